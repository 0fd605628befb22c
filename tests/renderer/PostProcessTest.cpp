// The post stages and the full-screen helper on a headless engine: small images
// uploaded into render targets, drawn through the full-screen effect and read back.
// Pictures are saved under /tmp/lumora-post-tests/ to be looked at.
#include <array>
#include <cmath>
#include <cstdlib>
#include <cstring>
#include <gtest/gtest.h>
#include <memory>
#include <numbers>
#include <string>
#include <vector>

#include "engine/Effect.h"
#include "engine/EngineFixture.h"
#include "engine/Texture.h"
#include "platform/dds/DdsFile.h"
#include "platform/fx/Variable.h"
#include "platform/gpu/Context.h"
#include "platform/gpu/GpuTest.h"
#include "renderer/post/BloomManager.h"
#include "renderer/post/ColorGradingManager.h"
#include "renderer/post/ComputeHelper.h"
#include "renderer/post/FXAAManager.h"
#include "renderer/post/FullScreenHelper.h"
#include "renderer/post/HDR_Manager.h"
#include "renderer/post/MotionBlurManager.h"
#include "renderer/post/OutlineManager.h"
#include "renderer/post/SSAOManager.h"

namespace
{
using Dds::Format;

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

	// aCount copies of one RGBA texel.
	template <typename Channel> static std::vector<Channel> Repeat(int aCount, std::array<Channel, 4> aTexel)
	{
		std::vector<Channel> texels;
		for (int index = 0; index < aCount; ++index)
		{
			texels.insert(texels.end(), aTexel.begin(), aTexel.end());
		}
		return texels;
	}

	// aCount RGBA float texels of one grey (alpha 1).
	static std::vector<float> Grey(int aCount, float aValue)
	{
		return Repeat<float>(aCount, {aValue, aValue, aValue, 1.0f});
	}

	static void Clear(Zeph::Texture* aTarget, float aRed, float aGreen, float aBlue, float anAlpha)
	{
		const float color[4] = {aRed, aGreen, aBlue, anAlpha};
		Context().ClearRenderTargetView(*aTarget->GetRenderTargetView(), color);
	}

	std::vector<uint8_t> Read(Zeph::Texture* aTarget, const std::string& aPngName = "")
	{
		std::vector<uint8_t> bytes;
		EXPECT_TRUE(Gpu::ReadRenderTarget(Context(), *aTarget->GetRenderTargetView(), bytes)) << TakeLog();
		if (!aPngName.empty())
		{
			Gpu::SavePng("/tmp/lumora-post-tests/" + aPngName + ".png",
			             static_cast<int>(aTarget->GetImageInfo().myWidth),
			             static_cast<int>(aTarget->GetImageInfo().myHeight), bytes.data());
		}
		return bytes;
	}

	std::vector<float> ReadFloats(Zeph::Texture* aTarget)
	{
		std::vector<float> values;
		EXPECT_TRUE(Gpu::ReadRenderTarget(Context(), *aTarget->GetRenderTargetView(), values)) << TakeLog();
		return values;
	}

	Fx::Variable* Variable(const char* aName)
	{
		return myHelper.GetEffect()->GetEffect()->GetVariableByName(aName);
	}

