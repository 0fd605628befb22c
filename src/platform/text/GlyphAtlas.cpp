#include "platform/text/GlyphAtlas.h"

#include <algorithm>
#include <cmath>
#include <cstring>

#include "platform/gpu/Report.h"
#include "platform/gpu/Texture.h"

namespace Glyphs
{
namespace
{
// Empty texels around each bitmap, so filtering never picks up a neighbour.
constexpr int ourPadding = 1;

uint64_t GlyphKey(int aSize26Dot6, uint32_t aGlyphIndex)
{
	return (static_cast<uint64_t>(aSize26Dot6) << 32) | aGlyphIndex;
}

// One row of a FreeType bitmap as 0..255 coverage; rows run top to bottom whatever the pitch's sign.
void CopyRow(const FT_Bitmap& aBitmap, unsigned int aRow, uint8_t* aDestination)
{
	const int pitch = aBitmap.pitch;
	const unsigned int rowOffset = pitch >= 0 ? aRow : aBitmap.rows - 1 - aRow;
	const uint8_t* source =
	    aBitmap.buffer + static_cast<size_t>(rowOffset) * static_cast<size_t>(std::abs(pitch));
	if (aBitmap.pixel_mode == FT_PIXEL_MODE_MONO)
	{
		for (unsigned int x = 0; x < aBitmap.width; ++x)
		{
			aDestination[x] = (source[x / 8] & (0x80 >> (x % 8))) != 0 ? 255 : 0;
		}
		return;
	}
	std::memcpy(aDestination, source, aBitmap.width);
}
} // namespace

GlyphAtlas::~GlyphAtlas()
{
	Destroy();
}

void GlyphAtlas::Init(FontFace& aFace, const std::string& aLabel)
{
	Destroy();
	myFace = &aFace;
	myLabel = aLabel;
}

void GlyphAtlas::Destroy()
{
	for (Page& page : myPages)
	{
		if (page.myTexture)
		{
			page.myTexture->Destroy();
		}
	}
	myPages.clear();
	myGlyphs.clear();
	myFace = nullptr;
}

bool GlyphAtlas::IsValidSize(float aPixelSize)
{
	return std::isfinite(aPixelSize) && aPixelSize >= ourMinPixelSize && aPixelSize <= ourMaxPixelSize;
}

const Glyph* GlyphAtlas::GetGlyph(uint32_t aGlyphIndex, float aPixelSize)
{
	const char* function = "Glyphs::GlyphAtlas::GetGlyph";
	if (!IsValidSize(aPixelSize))
	{
		Gpu::ReportError(__LINE__, function, "'%s': font size %g is outside %g..%g pixels", myLabel.c_str(),
		                 static_cast<double>(aPixelSize), static_cast<double>(ourMinPixelSize),
		                 static_cast<double>(ourMaxPixelSize));
		return nullptr;
	}
	if (myFace == nullptr || !myFace->IsInitialized())
	{
		Gpu::ReportError(__LINE__, function, "'%s': no font face", myLabel.c_str());
		return nullptr;
	}
	const int size = static_cast<int>(std::lround(aPixelSize * 64.0f));
	const uint64_t key = GlyphKey(size, aGlyphIndex);
	const auto found = myGlyphs.find(key);
	if (found != myGlyphs.end())
	{
		return &found->second;
	}
	FT_Face face = myFace->GetFace();
	// Outlines only (no embedded bitmaps), hinted, rendered as 8-bit coverage.
	if (!myFace->SelectSize(size) ||
	    FT_Load_Glyph(face, aGlyphIndex, FT_LOAD_NO_BITMAP | FT_LOAD_RENDER) != 0)
	{
		Gpu::ReportError(__LINE__, function, "'%s': FreeType cannot render glyph %u at %g pixels",
		                 myLabel.c_str(), aGlyphIndex, static_cast<double>(aPixelSize));
		return nullptr;
	}
	const FT_GlyphSlot slot = face->glyph;
	const FT_Bitmap& bitmap = slot->bitmap;
	if (bitmap.width > 0 && bitmap.rows > 0 && bitmap.pixel_mode != FT_PIXEL_MODE_GRAY &&
	    bitmap.pixel_mode != FT_PIXEL_MODE_MONO)
	{
		Gpu::ReportError(__LINE__, function, "'%s': glyph %u has a pixel mode (%d) that is not coverage",
		                 myLabel.c_str(), aGlyphIndex, static_cast<int>(bitmap.pixel_mode));
		return nullptr;
	}
	Glyph glyph;
	glyph.myAdvance = static_cast<float>(slot->advance.x) / 64.0f;
	glyph.myBearingX = slot->bitmap_left;
	glyph.myBearingY = slot->bitmap_top;
	glyph.myWidth = static_cast<int>(bitmap.width);
	glyph.myHeight = static_cast<int>(bitmap.rows);
	if (glyph.myWidth > 0 && glyph.myHeight > 0)
	{
		if (!Place(glyph.myWidth, glyph.myHeight, glyph.myPage, glyph.myAtlasX, glyph.myAtlasY))
		{
			Gpu::ReportError(__LINE__, function, "'%s': the glyph atlas is full (%d pages of %d texels)",
			                 myLabel.c_str(), ourMaxPages, ourMaxPageSize);
			return nullptr;
		}
		Page& page = myPages[static_cast<size_t>(glyph.myPage)];
		for (int row = 0; row < glyph.myHeight; ++row)
		{
			CopyRow(
			    bitmap, static_cast<unsigned int>(row),
			    &page.myPixels[static_cast<size_t>(glyph.myAtlasY + row) * static_cast<size_t>(page.mySize) +
			                   static_cast<size_t>(glyph.myAtlasX)]);
		}
		page.myDirtyFlag = true;
	}
	return &myGlyphs.emplace(key, glyph).first->second;
}

bool GlyphAtlas::Place(int aWidth, int aHeight, int& aPageOut, int& anXOut, int& aYOut)
{
	if (aWidth + 2 * ourPadding > ourMaxPageSize || aHeight + 2 * ourPadding > ourMaxPageSize)
	{
		return false;
	}
	if (myPages.empty())
	{
		AddPage();
	}
	Page* page = &myPages.back();
	while (!PlaceOnPage(*page, aWidth, aHeight, anXOut, aYOut))
	{
		if (page->mySize < ourMaxPageSize)
		{
			Grow(*page);
		}
		else if (static_cast<int>(myPages.size()) < ourMaxPages)
		{
			page = &AddPage();
		}
		else
		{
			return false;
		}
	}
	aPageOut = static_cast<int>(myPages.size()) - 1;
	return true;
}

bool GlyphAtlas::PlaceOnPage(Page& aPage, int aWidth, int aHeight, int& anXOut, int& aYOut)
{
	const int width = aWidth + ourPadding;
	const int height = aHeight + ourPadding;
	if (aPage.myCursorX + width + ourPadding > aPage.mySize)
	{
		// The next shelf starts below the tallest glyph of this one.
		aPage.myShelfY += aPage.myShelfHeight;
		aPage.myShelfHeight = 0;
		aPage.myCursorX = 0;
	}
	if (aPage.myCursorX + width + ourPadding > aPage.mySize ||
	    aPage.myShelfY + height + ourPadding > aPage.mySize)
	{
		return false;
	}
	anXOut = aPage.myCursorX + ourPadding;
	aYOut = aPage.myShelfY + ourPadding;
	aPage.myCursorX += width;
	aPage.myShelfHeight = std::max(aPage.myShelfHeight, height);
	return true;
}

void GlyphAtlas::Grow(Page& aPage)
{
	// Texel positions keep their meaning: the old pixels become the top-left quarter.
	const int size = aPage.mySize * 2;
	std::vector<uint8_t> pixels(static_cast<size_t>(size) * static_cast<size_t>(size), 0);
	for (int row = 0; row < aPage.mySize; ++row)
	{
		std::memcpy(&pixels[static_cast<size_t>(row) * static_cast<size_t>(size)],
		            &aPage.myPixels[static_cast<size_t>(row) * static_cast<size_t>(aPage.mySize)],
		            static_cast<size_t>(aPage.mySize));
	}
	aPage.myPixels = std::move(pixels);
	aPage.mySize = size;
	aPage.myDirtyFlag = true;
}

GlyphAtlas::Page& GlyphAtlas::AddPage()
{
	Page& page = myPages.emplace_back();
	page.mySize = ourFirstPageSize;
	page.myPixels.assign(static_cast<size_t>(page.mySize) * static_cast<size_t>(page.mySize), 0);
	return page;
}

bool GlyphAtlas::Upload(Gpu::Context& aContext)
{
	for (size_t index = 0; index < myPages.size(); ++index)
	{
		Page& page = myPages[index];
		if (!page.myDirtyFlag)
		{
			continue;
		}
		if (page.myTexture && page.myTexture->GetDesc().myWidth != page.mySize)
		{
			page.myTexture->Destroy();
			page.myTexture.reset();
		}
		if (!page.myTexture)
		{
			Gpu::TextureDesc desc;
			desc.myWidth = page.mySize;
			desc.myHeight = page.mySize;
			desc.myFormat = Dds::Format::R8_UNORM;
			desc.myLabel = myLabel + " page " + std::to_string(index);
			auto texture = std::make_unique<Gpu::Texture>();
			if (!texture->Init(aContext, desc))
			{
				return false;
			}
			page.myTexture = std::move(texture);
		}
		if (!page.myTexture->Upload(0, 0, page.myPixels.data(), static_cast<uint32_t>(page.mySize)))
		{
			return false;
		}
		page.myDirtyFlag = false;
	}
	return true;
}

int GlyphAtlas::GetPageSize(int aPage) const
{
	return aPage >= 0 && aPage < GetPageCount() ? myPages[static_cast<size_t>(aPage)].mySize : 0;
}

Gpu::ShaderResourceView* GlyphAtlas::GetPageView(int aPage) const
{
	if (aPage < 0 || aPage >= GetPageCount() || !myPages[static_cast<size_t>(aPage)].myTexture)
	{
		return nullptr;
	}
	return myPages[static_cast<size_t>(aPage)].myTexture->GetDefaultShaderResourceView();
}

uint8_t GlyphAtlas::GetCoverage(int aPage, int anX, int aY) const
{
	const int size = GetPageSize(aPage);
	if (anX < 0 || aY < 0 || anX >= size || aY >= size)
	{
		return 0;
	}
	return myPages[static_cast<size_t>(aPage)]
	    .myPixels[static_cast<size_t>(aY) * static_cast<size_t>(size) + static_cast<size_t>(anX)];
}
} // namespace Glyphs
