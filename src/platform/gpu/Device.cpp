#include "platform/gpu/Device.h"

#include <cstring>
#include <mutex>
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
} // namespace

bool Device::Init(int aWidth, int aHeight)
{
	const char* function = "Gpu::Device::Init";
	if (IsInitialized())
	{
		ReportError(__LINE__, function, "The device is already initialized");
		return false;
	}
	if (aWidth < 1 || aHeight < 1)
	{
		ReportError(__LINE__, function, "Bad back-buffer size %dx%d", aWidth, aHeight);
		return false;
	}
	myWidth = aWidth;
	myHeight = aHeight;

	const char* clientExtensions = eglQueryString(EGL_NO_DISPLAY, EGL_EXTENSIONS);
	if (HasExtension(clientExtensions, "EGL_MESA_platform_surfaceless") &&
	    HasExtension(clientExtensions, "EGL_EXT_platform_base"))
	{
		myDisplay = eglGetPlatformDisplayEXT(EGL_PLATFORM_SURFACELESS_MESA, EGL_DEFAULT_DISPLAY, nullptr);
		if (myDisplay != EGL_NO_DISPLAY && eglInitialize(myDisplay, nullptr, nullptr) && CreateContext(true))
		{
			return true;
		}
		ReleaseDisplay();
	}
	myDisplay = eglGetDisplay(EGL_DEFAULT_DISPLAY);
	if (myDisplay != EGL_NO_DISPLAY && eglInitialize(myDisplay, nullptr, nullptr) && CreateContext(false))
	{
		return true;
	}
	ReleaseDisplay();
	ReportError(__LINE__, function,
	            "No OpenGL 4.5 core context could be made (EGL error 0x%04x; surfaceless platform %s)",
	            eglGetError(),
	            HasExtension(clientExtensions, "EGL_MESA_platform_surfaceless") ? "present" : "missing");
	return false;
}

bool Device::CreateContext(bool aSurfacelessFlag)
{
	AddDisplayUser(myDisplay);
	if (!eglBindAPI(EGL_OPENGL_API))
	{
		return false;
	}
	if (aSurfacelessFlag &&
	    !HasExtension(eglQueryString(myDisplay, EGL_EXTENSIONS), "EGL_KHR_surfaceless_context"))
	{
		return false;
	}
	const EGLint configAttributes[] = {EGL_SURFACE_TYPE,
	                                   aSurfacelessFlag ? 0 : EGL_PBUFFER_BIT,
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
	if (!eglChooseConfig(myDisplay, configAttributes, &config, 1, &configCount) || configCount < 1)
	{
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
	myContextHandle = eglCreateContext(myDisplay, config, EGL_NO_CONTEXT, contextAttributes);
	if (myContextHandle == EGL_NO_CONTEXT)
	{
		return false;
	}
	if (!aSurfacelessFlag)
	{
		const EGLint surfaceAttributes[] = {EGL_WIDTH, myWidth, EGL_HEIGHT, myHeight, EGL_NONE};
		mySurface = eglCreatePbufferSurface(myDisplay, config, surfaceAttributes);
		if (mySurface == EGL_NO_SURFACE)
		{
			return false;
		}
	}
	mySurfacelessFlag = aSurfacelessFlag;
	if (!MakeCurrent())
	{
		return false;
	}

	// A driver may hand out a compatible higher version, never a lower one that passes.
	GLint major = 0;
	GLint minor = 0;
	GLint profile = 0;
	glGetIntegerv(GL_MAJOR_VERSION, &major);
	glGetIntegerv(GL_MINOR_VERSION, &minor);
	glGetIntegerv(GL_CONTEXT_PROFILE_MASK, &profile);
	if (major * 10 + minor < 45 || (profile & GL_CONTEXT_CORE_PROFILE_BIT) == 0)
	{
		return false;
	}
	myRendererName = reinterpret_cast<const char*>(glGetString(GL_RENDERER));
	myVersionName = reinterpret_cast<const char*>(glGetString(GL_VERSION));
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
