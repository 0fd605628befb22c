#pragma once
// What every model tree read from a file (an .al file, or a COLLADA document through the
// importer) guarantees the renderer, checked by the fuzz entries (the readers' refusals of unknown
// vertex types and short strides are the model file test's): each drawn model has its vertices,
// a known index format, every index names one of its vertices,
// every surface lies inside its indices, every texture binding names a model of the tree; and
// the .al writer and reader carry the tree over unchanged. A broken guarantee aborts.
#include <cstring>
#include <set>
#include <string>
#include <vector>

#include "FuzzEntries.h"
#include "model/AlFile.h"
#include "model/Model.h"
#include "model/ModelFactory.h"
#include "model/ModelNode.h"

namespace LumoraFuzz
{
inline void CheckModel(const Zeph::Model& aModel, std::set<const Zeph::Model*>& someModels)
{
	someModels.insert(&aModel);
	for (const Zeph::Model* child : aModel.GetChildModels())
	{
		CheckModel(*child, someModels);
	}
	if (aModel.IsNullObject())
	{
		return;
	}
	Require(static_cast<size_t>(aModel.GetVertexCount()) * static_cast<size_t>(aModel.GetVertexStride()) <=
	        aModel.GetVertexData().size());
	const int format = aModel.GetIndexFormat();
	Require(format == Zeph::Model::ourIndexFormatR16 || format == Zeph::Model::ourIndexFormatR32);
	const size_t indexBytes = format == Zeph::Model::ourIndexFormatR16 ? 2 : 4;
	Require(static_cast<size_t>(aModel.GetIndexCount()) * indexBytes <= aModel.GetIndexData().size());
	for (size_t index = 0; index < static_cast<size_t>(aModel.GetIndexCount()); ++index)
	{
		uint32_t value = 0;
		std::memcpy(&value, aModel.GetIndexData().data() + index * indexBytes, indexBytes);
		Require(value < static_cast<uint32_t>(aModel.GetVertexCount()));
	}
	for (const Zeph::Surface& surface : aModel.GetSurfaces())
	{
		Require(surface.GetStartIndex() >= 0 && surface.GetIndexCount() >= 0 &&
		        surface.GetStartIndex() + surface.GetIndexCount() <= aModel.GetIndexCount());
	}
}

inline void CheckModelTree(const Zeph::ModelNode& aRoot,
                           const std::vector<Zeph::AlTextureBinding>& someBindings)
{
	std::set<const Zeph::Model*> models;
	const auto checkNode = [&models](const auto& aSelf, const Zeph::ModelNode& aNode) -> void {
		if (aNode.GetModel() != nullptr)
		{
			CheckModel(*aNode.GetModel(), models);
		}
		for (const Zeph::ModelNode* child : aNode.GetChildren())
		{
			aSelf(aSelf, *child);
		}
	};
	checkNode(checkNode, aRoot);
	for (const Zeph::AlTextureBinding& binding : someBindings)
	{
		Require(models.contains(binding.myModel) && binding.mySurface >= 0 &&
		        binding.mySurface < binding.myModel->GetSurfaces().Count());
	}
	static_cast<void>(Zeph::ModelFactory::ComputeBoundingSphere(aRoot));

	std::vector<uint8_t> written;
	Zeph::AlFile::Encode(aRoot, written);
	std::vector<Zeph::AlTextureBinding> bindings;
	std::string error;
	const std::unique_ptr<Zeph::ModelNode> read = Zeph::AlFile::Parse(written, bindings, error);
	Require(read != nullptr);
	std::vector<uint8_t> again;
	Zeph::AlFile::Encode(*read, again);
	Require(again == written);
}
} // namespace LumoraFuzz
