// Model trees without a GPU: flags and technique names passed down a tree, the bounding
// sphere the factory stores, and the transformation kinds (a hierarchy multiplies its
// children in order, curves replace the stored values).
#include <cmath>
#include <gtest/gtest.h>
#include <memory>
#include <numbers>
#include <string>
#include <vector>

#include "model/Model.h"
#include "model/ModelFactory.h"
#include "model/ModelNode.h"
#include "model/TransformationNodeCurves.h"
#include "model/TransformationNodeHierarchy.h"

namespace
{
// root (no model) -> {first (model with a child model) -> {grandchild (model)}, second (null object)}
struct Tree
{
	Tree()
	{
		firstModel->AddChildModel(childModel);
		nullModel->SetIsNullObject(true);
		Zeph::ModelNode* first = Node(firstModel);
		first->AddChild(Node(grandchildModel));
		root->AddChild(first);
		root->AddChild(Node(nullModel));
	}
	~Tree() { delete root; }
	Tree(const Tree&) = delete;
	Tree& operator=(const Tree&) = delete;

	static Zeph::ModelNode* Node(Zeph::Model* aModel)
	{
		auto* node = new Zeph::ModelNode();
		node->SetModel(aModel);
		return node;
	}

	Zeph::ModelNode* root = new Zeph::ModelNode();
	Zeph::Model* firstModel = new Zeph::Model();
	Zeph::Model* childModel = new Zeph::Model();
	Zeph::Model* grandchildModel = new Zeph::Model();
	Zeph::Model* nullModel = new Zeph::Model();
};
// A model of the vertex type whose vertices hold the positions at the stride's start.
Zeph::Model* ModelWith(int aVertexType, int aStride, const std::vector<Vector3<float>>& somePositions)
{
	std::vector<float> data(somePositions.size() * static_cast<size_t>(aStride) / 4, 99.0f);
	for (size_t vertex = 0; vertex < somePositions.size(); ++vertex)
	{
		float* at = data.data() + vertex * static_cast<size_t>(aStride) / 4;
		at[0] = somePositions[vertex].x;
		at[1] = somePositions[vertex].y;
		at[2] = somePositions[vertex].z;
	}
	auto* model = new Zeph::Model();
	model->SetVertexType(aVertexType);
	model->SetVertexData(static_cast<int>(somePositions.size()), aStride, data.data(),
	                     static_cast<int>(data.size() * 4));
	return model;
}

Zeph::TransformationNode* Fixed(const Matrix44<float>& aMatrix)
{
	auto* node = new Zeph::TransformationNode();
	node->SetOrientation(aMatrix);
	return node;
}

Matrix44<float> Translation(float anX, float aY, float aZ)
{
	Matrix44<float> matrix;
	matrix.SetPosition({anX, aY, aZ});
	return matrix;
}
} // namespace

TEST(ModelNodeTest, ShadowCasterFlagReachesEveryNodesModel)
{
	Tree tree;
	const auto flags = [&] {
		return std::vector<bool>{tree.firstModel->GetIsShadowCasterFlag(),
		                         tree.grandchildModel->GetIsShadowCasterFlag(),
		                         tree.nullModel->GetIsShadowCasterFlag()};
	};
	tree.root->SetIsShadowCasterFlag(true);
	EXPECT_EQ(flags(), (std::vector<bool>{true, true, true}));
	tree.root->GetChildren()[0]->SetIsShadowCasterFlag(false);
	EXPECT_EQ(flags(), (std::vector<bool>{false, false, true}));
}

TEST(ModelNodeTest, TechniqueSelectionNamesTheGBufferAndShadowTechniques)
{
	struct Case
	{
		const char* myGiven;
		const char* myGBuffer;
		const char* myShadow;
	};
	// From a new model: G-buffer name empty, shadow name "RenderShadowBuffer".
	const Case cases[] = {
	    {"Render", "RenderGBuffer", "RenderShadowBuffer"},
	    {"RenderBase", "", "RenderShadowBufferBase"},
	    {"RenderFrontFace", "RenderGBufferFrontFace", "RenderShadowBufferFrontFace"},
	    {"RenderWireFrame", "", "RenderShadowBuffer"},
	};
	for (const Case& test : cases)
	{
		Tree tree;
		tree.root->SetTechniqueByName(test.myGiven);
		for (const Zeph::Model* model : {tree.firstModel, tree.childModel, tree.grandchildModel})
		{
			EXPECT_EQ(model->GetTechniqueName(), test.myGiven);
			EXPECT_EQ(model->GetGBufferTechniqueName(), test.myGBuffer) << test.myGiven;
			EXPECT_EQ(model->GetShadowTechniqueName(), test.myShadow) << test.myGiven;
		}
		EXPECT_EQ(tree.nullModel->GetTechniqueName(), "Render") << "a null object keeps its technique";
	}

	// "Unchanged" keeps what an earlier selection set.
	Tree tree;
	tree.root->SetTechniqueByName("RenderFrontFace");
	tree.root->SetTechniqueByName("RenderBase");
	EXPECT_EQ(tree.firstModel->GetGBufferTechniqueName(), "RenderGBufferFrontFace");
	EXPECT_EQ(tree.firstModel->GetShadowTechniqueName(), "RenderShadowBufferBase");
}

