#pragma once
// Report: how the GPU layer reaches the engine's log, and its debug-build GL checks.
//
//   Gpu::ReportError(__LINE__, "Gpu::Texture::Init", "Unsupported format %u", aFormat);
//   glTextureStorage2D(...);
//   LUMORA_GL_CHECK("Gpu::Texture::Init");
//
// The platform layer sits below the engine, so reports travel through CoreReport's
// error level, which the engine's Debug log writes as a non-fatal "ERROR" entry
// (standard error when no log exists). A report never ends the process: the caller
// returns false or null and the engine decides, in its own words, what it means. Debug builds read glGetError after the checked calls; release
// builds compile the checks away.

#include <epoxy/gl.h>
#include <string>

namespace Gpu
{
void ReportError(int aLine, const char* aFunctionName, const char* aFormat, ...)
    __attribute__((format(printf, 3, 4)));

// The formatted text, for failures that the caller reports (or not) in its own words.
std::string Describe(const char* aFormat, ...) __attribute__((format(printf, 1, 2)));

#ifdef NDEBUG
inline void CheckGlErrors(int, const char*)
{
}
#else
// Drains glGetError and reports every error with the caller's function and line.
void CheckGlErrors(int aLine, const char* aFunctionName);
#endif

// Names a GL object for debuggers; a no-op when the label is empty.
void LabelObject(GLenum anIdentifier, GLuint aName, const std::string& aLabel);
} // namespace Gpu

#define LUMORA_GL_CHECK(functionName) Gpu::CheckGlErrors(__LINE__, functionName)
