#pragma once
// Compiler: turns an effect source (.fx) into its compiled form (.fxal), the
// library behind lumora-fxc.
//
//   Fx::CompileOutput output;
//   if (!Fx::CompileFromFile("data/Shaders/Misc/Vertex_PosCol.fx", output))
//       std::fputs(output.myMessages.c_str(), stderr);   // "file(line): error: ..." lines
//   else
//       ... write output.myCompiled to "data/Shaders/Misc/Vertex_PosCol.fxal" ...
//
// Compiling needs a current OpenGL 4.5 context: every stage is compiled and every
// pass linked, so a compiled file is known to load. Messages name the source or
// the include a problem is in, with its line. The staleness check compares the
// hash a compiled file carries with the hash of the sources as they are now:
//
//   uint64_t now = 0, stored = 0;
//   Fx::ComputeSourceHash("data/x.fx", now, error) && Fx::ReadSourceHash(bytes, stored, error) && now ==
//   stored

#include <cstdint>
#include <span>
#include <string>
#include <vector>

namespace Fx
{
struct CompileOutput
{
	std::vector<uint8_t> myCompiled;
	std::string myMessages;                  // errors, or warnings on success
	std::vector<std::string> myDependencies; // the source and every include, as resolved
};

bool CompileFromFile(const std::string& aPath, CompileOutput& anOutput);
// aPathForIncludes names the source in messages; includes resolve relative to its directory.
bool CompileFromMemory(const std::string& aSource, const std::string& aPathForIncludes,
                       CompileOutput& anOutput);

// The source hash a compiled file of aPath would carry now; false with anError when
// the source or an include cannot be read.
bool ComputeSourceHash(const std::string& aPath, uint64_t& aHashOut, std::string& anError);
bool ReadSourceHash(std::span<const uint8_t> someCompiled, uint64_t& aHashOut, std::string& anError);
} // namespace Fx
