// The facade's lifecycle and frame loop, headless: what Create leaves, what a frame
// submits in each mode (gizmo pool, marked gizmo, node marker lights, decal box), the
// dropped update, two renders in a row and the info line.
#include <chrono>
#include <epoxy/egl.h>
#include <gtest/gtest.h>
#include <string>
#include <thread>
#include <vector>

#include "FacadeFixture.h"
#include "engine/Effect.h"
#include "engine/Engine.h"
#include "engine/Instance.h"
#include "engine/Text.h"
#include "platform/fx/Effect.h"
#include "platform/fx/Variable.h"
#include "platform/gpu/Readback.h"
#include "renderer/Renderer.h"
#include "renderer/post/FullScreenHelper.h"

namespace
{
// What one frame handed to the renderer, captured inside the frame.
struct FrameRecord
{
	int myPointLights = 0;
	int mySpotLights = 0;
	int myDecals = 0;
	// Late items besides the info line (which every frame queues for the next one).
	int myMarkers = 0;
	bool myBusyFlag = false;
	bool myContextFlag = false;
};

class FacadeFrameTest : public FacadeTest
{
protected:
	void SetUp() override
	{
		FacadeTest::SetUp();
		if (IsSkipped() || HasFatalFailure())
		{
			return;
		}
		Facade().SetFrameObserver([this](const Lumora::LumoraWrapper& aFacade) {
			Zeph::Engine* engine = Zeph::Engine::GetInstance();
			const Zeph::RenderTargetCollector& collector = engine->GetRenderer().GetRTC();
			FrameRecord record;
			record.myPointLights = collector.GetPointLights().Count();
			record.mySpotLights = collector.GetSpotLights().Count();
			record.myDecals = collector.GetDecals().Count();
			record.myMarkers = engine->GetRenderer().GetLateCount() - (myFrames.empty() ? 0 : 1);
			record.myBusyFlag = aFacade.IsBusy();
			record.myContextFlag = eglGetCurrentContext() != EGL_NO_CONTEXT;
			myFrames.push_back(record);
		});
	}

	void Frame()
	{
		Facade().Update(16.0f);
		Facade().Render();
	}

	static Vector3<float> GizmoPosition(const Zeph::Instance* anInstance)
	{
		return anInstance->GetOrientation().GetPosition();
	}

	std::vector<FrameRecord> myFrames;
};

void ExpectAt(const Vector3<float>& anActual, const Vector3<float>& anExpected, const char* aWhat)
{
	EXPECT_NEAR(anActual.x, anExpected.x, 1e-5f) << aWhat;
	EXPECT_NEAR(anActual.y, anExpected.y, 1e-5f) << aWhat;
	EXPECT_NEAR(anActual.z, anExpected.z, 1e-5f) << aWhat;
}
} // namespace

TEST(FacadeLifecycleTest, NoInstanceBeforeCreateAndShutDownWithoutOneDoesNothing)
{
	EXPECT_EQ(Lumora::LumoraWrapper::GetInstance(), nullptr);
	Lumora::LumoraWrapper::ShutDown();
	EXPECT_EQ(Lumora::LumoraWrapper::GetInstance(), nullptr);
}

