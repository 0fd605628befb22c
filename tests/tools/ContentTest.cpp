// The sample-content generator: every document loads (the reader checks counts and indices), has the
// sources of the lit vertex layout with proper tangent frames, and binds textures that exist with full
// mip chains; and the committed files under data/ (models, textures, grading lookups, cube maps,
// catalogues and sample levels) are what the generator writes now, which also holds it to the same
// bytes run after run. How the textures look is held by the frame goldens that draw them.

#include <gtest/gtest.h>

#include <algorithm>
#include <bit>
#include <cmath>
#include <filesystem>
#include <set>
#include <string>
#include <vector>

#include "GeneratedContent.h"
#include "Generator.h"
#include "platform/collada/Document.h"
#include "platform/dds/DdsFile.h"
#include "platform/dds/Format.h"
#include "support/TestSupport.h"

namespace
{
using ContentTestSupport::Dot;
using Vec = Vector3<double>;

Vec Read(const Collada::Source& aSource, uint32_t anIndex)
{
	const float* value = aSource.Element(anIndex);
	return value ? Vec(value[0], value[1], value[2]) : Vec(0.0, 0.0, 0.0);
}

using ContentTestSupport::GeneratedContent;

// The texture file an image path of a document names, inside the generated directory.
std::string GeneratedFileFor(const std::string& anImagePath)
{
	EXPECT_TRUE(anImagePath.starts_with("data/textures/")) << anImagePath;
	return GeneratedContent::Get().Path(anImagePath.substr(std::string("data/").size()));
}

// Every material of the document's one node binds the four channels the importer reads to distinct
// textures that exist with full mip chains.
void CheckMaterials(const Collada::Document& aDocument, const std::string& aName)
{
	ASSERT_NE(aDocument.GetVisualScene(), nullptr) << aName;
	ASSERT_EQ(aDocument.GetVisualScene()->myNodes.size(), 1u) << aName;
	const Collada::Node& node = *aDocument.GetVisualScene()->myNodes[0];
	ASSERT_EQ(node.myInstances.size(), 1u) << aName;
	const Collada::Geometry* geometry = aDocument.FindGeometry(node.myInstances[0].myUrl);
	ASSERT_NE(geometry, nullptr) << aName;
	for (const Collada::PolygonSet& set : geometry->myMesh.mySets)
	{
		const Collada::InstanceMaterial* binding = node.myInstances[0].FindMaterial(set.myMaterial);
		ASSERT_NE(binding, nullptr) << aName << ": " << set.myMaterial;
		const Collada::Material* material = aDocument.FindMaterial(binding->myTarget);
		ASSERT_NE(material, nullptr) << aName << ": " << binding->myTarget;
		const Collada::Effect* effect = aDocument.FindEffect(material->myEffect);
		ASSERT_NE(effect, nullptr) << aName << ": " << material->myEffect;
		EXPECT_EQ(effect->myShading, Collada::Shading::Phong) << aName;
		// The channels the importer binds, each with the colour space it binds the texture in
		// (sRGB for all but the normal map), which the file's format must declare.
		const std::pair<const Collada::Channel*, bool> channels[] = {{&effect->myDiffuse, true},
		                                                             {&effect->myBump, false},
		                                                             {&effect->mySpecular, true},
		                                                             {&effect->myAmbient, true}};
		std::set<std::string> paths;
		for (const auto& [channel, srgb] : channels)
		{
			ASSERT_TRUE(channel->myHasTextureFlag) << aName << ": " << effect->myId;
			const Collada::Image* image = aDocument.FindImage(channel->myImage);
			ASSERT_NE(image, nullptr) << aName << ": " << channel->myImage;
			paths.insert(image->myPath);
			Dds::Image texture;
			std::string error;
			ASSERT_TRUE(Dds::LoadFromFile(GeneratedFileFor(image->myPath), texture, error)) << error;
			const Dds::ImageInfo& info = texture.Info();
			EXPECT_EQ(info.myMipLevels, std::bit_width(std::max(info.myWidth, info.myHeight)))
			    << image->myPath;
			EXPECT_GE(info.myWidth, 128u) << image->myPath;
			EXPECT_EQ(Dds::IsSRGB(info.myFormat), srgb) << image->myPath;
			EXPECT_EQ(Dds::BlockBytes(info.myFormat), 4u) << image->myPath;
		}
		EXPECT_EQ(paths.size(), 4u) << aName << ": the four channels share a texture";
	}
}
} // namespace

