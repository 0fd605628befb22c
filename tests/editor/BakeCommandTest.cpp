// The facade's bakes: the ambient bake on the small sample level, what it writes and
// what the editor shows afterwards; both bakes' handshake with a render loop that
// keeps running and a third thread that polls the progress.
#include <algorithm>
#include <array>
#include <atomic>
#include <chrono>
#include <cmath>
#include <filesystem>
#include <functional>
#include <gtest/gtest.h>
#include <thread>
#include <vector>

#include "FacadeFixture.h"
#include "engine/Engine.h"
#include "renderer/AmbientVolumeFile.h"
#include "renderer/ProbeHelper.h"
#include "renderer/Renderer.h"
#include "support/TestSupport.h"

namespace
{
using BakeCommandTest = FacadeTest;

// The constant term of the red irradiance (E / pi) a cell holds: cAr.w decoded.
float RedConstant(const Zeph::AmbientVolume& aVolume, size_t aCell)
{
	return static_cast<float>(aVolume.myBlocks[0][aCell] >> 24) / 255.0f * 2.0f - 1.0f;
}

// The progress a third thread saw, with the frames drawn so far.
struct ProgressSample
{
	int myProgress;
	int myFrames;
};

// Runs aBake on this (the user-interface) thread while a render loop draws without
// pause on a second thread and a third polls the progress every millisecond.
std::vector<ProgressSample> BakeWhileTheLoopRuns(Lumora::LumoraWrapper& aFacade,
                                                 const std::function<void()>& aBake)
{
	std::atomic<int> frames{0};
	aFacade.SetFrameObserver([&](const Lumora::LumoraWrapper&) { frames.fetch_add(1); });
	std::atomic<bool> stop{false};
	std::thread renderLoop([&] {
		Lumora::LumoraWrapper* facade = Lumora::LumoraWrapper::GetInstance();
		while (!stop.load())
		{
			facade->Update(16.0f);
			facade->Render();
		}
	});
	std::vector<ProgressSample> samples;
	std::thread poller([&] {
		while (!stop.load())
		{
			samples.push_back({Lumora::LumoraWrapper::GetInstance()->GetBakeProgress(), frames.load()});
			std::this_thread::sleep_for(std::chrono::milliseconds(1));
		}
	});
	while (frames.load() < 2)
	{
		std::this_thread::sleep_for(std::chrono::milliseconds(1));
	}
	aBake();
	const int framesAfterBake = frames.load();
	while (frames.load() < framesAfterBake + 2)
	{
		std::this_thread::sleep_for(std::chrono::milliseconds(1));
	}
	stop = true;
	renderLoop.join();
	poller.join();
	aFacade.SetFrameObserver({});
	return samples;
}

// The progress never goes back, and while the bake runs (from its first progress until
// it reaches its final value) it holds the facade: every frame step returns at once,
// so the frame count stands still.
void ExpectTheBakeHeldTheLoop(const std::vector<ProgressSample>& someSamples, int aFinalProgress)
{
	ASSERT_FALSE(someSamples.empty());
	EXPECT_EQ(someSamples.back().myProgress, aFinalProgress);
	int framesInBake = -1;
	int samplesInBake = 0;
	for (size_t index = 0; index < someSamples.size(); ++index)
	{
		if (index > 0)
		{
			ASSERT_LE(someSamples[index - 1].myProgress, someSamples[index].myProgress)
			    << "progress went back";
		}
		if (someSamples[index].myProgress > 0 && someSamples[index].myProgress < aFinalProgress)
		{
			++samplesInBake;
			if (framesInBake < 0)
			{
				framesInBake = someSamples[index].myFrames;
			}
			EXPECT_EQ(someSamples[index].myFrames, framesInBake) << "a frame ran during the bake";
		}
	}
	EXPECT_GT(samplesInBake, 0) << "the poller never saw the bake running";
}
} // namespace

