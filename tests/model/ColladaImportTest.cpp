// Importing COLLADA documents through the model factory with a GPU: small hand-written
// documents pin the vertex numbering, the winding, the texture coordinates, the mirror at
// the root, the skin words, cameras, lights, material textures and the refusal of a
// geometry that fits no vertex type.
#include <array>
#include <cstring>
#include <fstream>
#include <gmock/gmock-matchers.h>
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
std::vector<uint32_t> Indices(const Zeph::Model& aModel)
{
	std::vector<uint32_t> indices(aModel.GetIndexData().size() / 4);
	std::memcpy(indices.data(), aModel.GetIndexData().data(), indices.size() * 4);
	return indices;
}

// The callers check the vertex count first, so the value lies inside the vertex data.
template <typename T> T VertexValue(const Zeph::Model& aModel, int aVertex, int anOffset)
{
	T value{};
	const size_t at = static_cast<size_t>(aVertex * aModel.GetVertexStride() + anOffset);
	std::memcpy(&value, aModel.GetVertexData().subspan(at, sizeof(T)).data(), sizeof(T));
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

TEST_F(ColladaImportTest, CornersWindingUvsMirrorCameraLightAndTexturesOfALitQuad)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	const char* channels[5] = {"reflective", "diffuse", "bump", "specular", "ambient"};
	std::string images[5];
	std::string imageLibrary = "<library_images>";
	for (int index = 0; index < 5; ++index)
	{
		images[index] = WriteSolidTexture(std::string(channels[index]) + ".dds");
		imageLibrary += std::string("<image id=\"") + channels[index] + "\"><init_from>file://" +
		                images[index] + "</init_from></image>";
	}
	imageLibrary += "</library_images>";
	const std::string libraries =
	    imageLibrary + R"(<library_effects><effect id="fx"><profile_COMMON><technique sid="t"><phong>
<ambient><texture texture="ambient" texcoord="uv"/></ambient>
<diffuse><texture texture="diffuse" texcoord="uv"/></diffuse>
<specular><texture texture="specular" texcoord="uv"/></specular>
<reflective><texture texture="reflective" texcoord="uv"/></reflective>
</phong><extra><technique profile="FCOLLADA"><bump><texture texture="bump" texcoord="uv"/></bump></technique></extra>
</technique></profile_COMMON></effect></library_effects>
<library_materials><material id="mat"><instance_effect url="#fx"/></material></library_materials>
<library_cameras><camera id="cam"><optics><technique_common><perspective><yfov>45</yfov>
<aspect_ratio>1.5</aspect_ratio><znear>0.5</znear><zfar>200</zfar></perspective></technique_common></optics></camera></library_cameras>
<library_lights><light id="sun"><technique_common><directional><color>0.5 0.25 1</color></directional></technique_common></light>
<light id="lamp"><technique_common><point><color>1 1 1</color></point></technique_common></light>
<light id="cone"><technique_common><spot><color>1 1 1</color></spot></technique_common></light>
<light id="sky"><technique_common><ambient><color>1 1 1</color></ambient></technique_common></light></library_lights>)";
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
<node id="k" name="Lamp"><instance_light url="#lamp"/></node>
<node id="o" name="Cone"><instance_light url="#cone"/></node>
<node id="a" name="Sky"><instance_light url="#sky"/></node>)";
	const std::string path = WriteDocument("quad.dae", Document(sources, sets, libraries, nodes));
	const Zeph::ModelNode* tree = Zeph::Engine::GetInstance()->GetModelFactory().GetModel(path);
	ASSERT_NE(tree, nullptr) << TakeLog();

	// The root is the scene with the identity transform, mirrored in x.
	const Matrix44<float> root = tree->GetTransformation()->GetTransformationForTime(0.0);
	EXPECT_EQ(std::vector<float>(root.myMatrix, root.myMatrix + 16),
	          (std::vector<float>{-1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1}));
	ASSERT_EQ(tree->GetChildren().Count(), 6);
	const Zeph::ModelNode& quad = *tree->GetChildren()[0];
	EXPECT_EQ(quad.GetName(), "Quad");
	const Matrix44<float> local = quad.GetTransformation()->GetTransformationForTime(0.0);
	EXPECT_EQ(std::vector<float>(local.myMatrix + 12, local.myMatrix + 15), (std::vector<float>{1, 2, 3}));

	const Zeph::Model* model = quad.GetModel();
	ASSERT_NE(model, nullptr);
	EXPECT_EQ(model->GetVertexType(), 4);
	ASSERT_EQ(model->GetVertexCount(), 4) << "the repeated key is one vertex";
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
	// Point and spot lights give point records; ambient light has no place at a node.
	for (int child = 3; child < 5; ++child)
	{
		ASSERT_NE(tree->GetChildren()[child]->GetLight(), nullptr);
		EXPECT_EQ(tree->GetChildren()[child]->GetLight()->myKind, Zeph::ModelLight::POINT);
	}
	EXPECT_EQ(tree->GetChildren()[5]->GetLight(), nullptr);
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

// Position and normal without texture coordinates fit no vertex type: the document is refused.
TEST_F(ColladaImportTest, AGeometryOfNoVertexTypeIsRefused)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	const std::string sets = R"(<triangles count="1"><input semantic="VERTEX" source="#v" offset="0"/>
<input semantic="NORMAL" source="#n" offset="1"/><p>0 0 1 0 2 0</p></triangles>)";
	const std::string path = WriteDocument(
	    "no-uv.dae", Document(Source("p", 3, "0 0 0 1 0 0 0 1 0") + Source("n", 3, "0 0 -1"), sets, "",
	                          R"(<node id="n"><instance_geometry url="#g"/></node>)"));
	EXPECT_EQ(Zeph::Engine::GetInstance()->GetModelFactory().GetModel(path), nullptr);
	EXPECT_THAT(TakeLog(), testing::AllOf(testing::HasSubstr("no vertex type has the layout"),
	                                      testing::HasSubstr("Couldn't load Model: " + path)));
}
