#include "platform/paths/Paths.h"

#include <filesystem>
#include <gtest/gtest.h>
#include <unistd.h>

#include "support/TestSupport.h"

namespace fs = std::filesystem;
using TestSupport::ReadWholeFile;
using TestSupport::ScratchDir;
using TestSupport::WriteWholeFile;

namespace
{
// Relative paths resolve against the working directory; this moves it into a
// scratch directory for one test and back afterwards.
class WorkingDirectory
{
public:
	explicit WorkingDirectory(const fs::path& aPath) : myPrevious(fs::current_path())
	{
		fs::current_path(aPath);
	}
	~WorkingDirectory() { fs::current_path(myPrevious); }

private:
	fs::path myPrevious;
};

// The engine's data tree as it lies on disk.
void MakeShaderTree(const ScratchDir& aScratch)
{
	fs::create_directories(aScratch.Path() / "data/Shaders/Misc");
	WriteWholeFile(aScratch.File("data/Shaders/Misc/x.fx"), "shader");
}
} // namespace

TEST(PathsTest, ResolveFindsEveryCaseSpellingOfRelativePaths)
{
	ScratchDir scratch;
	MakeShaderTree(scratch);
	WorkingDirectory inScratch(scratch.Path());

	EXPECT_EQ(Paths::Resolve("data/shaders/misc/x.fx"), "data/Shaders/Misc/x.fx");
	EXPECT_EQ(Paths::Resolve("Data/SHADERS/Misc/X.FX"), "data/Shaders/Misc/x.fx");
	EXPECT_EQ(Paths::Resolve("data/Shaders/Misc/x.fx"), "data/Shaders/Misc/x.fx");
	EXPECT_EQ(Paths::Resolve("./data/shaders/"), "data/Shaders/");
	EXPECT_EQ(Paths::Resolve("DATA"), "data");
}

TEST(PathsTest, ResolveWorksBelowTheRootForAbsolutePaths)
{
	ScratchDir scratch;
	MakeShaderTree(scratch);
	const std::string expected = scratch.File("data/Shaders/Misc/x.fx");

	EXPECT_EQ(Paths::Resolve(scratch.Path().string() + "/DATA/shaders/MISC/x.FX"), expected);
	EXPECT_EQ(ReadWholeFile(Paths::Resolve(scratch.Path().string() + "/data/shaders/misc/X.fx")), "shader");
}

TEST(PathsTest, ResolveKeepsComponentsAfterTheFirstMissingOneAsGiven)
{
	ScratchDir scratch;
	MakeShaderTree(scratch);
	WorkingDirectory inScratch(scratch.Path());

	EXPECT_EQ(Paths::Resolve("DATA/shaders/NoSuch/Misc/x.fx"), "data/Shaders/NoSuch/Misc/x.fx");
	EXPECT_EQ(Paths::Resolve("data/shaders/misc/new.fx"), "data/Shaders/Misc/new.fx");
	EXPECT_EQ(Paths::Resolve(""), "");
}

TEST(PathsTest, ResolveHandlesDotAndDotDot)
{
	ScratchDir scratch;
	MakeShaderTree(scratch);
	fs::create_directories(scratch.Path() / "data/Cubemaps");
	WorkingDirectory inScratch(scratch.Path());

	EXPECT_EQ(Paths::Resolve("./data/./shaders/misc/x.fx"), "data/Shaders/Misc/x.fx");
	const std::string throughParent = Paths::Resolve("data/cubemaps/../shaders/misc/x.fx");
	EXPECT_EQ(throughParent, "data/Cubemaps/../Shaders/Misc/x.fx");
	EXPECT_EQ(ReadWholeFile(throughParent), "shader");
	EXPECT_EQ(Paths::Resolve("."), ".");
}

TEST(PathsTest, ResolvePrefersTheExactSpelling)
{
	ScratchDir scratch;
	fs::create_directories(scratch.Path() / "data/Shaders");
	fs::create_directories(scratch.Path() / "data/shaders");
	WriteWholeFile(scratch.File("data/Shaders/a.fx"), "upper");
	WriteWholeFile(scratch.File("data/shaders/a.fx"), "lower");
	WriteWholeFile(scratch.File("data/shaders/b.FX"), "B upper");
	WriteWholeFile(scratch.File("data/shaders/b.fx"), "b lower");
	WorkingDirectory inScratch(scratch.Path());

	EXPECT_EQ(Paths::Resolve("data/Shaders/a.fx"), "data/Shaders/a.fx");
	EXPECT_EQ(Paths::Resolve("data/shaders/a.fx"), "data/shaders/a.fx");
	EXPECT_EQ(Paths::Resolve("data/shaders/b.FX"), "data/shaders/b.FX");
	EXPECT_EQ(Paths::Resolve("data/shaders/b.fx"), "data/shaders/b.fx");
	// Neither spelling exact: the choice must at least be stable.
	EXPECT_EQ(Paths::Resolve("data/SHADERS/A.FX"), Paths::Resolve("data/SHADERS/A.FX"));
	EXPECT_EQ(Paths::Resolve("data/SHADERS/A.FX"), "data/Shaders/a.fx");
}

