// Triangulation, node transforms, instance_node and skins of the document layer.

#include <cmath>
#include <gtest/gtest.h>
#include <string>
#include <vector>

#include "platform/collada/Document.h"
#include "support/TestSupport.h"

namespace
{
// A mesh of six points with one polygon set, inputs VERTEX (offset 0) and TEXCOORD (offset 1).
Collada::Mesh LoadMesh(const std::string& aSet)
{
	const std::string text = R"(<COLLADA><library_geometries><geometry id="g"><mesh>
<source id="p"><float_array id="pa" count="18">0 0 0 1 0 0 1 1 0 0 1 0 2 2 0 3 3 0</float_array>
<technique_common><accessor source="#pa" count="6" stride="3"/></technique_common></source>
<source id="t"><float_array id="ta" count="12">0 0 1 0 1 1 0 1 2 2 3 3</float_array>
<technique_common><accessor source="#ta" count="6" stride="2"/></technique_common></source>
<vertices id="v"><input semantic="POSITION" source="#p"/></vertices>)" +
	                         aSet + "</mesh></geometry></library_geometries></COLLADA>";
	Collada::Document document;
	std::string error;
	EXPECT_TRUE(document.LoadFromMemory(text.data(), text.size(), error)) << error;
	return document.GetGeometries().empty() ? Collada::Mesh() : document.GetGeometries()[0].myMesh;
}

const char* ourInputs =
    R"(<input semantic="VERTEX" source="#v" offset="0"/><input semantic="TEXCOORD" source="#t" offset="1" set="1"/>)";
} // namespace

TEST(ColladaGeometryTest, TriangulationKeepsEveryInputsCorners)
{
	struct Case
	{
		std::string mySet;
		std::vector<uint32_t> myPositions;
	};
	// Texcoord indices are the position indices reversed (5 - i), so a mix-up between inputs shows.
	// (Polylists fan out as polygons do; the real documents' counts hold their vcounts.)
	const Case cases[] = {
	    {std::string(R"(<polygons count="1">)") + ourInputs + "<p>0 5 1 4 2 3 3 2 4 1</p></polygons>",
	     {0, 1, 2, 0, 2, 3, 0, 3, 4}},
	    {std::string(R"(<tristrips count="1">)") + ourInputs + "<p>0 5 1 4 2 3 3 2 4 1</p></tristrips>",
	     {0, 1, 2, 2, 1, 3, 2, 3, 4}},
	    {std::string(R"(<trifans count="1">)") + ourInputs + "<p>0 5 1 4 2 3 3 2</p></trifans>",
	     {0, 1, 2, 0, 2, 3}},
	    // The hole is dropped; the outer ring is kept.
	    {std::string(R"(<polygons count="1">)") + ourInputs +
	         "<ph><p>0 5 1 4 2 3 3 2</p><h>4 1 5 0 4 1</h></ph></polygons>",
	     {0, 1, 2, 0, 2, 3}},
	};
	for (const Case& each : cases)
	{
		SCOPED_TRACE(each.mySet);
		Collada::Mesh mesh = LoadMesh(each.mySet);
		ASSERT_EQ(mesh.mySets.size(), 1u);
		EXPECT_FALSE(mesh.IsTriangles());
		mesh.Triangulate();
		ASSERT_TRUE(mesh.IsTriangles());
		const Collada::PolygonSet& set = mesh.mySets[0];
		EXPECT_EQ(set.GetTriangleCount(), each.myPositions.size() / 3);
		ASSERT_NE(set.FindInput(Collada::Semantic::Position), nullptr);
		ASSERT_NE(set.FindInput(Collada::Semantic::TexCoord, 1), nullptr);
		EXPECT_EQ(set.FindInput(Collada::Semantic::TexCoord, 0), nullptr);
		EXPECT_EQ(set.FindInput(Collada::Semantic::Position)->myIndices, each.myPositions);
		std::vector<uint32_t> texcoords;
		for (uint32_t position : each.myPositions)
		{
			texcoords.push_back(5 - position);
		}
		EXPECT_EQ(set.FindInput(Collada::Semantic::TexCoord, 1)->myIndices, texcoords);
		EXPECT_EQ(mesh.FindSourceBySemantic(Collada::Semantic::TexCoord, 1), mesh.FindSource("t"));
	}
}

