// Where glyphs go: points, alignment in a rectangle, line breaks, wrapping and kerning.

#include <cmath>

#include "TextTestSupport.h"
#include "platform/text/TextLayout.h"

class TextLayoutTest : public TextReportTest
{
protected:
	void SetUp() override
	{
		TextReportTest::SetUp();
		Glyphs::FontMatch match;
		ASSERT_TRUE(Glyphs::FontFace::Resolve("Arial", match));
		ASSERT_TRUE(myFace.Init(myFactory.GetLibrary(), match));
		myAtlas.Init(myFace, "layout atlas");
	}

	Glyphs::TextLayout Layout(std::wstring_view aText, const Glyphs::RectF& aRect, uint32_t someFlags,
	                          float aSize = 12.0f)
	{
		Glyphs::TextLayout layout;
		EXPECT_TRUE(layout.Build(myFace, myAtlas, aText, aSize, aRect, someFlags));
		return layout;
	}

	Glyphs::FontFace myFace;
	Glyphs::GlyphAtlas myAtlas;
};

TEST_F(TextLayoutTest, AlignmentPlacesTheBoxInTheRectangleOrAtThePoint)
{
	using namespace Glyphs::DrawFlags;
	const Glyphs::RectF rect{100, 50, 300, 150};
	const Glyphs::RectF point{40, 30, 40, 30};
	const float lineHeight = myFace.GetLineMetrics(12.0f).myLineHeight;
	const float width = Layout(L"Lumora", point, NoWordWrap).GetBounds().GetWidth();
	ASSERT_GT(width, 20.0f);
	struct Case
	{
		Glyphs::RectF myRect;
		uint32_t myFlags;
		float myLeft; // expected box, to half a pixel (line starts are rounded)
		float myTop;
	};
	const Case cases[] = {
	    {rect, Left | Top, 100, 50},
	    {rect, Center, 200 - width / 2, 50},
	    {rect, Right, 300 - width, 50},
	    {rect, VCenter, 100, 100 - lineHeight / 2},
	    {rect, Bottom | Right, 300 - width, 150 - lineHeight},
	    {point, NoWordWrap, 40, 30},
	    {point, NoWordWrap | Center | VCenter, 40 - width / 2, 30 - lineHeight / 2},
	    {point, NoWordWrap | Right | Bottom, 40 - width, 30 - lineHeight},
	};
	for (const Case& test : cases)
	{
		SCOPED_TRACE(testing::Message() << "flags " << test.myFlags);
		const Glyphs::TextLayout layout = Layout(L"Lumora", test.myRect, test.myFlags);
		EXPECT_NEAR(layout.GetBounds().myLeft, test.myLeft, 0.5f);
		EXPECT_NEAR(layout.GetBounds().myTop, test.myTop, 0.01f);
		EXPECT_NEAR(layout.GetBounds().GetWidth(), width, 0.01f);
		EXPECT_NEAR(layout.GetBounds().GetHeight(), lineHeight, 0.01f);
		// Every bitmap moves with the box.
		const Glyphs::RectF& box = layout.GetBounds();
		for (const Glyphs::PlacedGlyph& glyph : layout.GetGlyphs())
		{
			EXPECT_TRUE(glyph.myX >= std::floor(box.myLeft) && glyph.myY >= std::floor(box.myTop) &&
			            glyph.myX + glyph.myGlyph->myWidth <= std::ceil(box.myRight) &&
			            glyph.myY + glyph.myGlyph->myHeight <= std::ceil(box.myBottom))
			    << glyph.myX << ", " << glyph.myY;
		}
	}
}

TEST_F(TextLayoutTest, LinesBreakAtNewlinesAndWrapAtSpacesToFitTheWidth)
{
	using namespace Glyphs::DrawFlags;
	const std::wstring sentence = L"the quick brown fox jumps over the lazy dog";
	struct Case
	{
		const wchar_t* myText;
		float myWidth;
		uint32_t myFlags;
		int myMinLines;
		int myMaxLines;
		bool myFitsFlag; // every line within the width
	};
	const Case cases[] = {
	    {sentence.c_str(), 80, 0, 3, 8, true},
	    {sentence.c_str(), 80, NoWordWrap, 1, 1, false},
	    {sentence.c_str(), 1000, 0, 1, 1, true},
	    {L"one\ntwo\r\nthree", 1000, NoWordWrap, 3, 3, true},
	    {L"trailing\n", 1000, 0, 2, 2, true},
	    {L"", 1000, 0, 1, 1, true},
	    // A word wider than the box breaks between characters.
	    {L"Supercalifragilistic", 30, 0, 3, 20, true},
	};
	for (const Case& test : cases)
	{
		SCOPED_TRACE(testing::Message()
		             << "'" << std::string(test.myText, test.myText + std::wcslen(test.myText)) << "' in "
		             << test.myWidth);
		const Glyphs::TextLayout layout = Layout(test.myText, {0, 0, test.myWidth, 500}, test.myFlags);
		EXPECT_GE(layout.GetLineCount(), test.myMinLines);
		EXPECT_LE(layout.GetLineCount(), test.myMaxLines);
		EXPECT_EQ(layout.GetBounds().GetWidth() <= test.myWidth, test.myFitsFlag)
		    << layout.GetBounds().GetWidth();
		EXPECT_NEAR(layout.GetBounds().GetHeight(), layout.GetLineHeight() * layout.GetLineCount(), 0.01f);
	}
	// Wrapping keeps every letter: the glyphs of the sentence without its spaces.
	EXPECT_EQ(Layout(sentence, {0, 0, 80, 500}, 0).GetGlyphs().size(), sentence.size() - 8);
}

TEST_F(TextLayoutTest, UnusualCodePointsAndSizes)
{
	using namespace Glyphs::DrawFlags;
	const Glyphs::RectF point{0, 0, 0, 0};
	// Code points the face lacks, surrogates and values past U+10FFFF draw the missing-glyph box.
	const std::wstring odd = {L'x', static_cast<wchar_t>(0xD800), static_cast<wchar_t>(0x110000),
	                          static_cast<wchar_t>(0x7FFFFFFF), L'y'};
	EXPECT_EQ(Layout(odd, point, NoWordWrap).GetGlyphs().size(), 5u);
	// An invalid size lays out nothing, reported.
	Glyphs::TextLayout layout;
	EXPECT_FALSE(layout.Build(myFace, myAtlas, L"x", -1.0f, point, 0));
	EXPECT_TRUE(layout.GetGlyphs().empty());
	ExpectReports({{"Font size -1 is outside"}});
}
