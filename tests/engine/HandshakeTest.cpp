// Two threads take turns with the engine's GL context, as the editor's render loop
// and user-interface thread do through the busy flag: each makes the context
// current, creates a texture, clears and reads it, releases the context and hands over.

#include <atomic>
#include <cmath>
#include <thread>

#include "EngineFixture.h"
#include "engine/Texture.h"
#include "platform/gpu/Readback.h"

TEST_F(EngineTest, TwoThreadsTakingTurnsCreateAndReadTexturesWithoutErrors)
{
	LUMORA_RETURN_UNLESS(CreateEngine(64, 64));
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	engine->ReleaseContext();

	constexpr int rounds = 8;
	// One turn's work, on the context the turn made current: a new target cleared to the turn's
	// colour and read back.
	const auto drawTurn = [&](int anId, int aRound) {
		Zeph::Texture target(32, 32, Dds::Format::R8G8B8A8_UNORM);
		if (target.GetRenderTargetView() == nullptr)
		{
			return false;
		}
		const float color[4] = {static_cast<float>(anId), static_cast<float>(aRound) / rounds, 0.5f, 1.0f};
		engine->GetContext().ClearRenderTargetView(*target.GetRenderTargetView(), color);
		std::vector<uint8_t> pixels;
		return Gpu::ReadRenderTarget(engine->GetContext(), *target.GetRenderTargetView(), pixels) &&
		       pixels[0] == (anId == 0 ? 0 : 255) &&
		       std::abs(pixels[1] - static_cast<int>(std::lround(color[1] * 255.0f))) <= 1;
	};
	std::atomic<int> turn = 0;
	std::atomic<int> failures = 0;
	auto work = [&](int anId) {
		for (int round = 0; round < rounds; ++round)
		{
			while (turn.load(std::memory_order_acquire) != anId)
			{
				std::this_thread::yield();
			}
			if (!engine->MakeContextCurrent() || !drawTurn(anId, round))
			{
				++failures;
			}
			engine->ReleaseContext();
			turn.store(1 - anId, std::memory_order_release);
		}
	};
	std::thread first(work, 0);
	std::thread second(work, 1);
	first.join();
	second.join();
	EXPECT_EQ(failures.load(), 0);
	EXPECT_TRUE(engine->MakeContextCurrent());
}
