#include "platform/gpu/Texture.h"

#include <algorithm>
#include <bit>
#include <cstring>

#include "platform/gpu/Context.h"
#include "platform/gpu/Formats.h"
#include "platform/gpu/Report.h"

namespace Gpu
{
namespace
{
constexpr GLenum ToGlTarget(TextureKind aKind, int anArraySize)
{
	switch (aKind)
	{
	case TextureKind::Texture2D:
		return anArraySize > 1 ? GL_TEXTURE_2D_ARRAY : GL_TEXTURE_2D;
	case TextureKind::TextureCube:
		return anArraySize > 6 ? GL_TEXTURE_CUBE_MAP_ARRAY : GL_TEXTURE_CUBE_MAP;
	case TextureKind::Texture3D:
		return GL_TEXTURE_3D;
	}
	return GL_TEXTURE_2D;
}

constexpr GLenum ToGlTarget(ViewDimension aDimension)
{
	switch (aDimension)
	{
	case ViewDimension::Automatic:
	case ViewDimension::Texture2D:
		return GL_TEXTURE_2D;
	case ViewDimension::Texture2DArray:
		return GL_TEXTURE_2D_ARRAY;
	case ViewDimension::TextureCube:
		return GL_TEXTURE_CUBE_MAP;
	case ViewDimension::TextureCubeArray:
		return GL_TEXTURE_CUBE_MAP_ARRAY;
	case ViewDimension::Texture3D:
		return GL_TEXTURE_3D;
	}
	return GL_TEXTURE_2D;
}

// Formats that glTextureView may reinterpret into each other share a class:
// uncompressed colour formats by bits per texel, compressed ones only within the
// family that one typeless DXGI format stands for (sRGB/linear for BC1-BC3 and BC7,
// unsigned/signed for BC4-BC6H; GL's view classes pair them the same way), depth
// formats only as themselves.
constexpr uint32_t ViewClass(const FormatInfo& anInfo)
{
	if (anInfo.myDepthFlag)
	{
		return anInfo.myInternalFormat;
	}
	if (!anInfo.myCompressedFlag)
	{
		return 0x10000u + anInfo.myBlockBytes;
	}
	switch (anInfo.myInternalFormat)
	{
	case GL_COMPRESSED_SRGB_ALPHA_S3TC_DXT1_EXT:
		return GL_COMPRESSED_RGBA_S3TC_DXT1_EXT;
	case GL_COMPRESSED_SRGB_ALPHA_S3TC_DXT3_EXT:
		return GL_COMPRESSED_RGBA_S3TC_DXT3_EXT;
	case GL_COMPRESSED_SRGB_ALPHA_S3TC_DXT5_EXT:
		return GL_COMPRESSED_RGBA_S3TC_DXT5_EXT;
	case GL_COMPRESSED_SIGNED_RED_RGTC1:
		return GL_COMPRESSED_RED_RGTC1;
	case GL_COMPRESSED_SIGNED_RG_RGTC2:
		return GL_COMPRESSED_RG_RGTC2;
	case GL_COMPRESSED_RGB_BPTC_SIGNED_FLOAT:
		return GL_COMPRESSED_RGB_BPTC_UNSIGNED_FLOAT;
	case GL_COMPRESSED_SRGB_ALPHA_BPTC_UNORM:
		return GL_COMPRESSED_RGBA_BPTC_UNORM;
	default:
		return anInfo.myInternalFormat;
	}
}

int FullMipCount(int aWidth, int aHeight, int aDepth)
{
	const unsigned largest = static_cast<unsigned>(std::max({aWidth, aHeight, aDepth}));
	return static_cast<int>(std::bit_width(largest));
}
} // namespace

bool Texture::Init(Context& aContext, const TextureDesc& aDesc)
{
	const char* function = "Gpu::Texture::Init";
	const char* label = aDesc.myLabel.c_str();
	if (myName != 0)
	{
		ReportError(__LINE__, function, "Texture '%s' is already initialized", label);
		return false;
	}
	const FormatInfo info = GetFormatInfo(aDesc.myFormat);
	if (!info.IsSupported())
	{
		ReportError(__LINE__, function, "Texture '%s': unsupported DXGI format %u", label,
		            static_cast<unsigned>(aDesc.myFormat));
		return false;
	}
	const bool volumeFlag = aDesc.myKind == TextureKind::Texture3D;
	const bool cubeFlag = aDesc.myKind == TextureKind::TextureCube;
	if (aDesc.myWidth < 1 || aDesc.myHeight < 1 || aDesc.myDepth < 1 || aDesc.myArraySize < 1 ||
	    aDesc.myMipLevels < 0 || (!volumeFlag && aDesc.myDepth != 1) ||
	    (volumeFlag && aDesc.myArraySize != 1))
	{
		ReportError(__LINE__, function, "Texture '%s': bad size %dx%dx%d, %d slices, %d mips", label,
		            aDesc.myWidth, aDesc.myHeight, aDesc.myDepth, aDesc.myArraySize, aDesc.myMipLevels);
		return false;
	}
	if (cubeFlag && (aDesc.myWidth != aDesc.myHeight || aDesc.myArraySize % 6 != 0))
	{
		ReportError(__LINE__, function,
		            "Cube texture '%s' needs square faces and a multiple of 6 faces (%dx%d, %d)", label,
		            aDesc.myWidth, aDesc.myHeight, aDesc.myArraySize);
		return false;
	}
	const int fullMips = FullMipCount(aDesc.myWidth, aDesc.myHeight, aDesc.myDepth);
	if (aDesc.myMipLevels > fullMips)
	{
		ReportError(__LINE__, function, "Texture '%s': %d mips asked, %dx%dx%d has %d", label,
		            aDesc.myMipLevels, aDesc.myWidth, aDesc.myHeight, aDesc.myDepth, fullMips);
		return false;
	}

	myContext = &aContext;
	myDesc = aDesc;
	myDesc.myMipLevels = aDesc.myMipLevels == 0 ? fullMips : aDesc.myMipLevels;
	myTarget = ToGlTarget(aDesc.myKind, aDesc.myArraySize);
	glCreateTextures(myTarget, 1, &myName);
	switch (myTarget)
	{
	case GL_TEXTURE_2D:
	case GL_TEXTURE_CUBE_MAP:
		glTextureStorage2D(myName, myDesc.myMipLevels, info.myInternalFormat, myDesc.myWidth,
		                   myDesc.myHeight);
		break;
	case GL_TEXTURE_3D:
		glTextureStorage3D(myName, myDesc.myMipLevels, info.myInternalFormat, myDesc.myWidth, myDesc.myHeight,
		                   myDesc.myDepth);
		break;
	default: // arrays: the layers are the third dimension
		glTextureStorage3D(myName, myDesc.myMipLevels, info.myInternalFormat, myDesc.myWidth, myDesc.myHeight,
		                   myDesc.myArraySize);
		break;
	}
	// A new resource starts zeroed, as a Direct3D texture made without initial data
	// does: GL leaves fresh storage undefined, and passes that accumulate into a target
	// they never cleared (the probe capture's G-buffer) must not read garbage.
	// Block-compressed textures are always uploaded whole, so they are left alone.
	if (!info.myCompressedFlag)
	{
		for (int mip = 0; mip < myDesc.myMipLevels; ++mip)
		{
			glClearTexImage(myName, mip, info.myUploadFormat, info.myUploadType, nullptr);
		}
	}
	LUMORA_GL_CHECK(function);
	LabelObject(GL_TEXTURE, myName, myDesc.myLabel);
	myDefaultView = CreateShaderResourceView();
	return myDefaultView != nullptr;
}

void Texture::Destroy()
{
	for (std::unique_ptr<View>& view : myViews)
	{
		view->Destroy();
	}
	myViews.clear();
	myDefaultView = nullptr;
	if (myName != 0)
	{
		glDeleteTextures(1, &myName);
		myName = 0;
	}
	myContext = nullptr;
}

int Texture::GetSliceCount() const
{
	return myTarget == GL_TEXTURE_3D ? GetMipDepth(0) : myDesc.myArraySize;
}

int Texture::GetMipWidth(int aMip) const
{
	return std::max(1, myDesc.myWidth >> aMip);
}

int Texture::GetMipHeight(int aMip) const
{
	return std::max(1, myDesc.myHeight >> aMip);
}

int Texture::GetMipDepth(int aMip) const
{
	return std::max(1, myDesc.myDepth >> aMip);
}

bool Texture::Upload(int aMip, int aSlice, const void* someData, uint32_t aRowPitch, uint32_t aSlicePitch)
{
	const char* function = "Gpu::Texture::Upload";
	const char* label = myDesc.myLabel.c_str();
	const bool volumeFlag = myTarget == GL_TEXTURE_3D;
	if (myName == 0 || someData == nullptr || aMip < 0 || aMip >= myDesc.myMipLevels || aSlice < 0 ||
	    aSlice >= (volumeFlag ? 1 : myDesc.myArraySize))
	{
		ReportError(__LINE__, function, "Texture '%s': no subresource mip %d slice %d (or no data)", label,
		            aMip, aSlice);
		return false;
	}
	const FormatInfo info = GetFormatInfo(myDesc.myFormat);
	const int width = GetMipWidth(aMip);
	const int height = GetMipHeight(aMip);
	const int depth = volumeFlag ? GetMipDepth(aMip) : 1;
	const uint32_t rowBytes = info.RowBytes(static_cast<uint32_t>(width));
	const uint32_t rows = info.BlockRows(static_cast<uint32_t>(height));
	const uint32_t slicePitch = aSlicePitch == 0 ? aRowPitch * rows : aSlicePitch;
	if (aRowPitch < rowBytes || slicePitch < aRowPitch * rows)
	{
		ReportError(__LINE__, function, "Texture '%s': row pitch %u below the %u bytes of a row of mip %d",
		            label, aRowPitch, rowBytes, aMip);
		return false;
	}

	// GL reads tightly packed rows (unpack alignment 1); padded rows are packed here.
	const uint32_t imageBytes = rowBytes * rows * static_cast<uint32_t>(depth);
	const void* pixels = someData;
	std::vector<uint8_t> packed;
	if (aRowPitch != rowBytes || slicePitch != rowBytes * rows)
	{
		packed.resize(imageBytes);
		const uint8_t* source = static_cast<const uint8_t*>(someData);
		for (int z = 0; z < depth; ++z)
		{
			for (uint32_t row = 0; row < rows; ++row)
			{
				std::memcpy(&packed[(static_cast<uint32_t>(z) * rows + row) * rowBytes],
				            source + static_cast<size_t>(z) * slicePitch +
				                static_cast<size_t>(row) * aRowPitch,
				            rowBytes);
			}
		}
		pixels = packed.data();
	}

	if (myTarget == GL_TEXTURE_2D)
	{
		if (info.myCompressedFlag)
		{
			glCompressedTextureSubImage2D(myName, aMip, 0, 0, width, height, info.myInternalFormat,
			                              static_cast<GLsizei>(imageBytes), pixels);
		}
		else
		{
			glTextureSubImage2D(myName, aMip, 0, 0, width, height, info.myUploadFormat, info.myUploadType,
			                    pixels);
		}
	}
	else
	{
		// Layers and cube faces are the third dimension under direct state access.
		const int zOffset = volumeFlag ? 0 : aSlice;
		if (info.myCompressedFlag)
		{
			glCompressedTextureSubImage3D(myName, aMip, 0, 0, zOffset, width, height, depth,
			                              info.myInternalFormat, static_cast<GLsizei>(imageBytes), pixels);
		}
		else
		{
			glTextureSubImage3D(myName, aMip, 0, 0, zOffset, width, height, depth, info.myUploadFormat,
			                    info.myUploadType, pixels);
		}
	}
	LUMORA_GL_CHECK(function);
	return true;
}

bool Texture::CanViewAs(Dds::Format aFormat) const
{
	const FormatInfo info = GetFormatInfo(aFormat);
	return info.IsSupported() && ViewClass(info) == ViewClass(GetFormatInfo(myDesc.myFormat));
}

template <typename ViewType>
ViewType* Texture::AddView(GLenum aTarget, Dds::Format aFormat, int aFirstMip, int aMipCount, int aFirstSlice,
                           int aSliceCount, const char* aKind)
{
	auto view = std::make_unique<ViewType>();
	if (!view->InitView(*this, aTarget, aFormat, aFirstMip, aMipCount, aFirstSlice, aSliceCount, aKind))
	{
		return nullptr;
	}
	ViewType* result = view.get();
	myViews.push_back(std::move(view));
	return result;
}

ShaderResourceView* Texture::CreateShaderResourceView(const ShaderResourceDesc& aDesc)
{
	const Dds::Format format = aDesc.myFormat == Dds::Format::UNKNOWN ? myDesc.myFormat : aDesc.myFormat;
	const int slices = GetSliceCount();
	const int layers = myTarget == GL_TEXTURE_3D ? 1 : slices;
	const int mipCount = aDesc.myMipCount == 0 ? myDesc.myMipLevels - aDesc.myFirstMip : aDesc.myMipCount;
	const int sliceCount = aDesc.mySliceCount == 0 ? layers - aDesc.myFirstSlice : aDesc.mySliceCount;
	if (myName == 0 || !CanViewAs(format) || aDesc.myFirstMip < 0 || mipCount < 1 ||
	    aDesc.myFirstMip + mipCount > myDesc.myMipLevels || aDesc.myFirstSlice < 0 || sliceCount < 1 ||
	    aDesc.myFirstSlice + sliceCount > layers)
	{
		ReportError(__LINE__, "Gpu::Texture::CreateShaderResourceView",
		            "Texture '%s' (format %u): no view of format %u, mips %d+%d, slices %d+%d",
		            myDesc.myLabel.c_str(), static_cast<unsigned>(myDesc.myFormat),
		            static_cast<unsigned>(format), aDesc.myFirstMip, mipCount, aDesc.myFirstSlice,
		            sliceCount);
		return nullptr;
	}
	GLenum target = myTarget;
	if (aDesc.myDimension != ViewDimension::Automatic)
	{
		target = ToGlTarget(aDesc.myDimension);
	}
	else if (myTarget != GL_TEXTURE_3D && myTarget != GL_TEXTURE_CUBE_MAP &&
	         myTarget != GL_TEXTURE_CUBE_MAP_ARRAY)
	{
		target = sliceCount > 1 ? GL_TEXTURE_2D_ARRAY : GL_TEXTURE_2D;
	}
	return AddView<ShaderResourceView>(target, format, aDesc.myFirstMip, mipCount, aDesc.myFirstSlice,
	                                   sliceCount, "SRV");
}

RenderTargetView* Texture::CreateRenderTargetView(const RenderTargetDesc& aDesc)
{
	const char* function = "Gpu::Texture::CreateRenderTargetView";
	const Dds::Format format = aDesc.myFormat == Dds::Format::UNKNOWN ? myDesc.myFormat : aDesc.myFormat;
	const FormatInfo info = GetFormatInfo(format);
	const int slices = myTarget == GL_TEXTURE_3D ? GetMipDepth(aDesc.myMip) : myDesc.myArraySize;
	const int sliceCount = aDesc.mySliceCount == 0 ? slices - aDesc.myFirstSlice : aDesc.mySliceCount;
	if (myName == 0 || !CanViewAs(format) || info.myDepthFlag || info.myCompressedFlag || aDesc.myMip < 0 ||
	    aDesc.myMip >= myDesc.myMipLevels || aDesc.myFirstSlice < 0 || sliceCount < 1 ||
	    aDesc.myFirstSlice + sliceCount > slices)
	{
		ReportError(__LINE__, function,
		            "Texture '%s' (format %u): no render target of format %u at mip %d, slices %d+%d",
		            myDesc.myLabel.c_str(), static_cast<unsigned>(myDesc.myFormat),
		            static_cast<unsigned>(format), aDesc.myMip, aDesc.myFirstSlice, sliceCount);
		return nullptr;
	}
	const GLenum target = myTarget == GL_TEXTURE_3D ? GL_TEXTURE_3D
	                      : sliceCount > 1          ? GL_TEXTURE_2D_ARRAY
	                                                : GL_TEXTURE_2D;
	return AddView<RenderTargetView>(target, format, aDesc.myMip, 1, aDesc.myFirstSlice, sliceCount, "RTV");
}

DepthStencilView* Texture::CreateDepthStencilView(const DepthStencilDesc& aDesc)
{
	const char* function = "Gpu::Texture::CreateDepthStencilView";
	const Dds::Format format = aDesc.myFormat == Dds::Format::UNKNOWN ? myDesc.myFormat : aDesc.myFormat;
	const int sliceCount =
	    aDesc.mySliceCount == 0 ? myDesc.myArraySize - aDesc.myFirstSlice : aDesc.mySliceCount;
	if (myName == 0 || !CanViewAs(format) || !GetFormatInfo(format).myDepthFlag ||
	    myTarget == GL_TEXTURE_3D || aDesc.myMip < 0 || aDesc.myMip >= myDesc.myMipLevels ||
	    aDesc.myFirstSlice < 0 || sliceCount < 1 || aDesc.myFirstSlice + sliceCount > myDesc.myArraySize)
	{
		ReportError(__LINE__, function,
		            "Texture '%s' (format %u): no depth view of format %u at mip %d, slices %d+%d",
		            myDesc.myLabel.c_str(), static_cast<unsigned>(myDesc.myFormat),
		            static_cast<unsigned>(format), aDesc.myMip, aDesc.myFirstSlice, sliceCount);
		return nullptr;
	}
	const GLenum target = sliceCount > 1 ? GL_TEXTURE_2D_ARRAY : GL_TEXTURE_2D;
	return AddView<DepthStencilView>(target, format, aDesc.myMip, 1, aDesc.myFirstSlice, sliceCount, "DSV");
}

void Texture::DestroyView(View* aView)
{
	const auto found =
	    std::find_if(myViews.begin(), myViews.end(),
	                 [aView](const std::unique_ptr<View>& aMine) { return aMine.get() == aView; });
	if (found == myViews.end())
	{
		ReportError(__LINE__, "Gpu::Texture::DestroyView", "Texture '%s' does not own this view",
		            myDesc.myLabel.c_str());
		return;
	}
	if (aView == myDefaultView)
	{
		myDefaultView = nullptr;
	}
	(*found)->Destroy();
	myViews.erase(found);
}
} // namespace Gpu
