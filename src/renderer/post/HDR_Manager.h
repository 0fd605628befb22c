#pragma once
// HDR_Manager: eye adaptation and tone mapping. The log luminance of the image is
// averaged down a chain of square targets to 1x1; three pairs of adaptation
// targets move, frame by frame, from the luminance they held toward the scene's
// ("AdaptLuminance"); "ToneMap" then exposes the image by the adapted luminance.
// The adaptation state carries from one Render to the next.

#include <memory>
#include <vector>

#include "renderer/post/PostProcessManager.h"

namespace Zeph
{
class HDR_Manager : public PostProcessManager
{
public:
	static constexpr int ourAdaptSize = 3;
	// What the adaptation targets hold before the first frame.
	static constexpr float ourStartLuminance = 0.5f;

	// Targets in the luminance chain for a frame: trunc(log2(min(w, h))) + 1 (sizes
	// 1, 2, 4, ... up to the largest power of two that fits); 1 for a frame below 2x2.
	static int ComputeLuminanceCount(int aWidth, int aHeight);

	bool Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
	          ComputeHelper* aComputeHelper) override;
	void Render(Gpu::RenderTargetView* aDestination, Texture* aSource) override;
	void Destroy() override;

	int GetLuminanceCount() const { return static_cast<int>(myLuminanceChain.size()); }
	// Target anIndex of the chain, (1 << anIndex) texels square; null out of range.
	Texture* GetLuminanceTarget(int anIndex) const;
	// Target aSlot (0 or 1) of adaptation pair aPair, (4 >> aPair) texels square.
	Texture* GetAdaptationTarget(int aPair, int aSlot) const;
	// The target of pair aPair that holds the latest adapted luminance.
	Texture* GetCurrentAdaptation(int aPair) const;

protected:
	// The luminance chain follows the size; the adapted luminance carries on, so the
	// exposure does not jump while a view is being resized.
	bool ResizeTargets(int aWidth, int aHeight) override;

private:
	std::vector<std::unique_ptr<Texture>> myLuminanceChain;
	std::unique_ptr<Texture> myAdaptation[ourAdaptSize][2];
	// Per pair, the slot holding the latest result.
	int myCurrentSlot[ourAdaptSize] = {1, 1, 1};
};
} // namespace Zeph
