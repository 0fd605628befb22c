#pragma once
// Debug: the process-wide log and error-reporting singleton.
//
//   Debug::Create("DebugLogger.txt", std::bitset<4>(12));   // severe + critical are fatal
//   Debug::GetInstance()->CriticalErrorMessage(__LINE__, "Zeph::Engine::Init", "Failed to open %s:", name);
//   Debug::Destroy();
//
// Each entry is appended to a text log written through FI_File. A level whose bit
// is set in the fatal levels writes an assertion block and the call stack after its
// entry and then ends the process. The logger takes no lock.

#include <bitset>
#include <cstdarg>
#include <functional>
#include <string>

#include "engine/FI_File.h"

class Debug
{
public:
	enum AssertLevels
	{
		DEBUG_MESSAGE = 0,
		ERROR_MESSAGE = 1,
		SEVERE_ERROR_MESSAGE = 2,
		CRITICAL_ERROR_MESSAGE = 3,
	};

	// Sees every report after it is logged and before a fatal one ends the process:
	// level, line, function and the formatted message. For tools that list problems.
	using ReportListener = std::function<void(AssertLevels, int, const char*, const char*)>;

	static bool Create(std::string aFileName, std::bitset<4> someAssertLevels);
	static bool Destroy();
	static Debug* GetInstance();
	// Process-wide, kept across Create and Destroy; an empty listener removes it.
	static void SetReportListener(ReportListener aListener);

	void DebugMessage(int aLine, const char* aFunctionName, const char* aFormat, ...)
	    __attribute__((format(printf, 4, 5)));
	void ErrorMessage(int aLine, const char* aFunctionName, const char* aFormat, ...)
	    __attribute__((format(printf, 4, 5)));
	void SevereErrorMessage(int aLine, const char* aFunctionName, const char* aFormat, ...)
	    __attribute__((format(printf, 4, 5)));
	void CriticalErrorMessage(int aLine, const char* aFunctionName, const char* aFormat, ...)
	    __attribute__((format(printf, 4, 5)));

private:
	Debug() = default;
	~Debug() = default;

	bool Init(const std::string& aFileName, std::bitset<4> someAssertLevels);

	// The helpers are members so that their frames carry the "Debug::" prefix by
	// which the fatal report leaves the logger's own frames out of the call stack.
	void Report(AssertLevels aLevel, int aLine, const char* aFunctionName, const char* aFormat,
	            std::va_list someArguments);
	void WriteEntry(const char* aTag, int aLine, const char* aFunctionName, const char* aMessage);
	// aFile null: the log could not be opened and the report goes to standard error.
	[[noreturn]] static void FatalReport(FI_File* aFile, int aLine, const char* aFunctionName,
	                                     const char* aText);
	static void WriteTimeStamp(FI_File* aFile);
	static void WriteCallStack(FI_File* aFile);
	// Installed as CoreReport's critical handler while the log exists.
	static void ForwardCoreReport(int aLine, const char* aFunctionName, const char* aMessage);
	// Installed as CoreReport's error handler: failures below the engine, never fatal.
	static void ForwardCoreError(int aLine, const char* aFunctionName, const char* aMessage);

	FI_File myFile;
	std::bitset<4> myAssertLevels;

	static Debug* ourInstance;
	static ReportListener ourListener;
};