	void SetFloat(const char* aName, float aValue)
	{
		EXPECT_TRUE(Variable(aName)->SetFloat(aValue)) << aName;
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
	} cases[] = {{1280, 720, 10}, {1920, 1080, 11}, {720, 1280, 10}, {64, 64, 7},
	             {63, 100, 6},    {2, 2, 2},        {1, 1, 1},       {4096, 3, 2}};
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
	EXPECT_NEAR(horizontal.myWeights[7].x, density(0.0), 1e-6) << "the centre is not lifted";
	EXPECT_NEAR(horizontal.myWeights[8].x, 1.25 * density(1.0), 1e-6);
	EXPECT_NEAR(horizontal.myWeights[0].x, 1.25 * density(7.0), 1e-6);
	for (int tap = 0; tap < 15; ++tap)
	{
		const Vector4<float>& weight = horizontal.myWeights[tap];
		EXPECT_FLOAT_EQ(weight.x, horizontal.myWeights[14 - tap].x) << "tap " << tap;
		EXPECT_TRUE(weight.x == weight.y && weight.x == weight.z && weight.x == weight.w) << "tap " << tap;
		EXPECT_FLOAT_EQ(vertical.myWeights[tap].x, weight.x) << "the weights do not depend on the size";
		EXPECT_FLOAT_EQ(horizontal.myOffsets[tap].x, (tap - 7) / 160.0f);
		EXPECT_EQ(horizontal.myOffsets[tap].y, 0.0f);
		EXPECT_FLOAT_EQ(vertical.myOffsets[tap].y, (tap - 7) / 90.0f);
		EXPECT_EQ(vertical.myOffsets[tap].x, 0.0f);
	}
	EXPECT_GT(horizontal.myWeights[6].x, horizontal.myWeights[7].x) << "neighbours outweigh the centre";
	EXPECT_GT(horizontal.myWeights[7].x, horizontal.myWeights[4].x);
}

TEST_F(PostProcessTest, RenderCopiesTheSourceIntoTheViewportOfTheTarget)
{
	// Every texel different, so a flip, a swap of axes or a shifted quad shows.
	std::vector<uint8_t> texels;
	for (int y = 0; y < 6; ++y)
	{
		for (int x = 0; x < 8; ++x)
		{
			texels.insert(texels.end(),
			              {static_cast<uint8_t>(x * 30), static_cast<uint8_t>(y * 40), 200, 255});
		}
	}
	Zeph::Texture* source = Target(8, 6, Format::R8G8B8A8_UNORM, texels);
	Zeph::Texture* whole = Target(8, 6, Format::R8G8B8A8_UNORM);
	myHelper.Process("Render", source, whole);
	EXPECT_EQ(Read(whole, "copy"), texels);

	// Into the 8x6 viewport at (4, 3) of a 16x12 target; the rest keeps its clear colour.
	Zeph::Texture* large = Target(16, 12, Format::R8G8B8A8_UNORM);
	Clear(large, 1.0f, 0.0f, 0.0f, 1.0f);
	const Gpu::Viewport viewport{.myTopLeftX = 4.0f, .myTopLeftY = 3.0f, .myWidth = 8.0f, .myHeight = 6.0f};
	myHelper.Process("Render", source->GetShaderResourceView(), 8, 6, large->GetRenderTargetView(), viewport);
	const std::vector<uint8_t> pixels = Read(large, "copy-viewport");
	for (int y = 0; y < 12; ++y)
	{
		for (int x = 0; x < 16; ++x)
		{
			const bool insideFlag = x >= 4 && x < 12 && y >= 3 && y < 9;
			const Pixel expected = insideFlag ? PixelAt(texels, 8, x - 4, y - 3) : Pixel{255, 0, 0, 255};
			ASSERT_EQ(PixelAt(pixels, 16, x, y), expected) << "at " << x << ", " << y;
		}
	}
}

TEST_F(PostProcessTest, AnUnknownTechniqueIsReportedAndDrawsNothing)
{
	Zeph::Texture* source = Target(4, 4, Format::R8G8B8A8_UNORM, std::vector<uint8_t>(64, 255));
	Zeph::Texture* target = Target(4, 4, Format::R8G8B8A8_UNORM);
	Clear(target, 0.0f, 0.0f, 1.0f, 1.0f);
	myHelper.Process("RenderSomethingElse", source, target);
	const std::string log = TakeLog();
	EXPECT_NE(log.find("\"Function:\"\"Zeph::FullScreenHelper::Process\"\n\"The full-screen effect has no "
	                   "technique RenderSomethingElse"),
	          std::string::npos)
	    << log;
	EXPECT_EQ(PixelAt(Read(target), 4, 2, 2), (Pixel{0, 0, 255, 255}));

	// The compute helper finds its effect and buffers.
	Zeph::ComputeHelper compute;
	ASSERT_TRUE(compute.Init()) << TakeLog();
	EXPECT_TRUE(compute.GetInputData()->IsValid());
	EXPECT_TRUE(compute.GetOutputData()->IsValid());
	compute.Destroy();
	EXPECT_EQ(compute.GetEffect(), nullptr);
}

