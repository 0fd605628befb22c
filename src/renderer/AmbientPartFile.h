#pragma once
// AmbientPartFile: one range of cells of one bounce of the ambient volume, baked on its own
// so that a bake can be spread over many machines and merged back, bounce by bounce, into
// the ambient.sh a whole bake writes, byte for byte.
//
//   Zeph::AmbientPart part;                    // the header and the range's seven blocks
//   part.myBounce = 2; part.myFirst = 0; part.myCount = 5000; ...
//   if (!Zeph::WriteAmbientPart("bounce2-0.part", part, problem)) { ... }
//
//   Zeph::AmbientVolume merged;
//   if (!Zeph::MergeAmbientParts(paths, expected, merged, problem)) { ... refused, says why ... }
//
// File layout, little-endian: "LMRSHPRT", the version (uint32, 1), the bounce (int32,
// 1-based), WorldSize and WorldMin (3 float32 each), the counts (3 int32), the first cell
// and the cell count (int64 each), the inputs' hash and the previous volume's hash (32
// ASCII characters each, zero-padded; the previous one empty for bounce 1), then the
// seven blocks of the range (count packed texels each, in ambient.sh's block order).
// A part ties itself to the grid, to the level's inputs and to the volume its bounce was
// lit by: parts that disagree on any of them were baked from different things and are
// never merged.
#include <cstdint>
#include <string>
#include <vector>

#include "renderer/AmbientVolumeFile.h"

namespace Zeph
{
struct AmbientPart
{
	static constexpr int ourHashLength = 32;

	int myBounce = 1;
	Vector3<float> myWorldSize{0.0f, 0.0f, 0.0f};
	Vector3<float> myWorldMin{0.0f, 0.0f, 0.0f};
	int myCounts[3] = {0, 0, 0};
	long long myFirst = 0;
	long long myCount = 0;
	std::string myInputsHash;
	std::string myPreviousHash;
	std::vector<uint32_t> myBlocks[AmbientVolume::ourBlockCount];

	long long GetCellCount() const { return static_cast<long long>(myCounts[0]) * myCounts[1] * myCounts[2]; }
};

// Written to a temporary and renamed, as ambient.sh is.
bool WriteAmbientPart(const std::string& aPath, const AmbientPart& aPart, std::string& aProblemOut);
// The header always; the blocks too unless aHeaderOnlyFlag. False, with the reason, for a
// file that is no part, is damaged or cut short.
bool ReadAmbientPart(const std::string& aPath, AmbientPart& aPartOut, std::string& aProblemOut,
                     bool aHeaderOnlyFlag = false);

// Assembles one bounce's volume from its parts. Every part must have the grid and inputs'
// hash of anExpected (its blocks are not looked at), and all must share one bounce and one
// previous volume; together they must cover every cell once. Otherwise false, with a
// message naming the file and what is wrong (another grid or other inputs, a bounce or
// previous volume that differs, two parts over the same cells, cells no part holds).
bool MergeAmbientParts(const std::vector<std::string>& somePaths, const AmbientPart& anExpected,
                       AmbientVolume& aVolumeOut, std::string& aProblemOut);
} // namespace Zeph
