#include "platform/gpu/SwapChain.h"

#include "platform/gpu/Device.h"
#include "platform/gpu/Report.h"

namespace Gpu
{
namespace
{
// The formats a window can show, and the linear format of each one's present view.
constexpr Dds::Format LinearFormat(Dds::Format aFormat)
{
	switch (aFormat)
	{
	case Dds::Format::R8G8B8A8_UNORM:
	case Dds::Format::R8G8B8A8_UNORM_SRGB:
		return Dds::Format::R8G8B8A8_UNORM;
	case Dds::Format::B8G8R8A8_UNORM:
	case Dds::Format::B8G8R8A8_UNORM_SRGB:
		return Dds::Format::B8G8R8A8_UNORM;
	default:
		return Dds::Format::UNKNOWN;
	}
}
} // namespace

bool SwapChain::Init(Device& aDevice, int aWidth, int aHeight, Dds::Format aFormat)
{
	const char* function = "Gpu::SwapChain::Init";
	if (IsInitialized())
	{
		ReportError(__LINE__, function, "The swap chain is already initialized");
		return false;
	}
	if (!aDevice.IsInitialized())
	{
		ReportError(__LINE__, function, "The device is not initialized");
		return false;
	}
	myDevice = &aDevice;
	BufferSize size;
	if (!Resolve(function, aWidth, aHeight, aFormat, size) || !CreateBuffer(size, aFormat))
	{
		myDevice = nullptr;
		return false;
	}
	return true;
}

void SwapChain::Destroy()
{
	myBuffer.Destroy();
	myPresentView = nullptr;
	myDevice = nullptr;
	myWindowWidth = 0;
	myWindowHeight = 0;
}

bool SwapChain::HasWindow() const
{
	return myDevice != nullptr && myDevice->HasWindow();
}

bool SwapChain::ResizeBuffers(int aWidth, int aHeight, Dds::Format aFormat)
{
	const char* function = "Gpu::SwapChain::ResizeBuffers";
	if (!IsInitialized())
	{
		ReportError(__LINE__, function, "The swap chain is not initialized");
		return false;
	}
	const Dds::Format format = aFormat == Dds::Format::UNKNOWN ? GetFormat() : aFormat;
	// Everything is checked before the old buffer goes, so a refused resize changes nothing.
	BufferSize size;
	if (!Resolve(function, aWidth, aHeight, format, size))
	{
		return false;
	}
	myBuffer.Destroy();
	myPresentView = nullptr;
	return CreateBuffer(size, format);
}

bool SwapChain::Resolve(const char* aFunctionName, int aWidth, int aHeight, Dds::Format aFormat,
                        BufferSize& aSize) const
{
	if (HasWindow() && !myDevice->GetWindowSize(aSize.myWindowWidth, aSize.myWindowHeight))
	{
		return false;
	}
	aSize.myWidth = aWidth == 0 ? aSize.myWindowWidth : aWidth;
	aSize.myHeight = aHeight == 0 ? aSize.myWindowHeight : aHeight;
	GLint maxSize = 0;
	glGetIntegerv(GL_MAX_TEXTURE_SIZE, &maxSize);
	if (LinearFormat(aFormat) == Dds::Format::UNKNOWN || aSize.myWidth < 1 || aSize.myHeight < 1 ||
	    aSize.myWidth > maxSize || aSize.myHeight > maxSize)
	{
		ReportError(
		    __LINE__, aFunctionName,
		    "Cannot make a %dx%d back buffer of format %u (8-bit RGBA or BGRA, 1 to %d pixels a side%s)",
		    aSize.myWidth, aSize.myHeight, static_cast<unsigned>(aFormat), maxSize,
		    HasWindow() ? "" : "; no window to take a size of 0 from");
		return false;
	}
	return true;
}

bool SwapChain::CreateBuffer(const BufferSize& aSize, Dds::Format aFormat)
{
	if (HasWindow() && !myDevice->UpdateWindowSurface(aSize.myWindowWidth, aSize.myWindowHeight))
	{
		return false;
	}
	TextureDesc desc;
	desc.myWidth = aSize.myWidth;
	desc.myHeight = aSize.myHeight;
	desc.myFormat = aFormat;
	desc.myLabel = "back buffer";
	if (!myBuffer.Init(myDevice->GetContext(), desc))
	{
		return false;
	}
	myPresentView = myBuffer.CreateRenderTargetView({.myFormat = LinearFormat(aFormat)});
	if (myPresentView == nullptr)
	{
		myBuffer.Destroy();
		return false;
	}
	myWindowWidth = aSize.myWindowWidth;
	myWindowHeight = aSize.myWindowHeight;
	return true;
}

bool SwapChain::Present(int aSyncInterval)
{
	const char* function = "Gpu::SwapChain::Present";
	if (!IsInitialized())
	{
		ReportError(__LINE__, function, "The swap chain is not initialized");
		return false;
	}
	if (aSyncInterval < 0 || aSyncInterval > 4)
	{
		ReportError(__LINE__, function, "Bad sync interval %d (0 to 4)", aSyncInterval);
		return false;
	}
	if (!HasWindow())
	{
		glFlush();
		return true;
	}
	Context& context = myDevice->GetContext();
	RenderTargetView* const views[] = {myPresentView};
	const GLuint source = context.GetFramebufferCache().Get(views, nullptr);
	if (source == 0)
	{
		return false;
	}
	// A blit obeys the scissor test and, with GL_FRAMEBUFFER_SRGB on, encodes into
	// the window's framebuffer (which Mesa reports as sRGB-capable): linear bytes
	// would come out brighter. Off for the blit, on again for Direct3D's rendering.
	context.GetStateCache().SetScissorTestFlag(false);
	context.GetStateCache().SetColorWriteMask(ColorWrite::All);
	glDisable(GL_FRAMEBUFFER_SRGB);
	// Row 0 of the texture goes to the top of the window, where GL's window rows count from the bottom.
	const bool sameSizeFlag = myWindowWidth == GetWidth() && myWindowHeight == GetHeight();
	glBlitNamedFramebuffer(source, 0, 0, 0, GetWidth(), GetHeight(), 0, myWindowHeight, myWindowWidth, 0,
	                       GL_COLOR_BUFFER_BIT, sameSizeFlag ? GL_NEAREST : GL_LINEAR);
	glEnable(GL_FRAMEBUFFER_SRGB);
	LUMORA_GL_CHECK(function);
	return myDevice->SwapBuffers(aSyncInterval);
}
} // namespace Gpu
