// Drawing strings into a render target: where the pixels land, clipping, colour and
// blending, and the render states a draw leaves behind.

#include <cmath>

#include "GpuTest.h"
#include "platform/text/Factory.h"
#include "platform/text/FontWrapper.h"

namespace
{
constexpr int ourWidth = 320;
constexpr int ourHeight = 240;

// The smallest rectangle of pixels that differ from the background; empty (right < left) when none do.
struct LitBox
{
	int myLeft = ourWidth;
	int myTop = ourHeight;
	int myRight = -1; // inclusive
	int myBottom = -1;
	int myCount = 0;
};

LitBox FindLit(const std::vector<uint8_t>& somePixels, Pixel aBackground)
{
	LitBox box;
	for (int y = 0; y < ourHeight; ++y)
	{
		for (int x = 0; x < ourWidth; ++x)
		{
			const Pixel pixel = PixelAt(somePixels, ourWidth, x, y);
			if (pixel[0] != aBackground[0] || pixel[1] != aBackground[1] || pixel[2] != aBackground[2])
			{
				box.myLeft = std::min(box.myLeft, x);
				box.myTop = std::min(box.myTop, y);
				box.myRight = std::max(box.myRight, x);
				box.myBottom = std::max(box.myBottom, y);
				++box.myCount;
			}
		}
	}
	return box;
}

// A pixel in the stem of the first of some lit letters I: well inside the glyph.
Pixel StemPixel(const std::vector<uint8_t>& somePixels, Pixel aBackground)
{
	const LitBox lit = FindLit(somePixels, aBackground);
	EXPECT_GT(lit.myCount, 0);
	return PixelAt(somePixels, ourWidth, lit.myLeft + 2, (lit.myTop + lit.myBottom) / 2);
}
} // namespace

class TextDrawTest : public GpuTest
{
protected:
	void SetUpGpu() override
	{
		myTarget = BindTarget(Dds::Format::R8G8B8A8_UNORM, ourWidth, ourHeight);
		ASSERT_NE(myTarget, nullptr);
		ASSERT_TRUE(myFactory.Init());
		myFont = myFactory.CreateFontWrapper(GetContext(), "Arial");
		ASSERT_NE(myFont, nullptr);
		Clear({0, 0, 0, 255});
	}

	void TearDown() override
	{
		if (myFont)
		{
			myFont->Destroy();
		}
		myFactory.Destroy();
		GpuTest::TearDown();
	}

	void Clear(Pixel aColor)
	{
		const float color[4] = {aColor[0] / 255.0f, aColor[1] / 255.0f, aColor[2] / 255.0f,
		                        aColor[3] / 255.0f};
		GetContext().ClearRenderTargetView(*myTarget, color);
	}

	Glyphs::Factory myFactory;
	std::unique_ptr<Glyphs::FontWrapper> myFont;
	Gpu::RenderTargetView* myTarget = nullptr;
};

TEST_F(TextDrawTest, StringAtAPointLightsPixelsOnlyInsideItsMeasuredBox)
{
	const std::wstring text = L"Camera Position: 0 10 0";
	const Glyphs::RectF box = myFont->MeasureString(text, 12.0f, {5, 5, 5, 5}, Glyphs::DrawFlags::NoWordWrap);
	EXPECT_EQ(std::pair(box.myLeft, box.myTop), std::pair(5.0f, 5.0f));
	EXPECT_GT(box.GetWidth(), 100.0f); // 23 characters of about 6 pixels
	ASSERT_TRUE(myFont->DrawString(text, 12.0f, 5.0f, 5.0f, 0xFFFFFFFF, Glyphs::DrawFlags::RestoreState));
	const LitBox lit = FindLit(ReadPixels(*myTarget), {0, 0, 0, 255});
	EXPECT_GT(lit.myCount, 200);
	EXPECT_GE(lit.myTop, 5);
	EXPECT_LE(lit.myBottom + 1, std::ceil(box.myBottom));
	// The text fills its box: it starts within 2 pixels of the left and reaches near the right edge.
	EXPECT_GE(lit.myLeft, 5);
	EXPECT_LE(lit.myLeft, 7);
	EXPECT_LE(lit.myRight + 1, std::ceil(box.myRight));
	EXPECT_GE(lit.myRight + 1, box.myRight - 2.0f);
}

TEST_F(TextDrawTest, StringIntoARectangleWrapsAndClipsToIt)
{
	using namespace Glyphs::DrawFlags;
	const std::wstring text = L"A string much wider than its little box";
	const Glyphs::RectF rect{40, 60, 120, 75};
	struct Case
	{
		const char* myName;
		uint32_t myFlags;
		bool myOutsideFlag; // pixels outside the rectangle expected
	};
	const Case cases[] = {
	    {"noclip", NoWordWrap, true},
	    {"clip", NoWordWrap | ClipRect, false},
	    {"wrap", 0, true}, // wrapped lines run below the rectangle's height
	    {"wrapclip", ClipRect, false},
	};
	for (const Case& test : cases)
	{
		SCOPED_TRACE(test.myName);
		Clear({0, 0, 0, 255});
		ASSERT_TRUE(myFont->DrawString(text, 14.0f, rect, 0xFFFFFFFF, test.myFlags | RestoreState));
		const LitBox lit = FindLit(ReadPixels(*myTarget), {0, 0, 0, 255});
		EXPECT_GT(lit.myCount, 100);
		const bool outsideFlag =
		    lit.myLeft < 40 || lit.myTop < 60 || lit.myRight >= 120 || lit.myBottom >= 75;
		EXPECT_EQ(outsideFlag, test.myOutsideFlag)
		    << lit.myLeft << "," << lit.myTop << " to " << lit.myRight << "," << lit.myBottom;
		EXPECT_GE(lit.myLeft, 40); // left-aligned text never starts left of the rectangle
	}
}

