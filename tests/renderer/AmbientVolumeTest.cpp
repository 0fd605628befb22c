// The baked ambient light's file, ambient.sh: written whole through a temporary and
// read back unchanged, or not at all (a folder that cannot be written) with the old file
// kept byte for byte; temporaries of killed writers are cleared; damaged
// files are refused with a reason; SetSH drops the volume shown so far before it loads,
// so a damaged or missing file leaves none, and a loaded volume lights the frame.
#include <algorithm>
#include <array>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <string>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

#include "FrameFixture.h"
#include "renderer/AmbientVolumeFile.h"
#include "renderer/Renderer.h"
#include "renderer/ShPacking.h"
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

} // namespace

TEST(AmbientVolumeFileTest, AWrittenFileReadsBackUnchangedDamagedOnesAreRefusedAndRefusedWritesKeepTheOld)
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
	EXPECT_EQ((std::array{read.myWorldMin.x, read.myWorldSize.z}), (std::array{-3.0f, 4.5f}));
	EXPECT_EQ((std::array{read.myCounts[0], read.myCounts[1], read.myCounts[2]}), (std::array{3, 2, 2}));
	EXPECT_TRUE(std::equal(std::begin(read.myBlocks), std::end(read.myBlocks), std::begin(written.myBlocks)));
	// The layout is the documented one: counts at 24, block 0 from byte 36, little-endian.
	const std::string bytes = TestSupport::ReadWholeFile(path);
	EXPECT_EQ(static_cast<uint8_t>(bytes[24]), 3);
	EXPECT_EQ(static_cast<uint8_t>(bytes[36 + 12 * 4]), written.myBlocks[1][0] & 0xFF);

	Zeph::AmbientVolume incomplete = MakeVolume();
	incomplete.myBlocks[6].pop_back();
	EXPECT_FALSE(Zeph::WriteAmbientVolume(path, incomplete, problem));
	ASSERT_EQ(Zeph::ReadAmbientVolume(path, read, problem), Zeph::AmbientVolumeRead::OK)
	    << "a refused write leaves the old file";

	// Damaged copies of the file are refused with their reason (the fuzz entry drives the rest).
	std::string huge = bytes;
	const int counts[3] = {4096, 1, 1};
	huge.replace(24, 12, reinterpret_cast<const char*>(counts), 12);
	const struct
	{
		const char* myName;
		std::string myBytes;
		const char* myReason;
	} cases[] = {
	    {"short", bytes.substr(0, 20), "is shorter than its 36-byte header"},
	    {"longer", bytes + "x", "holds 373 bytes; its counts need 372"},
	    {"huge", huge, "has probe counts 4096 x 1 x 1 (each must be 1 to 2048)"},
	};
	for (const auto& test : cases)
	{
		const std::string file = scratch.File(std::string(test.myName) + ".sh");
		std::ofstream(file, std::ios::binary) << test.myBytes;
		Zeph::AmbientVolume volume;
		std::string reason;
		EXPECT_EQ(Zeph::ReadAmbientVolume(file, volume, reason), Zeph::AmbientVolumeRead::DAMAGED)
		    << test.myName;
		EXPECT_EQ(reason, file + " " + test.myReason);
	}
	EXPECT_EQ(Zeph::ReadAmbientVolume(scratch.File("missing.sh"), read, problem),
	          Zeph::AmbientVolumeRead::CANNOT_OPEN);

	// Writes a folder refuses keep the old file and say why (a full disk is the ambient
	// bake's and the command-line tool's to meet).
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
	const struct
	{
		std::string myPath;
		const char* myReason;
	} refusals[] = {
	    {locked, "no temporary file can be made beside it"},
	    {scratch.File("plain/ambient.sh"), "its folder cannot be made"},
	};
	for (const auto& refusal : refusals)
	{
		const std::string before = TestSupport::ReadWholeFile(refusal.myPath);
		EXPECT_FALSE(Zeph::WriteAmbientVolume(refusal.myPath, MakeVolume(), problem));
		EXPECT_EQ(problem, refusal.myPath + ": " + refusal.myReason);
		EXPECT_EQ(TestSupport::ReadWholeFile(refusal.myPath), before) << "the old file is untouched";
	}
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
	// The volume the bake would write for E / pi = 0.5 everywhere over the room.
	Zeph::AmbientVolume uniform = MakeVolume(2, 2, 2);
	uniform.myWorldMin = Vector3<float>(-2.0f, 0.0f, -2.0f);
	uniform.myWorldSize = Vector3<float>(4.0f, 3.0f, 4.0f);
	for (int block = 0; block < Zeph::AmbientVolume::ourBlockCount; ++block)
	{
		uniform.myBlocks[block].assign(8, block < 3 ? Zeph::PackSHVector(0.0f, 0.0f, 0.0f, 0.5f)
		                                            : Zeph::ourNeutralSHTexel);
	}
	ASSERT_TRUE(Zeph::WriteAmbientVolume(baked, uniform, problem)) << problem;
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
