#pragma once
// Format: the DXGI format numbers the engine stores in DDS files, and what the
// file layer needs to know about each: how many bytes a row, a slice and a mip
// level take, whether pixels come in 4x4 blocks, and the sRGB/typeless twins.
//
//   const Dds::Format format = Dds::Format::BC1_UNORM;
//   uint64_t rowBytes = Dds::RowPitch(format, 256);       // 64 blocks x 8 bytes
//   uint64_t mipBytes = Dds::MipSize(format, 256, 256, 1, 3);
//   Dds::Format srgb = Dds::ToSRGB(format);                // BC1_UNORM_SRGB
//
// The numbers are DXGI's own, because files carry them. Values outside the enum
// can arrive from a file; IsKnown() tells them apart and every function below
// treats them as UNKNOWN (zero sizes, "UNKNOWN" name).

#include <cstdint>

namespace Dds
{
enum class Format : uint32_t
{
	UNKNOWN = 0,
	R32G32B32A32_FLOAT = 2,
	R32G32B32_FLOAT = 6, // vertex positions
	R16G16B16A16_FLOAT = 10,
	R16G16B16A16_UNORM = 11,
	R32G32_FLOAT = 16,
	R10G10B10A2_UNORM = 24,
	R11G11B10_FLOAT = 26,
	R8G8B8A8_TYPELESS = 27,
	R8G8B8A8_UNORM = 28,
	R8G8B8A8_UNORM_SRGB = 29,
	R8G8B8A8_UINT = 30,
	R8G8B8A8_SNORM = 31,
	R8G8B8A8_SINT = 32,
	R16G16_FLOAT = 34,
	D32_FLOAT = 40,
	R32_FLOAT = 41,
	R24G8_TYPELESS = 44,   // depth buffers that shaders also read
	D24_UNORM_S8_UINT = 45,
	R24_UNORM_X8_TYPELESS = 46,
	R8G8_UNORM = 49,
	R16_FLOAT = 54,
	R8_UNORM = 61,
	BC1_TYPELESS = 70,
	BC1_UNORM = 71,
	BC1_UNORM_SRGB = 72,
	BC2_TYPELESS = 73,
	BC2_UNORM = 74,
	BC2_UNORM_SRGB = 75,
	BC3_TYPELESS = 76,
	BC3_UNORM = 77,
	BC3_UNORM_SRGB = 78,
	BC4_TYPELESS = 79, // one channel
	BC4_UNORM = 80,
	BC4_SNORM = 81,
	BC5_TYPELESS = 82, // two channels, mostly normal maps
	BC5_UNORM = 83,
	BC5_SNORM = 84,
	B8G8R8A8_UNORM = 87,
	B8G8R8X8_UNORM = 88,
	B8G8R8A8_TYPELESS = 90,
	B8G8R8A8_UNORM_SRGB = 91,
	BC6H_TYPELESS = 94, // RGB half floats
	BC6H_UF16 = 95,
	BC6H_SF16 = 96,
	BC7_TYPELESS = 97,
	BC7_UNORM = 98,
	BC7_UNORM_SRGB = 99,
};

// False for UNKNOWN and for numbers that are not members of the enum.
bool IsKnown(Format aFormat);
// "R8G8B8A8_UNORM" and so on; "UNKNOWN" for anything IsKnown() rejects.
const char* FormatName(Format aFormat);
bool IsBlockCompressed(Format aFormat);
bool IsSRGB(Format aFormat);
// Bits one pixel takes on average: 4 for BC1 and BC4, 8 for the other BC formats.
uint32_t BitsPerPixel(Format aFormat);
// Bytes of one pixel, or of one 4x4 block for block-compressed formats.
uint32_t BlockBytes(Format aFormat);

// The sRGB form of an 8-bit RGBA, BC1-BC3 or BC7 format; any other format unchanged
// (BC4, BC5 and BC6H have none).
Format ToSRGB(Format aFormat);
// The typeless form of an 8-bit RGBA or BC1-BC7 format; any other format unchanged.
Format ToTypeless(Format aFormat);

// Sizes of tightly packed data, in bytes. Block-compressed formats count whole
// 4x4 blocks, at least one per dimension. Widths and heights of 0 count as 1.
// Exact while every dimension stays within the reader's caps (16384); callers
// with larger numbers check for overflow themselves.
uint64_t RowPitch(Format aFormat, uint32_t aWidth);
// Rows of pixels, or of blocks, in an image aHeight pixels tall.
uint32_t RowCount(Format aFormat, uint32_t aHeight);
// One 2D slice.
uint64_t SlicePitch(Format aFormat, uint32_t aWidth, uint32_t aHeight);
// Level aMip of a chain whose top level is aWidth x aHeight x aDepth (every
// depth slice of a volume level included).
uint64_t MipSize(Format aFormat, uint32_t aWidth, uint32_t aHeight, uint32_t aDepth, uint32_t aMip);
// One dimension of level aMip: halved per level, never below 1.
uint32_t MipExtent(uint32_t anExtent, uint32_t aMip);
// Levels in a full chain down to 1x1x1.
uint32_t FullMipCount(uint32_t aWidth, uint32_t aHeight, uint32_t aDepth);
} // namespace Dds
