#include "renderer/post/MotionBlurManager.h"

#include "engine/Effect.h"
#include "engine/EngineReport.h"
#include "platform/fx/Variable.h"
#include "platform/gpu/Formats.h"
#include "renderer/post/FullScreenHelper.h"

namespace Zeph
{
namespace
{
// Two 32-bit floats per pixel; half floats where the GPU layer has no R32G32 target
// (screen velocities in texture units need no more than that).
constexpr Dds::Format ourVelocityFormat = Gpu::GetFormatInfo(Dds::Format::R32G32_FLOAT).IsSupported()
                                              ? Dds::Format::R32G32_FLOAT
                                              : Dds::Format::R16G16_FLOAT;
} // namespace

bool MotionBlurManager::Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
                             ComputeHelper* aComputeHelper)
{
	const char* function = "Zeph::MotionBlurManager::Init";
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
	Fx::Variable* factor = effect->GetEffect()->GetVariableByName("BlurFactor");
	Fx::Variable* scale = effect->GetEffect()->GetVariableByName("BlurScale");
	if (!factor->IsValid() || !scale->IsValid())
	{
		ReportCritical(__LINE__, function, "BlurFactor or BlurScale is invalid");
		Destroy();
		return false;
	}
	factor->SetFloat(ourBlurFactor);
	scale->SetFloat(ourBlurScale);
	myVelocityBuffer = CreateTarget(aWidth, aHeight, ourVelocityFormat);
	if (!myVelocityBuffer)
	{
		Destroy();
		return false;
	}
	return true;
}

void MotionBlurManager::Render(Gpu::RenderTargetView* aDestination, Texture* aSource)
{
	if (myFullScreenHelper == nullptr)
	{
		return;
	}
	myFullScreenHelper->SetVelocityTexture(myVelocityBuffer->GetShaderResourceView());
	myFullScreenHelper->Process("RenderFullBlur", aSource, aDestination, myWidth, myHeight);
	// The renderer draws velocities into the buffer next frame: it must not stay bound.
	myFullScreenHelper->SetVelocityTexture(nullptr);
	myFullScreenHelper->ApplyFirstPass("RenderFullBlur");
}

bool MotionBlurManager::ResizeTargets(int aWidth, int aHeight)
{
	std::unique_ptr<Texture> buffer = CreateTarget(aWidth, aHeight, ourVelocityFormat);
	if (!buffer)
	{
		return false;
	}
	myVelocityBuffer = std::move(buffer);
	return true;
}

void MotionBlurManager::Destroy()
{
	myVelocityBuffer.reset();
	PostProcessManager::Destroy();
}
} // namespace Zeph
