#include "platform/text/TextRenderer.h"

#include <algorithm>
#include <epoxy/gl.h>
#include <vector>

#include "platform/fx/Compiler.h"
#include "platform/gpu/Context.h"
#include "platform/gpu/GlEnums.h"
#include "platform/gpu/Report.h"

namespace Glyphs
{
namespace
{
// The glyph effect. Each quad is six vertices (two clockwise triangles) whose corners
// come from the quad's rectangle in clip space and its texel rectangle in the page.
constexpr const char* ourEffectSource = R"(
uniform vec4 GlyphRects[128];     // left, top, right, bottom in clip space
uniform vec4 GlyphTexCoords[128]; // left, top, right, bottom in the page
uniform vec4 TextColor;
uniform int AliasedFlag;
uniform sampler2D GlyphTexture;

sampler GlyphTexture
{
	Filter = MIN_MAG_MIP_POINT;
	AddressU = Clamp;
	AddressV = Clamp;
}

vertex VS_Glyph
{
	out vec2 vTexCoord;

	void main()
	{
		const int corners[6] = int[6](0, 1, 2, 0, 2, 3); // top-left, top-right, bottom-right, bottom-left
		const int glyph = gl_VertexID / 6;
		const int corner = corners[gl_VertexID % 6];
		const bool rightFlag = corner == 1 || corner == 2;
		const bool bottomFlag = corner >= 2;
		const vec4 rect = GlyphRects[glyph];
		const vec4 texCoords = GlyphTexCoords[glyph];
		gl_Position = vec4(rightFlag ? rect.z : rect.x, bottomFlag ? rect.w : rect.y, 0.0, 1.0);
		vTexCoord = vec2(rightFlag ? texCoords.z : texCoords.x, bottomFlag ? texCoords.w : texCoords.y);
	}
}

fragment PS_Glyph
{
	in vec2 vTexCoord;
	out vec4 oColor;

	void main()
	{
		float coverage = texture(GlyphTexture, vTexCoord).r;
		if (AliasedFlag != 0)
		{
			coverage = coverage >= 0.5 ? 1.0 : 0.0;
		}
		const float alpha = TextColor.a * coverage;
		oColor = vec4(TextColor.rgb * alpha, alpha);
	}
}

technique Render
{
	pass P0
	{
		VertexShader = VS_Glyph;
		PixelShader = PS_Glyph;
		BlendEnable = true;
		SrcBlend = One;
		DestBlend = InvSrcAlpha;
		SrcBlendAlpha = One;
		DestBlendAlpha = InvSrcAlpha;
		DepthEnable = false;
		DepthWriteMask = Zero;
		CullMode = None;
	}
}
)";

template <typename Enum, typename Mapping>
Enum FromGl(GLint aValue, int aCount, Mapping aMapping, Enum aFallback)
{
	for (int index = 0; index < aCount; ++index)
	{
		if (static_cast<GLint>(aMapping(static_cast<Enum>(index))) == aValue)
		{
			return static_cast<Enum>(index);
		}
	}
	return aFallback;
}

GLint GetInteger(GLenum aName)
{
	GLint value = 0;
	glGetIntegerv(aName, &value);
	return value;
}

// What a draw changes, read back from GL (which the state cache keeps in step) so it
// can be set again through the cache.
struct SavedState
{
	Gpu::BlendState myBlend;
	Gpu::DepthStencilState myDepth;
	Gpu::RasterizerState myRasterizer;
	GLuint myProgram = 0;
	GLuint mySampler = 0;

