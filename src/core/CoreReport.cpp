#include "core/CoreReport.h"

#include <atomic>
#include <cstdio>
#include <string>

#include "core/GrowingArray.h"

namespace
{
std::atomic<CoreReport::Handler> ourHandler{nullptr};
std::atomic<CoreReport::Handler> ourErrorHandler{nullptr};
}

namespace CoreReport
{
void SetCriticalHandler(Handler aHandler) { ourHandler.store(aHandler); }

Handler GetCriticalHandler() { return ourHandler.load(); }

void SetErrorHandler(Handler aHandler) { ourErrorHandler.store(aHandler); }

Handler GetErrorHandler() { return ourErrorHandler.load(); }

void Critical(int aLine, const char* aFunctionName, const char* aMessage)
{
	if (Handler handler = ourHandler.load())
	{
		handler(aLine, aFunctionName, aMessage);
		return;
	}
	std::fprintf(stderr, "CRITICAL ERROR: %s (%d): %s\n", aFunctionName, aLine, aMessage);
}

void Error(int aLine, const char* aFunctionName, const char* aMessage)
{
	if (Handler handler = ourErrorHandler.load())
	{
		handler(aLine, aFunctionName, aMessage);
		return;
	}
	std::fprintf(stderr, "ERROR: %s (%d): %s\n", aFunctionName, aLine, aMessage);
}
}

namespace GrowingArrayDetail
{
void ReportCapacityOverflow(int aRequestedCount, int aLimit)
{
	const std::string message = "Tried to grow past " + std::to_string(aLimit) + " elements (element " +
	                            std::to_string(aRequestedCount) + " refused)";
	CoreReport::Critical(__LINE__, "GrowingArray::Add", message.c_str());
}
}
