#include "renderer/post/FXAAManager.h"

#include "renderer/post/FullScreenHelper.h"

namespace Zeph
{
bool FXAAManager::Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
                       ComputeHelper* aComputeHelper)
{
	Destroy();
	if (!PostProcessManager::Init(aWidth, aHeight, aFullScreenHelper, aComputeHelper))
	{
		return false;
	}
	myTarget = CreateTarget(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM_SRGB);
	if (!myTarget)
	{
		Destroy();
		return false;
	}
	return true;
}

void FXAAManager::Render(Gpu::RenderTargetView* aDestination, Texture* aSource)
{
	if (myFullScreenHelper != nullptr)
	{
		myFullScreenHelper->Process("RenderFXAA", aSource, aDestination, myWidth, myHeight);
	}
}

bool FXAAManager::ResizeTargets(int aWidth, int aHeight)
{
	std::unique_ptr<Texture> target = CreateTarget(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM_SRGB);
	if (!target)
	{
		return false;
	}
	myTarget = std::move(target);
	return true;
}

void FXAAManager::Destroy()
{
	myTarget.reset();
	PostProcessManager::Destroy();
}
} // namespace Zeph
