#include "platform/paths/Paths.h"

#include <filesystem>
#include <gtest/gtest.h>

#include "support/TestSupport.h"

namespace fs = std::filesystem;
using TestSupport::ReadWholeFile;
using TestSupport::ScratchDir;
using TestSupport::WriteWholeFile;

namespace
{
// A scratch data tree, made the working directory for the test (relative paths
// resolve against it) and left again afterwards.
class PathsTest : public testing::Test
{
protected:
	PathsTest() : myPrevious(fs::current_path())
	{
		fs::create_directories(myScratch.Path() / "data/Shaders/Misc");
		WriteWholeFile(myScratch.File("data/Shaders/Misc/x.fx"), "shader");
		fs::current_path(myScratch.Path());
	}
	~PathsTest() override { fs::current_path(myPrevious); }

	ScratchDir myScratch;
	fs::path myPrevious;
};
} // namespace

TEST_F(PathsTest, ResolveFindsAnySpellingAndPrefersTheExactOne)
{
	fs::create_directories("data/Cubemaps");
	fs::create_directories("data/cubemaps");
	WriteWholeFile("data/cubemaps/b.DDS", "B");
	WriteWholeFile("data/cubemaps/b.dds", "b");
	const struct
	{
		std::string given;
		std::string resolved;
	} cases[] = {
	    {"data/shaders/misc/x.fx", "data/Shaders/Misc/x.fx"},
	    {"Data/SHADERS/Misc/X.FX", "data/Shaders/Misc/x.fx"},
	    {"./data/./shaders/", "data/Shaders/"},
	    {"DATA", "data"},
	    {"", ""},
	    {"DATA/shaders/NoSuch/Misc/x.fx", "data/Shaders/NoSuch/Misc/x.fx"},
	    {"data/Cubemaps/../shaders/misc/x.fx", "data/Cubemaps/../Shaders/Misc/x.fx"},
	    {"data/cubemaps/../shaders/misc/x.fx", "data/cubemaps/../Shaders/Misc/x.fx"},
	    {"data/cubemaps/b.DDS", "data/cubemaps/b.DDS"},
	    {"data/cubemaps/b.dds", "data/cubemaps/b.dds"},
	};
	for (const auto& test : cases)
	{
		EXPECT_EQ(Paths::Resolve(test.given), test.resolved) << test.given;
	}
	EXPECT_EQ(ReadWholeFile(Paths::Resolve(myScratch.Path().string() + "/DATA/shaders/MISC/x.FX")), "shader");
}

TEST_F(PathsTest, PrepareForWriteCreatesMissingDirectoriesOrFailsCleanly)
{
	const std::string target = Paths::PrepareForWrite("DATA/shaders/Cubemaps/level 1/1.dds");
	EXPECT_EQ(target, "data/Shaders/Cubemaps/level 1/1.dds");
	EXPECT_TRUE(fs::is_directory("data/Shaders/Cubemaps/level 1"));
	EXPECT_FALSE(fs::exists("DATA"));
	EXPECT_FALSE(fs::exists(target)) << "only directories are created";

	WriteWholeFile("plain", "x");
	EXPECT_EQ(Paths::PrepareForWrite("plain/sub/file.txt"), "");
	EXPECT_EQ(Paths::PrepareForWrite("plain/file.txt"), "");
	EXPECT_EQ(ReadWholeFile("plain"), "x");
}

// A temporary is a new file of its own beside the target, which replaces the target keeping its
// permissions, or fails keeping the old file and removing the temporary.
TEST_F(PathsTest, TemporariesBesideTheTargetReplaceItKeepingPermissionsOrKeepTheOldFile)
{
	WriteWholeFile("level.xml", "old");
	fs::permissions("level.xml", fs::perms(0640));
	EXPECT_EQ(Paths::TemporaryFor(myScratch.File("missing/level.xml")), "");
	for (const std::string target : {"level.xml", "fresh.xml"})
	{
		const std::string temporary = Paths::TemporaryFor(target);
		EXPECT_TRUE(fs::equivalent(fs::absolute(temporary).parent_path(), fs::current_path())) << temporary;
		EXPECT_NE(temporary, Paths::TemporaryFor(target));
		EXPECT_TRUE(fs::exists(temporary)) << "the name is reserved by creating the file";
		WriteWholeFile(temporary, "new");
		ASSERT_TRUE(Paths::ReplaceWith(temporary, target)) << target;
		EXPECT_EQ(ReadWholeFile(target), "new");
		EXPECT_FALSE(fs::exists(temporary));
	}
	EXPECT_EQ(fs::status("level.xml").permissions(), fs::perms(0640));

	WriteWholeFile("plain", "old");
	fs::create_directories("busy");
	WriteWholeFile("busy/inside.txt", "kept");
	// A target below a regular file, and a target that is a directory with content.
	for (const std::string target : {"plain/level.xml", "busy"})
	{
		const std::string temporary = Paths::TemporaryFor("level.xml");
		WriteWholeFile(temporary, "new");
		EXPECT_FALSE(Paths::ReplaceWith(temporary, target)) << target;
		EXPECT_FALSE(fs::exists(temporary)) << target;
	}
	EXPECT_EQ(ReadWholeFile("plain"), "old");
	EXPECT_EQ(ReadWholeFile("busy/inside.txt"), "kept");
	EXPECT_FALSE(Paths::ReplaceWith("never-written.tmp", "x"));
	EXPECT_FALSE(fs::exists("x"));
}
