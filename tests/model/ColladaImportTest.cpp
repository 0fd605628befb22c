// Importing COLLADA documents through the model factory with a GPU: the exporters'
// documents give the trees they declare or are rejected, and small hand-written
// documents pin the vertex numbering, the winding, the texture coordinates, the
// mirror at the root, the skin words, cameras, lights and material textures.
#include <array>
#include <cstring>
#include <fstream>
#include <gtest/gtest.h>
#include <iterator>
#include <numbers>
#include <sstream>
#include <tuple>
#include <vector>

#include "engine/Camera.h"
#include "engine/EngineFixture.h"
#include "model/Model.h"
#include "model/ModelFactory.h"
#include "model/ModelLight.h"
#include "model/ModelNode.h"
#include "model/TransformationNode.h"

namespace
{
struct FoundModel
{
	std::string myNode;
	const Zeph::Model* myModel;
};

struct TreeContents
{
	std::vector<FoundModel> myModels;
	std::vector<const Zeph::ModelNode*> myLights;
};

void Collect(const Zeph::ModelNode& aNode, TreeContents& someContents)
{
	if (aNode.GetModel() != nullptr)
	{
		someContents.myModels.push_back({aNode.GetName(), aNode.GetModel()});
	}
	if (aNode.GetLight() != nullptr)
	{
		someContents.myLights.push_back(&aNode);
	}
	for (const Zeph::ModelNode* child : aNode.GetChildren())
	{
		Collect(*child, someContents);
	}
}

std::vector<uint32_t> Indices(const Zeph::Model& aModel)
{
	std::vector<uint32_t> indices(aModel.GetIndexData().size() / 4);
	std::memcpy(indices.data(), aModel.GetIndexData().data(), indices.size() * 4);
	return indices;
}

template <typename T> T VertexValue(const Zeph::Model& aModel, int aVertex, int anOffset)
{
	T value{};
	const size_t at = static_cast<size_t>(aVertex * aModel.GetVertexStride() + anOffset);
	EXPECT_LE(at + sizeof(T), aModel.GetVertexData().size());
	if (at + sizeof(T) <= aModel.GetVertexData().size())
	{
		std::memcpy(&value, aModel.GetVertexData().data() + at, sizeof(T));
	}
	return value;
}

class ColladaImportTest : public EngineTest
{
protected:
	std::string WriteDocument(const std::string& aName, const std::string& aText)
	{
		const std::string path = myScratch.File(aName);
		std::ofstream(path) << aText;
		return path;
	}
};

// A geometry "g" whose inputs are listed in aSetInputs (VERTEX at offset 0) and
// whose sources are aSources; nodes and the rest go into the scene and libraries.
std::string Document(const std::string& aSources, const std::string& aSets, const std::string& aLibraries,
                     const std::string& aNodes)
{
	return R"(<COLLADA version="1.4.1"><library_geometries><geometry id="g"><mesh>)" + aSources +
	       R"(<vertices id="v"><input semantic="POSITION" source="#p"/></vertices>)" + aSets +
	       "</mesh></geometry></library_geometries>" + aLibraries +
	       R"(<library_visual_scenes><visual_scene id="s">)" + aNodes +
	       R"(</visual_scene></library_visual_scenes><scene><instance_visual_scene url="#s"/></scene></COLLADA>)";
}

std::string Source(const std::string& anId, int aStride, const std::string& someValues)
{
	std::istringstream values(someValues);
	const auto count = static_cast<int>(
	    std::distance(std::istream_iterator<std::string>(values), std::istream_iterator<std::string>()));
	return "<source id=\"" + anId + "\"><float_array id=\"" + anId + "a\" count=\"" + std::to_string(count) +
	       "\">" + someValues + "</float_array><technique_common><accessor source=\"#" + anId +
	       "a\" count=\"" + std::to_string(count / aStride) + "\" stride=\"" + std::to_string(aStride) +
	       "\"/></technique_common></source>";
}
} // namespace

