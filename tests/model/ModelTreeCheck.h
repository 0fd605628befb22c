#pragma once
// Model trees for the model file tests: a builder of a tree that uses every field the model
// file stores, and the tree's file image to compare trees with.
#include <cstdint>
#include <memory>
#include <vector>

#include "model/AlFile.h"
#include "model/Model.h"
#include "model/ModelNode.h"
#include "model/TransformationNodeCurves.h"
#include "model/TransformationNodeHierarchy.h"

namespace ModelTreeCheck
{
// The tree as a model file: the file holds every field of the tree, so two trees whose files
// are equal byte for byte are the same tree as far as the file goes.
inline std::vector<uint8_t> Encoded(const Zeph::ModelNode& aRoot)
{
	std::vector<uint8_t> bytes;
	Zeph::AlFile::Encode(aRoot, bytes);
	return bytes;
}

// A matrix whose every element differs, so a swapped or dropped element shows.
inline Matrix44<float> DistinctMatrix(float aBase)
{
	Matrix44<float> matrix;
	for (int i = 0; i < 16; ++i)
	{
		matrix.myMatrix[i] = aBase + static_cast<float>(i) * 0.25f;
	}
	return matrix;
}

inline Zeph::TransformationNodeCurves* MakeCurves(float aBase)
{
	auto* curves = new Zeph::TransformationNodeCurves();
	curves->SetParameters(7, aBase, aBase + 1.0f, -3);
	curves->SetRotationAxis({0.0f, 1.0f, 0.0f});
	curves->SetTranslation({aBase, 2.0f, 3.0f});
	curves->SetAngle(45.0f);
	auto* curve = new Zeph::AnimationCurve();
	curve->SetParameters(0.5, 1.5);
	curve->AddKey(0.0, 10.0);
	curve->AddKey(1.0, 30.0);
	curves->SetCurve(Zeph::TransformationNodeCurves::CURVE_ANGLE, curve);
	auto* translation = new Zeph::AnimationCurve();
	translation->AddKey(0.5, -1.0);
	curves->SetCurve(Zeph::TransformationNodeCurves::CURVE_TRANSLATION_Z, translation);
	curves->SetOrientation(DistinctMatrix(aBase));
	return curves;
}

// A lit model (vertex type 4) of one quad facing -z at depth aDepth, two surfaces
// of one triangle each, and every animation list filled.
inline Zeph::Model* MakeQuadModel(float aHalfSize, float aDepth)
{
	struct Vertex
	{
		float myPosition[3];
		float myNormal[3];
		float myUv[2];
		float myTangent[3];
		float myBinormal[3];
	};
	static_assert(sizeof(Vertex) == 56);
	const float h = aHalfSize;
	const Vertex vertices[4] = {
	    {{-h, -h, aDepth}, {0, 0, -1}, {0, 1}, {1, 0, 0}, {0, 1, 0}},
	    {{-h, h, aDepth}, {0, 0, -1}, {0, 0}, {1, 0, 0}, {0, 1, 0}},
	    {{h, h, aDepth}, {0, 0, -1}, {1, 0}, {1, 0, 0}, {0, 1, 0}},
	    {{h, -h, aDepth}, {0, 0, -1}, {1, 1}, {1, 0, 0}, {0, 1, 0}},
	};
	const uint32_t indices[6] = {0, 1, 2, 0, 2, 3};
	auto* model = new Zeph::Model();
	model->SetVertexType(4);
	model->SetVertexData(4, 56, vertices, sizeof(vertices));
	model->SetIndexData(6, Zeph::Model::ourIndexFormatR32, indices, sizeof(indices));
	model->SetNames("first", "Render", "third");
	for (int index = 0; index < 2; ++index)
	{
		Zeph::Surface surface;
		surface.SetIndexCount(3);
		surface.SetStartIndex(3 * index);
		surface.SetReservedValues(11 + index, 0);
		surface.SetPrimitiveTopology(index == 0 ? Gpu::PrimitiveTopology::TriangleList
		                                        : Gpu::PrimitiveTopology::TriangleStrip);
		model->GetSurfaces().Add(surface);
	}
	Zeph::ModelAnimationData& data = model->GetAnimationData();
	data.myTransformationRecords.push_back({std::unique_ptr<Zeph::TransformationNode>(MakeCurves(5.0f))});
	Zeph::ModelNamedRecord named;
	named.myName = "joint";
	named.myValue = 65535;
	named.myFirst = -2;
	named.mySecond = 9;
	named.myTransformation = std::make_unique<Zeph::TransformationNode>();
	named.myTransformation->SetOrientation(DistinctMatrix(20.0f));
	data.myNamedRecords.push_back(std::move(named));
	Zeph::ModelMatrixRecord matrices;
	matrices.myMatrices = {DistinctMatrix(1.0f), DistinctMatrix(2.0f), DistinctMatrix(3.0f)};
	matrices.myValues = {4, 5, 6};
	data.myMatrixRecords.push_back(std::move(matrices));
	data.myIntegers = {1, -1, 2};
	return model;
}

// Root (quad model, hierarchy of a curves and a fixed child) -> "group" (no model,
// curves) -> "leaf" (quad with a null-object child model), and "empty" (fixed).
inline Zeph::ModelNode* MakeTree()
{
	auto* root = new Zeph::ModelNode();
	root->SetName("root");
	root->SetModel(MakeQuadModel(0.5f, 0.5f));
	auto* hierarchy = new Zeph::TransformationNodeHierarchy();
	hierarchy->AddChild(MakeCurves(1.0f));
	auto* fixed = new Zeph::TransformationNode();
	fixed->SetOrientation(DistinctMatrix(-4.0f));
	hierarchy->AddChild(fixed);
	hierarchy->SetOrientation(DistinctMatrix(100.0f));
	root->SetTransformation(hierarchy);

	auto* group = new Zeph::ModelNode();
	group->SetName("group");
	group->SetTransformation(MakeCurves(2.0f));
	auto* leaf = new Zeph::ModelNode();
	leaf->SetName("leaf");
	Zeph::Model* leafModel = MakeQuadModel(0.25f, 0.75f);
	auto* nullChild = new Zeph::Model();
	nullChild->SetIsNullObject(true);
	nullChild->SetNames("", "RenderBase", "NULL");
	leafModel->AddChildModel(nullChild);
	leaf->SetModel(leafModel);
	group->AddChild(leaf);
	root->AddChild(group);
	auto* empty = new Zeph::ModelNode();
	empty->SetName("empty");
	root->AddChild(empty);
	return root;
}
} // namespace ModelTreeCheck
