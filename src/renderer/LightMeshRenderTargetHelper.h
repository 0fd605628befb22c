#pragma once
// LightMeshRenderTargetHelper: a debug view of the queued lights: when its render
// flag is set, Begin draws every point and spot light's volume as a wireframe mesh
// in the light's colour ("RenderMesh" of the light effects) into the bound target.
#include <atomic>

#include "renderer/RenderTargetHelper.h"

namespace Zeph
{
class DeferredRenderTargetHelper;

class LightMeshRenderTargetHelper : public RenderTargetHelper
{
public:
	void Init(DeferredRenderTargetHelper* aGBuffer) { myGBuffer = aGBuffer; }
	void SetRenderFlag(bool aFlag) { myRenderFlag = aFlag; }
	bool GetRenderFlag() const { return myRenderFlag; }

	void Begin(RenderTargetCollector& aCollector) override;
	void Render(const RenderBatch& aBatch) override { (void)aBatch; }
	void RenderSkinned(const SkinnedRenderBatch& aBatch) override { (void)aBatch; }

private:
	DeferredRenderTargetHelper* myGBuffer = nullptr;
	// Switched from the editor's user-interface thread while frames run on another.
	std::atomic<bool> myRenderFlag{false};
};
} // namespace Zeph
