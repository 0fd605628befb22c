#pragma once
// Context: the immediate context, the commands that change what the GPU draws into.
//
//   Gpu::Context& context = device.GetContext();
//   Gpu::RenderTargetView* targets[] = {albedo, normals};
//   context.SetRenderTargets(targets, depth);
//   context.SetViewport({.myWidth = 160, .myHeight = 90});
//   const float black[4] = {0, 0, 0, 1};
//   context.ClearRenderTargetView(*albedo, black);
//   context.CopyResource(backup, scene);
//
// Owned by Gpu::Device, which calls Init once the GL context is current for the
// first time. Clears behave as Direct3D's do: they ignore the scissor rectangle
// and the write masks of the current states, and change no binding the caller sees.

#include <span>

#include "platform/gpu/FramebufferCache.h"
#include "platform/gpu/StateCache.h"

namespace Gpu
{
class DepthStencilView;
class RenderTargetView;
class Texture;

class Context
{
public:
	// The Direct3D conventions every GL context runs under: 0..1 clip depth,
	// upper-left origin, seamless cube filtering, and the default rasterizer state.
	void Init();
	void Destroy();

	// Null entries leave a slot empty. Returns false (reported) when GL refuses the combination.
	bool SetRenderTargets(std::span<RenderTargetView* const> someColorViews,
	                      const DepthStencilView* aDepthView);
	void SetViewport(const Viewport& aViewport) { myStateCache.SetViewport(aViewport); }

	void ClearRenderTargetView(const RenderTargetView& aView, const float aColor[4]);
	void ClearDepthStencilView(const DepthStencilView& aView, bool aDepthFlag, bool aStencilFlag,
	                           float aDepth, int aStencil);

	// Whole textures of the same size, mip count, slice count and compatible formats.
	bool CopyResource(Texture& aDestination, const Texture& aSource);
	// One whole source subresource to a position in a destination subresource.
	bool CopySubresourceRegion(Texture& aDestination, int aDestinationMip, int aDestinationSlice, int anX,
	                           int aY, int aZ, const Texture& aSource, int aSourceMip, int aSourceSlice);

	StateCache& GetStateCache() { return myStateCache; }
	FramebufferCache& GetFramebufferCache() { return myFramebufferCache; }

private:
	StateCache myStateCache;
	FramebufferCache myFramebufferCache;
};
} // namespace Gpu
