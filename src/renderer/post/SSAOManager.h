#pragma once
// SSAOManager: screen-space ambient occlusion. ComputeOcclusion fills the occlusion
// buffer from the G-buffer's normals and linear depth ("RenderSSAO", then a
// depth-aware blur across and down); Render multiplies the image by it
// ("RenderApplySSAO"). The SSAO_ tuning variables are the renderer's to set.
//
// The 16 sample directions come from the C library's rand() when the stage is
// made, so two stages made after the same srand() sample alike.

#include <array>
#include <memory>

#include "core/Vector4.h"
#include "renderer/post/PostProcessManager.h"

namespace Gpu
{
class ShaderResourceView;
}

namespace Fx
{
class Variable;
}

namespace Zeph
{
class SSAOManager : public PostProcessManager
{
public:
	static constexpr int ourRandomVectorCount = 16;

	bool Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
	          ComputeHelper* aComputeHelper) override;
	// Applies the occlusion buffer to aSource into aDestination.
	void Render(Gpu::RenderTargetView* aDestination, Texture* aSource) override;
	void Destroy() override;

	void ComputeOcclusion(Gpu::ShaderResourceView* aNormal, Gpu::ShaderResourceView* aLinearDepth);

	// Ambient visibility per pixel in r (1 unoccluded).
	Texture* GetOcclusionBuffer() const { return myOcclusionBuffer.get(); }
	// xyz a unit direction (or zero), w 0, as written to "Randvectors".
	const std::array<Vector4<float>, ourRandomVectorCount>& GetRandomVectors() const
	{
		return myRandomVectors;
	}

protected:
	// The buffers follow the size; the sample directions stay.
	bool ResizeTargets(int aWidth, int aHeight) override;

private:
	void CreateRandomVectors();
	// The three buffers of a frame of the size, the blur's cleared to white; false when
	// one cannot be made.
	static bool MakeBuffers(int aWidth, int aHeight, std::unique_ptr<Texture>& anOcclusionOut,
	                        std::unique_ptr<Texture>& aHalfOut, std::unique_ptr<Texture>& aBlurOut);

	std::unique_ptr<Texture> myOcclusionBuffer;
	// Half size, kept for a half-resolution occlusion pass; the blur does not need it.
	std::unique_ptr<Texture> myHalfBuffer;
	// The horizontal blur's result, cleared to white at creation.
	std::unique_ptr<Texture> myBlurBuffer;
	std::array<Vector4<float>, ourRandomVectorCount> myRandomVectors{};
	Fx::Variable* myNormalTexture = nullptr;
	Fx::Variable* myLinearDepthTexture = nullptr;
	Fx::Variable* myAOTexture = nullptr;
};
} // namespace Zeph
