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

#include "TestProgram.h"
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

// Resizing with UNKNOWN keeps the format; the last case changes it.
TEST_F(SwapChainTest, HeadlessBackBufferIsARenderTargetThatResizeBuffersReplaces)
{
	using Dds::Format;
	const std::pair<Format, Format> cases[] = {{Format::R8G8B8A8_UNORM_SRGB, Format::UNKNOWN},
	                                           {Format::R8G8B8A8_UNORM, Format::UNKNOWN},
	                                           {Format::B8G8R8A8_UNORM_SRGB, Format::UNKNOWN},
	                                           {Format::R8G8B8A8_UNORM_SRGB, Format::B8G8R8A8_UNORM}};
	for (const auto& [initial, resized] : cases)
	{
		const Format format = resized == Format::UNKNOWN ? initial : resized;
		SCOPED_TRACE(Dds::FormatName(format));
		Gpu::SwapChain swapChain;
		ASSERT_TRUE(swapChain.Init(myDevice, 32, 16, initial));
		Gpu::RenderTargetView* views[] = {swapChain.GetBuffer()->CreateRenderTargetView()};
		ASSERT_TRUE(GetContext().SetRenderTargets(views, nullptr));
		const size_t framebufferCount = GetContext().GetFramebufferCache().GetEntryCount();

		ASSERT_TRUE(swapChain.ResizeBuffers(48, 20, resized));
		EXPECT_EQ(swapChain.GetFormat(), format);
		// The old view's framebuffer went with it, so nothing can draw into freed storage.
		EXPECT_EQ(GetContext().GetFramebufferCache().GetEntryCount(), framebufferCount - 1);
		Gpu::RenderTargetView* view = swapChain.GetBuffer()->CreateRenderTargetView();
		ASSERT_NE(view, nullptr);
		GetContext().ClearRenderTargetView(*view, ourClearColor);
		const std::vector<uint8_t> bytes = ReadPixels(*view);
		EXPECT_EQ(bytes.size(), 48u * 20u * 4u);
		EXPECT_EQ(PixelAt(bytes, 48, 47, 19), Stored(ourClearColor, format));
		EXPECT_TRUE(swapChain.Present(0));
		EXPECT_TRUE(swapChain.Present(1));
		swapChain.Destroy();
		EXPECT_EQ(swapChain.GetBuffer(), nullptr);
	}
}

