// Loading and saving levels through the facade: what each file puts into the scene, what is
// left out with a message, and what a save writes back (and keeps) in the level's files. The
// facade runs in a scratch working directory (FacadeFixture.h) with catalogues of our own: two
// model entity types and one that is not a model, two decal types; level files are written by
// the tests into data/XML/levels/<level>/.
#include <array>
#include <bitset>
#include <cmath>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <initializer_list>
#include <set>
#include <sstream>
#include <string>
#include <tuple>

#include "editor/FacadeFixture.h"
#include "engine/Instance.h"
#include "engine/Room.h"
#include "model/Model.h"
#include "model/ModelNode.h"
#include "support/TestSupport.h"

namespace
{
using Lumora::LIGHT_MODE;
using Lumora::NODE_MODE;
using testing::AllOf;
using testing::HasSubstr;
using testing::Not;

const char* const ourEntityTypesText = R"(<root><entities>
	<entity id="crate">
		<visual-component type="model" filepath="data/models/crate.dae" cast-shadow="false" /></entity>
	<entity id="pillar"><visual-component type="model" filepath="data/models/pillar.dae" /></entity>
	<entity id="lamp"><visual-component type="light" filepath="data/models/pillar.dae" /></entity>
</entities></root>
)";

const char* const ourDecalTypesText = R"(<root>
	<decal id="bricks"><texture path="data/textures/bricks_albedo.dds" />
		<normal path="data/textures/bricks_normal.dds" /></decal>
	<decal id="wood"><texture path="data/textures/wood_albedo.dds" />
		<normal path="data/textures/wood_normal.dds" /></decal>
</root>
)";

// One record to a line where its children fit; the loader and the savers take any layout.
const char* const ourRoomsText = R"(<root><rooms>
	<room><min x="2" y="0" z="0" /><max x="5" y="4" z="10" /><id value="hall" /></room>
	<room><max x="10" y="1" z="10" /><min x="-10" y="3" z="0" /></room>
</rooms></root>
)";

const char* const ourEntitiesText = R"(<root><entities>
	<entity type="crate"><position x="-3.5" y="2" z="5" /><rotation x="0" y="90" z="0" /></entity>
	<entity type="ghost"><position x="0" y="0" z="0" /><rotation x="0" y="0" z="0" /></entity>
	<entity type="lamp"><position x="0" y="0" z="0" /><rotation x="0" y="0" z="0" /></entity>
	<entity type="pillar"><position x="0" y="100" z="0" /><rotation x="0" y="0" z="0" /></entity>
</entities></root>
)";

const char* const ourLightsText = R"(<?xml version="1.0" ?>
<!-- lights of the small level -->
<root>
	<point-lights>
		<point-light>
			<position x="1" y="2" z="3" /><color r="1" g="0.5" b="0.25" a="2" /><falloff value="0.5" />
		</point-light>
		<point-light note="by hand">
			<falloff f="4" /><color a="1" b="3" g="2" r="1.5" /><position x="-1" y="1234.5678" z="0.1" /><extra />
		</point-light>
	</point-lights>
	<foreign><keep me="yes" /></foreign>
	<spot-lights>
		<spot-light>
			<position x="0" y="5" z="0" /><color r="1" g="1" b="1" a="1" /><falloff value="8" />
			<direction x="0" y="-2" z="0" /><angles inner="0.9" outer="0.7" />
		</spot-light>
		<spot-light>
			<angles outer="0.5" inner="0.8" /><direction x="0" y="0" z="3" /><falloff value="6" />
			<color r="0" g="1" b="0" a="1" /><position x="3" y="2" z="1" />
		</spot-light>
	</spot-lights>
</root>
)";

const char* const ourNodeGraphText = R"(<root>
	<!-- the guards' path -->
	<node-graph>
		<nodes number-of-nodes="3">
			<node id="4"><position x="0" y="0" z="0" /></node>
			<node id="9"><position x="3" y="0" z="0" /></node>
			<node id="2"><position x="3" y="4" z="0" /></node>
		</nodes>
		<edges number-of-edges="2">
			<edge><connections firstID="4" secondID="9" /><distance value="100" /></edge>
			<edge><distance value="7" /><connections secondID="2" firstID="9" /></edge>
		</edges>
	</node-graph>
</root>
)";

const char* const ourDecalsText = R"(<root><decals>
	<decal>
		<decal-type id="wood" /><position x="1" y="0" z="2" /><norm x="0" y="1" z="0" />
		<color r="1" g="1" b="1" a="0.5" /><size value="2" /><depth value="0.25" />
	</decal>
	<decal>
		<depth d="0.5" /><size s="1.5" /><color r="0.2" g="0.3" b="0.4" a="1" />
		<norm x="0" y="0" z="-1" /><position x="-4" y="1" z="6" /><decal-type name="bricks" />
	</decal>
</decals></root>
)";

