#include "renderer/post/HDR_Manager.h"

#include <algorithm>
#include <cmath>

#include "engine/Engine.h"
#include "platform/gpu/Context.h"
#include "renderer/post/FullScreenHelper.h"

namespace Zeph
{
int HDR_Manager::ComputeLuminanceCount(int aWidth, int aHeight)
{
	const int smallest = std::min(aWidth, aHeight);
	if (smallest < 2)
	{
		return 1;
	}
	return static_cast<int>(std::log(static_cast<double>(smallest)) / std::log(2.0)) + 1;
}

bool HDR_Manager::Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
                       ComputeHelper* aComputeHelper)
{
	Destroy();
	if (!PostProcessManager::Init(aWidth, aHeight, aFullScreenHelper, aComputeHelper))
	{
		return false;
	}
	const int count = ComputeLuminanceCount(aWidth, aHeight);
	for (int index = 0; index < count; ++index)
	{
		myLuminanceChain.push_back(CreateTarget(1 << index, 1 << index, Dds::Format::R32_FLOAT));
		if (!myLuminanceChain.back())
		{
			Destroy();
			return false;
		}
	}
	Gpu::Context& context = Engine::GetInstance()->GetContext();
	const float start[4] = {ourStartLuminance, ourStartLuminance, ourStartLuminance, ourStartLuminance};
	for (int pair = 0; pair < ourAdaptSize; ++pair)
	{
		const int size = 1 << (ourAdaptSize - 1 - pair);
		for (int slot = 0; slot < 2; ++slot)
		{
			myAdaptation[pair][slot] = CreateTarget(size, size, Dds::Format::R32_FLOAT);
			if (!myAdaptation[pair][slot])
			{
				Destroy();
				return false;
			}
		}
		// The first frame adapts from the start luminance in the second target.
		context.ClearRenderTargetView(*myAdaptation[pair][1]->GetRenderTargetView(), start);
		myCurrentSlot[pair] = 1;
	}
	return true;
}

void HDR_Manager::Render(Gpu::RenderTargetView* aDestination, Texture* aSource)
{
	if (myFullScreenHelper == nullptr || myLuminanceChain.empty())
	{
		return;
	}
	FullScreenHelper& helper = *myFullScreenHelper;
	const int count = GetLuminanceCount();
	helper.Process("RenderLum", aSource, myLuminanceChain[count - 1].get());
	for (int index = count - 1; index > 0; --index)
	{
		helper.Process("DownSampleLog", myLuminanceChain[index].get(), myLuminanceChain[index - 1].get());
	}
	for (int pair = 0; pair < ourAdaptSize; ++pair)
	{
		const int previous = myCurrentSlot[pair];
		const int next = 1 - previous;
		myCurrentSlot[pair] = next;
		helper.SetDiffuseTextures(myAdaptation[pair][previous]->GetShaderResourceView());
		helper.Process("AdaptLuminance", myLuminanceChain[std::min(pair, count - 1)].get(),
		               myAdaptation[pair][next].get());
	}
	Engine::GetInstance()->GetContext().SetRenderTargets({}, nullptr);
	helper.SetDiffuseTextures(GetCurrentAdaptation(0)->GetShaderResourceView());
	helper.Process("ToneMap", aSource, aDestination, myWidth, myHeight);
}

bool HDR_Manager::ResizeTargets(int aWidth, int aHeight)
{
	std::vector<std::unique_ptr<Texture>> chain;
	const int count = ComputeLuminanceCount(aWidth, aHeight);
	for (int index = 0; index < count; ++index)
	{
		chain.push_back(CreateTarget(1 << index, 1 << index, Dds::Format::R32_FLOAT));
		if (!chain.back())
		{
			return false;
		}
	}
	myLuminanceChain = std::move(chain);
	return true;
}

void HDR_Manager::Destroy()
{
	myLuminanceChain.clear();
	for (int pair = 0; pair < ourAdaptSize; ++pair)
	{
		myAdaptation[pair][0].reset();
		myAdaptation[pair][1].reset();
		myCurrentSlot[pair] = 1;
	}
	PostProcessManager::Destroy();
}

Texture* HDR_Manager::GetLuminanceTarget(int anIndex) const
{
	return anIndex >= 0 && anIndex < GetLuminanceCount() ? myLuminanceChain[anIndex].get() : nullptr;
}

Texture* HDR_Manager::GetAdaptationTarget(int aPair, int aSlot) const
{
	return aPair >= 0 && aPair < ourAdaptSize && (aSlot == 0 || aSlot == 1) ? myAdaptation[aPair][aSlot].get()
	                                                                        : nullptr;
}

Texture* HDR_Manager::GetCurrentAdaptation(int aPair) const
{
	return aPair >= 0 && aPair < ourAdaptSize ? myAdaptation[aPair][myCurrentSlot[aPair]].get() : nullptr;
}
} // namespace Zeph
