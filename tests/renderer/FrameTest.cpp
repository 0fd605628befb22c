// The deferred frame on a headless engine: lights measured on the lit image (the
// light's contribution is the difference from the same frame without it), the shadow
// quality rule and the empty frame. The settings files reach the effect through the
// setters the editor calls, in every golden frame.
#include <algorithm>
#include <cmath>
#include <gtest/gtest.h>
#include <string>
#include <vector>

#include "FrameFixture.h"
#include "engine/Engine.h"
#include "model/Model.h"
#include "renderer/RenderTargetHelper.h"

using namespace FrameTesting;
using testing::Contains;
using testing::Not;

TEST_F(FrameTest, PointLightReachesItsFalloffAndSpotLightItsOuterConeOnly)
{
	LUMORA_RETURN_UNLESS(Start());
	Place("data/models/room_small.dae", {0.0f, 0.0f, 0.0f});
	Look({0.0f, 2.9f, 0.0f}, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 1.0f});
	Render("light-off");
	const std::vector<float> unlit = myLit;
	// What the light adds on the floor at aRadius from the light's foot.
	const auto added = [&](float aRadius, float anAngle) {
		const Pixel pixel = Project({aRadius * std::cos(anAngle), 0.0f, aRadius * std::sin(anAngle)});
		return Luminance(myLit, pixel) - Luminance(unlit, pixel);
	};

	myPointLights.push_back(
	    {.myFalloff = 1.0f, .myPosition = {0.0f, 0.5f, 0.0f}, .myColor = {5.0f, 5.0f, 5.0f, 1.0f}});
	Render("point-light-on");
	// Floor points at horizontal distance r from the light's foot: distance to the
	// light sqrt(r^2 + 0.25), so 0.748 is 0.9 x falloff and 1.09 is 1.2 x falloff.
	// Directions toward the picture's sides (it is wider than high).
	for (float angle : {0.0f, 0.35f, 2.8f, 3.3f})
	{
		const float under = added(0.0f, angle);
		const float atNineTenths = added(0.748f, angle);
		EXPECT_GT(under, 0.02f) << "under the light";
		EXPECT_GT(under, atNineTenths) << "angle " << angle;
		EXPECT_GT(atNineTenths, 0.0f) << "angle " << angle;
		EXPECT_NEAR(added(1.2f, angle), 0.0f, 1e-3f) << "beyond 1.2 x falloff, angle " << angle;
		EXPECT_NEAR(added(1.8f, angle), 0.0f, 1e-3f) << "far beyond, angle " << angle;
	}

	// From 2.5 above the floor, outer cosine 0.8: the cone meets the floor at radius
	// 2.5 x tan(acos 0.8) = 1.875; inner cosine 0.95: full strength within 0.82.
	myPointLights.clear();
	mySpotLights.push_back(SpotDown({0.0f, 2.5f, 0.0f}, 4.0f, 0.95f, 0.8f));
	Render("spot-light-on");
	for (float angle : {0.0f, 0.3f, 2.9f, 3.4f})
	{
		EXPECT_GT(added(0.3f, angle), 0.02f) << "inside the inner cone, angle " << angle;
		EXPECT_GT(added(0.3f, angle), added(1.5f, angle)) << "the cone fades toward its edge";
		EXPECT_GT(added(1.5f, angle), 0.0f) << "the light's volume holds its outer cone, angle " << angle;
		EXPECT_NEAR(added(1.95f, angle), 0.0f, 1e-3f) << "outside the outer cone, angle " << angle;
	}
}

