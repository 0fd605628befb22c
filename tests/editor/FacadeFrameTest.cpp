// The facade's lifecycle, frame loop and two threads, headless. What Create leaves, what a frame
// submits (gizmo pool, marked gizmo), the dropped update, two renders in a row and the info
// line. Then a render loop calling Update and Render without pause while the user-interface
// thread adds, moves, recolours, picks and removes thousands of times and loads a level twice,
// or picks decals and switches the display over and over: inside every frame the scene must be
// whole (no half-made change is visible), the frame must hold the busy flag and the GL context;
// outside a claim the context is current on no thread; every claim proceeds; an edit that
// waited acts on the selection as it is when it gets the facade. A Create that failed can be
// shut down and followed by one that succeeds, and the ambient bake holds the loop off. Run
// under ThreadSanitizer (scripts/test.sh --tsan) for the data races.
#include <atomic>
#include <chrono>
#include <epoxy/egl.h>
#include <filesystem>
#include <gtest/gtest.h>
#include <sstream>
#include <string>
#include <thread>
#include <tuple>
#include <utility>
#include <vector>

#include "FacadeFixture.h"
#include "engine/Engine.h"
#include "engine/Instance.h"
#include "engine/Text.h"
#include "renderer/AmbientVolumeFile.h"
#include "renderer/ProbeHelper.h"
#include "renderer/Renderer.h"

namespace
{
// What one frame handed to the renderer, captured inside the frame.
struct FrameRecord
{
	int myPointLights = 0;
	int mySpotLights = 0;
	// Late items besides the info line (which every frame queues for the next one).
	int myMarkers = 0;
	bool myBusyFlag = false;
	bool myContextFlag = false;

	std::array<int, 3> Counts() const { return {myPointLights, mySpotLights, myMarkers}; }
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
	EXPECT_THAT(
	    (std::vector{anActual.x, anActual.y, anActual.z}),
	    testing::Pointwise(testing::FloatNear(1e-5f), std::vector{anExpected.x, anExpected.y, anExpected.z}))
	    << aWhat;
}

constexpr int ourEditRounds = 1000;

using FacadeThreadTest = FacadeTest;

// The invariants of a whole scene, as a frame sees it; empty when they hold.
std::string CheckScene(const Lumora::LumoraWrapper& aFacade)
{
	std::ostringstream problems;
	if (!aFacade.IsBusy() || eglGetCurrentContext() == EGL_NO_CONTEXT)
	{
		problems << "a frame ran without the busy flag or the GL context; ";
	}
	// Each kind's selection (point, spot, node, decal) and how many there are.
	const std::pair<int, int> selections[] = {{aFacade.GetSelectedPoint(), aFacade.GetPointLights().Count()},
	                                          {aFacade.GetSelectedSpot(), aFacade.GetSpotLights().Count()},
	                                          {aFacade.GetSelectedNode(), aFacade.GetNodes().Count()},
	                                          {aFacade.GetSelectedDecal(), aFacade.GetDecals().Count()}};
	for (const auto& [selection, count] : selections)
	{
		if (selection < -1 || selection >= count)
		{
			problems << "a selection " << selection << " of " << count << "; ";
		}
	}
	problems << GraphProblems(aFacade);
	const auto& nodes = aFacade.GetNodes();
	const auto& edges = aFacade.GetEdges();
	// A chain built by adding nodes has one edge fewer than nodes.
	if (nodes.Count() > 0 && edges.Count() != nodes.Count() - 1)
	{
		problems << nodes.Count() << " nodes but " << edges.Count() << " edges; ";
	}
	return problems.str();
}
} // namespace

