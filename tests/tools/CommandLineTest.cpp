// The lumora tool end to end, as a user runs it: a copy of data/ in a scratch folder,
// the small sample level baked there with one bounce, the written files described by
// lumora info, a frame rendered and compared with a golden image; and bad input
// answered with one line on standard error and a non-zero exit.
#include <algorithm>
#include <array>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <gtest/gtest.h>
#include <string>
#include <sys/wait.h>
#include <vector>

#include "model/AlFile.h"
#include "model/ModelNode.h"
#include "model/ModelTreeCheck.h"
#include "support/FileSizeLimit.h"
#include "support/Golden.h"
#include "support/TestSupport.h"

namespace
{
namespace fs = std::filesystem;

struct ToolRun
{
	int myStatus = -1;
	std::string myOutput; // standard output
	std::string myErrors; // standard error
};

// Runs the tool in aFolder with the arguments (quoted by the caller where needed).
ToolRun RunTool(const fs::path& aFolder, const std::string& someArguments)
{
	const fs::path errors = aFolder / "stderr.txt";
	const std::string command = "cd '" + aFolder.string() + "' && '" + std::string(LUMORA_CLI_PATH) + "' " +
	                            someArguments + " 2>'" + errors.string() + "'";
	ToolRun run;
	FILE* pipe = popen(command.c_str(), "r");
	if (pipe == nullptr)
	{
		return run;
	}
	std::array<char, 4096> buffer{};
	size_t count = 0;
	while ((count = fread(buffer.data(), 1, buffer.size(), pipe)) > 0)
	{
		run.myOutput.append(buffer.data(), count);
	}
	const int status = pclose(pipe);
	run.myStatus = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
	run.myErrors = TestSupport::ReadWholeFile(errors.string());
	return run;
}

class CommandLineTest : public ::testing::Test
{
protected:
	// data/ copied (without anything baked into it locally) into the scratch folder.
	void CopyData()
	{
		fs::copy(fs::path(LUMORA_TEST_SOURCE_ROOT) / "data", myScratch.Path() / "data",
		         fs::copy_options::recursive);
		for (const fs::directory_entry& entry : fs::directory_iterator(myScratch.Path() / "data/Cubemaps"))
		{
			if (entry.is_directory())
			{
				fs::remove_all(entry.path());
			}
		}
		for (const fs::directory_entry& entry : fs::directory_iterator(myScratch.Path() / "data/XML/levels"))
		{
			fs::remove(entry.path() / "ambient.sh");
		}
	}

	TestSupport::ScratchDir myScratch;
};
} // namespace

TEST_F(CommandLineTest, BakeDescribeAndRenderTheSmallLevel)
{
	CopyData();
	const ToolRun bake = RunTool(myScratch.Path(), "bake sample_small --bounces 1");
	if (bake.myErrors.find("no OpenGL 4.5") != std::string::npos && std::getenv("CI") == nullptr)
	{
		GTEST_SKIP() << bake.myErrors;
	}
	ASSERT_EQ(bake.myStatus, 0) << bake.myOutput << bake.myErrors;
	EXPECT_NE(bake.myOutput.find("ambient: data/XML/levels/sample_small/ambient.sh"), std::string::npos)
	    << bake.myOutput;
	EXPECT_NE(bake.myOutput.find("reflections: data/Cubemaps/sample_small/main.dds"), std::string::npos)
	    << bake.myOutput;

	// The volume: the room's -3..3 x 0..3 x -4..4 gives 3 x 2 x 4 cells; the top layer
	// (probes at y = 3, on the ceiling) is never captured.
	const ToolRun ambient = RunTool(myScratch.Path(), "info data/XML/levels/sample_small/ambient.sh");
	ASSERT_EQ(ambient.myStatus, 0) << ambient.myErrors;
	EXPECT_NE(ambient.myOutput.find("bounds (-3, 0, -4) to (3, 3, 4)"), std::string::npos)
	    << ambient.myOutput;
	EXPECT_NE(ambient.myOutput.find("3 x 2 x 4 cells (24), 12 never captured"), std::string::npos)
	    << ambient.myOutput;
	const ToolRun cubemap = RunTool(myScratch.Path(), "info data/Cubemaps/sample_small/main.dds");
	ASSERT_EQ(cubemap.myStatus, 0) << cubemap.myErrors;
	EXPECT_NE(cubemap.myOutput.find("cubemap, R16G16B16A16_FLOAT"), std::string::npos) << cubemap.myOutput;
	EXPECT_NE(cubemap.myOutput.find("256 x 256, 6 faces, 9 mips"), std::string::npos) << cubemap.myOutput;
	const ToolRun check = RunTool(myScratch.Path(), "check sample_small");
	EXPECT_EQ(check.myStatus, 0) << check.myOutput << check.myErrors;

	// A fixed camera: the info line prints its position.
	const ToolRun render =
	    RunTool(myScratch.Path(),
	            "render sample_small --out frame.png --size 160x90 --camera 0,1.5,-3.5 --pitch 0.15");
	ASSERT_EQ(render.myStatus, 0) << render.myOutput << render.myErrors;
	int width = 0;
	int height = 0;
	std::vector<uint8_t> pixels;
	ASSERT_TRUE(TestSupport::ReadPng((myScratch.Path() / "frame.png").string(), width, height, pixels));
	ASSERT_EQ(width, 160);
	ASSERT_EQ(height, 90);
	const std::string difference =
	    TestSupport::CompareWithGolden("cli-sample-small-baked", width, height, pixels);
	EXPECT_TRUE(difference.empty()) << difference;
}