namespace
{
// v * M for the point (x, y, z, 1).
std::array<float, 3> Apply(const Matrix44<float>& aMatrix, float anX, float aY, float aZ)
{
	const float* m = aMatrix.myMatrix;
	return {anX * m[0] + aY * m[4] + aZ * m[8] + m[12], anX * m[1] + aY * m[5] + aZ * m[9] + m[13],
	        anX * m[2] + aY * m[6] + aZ * m[10] + m[14]};
}

void ExpectPoint(const std::array<float, 3>& aPoint, float anX, float aY, float aZ)
{
	EXPECT_NEAR(aPoint[0], anX, 1e-5f);
	EXPECT_NEAR(aPoint[1], aY, 1e-5f);
	EXPECT_NEAR(aPoint[2], aZ, 1e-5f);
}
} // namespace

TEST(ColladaGeometryTest, NodeTransformsComposeInFileOrderAndInstanceNodesResolve)
{
	const std::string text =
	    R"(<COLLADA><library_nodes><node id="shared"><scale>2 2 2</scale></node></library_nodes>
<library_visual_scenes><visual_scene id="s">
<node id="a"><translate>10 0 0</translate><rotate>0 0 1 90</rotate><scale>2 1 1</scale>
<instance_node url="#shared"/></node>
<node id="b"><matrix>1 0 0 5 0 1 0 6 0 0 1 7 0 0 0 1</matrix></node>
</visual_scene></library_visual_scenes><scene><instance_visual_scene url="#s"/></scene></COLLADA>)";
	Collada::Document document;
	std::string error;
	ASSERT_TRUE(document.LoadFromMemory(text.data(), text.size(), error)) << error;
	const Collada::Node* a = document.FindNode("a");
	ASSERT_NE(a, nullptr);
	// (1, 0, 0): scaled to (2, 0, 0), turned 90 degrees about Z to (0, 2, 0), moved to (10, 2, 0).
	ExpectPoint(Apply(a->GetLocalMatrix(), 1, 0, 0), 10, 2, 0);
	ExpectPoint(Apply(a->GetLocalMatrix(), 0, 1, 0), 9, 0, 0);
	// The matrix is written for column vectors: its last column is the translation.
	ExpectPoint(Apply(document.FindNode("b")->GetLocalMatrix(), 1, 1, 1), 6, 7, 8);
	ASSERT_EQ(a->myInstances.size(), 1u);
	ASSERT_EQ(a->myInstances[0].myNode, document.FindNode("shared"));
	ExpectPoint(Apply(a->myInstances[0].myNode->GetLocalMatrix(), 1, 2, 3), 2, 4, 6);
}

// A real exporter's skin gives every vertex its influences and every joint its bind matrix; reduced,
// the strongest four joints stay, in order of weight, and share the whole weight.
TEST(ColladaGeometryTest, SkinWeightsAndReduceInfluences)
{
	LUMORA_SKIP_WITHOUT_SHARED_TESTDATA();
	Collada::Document document;
	std::string error;
	ASSERT_TRUE(document.Load("../shared/testdata/collada/box_nested_animation.dae", error)) << error;
	const Collada::Skin& skin = document.GetControllers().at(0).mySkin;
	ASSERT_NE(document.FindGeometry(skin.mySource), nullptr);
	EXPECT_EQ(skin.myInfluences.size(), size_t(document.FindGeometry(skin.mySource)
	                                               ->myMesh.FindSourceBySemantic(Collada::Semantic::Position)
	                                               ->myCount));
	EXPECT_EQ(skin.myJointNames.size(), skin.myInverseBindMatrices.size());
	EXPECT_FALSE(skin.myJointNames.empty());

	Collada::Skin reduced;
	reduced.myInfluences = {{{0, 0.1f}, {1, 0.4f}, {2, 0.05f}, {3, 0.2f}, {4, 0.15f}, {5, 0.1f}},
	                        {{7, 0.5f}}};
	reduced.ReduceInfluences(4, 0.0f);
	ASSERT_EQ(reduced.myInfluences[0].size(), 4u);
	const int joints[] = {1, 3, 4, 0};
	const float weights[] = {0.4f, 0.2f, 0.15f, 0.1f};
	for (size_t i = 0; i < 4; ++i)
	{
		EXPECT_EQ(reduced.myInfluences[0][i].myJoint, joints[i]);
		EXPECT_NEAR(reduced.myInfluences[0][i].myWeight, weights[i] / 0.85f, 1e-6f);
	}
	ASSERT_EQ(reduced.myInfluences[1].size(), 1u);
	EXPECT_FLOAT_EQ(reduced.myInfluences[1][0].myWeight, 1.0f);
}
