// The lumora tool end to end, as a user runs it: a copy of data/ in a scratch folder,
// the small sample level baked there with one bounce, the written files described by
// lumora info, a frame rendered and compared with a golden image, a bake onto a full
// disk; and bad input answered with one line on standard error and a non-zero exit.
#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <gmock/gmock-matchers.h>
#include <gtest/gtest.h>
#include <initializer_list>
#include <nlohmann/json.hpp>
#include <string>
#include <sys/wait.h>
#include <vector>

#include "model/AlFile.h"
#include "model/ModelNode.h"
#include "model/ModelTreeCheck.h"
#include "support/FileSizeLimit.h"
#include "support/GlSupport.h"
#include "support/Golden.h"
#include "support/TestSupport.h"

namespace
{
namespace fs = std::filesystem;
using testing::HasSubstr;

struct ToolRun
{
	int myStatus = -1;
	std::string myOutput; // standard output
	std::string myErrors; // standard error
};

class CommandLineTest : public ::testing::Test
{
protected:
	// Runs the tool in the scratch folder with the arguments (quoted by the caller where needed).
	ToolRun Run(const std::string& someArguments)
	{
		const std::string command = "cd '" + myScratch.Path().string() + "' && '" +
		                            std::string(LUMORA_CLI_PATH) + "' " + someArguments +
		                            " >stdout.txt 2>stderr.txt";
		const int status = std::system(command.c_str());
		return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, Read("stdout.txt"), Read("stderr.txt")};
	}

	// Runs a shell script (no single quotes in it) in the scratch folder, the tool named by
	// $LUMORA; returns its exit status.
	int Shell(const std::string& aScript)
	{
		const std::string command = "cd '" + myScratch.Path().string() + "' && LUMORA='" +
		                            std::string(LUMORA_CLI_PATH) + "' sh -c '" + aScript + "'";
		const int status = std::system(command.c_str());
		return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
	}

	std::string Read(const std::string& aFile) const
	{
		return TestSupport::ReadWholeFile(myScratch.File(aFile));
	}

	// Replaces the first aGood in the scratch folder's aFile with aBad.
	void Edit(const std::string& aFile, const std::string& aGood, const std::string& aBad)
	{
		std::string text = Read(aFile);
		ASSERT_NE(text.find(aGood), std::string::npos) << aGood;
		TestSupport::WriteWholeFile(myScratch.File(aFile),
		                            text.replace(text.find(aGood), aGood.size(), aBad));
	}

	// data/ copied into the scratch folder, without what a local bake of sample_small left there
	// (the tests bake it themselves).
	void CopyData()
	{
		fs::copy(fs::path(LUMORA_TEST_SOURCE_ROOT) / "data", myScratch.Path() / "data",
		         fs::copy_options::recursive);
		fs::remove_all(myScratch.Path() / "data/Cubemaps/sample_small");
		fs::remove(myScratch.Path() / "data/XML/levels/sample_small/ambient.sh");
		fs::remove(myScratch.Path() / "data/XML/levels/sample_small/bake.json");
	}

	TestSupport::ScratchDir myScratch;
};

// Exit status aStatus and one line on standard error, beginning with aStart.
void ExpectOneErrorLine(const ToolRun& aRun, int aStatus, const std::string& aStart)
{
	EXPECT_EQ(aRun.myStatus, aStatus) << aRun.myErrors;
	EXPECT_EQ(aRun.myErrors.rfind(aStart, 0), 0u) << aRun.myErrors;
	EXPECT_EQ(std::count(aRun.myErrors.begin(), aRun.myErrors.end(), '\n'), 1) << aRun.myErrors;
}

// Exit status aStatus, and each of someTexts in aText (the run's output or its errors).
void ExpectRun(const ToolRun& aRun, int aStatus, const std::string& aText,
               std::initializer_list<std::string> someTexts)
{
	EXPECT_EQ(aRun.myStatus, aStatus) << aRun.myOutput << aRun.myErrors;
	for (const std::string& text : someTexts)
	{
		EXPECT_THAT(aText, HasSubstr(text));
	}
}

} // namespace