TEST_F(BakeCommandTest, AnAmbientBakeHoldsOffTheRenderLoopWritesTheVolumeKeepsTheModeAndTheEditorShowsIt)
{
	Facade().ParseLevel(u"sample_small");
	ASSERT_GT(Facade().GetRooms().Count(), 0);
	Facade().SetIsLightMode(Lumora::DECAL_MODE);
	const std::filesystem::path file = ScratchPath() / "data/XML/levels/sample_small/ambient.sh";
	ASSERT_FALSE(std::filesystem::exists(file));

	// Zero bounces write nothing.
	Facade().BakeAmbient(u"sample_small", 0, false);
	EXPECT_FALSE(std::filesystem::exists(file));
	EXPECT_EQ(Facade().GetBakeProgress(), 0);

	const std::vector<ProgressSample> samples =
	    BakeWhileTheLoopRuns(Facade(), [this] { Facade().BakeAmbient(u"sample_small", 2, false); });
	// The small level's rooms leave some grid cells unvisited, so the final value is
	// below 100 and stays after the bake.
	const int finalProgress = Facade().GetBakeProgress();
	EXPECT_GT(finalProgress, 0);
	ExpectTheBakeHeldTheLoop(samples, finalProgress);
	EXPECT_EQ(Facade().GetMode(), Lumora::DECAL_MODE) << "the mode comes back after the bake";
	EXPECT_FALSE(Facade().IsBusy());
	Zeph::AmbientVolume volume;
	std::string problem;
	ASSERT_EQ(Zeph::ReadAmbientVolume(file.string(), volume, problem), Zeph::AmbientVolumeRead::OK)
	    << problem;
	// The room's -3..3 x 0..3 x -4..4 in cells of 2.
	EXPECT_EQ((std::array{volume.myCounts[0], volume.myCounts[1], volume.myCounts[2]}),
	          (std::array{3, 2, 4}));
	// The room is lit: some probe received light, and none is brighter than the lights allow.
	float brightest = -1.0f;
	for (size_t cell = 0; cell < volume.myBlocks[0].size(); ++cell)
	{
		brightest = std::max(brightest, RedConstant(volume, cell));
	}
	EXPECT_GT(brightest, 0.01f) << "no probe saw the lights";
	EXPECT_NE(Zeph::Engine::GetInstance()->GetRenderer().GetProbeHelper()->GetView(0), nullptr)
	    << "the baked volume stays bound";

	// Loading the level again reads the baked file, and the next frames draw (the bake's
	// queued markers, deleted by the load, are not drawn).
	Facade().ParseLevel(u"sample_small");
	EXPECT_TRUE(Zeph::Engine::GetInstance()->GetRenderer().IsSHLoaded());
	Facade().Update(16.0f);
	Facade().Render();
	Facade().Render();
}

TEST_F(BakeCommandTest, AReflectionBakeOfThreeRoomsHoldsOffTheRenderLoopAndReportsEachRoom)
{
	// The small level with three rooms in a row.
	namespace fs = std::filesystem;
	const fs::path level = ScratchPath() / "data/XML/levels/three_rooms";
	fs::copy(ScratchPath() / "data/XML/levels/sample_small", level, fs::copy_options::recursive);
	fs::remove(level / "ambient.sh");
	TestSupport::WriteWholeFile((level / "rooms.xml").string(), R"(<root>
    <rooms>
        <room><min x="-3" y="0" z="-4" /><max x="3" y="3" z="4" /><id value="west" /></room>
        <room><min x="3" y="0" z="-4" /><max x="9" y="3" z="4" /><id value="middle" /></room>
        <room><min x="9" y="0" z="-4" /><max x="15" y="3" z="4" /><id value="east" /></room>
    </rooms>
</root>
)");
	Facade().ParseLevel(u"three_rooms");
	ASSERT_EQ(Facade().GetRooms().Count(), 3);
	const std::vector<ProgressSample> samples =
	    BakeWhileTheLoopRuns(Facade(), [this] { Facade().BakeSpecular(u"three_rooms"); });
	EXPECT_EQ(Facade().GetBakeProgress(), 100);
	ExpectTheBakeHeldTheLoop(samples, 100);
	for (const ProgressSample& sample : samples)
	{
		EXPECT_TRUE(sample.myProgress == 0 || sample.myProgress == 33 || sample.myProgress == 66 ||
		            sample.myProgress == 100)
		    << sample.myProgress;
	}
	for (const char* room : {"west", "middle", "east"})
	{
		EXPECT_TRUE(
		    fs::is_regular_file(ScratchPath() / "data/Cubemaps/three_rooms" / (std::string(room) + ".dds")))
		    << room;
	}
	EXPECT_FALSE(Facade().IsBusy());
}
