// The swap chain: its back buffer as a render target, headless and in an X11
// window under Xvfb, where the test reads back what the window shows.

#include <array>
#include <chrono>
#include <functional>
#include <thread>
#include <vector>

#include "GpuTest.h"
#include "platform/gpu/SwapChain.h"
#include "support/TestSupport.h"

#include "XServer.h"

namespace
{
// The bytes a target of this format stores for a linear colour, in R, G, B, A order.
Pixel Stored(const float aColor[4], Dds::Format aFormat)
{
	const bool srgbFlag = Dds::IsSRGB(aFormat);
	Pixel pixel;
	for (int channel = 0; channel < 4; ++channel)
	{
		pixel[channel] = srgbFlag && channel < 3
		                     ? SrgbEncoded(aColor[channel])
		                     : static_cast<uint8_t>(std::lround(aColor[channel] * 255.0f));
	}
	return pixel;
}

constexpr float ourClearColor[4] = {0.6f, 0.2f, 1.0f, 1.0f};
constexpr float ourQuadColor[4] = {1.0f, 0.6f, 0.0f, 1.0f};
} // namespace

using SwapChainTest = GpuTest;

// A refused request changes nothing; a resize replaces the back buffer, keeping its format unless told.
TEST_F(SwapChainTest, BadRequestsAreReportedAndChangeNothingAndResizeBuffersReplaces)
{
	Gpu::SwapChain swapChain;
	EXPECT_FALSE(swapChain.Present(0));
	Gpu::Device noDevice;
	EXPECT_FALSE(swapChain.Init(noDevice, 8, 8, Dds::Format::R8G8B8A8_UNORM));
	EXPECT_FALSE(swapChain.Init(myDevice, 8, 8, Dds::Format::R16G16B16A16_FLOAT));
	EXPECT_FALSE(swapChain.Init(myDevice, 0, 8, Dds::Format::R8G8B8A8_UNORM)); // no window to size from
	EXPECT_EQ(swapChain.GetBuffer(), nullptr);
	EXPECT_EQ(TakeReports().size(), 4u);

	ASSERT_TRUE(swapChain.Init(myDevice, 8, 4, Dds::Format::R8G8B8A8_UNORM_SRGB));
	Gpu::RenderTargetView* views[] = {swapChain.GetBuffer()->CreateRenderTargetView()};
	Gpu::RenderTargetView* view = views[0];
	EXPECT_FALSE(swapChain.Init(myDevice, 8, 4, Dds::Format::R8G8B8A8_UNORM));
	EXPECT_FALSE(swapChain.ResizeBuffers(16, 16, Dds::Format::R32_FLOAT));
	EXPECT_FALSE(swapChain.ResizeBuffers(1 << 20, 4, Dds::Format::UNKNOWN));
	EXPECT_FALSE(swapChain.Present(5));
	ExpectReports({{"Gpu::SwapChain::Init: The swap chain is already initialized"},
	               {"Gpu::SwapChain::ResizeBuffers: Cannot make a 16x16 back buffer of format 41"},
	               {"ResizeBuffers"},
	               {"Gpu::SwapChain::Present: Bad sync interval 5"}});

	// The refused resizes left the buffer and its view alone.
	EXPECT_EQ(swapChain.GetWidth(), 8);
	GetContext().ClearRenderTargetView(*view, ourClearColor);
	EXPECT_EQ(PixelAt(ReadPixels(*view), 8, 7, 3), Stored(ourClearColor, Dds::Format::R8G8B8A8_UNORM_SRGB));

	for (const Dds::Format format : {Dds::Format::R8G8B8A8_UNORM_SRGB, Dds::Format::B8G8R8A8_UNORM})
	{
		SCOPED_TRACE(Dds::FormatName(format));
		ASSERT_TRUE(GetContext().SetRenderTargets(views, nullptr));
		const size_t framebufferCount = GetContext().GetFramebufferCache().GetEntryCount();
		ASSERT_TRUE(swapChain.ResizeBuffers(
		    48, 20, format == Dds::Format::B8G8R8A8_UNORM ? format : Dds::Format::UNKNOWN));
		EXPECT_EQ(swapChain.GetFormat(), format);
		// The old view's framebuffer went with it, so nothing can draw into freed storage.
		EXPECT_EQ(GetContext().GetFramebufferCache().GetEntryCount(), framebufferCount - 1);
		views[0] = swapChain.GetBuffer()->CreateRenderTargetView();
		ASSERT_NE(views[0], nullptr);
		GetContext().ClearRenderTargetView(*views[0], ourClearColor);
		const std::vector<uint8_t> bytes = ReadPixels(*views[0]);
		EXPECT_EQ(bytes.size(), 48u * 20u * 4u);
		EXPECT_EQ(PixelAt(bytes, 48, 47, 19), Stored(ourClearColor, format));
	}
	EXPECT_TRUE(swapChain.Present(1));
	swapChain.Destroy();
}