	void Read(int aUnit)
	{
		myBlend.myEnableFlag = glIsEnabled(GL_BLEND) == GL_TRUE;
		auto blend = [](GLenum aName) {
			return FromGl(GetInteger(aName), 13, Gpu::ToGlBlend, Gpu::Blend::One);
		};
		auto op = [](GLenum aName) {
			return FromGl(GetInteger(aName), 5, Gpu::ToGlBlendOp, Gpu::BlendOp::Add);
		};
		myBlend.myColor = {blend(GL_BLEND_SRC_RGB), blend(GL_BLEND_DST_RGB), op(GL_BLEND_EQUATION_RGB)};
		myBlend.myAlpha = {blend(GL_BLEND_SRC_ALPHA), blend(GL_BLEND_DST_ALPHA), op(GL_BLEND_EQUATION_ALPHA)};
		GLboolean mask[4] = {GL_TRUE, GL_TRUE, GL_TRUE, GL_TRUE};
		glGetBooleanv(GL_COLOR_WRITEMASK, mask);
		myBlend.myWriteMask = static_cast<uint8_t>(
		    (mask[0] ? Gpu::ColorWrite::Red : 0) | (mask[1] ? Gpu::ColorWrite::Green : 0) |
		    (mask[2] ? Gpu::ColorWrite::Blue : 0) | (mask[3] ? Gpu::ColorWrite::Alpha : 0));
		myDepth.myDepthEnableFlag = glIsEnabled(GL_DEPTH_TEST) == GL_TRUE;
		GLboolean depthWrite = GL_TRUE;
		glGetBooleanv(GL_DEPTH_WRITEMASK, &depthWrite);
		myDepth.myDepthWriteFlag = depthWrite == GL_TRUE;
		myDepth.myDepthFunc =
		    FromGl(GetInteger(GL_DEPTH_FUNC), 8, Gpu::ToGlComparison, Gpu::Comparison::Less);
		GLint polygonMode[2] = {GL_FILL, GL_FILL};
		glGetIntegerv(GL_POLYGON_MODE, polygonMode);
		myRasterizer.myFillMode = polygonMode[0] == GL_LINE ? Gpu::FillMode::Wireframe : Gpu::FillMode::Solid;
		myRasterizer.myCullMode = glIsEnabled(GL_CULL_FACE) != GL_TRUE        ? Gpu::CullMode::None
		                          : GetInteger(GL_CULL_FACE_MODE) == GL_FRONT ? Gpu::CullMode::Front
		                                                                      : Gpu::CullMode::Back;
		myRasterizer.myFrontCounterClockwiseFlag = GetInteger(GL_FRONT_FACE) == GL_CCW;
		myRasterizer.myDepthClipFlag = glIsEnabled(GL_DEPTH_CLAMP) != GL_TRUE;
		myRasterizer.myScissorFlag = glIsEnabled(GL_SCISSOR_TEST) == GL_TRUE;
		myProgram = static_cast<GLuint>(GetInteger(GL_CURRENT_PROGRAM));
		const GLint activeUnit = GetInteger(GL_ACTIVE_TEXTURE);
		glActiveTexture(static_cast<GLenum>(GL_TEXTURE0 + aUnit));
		mySampler = static_cast<GLuint>(GetInteger(GL_SAMPLER_BINDING));
		glActiveTexture(static_cast<GLenum>(activeUnit));
	}

	void Restore(Gpu::Context& aContext, int aUnit) const
	{
		aContext.SetBlendState(myBlend);
		aContext.SetDepthStencilState(myDepth);
		aContext.SetRasterizerState(myRasterizer);
		aContext.GetStateCache().UseProgram(myProgram);
		aContext.GetStateCache().BindSampler(aUnit, mySampler);
	}
};
} // namespace

bool TextRenderer::Init(Gpu::Context& aContext)
{
	const char* function = "Glyphs::TextRenderer::Init";
	Destroy();
	Fx::CompileOutput output;
	if (!Fx::CompileFromMemory(ourEffectSource, "Glyphs/TextRenderer.fx", output))
	{
		Gpu::ReportError(__LINE__, function, "The text effect does not compile: %s",
		                 output.myMessages.c_str());
		return false;
	}
	auto effect = std::make_unique<Fx::Effect>();
	if (!effect->Init(aContext, output.myCompiled, "text renderer"))
	{
		return false;
	}
	myPass = effect->GetTechniqueByName("Render")->GetPassByIndex(0);
	myRects = effect->GetVariableByName("GlyphRects");
	myTexCoords = effect->GetVariableByName("GlyphTexCoords");
	myColor = effect->GetVariableByName("TextColor");
	myAliased = effect->GetVariableByName("AliasedFlag");
	myTexture = effect->GetVariableByName("GlyphTexture");
	if (myPass == nullptr || !myRects->IsValid() || !myTexCoords->IsValid() || !myColor->IsValid() ||
	    !myTexture->IsValid())
	{
		Gpu::ReportError(__LINE__, function, "The text effect lacks its pass or variables");
		effect->Destroy();
		return false;
	}
	myEffect = std::move(effect);
	return true;
}

void TextRenderer::Destroy()
{
	if (myEffect)
	{
		myEffect->Destroy();
		myEffect.reset();
	}
	myPass = nullptr;
	myRects = nullptr;
	myTexCoords = nullptr;
	myColor = nullptr;
	myAliased = nullptr;
	myTexture = nullptr;
}

