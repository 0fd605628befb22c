// The facade's view, headless: resizing the drawing area (the frame fills the new size as a
// view made at that size draws it, with the SH volume and settings kept; picking and
// projection follow; bad sizes change nothing), the light icons (at each light's pixel, in its
// hue, of one size near and far, a click on one picks its light) and light wires, the camera
// queries and the report listener. The camera starts at (0, 10, 0) looking along +z; added
// lights stand 10 in front of it. Set LUMORA_TEST_FRAMES to a folder to keep the frames.
#include <algorithm>
#include <atomic>
#include <cmath>
#include <cstdlib>
#include <functional>
#include <mutex>
#include <numbers>
#include <string>
#include <thread>
#include <tuple>
#include <vector>

#include "editor/FacadeFixture.h"
#include "engine/Camera.h"
#include "engine/Debug.h"
#include "renderer/FrameCapture.h"
#include "renderer/Renderer.h"

namespace
{
using Lumora::LumoraWrapper;
using LightVolumes = Lumora::LumoraWrapper::LightVolumes;

// A read-back frame and the questions the tests ask of it.
struct Image
{
	int myWidth = 0;
	int myHeight = 0;
	std::vector<uint8_t> myPixels;

	const uint8_t* At(int anX, int aY) const
	{
		return &myPixels[(static_cast<size_t>(aY) * myWidth + anX) * 4];
	}
	// The pixels in the box around (anX, aY) of half-size aRadius that aTest accepts.
	int Count(float anX, float aY, int aRadius, const std::function<bool(const uint8_t*)>& aTest) const
	{
		int count = 0;
		for (int y = static_cast<int>(aY) - aRadius; y <= static_cast<int>(aY) + aRadius; ++y)
		{
			for (int x = static_cast<int>(anX) - aRadius; x <= static_cast<int>(anX) + aRadius; ++x)
			{
				count += x >= 0 && y >= 0 && x < myWidth && y < myHeight && aTest(At(x, y)) ? 1 : 0;
			}
		}
		return count;
	}
	int CountAll(const std::function<bool(const uint8_t*)>& aTest) const
	{
		return Count(myWidth / 2.0f, myHeight / 2.0f, std::max(myWidth, myHeight), aTest);
	}
	// The extent (width, height) of the pixels aTest accepts in the box, 0 x 0 when none.
	std::pair<int, int> Extent(float anX, float aY, int aRadius,
	                           const std::function<bool(const uint8_t*)>& aTest) const
	{
		int left = myWidth;
		int right = -1;
		int top = myHeight;
		int bottom = -1;
		for (int y = std::max(0, static_cast<int>(aY) - aRadius);
		     y <= std::min(myHeight - 1, static_cast<int>(aY) + aRadius); ++y)
		{
			for (int x = std::max(0, static_cast<int>(anX) - aRadius);
			     x <= std::min(myWidth - 1, static_cast<int>(anX) + aRadius); ++x)
			{
				if (aTest(At(x, y)))
				{
					left = std::min(left, x);
					right = std::max(right, x);
					top = std::min(top, y);
					bottom = std::max(bottom, y);
				}
			}
		}
		return right < 0 ? std::pair(0, 0) : std::pair(right - left + 1, bottom - top + 1);
	}
};

// The hues the tests give their lights, as the overlays show them (the light's colour scaled so
// its largest channel is 1, sRGB-encoded): clearly blue, clearly orange; neither is the red or
// green of the marker boxes.
bool IsBlue(const uint8_t* aPixel)
{
	return aPixel[2] >= 120 && aPixel[2] > aPixel[0] + 60 && aPixel[2] > aPixel[1] + 30;
}

bool IsOrange(const uint8_t* aPixel)
{
	return aPixel[0] >= 120 && aPixel[0] > aPixel[2] + 60 && aPixel[1] > aPixel[2] + 20 &&
	       aPixel[1] + 20 < aPixel[0];
}

// The selection ring's warm white-yellow.
bool IsHalo(const uint8_t* aPixel)
{
	return aPixel[0] >= 200 && aPixel[1] >= 180 && aPixel[2] >= 60 && aPixel[2] < aPixel[1] - 40;
}

bool IsLit(const uint8_t* aPixel)
{
	return aPixel[0] + aPixel[1] + aPixel[2] > 30;
}

class ViewTest : public FacadeTest
{
protected:
	// No GL error reached the log (with GL checks on, as the sanitizer build has them, each one
	// is an error entry naming it, such as "GL_INVALID_VALUE (0x0501)").
	void TearDown() override
	{
		if (!IsSkipped())
		{
			EXPECT_THAT(LogText(), testing::Not(testing::HasSubstr(" (0x05"))) << LogText();
		}
		FacadeTest::TearDown();
	}

