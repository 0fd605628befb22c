// The baked ambient light's file, ambient.sh: written whole through a temporary and
// read back unchanged, or not at all (a full disk, a folder that cannot be written) with
// the old file kept byte for byte; temporaries of killed writers are cleared; damaged
// files are refused with a reason; SetSH drops the volume shown so far before it loads,
// so a damaged or missing file leaves none, and a loaded volume lights the frame.
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <optional>
#include <string>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

#include "FrameFixture.h"
#include "renderer/AmbientVolumeFile.h"
#include "renderer/Renderer.h"
#include "support/FileSizeLimit.h"
#include "support/TestSupport.h"

using namespace FrameTesting;

namespace
{
// A 3 x 2 x 2 volume whose every texel differs, so a swapped block or cell shows.
Zeph::AmbientVolume MakeVolume(int anX = 3, int aY = 2, int aZ = 2)
{
	Zeph::AmbientVolume volume;
	volume.myWorldSize = Vector3<float>(6.0f, 4.0f, 4.5f);
	volume.myWorldMin = Vector3<float>(-3.0f, 0.0f, -2.25f);
	volume.myCounts[0] = anX;
	volume.myCounts[1] = aY;
	volume.myCounts[2] = aZ;
	uint32_t next = 0x01020304u;
	for (std::vector<uint32_t>& block : volume.myBlocks)
	{
		block.resize(static_cast<size_t>(anX * aY * aZ));
		for (uint32_t& texel : block)
		{
			texel = next;
			next = next * 2654435761u + 97u;
		}
	}
	return volume;
}

// The uniform volume the bake would write for E / pi = aLevel everywhere.
Zeph::AmbientVolume UniformVolume(float aLevel)
{
	Zeph::AmbientVolume volume = MakeVolume(2, 2, 2);
	volume.myWorldMin = Vector3<float>(-2.0f, 0.0f, -2.0f);
	volume.myWorldSize = Vector3<float>(4.0f, 3.0f, 4.0f);
	const auto byte = [](float aValue) { return static_cast<uint32_t>((aValue + 1.0f) * 0.5f * 255.0f); };
	const uint32_t zero = byte(0.0f) * 0x01010101u;
	for (int block = 0; block < Zeph::AmbientVolume::ourBlockCount; ++block)
	{
		const uint32_t texel = block < 3 ? (zero & 0x00FFFFFFu) | (byte(aLevel) << 24) : zero;
		volume.myBlocks[block].assign(volume.myBlocks[block].size(), texel);
	}
	return volume;
}
} // namespace

