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

#include <epoxy/gl.h>

namespace Gpu
{
enum class CullMode
{
	None,
	Front,
	Back,
};

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
	// Direct3D's defaults: back faces culled, clockwise is the front, all writes on.
	void Reset();

	void BindDrawFramebuffer(GLuint aFramebuffer);
	void BindReadFramebuffer(GLuint aFramebuffer);
	// GL unbinds a deleted framebuffer itself; the cache has to hear of it.
	void ForgetFramebuffer(GLuint aFramebuffer);

	void SetViewport(const Viewport& aViewport);
	void SetCullMode(CullMode aMode);
	void SetFrontCounterClockwiseFlag(bool aCounterClockwiseFlag);
	void SetColorWriteFlag(bool anEnabledFlag);
	void SetDepthWriteFlag(bool anEnabledFlag);
	void SetScissorTestFlag(bool anEnabledFlag);

	GLuint GetDrawFramebuffer() const { return myDrawFramebuffer; }
	const Viewport& GetViewport() const { return myViewport; }

private:
	GLuint myDrawFramebuffer = 0;
	GLuint myReadFramebuffer = 0;
	Viewport myViewport;
	CullMode myCullMode = CullMode::Back;
	bool myFrontCounterClockwiseFlag = false;
	bool myColorWriteFlag = true;
	bool myDepthWriteFlag = true;
	bool myScissorTestFlag = false;
};
} // namespace Gpu