	void Frames(int aCount)
	{
		for (int frame = 0; frame < aCount; ++frame)
		{
			Facade().Update(16.0f);
			Facade().Render();
		}
	}

	Image Capture(const std::string& aName)
	{
		Image image;
		image.myPixels = ReadFrame(aName, image.myWidth, image.myHeight);
		return image;
	}

	Vector3<float> PointPosition(int anIndex) { return Facade().GetPointLights()[anIndex].myPosition; }
	Vector3<float> SpotPosition(int anIndex)
	{
		return Facade().GetSpotLights()[anIndex].myOrientation.GetPosition();
	}

	// Where a world point is drawn, failing the test when it is behind the camera.
	std::pair<float, float> Pixel(const Vector3<float>& aWorld)
	{
		float x = -1.0f;
		float y = -1.0f;
		EXPECT_TRUE(Facade().ProjectToView(aWorld, x, y));
		return {x, y};
	}

	// A point light added in front of the camera, then put at aPosition with a colour and reach.
	void AddPointLight(const Vector3<float>& aPosition, const Vector3<float>& aColor, float aFalloff)
	{
		Facade().AddPointLight();
		ASSERT_TRUE(Facade().SetSelectedPosition(aPosition));
		Facade().ChangeColorPointLight(aColor.x, aColor.y, aColor.z);
		Facade().ChangeFalloffPointLight(aFalloff);
	}
};

// The frame's mean absolute difference per channel and the share of pixels off by more than aLimit.
std::pair<double, double> Difference(const Image& aFirst, const Image& aSecond, int aLimit)
{
	double sum = 0.0;
	size_t over = 0;
	for (size_t pixel = 0; pixel < aFirst.myPixels.size() / 4; ++pixel)
	{
		int largest = 0;
		for (size_t channel = 0; channel < 3; ++channel)
		{
			const int difference =
			    std::abs(aFirst.myPixels[pixel * 4 + channel] - aSecond.myPixels[pixel * 4 + channel]);
			sum += difference;
			largest = std::max(largest, difference);
		}
		over += largest > aLimit ? 1 : 0;
	}
	const double pixels = static_cast<double>(aFirst.myPixels.size() / 4);
	return {sum / (pixels * 3.0), static_cast<double>(over) / pixels};
}
} // namespace

