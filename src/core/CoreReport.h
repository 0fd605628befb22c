#pragma once
// CoreReport: how the core types reach the engine's log without depending on it.
//
// The core sits below the engine, so it cannot call Debug directly. Debug installs
// a handler when the log is created and removes it when the log is destroyed;
// without one, reports go to standard error. A handler may end the process (a
// fatal log level); when it returns, the caller carries on with its own recovery.

namespace CoreReport
{
using Handler = void (*)(int aLine, const char* aFunctionName, const char* aMessage);

void SetCriticalHandler(Handler aHandler);
Handler GetCriticalHandler();

// Sends one critical report to the installed handler, or to standard error.
void Critical(int aLine, const char* aFunctionName, const char* aMessage);
}
