#pragma once
// EnvironmentMaps: the generated cube maps, R16G16B16A16_FLOAT in the layout of CubeFaces.h.
//
//   Dds::Image image;
//   std::string error;
//   if (!Content::BuildFallbackCubemap(image, error)) { ... }
//   Dds::SaveToFile(outDir + "/Cubemaps/cubemap.dds", image, error);
//
// The fallback cube map is the reflection a room gets before one is captured for it: a neutral
// interior with a soft light overhead (1.0 straight up, falling to the walls' 0.25 at the horizon)
// and a darker floor (0.08 straight down), grey in all three channels, alpha 1. It has a full mip
// chain, each level the 2x2 box average of the one above (computed before rounding to halves), so
// the 1x1 level of a face is that face's mean.
//
// The normal test cube map stores in each texel its own unit direction (x, y, z, 1), which shows
// at a glance whether a sampler and a shader agree with the face layout.

#include <cstdint>
#include <string>

#include "platform/dds/Image.h"

namespace Content
{
// The face size of both maps.
constexpr uint32_t ourCubemapSize = 256;

// Radiance of the fallback interior seen along the unit direction (anX, aY, aZ); y is up.
double InteriorRadiance(double anX, double aY, double aZ);

bool BuildFallbackCubemap(Dds::Image& anImageOut, std::string& anErrorOut);
bool BuildNormalTestCubemap(Dds::Image& anImageOut, std::string& anErrorOut);
} // namespace Content
