#pragma once
// FontWrapper: one font family ready to draw: its face, its glyph atlas and the
// renderer that puts glyphs into the bound render target. Made by Glyphs::Factory.
//
//   std::unique_ptr<Glyphs::FontWrapper> arial = factory.CreateFontWrapper(context, "Arial");
//   arial->DrawString(L"Camera Position: 0 10 0", 12.0f, 5.0f, 5.0f, 0xFFFFFFFF,
//                     Glyphs::DrawFlags::RestoreState);                  // top-left at (5, 5)
//   arial->DrawString(L"A longer note", 12.0f, {10, 40, 110, 80}, 0xFF0000FF,
//                     Glyphs::DrawFlags::ClipRect | Glyphs::DrawFlags::RestoreState);
//   Glyphs::RectF box = arial->MeasureString(L"Camera", 12.0f, {5, 5, 5, 5}, Glyphs::DrawFlags::NoWordWrap);
//   arial->Destroy();                                                    // with the context current
//
// Positions and rectangles are pixels of the render target, row 0 at the top, placed
// through the current viewport. Drawing at a point is drawing into the zero-size
// rectangle at that point without word wrap (TextLayout gives the rules). Sizes are
// the em in pixels; sizes outside GlyphAtlas's range are reported and draw nothing.

#include <cstdint>
#include <string>
#include <string_view>

#include "platform/text/DrawFlags.h"
#include "platform/text/FontFace.h"
#include "platform/text/GlyphAtlas.h"
#include "platform/text/TextLayout.h"
#include "platform/text/TextRenderer.h"

namespace Glyphs
{
class FontWrapper
{
public:
	FontWrapper() = default;
	~FontWrapper();
	FontWrapper(const FontWrapper&) = delete;
	FontWrapper& operator=(const FontWrapper&) = delete;

	// Resolves the family, opens its face and compiles the renderer; reported on failure.
	bool Init(Gpu::Context& aContext, const FreeTypeLibrary& aLibrary, const std::string& aFamilyName);
	void Destroy();

	bool DrawString(std::wstring_view aText, float aPixelSize, float anX, float aY, uint32_t aColor,
	                uint32_t someFlags);
	bool DrawString(std::wstring_view aText, float aPixelSize, const RectF& aLayoutRect, uint32_t aColor,
	                uint32_t someFlags);
	// The box the text takes when drawn into the rectangle with the flags (a zero-size
	// rectangle for a point). Rasterises glyphs it has not seen, drawing nothing.
	RectF MeasureString(std::wstring_view aText, float aPixelSize, const RectF& aLayoutRect,
	                    uint32_t someFlags);

	const FontFace& GetFace() const { return myFace; }
	GlyphAtlas& GetAtlas() { return myAtlas; }
	// The layout of the last draw or measure.
	const TextLayout& GetLastLayout() const { return myLayout; }

private:
	Gpu::Context* myContext = nullptr;
	FontFace myFace;
	GlyphAtlas myAtlas;
	TextRenderer myRenderer;
	TextLayout myLayout;
};
} // namespace Glyphs
