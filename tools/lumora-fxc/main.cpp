// lumora-fxc: compiles an effect source into its compiled form.
//
//   lumora-fxc INPUT.fx [-o OUTPUT] [--depfile FILE]
//
// The output defaults to INPUT + "al" (Vertex_PosCol.fx -> Vertex_PosCol.fxal) and
// is written through a temporary file, so a failed run never leaves a damaged
// file behind. Messages are "file(line): message" lines; the exit status is 1 on
// any error. A headless GL context compiles and links every pass for validation.
// The depfile lists the source and its includes for Ninja.

#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>

#include "core/CoreReport.h"
#include "platform/fx/Compiler.h"
#include "platform/gpu/Device.h"
#include "platform/paths/Paths.h"

namespace
{
bool WriteAtomically(const std::string& aPath, const void* someBytes, size_t aSize)
{
	const std::string target = Paths::PrepareForWrite(aPath);
	if (target.empty())
	{
		return false;
	}
	const std::string temporary = Paths::TemporaryFor(target);
	{
		std::ofstream file(temporary, std::ios::binary | std::ios::trunc);
		file.write(static_cast<const char*>(someBytes), static_cast<std::streamsize>(aSize));
		if (!file.flush())
		{
			file.close();
			std::remove(temporary.c_str());
			return false;
		}
	}
	return Paths::ReplaceWith(temporary, target);
}

// Make's escaping: spaces and '#' take a backslash, '$' doubles.
std::string DepfileEscaped(const std::string& aPath)
{
	std::string escaped;
	for (const char letter : aPath)
	{
		if (letter == ' ' || letter == '#')
		{
			escaped += '\\';
		}
		if (letter == '$')
		{
			escaped += '$';
		}
		escaped += letter;
	}
	return escaped;
}

int Usage()
{
	std::fprintf(stderr, "usage: lumora-fxc INPUT.fx [-o OUTPUT] [--depfile FILE]\n");
	return 2;
}
} // namespace

int main(int aCount, char** someArguments)
{
	std::string input;
	std::string output;
	std::string depfile;
	for (int index = 1; index < aCount; ++index)
	{
		const std::string argument = someArguments[index];
		if ((argument == "-o" || argument == "--depfile") && index + 1 < aCount)
		{
			(argument == "-o" ? output : depfile) = someArguments[++index];
		}
		else if (!argument.empty() && argument[0] != '-' && input.empty())
		{
			input = argument;
		}
		else
		{
			return Usage();
		}
	}
	if (input.empty())
	{
		return Usage();
	}
	if (output.empty())
	{
		output = input + "al";
	}

	// The GPU layer's reports (no GL context) become messages of this tool.
	CoreReport::SetCriticalHandler([](int, const char* aFunctionName, const char* aMessage) {
		std::fprintf(stderr, "lumora-fxc: %s: %s\n", aFunctionName, aMessage);
	});
	Gpu::Device device;
	if (!device.Init(64, 64))
	{
		std::fprintf(stderr, "%s(1): error: no OpenGL 4.5 core context to validate the effect with (%s)\n",
		             input.c_str(), device.GetFailureText().c_str());
		return 1;
	}
	Fx::CompileOutput result;
	const bool okFlag = Fx::CompileFromFile(input, result);
	device.Destroy();
	std::fputs(result.myMessages.c_str(), okFlag ? stdout : stderr);
	if (!okFlag)
	{
		return 1;
	}
	if (!WriteAtomically(output, result.myCompiled.data(), result.myCompiled.size()))
	{
		std::fprintf(stderr, "%s(1): error: cannot write '%s'\n", input.c_str(), output.c_str());
		return 1;
	}
	if (!depfile.empty())
	{
		// Absolute paths: the build tool reads the depfile from its own directory.
		auto absolute = [](const std::string& aPath) {
			return DepfileEscaped(std::filesystem::absolute(aPath).lexically_normal().string());
		};
		std::string text = absolute(output) + ":";
		for (const std::string& dependency : result.myDependencies)
		{
			text += " " + absolute(dependency);
		}
		text += "\n";
		if (!WriteAtomically(depfile, text.data(), text.size()))
		{
			std::fprintf(stderr, "%s(1): error: cannot write the depfile '%s'\n", input.c_str(),
			             depfile.c_str());
			return 1;
		}
	}
	return 0;
}
