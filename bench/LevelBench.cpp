// Level loading and saving through the facade, on a generated level of 2,000 point lights,
// 2,000 decals and 2,000 path nodes (a chain of 1,999 edges). Besides the whole level, three
// levels holding one kind of object each split the load and the save by file.
//
// The facade reads data/ from the working directory, so the run works in a scratch directory
// whose data/ links to the repository's data folders, with catalogues and levels of its own.

#include <benchmark/benchmark.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <string>

#include "editor/LumoraWrapper.h"

namespace
{
constexpr int ourCount = 2000;

const char* const ourEntityTypesText =
    "<root><entities><entity id=\"crate\">"
    "<visual-component type=\"model\" filepath=\"data/models/crate.dae\" />"
    "</entity></entities></root>\n";
const char* const ourDecalTypesText =
    "<root><decal id=\"bricks\"><texture path=\"data/textures/bricks_albedo.dds\" />"
    "<normal path=\"data/textures/bricks_normal.dds\" /></decal>"
    "<decal id=\"wood\"><texture path=\"data/textures/wood_albedo.dds\" />"
    "<normal path=\"data/textures/wood_normal.dds\" /></decal></root>\n";
const char* const ourRoomsText =
    "<root><rooms><room><min x=\"-30\" y=\"-1\" z=\"-1\" />"
    "<max x=\"30\" y=\"10\" z=\"45\" /><id value=\"hall\" /></room></rooms></root>\n";
const char* const ourEntitiesText =
    "<root><entities><entity type=\"crate\"><position x=\"0\" y=\"0\" z=\"5\" />"
    "<rotation x=\"0\" y=\"45\" z=\"0\" /></entity></entities></root>\n";

void WriteText(const std::filesystem::path& aPath, const std::string& someText)
{
	std::filesystem::create_directories(aPath.parent_path());
	std::ofstream out(aPath, std::ios::binary | std::ios::trunc);
	out << someText;
}

std::string LightsText(int aCount)
{
	std::ostringstream text;
	text << "<root>\n\t<point-lights>\n";
	for (int index = 0; index < aCount; ++index)
	{
		text << "\t\t<point-light>\n\t\t\t<position x=\"" << (index % 50) * 1.25f - 30.0f
		     << "\" y=\"2.5\" z=\"" << (index / 50) * 1.1f << "\" />\n\t\t\t<color r=\"1\" g=\"0.8\" b=\""
		     << (index % 10) * 0.1f << "\" a=\"1\" />\n\t\t\t<falloff value=\"" << 2.0f + (index % 7) * 0.5f
		     << "\" />\n"
		     << "\t\t</point-light>\n";
	}
	text << "\t</point-lights>\n\t<spot-lights />\n</root>\n";
	return text.str();
}

std::string DecalsText(int aCount)
{
	std::ostringstream text;
	text << "<root>\n\t<decals>\n";
	for (int index = 0; index < aCount; ++index)
	{
		text << "\t\t<decal>\n\t\t\t<decal-type id=\"" << (index % 2 == 0 ? "bricks" : "wood") << "\" />\n"
		     << "\t\t\t<position x=\"" << (index % 50) * 1.25f - 30.0f << "\" y=\"0\" z=\""
		     << (index / 50) * 1.1f
		     << "\" />\n\t\t\t<norm x=\"0\" y=\"1\" z=\"0\" />\n\t\t\t<color r=\"1\" g=\"1\" b=\"1\" a=\"1\" "
		        "/>\n"
		     << "\t\t\t<size value=\"0.5\" />\n\t\t\t<depth value=\"0.3\" />\n\t\t</decal>\n";
	}
	text << "\t</decals>\n</root>\n";
	return text.str();
}

std::string NodeGraphText(int aCount)
{
	std::ostringstream text;
	text << "<root>\n\t<node-graph>\n\t\t<nodes number-of-nodes=\"" << aCount << "\">\n";
	for (int index = 0; index < aCount; ++index)
	{
		text << "\t\t\t<node id=\"" << index + 1 << "\">\n\t\t\t\t<position x=\""
		     << (index % 50) * 1.25f - 30.0f << "\" y=\"0\" z=\"" << (index / 50) * 1.1f
		     << "\" />\n\t\t\t</node>\n";
	}
	text << "\t\t</nodes>\n\t\t<edges number-of-edges=\"" << (aCount > 0 ? aCount - 1 : 0) << "\">\n";
	for (int id = 1; id < aCount; ++id)
	{
		text << "\t\t\t<edge>\n\t\t\t\t<connections firstID=\"" << id << "\" secondID=\"" << id + 1
		     << "\" />\n\t\t\t\t<distance value=\"1\" />\n\t\t\t</edge>\n";
	}
	text << "\t\t</edges>\n\t</node-graph>\n</root>\n";
	return text.str();
}

// The scratch working directory and the facade, for the whole run.
class BenchLevels
{
public:
	BenchLevels()
	{
		namespace fs = std::filesystem;
		std::string pattern = (fs::temp_directory_path() / "lumora-level-bench-XXXXXX").string();
		if (mkdtemp(pattern.data()) == nullptr)
		{
			throw std::runtime_error("mkdtemp failed for " + pattern);
		}
		myDirectory = pattern;
		const fs::path source = fs::path(__FILE__).parent_path().parent_path() / "data";
		const fs::path data = myDirectory / "data";
		fs::create_directories(data / "XML");
		for (const fs::directory_entry& entry : fs::directory_iterator(source))
		{
			if (entry.path().filename() != "XML")
			{
				fs::create_directory_symlink(entry.path(), data / entry.path().filename());
			}
		}
		WriteText(data / "XML" / "EntityTypes.xml", ourEntityTypesText);
		WriteText(data / "XML" / "DecalTypes.xml", ourDecalTypesText);
		WriteLevel("full", ourCount, ourCount, ourCount);
		WriteLevel("lights_only", ourCount, 0, 0);
		WriteLevel("decals_only", 0, ourCount, 0);
		WriteLevel("nodes_only", 0, 0, ourCount);
		WriteLevel("empty", 0, 0, 0);

		myPreviousDirectory = fs::current_path();
		fs::current_path(myDirectory);
		if (!Lumora::LumoraWrapper::Create(0, 160, 90))
		{
			throw std::runtime_error("the facade could not be created (no OpenGL 4.5?)");
		}
	}