TEST_F(ColladaImportTest, ExportersDocumentsImportAsDeclaredOrAreRejected)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	struct ExpectedModel
	{
		const char* myNode;
		int myVertexType;
		int myVertexCount; // distinct corner keys
		int myIndexCount;  // corners after triangulation, all in one surface
	};
	struct ExpectedDocument
	{
		const char* myFile;
		bool myRejectedFlag;
		std::vector<ExpectedModel> myModels;
		size_t myLights = 0;
	};
	const ExpectedDocument documents[] = {
	    // One polylist of 400 quads and 40 cap triangles (760 triangles) on 382 positions;
	    // seams and poles give 401 distinct position/normal/uv corners. Type 2.
	    {"sphere.dae", false, {{"pSphere1", 2, 401, 2280}}},
	    // Three nodes with one triangle set each: cone 756 triangles, sphere 528, cube 12
	    // (24 corners: 4 per face).
	    {"Cinema4D.dae",
	     false,
	     {{"Kegel", 2, 433, 2268}, {"Kugel", 2, 266, 1584}, {"W\xC3\xBCrfel", 2, 24, 36}}},
	    // A skinned cube (the controller under "Armature"; the bone is a joint, not a
	    // node of the tree): 12 triangles, no corner shared; position, weights, bones,
	    // normal, uv is type 7.
	    {"box_nested_animation.dae", false, {{"Cube", 7, 36, 36}}},
	    // Lamp and Area are point lights, Sun directional, Spot a spot (a point record);
	    // Hemi is ambient and gives no record.
	    {"lights.dae", false, {}, 4},
	    // Position and normal, no uv: no vertex type.
	    {"cube_tristrips.dae", true, {}},
	};
	Zeph::ModelFactory& factory = Zeph::Engine::GetInstance()->GetModelFactory();
	for (const ExpectedDocument& expected : documents)
	{
		SCOPED_TRACE(expected.myFile);
		const std::string path = std::string("../shared/testdata/collada/") + expected.myFile;
		const Zeph::ModelNode* tree = factory.GetModel(path);
		const std::string log = TakeLog();
		if (expected.myRejectedFlag)
		{
			EXPECT_EQ(tree, nullptr);
			EXPECT_NE(log.find("Couldn't load Model: " + path), std::string::npos) << log;
			EXPECT_NE(log.find("no vertex type has the layout"), std::string::npos) << log;
			continue;
		}
		ASSERT_NE(tree, nullptr) << log;
		EXPECT_EQ(log.find("CRITICAL"), std::string::npos) << log;
		TreeContents contents;
		Collect(*tree, contents);
		EXPECT_EQ(contents.myLights.size(), expected.myLights);
		ASSERT_EQ(contents.myModels.size(), expected.myModels.size());
		for (size_t index = 0; index < expected.myModels.size(); ++index)
		{
			const ExpectedModel& model = expected.myModels[index];
			const Zeph::Model& actual = *contents.myModels[index].myModel;
			ASSERT_EQ(actual.GetSurfaces().Count(), 1) << model.myNode;
			EXPECT_EQ(std::tuple(contents.myModels[index].myNode, actual.GetVertexType(),
			                     actual.GetVertexCount(), actual.GetIndexCount(),
			                     actual.GetSurfaces()[0].GetIndexCount(), actual.GetTechniqueName()),
			          std::tuple(std::string(model.myNode), model.myVertexType, model.myVertexCount,
			                     model.myIndexCount, model.myIndexCount, std::string("Render")));
		}
	}
}

TEST_F(ColladaImportTest, CornersWindingUvsMirrorCameraLightAndTexturesOfALitQuad)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	const std::string images[5] = {WriteSolidTexture("reflective.dds"), WriteSolidTexture("diffuse.dds"),
	                               WriteSolidTexture("bump.dds"), WriteSolidTexture("specular.dds"),
	                               WriteSolidTexture("ambient.dds")};
	std::string imageLibrary = "<library_images>";
	const char* imageIds[5] = {"imgR", "imgD", "imgB", "imgS", "imgA"};
	for (int index = 0; index < 5; ++index)
	{
		imageLibrary += std::string("<image id=\"") + imageIds[index] + "\"><init_from>file://" +
		                images[index] + "</init_from></image>";
	}
	imageLibrary += "</library_images>";
	const std::string libraries =
	    imageLibrary + R"(<library_effects><effect id="fx"><profile_COMMON><technique sid="t"><phong>
<ambient><texture texture="imgA" texcoord="uv"/></ambient>
<diffuse><texture texture="imgD" texcoord="uv"/></diffuse>
<specular><texture texture="imgS" texcoord="uv"/></specular>
<reflective><texture texture="imgR" texcoord="uv"/></reflective>
</phong><extra><technique profile="FCOLLADA"><bump><texture texture="imgB" texcoord="uv"/></bump></technique></extra>
</technique></profile_COMMON></effect></library_effects>
<library_materials><material id="mat"><instance_effect url="#fx"/></material></library_materials>
<library_cameras><camera id="cam"><optics><technique_common><perspective><yfov>45</yfov>
<aspect_ratio>1.5</aspect_ratio><znear>0.5</znear><zfar>200</zfar></perspective></technique_common></optics></camera></library_cameras>
<library_lights><light id="sun"><technique_common><directional><color>0.5 0.25 1</color></directional></technique_common></light>
<light id="lamp"><technique_common><point><color>1 1 1</color></point></technique_common></light></library_lights>)";
	// Corners 0, 1, 2 of the first triangle are distinct; the second repeats one key
	// three times. Position, normal, uv, texture tangent and binormal: type 4.
	const std::string sources = Source("p", 3, "0 0 0 1 0 0 0 1 0 5 5 5") + Source("n", 3, "0 0 -1") +
	                            Source("t", 2, "0.25 0.25 1 0 0 1") + Source("tt", 3, "1 0 0") +
	                            Source("tb", 3, "0 1 0");
	const std::string sets =
	    R"(<triangles count="2" material="surface"><input semantic="VERTEX" source="#v" offset="0"/>
