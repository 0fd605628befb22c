// Picking through the facade: which object a click selects, and what the selection
// queries report. The camera starts at (0, 10, 0) looking along +z; lights are placed
// by adding them (10 in front of the camera) and moving them.
#include <cmath>
#include <ostream>
#include <vector>

#include "editor/FacadeFixture.h"

namespace
{
using Lumora::DECAL_MODE;
using Lumora::LIGHT_MODE;
using Lumora::NODE_MODE;

enum class Kind
{
	Point,
	Spot,
};

struct Placed
{
	Kind myKind;
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
			if (light.myKind == Kind::Point)
			{
				Facade().AddPointLight();
				MoveSelectedTo(Facade().GetPointLights().Last().myPosition, light.myPosition);
			}
			else
			{
				Facade().AddSpotLight();
				MoveSelectedTo(Facade().GetSpotLights().Last().myOrientation.GetPosition(), light.myPosition);
			}
		}
		Facade().SetIsLightMode(LIGHT_MODE);
	}

	void MoveSelectedTo(const Vector3<float>& aFrom, const Vector3<float>& aTo)
	{
		const Vector3<float> offset = aTo - aFrom;
		Facade().MoveSelectedVector(offset.x, offset.y, offset.z);
	}
};

struct NearestCase
{
	const char* myName;
	std::vector<Placed> myLights;
	int myPoint;
	int mySpot;
};

// Names the case in test output instead of dumping its bytes.
void PrintTo(const NearestCase& aCase, std::ostream* anOut)
{
	*anOut << aCase.myName;
}

class NearestLightTest : public PickingTest, public testing::WithParamInterface<NearestCase>
{
};

Vector3<float> Ahead(float aDistance)
{
	return Vector3<float>(0.0f, 10.0f, aDistance);
}

// A click at the centre of the view: the line along +z through the camera.
TEST_P(NearestLightTest, CentreClickSelectsTheNearestLightOnTheLine)
{
	const NearestCase& testCase = GetParam();
	PlaceLights(testCase.myLights);
	ClickCentre();
	EXPECT_EQ(Selection(), (std::array{testCase.myPoint, testCase.mySpot, -1, -1}));
}

INSTANTIATE_TEST_SUITE_P(
    Cases, NearestLightTest,
    testing::Values(
        NearestCase{"SpotNearerThanPoint", {{Kind::Point, Ahead(5)}, {Kind::Spot, Ahead(3)}}, -1, 0},
        NearestCase{"PointNearerThanSpot", {{Kind::Spot, Ahead(5)}, {Kind::Point, Ahead(3)}}, 0, -1},
        NearestCase{"TieGoesToTheLowerIndex", {{Kind::Point, Ahead(4)}, {Kind::Point, Ahead(4)}}, 0, -1},
        NearestCase{"TieGoesToThePointLight", {{Kind::Spot, Ahead(4)}, {Kind::Point, Ahead(4)}}, 0, -1},
        NearestCase{"NearestOfThree",
                    {{Kind::Point, Ahead(9)}, {Kind::Point, Ahead(2)}, {Kind::Point, Ahead(6)}},
                    1,
                    -1},
        NearestCase{"SpotBeatsNearerPointOnlyWhenNearer",
                    {{Kind::Spot, Ahead(8)}, {Kind::Point, Ahead(6)}, {Kind::Spot, Ahead(7)}},
                    0,
                    -1},
        NearestCase{
            "BoxAroundTheCameraSkipped", {{Kind::Point, Ahead(0.1f)}, {Kind::Point, Ahead(7)}}, 1, -1},
        NearestCase{"BeyondTheFarPlane", {{Kind::Point, Ahead(1000.5f)}}, -1, -1},
        NearestCase{"InsideTheFarPlane", {{Kind::Point, Ahead(999.0f)}}, 0, -1},
        // The box test is against the whole line through the click: behind counts too.
        NearestCase{"BehindTheCameraAndNearest", {{Kind::Point, Ahead(5)}, {Kind::Point, Ahead(-3)}}, 1, -1},
        NearestCase{"OffTheLine", {{Kind::Point, Vector3<float>(1.0f, 10.0f, 5.0f)}}, -1, -1}),
    [](const testing::TestParamInfo<NearestCase>& anInfo) { return std::string(anInfo.param.myName); });
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
	const auto inView = [&](float aRight, float anUp, float aForward) {
		return camera.GetPosition() + orientation.GetRight() * aRight + orientation.GetUp() * anUp +
		       orientation.GetForward() * aForward;
	};
	const std::vector<Placed> lights = {{Kind::Point, inView(-3.0f, 1.5f, 12.0f)},
	                                    {Kind::Spot, inView(2.5f, -1.0f, 9.0f)},
	                                    {Kind::Point, inView(4.0f, 2.0f, 15.0f)},
	                                    {Kind::Spot, inView(-2.0f, -2.0f, 8.0f)}};
	PlaceLights(lights);
	int pointIndex = 0;
	int spotIndex = 0;
	for (const Placed& light : lights)
	{
		ClickAt(light.myPosition);
		const bool pointFlag = light.myKind == Kind::Point;
		EXPECT_EQ(Selection(),
		          (std::array{pointFlag ? pointIndex++ : -1, pointFlag ? -1 : spotIndex++, -1, -1}));
	}
	// The top-left corner sees none of them, and a miss clears the selection.
	Facade().DoIntersection(0.0f, 0.0f);
	EXPECT_EQ(Selection(), (std::array{-1, -1, -1, -1}));
}

