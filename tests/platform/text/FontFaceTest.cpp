// Families resolved through fontconfig and opened with FreeType, and the glyph atlas.

#include "platform/text/FontFace.h"
#include "TextTestSupport.h"
#include "platform/text/GlyphAtlas.h"
#include "support/TestSupport.h"

using FontFaceTest = TextReportTest;

TEST_F(FontFaceTest, FamiliesResolveToFontFilesFreeTypeOpens)
{
	// "Arial" maps to its metric-compatible stand-in; a family that is not installed
	// falls back to fontconfig's default face, which is still a real font.
	struct Case
	{
		const char* myFamily;
		const char* myExpectedFamily; // null: any family but the one asked for
	};
	const Case cases[] = {{"Arial", "Liberation Sans"}, {"No Such Family Lumora", nullptr}};
	for (const Case& test : cases)
	{
		SCOPED_TRACE(test.myFamily);
		Glyphs::FontMatch match;
		ASSERT_TRUE(Glyphs::FontFace::Resolve(test.myFamily, match));
		EXPECT_EQ(match.myRequestedFamily, test.myFamily);
		if (test.myExpectedFamily != nullptr)
		{
			EXPECT_EQ(match.myFamily, test.myExpectedFamily);
		}
		else
		{
			EXPECT_NE(match.myFamily, test.myFamily);
			EXPECT_FALSE(match.myFamily.empty());
		}
		Glyphs::FontFace face;
		ASSERT_TRUE(face.Init(myFactory.GetLibrary(), match)) << match.myFile;
		EXPECT_NE(face.GetGlyphIndex(U'A'), 0u);
		const Glyphs::LineMetrics line = face.GetLineMetrics(12.0f);
		EXPECT_GT(line.myAscent, 6.0f);
		EXPECT_LT(line.myLineHeight, 24.0f);
	}
}

TEST_F(FontFaceTest, FailuresAreReportedClearly)
{
	Glyphs::FontMatch match;
	EXPECT_FALSE(Glyphs::FontFace::Resolve("", match));
	ExpectReports({{"Glyphs::FontFace::Resolve: No font family named"}});

	TestSupport::ScratchDir scratch;
	const std::string notAFont = scratch.File("notafont.ttf");
	TestSupport::WriteWholeFile(notAFont, "this is not a font");
	match.myFile = notAFont;
	match.myRequestedFamily = "Broken";
	Glyphs::FontFace face;
	EXPECT_FALSE(face.Init(myFactory.GetLibrary(), match));
	EXPECT_FALSE(face.IsInitialized());
	ExpectReports({{"FreeType cannot open '" + notAFont, "'Broken'"}});
}

TEST_F(FontFaceTest, AtlasPacksGlyphsWithoutOverlapAndGrowsWhenFull)
{
	Glyphs::FontMatch match;
	ASSERT_TRUE(Glyphs::FontFace::Resolve("Arial", match));
	Glyphs::FontFace face;
	ASSERT_TRUE(face.Init(myFactory.GetLibrary(), match));
	Glyphs::GlyphAtlas atlas;
	atlas.Init(face, "test atlas");
	// 94 printable ASCII glyphs at 48 pixels do not fit the first 256-texel page.
	std::vector<const Glyphs::Glyph*> glyphs;
	for (char32_t code = U'!'; code <= U'~'; ++code)
	{
		const Glyphs::Glyph* glyph = atlas.GetGlyph(face.GetGlyphIndex(code), 48.0f);
		ASSERT_NE(glyph, nullptr);
		glyphs.push_back(glyph);
		EXPECT_EQ(atlas.GetGlyph(face.GetGlyphIndex(code), 48.0f), glyph) << "rasterised twice";
	}
	EXPECT_EQ(atlas.GetPageCount(), 1);
	EXPECT_GT(atlas.GetPageSize(0), Glyphs::GlyphAtlas::ourFirstPageSize);
	for (size_t first = 0; first < glyphs.size(); ++first)
	{
		const Glyphs::Glyph& a = *glyphs[first];
		EXPECT_GE(a.myAtlasX, 0);
		EXPECT_LE(a.myAtlasX + a.myWidth, atlas.GetPageSize(a.myPage));
		EXPECT_LE(a.myAtlasY + a.myHeight, atlas.GetPageSize(a.myPage));
		for (size_t second = first + 1; second < glyphs.size(); ++second)
		{
			const Glyphs::Glyph& b = *glyphs[second];
			const bool apartFlag = a.myPage != b.myPage || a.myAtlasX + a.myWidth <= b.myAtlasX ||
			                       b.myAtlasX + b.myWidth <= a.myAtlasX ||
			                       a.myAtlasY + a.myHeight <= b.myAtlasY ||
			                       b.myAtlasY + b.myHeight <= a.myAtlasY;
			EXPECT_TRUE(apartFlag) << "glyphs " << first << " and " << second << " overlap";
		}
	}
	// Sizes outside the range are refused, reported, never rasterised.
	for (const float size : {0.0f, -3.0f, std::numeric_limits<float>::quiet_NaN(), 5000.0f})
	{
		EXPECT_EQ(atlas.GetGlyph(face.GetGlyphIndex(U'A'), size), nullptr);
	}
	EXPECT_EQ(TakeReports().size(), 4u);
}
