#pragma once
// CubemapContainer: the rooms' reflection cubemaps by room index, each loaded once
// from its file and shared by every instance of the room, plus the fallback cubemap
// ("data/Cubemaps/cubemap.dds") for rooms without a file and instances in no room.
//
//   Zeph::DynamicCubemap* cube = engine->GetCubemapContainer().GetCubemap(2, "data/Cubemaps/level/room2.dds");
//
// A missing file is not an error: the fallback is returned and the index is not
// stored, so a later request tries the file again (after a bake, say).
#include <map>
#include <memory>
#include <string>

namespace Zeph
{
class DynamicCubemap;

class CubemapContainer
{
public:
	static constexpr const char* ourFallbackFile = "data/Cubemaps/cubemap.dds";
	static constexpr int ourCubemapSize = 256;

	CubemapContainer();
	~CubemapContainer();
	CubemapContainer(const CubemapContainer&) = delete;
	CubemapContainer& operator=(const CubemapContainer&) = delete;

	DynamicCubemap* GetCubemap(int aRoomIndex, const std::string& aPath);
	// Destroys the rooms' cubemaps; the fallback stays.
	void Clear();
	// Everything, the fallback too (engine shutdown).
	void Destroy();
	size_t GetCount() const { return myCubemaps.size(); }

private:
	std::unique_ptr<DynamicCubemap> myFallback;
	std::map<int, std::unique_ptr<DynamicCubemap>> myCubemaps;
};
} // namespace Zeph
