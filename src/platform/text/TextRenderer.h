#pragma once
// TextRenderer: draws laid-out glyphs as alpha-blended quads into whatever render
// target is bound, mapping pixels to clip space through the current viewport.
//
//   Glyphs::TextRenderer renderer;
//   if (!renderer.Init(context)) { ... reported ... }   // compiles its own effect
//   renderer.Draw(context, atlas, layout, 0xFFFFFFFF, Glyphs::DrawFlags::RestoreState, nullptr);
//   renderer.Destroy();
//
// Colours are 0xAABBGGRR (red in the low byte). The shader writes premultiplied
// colour and blends One / InvSrcAlpha, so text over an opaque target leaves it
// opaque and a half-transparent colour shows the background through. Quads carry no
// vertex buffer: their rectangles travel as an effect array, ourBatchGlyphs per draw,
// and the vertex shader builds the corners from gl_VertexID. Clipping to a rectangle
// cuts the quads (and their texture coordinates) on the CPU.
//
// With RestoreState, the blend, depth-stencil and rasterizer states, the program and
// the sampler object on the glyph unit are as they were before the draw. The input
// layout is left unset (null): every engine draw sets its own.

#include <cstdint>
#include <memory>

#include "platform/fx/Effect.h"
#include "platform/text/DrawFlags.h"
#include "platform/text/TextLayout.h"

namespace Gpu
{
class Context;
}

namespace Glyphs
{
class TextRenderer
{
public:
	static constexpr int ourBatchGlyphs = 128;

	TextRenderer() = default;
	~TextRenderer() = default;
	TextRenderer(const TextRenderer&) = delete;
	TextRenderer& operator=(const TextRenderer&) = delete;

	// Compiles the glyph effect from its embedded source; needs a current context.
	bool Init(Gpu::Context& aContext);
	void Destroy();
	bool IsInitialized() const { return myEffect != nullptr; }

	// aClip, when given, is the rectangle nothing is drawn outside of. False, reported,
	// when the viewport is empty or the atlas cannot reach the GPU.
	bool Draw(Gpu::Context& aContext, GlyphAtlas& anAtlas, const TextLayout& aLayout, uint32_t aColor,
	          uint32_t someFlags, const RectF* aClip);

private:
	std::unique_ptr<Fx::Effect> myEffect;
	Fx::Pass* myPass = nullptr;
	Fx::Variable* myRects = nullptr;
	Fx::Variable* myTexCoords = nullptr;
	Fx::Variable* myColor = nullptr;
	Fx::Variable* myAliased = nullptr;
	Fx::Variable* myTexture = nullptr;
};
} // namespace Glyphs