bool TextRenderer::Draw(Gpu::Context& aContext, GlyphAtlas& anAtlas, const TextLayout& aLayout,
                        uint32_t aColor, uint32_t someFlags, const RectF* aClip)
{
	const char* function = "Glyphs::TextRenderer::Draw";
	if (!myEffect)
	{
		Gpu::ReportError(__LINE__, function, "The text renderer is not initialised");
		return false;
	}
	if (aLayout.GetGlyphs().empty())
	{
		return true;
	}
	const Gpu::Viewport viewport = aContext.GetStateCache().GetViewport();
	if (!(viewport.myWidth > 0.0f) || !(viewport.myHeight > 0.0f))
	{
		Gpu::ReportError(__LINE__, function, "No viewport to draw text into (%g x %g)",
		                 static_cast<double>(viewport.myWidth), static_cast<double>(viewport.myHeight));
		return false;
	}
	if (!anAtlas.Upload(aContext))
	{
		return false;
	}
	const int unit = myTexture->GetUnit();
	SavedState saved;
	const bool restoreFlag = (someFlags & DrawFlags::RestoreState) != 0;
	if (restoreFlag)
	{
		saved.Read(unit);
	}
	const float color[4] = {static_cast<float>(aColor & 0xFFu) / 255.0f,
	                        static_cast<float>((aColor >> 8) & 0xFFu) / 255.0f,
	                        static_cast<float>((aColor >> 16) & 0xFFu) / 255.0f,
	                        static_cast<float>((aColor >> 24) & 0xFFu) / 255.0f};
	myColor->SetFloatVector(color);
	myAliased->SetInt((someFlags & DrawFlags::Aliased) != 0 ? 1 : 0);
	aContext.SetInputLayout(nullptr);
	aContext.SetPrimitiveTopology(Gpu::PrimitiveTopology::TriangleList);

	auto toClipX = [&](float aPixel) {
		return (aPixel - viewport.myTopLeftX) / viewport.myWidth * 2.0f - 1.0f;
	};
	auto toClipY = [&](float aPixel) {
		return 1.0f - (aPixel - viewport.myTopLeftY) / viewport.myHeight * 2.0f;
	};
	std::vector<float> rects;
	std::vector<float> texCoords;
	auto flush = [&]() {
		const int count = static_cast<int>(rects.size() / 4);
		if (count > 0)
		{
			myRects->SetFloatVectorArray(rects.data(), 0, count);
			myTexCoords->SetFloatVectorArray(texCoords.data(), 0, count);
			myPass->Apply(aContext);
			aContext.Draw(static_cast<uint32_t>(count * 6), 0);
		}
		rects.clear();
		texCoords.clear();
	};
	// One page at a time: the page is the texture of a whole batch.
	for (int page = 0; page < anAtlas.GetPageCount(); ++page)
	{
		const float pageSize = static_cast<float>(anAtlas.GetPageSize(page));
		myTexture->SetResource(anAtlas.GetPageView(page));
		for (const PlacedGlyph& placed : aLayout.GetGlyphs())
		{
			const Glyph& glyph = *placed.myGlyph;
			if (glyph.myPage != page)
			{
				continue;
			}
			float left = static_cast<float>(placed.myX);
			float top = static_cast<float>(placed.myY);
			float right = left + static_cast<float>(glyph.myWidth);
			float bottom = top + static_cast<float>(glyph.myHeight);
			float texLeft = static_cast<float>(glyph.myAtlasX);
			float texTop = static_cast<float>(glyph.myAtlasY);
			if (aClip != nullptr)
			{
				// Cut the quad to the clip rectangle; the texels follow the cut one to one.
				const float clippedLeft = std::max(left, aClip->myLeft);
				const float clippedTop = std::max(top, aClip->myTop);
				right = std::min(right, aClip->myRight);
				bottom = std::min(bottom, aClip->myBottom);
				texLeft += clippedLeft - left;
				texTop += clippedTop - top;
				left = clippedLeft;
				top = clippedTop;
				if (!(left < right) || !(top < bottom))
				{
					continue;
				}
			}
			rects.insert(rects.end(), {toClipX(left), toClipY(top), toClipX(right), toClipY(bottom)});
			texCoords.insert(texCoords.end(),
			                 {texLeft / pageSize, texTop / pageSize, (texLeft + right - left) / pageSize,
			                  (texTop + bottom - top) / pageSize});
			if (static_cast<int>(rects.size() / 4) == ourBatchGlyphs)
			{
				flush();
			}
		}
		flush();
	}
	// The page is not left bound in the effect; the texture unit still holds it until the next pass.
	myTexture->SetResource(nullptr);
	if (restoreFlag)
	{
		saved.Restore(aContext, unit);
	}
	LUMORA_GL_CHECK(function);
	return true;
}
} // namespace Glyphs
