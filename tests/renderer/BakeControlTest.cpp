// Bakes a designer can stop, watch and split: a cancel at any point leaves every file as it
// was; the status read from another thread follows the bake and its estimate of the time
// left holds on a level of equal rooms; a room re-bake changes that room's cells and cubemap
// only; a bake split into uneven parts and merged bounce by bounce writes the whole bake's
// file byte for byte, and parts that do not belong together are refused.
#include <atomic>
#include <filesystem>
#include <gmock/gmock-matchers.h>
#include <gtest/gtest.h>
#include <map>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "BakeFixture.h"
#include "renderer/AmbientPartFile.h"
#include "renderer/AmbientVolumeFile.h"
#include "renderer/BakeStatus.h"

using namespace FrameTesting;
using testing::HasSubstr;

namespace
{
namespace fs = std::filesystem;

const std::string ourAmbientPath = "data/XML/levels/three/ambient.sh";

// Three rooms of room_small in a row along x, each with a light: a grid of 6 x 2 x 2 cells
// whose 12 probes (y = 1; the layer at y = 3 is never visited) all lie inside a room; cells
// x 0-1 are the west room's, 2-3 the middle's, 4-5 the east's.
class BakeControlTest : public BakeTest
{
protected:
	bool StartThreeRooms()
	{
		if (!Start())
		{
			return false;
		}
		const std::pair<const char*, float> rooms[] = {{"west", -4.0f}, {"middle", 0.0f}, {"east", 4.0f}};
		for (const auto& [id, x] : rooms)
		{
			Place("data/models/room_small.dae", {x, 0.0f, 0.0f});
			AddRoom(id, {x, 0.0f, 0.0f});
			myPointLights.push_back({.myFalloff = 2.0f,
			                         .myPosition = {x + 1.0f, 1.5f, 0.5f},
			                         .myColor = {6.0f, 5.0f, 4.0f, 1.0f}});
		}
		return !HasFatalFailure();
	}

	void BakeAmbient(int aBounces)
	{
		Queue();
		Renderer().GenerateSH(myRooms, ourAmbientPath, aBounces, false);
	}

	void BakeReflections(const std::vector<std::string>* someRooms = nullptr)
	{
		Queue();
		Renderer().GenerateReflections(myRooms, "three", someRooms);
	}

	// Every file under data/XML/levels/three and data/Cubemaps/three, with its bytes.
	static std::map<std::string, std::string> Outputs()
	{
		std::map<std::string, std::string> files;
		for (const char* folder : {"data/XML/levels/three", "data/Cubemaps/three"})
		{
			for (const fs::directory_entry& entry : fs::directory_iterator(folder))
			{
				files[entry.path().string()] = TestSupport::ReadWholeFile(entry.path().string());
			}
		}
		return files;
	}
};

// Polls the status from its own thread until the bake it waits for gets to aCondition,
// then cancels it; keeps every status it saw.
class CancellingPoller
{
public:
	template <typename Condition> explicit CancellingPoller(Condition aCondition)
	{
		myThread = std::thread([this, aCondition] {
			bool cancelledFlag = false;
			while (!myStopFlag.load())
			{
				const Zeph::BakeStatus status = Zeph::Engine::GetInstance()->GetRenderer().GetBakeStatus();
				mySeen.push_back(status);
				if (!cancelledFlag && status.myPhase != Zeph::BakePhase::IDLE && aCondition(status))
				{
					Zeph::Engine::GetInstance()->GetRenderer().CancelBake();
					cancelledFlag = true;
				}
				std::this_thread::sleep_for(std::chrono::microseconds(500));
			}
		});
	}
	~CancellingPoller() { Stop(); }

	const std::vector<Zeph::BakeStatus>& Stop()
	{
		myStopFlag = true;
		if (myThread.joinable())
		{
			myThread.join();
		}
		return mySeen;
	}

private:
	std::atomic<bool> myStopFlag{false};
	std::vector<Zeph::BakeStatus> mySeen;
	std::thread myThread;
};
} // namespace

