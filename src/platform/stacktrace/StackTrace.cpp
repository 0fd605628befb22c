#include "platform/stacktrace/StackTrace.h"

#include <backtrace.h>
#include <cstdint>
#include <cstdlib>
#include <cxxabi.h>
#include <dlfcn.h>
#include <execinfo.h>

namespace
{
// A runaway recursion would otherwise fill the log with thousands of identical lines.
constexpr int ourMaxFrames = 128;

// Missing debug information is normal for system libraries; the frame then simply
// lacks a file and line, so errors are not reported anywhere.
void IgnoreError(void*, const char*, int)
{
}

backtrace_state* SharedState()
{
	// libbacktrace caches the parsed debug information in its state and cannot free
	// it, so one state serves the whole process.
	static backtrace_state* ourState = backtrace_create_state(nullptr, 1, IgnoreError, nullptr);
	return ourState;
}

std::string Demangle(const char* aName)
{
	if (aName == nullptr || *aName == '\0')
	{
		return {};
	}
	int status = 0;
	char* demangled = abi::__cxa_demangle(aName, nullptr, nullptr, &status);
	if (status != 0 || demangled == nullptr)
	{
		return aName;
	}
	std::string result(demangled);
	std::free(demangled);
	return result;
}

int CollectAddress(void* someAddresses, std::uintptr_t aPc)
{
	auto* addresses = static_cast<std::vector<std::uintptr_t>*>(someAddresses);
	if (aPc != 0 && aPc != static_cast<std::uintptr_t>(-1))
	{
		addresses->push_back(aPc);
	}
	return addresses->size() >= ourMaxFrames ? 1 : 0;
}

int AddSourceFrame(void* someFrames, std::uintptr_t aPc, const char* aFile, int aLine, const char* aFunction)
{
	StackTrace::Frame frame;
	frame.myAddress = reinterpret_cast<const void*>(aPc);
	frame.myFile = aFile != nullptr ? aFile : "";
	frame.myLine = aFile != nullptr ? aLine : 0;
	frame.myFunction = Demangle(aFunction);
	static_cast<std::vector<StackTrace::Frame>*>(someFrames)->push_back(std::move(frame));
	return 0;
}

void AddSymbol(void* aFrame, std::uintptr_t, const char* aSymbol, std::uintptr_t, std::uintptr_t)
{
	static_cast<StackTrace::Frame*>(aFrame)->myFunction = Demangle(aSymbol);
}

// Fills in what the debug information did not give: the module always, and the
// function name from the symbol table for the frame that really owns the address
// (not an inlined one). The symbol is preferred there because the debug information
// names functions without linkage (anonymous namespaces, statics) unqualified.
void CompleteFrame(backtrace_state* aState, StackTrace::Frame& aFrame, bool anOutermostFlag)
{
	const auto pc = reinterpret_cast<std::uintptr_t>(aFrame.myAddress);
	if (anOutermostFlag && aState != nullptr)
	{
		StackTrace::Frame symbol;
		backtrace_syminfo(aState, pc, AddSymbol, IgnoreError, &symbol);
		if (!symbol.myFunction.empty())
		{
			aFrame.myFunction = std::move(symbol.myFunction);
		}
	}
	Dl_info info{};
	if (::dladdr(aFrame.myAddress, &info) != 0)
	{
		if (info.dli_fname != nullptr)
		{
			aFrame.myModule = info.dli_fname;
		}
		if (aFrame.myFunction.empty())
		{
			aFrame.myFunction = Demangle(info.dli_sname);
		}
	}
}
} // namespace

namespace StackTrace
{
__attribute__((noinline)) std::vector<Frame> Capture(int aSkipFrames)
{
	std::vector<Frame> frames;
	backtrace_state* state = SharedState();
	std::vector<std::uintptr_t> addresses;
	if (state != nullptr)
	{
		// One more than asked: libbacktrace counts this function as the first frame.
		backtrace_simple(state, aSkipFrames + 1, CollectAddress, IgnoreError, &addresses);
	}
	if (addresses.empty())
	{
		// Without libbacktrace's unwinder the glibc one still gives the addresses. It
		// returns return addresses, one past the call, hence the - 1.
		void* raw[ourMaxFrames];
		const int count = ::backtrace(raw, ourMaxFrames);
		for (int i = aSkipFrames + 1; i < count; ++i)
		{
			addresses.push_back(reinterpret_cast<std::uintptr_t>(raw[i]) - 1);
		}
	}
	for (std::uintptr_t pc : addresses)
	{
		const std::size_t first = frames.size();
		if (state != nullptr)
		{
			backtrace_pcinfo(state, pc, AddSourceFrame, IgnoreError, &frames);
		}
		if (frames.size() == first)
		{
			Frame frame;
			frame.myAddress = reinterpret_cast<const void*>(pc);
			frames.push_back(std::move(frame));
		}
		// libbacktrace reports inlined calls first and the containing function last.
		for (std::size_t i = first; i < frames.size(); ++i)
		{
			CompleteFrame(state, frames[i], i + 1 == frames.size());
		}
	}
	return frames;
}
} // namespace StackTrace