TEST_F(SwapChainTest, BadRequestsAreReportedAndChangeNothing)
{
	Gpu::SwapChain swapChain;
	EXPECT_FALSE(swapChain.Present(0));
	EXPECT_FALSE(swapChain.ResizeBuffers(8, 8, Dds::Format::UNKNOWN));
	Gpu::Device noDevice;
	EXPECT_FALSE(swapChain.Init(noDevice, 8, 8, Dds::Format::R8G8B8A8_UNORM));
	EXPECT_FALSE(swapChain.Init(myDevice, 8, 8, Dds::Format::R16G16B16A16_FLOAT));
	EXPECT_FALSE(swapChain.Init(myDevice, 0, 8, Dds::Format::R8G8B8A8_UNORM)); // no window to size from
	EXPECT_EQ(swapChain.GetBuffer(), nullptr);
	EXPECT_EQ(TakeReports().size(), 5u);

	ASSERT_TRUE(swapChain.Init(myDevice, 8, 4, Dds::Format::R8G8B8A8_UNORM));
	Gpu::RenderTargetView* view = swapChain.GetBuffer()->CreateRenderTargetView();
	EXPECT_FALSE(swapChain.Init(myDevice, 8, 4, Dds::Format::R8G8B8A8_UNORM));
	EXPECT_FALSE(swapChain.ResizeBuffers(16, 16, Dds::Format::R32_FLOAT));
	EXPECT_FALSE(swapChain.ResizeBuffers(-1, 4, Dds::Format::UNKNOWN));
	EXPECT_FALSE(swapChain.ResizeBuffers(1 << 20, 4, Dds::Format::UNKNOWN));
	EXPECT_FALSE(swapChain.Present(5));
	EXPECT_FALSE(swapChain.Present(-1));
	ExpectReports({{"Gpu::SwapChain::Init: The swap chain is already initialized"},
	               {"Gpu::SwapChain::ResizeBuffers: Cannot make a 16x16 back buffer of format 41"},
	               {"ResizeBuffers"},
	               {"ResizeBuffers"},
	               {"Gpu::SwapChain::Present: Bad sync interval 5"},
	               {"Present"}});

	// The refused resizes left the buffer and its view alone.
	EXPECT_EQ(swapChain.GetWidth(), 8);
	GetContext().ClearRenderTargetView(*view, ourClearColor);
	EXPECT_EQ(PixelAt(ReadPixels(*view), 8, 7, 3), Stored(ourClearColor, Dds::Format::R8G8B8A8_UNORM));
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
		// The quad needs no vertex buffer: its corners come from gl_VertexID.
		const std::string fragment = "#version 450 core\nout vec4 oColor;\nvoid main() { oColor = vec4(" +
		                             std::to_string(ourQuadColor[0]) + ", " +
		                             std::to_string(ourQuadColor[1]) + ", " +
		                             std::to_string(ourQuadColor[2]) + ", 1.0); }\n";
		myProgram = LinkProgram(R"(#version 450 core
const vec2 corners[4] = vec2[](vec2(-1.0, 1.0), vec2(1.0, 1.0), vec2(-1.0, 0.0), vec2(1.0, 0.0));
void main() { gl_Position = vec4(corners[gl_VertexID], 0.5, 1.0); })",
		                        fragment.c_str());
	}

	void TearDown() override
	{
		if (myDevice.IsInitialized() && myDevice.MakeCurrent())
		{
			GetContext().GetStateCache().ForgetProgram(myProgram);
			glDeleteProgram(myProgram);
			mySwapChain.Destroy();
		}
		GpuTest::TearDown(); // the device goes before its window
		if (myDisplay != nullptr)
		{
			XDestroyWindow(myDisplay, myWindow);
			XCloseDisplay(myDisplay);
		}
	}

	// Clears the back buffer and draws a quad over the top half of the view (clip y 0..1).
	void DrawFrame(const float aClearColor[4])
	{
		Gpu::Context& context = GetContext();
		Gpu::RenderTargetView* views[] = {mySwapChain.GetBuffer()->CreateRenderTargetView()};
		ASSERT_NE(views[0], nullptr);
		ASSERT_TRUE(context.SetRenderTargets(views, nullptr));
		context.SetViewport({.myWidth = static_cast<float>(mySwapChain.GetWidth()),
		                     .myHeight = static_cast<float>(mySwapChain.GetHeight())});
		context.ClearRenderTargetView(*views[0], aClearColor);
		context.SetRasterizerState({.myCullMode = Gpu::CullMode::None});
		context.GetStateCache().UseProgram(myProgram);
		context.SetInputLayout(nullptr);
		context.SetPrimitiveTopology(Gpu::PrimitiveTopology::TriangleStrip);
		context.Draw(4, 0);
		myBackBuffer = ReadPixels(*views[0]);
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
	GLuint myProgram = 0;
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

		const std::vector<uint8_t> window = ReadWindow(320, 240);
		const Pixel quad = Stored(ourQuadColor, format);
		const Pixel clear = Stored(ourClearColor, format);
		// Direct3D's orientation: the top rows of the view are the top rows of the window.
		EXPECT_EQ(PixelAt(window, 320, 0, 0), quad);
		EXPECT_EQ(PixelAt(window, 320, 319, 119), quad);
		EXPECT_EQ(PixelAt(window, 320, 0, 120), clear);
		EXPECT_EQ(PixelAt(window, 320, 319, 239), clear);
		// Every byte arrives as the back buffer stored it (sRGB-encoded, not decoded or encoded again).
		EXPECT_TRUE(window == TestSupport::Opaque(myBackBuffer));
		Gpu::SavePng("/tmp/lumora-swapchain-window.png", 320, 240, window.data());
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
	std::vector<uint8_t> window = ReadWindow(400, 300);
	EXPECT_TRUE(window == TestSupport::Opaque(myBackBuffer));
	Gpu::SavePng("/tmp/lumora-swapchain-resized.png", 400, 300, window.data());

	// A back buffer smaller than the window is stretched over all of it.
	const float blackColor[4] = {0.0f, 0.0f, 0.0f, 1.0f};
	ASSERT_TRUE(mySwapChain.ResizeBuffers(200, 150, Dds::Format::UNKNOWN));
	DrawFrame(blackColor);
	ASSERT_TRUE(mySwapChain.Present(0));
	const Pixel quad = Stored(ourQuadColor, Dds::Format::R8G8B8A8_UNORM_SRGB);
	const Pixel black = {0, 0, 0, 255};
	window = ReadWindow(400, 300, [&](const std::vector<uint8_t>& someShown) {
		return PixelAt(someShown, 400, 399, 0) == quad && PixelAt(someShown, 400, 0, 299) == black;
	});
	EXPECT_EQ(PixelAt(window, 400, 399, 0), quad);
	EXPECT_EQ(PixelAt(window, 400, 399, 140), quad);
	EXPECT_EQ(PixelAt(window, 400, 399, 160), black);
	EXPECT_EQ(PixelAt(window, 400, 0, 299), black);
	Gpu::SavePng("/tmp/lumora-swapchain-stretched.png", 400, 300, window.data());
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
	    {display.c_str(), DefaultRootWindow(myDisplay) + 0x123456, "does not exist on X display"},
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
