#include "platform/fx/Compiler.h"

#include <algorithm>
#include <epoxy/egl.h>

#include "platform/fx/CompiledFormat.h"
#include "platform/fx/EffectParser.h"
#include "platform/fx/EffectSource.h"
#include "platform/fx/GlProgram.h"

namespace Fx
{
namespace
{
// A problem in shared GLSL shows up once per stage that includes it; say it once.
void AppendNew(std::string& someMessages, const std::string& someLines)
{
	size_t start = 0;
	while (start < someLines.size())
	{
		const size_t end = std::min(someLines.find('\n', start), someLines.size());
		const std::string line = someLines.substr(start, end - start + 1);
		if (someMessages.find(line) == std::string::npos)
		{
			someMessages += line;
		}
		start = end + 1;
	}
}

// Compiles every stage and links every pass, as Fx::Effect will when it loads the file.
bool Validate(const EffectDesc& aDesc, std::string& someMessages)
{
	const DebugOutputPause pause;
	bool okFlag = true;
	std::vector<GLuint> shaders;
	for (const StageDesc& stage : aDesc.myStages)
	{
		std::string log;
		const GLuint shader = CompileStage(stage.myKind, stage.mySource, log);
		AppendNew(someMessages,
		          MapDriverLog(log, aDesc.myFiles, aDesc.myFiles[0] + "(1): stage '" + stage.myName + "'"));
		okFlag = okFlag && shader != 0;
		shaders.push_back(shader);
	}
	for (const TechniqueDesc& technique : aDesc.myTechniques)
	{
		for (const PassDesc& pass : technique.myPasses)
		{
			const int stages[3] = {pass.myVertexStage, pass.myGeometryStage, pass.myFragmentStage};
			std::vector<GLuint> attached;
			bool compiledFlag = true;
			for (const int stage : stages)
			{
				if (stage >= 0)
				{
					attached.push_back(shaders[static_cast<size_t>(stage)]);
					compiledFlag = compiledFlag && attached.back() != 0;
				}
			}
			if (!compiledFlag)
			{
				continue;
			}
			std::string log;
			const GLuint program = LinkPass(attached, pass.myInputs, log);
			AppendNew(someMessages, MapDriverLog(log, aDesc.myFiles,
			                                     aDesc.myFiles[0] + "(1): technique '" + technique.myName +
			                                         "', pass '" + pass.myName + "'"));
			if (program == 0)
			{
				okFlag = false;
				// A driver that links without a word still fails the pass with a message.
				if (log.empty())
				{
					someMessages += aDesc.myFiles[0] + "(1): error: technique '" + technique.myName +
					                "', pass '" + pass.myName + "' does not link\n";
				}
			}
			glDeleteProgram(program);
		}
	}
	for (const GLuint shader : shaders)
	{
		glDeleteShader(shader);
	}
	return okFlag;
}

bool Compile(const EffectSource& aSource, bool aLoadedFlag, CompileOutput& anOutput)
{
	anOutput.myDependencies = aSource.GetFiles();
	if (!aLoadedFlag)
	{
		return false;
	}
	if (eglGetCurrentContext() == EGL_NO_CONTEXT)
	{
		anOutput.myMessages +=
		    aSource.GetFiles()[0] + "(1): error: compiling an effect needs a current OpenGL context\n";
		return false;
	}
	EffectDesc desc;
	if (!ParseEffect(aSource, desc, anOutput.myMessages) || !Validate(desc, anOutput.myMessages))
	{
		return false;
	}
	WriteCompiled(desc, anOutput.myCompiled);
	return true;
}
} // namespace

bool CompileFromFile(const std::string& aPath, CompileOutput& anOutput)
{
	anOutput = CompileOutput{};
	EffectSource source;
	const bool loadedFlag = source.Load(aPath, anOutput.myMessages);
	return Compile(source, loadedFlag, anOutput);
}

bool CompileFromMemory(const std::string& aSource, const std::string& aPathForIncludes,
                       CompileOutput& anOutput)
{
	anOutput = CompileOutput{};
	EffectSource source;
	const bool loadedFlag = source.LoadFromMemory(aSource, aPathForIncludes, anOutput.myMessages);
	return Compile(source, loadedFlag, anOutput);
}

bool ComputeSourceHash(const std::string& aPath, uint64_t& aHashOut, std::string& anError)
{
	anError.clear();
	EffectSource source;
	if (!source.Load(aPath, anError))
	{
		return false;
	}
	aHashOut = source.GetHash();
	return true;
}

bool ReadSourceHash(std::span<const uint8_t> someCompiled, uint64_t& aHashOut, std::string& anError)
{
	return ReadCompiledSourceHash(someCompiled, aHashOut, anError);
}
} // namespace Fx