<input semantic="NORMAL" source="#n" offset="1"/><input semantic="TEXCOORD" source="#t" offset="2"/>
<input semantic="TEXTANGENT" source="#tt" offset="3"/><input semantic="TEXBINORMAL" source="#tb" offset="4"/>
<p>0 0 0 0 0  1 0 1 0 0  2 0 2 0 0  3 0 1 0 0  3 0 1 0 0  3 0 1 0 0</p></triangles>)";
	const std::string nodes = R"(<node id="quad" name="Quad"><translate>1 2 3</translate>
<instance_geometry url="#g"><bind_material><technique_common><instance_material symbol="surface" target="#mat"/>
</technique_common></bind_material></instance_geometry></node>
<node id="c" name="Cam"><instance_camera url="#cam"/></node>
<node id="l" name="Sun"><instance_light url="#sun"/></node>
<node id="k" name="Lamp"><instance_light url="#lamp"/></node>)";
	const std::string path = WriteDocument("quad.dae", Document(sources, sets, libraries, nodes));
	const Zeph::ModelNode* tree = Zeph::Engine::GetInstance()->GetModelFactory().GetModel(path);
	ASSERT_NE(tree, nullptr) << TakeLog();

	// The root is the scene with the identity transform, mirrored in x.
	const Matrix44<float> root = tree->GetTransformation()->GetTransformationForTime(0.0);
	EXPECT_EQ(std::vector<float>(root.myMatrix, root.myMatrix + 16),
	          (std::vector<float>{-1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1}));
	ASSERT_EQ(tree->GetChildren().Count(), 4);
	const Zeph::ModelNode& quad = *tree->GetChildren()[0];
	EXPECT_EQ(quad.GetName(), "Quad");
	const Matrix44<float> local = quad.GetTransformation()->GetTransformationForTime(0.0);
	EXPECT_EQ(std::vector<float>(local.myMatrix + 12, local.myMatrix + 15), (std::vector<float>{1, 2, 3}));

	const Zeph::Model* model = quad.GetModel();
	ASSERT_NE(model, nullptr);
	EXPECT_EQ(model->GetVertexType(), 4);
	EXPECT_EQ(model->GetVertexCount(), 4) << "the repeated key is one vertex";
	EXPECT_EQ(Indices(*model), (std::vector<uint32_t>{2, 1, 0, 3, 3, 3}));
	// Type 4: position 0, normal 12, uv 24, tangent 32, binormal 44.
	const std::tuple<int, int, float> values[] = {{0, 24, 0.25f}, {0, 28, 0.75f}, {1, 0, 1.0f},
	                                              {1, 28, 1.0f},  {3, 0, 5.0f},   {2, 20, -1.0f},
	                                              {2, 32, 1.0f},  {2, 48, 1.0f}};
	for (const auto& [vertex, offset, value] : values)
	{
		EXPECT_EQ(VertexValue<float>(*model, vertex, offset), value) << vertex << " at " << offset;
	}

	ASSERT_EQ(model->GetSurfaces().Count(), 1);
	const Zeph::Surface& surface = model->GetSurfaces()[0];
	EXPECT_EQ(std::tuple(surface.GetIndexCount(), surface.GetStartIndex(), surface.GetPrimitiveTopology()),
	          std::tuple(6, 0, Gpu::PrimitiveTopology::TriangleList));
	const char* variables[5] = {"SubstanceTexture", "DiffuseTexture", "NormalTexture", "RoughnessTexture",
	                            "AOTexture"};
	const bool srgb[5] = {true, true, false, true, true};
	ASSERT_EQ(surface.GetTextureCount(), 5);
	for (int index = 0; index < 5; ++index)
	{
		EXPECT_EQ(surface.GetTextureFileName(index), images[index]) << index;
		EXPECT_EQ(surface.GetTextureVariableName(index), variables[index]) << index;
		EXPECT_EQ(surface.GetTextureSRGBFlag(index), srgb[index]) << index;
		EXPECT_NE(surface.GetTexture(index), nullptr) << index;
	}

	const Zeph::Camera* camera = tree->GetChildren()[1]->GetCamera();
	ASSERT_NE(camera, nullptr);
	EXPECT_EQ((std::vector{camera->GetFov(), camera->GetAspectRatio(), camera->GetNearPlane(),
	                       camera->GetFarPlane()}),
	          (std::vector{45.0f * std::numbers::pi_v<float> / 180.0f, 1.5f, 0.5f, 200.0f}));
	const Zeph::ModelLight* sun = tree->GetChildren()[2]->GetLight();
	ASSERT_NE(sun, nullptr);
	EXPECT_EQ(sun->myKind, Zeph::ModelLight::DIRECTIONAL);
	EXPECT_EQ((std::vector{sun->myColor.x, sun->myColor.y, sun->myColor.z, sun->myColor.w}),
	          (std::vector{0.5f, 0.25f, 1.0f, 1.0f}));
	ASSERT_NE(tree->GetChildren()[3]->GetLight(), nullptr);
	EXPECT_EQ(tree->GetChildren()[3]->GetLight()->myKind, Zeph::ModelLight::POINT);
}

