#pragma once
// FXAAManager: edge anti-aliasing of the finished image ("RenderFXAA").

#include <memory>

#include "renderer/post/PostProcessManager.h"

namespace Zeph
{
class FXAAManager : public PostProcessManager
{
public:
	bool Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
	          ComputeHelper* aComputeHelper) override;
	void Render(Gpu::RenderTargetView* aDestination, Texture* aSource) override;
	void Destroy() override;

	// A full-size target for the renderer to resolve into before anti-aliasing.
	Texture* GetTarget() const { return myTarget.get(); }

protected:
	bool ResizeTargets(int aWidth, int aHeight) override;

private:
	std::unique_ptr<Texture> myTarget;
};
} // namespace Zeph
