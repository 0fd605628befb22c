#include "engine/FontContainer.h"

namespace Zeph
{
Font* FontContainer::GetFont(const std::string& aFamilyName)
{
	const auto found = myFonts.find(aFamilyName);
	if (found != myFonts.end())
	{
		return found->second.get();
	}
	auto font = std::make_unique<Font>();
	if (!font->LoadFont(aFamilyName))
	{
		return nullptr;
	}
	Font* result = font.get();
	myFonts.emplace(aFamilyName, std::move(font));
	return result;
}

void FontContainer::Clear()
{
	myFonts.clear();
}
} // namespace Zeph