TEST_F(FrameTest, PointLightFallsOffWithTheInverseSquareScalesWithItsColourAndEndsAtItsReach)
{
	LUMORA_RETURN_UNLESS(Start());
	Place("data/models/room_small.dae", {0.0f, 0.0f, 0.0f});
	Look({0.0f, 2.9f, 0.0f}, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 1.0f});
	Render("falloff-off");
	const std::vector<float> unlit = myLit;
	const auto added = [&](float aRadius) {
		const Pixel pixel = Project({aRadius, 0.0f, 0.0f});
		return Luminance(myLit, pixel) - Luminance(unlit, pixel);
	};
	const auto lightAt = [&](float aHeight, float aReach, float anIntensity) {
		myPointLights = {{.myFalloff = aReach,
		                  .myPosition = {0.0f, aHeight, 0.0f},
		                  .myColor = {anIntensity, anIntensity, anIntensity, 1.0f}}};
		Render("falloff-on");
	};

	// The floor under the light, lit and seen from straight above, so only the distance changes
	// between the two heights: twice as far, a quarter of the light (a reach of 20 takes the
	// window's share below 0.01 %).
	lightAt(0.5f, 20.0f, 2.0f);
	const float halfAMetre = added(0.0f);
	lightAt(1.0f, 20.0f, 2.0f);
	const float oneMetre = added(0.0f);
	ASSERT_GT(oneMetre, 0.01f);
	EXPECT_NEAR(halfAMetre / oneMetre, 4.0f, 0.04f);
	// Twice the colour, twice the light.
	lightAt(1.0f, 20.0f, 4.0f);
	EXPECT_NEAR(added(0.0f), 2.0f * oneMetre, 2e-3f * oneMetre);
	// A light almost touching the floor is bright there, not infinite: the distance is held at
	// the size of a bulb (0.1), about a hundred times the light from 1 m (the pixel's centre lies
	// a little to the side, which moves the shading's angles).
	lightAt(0.02f, 20.0f, 2.0f);
	EXPECT_TRUE(std::isfinite(added(0.0f)));
	EXPECT_GT(added(0.0f) / oneMetre, 70.0f);
	EXPECT_LT(added(0.0f) / oneMetre, 130.0f);

	// From 0.5 above the floor with a reach of 1.5: the reach meets the floor at radius
	// sqrt(1.5^2 - 0.5^2) = 1.414. Just inside it the light still adds, just outside nothing at all.
	lightAt(0.5f, 1.5f, 8.0f);
	EXPECT_GT(added(1.25f), 0.0f);
	EXPECT_GT(added(0.5f), added(1.25f));
	EXPECT_EQ(added(1.5f), 0.0f);
	EXPECT_EQ(added(1.8f), 0.0f);
}

TEST_F(FrameTest, ShadowQualityPicksTheMapAndRepairsTheSettingAndEveryPassRunsWithNothingQueued)
{
	LUMORA_RETURN_UNLESS(Start());
	struct Case
	{
		int mySetting;
		int myQuality;
		int mySize;
	};
	const Case cases[] = {{1, 1, 1024}, {2, 2, 2048}, {7, 3, 4096}, {-1, 3, 4096}, {0, 0, 8}};
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	std::vector<std::string> names;
	for (const Case& test : cases)
	{
		SCOPED_TRACE(test.mySetting);
		engine->GetSetupInfo().myShadowQuality = test.mySetting;
		ASSERT_TRUE(Renderer().Init(ourWidth, ourHeight));
		EXPECT_EQ(Renderer().GetShadowQuality(), test.myQuality);
		EXPECT_EQ(Renderer().GetShadowMapSize(), test.mySize);
		EXPECT_EQ(engine->GetSetupInfo().myShadowQuality, test.myQuality) << "the setting is rewritten";
		Renderer().SetPassTimingFlag(true);
		Render("empty");
		names.clear();
		for (const Zeph::Renderer::PassTime& pass : Renderer().GetPassTimes())
		{
			names.push_back(pass.myName);
		}
		EXPECT_EQ(std::ranges::count(names, "shadow map"), test.myQuality > 0 ? 1 : 0)
		    << "quality 0 renders no shadow map";
	}
	for (const char* pass : {"G-buffer", "decals", "lights", "SSAO", "ambient", "forward", "tone map",
	                         "bloom", "grading", "late"})
	{
		EXPECT_THAT(names, Contains(pass));
	}
	EXPECT_THAT(names, Not(Contains("shadow resolve")));
	// Nothing outlined: the outline would blend nothing over the image, and is skipped.
	EXPECT_THAT(names, Not(Contains("outline")));
	// An empty lit image is black.
	for (float value : myLit)
	{
		ASSERT_NEAR(value, 0.0f, 1e-6f);
	}

	// A crate drawn with its outline (as the editor draws a selected entity): the pass runs, and
	// the glow changes the picture around the crate.
	Place("data/models/crate.dae", {0.0f, 0.0f, 3.0f});
	Look({0.0f, 1.0f, 0.0f}, {0.0f, 0.4f, 3.0f});
	Render("crate");
	const std::vector<uint8_t> plain = myPixels;
	Matrix44<float> local;
	Zeph::Model* crate = const_cast<Zeph::Model*>(Zeph::RenderTargetHelper::FindFirstModel(
	    Zeph::Engine::GetInstance()->GetModelFactory().GetModel("data/models/crate.dae"), local));
	ASSERT_NE(crate, nullptr);
	for (int surface = 0; surface < crate->GetSurfaces().Count(); ++surface)
	{
		crate->GetSurfaces()[surface].SetRenderCategory(Zeph::RENDER_CATEGORY_SHADOW_CASTING_OUTLINE);
	}
	Render("crate-outlined");
	names.clear();
	for (const Zeph::Renderer::PassTime& pass : Renderer().GetPassTimes())
	{
		names.push_back(pass.myName);
	}
	EXPECT_THAT(names, Contains("outline"));
	EXPECT_NE(myPixels, plain);
	for (int surface = 0; surface < crate->GetSurfaces().Count(); ++surface)
	{
		crate->GetSurfaces()[surface].SetRenderCategory(Zeph::RENDER_CATEGORY_SHADOW_CASTING);
	}
}