// The box of the first model (depth first) mirrored in x: its centre and half its diagonal.
TEST(BoundingSphereTest, TheBoxOfTheFirstModelIsMirroredInX)
{
	struct Case
	{
		const char* myName;
		int myType;
		int myStride;
		std::vector<Vector3<float>> myPositions;
		Vector3<float> myCentre;
		float myRadius;
	};
	const Case cases[] = {
	    {"two lit vertices, x swapped after mirroring",
	     4,
	     56,
	     {{1, 0, 0}, {3, 0, 4}},
	     {-2, 0, 2},
	     2.2360680f},
	    {"skinned vertices", 6, 64, {{0, -2, 0}, {2, 2, 0}}, {-1, 0, 0}, 2.2360680f},
	    {"other types count as the origin", 2, 32, {{5, 5, 5}, {-5, 1, 1}}, {0, 0, 0}, 0.0f},
	};
	for (const Case& test : cases)
	{
		Zeph::ModelNode root;
		root.SetModel(ModelWith(test.myType, test.myStride, test.myPositions));
		const Intersection::Sphere sphere = Zeph::ModelFactory::ComputeBoundingSphere(root);
		EXPECT_EQ((std::vector{sphere.myPosition.x, sphere.myPosition.y, sphere.myPosition.z}),
		          (std::vector{test.myCentre.x, test.myCentre.y, test.myCentre.z}))
		    << test.myName;
		EXPECT_NEAR(sphere.myRadius, test.myRadius, 1e-5f) << test.myName;
	}

	// A root without a model: the first child's grandchild comes before the second child.
	Zeph::ModelNode root;
	auto* first = new Zeph::ModelNode();
	auto* deep = new Zeph::ModelNode();
	deep->SetModel(ModelWith(4, 56, {{4, 0, 0}}));
	first->AddChild(deep);
	auto* second = new Zeph::ModelNode();
	second->SetModel(ModelWith(4, 56, {{8, 0, 0}}));
	root.AddChild(first);
	root.AddChild(second);
	EXPECT_FLOAT_EQ(Zeph::ModelFactory::ComputeBoundingSphere(root).myPosition.x, -4.0f);
}

TEST(TransformationNodeTest, AHierarchyAppliesItsFirstChildFirst)
{
	Zeph::TransformationNodeHierarchy hierarchy;
	hierarchy.SetOrientation(Translation(7.0f, 7.0f, 7.0f));
	EXPECT_EQ(hierarchy.GetTransformationForTime(0.0).GetPosition().x, 7.0f) << "no children: its own matrix";

	const float quarter = static_cast<float>(std::numbers::pi / 2.0);
	hierarchy.AddChild(Fixed(Translation(1.0f, 0.0f, 0.0f)));
	hierarchy.AddChild(Fixed(Matrix44<float>::CreateRotateAroundZ(quarter)));
	// The origin moved to (1, 0, 0) and then turned a quarter about z; the other
	// order would leave it at (1, 0, 0).
	const Vector3<float> position = hierarchy.GetTransformationForTime(0.0).GetPosition();
	EXPECT_NEAR(std::fabs(position.x) + std::fabs(position.z), 0.0f, 1e-6f);
	EXPECT_NEAR(std::fabs(position.y), 1.0f, 1e-6f);
}

TEST(TransformationNodeTest, ACurvesNodeRotatesAboutItsAxisThenTranslates)
{
	Zeph::TransformationNodeCurves node;
	node.SetRotationAxis({2.0f, 0.0f, 0.0f}); // normalised
	node.SetAngle(90.0f);
	node.SetTranslation({1.0f, 2.0f, 3.0f});
	node.SetOrientation(Translation(50.0f, 50.0f, 50.0f)); // not part of the evaluation
	const Matrix44<float> expected =
	    Matrix44<float>::CreateRotateAroundX(static_cast<float>(std::numbers::pi / 2.0));
	Matrix44<float> atZero = node.GetTransformationForTime(0.0);
	for (int i = 0; i < 12; ++i)
	{
		EXPECT_NEAR(atZero.myMatrix[i], expected.myMatrix[i], 1e-6f) << "element " << i;
	}
	EXPECT_EQ(atZero.GetPosition().x, 1.0f);
	EXPECT_EQ(atZero.GetPosition().z, 3.0f);

	// Curves replace the stored values; the editor evaluates at time 0, where a curve whose
	// first key comes later holds that key's value.
	auto* angle = new Zeph::AnimationCurve();
	angle->AddKey(1.0, 180.0);
	angle->AddKey(2.0, 0.0);
	node.SetCurve(Zeph::TransformationNodeCurves::CURVE_ANGLE, angle);
	auto* y = new Zeph::AnimationCurve();
	y->AddKey(1.0, -4.0);
	node.SetCurve(Zeph::TransformationNodeCurves::CURVE_TRANSLATION_Y, y);
	atZero = node.GetTransformationForTime(0.0);
	EXPECT_NEAR(atZero.myMatrix[5], -1.0f, 1e-6f) << "half a turn about x";
	EXPECT_NEAR(atZero.myMatrix[0], 1.0f, 1e-6f) << "about x";
	EXPECT_EQ(atZero.GetPosition().y, -4.0f);

	Zeph::TransformationNodeCurves noAxis;
	noAxis.SetAngle(90.0f);
	EXPECT_EQ(noAxis.GetTransformationForTime(0.0).myMatrix[0], 1.0f) << "a zero axis rotates nothing";
}
