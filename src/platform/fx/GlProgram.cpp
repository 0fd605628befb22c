#include "platform/fx/GlProgram.h"

#include <string_view>

#include "platform/fx/EffectSource.h"

namespace Fx
{
namespace
{
constexpr GLenum ToGlStage(StageKind aKind)
{
	switch (aKind)
	{
	case StageKind::Vertex:
		return GL_VERTEX_SHADER;
	case StageKind::Geometry:
		return GL_GEOMETRY_SHADER;
	case StageKind::Fragment:
		return GL_FRAGMENT_SHADER;
	}
	return GL_VERTEX_SHADER;
}

void AppendLog(std::string& aLog, const std::vector<char>& someText)
{
	std::string text(someText.data());
	while (!text.empty() && (text.back() == '\n' || text.back() == ' '))
	{
		text.pop_back();
	}
	if (!text.empty())
	{
		aLog += text + "\n";
	}
}
} // namespace

GLuint CompileStage(StageKind aKind, const std::string& aSource, std::string& aLog)
{
	const GLuint shader = glCreateShader(ToGlStage(aKind));
	const char* text = aSource.c_str();
	const GLint length = static_cast<GLint>(aSource.size());
	glShaderSource(shader, 1, &text, &length);
	glCompileShader(shader);
	GLint compiledFlag = GL_FALSE;
	glGetShaderiv(shader, GL_COMPILE_STATUS, &compiledFlag);
	GLint logLength = 0;
	glGetShaderiv(shader, GL_INFO_LOG_LENGTH, &logLength);
	std::vector<char> log(static_cast<size_t>(std::max(logLength, 1)) + 1, '\0');
	glGetShaderInfoLog(shader, logLength, nullptr, log.data());
	AppendLog(aLog, log);
	if (compiledFlag != GL_TRUE)
	{
		glDeleteShader(shader);
		return 0;
	}
	return shader;
}

GLuint LinkPass(std::span<const GLuint> someShaders, std::span<const VertexInput> someInputs,
                std::string& aLog)
{
	const GLuint program = glCreateProgram();
	for (const GLuint shader : someShaders)
	{
		if (shader != 0)
		{
			glAttachShader(program, shader);
		}
	}
	for (const VertexInput& input : someInputs)
	{
		glBindAttribLocation(program, static_cast<GLuint>(input.myLocation), input.myVariableName.c_str());
	}
	glLinkProgram(program);
	for (const GLuint shader : someShaders)
	{
		if (shader != 0)
		{
			glDetachShader(program, shader);
		}
	}
	GLint linkedFlag = GL_FALSE;
	glGetProgramiv(program, GL_LINK_STATUS, &linkedFlag);
	GLint logLength = 0;
	glGetProgramiv(program, GL_INFO_LOG_LENGTH, &logLength);
	std::vector<char> log(static_cast<size_t>(std::max(logLength, 1)) + 1, '\0');
	glGetProgramInfoLog(program, logLength, nullptr, log.data());
	AppendLog(aLog, log);
	if (linkedFlag != GL_TRUE)
	{
		glDeleteProgram(program);
		return 0;
	}
	return program;
}

namespace
{
// A small cursor over one log line; each step consumes only when it matches.
struct LineCursor
{
	const std::string& myText;
	size_t myAt = 0;

	bool Number(unsigned long& aValue)
	{
		const size_t first = myAt;
		aValue = 0;
		while (myAt < myText.size() && myText[myAt] >= '0' && myText[myAt] <= '9' && myAt - first < 9)
		{
			aValue = aValue * 10 + static_cast<unsigned long>(myText[myAt] - '0');
			++myAt;
		}
		return myAt > first;
	}

	bool Literal(const char* aLiteral)
	{
		const std::string_view literal(aLiteral);
		if (myText.compare(myAt, literal.size(), literal) != 0)
		{
			return false;
		}
		myAt += literal.size();
		return true;
	}

	std::string Rest() const { return myText.substr(myAt); }
};

// Driver log formats: Mesa "0:12(5): error: ...", others "ERROR: 0:12: ..." and
// "0(12) : error ...". True with the line number and the message when one matches.
bool ParseLogLine(const std::string& aLine, unsigned long& aLineNumber, std::string& aMessage)
{
	unsigned long source = 0;
	unsigned long column = 0;
	LineCursor mesa{aLine};
	if (mesa.Number(source) && mesa.Literal(":") && mesa.Number(aLineNumber) && mesa.Literal("(") &&
	    mesa.Number(column) && mesa.Literal("): "))
	{
		aMessage = mesa.Rest();
		return true;
	}
	LineCursor prefixed{aLine};
	const bool errorFlag = prefixed.Literal("ERROR: ");
	if ((errorFlag || prefixed.Literal("WARNING: ")) && prefixed.Number(source) && prefixed.Literal(":") &&
	    prefixed.Number(aLineNumber) && prefixed.Literal(": "))
	{
		aMessage = (errorFlag ? "error: " : "warning: ") + prefixed.Rest();
		return true;
	}
	LineCursor parenthesised{aLine};
	if (parenthesised.Number(source) && parenthesised.Literal("(") && parenthesised.Number(aLineNumber) &&
	    parenthesised.Literal(")") && (parenthesised.Literal(" : ") || parenthesised.Literal(": ")))
	{
		aMessage = parenthesised.Rest();
		return true;
	}
	return false;
}
} // namespace

std::string MapDriverLog(const std::string& aLog, const std::vector<std::string>& someFiles,
                         const std::string& aFallback)
{
	std::string mapped;
	size_t start = 0;
	while (start < aLog.size())
	{
		const size_t end = std::min(aLog.find('\n', start), aLog.size());
		const std::string line = aLog.substr(start, end - start);
		start = end + 1;
		if (line.find_first_not_of(" \t\r") == std::string::npos)
		{
			continue;
		}
		unsigned long number = 0;
		std::string message;
		if (!ParseLogLine(line, number, message))
		{
			mapped += aFallback + ": " + line + "\n";
			continue;
		}
		// Mesa keeps the line of a #line directive but not always its source number,
		// so included files carry their index in the line number instead.
		const unsigned long index = number / ourIncludeLineStride;
		const std::string file =
		    index < someFiles.size() ? someFiles[index] : "source " + std::to_string(index);
		mapped += file + "(" + std::to_string(number % ourIncludeLineStride) + "): " + message + "\n";
	}
	return mapped;
}

DebugOutputPause::DebugOutputPause() : myWasEnabledFlag(glIsEnabled(GL_DEBUG_OUTPUT) == GL_TRUE)
{
	if (myWasEnabledFlag)
	{
		glDisable(GL_DEBUG_OUTPUT);
	}
}

DebugOutputPause::~DebugOutputPause()
{
	if (myWasEnabledFlag)
	{
		glEnable(GL_DEBUG_OUTPUT);
	}
}
} // namespace Fx
