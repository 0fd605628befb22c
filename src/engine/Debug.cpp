#include "engine/Debug.h"

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>

#include "core/CoreReport.h"
#include "platform/stacktrace/StackTrace.h"

Debug* Debug::ourInstance = nullptr;
Debug::ReportListener Debug::ourListener;

namespace
{
// What a fatal report names after "File:". The logger reports where the assertion
// was raised, not where it was detected, so this is always its own source file.
constexpr const char* ourSourceFileName = "Debug.cpp";

// The line and text of the report when the log itself cannot be opened; the line
// is fixed so that the report reads the same in every build.
constexpr int ourInitFailureLine = 155;
constexpr const char* ourInitFailureText = "Failed to initialize debug system";

constexpr int ourMessageBufferSize = 4096;

const char* const ourTags[] = {"DEBUG", "ERROR", "SEVERE ERROR", "CRITICAL ERROR"};
const char* const ourAssertTexts[] = {"Debug Message", "Error Message", "Severe Error Message",
                                      "Critical Error Message"};

const char* OrEmpty(const char* aText)
{
	return aText != nullptr ? aText : "";
}

// Items in the log's text form: to the log file, or to standard error when the log
// could not be opened and the user must still learn why the program stopped.
class ReportWriter
{
public:
	explicit ReportWriter(FI_File* aFile) : myFile(aFile) {}

	void Item(const std::string& aText)
	{
		if (myFile != nullptr)
		{
			myFile->Write(aText);
		}
		else
		{
			std::fprintf(stderr, "\"%s\"", aText.c_str());
		}
	}

	void Number(int aValue)
	{
		if (myFile != nullptr)
		{
			myFile->Write(aValue);
		}
		else
		{
			std::fprintf(stderr, "%d", aValue);
		}
	}

	void LineEnd()
	{
		if (myFile != nullptr)
		{
			myFile->NewLine();
		}
		else
		{
			std::fputc('\n', stderr);
		}
	}

	void Flush()
	{
		if (myFile != nullptr)
		{
			myFile->Flush();
		}
		else
		{
			std::fflush(stderr);
		}
	}

private:
	FI_File* myFile;
};

std::string FrameLine(const StackTrace::Frame& aFrame)
{
	const std::string function =
	    aFrame.myFunction.empty() ? std::string("(function-name not available)") : aFrame.myFunction;
	if (!aFrame.myFile.empty())
	{
		return aFrame.myFile + " (" + std::to_string(aFrame.myLine) + "): " + function;
	}
	char address[32];
	std::snprintf(address, sizeof(address), "%p", aFrame.myAddress);
	const std::string module =
	    aFrame.myModule.empty() ? std::string("(module-name not available)") : aFrame.myModule;
	return std::string(address) + " (" + module + "): (filename not available): " + function;
}
} // namespace

void Debug::SetReportListener(ReportListener aListener)
{
	ourListener = std::move(aListener);
}

bool Debug::Create(std::string aFileName, std::bitset<4> someAssertLevels)
{
	if (ourInstance != nullptr)
	{
		return false;
	}
	ourInstance = new Debug();
	if (!ourInstance->Init(aFileName, someAssertLevels))
	{
		delete ourInstance;
		ourInstance = nullptr;
		return false;
	}
	CoreReport::SetCriticalHandler(&Debug::ForwardCoreReport);
	CoreReport::SetErrorHandler(&Debug::ForwardCoreError);
	return true;
}

bool Debug::Destroy()
{
	// Callers never destroy a log that does not exist; if one does, there is nothing
	// to close and false says so.
	if (ourInstance == nullptr)
	{
		return false;
	}
	if (!ourInstance->myFile.Close())
	{
		return false;
	}
	if (CoreReport::GetCriticalHandler() == &Debug::ForwardCoreReport)
	{
		CoreReport::SetCriticalHandler(nullptr);
	}
	if (CoreReport::GetErrorHandler() == &Debug::ForwardCoreError)
	{
		CoreReport::SetErrorHandler(nullptr);
	}
	delete ourInstance;
	ourInstance = nullptr;
	return true;
}

Debug* Debug::GetInstance()
{
	return ourInstance;
}

bool Debug::Init(const std::string& aFileName, std::bitset<4> someAssertLevels)
{
	if (!myFile.Open(aFileName, FI_File::FileFlags::WRITE))
	{
		// Without a log nothing could be reported later; FI_File has already named
		// the file on standard error and the report follows it there.
		FatalReport(nullptr, ourInitFailureLine, "Debug::Init", ourInitFailureText);
	}
	myAssertLevels = someAssertLevels;
	return true;
}

void Debug::DebugMessage(int aLine, const char* aFunctionName, const char* aFormat, ...)
{
	std::va_list arguments;
	va_start(arguments, aFormat);
	Report(DEBUG_MESSAGE, aLine, aFunctionName, aFormat, arguments);
	va_end(arguments);
}

void Debug::ErrorMessage(int aLine, const char* aFunctionName, const char* aFormat, ...)
{
	std::va_list arguments;
	va_start(arguments, aFormat);
	Report(ERROR_MESSAGE, aLine, aFunctionName, aFormat, arguments);
	va_end(arguments);
}