// Bad input first: every bad argument is one "lumora:" line and status 2 (CLI11 alone answers
// 105 to 114); what the tool cannot find or read (a damaged model among them) is one line and
// status 1; a model file is described node by node. Level names are matched without regard to
// case, as every data path is; an unbaked level is a note on standard output. Then the small
// level is baked, described (with a stale bake record), rendered and baked onto a full disk; then
// damaged, and refused with its problems listed.
TEST_F(CommandLineTest, BadInputGetsAClearLineAndAFailingExitTheSmallLevelBakesAndRendersAndDamageIsListed)
{
	ExpectOneErrorLine(Run("render sample_small --out x.png"), 1, "lumora: no data/ folder in ");
	CopyData();
	ExpectOneErrorLine(Run("bake no_such_level"), 1,
	                   "lumora: no level 'no_such_level' under data/XML/levels/\n");
	for (const char* arguments :
	     {"bake", "frobnicate", "bake sample_small --ambient-only --specular-only",
	      "render sample_small --out x.png --size 0x5", "info data/XML/EntityTypes.xml"})
	{
		SCOPED_TRACE(arguments);
		ExpectOneErrorLine(Run(arguments), 2, "lumora: ");
	}

	// Root (a quad) -> "group" -> "leaf" (a quad with a null-object child model), and "empty".
	const std::unique_ptr<Zeph::ModelNode> tree(ModelTreeCheck::MakeTree());
	std::vector<uint8_t> bytes;
	Zeph::AlFile::Encode(*tree, bytes);
	const std::string whole(bytes.begin(), bytes.end());
	TestSupport::WriteWholeFile((myScratch.Path() / "tree.al").string(), whole);
	const ToolRun described = Run("info tree.al");
	EXPECT_EQ(described.myStatus, 0) << described.myErrors;
	for (const char* line :
	     {"  node 'root', 2 children\n", "    node 'group', 1 child\n", "      node 'leaf', 0 children\n",
	      "        model: null object\n", "    node 'empty', 0 children\n",
	      "  model: POS_NORM_UV_TAN_BI, 4 vertices, 6 indices, 2 surfaces\n",
	      "  2 models, 8 vertices, 12 indices"})
	{
		EXPECT_THAT(described.myOutput, HasSubstr(line));
	}

	TestSupport::WriteWholeFile((myScratch.Path() / "cut.al").string(), whole.substr(0, whole.size() / 2));
	ExpectOneErrorLine(Run("info cut.al"), 1, "lumora: cut.al: ");

	const ToolRun unbaked = Run("render SAMPLE_Small --out x.png --size 64x36");
	// No OpenGL 4.5 is no failure outside CI: the rest is skipped.
	if (unbaked.myErrors.find("no OpenGL 4.5") != std::string::npos && !TestSupport::IsCi())
	{
		GTEST_SKIP() << unbaked.myErrors;
	}
	ExpectRun(unbaked, 0, unbaked.myOutput, {"note: level sample_small has no baked ambient light yet"});
	EXPECT_EQ(unbaked.myErrors, "");
	EXPECT_TRUE(fs::exists(myScratch.Path() / "x.png"));

	// The small level baked with one bounce, the written files described, a frame rendered.
	// Each bar ends at 100 % (the bake's own percentage stops at 50 here: it counts the
	// volume's top layer, which is never visited).
	const ToolRun bake = Run("bake sample_small --bounces 1");
	ExpectRun(bake, 0, bake.myOutput,
	          {"ambient      100%\n", "reflections  100%\n",
	           "ambient: data/XML/levels/sample_small/ambient.sh",
	           "reflections: data/Cubemaps/sample_small/main.dds"});

	// The volume: the room's -3..3 x 0..3 x -4..4 gives 3 x 2 x 4 cells; the top layer
	// (probes at y = 3, on the ceiling) is never captured.
	const ToolRun ambient = Run("info data/XML/levels/sample_small/ambient.sh");
	ExpectRun(ambient, 0, ambient.myOutput,
	          {"bounds (-3, 0, -4) to (3, 3, 4)", "3 x 2 x 4 cells (24), 12 never captured"});
	const ToolRun cubemap = Run("info data/Cubemaps/sample_small/main.dds");
	ExpectRun(cubemap, 0, cubemap.myOutput, {"cubemap, R16G16B16A16_FLOAT", "256 x 256, 6 faces, 9 mips"});
	ExpectRun(Run("check sample_small"), 0, "", {});

	// The bake's record, once lights.xml is edited: check names the file and fails (a baked
	// file's problem, which a bake mends); info describes the record and what changed since.
	const std::string lights = "data/XML/levels/sample_small/lights.xml";
	const std::string edited = Read(lights);
	TestSupport::WriteWholeFile(myScratch.File(lights), edited + "\n");
	const ToolRun stale = Run("check sample_small");
	ExpectRun(stale, 1, stale.myOutput,
	          {"1 problem:\n  lights.xml changed since the ambient and reflection bakes of 20"});
	const std::string record = "data/XML/levels/sample_small/bake.json";
	const ToolRun recorded = Run("info " + record);
	ExpectRun(recorded, 0, recorded.myOutput,
	          {"ambient: baked 20", "every room", "1 bounce, 3 x 2 x 4 probes, (-3, 0, -4) to (3, 3, 4)",
	           "data/XML/levels/sample_small/ambient.sh (708 bytes)", lights + " changed",
	           "data/Cubemaps/sample_small/main.dds"});
	TestSupport::WriteWholeFile(myScratch.File(lights), edited);
	// The damage below is listed without the record's lines.
	fs::remove(myScratch.Path() / record);

	// A fixed camera: the info line prints its position.
	const ToolRun render =
	    Run("render sample_small --out frame.png --size 160x90 --camera 0,1.5,-3.5 --pitch 0.15");
	ASSERT_EQ(render.myStatus, 0) << render.myOutput << render.myErrors;
	int width = 0;
	int height = 0;
	std::vector<uint8_t> pixels;
	ASSERT_TRUE(TestSupport::ReadPng((myScratch.Path() / "frame.png").string(), width, height, pixels));
	EXPECT_EQ(TestSupport::CompareWithGolden("cli-sample-small-baked", width, height, pixels), "");

	// A bake the disk will not take (of another volume: two bounces) exits 1 naming the file and
	// keeps the old volume: the disk takes the tool's messages, not the 708 bytes of the new one.
	const std::string path = "data/XML/levels/sample_small/ambient.sh";
	const std::string before = Read(path);
	ASSERT_EQ(before.size(), 708u);
	ToolRun full;
	{
		TestSupport::FileSizeLimit limit(640);
		full = Run("bake sample_small --bounces 2 --ambient-only");
	}
	ExpectRun(full, 1, full.myErrors, {"the ambient bake did not write " + path});
	EXPECT_TRUE(Read(path) == before) << "the old volume was replaced";

	// A light without its falloff value and a cut-off ambient.sh: check lists both, with
	// the file and the element; render and bake refuse with the first and end cleanly.
	Edit("data/XML/levels/sample_small/lights.xml", "<falloff value=\"5.2\" />", "<falloff />");
	TestSupport::WriteWholeFile(myScratch.File("data/XML/levels/sample_small/ambient.sh"),
	                            std::string(20, '\1'));
	const ToolRun damaged = Run("check sample_small");
	ExpectRun(damaged, 1, damaged.myOutput,
	          {"2 problems:", "[falloff] in [point-light] in [data/XML/levels/sample_small/lights.xml]",
	           "sample_small/ambient.sh is shorter than its 36-byte header"});
	// The same as records, for the desktop editor: the file and the element taken out of the line,
	// the damaged ambient.sh marked as a baked file's problem.
	const ToolRun records = Run("check --json sample_small");
	ASSERT_EQ(records.myStatus, 1) << records.myErrors;
	const nlohmann::json listedRecords = nlohmann::json::parse(records.myOutput, nullptr, false);
	ASSERT_FALSE(listedRecords.is_discarded()) << records.myOutput;
	ASSERT_EQ(listedRecords["problems"].size(), 2u) << records.myOutput;
	for (const nlohmann::json& problem : listedRecords["problems"])
	{
		const bool bakedFlag = problem["baked"].get<bool>();
		EXPECT_EQ(problem["file"], bakedFlag ? "data/XML/levels/sample_small/ambient.sh"
		                                     : "data/XML/levels/sample_small/lights.xml");
		if (!bakedFlag)
		{
			EXPECT_EQ(problem["element"], "falloff");
		}
	}
	const ToolRun refusedRender = Run("render sample_small --out y.png");
	ExpectRun(refusedRender, 1, refusedRender.myErrors, {"lumora: level 'sample_small' has 2 problem(s)"});
	EXPECT_THAT(refusedRender.myErrors, testing::Not(HasSubstr("Call stack")));
	EXPECT_FALSE(fs::exists(myScratch.Path() / "y.png"));

	// A level edited by hand into what a bake must not take: check lists each problem with its
	// file; bake refuses, naming them, unless --force. A plain 2D DDS as a room's cubemap is named
	// (the loader's message, which render gives too); a misspelt entity catalogue leaves every
	// level empty: a problem too.
	fs::copy_file(fs::path(LUMORA_TEST_SOURCE_ROOT) / "data/XML/levels/sample_small/lights.xml",
	              myScratch.Path() / "data/XML/levels/sample_small/lights.xml",
	              fs::copy_options::overwrite_existing);
	fs::remove(myScratch.Path() / "data/XML/levels/sample_small/ambient.sh");
	fs::copy_file(myScratch.Path() / "data/textures/wood_albedo.dds",
	              myScratch.Path() / "data/Cubemaps/sample_small/main.dds",
	              fs::copy_options::overwrite_existing);
	const std::string flat =
	    "Room cubemap [data/Cubemaps/sample_small/main.dds] of room 0: not a cubemap of 6 faces; "
	    "the room shows the fallback cubemap";
	const std::string level = "data/XML/levels/sample_small/";
	Edit(level + "rooms.xml", "</rooms>",
	     "<room><min x=\"0\" y=\"1\" z=\"0\" /><max x=\"2\" y=\"1\" z=\"2\" /><id value=\"main\" /></room>"
	     "<room><min x=\"0\" y=\"3\" z=\"0\" /><max x=\"2\" y=\"1\" z=\"2\" /><id value=\"../cubemap\" "
	     "/></room></rooms>");
	Edit(level + "entities.xml", "type=\"crate\"", "type=\"crates\"");
	Edit(level + "lights.xml", "<falloff value=\"", "<falloff value=\"abc");
	Edit(level + "decals.xml", "<decals>", "<decal-list>");
	Edit(level + "decals.xml", "</decals>", "</decal-list>");
	const std::string rooms = "data/XML/levels/sample_small/rooms.xml: room ";
	const std::vector<std::string> problems = {
	    rooms + "1 ('main') has no extent along y",
	    rooms + "1 ('main') has the ID of room 0: both would bake into one cubemap file",
	    rooms + "2 ('../cubemap') is inverted along y (min 3 > max 1)",
	    rooms + "2 ('../cubemap'): the ID cannot name a cubemap file",
	    "data/XML/levels/sample_small/entities.xml: entity 1 of type [crates], which "
	    "data/XML/EntityTypes.xml "
	    "does not list: it is left out",
	    "Not a number [abc",
	    "decals.xml: no \"decals\" element under the root, so the editor cannot save the level's decals into "
	    "it",
	};
	// The flat cubemap is named for both rooms that it would serve.
	const ToolRun listed = Run("check sample_small");
	ExpectRun(listed, 1, listed.myOutput, {"9 problems:", flat});
	// The damaged cubemap is what a bake replaces; the rest would be baked in.
	const ToolRun refused = Run("bake sample_small --ambient-only --bounces 0");
	ExpectRun(refused, 1, refused.myErrors, {"lumora: level 'sample_small' has 7 problems; not baked"});
	for (const std::string& problem : problems)
	{
		EXPECT_THAT(listed.myOutput, HasSubstr(problem));
		EXPECT_THAT(refused.myErrors, HasSubstr(problem));
	}
	const ToolRun forced = Run("bake sample_small --ambient-only --bounces 0 --force");
	ExpectRun(forced, 0, forced.myOutput, {"7 problems, baked anyway (--force)"});

	Edit("data/XML/EntityTypes.xml", "<entities>", "<entitys>");
	Edit("data/XML/EntityTypes.xml", "</entities>", "</entitys>");
	EXPECT_THAT(Run("check sample_small").myOutput,
	            HasSubstr("data/XML/EntityTypes.xml: no entity type with a model"));
}