// A view made at 160 x 90 and resized to 240 x 120 (another aspect) draws the room as a view
// made at 240 x 120 does, after as many frames, with the same SH volume and settings: not
// pinned to a corner, stretched, or lit differently. The volume and the settings both change
// the frame (without them it is far from the same), so neither was dropped by the resize.
TEST_F(ViewTest, AResizedViewDrawsTheSceneFillingItAsAViewMadeAtThatSizeWithItsVolumeAndSettings)
{
	constexpr int width = 240;
	constexpr int height = 120;
	// A scene, the ambient volume standing in for a baked one, and settings other than the defaults.
	const auto prepare = [this](bool aVolumeFlag, bool aSettingsFlag) {
		Facade().ParseLevel(u"sample_small");
		Facade().PlaceCamera(Vector3<float>(0.0f, 2.0f, 3.5f), std::numbers::pi_v<float>, 0.15f);
		if (aVolumeFlag)
		{
			Zeph::Engine::GetInstance()->MakeContextCurrent();
			ASSERT_TRUE(Zeph::FrameCapture::UploadUniformAmbient(0.8f, Vector3<float>(-20.0f, -5.0f, -20.0f),
			                                                     Vector3<float>(40.0f, 20.0f, 40.0f)));
			Zeph::Engine::GetInstance()->ReleaseContext();
		}
		if (aSettingsFlag)
		{
			Facade().UpdateSSAO(1.0f, 0.4f, 0.05f, 4.0f);
			Facade().UpdateHDRandBloom(0.35f, 0.05f, 4.0f, 0.6f, 1.5f, 1.0f);
		}
	};
	// The SSAO directions come from rand(): each view starts from the same seed.
	std::srand(7);
	Recreate(ourWidth, ourHeight);
	prepare(true, true);
	Frames(5);
	ASSERT_TRUE(Facade().Resize(width, height)) << LogText();
	EXPECT_EQ(std::pair(Facade().GetWidth(), Facade().GetHeight()), std::pair(width, height));
	Frames(35);
	const Image resized = Capture("resize-resized");

	const auto fresh = [&](bool aVolumeFlag, bool aSettingsFlag, const char* aName) {
		std::srand(7);
		Recreate(width, height);
		prepare(aVolumeFlag, aSettingsFlag);
		Frames(40);
		return Capture(aName);
	};
	const Image made = fresh(true, true, "resize-made-at-size");
	ASSERT_EQ(std::pair(resized.myWidth, resized.myHeight), std::pair(width, height));
	ASSERT_EQ(std::pair(made.myWidth, made.myHeight), std::pair(width, height));
	// Most of the room is lit, across the whole frame.
	EXPECT_GT(resized.CountAll(IsLit), width * height / 2);
	EXPECT_GT(resized.Count(width * 0.9f, height * 0.5f, 10, IsLit), 200) << "the right of the frame is dark";
	const auto [mean, share] = Difference(resized, made, 8);
	EXPECT_LT(mean, 1.0);
	EXPECT_LT(share, 0.01);

	const Image withoutVolume = fresh(false, true, "resize-without-volume");
	const Image withoutSettings = fresh(true, false, "resize-without-settings");
	EXPECT_GT(Difference(made, withoutVolume, 8).first, 5.0);
	EXPECT_GT(Difference(made, withoutSettings, 8).first, 5.0);
}

// Sizes below 1 or beyond what the GPU can draw are refused, reported, and change nothing: the
// view goes on drawing at its size, with its marker where ProjectToView says. The same size
// again is accepted at once.
TEST_F(ViewTest, BadSizesAreRefusedAndReportedAndTheViewDrawsOnAtItsSize)
{
	ASSERT_TRUE(Facade().Resize(200, 100));
	const std::pair<int, int> badSizes[] = {{0, 100},  {200, 0},       {-5, 100},
	                                        {200, -1}, {1 << 20, 100}, {200, 1 << 20}};
	for (const auto& [width, height] : badSizes)
	{
		EXPECT_FALSE(Facade().Resize(width, height)) << width << " x " << height;
		EXPECT_EQ(std::pair(Facade().GetWidth(), Facade().GetHeight()), std::pair(200, 100));
	}
	const std::string log = LogText();
	size_t reports = 0;
	for (size_t at = log.find("Cannot draw a view of"); at != std::string::npos;
	     at = log.find("Cannot draw a view of", at + 1))
	{
		++reports;
	}
	EXPECT_EQ(reports, std::size(badSizes));
	EXPECT_THAT(log, testing::HasSubstr("Cannot draw a view of 0x100 pixels"));
	EXPECT_THAT(log, testing::HasSubstr("it stays at 200x100"));

	EXPECT_TRUE(Facade().Resize(200, 100));
	Facade().AddPointLight();
	ASSERT_TRUE(Facade().SetSelectedPosition(Vector3<float>(2.0f, 11.0f, 8.0f)));
	Frames(1);
	const Image image = Capture("bad-sizes-kept");
	ASSERT_EQ(std::pair(image.myWidth, image.myHeight), std::pair(200, 100));
	// The selected light's marker box is green.
	const auto [x, y] = Pixel(PointPosition(0));
	EXPECT_GT(image.Count(x, y, 2, [](const uint8_t* aPixel) { return aPixel[1] > 200 && aPixel[0] < 60; }),
	          12);
}

