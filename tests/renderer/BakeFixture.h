#pragma once
// The fixture of the bake tests: a headless engine (FrameTest) with the editor's own fatal
// levels, run in a scratch folder whose data/ links the repository's folders except Cubemaps,
// which holds copies of the two cube maps the renderer reads (a bake writes
// "data/Cubemaps/<level>/"), and XML, which links the catalogues and holds empty levels/
// (a bake writes "data/XML/levels/<level>/"), and rooms of room_small's size owned by the test.
#include <filesystem>
#include <memory>
#include <string>
#include <vector>

#include "FrameFixture.h"
#include "core/GrowingArray.h"
#include "engine/Room.h"

namespace FrameTesting
{
class BakeTest : public FrameTest
{
protected:
	BakeTest() { myFatalLevels = 12; }

	void SetUp() override
	{
		namespace fs = std::filesystem;
		FrameTest::SetUp();
		const fs::path source = fs::path(LUMORA_TEST_SOURCE_ROOT) / "data";
		const fs::path data = myWorkDirectory.Path() / "data";
		fs::create_directories(data / "Cubemaps");
		for (const fs::directory_entry& entry : fs::directory_iterator(source))
		{
			if (entry.path().filename() != "Cubemaps" && entry.path().filename() != "XML")
			{
				fs::create_directory_symlink(entry.path(), data / entry.path().filename());
			}
		}
		// The catalogues are read, the levels' folders written: tests running at once each
		// bake into a folder of their own, never into the repository's.
		fs::create_directories(data / "XML" / "levels");
		for (const char* catalogue : {"EntityTypes.xml", "DecalTypes.xml"})
		{
			fs::create_symlink(source / "XML" / catalogue, data / "XML" / catalogue);
		}
		for (const char* file : {"cubemap.dds", "normaltest.dds"})
		{
			fs::copy_file(source / "Cubemaps" / file, data / "Cubemaps" / file);
		}
		myPreviousDirectory = fs::current_path();
		fs::current_path(myWorkDirectory.Path());
	}

	void TearDown() override
	{
		FrameTest::TearDown();
		std::filesystem::current_path(myPreviousDirectory);
	}

	// A room box of room_small's size (4 x 3 x 4, floor at y 0) around aFoot.
	void AddRoom(const std::string& anID, const Vector3<float>& aFoot)
	{
		myRoomOwners.push_back(std::make_unique<Zeph::Room>(aFoot + Vector3<float>(-2.0f, 0.0f, -2.0f),
		                                                    aFoot + Vector3<float>(2.0f, 3.0f, 2.0f)));
		myRoomOwners.back()->SetID(anID);
		myRooms.Add(myRoomOwners.back().get());
	}

	static std::string CubePath(const std::string& aLevel, const std::string& anID)
	{
		return "data/Cubemaps/" + aLevel + "/" + anID + ".dds";
	}

	TestSupport::ScratchDir myWorkDirectory;
	std::filesystem::path myPreviousDirectory;
	std::vector<std::unique_ptr<Zeph::Room>> myRoomOwners;
	GrowingArray<Zeph::Room*> myRooms{4, 4};
};
} // namespace FrameTesting