TEST_F(CommandLineTest, BadInputGetsOneClearLineAndAFailingExit)
{
	// No data/ here.
	const ToolRun noData = RunTool(myScratch.Path(), "render sample_small --out x.png");
	EXPECT_EQ(noData.myStatus, 1);
	EXPECT_EQ(noData.myErrors.rfind("lumora: no data/ folder in ", 0), 0u) << noData.myErrors;
	EXPECT_EQ(std::count(noData.myErrors.begin(), noData.myErrors.end(), '\n'), 1) << noData.myErrors;

	CopyData();
	const ToolRun unknown = RunTool(myScratch.Path(), "bake no_such_level");
	EXPECT_EQ(unknown.myStatus, 1);
	EXPECT_EQ(unknown.myErrors, "lumora: no level 'no_such_level' under data/XML/levels/\n");
	const ToolRun badSize = RunTool(myScratch.Path(), "render sample_small --out x.png --size 0x5");
	EXPECT_EQ(badSize.myStatus, 2) << badSize.myErrors;
	const ToolRun badFile = RunTool(myScratch.Path(), "info data/XML/EntityTypes.xml");
	EXPECT_EQ(badFile.myStatus, 2) << badFile.myErrors;

	// A light without its falloff value and a cut-off ambient.sh: check lists both, with
	// the file and the element; render and bake refuse with the first and end cleanly.
	const fs::path level = myScratch.Path() / "data/XML/levels/sample_small";
	std::string lights = TestSupport::ReadWholeFile((level / "lights.xml").string());
	const size_t falloff = lights.find("<falloff value=");
	ASSERT_NE(falloff, std::string::npos);
	lights.replace(falloff, lights.find("/>", falloff) - falloff, "<falloff ");
	TestSupport::WriteWholeFile((level / "lights.xml").string(), lights);
	TestSupport::WriteWholeFile((level / "ambient.sh").string(), std::string(20, '\1'));
	const ToolRun check = RunTool(myScratch.Path(), "check sample_small");
	if (check.myErrors.find("no OpenGL 4.5") != std::string::npos && std::getenv("CI") == nullptr)
	{
		GTEST_SKIP() << check.myErrors;
	}
	EXPECT_EQ(check.myStatus, 1);
	EXPECT_NE(check.myOutput.find("2 problems:"), std::string::npos) << check.myOutput;
	EXPECT_NE(check.myOutput.find("[falloff] in [point-light] in [data/XML/levels/sample_small/lights.xml]"),
	          std::string::npos)
	    << check.myOutput;
	EXPECT_NE(check.myOutput.find("sample_small/ambient.sh is shorter than its 36-byte header"),
	          std::string::npos)
	    << check.myOutput;
	const ToolRun render = RunTool(myScratch.Path(), "render sample_small --out x.png");
	EXPECT_EQ(render.myStatus, 1);
	EXPECT_NE(render.myErrors.find("lumora: level 'sample_small' has 2 problem(s)"), std::string::npos)
	    << render.myErrors;
	EXPECT_EQ(render.myErrors.find("Call stack"), std::string::npos) << render.myErrors;
	EXPECT_FALSE(fs::exists(myScratch.Path() / "x.png"));
	const ToolRun info = RunTool(myScratch.Path(), "info data/XML/levels/sample_small/ambient.sh");
	EXPECT_EQ(info.myStatus, 1);
	EXPECT_NE(info.myErrors.find("shorter than its 36-byte header"), std::string::npos) << info.myErrors;
}

