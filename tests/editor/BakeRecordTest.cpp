// The bake record (bake.json) without a GPU: written and read back whole, a room bake merged into
// its phase, damaged files read as damaged, and inputs edited or removed after the bake found
// stale. Each test works in a scratch folder holding a copy of the small sample level as "lvl".
#include <filesystem>
#include <gmock/gmock-matchers.h>
#include <gtest/gtest.h>
#include <string>
#include <vector>

#include "editor/BakeInputs.h"
#include "editor/BakeRecord.h"
#include "support/TestSupport.h"

namespace
{
namespace fs = std::filesystem;
using testing::HasSubstr;

constexpr const char* ourTexture = "data/textures/wood_albedo.dds";
constexpr const char* ourLights = "data/XML/levels/lvl/lights.xml";

class BakeRecordTest : public testing::Test
{
protected:
	void SetUp() override
	{
		const fs::path source(LUMORA_TEST_SOURCE_ROOT);
		fs::create_directories(myScratch.Path() / "data/XML/levels");
		fs::create_directories(myScratch.Path() / "data/textures");
		fs::copy(source / "data/XML/levels/sample_small", myScratch.Path() / "data/XML/levels/lvl");
		fs::remove(myScratch.Path() / "data/XML/levels/lvl/ambient.sh");
		fs::remove(myScratch.Path() / "data/XML/levels/lvl/bake.json");
		fs::copy_file(source / ourTexture, myScratch.Path() / ourTexture);
		myPrevious = fs::current_path();
		fs::current_path(myScratch.Path());
	}

	void TearDown() override { fs::current_path(myPrevious); }

	// A phase as a bake makes it, dated by the test.
	static Lumora::BakePhaseRecord Phase(const std::string& aDate, std::vector<std::string> someRooms,
	                                     const std::vector<std::string>& someFiles)
	{
		std::vector<std::string> inputs = Lumora::CollectBakeInputs("lvl");
		inputs.push_back(ourTexture);
		Lumora::BakePhaseRecord phase =
		    Lumora::MakeBakePhaseRecord(someRooms, someFiles, {{"total", 1.5}, {"rendering", 1.25}}, inputs);
		phase.myDate = aDate;
		return phase;
	}

	static Lumora::BakeRecord Read()
	{
		Lumora::BakeRecord record;
		std::string problem;
		EXPECT_EQ(Lumora::ReadBakeRecord(Lumora::GetBakeRecordPath("lvl"), record, problem),
		          Lumora::BakeRecordRead::OK)
		    << problem;
		return record;
	}

	TestSupport::ScratchDir myScratch;
	fs::path myPrevious;
};
} // namespace

