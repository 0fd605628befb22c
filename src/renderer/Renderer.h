#pragma once
// Renderer: draws one frame of what was queued: the collector's batches into the
// target with the depth buffer, then the late list (room boxes, gizmos, texts) over
// the finished image. Every queue is emptied by the frame.
//
//   Zeph::Renderer& renderer = engine->GetRenderer();
//   renderer.GetRTC().SetCamera(camera);
//   instance->Render();                          // into the collector
//   renderer.RenderLateInstance(gizmo);          // over everything
//   renderer.Render(backBufferView, depthView);  // what Engine::RenderScene does
//
// This is the forward core that the deferred frame grows from: batches are drawn
// with their model's render technique, World/View/Projection from the instance and
// the collector's camera. Owned by the Engine; Init runs once the device exists.
#include "core/GrowingArray.h"
#include "platform/gpu/RenderState.h"
#include "renderer/LateRenderItem.h"
#include "renderer/RenderTargetCollector.h"

namespace Gpu
{
class Context;
class DepthStencilView;
class RenderTargetView;
} // namespace Gpu

namespace Zeph
{
class Instance;
class Text;

class Renderer
{
public:
	Renderer();
	~Renderer() = default;
	Renderer(const Renderer&) = delete;
	Renderer& operator=(const Renderer&) = delete;

	bool Init(int aWidth, int aHeight);
	// Forgets the queued frame; the engine calls it first at shutdown.
	void Destroy();

	// Clears aTarget (opaque black) and aDepth (1.0), draws the batches, then the late
	// items without a depth buffer, and empties the collector and the late list.
	void Render(Gpu::RenderTargetView* aTarget, Gpu::DepthStencilView* aDepth);

	RenderTargetCollector& GetRTC() { return myCollector; }
	void RenderLateInstance(Instance* anInstance);
	void RenderLateText(Text* aText);
	int GetLateCount() const { return myLateItems.Count(); }
	int GetWidth() const { return myWidth; }
	int GetHeight() const { return myHeight; }

private:
	// Draws the batches of the drawn lists with the collector's camera.
	void DrawBatches(Gpu::Context& aContext);
	void DrawBatch(Gpu::Context& aContext, const RenderBatch& aBatch);
	void RenderLateItems(Gpu::Context& aContext, Gpu::RenderTargetView* aTarget);

	int myWidth = 0;
	int myHeight = 0;
	Gpu::Viewport myViewport;
	RenderTargetCollector myCollector;
	GrowingArray<LateRenderItem> myLateItems;
};
} // namespace Zeph
