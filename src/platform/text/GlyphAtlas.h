#pragma once
// GlyphAtlas: the glyphs of one face, rasterised on first use per pixel size and
// packed into pages of an R8 texture (coverage 0..255).
//
//   Glyphs::GlyphAtlas atlas;
//   atlas.Init(face, "Arial glyphs");
//   const Glyphs::Glyph* glyph = atlas.GetGlyph(face.GetGlyphIndex(U'A'), 12.0f);
//   ... more glyphs ...
//   atlas.Upload(context);                      // before drawing: new glyphs reach the GPU
//   Gpu::ShaderResourceView* page = atlas.GetPageView(glyph->myPage);
//   atlas.Destroy();                            // with the context current
//
// Rasterising needs no GL context: pixels are kept in memory and each page that
// changed is sent to its texture by Upload. Pages are packed in shelves; a full
// page doubles its size up to ourMaxPageSize, and then a new page starts. Glyph
// rectangles are in texels, so they stay valid when a page grows.

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "platform/gpu/Texture.h"
#include "platform/text/FontFace.h"

namespace Glyphs
{
struct Glyph
{
	float myAdvance = 0.0f; // pen movement in pixels
	int myBearingX = 0;     // bitmap's left edge right of the pen
	int myBearingY = 0;     // bitmap's top edge above the baseline
	int myWidth = 0;        // bitmap size in pixels; 0 for blanks
	int myHeight = 0;
	int myPage = -1;
	int myAtlasX = 0; // the bitmap's top-left texel in its page
	int myAtlasY = 0;
};

class GlyphAtlas
{
public:
	static constexpr int ourFirstPageSize = 256;
	static constexpr int ourMaxPageSize = 2048;
	static constexpr int ourMaxPages = 8;
	// Sizes (in pixels per em) that glyphs are rasterised at: a glyph of the largest fits a page.
	static constexpr float ourMinPixelSize = 1.0f / 64.0f;
	static constexpr float ourMaxPixelSize = 1024.0f;

	GlyphAtlas() = default;
	~GlyphAtlas();
	GlyphAtlas(const GlyphAtlas&) = delete;
	GlyphAtlas& operator=(const GlyphAtlas&) = delete;

	void Init(FontFace& aFace, const std::string& aLabel);
	void Destroy();

	static bool IsValidSize(float aPixelSize);
	// The glyph at the size, rasterised on its first request. Null, reported, for a
	// size outside the valid range, a glyph FreeType cannot render, or a full atlas.
	const Glyph* GetGlyph(uint32_t aGlyphIndex, float aPixelSize);

	// Sends the pages that changed to their textures; false, reported, when one cannot be made.
	bool Upload(Gpu::Context& aContext);
	int GetPageCount() const { return static_cast<int>(myPages.size()); }
	int GetPageSize(int aPage) const;
	// The page's texture view; null for a page never uploaded.
	Gpu::ShaderResourceView* GetPageView(int aPage) const;
	// Coverage at a texel of a page, as rasterised (0 outside the page).
	uint8_t GetCoverage(int aPage, int anX, int aY) const;

private:
	struct Page
	{
		int mySize = 0;
		std::vector<uint8_t> myPixels;
		int myShelfY = 0;      // top of the shelf being filled
		int myShelfHeight = 0; // its tallest glyph so far
		int myCursorX = 0;     // where its next glyph goes
		bool myDirtyFlag = true;
		std::unique_ptr<Gpu::Texture> myTexture;
	};

	// Finds room for a bitmap, growing or adding pages; false when the atlas is full.
	bool Place(int aWidth, int aHeight, int& aPageOut, int& anXOut, int& aYOut);
	static bool PlaceOnPage(Page& aPage, int aWidth, int aHeight, int& anXOut, int& aYOut);
	static void Grow(Page& aPage);
	Page& AddPage();

	FontFace* myFace = nullptr;
	std::string myLabel;
	std::map<uint64_t, Glyph> myGlyphs; // by size in 1/64 pixel and glyph index
	std::vector<Page> myPages;
};
} // namespace Glyphs