TEST_F(FacadeFrameTest,
       CreateLeavesAnEmptyLevelFramesHoldTheBusyFlagAndTheContextAndAnUpdateInsideOneIsDropped)
{
	// Mode, selection, node IDs and an empty scene; the gizmos made; the facade free, and the GL
	// context too, for whichever thread runs the first frame.
	ExpectAt(Facade().GetCameraInstance()->GetPosition(), {0.0f, 10.0f, 0.0f}, "camera");
	EXPECT_EQ(std::tuple(Facade().GetMode(), Selection(), Facade().GetNodeIDCounter(),
	                     Facade().GetPointLights().Count() + Facade().GetDecals().Count() +
	                         Facade().GetNodes().Count(),
	                     Facade().GetMarkedGizmo() != nullptr && Facade().GetDecalBox() != nullptr,
	                     Facade().IsBusy(), eglGetCurrentContext() == EGL_NO_CONTEXT),
	          std::tuple(Lumora::LIGHT_MODE, std::array{-1, -1, -1, -1}, 1, 0, true, false, true));

	Lumora::LumoraWrapper* first = &Facade();
	EXPECT_FALSE(Lumora::LumoraWrapper::Create(0, ourWidth, ourHeight)) << "the log already exists";
	EXPECT_EQ(Lumora::LumoraWrapper::GetInstance(), first);
	// The first facade still draws; a frame holds the busy flag and the context and lets both
	// go, and the info line shows the camera.
	Facade().Zoom(2.5f);
	Facade().Strafe(-1.25f);
	Frame();
	ASSERT_EQ(myFrames.size(), 1u);
	EXPECT_TRUE(myFrames[0].myBusyFlag && myFrames[0].myContextFlag);
	EXPECT_FALSE(Facade().IsBusy());
	EXPECT_EQ(eglGetCurrentContext(), EGL_NO_CONTEXT);
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

	// Nothing selected: Update grows the pool to one gizmo per light; the frame puts
	// gizmo g on the g-th light (points, then spots) and submits every light.
	Facade().SetIsLightMode(Lumora::LIGHT_MODE);
	Frame();
	ASSERT_EQ(Facade().GetLightGizmos().Count(), 4);
	ASSERT_EQ(myFrames.size(), 1u);
	EXPECT_EQ(myFrames[0].Counts(), (std::array{3, 1, 4})) << "four gizmos drawn late";
	ExpectAt(GizmoPosition(Facade().GetLightGizmos()[2]), points[2].myPosition, "point gizmo 2");
	ExpectAt(GizmoPosition(Facade().GetLightGizmos()[3]), spots[0].myOrientation.GetPosition(), "spot gizmo");

	// Point light 1 selected: the marked gizmo goes there, pool gizmo 1 stays where it was.
	ClickAt(points[1].myPosition);
	ASSERT_EQ(Facade().GetSelectedPoint(), 1);
	const Vector3<float> before = GizmoPosition(Facade().GetLightGizmos()[1]);
	Facade().MoveSelectedVector(0.0f, 1.0f, 0.0f);
	Frame();
	ExpectAt(GizmoPosition(Facade().GetMarkedGizmo()), points[1].myPosition, "marked gizmo");
	ExpectAt(GizmoPosition(Facade().GetLightGizmos()[1]), before, "the selected light's pool gizmo");
	EXPECT_EQ(myFrames.back().myMarkers, 4);

	// Removing lights never shrinks the pool; switching the meshes off draws no gizmo
	// but every light is still submitted.
	Facade().RemoveSelectedPointLight();
	Facade().RenderMeshes(false);
	Frame();
	EXPECT_EQ(Facade().GetLightGizmos().Count(), 4);
	EXPECT_EQ(myFrames.back().Counts(), (std::array{2, 1, 0}));
	EXPECT_FALSE(Zeph::Engine::GetInstance()->GetRenderer().GetLightMeshRenderer().GetRenderFlag());
}

