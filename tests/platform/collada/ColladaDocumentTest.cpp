// The document reader on real exporters' files and on small broken documents.

#include <array>
#include <gtest/gtest.h>
#include <string>
#include <tuple>
#include <vector>

#include "platform/collada/Document.h"
#include "support/TestSupport.h"

namespace
{
size_t CountNodes(const std::vector<std::unique_ptr<Collada::Node>>& someNodes)
{
	size_t count = 0;
	for (const auto& node : someNodes)
	{
		count += 1 + CountNodes(node->myChildren);
	}
	return count;
}

// What a document holds: its up axis, per mesh the polygon sets, sources and triangles once
// triangulated (n - 2 per polygon, strip or fan), then its nodes, cameras, lights, images,
// materials and controllers.
using Counts = std::tuple<std::string, std::vector<std::array<size_t, 3>>, std::array<size_t, 6>>;

Counts CountsOf(const Collada::Document& aDocument)
{
	std::vector<std::array<size_t, 3>> meshes;
	for (const Collada::Geometry& geometry : aDocument.GetGeometries())
	{
		Collada::Mesh mesh = geometry.myMesh;
		const size_t sets = mesh.mySets.size();
		mesh.Triangulate();
		EXPECT_TRUE(mesh.IsTriangles());
		meshes.push_back({sets, mesh.mySources.size(), mesh.GetTriangleCount()});
	}
	const Collada::VisualScene* scene = aDocument.GetVisualScene();
	return {aDocument.GetAsset().myUpAxis,
	        meshes,
	        {scene ? CountNodes(scene->myNodes) : 0, aDocument.GetCameras().size(),
	         aDocument.GetLights().size(), aDocument.GetImages().size(), aDocument.GetMaterials().size(),
	         aDocument.GetControllers().size()}};
}
} // namespace

TEST(ColladaDocumentTest, RealDocumentsLoadWithTheirCounts)
{
	LUMORA_SKIP_WITHOUT_SHARED_TESTDATA();
	const std::pair<const char*, Counts> documents[] = {
	    {"Cinema4D.dae", {"Y_UP", {{1, 3, 756}, {1, 3, 528}, {1, 3, 12}}, {3, 0, 0, 0, 1, 0}}},
	    {"ConcavePolygon.dae", {"Y_UP", {{1, 1, 64}}, {1, 0, 0, 0, 1, 0}}},
	    {"box_nested_animation.dae", {"Z_UP", {{1, 3, 12}}, {3, 0, 0, 0, 1, 1}}},
	    {"cameras.dae", {"Z_UP", {}, {3, 3, 0, 0, 0, 0}}},
	    {"cube_tristrips.dae", {"Z_UP", {{1, 2, 12}}, {7, 2, 4, 0, 1, 0}}},
	    {"kwxport_test_vcolors.dae", {"Z_UP", {{3, 4, 12}}, {1, 0, 0, 3, 3, 0}}},
	    {"lights.dae", {"Z_UP", {}, {5, 0, 5, 0, 0, 0}}},
	    {"sphere.dae", {"Y_UP", {{1, 3, 760}}, {1, 0, 0, 0, 1, 0}}},
	    {"teapots.DAE", {"Z_UP", {{1, 3, 992}, {1, 3, 992}, {1, 2, 992}}, {3, 0, 0, 1, 3, 0}}},
	};
	for (const auto& [file, expected] : documents)
	{
		SCOPED_TRACE(file);
		Collada::Document document;
		std::string error;
		ASSERT_TRUE(document.Load(std::string("../shared/testdata/collada/") + file, error)) << error;
		EXPECT_EQ(CountsOf(document), expected);
	}
}

TEST(ColladaDocumentTest, MaterialsLeadToImageFilesAndCamerasAndLightsKeepTheirParameters)
{
	LUMORA_SKIP_WITHOUT_SHARED_TESTDATA();
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
	EXPECT_EQ(std::tuple(camera->myHasYFlag, camera->myYFov, camera->myZFar),
	          std::tuple(true, 37.8493f, 1000.0f));
	// The empty <light id="light"/> before the real one must not hide it.
	const Collada::Light* light = document.FindLight("light");
	ASSERT_NE(light, nullptr);
	EXPECT_EQ(std::pair(light->myKind, light->myConstantAttenuation),
	          std::pair(Collada::LightKind::Point, 1.0f));
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
