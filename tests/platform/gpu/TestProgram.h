#pragma once
// A GLSL program for tests that draw, until the effect system exists: position
// (location 0) passes through as clip space, colour (location 1) is written out.

#include <epoxy/gl.h>
#include <gtest/gtest.h>
#include <string>

class TestProgram
{
public:
	// Fails the current test with the compiler's log when GLSL does not build.
	void Init()
	{
		const GLuint vertex = Compile(GL_VERTEX_SHADER, R"(#version 450 core
layout(location = 0) in vec3 aPosition;
layout(location = 1) in vec4 aColor;
out vec4 vColor;
void main()
{
	vColor = aColor;
	gl_Position = vec4(aPosition, 1.0);
})");
		const GLuint fragment = Compile(GL_FRAGMENT_SHADER, R"(#version 450 core
in vec4 vColor;
out vec4 oColor;
void main()
{
	oColor = vColor;
})");
		myName = glCreateProgram();
		glAttachShader(myName, vertex);
		glAttachShader(myName, fragment);
		glLinkProgram(myName);
		glDeleteShader(vertex);
		glDeleteShader(fragment);
		GLint linkedFlag = GL_FALSE;
		glGetProgramiv(myName, GL_LINK_STATUS, &linkedFlag);
		char log[1024] = {};
		glGetProgramInfoLog(myName, sizeof(log), nullptr, log);
		FailIf(linkedFlag != GL_TRUE, log);
	}

	void Destroy()
	{
		glDeleteProgram(myName);
		myName = 0;
	}

	GLuint GetName() const { return myName; }

private:
	static void FailIf(bool aFailedFlag, const char* aLog)
	{
		if (aFailedFlag)
		{
			ADD_FAILURE() << aLog;
		}
	}

	static GLuint Compile(GLenum aStage, const char* aSource)
	{
		const GLuint shader = glCreateShader(aStage);
		glShaderSource(shader, 1, &aSource, nullptr);
		glCompileShader(shader);
		GLint compiledFlag = GL_FALSE;
		glGetShaderiv(shader, GL_COMPILE_STATUS, &compiledFlag);
		char log[1024] = {};
		glGetShaderInfoLog(shader, sizeof(log), nullptr, log);
		FailIf(compiledFlag != GL_TRUE, log);
		return shader;
	}

	GLuint myName = 0;
};
