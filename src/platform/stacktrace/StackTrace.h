#pragma once
// StackTrace: the current thread's call stack, for fatal reports.
//
//   for (const StackTrace::Frame& frame : StackTrace::Capture(0)) { ... }
//
// Frames come innermost first with demangled function names, source file and
// line from the debug information (GCC's libbacktrace), and the module that
// holds the code. A part that cannot be found is left empty (line 0), so the
// caller decides how to show it. Inlined calls appear as frames of their own.

#include <string>
#include <vector>

namespace StackTrace
{
struct Frame
{
	const void* myAddress = nullptr;
	std::string myModule;
	std::string myFile;
	int myLine = 0;
	std::string myFunction;
};

// The stack of the calling thread, starting at the caller of Capture after
// skipping aSkipFrames more frames. Safe to call from any thread.
std::vector<Frame> Capture(int aSkipFrames);
} // namespace StackTrace
