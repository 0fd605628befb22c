#include "renderer/FrameCapture.h"

#include <algorithm>

#include "engine/Engine.h"
#include "platform/gpu/Readback.h"
#include "platform/gpu/TextureView.h"
#include "renderer/Renderer.h"

namespace Zeph
{
namespace FrameCapture
{
void SetCamera(const CameraInstance& aCamera)
{
	Engine* engine = Engine::GetInstance();
	if (engine != nullptr)
	{
		engine->GetRenderer().GetRTC().SetCamera(aCamera);
		engine->GetRenderer().UpdateScreenCamera(aCamera);
	}
}

bool RenderAndRead(const std::function<void()>& aQueue, int aFrameCount, std::vector<uint8_t>& somePixelsOut,
                   int& aWidthOut, int& aHeightOut)
{
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr || engine->GetBackBufferView() == nullptr)
	{
		return false;
	}
	for (int frame = 0; frame < std::max(aFrameCount, 1); ++frame)
	{
		if (aQueue)
		{
			aQueue();
		}
		engine->RenderScene();
	}
	const Gpu::RenderTargetView& view = *engine->GetBackBufferView();
	aWidthOut = view.GetWidth();
	aHeightOut = view.GetHeight();
	return Gpu::ReadRenderTarget(engine->GetContext(), view, somePixelsOut);
}

bool RenderToPng(const std::function<void()>& aQueue, int aFrameCount, const std::string& aPath)
{
	std::vector<uint8_t> pixels;
	int width = 0;
	int height = 0;
	if (!RenderAndRead(aQueue, aFrameCount, pixels, width, height))
	{
		return false;
	}
	// The back buffer's alpha is whatever the passes left there; a picture is opaque.
	for (size_t alpha = 3; alpha < pixels.size(); alpha += 4)
	{
		pixels[alpha] = 255;
	}
	return Gpu::SavePng(aPath, width, height, pixels.data());
}
} // namespace FrameCapture
} // namespace Zeph
