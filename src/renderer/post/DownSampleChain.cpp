#include "renderer/post/DownSampleChain.h"

#include <algorithm>

#include "renderer/post/FullScreenHelper.h"

namespace Zeph
{
bool DownSampleChain::Init(int aWidth, int aHeight, Dds::Format aFormat)
{
	Destroy();
	if (!MakeLevels(aWidth, aHeight, aFormat, myResults, myScratches))
	{
		Destroy();
		return false;
	}
	return true;
}

bool DownSampleChain::Resize(int aWidth, int aHeight, Dds::Format aFormat)
{
	std::unique_ptr<Texture> results[ourLevelCount];
	std::unique_ptr<Texture> scratches[ourLevelCount];
	if (!MakeLevels(aWidth, aHeight, aFormat, results, scratches))
	{
		return false;
	}
	for (int level = 0; level < ourLevelCount; ++level)
	{
		myResults[level] = std::move(results[level]);
		myScratches[level] = std::move(scratches[level]);
	}
	return true;
}

bool DownSampleChain::MakeLevels(int aWidth, int aHeight, Dds::Format aFormat,
                                 std::unique_ptr<Texture> (&someResultsOut)[ourLevelCount],
                                 std::unique_ptr<Texture> (&someScratchesOut)[ourLevelCount])
{
	for (int level = 0; level < ourLevelCount; ++level)
	{
		const int width = std::max(aWidth >> (level + 1), 1);
		const int height = std::max(aHeight >> (level + 1), 1);
		someResultsOut[level] = std::make_unique<Texture>(width, height, aFormat);
		someScratchesOut[level] = std::make_unique<Texture>(width, height, aFormat);
		if (someResultsOut[level]->GetRenderTargetView() == nullptr ||
		    someScratchesOut[level]->GetRenderTargetView() == nullptr)
		{
			return false;
		}
	}
	return true;
}

void DownSampleChain::Destroy()
{
	for (int level = 0; level < ourLevelCount; ++level)
	{
		myResults[level].reset();
		myScratches[level].reset();
	}
}

void DownSampleChain::Render(FullScreenHelper& aHelper, Texture* aSource, const char* aFirstTechnique,
                             const char* aHorizontal, const char* aVertical)
{
	if (!myResults[0])
	{
		return;
	}
	aHelper.Process(aFirstTechnique, aSource, myResults[0].get());
	for (int level = 1; level < ourLevelCount; ++level)
	{
		aHelper.Process("DownSamplePoint", myResults[level - 1].get(), myResults[level].get());
	}
	for (int level = 0; level < ourLevelCount; ++level)
	{
		aHelper.Process(aHorizontal, myResults[level].get(), myScratches[level].get());
		aHelper.Process(aVertical, myScratches[level].get(), myResults[level].get());
	}
}

Texture* DownSampleChain::GetResult(int aLevel) const
{
	return aLevel >= 0 && aLevel < ourLevelCount ? myResults[aLevel].get() : nullptr;
}

Texture* DownSampleChain::GetScratch(int aLevel) const
{
	return aLevel >= 0 && aLevel < ourLevelCount ? myScratches[aLevel].get() : nullptr;
}
} // namespace Zeph