// Everything a record holds reads back as written (0.1 stays 0.1f, sizes past 4 GiB stay whole).
// A bake of some rooms into a phase that holds a whole bake keeps that bake's date and inputs,
// updates its files and is listed as a room bake; a whole bake replaces it all; with no whole
// bake, room bakes stand alone until one covers every room on record.
TEST_F(BakeRecordTest, ARecordSurvivesARoundTripAndARoomBakeJoinsTheWholeBakeOfItsPhase)
{
	Lumora::BakeRecord record;
	record.myAmbient = Phase("2026-11-24T10:31:02Z", {}, {"data/XML/levels/lvl/lights.xml"});
	record.myAmbient->myBounces = 2;
	record.myAmbient->myGrid = {{3, 2, 4}, {-3.0f, 0.1f, -4.0f}, {6.0f, 3.0f, 8.25f}};
	record.myAmbient->myRoomUpdates = {{"2026-11-25T08:00:00Z", {"hall", "main"}}};
	record.myReflections = Phase("2026-11-24T10:40:00Z", {"main", "hall"}, {});
	record.myReflections->myFiles = {{"data/Cubemaps/lvl/main.dds", 6ull << 30}};
	record.myReflections->myTimings = {{"total", 0.1234}};
	std::string problem;
	ASSERT_TRUE(Lumora::WriteBakeRecord("lvl", record, problem)) << problem;
	EXPECT_EQ(record.myAmbient->myFiles.size(), 1u);
	EXPECT_EQ(record.myAmbient->myInputs.at(ourLights), Lumora::HashBakeInput(ourLights));
	EXPECT_EQ(record.myAmbient->myToolVersion, LUMORA_VERSION);
	record.myReflections->myTimings["total"] = 0.123; // written to the millisecond
	EXPECT_EQ(Read(), record);

	// A whole reflection bake, then one room of it again with other inputs and a larger file.
	Lumora::BakePhaseRecord whole = Phase("2026-11-26T09:00:00Z", {}, {});
	whole.myFiles = {{"data/Cubemaps/lvl/main.dds", 100}, {"data/Cubemaps/lvl/hall.dds", 100}};
	ASSERT_TRUE(Lumora::RecordBakePhase("lvl", Lumora::BakePhase::REFLECTIONS, whole, problem)) << problem;
	Lumora::BakePhaseRecord room = Phase("2026-11-26T11:30:00Z", {"hall"}, {});
	room.myFiles = {{"data/Cubemaps/lvl/hall.dds", 120}};
	room.myInputs[ourLights] = std::string(32, '0');
	ASSERT_TRUE(Lumora::RecordBakePhase("lvl", Lumora::BakePhase::REFLECTIONS, room, problem)) << problem;
	EXPECT_EQ(problem, "");
	Lumora::BakePhaseRecord merged = whole;
	merged.myFiles["data/Cubemaps/lvl/hall.dds"] = 120;
	merged.myRoomUpdates = {{"2026-11-26T11:30:00Z", {"hall"}}};
	EXPECT_EQ(Read().myReflections, merged);
	EXPECT_EQ(Read().myAmbient, record.myAmbient);
	ASSERT_TRUE(Lumora::RecordBakePhase("lvl", Lumora::BakePhase::REFLECTIONS, whole, problem));
	EXPECT_EQ(Read().myReflections, whole);

	// Room bakes with no whole bake on record: "a" alone, "a" again replacing it, then "b" joining.
	ASSERT_TRUE(Lumora::WriteBakeRecord("lvl", {}, problem));
	Lumora::BakePhaseRecord roomA = Phase("2026-11-27T09:00:00Z", {"a"}, {});
	roomA.myFiles = {{"data/Cubemaps/lvl/a.dds", 10}};
	ASSERT_TRUE(Lumora::RecordBakePhase("lvl", Lumora::BakePhase::REFLECTIONS, roomA, problem));
	roomA.myDate = "2026-11-27T10:00:00Z";
	ASSERT_TRUE(Lumora::RecordBakePhase("lvl", Lumora::BakePhase::REFLECTIONS, roomA, problem));
	EXPECT_EQ(Read().myReflections, roomA);
	Lumora::BakePhaseRecord roomB = Phase("2026-11-27T11:00:00Z", {"b"}, {});
	roomB.myFiles = {{"data/Cubemaps/lvl/b.dds", 20}};
	ASSERT_TRUE(Lumora::RecordBakePhase("lvl", Lumora::BakePhase::REFLECTIONS, roomB, problem));
	const Lumora::BakeRecord joined = Read();
	ASSERT_TRUE(joined.myReflections.has_value());
	EXPECT_EQ(joined.myReflections->myDate, "2026-11-27T10:00:00Z");
	EXPECT_EQ(joined.myReflections->myRooms, std::vector<std::string>{"a"});
	EXPECT_EQ(joined.myReflections->myFiles.size(), 2u);
	EXPECT_EQ(joined.myReflections->myRoomUpdates,
	          (std::vector<Lumora::BakeRoomUpdate>{{"2026-11-27T11:00:00Z", {"b"}}}));
	EXPECT_FALSE(joined.myAmbient.has_value());
}

