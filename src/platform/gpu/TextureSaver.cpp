#include "platform/gpu/TextureSaver.h"

#include "platform/dds/DdsFile.h"
#include "platform/gpu/Formats.h"
#include "platform/gpu/Report.h"
#include "platform/gpu/Texture.h"

namespace Gpu
{
namespace
{
// What the file says about aTexture: a 2D texture (an array, a cube) with its slices, or a volume.
Dds::ImageInfo DescribeForFile(const Texture& aTexture)
{
	const TextureDesc& desc = aTexture.GetDesc();
	const bool volumeFlag = aTexture.GetTarget() == GL_TEXTURE_3D;
	const bool cubeFlag =
	    aTexture.GetTarget() == GL_TEXTURE_CUBE_MAP || aTexture.GetTarget() == GL_TEXTURE_CUBE_MAP_ARRAY;
	Dds::ImageInfo info;
	info.myWidth = static_cast<uint32_t>(desc.myWidth);
	info.myHeight = static_cast<uint32_t>(desc.myHeight);
	info.myDepth = volumeFlag ? static_cast<uint32_t>(desc.myDepth) : 1u;
	info.myArraySize = volumeFlag ? 1u : static_cast<uint32_t>(aTexture.GetSliceCount());
	info.myMipLevels = static_cast<uint32_t>(aTexture.GetMipLevels());
	info.myMiscFlags = cubeFlag ? Dds::MiscTextureCube : 0u;
	info.myFormat = desc.myFormat;
	info.myResourceDimension =
	    volumeFlag ? Dds::ResourceDimension::Texture3D : Dds::ResourceDimension::Texture2D;
	return info;
}
} // namespace

bool SaveTextureToDds(Context& aContext, const Texture& aTexture, const std::string& aPath,
                      std::string* aStagedOut)
{
	static_cast<void>(aContext); // the reads below name the texture directly
	const char* function = "Gpu::SaveTextureToDds";
	if (!aTexture.IsInitialized())
	{
		ReportError(__LINE__, function, "Nothing to save to %s: the texture is not initialised",
		            aPath.c_str());
		return false;
	}
	const TextureDesc& desc = aTexture.GetDesc();
	const FormatInfo format = GetFormatInfo(desc.myFormat);
	if (!format.IsSupported() || format.myCompressedFlag || format.myDepthFlag)
	{
		ReportError(__LINE__, function, "Cannot save texture '%s' to %s: format %u does not read back",
		            desc.myLabel.c_str(), aPath.c_str(), static_cast<unsigned>(desc.myFormat));
		return false;
	}
	Dds::Image image;
	std::string error;
	if (!image.Init(DescribeForFile(aTexture), error))
	{
		ReportError(__LINE__, function, "Cannot save texture '%s' to %s: %s", desc.myLabel.c_str(),
		            aPath.c_str(), error.c_str());
		return false;
	}
	const bool volumeFlag = aTexture.GetTarget() == GL_TEXTURE_3D;
	const Dds::ImageInfo& info = image.Info();
	// Direct3D's subresource order is the file's: each slice with all its mips.
	for (uint32_t item = 0; item < info.myArraySize; ++item)
	{
		for (uint32_t mip = 0; mip < info.myMipLevels; ++mip)
		{
			const int level = static_cast<int>(mip);
			const int depth = volumeFlag ? aTexture.GetMipDepth(level) : 1;
			glGetTextureSubImage(aTexture.GetName(), level, 0, 0, volumeFlag ? 0 : static_cast<int>(item),
			                     aTexture.GetMipWidth(level), aTexture.GetMipHeight(level), depth,
			                     format.myUploadFormat, format.myUploadType,
			                     static_cast<GLsizei>(image.SubresourceSize(mip)), image.Data(mip, item));
		}
	}
	LUMORA_GL_CHECK(function);
	const bool saved = aStagedOut != nullptr ? Dds::SaveToTemporary(aPath, image, *aStagedOut, error)
	                                         : Dds::SaveToFile(aPath, image, error);
	if (!saved)
	{
		ReportError(__LINE__, function, "%s", error.c_str());
		return false;
	}
	return true;
}

bool ReplaceWithStaged(const std::string& aStaged, const std::string& aPath)
{
	std::string error;
	if (!Dds::ReplaceWithTemporary(aStaged, aPath, error))
	{
		ReportError(__LINE__, "Gpu::ReplaceWithStaged", "%s", error.c_str());
		return false;
	}
	return true;
}
} // namespace Gpu