class LevelLoadSaveTest : public FacadeTest
{
protected:
	void PrepareData(const std::filesystem::path& aDataPath) override
	{
		TestSupport::WriteWholeFile((aDataPath / "XML" / "EntityTypes.xml").string(), ourEntityTypesText);
		TestSupport::WriteWholeFile((aDataPath / "XML" / "DecalTypes.xml").string(), ourDecalTypesText);
	}

	// Relative to the working directory, as the facade spells it.
	static std::string LevelFile(const std::string& aLevel, const std::string& aFile)
	{
		return "data/XML/levels/" + aLevel + "/" + aFile;
	}

	static void WriteLevelFile(const std::string& aLevel, const std::string& aFile,
	                           const std::string& someText)
	{
		std::filesystem::create_directories("data/XML/levels/" + aLevel);
		TestSupport::WriteWholeFile(LevelFile(aLevel, aFile), someText);
	}

	static std::string ReadLevelFile(const std::string& aLevel, const std::string& aFile)
	{
		return TestSupport::ReadWholeFile(LevelFile(aLevel, aFile));
	}

	// How often aText occurs in aWhole.
	static int CountOf(const std::string& aWhole, const std::string& aText)
	{
		int count = 0;
		for (std::size_t at = aWhole.find(aText); at != std::string::npos; at = aWhole.find(aText, at + 1))
		{
			++count;
		}
		return count;
	}

	// Entries the log holds at the error levels (the facade ends the process on severe and
	// critical ones, so these are the survivable errors).
	int ErrorEntryCount() const { return CountOf(LogText(), "\"Error Type:\"\"ERROR\""); }

	void WriteSmallLevel(const std::string& aLevel)
	{
		WriteLevelFile(aLevel, "rooms.xml", ourRoomsText);
		WriteLevelFile(aLevel, "entities.xml", ourEntitiesText);
		WriteLevelFile(aLevel, "lights.xml", ourLightsText);
		WriteLevelFile(aLevel, "nodegraph.xml", ourNodeGraphText);
		WriteLevelFile(aLevel, "decals.xml", ourDecalsText);
	}

	// Point lights, spot lights, path nodes, path edges and decals in the scene.
	std::array<int, 5> Counts()
	{
		return {Facade().GetPointLights().Count(), Facade().GetSpotLights().Count(),
		        Facade().GetNodes().Count(), Facade().GetEdges().Count(), Facade().GetDecals().Count()};
	}

	// The three files the savers write, in one string.
	std::string SavedFiles(const std::string& aLevel)
	{
		Facade().SaveLights(std::u16string(aLevel.begin(), aLevel.end()));
		Facade().SaveDecals(std::u16string(aLevel.begin(), aLevel.end()));
		return ReadLevelFile(aLevel, "lights.xml") + ReadLevelFile(aLevel, "nodegraph.xml") +
		       ReadLevelFile(aLevel, "decals.xml");
	}
};

// How a report of the cursor begins in the log, up to its message.
const std::string ourCursorReport =
    "\"Error Type:\"\"CRITICAL ERROR\"\n\"Line:\"278\n\"Function:\"\"XML::Error\"\n\"";

// The log as `lumora` runs it, with no report fatal, so that a test sees what follows one.
class SoftLevelLoadSaveTest : public LevelLoadSaveTest
{
protected:
	SoftLevelLoadSaveTest() { Lumora::LumoraWrapper::SetFatalReportLevels(std::bitset<4>()); }
	~SoftLevelLoadSaveTest() override { Lumora::LumoraWrapper::SetFatalReportLevels(std::bitset<4>(12)); }
};

// Vectors' components in one list, to compare several at once.
std::vector<float> Floats(std::initializer_list<Vector3<float>> someVectors)
{
	std::vector<float> values;
	for (const Vector3<float>& vector : someVectors)
	{
		values.insert(values.end(), {vector.x, vector.y, vector.z});
	}
	return values;
}

void ExpectNear(const std::vector<float>& someActual, const std::vector<float>& anExpected)
{
	EXPECT_THAT(someActual, testing::Pointwise(testing::FloatNear(1e-5f), anExpected));
}

// Each of someHeld is in aText, and none of someGone.
void ExpectHeldAndGone(const std::string& aText, std::initializer_list<const char*> someHeld,
                       std::initializer_list<const char*> someGone)
{
	for (const char* held : someHeld)
	{
		EXPECT_THAT(aText, HasSubstr(held));
	}
	for (const char* gone : someGone)
	{
		EXPECT_THAT(aText, Not(HasSubstr(gone)));
	}
}

const Zeph::RoomData& RoomDataOf(const Zeph::Instance& anInstance)
{
	return anInstance.GetRootNode()->GetRenderData().myRoomData;
}

