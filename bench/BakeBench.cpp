// The bakes on a headless engine, room_small with four point lights queued as the editor
// queues its level before a bake.
//
// BM_ReflectionBake: Renderer::GenerateReflections over N rooms (the argument): per room six
// 256 x 256 deferred faces, the mip filter and the DDS file. The "per room" counter is the
// wall-clock time of one room; BM_ReflectionCubeSave times the file alone (the read-back of
// the 256-texel cube with its 9 mips and the write), so the render and the filter take the
// difference.
//
// The bake writes data/Cubemaps/<level>/, so the benchmarks run in a temporary directory
// whose data/ links the repository's folders (Cubemaps is a copy of the two cube maps the
// renderer reads). Run from the repository root:  ./build/bench/bench_bake

#include <benchmark/benchmark.h>

#include <epoxy/gl.h>
#include <filesystem>
#include <memory>
#include <string>
#include <system_error>
#include <unistd.h>
#include <vector>

#include "core/GrowingArray.h"
#include "engine/Engine.h"
#include "engine/Instance.h"
#include "engine/Room.h"
#include "model/ModelFactory.h"
#include "platform/gpu/TextureSaver.h"
#include "renderer/DynamicCubemap.h"
#include "renderer/ProbeHelper.h"
#include "renderer/Renderer.h"

namespace
{
namespace fs = std::filesystem;

// A headless engine at a small screen size in a scratch working directory, with room_small
// and its lights; each bake empties the collector, so Queue() runs before every one.
class BakeScene
{
public:
	BakeScene() : myRooms(8, 8) {}
	~BakeScene() { Destroy(); }
	BakeScene(const BakeScene&) = delete;
	BakeScene& operator=(const BakeScene&) = delete;

	// Empty when everything started; otherwise why not.
	std::string Init(int aRoomCount)
	{
		const fs::path source = fs::absolute("data");
		if (!fs::is_directory(source / "Cubemaps"))
		{
			return "run from the repository root (it reads data/)";
		}
		myPreviousDirectory = fs::current_path();
		myDirectory = fs::temp_directory_path() / ("lumora-bench-bake-" + std::to_string(::getpid()));
		std::error_code error;
		fs::remove_all(myDirectory, error);
		fs::create_directories(myDirectory / "data" / "Cubemaps");
		for (const fs::directory_entry& entry : fs::directory_iterator(source))
		{
			if (entry.path().filename() != "Cubemaps")
			{
				fs::create_directory_symlink(entry.path(), myDirectory / "data" / entry.path().filename());
			}
		}
		for (const char* file : {"cubemap.dds", "normaltest.dds"})
		{
			fs::copy_file(source / "Cubemaps" / file, myDirectory / "data" / "Cubemaps" / file);
		}
		fs::current_path(myDirectory);

		Gpu::WindowHandle window = 0;
		if (!Zeph::Engine::Create(window, 160, 90))
		{
			return "the engine could not start (no OpenGL 4.5 core context?)";
		}
		Zeph::Engine* engine = Zeph::Engine::GetInstance();
		engine->GetSetupInfo().myShadowQuality = 1;
		if (!engine->GetRenderer().Init(160, 90))
		{
			return "the renderer could not start";
		}
		Zeph::ModelNode* model = engine->GetModelFactory().GetModel("data/models/room_small.dae");
		if (model == nullptr)
		{
			return "room_small.dae did not load";
		}
		myInstance = std::make_unique<Zeph::Instance>(model);
		const Vector3<float> positions[] = {
		    {1.6f, 1.8f, -0.5f}, {1.0f, 2.7f, -1.0f}, {0.6f, 0.3f, 0.4f}, {-1.5f, 0.5f, 1.3f}};
		for (const Vector3<float>& position : positions)
		{
			Zeph::PointLightData light;
			light.myPosition = position;
			light.myFalloff = 2.0f;
			light.myColor = Vector4<float>(3.0f, 2.5f, 2.0f, 1.0f);
			myLights.push_back(light);
		}
		for (int room = 0; room < aRoomCount; ++room)
		{
			const Vector3<float> offset(static_cast<float>(room) * 0.5f, 0.0f, 0.0f);
			myRoomOwners.push_back(std::make_unique<Zeph::Room>(Vector3<float>(-2.0f, 0.0f, -2.0f) + offset,
			                                                    Vector3<float>(2.0f, 3.0f, 2.0f) + offset));
			myRoomOwners.back()->SetID("room" + std::to_string(room));
			myRooms.Add(myRoomOwners.back().get());
		}
		return "";
	}

	void Queue()
	{
		Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
		myInstance->Render();
		for (const Zeph::PointLightData& light : myLights)
		{
			renderer.GetRTC().AddPointLight(light);
		}
	}

	const GrowingArray<Zeph::Room*>& GetRooms() const { return myRooms; }

	void Destroy()
	{
		myInstance.reset();
		myRoomOwners.clear();
		myRooms.RemoveAll();
		if (Zeph::Engine::GetInstance() != nullptr)
		{
			Zeph::Engine::ShutDown();
		}
		if (!myDirectory.empty())
		{
			fs::current_path(myPreviousDirectory);
			std::error_code error;
			fs::remove_all(myDirectory, error);
			myDirectory.clear();
		}
	}

private:
	fs::path myPreviousDirectory;
	fs::path myDirectory;
	std::unique_ptr<Zeph::Instance> myInstance;
	std::vector<Zeph::PointLightData> myLights;
	std::vector<std::unique_ptr<Zeph::Room>> myRoomOwners;
	GrowingArray<Zeph::Room*> myRooms;
};

void BM_ReflectionBake(benchmark::State& aState)
{
	const int rooms = static_cast<int>(aState.range(0));
	BakeScene scene;
	const std::string problem = scene.Init(rooms);
	if (!problem.empty())
	{
		aState.SkipWithError(problem.c_str());
		return;
	}
	Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
	// Warm-up: the shaders of every pass compiled.
	scene.Queue();
	renderer.GenerateReflections(scene.GetRooms(), "bench");
	glFinish();
	for (auto _ : aState)
	{
		scene.Queue();
		renderer.GenerateReflections(scene.GetRooms(), "bench");
		glFinish();
	}
	aState.counters["per room"] =
	    benchmark::Counter(static_cast<double>(rooms * aState.iterations()),
	                       benchmark::Counter::kIsRate | benchmark::Counter::kInvert);
}
BENCHMARK(BM_ReflectionBake)->Arg(1)->Arg(3)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(3.0);

void BM_ReflectionCubeSave(benchmark::State& aState)
{
	BakeScene scene;
	const std::string problem = scene.Init(1);
	if (!problem.empty())
	{
		aState.SkipWithError(problem.c_str());
		return;
	}
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	Zeph::Renderer& renderer = engine->GetRenderer();
	scene.Queue();
	renderer.GenerateReflections(scene.GetRooms(), "bench");
	const Zeph::DynamicCubemap* cube = renderer.GetProbeHelper()->GetReflectionCubemap();
	for (auto _ : aState)
	{
		if (!Gpu::SaveTextureToDds(engine->GetContext(), *cube->GetTexture(), "data/Cubemaps/bench/save.dds"))
		{
			aState.SkipWithError("the cube could not be saved");
			break;
		}
	}
}
BENCHMARK(BM_ReflectionCubeSave)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(1.0);
} // namespace