// Whatever a bake.json holds, reading it neither throws nor crashes: what is not a record reads as
// DAMAGED with one line naming the file and what is wrong, and leaves the caller's record alone.
// The next bake replaces a damaged record and says so.
TEST_F(BakeRecordTest, DamagedRecordsReadAsDamagedWithOneLineAndAreReplacedByTheNextBake)
{
	const std::string path = Lumora::GetBakeRecordPath("lvl");
	Lumora::BakeRecord record;
	std::string problem;
	EXPECT_EQ(Lumora::ReadBakeRecord(path, record, problem), Lumora::BakeRecordRead::MISSING);

	Lumora::BakeRecord good;
	good.myAmbient = Phase("2026-11-24T10:31:02Z", {}, {ourLights});
	good.myAmbient->myBounces = 1;
	good.myReflections = Phase("2026-11-24T10:40:00Z", {}, {});
	ASSERT_TRUE(Lumora::WriteBakeRecord("lvl", good, problem)) << problem;
	const std::string text = TestSupport::ReadWholeFile(path);
	const auto replaced = [&](const std::string& aGood, const std::string& aBad) {
		std::string changed = text;
		const size_t at = changed.find(aGood);
		EXPECT_NE(at, std::string::npos) << aGood;
		return at == std::string::npos ? changed : changed.replace(at, aGood.size(), aBad);
	};
	const std::string hash = good.myAmbient->myInputs.at(ourLights);
	const std::string version = "\"tool_version\": \"" + std::string(LUMORA_VERSION) + "\",";
	const struct
	{
		std::string myBytes;
		std::string myProblem;
	} rows[] = {
	    {text.substr(0, text.size() / 2), "not JSON: parse error at line"},
	    {"", "not JSON"},
	    {std::string("\0\xff{", 3), "not JSON"},
	    {"[1, 2]", "the file is not a JSON object"},
	    {std::string(200000, '[') + std::string(200000, ']'), "the file is not a JSON object"},
	    {replaced("\"format\": 1", "\"format\": 2"), "format 2, which this Lumora (format 1) cannot read"},
	    {replaced("\"bounces\": 1", "\"bounces\": \"1\""), "/ambient/bounces is not a whole number"},
	    {replaced("\"bounces\": 1", "\"bounces\": 18446744073709551615"), "/ambient/bounces is not a whole"},
	    {replaced("\"reflections\": {", "\"reflections\": 5, \"x\": {"), "/reflections is not an object"},
	    {replaced(version, ""), "/ambient has no \"tool_version\""},
	    {replaced("\"rooms\": []", "\"rooms\": [3]"), "/ambient/rooms/0 is not a string"},
	    {replaced("\"date\": \"2026-11-24T10:31:02Z\"", "\"date\": \"yesterday\""),
	     "/ambient/date is not a date"},
	    {replaced("\"data/XML/levels/lvl/lights.xml\": ", "\"data/XML/levels/lvl/lights.xml\": -"),
	     "/ambient/files/data/XML/levels/lvl/lights.xml is not a whole number"},
	    {replaced(hash, "XYZ"), "/ambient/inputs/" + std::string(ourLights) + " is not 32 lowercase hex"},
	    {replaced("\"total\": 1.5", "\"total\": 1e999"), "not JSON"},
	    {replaced("\"world_size\": [", "\"world_size\": [1e300, "),
	     "/ambient/grid/world_size is not an array of 3"},
	};
	for (const auto& row : rows)
	{
		SCOPED_TRACE(row.myProblem);
		TestSupport::WriteWholeFile(path, row.myBytes);
		Lumora::BakeRecord untouched;
		untouched.myAmbient = good.myReflections;
		problem.clear();
		EXPECT_EQ(Lumora::ReadBakeRecord(path, untouched, problem), Lumora::BakeRecordRead::DAMAGED);
		EXPECT_EQ(problem.rfind(path + ": damaged bake record: ", 0), 0u) << problem;
		EXPECT_THAT(problem, HasSubstr(row.myProblem));
		EXPECT_EQ(problem.find('\n'), std::string::npos) << problem;
		EXPECT_EQ(untouched.myAmbient, good.myReflections);
	}

	ASSERT_TRUE(Lumora::RecordBakePhase("lvl", Lumora::BakePhase::REFLECTIONS, *good.myReflections, problem));
	EXPECT_THAT(problem, HasSubstr(": damaged bake record: "));
	EXPECT_THAT(problem, HasSubstr("(replaced by a record of this bake alone)"));
	const Lumora::BakeRecord fresh = Read();
	EXPECT_FALSE(fresh.myAmbient.has_value());
	EXPECT_EQ(fresh.myReflections, good.myReflections);
}

