#pragma once
// MotionBlurManager: blurs the image along the per-pixel screen velocity that the
// renderer writes into the stage's velocity buffer ("RenderFullBlur").

#include <memory>

#include "renderer/post/PostProcessManager.h"

namespace Zeph
{
class MotionBlurManager : public PostProcessManager
{
public:
	static constexpr float ourBlurFactor = 4.0f;
	static constexpr float ourBlurScale = 0.01f;

	bool Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
	          ComputeHelper* aComputeHelper) override;
	void Render(Gpu::RenderTargetView* aDestination, Texture* aSource) override;
	void Destroy() override;

	// The velocity buffer (two floats per pixel), also shown among the debug tiles.
	Texture* GetBuffer() const { return myVelocityBuffer.get(); }

protected:
	bool ResizeTargets(int aWidth, int aHeight) override;

private:
	std::unique_ptr<Texture> myVelocityBuffer;
};
} // namespace Zeph
