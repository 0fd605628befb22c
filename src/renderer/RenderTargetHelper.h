#pragma once
// RenderTargetHelper: the base of the geometry passes. The collector's pass runners
// call Begin (bind targets, set per-pass variables), the batch operation for every
// batch of their list(s), then End. The auxiliary hooks do nothing here; the
// standard helper draws the collector's auxiliary list with its hook.
//
//   collector.RenderShadowCastingStatic(deferredHelper);   // Begin, batches, End
//
// DrawBatch is the shared way to draw one batch: the model's buffers and its
// surface's textures (over the material defaults) are set once, then every
// instance is drawn with its world matrices through each pass of a technique.
#include <functional>

#include "core/Matrix44.h"
#include "renderer/RenderBatch.h"

namespace Fx
{
class Technique;
}

namespace Zeph
{
class Effect;
class Model;
class ModelNode;
class RenderTargetCollector;

class RenderTargetHelper
{
public:
	virtual ~RenderTargetHelper() = default;
	virtual void Begin(RenderTargetCollector& aCollector) { (void)aCollector; }
	virtual void End(RenderTargetCollector& aCollector) { (void)aCollector; }
	virtual void RenderAuxiliaryList(RenderTargetCollector& aCollector) { (void)aCollector; }
	virtual void RenderAuxiliaryEntry(RenderTargetCollector& aCollector) { (void)aCollector; }
	virtual void RenderSkinned(const SkinnedRenderBatch& aBatch) = 0;
	virtual void Render(const RenderBatch& aBatch) = 0;

	// The first model with geometry in a tree (the pass models, a light volume or
	// the decal box, hold one mesh each); null for none. aTransformOut receives the
	// nodes' transformations down to it (an imported file's root carries the change
	// of handedness, which a pass drawing the bare model has to apply itself).
	static const Model* FindFirstModel(const ModelNode* aNode, Matrix44<float>& aTransformOut);

protected:
	// The effect a batch draws with: its surface's, else its model's.
	static Effect* GetBatchEffect(const RenderBatch& aBatch);
	// Draws every instance of aBatch with every pass of aTechnique (nothing when
	// either is missing); aPerInstance(index) runs before each instance's passes.
	static void DrawBatch(const RenderBatch& aBatch, Effect& anEffect, Fx::Technique* aTechnique,
	                      const std::function<void(int)>& aPerInstance = {});
	// The model technique by name, falling back to aFallback; null when neither exists.
	static Fx::Technique* FindTechnique(Effect& anEffect, const std::string& aName, const char* aFallback);
};
} // namespace Zeph
