// The facade's two threads, for real: a render loop calling Update and Render without
// pause while the user-interface thread adds, moves, recolours, picks and removes
// thousands of times and loads a level twice, or picks decals and switches the display
// over and over. Inside every frame the scene must be whole (no half-made change is
// visible), the frame must hold the busy flag and the GL context; outside a claim the
// context is current on no thread; every claim proceeds; an edit that waited acts on the
// selection as it is when it gets the facade. And a Create that failed can be shut down
// and followed by one that succeeds. Run under ThreadSanitizer (scripts/test.sh --tsan)
// for the data races.
#include <atomic>
#include <chrono>
#include <epoxy/egl.h>
#include <gtest/gtest.h>
#include <sstream>
#include <string>
#include <thread>

#include "FacadeFixture.h"
#include "engine/Instance.h"

namespace
{
constexpr int ourEditRounds = 1000;

class FacadeThreadTest : public FacadeTest
{
};

// The invariants of a whole scene, as a frame sees it; empty when they hold.
std::string CheckScene(const Lumora::LumoraWrapper& aFacade)
{
	std::ostringstream problems;
	if (!aFacade.IsBusy())
	{
		problems << "a frame ran without the busy flag; ";
	}
	if (eglGetCurrentContext() == EGL_NO_CONTEXT)
	{
		problems << "a frame ran without the GL context; ";
	}
	const struct
	{
		const char* myName;
		int mySelection;
		int myCount;
	} selections[] = {{"point", aFacade.GetSelectedPoint(), aFacade.GetPointLights().Count()},
	                  {"spot", aFacade.GetSelectedSpot(), aFacade.GetSpotLights().Count()},
	                  {"node", aFacade.GetSelectedNode(), aFacade.GetNodes().Count()},
	                  {"decal", aFacade.GetSelectedDecal(), aFacade.GetDecals().Count()}};
	for (const auto& selection : selections)
	{
		if (selection.mySelection < -1 || selection.mySelection >= selection.myCount)
		{
			problems << selection.myName << " selection " << selection.mySelection << " of "
			         << selection.myCount << "; ";
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

TEST_F(FacadeThreadTest, EditsAndLoadsWhileTheRenderLoopRunsSeeNoHalfMadeChange)
{
	std::atomic<int> frames{0};
	std::atomic<int> brokenFrames{0};
	std::string firstProblem;
	Facade().SetFrameObserver([&](const Lumora::LumoraWrapper& aFacade) {
		const std::string problem = CheckScene(aFacade);
		if (!problem.empty() && brokenFrames.fetch_add(1) == 0)
		{
			firstProblem = problem;
		}
		frames.fetch_add(1);
	});

	std::atomic<bool> stop{false};
	std::atomic<int> contextLeaks{0};
	std::thread renderLoop([&] {
		Lumora::LumoraWrapper* facade = Lumora::LumoraWrapper::GetInstance();
		while (!stop.load())
		{
			facade->Update(16.0f);
			facade->Render();
			if (eglGetCurrentContext() != EGL_NO_CONTEXT)
			{
				contextLeaks.fetch_add(1);
			}
		}
	});

	// The user-interface thread: every operation claims and releases the facade.
	Lumora::LumoraWrapper& facade = Facade();
	int uiContextLeaks = 0;
	const auto afterClaim = [&] {
		if (eglGetCurrentContext() != EGL_NO_CONTEXT)
		{
			++uiContextLeaks;
		}
	};
	for (int round = 0; round < ourEditRounds; ++round)
	{
		if (round == ourEditRounds / 3 || round == 2 * ourEditRounds / 3)
		{
			facade.ParseLevel(u"sample_small");
			afterClaim();
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
		afterClaim();
		// A user pauses now and then; frames get drawn between the edits.
		if (round % 8 == 0)
		{
			std::this_thread::sleep_for(std::chrono::milliseconds(1));
		}
	}
	// The UI thread made every claim; let the loop draw a few more frames, then stop.
	const int framesAtEnd = frames.load();
	RecordProperty("frames during the edits", framesAtEnd);

	const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(30);
	while (frames.load() < framesAtEnd + 3 && std::chrono::steady_clock::now() < deadline)
	{
		std::this_thread::sleep_for(std::chrono::milliseconds(1));
	}
	stop = true;
	renderLoop.join();

	EXPECT_GT(framesAtEnd, 0) << "no frame was drawn between the edits";
	EXPECT_GE(frames.load(), framesAtEnd + 3) << "the render loop stopped drawing";
	EXPECT_EQ(brokenFrames.load(), 0) << firstProblem;
	EXPECT_EQ(contextLeaks.load(), 0) << "the render loop kept the context after a frame step";
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
	ASSERT_NE(decal.x * decal.x + decal.y * decal.y + decal.z * decal.z, 0.0f);

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
			const Vector3<float> box = loop->GetDecalBox()->GetPosition();
			if (!(box.x == decal.x && box.y == decal.y && box.z == decal.z))
			{
				record("the decal box was fitted at " + std::to_string(box.x) + " " + std::to_string(box.y) +
				       " " + std::to_string(box.z));
			}
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
	const Vector3<float> box = facade.GetDecalBox()->GetPosition();
	EXPECT_TRUE(box.x == decal.x && box.y == decal.y && box.z == decal.z) << "the last pick was fitted";
	RecordProperty("picks", picks);
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

	EXPECT_EQ(facade.GetSelectedPoint(), -1);
	EXPECT_EQ(facade.GetPointLights().Count(), 1)
	    << "the light lost its selection while the removal waited, yet a light was removed";
	EXPECT_FALSE(facade.IsBusy());
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
