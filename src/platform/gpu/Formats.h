#pragma once
// Formats: what a DXGI format number means to OpenGL.
//
//   const Gpu::FormatInfo info = Gpu::GetFormatInfo(aFormat);
//   if (!info.IsSupported()) { ... report, refuse ... }
//   glTextureStorage2D(name, mips, info.myInternalFormat, width, height);
//   glTextureSubImage2D(name, 0, 0, 0, width, height, info.myUploadFormat, info.myUploadType, data);
//
// Formats keep their DXGI numbers because files store them; the platform layer
// has one type for them, Dds::Format, so a format read from a file reaches a
// texture unchanged. Memory layouts match Direct3D's: B8G8R8A8 uploads and
// reads as GL_BGRA, so bytes in memory mean the same under both.
//
// One layout differs: D24_UNORM_S8_UINT keeps depth in the low 24 bits under
// Direct3D and in the high 24 bits under GL_UNSIGNED_INT_24_8. Depth is rendered,
// never uploaded or saved, so the difference is left alone.

#include <cstdint>
#include <epoxy/gl.h>

#include "platform/dds/Format.h"

namespace Gpu
{
struct FormatInfo
{
	GLenum myInternalFormat = 0; // 0: no GL equivalent
	GLenum myUploadFormat = 0;   // pixel-transfer format (unused for compressed formats)
	GLenum myUploadType = 0;
	uint32_t myBlockBytes = 0; // bytes per pixel, or per 4x4 block when compressed
	uint32_t myBlockSize = 1;  // 4 for block-compressed formats
	bool myCompressedFlag = false;
	bool myDepthFlag = false;
	bool myStencilFlag = false;
	bool mySrgbFlag = false;
	bool myFloatFlag = false; // reads back as floats

