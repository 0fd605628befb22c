// Editing through the facade: what the adds create, how removal and copying change the
// arrays and the selection, moving and turning by mode, value changes, the path graph
// (chains, loaded rings, the size limit), the decal types, and picking (which object a
// click selects). The camera starts at (0, 10, 0) looking along +z; objects are placed by
// adding them (10 in front of the camera) and moving them.
#include <algorithm>
#include <array>
#include <filesystem>
#include <functional>
#include <numbers>
#include <ostream>
#include <string>
#include <tuple>
#include <utility>
#include <vector>

#include "editor/FacadeFixture.h"
#include "editor/StringConversion.h"

namespace
{
using Lumora::DECAL_MODE;
using Lumora::LIGHT_MODE;
using Lumora::LumoraWrapper;
using Lumora::NODE_MODE;

constexpr float ourTolerance = 1.0e-5f;

// Each element within aTolerance of the expected one.
void ExpectNearAll(const std::vector<float>& anActual, const std::vector<float>& anExpected,
                   float aTolerance = ourTolerance)
{
	EXPECT_THAT(anActual, testing::Pointwise(testing::FloatNear(aTolerance), anExpected));
}

void ExpectNear(const Vector3<float>& anActual, const Vector3<float>& anExpected,
                float aTolerance = ourTolerance)
{
	ExpectNearAll({anActual.x, anActual.y, anActual.z}, {anExpected.x, anExpected.y, anExpected.z},
	              aTolerance);
}

// The scene's counts, every light's values and every node's position.
std::vector<float> SceneValues(const LumoraWrapper& aFacade)
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

std::vector<std::pair<int, int>> EdgeIDs(const LumoraWrapper& aFacade)
{
	std::vector<std::pair<int, int>> result;
	for (const AI::NGEdge& edge : aFacade.GetEdges())
	{
		result.emplace_back(edge.GetFirstConnectionID(), edge.GetSecondConnectionID());
	}
	return result;
}

// How many edges each node holds.
std::vector<int> EdgeCounts(const GrowingArray<AI::NGNode>& someNodes)
{
	std::vector<int> counts;
	for (const AI::NGNode& node : someNodes)
	{
		counts.push_back((node.GetEdgeSlots()[0] != nullptr ? 1 : 0) +
		                 (node.GetEdgeSlots()[1] != nullptr ? 1 : 0));
	}
	return counts;
}

using EditingTest = FacadeTest;

TEST_F(EditingTest, AddsPlaceNewObjectsInFrontOfTheCameraAndSelectThemAndDeleteTakesThemInKindOrder)
{
	Facade().AddPointLight();
	ASSERT_EQ(Facade().GetPointLights().Count(), 1);
	// Falloff, position and colour.
	EXPECT_EQ(Values(Facade().GetPointLights()[0]), (std::vector<float>{0.5f, 0, 10, 10, 1, 1, 1, 1}));
	EXPECT_EQ(Selection(), (std::array{0, -1, -1, -1}));

	// Falloff, angles, colour, and an orientation pointing straight up: right (-1, 0, 0),
	// up (0, 0, 1), forward (0, 1, 0), at (0, 10, 10).
	Facade().AddSpotLight();
	ASSERT_EQ(Facade().GetSpotLights().Count(), 1);
	ExpectNearAll(Values(Facade().GetSpotLights()[0]),
	              {1, 0.9f, 0.7f, 1, 1, 1, 1, -1, 0, 0, 0, 0, 0, 1, 0, 0, 1, 0, 0, 0, 10, 10, 1});
	EXPECT_EQ(Selection(), (std::array{-1, 0, -1, -1}));

	// Path nodes come 2 in front; the lights' selection stays.
	Facade().Zoom(5.0f);
	Facade().AddPathNode();
	ASSERT_EQ(Facade().GetNodes().Count(), 1);
	ExpectNear(Facade().GetNodes()[0].GetPosition(), {0.0f, 10.0f, 7.0f});
	EXPECT_NE(Facade().GetNodes()[0].GetDebugInstance(), nullptr);
	EXPECT_EQ(Selection(), (std::array{-1, 0, 0, -1}));

	// Delete removes one selected object at a time, lights before nodes.
	Facade().AddPointLight();
	ASSERT_EQ(Selection(), (std::array{1, -1, 0, -1}));
	Facade().DeleteSelected();
	EXPECT_EQ(std::tuple(Facade().GetPointLights().Count(), Facade().GetNodes().Count()), std::tuple(1, 1));
	Facade().DeleteSelected();
	EXPECT_EQ(std::tuple(Facade().GetPointLights().Count(), Facade().GetNodes().Count()), std::tuple(1, 0));
}

TEST_F(EditingTest, RemovingALightMovesTheLastIntoItsPlace)
{
	// Three point lights and three spot lights A, B, C (told apart by falloff) across the view.
	for (int index = 0; index < 3; ++index)
	{
		Facade().AddPointLight();
		Facade().MoveSelectedVector(3.0f * static_cast<float>(index - 1), 0.0f, 0.0f);
		Facade().ChangeFalloffPointLight(static_cast<float>(index + 1));
		Facade().AddSpotLight();
		Facade().MoveSelectedVector(3.0f * static_cast<float>(index - 1), 2.0f, 0.0f);
		Facade().ChangeFalloffSpotLight(static_cast<float>(index + 1));
	}
	const auto& points = Facade().GetPointLights();
	const auto& spots = Facade().GetSpotLights();
	Facade().SetIsLightMode(LIGHT_MODE);
	ClickAt(points[0].myPosition);
	Facade().RemoveSelectedPointLight();
	EXPECT_EQ(Facade().GetSelectedPoint(), -1);
	ClickAt(spots[0].myOrientation.GetPosition());
	Facade().RemoveSelectedSpotLight();
	EXPECT_EQ((std::vector{points[0].myFalloff, points[1].myFalloff, spots[0].myFalloff, spots[1].myFalloff}),
	          (std::vector<float>{3, 2, 3, 2}));
	EXPECT_EQ(Selection(), (std::array{-1, -1, -1, -1}));

	// Removing the last element needs no move.
	ClickAt(points[1].myPosition);
	Facade().RemoveSelectedPointLight();
	ASSERT_EQ(points.Count(), 1);
	EXPECT_EQ(points[0].myFalloff, 3.0f);
}

TEST_F(EditingTest, ACopyIsExactAndClearsTheSelection)
{
	Facade().AddPointLight();
	Facade().ChangeColorPointLight(0.1f, 0.2f, 0.3f);
	Facade().ChangeFalloffPointLight(4.0f);
	Facade().MoveSelectedVector(1.0f, -2.0f, 3.0f);
	Facade().CopyPointLight();
	ASSERT_EQ(Facade().GetPointLights().Count(), 2);
	EXPECT_EQ(Values(Facade().GetPointLights()[1]), Values(Facade().GetPointLights()[0]));

	EXPECT_EQ(Selection(), (std::array{-1, -1, -1, -1}));
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
	// Each move, the offset it gives a light, and whether it moves a node in node mode (only the
	// world-space offset does).
	const std::tuple<std::function<void()>, Vector3<float>, bool> cases[] = {
	    {[&] { Facade().MoveSelectedVert(1.5f); }, axes.GetUp() * 1.5f, false},
	    {[&] { Facade().MoveSelectedHor(-2.0f); }, axes.GetRight() * -2.0f, false},
	    {[&] { Facade().MoveSelectedDepth(0.5f); }, axes.GetForward() * 0.5f, false},
	    {[&] { Facade().MoveSelectedVector(1.0f, -2.0f, 3.0f); }, Vector3<float>(1.0f, -2.0f, 3.0f), true},
	};
	for (const auto& [move, offset, nodeFlag] : cases)
	{
		SCOPED_TRACE(testing::Message() << offset.x << " " << offset.y << " " << offset.z);
		Facade().SetIsLightMode(LIGHT_MODE);
		Facade().AddPointLight();
		const Vector3<float> point = Facade().GetPointLights().Last().myPosition;
		move();
		ExpectNear(Facade().GetPointLights().Last().myPosition, point + offset);

		Facade().SetIsLightMode(NODE_MODE);
		Facade().AddPathNode();
		const Vector3<float> node = Facade().GetNodes().Last().GetPosition();
		move();
		ExpectNear(Facade().GetNodes().Last().GetPosition(), nodeFlag ? node + offset : node);
	}
}

TEST_F(EditingTest, TurningASpotLightTurnsItAboutItsOwnAxes)
{
	const float quarter = std::numbers::pi_v<float> / 2.0f;
	struct Case
	{
		void (LumoraWrapper::*myTurn)(float);
		float myAngle;
		Vector3<float> myForward;
		int myFixedRow; // the axis turned about stays put: 0 the right row, 4 the up row
	};
	// A new spot light: right (-1, 0, 0), up (0, 0, 1), forward (0, 1, 0).
	const Case cases[] = {
	    {&LumoraWrapper::PitchSpotLight, quarter, {0.0f, 0.0f, 1.0f}, 0},
	    {&LumoraWrapper::PitchSpotLight, -quarter, {0.0f, 0.0f, -1.0f}, 0},
	    {&LumoraWrapper::YawSpotLight, quarter, {1.0f, 0.0f, 0.0f}, 4},
	    {&LumoraWrapper::YawSpotLight, 2.0f * quarter, {0.0f, -1.0f, 0.0f}, 4},
	};
	for (const Case& testCase : cases)
	{
		SCOPED_TRACE(testing::Message() << testCase.myAngle << " about row " << testCase.myFixedRow);
		Facade().AddSpotLight();
		Facade().MoveSelectedVector(1.0f, 2.0f, 3.0f);
		(Facade().*testCase.myTurn)(testCase.myAngle);
		const Matrix44<float>& orientation = Facade().GetSpotLights().Last().myOrientation;
		ExpectNear(orientation.GetForward(), testCase.myForward);
		ExpectNear(orientation.GetPosition(), {1.0f, 12.0f, 13.0f}, 0.0f);
		const float* fixed = orientation.myMatrix + testCase.myFixedRow;
		ExpectNearAll({fixed[0], fixed[1], fixed[2]},
		              testCase.myFixedRow == 0 ? std::vector<float>{-1, 0, 0} : std::vector<float>{0, 0, 1});
	}
}

// Nodes laid out across the view (so each can be clicked) and joined in a chain.
// What an outliner and a properties panel do: select by kind and index (the mode follows),
// put the selection at a position, point a spot light along a direction.
TEST_F(EditingTest, SelectingByKindAndIndexAndPlacingTheSelection)
{
	Facade().AddPointLight();
	Facade().AddPointLight();
	Facade().AddSpotLight();
	Facade().AddSpotLight();
	Facade().AddPathNode();
	ASSERT_TRUE(Facade().Select(LumoraWrapper::ObjectKind::SPOT_LIGHT, 0));
	EXPECT_EQ(Selection(), (std::array{-1, 0, -1, -1}));
	EXPECT_FALSE(Facade().Select(LumoraWrapper::ObjectKind::POINT_LIGHT, 2));
	EXPECT_FALSE(Facade().Select(LumoraWrapper::ObjectKind::DECAL, 0));
	EXPECT_EQ(Selection(), (std::array{-1, 0, -1, -1})) << "a refused selection changes nothing";

	ASSERT_TRUE(Facade().Select(LumoraWrapper::ObjectKind::PATH_NODE, 0));
	EXPECT_EQ(std::tuple(Facade().GetMode(), Selection()), std::tuple(NODE_MODE, std::array{-1, -1, 0, -1}));
	EXPECT_TRUE(Facade().SetSelectedPosition({1.0f, 2.0f, 3.0f}));
	ExpectNear(Facade().GetNodes()[0].GetPosition(), {1.0f, 2.0f, 3.0f}, 0.0f);
	EXPECT_FALSE(Facade().SetSelectedDirection({1.0f, 0.0f, 0.0f})) << "a node has no direction";

	ASSERT_TRUE(Facade().Select(LumoraWrapper::ObjectKind::POINT_LIGHT, 1));
	EXPECT_EQ(Facade().GetMode(), LIGHT_MODE);
	EXPECT_TRUE(Facade().SetSelectedPosition({-4.0f, 0.5f, 6.0f}));
	ExpectNear(Facade().GetPointLights()[1].myPosition, {-4.0f, 0.5f, 6.0f}, 0.0f);
	ExpectNear(Facade().GetPointLights()[0].myPosition, {0.0f, 10.0f, 10.0f}, 0.0f);
	EXPECT_FALSE(Facade().SetSelectedPosition({std::nanf(""), 0.0f, 0.0f}));

	// Pointed straight up, a spot light has a new light's rows; aslant, unit rows with
	// forward = right x up; its position stays.
	ASSERT_TRUE(Facade().Select(LumoraWrapper::ObjectKind::SPOT_LIGHT, 1));
	const Matrix44<float>& orientation = Facade().GetSpotLights()[1].myOrientation;
	Facade().MoveSelectedVector(1.0f, 0.0f, 0.0f);
	for (const Vector3<float>& direction :
	     {Vector3<float>(0.0f, 3.0f, 0.0f), Vector3<float>(2.0f, -2.0f, 1.0f)})
	{
		ASSERT_TRUE(Facade().SetSelectedDirection(direction));
		const Vector3<float> forward = direction * (1.0f / direction.Length());
		ExpectNear(orientation.GetForward(), forward);
		ExpectNear(orientation.GetRight().Cross(orientation.GetUp()), forward);
		EXPECT_NEAR(orientation.GetRight().Length() * orientation.GetUp().Length(), 1.0f, 1e-5f);
		ExpectNear(orientation.GetPosition(), {1.0f, 10.0f, 10.0f}, 0.0f);
		if (direction.y == 3.0f)
		{
			ExpectNearAll(Values(Facade().GetSpotLights()[1]),
			              {1, 0.9f, 0.7f, 1, 1, 1, 1, -1, 0, 0, 0, 0, 0, 1, 0, 0, 1, 0, 0, 1, 10, 10, 1});
		}
	}
	EXPECT_FALSE(Facade().SetSelectedDirection({0.0f, 0.0f, 0.0f}));
	ASSERT_TRUE(Facade().Select(LumoraWrapper::ObjectKind::SPOT_LIGHT, -1));
	EXPECT_EQ(Selection(), (std::array{-1, -1, -1, -1}));
	EXPECT_FALSE(Facade().SetSelectedPosition({0.0f, 0.0f, 0.0f})) << "nothing is selected";
}

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
};

