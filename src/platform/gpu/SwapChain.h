#pragma once
// SwapChain: the back buffer the engine renders a frame into, and Present.
//
//   Gpu::SwapChain swapChain;
//   if (!swapChain.Init(device, 1280, 720, Dds::Format::R8G8B8A8_UNORM_SRGB)) { ... reported ... }
//   Gpu::RenderTargetView* backBuffer = swapChain.GetBuffer()->CreateRenderTargetView();
//   ...                                  // render the frame into backBuffer
//   swapChain.Present(1);                // wait for the vertical blank, then show it
//   ...                                  // the front end's window was resized:
//   swapChain.ResizeBuffers(0, 0, Dds::Format::UNKNOWN); // the window's size, the same format
//   backBuffer = swapChain.GetBuffer()->CreateRenderTargetView(); // the old view died with the old buffer
//
// DXGI's swap chain with one buffer and the discard effect. The back buffer is
// always an offscreen 2D texture of the asked size and format, owned here, so the
// engine binds, clears and reads it like any render target. Rendering runs with
// the upper-left origin (row 0 of the texture is the top of the picture); Present
// with a window blits it to the window's default framebuffer turned the right way
// up, stretched to the window's size as last read by Init or ResizeBuffers, with
// the stored bytes unchanged (an sRGB back buffer holds encoded values, and those
// are what the screen gets), and then swaps. Without a window Present flushes.
// The window comes from the device.

#include "platform/dds/Format.h"
#include "platform/gpu/Texture.h"

namespace Gpu
{
class Device;

class SwapChain
{
public:
	SwapChain() = default;
	~SwapChain() = default;
	SwapChain(const SwapChain&) = delete;
	SwapChain& operator=(const SwapChain&) = delete;

	// aFormat: R8G8B8A8 or B8G8R8A8, UNORM or UNORM_SRGB. Sizes of 0 take the window's.
	bool Init(Device& aDevice, int aWidth, int aHeight, Dds::Format aFormat);
	void Destroy();

	// Replaces the back buffer; views made of the old one are destroyed with it.
	// Sizes of 0 take the window's and UNKNOWN keeps the format, as in DXGI. The
	// window's size is read again for the blit.
	bool ResizeBuffers(int aWidth, int aHeight, Dds::Format aFormat);
	// The back buffer, or null before Init.
	Texture* GetBuffer() { return myBuffer.IsInitialized() ? &myBuffer : nullptr; }
	// aSyncInterval 0: show at once; 1-4: after that many vertical blanks.
	bool Present(int aSyncInterval);

	bool IsInitialized() const { return myDevice != nullptr; }
	bool HasWindow() const;
	// 0 and UNKNOWN while there is no back buffer.
	int GetWidth() const { return myBuffer.IsInitialized() ? myBuffer.GetDesc().myWidth : 0; }
	int GetHeight() const { return myBuffer.IsInitialized() ? myBuffer.GetDesc().myHeight : 0; }
	Dds::Format GetFormat() const
	{
		return myBuffer.IsInitialized() ? myBuffer.GetDesc().myFormat : Dds::Format::UNKNOWN;
	}

private:
	struct BufferSize
	{
		int myWidth = 0;
		int myHeight = 0;
		int myWindowWidth = 0; // 0 without a window
		int myWindowHeight = 0;
	};

	// The size a request means (0: the window's), checked with the format; reported when refused.
	bool Resolve(const char* aFunctionName, int aWidth, int aHeight, Dds::Format aFormat,
	             BufferSize& aSize) const;
	bool CreateBuffer(const BufferSize& aSize, Dds::Format aFormat);

	Device* myDevice = nullptr;
	Texture myBuffer;
	// A linear view of the back buffer that Present blits from, so no driver
	// decodes the sRGB bytes on the way out.
	RenderTargetView* myPresentView = nullptr;
	int myWindowWidth = 0;
	int myWindowHeight = 0;
};
} // namespace Gpu