TEST_F(FacadeThreadTest, EditsAndLoadsWhileTheRenderLoopRunsSeeNoHalfMadeChange)
{
	std::atomic<int> brokenFrames{0};
	std::string firstProblem;
	RenderLoop loop(Facade(), [&](const Lumora::LumoraWrapper& aFacade) {
		const std::string problem = CheckScene(aFacade);
		if (!problem.empty() && brokenFrames.fetch_add(1) == 0)
		{
			firstProblem = problem;
		}
	});

	// The user-interface thread: every operation claims and releases the facade, and leaves the
	// context current on no thread.
	Lumora::LumoraWrapper& facade = Facade();
	int uiContextLeaks = 0;
	for (int round = 0; round < ourEditRounds; ++round)
	{
		if (round == ourEditRounds / 3 || round == 2 * ourEditRounds / 3)
		{
			facade.ParseLevel(u"sample_small");
			uiContextLeaks += eglGetCurrentContext() != EGL_NO_CONTEXT ? 1 : 0;
			facade.SetIsLightMode(Lumora::LIGHT_MODE);
		}
		// Each round's edits leave the scene as large as they found it (bar one path node
		// per four rounds), so the frames stay quick.
		switch (round % 4)
		{
		case 0:
			facade.AddPointLight();
			facade.MoveSelectedVector(0.01f * static_cast<float>(round % 50), 0.0f, 0.0f);
			facade.ChangeColorPointLight(0.5f, 0.25f, static_cast<float>(round % 7) / 7.0f);
			facade.RemoveSelectedPointLight();
			break;
		case 1:
			facade.AddSpotLight();
			facade.PitchSpotLight(0.1f);
			facade.ChangeFalloffSpotLight(2.0f);
			facade.DeleteSelected();
			break;
		case 2:
			facade.AddDecal();
			facade.ChangeDecalSize(0.5f);
			facade.RemoveSelectedDecal();
			facade.AddPathNode();
			break;
		default:
			ClickCentre();
			facade.DoIntersection(10.0f, 10.0f);
			facade.AddPathNode();
			facade.RemoveSelectedNode();
			facade.YawCamera(0.001f);
			break;
		}
		uiContextLeaks += eglGetCurrentContext() != EGL_NO_CONTEXT ? 1 : 0;
		// A user pauses now and then; frames get drawn between the edits.
		if (round % 8 == 0)
		{
			std::this_thread::sleep_for(std::chrono::milliseconds(1));
		}
	}
	// The UI thread made every claim; the loop draws a few more frames, then stops.
	const int framesAtEnd = loop.Frames();
	loop.WaitForFrames(3);
	loop.Stop();

	EXPECT_GT(framesAtEnd, 0) << "no frame was drawn between the edits";
	EXPECT_GE(loop.Frames(), framesAtEnd + 3) << "the render loop stopped drawing";
	EXPECT_EQ(brokenFrames.load(), 0) << firstProblem;
	EXPECT_EQ(loop.ContextLeaks(), 0) << "the render loop kept the context after a frame step";
	EXPECT_EQ(uiContextLeaks, 0) << "an operation kept the context after its claim";
	EXPECT_FALSE(facade.IsBusy());
}

