// Editing through the facade: what the adds create, how removal and copying change the
// arrays and the selection, moving and turning by mode, value changes, the path graph
// (chains, loaded rings, the size limit) and the decal types.
#include <algorithm>
#include <array>
#include <cmath>
#include <filesystem>
#include <functional>
#include <numbers>
#include <utility>
#include <vector>

#include "editor/FacadeFixture.h"
#include "editor/StringConversion.h"

namespace
{
using Lumora::DECAL_MODE;
using Lumora::LIGHT_MODE;
using Lumora::NODE_MODE;

constexpr float ourTolerance = 1.0e-5f;

void ExpectNear(const Vector3<float>& anActual, const Vector3<float>& anExpected,
                float aTolerance = ourTolerance)
{
	EXPECT_NEAR(anActual.x, anExpected.x, aTolerance);
	EXPECT_NEAR(anActual.y, anExpected.y, aTolerance);
	EXPECT_NEAR(anActual.z, anExpected.z, aTolerance);
}

void ExpectSameColor(const Vector4<float>& anActual, const Vector4<float>& anExpected)
{
	EXPECT_EQ((std::array{anActual.x, anActual.y, anActual.z, anActual.w}),
	          (std::array{anExpected.x, anExpected.y, anExpected.z, anExpected.w}));
}

// The scene's counts, every light's values and every node's position.
std::vector<float> SceneValues(const Lumora::LumoraWrapper& aFacade)
{
	std::vector<float> values = {static_cast<float>(aFacade.GetPointLights().Count()),
	                             static_cast<float>(aFacade.GetSpotLights().Count()),
	                             static_cast<float>(aFacade.GetEdges().Count()),
	                             static_cast<float>(aFacade.GetDecals().Count())};
	for (const Zeph::PointLightData& point : aFacade.GetPointLights())
	{
		const std::vector<float> light = Values(point);
		values.insert(values.end(), light.begin(), light.end());
	}
	for (const Zeph::SpotLightData& spot : aFacade.GetSpotLights())
	{
		const std::vector<float> light = Values(spot);
		values.insert(values.end(), light.begin(), light.end());
	}
	for (const AI::NGNode& node : aFacade.GetNodes())
	{
		values.insert(values.end(), {node.GetPosition().x, node.GetPosition().y, node.GetPosition().z});
	}
	return values;
}

std::vector<std::pair<int, int>> EdgeIDs(const Lumora::LumoraWrapper& aFacade)
{
	std::vector<std::pair<int, int>> result;
	for (const AI::NGEdge& edge : aFacade.GetEdges())
	{
		result.emplace_back(edge.GetFirstConnectionID(), edge.GetSecondConnectionID());
	}
	return result;
}

int EdgeCount(const AI::NGNode& aNode)
{
	return (aNode.GetEdgeSlots()[0] != nullptr ? 1 : 0) + (aNode.GetEdgeSlots()[1] != nullptr ? 1 : 0);
}

std::vector<int> EdgeCounts(const GrowingArray<AI::NGNode>& someNodes)
{
	std::vector<int> counts;
	for (const AI::NGNode& node : someNodes)
	{
		counts.push_back(EdgeCount(node));
	}
	return counts;
}

using EditingTest = FacadeTest;

TEST_F(EditingTest, AddsPlaceNewObjectsInFrontOfTheCameraAndSelectThem)
{
	Facade().AddPointLight();
	ASSERT_EQ(Facade().GetPointLights().Count(), 1);
	// Falloff, position and colour.
	EXPECT_EQ(Values(Facade().GetPointLights()[0]), (std::vector<float>{0.5f, 0, 10, 10, 1, 1, 1, 1}));
	EXPECT_EQ(Selection(), (std::array{0, -1, -1, -1}));

	Facade().AddSpotLight();
	ASSERT_EQ(Facade().GetSpotLights().Count(), 1);
	const Zeph::SpotLightData& spot = Facade().GetSpotLights()[0];
	ExpectNear(spot.myOrientation.GetPosition(), {0.0f, 10.0f, 10.0f});
	// Pointing straight up, with a right-handed-looking basis of the engine's convention.
	ExpectNear(spot.myOrientation.GetForward(), {0.0f, 1.0f, 0.0f});
	ExpectNear(spot.myOrientation.GetUp(), {0.0f, 0.0f, 1.0f});
	ExpectNear(spot.myOrientation.GetRight(), {-1.0f, 0.0f, 0.0f});
	EXPECT_EQ(spot.myAngles.x, 0.9f);
	EXPECT_EQ(spot.myAngles.y, 0.7f);
	EXPECT_EQ(spot.myFalloff, 1.0f);
	ExpectSameColor(spot.myColor, {1.0f, 1.0f, 1.0f, 1.0f});
	EXPECT_EQ(Selection(), (std::array{-1, 0, -1, -1}));

	// Path nodes come 2 in front; the lights' selection stays.
	Facade().Zoom(5.0f);
	Facade().AddPathNode();
	ASSERT_EQ(Facade().GetNodes().Count(), 1);
	ExpectNear(Facade().GetNodes()[0].GetPosition(), {0.0f, 10.0f, 7.0f});
	EXPECT_NE(Facade().GetNodes()[0].GetDebugInstance(), nullptr);
	EXPECT_EQ(Selection(), (std::array{-1, 0, 0, -1}));

	// A turned camera: the new light lies 10 along the camera's own forward row.
	Facade().YawCamera(0.7f);
	Facade().PitchCamera(0.3f);
	const Zeph::CameraInstance& camera = *Facade().GetCameraInstance();
	const Vector3<float> expected = camera.GetPosition() + camera.GetActualOrientation().GetForward() * 10.0f;
	Facade().AddPointLight();
	ExpectNear(Facade().GetPointLights()[1].myPosition, expected);
	EXPECT_EQ(Selection(), (std::array{1, -1, 0, -1}));
	EXPECT_FALSE(Facade().IsBusy());
}

TEST_F(EditingTest, RemovingALightMovesTheLastIntoItsPlace)
{
	// Three point lights A, B, C (told apart by falloff) across the view; then the same
	// for spot lights.
	for (int index = 0; index < 3; ++index)
	{
		Facade().AddPointLight();
		Facade().MoveSelectedVector(3.0f * static_cast<float>(index - 1), 0.0f, 0.0f);
		Facade().ChangeFalloffPointLight(static_cast<float>(index + 1));
		Facade().AddSpotLight();
		Facade().MoveSelectedVector(3.0f * static_cast<float>(index - 1), 2.0f, 0.0f);
		Facade().ChangeFalloffSpotLight(static_cast<float>(index + 1));
	}
	Facade().SetIsLightMode(LIGHT_MODE);
	Facade().DoIntersection(0.0f, 0.0f);

	ClickAt(Facade().GetPointLights()[0].myPosition);
	ASSERT_EQ(Facade().GetSelectedPoint(), 0);
	Facade().RemoveSelectedPointLight();
	ASSERT_EQ(Facade().GetPointLights().Count(), 2);
	EXPECT_EQ(Facade().GetPointLights()[0].myFalloff, 3.0f);
	EXPECT_EQ(Facade().GetPointLights()[1].myFalloff, 2.0f);
	EXPECT_EQ(Facade().GetSelectedPoint(), -1);

	ClickAt(Facade().GetSpotLights()[0].myOrientation.GetPosition());
	ASSERT_EQ(Facade().GetSelectedSpot(), 0);
	Facade().RemoveSelectedSpotLight();
	ASSERT_EQ(Facade().GetSpotLights().Count(), 2);
	EXPECT_EQ(Facade().GetSpotLights()[0].myFalloff, 3.0f);
	EXPECT_EQ(Facade().GetSpotLights()[1].myFalloff, 2.0f);
	EXPECT_EQ(Facade().GetSelectedSpot(), -1);

	// Removing the last element needs no move.
	ClickAt(Facade().GetPointLights()[1].myPosition);
	Facade().RemoveSelectedPointLight();
	ASSERT_EQ(Facade().GetPointLights().Count(), 1);
	EXPECT_EQ(Facade().GetPointLights()[0].myFalloff, 3.0f);
}

TEST_F(EditingTest, CopiesAreExactAndClearTheSelection)
{
	Facade().AddPointLight();
	Facade().ChangeColorPointLight(0.1f, 0.2f, 0.3f);
	Facade().ChangeFalloffPointLight(4.0f);
	Facade().MoveSelectedVector(1.0f, -2.0f, 3.0f);
	Facade().CopyPointLight();
	ASSERT_EQ(Facade().GetPointLights().Count(), 2);
	EXPECT_EQ(Values(Facade().GetPointLights()[1]), Values(Facade().GetPointLights()[0]));
	EXPECT_EQ(Facade().GetSelectedPoint(), -1);

	Facade().AddSpotLight();
	Facade().YawSpotLight(0.4f);
	Facade().ChangeColorSpotLight(0.5f, 0.25f, 0.0f);
	// Stored as given: inner below outer, a negative falloff.
	Facade().ChangeAnglesSpotLight(0.2f, 0.8f);
	Facade().ChangeFalloffSpotLight(-1.0f);
	Facade().CopySpotLight();
	ASSERT_EQ(Facade().GetSpotLights().Count(), 2);
	const Zeph::SpotLightData& spot = Facade().GetSpotLights()[0];
	EXPECT_EQ(Values(Facade().GetSpotLights()[1]), Values(spot));
	ExpectSameColor(spot.myColor, {0.5f, 0.25f, 0.0f, 1.0f});
	EXPECT_TRUE(spot.myAngles.x == 0.2f && spot.myAngles.y == 0.8f && spot.myFalloff == -1.0f);
	ExpectNear(spot.myOrientation.GetForward(), {std::sin(0.4f), std::cos(0.4f), 0.0f});
	EXPECT_EQ(Facade().GetSelectedSpot(), -1);

	// Nothing selected: nothing copied.
	Facade().CopyPointLight();
	Facade().CopySpotLight();
	EXPECT_EQ(Facade().GetPointLights().Count(), 2);
	EXPECT_EQ(Facade().GetSpotLights().Count(), 2);
}

// Every operation on a selection, with nothing selected, changes nothing and leaves
// the facade free.
TEST_F(EditingTest, WithoutASelectionNothingChanges)
{
	Facade().AddPointLight();
	Facade().AddSpotLight();
	Facade().AddPathNode();
	Facade().AddPathNode();
	const std::vector<float> before = SceneValues(Facade());
	const std::vector<std::pair<const char*, std::function<void()>>> operations = {
	    {"CopyPointLight", [&] { Facade().CopyPointLight(); }},
	    {"CopySpotLight", [&] { Facade().CopySpotLight(); }},
	    {"CopyDecal", [&] { Facade().CopyDecal(); }},
	    {"RemoveSelectedPointLight", [&] { Facade().RemoveSelectedPointLight(); }},
	    {"RemoveSelectedSpotLight", [&] { Facade().RemoveSelectedSpotLight(); }},
	    {"RemoveSelectedDecal", [&] { Facade().RemoveSelectedDecal(); }},
	    {"RemoveSelectedNode", [&] { Facade().RemoveSelectedNode(); }},
	    {"DeleteSelected", [&] { Facade().DeleteSelected(); }},
	    {"MoveSelectedVector", [&] { Facade().MoveSelectedVector(1.0f, 1.0f, 1.0f); }},
	    {"MoveSelectedVert", [&] { Facade().MoveSelectedVert(1.0f); }},
	    {"MoveSelectedHor", [&] { Facade().MoveSelectedHor(1.0f); }},
	    {"MoveSelectedDepth", [&] { Facade().MoveSelectedDepth(1.0f); }},
	    {"PitchSpotLight", [&] { Facade().PitchSpotLight(1.0f); }},
	    {"YawSpotLight", [&] { Facade().YawSpotLight(1.0f); }},
	    {"ChangeColorPointLight", [&] { Facade().ChangeColorPointLight(0.0f, 0.0f, 0.0f); }},
	    {"ChangeColorSpotLight", [&] { Facade().ChangeColorSpotLight(0.0f, 0.0f, 0.0f); }},
	    {"ChangeFalloffPointLight", [&] { Facade().ChangeFalloffPointLight(9.0f); }},
	    {"ChangeFalloffSpotLight", [&] { Facade().ChangeFalloffSpotLight(9.0f); }},
	    {"ChangeAnglesSpotLight", [&] { Facade().ChangeAnglesSpotLight(0.1f, 0.1f); }},
	    {"ChangeColorDecal", [&] { Facade().ChangeColorDecal(0.0f, 0.0f, 0.0f); }},
	    {"ChangeDecalSize", [&] { Facade().ChangeDecalSize(5.0f); }},
	    {"ChangeDecalDepth", [&] { Facade().ChangeDecalDepth(5.0f); }},
	    {"ChangeDecalType", [&] { Facade().ChangeDecalType(u"brick"); }},
	};
	for (const int mode : {LIGHT_MODE, NODE_MODE, DECAL_MODE})
	{
		Facade().SetIsLightMode(mode);
		for (const auto& [name, operation] : operations)
		{
			SCOPED_TRACE(testing::Message() << name << " in mode " << mode);
			operation();
			EXPECT_FALSE(Facade().IsBusy());
			EXPECT_EQ(SceneValues(Facade()), before);
		}
	}
}

TEST_F(EditingTest, MovingFollowsTheModeAndTheCameraAxes)
{
	Facade().YawCamera(-0.6f);
	Facade().PitchCamera(0.2f);
	const Matrix44<float> axes = Facade().GetCameraInstance()->GetActualOrientation();
	struct Case
	{
		const char* myName;
		std::function<void()> myMove;
		Vector3<float> myOffset;
	};
	const std::vector<Case> cases = {
	    {"Vert", [&] { Facade().MoveSelectedVert(1.5f); }, axes.GetUp() * 1.5f},
	    {"Hor", [&] { Facade().MoveSelectedHor(-2.0f); }, axes.GetRight() * -2.0f},
	    {"Depth", [&] { Facade().MoveSelectedDepth(0.5f); }, axes.GetForward() * 0.5f},
	    {"Vector", [&] { Facade().MoveSelectedVector(1.0f, -2.0f, 3.0f); },
	     Vector3<float>(1.0f, -2.0f, 3.0f)},
	};
	for (const Case& testCase : cases)
	{
		SCOPED_TRACE(testCase.myName);
		Facade().SetIsLightMode(LIGHT_MODE);
		Facade().AddPointLight();
		const Vector3<float> point = Facade().GetPointLights().Last().myPosition;
		testCase.myMove();
		ExpectNear(Facade().GetPointLights().Last().myPosition, point + testCase.myOffset);

		Facade().AddSpotLight();
		const Matrix44<float> spot = Facade().GetSpotLights().Last().myOrientation;
		testCase.myMove();
		const Matrix44<float>& moved = Facade().GetSpotLights().Last().myOrientation;
		ExpectNear(moved.GetPosition(), spot.GetPosition() + testCase.myOffset);
		ExpectNear(moved.GetForward(), spot.GetForward(), 0.0f);

		// In node mode only the world-space offset moves a node; lights stay where they are.
		Facade().SetIsLightMode(NODE_MODE);
		Facade().AddPathNode();
		Facade().AddSpotLight();
		const Vector3<float> node = Facade().GetNodes().Last().GetPosition();
		const Vector3<float> spotBefore = Facade().GetSpotLights().Last().myOrientation.GetPosition();
		testCase.myMove();
		const bool vectorFlag = std::string(testCase.myName) == "Vector";
		ExpectNear(Facade().GetNodes().Last().GetPosition(), vectorFlag ? node + testCase.myOffset : node);
		ExpectNear(Facade().GetSpotLights().Last().myOrientation.GetPosition(), spotBefore, 0.0f);
	}
}

TEST_F(EditingTest, TurningASpotLightTurnsItAboutItsOwnAxes)
{
	const float quarter = std::numbers::pi_v<float> / 2.0f;
	struct Case
	{
		const char* myName;
		bool myPitchFlag;
		float myAngle;
		Vector3<float> myForward;
	};
	// A new spot light: right (-1, 0, 0), up (0, 0, 1), forward (0, 1, 0).
	const Case cases[] = {
	    {"pitch a quarter", true, quarter, {0.0f, 0.0f, 1.0f}},
	    {"pitch back a quarter", true, -quarter, {0.0f, 0.0f, -1.0f}},
	    {"yaw a quarter", false, quarter, {1.0f, 0.0f, 0.0f}},
	    {"yaw a half", false, 2.0f * quarter, {0.0f, -1.0f, 0.0f}},
	};
	for (const Case& testCase : cases)
	{
		SCOPED_TRACE(testCase.myName);
		Facade().AddSpotLight();
		Facade().MoveSelectedVector(1.0f, 2.0f, 3.0f);
		if (testCase.myPitchFlag)
		{
			Facade().PitchSpotLight(testCase.myAngle);
		}
		else
		{
			Facade().YawSpotLight(testCase.myAngle);
		}
		const Matrix44<float>& orientation = Facade().GetSpotLights().Last().myOrientation;
		ExpectNear(orientation.GetForward(), testCase.myForward);
		ExpectNear(orientation.GetPosition(), {1.0f, 12.0f, 13.0f}, 0.0f);
		// The axis turned about stays put.
		if (testCase.myPitchFlag)
		{
			ExpectNear(orientation.GetRight(), {-1.0f, 0.0f, 0.0f});
		}
		else
		{
			ExpectNear(orientation.GetUp(), {0.0f, 0.0f, 1.0f});
		}
	}

	// Only light mode turns a spot light.
	for (const int mode : {NODE_MODE, DECAL_MODE})
	{
		Facade().SetIsLightMode(mode);
		Facade().AddSpotLight();
		Facade().PitchSpotLight(0.5f);
		Facade().YawSpotLight(0.5f);
		ExpectNear(Facade().GetSpotLights().Last().myOrientation.GetForward(), {0.0f, 1.0f, 0.0f}, 0.0f);
	}
}

TEST_F(EditingTest, DeleteSelectedRemovesOneObjectInKindOrder)
{
	Facade().AddSpotLight();
	Facade().AddPathNode();
	// Spot light and node selected: the spot light goes first, then the node.
	Facade().DeleteSelected();
	EXPECT_EQ(Facade().GetSpotLights().Count(), 0);
	EXPECT_EQ(Facade().GetNodes().Count(), 1);
	EXPECT_EQ(Facade().GetSelectedNode(), 0);
	Facade().DeleteSelected();
	EXPECT_EQ(Facade().GetNodes().Count(), 0);
	EXPECT_EQ(Facade().GetSelectedNode(), -1);

	Facade().AddPathNode();
	Facade().AddPointLight();
	Facade().DeleteSelected();
	EXPECT_EQ(Facade().GetPointLights().Count(), 0);
	EXPECT_EQ(Facade().GetNodes().Count(), 1);
	EXPECT_FALSE(Facade().IsBusy());
}

// Nodes laid out across the view (so each can be clicked) and joined in a chain.
class PathGraphTest : public FacadeTest
{
protected:
	void AddNodeAt(const Vector3<float>& aPosition)
	{
		Facade().AddPathNode();
		const Vector3<float> offset = aPosition - Facade().GetNodes().Last().GetPosition();
		Facade().MoveSelectedVector(offset.x, offset.y, offset.z);
	}