TEST_F(CommandLineTest, ArgumentsAndLevelNamesKeepTheReadmesWord)
{
	// Every bad argument: one "lumora:" line, status 2 (CLI11 alone answers 105 to 114).
	for (const char* arguments : {"bake", "bake sample_small --bounces 99", "frobnicate",
	                              "render sample_small", "bake sample_small --ambient-only --specular-only"})
	{
		SCOPED_TRACE(arguments);
		const ToolRun run = RunTool(myScratch.Path(), arguments);
		EXPECT_EQ(run.myStatus, 2);
		EXPECT_EQ(run.myErrors.rfind("lumora: ", 0), 0u) << run.myErrors;
		EXPECT_EQ(std::count(run.myErrors.begin(), run.myErrors.end(), '\n'), 1) << run.myErrors;
	}
	EXPECT_EQ(RunTool(myScratch.Path(), "--help").myStatus, 0);

	// Level names are matched without regard to case, as every data path is; an unbaked
	// level is a note on standard output, not an error.
	CopyData();
	const ToolRun render = RunTool(myScratch.Path(), "render SAMPLE_Small --out x.png --size 64x36");
	if (render.myErrors.find("no OpenGL 4.5") != std::string::npos && std::getenv("CI") == nullptr)
	{
		GTEST_SKIP() << render.myErrors;
	}
	EXPECT_EQ(render.myStatus, 0) << render.myErrors;
	EXPECT_EQ(render.myErrors, "");
	EXPECT_NE(render.myOutput.find("note: level sample_small has no baked ambient light yet"),
	          std::string::npos)
	    << render.myOutput;
	EXPECT_TRUE(fs::exists(myScratch.Path() / "x.png"));
}

TEST_F(CommandLineTest, InfoDescribesAModelFileAndNamesTheDamage)
{
	// Root (a quad) -> "group" -> "leaf" (a quad with a null-object child model), and "empty".
	const std::unique_ptr<Zeph::ModelNode> tree(ModelTreeCheck::MakeTree());
	std::vector<uint8_t> bytes;
	Zeph::AlFile::Encode(*tree, bytes);
	const std::string whole(bytes.begin(), bytes.end());
	TestSupport::WriteWholeFile((myScratch.Path() / "tree.al").string(), whole);
	const ToolRun info = RunTool(myScratch.Path(), "info tree.al");
	ASSERT_EQ(info.myStatus, 0) << info.myErrors;
	for (const char* line :
	     {"  node 'root', 2 children\n", "    node 'group', 1 child\n", "      node 'leaf', 0 children\n",
	      "        model: null object\n", "    node 'empty', 0 children\n",
	      "  model: POS_NORM_UV_TAN_BI, 4 vertices, 6 indices, 2 surfaces\n",
	      "  2 models, 8 vertices, 12 indices"})
	{
		EXPECT_NE(info.myOutput.find(line), std::string::npos) << line << "\n" << info.myOutput;
	}

	TestSupport::WriteWholeFile((myScratch.Path() / "cut.al").string(), whole.substr(0, whole.size() / 2));
	const ToolRun cut = RunTool(myScratch.Path(), "info cut.al");
	EXPECT_EQ(cut.myStatus, 1);
	EXPECT_EQ(cut.myErrors.rfind("lumora: cut.al: ", 0), 0u) << cut.myErrors;
	EXPECT_EQ(std::count(cut.myErrors.begin(), cut.myErrors.end(), '\n'), 1) << cut.myErrors;
}