// The first model of a tree, depth-first.
const Zeph::Model* FirstModel(const Zeph::ModelNode& aNode)
{
	if (aNode.GetModel() != nullptr)
	{
		return aNode.GetModel();
	}
	for (int index = 0; index < aNode.GetChildren().Count(); ++index)
	{
		if (const Zeph::Model* model = FirstModel(*aNode.GetChildren()[index]))
		{
			return model;
		}
	}
	return nullptr;
}
} // namespace

// The small level: what each file puts into the scene, what a save writes back (the loaded
// lights and decals are checked in the saved text) and keeps, a new level's files, and the next
// level replacing the scene.
TEST_F(LevelLoadSaveTest, ASmallLevelFillsTheSceneSavesItsOwnSectionsOnlyAndTheNextLevelReplacesIt)
{
	// The entity catalogue is seen in the entities placed: models of the two model types only.
	const auto& types = Facade().GetDecalTypes();
	ASSERT_EQ(types.size(), 2u);
	// Each type has textures of its own (null ones would be the same).
	EXPECT_TRUE(types.at("bricks").myTexture != types.at("wood").myTexture &&
	            types.at("bricks").myNormalTexture != types.at("wood").myNormalTexture);

	WriteSmallLevel("small");
	Facade().ParseLevel(u"small");
	ASSERT_EQ(Counts(), (std::array{2, 2, 3, 2, 2}));
	const auto& rooms = Facade().GetRooms();
	ASSERT_EQ(rooms.Count(), 2);
	EXPECT_EQ(rooms[0]->GetID() + " " + rooms[1]->GetID(), "hall NOT_SET");
	// Only x is mirrored and put in order.
	ExpectNear(Floats({rooms[0]->GetMin(), rooms[0]->GetMax(), rooms[1]->GetMin(), rooms[1]->GetMax()}),
	           {-5, 0, 0, -2, 4, 10, -10, 3, 0, 10, 1, 10});
	EXPECT_NE(rooms[0]->GetDebugInstance(), nullptr);

	// The unknown type and the type that is no model place nothing; the pillar is in no room.
	const auto& entities = Facade().GetEntities();
	ASSERT_EQ(entities.Count(), 2);
	const Zeph::RoomData& inHall = RoomDataOf(*entities[0]);
	const Zeph::RoomData& outside = RoomDataOf(*entities[1]);
	ExpectNear(Floats({entities[0]->GetOrientation().GetRight(), entities[0]->GetOrientation().GetPosition(),
	                   inHall.myMin, outside.myMin, outside.myMax}),
	           {0, 0, 1, -3.5f, 2, 5, -5, 0, 0, -1, -1, -1, 1, 1, 1});
	EXPECT_EQ(std::pair(inHall.myRoomIndex, outside.myRoomIndex), std::pair(0, -1));
	EXPECT_NE(inHall.myCubemap, nullptr);
	const Zeph::Model* crateModel = FirstModel(*entities[0]->GetModelNode());
	const Zeph::Model* pillarModel = FirstModel(*entities[1]->GetModelNode());
	ASSERT_TRUE(crateModel != nullptr && pillarModel != nullptr);
	EXPECT_EQ(std::pair(crateModel->GetIsShadowCasterFlag(), pillarModel->GetIsShadowCasterFlag()),
	          std::pair(false, true));

	// Falloff, position and colour: a single value is the first attribute, whatever its name;
	// colour goes by component name.
	EXPECT_EQ(Values(Facade().GetPointLights()[1]),
	          (std::vector<float>{4, -1, 1234.5678f, 0.1f, 1.5f, 2, 3, 1}));
	// Numbering goes on from the last node of the file, not from the largest ID; the stored
	// distances give way to the lengths between the nodes.
	const auto& nodes = Facade().GetNodes();
	const auto& edges = Facade().GetEdges();
	EXPECT_EQ((std::vector{nodes[0].GetID(), nodes[1].GetID(), nodes[2].GetID(), Facade().GetNodeIDCounter(),
	                       edges[1].GetFirstConnectionID(), edges[1].GetSecondConnectionID()}),
	          (std::vector{4, 9, 2, 3, 9, 2}));
	EXPECT_EQ((std::vector{edges[0].GetDistance(), edges[1].GetDistance()}), (std::vector{3.0f, 4.0f}));
	EXPECT_EQ(GraphProblems(Facade()), "");
	EXPECT_TRUE(edges[0].GetDebugLine() != nullptr && nodes[0].GetDebugInstance() != nullptr);
	const auto& decals = Facade().GetDecals();
	EXPECT_TRUE(decals[0].myTexture == types.at("wood").myTexture &&
	            decals[0].myNormalTexture == types.at("wood").myNormalTexture &&
	            decals[1].myTexture == types.at("bricks").myTexture);

	// A save after drawing (the distances as drawn) gives what the next save gives. Each file
	// holds what it held beside the records; a record is written from the editor's data alone
	// (what was written into it by hand goes), numbers in six significant digits, a spot light's
	// direction normalised, children in the writer's order.
	Facade().SetIsLightMode(NODE_MODE);
	Facade().Update(16.0f);
	Facade().Render();
	const std::string first = SavedFiles("small");
	Facade().ParseLevel(u"small");
	EXPECT_EQ(SavedFiles("small"), first);
	ExpectHeldAndGone(
	    ReadLevelFile("small", "lights.xml"),
	    {"<!-- lights of the small level -->", "<keep me=\"yes\" />",
	     "<position x=\"1\" y=\"2\" z=\"3\" />\n            <color r=\"1\" g=\"0.5\" b=\"0.25\" a=\"2\" />\n"
	     "            <falloff value=\"0.5\" />",
	     "<position x=\"-1\" y=\"1234.57\" z=\"0.1\" />",
	     "<position x=\"0\" y=\"5\" z=\"0\" />\n            <color r=\"1\" g=\"1\" b=\"1\" a=\"1\" />\n"
	     "            <falloff value=\"8\" />\n            <direction x=\"0\" y=\"-1\" z=\"0\" />\n"
	     "            <angles inner=\"0.9\" outer=\"0.7\" />",
	     "<position x=\"3\" y=\"2\" z=\"1\" />\n            <color r=\"0\" g=\"1\" b=\"0\" a=\"1\" />\n"
	     "            <falloff value=\"6\" />\n            <direction x=\"0\" y=\"0\" z=\"1\" />\n"
	     "            <angles inner=\"0.8\" outer=\"0.5\" />"},
	    {"by hand", "<extra />"});
	ExpectHeldAndGone(
	    ReadLevelFile("small", "nodegraph.xml"),
	    {"<!-- the guards' path -->", "<nodes number-of-nodes=\"3\">", "<edges number-of-edges=\"2\">",
	     "<node id=\"9\">",
	     "<connections firstID=\"4\" secondID=\"9\" />\n                <distance value=\"3\" />",
	     "<distance value=\"4\" />"},
	    {"100", "<distance value=\"7\" />"});
	ExpectHeldAndGone(ReadLevelFile("small", "decals.xml"),
	                  {"<decal-type id=\"wood\" />\n            <position x=\"1\" y=\"0\" z=\"2\" />\n"
	                   "            <norm x=\"0\" y=\"1\" z=\"0\" />\n"
	                   "            <color r=\"1\" g=\"1\" b=\"1\" a=\"0.5\" />\n"
	                   "            <size value=\"2\" />\n            <depth value=\"0.25\" />",
	                   "<decal-type id=\"bricks\" />\n            <position x=\"-4\" y=\"1\" z=\"6\" />\n"
	                   "            <norm x=\"0\" y=\"0\" z=\"-1\" />\n"
	                   "            <color r=\"0.2\" g=\"0.3\" b=\"0.4\" a=\"1\" />\n"
	                   "            <size value=\"1.5\" />\n            <depth value=\"0.5\" />"},
	                  {});

	// Decals are saved alone; lights take the path graph with them.
	const std::string graphBefore = ReadLevelFile("small", "nodegraph.xml");
	WriteLevelFile("small", "lights.xml", ourLightsText);
	Facade().SaveDecals(u"small");
	EXPECT_EQ(ReadLevelFile("small", "lights.xml"), ourLightsText);
	WriteLevelFile("small", "nodegraph.xml", ourNodeGraphText);
	Facade().SaveLights(u"small");
	EXPECT_EQ(ReadLevelFile("small", "nodegraph.xml"), graphBefore);

	// Numbering goes on from the last ID but never hands out one in use: 3, then 5.
	Facade().AddPathNode();
	Facade().AddPathNode();
	EXPECT_EQ(std::pair(nodes[3].GetID(), nodes[4].GetID()), std::pair(3, 5));

	// Saving a level that has no folder yet makes its three files, and no temporary beside them.
	ASSERT_FALSE(std::filesystem::exists("data/XML/levels/fresh"));
	Facade().SaveLights(u"fresh");
	Facade().SaveDecals(u"fresh");
	std::set<std::string> files;
	for (const auto& entry : std::filesystem::directory_iterator("data/XML/levels/fresh"))
	{
		files.insert(entry.path().filename().string());
	}
	EXPECT_EQ(files, (std::set<std::string>{"decals.xml", "lights.xml", "nodegraph.xml"}));
	WriteLevelFile("fresh", "rooms.xml", ourRoomsText);
	WriteLevelFile("fresh", "entities.xml", ourEntitiesText);
	Facade().ParseLevel(u"fresh");
	EXPECT_EQ(Counts(), (std::array{2, 2, 5, 4, 2})) << "the two new nodes and their edges too";

	// The next level, with every section missing, empties the scene, the selection and the
	// numbering, and puts the camera back.
	WriteLevelFile("sparse", "rooms.xml",
	               "<root><rooms><room><min x=\"0\" y=\"0\" z=\"0\" />"
	               "<max x=\"1\" y=\"1\" z=\"1\" /></room></rooms></root>");
	WriteLevelFile("sparse", "entities.xml", "<root />");
	WriteLevelFile("sparse", "lights.xml", "<root><spot-lights /></root>");
	WriteLevelFile("sparse", "nodegraph.xml", "<root><node-graph><edges /></node-graph></root>");
	WriteLevelFile("sparse", "decals.xml", "<root><decoration /></root>");
	Facade().SetIsLightMode(LIGHT_MODE);
	Facade().AddPointLight();
	ASSERT_EQ(Facade().GetSelectedPoint(), 2);
	Facade().Update(16.0f);
	ASSERT_EQ(Facade().GetLightGizmos().Count(), 5);
	Facade().SetIsLightMode(NODE_MODE);
	Facade().Zoom(5.0f);
	Facade().YawCamera(0.5f);
	Facade().SetIsLightMode(LIGHT_MODE);
	Facade().ParseLevel(u"sparse");
	EXPECT_EQ((std::array{Facade().GetRooms().Count(), Facade().GetEntities().Count(),
	                      Facade().GetLightGizmos().Count(), Facade().GetNodeIDCounter()}),
	          (std::array{1, 0, 0, 1}));
	EXPECT_EQ(Counts(), (std::array{0, 0, 0, 0, 0}));
	EXPECT_EQ(Selection(), (std::array{-1, -1, -1, -1}));
	const Zeph::CameraInstance& camera = *Facade().GetCameraInstance();
	ExpectNear(Floats({camera.GetPosition(), camera.GetActualOrientation().GetForward(),
	                   camera.GetActualOrientation().GetRight()}),
	           {0, 10, 0, 0, 0, 1, 1, 0, 0});
	// A frame of the emptied scene runs.
	Facade().Update(16.0f);
	Facade().Render();
	EXPECT_EQ(ErrorEntryCount(), 0) << LogText();
}