TEST_F(PathGraphTest, AddedNodesFormAChainAndOnlyTheLastCanBeRemoved)
{
	using Pairs = std::vector<std::pair<int, int>>;
	Facade().SetIsLightMode(NODE_MODE);
	for (int index = 0; index < 3; ++index)
	{
		AddNodeAt(Spot(index));
	}
	// IDs count from 1, and each new node is joined to the one before.
	const GrowingArray<AI::NGNode>& nodes = Facade().GetNodes();
	EXPECT_EQ(EdgeIDs(Facade()), (Pairs{{1, 2}, {2, 3}}));
	EXPECT_EQ(EdgeCounts(nodes), (std::vector{1, 2, 1}));
	EXPECT_EQ(GraphProblems(Facade()), "");
	// The distance is taken when the edge is made (the node was moved only afterwards)
	// and follows the nodes once the graph is drawn.
	Facade().Update(16.0f);
	Facade().Render();
	EXPECT_NEAR(Facade().GetEdges()[0].GetDistance(), 2.5f, ourTolerance);

	// A node in the middle stays, selected.
	ClickAt(Spot(1));
	ASSERT_EQ(Facade().GetSelectedNode(), 1);
	Facade().RemoveSelectedNode();
	EXPECT_EQ(std::tuple(nodes.Count(), Facade().GetEdges().Count(), Facade().GetSelectedNode()),
	          std::tuple(3, 2, 1));

	// The last goes with its edge; its ID is not handed out again.
	ClickAt(Spot(2));
	ASSERT_EQ(Facade().GetSelectedNode(), 2);
	Facade().RemoveSelectedNode();
	EXPECT_EQ(EdgeIDs(Facade()), (Pairs{{1, 2}}));
	EXPECT_EQ(EdgeCounts(nodes), (std::vector{1, 1}));
	EXPECT_EQ(Facade().GetSelectedNode(), -1);
	AddNodeAt(Spot(3));
	EXPECT_EQ(EdgeIDs(Facade()), (Pairs{{1, 2}, {2, 4}}));
	EXPECT_EQ(GraphProblems(Facade()), "");
}

