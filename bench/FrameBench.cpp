// The deferred frame at 1280 x 720, headless, with every stage on. One iteration is one frame:
// queue, render, and wait for the GPU to finish it, so the time column is the whole frame's
// wall-clock time. The counters are the GPU time of each pass (timestamp queries, averaged over
// the iterations, in milliseconds).
//
// BM_DemoFrame/S: the demo scene (the large sample room with its props, three point lights, a
//   spot light, a decal, the ambient volume) at shadow quality S (0 = no shadow map, 1 = 1024,
//   3 = 4096 texels).
// BM_DemoFrameMoving/D: the same with the camera turning a little every frame and the
//   interactive divisor at D, as the editor draws while a designer flies: each frame is drawn
//   at 1280/D x 720/D and scaled up (the editor picks D from 2 to 4 by the frames' time).
// BM_LevelFrame/D: sample_large through the editor facade from the README's camera (the level's
//   baked ambient.sh and cubemaps where they exist: scripts/run.sh bakes them), with the
//   facade's shadow setting; D = 0 still, D > 1 the camera turning at that divisor.
//
// Run from the repository root (it reads data/):  ./build/bench/bench_frame

#include <benchmark/benchmark.h>

#include <algorithm>
#include <epoxy/gl.h>
#include <functional>
#include <map>
#include <string>

#include "DemoScene.h"
#include "EditorSession.h"
#include "LevelCamera.h"
#include "engine/Engine.h"
#include "renderer/Renderer.h"

namespace
{
constexpr int ourWidth = 1280;
constexpr int ourHeight = 720;
constexpr float ourTurn = 0.002f;

// Times aFrame (which renders one frame and leaves the context current) and publishes the
// mean GPU time of each pass as a counter.
void TimeFrames(benchmark::State& aState, Zeph::Renderer& aRenderer, const std::function<void(int)>& aFrame)
{
	// Warm-up: shaders compiled, eye adaptation settled, both frame sizes made once.
	for (int frame = 0; frame < 6; ++frame)
	{
		aFrame(frame);
	}
	glFinish();
	aRenderer.SetPassTimingFlag(true);
	std::map<std::string, double> passTotals;
	int frame = 0;
	for (auto _ : aState)
	{
		aFrame(frame++);
		glFinish();
		for (const Zeph::Renderer::PassTime& pass : aRenderer.GetPassTimes())
		{
			passTotals[pass.myName] += pass.myMilliseconds;
		}
	}
	for (const auto& [name, total] : passTotals)
	{
		aState.counters[name] = benchmark::Counter(total / static_cast<double>(aState.iterations()));
	}
	aState.counters["reduced"] = aRenderer.IsFrameReduced() ? 1.0 : 0.0;
	aRenderer.SetPassTimingFlag(false);
}

void DemoFrame(benchmark::State& aState, int aShadowQuality, int aMovingDivisor)
{
	Gpu::WindowHandle window = 0;
	if (!Zeph::Engine::Create(window, ourWidth, ourHeight))
	{
		aState.SkipWithError("the engine could not start (no OpenGL 4.5 core context?)");
		Zeph::Engine::ShutDown();
		return;
	}
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	engine->GetSetupInfo().myShadowQuality = aShadowQuality;
	Zeph::Renderer& renderer = engine->GetRenderer();
	LumoraTool::DemoScene scene;
	if (!renderer.Init(ourWidth, ourHeight) || !scene.Init(*engine))
	{
		aState.SkipWithError("the renderer or the demo scene could not start (run from the repository root)");
		scene.Destroy();
		Zeph::Engine::ShutDown();
		return;
	}
	renderer.SetInteractiveDivisor(std::max(aMovingDivisor, 1));
	TimeFrames(aState, renderer, [&](int aFrame) {
		if (aMovingDivisor > 1)
		{
			scene.GetCamera().Yaw(aFrame % 2 == 0 ? ourTurn : -ourTurn);
		}
		scene.Queue();
		engine->RenderScene();
	});
	scene.Destroy();
	Zeph::Engine::ShutDown();
}

void BM_DemoFrame(benchmark::State& aState)
{
	DemoFrame(aState, static_cast<int>(aState.range(0)), 0);
}

void BM_DemoFrameMoving(benchmark::State& aState)
{
	DemoFrame(aState, 0, static_cast<int>(aState.range(0)));
}

void BM_LevelFrame(benchmark::State& aState)
{
	const int movingDivisor = static_cast<int>(aState.range(0));
	const bool movingFlag = movingDivisor > 1;
	LumoraTool::EditorSession session;
	if (!session.Start("sample_large", ourWidth, ourHeight) || !session.Load("sample_large"))
	{
		aState.SkipWithError("sample_large could not be opened (run from the repository root)");
		return;
	}
	Lumora::LumoraWrapper& editor = session.Editor();
	LumoraTool::WalkIntoTheFirstRoom(editor);
	// The level as the README pictures it: no light gizmos or volume outlines.
	editor.RenderMeshes(false);
	editor.SetInteractiveDivisor(std::max(movingDivisor, 1));
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	TimeFrames(aState, engine->GetRenderer(), [&](int aFrame) {
		if (movingFlag)
		{
			editor.YawCamera(aFrame % 2 == 0 ? ourTurn : -ourTurn);
		}
		editor.Update(16.0f);
		editor.Render();
		// The facade lets the context go after a frame; the wait and the timings need it.
		engine->MakeContextCurrent();
	});
	engine->ReleaseContext();
}

BENCHMARK(BM_DemoFrame)->Arg(0)->Arg(1)->Arg(3)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(3.0);
BENCHMARK(BM_DemoFrameMoving)->Arg(3)->Arg(4)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(3.0);
BENCHMARK(BM_LevelFrame)->Arg(0)->Arg(3)->Arg(4)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(3.0);
} // namespace
