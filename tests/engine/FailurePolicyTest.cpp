// Failures below the engine are the engine's to judge: under the facade's own log
// (severe and critical fatal) a platform failure is an "ERROR" entry and a false or
// null result, and the engine's report in its own words is the one that decides.
#include <gtest/gtest.h>
#include <string>

#include "EngineFixture.h"
#include "engine/Effect.h"
#include "engine/Font.h"
#include "engine/TextureContainer.h"
#include "platform/gpu/Report.h"

namespace
{
class FailurePolicyTest : public EngineTest
{
protected:
	FailurePolicyTest() { myFatalLevels = std::bitset<4>(12); }

	// The log since the last take holds an ERROR entry naming aText and no critical one.
	void ExpectLoggedError(const std::string& aText)
	{
		EXPECT_THAT(TakeLog(), testing::AllOf(testing::HasSubstr("\"ERROR\""), testing::HasSubstr(aText),
		                                      testing::Not(testing::HasSubstr("CRITICAL"))));
	}
};

// Error entries carry the tag as a quoted item; a bare search for ERROR would also
// match "CRITICAL ERROR".
TEST_F(FailurePolicyTest, AFailedSetUpStepAndResourcesThatCannotBeMadeAreErrorsAndTheEditorGoesOn)
{
	// The back buffer is larger than any GL texture: the swap-chain step fails, not the device.
	Gpu::WindowHandle window = 0;
	EXPECT_FALSE(Zeph::Engine::Create(window, 40000, 40000)) << "a 40000 x 40000 back buffer was accepted";
	ExpectLoggedError("back buffer");
	// A fresh start succeeds.
	Zeph::Engine::ShutDown();
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	Zeph::Engine* engine = Zeph::Engine::GetInstance();

	// A DDS the reader understands but GL cannot sample: a depth-stencil format.
	const std::string depthTexture = WriteSolidTexture("depth.dds", nullptr, Dds::Format::D24_UNORM_S8_UINT);
	EXPECT_EQ(engine->GetTextureContainer().GetTexture(depthTexture, false), nullptr);
	ExpectLoggedError("has no GL texture form");

	// Text at a size the glyph atlas refuses is left out of the frame.
	Zeph::Font* font = engine->GetFontContainer().GetFont("Arial");
	ASSERT_NE(font, nullptr) << TakeLog();
	font->Render(L"too large", 1.0e6f, Vector2<float>(0.0f, 0.0f), 0xffffffffu, 0);
	ExpectLoggedError("is outside");

	// A GL error in a build that checks for them is logged, never fatal.
	glBindTexture(GL_TEXTURE_2D, 0xdeadbeefu);
	LUMORA_GL_CHECK("FailurePolicyTest");
#ifndef NDEBUG
	ExpectLoggedError("GL_INVALID");
#else
	while (glGetError() != GL_NO_ERROR)
	{
	}
#endif
}

using FailurePolicyDeathTest = FailurePolicyTest;

// A damaged compiled effect is the engine's own "Cant Create Effect", fatal under the
// facade's levels; the effect layer's account of the damage comes first, as an error.
TEST_F(FailurePolicyDeathTest, ADamagedCompiledEffectEndsWithTheEnginesOwnReport)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	const std::string source = myScratch.File("Damaged.fx");
	TestSupport::WriteWholeFile(source, "technique Render {}");
	TestSupport::WriteWholeFile(source + "al", std::string("FXAL\x01\x00garbage", 13));
	TakeLog();
	EXPECT_DEATH(
	    {
		    Zeph::Effect effect;
		    effect.Init(source);
	    },
	    "");
	const std::string log = TakeLog();
	const size_t critical = log.find("\"CRITICAL ERROR\"");
	ASSERT_NE(critical, std::string::npos) << log;
	EXPECT_THAT(log.substr(0, critical), testing::HasSubstr("\"ERROR\""));
	EXPECT_THAT(log.substr(critical), testing::AllOf(testing::HasSubstr("\"Zeph::Effect::Init\""),
	                                                 testing::HasSubstr("Cant Create Effect"),
	                                                 testing::HasSubstr("Critical Error Message")));
}
} // namespace