// The graph's arrays never grow (that would move the elements the references point
// at): the node past the limit is refused and said so in the log.
TEST_F(PathGraphTest, NodesStopAtTheArrayLimit)
{
	const int limit = LumoraWrapper::ourArraySize;
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
			fs::copy_file(aDataPath / "XML/levels/sample_small" / file, level / file);
		}
		// Nodes 1 to 4 from x = -3 to 3, two apart; the edges (4, 1), (1, 2), (2, 3), (3, 4).
		std::string nodes;
		std::string edges;
		for (int index = 0; index < 4; ++index)
		{
			nodes += "<node id=\"" + std::to_string(index + 1) + "\"><position x=\"" +
			         std::to_string(2 * index - 3) + "\" y=\"10\" z=\"12\" /></node>";
			edges += "<edge><connections firstID=\"" + std::to_string((index + 3) % 4 + 1) +
			         "\" secondID=\"" + std::to_string(index + 1) + "\" /><distance value=\"2\" /></edge>";
		}
		TestSupport::WriteWholeFile((level / "nodegraph.xml").string(),
		                            "<root><node-graph><nodes number-of-nodes=\"4\">" + nodes +
		                                "</nodes><edges number-of-edges=\"4\">" + edges +
		                                "</edges></node-graph></root>");
	}
};

