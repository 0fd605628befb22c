#include "platform/gpu/Readback.h"

#include <cstdio>
#include <png.h>

#include "platform/gpu/Context.h"
#include "platform/gpu/Formats.h"
#include "platform/gpu/Report.h"
#include "platform/gpu/Texture.h"
#include "platform/gpu/TextureView.h"
#include "platform/paths/Paths.h"

namespace Gpu
{
namespace
{
bool ReadPixels(Context& aContext, const RenderTargetView& aView, GLenum aType, size_t aByteCount,
                void* aTarget)
{
	RenderTargetView* const views[] = {const_cast<RenderTargetView*>(&aView)};
	const GLuint framebuffer = aContext.GetFramebufferCache().Get(views, nullptr);
	if (framebuffer == 0)
	{
		return false;
	}
	aContext.GetStateCache().BindReadFramebuffer(framebuffer);
	glNamedFramebufferReadBuffer(framebuffer, GL_COLOR_ATTACHMENT0);
	glReadnPixels(0, 0, aView.GetWidth(), aView.GetHeight(), GL_RGBA, aType, static_cast<GLsizei>(aByteCount),
	              aTarget);
	LUMORA_GL_CHECK("Gpu::ReadRenderTarget");
	return true;
}
} // namespace

bool ReadRenderTarget(Context& aContext, const RenderTargetView& aView, std::vector<uint8_t>& someBytes)
{
	const FormatInfo info = GetFormatInfo(aView.GetFormat());
	if (info.myUploadType != GL_UNSIGNED_BYTE || info.myBlockBytes != 4)
	{
		ReportError(__LINE__, "Gpu::ReadRenderTarget",
		            "Format %u is not an 8-bit RGBA target; read it as floats",
		            static_cast<unsigned>(aView.GetFormat()));
		return false;
	}
	someBytes.resize(static_cast<size_t>(aView.GetWidth()) * static_cast<size_t>(aView.GetHeight()) * 4);
	return ReadPixels(aContext, aView, GL_UNSIGNED_BYTE, someBytes.size(), someBytes.data());
}

bool ReadRenderTarget(Context& aContext, const RenderTargetView& aView, std::vector<float>& someValues)
{
	const FormatInfo info = GetFormatInfo(aView.GetFormat());
	if (!info.IsSupported() || info.myDepthFlag || info.myCompressedFlag)
	{
		ReportError(__LINE__, "Gpu::ReadRenderTarget", "Format %u is not a colour target",
		            static_cast<unsigned>(aView.GetFormat()));
		return false;
	}
	someValues.resize(static_cast<size_t>(aView.GetWidth()) * static_cast<size_t>(aView.GetHeight()) * 4);
	return ReadPixels(aContext, aView, GL_FLOAT, someValues.size() * sizeof(float), someValues.data());
}

bool ReadTexture(const Texture& aTexture, int aMip, int aFirstSlice, int aSliceCount,
                 std::vector<float>& someValues)
{
	const char* function = "Gpu::ReadTexture";
	if (!aTexture.IsInitialized())
	{
		ReportError(__LINE__, function, "The texture is not initialised");
		return false;
	}
	const TextureDesc& desc = aTexture.GetDesc();
	const FormatInfo info = GetFormatInfo(desc.myFormat);
	if (info.myDepthFlag || info.myCompressedFlag)
	{
		ReportError(__LINE__, function, "Texture '%s': format %u does not read back as colours",
		            desc.myLabel.c_str(), static_cast<unsigned>(desc.myFormat));
		return false;
	}
	const int slices = aMip >= 0 && aTexture.GetTarget() == GL_TEXTURE_3D ? aTexture.GetMipDepth(aMip)
	                                                                      : aTexture.GetSliceCount();
	if (aMip < 0 || aMip >= aTexture.GetMipLevels() || aFirstSlice < 0 || aSliceCount < 1 ||
	    aFirstSlice + aSliceCount > slices)
	{
		ReportError(__LINE__, function, "Texture '%s': no mip %d slices %d+%d (%d mips, %d slices)",
		            desc.myLabel.c_str(), aMip, aFirstSlice, aSliceCount, aTexture.GetMipLevels(), slices);
		return false;
	}
	const int width = aTexture.GetMipWidth(aMip);
	const int height = aTexture.GetMipHeight(aMip);
	someValues.resize(static_cast<size_t>(width) * static_cast<size_t>(height) *
	                  static_cast<size_t>(aSliceCount) * 4);
	glGetTextureSubImage(aTexture.GetName(), aMip, 0, 0, aFirstSlice, width, height, aSliceCount, GL_RGBA,
	                     GL_FLOAT, static_cast<GLsizei>(someValues.size() * sizeof(float)),
	                     someValues.data());
	LUMORA_GL_CHECK(function);
	return true;
}

bool SavePng(const std::string& aPath, int aWidth, int aHeight, const uint8_t* somePixels)
{
	const char* function = "Gpu::SavePng";
	if (aWidth < 1 || aHeight < 1 || somePixels == nullptr)
	{
		ReportError(__LINE__, function, "Nothing to write to %s (%dx%d)", aPath.c_str(), aWidth, aHeight);
		return false;
	}
	const std::string target = Paths::PrepareForWrite(aPath);
	if (target.empty())
	{
		ReportError(__LINE__, function, "Cannot create the directory of %s", aPath.c_str());
		return false;
	}
	const std::string temporary = Paths::TemporaryFor(target);
	png_image image{};
	image.version = PNG_IMAGE_VERSION;
	image.width = static_cast<png_uint_32>(aWidth);
	image.height = static_cast<png_uint_32>(aHeight);
	image.format = PNG_FORMAT_RGBA;
	if (!png_image_write_to_file(&image, temporary.c_str(), 0, somePixels, aWidth * 4, nullptr))
	{
		ReportError(__LINE__, function, "Cannot write %s: %s", temporary.c_str(), image.message);
		std::remove(temporary.c_str());
		return false;
	}
	if (!Paths::ReplaceWith(temporary, target))
	{
		ReportError(__LINE__, function, "Cannot replace %s", target.c_str());
		return false;
	}
	return true;
}
} // namespace Gpu