TEST(AmbientVolumeFileTest, AWrittenFileReadsBackUnchangedLeavesNoTemporaryAndDamagedOnesAreRefused)
{
	TestSupport::ScratchDir scratch;
	const std::string path = scratch.File("levels/a/ambient.sh");
	const Zeph::AmbientVolume written = MakeVolume();
	std::string problem;
	ASSERT_TRUE(Zeph::WriteAmbientVolume(path, written, problem)) << "the missing directories are made";
	EXPECT_EQ(std::filesystem::file_size(path), 36u + 28u * 12u);
	EXPECT_EQ(std::distance(std::filesystem::directory_iterator(scratch.Path() / "levels/a"),
	                        std::filesystem::directory_iterator()),
	          1);

	Zeph::AmbientVolume read;
	ASSERT_EQ(Zeph::ReadAmbientVolume(path, read, problem), Zeph::AmbientVolumeRead::OK) << problem;
	EXPECT_EQ(read.myWorldSize.z, 4.5f);
	EXPECT_EQ(read.myWorldMin.x, -3.0f);
	EXPECT_EQ(read.myCounts[0], 3);
	EXPECT_EQ(read.myCounts[2], 2);
	for (int block = 0; block < Zeph::AmbientVolume::ourBlockCount; ++block)
	{
		EXPECT_EQ(read.myBlocks[block], written.myBlocks[block]) << "block " << block;
	}
	// The layout is the documented one: counts at 24, block 0 from byte 36, little-endian.
	const std::string bytes = TestSupport::ReadWholeFile(path);
	EXPECT_EQ(static_cast<uint8_t>(bytes[24]), 3);
	EXPECT_EQ(static_cast<uint8_t>(bytes[36]), written.myBlocks[0][0] & 0xFF);
	EXPECT_EQ(static_cast<uint8_t>(bytes[36 + 12 * 4]), written.myBlocks[1][0] & 0xFF);

	Zeph::AmbientVolume incomplete = MakeVolume();
	incomplete.myBlocks[6].pop_back();
	EXPECT_FALSE(Zeph::WriteAmbientVolume(path, incomplete, problem));
	ASSERT_EQ(Zeph::ReadAmbientVolume(path, read, problem), Zeph::AmbientVolumeRead::OK)
	    << "a refused write leaves the old file";

	// Damaged copies of the file are refused with their reason.
	const auto withCounts = [&](int anX, int aY, int aZ) {
		std::string damaged = bytes;
		const int counts[3] = {anX, aY, aZ};
		damaged.replace(24, 12, reinterpret_cast<const char*>(counts), 12);
		return damaged;
	};
	const struct
	{
		const char* myName;
		std::string myBytes;
		const char* myReason;
	} cases[] = {
	    {"short", bytes.substr(0, 20), "header"},
	    {"cut", bytes.substr(0, bytes.size() - 1), "bytes"},
	    {"longer", bytes + "x", "bytes"},
	    {"zero", withCounts(3, 0, 2), "probe counts"},
	    {"negative", withCounts(-3, -2, 2), "probe counts"},
	    {"huge", withCounts(4096, 1, 1), "probe counts"},
	    {"swapped", withCounts(2, 2, 2), "bytes"},
	};
	for (const auto& test : cases)
	{
		const std::string file = scratch.File(std::string(test.myName) + ".sh");
		std::ofstream(file, std::ios::binary) << test.myBytes;
		Zeph::AmbientVolume volume;
		std::string reason;
		EXPECT_EQ(Zeph::ReadAmbientVolume(file, volume, reason), Zeph::AmbientVolumeRead::DAMAGED)
		    << test.myName;
		EXPECT_NE(reason.find(test.myReason), std::string::npos) << test.myName << ": " << reason;
		EXPECT_NE(reason.find(file), std::string::npos) << "the file is named";
	}
	EXPECT_EQ(Zeph::ReadAmbientVolume(scratch.File("missing.sh"), read, problem),
	          Zeph::AmbientVolumeRead::CANNOT_OPEN);
}

TEST(AmbientVolumeFileTest, AWriteTheDiskRefusesKeepsTheOldFileByteForByteAndSaysWhy)
{
	TestSupport::ScratchDir scratch;
	std::filesystem::create_directories(scratch.Path() / "level");
	TestSupport::WriteWholeFile(scratch.File("plain"), "a file, not a folder");
	// Root may write into any folder it can chmod; /sys is one it cannot.
	const bool rootFlag = ::geteuid() == 0;
	const std::string locked = rootFlag ? "/sys/ambient.sh" : scratch.File("locked/ambient.sh");
	if (!rootFlag)
	{
		std::filesystem::create_directories(scratch.Path() / "locked");
		TestSupport::WriteWholeFile(locked, "old bake");
		std::filesystem::permissions(scratch.Path() / "locked", std::filesystem::perms(0555));
	}
	const std::string full = scratch.File("level/ambient.sh");
	TestSupport::WriteWholeFile(full, "old bake");
	const struct
	{
		const char* myName;
		std::string myPath;
		const char* myReason;
		rlim_t myFileSizeLimit; // 0: none
	} cases[] = {
	    {"full disk", full, "did not take", 100},
	    {"read-only folder", locked, "no temporary file", 0},
	    {"folder is a file", scratch.File("plain/ambient.sh"), "folder cannot be made", 0},
	};
	for (const auto& test : cases)
	{
		SCOPED_TRACE(test.myName);
		const std::string before = TestSupport::ReadWholeFile(test.myPath);
		std::string problem;
		bool written = true;
		{
			std::optional<TestSupport::FileSizeLimit> limit;
			if (test.myFileSizeLimit != 0)
			{
				limit.emplace(test.myFileSizeLimit);
			}
			written = Zeph::WriteAmbientVolume(test.myPath, MakeVolume(), problem);
		}
		EXPECT_FALSE(written);
		EXPECT_NE(problem.find(test.myPath), std::string::npos) << problem;
		EXPECT_NE(problem.find(test.myReason), std::string::npos) << problem;
		EXPECT_EQ(TestSupport::ReadWholeFile(test.myPath), before) << "the old file is untouched";
	}
	EXPECT_EQ(std::distance(std::filesystem::directory_iterator(scratch.Path() / "level"),
	                        std::filesystem::directory_iterator()),
	          1)
	    << "no temporary is left beside it";
	if (!rootFlag)
	{
		std::filesystem::permissions(scratch.Path() / "locked", std::filesystem::perms(0755));
	}
}