// After a resize to another aspect, a light off the view's axis is drawn, projected and picked
// at its pixel of the new size, and the view's edges are where the lens's field of view puts
// them; a click where the old aspect would have put the light finds nothing.
TEST_F(ViewTest, PickingProjectionAndTheFrameFollowTheNewSize)
{
	constexpr float fov = 0.7853982f; // the lens's vertical field of view
	Facade().AddPointLight();
	const Vector3<float> light(3.0f, 11.0f, 10.0f);
	ASSERT_TRUE(Facade().SetSelectedPosition(light));
	ASSERT_TRUE(Facade().Resize(320, 120));
	const float aspect = 320.0f / 120.0f;
	const float slope = std::tan(fov * 0.5f);

	// The camera stands at (0, 10, 0) looking along +z with +x to its right.
	const auto [rightX, rightY] = Pixel(Vector3<float>(20.0f * slope * aspect, 10.0f, 20.0f));
	const auto [topX, topY] = Pixel(Vector3<float>(0.0f, 10.0f + 20.0f * slope, 20.0f));
	EXPECT_NEAR(rightX, 320.0f, 0.01f);
	EXPECT_NEAR(rightY, 60.0f, 0.01f);
	EXPECT_NEAR(topX, 160.0f, 0.01f);
	EXPECT_NEAR(topY, 0.0f, 0.01f);
	float x = 0.0f;
	float y = 0.0f;
	EXPECT_FALSE(Facade().ProjectToView(Vector3<float>(0.0f, 10.0f, -1.0f), x, y)) << "behind the camera";

	const auto [lightX, lightY] = Pixel(light);
	EXPECT_NEAR(lightX, 160.0f * (1.0f + 0.3f / (slope * aspect)), 0.01f);
	Frames(1);
	const Image image = Capture("resized-pick");
	EXPECT_GT(image.Count(lightX, lightY, 2,
	                      [](const uint8_t* aPixel) { return aPixel[1] > 200 && aPixel[0] < 60; }),
	          12)
	    << "the selected light's green marker is not at its pixel";
	const float staleX = 160.0f * (1.0f + 0.3f / (slope * 16.0f / 9.0f));
	Facade().DoIntersection(staleX, lightY);
	EXPECT_EQ(Facade().GetSelectedPoint(), -1);
	Facade().DoIntersection(lightX, lightY);
	EXPECT_EQ(Facade().GetSelectedPoint(), 0);
}

// PlaceCamera with what GetCameraPlacement gives puts the camera back as it was, after any
// mix of turns, tilts, zooms and strafes; and the placement PlaceCamera took comes back.
TEST_F(ViewTest, GetCameraPlacementGivesWhatPlaceCameraTakesToPutTheCameraBack)
{
	const Zeph::CameraInstance& camera = *Facade().GetCameraInstance();
	const auto matrices = [&camera] {
		std::vector<float> values(camera.GetActualOrientation().myMatrix,
		                          camera.GetActualOrientation().myMatrix + 16);
		values.insert(values.end(), camera.GetView().myMatrix, camera.GetView().myMatrix + 16);
		return values;
	};
	const std::vector<std::pair<const char*, std::function<void()>>> moves = {
	    {"as created", [] {}},
	    {"tilted down", [this] { Facade().PitchCamera(0.4f); }},
	    {"turned past a half turn",
	     [this] {
		     Facade().YawCamera(2.5f);
		     Facade().YawCamera(1.9f);
	     }},
	    {"zoomed and strafed",
	     [this] {
		     Facade().Zoom(3.0f);
		     Facade().Strafe(-2.0f);
	     }},
	    {"tilted up", [this] { Facade().PitchCamera(-1.1f); }},
	    {"turned back",
	     [this] {
		     Facade().YawCamera(-4.0f);
		     Facade().Strafe(1.5f);
	     }},
	};
	for (const auto& [what, move] : moves)
	{
		SCOPED_TRACE(what);
		move();
		const std::vector<float> before = matrices();
		Vector3<float> position;
		float yaw = 0.0f;
		float pitch = 0.0f;
		Facade().GetCameraPlacement(position, yaw, pitch);
		EXPECT_LE(std::abs(yaw), std::numbers::pi_v<float>);
		EXPECT_LE(std::abs(pitch), std::numbers::pi_v<float> * 0.5f);
		Facade().PlaceCamera(Vector3<float>(40.0f, -3.0f, 7.0f), 1.0f, 0.3f);
		Facade().PlaceCamera(position, yaw, pitch);
		EXPECT_THAT(matrices(), testing::Pointwise(testing::FloatNear(1e-4f), before));
	}
	Facade().PlaceCamera(Vector3<float>(1.0f, 2.0f, 3.0f), -2.0f, 0.5f);
	Vector3<float> position;
	float yaw = 0.0f;
	float pitch = 0.0f;
	Facade().GetCameraPlacement(position, yaw, pitch);
	EXPECT_THAT((std::vector{position.x, position.y, position.z, yaw, pitch}),
	            testing::Pointwise(testing::FloatNear(1e-5f), std::vector{1.0f, 2.0f, 3.0f, -2.0f, 0.5f}));
}

