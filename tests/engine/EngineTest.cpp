// The engine's start-up, frame, render-target set-up and shutdown, headless.

#include <atomic>
#include <chrono>
#include <cmath>
#include <thread>

#include "EngineFixture.h"
#include "engine/Camera.h"
#include "engine/ShaderFiles.h"
#include "platform/gpu/Readback.h"

namespace
{
using Zeph::Engine;

void ExpectPixel(const std::vector<uint8_t>& someBytes, int aWidth, int anX, int aY, const float* aLinear,
                 const char* aWhat)
{
	const size_t offset =
	    (static_cast<size_t>(aY) * static_cast<size_t>(aWidth) + static_cast<size_t>(anX)) * 4;
	for (int channel = 0; channel < 3; ++channel)
	{
		EXPECT_NEAR(someBytes[offset + static_cast<size_t>(channel)],
		            TestSupport::SrgbEncoded(aLinear[channel]), 1)
		    << aWhat << " at (" << anX << ", " << aY << "), channel " << channel;
	}
}
} // namespace

TEST_F(EngineTest, CreateSetsUpTheSettingsAndTargetsAndShutDownClearsTheInstance)
{
	const struct
	{
		int width;
		int height;
	} sizes[] = {{320, 240}, {800, 600}};
	for (const auto& size : sizes)
	{
		SCOPED_TRACE(std::to_string(size.width) + "x" + std::to_string(size.height));
		LUMORA_RETURN_UNLESS(CreateEngine(size.width, size.height));
		Engine* engine = Engine::GetInstance();
		ASSERT_NE(engine, nullptr);
		const Zeph::SetupInfo& info = engine->GetSetupInfo();
		EXPECT_EQ(info.myWidth, size.width);
		EXPECT_EQ(info.myHeight, size.height);
		EXPECT_TRUE(info.myWindowed);
		EXPECT_EQ(info.myFileName, "NULL") << "no settings file is written";
		EXPECT_GE(engine->GetFeatureLevel(), 45);

		ASSERT_NE(engine->GetBackBufferView(), nullptr);
		EXPECT_EQ(engine->GetBackBufferView()->GetFormat(), Dds::Format::R8G8B8A8_UNORM_SRGB);
		EXPECT_EQ(engine->GetBackBufferView()->GetWidth(), size.width);
		EXPECT_EQ(engine->GetBackBufferView()->GetHeight(), size.height);
		ASSERT_NE(engine->GetDepthStencilView(), nullptr);
		EXPECT_EQ(engine->GetDepthStencilView()->GetFormat(), Dds::Format::D24_UNORM_S8_UINT);
		EXPECT_EQ(engine->GetDepthStencilView()->GetWidth(), size.width);
		ASSERT_NE(engine->GetDepthShaderView(), nullptr);
		EXPECT_EQ(engine->GetDepthShaderView()->GetFormat(), Dds::Format::R24_UNORM_X8_TYPELESS);
		EXPECT_FALSE(engine->IsSettingUpTargets());

		// The camera takes the engine's aspect ratio when it is made.
		EXPECT_FLOAT_EQ(Zeph::Camera().GetAspectRatio(),
		                static_cast<float>(size.width) / static_cast<float>(size.height));

		Gpu::WindowHandle window = 0;
		EXPECT_FALSE(Engine::Create(window, 64, 64)) << "a second engine";
		EXPECT_NE(TakeLog().find("The engine already exists"), std::string::npos);
		EXPECT_EQ(Engine::GetInstance(), engine);

		engine->Present();
		Engine::ShutDown();
		EXPECT_EQ(Engine::GetInstance(), nullptr);
		Engine::ShutDown(); // nothing left to shut down: harmless
	}
}

TEST_F(EngineTest, AFrameClearsDrawsThroughAnEffectAndReadsBackTopRowFirst)
{
	constexpr int width = 320;
	constexpr int height = 240;
	LUMORA_RETURN_UNLESS(CreateEngine(width, height));
	ASSERT_TRUE(DrawFrame());
	Engine* engine = Engine::GetInstance();
	Gpu::Context& context = engine->GetContext();
	const float* clearColor = ourClearColor;
	const float* quadColor = ourQuadColor;

	std::vector<uint8_t> pixels;
	ASSERT_TRUE(Gpu::ReadRenderTarget(context, *engine->GetBackBufferView(), pixels));
	ASSERT_EQ(pixels.size(), size_t{width * height * 4});
	Gpu::SavePng(myScratch.File("frame.png"), width, height, pixels.data());
	// Clip y 0.9..0.2 is rows 12..96 from the top; x -0.5..0.5 is columns 80..240.
	ExpectPixel(pixels, width, 160, 54, quadColor, "quad centre");
	ExpectPixel(pixels, width, 82, 14, quadColor, "quad, near its top-left corner");
	ExpectPixel(pixels, width, 0, 0, clearColor, "top-left corner");
	ExpectPixel(pixels, width, width - 1, height - 1, clearColor, "bottom-right corner");
	ExpectPixel(pixels, width, 160, 180, clearColor, "lower half, below the quad");
	ExpectPixel(pixels, width, 160, 5, clearColor, "above the quad");
}

TEST_F(EngineTest, RenderTargetSetupResizesAndAFailedSetupNeverBlocksTheNext)
{
	LUMORA_RETURN_UNLESS(CreateEngine(320, 240));
	Engine* engine = Engine::GetInstance();
	ASSERT_TRUE(engine->SetupRenderTargets(160, 90));
	EXPECT_EQ(engine->GetBackBufferView()->GetWidth(), 160);
	EXPECT_EQ(engine->GetBackBufferView()->GetHeight(), 90);
	EXPECT_EQ(engine->GetDepthStencilView()->GetHeight(), 90);

	EXPECT_FALSE(engine->SetupRenderTargets(-1, -1));
	const std::string log = TakeLog();
	EXPECT_NE(log.find("\"Function:\"\"Gpu::SwapChain::ResizeBuffers\"\n\"Cannot make a -1x-1 back buffer"),
	          std::string::npos)
	    << "the failed step is reported:\n"
	    << log;
	EXPECT_FALSE(engine->IsSettingUpTargets());
	ASSERT_TRUE(engine->SetupRenderTargets(200, 100));
	EXPECT_EQ(engine->GetBackBufferView()->GetWidth(), 200);
	const float clearColor[4] = {1.0f, 0.0f, 0.0f, 1.0f};
	engine->GetContext().ClearRenderTargetView(*engine->GetBackBufferView(), clearColor);
	std::vector<uint8_t> pixels;
	ASSERT_TRUE(Gpu::ReadRenderTarget(engine->GetContext(), *engine->GetBackBufferView(), pixels));
	EXPECT_EQ(pixels.size(), size_t{200 * 100 * 4});
	EXPECT_EQ(pixels[0], 255);
}

TEST_F(EngineTest, TheSetupFlagMakesASecondCallerWaitUntilItIsReleased)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	Engine* engine = Engine::GetInstance();
	engine->AcquireSetupFlag();
	std::atomic<bool> acquiredFlag = false;
	std::thread second([&] {
		engine->AcquireSetupFlag();
		acquiredFlag = true;
		engine->ReleaseSetupFlag();
	});
	std::this_thread::sleep_for(std::chrono::milliseconds(30));
	EXPECT_FALSE(acquiredFlag.load()) << "the second caller went through a held flag";
	engine->ReleaseSetupFlag();
	second.join();
	EXPECT_TRUE(acquiredFlag.load());
	EXPECT_FALSE(engine->IsSettingUpTargets());
}
