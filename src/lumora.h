#pragma once
// The library's own identity, for tools and front ends that load it:
//
//   std::printf("%s\n%s", Lumora::GetVersion(), Lumora::GetBuildInfo().c_str());

#include <string>

namespace Lumora
{
// The library version, "major.minor.patch".
const char* GetVersion();

// A few lines describing this build: compiler, build type, sanitizers and the
// subsystems with the libraries they rest on.
std::string GetBuildInfo();
}
