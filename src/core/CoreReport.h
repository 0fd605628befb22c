#pragma once
// CoreReport: how the core types reach the engine's log without depending on it.
//
// The core and the platform layer sit below the engine, so they cannot call Debug
// directly. Debug installs handlers when the log is created and removes them when the
// log is destroyed; without one, reports go to standard error.
//
// Two levels: Critical is for the core's own broken invariants (a growing array past
// its limit) and goes to the log's critical level, which a host may make fatal.
// Error is for everything a user or the machine can cause below the engine (a bad
// file, a missing font, a GL failure): it goes to the log's error level, never fatal,
// and the caller returns false or null so the engine decides what the failure means.

namespace CoreReport
{
using Handler = void (*)(int aLine, const char* aFunctionName, const char* aMessage);

void SetCriticalHandler(Handler aHandler);
Handler GetCriticalHandler();

void SetErrorHandler(Handler aHandler);
Handler GetErrorHandler();

// Sends one critical report to the installed handler, or to standard error.
void Critical(int aLine, const char* aFunctionName, const char* aMessage);
// Sends one non-fatal failure report to the installed handler, or to standard error.
void Error(int aLine, const char* aFunctionName, const char* aMessage);
}