TEST(PathsTest, PrepareForWriteCreatesMissingDirectoriesUnderTheExistingSpelling)
{
	ScratchDir scratch;
	MakeShaderTree(scratch);
	WorkingDirectory inScratch(scratch.Path());

	const std::string target = Paths::PrepareForWrite("DATA/shaders/Cubemaps/level 1/1.dds");
	EXPECT_EQ(target, "data/Shaders/Cubemaps/level 1/1.dds");
	EXPECT_TRUE(fs::is_directory("data/Shaders/Cubemaps/level 1"));
	EXPECT_FALSE(fs::exists("DATA"));
	EXPECT_FALSE(fs::exists(target)) << "only directories are created";

	EXPECT_EQ(Paths::PrepareForWrite("top.txt"), "top.txt");
}

TEST(PathsTest, PrepareForWriteFailsWhenADirectoryIsAFile)
{
	ScratchDir scratch;
	WriteWholeFile(scratch.File("plain"), "x");

	EXPECT_EQ(Paths::PrepareForWrite(scratch.File("plain/sub/file.txt")), "");
	EXPECT_EQ(Paths::PrepareForWrite(scratch.File("plain/file.txt")), "");
	EXPECT_EQ(ReadWholeFile(scratch.File("plain")), "x");
}

TEST(PathsTest, TemporaryForGivesUniqueNewFilesBesideTheTarget)
{
	ScratchDir scratch;
	const std::string target = scratch.File("level.xml");

	const std::string first = Paths::TemporaryFor(target);
	const std::string second = Paths::TemporaryFor(target);
	ASSERT_FALSE(first.empty());
	EXPECT_NE(first, second);
	EXPECT_EQ(fs::path(first).parent_path(), scratch.Path());
	EXPECT_TRUE(fs::path(first).filename().string().starts_with(".level.xml."));
	EXPECT_TRUE(first.ends_with(".tmp"));
	EXPECT_TRUE(fs::exists(first)) << "the name is reserved by creating the file";
	EXPECT_FALSE(fs::exists(target));

	EXPECT_EQ(Paths::TemporaryFor(scratch.File("missing/level.xml")), "");
}

TEST(PathsTest, ReplaceWithSwapsInTheNewContent)
{
	ScratchDir scratch;
	const std::string target = scratch.File("level.xml");
	WriteWholeFile(target, "old");
	fs::permissions(target, fs::perms(0640));

	const std::string temporary = Paths::TemporaryFor(target);
	WriteWholeFile(temporary, "new");
	ASSERT_TRUE(Paths::ReplaceWith(temporary, target));
	EXPECT_EQ(ReadWholeFile(target), "new");
	EXPECT_FALSE(fs::exists(temporary));
	EXPECT_EQ(fs::status(target).permissions(), fs::perms(0640)) << "the replaced file keeps its permissions";

	const std::string fresh = scratch.File("fresh.xml");
	const std::string freshTemporary = Paths::TemporaryFor(fresh);
	WriteWholeFile(freshTemporary, "first");
	ASSERT_TRUE(Paths::ReplaceWith(freshTemporary, fresh));
	EXPECT_EQ(ReadWholeFile(fresh), "first");
}

TEST(PathsTest, FailedReplaceKeepsTheOldFileAndRemovesTheTemporary)
{
	ScratchDir scratch;

	// The target's directory is a regular file: the rename cannot succeed.
	const std::string notADirectory = scratch.File("plain");
	WriteWholeFile(notADirectory, "old");
	std::string temporary = Paths::TemporaryFor(scratch.File("level.xml"));
	WriteWholeFile(temporary, "new");
	EXPECT_FALSE(Paths::ReplaceWith(temporary, notADirectory + "/level.xml"));
	EXPECT_EQ(ReadWholeFile(notADirectory), "old");
	EXPECT_FALSE(fs::exists(temporary));

	// The target is a directory with content: it must survive untouched.
	fs::create_directories(scratch.Path() / "busy");
	WriteWholeFile(scratch.File("busy/inside.txt"), "kept");
	temporary = Paths::TemporaryFor(scratch.File("busy"));
	WriteWholeFile(temporary, "new");
	EXPECT_FALSE(Paths::ReplaceWith(temporary, scratch.File("busy")));
	EXPECT_EQ(ReadWholeFile(scratch.File("busy/inside.txt")), "kept");
	EXPECT_FALSE(fs::exists(temporary));

	EXPECT_FALSE(Paths::ReplaceWith(scratch.File("never-written.tmp"), scratch.File("x")));
	EXPECT_FALSE(fs::exists(scratch.File("x")));
}
