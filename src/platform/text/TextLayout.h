#pragma once
// TextLayout: where each glyph of a string goes, in pixels of the render target.
//
//   Glyphs::TextLayout layout;
//   layout.Build(face, atlas, L"Camera Position: 0 10 0", 12.0f, {5, 5, 5, 5},
//   Glyphs::DrawFlags::NoWordWrap); layout.GetBounds();   // the box the lines take: 5,5 to 5 + width, 5 +
//   line height
//
// The rules:
// - Lines break at '\n' (a "\r\n" pair counts once). Unless NoWordWrap is set, a line
//   wider than the rectangle wraps at the last space that fits; a word wider than the
//   rectangle on its own breaks between characters. Spaces at a wrap are dropped.
// - Each line is aligned in the rectangle's width (Left, Center, Right), the block of
//   lines in its height (Top, VCenter, Bottom). A rectangle of zero size is a point:
//   the text's box starts there (Left/Top), is centred on it or ends at it.
// - A line's box is the font's line height; its baseline lies the ascent below the
//   box's top. Line starts and baselines are whole pixels (rounded), pens move by the
//   hinted advances plus the face's kerning, so a glyph's bitmap lands on whole pixels.
// - The bounds are the lines' boxes: from the first line's top to the last line's
//   bottom, from the leftmost start to the rightmost end of a line's advances
//   (without trailing spaces). Glyph bitmaps stay inside them for ordinary text.
// Code points the face lacks are drawn as its missing-glyph box.

#include <cstdint>
#include <string_view>
#include <vector>

#include "platform/text/DrawFlags.h"
#include "platform/text/FontFace.h"
#include "platform/text/GlyphAtlas.h"

namespace Glyphs
{
struct PlacedGlyph
{
	const Glyph* myGlyph = nullptr;
	int myX = 0; // the bitmap's top-left pixel
	int myY = 0;
};

class TextLayout
{
public:
	// False, reported, for an invalid size; glyphs that cannot be rasterised are left out.
	bool Build(FontFace& aFace, GlyphAtlas& anAtlas, std::wstring_view aText, float aPixelSize,
	           const RectF& aRect, uint32_t someFlags);

	const std::vector<PlacedGlyph>& GetGlyphs() const { return myGlyphs; }
	const RectF& GetBounds() const { return myBounds; }
	int GetLineCount() const { return myLineCount; }
	float GetLineHeight() const { return myLineHeight; }

private:
	struct Item
	{
		const Glyph* myGlyph = nullptr;
		char32_t myCodePoint = 0;
		float myPen = 0.0f; // pen position from the line's start, kerning included
	};
	struct Line
	{
		std::vector<Item> myItems;
		float myWidth = 0.0f; // advances without trailing spaces
	};

	void BreakLines(FontFace& aFace, GlyphAtlas& anAtlas, std::wstring_view aText, float aPixelSize,
	                float aWrapWidth, std::vector<Line>& someLines);

	std::vector<PlacedGlyph> myGlyphs;
	RectF myBounds;
	int myLineCount = 0;
	float myLineHeight = 0.0f;
};
} // namespace Glyphs
