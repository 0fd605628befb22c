// Fonts through the engine's container, and Text drawn at once or queued with the renderer.

#include "engine/Text.h"
#include "EngineFixture.h"
#include "engine/Font.h"
#include "engine/FontContainer.h"
#include "platform/gpu/Readback.h"
#include "renderer/Renderer.h"

namespace
{
constexpr int ourWidth = 160;
constexpr int ourHeight = 90;
} // namespace

class TextTest : public EngineTest
{
protected:
	// Clears the back buffer to black, runs the drawing and reads the pixels back.
	template <typename Draw> std::vector<uint8_t> Drawn(Draw aDraw, const char* aName)
	{
		Zeph::Engine* engine = Zeph::Engine::GetInstance();
		const float black[4] = {0, 0, 0, 1};
		engine->GetContext().ClearRenderTargetView(*engine->GetBackBufferView(), black);
		aDraw();
		std::vector<uint8_t> pixels;
		EXPECT_TRUE(Gpu::ReadRenderTarget(engine->GetContext(), *engine->GetBackBufferView(), pixels));
		Gpu::SavePng(std::string("/tmp/lumora-engine-text-") + aName + ".png", ourWidth, ourHeight,
		             pixels.data());
		return pixels;
	}

	// The first lit column and row.
	static std::pair<int, int> FirstLit(const std::vector<uint8_t>& somePixels)
	{
		int left = ourWidth;
		int top = ourHeight;
		for (int y = 0; y < ourHeight; ++y)
		{
			for (int x = 0; x < ourWidth; ++x)
			{
				if (somePixels[(static_cast<size_t>(y) * ourWidth + static_cast<size_t>(x)) * 4] != 0)
				{
					left = std::min(left, x);
					top = std::min(top, y);
				}
			}
		}
		return {left, top};
	}
};

// One engine: Text drawn at once and queued with the renderer, then the font container.
TEST_F(TextTest, TextDrawsAtItsPositionRoundedUpOrLateWithTheRendererAndFontsAreSharedByFamily)
{
	LUMORA_RETURN_UNLESS(CreateEngine(ourWidth, ourHeight));
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	Zeph::Font* arial = engine->GetFontContainer().GetFont("Arial");
	ASSERT_NE(arial, nullptr) << TakeLog();
	const std::string utf8 = "Gr\xC3\xB6\xC3\x9F"
	                         "e 10";
	const std::wstring wide = L"Gr\u00F6\u00DFe 10";
	Zeph::Text text(arial);
	text.SetPosition(Vector2<float>(10.2f, 5.0f));
	text.SetText(utf8);
	const std::vector<uint8_t> byText = Drawn([&] { text.Render(true); }, "text");
	const auto at = [&](float anX, float aY) {
		return Drawn([&] { arial->Render(wide, 12.0f, Vector2<float>(anX, aY), 0xFFFFFFFF, 0x800); },
		             "direct");
	};
	const std::vector<uint8_t> at11 = at(11.0f, 5.0f);
	const std::vector<uint8_t> at10 = at(10.0f, 5.0f);
	ASSERT_NE(FirstLit(byText).first, ourWidth) << "nothing drawn";
	EXPECT_EQ(FirstLit(byText), FirstLit(at11));
	EXPECT_NE(FirstLit(byText), FirstLit(at10));
	EXPECT_TRUE(byText == at11) << "the Text draws exactly what the font draws at (11, 5), size 12, white";
	EXPECT_FALSE(byText == at10);

	// SetSize reaches the draw: a larger size lights more pixels.
	text.SetSize(24.0f);
	const std::vector<uint8_t> larger = Drawn([&] { text.Render(true); }, "larger");
	const auto lit = [](const std::vector<uint8_t>& somePixels) {
		size_t count = 0;
		for (size_t index = 0; index < somePixels.size(); index += 4)
		{
			count += somePixels[index] != 0 ? 1 : 0;
		}
		return count;
	};
	EXPECT_GT(lit(larger), 2 * lit(byText));

	// Bytes that are not UTF-8 become '?'.
	text.SetSize(12.0f);
	text.SetText("a\xFF"
	             "b");
	const std::vector<uint8_t> broken = Drawn([&] { text.Render(true); }, "broken");
	EXPECT_TRUE(
	    broken ==
	    Drawn([&] { arial->Render(L"a?b", 12.0f, Vector2<float>(11.0f, 5.0f), 0xFFFFFFFF, 0x800); }, "q"));

	// Text rendered later is queued with the renderer.
	text.SetPosition(Vector2<float>(5.0f, 5.0f));
	text.SetText("Camera Position: 0 10 0");
	const int before = engine->GetRenderer().GetLateCount();
	text.Render(false);
	EXPECT_EQ(engine->GetRenderer().GetLateCount(), before + 1);
	// The frame draws it over the finished image, as a direct draw over black would
	// (colour compared: the finished image's alpha is the post chain's, not the clear's).
	const std::vector<uint8_t> frame = Drawn(
	    [&] { engine->GetRenderer().Render(engine->GetBackBufferView(), engine->GetDepthStencilView()); },
	    "late");
	EXPECT_EQ(engine->GetRenderer().GetLateCount(), 0);
	const std::vector<uint8_t> direct = Drawn(
	    [&] { arial->Render(L"Camera Position: 0 10 0", 12.0f, Vector2<float>(5, 5), 0xFFFFFFFF, 0x800); },
	    "now");
	EXPECT_NE(FirstLit(frame).first, ourWidth) << "nothing drawn";
	EXPECT_TRUE(TestSupport::Opaque(frame) == TestSupport::Opaque(direct));

	// The container shares fonts by family and stores no failed load.
	Zeph::FontContainer& fonts = engine->GetFontContainer();
	ASSERT_NE(arial->GetFontWrapper(), nullptr);
	EXPECT_EQ(arial->GetFontWrapper()->GetFace().GetMatch().myFamily, "Liberation Sans");
	EXPECT_EQ(fonts.GetFont("Arial"), arial);
	Zeph::Font* other = fonts.GetFont("Liberation Serif");
	ASSERT_NE(other, nullptr);
	EXPECT_NE(other, arial);
	EXPECT_EQ(fonts.GetCount(), 2u);

	// A family that cannot be made: null, reported from LoadFont, nothing stored; a
	// second request tries (and reports) again.
	for (int attempt = 0; attempt < 2; ++attempt)
	{
		EXPECT_EQ(fonts.GetFont(""), nullptr);
		EXPECT_THAT(TakeLog(),
		            testing::AllOf(testing::HasSubstr("Zeph::Font::LoadFont"),
		                           testing::HasSubstr("Can't create Font"),
		                           testing::Not(testing::HasSubstr("Failed to create fontFactory"))));
		EXPECT_EQ(fonts.GetCount(), 2u);
	}
	fonts.Clear();
	EXPECT_EQ(fonts.GetCount(), 0u);
}
