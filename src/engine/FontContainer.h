#pragma once
// FontContainer: the engine's fonts by family name, each loaded once on its first
// request and shared.
//
//   Zeph::Font* arial = engine->GetFontContainer().GetFont("Arial");
//
// A failed load stores nothing and returns null, so the next request tries again.
// The container owns its fonts; Clear (the engine's shutdown) releases them while the
// GL context is still current.

#include <map>
#include <memory>
#include <string>

#include "engine/Font.h"

namespace Zeph
{
class FontContainer
{
public:
	FontContainer() = default;
	~FontContainer() = default;
	FontContainer(const FontContainer&) = delete;
	FontContainer& operator=(const FontContainer&) = delete;

	Font* GetFont(const std::string& aFamilyName);
	void Clear();

	size_t GetCount() const { return myFonts.size(); }

private:
	std::map<std::string, std::unique_ptr<Font>> myFonts;
};
} // namespace Zeph