// While the camera moves, an interactive divisor draws the frame's targets smaller and the grading
// pass scales the picture up to the whole back buffer; the first frame with the camera still is
// drawn at full size again, and a divisor of 1 never reduces.
TEST_F(FrameTest, AMovingCameraIsDrawnSmallerAndScaledUpAndAStillOneAtFullSize)
{
	LUMORA_RETURN_UNLESS(Start());
	Place("data/models/room_small.dae", {0.0f, 0.0f, 0.0f});
	Place("data/models/crate.dae", {0.3f, 0.0f, 0.6f});
	myPointLights.push_back(
	    {.myFalloff = 3.0f, .myPosition = {0.0f, 2.0f, 0.0f}, .myColor = {4.0f, 4.0f, 4.0f, 1.0f}});
	const auto litWidth = [] { return static_cast<int>(Renderer().GetLitImage()->GetImageInfo().myWidth); };
	const auto meanDifference = [](const std::vector<uint8_t>& aFirst, const std::vector<uint8_t>& aSecond) {
		double sum = 0.0;
		for (size_t index = 0; index < aFirst.size(); ++index)
		{
			sum += index % 4 == 3 ? 0.0 : std::abs(aFirst[index] - aSecond[index]);
		}
		return sum / (static_cast<double>(aFirst.size()) * 0.75);
	};

	Renderer().SetInteractiveDivisor(2);
	Look({-1.0f, 1.6f, -1.6f}, {0.3f, 0.3f, 0.6f});
	Render("interactive-still", 6);
	EXPECT_FALSE(Renderer().IsFrameReduced());
	EXPECT_EQ(litWidth(), ourWidth);

	Look({-1.02f, 1.6f, -1.6f}, {0.3f, 0.3f, 0.6f});
	Render("interactive-moving");
	EXPECT_TRUE(Renderer().IsFrameReduced());
	EXPECT_EQ(litWidth(), ourWidth / 2);
	const std::vector<uint8_t> moving = myPixels;
	Render("interactive-stopped");
	EXPECT_FALSE(Renderer().IsFrameReduced());
	EXPECT_EQ(litWidth(), ourWidth);
	// The reduced frame is the same picture, softer: it covers the whole back buffer.
	const double difference = meanDifference(moving, myPixels);
	EXPECT_GT(difference, 0.0);
	EXPECT_LT(difference, 6.0);

	// Off: a moving camera is drawn at full size.
	Renderer().SetInteractiveDivisor(1);
	Look({-1.0f, 1.6f, -1.6f}, {0.3f, 0.3f, 0.6f});
	Render("interactive-off");
	EXPECT_FALSE(Renderer().IsFrameReduced());
	EXPECT_EQ(litWidth(), ourWidth);
}