	constexpr bool IsSupported() const { return myInternalFormat != 0; }
	// Bytes in one tightly packed row of blocks (of pixels when uncompressed).
	constexpr uint32_t RowBytes(uint32_t aWidth) const
	{
		return (aWidth + myBlockSize - 1) / myBlockSize * myBlockBytes;
	}
	// Rows of blocks in an image aHeight pixels tall.
	constexpr uint32_t BlockRows(uint32_t aHeight) const { return (aHeight + myBlockSize - 1) / myBlockSize; }
};

namespace Detail
{
constexpr FormatInfo Plain(GLenum anInternal, GLenum aFormat, GLenum aType, uint32_t someBytes)
{
	FormatInfo info;
	info.myInternalFormat = anInternal;
	info.myUploadFormat = aFormat;
	info.myUploadType = aType;
	info.myBlockBytes = someBytes;
	info.mySrgbFlag = anInternal == GL_SRGB8_ALPHA8;
	info.myFloatFlag =
	    aType == GL_FLOAT || aType == GL_HALF_FLOAT || aType == GL_UNSIGNED_INT_10F_11F_11F_REV;
	return info;
}

constexpr FormatInfo Block(GLenum anInternal, uint32_t someBytes, bool anSrgbFlag)
{
	FormatInfo info;
	info.myInternalFormat = anInternal;
	info.myBlockBytes = someBytes;
	info.myBlockSize = 4;
	info.myCompressedFlag = true;
	info.mySrgbFlag = anSrgbFlag;
	return info;
}

constexpr FormatInfo Depth(GLenum anInternal, GLenum aFormat, GLenum aType, bool aStencilFlag)
{
	FormatInfo info = Plain(anInternal, aFormat, aType, 4);
	info.myDepthFlag = true;
	info.myStencilFlag = aStencilFlag;
	info.myFloatFlag = false;
	return info;
}
} // namespace Detail

// The GL description of a DXGI format; a default FormatInfo (IsSupported() false)
// for numbers the engine does not use. A default is needed here, unlike in the
// layer's own enums: the numbers come from files and can be anything.
constexpr FormatInfo GetFormatInfo(Dds::Format aFormat)
{
	using namespace Detail;
	switch (aFormat)
	{
	case Dds::Format::R32G32B32A32_FLOAT:
		return Plain(GL_RGBA32F, GL_RGBA, GL_FLOAT, 16);
	case Dds::Format::R16G16B16A16_FLOAT:
		return Plain(GL_RGBA16F, GL_RGBA, GL_HALF_FLOAT, 8);
	case Dds::Format::R10G10B10A2_UNORM:
		return Plain(GL_RGB10_A2, GL_RGBA, GL_UNSIGNED_INT_2_10_10_10_REV, 4);
	case Dds::Format::R11G11B10_FLOAT:
		return Plain(GL_R11F_G11F_B10F, GL_RGB, GL_UNSIGNED_INT_10F_11F_11F_REV, 4);
	case Dds::Format::R8G8B8A8_TYPELESS: // storage that UNORM and UNORM_SRGB views share
	case Dds::Format::R8G8B8A8_UNORM:
		return Plain(GL_RGBA8, GL_RGBA, GL_UNSIGNED_BYTE, 4);
	case Dds::Format::R8G8B8A8_UNORM_SRGB:
		return Plain(GL_SRGB8_ALPHA8, GL_RGBA, GL_UNSIGNED_BYTE, 4);
	case Dds::Format::R16G16_FLOAT:
		return Plain(GL_RG16F, GL_RG, GL_HALF_FLOAT, 4);
	case Dds::Format::D32_FLOAT:
		return Depth(GL_DEPTH_COMPONENT32F, GL_DEPTH_COMPONENT, GL_FLOAT, false);
	case Dds::Format::R32_FLOAT:
		return Plain(GL_R32F, GL_RED, GL_FLOAT, 4);
	case Dds::Format::R24G8_TYPELESS:        // storage of a depth buffer that shaders read
	case Dds::Format::R24_UNORM_X8_TYPELESS: // its depth as a texture
	case Dds::Format::D24_UNORM_S8_UINT:
		return Depth(GL_DEPTH24_STENCIL8, GL_DEPTH_STENCIL, GL_UNSIGNED_INT_24_8, true);
	case Dds::Format::R16_FLOAT:
		return Plain(GL_R16F, GL_RED, GL_HALF_FLOAT, 2);
	case Dds::Format::R8_UNORM:
		return Plain(GL_R8, GL_RED, GL_UNSIGNED_BYTE, 1);
	case Dds::Format::BC1_TYPELESS: // storage that UNORM and UNORM_SRGB views share
	case Dds::Format::BC1_UNORM: // Direct3D's BC1 always has a 1-bit alpha
		return Block(GL_COMPRESSED_RGBA_S3TC_DXT1_EXT, 8, false);
	case Dds::Format::BC1_UNORM_SRGB:
		return Block(GL_COMPRESSED_SRGB_ALPHA_S3TC_DXT1_EXT, 8, true);
	case Dds::Format::BC2_TYPELESS: // storage that UNORM and UNORM_SRGB views share
	case Dds::Format::BC2_UNORM:
		return Block(GL_COMPRESSED_RGBA_S3TC_DXT3_EXT, 16, false);
	case Dds::Format::BC2_UNORM_SRGB:
		return Block(GL_COMPRESSED_SRGB_ALPHA_S3TC_DXT3_EXT, 16, true);
	case Dds::Format::BC3_TYPELESS: // storage that UNORM and UNORM_SRGB views share
	case Dds::Format::BC3_UNORM:
		return Block(GL_COMPRESSED_RGBA_S3TC_DXT5_EXT, 16, false);
	case Dds::Format::BC3_UNORM_SRGB:
		return Block(GL_COMPRESSED_SRGB_ALPHA_S3TC_DXT5_EXT, 16, true);
	case Dds::Format::BC4_TYPELESS: // storage that UNORM and SNORM views share
	case Dds::Format::BC4_UNORM:
		return Block(GL_COMPRESSED_RED_RGTC1, 8, false);
	case Dds::Format::BC4_SNORM:
		return Block(GL_COMPRESSED_SIGNED_RED_RGTC1, 8, false);
	case Dds::Format::BC5_TYPELESS: // storage that UNORM and SNORM views share
	case Dds::Format::BC5_UNORM:
		return Block(GL_COMPRESSED_RG_RGTC2, 16, false);
	case Dds::Format::BC5_SNORM:
		return Block(GL_COMPRESSED_SIGNED_RG_RGTC2, 16, false);
	case Dds::Format::BC6H_TYPELESS: // storage that UF16 and SF16 views share
	case Dds::Format::BC6H_UF16:
		return Block(GL_COMPRESSED_RGB_BPTC_UNSIGNED_FLOAT, 16, false);
	case Dds::Format::BC6H_SF16:
		return Block(GL_COMPRESSED_RGB_BPTC_SIGNED_FLOAT, 16, false);
	case Dds::Format::BC7_TYPELESS: // storage that UNORM and UNORM_SRGB views share
	case Dds::Format::BC7_UNORM:
		return Block(GL_COMPRESSED_RGBA_BPTC_UNORM, 16, false);
	case Dds::Format::BC7_UNORM_SRGB:
		return Block(GL_COMPRESSED_SRGB_ALPHA_BPTC_UNORM, 16, true);
	case Dds::Format::B8G8R8A8_UNORM:
		return Plain(GL_RGBA8, GL_BGRA, GL_UNSIGNED_BYTE, 4);
	case Dds::Format::B8G8R8A8_UNORM_SRGB:
		return Plain(GL_SRGB8_ALPHA8, GL_BGRA, GL_UNSIGNED_BYTE, 4);
	default:
		return FormatInfo{};
	}
}
} // namespace Gpu
