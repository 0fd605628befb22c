#include "renderer/FrameCapture.h"

#include <algorithm>
#include <cstdint>
#include <vector>

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

bool UploadUniformAmbient(float aLevel, const Vector3<float>& aWorldMin, const Vector3<float>& aWorldSize)
{
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr)
	{
		return false;
	}
	// Texels hold coefficient * 0.5 + 0.5 as bytes x, y, z, w; the constant term of
	// each colour is the w of cAr, cAg and cAb, every other coefficient is 0.
	const auto byte = [](float aValue) {
		return static_cast<uint32_t>((std::clamp(aValue, -1.0f, 1.0f) + 1.0f) * 0.5f * 255.0f);
	};
	const uint32_t zero = byte(0.0f) | byte(0.0f) << 8 | byte(0.0f) << 16 | byte(0.0f) << 24;
	const uint32_t constant = (zero & 0x00FFFFFFu) | (byte(aLevel) << 24);
	constexpr int cornerCount = 8;
	std::vector<uint32_t> blocks[7];
	for (int block = 0; block < 7; ++block)
	{
		blocks[block].assign(cornerCount, block < 3 ? constant : zero);
	}
	Renderer& renderer = engine->GetRenderer();
	if (!renderer.UploadSHToGPU(false, blocks, 2, 2, 2))
	{
		return false;
	}
	renderer.SetVolumeBounds(aWorldMin, aWorldSize);
	return true;
}
} // namespace FrameCapture
} // namespace Zeph
