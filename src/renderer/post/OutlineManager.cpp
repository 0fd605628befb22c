#include "renderer/post/OutlineManager.h"

#include <cmath>
#include <numbers>

#include "engine/Effect.h"
#include "engine/Engine.h"
#include "engine/EngineReport.h"
#include "platform/fx/Variable.h"
#include "platform/gpu/Context.h"
#include "renderer/post/FullScreenHelper.h"

namespace Zeph
{
OutlineManager::Kernel OutlineManager::ComputeKernel(int aSize, bool aHorizontalFlag)
{
	const double variance = static_cast<double>(ourDeviation) * ourDeviation;
	const double normalisation = 1.0 / std::sqrt(2.0 * std::numbers::pi * variance);
	const double texel = aSize > 0 ? 1.0 / aSize : 0.0;
	Kernel kernel;
	for (int tap = 0; tap < ourTapCount; ++tap)
	{
		const int offset = tap - ourTapCount / 2;
		// The centre keeps the plain Gaussian weight; the other taps are lifted so the
		// glow reaches further than the blur alone would carry it.
		const double weight =
		    offset == 0 ? normalisation
		                : ourMultiplier * std::exp(-(offset * offset) / (2.0 * variance)) * normalisation;
		const float shift = static_cast<float>(offset * texel);
		kernel.myOffsets[tap] = aHorizontalFlag ? Vector4<float>(shift, 0.0f, 0.0f, 0.0f)
		                                        : Vector4<float>(0.0f, shift, 0.0f, 0.0f);
		const float value = static_cast<float>(weight);
		kernel.myWeights[tap] = Vector4<float>(value, value, value, value);
	}
	return kernel;
}

bool OutlineManager::Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
                          ComputeHelper* aComputeHelper)
{
	const char* function = "Zeph::OutlineManager::Init";
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
	const bool resultFlag = PublishKernels(*effect, aWidth, aHeight);
	myTarget = CreateTarget(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM_SRGB);
	if (!resultFlag || !myTarget || !myChain.Init(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM_SRGB))
	{
		Destroy();
		return false;
	}
	return true;
}

void OutlineManager::Render(Gpu::RenderTargetView* aDestination, Texture* aSource)
{
	Render(aDestination, myWidth, myHeight, aSource);
}

void OutlineManager::Render(Gpu::RenderTargetView* aDestination, int aWidth, int aHeight, Texture* aSource)
{
	if (myFullScreenHelper == nullptr)
	{
		return;
	}
	myChain.Render(*myFullScreenHelper, aSource, "DownSamplePoint", "HorOutlineBlur", "VertOutlineBlur");
	myFullScreenHelper->SetDiffuseTextures(myChain.GetResult(0)->GetShaderResourceView(),
	                                       myChain.GetResult(1)->GetShaderResourceView(),
	                                       myChain.GetResult(2)->GetShaderResourceView());
	myFullScreenHelper->Process("Outline", aSource, aDestination, aWidth, aHeight);
	Engine::GetInstance()->GetContext().SetRenderTargets({}, nullptr);
}

bool OutlineManager::PublishKernels(Effect& anEffect, int aWidth, int aHeight)
{
	const Kernel horizontal = ComputeKernel(aWidth, true);
	const Kernel vertical = ComputeKernel(aHeight, false);
	const struct
	{
		const char* myName;
		const std::array<Vector4<float>, ourTapCount>& myValues;
	} arrays[] = {
	    {"horSampleOffsets", horizontal.myOffsets},
	    {"horSampleWeights", horizontal.myWeights},
	    {"vertSampleOffsets", vertical.myOffsets},
	    {"vertSampleWeights", vertical.myWeights},
	};
	bool resultFlag = true;
	for (const auto& entry : arrays)
	{
		Fx::Variable* variable = anEffect.GetEffect()->GetVariableByName(entry.myName);
		if (!variable->IsValid())
		{
			ReportCritical(__LINE__, "Zeph::OutlineManager::Init", "%s is invalid", entry.myName);
			resultFlag = false;
			continue;
		}
		variable->SetFloatVectorArray(&entry.myValues[0].x, 0, ourTapCount);
	}
	return resultFlag;
}

bool OutlineManager::ResizeTargets(int aWidth, int aHeight)
{
	Effect* effect = myFullScreenHelper->GetEffect();
	std::unique_ptr<Texture> target = CreateTarget(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM_SRGB);
	if (effect == nullptr || !target || !myChain.Resize(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM_SRGB))
	{
		return false;
	}
	myTarget = std::move(target);
	// The blur's taps are a texel apart, so they follow the size.
	PublishKernels(*effect, aWidth, aHeight);
	return true;
}

void OutlineManager::Destroy()
{
	myChain.Destroy();
	myTarget.reset();
	PostProcessManager::Destroy();
}
} // namespace Zeph
