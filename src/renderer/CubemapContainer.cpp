#include "renderer/CubemapContainer.h"

#include <fstream>

#include "renderer/DynamicCubemap.h"

namespace Zeph
{
CubemapContainer::CubemapContainer() = default;
CubemapContainer::~CubemapContainer() = default;

DynamicCubemap* CubemapContainer::GetCubemap(int aRoomIndex, const std::string& aPath)
{
	const auto found = myCubemaps.find(aRoomIndex);
	if (found != myCubemaps.end())
	{
		return found->second.get();
	}
	if (!aPath.empty() && std::ifstream(aPath, std::ios::binary).is_open())
	{
		auto cubemap = std::make_unique<DynamicCubemap>(ourCubemapSize);
		cubemap->Init(aPath);
		DynamicCubemap* result = cubemap.get();
		myCubemaps[aRoomIndex] = std::move(cubemap);
		return result;
	}
	if (!myFallback)
	{
		myFallback = std::make_unique<DynamicCubemap>(ourCubemapSize);
		myFallback->Init(ourFallbackFile);
	}
	return myFallback.get();
}

void CubemapContainer::Clear()
{
	myCubemaps.clear();
}

void CubemapContainer::Destroy()
{
	myCubemaps.clear();
	myFallback.reset();
}
} // namespace Zeph
