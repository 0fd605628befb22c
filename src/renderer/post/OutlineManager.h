#pragma once
// OutlineManager: the selection glow. The outline mask (selected surfaces in flat
// outline colour) is down-sampled to half, quarter and eighth size, blurred with a
// 15-tap Gaussian at each level, and the sum is blended onto the destination
// outside the mask ("Outline").

#include <array>
#include <memory>

#include "core/Vector4.h"
#include "renderer/post/DownSampleChain.h"
#include "renderer/post/PostProcessManager.h"

namespace Fx
{
class Variable;
}

namespace Zeph
{
class Effect;

class OutlineManager : public PostProcessManager
{
public:
	static constexpr int ourTapCount = 15;
	static constexpr float ourDeviation = 3.0f;
	static constexpr float ourMultiplier = 1.25f;

	struct Kernel
	{
		// Offset of tap i - 7 in texture-coordinate units: .x for a horizontal kernel,
		// .y for a vertical one; the other components 0.
		std::array<Vector4<float>, ourTapCount> myOffsets;
		// The tap's weight in all four components.
		std::array<Vector4<float>, ourTapCount> myWeights;
	};

	// The Gaussian kernel over aSize texels (the width for a horizontal kernel, the
	// height for a vertical one): weight 1/sqrt(2 pi d^2) at the centre and
	// multiplier * exp(-i^2 / (2 d^2)) / sqrt(2 pi d^2) at tap i elsewhere.
	static Kernel ComputeKernel(int aSize, bool aHorizontalFlag);

	bool Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
	          ComputeHelper* aComputeHelper) override;
	// aSource is the outline mask; the glow is blended onto aDestination.
	void Render(Gpu::RenderTargetView* aDestination, Texture* aSource) override;
	// Onto a destination of another size than the stage's (the glow is scaled to it).
	void Render(Gpu::RenderTargetView* aDestination, int aWidth, int aHeight, Texture* aSource);
	void Destroy() override;

	Texture* GetTarget() const { return myTarget.get(); }
	const DownSampleChain& GetChain() const { return myChain; }

protected:
	bool ResizeTargets(int aWidth, int aHeight) override;

private:
	// The kernels for a frame of the size set on the full-screen effect; false (reported)
	// when it lacks one of their variables.
	static bool PublishKernels(Effect& anEffect, int aWidth, int aHeight);

	std::unique_ptr<Texture> myTarget;
	DownSampleChain myChain;
};
} // namespace Zeph