// Inputs are hashed by content, whatever the path's case; the combined hash follows any one
// input. Editing lights.xml, then a texture, makes the bakes stale, each file named once with
// both bakes; a removed texture is gone. Inputs that were missing at the bake and still are
// (the post-processing files are not in the scratch folder) are no change.
TEST_F(BakeRecordTest, EditedOrRemovedInputsMakeTheBakeStale)
{
	const std::vector<std::string> inputs = Lumora::CollectBakeInputs("lvl");
	EXPECT_TRUE(std::is_sorted(inputs.begin(), inputs.end()));
	for (const char* input :
	     {ourLights, "data/XML/EntityTypes.xml", "data/Shaders/SSAO.xml", "data/grading/default.dds"})
	{
		EXPECT_THAT(inputs, testing::Contains(std::string(input)));
	}
	const std::map<std::string, std::string> before = Lumora::HashBakeInputs({ourLights, ourTexture});
	EXPECT_TRUE(Lumora::IsInputHash(before.at(ourLights)));
	EXPECT_NE(before.at(ourLights), before.at(ourTexture));
	EXPECT_EQ(Lumora::HashBakeInput("DATA/Textures/WOOD_albedo.dds"), before.at(ourTexture));
	EXPECT_EQ(Lumora::HashBakeInput("data/textures"), Lumora::ourMissingHash);
	EXPECT_EQ(Lumora::HashBakeInput("data/SSAO.xml"), Lumora::ourMissingHash);

	Lumora::BakeRecord record;
	record.myAmbient = Phase("2026-11-24T10:31:02Z", {}, {});
	record.myReflections = Phase("2026-11-24T10:40:00Z", {}, {});
	EXPECT_EQ(Lumora::FindStaleInputs(record), std::vector<std::string>{});

	const std::vector<std::string> recorded = Lumora::GetRecordedInputs(record);
	const std::string combined = Lumora::CombineInputHashes(record.myAmbient->myInputs);
	EXPECT_EQ(Lumora::CombineInputHashes(Lumora::HashBakeInputs(recorded)), combined);
	TestSupport::WriteWholeFile(ourLights, TestSupport::ReadWholeFile(ourLights) + " ");
	EXPECT_NE(Lumora::CombineInputHashes(Lumora::HashBakeInputs(recorded)), combined);
	const std::string lights = "lights.xml changed since the ambient bake of 2026-11-24 10:31 and the "
	                           "reflection bake of 2026-11-24 10:40";
	EXPECT_EQ(Lumora::FindStaleInputs(record), std::vector<std::string>{lights});

	std::string texture = TestSupport::ReadWholeFile(ourTexture);
	texture[texture.size() / 2] ^= 1;
	TestSupport::WriteWholeFile(ourTexture, texture);
	record.myReflections->myDate = record.myAmbient->myDate;
	EXPECT_EQ(Lumora::FindStaleInputs(record),
	          (std::vector<std::string>{
	              "lights.xml changed since the ambient and reflection bakes of 2026-11-24 10:31",
	              std::string(ourTexture) +
	                  " changed since the ambient and reflection bakes of 2026-11-24 10:31"}));

	fs::remove(ourTexture);
	record.myAmbient.reset();
	EXPECT_THAT(Lumora::FindStaleInputs(record),
	            testing::Contains(std::string(ourTexture) +
	                              " is gone since the reflection bake of 2026-11-24 10:31"));
}