TEST_F(FacadeFrameTest,
       CreateLeavesAnEmptyLevelFramesHoldTheBusyFlagAndTheContextAndAnUpdateInsideOneIsDropped)
{
	EXPECT_EQ(Facade().GetMode(), Lumora::LIGHT_MODE);
	ExpectAt(Facade().GetCameraInstance()->GetPosition(), {0.0f, 10.0f, 0.0f}, "camera");
	EXPECT_EQ(Selection(), (std::array{-1, -1, -1, -1}));
	EXPECT_EQ(Facade().GetNodeIDCounter(), 1);
	EXPECT_EQ(Facade().GetPointLights().Count() + Facade().GetDecals().Count() + Facade().GetNodes().Count(),
	          0);
	ASSERT_NE(Facade().GetMarkedGizmo(), nullptr);
	ASSERT_NE(Facade().GetDecalBox(), nullptr);
	EXPECT_FALSE(Facade().IsBusy());
	// Create leaves the GL context free for whichever thread runs the first frame.
	EXPECT_EQ(eglGetCurrentContext(), EGL_NO_CONTEXT);

	Lumora::LumoraWrapper* first = &Facade();
	EXPECT_FALSE(Lumora::LumoraWrapper::Create(0, ourWidth, ourHeight)) << "the log already exists";
	EXPECT_EQ(Lumora::LumoraWrapper::GetInstance(), first);
	// The first facade still draws; a frame holds the busy flag and the context, and the info
	// line shows the camera.
	Frame();
	ASSERT_EQ(myFrames.size(), 1u);
	EXPECT_TRUE(myFrames[0].myBusyFlag);
	EXPECT_TRUE(myFrames[0].myContextFlag);
	EXPECT_FALSE(Facade().IsBusy());
	EXPECT_EQ(eglGetCurrentContext(), EGL_NO_CONTEXT) << "the frame lets the context go";
	EXPECT_EQ(Facade().GetInfoText()->GetText(), L"Camera Position: 0 10 0");
	Facade().Zoom(2.5f);
	Facade().Strafe(-1.25f);
	Frame();
	EXPECT_EQ(Facade().GetInfoText()->GetText(), L"Camera Position: -1.25 10 2.5");

	Facade().AddPointLight();
	Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
	// An Update that falls inside a frame finds the facade busy and does nothing: no
	// time passes, no gizmo is made.
	float timeInFrame = -1.0f;
	int gizmosInFrame = -1;
	Facade().SetFrameObserver([&](const Lumora::LumoraWrapper& aFacade) {
		const float time = renderer.GetElapsedTime();
		Lumora::LumoraWrapper::GetInstance()->Update(1000.0f);
		timeInFrame = renderer.GetElapsedTime() - time;
		gizmosInFrame = aFacade.GetLightGizmos().Count();
		myFrames.emplace_back();
	});
	const size_t framesBefore = myFrames.size();
	Facade().Render();
	ASSERT_EQ(myFrames.size(), framesBefore + 1);
	EXPECT_EQ(timeInFrame, 0.0f);
	EXPECT_EQ(gizmosInFrame, 0);
	// The next Update after the frame proceeds; a second Render without an Update draws too.
	const float before = renderer.GetElapsedTime();
	Facade().Update(16.0f);
	EXPECT_FLOAT_EQ(renderer.GetElapsedTime() - before, 16.0f);
	EXPECT_EQ(Facade().GetLightGizmos().Count(), 1);
	Facade().Render();
	Facade().Render();
	EXPECT_EQ(myFrames.size(), framesBefore + 3);
}

TEST_F(FacadeFrameTest, GizmoPoolFollowsTheLightsAndTheSelectedLightGetsTheMarkedGizmo)
{
	Facade().AddPointLight();
	Facade().MoveSelectedVector(-2.0f, 0.0f, 0.0f);
	Facade().AddPointLight();
	Facade().AddPointLight();
	Facade().MoveSelectedVector(2.0f, 0.0f, 0.0f);
	Facade().AddSpotLight();
	Facade().MoveSelectedVector(0.0f, 2.0f, 0.0f);
	const auto& points = Facade().GetPointLights();
	const auto& spots = Facade().GetSpotLights();
	ASSERT_EQ(points.Count(), 3);
	ASSERT_EQ(spots.Count(), 1);

	// Nothing selected: Update grows the pool to one gizmo per light; the frame puts
	// gizmo g on the g-th light (points, then spots) and submits every light.
	Facade().SetIsLightMode(Lumora::LIGHT_MODE);
	Frame();
	ASSERT_EQ(Facade().GetLightGizmos().Count(), 4);
	ASSERT_EQ(myFrames.size(), 1u);
	EXPECT_EQ(myFrames[0].myPointLights, 3);
	EXPECT_EQ(myFrames[0].mySpotLights, 1);
	EXPECT_EQ(myFrames[0].myMarkers, 4) << "four gizmos drawn late";
	for (int light = 0; light < 3; ++light)
	{
		ExpectAt(GizmoPosition(Facade().GetLightGizmos()[light]), points[light].myPosition, "point gizmo");
	}
	ExpectAt(GizmoPosition(Facade().GetLightGizmos()[3]), spots[0].myOrientation.GetPosition(), "spot gizmo");

	// Point light 1 selected: the marked gizmo goes there, pool gizmo 1 stays where it was.
	ClickAt(points[1].myPosition);
	ASSERT_EQ(Facade().GetSelectedPoint(), 1);
	const Vector3<float> before = GizmoPosition(Facade().GetLightGizmos()[1]);
	Facade().MoveSelectedVector(0.0f, 1.0f, 0.0f);
	Frame();
	ExpectAt(GizmoPosition(Facade().GetMarkedGizmo()), points[1].myPosition, "marked gizmo");
	ExpectAt(GizmoPosition(Facade().GetLightGizmos()[1]), before, "the selected light's pool gizmo");
	ExpectAt(GizmoPosition(Facade().GetLightGizmos()[2]), points[2].myPosition, "gizmo 2");
	EXPECT_EQ(myFrames.back().myMarkers, 4);

	// Removing lights never shrinks the pool; switching the meshes off draws no gizmo
	// but every light is still submitted.
	Facade().RemoveSelectedPointLight();
	Facade().RenderMeshes(false);
	Frame();
	EXPECT_EQ(Facade().GetLightGizmos().Count(), 4);
	EXPECT_EQ(myFrames.back().myMarkers, 0);
	EXPECT_EQ(myFrames.back().myPointLights, 2);
	EXPECT_EQ(myFrames.back().mySpotLights, 1);
	EXPECT_FALSE(Zeph::Engine::GetInstance()->GetRenderer().GetLightMeshRenderer().GetRenderFlag());
}

