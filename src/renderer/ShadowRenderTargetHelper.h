#pragma once
// ShadowRenderTargetHelper: one directional shadow caster. Its Begin fits an
// orthographic caster to a box in front of the viewer (x and y within +-25, z from
// 0.0025 to 25 in the viewing camera's space), seen along the caster direction, and
// publishes the caster's view-projection, the light radius and the depth bias to the
// effects that take shadows (the two model effects and the full-screen effect). The
// batches are drawn depth only into the shadow depth buffer that the renderer binds.
// Resolve turns the shadow map into a screen-space visibility texture ("ShadowMap").
// The visibility target is screen-sized: the resolve is one filtered lookup per
// screen pixel, and a target of the map's size (up to 4096 x 4096) would cost up to
// a hundred times the fragments for no detail the screen can show.
#include <memory>

#include "core/Matrix44.h"
#include "core/Vector3.h"
#include "renderer/RenderTargetHelper.h"

namespace Fx
{
class Variable;
}
namespace Gpu
{
class ShaderResourceView;
}

namespace Zeph
{
class FullScreenHelper;
class Texture;

class ShadowRenderTargetHelper : public RenderTargetHelper
{
public:
	static constexpr int NumberOfShadowShaders = 3;

	ShadowRenderTargetHelper();
	~ShadowRenderTargetHelper() override;

	bool Init(int aShadowMapSize, int aWidth, int aHeight);
	// The frame-sized target the shadow map resolves into made again at a new size; the
	// caster and its settings stay. The old target stays when the new one cannot be made.
	bool Resize(int aWidth, int aHeight);
	void Destroy();

	void SetRecomputeFlag(bool aFlag) { myRecomputeFlag = aFlag; }
	// The direction the caster's light travels along; (0, 1, 0) after Init.
	void SetCasterDirection(const Vector3<float>& aDirection) { myDirection = aDirection; }
	const Vector3<float>& GetCasterDirection() const { return myDirection; }
	const Matrix44<float>& GetCasterViewProjection() const { return myViewProjection; }
	Texture* GetTarget() const { return myTarget.get(); }
	int GetShadowMapSize() const { return myShadowMapSize; }

	void Begin(RenderTargetCollector& aCollector) override;
	void End(RenderTargetCollector& aCollector) override;
	void Render(const RenderBatch& aBatch) override;
	void RenderSkinned(const SkinnedRenderBatch& aBatch) override;

	// Resolves the shadow map against the G-buffer's linear depth (and its normals,
	// which offset each receiver off its surface) with "RenderShadowMap" into the
	// target and publishes it as "ShadowMap".
	void Resolve(FullScreenHelper& aFullScreenHelper, Gpu::ShaderResourceView* aShadowDepth,
	             Gpu::ShaderResourceView* aLinearDepth, Gpu::ShaderResourceView* aNormals);

	// The caster fit on its own (for tests): view along aDirection, orthographic
	// bounds of the viewer's box transformed by aCameraWorld.
	static Matrix44<float> FitCaster(const Vector3<float>& aDirection, const Matrix44<float>& aCameraWorld,
	                                 float aNear, float aFar);

private:
	void Publish();

	bool myRecomputeFlag = true;
	std::unique_ptr<Texture> myTarget;
	int myShadowMapSize = 0;
	float myDepthBias = 0.0009f;
	float myLightRadiusUV = 0.078201f;
	float myNear = 0.0025f;
	float myFar = 25.0f;
	Vector3<float> myDirection{0.0f, 1.0f, 0.0f};
	Matrix44<float> myViewProjection;
	Fx::Variable* myViewProjectionVariables[NumberOfShadowShaders] = {};
	Fx::Variable* myLightRadiusVariables[NumberOfShadowShaders] = {};
	Fx::Variable* myBiasVariables[NumberOfShadowShaders] = {};
};
} // namespace Zeph