TEST_F(ColladaImportTest, ASkinStoresWeightsAndBonesBytesPerInfluence)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	std::string bind;
	for (int joint = 0; joint < 4; ++joint)
	{
		bind += "1 0 0 0 0 1 0 0 0 0 1 0 0 0 0 1 ";
	}
	// Vertex 0 on joint 3 alone, vertex 1 on joint 1, vertex 2 half on joints 0 and 2
	// (listed smaller weight first, to be sorted).
	const std::string libraries =
	    R"(<library_controllers><controller id="skin"><skin source="#g">
<source id="j"><Name_array id="ja" count="4">J0 J1 J2 J3</Name_array><technique_common><accessor source="#ja" count="4" stride="1"/></technique_common></source>
)" + Source("ib", 16, bind) +
	    Source("w", 1, "1 0.25 0.75") +
	    R"(<joints><input semantic="JOINT" source="#j"/><input semantic="INV_BIND_MATRIX" source="#ib"/></joints>
<vertex_weights count="3"><input semantic="JOINT" source="#j" offset="0"/><input semantic="WEIGHT" source="#w" offset="1"/>
<vcount>1 1 2</vcount><v>3 0 1 0 0 1 2 2</v></vertex_weights></skin></controller></library_controllers>)";
	const std::string sources =
	    Source("p", 3, "0 0 0 1 0 0 0 1 0") + Source("n", 3, "0 0 -1") + Source("t", 2, "0 0 1 0 0 1");
	const std::string sets = R"(<triangles count="1"><input semantic="VERTEX" source="#v" offset="0"/>
<input semantic="NORMAL" source="#n" offset="1"/><input semantic="TEXCOORD" source="#t" offset="2"/>
<p>0 0 0 1 0 1 2 0 2</p></triangles>)";
	const std::string nodes = R"(<node id="b" name="Body"><instance_controller url="#skin"/></node>)";
	const std::string path = WriteDocument("skin.dae", Document(sources, sets, libraries, nodes));
	const Zeph::ModelNode* tree = Zeph::Engine::GetInstance()->GetModelFactory().GetModel(path);
	ASSERT_NE(tree, nullptr) << TakeLog();
	ASSERT_EQ(tree->GetChildren().Count(), 1);
	const Zeph::Model* model = tree->GetChildren()[0]->GetModel();
	ASSERT_NE(model, nullptr);
	EXPECT_EQ(model->GetVertexType(), 7);
	ASSERT_EQ(model->GetVertexCount(), 3);
	// Type 7: position 0, weights 12, bones 16, normal 20, uv 32.
	using Bytes = std::array<uint8_t, 4>;
	struct Expected
	{
		Bytes myWeights;
		Bytes myBones;
	};
	const Expected expected[3] = {
	    {{255, 0, 0, 0}, {3, 0, 0, 0}},
	    {{255, 0, 0, 0}, {1, 0, 0, 0}},
	    {{191, 64, 0, 0}, {2, 0, 0, 0}},
	};
	for (int vertex = 0; vertex < 3; ++vertex)
	{
		EXPECT_EQ(VertexValue<Bytes>(*model, vertex, 12), expected[vertex].myWeights) << "vertex " << vertex;
		EXPECT_EQ(VertexValue<Bytes>(*model, vertex, 16), expected[vertex].myBones) << "vertex " << vertex;
	}
	EXPECT_EQ(VertexValue<float>(*model, 0, 28), -1.0f);
}