TEST_F(FacadeFrameTest, ModesDecideTheMarkersAndAModeChangeClearsTheSelection)
{
	Facade().AddPointLight();
	Facade().AddPathNode();
	Facade().AddPathNode();
	ASSERT_EQ(Facade().GetNodes().Count(), 2);
	ASSERT_NE(Facade().GetSelectedPoint(), -1);

	Facade().SetIsLightMode(Lumora::NODE_MODE);
	EXPECT_EQ(Facade().GetSelectedPoint(), -1);
	EXPECT_EQ(Facade().GetSelectedNode(), -1);
	Frame();
	// One red marker light per node besides the level's light; node boxes and the edge
	// line are late items, light gizmos are not.
	EXPECT_EQ(myFrames.back().myPointLights, 3);
	EXPECT_EQ(myFrames.back().myMarkers, 3);

	// A mode outside the three is kept and draws no marker at all.
	Facade().SetIsLightMode(7);
	EXPECT_EQ(static_cast<int>(Facade().GetMode()), 7);
	Frame();
	EXPECT_EQ(myFrames.back().myPointLights, 1);
	EXPECT_EQ(myFrames.back().myMarkers, 0);
}

TEST_F(FacadeFrameTest, TheLightsAndTheSelectedLightsGizmoReachThePicture)
{
	Facade().AddPointLight();
	Facade().MoveSelectedVector(-1.5f, -1.0f, 0.0f);
	Facade().AddPointLight();
	Facade().MoveSelectedVector(1.5f, -1.0f, 0.0f);
	Facade().RenderMeshes(true);
	Frame();
	Frame();
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	ASSERT_TRUE(engine->MakeContextCurrent());
	std::vector<uint8_t> pixels;
	ASSERT_TRUE(Gpu::ReadRenderTarget(engine->GetContext(), *engine->GetBackBufferView(), pixels));
	Gpu::SavePng(ScratchPath() / "gizmos.png", ourWidth, ourHeight, pixels.data());
	engine->ReleaseContext();
	// Light 0 has the red pool gizmo, light 1 (selected, the last added) the green marked one.
	const auto at = [&](const Vector3<float>& aPosition) {
		float x = 0.0f;
		float y = 0.0f;
		PixelOf(aPosition, x, y);
		const size_t offset = (static_cast<size_t>(y) * ourWidth + static_cast<size_t>(x)) * 4;
		return std::vector<uint8_t>(pixels.begin() + static_cast<long>(offset),
		                            pixels.begin() + static_cast<long>(offset) + 3);
	};
	const std::vector<uint8_t> red = at(Facade().GetPointLights()[0].myPosition);
	const std::vector<uint8_t> green = at(Facade().GetPointLights()[1].myPosition);
	EXPECT_GT(red[0], 200);
	EXPECT_LT(red[1], 40);
	EXPECT_GT(green[1], 200);
	EXPECT_LT(green[0], 40);
}

TEST_F(FacadeFrameTest, SettingsChangedDuringAFrameWaitForItAndArriveInOrder)
{
	// Inside a frame another thread changes the SSAO settings: the change waits for the
	// frame to end, then reaches the renderer's variables in the order given.
	using Clock = std::chrono::steady_clock;
	Clock::time_point observerDone{};
	Clock::time_point settingsReturned{};
	std::thread settings;
	Facade().SetFrameObserver([&](const Lumora::LumoraWrapper&) {
		if (settings.joinable())
		{
			return;
		}
		settings = std::thread([&] {
			Lumora::LumoraWrapper::GetInstance()->UpdateSSAO(1.0f, 2.0f, 3.0f, 4.0f);
			settingsReturned = Clock::now();
		});
		// Long enough for a change that did not wait to be over before this point.
		std::this_thread::sleep_for(std::chrono::milliseconds(30));
		observerDone = Clock::now();
	});
	Facade().Render();
	settings.join();
	EXPECT_GT(settingsReturned, observerDone) << "the settings change did not wait for the frame";
	Zeph::Effect* fullScreen = Zeph::Engine::GetInstance()->GetRenderer().GetFullScreenHelper().GetEffect();
	ASSERT_NE(fullScreen, nullptr);
	const char* names[] = {"SSAO_scale", "SSAO_sample_rad", "SSAO_bias", "SSAO_Intensity"};
	for (int index = 0; index < 4; ++index)
	{
		EXPECT_EQ(fullScreen->GetEffect()->GetVariableByName(names[index])->GetFloats()[0],
		          static_cast<float>(index + 1))
		    << names[index];
	}
}
