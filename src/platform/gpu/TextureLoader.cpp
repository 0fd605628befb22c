#include "platform/gpu/TextureLoader.h"

#include <epoxy/gl.h>

#include "platform/dds/DdsFile.h"
#include "platform/gpu/Formats.h"
#include "platform/gpu/Report.h"

namespace Gpu
{
namespace
{
constexpr const char* ourImageFunction = "Gpu::CreateTextureFromImage";

TextureKind ToTextureKind(const Dds::ImageInfo& anInfo)
{
	if (anInfo.IsVolume())
	{
		return TextureKind::Texture3D;
	}
	return anInfo.IsCube() ? TextureKind::TextureCube : TextureKind::Texture2D;
}

int GetLimit(GLenum aName)
{
	GLint value = 0;
	glGetIntegerv(aName, &value);
	return value;
}

// The reason the context cannot hold a texture of this shape, or null when it can.
// Texture::Init leaves these to GL, which would only say INVALID_VALUE.
const char* CheckLimits(const TextureDesc& aDesc, const FormatInfo& aFormat)
{
	switch (aDesc.myKind)
	{
	case TextureKind::Texture3D:
		if (aFormat.myCompressedFlag)
		{
			return "GL has no block-compressed volume textures";
		}
		if (aDesc.myWidth > GetLimit(GL_MAX_3D_TEXTURE_SIZE) ||
		    aDesc.myHeight > GetLimit(GL_MAX_3D_TEXTURE_SIZE) ||
		    aDesc.myDepth > GetLimit(GL_MAX_3D_TEXTURE_SIZE))
		{
			return "the volume is larger than GL_MAX_3D_TEXTURE_SIZE";
		}
		return nullptr;
	case TextureKind::TextureCube:
		if (aDesc.myWidth > GetLimit(GL_MAX_CUBE_MAP_TEXTURE_SIZE))
		{
			return "the faces are larger than GL_MAX_CUBE_MAP_TEXTURE_SIZE";
		}
		break;
	case TextureKind::Texture2D:
		if (aDesc.myWidth > GetLimit(GL_MAX_TEXTURE_SIZE) || aDesc.myHeight > GetLimit(GL_MAX_TEXTURE_SIZE))
		{
			return "the image is larger than GL_MAX_TEXTURE_SIZE";
		}
		break;
	}
	if (aDesc.myArraySize > 6 && aDesc.myArraySize > GetLimit(GL_MAX_ARRAY_TEXTURE_LAYERS))
	{
		return "the array has more slices than GL_MAX_ARRAY_TEXTURE_LAYERS";
	}
	return nullptr;
}

// B8G8R8X8_UNORM as B8G8R8A8_UNORM: the undefined fourth byte becomes an opaque alpha.
bool ToOpaqueBgra(const Dds::Image& anImage, Dds::Image& anImageOut, std::string& anErrorOut)
{
	Dds::ImageInfo info = anImage.Info();
	info.myFormat = Dds::Format::B8G8R8A8_UNORM;
	if (!anImageOut.Init(info, anErrorOut))
	{
		return false;
	}
	std::vector<uint8_t>& bytes = anImageOut.Bytes();
	bytes = anImage.Bytes();
	for (size_t alpha = 3; alpha < bytes.size(); alpha += 4)
	{
		bytes[alpha] = 0xFF;
	}
	return true;
}

bool UploadAll(Texture& aTexture, const Dds::Image& anImage)
{
	const Dds::ImageInfo& info = anImage.Info();
	for (uint32_t item = 0; item < info.myArraySize; ++item)
	{
		for (uint32_t mip = 0; mip < info.myMipLevels; ++mip)
		{
			// Image caps every image at 1 GiB, so pitches fit in 32 bits.
			const uint32_t rowPitch = static_cast<uint32_t>(anImage.RowPitch(mip));
			const uint32_t slicePitch = static_cast<uint32_t>(anImage.SlicePitch(mip));
			if (!aTexture.Upload(static_cast<int>(mip), static_cast<int>(item), anImage.Data(mip, item),
			                     rowPitch, slicePitch))
			{
				return false;
			}
		}
	}
	return true;
}
} // namespace

std::unique_ptr<Texture> CreateTextureFromImage(Context& aContext, const Dds::Image& anImage,
                                                const std::string& aLabel)
{
	const char* label = aLabel.c_str();
	if (anImage.IsEmpty())
	{
		ReportError(__LINE__, ourImageFunction, "Texture '%s': the image is empty", label);
		return nullptr;
	}
	const Dds::Image* source = &anImage;
	Dds::Image converted;
	if (anImage.Info().myFormat == Dds::Format::B8G8R8X8_UNORM)
	{
		std::string error;
		if (!ToOpaqueBgra(anImage, converted, error))
		{
			ReportError(__LINE__, ourImageFunction, "Texture '%s': %s", label, error.c_str());
			return nullptr;
		}
		source = &converted;
	}

	const Dds::ImageInfo& info = source->Info();
	const FormatInfo format = GetFormatInfo(info.myFormat);
	if (!format.IsSupported() || format.myDepthFlag)
	{
		ReportError(__LINE__, ourImageFunction, "Texture '%s': DXGI format %u (%s) has no GL texture form",
		            label, static_cast<unsigned>(info.myFormat), Dds::FormatName(info.myFormat));
		return nullptr;
	}
	TextureDesc desc;
	desc.myKind = ToTextureKind(info);
	desc.myWidth = static_cast<int>(info.myWidth);
	desc.myHeight = static_cast<int>(info.myHeight);
	desc.myDepth = static_cast<int>(info.myDepth);
	desc.myArraySize = static_cast<int>(info.myArraySize);
	desc.myMipLevels = static_cast<int>(info.myMipLevels);
	desc.myFormat = info.myFormat;
	desc.myLabel = aLabel;
	if (const char* reason = CheckLimits(desc, format))
	{
		ReportError(__LINE__, ourImageFunction, "Texture '%s' (%ux%ux%u, %u slices, %s): %s", label,
		            info.myWidth, info.myHeight, info.myDepth, info.myArraySize,
		            Dds::FormatName(info.myFormat), reason);
		return nullptr;
	}

	auto texture = std::make_unique<Texture>();
	if (!texture->Init(aContext, desc))
	{
		// Init reported why; the texture's label names the file.
		texture->Destroy();
		return nullptr;
	}
	// Storage that GL refused (out of memory) leaves the texture mutable; release
	// builds check no GL errors, so this is how the failure shows.
	GLint immutableFlag = GL_FALSE;
	glGetTextureParameteriv(texture->GetName(), GL_TEXTURE_IMMUTABLE_FORMAT, &immutableFlag);
	if (immutableFlag != GL_TRUE)
	{
		ReportError(__LINE__, ourImageFunction, "Texture '%s': GL could not allocate its storage", label);
		texture->Destroy();
		return nullptr;
	}
	if (!UploadAll(*texture, *source))
	{
		ReportError(__LINE__, ourImageFunction, "Texture '%s': uploading its pixels failed", label);
		texture->Destroy();
		return nullptr;
	}
	return texture;
}

std::unique_ptr<Texture> CreateTextureFromFile(Context& aContext, const std::string& aFileName,
                                               Dds::ImageInfo* anInfoOut)
{
	Dds::Image image;
	std::string error;
	if (!Dds::LoadFromFile(aFileName, image, error))
	{
		// The reader's message names the file and what is wrong with it.
		ReportError(__LINE__, "Gpu::CreateTextureFromFile", "No texture: %s", error.c_str());
		return nullptr;
	}
	if (anInfoOut != nullptr)
	{
		*anInfoOut = image.Info();
	}
	return CreateTextureFromImage(aContext, image, aFileName);
}
} // namespace Gpu