TEST_F(LoadedRingTest, AddingAfterAFullNodeAndRemovingItKeepTheGraphSound)
{
	Facade().ParseLevel(u"ring");
	Facade().SetIsLightMode(NODE_MODE);
	const GrowingArray<AI::NGNode>& nodes = Facade().GetNodes();
	ASSERT_EQ(std::tuple(nodes.Count(), Facade().GetEdges().Count()), std::tuple(4, 4));

	// Node 4 holds two edges: the new node is added without one.
	Facade().AddPathNode();
	EXPECT_EQ(std::tuple(nodes.Count(), nodes.Last().GetID(), Facade().GetEdges().Count()),
	          std::tuple(5, 5, 4));
	EXPECT_THAT(LogText(), testing::HasSubstr("Node 4 already has two edges; node 5 added without an edge"));
	Facade().RemoveSelectedNode();
	ASSERT_EQ(std::tuple(nodes.Count(), Facade().GetEdges().Count()), std::tuple(4, 4));

	// Node 4 goes with both its edges, (4, 1) at the front of the array and (3, 4) at its end.
	ClickAt(nodes[3].GetPosition());
	ASSERT_EQ(Facade().GetSelectedNode(), 3);
	Facade().RemoveSelectedNode();
	std::vector<std::pair<int, int>> edges = EdgeIDs(Facade());
	std::sort(edges.begin(), edges.end());
	EXPECT_EQ(edges, (std::vector<std::pair<int, int>>{{1, 2}, {2, 3}}));
	EXPECT_EQ(EdgeCounts(nodes), (std::vector{1, 2, 1}));
	EXPECT_EQ(GraphProblems(Facade()), "");

	// The chain goes on from node 3, and the graph still draws.
	Facade().AddPathNode();
	EXPECT_EQ(EdgeCounts(nodes)[2], 2);
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
	// Position, direction, size, depth and colour; the type's textures.
	ExpectNearAll({decal.myPosition.x, decal.myPosition.y, decal.myPosition.z, decal.myNorm.x, decal.myNorm.y,
	               decal.myNorm.z, decal.mySize, decal.myDepth, decal.myColor.x, decal.myColor.y,
	               decal.myColor.z, decal.myColor.w},
	              {0, 10, 10, 0, 0, -1, 1, 0.3f, 1, 1, 1, 1});
	EXPECT_EQ(std::tuple(decal.myTypeId, decal.myTexture, decal.myNormalTexture),
	          std::tuple(std::string("brick"), brick.myTexture, brick.myNormalTexture));
	EXPECT_EQ(Selection(), (std::array{-1, -1, -1, 0}));
	// Another type by name; an unknown name keeps the type and says so.
	const auto other = std::find_if(Facade().GetDecalTypes().begin(), Facade().GetDecalTypes().end(),
	                                [](const auto& aType) { return aType.first != "brick"; });
	ASSERT_NE(other, Facade().GetDecalTypes().end());
	Facade().ChangeDecalType(Lumora::ToWide(other->first));
	EXPECT_EQ(std::tie(decal.myTypeId, decal.myTexture), std::tie(other->first, other->second.myTexture));
	Facade().ChangeDecalType(u"no-such-type");
	EXPECT_EQ(decal.myTypeId, other->first);
	EXPECT_THAT(LogText(), testing::HasSubstr("No decal type \"no-such-type\""));

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
	ExpectNearAll(
	    {turned.mySize, turned.myDepth, turned.myPosition.x, turned.myPosition.y, turned.myPosition.z},
	    {3, -1, 0, 10, 12});

	// The copy is the same in every value, and nothing stays selected.
	Facade().CopyDecal();
	ASSERT_EQ(Facade().GetDecals().Count(), 3);
	const Zeph::DecalData& copy = Facade().GetDecals().Last();
	EXPECT_EQ(std::tuple(copy.myPosition.z, copy.myNorm.x, copy.myNorm.y, copy.myColor.x, copy.mySize,
	                     copy.myDepth, copy.myTypeId, copy.myTexture),
	          std::tuple(turned.myPosition.z, turned.myNorm.x, turned.myNorm.y, turned.myColor.x,
	                     turned.mySize, turned.myDepth, turned.myTypeId, turned.myTexture));
	EXPECT_EQ(Facade().GetSelectedDecal(), -1);

	// Selected by index and pointed along a direction (kept at the decal's own length, 1 here).
	ASSERT_TRUE(Facade().Select(LumoraWrapper::ObjectKind::DECAL, 0));
	EXPECT_EQ(Facade().GetMode(), DECAL_MODE);
	const float length = Facade().GetDecals()[0].myNorm.Length();
	ASSERT_TRUE(Facade().SetSelectedDirection({0.0f, -3.0f, 4.0f}));
	ExpectNear(Facade().GetDecals()[0].myNorm, Vector3<float>(0.0f, -0.6f, 0.8f) * length);
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
	ASSERT_EQ(Facade().GetDecalTypes().count("hazard"), 1u);
	Facade().AddPointLight();
	Facade().AddDecal();
	EXPECT_EQ(Facade().GetDecals().Count(), 0);
	EXPECT_EQ(Selection(), (std::array{0, -1, -1, -1}));
	EXPECT_THAT(LogText(), testing::HasSubstr("No decal type \"brick\""));
}
// A light to place: a spot light or a point light, and where.
struct Placed
{
	bool mySpotFlag;
	Vector3<float> myPosition;
};

