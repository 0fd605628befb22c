#pragma once
// AmbientVolumeFile: the level's baked ambient light, "ambient.sh": little-endian,
// WorldSize (3 float32), WorldMin (3 float32), the probe counts nx, ny, nz (int32),
// then seven blocks of nx * ny * nz packed RGBA8 texels (cAr, cAg, cAb, cBr, cBg, cBb,
// cC; cells x fastest, then y, then z). No header beyond that: the file's size is
// 36 + 28 * N bytes.
//
//   Zeph::AmbientVolume volume;
//   std::string problem;
//   switch (Zeph::ReadAmbientVolume("data/XML/levels/x/ambient.sh", volume, problem)) { ... }
//   if (!Zeph::WriteAmbientVolume(path, volume, problem)) { ... }   // the old file is kept
#include <cstdint>
#include <string>
#include <vector>

#include "core/Vector3.h"

namespace Zeph
{
struct AmbientVolume
{
	static constexpr int ourBlockCount = 7;
	// A 3D texture may be at most this many texels along each axis.
	static constexpr int ourMaxCount = 2048;

	Vector3<float> myWorldSize{0.0f, 0.0f, 0.0f};
	Vector3<float> myWorldMin{0.0f, 0.0f, 0.0f};
	int myCounts[3] = {0, 0, 0};
	std::vector<uint32_t> myBlocks[ourBlockCount];
};

enum class AmbientVolumeRead
{
	OK,
	CANNOT_OPEN, // the file stream has said why
	DAMAGED,     // aProblemOut says what is wrong; nothing of the file is used
};

// Reads the whole file, checking its counts against its size before trusting them.
AmbientVolumeRead ReadAmbientVolume(const std::string& aPath, AmbientVolume& aVolumeOut,
                                    std::string& aProblemOut);
// Writes the whole file to a temporary in the same directory and renames it over
// aPath; false, with aProblemOut naming the file and the reason, when it cannot be
// written whole (the old file then stays as it was, byte for byte).
bool WriteAmbientVolume(const std::string& aPath, const AmbientVolume& aVolume, std::string& aProblemOut);
} // namespace Zeph
