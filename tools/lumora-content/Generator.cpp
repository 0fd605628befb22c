#include "Generator.h"

#include <cstdio>
#include <fstream>

#include "ColladaWriter.h"
#include "Models.h"
#include "TextureBaker.h"
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
	for (const ModelDescription& model : BuildModels())
	{
		const std::string relative = "models/" + model.myName + ".dae";
		if (!WriteTextFile(root + relative, WriteColladaDocument(model), anErrorOut))
		{
			return false;
		}
		someWrittenOut.push_back(relative);
	}
	for (const MaterialKind material : ourMaterialKinds)
	{
		for (const MapKind map : {MapKind::Albedo, MapKind::Normal, MapKind::Roughness, MapKind::Occlusion})
		{
			const std::string relative = "textures/" + TextureFileName(material, map);
			Dds::Image image;
			if (!BakeMap(material, map, image, anErrorOut) ||
			    !Dds::SaveToFile(root + relative, image, anErrorOut))
			{
				anErrorOut = relative + ": " + anErrorOut;
				return false;
			}
			someWrittenOut.push_back(relative);
		}
	}
	return true;
}
} // namespace Content
