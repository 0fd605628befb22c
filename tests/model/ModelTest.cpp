// Model trees without a GPU: the vertex type table, flags and technique names
// passed down a tree.
#include <gtest/gtest.h>
#include <string>
#include <vector>

#include "model/Model.h"
#include "model/ModelNode.h"
#include "model/VertexTypes.h"

TEST(VertexTypesTest, ElementsStridesAndOffsets)
{
	struct Case
	{
		int myType;
		const char* myElements; // semantic names joined by spaces
		int myStride;
	};
	const Case cases[] = {
	    {0, "POSITION TEXCOORD", 20},
	    {1, "POSITION COLOR TEXCOORD", 36},
	    {2, "POSITION NORMAL TEXCOORD", 32},
	    {3, "POSITION NORMAL TEXCOORD TANGENT", 44},
	    {4, "POSITION NORMAL TEXCOORD TANGENT BINORMAL", 56},
	    {5, "POSITION WEIGHTS BONES NORMAL TEXCOORD TANGENT", 52},
	    {6, "POSITION WEIGHTS BONES NORMAL TEXCOORD TANGENT BINORMAL", 64},
	    {7, "POSITION WEIGHTS BONES NORMAL TEXCOORD", 40},
	};
	GrowingArray<Gpu::InputElement> layout(10, 10);
	for (const Case& test : cases)
	{
		Zeph::BuildInputLayoutDesc(test.myType, layout);
		std::string names;
		uint32_t expectedOffset = 0;
		for (int index = 0; index < layout.Count(); ++index)
		{
			names += (index > 0 ? " " : "") + layout[index].mySemanticName;
			EXPECT_EQ(layout[index].myAlignedByteOffset, expectedOffset) << "type " << test.myType;
			expectedOffset += static_cast<uint32_t>(
			    Zeph::GetVertexTypeElements(test.myType)[static_cast<size_t>(index)].mySize);
		}
		EXPECT_EQ(names, test.myElements);
		EXPECT_EQ(Zeph::GetVertexTypeStride(test.myType), test.myStride);
		EXPECT_EQ(static_cast<int>(expectedOffset), test.myStride);
	}
	Zeph::BuildInputLayoutDesc(6, layout);
	EXPECT_EQ(layout[1].myFormat, Dds::Format::R8G8B8A8_UNORM);
	EXPECT_EQ(layout[2].myFormat, Dds::Format::R8G8B8A8_UINT);
	// Not a vertex type: an empty layout, not a read past the table.
	Zeph::BuildInputLayoutDesc(8, layout);
	EXPECT_EQ(layout.Count(), 0);
	EXPECT_EQ(Zeph::GetVertexTypeStride(-1), 0);
}

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
	    {"RenderAlphaTest", "", "RenderShadowBufferAlphaTest"},
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
