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

#include <cstdint>
#include <span>

#include "platform/gpu/FramebufferCache.h"
#include "platform/gpu/InputLayout.h"
#include "platform/gpu/RenderState.h"
#include "platform/gpu/StateCache.h"

namespace Gpu
{
class Buffer;
class DepthStencilView;
class RenderTargetView;
class SamplerState;
class Texture;

enum class PrimitiveTopology
{
	TriangleList,
	TriangleStrip,
	LineList,
};

enum class IndexFormat
{
	UInt16,
	UInt32,
};

class Context
{
public:
	// The Direct3D conventions every GL context runs under: 0..1 clip depth,
	// upper-left origin, seamless cube filtering, and the default rasterizer state.
	void Init();
	void Destroy();

	// Direct3D's ClearState: no render targets, program, input layout, buffers or
	// samplers bound, and the default blend, depth and rasterizer states.
	void ClearState();
	// Hands the queued commands to the GPU without waiting for them.
	void Flush();

	// Null entries leave a slot empty. Returns false (reported) when GL refuses the combination.
	bool SetRenderTargets(std::span<RenderTargetView* const> someColorViews,
	                      const DepthStencilView* aDepthView);
	void SetViewport(const Viewport& aViewport) { myStateCache.SetViewport(aViewport); }

	void SetBlendState(const BlendState& aState) { myStateCache.SetBlendState(aState); }
	void SetDepthStencilState(const DepthStencilState& aState) { myStateCache.SetDepthStencilState(aState); }
	void SetRasterizerState(const RasterizerState& aState) { myStateCache.SetRasterizerState(aState); }
	// Null unbinds. Units beyond the cache's range are refused with a report.
	void SetSampler(int aUnit, const SamplerState* aSampler);

	// Null draws without vertex buffers (vertices built from gl_VertexID).
	void SetInputLayout(const InputLayout* aLayout);
	// A null buffer empties the slot. Returns false (reported) for a bad slot or a non-vertex buffer.
	bool SetVertexBuffer(uint32_t aSlot, const Buffer* aBuffer, uint32_t aStride, uint32_t anOffset);
	bool SetIndexBuffer(const Buffer* aBuffer, IndexFormat aFormat, uint32_t anOffset);
	void SetPrimitiveTopology(PrimitiveTopology aTopology) { myTopology = aTopology; }

	// Draws with the program the caller made current. Returns false (reported)
	// when the indices would be read past the end of the index buffer or none is set.
	void Draw(uint32_t aVertexCount, uint32_t aStartVertex);
	bool DrawIndexed(uint32_t anIndexCount, uint32_t aStartIndex, int32_t aBaseVertex);
	// Called by InputLayout::Destroy, so a destroyed layout is never drawn with.
	void ForgetInputLayout(const InputLayout& aLayout);
	// A destroyed buffer leaves every vertex slot and the index binding it held empty.
	void ForgetBuffer(GLuint aBuffer);

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
	struct VertexBinding
	{
		GLuint myBuffer = 0;
		GLintptr myOffset = 0;
		GLsizei myStride = 0;
	};

	// Attaches the slots' buffers to the vertex array about to draw; GL keeps them
	// per vertex array, Direct3D per context.
	void PrepareDraw();

	StateCache myStateCache;
	FramebufferCache myFramebufferCache;
	GLuint myEmptyVertexArray = 0;
	const InputLayout* myInputLayout = nullptr;
	VertexBinding myVertexBuffers[InputLayout::ourSlotCount];
	GLuint myIndexBuffer = 0;
	size_t myIndexBufferSize = 0;
	uint32_t myIndexOffset = 0;
	IndexFormat myIndexFormat = IndexFormat::UInt16;
	bool myBuffersDirtyFlag = true;
	PrimitiveTopology myTopology = PrimitiveTopology::TriangleList;
};
} // namespace Gpu