TEST_F(FacadeThreadTest, DecalPickingAndDisplaySwitchesWhileTheRenderLoopRuns)
{
	Lumora::LumoraWrapper& facade = Facade();
	facade.SetIsLightMode(Lumora::DECAL_MODE);
	facade.AddDecal();
	ASSERT_EQ(facade.GetDecals().Count(), 1);
	const Vector3<float> decal = facade.GetDecals()[0].myPosition;
	const auto boxAtDecal = [&decal](const Lumora::LumoraWrapper& aFacade) {
		const Vector3<float> box = aFacade.GetDecalBox()->GetPosition();
		return box.x == decal.x && box.y == decal.y && box.z == decal.z;
	};

	// Every update fits the decal box to the selected decal, so once fitted the box stays
	// at the decal; a selection read half before and half after a pick (which resets it
	// to -1 first) fits it to a decal that does not exist. The box is written only by the
	// updates, on the loop's thread, which checks it after each one; the loop draws a
	// frame every few updates (the frame checks the rest).
	ClickAt(decal);
	facade.Update(16.0f);
	constexpr int ourUpdates = 20000;
	constexpr int ourUpdatesPerFrame = 100;
	std::atomic<int> updates{0};
	std::atomic<int> frames{0};
	std::atomic<int> broken{0};
	std::string firstProblem;
	const auto record = [&](const std::string& aProblem) {
		if (!aProblem.empty() && broken.fetch_add(1) == 0)
		{
			firstProblem = aProblem;
		}
	};
	facade.SetFrameObserver([&](const Lumora::LumoraWrapper& aFacade) {
		record(CheckScene(aFacade));
		frames.fetch_add(1);
	});
	std::atomic<bool> stop{false};
	std::thread renderLoop([&] {
		Lumora::LumoraWrapper* loop = Lumora::LumoraWrapper::GetInstance();
		while (!stop.load())
		{
			loop->Update(16.0f);
			record(boxAtDecal(*loop) ? "" : "the decal box was fitted away from the decal");
			if (updates.fetch_add(1) % ourUpdatesPerFrame == 0)
			{
				loop->Render();
			}
		}
	});
	// Picking and the display switches take no flag: they run straight into the frames
	// (for 15 s at most: a sanitizer build runs slower).
	int picks = 0;
	const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(15);
	float x = 0.0f;
	float y = 0.0f;
	PixelOf(decal, x, y);
	while (updates.load() < ourUpdates && std::chrono::steady_clock::now() < deadline)
	{
		facade.DoIntersection(x, y);
		facade.DoIntersection(1.0f, 1.0f);
		if (++picks % 16 == 0)
		{
			facade.RenderMeshes(picks % 32 == 0);
			facade.RenderRooms(picks % 48 == 0);
		}
	}
	ClickAt(decal);
	const int updatesBefore = updates.load();
	while (updates.load() < updatesBefore + ourUpdatesPerFrame + 1)
	{
		std::this_thread::sleep_for(std::chrono::milliseconds(1));
	}
	stop = true;
	renderLoop.join();
	facade.SetFrameObserver({});

	EXPECT_GT(updates.load(), ourUpdates / 10) << "the loop stalled";
	EXPECT_GE(frames.load(), updates.load() / ourUpdatesPerFrame) << "frames were dropped";
	EXPECT_EQ(broken.load(), 0) << firstProblem;
	EXPECT_EQ(facade.GetSelectedDecal(), 0);
	EXPECT_TRUE(boxAtDecal(facade)) << "the last pick was fitted";
}

TEST_F(FacadeThreadTest, AnEditThatWaitedActsOnTheSelectionAsItIsWhenItGetsTheFacade)
{
	Lumora::LumoraWrapper& facade = Facade();
	facade.AddPointLight();
	ASSERT_EQ(facade.GetSelectedPoint(), 0);

	// A frame holds the facade while the edit is asked for; before it lets go, the
	// selection is cleared (as a level loaded by another thread would clear it).
	std::atomic<bool> inFrame{false};
	std::atomic<bool> armed{true};
	facade.SetFrameObserver([&](const Lumora::LumoraWrapper&) {
		if (!armed.exchange(false))
		{
			return;
		}
		inFrame = true;
		std::this_thread::sleep_for(std::chrono::milliseconds(200));
		Lumora::LumoraWrapper::GetInstance()->DoIntersection(1.0f, 1.0f);
	});
	std::thread frame([] {
		Lumora::LumoraWrapper* loop = Lumora::LumoraWrapper::GetInstance();
		loop->Update(16.0f);
		loop->Render();
	});
	while (!inFrame.load())
	{
		std::this_thread::sleep_for(std::chrono::milliseconds(1));
	}
	facade.RemoveSelectedPointLight();
	frame.join();
	facade.SetFrameObserver({});

	EXPECT_EQ(std::tuple(facade.GetSelectedPoint(), facade.GetPointLights().Count(), facade.IsBusy()),
	          std::tuple(-1, 1, false))
	    << "the light lost its selection while the removal waited, yet a light was removed";
}

TEST_F(FacadeThreadTest, ACreateThatFailedCanBeShutDownAndFollowedByOneThatSucceeds)
{
	Lumora::LumoraWrapper::ShutDown();
	// Larger than any texture the device makes: the engine's set-up fails, without ending
	// the process under the facade's own fatal levels.
	EXPECT_FALSE(Lumora::LumoraWrapper::Create(0, 100000, 100000));
	EXPECT_NE(Lumora::LumoraWrapper::GetInstance(), nullptr) << "the instance stays, without a scene";
	Lumora::LumoraWrapper::ShutDown();
	EXPECT_EQ(Lumora::LumoraWrapper::GetInstance(), nullptr);
	ASSERT_TRUE(Lumora::LumoraWrapper::Create(0, ourWidth, ourHeight)) << LogText();
	Lumora::LumoraWrapper* facade = Lumora::LumoraWrapper::GetInstance();
	facade->AddPointLight();
	facade->Update(16.0f);
	facade->Render();
	EXPECT_EQ(facade->GetPointLights().Count(), 1);
}