TEST(ContentDocumentTest, EveryMeshHasTheLitLayoutAndEveryMaterialExistingTextures)
{
	ASSERT_EQ(GeneratedContent::Get().Error(), "");
	for (const std::string& name : GeneratedContent::Get().Documents())
	{
		Collada::Document document;
		std::string error;
		ASSERT_TRUE(document.Load(GeneratedContent::Get().Path(name), error)) << error;
		EXPECT_EQ(document.GetAsset().myUpAxis, "Y_UP") << name;
		EXPECT_EQ(document.GetAsset().myUnitMeter, 1.0f) << name;
		ASSERT_EQ(document.GetGeometries().size(), 1u) << name;
		ASSERT_NO_FATAL_FAILURE(CheckMaterials(document, name));
		Collada::Mesh mesh = document.GetGeometries()[0].myMesh;
		mesh.Triangulate();
		for (const Collada::PolygonSet& set : mesh.mySets)
		{
			// Exactly the inputs of POSITION, NORMAL, TEXCOORD, TANGENT, BINORMAL and nothing else, the
			// last three of set 0.
			using enum Collada::Semantic;
			const Collada::Semantic order[5] = {Position, Normal, TexCoord, TexTangent, TexBinormal};
			std::multiset<Collada::Semantic> semantics;
			for (const Collada::Input& input : set.myInputs)
			{
				semantics.insert(input.mySemantic);
			}
			EXPECT_EQ(semantics, std::multiset<Collada::Semantic>(std::begin(order), std::end(order)))
			    << name << ": " << set.myMaterial;
			const Collada::Input* inputs[5] = {};
			const Collada::Source* sources[5] = {};
			for (int at = 0; at < 5; ++at)
			{
				inputs[at] = set.FindInput(order[at], at < 2 ? -1 : 0);
				ASSERT_NE(inputs[at], nullptr) << name << ": " << set.myMaterial;
				sources[at] = mesh.FindSource(inputs[at]->mySource);
				ASSERT_NE(sources[at], nullptr) << name;
			}
			int failures = 0;
			for (size_t corner = 0; corner + 2 < set.GetCornerCount() && failures < 5; corner += 3)
			{
				Vec position[3], normal[3], tangent[3], binormal[3];
				double u[3], v[3];
				for (int k = 0; k < 3; ++k)
				{
					position[k] = Read(*sources[0], inputs[0]->myIndices[corner + k]);
					normal[k] = Read(*sources[1], inputs[1]->myIndices[corner + k]);
					const float* uv = sources[2]->Element(inputs[2]->myIndices[corner + k]);
					u[k] = uv[0];
					v[k] = uv[1];
					tangent[k] = Read(*sources[3], inputs[3]->myIndices[corner + k]);
					binormal[k] = Read(*sources[4], inputs[4]->myIndices[corner + k]);
					const Vec& n = normal[k];
					const Vec& t = tangent[k];
					const Vec& b = binormal[k];
					// Unit, orthogonal and right-handed.
					const double deviation =
					    std::max({std::abs(Dot(n, n) - 1.0), std::abs(Dot(t, t) - 1.0),
					              std::abs(Dot(b, b) - 1.0), std::abs(Dot(n, t)), std::abs(Dot(n, b)),
					              std::abs(Dot(t, b)), 0.99 - Dot(t.Cross(b), n)});
					if (deviation >= 1e-3 && ++failures)
					{
						ADD_FAILURE()
						    << name << ": the frame at corner " << corner + k << " is off by " << deviation;
					}
				}
				// The face winds counter-clockwise around its normals, and the frame follows the
				// texture: the tangent along +u and the binormal along +v over this triangle.
				const Vec edge1 = position[1] - position[0];
				const Vec edge2 = position[2] - position[0];
				const Vec faceNormal = edge1.Cross(edge2);
				const double du1 = u[1] - u[0], dv1 = v[1] - v[0], du2 = u[2] - u[0], dv2 = v[2] - v[0];
				const double determinant = du1 * dv2 - du2 * dv1;
				if (Dot(faceNormal, faceNormal) < 1e-12 || std::abs(determinant) < 1e-9)
				{
					continue;
				}
				const Vec alongU = (edge1 * dv2 - edge2 * dv1) * (1.0 / determinant);
				const Vec alongV = (edge2 * du1 - edge1 * du2) * (1.0 / determinant);
				for (int k = 0; k < 3; ++k)
				{
					if (Dot(faceNormal, normal[k]) <= 0.0 || Dot(alongU, tangent[k]) <= 0.0 ||
					    Dot(alongV, binormal[k]) <= 0.0)
					{
						++failures;
						ADD_FAILURE()
						    << name << ": triangle at corner " << corner << " winds against its normal"
						    << " or its frame against its texture coordinates";
						break;
					}
				}
			}
		}
	}
}

TEST(ContentStalenessTest, CommittedDataMatchesTheGenerator)
{
	ASSERT_EQ(GeneratedContent::Get().Error(), "");
	const char* const howTo =
	    "regenerate with `lumora-content` from the repository root "
	    "(build/tools/lumora-content/lumora-content writes data/models, data/textures, data/grading, "
	    "data/Cubemaps and data/XML)";
	uint64_t bytes = 0;
	for (const std::string& file : GeneratedContent::Get().Files())
	{
		const std::string committed = "data/" + file;
		const std::string generated = TestSupport::ReadWholeFile(GeneratedContent::Get().Path(file));
		EXPECT_FALSE(generated.empty()) << file;
		bytes += generated.size();
		if (!std::filesystem::exists(committed))
		{
			ADD_FAILURE() << committed << " is missing: " << howTo;
			continue;
		}
		EXPECT_TRUE(TestSupport::ReadWholeFile(committed) == generated)
		    << committed << " is stale: " << howTo;
	}
	// The content is committed; it must stay small (the two float cube maps take 7 MiB of it, the
	// decal textures 4 MiB).
	EXPECT_LT(bytes, 18u * 1024 * 1024);
	// The files the renderer opens by name must stay among the generated (and so checked) ones.
	for (const std::string required :
	     {"grading/default.dds", "grading/warm.dds", "Cubemaps/cubemap.dds", "Cubemaps/normaltest.dds",
	      "models/light_volume_point.dae", "models/light_volume_spot.dae", "models/decal_box.dae",
	      "XML/EntityTypes.xml", "XML/DecalTypes.xml", "XML/levels/sample_small/lights.xml",
	      "XML/levels/sample_large/lights.xml"})
	{
		const std::vector<std::string>& files = GeneratedContent::Get().Files();
		EXPECT_NE(std::find(files.begin(), files.end(), required), files.end()) << required;
	}
}
