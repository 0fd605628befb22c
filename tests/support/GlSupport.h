#pragma once
// Shared by the tests that need a GL context.

#include <cstdlib>
#include <cstring>

namespace TestSupport
{
// Under CI a missing GL is a failure; elsewhere GPU tests skip without one.
inline bool IsCi()
{
	const char* ci = std::getenv("CI");
	return ci != nullptr && std::strcmp(ci, "true") == 0;
}
} // namespace TestSupport
