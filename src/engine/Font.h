#pragma once
// Font: one font family of the engine, loaded by the font container and drawn by Text.
//
//   Zeph::Font* arial = engine->GetFontContainer().GetFont("Arial");
//   arial->Render(L"Saved", 12.0f, Vector2<float>(5.0f, 5.0f), 0xFFFFFFFF, 0x800);
//   arial->Render(L"A note", 12.0f, Vector4<float>(10, 40, 110, 80), 0xFF0000FF, 0x840);
//
// Colours are 0xAABBGGRR; flags are the Glyphs::DrawFlags values (0x800 restores the
// render states the draw changed). Drawing goes into whatever render target is bound,
// through the current viewport, and needs the engine's context current.

#include <cstdint>
#include <memory>
#include <string>

#include "core/Vector2.h"
#include "core/Vector4.h"
#include "platform/text/FontWrapper.h"

namespace Zeph
{
class Font
{
public:
	Font() = default;
	~Font();
	Font(const Font&) = delete;
	Font& operator=(const Font&) = delete;

	// Starts the text system and makes the family's font wrapper on the engine's device;
	// false, reported, when either fails.
	bool LoadFont(const std::string& aFamilyName);

	// The string with its box's top-left at the position (or aligned to it by the flags).
	void Render(const std::wstring& aText, float aSize, const Vector2<float>& aPosition, uint32_t aColor,
	            uint32_t someFlags);
	// The string laid out in the rectangle (left, top, right, bottom as x, y, z, w).
	void Render(const std::wstring& aText, float aSize, const Vector4<float>& aRect, uint32_t aColor,
	            uint32_t someFlags);

	Glyphs::FontWrapper* GetFontWrapper() const { return myFontWrapper.get(); }

private:
	std::unique_ptr<Glyphs::FontWrapper> myFontWrapper;
};
} // namespace Zeph
