#pragma once
// TextureBaker: samples a procedural material into the four DDS maps a lit model reads.
//
//   Dds::Image image;
//   std::string error;
//   if (!Content::BakeMap(Content::MaterialKind::Bricks, Content::MapKind::Normal, image, error)) { ... }
//   Dds::SaveToFile(outDir + "/textures/" + Content::TextureFileName(kind, map), image, error);
//
// Every map is RGBA8 with a full mip chain down to 1x1, its mips averaged in linear values.
// The model importer binds the albedo, roughness and occlusion maps with sRGB views, so those three
// hold sRGB-encoded bytes and say so (R8G8B8A8_UNORM_SRGB): sampling gives back the linear colour,
// roughness and occlusion. Roughness and occlusion are grey levels with alpha 1. The normal map
// (R8G8B8A8_UNORM, bound without sRGB) is in tangent space, x along the texture's u and y along
// its v as COLLADA counts it (v up, towards the image's top row), so a shader builds
// normal = x * tangent + y * binormal + z * normal with the model's TEXTANGENT and TEXBINORMAL;
// its alpha holds the height it was made from.

#include <cstdint>
#include <string>

#include "Materials.h"
#include "platform/dds/Image.h"

namespace Content
{
enum class MapKind
{
	Albedo,
	Normal,
	Roughness,
	Occlusion
};

// "albedo", "normal", "roughness", "ao".
const char* MapSuffix(MapKind aMap);
// The width and height of level 0: 256 for albedo and normal maps, 128 for the grey maps.
uint32_t MapSize(MapKind aMap);
// "bricks_albedo.dds" and so on.
std::string TextureFileName(MaterialKind aMaterial, MapKind aMap);

bool BakeMap(MaterialKind aMaterial, MapKind aMap, Dds::Image& anImageOut, std::string& anErrorOut);
} // namespace Content
