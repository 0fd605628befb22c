#include "renderer/post/SSAOManager.h"

#include <cmath>
#include <cstdlib>

#include "engine/Effect.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "platform/fx/Variable.h"
#include "platform/gpu/Context.h"
#include "renderer/post/FullScreenHelper.h"

namespace Zeph
{
namespace
{
// A component in -1..1 from rand(). The directions were tuned with a generator of
// 15 bits (RAND_MAX 32767); the low 15 bits keep that range wherever RAND_MAX is larger.
float RandomComponent()
{
	return static_cast<float>(2.0 * ((std::rand() & 0x7fff) / 32767.0) - 1.0);
}
} // namespace

bool SSAOManager::Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
                       ComputeHelper* aComputeHelper)
{
	const char* function = "Zeph::SSAOManager::Init";
	Destroy();
	if (!PostProcessManager::Init(aWidth, aHeight, aFullScreenHelper, aComputeHelper))
	{
		return false;
	}
	Effect* effect = aFullScreenHelper->GetEffect();
	if (effect == nullptr)
	{
		ReportCritical(__LINE__, function, "The full-screen helper has no effect");
		Destroy();
		return false;
	}
	Fx::Effect& fx = *effect->GetEffect();
	Fx::Variable* randomVectors = fx.GetVariableByName("Randvectors");
	myNormalTexture = fx.GetVariableByName("NormalTexture");
	myLinearDepthTexture = fx.GetVariableByName("LinearDepthTexture");
	myAOTexture = fx.GetVariableByName("AOTexture");
	bool resultFlag = true;
	for (const Fx::Variable* variable : {randomVectors, myNormalTexture, myLinearDepthTexture, myAOTexture})
	{
		if (!variable->IsValid())
		{
			resultFlag = false;
		}
	}
	if (!resultFlag)
	{
		ReportCritical(
		    __LINE__, function,
		    "The full-screen effect lacks Randvectors, NormalTexture, LinearDepthTexture or AOTexture");
	}
	if (!resultFlag || !MakeBuffers(aWidth, aHeight, myOcclusionBuffer, myHalfBuffer, myBlurBuffer))
	{
		Destroy();
		return false;
	}
	CreateRandomVectors();
	randomVectors->SetFloatVectorArray(&myRandomVectors[0].x, 0, ourRandomVectorCount);
	return true;
}

bool SSAOManager::MakeBuffers(int aWidth, int aHeight, std::unique_ptr<Texture>& anOcclusionOut,
                              std::unique_ptr<Texture>& aHalfOut, std::unique_ptr<Texture>& aBlurOut)
{
	anOcclusionOut = CreateTarget(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM);
	aHalfOut = CreateTarget(aWidth / 2, aHeight / 2, Dds::Format::R8G8B8A8_UNORM);
	aBlurOut = CreateTarget(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM);
	if (!anOcclusionOut || !aHalfOut || !aBlurOut)
	{
		return false;
	}
	const float white[4] = {1.0f, 1.0f, 1.0f, 1.0f};
	Engine::GetInstance()->GetContext().ClearRenderTargetView(*aBlurOut->GetRenderTargetView(), white);
	return true;
}

bool SSAOManager::ResizeTargets(int aWidth, int aHeight)
{
	std::unique_ptr<Texture> occlusion;
	std::unique_ptr<Texture> half;
	std::unique_ptr<Texture> blur;
	if (!MakeBuffers(aWidth, aHeight, occlusion, half, blur))
	{
		return false;
	}
	myOcclusionBuffer = std::move(occlusion);
	myHalfBuffer = std::move(half);
	myBlurBuffer = std::move(blur);
	return true;
}

void SSAOManager::CreateRandomVectors()
{
	for (Vector4<float>& vector : myRandomVectors)
	{
		// Evaluated in order x, y, z, so the sequence of rand() calls is fixed.
		const float x = RandomComponent();
		const float y = RandomComponent();
		const float z = RandomComponent();
		const float length = std::sqrt(x * x + y * y + z * z);
		vector = length > 0.0f ? Vector4<float>(x / length, y / length, z / length, 0.0f)
		                       : Vector4<float>(x, y, z, 0.0f);
	}
}

void SSAOManager::ComputeOcclusion(Gpu::ShaderResourceView* aNormal, Gpu::ShaderResourceView* aLinearDepth)
{
	if (myFullScreenHelper == nullptr)
	{
		return;
	}
	myNormalTexture->SetResource(aNormal);
	myLinearDepthTexture->SetResource(aLinearDepth);
	myFullScreenHelper->Process("RenderSSAO", nullptr, myOcclusionBuffer.get());
	myFullScreenHelper->Process("RenderBilaterialHorz", myOcclusionBuffer.get(), myBlurBuffer.get());
	myFullScreenHelper->Process("RenderBilaterialVert", myBlurBuffer.get(), myOcclusionBuffer.get());
	myNormalTexture->SetResource(nullptr);
	myLinearDepthTexture->SetResource(nullptr);
	myFullScreenHelper->ApplyFirstPass("RenderSSAO");
}

void SSAOManager::Render(Gpu::RenderTargetView* aDestination, Texture* aSource)
{
	if (myFullScreenHelper == nullptr)
	{
		return;
	}
	myAOTexture->SetResource(myOcclusionBuffer->GetShaderResourceView());
	myFullScreenHelper->Process("RenderApplySSAO", aSource, aDestination, myWidth, myHeight);
	myAOTexture->SetResource(nullptr);
	myFullScreenHelper->ApplyFirstPass("RenderApplySSAO");
}

void SSAOManager::Destroy()
{
	myOcclusionBuffer.reset();
	myHalfBuffer.reset();
	myBlurBuffer.reset();
	myNormalTexture = nullptr;
	myLinearDepthTexture = nullptr;
	myAOTexture = nullptr;
	PostProcessManager::Destroy();
}
} // namespace Zeph