TEST_F(BakeControlTest, CancelsLeaveEveryFileAsItWasAndTheStatusFollowsTheBake)
{
	LUMORA_RETURN_UNLESS(StartThreeRooms());
	// A whole bake watched from another thread (never cancelled): every bounce seen, the
	// counts over all, and once a quarter is done the estimate of the whole is within reach
	// of what it took. (Eight bounces: long enough for a busy machine's poller to see them.)
	CancellingPoller watcher([](const Zeph::BakeStatus&) { return false; });
	const auto start = std::chrono::steady_clock::now();
	BakeAmbient(8);
	const double took = std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
	const std::vector<Zeph::BakeStatus> seen = watcher.Stop();
	int lastBounce = 0;
	int estimates = 0;
	for (const Zeph::BakeStatus& status : seen)
	{
		if (status.myPhase != Zeph::BakePhase::AMBIENT)
		{
			continue;
		}
		EXPECT_EQ((std::array{status.myBounceCount, static_cast<int>(status.myProbesTotal)}),
		          (std::array{8, 96}));
		EXPECT_GE(status.myBounce, lastBounce);
		lastBounce = status.myBounce;
		if (status.myProbesDone * 4 >= status.myProbesTotal && status.myProbesDone < status.myProbesTotal)
		{
			++estimates;
			const double whole = status.myElapsedSeconds + status.mySecondsLeft;
			EXPECT_GT(whole, 0.4 * took) << status.myProbesDone << " probes done";
			EXPECT_LT(whole, 2.5 * took) << status.myProbesDone << " probes done";
		}
	}
	EXPECT_EQ(lastBounce, 8);
	EXPECT_GT(estimates, 0) << "the status was read while the bake ran";
	const Zeph::BakeStatus finished = Renderer().GetBakeStatus();
	EXPECT_EQ(finished.myPhase, Zeph::BakePhase::IDLE);
	EXPECT_EQ(finished.myLastResult, Zeph::BakeResult::FINISHED);
	EXPECT_EQ(finished.myProbesDone, 96);
	BakeReflections();

	// Brighter lights: a bake that ran to its end would change every file.
	const std::map<std::string, std::string> before = Outputs();
	ASSERT_EQ(before.size(), 4u) << "ambient.sh and three cubemaps";
	for (Zeph::PointLightData& light : myPointLights)
	{
		light.myColor = Vector4<float>(30.0f, 5.0f, 4.0f, 1.0f);
	}
	using Condition = bool (*)(const Zeph::BakeStatus&);
	const std::pair<const char*, Condition> cancels[] = {
	    {"ambient, at once",
	     [](const Zeph::BakeStatus& aStatus) { return aStatus.myPhase == Zeph::BakePhase::AMBIENT; }},
	    {"ambient, in the first bounce",
	     [](const Zeph::BakeStatus& aStatus) { return aStatus.myProbesDone >= 5; }},
	    {"ambient, in the second bounce",
	     [](const Zeph::BakeStatus& aStatus) { return aStatus.myBounce == 2; }},
	    {"reflections, at once",
	     [](const Zeph::BakeStatus& aStatus) { return aStatus.myPhase == Zeph::BakePhase::REFLECTIONS; }},
	    {"reflections, at the second room",
	     [](const Zeph::BakeStatus& aStatus) { return aStatus.myRoomsDone == 1; }},
	};
	for (const auto& [name, condition] : cancels)
	{
		SCOPED_TRACE(name);
		{
			CancellingPoller poller(condition);
			if (std::string(name).starts_with("ambient"))
			{
				BakeAmbient(16);
			}
			else
			{
				BakeReflections();
			}
		}
		const Zeph::BakeStatus status = Renderer().GetBakeStatus();
		EXPECT_EQ(status.myLastResult, Zeph::BakeResult::CANCELLED) << status.myLastMessage;
		EXPECT_EQ(status.myPhase, Zeph::BakePhase::IDLE);
		EXPECT_TRUE(Outputs() == before) << "a file changed, or a temporary was left";
	}
	EXPECT_TRUE(Renderer().IsSHLoaded()) << "the cancelled ambient bake shows the file's volume again";
	// A cancel with no bake running is not kept for the next one.
	Renderer().CancelBake();
	BakeAmbient(1);
	EXPECT_EQ(Renderer().GetBakeStatus().myLastResult, Zeph::BakeResult::FINISHED);
	EXPECT_FALSE(TestSupport::ReadWholeFile(ourAmbientPath) == before.at(ourAmbientPath));
}