TEST_F(PostProcessTest, HdrAdaptsTowardTheSceneAndToneMapsGreyMonotonically)
{
	SetFloat("lumMin", 0.01f);
	SetFloat("lumMax", 20.0f);
	SetFloat("AutoExposureAdjustment", 0.5f);
	const float scene = 0.2f;
	Zeph::Texture* source = Target(16, 16, Format::R32G32B32A32_FLOAT, Grey(256, scene));
	Zeph::Texture* output = Target(16, 16, Format::R8G8B8A8_UNORM_SRGB);
	Zeph::HDR_Manager hdr;
	ASSERT_TRUE(hdr.Init(16, 16, &myHelper, nullptr)) << TakeLog();

	float adapted = 0.5f; // every adaptation target starts at a half
	int previousOutput = -1;
	for (int frame = 0; frame < 3; ++frame)
	{
		hdr.Render(output->GetRenderTargetView(), source);
		adapted += (scene - adapted) * 0.1f;
		for (int pair = 0; pair < Zeph::HDR_Manager::ourAdaptSize; ++pair)
		{
			EXPECT_NEAR(ReadFloats(hdr.GetCurrentAdaptation(pair))[0], adapted, 2e-3f)
			    << "frame " << frame << ", pair " << pair;
		}
		const std::vector<uint8_t> pixels = Read(output, "tonemap-" + std::to_string(frame));
		const Pixel first = PixelAt(pixels, 16, 0, 0);
		EXPECT_EQ(PixelAt(pixels, 16, 15, 9), first) << "a uniform image stays uniform";
		EXPECT_GT(first[0], 0);
		EXPECT_LT(first[0], 255);
		// Adapting down toward a darker scene raises the exposure, a little each frame.
		EXPECT_GE(first[0], previousOutput) << "frame " << frame;
		if (previousOutput >= 0)
		{
			EXPECT_LE(first[0] - previousOutput, 8) << "frame " << frame;
		}
		previousOutput = first[0];
	}

	// A brighter grey maps brighter from the same adaptation state.
	Zeph::HDR_Manager fresh;
	ASSERT_TRUE(fresh.Init(16, 16, &myHelper, nullptr)) << TakeLog();
	Zeph::HDR_Manager freshBright;
	ASSERT_TRUE(freshBright.Init(16, 16, &myHelper, nullptr)) << TakeLog();
	Zeph::Texture* bright = Target(16, 16, Format::R32G32B32A32_FLOAT, Grey(256, 0.4f));
	fresh.Render(output->GetRenderTargetView(), source);
	const int dark = PixelAt(Read(output), 16, 5, 5)[0];
	freshBright.Render(output->GetRenderTargetView(), bright);
	EXPECT_GT(PixelAt(Read(output), 16, 5, 5)[0], dark);
}

TEST_F(PostProcessTest, BloomSpreadsABrightPixelAndLeavesADarkImageAlone)
{
	SetFloat("BloomThreshold", 1.0f);
	SetFloat("BloomFactor", 1.0f);
	Zeph::BloomManager bloom;
	ASSERT_TRUE(bloom.Init(64, 64, &myHelper, nullptr)) << TakeLog();
	Zeph::Texture* output = Target(64, 64, Format::R8G8B8A8_UNORM_SRGB);

	std::vector<float> spot = Grey(64 * 64, 0.0f);
	for (int channel = 0; channel < 3; ++channel)
	{
		spot[(33 * 64 + 33) * 4 + channel] = 50.0f;
	}
	bloom.Render(output->GetRenderTargetView(), Target(64, 64, Format::R32G32B32A32_FLOAT, spot));
	std::vector<uint8_t> pixels = Read(output, "bloom-spot");
	for (const auto& [x, y] : {std::pair{36, 33}, std::pair{33, 30}, std::pair{30, 36}})
	{
		EXPECT_GT(PixelAt(pixels, 64, x, y)[0], 0) << "no light at " << x << ", " << y;
	}
	// Fading with distance: a few 8-bit steps are left at the far corners (sRGB spends
	// its lowest codes on tiny linear values).
	EXPECT_GT(PixelAt(pixels, 64, 36, 33)[0], 20);
	EXPECT_LE(PixelAt(pixels, 64, 2, 2)[0], 2) << "the glow is local";
	EXPECT_LE(PixelAt(pixels, 64, 61, 60)[0], 2) << "the glow is local";

	bloom.Render(output->GetRenderTargetView(),
	             Target(64, 64, Format::R32G32B32A32_FLOAT, Grey(64 * 64, 0.3f)));
	pixels = Read(output, "bloom-dark");
	for (const auto& [x, y] : {std::pair{0, 0}, std::pair{33, 33}, std::pair{63, 20}})
	{
		EXPECT_NEAR(PixelAt(pixels, 64, x, y)[1], SrgbEncoded(0.3f), 1) << "at " << x << ", " << y;
	}
}

