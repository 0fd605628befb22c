#pragma once
// Model trees for the model file tests: every field the file stores written out as text, so
// that two trees compare in one expectation and a difference shows where it lies, and a
// builder of a tree that uses every one of those fields.
#include <ostream>
#include <sstream>
#include <string>

#include "model/Model.h"
#include "model/ModelNode.h"
#include "model/TransformationNodeCurves.h"
#include "model/TransformationNodeHierarchy.h"

namespace ModelTreeCheck
{
// One line of the description: a label and the values after it.
template <typename... Values> void Line(std::ostream& anOut, const char* aLabel, const Values&... someValues)
{
	anOut << aLabel;
	((anOut << ' ' << someValues), ...);
	anOut << '\n';
}

// A label and every element of aRange (bytes as numbers).
template <typename Range> void RangeLine(std::ostream& anOut, const char* aLabel, const Range& aRange)
{
	anOut << aLabel;
	for (const auto& value : aRange)
	{
		anOut << ' ' << +value;
	}
	anOut << '\n';
}

inline void Write(std::ostream& anOut, const Matrix44<float>& aMatrix)
{
	RangeLine(anOut, "matrix", aMatrix.myMatrix);
}

inline void Write(std::ostream& anOut, const Zeph::TransformationNode* aNode)
{
	if (aNode == nullptr)
	{
		Line(anOut, "no transformation");
		return;
	}
	Line(anOut, "transformation", static_cast<int>(aNode->GetType()));
	Write(anOut, aNode->GetOrientation());
	if (const auto* hierarchy = dynamic_cast<const Zeph::TransformationNodeHierarchy*>(aNode))
	{
		for (int child = 0; child < hierarchy->GetChildCount(); ++child)
		{
			Line(anOut, "hierarchy child", child);
			Write(anOut, &hierarchy->GetChild(child));
		}
	}
	if (const auto* curves = dynamic_cast<const Zeph::TransformationNodeCurves*>(aNode))
	{
		const Vector3<float>& axis = curves->GetRotationAxis();
		const Vector3<float>& move = curves->GetTranslation();
		Line(anOut, "curves", curves->GetFirstParameter(), curves->GetSecondParameter(),
		     curves->GetThirdParameter(), curves->GetFourthParameter(), axis.x, axis.y, axis.z, move.x,
		     move.y, move.z, curves->GetAngle());
		for (int slot = 0; slot < Zeph::TransformationNodeCurves::CURVE_SLOT_COUNT; ++slot)
		{
			if (const Zeph::AnimationCurve* curve = curves->GetCurve(slot))
			{
				Line(anOut, "curve", slot, curve->GetFirstParameter(), curve->GetSecondParameter());
				for (const Zeph::AnimationKey& key : curve->GetKeys())
				{
					Line(anOut, "key", key.myTime, key.myValue);
				}
			}
		}
	}
}

inline void Write(std::ostream& anOut, const Zeph::Model& aModel)
{
	Line(anOut, "model", aModel.IsNullObject(), aModel.GetModelID(), aModel.GetVertexType(),
	     aModel.GetIndexCount(), aModel.GetIndexFormat(), aModel.GetVertexCount(), aModel.GetVertexStride(),
	     aModel.GetFirstName(), aModel.GetTechniqueName(), aModel.GetThirdName());
	RangeLine(anOut, "indices", aModel.GetIndexData());
	RangeLine(anOut, "vertices", aModel.GetVertexData());
	for (const Zeph::Surface& surface : aModel.GetSurfaces())
	{
		Line(anOut, "surface", surface.GetIndexCount(), surface.GetStartIndex(), surface.GetReservedValue(),
		     surface.GetSecondReservedValue(), static_cast<int>(surface.GetPrimitiveTopology()));
		for (int texture = 0; texture < surface.GetTextureCount(); ++texture)
		{
			// The texture object too: a tree loaded twice shares the container's textures.
			Line(anOut, "texture", surface.GetTextureFileName(texture),
			     surface.GetTextureVariableName(texture), surface.GetTextureSRGBFlag(texture),
			     surface.GetTexture(texture));
		}
	}
	const Zeph::ModelAnimationData& data = aModel.GetAnimationData();
	for (const Zeph::ModelTransformationRecord& record : data.myTransformationRecords)
	{
		Write(anOut, record.myTransformation.get());
	}
	for (const Zeph::ModelNamedRecord& record : data.myNamedRecords)
	{
		Line(anOut, "named", record.myName, record.myValue, record.myFirst, record.mySecond);
		Write(anOut, record.myTransformation.get());
	}
	for (const Zeph::ModelMatrixRecord& record : data.myMatrixRecords)
	{
		for (const Matrix44<float>& matrix : record.myMatrices)
		{
			Write(anOut, matrix);
		}
		RangeLine(anOut, "values", record.myValues);
	}
	RangeLine(anOut, "integers", data.myIntegers);
	for (const Zeph::Model* child : aModel.GetChildModels())
	{
		Write(anOut, *child);
	}
	Line(anOut, "end of model");
}

inline void Write(std::ostream& anOut, const Zeph::ModelNode& aNode)
{
	Line(anOut, "node", aNode.GetName());
	if (aNode.GetModel() != nullptr)
	{
		Write(anOut, *aNode.GetModel());
	}
	Write(anOut, aNode.GetTransformation());
	for (const Zeph::ModelNode* child : aNode.GetChildren())
	{
		Write(anOut, *child);
	}
	Line(anOut, "end of node", aNode.GetName());
}

// The tree as text, exact to the last bit of every value.
inline std::string Describe(const Zeph::ModelNode& aRoot)
{
	std::ostringstream text;
	text.precision(17);
	Write(text, aRoot);
	return text.str();
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
