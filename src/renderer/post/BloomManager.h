#pragma once
// BloomManager: light above the bloom threshold, blurred at half, quarter and
// eighth size and added back onto the image ("Bloom": source + the three levels *
// BloomFactor). BloomThreshold and BloomFactor are the renderer's to set.

#include <memory>

#include "renderer/post/DownSampleChain.h"
#include "renderer/post/PostProcessManager.h"

namespace Zeph
{
class BloomManager : public PostProcessManager
{
public:
	bool Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
	          ComputeHelper* aComputeHelper) override;
	void Render(Gpu::RenderTargetView* aDestination, Texture* aSource) override;
	void Destroy() override;

	Texture* GetTarget() const { return myTarget.get(); }
	const DownSampleChain& GetChain() const { return myChain; }

protected:
	bool ResizeTargets(int aWidth, int aHeight) override;

private:
	// A full-size target for the renderer to bloom into when it needs an intermediate.
	std::unique_ptr<Texture> myTarget;
	DownSampleChain myChain;
};
} // namespace Zeph
