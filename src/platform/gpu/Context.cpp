#include "platform/gpu/Context.h"

#include "platform/gpu/Formats.h"
#include "platform/gpu/Report.h"
#include "platform/gpu/Texture.h"

namespace Gpu
{
namespace
{
bool CopyCompatible(const Texture& aDestination, const Texture& aSource)
{
	const FormatInfo destination = GetFormatInfo(aDestination.GetDesc().myFormat);
	const FormatInfo source = GetFormatInfo(aSource.GetDesc().myFormat);
	return destination.myBlockBytes == source.myBlockBytes && destination.myBlockSize == source.myBlockSize &&
	       destination.myDepthFlag == source.myDepthFlag;
}
} // namespace

void Context::Init()
{
	glClipControl(GL_UPPER_LEFT, GL_ZERO_TO_ONE);
	glEnable(GL_TEXTURE_CUBE_MAP_SEAMLESS);
	// Direct3D always encodes writes to sRGB targets; desktop GL only with this on.
	// It leaves linear targets alone, so it never needs turning off.
	glEnable(GL_FRAMEBUFFER_SRGB);
	// Rows are tightly packed in every upload and readback; nothing changes this later.
	glPixelStorei(GL_UNPACK_ALIGNMENT, 1);
	glPixelStorei(GL_PACK_ALIGNMENT, 1);
	myStateCache.Reset();
	myFramebufferCache.Init(myStateCache);
	LUMORA_GL_CHECK("Gpu::Context::Init");
}

void Context::Destroy()
{
	myFramebufferCache.Destroy();
	myStateCache.BindDrawFramebuffer(0);
	myStateCache.BindReadFramebuffer(0);
}

bool Context::SetRenderTargets(std::span<RenderTargetView* const> someColorViews,
                               const DepthStencilView* aDepthView)
{
	const GLuint framebuffer = myFramebufferCache.Get(someColorViews, aDepthView);
	if (framebuffer == 0 && (!someColorViews.empty() || aDepthView))
	{
		return false;
	}
	myStateCache.BindDrawFramebuffer(framebuffer);
	return true;
}

void Context::ClearRenderTargetView(const RenderTargetView& aView, const float aColor[4])
{
	RenderTargetView* const views[] = {const_cast<RenderTargetView*>(&aView)};
	const GLuint framebuffer = myFramebufferCache.Get(views, nullptr);
	if (framebuffer == 0)
	{
		return;
	}
	myStateCache.SetColorWriteFlag(true);
	myStateCache.SetScissorTestFlag(false);
	glClearNamedFramebufferfv(framebuffer, GL_COLOR, 0, aColor);
	LUMORA_GL_CHECK("Gpu::Context::ClearRenderTargetView");
}

void Context::ClearDepthStencilView(const DepthStencilView& aView, bool aDepthFlag, bool aStencilFlag,
                                    float aDepth, int aStencil)
{
	const GLuint framebuffer = myFramebufferCache.Get({}, &aView);
	if (framebuffer == 0)
	{
		return;
	}
	myStateCache.SetScissorTestFlag(false);
	if (aDepthFlag)
	{
		myStateCache.SetDepthWriteFlag(true);
	}
	const bool stencilFormatFlag = GetFormatInfo(aView.GetFormat()).myStencilFlag;
	if (aDepthFlag && aStencilFlag && stencilFormatFlag)
	{
		glClearNamedFramebufferfi(framebuffer, GL_DEPTH_STENCIL, 0, aDepth, aStencil);
	}
	else if (aDepthFlag)
	{
		glClearNamedFramebufferfv(framebuffer, GL_DEPTH, 0, &aDepth);
	}
	else if (aStencilFlag && stencilFormatFlag)
	{
		glClearNamedFramebufferiv(framebuffer, GL_STENCIL, 0, &aStencil);
	}
	LUMORA_GL_CHECK("Gpu::Context::ClearDepthStencilView");
}

bool Context::CopyResource(Texture& aDestination, const Texture& aSource)
{
	const TextureDesc& destination = aDestination.GetDesc();
	const TextureDesc& source = aSource.GetDesc();
	if (!aDestination.IsInitialized() || !aSource.IsInitialized() || destination.myWidth != source.myWidth ||
	    destination.myHeight != source.myHeight || aDestination.GetSliceCount() != aSource.GetSliceCount() ||
	    destination.myMipLevels != source.myMipLevels || aDestination.GetTarget() != aSource.GetTarget() ||
	    !CopyCompatible(aDestination, aSource))
	{
		ReportError(__LINE__, "Gpu::Context::CopyResource",
		            "Cannot copy '%s' (format %u) to '%s' (format %u)", source.myLabel.c_str(),
		            source.myFormat, destination.myLabel.c_str(), destination.myFormat);
		return false;
	}
	for (int mip = 0; mip < source.myMipLevels; ++mip)
	{
		const int depth =
		    aSource.GetTarget() == GL_TEXTURE_3D ? aSource.GetMipDepth(mip) : aSource.GetSliceCount();
		glCopyImageSubData(aSource.GetName(), aSource.GetTarget(), mip, 0, 0, 0, aDestination.GetName(),
		                   aDestination.GetTarget(), mip, 0, 0, 0, aSource.GetMipWidth(mip),
		                   aSource.GetMipHeight(mip), depth);
	}
	LUMORA_GL_CHECK("Gpu::Context::CopyResource");
	return true;
}

bool Context::CopySubresourceRegion(Texture& aDestination, int aDestinationMip, int aDestinationSlice,
                                    int anX, int aY, int aZ, const Texture& aSource, int aSourceMip,
                                    int aSourceSlice)
{
	const bool sourceVolumeFlag = aSource.GetTarget() == GL_TEXTURE_3D;
	const bool destinationVolumeFlag = aDestination.GetTarget() == GL_TEXTURE_3D;
	const int width = aSource.GetMipWidth(aSourceMip);
	const int height = aSource.GetMipHeight(aSourceMip);
	const int depth = sourceVolumeFlag ? aSource.GetMipDepth(aSourceMip) : 1;
	const bool validFlag =
	    aDestination.IsInitialized() && aSource.IsInitialized() && CopyCompatible(aDestination, aSource) &&
	    aSourceMip >= 0 && aSourceMip < aSource.GetMipLevels() && aDestinationMip >= 0 &&
	    aDestinationMip < aDestination.GetMipLevels() && aSourceSlice >= 0 &&
	    aSourceSlice < (sourceVolumeFlag ? 1 : aSource.GetSliceCount()) && aDestinationSlice >= 0 &&
	    aDestinationSlice < (destinationVolumeFlag ? 1 : aDestination.GetSliceCount()) && anX >= 0 &&
	    aY >= 0 && aZ >= 0 && anX + width <= aDestination.GetMipWidth(aDestinationMip) &&
	    aY + height <= aDestination.GetMipHeight(aDestinationMip) &&
	    aZ + depth <= (destinationVolumeFlag ? aDestination.GetMipDepth(aDestinationMip) : 1);
	if (!validFlag)
	{
		ReportError(__LINE__, "Gpu::Context::CopySubresourceRegion",
		            "Cannot copy mip %d slice %d of '%s' to mip %d slice %d of '%s' at (%d, %d, %d)",
		            aSourceMip, aSourceSlice, aSource.GetDesc().myLabel.c_str(), aDestinationMip,
		            aDestinationSlice, aDestination.GetDesc().myLabel.c_str(), anX, aY, aZ);
		return false;
	}
	// Layers and cube faces are the z coordinate of glCopyImageSubData.
	glCopyImageSubData(aSource.GetName(), aSource.GetTarget(), aSourceMip, 0, 0,
	                   sourceVolumeFlag ? 0 : aSourceSlice, aDestination.GetName(), aDestination.GetTarget(),
	                   aDestinationMip, anX, aY, destinationVolumeFlag ? aZ : aDestinationSlice, width,
	                   height, depth);
	LUMORA_GL_CHECK("Gpu::Context::CopySubresourceRegion");
	return true;
}
} // namespace Gpu