TEST_F(BakeControlTest, ARoomReBakeChangesThatRoomsCellsAndCubemapOnly)
{
	LUMORA_RETURN_UNLESS(StartThreeRooms());
	BakeAmbient(1);
	BakeReflections();
	const Zeph::AmbientVolume before = ReadVolume(ourAmbientPath);
	const std::map<std::string, std::string> files = Outputs();

	// Every light turned red, then the east room alone re-baked.
	for (Zeph::PointLightData& light : myPointLights)
	{
		light.myColor = Vector4<float>(40.0f, 1.0f, 1.0f, 1.0f);
	}
	GrowingArray<Zeph::Room*> east(1, 1);
	east.Add(myRooms[2]);
	Queue();
	Renderer().GenerateSHForRooms(myRooms, east, ourAmbientPath, 1);
	const std::vector<std::string> eastID = {"east"};
	BakeReflections(&eastID);
	EXPECT_EQ(Renderer().GetBakeStatus().myLastResult, Zeph::BakeResult::FINISHED);
	const Zeph::AmbientVolume after = ReadVolume(ourAmbientPath);
	int changedEastCells = 0;
	for (size_t cell = 0; cell < 24; ++cell)
	{
		const bool eastFlag = cell % 6 >= 4;
		bool sameFlag = true;
		for (int block = 0; block < Zeph::AmbientVolume::ourBlockCount; ++block)
		{
			sameFlag = sameFlag && after.myBlocks[block][cell] == before.myBlocks[block][cell];
		}
		EXPECT_TRUE(sameFlag || eastFlag) << "cell " << cell << " is not the east room's";
		changedEastCells += eastFlag && !sameFlag ? 1 : 0;
	}
	EXPECT_EQ(changedEastCells, 4) << "the east room's four probes";
	const std::map<std::string, std::string> rebaked = Outputs();
	EXPECT_TRUE(rebaked.at(CubePath("three", "west")) == files.at(CubePath("three", "west")));
	EXPECT_TRUE(rebaked.at(CubePath("three", "middle")) == files.at(CubePath("three", "middle")));
	EXPECT_FALSE(rebaked.at(CubePath("three", "east")) == files.at(CubePath("three", "east")));

	// With one bounce the room's probes are those a whole bake gives (which changes the
	// other rooms too).
	BakeAmbient(1);
	const Zeph::AmbientVolume whole = ReadVolume(ourAmbientPath);
	for (size_t cell = 0; cell < 24; ++cell)
	{
		bool sameFlag = true;
		for (int block = 0; block < Zeph::AmbientVolume::ourBlockCount; ++block)
		{
			sameFlag = sameFlag && whole.myBlocks[block][cell] == after.myBlocks[block][cell];
		}
		// The layer at y = 3 lies on the rooms' ceiling: never visited, neutral in both.
		EXPECT_EQ(sameFlag, cell % 6 >= 4 || cell / 6 % 2 == 1) << "cell " << cell;
	}

	// A fourth room changes the grid: the file's cells cannot be kept, the whole volume is
	// baked, and the status says so.
	AddRoom("north", {0.0f, 0.0f, 4.0f});
	Queue();
	Renderer().GenerateSHForRooms(myRooms, east, ourAmbientPath, 1);
	const Zeph::BakeStatus status = Renderer().GetBakeStatus();
	EXPECT_EQ(status.myLastResult, Zeph::BakeResult::FINISHED);
	EXPECT_THAT(status.myLastMessage,
	            HasSubstr("is of a grid of 6 x 2 x 2, the rooms' is 6 x 2 x 4: the whole "
	                      "volume was baked"));
	EXPECT_EQ(ReadVolume(ourAmbientPath).myCounts[2], 4);
}

