// The engine on an X11 window under Xvfb: the same frame as headless, read back
// from what the window shows after Present.

#include <chrono>
#include <cmath>
#include <thread>

#include "EngineFixture.h"
#include "platform/gpu/Readback.h"
#include "platform/gpu/XServer.h"

namespace
{
bool Near(const uint8_t* aPixel, const float* aLinear)
{
	for (int channel = 0; channel < 3; ++channel)
	{
		if (std::abs(aPixel[channel] - TestSupport::SrgbEncoded(aLinear[channel])) > 1)
		{
			return false;
		}
	}
	return true;
}
} // namespace

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
		const float* clearColor = ourClearColor;
		const float* quadColor = ourQuadColor;

		// Another connection draws the window: wait until the frame has arrived.
		std::vector<uint8_t> shown;
		bool arrivedFlag = false;
		for (int attempt = 0; attempt < 100 && !arrivedFlag; ++attempt)
		{
			shown = ReadWindowPixels(display, window, width, height);
			ASSERT_FALSE(shown.empty());
			arrivedFlag = Near(&shown[(54 * width + 160) * 4], quadColor);
			if (!arrivedFlag)
			{
				std::this_thread::sleep_for(std::chrono::milliseconds(20));
			}
		}
		Gpu::SavePng(myScratch.File("window.png"), width, height, shown.data());
		EXPECT_TRUE(arrivedFlag) << "the quad's colour, sRGB-encoded, at the centre of the top half";
		EXPECT_TRUE(Near(&shown[0], clearColor)) << "top-left corner";
		EXPECT_TRUE(Near(&shown[((height - 1) * width + width - 1) * 4], clearColor))
		    << "bottom-right corner";
		EXPECT_TRUE(Near(&shown[(180 * width + 160) * 4], clearColor)) << "below the quad";
		// The window goes after the engine's surface on it.
		Zeph::Engine::ShutDown();
	}
	XDestroyWindow(display, window);
	XCloseDisplay(display);
}
