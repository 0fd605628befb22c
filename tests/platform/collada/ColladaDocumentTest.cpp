// The document reader on real exporters' files and on small broken documents.

#include <gtest/gtest.h>
#include <string>
#include <vector>

#include "platform/collada/Document.h"

namespace
{
struct MeshCounts
{
	size_t mySets;
	size_t myTriangles;
	size_t mySources;
};

struct RealDocument
{
	const char* myFile;
	const char* myUpAxis;
	std::vector<MeshCounts> myMeshes;
	size_t myNodes;
	size_t myCameras;
	size_t myLights;
	size_t myImages;
	size_t myMaterials;
	size_t myControllers;
};

size_t CountNodes(const std::vector<std::unique_ptr<Collada::Node>>& someNodes)
{
	size_t count = 0;
	for (const auto& node : someNodes)
	{
		count += 1 + CountNodes(node->myChildren);
	}
	return count;
}

// Counted from the files: polygon sets, triangles once triangulated (n - 2 per polygon, strip or
// fan), sources per mesh, and the library entries.
const RealDocument ourRealDocuments[] = {
    {"Cinema4D.dae", "Y_UP", {{1, 756, 3}, {1, 528, 3}, {1, 12, 3}}, 3, 0, 0, 0, 1, 0},
    {"ConcavePolygon.dae", "Y_UP", {{1, 64, 1}}, 1, 0, 0, 0, 1, 0},
    {"box_nested_animation.dae", "Z_UP", {{1, 12, 3}}, 3, 0, 0, 0, 1, 1},
    {"cameras.dae", "Z_UP", {}, 3, 3, 0, 0, 0, 0},
    {"cube_tristrips.dae", "Z_UP", {{1, 12, 2}}, 7, 2, 4, 0, 1, 0},
    {"kwxport_test_vcolors.dae", "Z_UP", {{3, 12, 4}}, 1, 0, 0, 3, 3, 0},
    {"lights.dae", "Z_UP", {}, 5, 0, 5, 0, 0, 0},
    {"sphere.dae", "Y_UP", {{1, 760, 3}}, 1, 0, 0, 0, 1, 0},
    {"teapots.DAE", "Z_UP", {{1, 992, 3}, {1, 992, 3}, {1, 992, 2}}, 3, 0, 0, 1, 3, 0},
};
} // namespace

TEST(ColladaDocumentTest, RealDocumentsLoadWithTheirCounts)
{
	for (const RealDocument& expected : ourRealDocuments)
	{
		SCOPED_TRACE(expected.myFile);
		Collada::Document document;
		std::string error;
		ASSERT_TRUE(document.Load(std::string("../shared/testdata/collada/") + expected.myFile, error))
		    << error;
		EXPECT_EQ(document.GetAsset().myUpAxis, expected.myUpAxis);
		ASSERT_EQ(document.GetGeometries().size(), expected.myMeshes.size());
		for (size_t i = 0; i < expected.myMeshes.size(); ++i)
		{
			Collada::Mesh mesh = document.GetGeometries()[i].myMesh;
			EXPECT_EQ(mesh.mySets.size(), expected.myMeshes[i].mySets);
			EXPECT_EQ(mesh.mySources.size(), expected.myMeshes[i].mySources);
			mesh.Triangulate();
			EXPECT_TRUE(mesh.IsTriangles());
			EXPECT_EQ(mesh.GetTriangleCount(), expected.myMeshes[i].myTriangles);
			for (const Collada::PolygonSet& set : mesh.mySets)
			{
				ASSERT_NE(set.FindInput(Collada::Semantic::Position), nullptr);
				EXPECT_EQ(set.FindInput(Collada::Semantic::Position)->myIndices.size(),
				          set.GetTriangleCount() * 3);
			}
		}
		ASSERT_NE(document.GetVisualScene(), nullptr);
		EXPECT_EQ(CountNodes(document.GetVisualScene()->myNodes), expected.myNodes);
		EXPECT_EQ(document.GetCameras().size(), expected.myCameras);
		EXPECT_EQ(document.GetLights().size(), expected.myLights);
		EXPECT_EQ(document.GetImages().size(), expected.myImages);
		EXPECT_EQ(document.GetMaterials().size(), expected.myMaterials);
		EXPECT_EQ(document.GetControllers().size(), expected.myControllers);
	}
}