TEST_F(BakeControlTest, UnevenPartsMergedBounceByBounceGiveTheWholeBakeByteForByte)
{
	LUMORA_RETURN_UNLESS(StartThreeRooms());
	BakeAmbient(2);
	const std::string whole = TestSupport::ReadWholeFile(ourAmbientPath);
	ASSERT_EQ(whole.size(), 36u + 28u * 24u);

	Zeph::AmbientPart expected;
	std::string previousPath;
	const std::vector<std::pair<long long, long long>> ranges[] = {{{0, 5}, {5, 11}, {16, 8}},
	                                                               {{12, 12}, {0, 11}, {11, 1}}};
	for (int bounce = 1; bounce <= 2; ++bounce)
	{
		Zeph::AmbientVolume previous;
		if (bounce > 1)
		{
			previous = ReadVolume(previousPath);
		}
		std::vector<std::string> parts;
		for (const auto& [first, count] : ranges[bounce - 1])
		{
			Zeph::AmbientPart part;
			Queue();
			ASSERT_TRUE(Renderer().GenerateSHPart(myRooms, bounce, bounce > 1 ? &previous : nullptr, first,
			                                      count, part));
			part.myInputsHash = "inputs";
			part.myPreviousHash = bounce > 1 ? "bounce 1" : "";
			parts.push_back(
			    myScratch.File("b" + std::to_string(bounce) + "-" + std::to_string(first) + ".part"));
			std::string problem;
			ASSERT_TRUE(Zeph::WriteAmbientPart(parts.back(), part, problem)) << problem;
			expected = part;
		}
		Zeph::AmbientVolume merged;
		std::string problem;
		ASSERT_TRUE(Zeph::MergeAmbientParts(parts, expected, merged, problem)) << problem;
		previousPath = myScratch.File("bounce" + std::to_string(bounce) + ".sh");
		ASSERT_TRUE(Zeph::WriteAmbientVolume(previousPath, merged, problem)) << problem;
	}
	EXPECT_TRUE(TestSupport::ReadWholeFile(previousPath) == whole)
	    << "the merged volume differs from the whole bake";

	// A range outside the grid and a second bounce without the first are refused.
	Zeph::AmbientPart part;
	Queue();
	EXPECT_FALSE(Renderer().GenerateSHPart(myRooms, 1, nullptr, 20, 5, part));
	EXPECT_THAT(Renderer().GetBakeStatus().myLastMessage,
	            HasSubstr("cells 20 to 24 are not all in the grid of 6 x 2 x 2"));
	EXPECT_FALSE(Renderer().GenerateSHPart(myRooms, 2, nullptr, 0, 5, part));
	EXPECT_THAT(TakeLog(), HasSubstr("bounce 2 needs the volume of bounce 1"));
}

