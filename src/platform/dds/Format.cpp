#include "platform/dds/Format.h"

namespace Dds
{
namespace
{
struct Facts
{
	const char* myName;
	uint32_t myBlockBytes; // 0 when the format is not one of ours
	bool myBlockCompressedFlag;
	bool mySRGBFlag;
};

// No default: the compiler names a member added to the enum but not here.
constexpr Facts GetFacts(Format aFormat)
{
	switch (aFormat)
	{
	case Format::UNKNOWN:
		return {"UNKNOWN", 0, false, false};
	case Format::R32G32B32A32_FLOAT:
		return {"R32G32B32A32_FLOAT", 16, false, false};
	case Format::R32G32B32_FLOAT:
		return {"R32G32B32_FLOAT", 12, false, false};
	case Format::R16G16B16A16_FLOAT:
		return {"R16G16B16A16_FLOAT", 8, false, false};
	case Format::R16G16B16A16_UNORM:
		return {"R16G16B16A16_UNORM", 8, false, false};
	case Format::R32G32_FLOAT:
		return {"R32G32_FLOAT", 8, false, false};
	case Format::R10G10B10A2_UNORM:
		return {"R10G10B10A2_UNORM", 4, false, false};
	case Format::R11G11B10_FLOAT:
		return {"R11G11B10_FLOAT", 4, false, false};
	case Format::R8G8B8A8_TYPELESS:
		return {"R8G8B8A8_TYPELESS", 4, false, false};
	case Format::R8G8B8A8_UNORM:
		return {"R8G8B8A8_UNORM", 4, false, false};
	case Format::R8G8B8A8_UNORM_SRGB:
		return {"R8G8B8A8_UNORM_SRGB", 4, false, true};
	case Format::R8G8B8A8_UINT:
		return {"R8G8B8A8_UINT", 4, false, false};
	case Format::R8G8B8A8_SNORM:
		return {"R8G8B8A8_SNORM", 4, false, false};
	case Format::R8G8B8A8_SINT:
		return {"R8G8B8A8_SINT", 4, false, false};
	case Format::R16G16_FLOAT:
		return {"R16G16_FLOAT", 4, false, false};
	case Format::D32_FLOAT:
		return {"D32_FLOAT", 4, false, false};
	case Format::R32_FLOAT:
		return {"R32_FLOAT", 4, false, false};
	case Format::R24G8_TYPELESS:
		return {"R24G8_TYPELESS", 4, false, false};
	case Format::D24_UNORM_S8_UINT:
		return {"D24_UNORM_S8_UINT", 4, false, false};
	case Format::R24_UNORM_X8_TYPELESS:
		return {"R24_UNORM_X8_TYPELESS", 4, false, false};
	case Format::R8G8_UNORM:
		return {"R8G8_UNORM", 2, false, false};
	case Format::R16_FLOAT:
		return {"R16_FLOAT", 2, false, false};
	case Format::R8_UNORM:
		return {"R8_UNORM", 1, false, false};
	case Format::BC1_TYPELESS:
		return {"BC1_TYPELESS", 8, true, false};
	case Format::BC1_UNORM:
		return {"BC1_UNORM", 8, true, false};
	case Format::BC1_UNORM_SRGB:
		return {"BC1_UNORM_SRGB", 8, true, true};
	case Format::BC2_TYPELESS:
		return {"BC2_TYPELESS", 16, true, false};
	case Format::BC2_UNORM:
		return {"BC2_UNORM", 16, true, false};
	case Format::BC2_UNORM_SRGB:
		return {"BC2_UNORM_SRGB", 16, true, true};
	case Format::BC3_TYPELESS:
		return {"BC3_TYPELESS", 16, true, false};
	case Format::BC3_UNORM:
		return {"BC3_UNORM", 16, true, false};
	case Format::BC3_UNORM_SRGB:
		return {"BC3_UNORM_SRGB", 16, true, true};
	case Format::BC4_TYPELESS:
		return {"BC4_TYPELESS", 8, true, false};
	case Format::BC4_UNORM:
		return {"BC4_UNORM", 8, true, false};
	case Format::BC4_SNORM:
		return {"BC4_SNORM", 8, true, false};
	case Format::BC5_TYPELESS:
		return {"BC5_TYPELESS", 16, true, false};
	case Format::BC5_UNORM:
		return {"BC5_UNORM", 16, true, false};
	case Format::BC5_SNORM:
		return {"BC5_SNORM", 16, true, false};
	case Format::B8G8R8A8_UNORM:
		return {"B8G8R8A8_UNORM", 4, false, false};
	case Format::B8G8R8X8_UNORM:
		return {"B8G8R8X8_UNORM", 4, false, false};
	case Format::B8G8R8A8_TYPELESS:
		return {"B8G8R8A8_TYPELESS", 4, false, false};
	case Format::B8G8R8A8_UNORM_SRGB:
		return {"B8G8R8A8_UNORM_SRGB", 4, false, true};
	case Format::BC6H_TYPELESS:
		return {"BC6H_TYPELESS", 16, true, false};
	case Format::BC6H_UF16:
		return {"BC6H_UF16", 16, true, false};
	case Format::BC6H_SF16:
		return {"BC6H_SF16", 16, true, false};
	case Format::BC7_TYPELESS:
		return {"BC7_TYPELESS", 16, true, false};
	case Format::BC7_UNORM:
		return {"BC7_UNORM", 16, true, false};
	case Format::BC7_UNORM_SRGB:
		return {"BC7_UNORM_SRGB", 16, true, true};
	}
	// A number read from a file that names none of the members.
	return {"UNKNOWN", 0, false, false};
}
} // namespace

bool IsKnown(Format aFormat)
{
	return GetFacts(aFormat).myBlockBytes != 0;
}

const char* FormatName(Format aFormat)
{
	return GetFacts(aFormat).myName;
}

bool IsBlockCompressed(Format aFormat)
{
	return GetFacts(aFormat).myBlockCompressedFlag;
}

bool IsSRGB(Format aFormat)
{
	return GetFacts(aFormat).mySRGBFlag;
}

uint32_t BitsPerPixel(Format aFormat)
{
	const Facts facts = GetFacts(aFormat);
	return facts.myBlockCompressedFlag ? facts.myBlockBytes * 8 / 16 : facts.myBlockBytes * 8;
}

uint32_t BlockBytes(Format aFormat)
{
	return GetFacts(aFormat).myBlockBytes;
}

Format ToSRGB(Format aFormat)
{
	switch (aFormat)
	{
	case Format::R8G8B8A8_TYPELESS:
	case Format::R8G8B8A8_UNORM:
	case Format::R8G8B8A8_UINT:
	case Format::R8G8B8A8_SNORM:
	case Format::R8G8B8A8_SINT:
		return Format::R8G8B8A8_UNORM_SRGB;
	case Format::BC1_TYPELESS:
	case Format::BC1_UNORM:
		return Format::BC1_UNORM_SRGB;
	case Format::BC2_TYPELESS:
	case Format::BC2_UNORM:
		return Format::BC2_UNORM_SRGB;
	case Format::BC3_TYPELESS:
	case Format::BC3_UNORM:
		return Format::BC3_UNORM_SRGB;
	case Format::BC7_TYPELESS:
	case Format::BC7_UNORM:
		return Format::BC7_UNORM_SRGB;
	default:
		return aFormat;
	}
}

Format ToTypeless(Format aFormat)
{
	switch (aFormat)
	{
	case Format::R8G8B8A8_UNORM:
	case Format::R8G8B8A8_UNORM_SRGB:
	case Format::R8G8B8A8_UINT:
	case Format::R8G8B8A8_SNORM:
	case Format::R8G8B8A8_SINT:
		return Format::R8G8B8A8_TYPELESS;
	case Format::BC1_UNORM:
	case Format::BC1_UNORM_SRGB:
		return Format::BC1_TYPELESS;
	case Format::BC2_UNORM:
	case Format::BC2_UNORM_SRGB:
		return Format::BC2_TYPELESS;
	case Format::BC3_UNORM:
	case Format::BC3_UNORM_SRGB:
		return Format::BC3_TYPELESS;
	case Format::BC4_UNORM:
	case Format::BC4_SNORM:
		return Format::BC4_TYPELESS;
	case Format::BC5_UNORM:
	case Format::BC5_SNORM:
		return Format::BC5_TYPELESS;
	case Format::BC6H_UF16:
	case Format::BC6H_SF16:
		return Format::BC6H_TYPELESS;
	case Format::BC7_UNORM:
	case Format::BC7_UNORM_SRGB:
		return Format::BC7_TYPELESS;
	default:
		return aFormat;
	}
}

uint64_t RowPitch(Format aFormat, uint32_t aWidth)
{
	const uint64_t width = aWidth == 0 ? 1 : aWidth;
	const Facts facts = GetFacts(aFormat);
	const uint64_t units = facts.myBlockCompressedFlag ? (width + 3) / 4 : width;
	return units * facts.myBlockBytes;
}

uint32_t RowCount(Format aFormat, uint32_t aHeight)
{
	const uint32_t height = aHeight == 0 ? 1 : aHeight;
	return IsBlockCompressed(aFormat) ? height / 4 + (height % 4 != 0 ? 1 : 0) : height;
}

uint64_t SlicePitch(Format aFormat, uint32_t aWidth, uint32_t aHeight)
{
	return RowPitch(aFormat, aWidth) * RowCount(aFormat, aHeight);
}

uint32_t MipExtent(uint32_t anExtent, uint32_t aMip)
{
	const uint32_t extent = aMip >= 32 ? 0 : anExtent >> aMip;
	return extent == 0 ? 1 : extent;
}

uint64_t MipSize(Format aFormat, uint32_t aWidth, uint32_t aHeight, uint32_t aDepth, uint32_t aMip)
{
	return SlicePitch(aFormat, MipExtent(aWidth, aMip), MipExtent(aHeight, aMip)) * MipExtent(aDepth, aMip);
}

uint32_t FullMipCount(uint32_t aWidth, uint32_t aHeight, uint32_t aDepth)
{
	uint32_t largest = aWidth > aHeight ? aWidth : aHeight;
	largest = largest > aDepth ? largest : aDepth;
	uint32_t count = 1;
	while (largest > 1)
	{
		largest >>= 1;
		++count;
	}
	return count;
}
} // namespace Dds