// A saver does not reshape a file that lacks a section it fills: the cursor reports it (fatal
// under the facade's own log) and the file stays as it was; the other file of SaveLights is
// still written.
TEST_F(SoftLevelLoadSaveTest, AFileLackingItsSectionIsReportedAndLeftAsItWas)
{
	// The file, its text, and the other file that the same save writes (or none).
	const std::tuple<const char*, const char*, const char*> cases[] = {
	    {"lights.xml", "<root><spot-lights /></root>", "nodegraph.xml"},
	    {"nodegraph.xml", "<root><nodes /></root>", "lights.xml"},
	    {"decals.xml", "<root><decoration /></root>", nullptr}};
	WriteSmallLevel("small");
	Facade().ParseLevel(u"small");
	for (const auto& [file, text, otherFile] : cases)
	{
		const std::string level = std::string("lacking-") + file;
		WriteSmallLevel(level);
		WriteLevelFile(level, file, text);
		const size_t logStart = LogText().size();
		const std::u16string level16(level.begin(), level.end());
		otherFile == nullptr ? Facade().SaveDecals(level16) : Facade().SaveLights(level16);

		EXPECT_EQ(ReadLevelFile(level, file), text);
		if (otherFile != nullptr)
		{
			EXPECT_NE(ReadLevelFile(level, otherFile), ReadLevelFile("small", otherFile)) << text;
		}
		const std::string log = LogText().substr(logStart);
		EXPECT_EQ(CountOf(log, ourCursorReport + "No node set to remove children from\n"), 1) << text << "\n"
		                                                                                      << log;
	}
}