	static Vector3<float> Spot(int anIndex)
	{
		return Vector3<float>(-4.0f + 2.5f * static_cast<float>(anIndex), 10.0f, 12.0f);
	}

	void SetUp() override
	{
		FacadeTest::SetUp();
		if (IsSkipped() || HasFatalFailure())
		{
			return;
		}
		Facade().SetIsLightMode(NODE_MODE);
	}
};

TEST_F(PathGraphTest, AddedNodesFormAChainAndOnlyTheLastCanBeRemoved)
{
	for (int index = 0; index < 3; ++index)
	{
		AddNodeAt(Spot(index));
	}
	const GrowingArray<AI::NGNode>& nodes = Facade().GetNodes();
	ASSERT_EQ(nodes.Count(), 3);
	EXPECT_EQ((std::vector{nodes[0].GetID(), nodes[1].GetID(), nodes[2].GetID()}), (std::vector{1, 2, 3}));
	EXPECT_EQ(EdgeIDs(Facade()), (std::vector<std::pair<int, int>>{{1, 2}, {2, 3}}));
	EXPECT_EQ(EdgeCounts(nodes), (std::vector{1, 2, 1}));
	EXPECT_EQ(GraphProblems(Facade()), "");
	// The distance is taken when the edge is made (the node was moved only afterwards)
	// and follows the nodes once the graph is drawn.
	Facade().Update(16.0f);
	Facade().Render();
	EXPECT_NEAR(Facade().GetEdges()[0].GetDistance(), 2.5f, ourTolerance);

	// A node in the middle stays.
	ClickAt(Spot(1));
	ASSERT_EQ(Facade().GetSelectedNode(), 1);
	Facade().RemoveSelectedNode();
	EXPECT_EQ(nodes.Count(), 3);
	EXPECT_EQ(Facade().GetEdges().Count(), 2);
	EXPECT_EQ(Facade().GetSelectedNode(), 1);

	// The last goes with its edge; its ID is not handed out again.
	ClickAt(Spot(2));
	ASSERT_EQ(Facade().GetSelectedNode(), 2);
	Facade().RemoveSelectedNode();
	ASSERT_EQ(nodes.Count(), 2);
	EXPECT_EQ(EdgeIDs(Facade()), (std::vector<std::pair<int, int>>{{1, 2}}));
	EXPECT_EQ(EdgeCount(nodes[1]), 1);
	EXPECT_EQ(Facade().GetSelectedNode(), -1);
	EXPECT_EQ(GraphProblems(Facade()), "");

	AddNodeAt(Spot(3));
	EXPECT_EQ(nodes.Last().GetID(), 4);
	EXPECT_EQ(EdgeIDs(Facade()), (std::vector<std::pair<int, int>>{{1, 2}, {2, 4}}));
	EXPECT_EQ(GraphProblems(Facade()), "");

	// Down to nothing, and a lone node without edges.
	for (int remaining = 3; remaining > 0; --remaining)
	{
		ClickAt(nodes.Last().GetPosition());
		Facade().RemoveSelectedNode();
		ASSERT_EQ(nodes.Count(), remaining - 1);
		EXPECT_EQ(GraphProblems(Facade()), "");
	}
	EXPECT_EQ(Facade().GetEdges().Count(), 0);
	AddNodeAt(Spot(0));
	EXPECT_EQ(nodes.Last().GetID(), 5);
	EXPECT_EQ(Facade().GetEdges().Count(), 0);
}

// The graph's arrays never grow (that would move the elements the references point
// at): the node past the limit is refused and said so in the log.
TEST_F(PathGraphTest, NodesStopAtTheArrayLimit)
{
	const int limit = Lumora::LumoraWrapper::ourArraySize;
	for (int index = 0; index < limit; ++index)
	{
		Facade().AddPathNode();
	}
	const AI::NGNode* first = &Facade().GetNodes()[0];
	ASSERT_EQ(Facade().GetNodes().Count(), limit);
	ASSERT_EQ(Facade().GetEdges().Count(), limit - 1);
	Facade().AddPathNode();
	EXPECT_EQ(Facade().GetNodes().Count(), limit);
	EXPECT_EQ(Facade().GetEdges().Count(), limit - 1);
	EXPECT_EQ(&Facade().GetNodes()[0], first);
	EXPECT_EQ(Facade().GetNodes().Last().GetID(), limit);
	EXPECT_EQ(Facade().GetSelectedNode(), limit - 1);
	EXPECT_FALSE(Facade().IsBusy());
	EXPECT_NE(LogText().find("limit of 2000 nodes"), std::string::npos) << LogText();
	EXPECT_EQ(GraphProblems(Facade()), "");
}

// A loaded graph need not be a chain. The ring 1-2-3-4-1, with the edge (4, 1) stored
// first: node 4 (the last) already holds two edges, and removing it removes an edge
// from the middle of the edge array.
class LoadedRingTest : public PathGraphTest
{
protected:
	void PrepareData(const std::filesystem::path& aDataPath) override
	{
		namespace fs = std::filesystem;
		const fs::path level = aDataPath / "XML" / "levels" / "ring";
		fs::create_directories(level);
		for (const char* file : {"rooms.xml", "entities.xml", "lights.xml", "decals.xml"})
		{
			const fs::path source = aDataPath / "XML" / "levels" / "sample_small" / file;
			fs::copy_file(source, level / file);
		}
		TestSupport::WriteWholeFile((level / "nodegraph.xml").string(), R"(<root>
    <node-graph>
        <nodes number-of-nodes="4">
            <node id="1"><position x="-3" y="10" z="12" /></node>
            <node id="2"><position x="-1" y="10" z="12" /></node>
            <node id="3"><position x="1" y="10" z="12" /></node>
            <node id="4"><position x="3" y="10" z="12" /></node>
        </nodes>
        <edges number-of-edges="4">
            <edge><connections firstID="4" secondID="1" /><distance value="6" /></edge>
            <edge><connections firstID="1" secondID="2" /><distance value="2" /></edge>
            <edge><connections firstID="2" secondID="3" /><distance value="2" /></edge>
            <edge><connections firstID="3" secondID="4" /><distance value="2" /></edge>
        </edges>
    </node-graph>
</root>
)");
	}
};

TEST_F(LoadedRingTest, AddingAfterAFullNodeAndRemovingItKeepTheGraphSound)
{
	Facade().ParseLevel(u"ring");
	Facade().SetIsLightMode(NODE_MODE);
	const GrowingArray<AI::NGNode>& nodes = Facade().GetNodes();
	ASSERT_EQ(nodes.Count(), 4);
	ASSERT_EQ(Facade().GetEdges().Count(), 4);
	EXPECT_EQ(GraphProblems(Facade()), "");

	// Node 4 holds two edges: the new node is added without one.
	Facade().AddPathNode();
	ASSERT_EQ(nodes.Count(), 5);
	EXPECT_EQ(nodes.Last().GetID(), 5);
	EXPECT_EQ(Facade().GetEdges().Count(), 4);
	EXPECT_NE(LogText().find("Node 4 already has two edges; node 5 added without an edge"), std::string::npos)
	    << LogText();
	Facade().RemoveSelectedNode();
	ASSERT_EQ(nodes.Count(), 4);
	EXPECT_EQ(Facade().GetEdges().Count(), 4);

	// Node 4 goes with both its edges, (4, 1) at the front of the array and (3, 4) at its end.
	ClickAt(nodes[3].GetPosition());
	ASSERT_EQ(Facade().GetSelectedNode(), 3);
	Facade().RemoveSelectedNode();
	ASSERT_EQ(nodes.Count(), 3);
	std::vector<std::pair<int, int>> edges = EdgeIDs(Facade());
	std::sort(edges.begin(), edges.end());
	EXPECT_EQ(edges, (std::vector<std::pair<int, int>>{{1, 2}, {2, 3}}));
	EXPECT_EQ(EdgeCounts(nodes), (std::vector{1, 2, 1}));
	EXPECT_EQ(GraphProblems(Facade()), "");

	// The chain goes on from node 3, and the graph still draws.
	Facade().AddPathNode();
	EXPECT_EQ(EdgeCount(nodes[2]), 2);
	EXPECT_EQ(GraphProblems(Facade()), "");
	Facade().Update(16.0f);
	Facade().Render();
	EXPECT_NEAR(Facade().GetEdges()[0].GetDistance(), 2.0f, ourTolerance);
}

using DecalEditingTest = DecalFacadeTest;

TEST_F(DecalEditingTest, AddCopyTurnAndRetypeDecals)
{
	Facade().AddPointLight();
	Facade().AddDecal();
	ASSERT_EQ(Facade().GetDecals().Count(), 1);
	const Zeph::DecalData& decal = Facade().GetDecals()[0];
	const Lumora::DecalType& brick = Facade().GetDecalTypes().at("brick");
	ExpectNear(decal.myPosition, {0.0f, 10.0f, 10.0f});
	ExpectNear(decal.myNorm, {0.0f, 0.0f, -1.0f});
	EXPECT_EQ(decal.mySize, 1.0f);
	EXPECT_EQ(decal.myDepth, 0.3f);
	EXPECT_EQ(decal.myTypeId, "brick");
	EXPECT_EQ(decal.myTexture, brick.myTexture);
	EXPECT_EQ(decal.myNormalTexture, brick.myNormalTexture);
	ExpectSameColor(decal.myColor, {1.0f, 1.0f, 1.0f, 1.0f});
	EXPECT_EQ(Selection(), (std::array{-1, -1, -1, 0}));

	Lumora::DecalStruct record;
	ASSERT_TRUE(Facade().TryGetCurrentDecal(record));
	EXPECT_EQ(record.decalID, std::u16string(u"brick"));
	EXPECT_EQ(record.direction, (std::array<float, 3>{0.0f, 0.0f, -1.0f}));

	// Another type by name; an unknown name keeps the type and says so.
	const auto other = std::find_if(Facade().GetDecalTypes().begin(), Facade().GetDecalTypes().end(),
	                                [](const auto& aType) { return aType.first != "brick"; });
	ASSERT_NE(other, Facade().GetDecalTypes().end());
	Facade().ChangeDecalType(Lumora::ToWide(other->first));
	EXPECT_EQ(decal.myTypeId, other->first);
	EXPECT_EQ(decal.myTexture, other->second.myTexture);
	Facade().ChangeDecalType(u"no-such-type");
	EXPECT_EQ(decal.myTypeId, other->first);
	EXPECT_NE(LogText().find("No decal type \"no-such-type\""), std::string::npos) << LogText();

	// Turning in decal mode keeps the direction's length, even once it leans up or down
	// (where the turning basis is not of unit length).
	Facade().SetIsLightMode(DECAL_MODE);
	Facade().AddDecal();
	Facade().PitchSpotLight(std::numbers::pi_v<float> / 2.0f);
	ExpectNear(Facade().GetDecals().Last().myNorm, {0.0f, 1.0f, 0.0f});
	for (int turn = 0; turn < 4; ++turn)
	{
		Facade().PitchSpotLight(-0.35f);
		Facade().YawSpotLight(0.6f);
		EXPECT_NEAR(Facade().GetDecals().Last().myNorm.Length(), 1.0f, ourTolerance);
	}
	Facade().ChangeDecalSize(3.0f);
	Facade().ChangeDecalDepth(-1.0f);
	Facade().ChangeColorDecal(0.5f, 0.5f, 0.5f);
	Facade().MoveSelectedDepth(2.0f);
	const Zeph::DecalData turned = Facade().GetDecals().Last();
	EXPECT_EQ(turned.mySize, 3.0f);
	EXPECT_EQ(turned.myDepth, -1.0f);
	ExpectNear(turned.myPosition, {0.0f, 10.0f, 12.0f});

	Facade().CopyDecal();
	ASSERT_EQ(Facade().GetDecals().Count(), 3);
	const Zeph::DecalData& copy = Facade().GetDecals().Last();
	ExpectNear(copy.myPosition, turned.myPosition, 0.0f);
	ExpectNear(copy.myNorm, turned.myNorm, 0.0f);
	ExpectSameColor(copy.myColor, turned.myColor);
	EXPECT_TRUE(copy.mySize == turned.mySize && copy.myDepth == turned.myDepth &&
	            copy.myTypeId == turned.myTypeId && copy.myTexture == turned.myTexture);
	EXPECT_EQ(Facade().GetSelectedDecal(), -1);
}

TEST_F(DecalEditingTest, DecalTypesAreAppendedInNameOrder)
{
	Lumora::DecalTypeStruct record;
	record.decalTypes = {u"first", u"second"};
	Facade().GetCurrentDecalTypes(record);
	std::vector<std::u16string> expected = {u"first", u"second"};
	for (const auto& type : Facade().GetDecalTypes())
	{
		expected.push_back(Lumora::ToWide(type.first));
	}
	EXPECT_EQ(record.decalTypes, expected);
	EXPECT_GT(record.decalTypes.size(), 2u);
	EXPECT_TRUE(std::is_sorted(record.decalTypes.begin() + 2, record.decalTypes.end()));
}

// A catalogue without "brick": adding a decal is refused.
class NoBrickTest : public FacadeTest
{
protected:
	void PrepareData(const std::filesystem::path& aDataPath) override
	{
		TestSupport::WriteWholeFile((aDataPath / "XML" / "DecalTypes.xml").string(), R"(<root>
    <decal id="hazard">
        <texture path="data/textures/decal_hazard_albedo.dds" />
        <normal path="data/textures/decal_hazard_normal.dds" />
    </decal>
</root>
)");
	}
};

TEST_F(NoBrickTest, AddDecalIsRefused)
{
	ASSERT_EQ(Facade().GetDecalTypes().count("brick"), 0u);
	ASSERT_EQ(Facade().GetDecalTypes().count("hazard"), 1u);
	Facade().AddPointLight();
	Facade().AddDecal();
	EXPECT_EQ(Facade().GetDecals().Count(), 0);
	EXPECT_EQ(Selection(), (std::array{0, -1, -1, -1}));
	EXPECT_FALSE(Facade().IsBusy());
	EXPECT_NE(LogText().find("No decal type \"brick\""), std::string::npos) << LogText();
}
} // namespace
