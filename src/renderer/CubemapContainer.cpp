#include "renderer/CubemapContainer.h"

#include <filesystem>
#include <system_error>

#include "platform/dds/DdsFile.h"
#include "platform/dds/ImageInfo.h"
#include "platform/paths/Paths.h"
#include "renderer/DynamicCubemap.h"

namespace Zeph
{
CubemapContainer::CubemapContainer() = default;
CubemapContainer::~CubemapContainer() = default;

std::string CubemapContainer::GetRoomFile(const std::string& aLevel, const std::string& aRoomID)
{
	if (aRoomID.empty() || aRoomID == "." || aRoomID == ".." ||
	    aRoomID.find_first_of(std::string("/\\\0", 3)) != std::string::npos)
	{
		return {};
	}
	return "data/Cubemaps/" + aLevel + "/" + aRoomID + ".dds";
}

CubemapContainer::FileState CubemapContainer::CheckFile(const std::string& aPath, std::string& aResolvedRef,
                                                        std::string& aProblemRef)
{
	namespace fs = std::filesystem;
	const std::string resolved = Paths::Resolve(aPath);
	std::error_code error;
	const fs::file_status status = fs::status(resolved, error);
	if (!fs::exists(status))
	{
		return FileState::MISSING;
	}
	if (!fs::is_regular_file(status))
	{
		aProblemRef = "not a regular file";
		return FileState::UNUSABLE;
	}
	Dds::ImageInfo info;
	std::string why;
	if (!Dds::GetImageInfoFromFile(resolved, info, why))
	{
		aProblemRef = why;
		return FileState::UNUSABLE;
	}
	if (!info.IsCube() || info.myArraySize != DynamicCubemap::ourFaceCount)
	{
		aProblemRef = "not a cubemap of 6 faces";
		return FileState::UNUSABLE;
	}
	aResolvedRef = resolved;
	return FileState::USABLE;
}

DynamicCubemap* CubemapContainer::GetCubemap(int aRoomIndex, const std::string& aPath)
{
	const auto found = myCubemaps.find(aRoomIndex);
	if (found != myCubemaps.end())
	{
		return found->second.get();
	}
	std::string resolved;
	std::string problem;
	if (!aPath.empty() && CheckFile(aPath, resolved, problem) == FileState::USABLE)
	{
		auto cubemap = std::make_unique<DynamicCubemap>(ourCubemapSize);
		cubemap->Init(resolved);
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
