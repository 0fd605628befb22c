#pragma once
// GLSL for tests that draw without the effect system.
//
// LinkProgram builds a program from two sources, failing the test with the log
// when it does not build. ourColorVertex/ourColorFragment pass position (location 0)
// through as clip space and write colour (location 1) out.

#include <epoxy/gl.h>
#include <gtest/gtest.h>
#include <string>
// 0 (and a test failure with the compiler's or linker's log) when the program does not build.
inline GLuint LinkProgram(const char* aVertexSource, const char* aFragmentSource)
{
	const GLuint program = glCreateProgram();
	std::string log(4096, '\0');
	for (const auto& [stage, source] :
	     {std::pair{GL_VERTEX_SHADER, aVertexSource}, std::pair{GL_FRAGMENT_SHADER, aFragmentSource}})
	{
		const GLuint shader = glCreateShader(stage);
		glShaderSource(shader, 1, &source, nullptr);
		glCompileShader(shader);
		glGetShaderInfoLog(shader, GLsizei(log.size()), nullptr, log.data());
		glAttachShader(program, shader);
		glDeleteShader(shader);
	}
	glLinkProgram(program);
	GLint linkedFlag = GL_FALSE;
	glGetProgramiv(program, GL_LINK_STATUS, &linkedFlag);
	if (linkedFlag != GL_TRUE)
	{
		glGetProgramInfoLog(program, GLsizei(log.size()), nullptr, log.data());
		ADD_FAILURE() << log.c_str() << "\n" << aVertexSource << "\n" << aFragmentSource;
		glDeleteProgram(program);
		return 0;
	}
	return program;
}

constexpr const char* ourColorVertex = R"(#version 450 core
layout(location = 0) in vec3 aPosition;
layout(location = 1) in vec4 aColor;
out vec4 vColor;
void main() { vColor = aColor; gl_Position = vec4(aPosition, 1.0); })";
constexpr const char* ourColorFragment = R"(#version 450 core
in vec4 vColor;
out vec4 oColor;
void main() { oColor = vColor; })";