class PickingTest : public FacadeTest
{
protected:
	// Adds the lights in order (point and spot lights are indexed separately) and
	// leaves nothing selected.
	void PlaceLights(const std::vector<Placed>& someLights)
	{
		for (const Placed& light : someLights)
		{
			if (light.mySpotFlag)
			{
				Facade().AddSpotLight();
			}
			else
			{
				Facade().AddPointLight();
			}
			const Vector3<float> offset =
			    light.myPosition - (light.mySpotFlag
			                            ? Facade().GetSpotLights().Last().myOrientation.GetPosition()
			                            : Facade().GetPointLights().Last().myPosition);
			Facade().MoveSelectedVector(offset.x, offset.y, offset.z);
		}
		Facade().SetIsLightMode(LIGHT_MODE);
	}
};

// Picking must agree with what the renderer draws: clicking the pixel at which the
// camera's view and projection put a light selects that light, whichever way the
// camera has been turned and moved.
TEST_F(PickingTest, ClickOnTheDrawnPixelSelectsThatLight)
{
	Facade().YawCamera(0.4f);
	Facade().PitchCamera(-0.25f);
	Facade().Strafe(1.5f);
	Facade().Zoom(-2.0f);
	const Zeph::CameraInstance& camera = *Facade().GetCameraInstance();
	const Matrix44<float>& orientation = camera.GetActualOrientation();
	// Spread across the view (left and right, above and below the centre), far enough
	// apart that no line through one box passes through another.
	const auto inView = [&](bool aSpotFlag, float aRight, float anUp, float aForward) {
		return Placed{aSpotFlag, camera.GetPosition() + orientation.GetRight() * aRight +
		                             orientation.GetUp() * anUp + orientation.GetForward() * aForward};
	};
	const std::vector<Placed> lights = {inView(false, -3.0f, 1.5f, 12.0f), inView(true, 2.5f, -1.0f, 9.0f),
	                                    inView(false, 4.0f, 2.0f, 15.0f), inView(true, -2.0f, -2.0f, 8.0f)};
	PlaceLights(lights);
	const std::array<int, 4> expected[] = {
	    {0, -1, -1, -1}, {-1, 0, -1, -1}, {1, -1, -1, -1}, {-1, 1, -1, -1}};
	for (size_t light = 0; light < lights.size(); ++light)
	{
		ClickAt(lights[light].myPosition);
		EXPECT_EQ(Selection(), expected[light]) << "light " << light;
	}
	// The top-left corner sees none of them, and a miss clears the selection.
	Facade().DoIntersection(0.0f, 0.0f);
	EXPECT_EQ(Selection(), (std::array{-1, -1, -1, -1}));
}

