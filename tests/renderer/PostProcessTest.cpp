// The post stages on a headless engine where the golden frames cannot tell: the luminance
// chain's sizes, the outline (no golden frame selects anything), the default grading within
// less than the golden tolerance, and their reports. Small images are uploaded into render
// targets, drawn through the full-screen effect and read back. Tone mapping with its
// adaptation, bloom, SSAO and the full-screen copies are in every golden frame and the
// reflection bake's filtered mips.
#include <cmath>
#include <cstring>
#include <gtest/gtest.h>
#include <memory>
#include <numbers>
#include <string>
#include <vector>

#include "engine/EngineFixture.h"
#include "engine/Texture.h"
#include "platform/dds/DdsFile.h"
#include "platform/gpu/Context.h"
#include "platform/gpu/GpuTest.h"
#include "renderer/post/ColorGradingManager.h"
#include "renderer/post/FullScreenHelper.h"
#include "renderer/post/HDR_Manager.h"
#include "renderer/post/OutlineManager.h"

namespace
{
using Dds::Format;
using testing::HasSubstr;

class PostProcessTest : public EngineTest
{
protected:
	void TearDown() override
	{
		myHelper.Destroy();
		myTextures.clear();
		EngineTest::TearDown();
	}

	// A 64 x 64 engine (the stages take their sizes from their own arguments) and the
	// full-screen helper; the test is skipped without GL.
	void SetUp() override
	{
		EngineTest::SetUp();
		if (!HasFatalFailure() && !CreateEngine(64, 64))
		{
			ASSERT_TRUE(IsSkipped()) << "the engine did not start";
			return;
		}
		ASSERT_TRUE(myHelper.Init()) << "the full-screen helper did not start:\n" << TakeLog();
	}

	static Gpu::Context& Context() { return Zeph::Engine::GetInstance()->GetContext(); }

	// A render target the fixture keeps, filled with someTexels (rows packed) when given.
	template <typename Texel = uint8_t>
	Zeph::Texture* Target(int aWidth, int aHeight, Format aFormat, const std::vector<Texel>& someTexels = {})
	{
		auto texture = std::make_unique<Zeph::Texture>(aWidth, aHeight, aFormat);
		EXPECT_NE(texture->GetRenderTargetView(), nullptr) << TakeLog();
		if (!someTexels.empty())
		{
			const auto rowPitch = static_cast<uint32_t>(someTexels.size() * sizeof(Texel) / aHeight);
			EXPECT_TRUE(texture->GetResource()->Upload(0, 0, someTexels.data(), rowPitch));
		}
		myTextures.push_back(std::move(texture));
		return myTextures.back().get();
	}

	static void Clear(Zeph::Texture* aTarget, float aRed, float aGreen, float aBlue, float anAlpha)
	{
		const float color[4] = {aRed, aGreen, aBlue, anAlpha};
		Context().ClearRenderTargetView(*aTarget->GetRenderTargetView(), color);
	}

	std::vector<uint8_t> Read(Zeph::Texture* aTarget)
	{
		std::vector<uint8_t> bytes;
		EXPECT_TRUE(Gpu::ReadRenderTarget(Context(), *aTarget->GetRenderTargetView(), bytes)) << TakeLog();
		return bytes;
	}

