// The deferred frame of the demo scene (the large sample room with its props, three
// point lights, a spot light, a decal, the ambient volume and every post stage) at
// 1280 x 720, headless. One iteration is one frame: queue, render, and wait for the
// GPU to finish it, so the time column is the whole frame's wall-clock time. The
// counters are the GPU time of each pass (timestamp queries, averaged over the
// iterations, in milliseconds). The argument is the shadow quality (0 = no shadow map,
// 1 = 1024, 3 = 4096 texels).
//
// Run from the repository root (it reads data/):  ./build/bench/bench_frame

#include <benchmark/benchmark.h>

#include <epoxy/gl.h>
#include <map>
#include <string>

#include "DemoScene.h"
#include "engine/Engine.h"
#include "renderer/Renderer.h"

namespace
{
void BM_DeferredFrame(benchmark::State& aState)
{
	constexpr int width = 1280;
	constexpr int height = 720;
	Gpu::WindowHandle window = 0;
	if (!Zeph::Engine::Create(window, width, height))
	{
		aState.SkipWithError("the engine could not start (no OpenGL 4.5 core context?)");
		Zeph::Engine::ShutDown();
		return;
	}
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	engine->GetSetupInfo().myShadowQuality = static_cast<int>(aState.range(0));
	Zeph::Renderer& renderer = engine->GetRenderer();
	LumoraTool::DemoScene scene;
	if (!renderer.Init(width, height) || !scene.Init(*engine))
	{
		aState.SkipWithError("the renderer or the demo scene could not start (run from the repository root)");
		scene.Destroy();
		Zeph::Engine::ShutDown();
		return;
	}
	// Warm-up: shaders compiled, eye adaptation settled.
	for (int frame = 0; frame < 5; ++frame)
	{
		scene.Queue();
		engine->RenderScene();
	}
	glFinish();
	renderer.SetPassTimingFlag(true);
	std::map<std::string, double> passTotals;
	for (auto _ : aState)
	{
		scene.Queue();
		engine->RenderScene();
		glFinish();
		for (const Zeph::Renderer::PassTime& pass : renderer.GetPassTimes())
		{
			passTotals[pass.myName] += pass.myMilliseconds;
		}
	}
	for (const auto& [name, total] : passTotals)
	{
		aState.counters[name] = benchmark::Counter(total / static_cast<double>(aState.iterations()));
	}
	renderer.SetPassTimingFlag(false);
	scene.Destroy();
	Zeph::Engine::ShutDown();
}
BENCHMARK(BM_DeferredFrame)
    ->Arg(0)
    ->Arg(1)
    ->Arg(3)
    ->Unit(benchmark::kMillisecond)
    ->UseRealTime()
    ->MinTime(3.0);
} // namespace