// A device and swap chain on a 320x240 X11 window of an X server the suite
// starts (or finds); the window device replaces GpuTest's headless one.
class SwapChainWindowTest : public GpuTest
{
protected:
	static void SetUpTestSuite()
	{
		ourServer = new XServer;
		ourServerFlag = ourServer->Start();
	}

	static void TearDownTestSuite()
	{
		delete ourServer;
		ourServer = nullptr;
	}

	void SetUpGpu() override
	{
		if (!ourServerFlag && XServer::IsXvfbInstalled())
		{
			LUMORA_SKIP_OR_FAIL(ourServer->GetReason());
		}
		if (!ourServerFlag)
		{
			GTEST_SKIP() << ourServer->GetReason(); // the machine has no X server to offer
		}
		myDisplay = XOpenDisplay(nullptr);
		ASSERT_NE(myDisplay, nullptr);
		myWindow = XCreateSimpleWindow(myDisplay, DefaultRootWindow(myDisplay), 0, 0, 320, 240, 0, 0, 0);
		XSync(myDisplay, False);
		myDevice.Destroy();
		ASSERT_TRUE(myDevice.Init(320, 240, myWindow)) << Joined();
		EXPECT_EQ(myDevice.GetWindow(), myWindow);
		// The device mapped the window through its own connection.
		XWindowAttributes attributes{};
		for (int attempt = 0; attempt < 200; ++attempt)
		{
			XGetWindowAttributes(myDisplay, myWindow, &attributes);
			if (attributes.map_state == IsViewable)
			{
				break;
			}
			std::this_thread::sleep_for(std::chrono::milliseconds(10));
		}
		ASSERT_EQ(attributes.map_state, IsViewable);
	}

	void TearDown() override
	{
		if (myDevice.IsInitialized() && myDevice.MakeCurrent())
		{
			mySwapChain.Destroy();
		}
		GpuTest::TearDown(); // the device goes before its window
		if (myDisplay != nullptr)
		{
			XDestroyWindow(myDisplay, myWindow);
			XCloseDisplay(myDisplay);
		}
	}

	// Clears the back buffer and copies a tile of the quad colour over the top half of it.
	void DrawFrame(const float aClearColor[4])
	{
		Gpu::RenderTargetView* view = mySwapChain.GetBuffer()->CreateRenderTargetView();
		Gpu::Texture* tile =
		    MakeTarget(mySwapChain.GetFormat(), mySwapChain.GetWidth(), mySwapChain.GetHeight() / 2);
		ASSERT_TRUE(view && tile);
		GetContext().ClearRenderTargetView(*view, aClearColor);
		GetContext().ClearRenderTargetView(*tile->CreateRenderTargetView(), ourQuadColor);
		ASSERT_TRUE(GetContext().CopySubresourceRegion(*mySwapChain.GetBuffer(), 0, 0, 0, 0, 0, *tile, 0, 0));
		myBackBuffer = ReadPixels(*view);
	}

	// The window's pixels as RGBA (alpha 255), row 0 at the top. Another client (the
	// device's connection) draws them, so wait until aShownFlag says the frame has
	// arrived, or a few seconds pass; without aShownFlag, until the window shows the
	// back buffer's bytes (without its alpha channel).
	std::vector<uint8_t> ReadWindow(int aWidth, int aHeight,
	                                std::function<bool(const std::vector<uint8_t>&)> aShownFlag = nullptr)
	{
		if (!aShownFlag)
		{
			aShownFlag = [&](const std::vector<uint8_t>& someShown) {
				return someShown == TestSupport::Opaque(myBackBuffer);
			};
		}
		std::vector<uint8_t> pixels;
		for (int attempt = 0; attempt < 100; ++attempt)
		{
			pixels = ReadWindowPixels(myDisplay, myWindow, aWidth, aHeight);
			if (pixels.empty())
			{
				ADD_FAILURE() << "XGetImage failed";
				return {};
			}
			if (aShownFlag(pixels))
			{
				break;
			}
			std::this_thread::sleep_for(std::chrono::milliseconds(20));
		}
		return pixels;
	}

	static inline XServer* ourServer = nullptr;
	static inline bool ourServerFlag = false;
	Display* myDisplay = nullptr;
	Window myWindow = 0;
	Gpu::SwapChain mySwapChain;
	std::vector<uint8_t> myBackBuffer;
};