TEST_F(PostProcessTest, SsaoSampleDirectionsAreUnitRepeatableAndSpread)
{
	Zeph::SSAOManager first;
	Zeph::SSAOManager second;
	std::srand(1234);
	ASSERT_TRUE(first.Init(64, 64, &myHelper, nullptr)) << TakeLog();
	const std::span<const float> written = Variable("Randvectors")->GetFloats();
	std::srand(1234);
	ASSERT_TRUE(second.Init(64, 64, &myHelper, nullptr)) << TakeLog();
	int negative[3] = {0, 0, 0};
	for (int index = 0; index < Zeph::SSAOManager::ourRandomVectorCount; ++index)
	{
		const Vector4<float>& vector = first.GetRandomVectors()[index];
		EXPECT_NEAR(std::sqrt(vector.x * vector.x + vector.y * vector.y + vector.z * vector.z), 1.0f, 1e-5f);
		EXPECT_EQ(vector.w, 0.0f);
		const Vector4<float>& again = second.GetRandomVectors()[index];
		EXPECT_TRUE(vector.x == again.x && vector.y == again.y && vector.z == again.z) << index;
		EXPECT_EQ(written[index * 4 + 1], vector.y) << "the effect holds the directions";
		negative[0] += vector.x < 0.0f;
		negative[1] += vector.y < 0.0f;
		negative[2] += vector.z < 0.0f;
	}
	for (const int count : negative)
	{
		EXPECT_TRUE(count > 2 && count < 14) << count << " of 16 negative: the directions lean one way";
	}
}

