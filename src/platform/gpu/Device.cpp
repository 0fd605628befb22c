#include "platform/gpu/Device.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <dlfcn.h>
#include <link.h>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include "platform/gpu/Report.h"

namespace Gpu
{
namespace
{
// EGL displays are per process, and eglTerminate ends a display for everyone who
// uses it; devices count their uses so that the last one terminates it.
std::mutex ourDisplayMutex;
std::vector<std::pair<EGLDisplay, int>> ourDisplayUsers;

void AddDisplayUser(EGLDisplay aDisplay)
{
	std::lock_guard lock(ourDisplayMutex);
	for (auto& [display, count] : ourDisplayUsers)
	{
		if (display == aDisplay)
		{
			++count;
			return;
		}
	}
	ourDisplayUsers.emplace_back(aDisplay, 1);
}

bool RemoveDisplayUser(EGLDisplay aDisplay)
{
	std::lock_guard lock(ourDisplayMutex);
	for (auto entry = ourDisplayUsers.begin(); entry != ourDisplayUsers.end(); ++entry)
	{
		if (entry->first == aDisplay && --entry->second == 0)
		{
			ourDisplayUsers.erase(entry);
			return true;
		}
	}
	return false;
}

bool HasExtension(const char* someExtensions, const char* aName)
{
	if (someExtensions == nullptr)
	{
		return false;
	}
	const size_t length = std::strlen(aName);
	for (const char* found = std::strstr(someExtensions, aName); found; found = std::strstr(found + 1, aName))
	{
		const bool startFlag = found == someExtensions || found[-1] == ' ';
		const bool endFlag = found[length] == '\0' || found[length] == ' ';
		if (startFlag && endFlag)
		{
			return true;
		}
	}
	return false;
}

// Mesa unloads its driver when the last EGL display goes, and loads it again for
// the next device (tens of milliseconds each time); worse, the driver's
// process-wide allocations, held by its globals, then look leaked to
// LeakSanitizer because the globals are unmapped. The first device keeps the
// loaded GL libraries mapped for the life of the process.
void KeepDriverLoaded()
{
	static std::once_flag ourOnce;
	std::call_once(ourOnce, [] {
		dl_iterate_phdr(
		    [](dl_phdr_info* anInfo, size_t, void*) -> int {
			    const std::string name = anInfo->dlpi_name != nullptr ? anInfo->dlpi_name : "";
			    for (const char* library : {"_dri.so", "libgallium", "libEGL_mesa", "libglapi", "libGLX_mesa",
			                                "libEGL_nvidia", "libnvidia-"})
			    {
				    if (name.find(library) != std::string::npos)
				    {
					    dlopen(name.c_str(), RTLD_LAZY | RTLD_NOLOAD | RTLD_NODELETE);
				    }
			    }
			    return 0;
		    },
		    nullptr);
	});
}

#ifndef NDEBUG
void GLAPIENTRY ForwardDebugMessage(GLenum, GLenum aType, GLuint anId, GLenum aSeverity, GLsizei,
                                    const GLchar* aMessage, const void*)
{
	// Errors are caught by the glGetError checks with a function name; the
	// callback adds the driver's explanation and what it thinks is undefined.
	if (aSeverity == GL_DEBUG_SEVERITY_HIGH || aType == GL_DEBUG_TYPE_UNDEFINED_BEHAVIOR)
	{
		ReportError(__LINE__, "Gpu::Device (GL debug output)", "[%u] %s", anId, aMessage);
	}
}
#endif

EGLConfig ChooseConfig(EGLDisplay aDisplay, EGLint aSurfaceType)
{
	const EGLint attributes[] = {EGL_SURFACE_TYPE,
	                             aSurfaceType,
	                             EGL_RENDERABLE_TYPE,
	                             EGL_OPENGL_BIT,
	                             EGL_RED_SIZE,
	                             8,
	                             EGL_GREEN_SIZE,
	                             8,
	                             EGL_BLUE_SIZE,
	                             8,
	                             EGL_ALPHA_SIZE,
	                             8,
	                             EGL_NONE};
	EGLConfig config = nullptr;
	EGLint configCount = 0;
	if (!eglChooseConfig(aDisplay, attributes, &config, 1, &configCount) || configCount < 1)
	{
		return nullptr;
	}
	return config;
}

// A window surface needs a config of the window's own visual: on a 24-bit window
// that is one without alpha (the back buffer is a texture, so nothing is lost).
EGLConfig ChooseWindowConfig(EGLDisplay aDisplay, unsigned long aVisualId)
{
	const EGLint attributes[] = {EGL_SURFACE_TYPE,
	                             EGL_WINDOW_BIT,
	                             EGL_RENDERABLE_TYPE,
	                             EGL_OPENGL_BIT,
	                             EGL_RED_SIZE,
	                             8,
	                             EGL_GREEN_SIZE,
	                             8,
	                             EGL_BLUE_SIZE,
	                             8,
	                             EGL_NONE};
	EGLint configCount = 0;
	if (!eglChooseConfig(aDisplay, attributes, nullptr, 0, &configCount) || configCount < 1)
	{
		return nullptr;
	}
	std::vector<EGLConfig> configs(static_cast<size_t>(configCount));
	if (!eglChooseConfig(aDisplay, attributes, configs.data(), configCount, &configCount))
	{
		return nullptr;
	}
	for (EGLint index = 0; index < configCount; ++index)
	{
		EGLint visualId = 0;
		if (eglGetConfigAttrib(aDisplay, configs[static_cast<size_t>(index)], EGL_NATIVE_VISUAL_ID,
		                       &visualId) &&
		    static_cast<unsigned long>(visualId) == aVisualId)
		{
			return configs[static_cast<size_t>(index)];
		}
	}
	return nullptr;
}
} // namespace

bool Device::Init(int aWidth, int aHeight, WindowHandle aWindow)
{
	const char* function = "Gpu::Device::Init";
	if (IsInitialized())
	{
		ReportError(__LINE__, function, "The device is already initialized");
		return false;
	}
	myFailure = DeviceFailure::NoDevice;
	if (aWidth < 1 || aHeight < 1)
	{
		ReportError(__LINE__, function, "Bad back-buffer size %dx%d", aWidth, aHeight);
		return false;
	}
	myWidth = aWidth;
	myHeight = aHeight;
	myEglError = EGL_SUCCESS;
	myFailureText.clear();
	myRendererName.clear();
	myVersionName.clear();

	if (aWindow != 0 ? InitWindow(aWindow) : InitHeadless())
	{
		myFailure = DeviceFailure::None;
		KeepDriverLoaded();
		return true;
	}
	ReleaseDisplay();
	myWindow.Destroy();
	if (myFailure == DeviceFailure::VersionTooLow)
	{
		myFailureText = Describe("OpenGL 4.5 core profile is needed; %s offers only OpenGL %s",
		                         myRendererName.c_str(), myVersionName.c_str());
	}
	else if (aWindow == 0)
	{
		const char* clientExtensions = eglQueryString(EGL_NO_DISPLAY, EGL_EXTENSIONS);
		myFailureText =
		    Describe("No OpenGL 4.5 core context could be made (EGL error 0x%04x; surfaceless platform %s)",
		             myEglError,
		             HasExtension(clientExtensions, "EGL_MESA_platform_surfaceless") ? "present" : "missing");
	}
	return false;
}

// A GPU's own EGL device, where the EGL vendor libraries list one. With the vendor-neutral
// libEGL, Mesa's surfaceless platform belongs to Mesa alone: on a machine whose GPU Mesa has
// no driver for (NVIDIA's), it answers with its software rasterizer. A device display reaches
// the GPU's own driver, as a Direct3D device is made on the first hardware adapter. Mesa's
// software device is left to the surfaceless path below, and LIBGL_ALWAYS_SOFTWARE (Mesa's
// own switch) skips this path, for bakes that must match a software machine byte for byte.
bool Device::InitHardwareDevice(const char* someClientExtensions)
{
	const char* software = std::getenv("LIBGL_ALWAYS_SOFTWARE");
	if ((software != nullptr && *software != '\0' && std::strcmp(software, "0") != 0) ||
	    !HasExtension(someClientExtensions, "EGL_EXT_platform_device") ||
	    !HasExtension(someClientExtensions, "EGL_EXT_device_enumeration") ||
	    !HasExtension(someClientExtensions, "EGL_EXT_device_query"))
	{
		return false;
	}
	EGLint count = 0;
	if (!eglQueryDevicesEXT(0, nullptr, &count) || count < 1)
	{
		return false;
	}
	std::vector<EGLDeviceEXT> devices(static_cast<size_t>(count));
	if (!eglQueryDevicesEXT(count, devices.data(), &count))
	{
		return false;
	}
	devices.resize(static_cast<size_t>(std::max(count, 0)));
	for (EGLDeviceEXT device : devices)
	{
		if (HasExtension(eglQueryDeviceStringEXT(device, EGL_EXTENSIONS), "EGL_MESA_device_software"))
		{
			continue;
		}
		if (OpenDisplay(eglGetPlatformDisplayEXT(EGL_PLATFORM_DEVICE_EXT, device, nullptr)) &&
		    HasExtension(eglQueryString(myDisplay, EGL_EXTENSIONS), "EGL_KHR_surfaceless_context") &&
		    CreateContext(SurfaceKind::Surfaceless, ChooseConfig(myDisplay, 0)))
		{
			myHardwareDeviceFlag = true;
			return true;
		}
		// A device without OpenGL 4.5 core is passed over for the next one, or for the
		// software rasterizer, rather than failing the whole start.
		ReleaseDisplay();
		myFailure = DeviceFailure::NoDevice;
		myRendererName.clear();
		myVersionName.clear();
	}
	return false;
}

bool Device::InitHeadless()
{
	const char* clientExtensions = eglQueryString(EGL_NO_DISPLAY, EGL_EXTENSIONS);
	if (InitHardwareDevice(clientExtensions))
	{
		return true;
	}
	if (HasExtension(clientExtensions, "EGL_MESA_platform_surfaceless") &&
	    HasExtension(clientExtensions, "EGL_EXT_platform_base"))
	{
		if (OpenDisplay(
		        eglGetPlatformDisplayEXT(EGL_PLATFORM_SURFACELESS_MESA, EGL_DEFAULT_DISPLAY, nullptr)) &&
		    HasExtension(eglQueryString(myDisplay, EGL_EXTENSIONS), "EGL_KHR_surfaceless_context") &&
		    CreateContext(SurfaceKind::Surfaceless, ChooseConfig(myDisplay, 0)))
		{
			return true;
		}
		ReleaseDisplay();
		if (myFailure == DeviceFailure::VersionTooLow)
		{
			return false; // the same driver answers the pbuffer path
		}
	}
	return OpenDisplay(eglGetDisplay(EGL_DEFAULT_DISPLAY)) &&
	       CreateContext(SurfaceKind::Pbuffer, ChooseConfig(myDisplay, EGL_PBUFFER_BIT));
}

bool Device::InitWindow(WindowHandle aWindow)
{
	if (!myWindow.Init(aWindow, myFailureText))
	{
		return false;
	}
	const char* clientExtensions = eglQueryString(EGL_NO_DISPLAY, EGL_EXTENSIONS);
	const bool x11Flag = HasExtension(clientExtensions, "EGL_EXT_platform_base") &&
	                     (HasExtension(clientExtensions, "EGL_KHR_platform_x11") ||
	                      HasExtension(clientExtensions, "EGL_EXT_platform_x11"));
	if (!x11Flag ||
	    !OpenDisplay(eglGetPlatformDisplayEXT(EGL_PLATFORM_X11_KHR, myWindow.GetDisplay(), nullptr)))
	{
		myFailureText =
		    Describe("EGL cannot use X display '%s' (X11 platform %s, EGL error 0x%04x)",
		             myWindow.GetDisplayName().c_str(), x11Flag ? "present" : "missing", eglGetError());
		return false;
	}
	const EGLConfig config = ChooseWindowConfig(myDisplay, myWindow.GetVisualId());
	if (config == nullptr)
	{
		myFailureText = Describe("No EGL config draws into window 0x%lx (X visual 0x%lx)", aWindow,
		                         myWindow.GetVisualId());
		return false;
	}
	myWindowConfig = config;
	if (!myWindow.GetSize(mySurfaceWidth, mySurfaceHeight) || !CreateContext(SurfaceKind::Window, config))
	{
		if (myFailure != DeviceFailure::VersionTooLow)
		{
			myFailureText =
			    Describe("No OpenGL 4.5 core context for window 0x%lx on X display '%s' (EGL error 0x%04x)",
			             aWindow, myWindow.GetDisplayName().c_str(), myEglError);
		}
		return false;
	}
	myWindow.Show();
	return true;
}

bool Device::OpenDisplay(EGLDisplay aDisplay)
{
	if (aDisplay == EGL_NO_DISPLAY || !eglInitialize(aDisplay, nullptr, nullptr))
	{
		myEglError = eglGetError();
		return false;
	}
	myDisplay = aDisplay;
	AddDisplayUser(myDisplay);
	return true;
}

bool Device::CreateContext(SurfaceKind aKind, EGLConfig aConfig)
{
	if (aConfig == nullptr || !eglBindAPI(EGL_OPENGL_API))
	{
		myEglError = eglGetError();
		return false;
	}
	if (aKind == SurfaceKind::Pbuffer)
	{
		const EGLint surfaceAttributes[] = {EGL_WIDTH, myWidth, EGL_HEIGHT, myHeight, EGL_NONE};
		mySurface = eglCreatePbufferSurface(myDisplay, aConfig, surfaceAttributes);
	}
	else if (aKind == SurfaceKind::Window)
	{
		mySurface = eglCreateWindowSurface(myDisplay, aConfig,
		                                   static_cast<EGLNativeWindowType>(myWindow.GetHandle()), nullptr);
	}
	if (aKind != SurfaceKind::Surfaceless && mySurface == EGL_NO_SURFACE)
	{
		myEglError = eglGetError();
		return false;
	}
#ifdef NDEBUG
	const EGLint debugFlag = EGL_FALSE;
#else
	const EGLint debugFlag = EGL_TRUE;
#endif
	const EGLint contextAttributes[] = {EGL_CONTEXT_MAJOR_VERSION,
	                                    4,
	                                    EGL_CONTEXT_MINOR_VERSION,
	                                    5,
	                                    EGL_CONTEXT_OPENGL_PROFILE_MASK,
	                                    EGL_CONTEXT_OPENGL_CORE_PROFILE_BIT,
	                                    EGL_CONTEXT_OPENGL_DEBUG,
	                                    debugFlag,
	                                    EGL_NONE};
	myContextHandle = eglCreateContext(myDisplay, aConfig, EGL_NO_CONTEXT, contextAttributes);
	if (myContextHandle == EGL_NO_CONTEXT)
	{
		myEglError = eglGetError();
		ProbeLowerVersion(aConfig);
		return false;
	}
	mySurfacelessFlag = aKind == SurfaceKind::Surfaceless;
	// Not MakeCurrent: a failure here is one of several attempts, reported by Init.
	if (!eglMakeCurrent(myDisplay, mySurface, mySurface, myContextHandle))
	{
		myEglError = eglGetError();
		return false;
	}
	return SetUpContext();
}

void Device::ProbeLowerVersion(EGLConfig aConfig)
{
	// No attributes: the driver's best context of any profile and version.
	const EGLContext probe = eglCreateContext(myDisplay, aConfig, EGL_NO_CONTEXT, nullptr);
	if (probe == EGL_NO_CONTEXT)
	{
		return;
	}
	if (eglMakeCurrent(myDisplay, mySurface, mySurface, probe))
	{
		// GL_MAJOR_VERSION exists from 3.0 on; older contexts leave the zeros.
		GLint major = 0;
		GLint minor = 0;
		glGetIntegerv(GL_MAJOR_VERSION, &major);
		glGetIntegerv(GL_MINOR_VERSION, &minor);
		const GLubyte* version = glGetString(GL_VERSION);
		const GLubyte* renderer = glGetString(GL_RENDERER);
		if (version != nullptr && major * 10 + minor < 45)
		{
			myVersionName = reinterpret_cast<const char*>(version);
			myRendererName = renderer != nullptr ? reinterpret_cast<const char*>(renderer) : "";
			myFailure = DeviceFailure::VersionTooLow;
		}
		eglMakeCurrent(myDisplay, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
	}
	eglDestroyContext(myDisplay, probe);
}

bool Device::SetUpContext()
{
	// A driver may hand out a compatible higher version, never a lower one that passes.
	GLint major = 0;
	GLint minor = 0;
	GLint profile = 0;
	glGetIntegerv(GL_MAJOR_VERSION, &major);
	glGetIntegerv(GL_MINOR_VERSION, &minor);
	glGetIntegerv(GL_CONTEXT_PROFILE_MASK, &profile);
	myRendererName = reinterpret_cast<const char*>(glGetString(GL_RENDERER));
	myVersionName = reinterpret_cast<const char*>(glGetString(GL_VERSION));
	if (major * 10 + minor < 45 || (profile & GL_CONTEXT_CORE_PROFILE_BIT) == 0)
	{
		myFailure = DeviceFailure::VersionTooLow;
		return false;
	}
#ifndef NDEBUG
	glEnable(GL_DEBUG_OUTPUT);
	glEnable(GL_DEBUG_OUTPUT_SYNCHRONOUS);
	glDebugMessageCallback(ForwardDebugMessage, nullptr);
#endif
	myContext.Init();
	return true;
}

void Device::ReleaseDisplay()
{
	if (myDisplay == EGL_NO_DISPLAY)
	{
		return;
	}
	eglMakeCurrent(myDisplay, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
	if (mySurface != EGL_NO_SURFACE)
	{
		eglDestroySurface(myDisplay, mySurface);
		mySurface = EGL_NO_SURFACE;
	}
	if (myContextHandle != EGL_NO_CONTEXT)
	{
		eglDestroyContext(myDisplay, myContextHandle);
		myContextHandle = EGL_NO_CONTEXT;
	}
	if (RemoveDisplayUser(myDisplay))
	{
		eglTerminate(myDisplay);
	}
	myDisplay = EGL_NO_DISPLAY;
	mySurfacelessFlag = false;
	myHardwareDeviceFlag = false;
}

void Device::Destroy()
{
	if (!IsInitialized())
	{
		return;
	}
	MakeCurrent();
	myContext.Destroy();
	ReleaseDisplay();
	// The X connection goes after the EGL display that draws through it.
	myWindow.Destroy();
	mySwapInterval = -1;
	// EGL keeps per-thread state (the bound API, the last error) until this.
	eglReleaseThread();
	myRendererName.clear();
	myVersionName.clear();
}

bool Device::MakeCurrent()
{
	if (eglGetCurrentContext() == myContextHandle)
	{
		return true;
	}
	if (!eglMakeCurrent(myDisplay, mySurface, mySurface, myContextHandle))
	{
		ReportError(__LINE__, "Gpu::Device::MakeCurrent", "eglMakeCurrent failed (EGL error 0x%04x)",
		            eglGetError());
		return false;
	}
	return true;
}

void Device::ReleaseCurrent()
{
	if (myDisplay != EGL_NO_DISPLAY)
	{
		eglMakeCurrent(myDisplay, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
	}
}
} // namespace Gpu

namespace Gpu
{
bool Device::GetWindowSize(int& aWidth, int& aHeight) const
{
	if (!HasWindow())
	{
		ReportError(__LINE__, "Gpu::Device::GetWindowSize", "The device has no window");
		return false;
	}
	return myWindow.GetSize(aWidth, aHeight);
}

bool Device::UpdateWindowSurface(int aWidth, int aHeight)
{
	const char* function = "Gpu::Device::UpdateWindowSurface";
	if (!IsInitialized() || !HasWindow())
	{
		ReportError(__LINE__, function, "The device has no window");
		return false;
	}
	if (aWidth == mySurfaceWidth && aHeight == mySurfaceHeight)
	{
		return true;
	}
	// Mesa's software path sizes a window's framebuffer when the surface is made and
	// after each swap, so the first frame after a resize would be cut to the old
	// size. A new surface takes the window's size at once.
	eglMakeCurrent(myDisplay, EGL_NO_SURFACE, EGL_NO_SURFACE, EGL_NO_CONTEXT);
	eglDestroySurface(myDisplay, mySurface);
	mySurface = eglCreateWindowSurface(myDisplay, myWindowConfig,
	                                   static_cast<EGLNativeWindowType>(myWindow.GetHandle()), nullptr);
	mySwapInterval = -1; // the interval belongs to the surface
	if (mySurface == EGL_NO_SURFACE)
	{
		ReportError(__LINE__, function, "Cannot make a surface for window 0x%lx again (EGL error 0x%04x)",
		            myWindow.GetHandle(), eglGetError());
		eglMakeCurrent(myDisplay, EGL_NO_SURFACE, EGL_NO_SURFACE, myContextHandle);
		return false;
	}
	mySurfaceWidth = aWidth;
	mySurfaceHeight = aHeight;
	if (!eglMakeCurrent(myDisplay, mySurface, mySurface, myContextHandle))
	{
		ReportError(__LINE__, function, "eglMakeCurrent failed (EGL error 0x%04x)", eglGetError());
		return false;
	}
	return true;
}

void Device::GetMaxFrameSize(int& aWidth, int& aHeight) const
{
	GLint textureSize = 0;
	GLint viewport[2] = {0, 0};
	GLint framebufferWidth = 0;
	GLint framebufferHeight = 0;
	glGetIntegerv(GL_MAX_TEXTURE_SIZE, &textureSize);
	glGetIntegerv(GL_MAX_VIEWPORT_DIMS, viewport);
	glGetIntegerv(GL_MAX_FRAMEBUFFER_WIDTH, &framebufferWidth);
	glGetIntegerv(GL_MAX_FRAMEBUFFER_HEIGHT, &framebufferHeight);
	aWidth = std::min({textureSize, viewport[0], framebufferWidth});
	aHeight = std::min({textureSize, viewport[1], framebufferHeight});
}

bool Device::SwapBuffers(int aSyncInterval)
{
	const char* function = "Gpu::Device::SwapBuffers";
	if (!IsInitialized() || !HasWindow())
	{
		ReportError(__LINE__, function, "The device has no window to show");
		return false;
	}
	if (aSyncInterval != mySwapInterval)
	{
		// Applies to the surface of the current context; the driver clamps it to its range.
		if (!eglSwapInterval(myDisplay, aSyncInterval))
		{
			ReportError(__LINE__, function, "eglSwapInterval(%d) failed (EGL error 0x%04x)", aSyncInterval,
			            eglGetError());
			return false;
		}
		mySwapInterval = aSyncInterval;
	}
	if (!eglSwapBuffers(myDisplay, mySurface))
	{
		ReportError(__LINE__, function, "eglSwapBuffers failed on window 0x%lx (EGL error 0x%04x)",
		            myWindow.GetHandle(), eglGetError());
		return false;
	}
	// Mesa's software path puts the image through this connection and may leave it queued.
	myWindow.Flush();
	return true;
}
} // namespace Gpu
