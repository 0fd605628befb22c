#pragma once
// ImageInfo: what a DDS file says about the texture it holds, before any pixel
// is read. GetImageInfoFromFile() fills it; Image::Init() takes one to lay out
// memory; SaveToFile() writes it back.
//
//   Dds::ImageInfo info;
//   std::string error;
//   if (Dds::GetImageInfoFromFile("data/Cubemaps/1.dds", info, error) && info.IsCube()) { ... }
//
// The numbers keep Direct3D's meanings, because the GPU layer takes them as
// they are: a cube is a 2D texture with ArraySize 6 (6 per cube of an array)
// and the TEXTURECUBE misc flag; a volume has ArraySize 1 and a Depth.

#include <cstdint>

#include "platform/dds/Format.h"

namespace Dds
{
// Direct3D's D3D11_RESOURCE_DIMENSION numbers.
enum class ResourceDimension : uint32_t
{
	Unknown = 0,
	Texture1D = 2,
	Texture2D = 3,
	Texture3D = 4,
};

// D3D11_RESOURCE_MISC_TEXTURECUBE.
constexpr uint32_t MiscTextureCube = 0x4;

// D3DX's image file format numbers; only DDS is read and written here.
enum class ImageFileFormat : uint32_t
{
	Dds = 4,
};

struct ImageInfo
{
	uint32_t myWidth = 0;
	uint32_t myHeight = 0;
	uint32_t myDepth = 1;
	uint32_t myArraySize = 1;
	uint32_t myMipLevels = 1;
	uint32_t myMiscFlags = 0;
	Format myFormat = Format::UNKNOWN;
	ResourceDimension myResourceDimension = ResourceDimension::Texture2D;
	ImageFileFormat myImageFileFormat = ImageFileFormat::Dds;

	bool IsCube() const { return (myMiscFlags & MiscTextureCube) != 0; }
	bool IsVolume() const { return myResourceDimension == ResourceDimension::Texture3D; }

	bool operator==(const ImageInfo&) const = default;
};
} // namespace Dds
