#pragma once
// MipChain: what the material and decal texture bakers share: a mip level held as
// doubles (linear colour and alpha, or a unit normal and height), the sRGB transfer
// functions, the box-filtered next level, and the whole chain stored as an RGBA8 DDS.
//
//   Content::MipLevel level = ...;   // level 0, mySize x mySize texels
//   Content::BakeMipChain(std::move(level), false, false, image, error);
#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "platform/dds/Image.h"

namespace Content
{
struct MipLevel
{
	uint32_t mySize = 0;
	std::vector<std::array<double, 4>> myTexels;
};

double SrgbToLinear(double aValue);
double LinearToSrgb(double aValue);
// 0..1 to a byte, rounded.
uint8_t ToByte(double aValue);

// Half the size, each texel the mean of four. Normals (aNormalFlag) are renormalised;
// with aCoverageWeightedFlag colour is averaged by alpha, so transparent texels do not
// bleed into the edge of what covers.
MipLevel Downsample(const MipLevel& aLevel, bool aNormalFlag, bool aCoverageWeightedFlag);

// Every mip from level 0 down to 1 x 1 into anImageOut: R8G8B8A8_UNORM for normals
// (x, y, z mapped to 0..1, height in alpha), R8G8B8A8_UNORM_SRGB otherwise.
bool BakeMipChain(MipLevel aLevelZero, bool aNormalFlag, bool aCoverageWeightedFlag, Dds::Image& anImageOut,
                  std::string& anErrorOut);
} // namespace Content
