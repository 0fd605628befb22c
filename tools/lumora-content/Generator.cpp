#include "Generator.h"

#include <cstdio>
#include <fstream>
#include <utility>

#include "ColladaWriter.h"
#include "ColorGrading.h"
#include "DecalTextures.h"
#include "EnvironmentMaps.h"
#include "LevelWriter.h"
#include "Models.h"
#include "SampleLevels.h"
#include "TextureBaker.h"
#include "VolumeModels.h"
#include "platform/dds/DdsFile.h"
#include "platform/paths/Paths.h"

namespace Content
{
namespace
{
// Writes through a temporary file renamed over the target, so a failed run leaves no half file.
bool WriteTextFile(const std::string& aPath, const std::string& aText, std::string& anErrorOut)
{
	const std::string target = Paths::PrepareForWrite(aPath);
	if (target.empty())
	{
		anErrorOut = aPath + ": cannot create its directory";
		return false;
	}
	const std::string temporary = Paths::TemporaryFor(target);
	{
		std::ofstream file(temporary, std::ios::binary | std::ios::trunc);
		file.write(aText.data(), static_cast<std::streamsize>(aText.size()));
		if (!file.flush())
		{
			file.close();
			std::remove(temporary.c_str());
			anErrorOut = aPath + ": cannot be written";
			return false;
		}
	}
	if (!Paths::ReplaceWith(temporary, target))
	{
		anErrorOut = aPath + ": cannot replace the old file";
		return false;
	}
	return true;
}
} // namespace

bool Generate(const std::string& anOutDirectory, std::vector<std::string>& someWrittenOut,
              std::string& anErrorOut)
{
	const std::string root =
	    anOutDirectory.empty() || anOutDirectory.back() == '/' ? anOutDirectory : anOutDirectory + "/";
	std::vector<ModelDescription> models = BuildModels();
	for (ModelDescription& volume : BuildVolumeModels())
	{
		models.push_back(std::move(volume));
	}
	for (const ModelDescription& model : models)
	{
		const std::string relative = "models/" + model.myName + ".dae";
		if (!WriteTextFile(root + relative, WriteColladaDocument(model), anErrorOut))
		{
			return false;
		}
		someWrittenOut.push_back(relative);
	}
	// Builds one image with aBuild and saves it; errors name the file.
	auto writeImage = [&](const std::string& aRelative, auto aBuild) {
		Dds::Image image;
		if (!aBuild(image) || !Dds::SaveToFile(root + aRelative, image, anErrorOut))
		{
			anErrorOut = aRelative + ": " + anErrorOut;
			return false;
		}
		someWrittenOut.push_back(aRelative);
		return true;
	};
	for (const MaterialKind material : ourMaterialKinds)
	{
		for (const MapKind map : {MapKind::Albedo, MapKind::Normal, MapKind::Roughness, MapKind::Occlusion})
		{
			if (!writeImage("textures/" + TextureFileName(material, map),
			                [&](Dds::Image& anImage) { return BakeMap(material, map, anImage, anErrorOut); }))
			{
				return false;
			}
		}
	}
	// The editor loads a brick albedo and normal map of its own at start-up.
	const struct
	{
		const char* myName;
		MapKind myMap;
	} editorTextures[] = {{"Particles/bricksAlbedo.dds", MapKind::Albedo},
	                      {"Particles/bricksNormal.dds", MapKind::Normal}};
	for (const auto& texture : editorTextures)
	{
		if (!writeImage(texture.myName, [&](Dds::Image& anImage) {
			    return BakeMap(MaterialKind::Bricks, texture.myMap, anImage, anErrorOut);
		    }))
		{
			return false;
		}
	}
	for (const DecalKind decal : ourDecalKinds)
	{
		for (const MapKind map : {MapKind::Albedo, MapKind::Normal})
		{
			if (!writeImage("textures/" + DecalTextureFileName(decal, map), [&](Dds::Image& anImage) {
				    return BakeDecalMap(decal, map, anImage, anErrorOut);
			    }))
			{
				return false;
			}
		}
	}
	for (const GradingKind grading : {GradingKind::Neutral, GradingKind::Warm})
	{
		if (!writeImage(std::string("grading/") + GradingFileName(grading), [&](Dds::Image& anImage) {
			    return BuildGradingLookup(grading, anImage, anErrorOut);
		    }))
		{
			return false;
		}
	}
	if (!writeImage("Cubemaps/cubemap.dds",
	                [&](Dds::Image& anImage) { return BuildFallbackCubemap(anImage, anErrorOut); }) ||
	    !writeImage("Cubemaps/normaltest.dds",
	                [&](Dds::Image& anImage) { return BuildNormalTestCubemap(anImage, anErrorOut); }))
	{
		return false;
	}
	if (!WriteEntityTypes(root + "XML/EntityTypes.xml", anErrorOut) ||
	    !WriteDecalTypes(root + "XML/DecalTypes.xml", anErrorOut))
	{
		return false;
	}
	someWrittenOut.push_back("XML/EntityTypes.xml");
	someWrittenOut.push_back("XML/DecalTypes.xml");
	for (const LevelDescription& level : BuildSampleLevels())
	{
		const std::string directory = "XML/levels/" + level.myName + "/";
		if (!WriteLevel(root + directory, level, anErrorOut))
		{
			return false;
		}
		for (const char* file : ourLevelFileNames)
		{
			someWrittenOut.push_back(directory + file);
		}
	}
	return true;
}
} // namespace Content
