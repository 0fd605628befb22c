#pragma once
// StandardRenderTargetHelper: forward drawing into whatever is bound: the forward
// batches after the lit image, and the late instances (gizmos, room boxes) over
// the finished frame. Each batch draws with its model's forward technique. Its
// auxiliary-list hook draws the effect objects instances attached to the collector.
#include "renderer/RenderTargetHelper.h"

namespace Zeph
{
class StandardRenderTargetHelper : public RenderTargetHelper
{
public:
	void RenderAuxiliaryList(RenderTargetCollector& aCollector) override;
	void RenderAuxiliaryEntry(RenderTargetCollector& aCollector) override;
	void Render(const RenderBatch& aBatch) override;
	void RenderSkinned(const SkinnedRenderBatch& aBatch) override;
};
} // namespace Zeph