	~BenchLevels()
	{
		Lumora::LumoraWrapper::ShutDown();
		std::filesystem::current_path(myPreviousDirectory);
		std::error_code ignored;
		std::filesystem::remove_all(myDirectory, ignored);
	}

	Lumora::LumoraWrapper& Facade() { return *Lumora::LumoraWrapper::GetInstance(); }

private:
	void WriteLevel(const std::string& aName, int aLights, int aDecals, int aNodes)
	{
		const std::filesystem::path level = myDirectory / "data" / "XML" / "levels" / aName;
		WriteText(level / "rooms.xml", ourRoomsText);
		WriteText(level / "entities.xml", ourEntitiesText);
		WriteText(level / "lights.xml", LightsText(aLights));
		WriteText(level / "decals.xml", DecalsText(aDecals));
		WriteText(level / "nodegraph.xml", NodeGraphText(aNodes));
	}

	std::filesystem::path myDirectory;
	std::filesystem::path myPreviousDirectory;
};

BenchLevels& Levels()
{
	static BenchLevels ourLevels;
	return ourLevels;
}

void BM_LoadLevel(benchmark::State& aState, const char16_t* aLevel)
{
	Lumora::LumoraWrapper& facade = Levels().Facade();
	for (auto _ : aState)
	{
		facade.ParseLevel(aLevel);
	}
	aState.counters["lights"] = facade.GetPointLights().Count();
	aState.counters["decals"] = facade.GetDecals().Count();
	aState.counters["nodes"] = facade.GetNodes().Count();
}

// SaveLights writes lights.xml and then nodegraph.xml.
void BM_SaveLightsAndNodes(benchmark::State& aState, const char16_t* aLevel)
{
	Lumora::LumoraWrapper& facade = Levels().Facade();
	facade.ParseLevel(aLevel);
	for (auto _ : aState)
	{
		facade.SaveLights(aLevel);
	}
}

void BM_SaveDecals(benchmark::State& aState, const char16_t* aLevel)
{
	Lumora::LumoraWrapper& facade = Levels().Facade();
	facade.ParseLevel(aLevel);
	for (auto _ : aState)
	{
		facade.SaveDecals(aLevel);
	}
}

void BM_SaveLevel(benchmark::State& aState, const char16_t* aLevel)
{
	Lumora::LumoraWrapper& facade = Levels().Facade();
	facade.ParseLevel(aLevel);
	for (auto _ : aState)
	{
		facade.SaveLights(aLevel);
		facade.SaveDecals(aLevel);
	}
}
} // namespace

BENCHMARK_CAPTURE(BM_LoadLevel, full, u"full")->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_LoadLevel, empty, u"empty")->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_LoadLevel, lights_only, u"lights_only")->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_LoadLevel, decals_only, u"decals_only")->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_LoadLevel, nodes_only, u"nodes_only")->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_SaveLevel, full, u"full")->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_SaveLightsAndNodes, lights_only, u"lights_only")->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_SaveLightsAndNodes, nodes_only, u"nodes_only")->Unit(benchmark::kMillisecond);
BENCHMARK_CAPTURE(BM_SaveDecals, decals_only, u"decals_only")->Unit(benchmark::kMillisecond);