TEST(AmbientVolumeFileTest, TheNextWriteRemovesTemporariesThatKilledWritersLeft)
{
	TestSupport::ScratchDir scratch;
	// The process id of a writer that is gone, as a bake killed part-way leaves it.
	const pid_t child = ::fork();
	if (child == 0)
	{
		::_exit(0);
	}
	ASSERT_GT(child, 0);
	::waitpid(child, nullptr, 0);
	const std::string dead = std::to_string(child);
	const std::string alive = std::to_string(::getpid());
	const struct
	{
		std::string myName;
		bool myRemovedFlag;
	} cases[] = {
	    {".ambient.sh." + dead + ".Ab12cD.tmp", true},
	    {".ambient.sh.Ab12cD.tmp", true},                // named before writers put their process id in it
	    {".ambient.sh." + alive + ".Ab12cD.tmp", false}, // a write of this process in progress
	    {".lights.xml." + dead + ".Ab12cD.tmp", false},  // another file's
	    {".ambient.sh.notes.tmp", false},                // not a temporary's name
	    {"ambient.sh." + dead + ".Ab12cD.tmp", false},
	};
	for (const auto& test : cases)
	{
		TestSupport::WriteWholeFile(scratch.File(test.myName), "half");
	}
	std::string problem;
	ASSERT_TRUE(Zeph::WriteAmbientVolume(scratch.File("ambient.sh"), MakeVolume(), problem)) << problem;
	for (const auto& test : cases)
	{
		EXPECT_EQ(std::filesystem::exists(scratch.File(test.myName)), !test.myRemovedFlag) << test.myName;
	}
}

TEST_F(FrameTest, SetShLightsTheFrameAndADamagedOrMissingFileLeavesNoVolume)
{
	LUMORA_RETURN_UNLESS(Start());
	Place("data/models/room_small.dae", {0.0f, 0.0f, 0.0f});
	Look({1.6f, 1.7f, -1.7f}, {-0.3f, 0.7f, 0.6f});
	const Pixel floor = Project({0.5f, 0.0f, 0.5f});
	Render("ambient-none");
	const float dark = Luminance(myLit, floor);

	const std::string baked = myScratch.File("baked/ambient.sh");
	std::string problem;
	ASSERT_TRUE(Zeph::WriteAmbientVolume(baked, UniformVolume(0.5f), problem)) << problem;
	const std::string damaged = myScratch.File("damaged/ambient.sh");
	std::filesystem::create_directories(myScratch.Path() / "damaged");
	std::ofstream(damaged, std::ios::binary) << TestSupport::ReadWholeFile(baked).substr(0, 50);
	// Each time from a lit frame: the previous level's light must not stay.
	for (const std::string& next : {damaged, myScratch.File("unbaked/ambient.sh")})
	{
		SCOPED_TRACE(next);
		Renderer().SetSH(baked);
		EXPECT_TRUE(Renderer().IsSHLoaded());
		Render("ambient-loaded");
		EXPECT_GT(Luminance(myLit, floor), 3.0f * dark) << "the volume lights the floor";
		TakeLog();

		Renderer().SetSH(next);
		const std::string log = TakeLog();
		EXPECT_EQ(log.find("Damaged ambient light, not loaded: " + damaged) != std::string::npos,
		          next == damaged)
		    << log;
		EXPECT_FALSE(Renderer().IsSHLoaded());
		Render("ambient-dropped");
		EXPECT_NEAR(Luminance(myLit, floor), dark, 1e-4f);
	}
}