TEST_F(PickingTest, OnlyTheModesCandidatesArePicked)
{
	PlaceLights({{false, Vector3<float>(0.0f, 10.0f, 6.0f)}, {true, Vector3<float>(0.0f, 10.0f, 4.0f)}});
	Facade().SetIsLightMode(NODE_MODE);
	Facade().AddPathNode(); // at (0, 10, 2), on the centre line
	Facade().AddPointLight();
	ClickCentre();
	EXPECT_EQ(Selection(), (std::array{-1, -1, 0, -1}));
	// A click on empty space clears every kind, including ones the mode does not pick.
	Facade().AddPointLight();
	Facade().DoIntersection(5.0f, 5.0f);
	EXPECT_EQ(Selection(), (std::array{-1, -1, -1, -1}));
	// Decal mode picks no light, and a mode outside the three nothing at all.
	for (const int mode : {static_cast<int>(DECAL_MODE), 7})
	{
		Facade().SetIsLightMode(mode);
		ClickCentre();
		EXPECT_EQ(Selection(), (std::array{-1, -1, -1, -1})) << mode;
	}
	Facade().SetIsLightMode(LIGHT_MODE);
	ClickCentre();
	EXPECT_EQ(Selection(), (std::array{-1, 0, -1, -1}));
}

struct NearestCase
{
	const char* myName;
	std::vector<Placed> myLights;
	std::array<int, 4> mySelection;
};

