#pragma once
// CubemapContainer: the rooms' reflection cubemaps by room index, each loaded once
// from its file and shared by every instance of the room, plus the fallback cubemap
// ("data/Cubemaps/cubemap.dds") for rooms without a file and instances in no room.
//
//   Zeph::DynamicCubemap* cube = engine->GetCubemapContainer().GetCubemap(2, "data/Cubemaps/level/room2.dds");
//
// A missing file is not an error: the fallback is returned and the index is not
// stored, so a later request tries the file again (after a bake, say). Nor is a file
// that is no cube of six faces loaded: CheckFile says why, for the callers to report.
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

	// How the level loader's report of an unusable room cubemap begins, for tools that sort
	// reports about baked outputs from the others.
	static constexpr const char* ourUnusableFileText = "Room cubemap [";

	enum class FileState
	{
		USABLE,
		MISSING,
		UNUSABLE
	};
	// The file of a room's cubemap, "data/Cubemaps/" + level + "/" + room ID + ".dds"; empty
	// when the ID cannot name a file in that folder (empty, "." or "..", or holding a path
	// separator), so that no room ID reaches outside it.
	static std::string GetRoomFile(const std::string& aLevel, const std::string& aRoomID);
	// Whether aPath, found through the path resolver, is a regular file holding a cube of six
	// faces: USABLE with aResolvedRef set to the path on disk, MISSING, or UNUSABLE with
	// aProblemRef saying why (a plain 2D DDS, a damaged header, a folder of that name).
	static FileState CheckFile(const std::string& aPath, std::string& aResolvedRef, std::string& aProblemRef);

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