TEST(ColladaDocumentTest, MaterialsLeadToImageFilesAndCamerasAndLightsKeepTheirParameters)
{
	Collada::Document document;
	std::string error;
	ASSERT_TRUE(document.Load("../shared/testdata/collada/kwxport_test_vcolors.dae", error)) << error;
	const Collada::Effect* effect = document.FindEffect("top-fx");
	ASSERT_NE(effect, nullptr);
	EXPECT_EQ(effect->myShading, Collada::Shading::Blinn);
	ASSERT_TRUE(effect->myDiffuse.myHasTextureFlag);
	EXPECT_EQ(effect->myDiffuse.myTexcoord, "CHANNEL1");
	ASSERT_NE(document.FindImage(effect->myDiffuse.myImage), nullptr);
	EXPECT_EQ(document.FindImage(effect->myDiffuse.myImage)->myPath, "./../X/top.tga");

	// An older exporter names the image directly and writes a file:// URI with backslashes.
	ASSERT_TRUE(document.Load("../shared/testdata/collada/teapots.DAE", error)) << error;
	ASSERT_EQ(document.GetImages().size(), 1u);
	EXPECT_EQ(document.GetImages()[0].myPath, "../LWO/LWO2/MappingModes/earthSpherical.jpg");

	ASSERT_TRUE(document.Load("../shared/testdata/collada/cube_tristrips.dae", error)) << error;
	const Collada::Camera* camera = document.FindCamera("PerspCamera");
	ASSERT_NE(camera, nullptr);
	EXPECT_TRUE(camera->myHasYFlag);
	EXPECT_FLOAT_EQ(camera->myYFov, 37.8493f);
	EXPECT_FLOAT_EQ(camera->myZFar, 1000.0f);
	// The empty <light id="light"/> before the real one must not hide it.
	const Collada::Light* light = document.FindLight("light");
	ASSERT_NE(light, nullptr);
	EXPECT_EQ(light->myKind, Collada::LightKind::Point);
	EXPECT_FLOAT_EQ(light->myConstantAttenuation, 1.0f);

	ASSERT_TRUE(document.Load("../shared/testdata/collada/cameras.dae", error)) << error;
	size_t orthographic = 0;
	for (const Collada::Camera& each : document.GetCameras())
	{
		orthographic += each.myProjection == Collada::Projection::Orthographic ? 1 : 0;
	}
	EXPECT_EQ(orthographic, 1u);
}

namespace
{
const char* ourMeshHead = R"(<COLLADA><library_geometries><geometry id="g"><mesh>
<source id="p"><float_array id="pa" count="9">0 0 0 1 0 0 0 1 0</float_array>
<technique_common><accessor source="#pa" count="3" stride="3"/></technique_common></source>
<vertices id="v"><input semantic="POSITION" source="#p"/></vertices>
)";

std::string MeshDocument(const std::string& aSets)
{
	return std::string(ourMeshHead) + aSets + "</mesh></geometry></library_geometries></COLLADA>";
}
} // namespace