TEST_F(PickingTest, OnlyTheModesCandidatesArePicked)
{
	PlaceLights({{Kind::Point, Ahead(6)}, {Kind::Spot, Ahead(4)}});

	Facade().SetIsLightMode(NODE_MODE);
	ClickCentre();
	EXPECT_EQ(Selection(), (std::array{-1, -1, -1, -1}));
	Facade().AddPathNode(); // at (0, 10, 2), on the centre line
	Facade().AddPointLight();
	ASSERT_EQ(Facade().GetSelectedNode(), 0);
	ClickCentre();
	EXPECT_EQ(Selection(), (std::array{-1, -1, 0, -1}));
	// A click on empty space clears every kind, including ones the mode does not pick.
	Facade().AddPointLight();
	Facade().DoIntersection(5.0f, 5.0f);
	EXPECT_EQ(Selection(), (std::array{-1, -1, -1, -1}));

	Facade().SetIsLightMode(DECAL_MODE);
	ClickCentre();
	EXPECT_EQ(Selection(), (std::array{-1, -1, -1, -1}));

	// A mode outside the three picks nothing at all.
	Facade().SetIsLightMode(7);
	ClickCentre();
	EXPECT_EQ(Selection(), (std::array{-1, -1, -1, -1}));

	Facade().SetIsLightMode(LIGHT_MODE);
	ClickCentre();
	EXPECT_EQ(Selection(), (std::array{-1, 0, -1, -1}));
}

TEST_F(PickingTest, QueriesReportTheSelectionOrLeaveTheRecordAlone)
{
	Lumora::PointLightStruct point;
	point.falloff = -7.0f;
	point.pos = {-1.0f, -2.0f, -3.0f};
	Lumora::SpotLightStruct spot;
	spot.angles = {-4.0f, -5.0f};
	spot.direction = {-6.0f, -7.0f, -8.0f};
	Lumora::DecalStruct decal;
	decal.size = -9.0f;
	EXPECT_FALSE(Facade().TryGetCurrentPointLight(point));
	EXPECT_FALSE(Facade().TryGetCurrentSpotLight(spot));
	EXPECT_FALSE(Facade().TryGetCurrentDecal(decal));
	EXPECT_EQ(point.falloff, -7.0f);
	EXPECT_EQ(point.pos, (std::array<float, 3>{-1.0f, -2.0f, -3.0f}));
	EXPECT_EQ(spot.angles, (std::array<float, 2>{-4.0f, -5.0f}));
	EXPECT_EQ(spot.direction, (std::array<float, 3>{-6.0f, -7.0f, -8.0f}));
	EXPECT_EQ(decal.size, -9.0f);
	EXPECT_FALSE(decal.decalID.has_value());

	// Without a click: the add selects, and the query reports the stored values.
	Facade().AddPointLight();
	Facade().ChangeColorPointLight(0.25f, 0.5f, 0.75f);
	Facade().ChangeFalloffPointLight(3.0f);
	ASSERT_TRUE(Facade().TryGetCurrentPointLight(point));
	EXPECT_EQ(point.pos, (std::array<float, 3>{0.0f, 10.0f, 10.0f}));
	EXPECT_EQ(point.col, (std::array<float, 4>{0.25f, 0.5f, 0.75f, 1.0f}));
	EXPECT_EQ(point.falloff, 3.0f);

	Facade().AddSpotLight();
	Facade().MoveSelectedVector(1.0f, 2.0f, 3.0f);
	Facade().ChangeAnglesSpotLight(0.8f, 0.6f);
	Facade().ChangeFalloffSpotLight(2.5f);
	ASSERT_TRUE(Facade().TryGetCurrentSpotLight(spot));
	EXPECT_EQ(spot.pos, (std::array<float, 3>{1.0f, 12.0f, 13.0f}));
	EXPECT_EQ(spot.col, (std::array<float, 4>{1.0f, 1.0f, 1.0f, 1.0f}));
	EXPECT_EQ(spot.direction, (std::array<float, 3>{0.0f, 1.0f, 0.0f}));
	EXPECT_EQ(spot.angles, (std::array<float, 2>{0.8f, 0.6f}));
	EXPECT_EQ(spot.falloff, 2.5f);
	// The queries do not look at the mode.
	Facade().SetIsLightMode(NODE_MODE);
	Facade().AddSpotLight();
	EXPECT_FALSE(Facade().TryGetCurrentPointLight(point));
	ASSERT_TRUE(Facade().TryGetCurrentSpotLight(spot));
	EXPECT_EQ(spot.pos, (std::array<float, 3>{0.0f, 10.0f, 10.0f}));
}

using DecalPickingTest = DecalFacadeTest;

// The decal's box is plus and minus size across and 0.5 along z, whatever its direction.
TEST_F(DecalPickingTest, DecalBoxIgnoresTheDirection)
{
	Facade().SetIsLightMode(DECAL_MODE);
	Facade().AddDecal(); // at (0, 10, 10), size 1
	Facade().ChangeDecalSize(2.0f);
	Facade().YawSpotLight(1.0f);
	Facade().PitchSpotLight(0.5f);
	struct Case
	{
		Vector3<float> myTarget;
		bool myHitFlag;
	};
	const Case cases[] = {
	    {{1.9f, 11.9f, 10.0f}, true}, {{-1.9f, 8.1f, 10.0f}, true},  {{2.3f, 10.0f, 10.0f}, false},
	    {{0.0f, 7.6f, 10.0f}, false}, {{1.5f, 10.0f, 10.45f}, true},
	};
	for (const Case& testCase : cases)
	{
		SCOPED_TRACE(testing::Message()
		             << testCase.myTarget.x << " " << testCase.myTarget.y << " " << testCase.myTarget.z);
		// The line from the camera through the target crosses the box's depth near z = 10.
		ClickAt(testCase.myTarget);
		EXPECT_EQ(Facade().GetSelectedDecal(), testCase.myHitFlag ? 0 : -1);
	}
}
} // namespace
