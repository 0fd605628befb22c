#include "renderer/post/PostProcessManager.h"

#include <algorithm>

#include "engine/EngineReport.h"

namespace Zeph
{
bool PostProcessManager::Init(int aWidth, int aHeight, FullScreenHelper* aFullScreenHelper,
                              ComputeHelper* aComputeHelper)
{
	if (aWidth < 1 || aHeight < 1 || aFullScreenHelper == nullptr)
	{
		ReportCritical(__LINE__, "Zeph::PostProcessManager::Init",
		               "A post stage needs a frame of at least 1x1 (got %dx%d) and a full-screen helper",
		               aWidth, aHeight);
		return false;
	}
	myWidth = aWidth;
	myHeight = aHeight;
	myFullScreenHelper = aFullScreenHelper;
	myComputeHelper = aComputeHelper;
	return true;
}

bool PostProcessManager::Resize(int aWidth, int aHeight)
{
	if (aWidth < 1 || aHeight < 1)
	{
		ReportError(__LINE__, "Zeph::PostProcessManager::Resize",
		            "A post stage needs a frame of at least 1x1 (got %dx%d)", aWidth, aHeight);
		return false;
	}
	if (myFullScreenHelper == nullptr)
	{
		return true;
	}
	if (!ResizeTargets(aWidth, aHeight))
	{
		return false;
	}
	myWidth = aWidth;
	myHeight = aHeight;
	return true;
}

bool PostProcessManager::ResizeTargets(int aWidth, int aHeight)
{
	(void)aWidth;
	(void)aHeight;
	return true;
}

void PostProcessManager::Destroy()
{
	myWidth = 0;
	myHeight = 0;
	myFullScreenHelper = nullptr;
	myComputeHelper = nullptr;
}

std::unique_ptr<Texture> PostProcessManager::CreateTarget(int aWidth, int aHeight, Dds::Format aFormat)
{
	auto texture = std::make_unique<Texture>(std::max(aWidth, 1), std::max(aHeight, 1), aFormat);
	if (texture->GetRenderTargetView() == nullptr)
	{
		return nullptr;
	}
	return texture;
}
} // namespace Zeph
