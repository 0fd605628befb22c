#pragma once
// Reports from the engine's classes: to the log when one exists (Debug decides
// whether the level is fatal), else to standard error, so tools and tests that
// run without a log still see every message.

namespace Zeph
{
void ReportCritical(int aLine, const char* aFunctionName, const char* aFormat, ...)
    __attribute__((format(printf, 3, 4)));
// A failure the engine recovers from (a file it could not write): the log's error
// level, which the facade never makes fatal.
void ReportError(int aLine, const char* aFunctionName, const char* aFormat, ...)
    __attribute__((format(printf, 3, 4)));
void ReportDebug(int aLine, const char* aFunctionName, const char* aFormat, ...)
    __attribute__((format(printf, 3, 4)));
} // namespace Zeph