// A level edited by hand: records the editor leaves out, misspelt ones, comments, unknown
// attributes and children. Loading is never fatal; a save after moving one light gives back what
// the sections held beside the records (comments, foreign elements, records left out), while
// each record is written from the editor's data alone; what the editor wrote loads again the same way.
TEST_F(LevelLoadSaveTest, HandEditedFilesLoadSoftlyAndSaveBackWhatTheirSectionsHeld)
{
	WriteSmallLevel("hostile");
	WriteLevelFile("hostile", "lights.xml", R"(<root><point-lights>
		<!-- kitchen -->
		<point-light id="lamp-1"><position x="0" y="10" z="5" /><color r="1" g="1" b="1" a="1" note="warm" />
			<falloff value="2" /><position x="9" y="9" z="9" /><flicker rate="3"><!-- by hand --></flicker>
		</point-light>
		<point-ligth><position x="1" y="1" z="1" /></point-ligth>
		<point-light><position x="4" y="1" z="1" /><color r="1" g="0" b="0" a="1" /><falloff value="3" /></point-light>
	</point-lights><spot-lights /></root>)");
	WriteLevelFile("hostile", "nodegraph.xml", R"(<root><node-graph><nodes number-of-nodes="9" author="me">
		<node id="1"><position x="0" y="0" z="0" /></node><node id="2" tag="door"><position x="1" y="0" z="0" /></node>
		<node id="3"><position x="2" y="0" z="0" /></node><node id="7"><position x="3" y="0" z="0" /></node>
		<node id="7"><position x="4" y="0" z="0" /></node><node id="41"><position x="5" y="0" z="0" /></node>
		</nodes><edges><!-- patrol -->
		<edge><connections firstID="1" secondID="2" /><distance value="1" /></edge>
		<edge><connections firstID="2" secondID="3" /><distance value="1" /><speed value="2" /></edge>
		<edge><connections firstID="2" secondID="1" /><distance value="1" /></edge>
		<edge><connections firstID="3" secondID="3" /><distance value="1" /></edge>
		<edge><connections firstID="3" secondID="7" /><distance value="1" /></edge>
		<edge><connections firstID="1" secondID="42" /><distance value="1" /></edge>
		</edges></node-graph></root>)");
	WriteLevelFile("hostile", "decals.xml", R"(<root><decals>
		<decal><decal-type id="marble" /><position x="0" y="0" z="0" /><norm x="0" y="0" z="1" />
		       <color r="1" g="1" b="1" a="1" /><size value="1" /><depth value="1" /></decal>
		<decal><decal-type id="wood" /><position x="5" y="0" z="0" /><norm x="0" y="0" z="1" />
		       <color r="1" g="1" b="1" a="1" /><size value="1" /><depth value="1" /><!-- mine --></decal>
	</decals></root>)");
	const std::string messages[] = {
	    "Edge between path nodes 2 and 1 in [data/XML/levels/hostile/nodegraph.xml] would be a third edge of "
	    "path node 2: left out (kept in the file)",
	    "Edge between path nodes 3 and 3 in [data/XML/levels/hostile/nodegraph.xml] joins a node to itself",
	    "Edge between path nodes 3 and 7 in [data/XML/levels/hostile/nodegraph.xml] names path node 7, an ID "
	    "that 2 nodes share",
	    "Edge between path nodes 1 and 42 in [data/XML/levels/hostile/nodegraph.xml] names a missing node",
	    "Unknown decal-type [marble] in [data/XML/levels/hostile/decals.xml]: decal left out (kept in the "
	    "file)"};
	// Each load reports each of them once, at the error level.
	const auto loadAndExpect = [&](int aNodeCount, int anEdgeCount) {
		const size_t logStart = LogText().size();
		Facade().ParseLevel(u"hostile");
		EXPECT_EQ(Counts(), (std::array{2, 0, aNodeCount, anEdgeCount, 1}));
		const std::string log = LogText().substr(logStart);
		for (const std::string& message : messages)
		{
			EXPECT_EQ(CountOf(log, message), 1) << message << "\n" << log;
		}
		EXPECT_EQ(CountOf(log, "\"Error Type:\"\"ERROR\""), 5) << log;
	};
	loadAndExpect(6, 2);

	ClickAt(Facade().GetPointLights()[0].myPosition);
	Facade().MoveSelectedVector(1.0f, 0.0f, 0.0f);
	// Node 42 is named by a kept edge: the next node (after 41) gets 43.
	Facade().AddPathNode();
	EXPECT_EQ(Facade().GetNodes().Last().GetID(), 43);
	const std::string saved = SavedFiles("hostile");
	// The moved light is written from the editor's data; the misspelt record and its comment
	// follow the records.
	ExpectHeldAndGone(
	    ReadLevelFile("hostile", "lights.xml"),
	    {"<point-light>\n            <position x=\"1\" y=\"10\" z=\"5\" />\n"
	     "            <color r=\"1\" g=\"1\" b=\"1\" a=\"1\" />\n            <falloff value=\"2\" />",
	     "</point-light>\n        <!-- kitchen -->\n        <point-ligth>\n"
	     "            <position x=\"1\" y=\"1\" z=\"1\" />\n        </point-ligth>\n    </point-lights>"},
	    {"lamp-1", "warm", "flicker", "by hand", "9"});
	// "nodes" and "edges" are written anew, their records first, then what else they held; the
	// decal of an unknown type stays. What was written into a record the editor holds, or onto
	// "nodes", is gone.
	const std::string others =
	    ReadLevelFile("hostile", "nodegraph.xml") + ReadLevelFile("hostile", "decals.xml");
	ExpectHeldAndGone(others,
	                  {"<nodes number-of-nodes=\"7\">\n            <node id=\"1\">", "<node id=\"2\">",
	                   "</edge>\n            <!-- patrol -->", "secondID=\"42\"",
	                   "<decal-type id=\"marble\" />"},
	                  {"author", "door", "speed", "mine"});
	EXPECT_EQ(CountOf(others, "<edge>"), 7) << others;

	// The editor's own file loads again, leaving out the same edges, and saves the same.
	loadAndExpect(7, 3);
	EXPECT_EQ(SavedFiles("hostile"), saved);
}

