#pragma once
// FullScreenHelper: draws full-screen passes of the full-screen effect
// (VertexUV_Shader.fx): one quad per pass of a technique, from a source texture into
// a render target. Every post stage and several renderer passes draw through it.
//
//   Zeph::FullScreenHelper helper;
//   if (!helper.Init()) { ... reported ... }
//   helper.Process("Render", &source, &target);                 // copy, sizes from the textures
//   helper.SetDiffuseTextures(a.GetShaderResourceView(), b.GetShaderResourceView());
//   helper.Process("Bloom", &source, backBuffer, width, height); // unbinds the diffuse textures again
//   helper.Destroy();
//
// The quad's four corners run top-left, top-right, bottom-left, bottom-right as a
// triangle strip, with POSITION (clip space, z 0) and TEXCOORD ((0,0) at the top
// left). The effect belongs to the engine's EffectContainer; the helper owns the
// quad's vertex buffer and input layout. Needs the Engine (its context current).

#include "platform/gpu/Buffer.h"
#include "platform/gpu/InputLayout.h"
#include "platform/gpu/StateCache.h"

namespace Fx
{
class Technique;
class Variable;
} // namespace Fx

namespace Gpu
{
class RenderTargetView;
class ShaderResourceView;
} // namespace Gpu

namespace Zeph
{
class Effect;
class Texture;

class FullScreenHelper
{
public:
	FullScreenHelper() = default;
	~FullScreenHelper();
	FullScreenHelper(const FullScreenHelper&) = delete;
	FullScreenHelper& operator=(const FullScreenHelper&) = delete;

	// Loads the effect, resolves its variables and makes the quad; false, with a
	// critical report, when the effect or one of its variables is missing.
	bool Init();
	void Destroy();

	Effect* GetEffect();
	void SetElapsedTime(float aTime);
	// Sets "DiffuseTexture", "SecondaryDiffuseTexture" and "TertiaryDiffuseTexture" for
	// the next Process, which unbinds them afterwards (null leaves a slot empty).
	void SetDiffuseTextures(Gpu::ShaderResourceView* aDiffuse, Gpu::ShaderResourceView* aSecondary = nullptr,
	                        Gpu::ShaderResourceView* aTertiary = nullptr);
	// "VelocityTexture"; stays bound until set to null.
	void SetVelocityTexture(Gpu::ShaderResourceView* aVelocity);

	// Draws every pass of the named technique, one quad per pass, into aTarget over
	// aViewport, with aSource bound as "SourceTexture" and InvTargetSize, InvSourceSize
	// and ScreenSize set; then unbinds "SourceTexture" and the five diffuse textures
	// and applies pass 0 again. A technique the effect lacks is reported and nothing
	// is drawn.
	void Process(const char* aTechnique, Gpu::ShaderResourceView* aSource, int aSourceWidth,
	             int aSourceHeight, Gpu::RenderTargetView* aTarget, const Gpu::Viewport& aViewport);
	// Sizes from the textures; a null source takes the target's size.
	void Process(const char* aTechnique, Texture* aSource, Texture* aTarget);
	// Into aTarget over (0, 0, aWidth, aHeight).
	void Process(const char* aTechnique, Texture* aSource, Gpu::RenderTargetView* aTarget, int aWidth,
	             int aHeight);

	// Applies pass 0 of the technique without drawing, so that textures set to null
	// since the last draw leave their texture units (a stage does this after
	// unbinding inputs of its own).
	void ApplyFirstPass(const char* aTechnique);

private:
	// The named technique; null, reported, when the effect has none of that name.
	Fx::Technique* FindTechnique(const char* aTechnique, const char* aFunctionName);
	bool CreateQuad();
	void UnbindTextures();

	Effect* myEffect = nullptr;
	Fx::Variable* myElapsedTimeVariable = nullptr;
	Fx::Variable* mySourceSRV = nullptr;
	Fx::Variable* myDiffuseSRV = nullptr;
	Fx::Variable* mySecondarySRV = nullptr;
	Fx::Variable* myTertiarySRV = nullptr;
	Fx::Variable* myQuartarySRV = nullptr;
	Fx::Variable* myQuintiarySRV = nullptr;
	Fx::Variable* myVelocitySRV = nullptr;
	Fx::Variable* myInvTargetSizeVariable = nullptr;
	Fx::Variable* myInvSourceSizeVariable = nullptr;
	Fx::Variable* myScreenSizeVariable = nullptr;
	Gpu::Buffer myVertexBuffer;
	Gpu::InputLayout myInputLayout;
	bool myQuadFlag = false;
};
} // namespace Zeph