	Zeph::FullScreenHelper myHelper;
	std::vector<std::unique_ptr<Zeph::Texture>> myTextures;
};

TEST(PostProcessKernels, LuminanceChainHasOneTargetPerPowerOfTwoThatFitsTheShorterSide)
{
	const struct
	{
		int myWidth;
		int myHeight;
		int myCount;
	} cases[] = {{1920, 1080, 11}, {720, 1280, 10}, {63, 100, 6}, {1, 1, 1}, {4096, 3, 2}};
	for (const auto& entry : cases)
	{
		EXPECT_EQ(Zeph::HDR_Manager::ComputeLuminanceCount(entry.myWidth, entry.myHeight), entry.myCount)
		    << entry.myWidth << "x" << entry.myHeight;
	}
}

TEST(PostProcessKernels, OutlineKernelIsASymmetricLiftedGaussianInTexelSteps)
{
	// The normal density with deviation 3 at distance x.
	auto density = [](double anX) {
		return std::exp(-anX * anX / 18.0) / (3.0 * std::sqrt(2.0 * std::numbers::pi));
	};
	const Zeph::OutlineManager::Kernel horizontal = Zeph::OutlineManager::ComputeKernel(160, true);
	const Zeph::OutlineManager::Kernel vertical = Zeph::OutlineManager::ComputeKernel(90, false);
	for (int tap = 0; tap < 15; ++tap)
	{
		// Every tap but the centre is lifted by a quarter.
		const Vector4<float>& weight = horizontal.myWeights[tap];
		EXPECT_NEAR(weight.x, density(tap - 7) * (tap == 7 ? 1.0 : 1.25), 1e-6) << "tap " << tap;
		EXPECT_TRUE(weight.x == weight.y && weight.x == weight.z && weight.x == weight.w) << "tap " << tap;
		EXPECT_FLOAT_EQ(vertical.myWeights[tap].x, weight.x) << "the weights do not depend on the size";
		EXPECT_FLOAT_EQ(horizontal.myOffsets[tap].x, (tap - 7) / 160.0f);
		EXPECT_EQ(horizontal.myOffsets[tap].y, 0.0f);
		EXPECT_FLOAT_EQ(vertical.myOffsets[tap].y, (tap - 7) / 90.0f);
		EXPECT_EQ(vertical.myOffsets[tap].x, 0.0f);
	}
}

TEST_F(PostProcessTest, TheDefaultGradingKeepsColoursAndAMissingLookupOrTechniqueIsReported)
{
	std::vector<uint8_t> colours;
	for (int index = 0; index < 16; ++index)
	{
		colours.insert(colours.end(),
		               {static_cast<uint8_t>(index * 17), static_cast<uint8_t>(255 - index * 13),
		                static_cast<uint8_t>((index * 71) % 256), 255});
	}
	// The shipped default lookup, an identity of 32 texels a side: every frame grades through
	// it, and a lookup half a texel off would move colours by less than the golden images allow.
	Zeph::Texture* output = Target(4, 4, Format::R8G8B8A8_UNORM_SRGB);
	Zeph::ColorGradingManager grading;
	ASSERT_TRUE(grading.Init(4, 4, &myHelper, nullptr, Zeph::ColorGradingManager::ourLookupFile))
	    << TakeLog();
	Zeph::Texture* source = Target(4, 4, Format::R8G8B8A8_UNORM_SRGB, colours);
	grading.Render(output->GetRenderTargetView(), source);
	const std::vector<uint8_t> pixels = Read(output);
	ASSERT_EQ(pixels.size(), colours.size());
	for (size_t at = 0; at < pixels.size(); ++at)
	{
		EXPECT_NEAR(pixels[at], colours[at], 2) << "byte " << at;
	}

	// A missing or flat lookup is reported; a technique the effect lacks is reported and draws nothing.
	EXPECT_FALSE(grading.Init(4, 4, &myHelper, nullptr, myScratch.File("no-such-lookup.dds")));
	EXPECT_THAT(TakeLog(),
	            HasSubstr("\"Line:\"50\n\"Function:\"\"Zeph::ColorGradingManager::Init\"\n\"FAILED "
	                      "TO CREATE COLOR GRADING TEXTURE"));
	EXPECT_FALSE(grading.Init(4, 4, &myHelper, nullptr, WriteSolidTexture("flat.dds")));
	EXPECT_THAT(TakeLog(), HasSubstr("Failed to create 3D SRV"));
	EXPECT_EQ(grading.GetLookupView(), nullptr);
	Clear(output, 0.0f, 0.0f, 1.0f, 1.0f);
	myHelper.Process("RenderSomethingElse", source, output);
	EXPECT_THAT(TakeLog(),
	            HasSubstr("\"Function:\"\"Zeph::FullScreenHelper::Process\"\n\"The full-screen effect "
	                      "has no technique RenderSomethingElse"));
	EXPECT_EQ(PixelAt(Read(output), 4, 2, 2), (Pixel{0, 0, 255, 255}));
}

TEST_F(PostProcessTest, OutlineGlowsAroundTheMaskOnly)
{
	Zeph::OutlineManager outline;
	ASSERT_TRUE(outline.Init(64, 64, &myHelper, nullptr)) << TakeLog();
	const uint8_t orange[4] = {255, 140, 26, 255};
	std::vector<uint8_t> mask(64 * 64 * 4, 0);
	for (int y = 24; y < 40; ++y)
	{
		for (int x = 24; x < 40; ++x)
		{
			std::memcpy(&mask[static_cast<size_t>(y * 64 + x) * 4], orange, 4);
		}
	}
	Zeph::Texture* destination = Target(64, 64, Format::R8G8B8A8_UNORM);
	Clear(destination, 0.0f, 0.0f, 0.5f, 1.0f);
	outline.Render(destination->GetRenderTargetView(), Target(64, 64, Format::R8G8B8A8_UNORM, mask));
	const std::vector<uint8_t> pixels = Read(destination);
	EXPECT_GT(PixelAt(pixels, 64, 21, 32)[0], 20) << "glow just outside the left edge";
	EXPECT_GT(PixelAt(pixels, 64, 32, 42)[0], 20) << "glow just below the mask";
	EXPECT_EQ(PixelAt(pixels, 64, 32, 32), (Pixel{0, 0, 128, 255})) << "no glow inside the object";
	EXPECT_EQ(PixelAt(pixels, 64, 1, 1), (Pixel{0, 0, 128, 255})) << "the glow is local";
}

} // namespace
