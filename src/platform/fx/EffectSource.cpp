#include "platform/fx/EffectSource.h"

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <sstream>

#include "platform/fx/CompiledFormat.h"
#include "platform/fx/Fnv1a.h"
#include "platform/paths/Paths.h"

namespace Fx
{
namespace
{
constexpr size_t ourMaxIncludeDepth = 32;

std::string DirectoryOf(const std::string& aPath)
{
	const size_t slash = aPath.find_last_of('/');
	return slash == std::string::npos ? std::string() : aPath.substr(0, slash + 1);
}

// The quoted path of an `#include "path"` line, or false when the line is no include.
// aBadFlag is set for an #include whose argument is not a quoted path.
bool ParseInclude(const std::string& aLine, std::string& aPathOut, bool& aBadFlag)
{
	size_t at = aLine.find_first_not_of(" \t");
	if (at == std::string::npos || aLine[at] != '#')
	{
		return false;
	}
	at = aLine.find_first_not_of(" \t", at + 1);
	if (at == std::string::npos || aLine.compare(at, 7, "include") != 0)
	{
		return false;
	}
	at = aLine.find_first_not_of(" \t", at + 7);
	const size_t close = at == std::string::npos ? std::string::npos : aLine.find('"', at + 1);
	if (at == std::string::npos || aLine[at] != '"' || close == std::string::npos || close == at + 1)
	{
		aBadFlag = true;
		return true;
	}
	aPathOut = aLine.substr(at + 1, close - at - 1);
	return true;
}
} // namespace

bool ReadWholeFile(const std::string& aPath, std::string& aTextOut)
{
	std::ifstream file(aPath, std::ios::binary);
	if (!file)
	{
		return false;
	}
	std::ostringstream text;
	text << file.rdbuf();
	aTextOut = text.str();
	return !file.bad();
}

bool EffectSource::Load(const std::string& aPath, std::string& someErrors)
{
	std::string text;
	if (!ReadWholeFile(Paths::Resolve(aPath), text))
	{
		someErrors += aPath + "(1): error: cannot read the effect source\n";
		return false;
	}
	return LoadFromMemory(text, aPath, someErrors);
}

bool EffectSource::LoadFromMemory(const std::string& aText, const std::string& aPath, std::string& someErrors)
{
	myText.clear();
	myFiles.clear();
	myLineOrigins.clear();
	myLineStarts.clear();
	const uint32_t version = ourCompiledFormatVersion;
	const uint8_t versionBytes[4] = {static_cast<uint8_t>(version), static_cast<uint8_t>(version >> 8),
	                                 static_cast<uint8_t>(version >> 16),
	                                 static_cast<uint8_t>(version >> 24)};
	myHash = Fnv1a(versionBytes, 4);
	std::vector<int> openFiles;
	// Files are named as resolved, so that a cycle through another spelling of a path is still seen.
	const bool okFlag = Expand(aText, AddFile(Paths::Resolve(aPath)), openFiles, someErrors);
	size_t start = 0;
	while (start <= myText.size())
	{
		myLineStarts.push_back(start);
		const size_t end = myText.find('\n', start);
		if (end == std::string::npos)
		{
			break;
		}
		start = end + 1;
	}
	myLineOrigins.resize(myLineStarts.size(), myLineOrigins.empty() ? LineOrigin{} : myLineOrigins.back());
	return okFlag;
}

int EffectSource::AddFile(const std::string& aPath)
{
	const auto found = std::find(myFiles.begin(), myFiles.end(), aPath);
	if (found != myFiles.end())
	{
		return static_cast<int>(found - myFiles.begin());
	}
	myFiles.push_back(aPath);
	return static_cast<int>(myFiles.size()) - 1;
}

bool EffectSource::Expand(const std::string& aText, int aFile, std::vector<int>& someOpenFiles,
                          std::string& someErrors)
{
	myHash = Fnv1a(aText.data(), aText.size(), myHash);
	someOpenFiles.push_back(aFile);
	bool okFlag = true;
	bool inCommentFlag = false;
	size_t start = 0;
	for (int line = 1; start < aText.size() || (start == aText.size() && line == 1); ++line)
	{
		const size_t end = std::min(aText.find('\n', start), aText.size());
		const std::string text = aText.substr(start, end - start);
		start = end + 1;
		std::string includePath;
		bool badFlag = false;
		if (!inCommentFlag && ParseInclude(text, includePath, badFlag))
		{
			const std::string where =
			    myFiles[static_cast<size_t>(aFile)] + "(" + std::to_string(line) + "): ";
			if (badFlag)
			{
				someErrors += where + "error: #include needs a quoted path: " + text + "\n";
				okFlag = false;
				continue;
			}
			const std::string joined = DirectoryOf(myFiles[static_cast<size_t>(aFile)]) + includePath;
			const std::string path =
			    Paths::Resolve(std::filesystem::path(joined).lexically_normal().string());
			std::string included;
			if (!ReadWholeFile(path, included))
			{
				someErrors +=
				    where + "error: cannot open include file '" + includePath + "' (" + path + ")\n";
				okFlag = false;
				continue;
			}
			const int file = AddFile(path);
			if (someOpenFiles.size() >= ourMaxIncludeDepth)
			{
				someErrors += where + "error: includes nested deeper than " +
				              std::to_string(ourMaxIncludeDepth) + " files\n";
				okFlag = false;
				continue;
			}
			if (std::find(someOpenFiles.begin(), someOpenFiles.end(), file) != someOpenFiles.end())
			{
				std::string cycle;
				for (const int open : someOpenFiles)
				{
					cycle += myFiles[static_cast<size_t>(open)] + " -> ";
				}
				someErrors += where + "error: include cycle: " + cycle + path + "\n";
				okFlag = false;
				continue;
			}
			okFlag = Expand(included, file, someOpenFiles, someErrors) && okFlag;
			continue;
		}
		// Block comments decide whether a later '#include' line is real.
		for (size_t at = 0; at + 1 < text.size(); ++at)
		{
			if (!inCommentFlag && text[at] == '/' && text[at + 1] == '/')
			{
				break;
			}
			if (!inCommentFlag && text[at] == '/' && text[at + 1] == '*')
			{
				inCommentFlag = true;
				++at;
			}
			else if (inCommentFlag && text[at] == '*' && text[at + 1] == '/')
			{
				inCommentFlag = false;
				++at;
			}
		}
		myText += text;
		myText += '\n';
		myLineOrigins.push_back({aFile, line});
	}
	someOpenFiles.pop_back();
	return okFlag;
}

EffectSource::LineOrigin EffectSource::GetOrigin(size_t anOffset) const
{
	const auto after = std::upper_bound(myLineStarts.begin(), myLineStarts.end(), anOffset);
	const size_t line =
	    after == myLineStarts.begin() ? 0 : static_cast<size_t>(after - myLineStarts.begin()) - 1;
	return line < myLineOrigins.size() ? myLineOrigins[line] : LineOrigin{};
}

std::string EffectSource::GetLocation(size_t anOffset) const
{
	const LineOrigin origin = GetOrigin(anOffset);
	const std::string& file = myFiles.empty() ? std::string() : myFiles[static_cast<size_t>(origin.myFile)];
	return file + "(" + std::to_string(origin.myLine) + ")";
}
} // namespace Fx
