// Fonts through the engine's container, and Text drawn at once or queued with the renderer.

#include "engine/Text.h"
#include "EngineFixture.h"
#include "engine/Font.h"
#include "engine/FontContainer.h"
#include "platform/gpu/Readback.h"
#include "renderer/Renderer.h"

namespace
{
// Clears the back buffer to black, runs aDraw and reads the pixels back.
template <typename Draw> std::vector<uint8_t> Drawn(Draw aDraw)
{
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	const float black[4] = {0, 0, 0, 1};
	engine->GetContext().ClearRenderTargetView(*engine->GetBackBufferView(), black);
	aDraw();
	std::vector<uint8_t> pixels;
	EXPECT_TRUE(Gpu::ReadRenderTarget(engine->GetContext(), *engine->GetBackBufferView(), pixels));
	// The finished image's alpha is the post chain's, not the clear's: colour is compared.
	return TestSupport::Opaque(pixels);
}
} // namespace

// One engine: Text drawn at once and queued with the renderer, then the font container.
TEST_F(EngineTest, TextDrawsAtItsPositionRoundedUpOrLateWithTheRendererAndFontsAreSharedByFamily)
{
	LUMORA_RETURN_UNLESS(CreateEngine(160, 90));
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	Zeph::Font* arial = engine->GetFontContainer().GetFont("Arial");
	ASSERT_NE(arial, nullptr) << TakeLog();
	const auto direct = [&](const std::wstring& aText, float anX) {
		return Drawn([&] { arial->Render(aText, 12.0f, Vector2<float>(anX, 5.0f), 0xFFFFFFFF, 0x800); });
	};
	const std::vector<uint8_t> black = Drawn([] {});
	// UTF-8 in, the x position rounded up; bytes that are not UTF-8 become '?'.
	Zeph::Text text(arial);
	text.SetPosition(Vector2<float>(10.2f, 5.0f));
	const std::pair<std::string, std::wstring> cases[] = {{"Gr\u00F6\u00DFe 10", L"Gr\u00F6\u00DFe 10"},
	                                                      {std::string("a\xFF") + "b", L"a?b"}};
	for (const auto& [utf8, wide] : cases)
	{
		text.SetText(utf8);
		const std::vector<uint8_t> byText = Drawn([&] { text.Render(true); });
		EXPECT_FALSE(byText == black) << "nothing drawn";
		EXPECT_TRUE(byText == direct(wide, 11.0f));
		EXPECT_FALSE(byText == direct(wide, 10.0f));
	}

	// Text rendered later is queued with the renderer, and the frame draws it over the
	// finished image as a direct draw over black would.
	text.SetPosition(Vector2<float>(5.0f, 5.0f));
	text.SetText("Camera Position: 0 10 0");
	const int before = engine->GetRenderer().GetLateCount();
	text.Render(false);
	EXPECT_EQ(engine->GetRenderer().GetLateCount(), before + 1);
	const std::vector<uint8_t> frame = Drawn(
	    [&] { engine->GetRenderer().Render(engine->GetBackBufferView(), engine->GetDepthStencilView()); });
	EXPECT_EQ(engine->GetRenderer().GetLateCount(), 0);
	EXPECT_FALSE(frame == black) << "nothing drawn";
	EXPECT_TRUE(frame == direct(L"Camera Position: 0 10 0", 5.0f));

	// The container shares fonts by family and stores no failed load: a family that cannot be
	// made is null, reported from LoadFont, and tried (and reported) again.
	Zeph::FontContainer& fonts = engine->GetFontContainer();
	EXPECT_EQ(fonts.GetFont("Arial"), arial);
	EXPECT_NE(fonts.GetFont("Liberation Serif"), arial);
	for (int attempt = 0; attempt < 2; ++attempt)
	{
		EXPECT_EQ(fonts.GetFont(""), nullptr);
		EXPECT_THAT(TakeLog(), testing::AllOf(testing::HasSubstr("Zeph::Font::LoadFont"),
		                                      testing::HasSubstr("Can't create Font")));
		EXPECT_EQ(fonts.GetCount(), 2u);
	}
}
