#pragma once
// Device: the GL context that every GPU object of the editor lives in.
//
//   Gpu::Device device;
//   if (!device.Init(160, 90, window))        // window 0: headless
//   {
//       if (device.GetFailure() == Gpu::DeviceFailure::VersionTooLow) { ... GetVersionName() says what there
//       is ... }
//       ...
//   }
//   device.ReleaseCurrent();      // the UI thread lets go when it clears the busy flag
//   ...                           // on the render thread, holding the busy flag:
//   device.MakeCurrent();
//   Gpu::Texture target; target.Init(device.GetContext(), desc);
//   ...
//   target.Destroy();
//   device.Destroy();             // with the context current: GPU objects first
//
// Init(width, height) is the headless device: a GPU's own EGL device where the driver lists
// one (not Mesa's software device; LIBGL_ALWAYS_SOFTWARE set skips it), else EGL surfaceless
// on Mesa, or a pbuffer of that size where the surfaceless platform is missing. Init(width,
// height, window) opens the X display named by $DISPLAY, makes an EGL window
// surface on that X11 window and maps the window; a Gpu::SwapChain then presents
// into it. Either way the context is OpenGL 4.5 core (with the debug flag in
// debug builds), runs under the Direct3D conventions of Gpu::Context, and is left
// current on the calling thread. A GL context is current on one thread at a time:
// whichever thread holds the editor's busy flag calls MakeCurrent before touching
// the GPU and ReleaseCurrent when it clears the flag.

#include <epoxy/egl.h>
#include <string>

#include "platform/gpu/Context.h"
#include "platform/gpu/WindowX11.h"

namespace Gpu
{
// Why the last Init failed, for the engine's message to the user.
enum class DeviceFailure
{
	None,
	NoDevice,      // no display, no window, or no GL context at all
	VersionTooLow, // a GL context exists, but not OpenGL 4.5 core
};

class Device
{
public:
	Device() = default;
	~Device() = default;
	Device(const Device&) = delete;
	Device& operator=(const Device&) = delete;

	bool Init(int aWidth, int aHeight, WindowHandle aWindow = 0);
	void Destroy();

	bool MakeCurrent();
	void ReleaseCurrent();

	bool IsInitialized() const { return myContextHandle != EGL_NO_CONTEXT; }
	// Why Init failed (no display, no window, no GL 4.5 core context, an older GL), in
	// words for a log or a terminal. Init does not report these itself: the caller
	// says what a missing device means to it.
	DeviceFailure GetFailure() const { return myFailure; }
	const std::string& GetFailureText() const { return myFailureText; }
	Context& GetContext() { return myContext; }
	int GetWidth() const { return myWidth; }
	int GetHeight() const { return myHeight; }
	// GL_RENDERER and GL_VERSION as the driver reports them ("llvmpipe (LLVM 15.0.6, 256 bits)");
	// after a VersionTooLow failure, those of the best context the driver could make.
	const std::string& GetRendererName() const { return myRendererName; }
	const std::string& GetVersionName() const { return myVersionName; }
	// True when the context has no surface (a GPU's EGL device or Mesa's surfaceless
	// platform) rather than the pbuffer fallback or a window.
	bool IsSurfaceless() const { return mySurfacelessFlag; }
	// True when the headless context is on a GPU's own EGL device.
	bool IsHardwareDevice() const { return myHardwareDeviceFlag; }

	bool HasWindow() const { return myWindow.IsInitialized(); }
	WindowHandle GetWindow() const { return myWindow.GetHandle(); }
	// The window's size now; false (reported) without a window or when it is gone.
	bool GetWindowSize(int& aWidth, int& aHeight) const;
	// Gives the window's framebuffer the window's new size, with the context current on
	// this thread (the EGL surface is made anew). Nothing happens when the size is unchanged.
	bool UpdateWindowSurface(int aWidth, int aHeight);
	// The largest frame the context can draw: the smallest of the texture, viewport and
	// framebuffer limits, per side. Needs the context current.
	void GetMaxFrameSize(int& aWidth, int& aHeight) const;
	// Shows what was drawn into the window's default framebuffer, after aSyncInterval
	// vertical blanks (0: at once; the driver clamps to what it supports).
	bool SwapBuffers(int aSyncInterval);

private:
	enum class SurfaceKind
	{
		Surfaceless,
		Pbuffer,
		Window,
	};

	bool InitHeadless();
	bool InitHardwareDevice(const char* someClientExtensions);
	bool InitWindow(WindowHandle aWindow);
	bool OpenDisplay(EGLDisplay aDisplay);
	bool CreateContext(SurfaceKind aKind, EGLConfig aConfig);
	// After a failed 4.5 core request: reads the version of a plain context, if one can be made.
	void ProbeLowerVersion(EGLConfig aConfig);
	// Everything a new context needs, the same for windows and headless devices.
	bool SetUpContext();
	void ReleaseDisplay();

	EGLDisplay myDisplay = EGL_NO_DISPLAY;
	EGLContext myContextHandle = EGL_NO_CONTEXT;
	EGLSurface mySurface = EGL_NO_SURFACE;
	EGLConfig myWindowConfig = nullptr;
	int mySurfaceWidth = 0; // the window's size when its surface was made
	int mySurfaceHeight = 0;
	WindowX11 myWindow;
	Context myContext;
	DeviceFailure myFailure = DeviceFailure::None;
	std::string myFailureText;
	int myWidth = 0;
	int myHeight = 0;
	int mySwapInterval = -1;         // not set yet
	EGLint myEglError = EGL_SUCCESS; // of the last failed attempt, for the report
	bool mySurfacelessFlag = false;
	bool myHardwareDeviceFlag = false;
	std::string myRendererName;
	std::string myVersionName;
};
} // namespace Gpu
