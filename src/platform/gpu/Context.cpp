#include "platform/gpu/Context.h"

#include <algorithm>

#include "platform/gpu/Buffer.h"
#include "platform/gpu/Formats.h"
#include "platform/gpu/Report.h"
#include "platform/gpu/SamplerState.h"
#include "platform/gpu/Texture.h"

namespace Gpu
{
namespace
{
// Block-compressed data copies only within its typeless family (BC7 into BC7_UNORM_SRGB, not into
// BC3): GL refuses the rest, and Direct3D does too.
bool CopyCompatible(const Texture& aDestination, const Texture& aSource)
{
	const FormatInfo destination = GetFormatInfo(aDestination.GetDesc().myFormat);
	const FormatInfo source = GetFormatInfo(aSource.GetDesc().myFormat);
	return destination.myBlockBytes == source.myBlockBytes && destination.myBlockSize == source.myBlockSize &&
	       destination.myDepthFlag == source.myDepthFlag &&
	       (!destination.myCompressedFlag || aDestination.CanViewAs(aSource.GetDesc().myFormat));
}

constexpr GLenum ToGlTopology(PrimitiveTopology aTopology)
{
	switch (aTopology)
	{
	case PrimitiveTopology::TriangleList:
		return GL_TRIANGLES;
	case PrimitiveTopology::TriangleStrip:
		return GL_TRIANGLE_STRIP;
	case PrimitiveTopology::LineList:
		return GL_LINES;
	}
	return GL_TRIANGLES;
}

constexpr uint32_t IndexBytes(IndexFormat aFormat)
{
	switch (aFormat)
	{
	case IndexFormat::UInt16:
		return 2;
	case IndexFormat::UInt32:
		return 4;
	}
	return 4;
}
} // namespace

void Context::Init()
{
	glClipControl(GL_UPPER_LEFT, GL_ZERO_TO_ONE);
	glEnable(GL_TEXTURE_CUBE_MAP_SEAMLESS);
	// Direct3D always encodes writes to sRGB targets; desktop GL only with this on.
	// It leaves linear targets alone, so it never needs turning off.
	glEnable(GL_FRAMEBUFFER_SRGB);
	// Rows are tightly packed in every upload and readback; nothing changes this later.
	glPixelStorei(GL_UNPACK_ALIGNMENT, 1);
	glPixelStorei(GL_PACK_ALIGNMENT, 1);
	myStateCache.Reset();
	myFramebufferCache.Init(myStateCache);
	glCreateVertexArrays(1, &myEmptyVertexArray);
	LabelObject(GL_VERTEX_ARRAY, myEmptyVertexArray, "no input layout");
	LUMORA_GL_CHECK("Gpu::Context::Init");
}

void Context::Destroy()
{
	myFramebufferCache.Destroy();
	myStateCache.BindVertexArray(0);
	myStateCache.UseProgram(0);
	myInputLayout = nullptr;
	if (myEmptyVertexArray != 0)
	{
		glDeleteVertexArrays(1, &myEmptyVertexArray);
		myEmptyVertexArray = 0;
	}
	myStateCache.BindDrawFramebuffer(0);
	myStateCache.BindReadFramebuffer(0);
}

void Context::ClearState()
{
	myStateCache.BindDrawFramebuffer(0);
	myStateCache.BindReadFramebuffer(0);
	myStateCache.UseProgram(0);
	myInputLayout = nullptr;
	for (VertexBinding& binding : myVertexBuffers)
	{
		binding = VertexBinding();
	}
	myIndexBuffer = 0;
	myIndexBufferSize = 0;
	myIndexOffset = 0;
	myBuffersDirtyFlag = true;
	myTopology = PrimitiveTopology::TriangleList;
	for (int unit = 0; unit < StateCache::ourSamplerUnitCount; ++unit)
	{
		myStateCache.BindSampler(unit, 0);
	}
	myStateCache.SetBlendState(BlendState());
	myStateCache.SetDepthStencilState(DepthStencilState());
	myStateCache.SetRasterizerState(RasterizerState());
	LUMORA_GL_CHECK("Gpu::Context::ClearState");
}

void Context::Flush()
{
	glFlush();
}

bool Context::SetRenderTargets(std::span<RenderTargetView* const> someColorViews,
                               const DepthStencilView* aDepthView)
{
	const GLuint framebuffer = myFramebufferCache.Get(someColorViews, aDepthView);
	const bool anyViewFlag =
	    aDepthView != nullptr || std::any_of(someColorViews.begin(), someColorViews.end(),
	                                         [](RenderTargetView* aView) { return aView; });
	if (framebuffer == 0 && anyViewFlag)
	{
		return false;
	}
	myStateCache.BindDrawFramebuffer(framebuffer);
	return true;
}

void Context::ClearRenderTargetView(const RenderTargetView& aView, const float aColor[4])
{
	// A view attached to the bound framebuffer is cleared there: clearing through
	// another framebuffer would make a software rasterizer end its scene twice.
	const GLuint bound = myStateCache.GetDrawFramebuffer();
	const int boundSlot = myFramebufferCache.FindColorSlot(bound, aView.GetUniqueId());
	GLuint framebuffer = bound;
	if (boundSlot < 0)
	{
		RenderTargetView* const views[] = {const_cast<RenderTargetView*>(&aView)};
		framebuffer = myFramebufferCache.Get(views, nullptr);
	}
	if (framebuffer == 0)
	{
		return;
	}
	myStateCache.SetColorWriteMask(ColorWrite::All);
	myStateCache.SetScissorTestFlag(false);
	glClearNamedFramebufferfv(framebuffer, GL_COLOR, std::max(boundSlot, 0), aColor);
	LUMORA_GL_CHECK("Gpu::Context::ClearRenderTargetView");
}

void Context::ClearDepthStencilView(const DepthStencilView& aView, bool aDepthFlag, bool aStencilFlag,
                                    float aDepth, int aStencil)
{
	const GLuint bound = myStateCache.GetDrawFramebuffer();
	const GLuint framebuffer = myFramebufferCache.HasDepthView(bound, aView.GetUniqueId())
	                               ? bound
	                               : myFramebufferCache.Get({}, &aView);
	if (framebuffer == 0)
	{
		return;
	}
	myStateCache.SetScissorTestFlag(false);
	if (aDepthFlag)
	{
		myStateCache.SetDepthWriteFlag(true);
	}
	const bool stencilFormatFlag = GetFormatInfo(aView.GetFormat()).myStencilFlag;
	if (aDepthFlag && aStencilFlag && stencilFormatFlag)
	{
		glClearNamedFramebufferfi(framebuffer, GL_DEPTH_STENCIL, 0, aDepth, aStencil);
	}
	else if (aDepthFlag)
	{
		glClearNamedFramebufferfv(framebuffer, GL_DEPTH, 0, &aDepth);
	}
	else if (aStencilFlag && stencilFormatFlag)
	{
		glClearNamedFramebufferiv(framebuffer, GL_STENCIL, 0, &aStencil);
	}
	LUMORA_GL_CHECK("Gpu::Context::ClearDepthStencilView");
}

bool Context::CopyResource(Texture& aDestination, const Texture& aSource)
{
	const TextureDesc& destination = aDestination.GetDesc();
	const TextureDesc& source = aSource.GetDesc();
	if (!aDestination.IsInitialized() || !aSource.IsInitialized() || destination.myWidth != source.myWidth ||
	    destination.myHeight != source.myHeight || aDestination.GetSliceCount() != aSource.GetSliceCount() ||
	    destination.myMipLevels != source.myMipLevels || aDestination.GetTarget() != aSource.GetTarget() ||
	    !CopyCompatible(aDestination, aSource))
	{
		ReportError(__LINE__, "Gpu::Context::CopyResource",
		            "Cannot copy '%s' (format %u) to '%s' (format %u)", source.myLabel.c_str(),
		            static_cast<unsigned>(source.myFormat), destination.myLabel.c_str(),
		            static_cast<unsigned>(destination.myFormat));
		return false;
	}
	for (int mip = 0; mip < source.myMipLevels; ++mip)
	{
		const int depth =
		    aSource.GetTarget() == GL_TEXTURE_3D ? aSource.GetMipDepth(mip) : aSource.GetSliceCount();
		glCopyImageSubData(aSource.GetName(), aSource.GetTarget(), mip, 0, 0, 0, aDestination.GetName(),
		                   aDestination.GetTarget(), mip, 0, 0, 0, aSource.GetMipWidth(mip),
		                   aSource.GetMipHeight(mip), depth);
	}
	LUMORA_GL_CHECK("Gpu::Context::CopyResource");
	return true;
}

bool Context::CopySubresourceRegion(Texture& aDestination, int aDestinationMip, int aDestinationSlice,
                                    int anX, int aY, int aZ, const Texture& aSource, int aSourceMip,
                                    int aSourceSlice)
{
	const bool sourceVolumeFlag = aSource.GetTarget() == GL_TEXTURE_3D;
	const bool destinationVolumeFlag = aDestination.GetTarget() == GL_TEXTURE_3D;
	const int width = aSource.GetMipWidth(aSourceMip);
	const int height = aSource.GetMipHeight(aSourceMip);
	const int depth = sourceVolumeFlag ? aSource.GetMipDepth(aSourceMip) : 1;
	const bool validFlag =
	    aDestination.IsInitialized() && aSource.IsInitialized() && CopyCompatible(aDestination, aSource) &&
	    aSourceMip >= 0 && aSourceMip < aSource.GetMipLevels() && aDestinationMip >= 0 &&
	    aDestinationMip < aDestination.GetMipLevels() && aSourceSlice >= 0 &&
	    aSourceSlice < (sourceVolumeFlag ? 1 : aSource.GetSliceCount()) && aDestinationSlice >= 0 &&
	    aDestinationSlice < (destinationVolumeFlag ? 1 : aDestination.GetSliceCount()) && anX >= 0 &&
	    aY >= 0 && aZ >= 0 && anX + width <= aDestination.GetMipWidth(aDestinationMip) &&
	    aY + height <= aDestination.GetMipHeight(aDestinationMip) &&
	    aZ + depth <= (destinationVolumeFlag ? aDestination.GetMipDepth(aDestinationMip) : 1);
	if (!validFlag)
	{
		ReportError(__LINE__, "Gpu::Context::CopySubresourceRegion",
		            "Cannot copy mip %d slice %d of '%s' to mip %d slice %d of '%s' at (%d, %d, %d)",
		            aSourceMip, aSourceSlice, aSource.GetDesc().myLabel.c_str(), aDestinationMip,
		            aDestinationSlice, aDestination.GetDesc().myLabel.c_str(), anX, aY, aZ);
		return false;
	}
	// Layers and cube faces are the z coordinate of glCopyImageSubData.
	glCopyImageSubData(aSource.GetName(), aSource.GetTarget(), aSourceMip, 0, 0,
	                   sourceVolumeFlag ? 0 : aSourceSlice, aDestination.GetName(), aDestination.GetTarget(),
	                   aDestinationMip, anX, aY, destinationVolumeFlag ? aZ : aDestinationSlice, width,
	                   height, depth);
	LUMORA_GL_CHECK("Gpu::Context::CopySubresourceRegion");
	return true;
}

void Context::SetSampler(int aUnit, const SamplerState* aSampler)
{
	if (aUnit < 0 || aUnit >= StateCache::ourSamplerUnitCount)
	{
		ReportError(__LINE__, "Gpu::Context::SetSampler", "Sampler unit %d out of range 0..%d", aUnit,
		            StateCache::ourSamplerUnitCount - 1);
		return;
	}
	myStateCache.BindSampler(aUnit, aSampler ? aSampler->GetName() : 0);
}

void Context::SetInputLayout(const InputLayout* aLayout)
{
	if (aLayout != myInputLayout)
	{
		myInputLayout = aLayout;
		myBuffersDirtyFlag = true;
	}
}

bool Context::SetVertexBuffer(uint32_t aSlot, const Buffer* aBuffer, uint32_t aStride, uint32_t anOffset)
{
	if (aSlot >= InputLayout::ourSlotCount || (aBuffer && aBuffer->GetDesc().myKind != BufferKind::Vertex))
	{
		ReportError(__LINE__, "Gpu::Context::SetVertexBuffer", "Cannot bind buffer '%s' to vertex slot %u",
		            aBuffer ? aBuffer->GetDesc().myLabel.c_str() : "", aSlot);
		return false;
	}
	const VertexBinding binding{aBuffer ? aBuffer->GetName() : 0, static_cast<GLintptr>(anOffset),
	                            static_cast<GLsizei>(aStride)};
	VertexBinding& current = myVertexBuffers[aSlot];
	if (binding.myBuffer != current.myBuffer || binding.myOffset != current.myOffset ||
	    binding.myStride != current.myStride)
	{
		current = binding;
		myBuffersDirtyFlag = true;
	}
	return true;
}

bool Context::SetIndexBuffer(const Buffer* aBuffer, IndexFormat aFormat, uint32_t anOffset)
{
	if (aBuffer && (aBuffer->GetDesc().myKind != BufferKind::Index || anOffset % IndexBytes(aFormat) != 0))
	{
		ReportError(__LINE__, "Gpu::Context::SetIndexBuffer",
		            "Cannot use buffer '%s' as an index buffer at offset %u",
		            aBuffer->GetDesc().myLabel.c_str(), anOffset);
		return false;
	}
	myIndexBuffer = aBuffer ? aBuffer->GetName() : 0;
	myIndexBufferSize = aBuffer ? aBuffer->GetDesc().mySize : 0;
	myIndexFormat = aFormat;
	myIndexOffset = anOffset;
	myBuffersDirtyFlag = true;
	return true;
}

void Context::ForgetInputLayout(const InputLayout& aLayout)
{
	myStateCache.ForgetVertexArray(aLayout.GetVertexArray());
	if (myInputLayout == &aLayout)
	{
		myInputLayout = nullptr;
		myBuffersDirtyFlag = true;
	}
}

void Context::ForgetBuffer(GLuint aBuffer)
{
	for (VertexBinding& binding : myVertexBuffers)
	{
		if (binding.myBuffer == aBuffer)
		{
			binding = VertexBinding{};
			myBuffersDirtyFlag = true;
		}
	}
	if (myIndexBuffer == aBuffer)
	{
		myIndexBuffer = 0;
		myIndexBufferSize = 0;
		myIndexOffset = 0;
		myBuffersDirtyFlag = true;
	}
}

void Context::PrepareDraw()
{
	const GLuint vertexArray = myInputLayout ? myInputLayout->GetVertexArray() : myEmptyVertexArray;
	if (myBuffersDirtyFlag)
	{
		const uint32_t usedSlots = myInputLayout ? myInputLayout->GetUsedSlots() : 0;
		for (uint32_t slot = 0; slot < InputLayout::ourSlotCount; ++slot)
		{
			if ((usedSlots & (1u << slot)) != 0)
			{
				const VertexBinding& binding = myVertexBuffers[slot];
				glVertexArrayVertexBuffer(vertexArray, slot, binding.myBuffer, binding.myOffset,
				                          binding.myStride);
			}
		}
		glVertexArrayElementBuffer(vertexArray, myIndexBuffer);
		myBuffersDirtyFlag = false;
	}
	myStateCache.BindVertexArray(vertexArray);
}

void Context::Draw(uint32_t aVertexCount, uint32_t aStartVertex)
{
	PrepareDraw();
	glDrawArrays(ToGlTopology(myTopology), static_cast<GLint>(aStartVertex),
	             static_cast<GLsizei>(aVertexCount));
	LUMORA_GL_CHECK("Gpu::Context::Draw");
}

bool Context::DrawIndexed(uint32_t anIndexCount, uint32_t aStartIndex, int32_t aBaseVertex)
{
	const uint64_t indexBytes = IndexBytes(myIndexFormat);
	const uint64_t end = myIndexOffset + (uint64_t{aStartIndex} + anIndexCount) * indexBytes;
	if (myIndexBuffer == 0 || end > myIndexBufferSize)
	{
		ReportError(__LINE__, "Gpu::Context::DrawIndexed",
		            "%u indices from index %u need %llu bytes; the index buffer has %zu", anIndexCount,
		            aStartIndex, static_cast<unsigned long long>(end), myIndexBufferSize);
		return false;
	}
	PrepareDraw();
	const uintptr_t offset = myIndexOffset + aStartIndex * indexBytes;
	glDrawElementsBaseVertex(ToGlTopology(myTopology), static_cast<GLsizei>(anIndexCount),
	                         myIndexFormat == IndexFormat::UInt16 ? GL_UNSIGNED_SHORT : GL_UNSIGNED_INT,
	                         reinterpret_cast<const void*>(offset), aBaseVertex);
	LUMORA_GL_CHECK("Gpu::Context::DrawIndexed");
	return true;
}
} // namespace Gpu
