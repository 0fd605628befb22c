// The facade's two threads, for real: a render loop calling Update and Render without
// pause while the user-interface thread adds, moves, recolours, picks and removes
// thousands of times and loads a level twice. Inside every frame the scene must be
// whole (no half-made change is visible), the frame must hold the busy flag and the GL
// context; outside a claim the context is current on no thread; every claim proceeds.
// Run under ThreadSanitizer (scripts/test.sh --tsan) for the data races.
#include <atomic>
#include <chrono>
#include <epoxy/egl.h>
#include <gtest/gtest.h>
#include <sstream>
#include <string>
#include <thread>

#include "FacadeFixture.h"

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
	// Every edge joins two nodes of the array, and each of them holds it.
	const auto& nodes = aFacade.GetNodes();
	const auto& edges = aFacade.GetEdges();
	const AI::NGNode* first = nodes.Count() > 0 ? &nodes[0] : nullptr;
	for (int index = 0; index < edges.Count(); ++index)
	{
		for (int end = 0; end < 2; ++end)
		{
			const AI::NGNode* node = edges[index].GetConnections()[end];
			if (node == nullptr || first == nullptr || node < first || node >= first + nodes.Count())
			{
				problems << "edge " << index << " points outside the nodes; ";
				continue;
			}
			const auto& slots = node->GetEdgeSlots();
			if (slots[0] != &edges[index] && slots[1] != &edges[index])
			{
				problems << "edge " << index << " is not held by its node; ";
			}
		}
	}
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
