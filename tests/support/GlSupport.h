#pragma once
// Shared by the tests that need a GL context.

#include <cstdlib>
#include <cstring>
#include <dlfcn.h>
#include <link.h>
#include <string>

namespace TestSupport
{
// Mesa unloads its driver when the EGL display goes; the driver's process-wide
// allocations, still held by its globals, then look leaked to LeakSanitizer
// because those globals are unmapped. Keeping the loaded GL libraries mapped
// leaves them reachable, so a leak report from a GPU test is a leak of ours.
inline void PinLoadedGlLibraries()
{
	dl_iterate_phdr(
	    [](dl_phdr_info* anInfo, size_t, void*) -> int {
		    const std::string name = anInfo->dlpi_name != nullptr ? anInfo->dlpi_name : "";
		    for (const char* library : {"_dri.so", "libgallium", "libEGL_mesa", "libglapi", "libGLX_mesa"})
		    {
			    if (name.find(library) != std::string::npos)
			    {
				    dlopen(name.c_str(), RTLD_LAZY | RTLD_NOLOAD | RTLD_NODELETE);
			    }
		    }
		    return 0;
	    },
	    nullptr);
}

// Under CI a missing GL is a failure; elsewhere GPU tests skip without one.
inline bool IsCi()
{
	const char* ci = std::getenv("CI");
	return ci != nullptr && std::strcmp(ci, "true") == 0;
}
} // namespace TestSupport