// The report listener hears each report once, with its level, function and text (without the
// line break), on the thread that reported; once removed it hears nothing.
TEST_F(ViewTest, TheReportListenerHearsReportsOnTheirThreadsUntilRemoved)
{
	struct Heard
	{
		int myLevel;
		std::string myFunction;
		std::string myText;
		std::thread::id myThread;
	};
	std::mutex mutex;
	std::vector<Heard> heard;
	LumoraWrapper::SetReportListener([&](int aLevel, const std::string& aFunction, const std::string& aText) {
		const std::lock_guard<std::mutex> lock(mutex);
		heard.push_back({aLevel, aFunction, aText, std::this_thread::get_id()});
	});
	EXPECT_FALSE(Facade().Resize(0, 50));
	std::thread::id otherThread;
	std::thread other([&] {
		otherThread = std::this_thread::get_id();
		EXPECT_FALSE(Facade().Resize(50, -1));
	});
	other.join();
	Debug::GetInstance()->DebugMessage(__LINE__, "ViewTest", "a note for the log\n");
	LumoraWrapper::SetReportListener({});
	EXPECT_FALSE(Facade().Resize(0, 0));

	ASSERT_EQ(heard.size(), 3u);
	EXPECT_EQ(std::tuple(heard[0].myLevel, heard[0].myFunction, heard[0].myThread),
	          std::tuple(1, std::string("Zeph::Engine::Resize"), std::this_thread::get_id()));
	EXPECT_THAT(heard[0].myText, testing::StartsWith("Cannot draw a view of 0x50 pixels (1x1 to "));
	EXPECT_THAT(heard[0].myText, testing::EndsWith("; it stays at 160x90"));
	EXPECT_EQ(std::tuple(heard[1].myLevel, heard[1].myThread), std::tuple(1, otherThread));
	EXPECT_THAT(heard[1].myText, testing::StartsWith("Cannot draw a view of 50x-1 pixels"));
	EXPECT_EQ(std::tuple(heard[2].myLevel, heard[2].myFunction, heard[2].myText),
	          std::tuple(0, std::string("ViewTest"), std::string("a note for the log")));
}

// Resizes from the user-interface thread while the render loop runs: every frame draws into a
// back buffer, renderer and picking size that agree, and the context is let go after each.
TEST_F(ViewTest, ResizesWhileTheRenderLoopRunsGiveEveryFrameOneSize)
{
	std::atomic<int> mismatches{0};
	RenderLoop loop(Facade(), [&mismatches](const LumoraWrapper& aFacade) {
		Zeph::Engine* engine = Zeph::Engine::GetInstance();
		const Gpu::RenderTargetView* view = engine->GetBackBufferView();
		const Zeph::SetupInfo& setup = engine->GetSetupInfo();
		if (view->GetWidth() != aFacade.GetWidth() || view->GetHeight() != aFacade.GetHeight() ||
		    engine->GetRenderer().GetWidth() != aFacade.GetWidth() ||
		    engine->GetRenderer().GetHeight() != aFacade.GetHeight() || setup.myWidth != aFacade.GetWidth() ||
		    setup.myHeight != aFacade.GetHeight())
		{
			mismatches.fetch_add(1);
		}
	});
	loop.WaitForFrames(2);
	for (int round = 0; round < 12; ++round)
	{
		EXPECT_TRUE(Facade().Resize(100 + round * 17, 60 + round * 5));
		loop.WaitForFrames(1);
	}
	loop.Stop();
	EXPECT_GT(loop.Frames(), 12);
	EXPECT_EQ(mismatches.load(), 0);
	EXPECT_EQ(loop.ContextLeaks(), 0);
}

