#pragma once
// The library's own identity, for tools and front ends that load it.

namespace Lumora
{
// The library version, "major.minor.patch".
const char* GetVersion();
}
