// The engine's start-up, frame, render-target set-up and shutdown, headless.

#include <atomic>
#include <chrono>
#include <thread>

#include "EngineFixture.h"
#include "engine/Camera.h"
#include "engine/ShaderFiles.h"
#include "platform/gpu/Readback.h"

using Zeph::Engine;

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
		EXPECT_THAT(TakeLog(), testing::HasSubstr("The engine already exists"));
		EXPECT_EQ(Engine::GetInstance(), engine);

		engine->Present();
		Engine::ShutDown();
		EXPECT_EQ(Engine::GetInstance(), nullptr);
		Engine::ShutDown(); // nothing left to shut down: harmless
	}
}

// One engine: the acceptance frame, resized targets, and the flag that guards their set-up.
TEST_F(EngineTest, AFrameReadsBackTopRowFirstTargetsResizeAndTheSetupFlagHoldsOffASecondCaller)
{
	LUMORA_RETURN_UNLESS(CreateEngine(320, 240));
	ASSERT_TRUE(DrawFrame());
	Engine* engine = Engine::GetInstance();
	std::vector<uint8_t> pixels;
	ASSERT_TRUE(Gpu::ReadRenderTarget(engine->GetContext(), *engine->GetBackBufferView(), pixels));
	Gpu::SavePng(myScratch.File("frame.png"), 320, 240, pixels.data());
	EXPECT_TRUE(IsAcceptanceFrame(pixels, 320, 240));

	ASSERT_TRUE(engine->SetupRenderTargets(160, 90));
	EXPECT_EQ(engine->GetBackBufferView()->GetWidth(), 160);
	EXPECT_EQ(engine->GetBackBufferView()->GetHeight(), 90);
	EXPECT_EQ(engine->GetDepthStencilView()->GetHeight(), 90);
	// A failed set-up is reported and never blocks the next.
	EXPECT_FALSE(engine->SetupRenderTargets(-1, -1));
	EXPECT_THAT(TakeLog(), testing::HasSubstr("\"Function:\"\"Gpu::SwapChain::ResizeBuffers\"\n"
	                                          "\"Cannot make a -1x-1 back buffer"));
	EXPECT_FALSE(engine->IsSettingUpTargets());
	ASSERT_TRUE(engine->SetupRenderTargets(200, 100));
	EXPECT_EQ(engine->GetBackBufferView()->GetWidth(), 200);
	const float red[4] = {1.0f, 0.0f, 0.0f, 1.0f};
	engine->GetContext().ClearRenderTargetView(*engine->GetBackBufferView(), red);
	ASSERT_TRUE(Gpu::ReadRenderTarget(engine->GetContext(), *engine->GetBackBufferView(), pixels));
	EXPECT_EQ(pixels.size(), size_t{200 * 100 * 4});
	EXPECT_EQ(pixels[0], 255);

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