// With icons on, each light shows as an icon in its hue at its pixel, about 24 pixels across
// near and far; a point light's and a spot light's differ; the selected one is ringed; the
// marker boxes give way. Off again, the frame is the one drawn before icons were ever on.
TEST_F(ViewTest, IconsShowEachLightInItsHueAtItsPixelAtOneSizeNearAndFar)
{
	ASSERT_TRUE(Facade().Resize(320, 180));
	AddPointLight(Vector3<float>(-1.5f, 10.0f, 6.0f), Vector3<float>(0.4f, 0.6f, 3.0f), 1.0f);
	Facade().AddSpotLight();
	ASSERT_TRUE(Facade().SetSelectedPosition(Vector3<float>(1.5f, 10.0f, 6.0f)));
	ASSERT_TRUE(Facade().SetSelectedDirection(Vector3<float>(0.0f, -1.0f, 0.0f)));
	Facade().ChangeColorSpotLight(3.0f, 0.9f, 0.2f);
	// The info line is queued for the next frame: the second frame has it.
	Frames(2);
	const Image off = Capture("icons-off");
	EXPECT_EQ(off.CountAll(IsBlue) + off.CountAll(IsOrange), 0);

	Facade().SetLightIconsFlag(true);
	Frames(1);
	const Image near = Capture("icons-near");
	const auto [pointX, pointY] = Pixel(PointPosition(0));
	const auto [spotX, spotY] = Pixel(SpotPosition(0));
	EXPECT_GT(near.Count(pointX, pointY, 3, IsBlue), 10) << "no blue at the point light's pixel";
	EXPECT_GT(near.Count(spotX, spotY, 3, IsOrange), 10) << "no orange at the spot light's pixel";
	EXPECT_EQ(near.CountAll(IsBlue), near.Count(pointX, pointY, 16, IsBlue)) << "blue away from the icon";
	EXPECT_EQ(near.Count(pointX, pointY, 16, IsOrange), 0);
	// The marker boxes (red, the selected one green) are not drawn.
	EXPECT_EQ(near.CountAll([](const uint8_t* aPixel) { return aPixel[0] > 200 && aPixel[1] < 40; }), 0);
	// The selected spot light is ringed, the point light not.
	EXPECT_GT(near.Count(spotX, spotY, 16, IsHalo), 40);
	EXPECT_EQ(near.Count(pointX, pointY, 16, IsHalo), 0);
	// The glyphs differ: laid over each other, the two icons' pixels are far from the same.
	int either = 0;
	int both = 0;
	for (int dy = -14; dy <= 14; ++dy)
	{
		for (int dx = -14; dx <= 14; ++dx)
		{
			const bool pointFlag =
			    IsBlue(near.At(static_cast<int>(pointX) + dx, static_cast<int>(pointY) + dy));
			const bool spotFlag =
			    IsOrange(near.At(static_cast<int>(spotX) + dx, static_cast<int>(spotY) + dy));
			either += pointFlag || spotFlag ? 1 : 0;
			both += pointFlag && spotFlag ? 1 : 0;
		}
	}
	EXPECT_LT(both * 2, either);

	// Four times as far away, the icons cover as many pixels.
	const std::pair<int, int> pointNear = near.Extent(pointX, pointY, 16, IsBlue);
	const std::pair<int, int> spotNear = near.Extent(spotX, spotY, 18, IsOrange);
	EXPECT_NEAR(pointNear.first, 24, 3);
	EXPECT_NEAR(pointNear.second, 24, 3);
	ASSERT_TRUE(Facade().SetSelectedPosition(Vector3<float>(6.0f, 10.0f, 24.0f)));
	ASSERT_TRUE(Facade().Select(LumoraWrapper::ObjectKind::POINT_LIGHT, 0));
	ASSERT_TRUE(Facade().SetSelectedPosition(Vector3<float>(-6.0f, 10.0f, 24.0f)));
	Frames(1);
	const Image far = Capture("icons-far");
	const auto [farPointX, farPointY] = Pixel(PointPosition(0));
	const auto [farSpotX, farSpotY] = Pixel(SpotPosition(0));
	const std::pair<int, int> pointFar = far.Extent(farPointX, farPointY, 16, IsBlue);
	const std::pair<int, int> spotFar = far.Extent(farSpotX, farSpotY, 18, IsOrange);
	EXPECT_NEAR(pointFar.first, pointNear.first, 1);
	EXPECT_NEAR(pointFar.second, pointNear.second, 1);
	EXPECT_NEAR(spotFar.first, spotNear.first, 1);
	EXPECT_NEAR(spotFar.second, spotNear.second, 1);
	// The selection moved to the point light, and its ring with it.
	EXPECT_GT(far.Count(farPointX, farPointY, 16, IsHalo), 40);
	EXPECT_EQ(far.Count(farSpotX, farSpotY, 16, IsHalo), 0);

	Facade().SetLightIconsFlag(false);
	Facade().Select(LumoraWrapper::ObjectKind::SPOT_LIGHT, 0);
	ASSERT_TRUE(Facade().SetSelectedPosition(Vector3<float>(1.5f, 10.0f, 6.0f)));
	ASSERT_TRUE(Facade().Select(LumoraWrapper::ObjectKind::POINT_LIGHT, 0));
	ASSERT_TRUE(Facade().SetSelectedPosition(Vector3<float>(-1.5f, 10.0f, 6.0f)));
	ASSERT_TRUE(Facade().Select(LumoraWrapper::ObjectKind::SPOT_LIGHT, 0));
	Frames(1);
	EXPECT_TRUE(Capture("icons-off-again").myPixels == off.myPixels);
}

