#include "engine/EngineReport.h"

#include <cstdarg>
#include <cstdio>

#include "engine/Debug.h"

namespace Zeph
{
namespace
{
// The log cuts an entry at 4,095 characters; the buffer matches it.
constexpr int ourMessageSize = 4096;

void Forward(Debug::AssertLevels aLevel, int aLine, const char* aFunctionName, const char* aFormat,
             std::va_list someArguments)
{
	char message[ourMessageSize];
	std::vsnprintf(message, sizeof(message), aFormat, someArguments);
	Debug* log = Debug::GetInstance();
	if (log == nullptr)
	{
		std::fprintf(stderr, "%s: %s\n", aFunctionName, message);
		return;
	}
	// The formatted text goes in as an argument: file names may hold '%'.
	switch (aLevel)
	{
	case Debug::CRITICAL_ERROR_MESSAGE:
		log->CriticalErrorMessage(aLine, aFunctionName, "%s", message);
		break;
	case Debug::ERROR_MESSAGE:
		log->ErrorMessage(aLine, aFunctionName, "%s", message);
		break;
	default:
		log->DebugMessage(aLine, aFunctionName, "%s", message);
		break;
	}
}
} // namespace

void ReportCritical(int aLine, const char* aFunctionName, const char* aFormat, ...)
{
	std::va_list arguments;
	va_start(arguments, aFormat);
	Forward(Debug::CRITICAL_ERROR_MESSAGE, aLine, aFunctionName, aFormat, arguments);
	va_end(arguments);
}

void ReportError(int aLine, const char* aFunctionName, const char* aFormat, ...)
{
	std::va_list arguments;
	va_start(arguments, aFormat);
	Forward(Debug::ERROR_MESSAGE, aLine, aFunctionName, aFormat, arguments);
	va_end(arguments);
}

void ReportDebug(int aLine, const char* aFunctionName, const char* aFormat, ...)
{
	std::va_list arguments;
	va_start(arguments, aFormat);
	Forward(Debug::DEBUG_MESSAGE, aLine, aFunctionName, aFormat, arguments);
	va_end(arguments);
}
} // namespace Zeph