// A value that is no number where a number goes reads as 0, and the log names the file, the
// element and the attribute; the editor goes on. Text after a number is let pass, as stream
// extraction reads it ("4x" is 4).
TEST_F(LevelLoadSaveTest, ValuesThatAreNoNumbersReadAsZeroWithAMessage)
{
	// The file, the text replaced, its replacement, and the message (none: read as a number).
	const std::tuple<const char*, const char*, const char*, const char*> cases[] = {
	    {"lights.xml", "x=\"1\" y=\"2\"", "x=\"abc\" y=\"2\"",
	     "[abc] in attribute [x] of [position] in [point-light]"},
	    {"lights.xml", "g=\"0.5\"", "g=\"nan\"", "[nan] in attribute [g] of [color] in [point-light]"},
	    {"nodegraph.xml", "<node id=\"4\">", "<node id=\"4x\">", nullptr},
	    {"nodegraph.xml", "<node id=\"2\">", "<node id=\"\">", "[] in attribute [id] of [node]"},
	};
	WriteSmallLevel("numbers");
	for (const auto& [file, good, bad, message] : cases)
	{
		std::string text = ReadLevelFile("numbers", file);
		ASSERT_NE(text.find(good), std::string::npos) << good;
		WriteLevelFile("numbers", file, text.replace(text.find(good), std::strlen(good), bad));
	}
	Facade().ParseLevel(u"numbers");
	const std::string log = LogText();
	for (const auto& [file, good, bad, message] : cases)
	{
		if (message != nullptr)
		{
			EXPECT_THAT(log, HasSubstr(std::string("\"Not a number ") + message +
			                           " in [data/XML/levels/numbers/" + file + "]"));
		}
	}
	EXPECT_EQ(CountOf(log, "\"Not a number "), 3) << log;
	const auto& nodes = Facade().GetNodes();
	const Zeph::PointLightData& light = Facade().GetPointLights()[0];
	EXPECT_EQ((std::vector<float>{static_cast<float>(nodes[0].GetID()), static_cast<float>(nodes[2].GetID()),
	                              light.myPosition.x, light.myColor.y}),
	          (std::vector<float>{4, 0, 0, 0}));
}