void Debug::SevereErrorMessage(int aLine, const char* aFunctionName, const char* aFormat, ...)
{
	std::va_list arguments;
	va_start(arguments, aFormat);
	Report(SEVERE_ERROR_MESSAGE, aLine, aFunctionName, aFormat, arguments);
	va_end(arguments);
}

void Debug::CriticalErrorMessage(int aLine, const char* aFunctionName, const char* aFormat, ...)
{
	std::va_list arguments;
	va_start(arguments, aFormat);
	Report(CRITICAL_ERROR_MESSAGE, aLine, aFunctionName, aFormat, arguments);
	va_end(arguments);
}

void Debug::Report(AssertLevels aLevel, int aLine, const char* aFunctionName, const char* aFormat,
                   std::va_list someArguments)
{
	char message[ourMessageBufferSize];
	std::memset(message, 0, sizeof(message));
	std::vsnprintf(message, sizeof(message), OrEmpty(aFormat), someArguments);
	WriteEntry(ourTags[aLevel], aLine, aFunctionName, message);
	if (ourListener)
	{
		ourListener(aLevel, aLine, OrEmpty(aFunctionName), message);
	}
	if (myAssertLevels.test(aLevel))
	{
		FatalReport(&myFile, aLine, aFunctionName, ourAssertTexts[aLevel]);
	}
}

void Debug::WriteEntry(const char* aTag, int aLine, const char* aFunctionName, const char* aMessage)
{
	ReportWriter out(&myFile);
	WriteTimeStamp(&myFile);
	out.Item("Error Type:");
	out.Item(aTag);
	out.LineEnd();
	out.Item("Line:");
	out.Number(aLine);
	out.LineEnd();
	out.Item("Function:");
	out.Item(OrEmpty(aFunctionName));
	out.LineEnd();
	out.Item(std::string(aMessage) + "\n");
	out.LineEnd();
	out.Flush();
}

void Debug::WriteTimeStamp(FI_File* aFile)
{
	const auto now = std::chrono::system_clock::now();
	const std::time_t seconds = std::chrono::system_clock::to_time_t(now);
	std::tm local{};
	::localtime_r(&seconds, &local);
	const long long milliseconds =
	    std::chrono::duration_cast<std::chrono::milliseconds>(now.time_since_epoch()).count() % 1000;
	char stamp[96];
	std::snprintf(stamp, sizeof(stamp), "%d/%d/%d\n%d:%d:%d:%lld", local.tm_year + 1900, local.tm_mon + 1,
	              local.tm_mday, local.tm_hour, local.tm_min, local.tm_sec, milliseconds);
	ReportWriter out(aFile);
	out.Item(stamp);
	out.LineEnd();
}

void Debug::FatalReport(FI_File* aFile, int aLine, const char* aFunctionName, const char* aText)
{
	ReportWriter out(aFile);
	WriteTimeStamp(aFile);
	out.Item("Assertion Failed:");
	out.Item(aText);
	out.LineEnd();
	out.Item("File:");
	out.Item(ourSourceFileName);
	out.LineEnd();
	out.Item("Function:");
	out.Item(OrEmpty(aFunctionName));
	out.LineEnd();
	out.Item("Line:");
	out.Number(aLine);
	out.LineEnd();
	out.LineEnd();
	out.Flush();
	WriteCallStack(aFile);
	if (aFile != nullptr)
	{
		aFile->Close();
	}
	std::abort();
}

void Debug::WriteCallStack(FI_File* aFile)
{
	ReportWriter out(aFile);
	const std::vector<StackTrace::Frame> frames = StackTrace::Capture(0);
	// The logger's own frames say nothing about the failure; the stack starts at
	// the code that reported it.
	std::size_t first = 0;
	while (first < frames.size() && frames[first].myFunction.starts_with("Debug::"))
	{
		++first;
	}
	if (first == frames.size())
	{
		// No frame to show (no unwinder, or only the logger's own): one line in the
		// walker's failure form says so, rather than an empty stack.
		char line[128];
		std::snprintf(line, sizeof(line), "ERROR: %s, GetLastError: %d (Address: %p)", "StackTrace::Capture",
		              0, static_cast<const void*>(nullptr));
		out.Item(line);
		out.LineEnd();
		out.Flush();
		return;
	}
	for (std::size_t i = first; i < frames.size(); ++i)
	{
		out.Item(FrameLine(frames[i]));
		out.LineEnd();
		out.Flush();
	}
}

void Debug::ForwardCoreReport(int aLine, const char* aFunctionName, const char* aMessage)
{
	if (ourInstance != nullptr)
	{
		ourInstance->CriticalErrorMessage(aLine, aFunctionName, "%s", OrEmpty(aMessage));
	}
}

void Debug::ForwardCoreError(int aLine, const char* aFunctionName, const char* aMessage)
{
	if (ourInstance != nullptr)
	{
		ourInstance->ErrorMessage(aLine, aFunctionName, "%s", OrEmpty(aMessage));
	}
}
