#include "platform/gpu/Report.h"

#include <cstdarg>
#include <cstdio>

#include "core/CoreReport.h"

namespace Gpu
{
void ReportError(int aLine, const char* aFunctionName, const char* aFormat, ...)
{
	char message[1024];
	std::va_list arguments;
	va_start(arguments, aFormat);
	std::vsnprintf(message, sizeof(message), aFormat, arguments);
	va_end(arguments);
	CoreReport::Error(aLine, aFunctionName, message);
}

std::string Describe(const char* aFormat, ...)
{
	char message[1024];
	std::va_list arguments;
	va_start(arguments, aFormat);
	std::vsnprintf(message, sizeof(message), aFormat, arguments);
	va_end(arguments);
	return message;
}

#ifndef NDEBUG
namespace
{
const char* GlErrorName(GLenum anError)
{
	switch (anError)
	{
	case GL_INVALID_ENUM:
		return "GL_INVALID_ENUM";
	case GL_INVALID_VALUE:
		return "GL_INVALID_VALUE";
	case GL_INVALID_OPERATION:
		return "GL_INVALID_OPERATION";
	case GL_INVALID_FRAMEBUFFER_OPERATION:
		return "GL_INVALID_FRAMEBUFFER_OPERATION";
	case GL_OUT_OF_MEMORY:
		return "GL_OUT_OF_MEMORY";
	default:
		return "unknown GL error";
	}
}
} // namespace

void CheckGlErrors(int aLine, const char* aFunctionName)
{
	// A lost context keeps answering the same error; the bound keeps that from spinning.
	for (int count = 0; count < 16; ++count)
	{
		const GLenum error = glGetError();
		if (error == GL_NO_ERROR)
		{
			return;
		}
		ReportError(aLine, aFunctionName, "%s (0x%04x)", GlErrorName(error), error);
	}
}
#endif

void LabelObject(GLenum anIdentifier, GLuint aName, const std::string& aLabel)
{
	if (aLabel.empty() || aName == 0)
	{
		return;
	}
	glObjectLabel(anIdentifier, aName, static_cast<GLsizei>(aLabel.size()), aLabel.c_str());
}
} // namespace Gpu
