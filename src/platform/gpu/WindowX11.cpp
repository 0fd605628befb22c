#include "platform/gpu/WindowX11.h"

#include <X11/Xlib.h>
#include <mutex>

#include "platform/gpu/Report.h"

namespace Gpu
{
namespace
{
// Xlib has one error handler per process; the trap swaps it in for the requests
// that may fail and puts the previous one back, so a front end that installs
// its own keeps it.
std::mutex ourTrapMutex;
int ourTrappedError = Success;

int RecordError(Display*, XErrorEvent* anEvent)
{
	if (ourTrappedError == Success)
	{
		ourTrappedError = anEvent->error_code;
	}
	return 0;
}

class ErrorTrap
{
public:
	explicit ErrorTrap(Display* aDisplay) : myDisplay(aDisplay), myLock(ourTrapMutex)
	{
		XSync(myDisplay, False); // errors of earlier requests are not ours to catch
		ourTrappedError = Success;
		myPreviousHandler = XSetErrorHandler(RecordError);
	}

	~ErrorTrap() { XSetErrorHandler(myPreviousHandler); }

	// Waits for the server to answer everything sent so far; the first error, or Success.
	int Finish()
	{
		XSync(myDisplay, False);
		return ourTrappedError;
	}

private:
	Display* myDisplay;
	std::lock_guard<std::mutex> myLock;
	XErrorHandler myPreviousHandler = nullptr;
};

std::string ErrorText(Display* aDisplay, int aCode)
{
	char text[256] = {};
	XGetErrorText(aDisplay, aCode, text, sizeof(text));
	return text;
}
} // namespace

bool WindowX11::Init(WindowHandle aWindow, std::string& aFailureOut)
{
	const char* displayName = XDisplayName(nullptr);
	myDisplayName = displayName != nullptr ? displayName : "";
	if (myDisplayName.empty())
	{
		aFailureOut = Describe("No X display for window 0x%lx: $DISPLAY is not set", aWindow);
		return false;
	}
	myDisplay = XOpenDisplay(nullptr);
	if (myDisplay == nullptr)
	{
		aFailureOut =
		    Describe("Cannot open the X display '%s' for window 0x%lx", myDisplayName.c_str(), aWindow);
		return false;
	}
	XWindowAttributes attributes{};
	int error = Success;
	{
		ErrorTrap trap(myDisplay);
		const Status status = XGetWindowAttributes(myDisplay, aWindow, &attributes);
		error = trap.Finish();
		error = error == Success && !status ? BadWindow : error;
	}
	if (error != Success || attributes.visual == nullptr)
	{
		aFailureOut = Describe("Window 0x%lx does not exist on X display '%s' (%s)", aWindow,
		                       myDisplayName.c_str(), ErrorText(myDisplay, error).c_str());
		Destroy();
		return false;
	}
	myWindow = aWindow;
	myVisualId = XVisualIDFromVisual(attributes.visual);
	return true;
}

void WindowX11::Destroy()
{
	if (myDisplay != nullptr)
	{
		XCloseDisplay(myDisplay);
		myDisplay = nullptr;
	}
	myWindow = 0;
	myVisualId = 0;
}

void WindowX11::Show()
{
	if (myDisplay != nullptr)
	{
		XMapWindow(myDisplay, myWindow);
		XFlush(myDisplay);
	}
}

void WindowX11::Flush()
{
	if (myDisplay != nullptr)
	{
		XFlush(myDisplay);
	}
}

bool WindowX11::GetSize(int& aWidth, int& aHeight) const
{
	if (myDisplay == nullptr)
	{
		ReportError(__LINE__, "Gpu::WindowX11::GetSize", "No window");
		return false;
	}
	XWindowAttributes attributes{};
	int error = Success;
	{
		ErrorTrap trap(myDisplay);
		const Status status = XGetWindowAttributes(myDisplay, myWindow, &attributes);
		error = trap.Finish();
		error = error == Success && !status ? BadWindow : error;
	}
	if (error != Success)
	{
		ReportError(__LINE__, "Gpu::WindowX11::GetSize", "Window 0x%lx is gone from X display '%s' (%s)",
		            myWindow, myDisplayName.c_str(), ErrorText(myDisplay, error).c_str());
		return false;
	}
	aWidth = attributes.width;
	aHeight = attributes.height;
	return true;
}
} // namespace Gpu
