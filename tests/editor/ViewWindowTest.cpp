// The facade in an X11 window, as the editor's native child window has it, under an X server
// the suite starts (or finds): the window shows each frame as drawn, and after the host
// resizes the window and then the view, it shows frames of the new size pixel for pixel, with
// a light where ProjectToView puts it.
#include <chrono>
#include <string>
#include <thread>
#include <vector>

#include "editor/FacadeFixture.h"

#include "XServer.h"

namespace
{
class ViewWindowTest : public FacadeTest
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

	void SetUp() override
	{
		FacadeTest::SetUp();
		if (IsSkipped() || HasFatalFailure())
		{
			return;
		}
		if (!ourServerFlag)
		{
			// A machine without Xvfb cannot help it; one whose Xvfb does not start must not pass unseen.
			if (TestSupport::IsCi() && XServer::IsXvfbInstalled())
			{
				FAIL() << "under CI: " << ourServer->GetReason();
			}
			GTEST_SKIP() << ourServer->GetReason();
		}
		myDisplay = XOpenDisplay(nullptr);
		ASSERT_NE(myDisplay, nullptr);
		myWindow = XCreateSimpleWindow(myDisplay, DefaultRootWindow(myDisplay), 0, 0, 320, 240, 0, 0, 0);
		XSync(myDisplay, False);
	}

	void TearDown() override
	{
		// The facade's surface goes before its window.
		FacadeTest::TearDown();
		if (myDisplay != nullptr)
		{
			XDestroyWindow(myDisplay, myWindow);
			XCloseDisplay(myDisplay);
		}
	}

	void Frames(int aCount)
	{
		for (int frame = 0; frame < aCount; ++frame)
		{
			Facade().Update(16.0f);
			Facade().Render();
		}
	}

	// The window's pixels once they are aFrame's (another connection draws them), or after a
	// few seconds what it shows then.
	std::vector<uint8_t> WindowShowing(const std::vector<uint8_t>& aFrame, int aWidth, int aHeight)
	{
		std::vector<uint8_t> pixels;
		for (int attempt = 0; attempt < 150; ++attempt)
		{
			pixels = ReadWindowPixels(myDisplay, myWindow, aWidth, aHeight);
			if (pixels == aFrame)
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
};
} // namespace

TEST_F(ViewWindowTest, TheWindowShowsEachFrameAtTheViewsSizeBeforeAndAfterAResize)
{
	Recreate(320, 240, myWindow);
	Facade().AddPointLight();
	ASSERT_TRUE(Facade().SetSelectedPosition(Vector3<float>(2.0f, 11.0f, 8.0f)));
	Frames(2);
	int width = 0;
	int height = 0;
	const std::vector<uint8_t> first = ReadFrame("window-before", width, height);
	ASSERT_EQ(std::pair(width, height), std::pair(320, 240));
	EXPECT_TRUE(WindowShowing(first, 320, 240) == first) << "the window does not show the frame";

	// The host resizes its window, then the view.
	XResizeWindow(myDisplay, myWindow, 400, 180);
	XSync(myDisplay, False);
	ASSERT_TRUE(Facade().Resize(400, 180)) << LogText();
	Frames(2);
	const std::vector<uint8_t> resized = ReadFrame("window-after", width, height);
	ASSERT_EQ(std::pair(width, height), std::pair(400, 180));
	EXPECT_TRUE(WindowShowing(resized, 400, 180) == resized) << "the window does not show the resized frame";
	// The selected light's green marker box is where the view projects the light.
	float x = 0.0f;
	float y = 0.0f;
	ASSERT_TRUE(Facade().ProjectToView(Vector3<float>(2.0f, 11.0f, 8.0f), x, y));
	const uint8_t* pixel = &resized[(static_cast<size_t>(y) * 400 + static_cast<size_t>(x)) * 4];
	EXPECT_TRUE(pixel[1] > 200 && pixel[0] < 60) << "no marker at " << x << ", " << y;
}
