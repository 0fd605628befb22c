#pragma once
// Device: the GL context that every GPU object of the editor lives in.
//
//   Gpu::Device device;
//   if (!device.Init(160, 90)) { ... reported: no OpenGL 4.5 core context ... }
//   device.ReleaseCurrent();      // the UI thread lets go when it clears the busy flag
//   ...                           // on the render thread, holding the busy flag:
//   device.MakeCurrent();
//   Gpu::Texture target; target.Init(device.GetContext(), desc);
//   ...
//   target.Destroy();
//   device.Destroy();             // with the context current: GPU objects first
//
// Init(width, height) is the headless device: EGL surfaceless on Mesa, or a
// pbuffer of that size where the surfaceless platform is missing. The context is
// OpenGL 4.5 core (with the debug flag in debug builds) and is left current on
// the calling thread. A GL context is current on one thread at a time: whichever
// thread holds the editor's busy flag calls MakeCurrent before touching the GPU
// and ReleaseCurrent when it clears the flag.

#include <epoxy/egl.h>
#include <string>

#include "platform/gpu/Context.h"

namespace Gpu
{
class Device
{
public:
	Device() = default;
	~Device() = default;
	Device(const Device&) = delete;
	Device& operator=(const Device&) = delete;

	bool Init(int aWidth, int aHeight);
	void Destroy();

	bool MakeCurrent();
	void ReleaseCurrent();

	bool IsInitialized() const { return myContextHandle != EGL_NO_CONTEXT; }
	Context& GetContext() { return myContext; }
	int GetWidth() const { return myWidth; }
	int GetHeight() const { return myHeight; }
	// GL_RENDERER and GL_VERSION as the driver reports them ("llvmpipe (LLVM 15.0.6, 256 bits)").
	const std::string& GetRendererName() const { return myRendererName; }
	const std::string& GetVersionName() const { return myVersionName; }
	// True when the display is EGL's surfaceless platform rather than the pbuffer fallback.
	bool IsSurfaceless() const { return mySurfacelessFlag; }

private:
	bool CreateContext(bool aSurfacelessFlag);
	void ReleaseDisplay();

	EGLDisplay myDisplay = EGL_NO_DISPLAY;
	EGLContext myContextHandle = EGL_NO_CONTEXT;
	EGLSurface mySurface = EGL_NO_SURFACE;
	Context myContext;
	int myWidth = 0;
	int myHeight = 0;
	bool mySurfacelessFlag = false;
	std::string myRendererName;
	std::string myVersionName;
};
} // namespace Gpu
