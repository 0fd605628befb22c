// The engine on an X11 window under Xvfb: the same frame as headless, read back
// from what the window shows after Present.

#include <chrono>
#include <thread>

#include "EngineFixture.h"
#include "platform/gpu/Readback.h"
#include "platform/gpu/XServer.h"

TEST_F(EngineTest, AFrameOnAnX11WindowShowsTheQuadAtTheTop)
{
	XServer server;
	if (!server.Start())
	{
		if (TestSupport::IsCi() && XServer::IsXvfbInstalled())
		{
			FAIL() << server.GetReason();
		}
		GTEST_SKIP() << server.GetReason();
	}
	constexpr int width = 320;
	constexpr int height = 240;
	Display* display = XOpenDisplay(nullptr);
	ASSERT_NE(display, nullptr);
	const Window window =
	    XCreateSimpleWindow(display, DefaultRootWindow(display), 0, 0, width, height, 0, 0, 0);
	XFlush(display);
	if (CreateEngine(width, height, window))
	{
		ASSERT_TRUE(DrawFrame());
		// Another connection draws the window: wait until the frame has arrived.
		std::vector<uint8_t> shown;
		testing::AssertionResult arrived = testing::AssertionFailure();
		for (int attempt = 0; attempt < 100 && !arrived; ++attempt)
		{
			std::this_thread::sleep_for(std::chrono::milliseconds(attempt == 0 ? 0 : 20));
			shown = ReadWindowPixels(display, window, width, height);
			arrived = IsAcceptanceFrame(shown, width, height);
		}
		ASSERT_EQ(shown.size(), size_t{width * height * 4});
		Gpu::SavePng(myScratch.File("window.png"), width, height, shown.data());
		EXPECT_TRUE(arrived);
		// The window goes after the engine's surface on it.
		Zeph::Engine::ShutDown();
	}
	XDestroyWindow(display, window);
	XCloseDisplay(display);
}
