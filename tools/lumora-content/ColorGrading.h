#pragma once
// ColorGrading: the colour-grading lookups, 32x32x32 volumes of R8G8B8A8_UNORM (one mip).
//
//   Dds::Image image;
//   std::string error;
//   if (Content::BuildGradingLookup(Content::GradingKind::Warm, image, error))
//   {
//       Dds::SaveToFile(outDir + "/grading/" + Content::GradingFileName(Content::GradingKind::Warm), image,
//                       error);
//   }
//
// A lookup is indexed by an sRGB-encoded colour and holds the graded sRGB-encoded colour: red runs
// along x, green down the rows, blue through the depth slices, index i standing for i / 31. Alpha
// is 255. The format is not sRGB because the shader wants the encoded values as they are.
//
// Neutral is the identity (texel (r, g, b) = round(i / 31 * 255) per channel). Warm lifts the
// shadows a little, adds a little saturation and warms the highlights; each output channel still
// grows with its own input channel.

#include <cstdint>
#include <string>

#include "platform/dds/Image.h"

namespace Content
{
constexpr uint32_t ourGradingSize = 32;

enum class GradingKind
{
	Neutral,
	Warm
};

// "default.dds" for the identity, "warm.dds".
const char* GradingFileName(GradingKind aKind);
bool BuildGradingLookup(GradingKind aKind, Dds::Image& anImageOut, std::string& anErrorOut);
} // namespace Content
