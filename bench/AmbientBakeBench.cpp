// The ambient bake of the larger sample level through the editor facade, headless:
// one iteration is one whole bake (1, 2 or 3 bounces), with the probes read back in
// batches, one cube at a time or one face at a time. Counters: probes rendered and
// projected per second (a probe is six 32 x 32 deferred faces, one read-back of the
// cube and its SH projection), the probe count, and milliseconds per probe spent
// submitting the captures, reading them back and projecting them. Writes the level's ambient.sh in
// the working directory's data/ (run from the repository root, or a copy of it).

#include <benchmark/benchmark.h>

#include <algorithm>

#include "editor/LumoraWrapper.h"
#include "engine/Engine.h"
#include "renderer/Renderer.h"

namespace
{
void BM_AmbientBake(benchmark::State& aState)
{
	const int bounces = static_cast<int>(aState.range(0));
	using Readback = Zeph::Renderer::ProbeReadback;
	const Readback readback = static_cast<Readback>(aState.range(1));
	if (!Lumora::LumoraWrapper::Create(0, 1280, 720))
	{
		aState.SkipWithError("the editor could not start (no OpenGL 4.5 core context?)");
		return;
	}
	Lumora::LumoraWrapper& editor = *Lumora::LumoraWrapper::GetInstance();
	editor.ParseLevel(u"sample_large");
	if (editor.GetRooms().Count() == 0)
	{
		aState.SkipWithError("data/XML/levels/sample_large did not load (run from the repository root)");
		Lumora::LumoraWrapper::ShutDown();
		return;
	}
	Zeph::Engine::GetInstance()->GetRenderer().SetProbeReadback(readback);
	long long probes = 0;
	Zeph::Renderer::BakeTimings timings;
	for (auto _ : aState)
	{
		editor.BakeAmbient(u"sample_large", bounces, false);
		const Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
		probes += renderer.GetBakedProbeCount();
		timings.myRendering += renderer.GetBakeTimings().myRendering;
		timings.myReadback += renderer.GetBakeTimings().myReadback;
		timings.myProjection += renderer.GetBakeTimings().myProjection;
	}
	// Milliseconds per probe in each part of the bake.
	const double perProbe = 1000.0 / static_cast<double>(std::max(probes, 1LL));
	aState.counters["render_ms"] = timings.myRendering * perProbe;
	aState.counters["readback_ms"] = timings.myReadback * perProbe;
	aState.counters["project_ms"] = timings.myProjection * perProbe;
	aState.counters["probes/s"] =
	    benchmark::Counter(static_cast<double>(probes), benchmark::Counter::kIsRate);
	aState.counters["probes"] = static_cast<double>(probes) / static_cast<double>(aState.iterations());
	Lumora::LumoraWrapper::ShutDown();
}
// Arguments: bounces, then the read-back: 0 batched through the atlas, 1 one per probe,
// 2 one per face.
BENCHMARK(BM_AmbientBake)
    ->Args({1, 2})
    ->Args({1, 1})
    ->Args({1, 0})
    ->Args({2, 0})
    ->Args({3, 0})
    ->Unit(benchmark::kMillisecond)
    ->UseRealTime()
    ->Iterations(1);
} // namespace
