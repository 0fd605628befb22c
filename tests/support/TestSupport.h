#pragma once
// Helpers shared by the test suites: scratch directories and whole-file reads.

#include <cmath>
#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

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

// Whether ../shared/testdata (real files from other exporters, beside the repository as CI has
// it) is there; a bare clone lacks it and the tests that read it skip.
bool HasSharedTestData();
#define LUMORA_SKIP_WITHOUT_SHARED_TESTDATA()                                                            \
	if (!TestSupport::HasSharedTestData())                                                               \
	GTEST_SKIP() << "../shared/testdata is absent (CI has it beside the repository)"

// The bytes of a file, or an empty string when it cannot be read.
std::string ReadWholeFile(const std::string& aPath);

// Writes the bytes to a file, replacing it.
void WriteWholeFile(const std::string& aPath, const std::string& someBytes);

// The sRGB byte that stores a linear value, as an sRGB render target or texture holds it.
inline uint8_t SrgbEncoded(float aLinear)
{
	const float encoded =
	    aLinear <= 0.0031308f ? aLinear * 12.92f : 1.055f * std::pow(aLinear, 1.0f / 2.4f) - 0.055f;
	return static_cast<uint8_t>(std::lround(encoded * 255.0f));
}

// RGBA bytes with every alpha at 255: a frame saved to be looked at, whose alpha means nothing.
inline std::vector<uint8_t> Opaque(std::vector<uint8_t> someRgba)
{
	for (size_t alpha = 3; alpha < someRgba.size(); alpha += 4)
	{
		someRgba[alpha] = 255;
	}
	return someRgba;
}
}