// A room's cubemap is found whatever the case of its name, and only a regular file is tied to the
// room: a folder is named in the log and the room shows the fallback. (A flat texture is lumora's
// test, through check and render.) A room's ID never takes the reflection bake out of its folder.
TEST_F(LevelLoadSaveTest, RoomCubemapsAreFoundThroughTheResolverMustBeFilesAndAreBakedInsideTheirFolder)
{
	WriteSmallLevel("cubes");
	std::filesystem::create_directories("data/Cubemaps/cubes");
	std::filesystem::copy_file(std::filesystem::path(LUMORA_TEST_SOURCE_ROOT) / "data/Cubemaps/cubemap.dds",
	                           "data/Cubemaps/cubes/HALL.dds");
	const auto& entities = Facade().GetEntities();
	for (const bool folderFlag : {false, true})
	{
		if (folderFlag)
		{
			std::filesystem::remove("data/Cubemaps/cubes/HALL.dds");
			std::filesystem::create_directories("data/Cubemaps/cubes/hall.dds");
		}
		Facade().ParseLevel(u"cubes");
		ASSERT_EQ(entities.Count(), 2);
		// The second entity is in no room: it shows the fallback.
		EXPECT_EQ(RoomDataOf(*entities[0]).myCubemap == RoomDataOf(*entities[1]).myCubemap, folderFlag);
	}
	const std::string folder = "Room cubemap [data/Cubemaps/cubes/hall.dds] of room 0: not a regular file";
	EXPECT_EQ(CountOf(LogText(), folder), 1) << LogText();

	// A room ID that is no file name never makes the reflection bake write outside the level's
	// folder: the shared fallback is still the link to the shipped file.
	WriteLevelFile("cubes", "rooms.xml",
	               "<root><rooms><room><min x=\"1\" y=\"0\" z=\"0\" /><max x=\"-1\" y=\"2\" "
	               "z=\"2\" /><id value=\"../cubemap\" /></room></rooms></root>");
	Facade().ParseLevel(u"cubes");
	Facade().BakeSpecular(u"cubes");
	EXPECT_TRUE(std::filesystem::is_symlink("data/Cubemaps/cubemap.dds"));
	EXPECT_THAT(LogText(),
	            HasSubstr("Room 0 has the ID [../cubemap], which cannot name a cubemap file: not baked"));
}

