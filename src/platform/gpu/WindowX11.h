#pragma once
// WindowX11: the X display connection and the window a device presents into.
//
//   Gpu::WindowX11 window;
//   if (!window.Init(handle)) { ... reported: no display, or no such window ... }
//   EGLDisplay display = eglGetPlatformDisplayEXT(EGL_PLATFORM_X11_KHR, window.GetDisplay(), nullptr);
//   ...                           // create the EGL window surface for window.GetHandle()
//   window.Show();                // XMapWindow + XFlush, as ShowWindow/UpdateWindow were
//   int width, height;
//   window.GetSize(width, height);
//   window.Destroy();             // after the EGL display is terminated
//
// The window belongs to the front end; this class opens its own connection to the
// display named by $DISPLAY and never destroys the window. Xlib's default error
// handler exits the process, so every request that can name a bad window runs
// under a handler that records the error instead. Xlib.h stays out of this header:
// its macros (None, Bool, Status) would collide with names above the platform layer.

#include <string>

struct _XDisplay;

namespace Gpu
{
// An X11 Window id; 0 means no window (a headless device).
using WindowHandle = unsigned long;

class WindowX11
{
public:
	WindowX11() = default;
	~WindowX11() = default;
	WindowX11(const WindowX11&) = delete;
	WindowX11& operator=(const WindowX11&) = delete;

	// Opens the display and checks that the window exists there; false with the
	// reason in aFailureOut otherwise (the caller decides whether that is an error).
	bool Init(WindowHandle aWindow, std::string& aFailureOut);
	void Destroy();

	// Maps the window and sends the request on its way.
	void Show();
	// Sends what is queued on the connection (a presented frame) to the server now.
	void Flush();
	// The window's size as the X server has it now; false (reported) when the window is gone.
	bool GetSize(int& aWidth, int& aHeight) const;

	bool IsInitialized() const { return myDisplay != nullptr; }
	_XDisplay* GetDisplay() const { return myDisplay; }
	WindowHandle GetHandle() const { return myWindow; }
	// The X visual the window was created with; the EGL config must match it.
	unsigned long GetVisualId() const { return myVisualId; }
	const std::string& GetDisplayName() const { return myDisplayName; }

private:
	_XDisplay* myDisplay = nullptr;
	WindowHandle myWindow = 0;
	unsigned long myVisualId = 0;
	std::string myDisplayName;
};
} // namespace Gpu
