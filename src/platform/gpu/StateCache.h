#pragma once
// StateCache: the one place that changes GL's global state.
//
// Every binding and fixed-function setting the layer touches goes through here,
// so a redundant change costs a compare instead of a driver call, and code that
// needs a setting (a clear needs all colour channels writable) can ask for it
// without knowing who changed it last. Reset() writes every tracked value, so the
// cache and GL agree after a context is made current for the first time.
//
// Owned by Gpu::Context; one per GL context.

#include <cstdint>
#include <epoxy/gl.h>

#include "platform/gpu/RenderState.h"

namespace Gpu
{
// Direct3D's viewport: top-left corner in pixels, row 0 at the top. Under the
// upper-left clip origin that is also GL's window origin, so nothing is flipped.
struct Viewport
{
	float myTopLeftX = 0.0f;
	float myTopLeftY = 0.0f;
	float myWidth = 0.0f;
	float myHeight = 0.0f;
	float myMinDepth = 0.0f;
	float myMaxDepth = 1.0f;

	bool operator==(const Viewport&) const = default;
};

class StateCache
{
public:
	// Texture units the cache tracks sampler bindings for (GL guarantees 16 per stage).
	static constexpr int ourSamplerUnitCount = 32;

	// Direct3D's defaults: default blend, depth-stencil and rasterizer states.
	void Reset();

	void BindDrawFramebuffer(GLuint aFramebuffer);
	void BindReadFramebuffer(GLuint aFramebuffer);
	// GL unbinds a deleted framebuffer itself; the cache has to hear of it.
	void ForgetFramebuffer(GLuint aFramebuffer);
	void UseProgram(GLuint aProgram);
	void BindVertexArray(GLuint aVertexArray);
	// Units outside 0..ourSamplerUnitCount-1 are ignored; callers check them first.
	void BindSampler(int aUnit, GLuint aSampler);
	// Deleted GL objects are unbound by GL; the cache must not skip a later bind of a reused name.
	void ForgetProgram(GLuint aProgram);
	void ForgetVertexArray(GLuint aVertexArray);
	void ForgetSampler(GLuint aSampler);

	void SetViewport(const Viewport& aViewport);
	void SetBlendState(const BlendState& aState);
	void SetDepthStencilState(const DepthStencilState& aState);
	void SetRasterizerState(const RasterizerState& aState);

	// Single settings that clears need whatever the current states say.
	void SetCullMode(CullMode aMode);
	void SetFrontCounterClockwiseFlag(bool aCounterClockwiseFlag);
	void SetColorWriteMask(uint8_t aMask);
	void SetDepthWriteFlag(bool anEnabledFlag);
	void SetScissorTestFlag(bool anEnabledFlag);

	GLuint GetDrawFramebuffer() const { return myDrawFramebuffer; }
	const Viewport& GetViewport() const { return myViewport; }

private:
	void SetBlendEnableFlag(bool anEnabledFlag);
	void SetDepthTestFlag(bool anEnabledFlag);
	void SetDepthClampFlag(bool anEnabledFlag);

	GLuint myDrawFramebuffer = 0;
	GLuint myReadFramebuffer = 0;
	GLuint myProgram = 0;
	GLuint myVertexArray = 0;
	GLuint mySamplers[ourSamplerUnitCount] = {};
	Viewport myViewport;
	BlendState myBlend;
	bool myDepthTestFlag = true;
	bool myDepthWriteFlag = true;
	Comparison myDepthFunc = Comparison::Less;
	FillMode myFillMode = FillMode::Solid;
	CullMode myCullMode = CullMode::Back;
	bool myFrontCounterClockwiseFlag = false;
	bool myDepthClampFlag = false;
	bool myScissorTestFlag = false;
};
} // namespace Gpu