// The ambient bake claims the facade as every edit does: the render loop is held off while it
// runs, a third thread polls the progress, and the editor shows the baked volume afterwards.
// (Both bakes claim it the same way; the reflection bake's progress per room is the renderer's
// reflection bake test's.)
using BakeCommandTest = FacadeTest;

TEST_F(BakeCommandTest, AnAmbientBakeHoldsOffTheRenderLoopWritesTheVolumeKeepsTheModeAndTheEditorShowsIt)
{
	Facade().ParseLevel(u"sample_small");
	ASSERT_GT(Facade().GetRooms().Count(), 0);
	Facade().SetIsLightMode(Lumora::DECAL_MODE);
	const std::filesystem::path file = ScratchPath() / "data/XML/levels/sample_small/ambient.sh";
	Facade().BakeAmbient(u"sample_small", 0, false);
	EXPECT_FALSE(std::filesystem::exists(file)) << "zero bounces write nothing";
	EXPECT_EQ(Facade().GetBakeProgress(), 0);

	// Progress and frame count as a third thread sees them, every millisecond.
	RenderLoop loop(Facade());
	loop.WaitForFrames(2);
	std::atomic<bool> stop{false};
	std::vector<std::pair<int, int>> samples;
	std::thread poller([&] {
		while (!stop.load())
		{
			samples.emplace_back(Lumora::LumoraWrapper::GetInstance()->GetBakeProgress(), loop.Frames());
			std::this_thread::sleep_for(std::chrono::milliseconds(1));
		}
	});
	Facade().BakeAmbient(u"sample_small", 2, false);
	loop.WaitForFrames(2);
	stop = true;
	poller.join();
	loop.Stop();

	// The small level's rooms leave some grid cells unvisited, so the final value is below 100
	// and stays after the bake. The progress never goes back, and while the bake runs (from its
	// first progress until its final value) every frame step returns at once: no frame is drawn.
	const int finalProgress = Facade().GetBakeProgress();
	EXPECT_GT(finalProgress, 0);
	ASSERT_FALSE(samples.empty());
	EXPECT_EQ(samples.back().first, finalProgress);
	int framesInBake = -1;
	int samplesInBake = 0;
	for (size_t index = 0; index < samples.size(); ++index)
	{
		ASSERT_TRUE(index == 0 || samples[index - 1].first <= samples[index].first) << "progress went back";
		if (samples[index].first > 0 && samples[index].first < finalProgress)
		{
			++samplesInBake;
			framesInBake = framesInBake < 0 ? samples[index].second : framesInBake;
			EXPECT_EQ(samples[index].second, framesInBake) << "a frame ran during the bake";
		}
	}
	EXPECT_GT(samplesInBake, 0) << "the poller never saw the bake running";
	EXPECT_EQ(std::tuple(Facade().GetMode(), Facade().IsBusy()), std::tuple(Lumora::DECAL_MODE, false))
	    << "the mode comes back after the bake, and the facade is free";
	Zeph::AmbientVolume volume;
	std::string problem;
	ASSERT_EQ(Zeph::ReadAmbientVolume(file.string(), volume, problem), Zeph::AmbientVolumeRead::OK)
	    << problem;
	Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
	EXPECT_NE(renderer.GetProbeHelper()->GetView(0), nullptr) << "the baked volume stays bound";

	// Loading the level again reads the baked file, and the next frames draw (the bake's
	// queued markers, deleted by the load, are not drawn).
	Facade().ParseLevel(u"sample_small");
	EXPECT_TRUE(renderer.IsSHLoaded());
	Facade().Update(16.0f);
	Facade().Render();
	Facade().Render();
}