// The last case draws and presents on a render thread that holds the context meanwhile; then the
// back buffer follows the window's new size, or is stretched over it.
TEST_F(SwapChainWindowTest, PresentShowsTheBackBufferUprightWithItsBytesAndFollowsTheWindow)
{
	const std::pair<Dds::Format, bool> cases[] = {{Dds::Format::R8G8B8A8_UNORM_SRGB, false},
	                                              {Dds::Format::B8G8R8A8_UNORM, false},
	                                              {Dds::Format::R8G8B8A8_UNORM_SRGB, true}};
	for (const auto& [format, threadFlag] : cases)
	{
		SCOPED_TRACE(std::to_string(static_cast<unsigned>(format)) +
		             (threadFlag ? " on a render thread" : ""));
		ASSERT_TRUE(mySwapChain.Init(myDevice, 0, 0, format)); // the window's size
		EXPECT_TRUE(mySwapChain.HasWindow());
		EXPECT_EQ(mySwapChain.GetWidth(), 320);
		EXPECT_EQ(mySwapChain.GetHeight(), 240);
		bool presentedFlag = false;
		auto frame = [&] {
			DrawFrame(ourClearColor);
			presentedFlag = mySwapChain.Present(threadFlag ? 1 : 0);
		};
		if (threadFlag)
		{
			myDevice.ReleaseCurrent();
			std::thread renderThread([&] {
				if (myDevice.MakeCurrent())
				{
					frame();
					myDevice.ReleaseCurrent();
				}
			});
			renderThread.join();
			ASSERT_TRUE(myDevice.MakeCurrent());
		}
		else
		{
			frame();
		}
		ASSERT_TRUE(presentedFlag);

		// Every byte arrives as the back buffer stored it (sRGB-encoded, not decoded or encoded
		// again), upright: the quad in the top half of the view is in the top half of the window.
		const std::vector<uint8_t> window = ReadWindow(320, 240);
		EXPECT_TRUE(window == TestSupport::Opaque(myBackBuffer));
		EXPECT_EQ(PixelAt(window, 320, 0, 0), Stored(ourQuadColor, format));
		mySwapChain.Destroy();
	}

	ASSERT_TRUE(mySwapChain.Init(myDevice, 320, 240, Dds::Format::R8G8B8A8_UNORM_SRGB));
	XResizeWindow(myDisplay, myWindow, 400, 300);
	XSync(myDisplay, False);
	ASSERT_TRUE(mySwapChain.ResizeBuffers(0, 0, Dds::Format::UNKNOWN));
	EXPECT_EQ(mySwapChain.GetWidth(), 400);
	EXPECT_EQ(mySwapChain.GetHeight(), 300);
	DrawFrame(ourClearColor);
	ASSERT_TRUE(mySwapChain.Present(1));
	EXPECT_TRUE(ReadWindow(400, 300) == TestSupport::Opaque(myBackBuffer));

	// A back buffer smaller than the window is stretched over all of it.
	const float blackColor[4] = {0.0f, 0.0f, 0.0f, 1.0f};
	ASSERT_TRUE(mySwapChain.ResizeBuffers(200, 150, Dds::Format::UNKNOWN));
	DrawFrame(blackColor);
	ASSERT_TRUE(mySwapChain.Present(0));
	const Pixel quad = Stored(ourQuadColor, Dds::Format::R8G8B8A8_UNORM_SRGB);
	const Pixel black = {0, 0, 0, 255};
	const std::vector<uint8_t> window = ReadWindow(400, 300, [&](const std::vector<uint8_t>& someShown) {
		return PixelAt(someShown, 400, 399, 0) == quad && PixelAt(someShown, 400, 0, 299) == black;
	});
	EXPECT_EQ(PixelAt(window, 400, 399, 140), quad);
	EXPECT_EQ(PixelAt(window, 400, 399, 160), black);
}

TEST_F(SwapChainWindowTest, BadWindowOrDisplayIsReportedNotFatal)
{
	const std::string display = std::getenv("DISPLAY");
	struct Case
	{
		const char* myDisplay; // null: unset
		Window myWindow;
		const char* myMessage;
	};
	const Case cases[] = {
	    {display.c_str(), 0x3fffffff, "does not exist on X display"},
	    {":997", myWindow, "Cannot open the X display ':997'"},
	    {nullptr, myWindow, "$DISPLAY is not set"},
	};
	for (const Case& aCase : cases)
	{
		SCOPED_TRACE(aCase.myMessage);
		if (aCase.myDisplay != nullptr)
		{
			setenv("DISPLAY", aCase.myDisplay, 1);
		}
		else
		{
			unsetenv("DISPLAY");
		}
		Gpu::Device device;
		EXPECT_FALSE(device.Init(64, 64, aCase.myWindow));
		EXPECT_EQ(device.GetFailure(), Gpu::DeviceFailure::NoDevice);
		EXPECT_NE(device.GetFailureText().find(aCase.myMessage), std::string::npos)
		    << device.GetFailureText();
		EXPECT_TRUE(TakeReports().empty()) << "the caller reports a missing device in its own words";
	}
	setenv("DISPLAY", display.c_str(), 1);
	// The window device is untouched and still presents.
	ASSERT_TRUE(myDevice.MakeCurrent());
	ASSERT_TRUE(mySwapChain.Init(myDevice, 0, 0, Dds::Format::R8G8B8A8_UNORM));
	EXPECT_TRUE(mySwapChain.Present(0));
}
