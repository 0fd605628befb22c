#pragma once
// DecalTextures: the procedural decal images, an albedo with alpha and a matching normal map per kind.
//
//   Dds::Image image;
//   std::string error;
//   if (!Content::BakeDecalMap(Content::DecalKind::Hazard, Content::MapKind::Albedo, image, error)) { ... }
//   Dds::SaveToFile(outDir + "/textures/" + Content::DecalTextureFileName(kind, map), image, error);
//
// The formats are those of the material maps (TextureBaker.h): 256 x 256 RGBA8 with a full mip chain,
// the albedo sRGB-encoded (R8G8B8A8_UNORM_SRGB) with a linear alpha that is 0 outside the shape, the
// normal map R8G8B8A8_UNORM in tangent space (x along u, y towards the image's top row) with the height
// it was made from in alpha. Outside the shape the normal map is flat. The albedo's mips average the
// colour weighted by alpha, so the transparent surroundings never darken the shape's edge when the
// decal is seen from far away. The images do not tile: their rim stays transparent.

#include <array>
#include <cstdint>
#include <string>

#include "TextureBaker.h"
#include "platform/dds/Image.h"

namespace Content
{
enum class DecalKind
{
	Brick,  // a patch of bricks where the plaster has broken away; the editor's default decal type
	Hazard, // a sign plate with yellow and black stripes
	Target, // a round emblem of red and white rings
	Crack,  // a branching crack with chipped edges
	Stain,  // a grime stain with drips running down
	Arrow   // a worn painted arrow pointing to the image's top
};

constexpr std::array<DecalKind, 6> ourDecalKinds = {DecalKind::Brick, DecalKind::Hazard, DecalKind::Target,
                                                    DecalKind::Crack, DecalKind::Stain,  DecalKind::Arrow};

constexpr uint32_t ourDecalMapSize = 256;

// "brick", "hazard", "target", "crack", "stain", "arrow": the decal type's name in the catalogue.
const char* DecalName(DecalKind aKind);
// "decal_brick_albedo.dds", "decal_brick_normal.dds"; only the albedo and normal maps exist.
std::string DecalTextureFileName(DecalKind aKind, MapKind aMap);

// aMap is MapKind::Albedo or MapKind::Normal; any other map is an error.
bool BakeDecalMap(DecalKind aKind, MapKind aMap, Dds::Image& anImageOut, std::string& anErrorOut);
} // namespace Content