// A level as full as the arrays hold (2000 lights, path nodes and edges) and one path node and one
// edge more: it loads, draws and saves; what passes the array size is left out with a message (and
// kept in the file), and the graph's arrays never move.
TEST_F(LevelLoadSaveTest, AFullLevelLoadsDrawsAndSavesAndWhatPassesTheArraySizeIsLeftOut)
{
	constexpr int count = Lumora::LumoraWrapper::ourArraySize;
	std::ostringstream lights;
	std::ostringstream graph;
	lights << "<root><point-lights>";
	graph << "<root><node-graph><nodes>";
	for (int index = 0; index <= count; ++index)
	{
		const float x = static_cast<float>(index % 50) - 25.0f;
		const float z = static_cast<float>(index / 50);
		graph << "<node id=\"" << index + 1 << "\"><position x=\"" << x << "\" y=\"0\" z=\"" << z
		      << "\" /></node>";
		if (index == count)
		{
			break;
		}
		lights << "<point-light><position x=\"" << x << "\" y=\"1\" z=\"" << z
		       << "\" /><color r=\"1\" g=\"0.5\" b=\"0.25\" a=\"1\" /><falloff value=\"2\" /></point-light>";
	}
	// A ring over the nodes that fit (no chain needed), then one edge more than the array holds.
	graph << "</nodes><edges>";
	for (int id = 1; id <= count; ++id)
	{
		graph << "<edge><connections firstID=\"" << id << "\" secondID=\"" << (id < count ? id + 1 : 1)
		      << "\" /><distance value=\"0\" /></edge>";
	}
	graph << "<edge><connections firstID=\"" << count << "\" secondID=\"" << count + 1
	      << "\" /><distance value=\"0\" /></edge>";
	lights << "</point-lights><spot-lights /></root>";
	graph << "</edges></node-graph></root>";
	WriteSmallLevel("full");
	WriteLevelFile("full", "lights.xml", lights.str());
	WriteLevelFile("full", "nodegraph.xml", graph.str());

	Facade().ParseLevel(u"full");
	ASSERT_EQ(Counts(), (std::array{count, 0, count, count, 2}));
	EXPECT_EQ(Facade().GetNodeIDCounter(), count + 1);
	// The last edge closes the ring, from node 2000 at (24, 0, 39) to node 1 at (-25, 0, 0).
	EXPECT_FLOAT_EQ(Facade().GetEdges().Last().GetDistance(), std::hypot(49.0f, 39.0f));
	// Every pointer of the graph lands on an element of the arrays as they are now.
	EXPECT_EQ(GraphProblems(Facade()), "");
	EXPECT_THAT(LogText(), AllOf(HasSubstr("holds more than 2000 path nodes: 1 nodes were left out"),
	                             HasSubstr("holds more than 2000 path edges: 1 edges were left out")));
	EXPECT_EQ(ErrorEntryCount(), 2) << LogText();
	Facade().Update(16.0f);
	Facade().Render();
	EXPECT_EQ(Facade().GetLightGizmos().Count(), count);

	Facade().SaveLights(u"full");
	const std::string saved = ReadLevelFile("full", "nodegraph.xml");
	EXPECT_EQ((std::array{CountOf(ReadLevelFile("full", "lights.xml"), "<point-light>"),
	                      CountOf(saved, "<node id="), CountOf(saved, "<edge>")}),
	          (std::array{count, count + 1, count + 1}));
}

// A required value that a level lacks ends the editor with the cursor's report in the log.
// The child runs in a fresh process (the GL driver's threads do not survive a fork); it
// names its scratch directory in a file the parent chose, since each has its own.
TEST_F(LevelLoadSaveTest, MissingRequiredAttributeEndsTheEditorWithTheCursorsMessage)
{
	GTEST_FLAG_SET(death_test_style, "threadsafe");
	constexpr const char* variable = "LUMORA_LEVEL_DEATH_MARKER";
	const bool parentFlag = std::getenv(variable) == nullptr;
	const std::string marker = (ScratchPath() / "child-scratch.txt").string();
	if (parentFlag)
	{
		setenv(variable, marker.c_str(), 1);
	}
	WriteSmallLevel("broken");
	std::string lights = ourLightsText;
	lights.replace(lights.find(" outer=\"0.5\""), 12, "");
	WriteLevelFile("broken", "lights.xml", lights);

	EXPECT_EXIT(
	    {
		    TestSupport::WriteWholeFile(std::getenv(variable), ScratchPath().string());
		    Facade().ParseLevel(u"broken");
	    },
	    testing::KilledBySignal(SIGABRT), "");
	unsetenv(variable);

	const std::filesystem::path child = TestSupport::ReadWholeFile(marker);
	ASSERT_FALSE(child.empty());
	const std::string log = TestSupport::ReadWholeFile((child / "DebugLogger.txt").string());
	std::error_code ignored;
	std::filesystem::remove_all(child, ignored);
	EXPECT_THAT(log, HasSubstr(ourCursorReport + "Could not find name [outer] in [angles] in [spot-light] in "
	                                             "[data/XML/levels/broken/lights.xml]"));
}