void PrintTo(const NearestCase& aCase, std::ostream* anOut)
{
	*anOut << aCase.myName;
}

class NearestLightTest : public PickingTest, public testing::WithParamInterface<NearestCase>
{
};

// A click at the centre of the view picks along the line through the camera (+z): the nearest
// light, ties to the lower index and to the point light, the box round the camera and anything
// past the far plane passed over, behind the camera counting as on the line.
TEST_P(NearestLightTest, CentreClickSelectsTheNearestLightOnTheLine)
{
	PlaceLights(GetParam().myLights);
	ClickCentre();
	EXPECT_EQ(Selection(), GetParam().mySelection);
}

Placed Ahead(bool aSpotFlag, float aDistance)
{
	return Placed{aSpotFlag, Vector3<float>(0.0f, 10.0f, aDistance)};
}

INSTANTIATE_TEST_SUITE_P(
    Cases, NearestLightTest,
    testing::Values(
        NearestCase{"SpotNearer", {Ahead(false, 5), Ahead(true, 3)}, {-1, 0, -1, -1}},
        NearestCase{"PointNearer", {Ahead(true, 5), Ahead(false, 3)}, {0, -1, -1, -1}},
        NearestCase{"TieToTheLowerIndex", {Ahead(false, 4), Ahead(false, 4)}, {0, -1, -1, -1}},
        NearestCase{"TieToThePointLight", {Ahead(true, 4), Ahead(false, 4)}, {0, -1, -1, -1}},
        NearestCase{"NearestOfThree", {Ahead(false, 9), Ahead(false, 2), Ahead(false, 6)}, {1, -1, -1, -1}},
        NearestCase{"BoxRoundTheCamera", {Ahead(false, 0.1f), Ahead(false, 7)}, {1, -1, -1, -1}},
        NearestCase{"PastTheFarPlane", {Ahead(false, 1000.5f)}, {-1, -1, -1, -1}},
        NearestCase{"InsideTheFarPlane", {Ahead(false, 999.0f)}, {0, -1, -1, -1}},
        NearestCase{"BehindAndNearest", {Ahead(false, 5), Ahead(false, -3)}, {1, -1, -1, -1}},
        NearestCase{"OffTheLine", {{false, Vector3<float>(1.0f, 10.0f, 5.0f)}}, {-1, -1, -1, -1}}),
    [](const testing::TestParamInfo<NearestCase>& anInfo) { return std::string(anInfo.param.myName); });