// The wires: NONE draws none; SELECTED the selected light's reach alone (a point light's sphere,
// a spot light's cone and rim); ALL every light's; only in LIGHT_MODE.
TEST_F(ViewTest, LightWiresShowTheSelectedLightsReachOrEveryLightsInLightMode)
{
	ASSERT_TRUE(Facade().Resize(320, 180));
	const Vector3<float> point(-3.0f, 10.0f, 8.0f);
	AddPointLight(point, Vector3<float>(0.4f, 0.6f, 3.0f), 2.0f);
	const Vector3<float> apex(2.0f, 10.0f, 8.0f);
	Facade().AddSpotLight();
	ASSERT_TRUE(Facade().SetSelectedPosition(apex));
	ASSERT_TRUE(Facade().SetSelectedDirection(Vector3<float>(1.0f, 0.0f, 0.0f)));
	Facade().ChangeColorSpotLight(3.0f, 0.9f, 0.2f);
	Facade().ChangeFalloffSpotLight(2.5f);
	Facade().ChangeAnglesSpotLight(0.94f, 0.8f);

	// Where the wires must pass: the point light's great circle across the view; the spot
	// light's rim (reach 2.5 at the outer cone, cosine 0.8) seen edge-on, and a line from the
	// apex to it.
	const std::vector<Vector3<float>> sphere = {
	    point + Vector3<float>(2.0f, 0.0f, 0.0f), point + Vector3<float>(-2.0f, 0.0f, 0.0f),
	    point + Vector3<float>(0.0f, 2.0f, 0.0f), point + Vector3<float>(0.0f, -2.0f, 0.0f)};
	const std::vector<Vector3<float>> cone = {
	    apex + Vector3<float>(2.0f, 1.5f, 0.0f), apex + Vector3<float>(2.0f, -1.5f, 0.0f),
	    apex + Vector3<float>(2.0f, 0.0f, 0.0f) * 0.5f + Vector3<float>(0.0f, 0.75f, 0.0f)};
	// How many of the places show the hue within a pixel.
	const auto found = [this](const Image& anImage, const std::vector<Vector3<float>>& somePlaces,
	                          bool (*aHue)(const uint8_t*)) {
		int count = 0;
		for (const Vector3<float>& place : somePlaces)
		{
			const auto [x, y] = Pixel(place);
			count += anImage.Count(x, y, 1, aHue) > 0 ? 1 : 0;
		}
		return count;
	};
	const auto check = [&](LightVolumes aWhich, const char* aName, int aSphere, int aCone) {
		SCOPED_TRACE(aName);
		Facade().SetLightVolumes(aWhich);
		Frames(1);
		const Image image = Capture(aName);
		EXPECT_EQ(found(image, sphere, IsBlue), aSphere);
		EXPECT_EQ(found(image, cone, IsOrange), aCone);
	};
	const int sphereCount = static_cast<int>(sphere.size());
	const int coneCount = static_cast<int>(cone.size());
	check(LightVolumes::NONE, "wires-none", 0, 0);
	check(LightVolumes::SELECTED, "wires-selected-spot", 0, coneCount);
	ASSERT_TRUE(Facade().Select(LumoraWrapper::ObjectKind::POINT_LIGHT, 0));
	check(LightVolumes::SELECTED, "wires-selected-point", sphereCount, 0);
	check(LightVolumes::ALL, "wires-all", sphereCount, coneCount);
	Facade().SetIsLightMode(Lumora::DECAL_MODE);
	check(LightVolumes::ALL, "wires-decal-mode", 0, 0);
}