TEST_F(PostProcessTest, ColorGradingWithAnIdentityLookupKeepsColoursAndAMissingOrFlatOneIsReported)
{
	Dds::ImageInfo info;
	info.myWidth = info.myHeight = info.myDepth = 16;
	info.myFormat = Format::R8G8B8A8_UNORM;
	info.myResourceDimension = Dds::ResourceDimension::Texture3D;
	Dds::Image image;
	std::string error;
	ASSERT_TRUE(image.Init(info, error)) << error;
	// x, y and z of each texel, row by row and slice by slice, as red, green and blue.
	uint8_t* texel = image.Data(0, 0);
	for (int index = 0; index < 16 * 16 * 16; ++index, texel += 4)
	{
		const uint8_t rgba[4] = {static_cast<uint8_t>(index % 16 * 17),
		                         static_cast<uint8_t>(index / 16 % 16 * 17),
		                         static_cast<uint8_t>(index / 256 * 17), 255};
		std::memcpy(texel, rgba, 4);
	}
	const std::string lookup = myScratch.File("identity.dds");
	ASSERT_TRUE(Dds::SaveToFile(lookup, image, error)) << error;

	std::vector<uint8_t> colours;
	for (int index = 0; index < 16; ++index)
	{
		colours.insert(colours.end(),
		               {static_cast<uint8_t>(index * 17), static_cast<uint8_t>(255 - index * 13),
		                static_cast<uint8_t>((index * 71) % 256), 255});
	}
	Zeph::Texture* source = Target(4, 4, Format::R8G8B8A8_UNORM_SRGB, colours);
	Zeph::Texture* output = Target(4, 4, Format::R8G8B8A8_UNORM_SRGB);
	// Ours (16 texels a side) and the shipped default (an identity of 32 a side).
	for (const std::string& file : {lookup, std::string(Zeph::ColorGradingManager::ourLookupFile)})
	{
		Zeph::ColorGradingManager grading;
		ASSERT_TRUE(grading.Init(4, 4, &myHelper, nullptr, file)) << TakeLog();
		Clear(output, 0.0f, 0.0f, 0.0f, 0.0f);
		grading.Render(output->GetRenderTargetView(), source);
		const std::vector<uint8_t> pixels = Read(output, "grading-identity");
		ASSERT_EQ(pixels.size(), colours.size());
		for (size_t at = 0; at < pixels.size(); ++at)
		{
			EXPECT_NEAR(pixels[at], colours[at], 2) << file << ", byte " << at;
		}
	}

	// A missing or flat lookup is reported.
	Zeph::ColorGradingManager grading;
	EXPECT_FALSE(grading.Init(4, 4, &myHelper, nullptr, myScratch.File("no-such-lookup.dds")));
	std::string log = TakeLog();
	EXPECT_NE(log.find("\"Line:\"50\n\"Function:\"\"Zeph::ColorGradingManager::Init\"\n\"FAILED TO CREATE "
	                   "COLOR GRADING TEXTURE"),
	          std::string::npos)
	    << log;

	EXPECT_FALSE(grading.Init(4, 4, &myHelper, nullptr, WriteSolidTexture("flat.dds")));
	log = TakeLog();
	EXPECT_NE(log.find("Failed to create 3D SRV"), std::string::npos) << log;
	EXPECT_EQ(grading.GetLookupView(), nullptr);
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
	const std::vector<uint8_t> pixels = Read(destination, "outline");
	EXPECT_GT(PixelAt(pixels, 64, 21, 32)[0], 20) << "glow just outside the left edge";
	EXPECT_GT(PixelAt(pixels, 64, 32, 42)[0], 20) << "glow just below the mask";
	EXPECT_EQ(PixelAt(pixels, 64, 32, 32), (Pixel{0, 0, 128, 255})) << "no glow inside the object";
	EXPECT_EQ(PixelAt(pixels, 64, 1, 1), (Pixel{0, 0, 128, 255})) << "the glow is local";
}

TEST_F(PostProcessTest, MotionBlurWithoutMotionAndFxaaOnAFlatImageKeepTheImage)
{
	Zeph::Texture* source = Target(16, 16, Format::R8G8B8A8_UNORM, Repeat<uint8_t>(256, {90, 160, 30, 255}));
	Zeph::Texture* output = Target(16, 16, Format::R8G8B8A8_UNORM);

	Zeph::MotionBlurManager blur;
	ASSERT_TRUE(blur.Init(16, 16, &myHelper, nullptr)) << TakeLog();
	Clear(blur.GetBuffer(), 0.0f, 0.0f, 0.0f, 0.0f);
	blur.Render(output->GetRenderTargetView(), source);
	EXPECT_EQ(PixelAt(Read(output), 16, 8, 8), (Pixel{90, 160, 30, 255}));

	Zeph::FXAAManager fxaa;
	ASSERT_TRUE(fxaa.Init(16, 16, &myHelper, nullptr)) << TakeLog();
	Clear(output, 0.0f, 0.0f, 0.0f, 0.0f);
	fxaa.Render(output->GetRenderTargetView(), source);
	const std::vector<uint8_t> pixels = Read(output);
	for (const auto& [x, y] : {std::pair{0, 0}, std::pair{8, 8}, std::pair{15, 3}})
	{
		const Pixel pixel = PixelAt(pixels, 16, x, y);
		EXPECT_TRUE(std::abs(pixel[0] - 90) <= 1 && std::abs(pixel[1] - 160) <= 1 &&
		            std::abs(pixel[2] - 30) <= 1)
		    << "at " << x << ", " << y;
	}
}
} // namespace
