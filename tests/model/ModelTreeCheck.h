#pragma once
// Field-by-field comparison of model trees for the model file tests, and a
// builder of a tree that uses every field the file stores.
#include <gtest/gtest.h>
#include <string>
#include <tuple>

#include "model/Model.h"
#include "model/ModelNode.h"
#include "model/TransformationNodeCurves.h"
#include "model/TransformationNodeHierarchy.h"

namespace ModelTreeCheck
{
inline void ExpectSameMatrix(const Matrix44<float>& anExpected, const Matrix44<float>& anActual,
                             const std::string& aWhere)
{
	for (int i = 0; i < 16; ++i)
	{
		EXPECT_EQ(anExpected.myMatrix[i], anActual.myMatrix[i]) << aWhere << ", element " << i;
	}
}

inline void ExpectSameTransformation(const Zeph::TransformationNode* anExpected,
                                     const Zeph::TransformationNode* anActual, const std::string& aWhere)
{
	ASSERT_NE(anExpected, nullptr) << aWhere;
	ASSERT_NE(anActual, nullptr) << aWhere;
	ASSERT_EQ(anExpected->GetType(), anActual->GetType()) << aWhere;
	ExpectSameMatrix(anExpected->GetOrientation(), anActual->GetOrientation(), aWhere + " matrix");
	const auto* hierarchy = dynamic_cast<const Zeph::TransformationNodeHierarchy*>(anExpected);
	if (hierarchy != nullptr)
	{
		const auto* other = dynamic_cast<const Zeph::TransformationNodeHierarchy*>(anActual);
		ASSERT_NE(other, nullptr) << aWhere << ": not read back as a hierarchy";
		ASSERT_EQ(hierarchy->GetChildCount(), other->GetChildCount()) << aWhere;
		for (int child = 0; child < hierarchy->GetChildCount(); ++child)
		{
			ExpectSameTransformation(&hierarchy->GetChild(child), &other->GetChild(child),
			                         aWhere + "/child " + std::to_string(child));
		}
	}
	const auto* curves = dynamic_cast<const Zeph::TransformationNodeCurves*>(anExpected);
	if (curves != nullptr)
	{
		const auto* other = dynamic_cast<const Zeph::TransformationNodeCurves*>(anActual);
		ASSERT_NE(other, nullptr) << aWhere << ": not read back as curves";
		const auto fields = [](const Zeph::TransformationNodeCurves& aNode) {
			const Vector3<float>& axis = aNode.GetRotationAxis();
			const Vector3<float>& translation = aNode.GetTranslation();
			return std::tuple(aNode.GetFirstParameter(), aNode.GetSecondParameter(),
			                  aNode.GetThirdParameter(), aNode.GetFourthParameter(), axis.x, axis.y, axis.z,
			                  translation.x, translation.y, translation.z, aNode.GetAngle());
		};
		EXPECT_EQ(fields(*curves), fields(*other)) << aWhere << ": parameters, axis, translation, angle";
		for (int slot = 0; slot < Zeph::TransformationNodeCurves::CURVE_SLOT_COUNT; ++slot)
		{
			const Zeph::AnimationCurve* curve = curves->GetCurve(slot);
			const Zeph::AnimationCurve* otherCurve = other->GetCurve(slot);
			ASSERT_EQ(curve == nullptr, otherCurve == nullptr) << aWhere << ", slot " << slot;
			if (curve == nullptr)
			{
				continue;
			}
			EXPECT_EQ(curve->GetFirstParameter(), otherCurve->GetFirstParameter()) << aWhere;
			EXPECT_EQ(curve->GetSecondParameter(), otherCurve->GetSecondParameter()) << aWhere;
			ASSERT_EQ(curve->GetKeys().size(), otherCurve->GetKeys().size()) << aWhere << ", slot " << slot;
			for (size_t key = 0; key < curve->GetKeys().size(); ++key)
			{
				EXPECT_EQ(curve->GetKeys()[key].myTime, otherCurve->GetKeys()[key].myTime) << aWhere;
				EXPECT_EQ(curve->GetKeys()[key].myValue, otherCurve->GetKeys()[key].myValue) << aWhere;
			}
		}
	}
}

inline void ExpectSameModel(const Zeph::Model& anExpected, const Zeph::Model& anActual,
                            const std::string& aWhere)
{
	const auto fields = [](const Zeph::Model& aModel) {
		return std::tuple(aModel.IsNullObject(), aModel.GetModelID(), aModel.GetVertexType(),
		                  aModel.GetIndexCount(), aModel.GetIndexFormat(), aModel.GetVertexCount(),
		                  aModel.GetVertexStride(), aModel.GetFirstName(), aModel.GetTechniqueName(),
		                  aModel.GetThirdName());
	};
	EXPECT_EQ(fields(anExpected), fields(anActual))
	    << aWhere << ": null flag, ID, type, counts, format, names";
	EXPECT_TRUE(std::ranges::equal(anExpected.GetIndexData(), anActual.GetIndexData())) << aWhere;
	EXPECT_TRUE(std::ranges::equal(anExpected.GetVertexData(), anActual.GetVertexData())) << aWhere;

	ASSERT_EQ(anExpected.GetSurfaces().Count(), anActual.GetSurfaces().Count()) << aWhere;
	for (int index = 0; index < anExpected.GetSurfaces().Count(); ++index)
	{
		const Zeph::Surface& surface = anExpected.GetSurfaces()[index];
		const Zeph::Surface& other = anActual.GetSurfaces()[index];
		const std::string where = aWhere + ", surface " + std::to_string(index);
		EXPECT_EQ(surface.GetIndexCount(), other.GetIndexCount()) << where;
		EXPECT_EQ(surface.GetStartIndex(), other.GetStartIndex()) << where;
		EXPECT_EQ(surface.GetReservedValue(), other.GetReservedValue()) << where;
		EXPECT_EQ(surface.GetSecondReservedValue(), other.GetSecondReservedValue()) << where;
		EXPECT_EQ(surface.GetPrimitiveTopology(), other.GetPrimitiveTopology()) << where;
		ASSERT_EQ(surface.GetTextureCount(), other.GetTextureCount()) << where;
		for (int texture = 0; texture < surface.GetTextureCount(); ++texture)
		{
			EXPECT_EQ(surface.GetTextureFileName(texture), other.GetTextureFileName(texture)) << where;
			EXPECT_EQ(surface.GetTextureVariableName(texture), other.GetTextureVariableName(texture))
			    << where;
			EXPECT_EQ(surface.GetTextureSRGBFlag(texture), other.GetTextureSRGBFlag(texture)) << where;
			EXPECT_EQ(surface.GetTexture(texture), other.GetTexture(texture))
			    << where << ": the shared texture";
		}
	}

	const Zeph::ModelAnimationData& data = anExpected.GetAnimationData();
	const Zeph::ModelAnimationData& otherData = anActual.GetAnimationData();
	ASSERT_EQ(data.myTransformationRecords.size(), otherData.myTransformationRecords.size()) << aWhere;
	for (size_t index = 0; index < data.myTransformationRecords.size(); ++index)
	{
		ExpectSameTransformation(data.myTransformationRecords[index].myTransformation.get(),
		                         otherData.myTransformationRecords[index].myTransformation.get(),
		                         aWhere + ", transformation record");
	}
	ASSERT_EQ(data.myNamedRecords.size(), otherData.myNamedRecords.size()) << aWhere;
	for (size_t index = 0; index < data.myNamedRecords.size(); ++index)
	{
		const Zeph::ModelNamedRecord& record = data.myNamedRecords[index];
		const Zeph::ModelNamedRecord& other = otherData.myNamedRecords[index];
		EXPECT_EQ(record.myName, other.myName) << aWhere;
		EXPECT_EQ(record.myValue, other.myValue) << aWhere;
		EXPECT_EQ(record.myFirst, other.myFirst) << aWhere;
		EXPECT_EQ(record.mySecond, other.mySecond) << aWhere;
		ExpectSameTransformation(record.myTransformation.get(), other.myTransformation.get(),
		                         aWhere + ", named record");
	}
	ASSERT_EQ(data.myMatrixRecords.size(), otherData.myMatrixRecords.size()) << aWhere;
	for (size_t index = 0; index < data.myMatrixRecords.size(); ++index)
	{
		for (size_t matrix = 0; matrix < 3; ++matrix)
		{
			ExpectSameMatrix(data.myMatrixRecords[index].myMatrices[matrix],
			                 otherData.myMatrixRecords[index].myMatrices[matrix], aWhere + ", matrix record");
		}
		EXPECT_EQ(data.myMatrixRecords[index].myValues, otherData.myMatrixRecords[index].myValues) << aWhere;
	}
	EXPECT_EQ(data.myIntegers, otherData.myIntegers) << aWhere;

	ASSERT_EQ(anExpected.GetChildModels().Count(), anActual.GetChildModels().Count()) << aWhere;
	for (int child = 0; child < anExpected.GetChildModels().Count(); ++child)
	{
		ExpectSameModel(*anExpected.GetChildModels()[child], *anActual.GetChildModels()[child],
		                aWhere + "/child model " + std::to_string(child));
	}
}

inline void ExpectSameTree(const Zeph::ModelNode& anExpected, const Zeph::ModelNode& anActual,
                           const std::string& aWhere = "root")
{
	EXPECT_EQ(anExpected.GetName(), anActual.GetName()) << aWhere;
	ASSERT_EQ(anExpected.GetModel() == nullptr, anActual.GetModel() == nullptr) << aWhere;
	if (anExpected.GetModel() != nullptr)
	{
		ExpectSameModel(*anExpected.GetModel(), *anActual.GetModel(), aWhere + " model");
	}
	ExpectSameTransformation(anExpected.GetTransformation(), anActual.GetTransformation(),
	                         aWhere + " transformation");
	ASSERT_EQ(anExpected.GetChildren().Count(), anActual.GetChildren().Count()) << aWhere;
	for (int child = 0; child < anExpected.GetChildren().Count(); ++child)
	{
		ExpectSameTree(*anExpected.GetChildren()[child], *anActual.GetChildren()[child],
		               aWhere + "/" + std::to_string(child));
	}
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
