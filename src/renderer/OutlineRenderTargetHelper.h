#pragma once
// OutlineRenderTargetHelper: draws the outline batches (selected objects) in a flat
// colour into the outline mask target, which the outline stage blurs into a glow.
#include <memory>

#include "renderer/RenderTargetHelper.h"

namespace Zeph
{
class Texture;

class OutlineRenderTargetHelper : public RenderTargetHelper
{
public:
	OutlineRenderTargetHelper();
	~OutlineRenderTargetHelper() override;

	bool Init(int aWidth, int aHeight);
	// The mask made again at a new size; the old one stays when it cannot be made.
	bool Resize(int aWidth, int aHeight);
	void Destroy();
	Texture* GetTarget() const { return myTarget.get(); }

	void Begin(RenderTargetCollector& aCollector) override;
	void End(RenderTargetCollector& aCollector) override;
	void Render(const RenderBatch& aBatch) override;
	void RenderSkinned(const SkinnedRenderBatch& aBatch) override;

private:
	std::unique_ptr<Texture> myTarget;
};
} // namespace Zeph
