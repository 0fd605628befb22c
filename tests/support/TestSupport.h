#pragma once
// Helpers shared by the test suites: scratch directories and whole-file reads.

#include <filesystem>
#include <string>

namespace TestSupport
{
// A fresh empty directory under the system's temporary directory, removed when
// the object goes out of scope.
class ScratchDir
{
public:
	ScratchDir();
	~ScratchDir();
	ScratchDir(const ScratchDir&) = delete;
	ScratchDir& operator=(const ScratchDir&) = delete;

	const std::filesystem::path& Path() const { return myPath; }
	// Path of a file inside the directory, as a string.
	std::string File(const std::string& aName) const { return (myPath / aName).string(); }

private:
	std::filesystem::path myPath;
};

// The bytes of a file, or an empty string when it cannot be read.
std::string ReadWholeFile(const std::string& aPath);

// Writes the bytes to a file, replacing it.
void WriteWholeFile(const std::string& aPath, const std::string& someBytes);
}