// The bakes a designer stops, narrows and spreads: Ctrl-C (SIGINT) during a long ambient bake
// ends it with exit 130 and one line, every file as it was; a room re-bake bakes that room and
// an unknown room is refused before anything is baked; a two-bounce bake split into three
// uneven parts per bounce, each its own process, merges into the whole bake's file byte for
// byte, and parts of another bounce or of other inputs are refused.
TEST_F(CommandLineTest, ACancelledBakeKeepsItsFilesRoomsBakeAloneAndPartsMergeIntoTheWholeBake)
{
	CopyData();
	const ToolRun whole = Run("bake sample_small --bounces 2 --ambient-only");
	// No OpenGL 4.5 is no failure outside CI.
	if (whole.myErrors.find("no OpenGL 4.5") != std::string::npos && !TestSupport::IsCi())
	{
		GTEST_SKIP() << whole.myErrors;
	}
	ASSERT_EQ(whole.myStatus, 0) << whole.myErrors;
	const std::string ambient = "data/XML/levels/sample_small/ambient.sh";
	const std::string baked = Read(ambient);

	// Interrupted once its progress shows; a second signal would end it the usual way.
	const int cancelled =
	    Shell("$LUMORA bake sample_small --bounces 16 --ambient-only >bake.out 2>bake.err & "
	          "pid=$!; until grep -q probes bake.out || ! kill -0 $pid 2>/dev/null; do "
	          "sleep 0.02; done; kill -INT $pid; wait $pid");
	EXPECT_EQ(cancelled, 130) << Read("bake.out");
	EXPECT_EQ(Read("bake.err"), "lumora: bake cancelled (SIGINT): ambient.sh is as it was\n");
	EXPECT_TRUE(Read(ambient) == baked) << "the cancelled bake changed ambient.sh";
	EXPECT_EQ(std::distance(fs::directory_iterator(myScratch.File("data/XML/levels/sample_small")),
	                        fs::directory_iterator()),
	          7)
	    << "five level files, ambient.sh and bake.json: no temporary";

	const char* ranges[2][3] = {{"0:5", "5:11", "16:8"}, {"12:12", "0:11", "11:1"}};
	for (int bounce = 1; bounce <= 2; ++bounce)
	{
		std::string parts;
		for (const char* range : ranges[bounce - 1])
		{
			const std::string part =
			    "b" + std::to_string(bounce) + "-" + std::string(range).substr(0, 2) + ".part";
			const ToolRun run = Run("bake sample_small --bounce " + std::to_string(bounce) + " --probes " +
			                        range + " --out " + part + (bounce > 1 ? " --previous bounce1.sh" : ""));
			ExpectRun(run, 0, run.myOutput, {"ambient part: bounce " + std::to_string(bounce)});
			parts += " " + part;
		}
		const ToolRun merged =
		    Run("bake-merge sample_small" + parts + " --out bounce" + std::to_string(bounce) + ".sh");
		ExpectRun(merged, 0, merged.myOutput, {"merged 3 parts into bounce"});
	}
	EXPECT_TRUE(Read("bounce2.sh") == baked) << "the merged parts differ from the whole bake";
	ExpectOneErrorLine(Run("bake-merge sample_small b1-0:.part b2-12.part b2-11.part --out x.sh"), 1,
	                   "lumora: not merged: b2-12.part is bounce 2; b1-0:.part is bounce 1");
	ExpectOneErrorLine(Run("bake sample_small --bounce 2 --probes 0:5 --out x.part"), 2,
	                   "lumora: --bounce 2 needs --previous");

	// The only room, re-baked: its probes as the whole bake had them, then its cubemap.
	ExpectOneErrorLine(Run("bake sample_small --rooms main,nope"), 2,
	                   "lumora: level 'sample_small' has no room with the ID 'nope'");
	const ToolRun room = Run("bake sample_small --rooms main --bounces 2");
	ExpectRun(room, 0, room.myOutput,
	          {"reflections: 1 room in", "ambient: data/XML/levels/sample_small/ambient.sh"});
	EXPECT_TRUE(Read(ambient) == baked) << "the only room re-baked is not the whole bake";
	// The ambient pass reflects the new cubemap: parts baked before it are not merged.
	ExpectOneErrorLine(Run("bake-merge sample_small b2-12.part b2-0:.part b2-11.part --out x.sh"), 1,
	                   "lumora: not merged: b2-12.part was baked from other inputs");
}