// A level edited by hand into what a bake must not take: check lists each problem with its
// file; bake refuses, naming them, unless --force; a plain 2D DDS as a room's cubemap is named
// in render as in check. A misspelt entity catalogue leaves every level empty: a problem too.
TEST_F(CommandLineTest, CheckListsHostileLevelsAndBakeRefusesThemUnlessForced)
{
	CopyData();
	const fs::path level = myScratch.Path() / "data/XML/levels/sample_small";
	const auto edit = [](const fs::path& aFile, const std::string& aGood, const std::string& aBad) {
		std::string text = TestSupport::ReadWholeFile(aFile.string());
		ASSERT_NE(text.find(aGood), std::string::npos) << aGood;
		TestSupport::WriteWholeFile(aFile.string(), text.replace(text.find(aGood), aGood.size(), aBad));
	};
	fs::create_directories(myScratch.Path() / "data/Cubemaps/sample_small");
	fs::copy_file(myScratch.Path() / "data/textures/wood_albedo.dds",
	              myScratch.Path() / "data/Cubemaps/sample_small/main.dds");
	const ToolRun render = RunTool(myScratch.Path(), "render sample_small --out x.png --size 32x18");
	if (render.myErrors.find("no OpenGL 4.5") != std::string::npos && std::getenv("CI") == nullptr)
	{
		GTEST_SKIP() << render.myErrors;
	}
	const std::string flat =
	    "Room cubemap [data/Cubemaps/sample_small/main.dds] of room 0: not a cubemap of 6 faces; "
	    "the room shows the fallback cubemap";
	EXPECT_NE(render.myErrors.find(flat), std::string::npos) << render.myErrors;

	edit(level / "rooms.xml", "</rooms>",
	     "<room><min x=\"0\" y=\"1\" z=\"0\" /><max x=\"2\" y=\"1\" z=\"2\" /><id value=\"main\" /></room>"
	     "<room><min x=\"0\" y=\"3\" z=\"0\" /><max x=\"2\" y=\"1\" z=\"2\" /><id value=\"../cubemap\" "
	     "/></room></rooms>");
	edit(level / "entities.xml", "type=\"crate\"", "type=\"crates\"");
	edit(level / "lights.xml", "<falloff value=\"", "<falloff value=\"abc");
	const std::string rooms = "data/XML/levels/sample_small/rooms.xml: room ";
	const std::vector<std::string> problems = {
	    rooms + "1 ('main') has no extent along y",
	    rooms + "1 ('main') has the ID of room 0: both would bake into one cubemap file",
	    rooms + "2 ('../cubemap') is inverted along y (min 3 > max 1)",
	    rooms + "2 ('../cubemap'): the ID cannot name a cubemap file",
	    "data/XML/levels/sample_small/entities.xml: entity 1 of type [crates], which "
	    "data/XML/EntityTypes.xml does "
	    "not list: it is left out",
	    "Not a number [abc",
	};
	const ToolRun check = RunTool(myScratch.Path(), "check sample_small");
	EXPECT_EQ(check.myStatus, 1);
	// The flat cubemap is named for both rooms that it would serve.
	EXPECT_NE(check.myOutput.find("8 problems:"), std::string::npos) << check.myOutput;
	for (const std::string& problem : problems)
	{
		EXPECT_NE(check.myOutput.find(problem), std::string::npos) << problem << "\n" << check.myOutput;
	}
	EXPECT_NE(check.myOutput.find(flat), std::string::npos) << check.myOutput;

	// The damaged cubemap is what a bake replaces; the rest would be baked in.
	const ToolRun refused = RunTool(myScratch.Path(), "bake sample_small --ambient-only --bounces 0");
	EXPECT_EQ(refused.myStatus, 1);
	EXPECT_NE(refused.myErrors.find("lumora: level 'sample_small' has 6 problems; not baked"),
	          std::string::npos)
	    << refused.myErrors;
	for (const std::string& problem : problems)
	{
		EXPECT_NE(refused.myErrors.find(problem), std::string::npos) << problem << "\n" << refused.myErrors;
	}
	const ToolRun forced = RunTool(myScratch.Path(), "bake sample_small --ambient-only --bounces 0 --force");
	EXPECT_EQ(forced.myStatus, 0) << forced.myErrors;
	EXPECT_NE(forced.myOutput.find("6 problems, baked anyway (--force)"), std::string::npos)
	    << forced.myOutput;

	edit(myScratch.Path() / "data/XML/EntityTypes.xml", "<entities>", "<entitys>");
	edit(myScratch.Path() / "data/XML/EntityTypes.xml", "</entities>", "</entitys>");
	const ToolRun empty = RunTool(myScratch.Path(), "check sample_small");
	EXPECT_NE(empty.myOutput.find("data/XML/EntityTypes.xml: no entity type with a model"), std::string::npos)
	    << empty.myOutput;
}

TEST_F(CommandLineTest, ABakeTheDiskWillNotTakeExitsOneNamingTheFileAndKeepsTheOldOne)
{
	CopyData();
	const std::string bake = "bake sample_small --bounces 1 --ambient-only";
	const ToolRun first = RunTool(myScratch.Path(), bake);
	if (first.myErrors.find("no OpenGL 4.5") != std::string::npos && std::getenv("CI") == nullptr)
	{
		GTEST_SKIP() << first.myErrors;
	}
	ASSERT_EQ(first.myStatus, 0) << first.myOutput << first.myErrors;
	const std::string path = "data/XML/levels/sample_small/ambient.sh";
	const std::string before = TestSupport::ReadWholeFile((myScratch.Path() / path).string());
	ASSERT_EQ(before.size(), 708u);
	TestSupport::WriteWholeFile((myScratch.Path() / "data/XML/levels/sample_small/lights.xml").string(),
	                            "<root><point-lights/><spot-lights/></root>\n");
	ToolRun full;
	{
		// The disk takes the tool's messages, not the 708 bytes of the new volume.
		TestSupport::FileSizeLimit limit(640);
		full = RunTool(myScratch.Path(), bake);
	}
	EXPECT_EQ(full.myStatus, 1) << full.myOutput << full.myErrors;
	EXPECT_NE(full.myErrors.find("the ambient bake did not write " + path), std::string::npos)
	    << full.myErrors;
	EXPECT_TRUE(TestSupport::ReadWholeFile((myScratch.Path() / path).string()) == before)
	    << "the old volume was replaced";
}
