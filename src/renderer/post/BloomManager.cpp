#include "renderer/post/BloomManager.h"

#include "renderer/post/FullScreenHelper.h"

namespace Zeph
{
bool BloomManager::Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
                        ComputeHelper* aComputeHelper)
{
	Destroy();
	if (!PostProcessManager::Init(aWidth, aHeight, aFullScreenHelper, aComputeHelper))
	{
		return false;
	}
	myTarget = CreateTarget(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM_SRGB);
	if (!myTarget || !myChain.Init(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM_SRGB))
	{
		Destroy();
		return false;
	}
	return true;
}

void BloomManager::Render(Gpu::RenderTargetView* aDestination, Texture* aSource)
{
	if (myFullScreenHelper == nullptr)
	{
		return;
	}
	myChain.Render(*myFullScreenHelper, aSource, "DownSamplePointHiPass", "HorBlur", "VertBlur");
	myFullScreenHelper->SetDiffuseTextures(myChain.GetResult(0)->GetShaderResourceView(),
	                                       myChain.GetResult(1)->GetShaderResourceView(),
	                                       myChain.GetResult(2)->GetShaderResourceView());
	myFullScreenHelper->Process("Bloom", aSource, aDestination, myWidth, myHeight);
}

bool BloomManager::ResizeTargets(int aWidth, int aHeight)
{
	std::unique_ptr<Texture> target = CreateTarget(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM_SRGB);
	if (!target || !myChain.Resize(aWidth, aHeight, Dds::Format::R8G8B8A8_UNORM_SRGB))
	{
		return false;
	}
	myTarget = std::move(target);
	return true;
}

void BloomManager::Destroy()
{
	myChain.Destroy();
	myTarget.reset();
	PostProcessManager::Destroy();
}
} // namespace Zeph