// Every light a click would hit, nearest first, for a front end that cycles through lights
// behind each other: the first is what the click selects; lights off the line are not listed.
TEST_F(PickingTest, EveryLightUnderTheClickIsListedNearestFirst)
{
	PlaceLights(
	    {Ahead(false, 9), Ahead(true, 3), Ahead(false, 6), {false, Vector3<float>(1.0f, 10.0f, 5.0f)}});
	const std::vector<LumoraWrapper::PickHit> hits = Facade().PickAll(0.5f * ourWidth, 0.5f * ourHeight);
	ASSERT_EQ(hits.size(), 3u);
	EXPECT_EQ(hits[0].myKind, LumoraWrapper::ObjectKind::SPOT_LIGHT);
	EXPECT_EQ(hits[0].myIndex, 0);
	EXPECT_EQ(hits[1].myKind, LumoraWrapper::ObjectKind::POINT_LIGHT);
	EXPECT_EQ(hits[1].myIndex, 1);
	EXPECT_EQ(hits[2].myIndex, 0);
	EXPECT_LT(hits[0].myDistance, hits[1].myDistance);
	EXPECT_LT(hits[1].myDistance, hits[2].myDistance);
	ClickCentre();
	EXPECT_EQ(Selection(), (std::array{-1, 0, -1, -1}));
	EXPECT_TRUE(Facade().PickAll(0.0f, 0.0f).empty());
}

// The queries report the stored values of the selection, whatever the mode, and leave the
// caller's record alone when nothing of their kind is selected.
TEST_F(PickingTest, QueriesReportTheSelectionOrLeaveTheRecordAlone)
{
	Lumora::PointLightStruct point;
	point.falloff = -7.0f;
	Lumora::SpotLightStruct spot;
	spot.angles = {-4.0f, -5.0f};
	EXPECT_FALSE(Facade().TryGetCurrentPointLight(point));
	EXPECT_FALSE(Facade().TryGetCurrentSpotLight(spot));
	EXPECT_EQ(std::tuple(point.falloff, spot.angles), std::tuple(-7.0f, std::array<float, 2>{-4.0f, -5.0f}));

	Facade().AddPointLight();
	Facade().ChangeColorPointLight(0.25f, 0.5f, 0.75f);
	Facade().ChangeFalloffPointLight(3.0f);
	ASSERT_TRUE(Facade().TryGetCurrentPointLight(point));
	EXPECT_EQ(std::tuple(point.pos, point.col, point.falloff),
	          std::tuple(std::array<float, 3>{0.0f, 10.0f, 10.0f},
	                     std::array<float, 4>{0.25f, 0.5f, 0.75f, 1.0f}, 3.0f));
	Facade().AddSpotLight();
	Facade().MoveSelectedVector(1.0f, 2.0f, 3.0f);
	Facade().ChangeAnglesSpotLight(0.8f, 0.6f);
	Facade().ChangeFalloffSpotLight(2.5f);
	ASSERT_TRUE(Facade().TryGetCurrentSpotLight(spot));
	EXPECT_EQ(std::tuple(spot.pos, spot.direction, spot.angles, spot.falloff),
	          std::tuple(std::array<float, 3>{1.0f, 12.0f, 13.0f}, std::array<float, 3>{0.0f, 1.0f, 0.0f},
	                     std::array<float, 2>{0.8f, 0.6f}, 2.5f));
	// The queries do not look at the mode.
	Facade().SetIsLightMode(NODE_MODE);
	Facade().AddSpotLight();
	EXPECT_FALSE(Facade().TryGetCurrentPointLight(point));
	ASSERT_TRUE(Facade().TryGetCurrentSpotLight(spot));
	EXPECT_EQ(spot.pos, (std::array<float, 3>{0.0f, 10.0f, 10.0f}));
}

// The decal's pick box is plus and minus its size across and 0.5 along z, whatever its direction.
TEST_F(DecalEditingTest, ThePickBoxIgnoresTheDirection)
{
	Facade().SetIsLightMode(DECAL_MODE);
	Facade().AddDecal(); // at (0, 10, 10), size 1
	Facade().ChangeDecalSize(2.0f);
	Facade().YawSpotLight(1.0f);
	Facade().PitchSpotLight(0.5f);
	const std::pair<Vector3<float>, int> clicks[] = {{{1.9f, 11.9f, 10.0f}, 0},
	                                                 {{-1.9f, 8.1f, 10.0f}, 0},
	                                                 {{2.3f, 10.0f, 10.0f}, -1},
	                                                 {{0.0f, 7.6f, 10.0f}, -1},
	                                                 {{1.5f, 10.0f, 10.45f}, 0}};
	for (const auto& [target, selected] : clicks)
	{
		ClickAt(target);
		EXPECT_EQ(Facade().GetSelectedDecal(), selected) << target.x << " " << target.y << " " << target.z;
	}
}

} // namespace