TEST(ColladaDocumentTest, MalformedDocumentsGiveClearErrors)
{
	struct Case
	{
		std::string myText;
		std::string myError;
	};
	const Case cases[] = {
	    {"<COLLADA><asset>", "not well-formed XML"},
	    {"<model/>", "bad.dae:1: <model>: the root element is not <COLLADA>"},
	    {MeshDocument(
	         R"(<triangles count="1"><input semantic="VERTEX" source="#v" offset="0"/><p>0 1 3</p></triangles>)"),
	     "bad.dae:5: <input>: index 3 is past the end of source 'p' (3 elements)"},
	    {MeshDocument(
	         R"(<triangles count="2"><input semantic="VERTEX" source="#v" offset="0"/><p>0 1 2</p></triangles>)"),
	     "bad.dae:5: <p>: has 3 indices; 6 corners of 1 need 6"},
	    {MeshDocument(
	         R"(<polylist count="1"><input semantic="VERTEX" source="#v" offset="0"/><vcount>4</vcount><p>0 1 2</p></polylist>)"),
	     "bad.dae:5: <p>: has 3 indices; 4 corners of 1 need 4"},
	    {MeshDocument(
	         R"(<triangles count="1"><input semantic="NORMAL" source="#n" offset="0"/><p>0 1 2</p></triangles>)"),
	     "bad.dae:5: <input>: source '#n' is not in the mesh"},
	    {MeshDocument(
	         R"(<triangles count="1"><input semantic="VERTEX" source="#v" offset="0"/><p>0 x 2</p></triangles>)"),
	     "bad.dae:5: <p>: 'x' is not a valid index"},
	    {R"(<COLLADA><library_geometries><geometry id="g"><mesh>
<source id="p"><float_array id="pa" count="8">0 0 0 1 0 0 0 1</float_array>
<technique_common><accessor source="#pa" count="3" stride="3"/></technique_common></source></mesh></geometry></library_geometries></COLLADA>)",
	     "bad.dae:3: <accessor>: count 3 x stride 3 needs 9 values but the array has 8"},
	    {R"(<COLLADA><library_geometries><geometry id="g"><mesh>
<source id="p"><float_array id="pa" count="9">0 0 0 1 0 0 0 1</float_array></source></mesh></geometry></library_geometries></COLLADA>)",
	     "bad.dae:2: <float_array>: count 9 but 8 values"},
	    {R"(<COLLADA><library_geometries><geometry id="g"><mesh/></geometry></library_geometries></COLLADA>)",
	     "bad.dae:1: <mesh>: missing <vertices>"},
	    {R"(<COLLADA><library_visual_scenes><visual_scene id="s">
<node><instance_geometry url="#nothing"/></node></visual_scene></library_visual_scenes></COLLADA>)",
	     "bad.dae:2: <instance>: '#nothing' is not in the document"},
	    {R"(<COLLADA><library_visual_scenes><visual_scene id="s">
<node><instance_geometry url="other.dae#g"/></node></visual_scene></library_visual_scenes></COLLADA>)",
	     "bad.dae:2: <instance_geometry>: 'other.dae#g' is not a reference inside this document"},
	    {R"(<COLLADA><library_visual_scenes><visual_scene id="s">
<node id="a"><instance_node url="#b"/><node id="b"><instance_node url="#a"/></node></node></visual_scene></library_visual_scenes></COLLADA>)",
	     "instances itself through instance_node"},
	    {R"(<COLLADA><library_visual_scenes><visual_scene id="s">
<node><translate>1 2</translate></node></visual_scene></library_visual_scenes></COLLADA>)",
	     "bad.dae:2: <translate>: needs 3 values, has 2"},
	    {R"(<COLLADA><library_materials><material id="m">
<instance_effect url="#fx"/></material></library_materials></COLLADA>)",
	     "bad.dae:2: <instance_effect>: effect '#fx' is not in the document"},
	    {R"(<COLLADA><library_cameras><camera id="c"/></library_cameras></COLLADA>)",
	     "bad.dae:1: <camera>: missing <optics>"},
	    {R"(<COLLADA><scene><instance_visual_scene url="#none"/></scene></COLLADA>)",
	     "bad.dae:1: <instance_visual_scene>: visual scene '#none' is not in the document"},
	};
	for (const Case& each : cases)
	{
		SCOPED_TRACE(each.myText);
		Collada::Document document;
		std::string error;
		EXPECT_FALSE(document.LoadFromMemory(each.myText.data(), each.myText.size(), error, "bad.dae"));
		EXPECT_NE(error.find(each.myError), std::string::npos) << error;
		EXPECT_TRUE(document.GetGeometries().empty());
	}
	Collada::Document document;
	std::string error;
	EXPECT_FALSE(document.Load("../shared/testdata/collada/no-such-file.dae", error));
	EXPECT_EQ(error, "../shared/testdata/collada/no-such-file.dae: cannot open the file");
}