// A bake shared by three processes (--jobs 3) writes what the bake in one process writes,
// byte for byte, starting from the same files: the volume (each bounce split between them and
// merged) and the cubemap (baked by a helper). Ctrl-C stops the helpers too and leaves every
// file as it was, with no part or temporary left behind. --jobs does not go with a room
// re-bake.
TEST_F(CommandLineTest, ABakeSharedByProcessesIsTheOneProcessBakeByteForByteAndStopsCleanly)
{
	CopyData();
	const ToolRun alone = Run("bake sample_small --bounces 2");
	if (alone.myErrors.find("no OpenGL 4.5") != std::string::npos && !TestSupport::IsCi())
	{
		GTEST_SKIP() << alone.myErrors;
	}
	ASSERT_EQ(alone.myStatus, 0) << alone.myErrors;
	const std::string ambient = "data/XML/levels/sample_small/ambient.sh";
	const std::string cubemap = "data/Cubemaps/sample_small/main.dds";
	const std::string bakedAmbient = Read(ambient);
	const std::string bakedCubemap = Read(cubemap);
	ASSERT_FALSE(bakedAmbient.empty());
	ASSERT_FALSE(bakedCubemap.empty());
	// The ambient pass reflects the rooms' cubemaps: the shared bake starts where this one did.
	fs::remove_all(myScratch.File("data/Cubemaps/sample_small"));
	fs::remove(myScratch.File(ambient));
	fs::remove(myScratch.File("data/XML/levels/sample_small/bake.json"));

	const ToolRun shared = Run("bake sample_small --bounces 2 --jobs 3");
	ExpectRun(shared, 0, shared.myOutput,
	          {"over 2 bounces in", "3 processes)", "reflections: 1 room in", "reflections: " + cubemap});
	EXPECT_EQ(shared.myErrors, "");
	EXPECT_TRUE(Read(ambient) == bakedAmbient) << "the shared bake's volume differs";
	EXPECT_TRUE(Read(cubemap) == bakedCubemap) << "the shared bake's cubemap differs";
	const ToolRun record = Run("info data/XML/levels/sample_small/bake.json");
	ExpectRun(record, 0, record.myOutput, {"ambient: baked 20", "2 bounces", "reflections: baked 20"});

	// Stopped in its first bounce; the parts went to a temporary folder of the test's own.
	const int stopped =
	    Shell("mkdir tmp && TMPDIR=$PWD/tmp $LUMORA bake sample_small --bounces 16 --jobs 2 >bake.out "
	          "2>bake.err & pid=$!; until grep -q bounce bake.out || ! kill -0 $pid 2>/dev/null; do "
	          "sleep 0.02; done; kill -INT $pid; wait $pid");
	EXPECT_EQ(stopped, 130) << Read("bake.out");
	EXPECT_EQ(Read("bake.err"), "lumora: bake cancelled (SIGINT): ambient.sh and every room cubemap are as "
	                            "they were\n");
	EXPECT_TRUE(Read(ambient) == bakedAmbient) << "the stopped bake changed ambient.sh";
	EXPECT_TRUE(fs::is_empty(myScratch.File("tmp"))) << "the stopped bake left its parts";
	EXPECT_EQ(std::distance(fs::directory_iterator(myScratch.File("data/XML/levels/sample_small")),
	                        fs::directory_iterator()),
	          7)
	    << "five level files, ambient.sh and bake.json: no temporary";

	// With no temporary folder to be had, the parts go to a hidden one in the level's folder,
	// which is gone afterwards (from the starting files again: no room cubemap).
	fs::remove_all(myScratch.File("data/Cubemaps/sample_small"));
	const int withoutTemporary =
	    Shell("TMPDIR=/nonexistent/lumora $LUMORA bake sample_small --bounces 2 --jobs 2 --ambient-only "
	          ">bake.out 2>bake.err");
	EXPECT_EQ(withoutTemporary, 0) << Read("bake.err");
	EXPECT_TRUE(Read(ambient) == bakedAmbient) << "the bake without a temporary folder differs";
	EXPECT_EQ(std::distance(fs::directory_iterator(myScratch.File("data/XML/levels/sample_small")),
	                        fs::directory_iterator()),
	          7)
	    << "the hidden folder of parts is left";

	ExpectOneErrorLine(Run("bake sample_small --jobs 2 --rooms main"), 2,
	                   "lumora: --jobs shares a whole bake: it does not go with --bounce, --rooms");
}