// A click on an icon picks its light, away from its marker box too; where icons overlap the
// nearer light wins; with icons off only the boxes pick.
TEST_F(ViewTest, AClickOnAnIconSelectsItsLightAndTheNearerWhereIconsOverlap)
{
	ASSERT_TRUE(Facade().Resize(320, 180));
	const Vector3<float> nearLight(0.0f, 10.0f, 5.0f);
	AddPointLight(nearLight, Vector3<float>(1.0f, 1.0f, 1.0f), 1.0f);
	const auto [nearX, nearY] = Pixel(nearLight);
	// The far light drawn 8 pixels to the right of the near one, three times as deep.
	const float pixelsPerUnitAt15 = Facade().GetCameraInstance()->GetProjection().myMatrix[5] * 90.0f / 15.0f;
	const Vector3<float> farLight(8.0f / pixelsPerUnitAt15, 10.0f, 15.0f);
	AddPointLight(farLight, Vector3<float>(1.0f, 1.0f, 1.0f), 1.0f);
	const auto [farX, farY] = Pixel(farLight);
	ASSERT_NEAR(farX - nearX, 8.0f, 0.01f);
	const Vector3<float> spot(-2.0f, 10.0f, 8.0f);
	Facade().AddSpotLight();
	ASSERT_TRUE(Facade().SetSelectedPosition(spot));
	const auto [spotX, spotY] = Pixel(spot);

	// Where each click lands and what it picks (point, spot) with icons off and on: beside the
	// near light, outside its box (about 11 pixels across each way) but on its icon; on both
	// icons, nearer the far light; beside the far light, on its icon only; above the spot light.
	const struct
	{
		float myX;
		float myY;
		std::pair<int, int> myBoxes;
		std::pair<int, int> myIcons;
	} clicks[] = {
	    {nearX - 12.0f, nearY, {-1, -1}, {0, -1}},
	    {nearX + 7.0f, nearY, {0, -1}, {0, -1}},
	    {farX + 12.0f, farY, {-1, -1}, {1, -1}},
	    {spotX, spotY - 12.0f, {-1, -1}, {-1, 0}},
	};
	for (const bool iconsFlag : {false, true})
	{
		Facade().SetLightIconsFlag(iconsFlag);
		for (const auto& click : clicks)
		{
			SCOPED_TRACE(std::to_string(click.myX) + ", " + std::to_string(click.myY) +
			             (iconsFlag ? " icons" : " boxes"));
			Facade().DoIntersection(click.myX, click.myY);
			EXPECT_EQ(std::pair(Facade().GetSelectedPoint(), Facade().GetSelectedSpot()),
			          iconsFlag ? click.myIcons : click.myBoxes);
		}
	}
	Frames(1);
	const Image image = Capture("icon-picked-spot");
	EXPECT_GT(image.Count(spotX, spotY, 16, IsHalo), 40) << "the picked spot light is not ringed";
}
