// The XML cursor on a level-sized lights file: 2,000 point-light records, read the way the level
// loader reads them, and written the way the level saver writes them.

#include <benchmark/benchmark.h>

#include <bitset>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <string>

#include "engine/Debug.h"
#include "xml/XML.h"
#include "xml/XMLElement.h"

namespace
{
constexpr int ourPointLightCount = 2000;

const char* const ourEmptyLightsText = "<?xml version=\"1.0\" ?>\n<!-- saved by the benchmark -->\n"
                                       "<root>\n\t<point-lights />\n\t<spot-lights />\n</root>\n";

void WriteText(const std::string& aPath, const std::string& someText)
{
	std::ofstream out(aPath, std::ios::binary | std::ios::trunc);
	out << someText;
}

// A scratch directory with the generated files and the log the cursor reports to; it lives for the
// whole run and is removed at exit.
class BenchFiles
{
public:
	BenchFiles()
	{
		std::string pattern = (std::filesystem::temp_directory_path() / "lumora-xml-bench-XXXXXX").string();
		if (mkdtemp(pattern.data()) == nullptr)
		{
			throw std::runtime_error("mkdtemp failed for " + pattern);
		}
		myDirectory = pattern;
		Debug::Create((myDirectory / "DebugLogger.txt").string(), std::bitset<4>(0));

		std::ostringstream text;
		text << "<?xml version=\"1.0\" ?>\n<root>\n\t<point-lights>\n";
		for (int i = 0; i < ourPointLightCount; ++i)
		{
			text << "\t\t<point-light>\n"
			     << "\t\t\t<position x=\"" << i * 0.5f << "\" y=\"" << 2.25f << "\" z=\"" << -i * 0.125f
			     << "\" />\n"
			     << "\t\t\t<color r=\"1\" g=\"0.8\" b=\"" << (i % 10) * 0.1f << "\" a=\"2.5\" />\n"
			     << "\t\t\t<falloff value=\"" << 3.0f + (i % 7) << "\" />\n"
			     << "\t\t</point-light>\n";
		}
		text << "\t</point-lights>\n\t<spot-lights />\n</root>\n";
		myLightsPath = (myDirectory / "lights.xml").string();
		WriteText(myLightsPath, text.str());
		mySavedPath = (myDirectory / "saved-lights.xml").string();
	}

	~BenchFiles()
	{
		Debug::Destroy();
		std::error_code ignored;
		std::filesystem::remove_all(myDirectory, ignored);
	}

	std::filesystem::path myDirectory;
	std::string myLightsPath;
	std::string mySavedPath;
};

BenchFiles& Files()
{
	static BenchFiles ourFiles;
	return ourFiles;
}

void BM_LoadAndReadPointLights(benchmark::State& aState)
{
	const std::string& path = Files().myLightsPath;
	for (auto _ : aState)
	{
		XML xml(path);
		xml.GoToElement("point-lights", "", "");
		float sum = 0.0f;
		int count = 0;
		if (xml.EnterChild("point-light"))
		{
			do
			{
				const Vector3<float> position = xml.GetVector3Attribute("position");
				const Vector4<float> color = xml.GetVector4Attribute("color");
				const float falloff = xml.GetChildAttribute<float>("falloff", "");
				sum += position.x + position.y + position.z + color.x + color.w + falloff;
				++count;
			} while (xml.GoToNextSibling("point-light"));
		}
		xml.ExitChild();
		if (count != ourPointLightCount)
		{
			aState.SkipWithError("the walk did not read every record");
			break;
		}
		benchmark::DoNotOptimize(sum);
	}
	aState.SetItemsProcessed(aState.iterations() * ourPointLightCount);
}
BENCHMARK(BM_LoadAndReadPointLights)->Unit(benchmark::kMillisecond);

void BM_BuildAndSavePointLights(benchmark::State& aState)
{
	const std::string& path = Files().mySavedPath;
	for (auto _ : aState)
	{
		// Every round rewrites the same small file, as the saver does with an existing level.
		aState.PauseTiming();
		WriteText(path, ourEmptyLightsText);
		aState.ResumeTiming();

		XML xml(path);
		xml.GoToElement("point-lights", "", "");
		xml.RemoveChildren();
		for (int i = 0; i < ourPointLightCount; ++i)
		{
			XMLElement position("position");
			position.AddVector3Attributes(Vector3<float>(i * 0.5f, 2.25f, -i * 0.125f));
			XMLElement color("color");
			color.AddVector4Attributes(Vector4<float>(1.0f, 0.8f, (i % 10) * 0.1f, 2.5f));
			XMLElement falloff("falloff");
			falloff.AddAttribute("value", 3.0f + static_cast<float>(i % 7));
			XMLElement record("point-light");
			record.InsertElement(position);
			record.InsertElement(color);
			record.InsertElement(falloff);
			xml.InsertElement(record, false);
		}
		xml.SaveFile();
	}
	aState.SetItemsProcessed(aState.iterations() * ourPointLightCount);
	aState.counters["file_bytes"] = static_cast<double>(std::filesystem::file_size(path));
}
BENCHMARK(BM_BuildAndSavePointLights)->Unit(benchmark::kMillisecond);
} // namespace