TEST_F(TextDrawTest, RestoreStatePutsBackTheRenderStatesTheDrawChangedAndTheTextBlendsItsColour)
{
	Gpu::BlendState additive;
	additive.myEnableFlag = true;
	additive.myColor = {Gpu::Blend::One, Gpu::Blend::One, Gpu::BlendOp::Add};
	additive.myWriteMask = Gpu::ColorWrite::Red | Gpu::ColorWrite::Alpha;
	const Gpu::DepthStencilState depth{
	    .myDepthEnableFlag = true, .myDepthWriteFlag = false, .myDepthFunc = Gpu::Comparison::GreaterEqual};
	const Gpu::RasterizerState rasterizer{.myCullMode = Gpu::CullMode::Front,
	                                      .myFrontCounterClockwiseFlag = true};
	auto snapshot = []() {
		GLint values[8] = {};
		glGetIntegerv(GL_BLEND_SRC_RGB, &values[0]);
		glGetIntegerv(GL_BLEND_DST_RGB, &values[1]);
		glGetIntegerv(GL_DEPTH_FUNC, &values[2]);
		glGetIntegerv(GL_CULL_FACE_MODE, &values[3]);
		glGetIntegerv(GL_FRONT_FACE, &values[4]);
		GLboolean mask[4] = {};
		glGetBooleanv(GL_COLOR_WRITEMASK, mask);
		values[5] = mask[0] + 2 * mask[1] + 4 * mask[2] + 8 * mask[3];
		values[6] = glIsEnabled(GL_DEPTH_TEST) + 2 * glIsEnabled(GL_BLEND) + 4 * glIsEnabled(GL_CULL_FACE);
		glGetIntegerv(GL_CURRENT_PROGRAM, &values[7]);
		return std::vector<GLint>(values, values + 8);
	};
	for (const bool restoreFlag : {true, false})
	{
		SCOPED_TRACE(restoreFlag ? "restore" : "keep");
		GetContext().SetBlendState(additive);
		GetContext().SetDepthStencilState(depth);
		GetContext().SetRasterizerState(rasterizer);
		const std::vector<GLint> before = snapshot();
		ASSERT_TRUE(myFont->DrawString(L"state", 12.0f, 5.0f, 5.0f, 0xFFFFFFFF,
		                               restoreFlag ? Glyphs::DrawFlags::RestoreState : 0));
		EXPECT_EQ(snapshot() == before, restoreFlag);
	}
	// The text draws with its own states whatever was set (white, not red only), red in the colour's
	// low byte, alpha blended over the background.
	const struct
	{
		uint32_t myColor;
		Pixel myBackground;
		Pixel myExpected; // at a fully covered pixel
	} cases[] = {{0xFFFFFFFF, {0, 0, 0, 255}, {255, 255, 255, 255}},
	             {0x800000FF, {0, 0, 255, 255}, {128, 0, 127, 255}}};
	for (const auto& test : cases)
	{
		GetContext().SetBlendState(additive);
		Clear(test.myBackground);
		ASSERT_TRUE(
		    myFont->DrawString(L"IIII", 40.0f, 10.0f, 10.0f, test.myColor, Glyphs::DrawFlags::RestoreState));
		const Pixel center = StemPixel(ReadPixels(*myTarget), test.myBackground);
		for (int channel = 0; channel < 4; ++channel)
		{
			EXPECT_NEAR(center[channel], test.myExpected[channel], 1)
			    << std::hex << test.myColor << ", channel " << channel;
		}
	}
}

TEST_F(TextDrawTest, BadInputDrawsNothingAndIsReported)
{
	EXPECT_FALSE(myFont->DrawString(L"nothing", 0.0f, 5.0f, 5.0f, 0xFFFFFFFF, 0x800));
	EXPECT_FALSE(myFont->DrawString(L"nothing", std::nanf(""), 5.0f, 5.0f, 0xFFFFFFFF, 0x800));
	ExpectReports(
	    {{"Glyphs::TextLayout::Build", "Font size 0"}, {"Glyphs::TextLayout::Build", "Font size nan"}});
	EXPECT_EQ(FindLit(ReadPixels(*myTarget), {0, 0, 0, 255}).myCount, 0);
	// Far off the target: nothing lit, nothing reported.
	EXPECT_TRUE(myFont->DrawString(L"far away", 12.0f, -5000.0f, 1e9f, 0xFFFFFFFF, 0x800));
	EXPECT_EQ(FindLit(ReadPixels(*myTarget), {0, 0, 0, 255}).myCount, 0);
}
