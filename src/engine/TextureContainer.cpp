#include "engine/TextureContainer.h"

#include "engine/EngineReport.h"

namespace Zeph
{
TextureContainer::TextureContainer(std::vector<std::string> someAcceptedExtensions)
    : myAcceptedExtensions(std::move(someAcceptedExtensions))
{
}

bool TextureContainer::AcceptsName(const std::string& aFileName) const
{
	if (myAcceptedExtensions.empty())
	{
		return true;
	}
	for (const std::string& extension : myAcceptedExtensions)
	{
		if (aFileName.ends_with(extension))
		{
			return true;
		}
	}
	return false;
}

Texture* TextureContainer::GetTexture(const std::string& aFileName, bool aSRGBFlag)
{
	const auto found = myTextures.find(aFileName);
	if (found != myTextures.end())
	{
		return found->second.get();
	}
	if (!AcceptsName(aFileName))
	{
		ReportCritical(__LINE__, "Zeph::TextureContainer::GetTexture",
		               "Not a texture file this container takes: %s", aFileName.c_str());
		return nullptr;
	}
	auto texture = std::make_unique<Texture>();
	if (!texture->Load(aFileName, aSRGBFlag))
	{
		return nullptr;
	}
	Texture* result = texture.get();
	myTextures.emplace(aFileName, std::move(texture));
	return result;
}

void TextureContainer::Clear()
{
	myTextures.clear();
}

std::vector<std::string> TextureContainer::GetFileNames() const
{
	std::vector<std::string> names;
	names.reserve(myTextures.size());
	for (const auto& [name, texture] : myTextures)
	{
		names.push_back(name);
	}
	return names;
}
} // namespace Zeph