// Parts made by hand (their blocks count the cells): what a merge refuses, and that it
// assembles in cell order whatever the order of the files.
TEST(AmbientPartFileTest, MergesCoverTheGridOnceFromOnePreviousVolumeAndRefuseTheRest)
{
	TestSupport::ScratchDir scratch;
	Zeph::AmbientPart grid;
	grid.myCounts[0] = 4;
	grid.myCounts[1] = 1;
	grid.myCounts[2] = 3;
	grid.myWorldSize = Vector3<float>(8.0f, 2.0f, 6.0f);
	grid.myInputsHash = "0123456789abcdef0123456789abcdef";
	grid.myPreviousHash = "fedcba9876543210fedcba9876543210";
	grid.myBounce = 3;
	const auto write = [&](const std::string& aName, long long aFirst, long long aCount,
	                       const std::function<void(Zeph::AmbientPart&)>& aChange = nullptr) {
		Zeph::AmbientPart part = grid;
		part.myFirst = aFirst;
		part.myCount = aCount;
		for (int block = 0; block < Zeph::AmbientVolume::ourBlockCount; ++block)
		{
			for (long long cell = aFirst; cell < aFirst + aCount; ++cell)
			{
				part.myBlocks[block].push_back(static_cast<uint32_t>(cell * 10 + block));
			}
		}
		if (aChange)
		{
			aChange(part);
		}
		std::string problem;
		EXPECT_TRUE(Zeph::WriteAmbientPart(scratch.File(aName), part, problem)) << problem;
		return scratch.File(aName);
	};
	const std::string tail = write("tail", 7, 5);
	const std::string head = write("head", 0, 3);
	const std::string middle = write("middle", 3, 4);
	Zeph::AmbientVolume volume;
	std::string problem;
	ASSERT_TRUE(Zeph::MergeAmbientParts({tail, head, middle}, grid, volume, problem)) << problem;
	for (int block = 0; block < Zeph::AmbientVolume::ourBlockCount; ++block)
	{
		ASSERT_EQ(volume.myBlocks[block].size(), 12u);
		for (size_t cell = 0; cell < 12; ++cell)
		{
			EXPECT_EQ(volume.myBlocks[block][cell], cell * 10 + block);
		}
	}

	std::string cut = TestSupport::ReadWholeFile(middle);
	TestSupport::WriteWholeFile(scratch.File("cut"), cut.substr(0, cut.size() - 4));
	Zeph::AmbientPart otherInputs = grid;
	otherInputs.myInputsHash = "ffffffffffffffffffffffffffffffff";
	const struct
	{
		const char* myName;
		std::vector<std::string> myParts;
		const Zeph::AmbientPart& myExpected;
		std::string myProblem;
	} refusals[] = {
	    {"a gap", {head, tail}, grid, "no part holds cells 3 to 6"},
	    {"the end missing", {head, middle}, grid, "no part holds cells 7 to 11"},
	    {"an overlap", {head, middle, write("overlap", 6, 6), tail}, grid, "overlaps"},
	    {"another grid",
	     {head, middle, write("grid", 7, 5, [](Zeph::AmbientPart& aPart) { aPart.myCounts[2] = 4; })},
	     grid,
	     "is a part of another grid (4 x 1 x 4; the level's is 4 x 1 x 3)"},
	    {"other inputs", {head, middle, tail}, otherInputs, "was baked from other inputs"},
	    {"another bounce",
	     {head, middle, write("bounce", 7, 5, [](Zeph::AmbientPart& aPart) { aPart.myBounce = 2; })},
	     grid,
	     "is bounce 2"},
	    {"another previous volume",
	     {head, middle, write("lit", 7, 5, [](Zeph::AmbientPart& aPart) { aPart.myPreviousHash = "x"; })},
	     grid,
	     "lit by another previous volume"},
	    {"a cut file", {head, scratch.File("cut"), tail}, grid, "holds 240 bytes; its 4 cells need 244"},
	    {"not a part", {head, scratch.File("cut") + "-missing", tail}, grid, "cannot be opened"},
	};
	for (const auto& refusal : refusals)
	{
		SCOPED_TRACE(refusal.myName);
		problem.clear();
		EXPECT_FALSE(Zeph::MergeAmbientParts(refusal.myParts, refusal.myExpected, volume, problem));
		EXPECT_THAT(problem, HasSubstr(refusal.myProblem));
	}
}
