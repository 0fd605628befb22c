// The engine's start-up, render-target set-up and shutdown, headless. Its frames are the
// renderer's tests (golden images); what is left here is the set-up around them.

#include <atomic>
#include <chrono>
#include <thread>
#include <tuple>

#include "EngineFixture.h"
#include "engine/Camera.h"

using Zeph::Engine;

// One engine: its settings and targets, a refused second engine, resized targets, a failed
// set-up that never blocks the next, and the flag that holds off a second caller.
TEST_F(EngineTest, CreateSetsUpSettingsAndTargetsThatResizeAndTheSetupFlagHoldsOffASecondCaller)
{
	LUMORA_RETURN_UNLESS(CreateEngine(800, 600));
	Engine* engine = Engine::GetInstance();
	const Zeph::SetupInfo& info = engine->GetSetupInfo();
	EXPECT_EQ(std::tuple(info.myWidth, info.myHeight, info.myWindowed, info.myVSync, info.myShadowQuality,
	                     info.mySessionName, info.myFileName),
	          std::tuple(800, 600, true, false, 3, std::string("Orvanta"), std::string("NULL")));
	EXPECT_GE(engine->GetFeatureLevel(), 45);
	const auto targets = [engine] {
		return std::tuple(engine->GetBackBufferView()->GetFormat(), engine->GetBackBufferView()->GetWidth(),
		                  engine->GetDepthStencilView()->GetFormat(),
		                  engine->GetDepthStencilView()->GetHeight(),
		                  engine->GetDepthShaderView()->GetFormat(), engine->IsSettingUpTargets());
	};
	EXPECT_EQ(targets(), std::tuple(Dds::Format::R8G8B8A8_UNORM_SRGB, 800, Dds::Format::D24_UNORM_S8_UINT,
	                                600, Dds::Format::R24_UNORM_X8_TYPELESS, false));
	// The camera takes the engine's aspect ratio when it is made.
	EXPECT_FLOAT_EQ(Zeph::Camera().GetAspectRatio(), 800.0f / 600.0f);

	Gpu::WindowHandle window = 0;
	EXPECT_FALSE(Engine::Create(window, 64, 64)) << "a second engine";
	EXPECT_THAT(TakeLog(), testing::HasSubstr("The engine already exists"));
	EXPECT_EQ(Engine::GetInstance(), engine);

	ASSERT_TRUE(engine->SetupRenderTargets(160, 90));
	EXPECT_EQ(targets(), std::tuple(Dds::Format::R8G8B8A8_UNORM_SRGB, 160, Dds::Format::D24_UNORM_S8_UINT, 90,
	                                Dds::Format::R24_UNORM_X8_TYPELESS, false));
	EXPECT_FALSE(engine->SetupRenderTargets(-1, -1));
	EXPECT_THAT(TakeLog(), testing::HasSubstr("\"Function:\"\"Gpu::SwapChain::ResizeBuffers\"\n"
	                                          "\"Cannot make a -1x-1 back buffer"));
	EXPECT_FALSE(engine->IsSettingUpTargets());
	ASSERT_TRUE(engine->SetupRenderTargets(200, 100));

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

	engine->Present();
	Engine::ShutDown();
	EXPECT_EQ(Engine::GetInstance(), nullptr);
	Engine::ShutDown(); // nothing left to shut down: harmless
}
