#include "renderer/ShadowRenderTargetHelper.h"

#include <algorithm>
#include <cmath>

#include "core/LookTo.h"
#include "engine/Effect.h"
#include "engine/EffectContainer.h"
#include "engine/Engine.h"
#include "engine/ShaderFiles.h"
#include "engine/Texture.h"
#include "model/Model.h"
#include "platform/fx/Variable.h"
#include "platform/gpu/StateCache.h"
#include "renderer/RenderTargetCollector.h"
#include "renderer/post/FullScreenHelper.h"

namespace Zeph
{
namespace
{
constexpr EffectType ourShadowEffects[ShadowRenderTargetHelper::NumberOfShadowShaders] = {
    EFFECT_LIT_MODEL, EFFECT_SKINNED_MODEL, EFFECT_FULL_SCREEN};
constexpr float ourBoxHalfWidth = 25.0f;

// Direct3D's left-handed off-centre orthographic projection (depth 0..1), row vectors.
Matrix44<float> OrthographicOffCenter(float aLeft, float aRight, float aBottom, float aTop, float aNear,
                                      float aFar)
{
	Matrix44<float> projection;
	float* m = projection.myMatrix;
	m[0] = 2.0f / (aRight - aLeft);
	m[5] = 2.0f / (aTop - aBottom);
	m[10] = 1.0f / (aFar - aNear);
	m[12] = (aLeft + aRight) / (aLeft - aRight);
	m[13] = (aTop + aBottom) / (aBottom - aTop);
	m[14] = aNear / (aNear - aFar);
	m[15] = 1.0f;
	return projection;
}
} // namespace

ShadowRenderTargetHelper::ShadowRenderTargetHelper() = default;
ShadowRenderTargetHelper::~ShadowRenderTargetHelper() = default;

bool ShadowRenderTargetHelper::Init(int aShadowMapSize, int aWidth, int aHeight)
{
	Engine* engine = Engine::GetInstance();
	if (engine == nullptr)
	{
		return false;
	}
	myRecomputeFlag = true;
	myShadowMapSize = aShadowMapSize;
	myTarget = std::make_unique<Texture>(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM);
	myDepthBias = 0.0009f;
	myLightRadiusUV = 0.078201f;
	myNear = 0.0025f;
	myFar = 25.0f;
	myDirection = Vector3<float>(0.0f, 1.0f, 0.0f);
	for (int index = 0; index < NumberOfShadowShaders; ++index)
	{
		Effect* effect = engine->GetEffectContainer().GetEffect(ShaderFiles[ourShadowEffects[index]]);
		Fx::Effect* fx = effect != nullptr ? effect->GetEffect() : nullptr;
		myViewProjectionVariables[index] =
		    fx != nullptr ? fx->GetVariableByName("ShadowCasterViewProj") : nullptr;
		myLightRadiusVariables[index] = fx != nullptr ? fx->GetVariableByName("LightRadiusUV") : nullptr;
		myBiasVariables[index] = fx != nullptr ? fx->GetVariableByName("ShadowBias") : nullptr;
	}
	return myTarget->GetRenderTargetView() != nullptr;
}

bool ShadowRenderTargetHelper::Resize(int aWidth, int aHeight)
{
	auto target = std::make_unique<Texture>(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM);
	if (target->GetRenderTargetView() == nullptr)
	{
		return false;
	}
	myTarget = std::move(target);
	return true;
}

void ShadowRenderTargetHelper::Destroy()
{
	myTarget.reset();
	for (int index = 0; index < NumberOfShadowShaders; ++index)
	{
		myViewProjectionVariables[index] = nullptr;
		myLightRadiusVariables[index] = nullptr;
		myBiasVariables[index] = nullptr;
	}
}

Matrix44<float> ShadowRenderTargetHelper::FitCaster(const Vector3<float>& aDirection,
                                                    const Matrix44<float>& aCameraWorld, float aNear,
                                                    float aFar)
{
	Vector3<float> direction = aDirection;
	direction.Normalize();
	// Looking straight up or down, the world's up is parallel to the view: use +Z as up.
	const Vector3<float> up =
	    std::abs(direction.y) > 0.999f ? Vector3<float>(0.0f, 0.0f, 1.0f) : Vector3<float>(0.0f, 1.0f, 0.0f);
	const Matrix44<float> casterView = CreateLookToLH(Vector3<float>(0.0f, 0.0f, 0.0f), direction, up);
	const Matrix44<float> toCaster = aCameraWorld * casterView;
	Vector3<float> minimum(2000000.0f, 2000000.0f, 2000000.0f);
	Vector3<float> maximum(-2000000.0f, -2000000.0f, -2000000.0f);
	for (int corner = 0; corner < 8; ++corner)
	{
		const Vector4<float> local((corner & 1) != 0 ? ourBoxHalfWidth : -ourBoxHalfWidth,
		                           (corner & 2) != 0 ? ourBoxHalfWidth : -ourBoxHalfWidth,
		                           (corner & 4) != 0 ? aFar : aNear, 1.0f);
		const Vector4<float> p = local * toCaster;
		minimum.Set(std::min(minimum.x, p.x), std::min(minimum.y, p.y), std::min(minimum.z, p.z));
		maximum.Set(std::max(maximum.x, p.x), std::max(maximum.y, p.y), std::max(maximum.z, p.z));
	}
	return casterView *
	       OrthographicOffCenter(minimum.x, maximum.x, minimum.y, maximum.y, minimum.z, maximum.z);
}

void ShadowRenderTargetHelper::Publish()
{
	const Vector4<float> radius(myLightRadiusUV, myLightRadiusUV, 0.0f, 0.0f);
	for (int index = 0; index < NumberOfShadowShaders; ++index)
	{
		if (myViewProjectionVariables[index] != nullptr)
		{
			myViewProjectionVariables[index]->SetMatrix(myViewProjection.myMatrix);
			myLightRadiusVariables[index]->SetFloatVector(&radius.x);
			myBiasVariables[index]->SetFloat(myDepthBias);
		}
	}
}

void ShadowRenderTargetHelper::Begin(RenderTargetCollector& aCollector)
{
	if (myRecomputeFlag)
	{
		myViewProjection = FitCaster(myDirection, aCollector.GetCameraWorld(), myNear, myFar);
		myRecomputeFlag = false;
	}
	Publish();
}

void ShadowRenderTargetHelper::End(RenderTargetCollector& aCollector)
{
	(void)aCollector;
}

void ShadowRenderTargetHelper::Render(const RenderBatch& aBatch)
{
	Effect* effect = GetBatchEffect(aBatch);
	if (effect != nullptr)
	{
		DrawBatch(aBatch, *effect,
		          FindTechnique(*effect, aBatch.GetModel()->GetShadowTechniqueName(), "RenderShadowBuffer"));
	}
}

void ShadowRenderTargetHelper::RenderSkinned(const SkinnedRenderBatch& aBatch)
{
	Render(aBatch);
}

void ShadowRenderTargetHelper::Resolve(FullScreenHelper& aFullScreenHelper,
                                       Gpu::ShaderResourceView* aShadowDepth,
                                       Gpu::ShaderResourceView* aLinearDepth,
                                       Gpu::ShaderResourceView* aNormals)
{
	Effect* effect = aFullScreenHelper.GetEffect();
	if (effect == nullptr || !myTarget || myTarget->GetRenderTargetView() == nullptr)
	{
		return;
	}
	effect->SetShaderResource("ShadowDepthTexture", aShadowDepth);
	effect->SetShaderResource("ShadowBlockerTexture", aShadowDepth);
	effect->SetShaderResource("NormalTexture", aNormals);
	effect->SetShaderResource("LinearDepthTexture", aLinearDepth);
	// The linear depth is the source: the target must not be read while it is written.
	const int width = static_cast<int>(myTarget->GetImageInfo().myWidth);
	const int height = static_cast<int>(myTarget->GetImageInfo().myHeight);
	Gpu::Viewport viewport;
	viewport.myWidth = static_cast<float>(width);
	viewport.myHeight = static_cast<float>(height);
	aFullScreenHelper.Process("RenderShadowMap", aLinearDepth, width, height, myTarget->GetRenderTargetView(),
	                          viewport);
	effect->SetShaderResource("ShadowDepthTexture", nullptr);
	effect->SetShaderResource("ShadowBlockerTexture", nullptr);
	Engine::GetInstance()->GetEffectContainer().ForEachEffect([this](Effect& anEffect) {
		anEffect.SetShaderResource("ShadowMap", myTarget->GetShaderResourceView());
	});
}
} // namespace Zeph
