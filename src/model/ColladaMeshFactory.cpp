#include "model/ColladaMeshFactory.h"

#include <cstdint>
#include <memory>
#include <vector>

#include "engine/EffectContainer.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "engine/FI_File.h"
#include "engine/ShaderFiles.h"
#include "model/AlFile.h"
#include "model/ColladaImport.h"
#include "model/Model.h"
#include "model/ModelNode.h"
#include "model/Surface.h"
#include "platform/collada/Document.h"
#include "platform/paths/Paths.h"

namespace Zeph
{
namespace
{
constexpr const char* ourReadFunction = "Zeph::ColladaMeshFactory::CreateModelNodeAL";
constexpr const char* ourImportFunction = "Zeph::ColladaMeshFactory::CreateModelNodeDAE";
constexpr const char* ourWriteFunction = "Zeph::ColladaMeshFactory::SaveModelNodeAL";
constexpr int ourOpenFailedLine = 86;

// The effect of each model's vertex type, on the model and its surfaces; child
// models take their own.
void SetEffects(Model& aModel, EffectContainer& anEffects)
{
	if (!aModel.IsNullObject())
	{
		Effect* effect = anEffects.GetEffect(ShaderFiles[static_cast<size_t>(aModel.GetVertexType())]);
		aModel.SetEffect(effect);
		for (Surface& surface : aModel.GetSurfaces())
		{
			surface.SetEffect(effect);
		}
	}
	for (Model* child : aModel.GetChildModels())
	{
		SetEffects(*child, anEffects);
	}
}

void SetNodeEffects(ModelNode& aNode, EffectContainer& anEffects)
{
	if (aNode.GetModel() != nullptr)
	{
		SetEffects(*aNode.GetModel(), anEffects);
	}
	for (ModelNode* child : aNode.GetChildren())
	{
		SetNodeEffects(*child, anEffects);
	}
}

// Each node's model with its child models: buffers and the technique pointers.
bool InitNodeBuffers(ModelNode& aNode)
{
	if (aNode.GetModel() != nullptr && !aNode.GetModel()->Init())
	{
		return false;
	}
	for (ModelNode* child : aNode.GetChildren())
	{
		if (!InitNodeBuffers(*child))
		{
			return false;
		}
	}
	return true;
}

// Each node's model with its child models: buffers, then the technique read from
// the file, which technique selection passes down to the child models.
bool InitNodeModels(ModelNode& aNode)
{
	Model* model = aNode.GetModel();
	if (model != nullptr)
	{
		if (!model->Init())
		{
			return false;
		}
		const std::string technique = model->GetTechniqueName();
		model->SetTechniqueByName(technique);
	}
	for (ModelNode* child : aNode.GetChildren())
	{
		if (!InitNodeModels(*child))
		{
			return false;
		}
	}
	return true;
}
} // namespace

ModelNode* ColladaMeshFactory::CreateModelNodeDAE(const std::string& aFileName)
{
	std::unique_ptr<ModelNode> root;
	std::vector<AlTextureBinding> bindings;
	std::string error;
	{
		// The document is only needed while converting: it goes before the GPU work.
		Collada::Document document;
		if (document.Load(aFileName, error))
		{
			root = ColladaImport::Convert(document, bindings, error);
		}
	}
	if (!root)
	{
		ReportDebug(__LINE__, ourImportFunction, "%s: %s", aFileName.c_str(), error.c_str());
		return nullptr;
	}
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr)
	{
		ReportCritical(__LINE__, ourImportFunction, "No engine to load %s with", aFileName.c_str());
		return nullptr;
	}
	SetNodeEffects(*root, engine->GetEffectContainer());
	// A texture that is missing, or a variable the effect lacks, is reported and left unbound.
	for (const AlTextureBinding& binding : bindings)
	{
		binding.myModel->GetSurfaces()[binding.mySurface].SetTexture(binding.myPath, binding.myVariableName,
		                                                             binding.mySRGBFlag);
	}
	if (!InitNodeBuffers(*root))
	{
		return nullptr;
	}
	return root.release();
}

ModelNode* ColladaMeshFactory::CreateModelNodeAL(const std::string& aFileName)
{
	FI_File file;
	if (!file.Open(aFileName, FI_File::FileFlags::READ | FI_File::FileFlags::BINARY))
	{
		ReportCritical(ourOpenFailedLine, ourReadFunction, "Failed to open %s:", aFileName.c_str());
		return nullptr;
	}
	// The whole file is read at once and parsed from memory, so a damaged file can
	// never make a read run past its end.
	const int size = file.GetFileSize();
	std::vector<uint8_t> bytes(size > 0 ? static_cast<size_t>(size) : 0);
	const bool readFlag = size >= 0 && file.ReadData(bytes.data(), size);
	if (!file.Close() || !readFlag)
	{
		ReportCritical(__LINE__, ourReadFunction, "Failed to read %s", aFileName.c_str());
		return nullptr;
	}

	std::vector<AlTextureBinding> bindings;
	std::string error;
	std::unique_ptr<ModelNode> root = AlFile::Parse(bytes, bindings, error);
	if (!root)
	{
		ReportCritical(__LINE__, ourReadFunction, "Damaged model file %s: %s", aFileName.c_str(),
		               error.c_str());
		return nullptr;
	}
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr)
	{
		ReportCritical(__LINE__, ourReadFunction, "No engine to load %s with", aFileName.c_str());
		return nullptr;
	}
	SetNodeEffects(*root, engine->GetEffectContainer());
	// A texture that is missing is reported and left unbound, as on import.
	for (const AlTextureBinding& binding : bindings)
	{
		binding.myModel->GetSurfaces()[binding.mySurface].SetTexture(binding.myPath, binding.myVariableName,
		                                                             binding.mySRGBFlag);
	}
	if (!InitNodeModels(*root))
	{
		return nullptr;
	}
	return root.release();
}

bool ColladaMeshFactory::SaveModelNodeAL(const ModelNode& aNode, const std::string& aFileName)
{
	std::vector<uint8_t> bytes;
	AlFile::Encode(aNode, bytes);
	const std::string target = Paths::PrepareForWrite(aFileName);
	if (target.empty() || bytes.size() > static_cast<size_t>(INT32_MAX))
	{
		ReportCritical(__LINE__, ourWriteFunction, "Couldn't write model file %s", aFileName.c_str());
		return false;
	}
	const std::string temporary = Paths::TemporaryFor(target);
	FI_File file;
	bool writtenFlag = !temporary.empty() &&
	                   file.Open(temporary, FI_File::FileFlags::WRITE | FI_File::FileFlags::BINARY) &&
	                   file.WriteData(bytes.data(), static_cast<int>(bytes.size()));
	writtenFlag = file.Close() && writtenFlag;
	if (!writtenFlag || !Paths::ReplaceWith(temporary, target))
	{
		Paths::Discard(temporary);
		ReportCritical(__LINE__, ourWriteFunction, "Couldn't write model file %s", aFileName.c_str());
		return false;
	}
	return true;
}
} // namespace Zeph
