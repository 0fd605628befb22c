#pragma once
// EffectSource: an effect source with its #include lines replaced by the files
// they name, and where every line of the result came from.
//
//   Fx::EffectSource source;
//   std::string errors;
//   if (!source.Load("data/Shaders/Misc/Vertex_PosCol.fx", errors)) { ... "file(line): message" ... }
//   source.GetLocation(offset);   // "data/Shaders/Common/Transforms.fxh(12)"
//
// Includes are textual and relative to the including file; each path component is
// matched case-insensitively (Paths::Resolve). Only `#include "path"` lines are
// handled here; every other directive is left for the GLSL compiler. The source
// hash runs FNV-1a over the format version and then the bytes of every file in the
// order they are included, so a change to any include makes compiled files stale.

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace Fx
{
// Assembled GLSL numbers the lines of file k as k * ourIncludeLineStride + line
// (#line directives), so a driver's message names the file through its line alone.
constexpr unsigned long ourIncludeLineStride = 100000;

class EffectSource
{
public:
	struct LineOrigin
	{
		int myFile = 0; // index into GetFiles()
		int myLine = 1;
	};

	bool Load(const std::string& aPath, std::string& someErrors);
	// aPath names the text in messages; includes resolve relative to its directory.
	bool LoadFromMemory(const std::string& aText, const std::string& aPath, std::string& someErrors);

	const std::string& GetText() const { return myText; }
	// The source path first, then every distinct include as it was resolved.
	const std::vector<std::string>& GetFiles() const { return myFiles; }
	uint64_t GetHash() const { return myHash; }

	LineOrigin GetOrigin(size_t anOffset) const;
	// "file(line)" for a character offset of GetText().
	std::string GetLocation(size_t anOffset) const;
	// The origin of every line of the text, for emitting #line directives.
	const std::vector<LineOrigin>& GetLineOrigins() const { return myLineOrigins; }
	const std::vector<size_t>& GetLineStarts() const { return myLineStarts; }

private:
	bool Expand(const std::string& aText, int aFile, std::vector<int>& someOpenFiles,
	            std::string& someErrors);
	int AddFile(const std::string& aPath);

	std::string myText;
	std::vector<std::string> myFiles;
	std::vector<LineOrigin> myLineOrigins;
	std::vector<size_t> myLineStarts;
	uint64_t myHash = 0;
};

// Reads a whole file; false when it cannot be opened.
bool ReadWholeFile(const std::string& aPath, std::string& aTextOut);
} // namespace Fx
