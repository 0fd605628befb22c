#pragma once
// TextureContainer: the engine's textures by file name, each loaded once on its first
// request and shared. A failed load stores nothing, so the next request tries again.
//
//   Zeph::Texture* albedo = engine->GetTextureContainer().GetTexture("data/textures/brick_d.dds", true);
//
// The container owns its textures; Clear (the engine's shutdown) releases them while
// the GL context is still current.

#include <map>
#include <memory>
#include <string>
#include <vector>

#include "engine/Texture.h"

namespace Zeph
{
class TextureContainer
{
public:
	TextureContainer() = default;
	// Only names ending in one of the extensions are loaded; others are refused with a report.
	explicit TextureContainer(std::vector<std::string> someAcceptedExtensions);
	~TextureContainer() = default;
	TextureContainer(const TextureContainer&) = delete;
	TextureContainer& operator=(const TextureContainer&) = delete;

	// aSRGBFlag applies to the first load of a name only. Null when loading fails.
	Texture* GetTexture(const std::string& aFileName, bool aSRGBFlag);
	void Clear();

	size_t GetCount() const { return myTextures.size(); }
	// The file names of the loaded textures, sorted (a bake's inputs).
	std::vector<std::string> GetFileNames() const;
	const std::vector<std::string>& GetAcceptedExtensions() const { return myAcceptedExtensions; }

private:
	bool AcceptsName(const std::string& aFileName) const;

	std::map<std::string, std::unique_ptr<Texture>> myTextures;
	std::vector<std::string> myAcceptedExtensions;
};
} // namespace Zeph
