// Level folders: the five level files and the two catalogues, any bytes, loaded through the
// editor facade with the log non-fatal (the tool that checks levels runs it so): loading may
// report and leave things out, but never crash; and what the editor then saves loads again
// with the same records.
//
// The facade is made once, headless, in a scratch working directory whose data/ links to the
// repository's data folders, except data/XML, which holds the files of each input.

#include <array>
#include <bitset>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <string_view>
#include <system_error>
#include <unistd.h>

#include "FuzzEntries.h"
#include "editor/LumoraWrapper.h"
#include "platform/gpu/Device.h"

namespace
{
namespace fs = std::filesystem;

// In the order the parts of an input come in.
constexpr std::array<const char*, 7> ourFiles = {
    "data/XML/levels/fuzz/rooms.xml",  "data/XML/levels/fuzz/entities.xml",
    "data/XML/levels/fuzz/lights.xml", "data/XML/levels/fuzz/nodegraph.xml",
    "data/XML/levels/fuzz/decals.xml", "data/XML/EntityTypes.xml",
    "data/XML/DecalTypes.xml",
};

// The scratch working directory, and the one the process started in.
fs::path ourScratch;
fs::path ourPreviousDirectory;

// The facade, made on the first call (null without an OpenGL context).
Lumora::LumoraWrapper* Facade()
{
	static Lumora::LumoraWrapper* const ourFacade = []() -> Lumora::LumoraWrapper* {
		Gpu::Device probe;
		if (!probe.Init(16, 16))
		{
			return nullptr;
		}
		probe.Destroy();
		const fs::path source = fs::path(LUMORA_FUZZ_SOURCE_ROOT) / "data";
		ourScratch = fs::temp_directory_path() / ("lumora-fuzz-level-" + std::to_string(::getpid()));
		fs::remove_all(ourScratch);
		fs::create_directories(ourScratch / "data/XML/levels/fuzz");
		for (const fs::directory_entry& entry : fs::directory_iterator(source))
		{
			if (entry.path().filename() != "XML")
			{
				fs::create_directory_symlink(entry.path(), ourScratch / "data" / entry.path().filename());
			}
		}
		fs::copy(source / "XML/EntityTypes.xml", ourScratch / "data/XML/EntityTypes.xml");
		fs::copy(source / "XML/DecalTypes.xml", ourScratch / "data/XML/DecalTypes.xml");
		ourPreviousDirectory = fs::current_path();
		fs::current_path(ourScratch);
		// A fuzzer ends by exit(), never through ShutDownLevel: the scratch folder (with a log of
		// every input's reports) goes then. After a crash it stays, for a look at the log.
		std::atexit([] {
			std::error_code ignored;
			fs::remove_all(ourScratch, ignored);
		});
		Lumora::LumoraWrapper::SetFatalReportLevels(std::bitset<4>(0));
		LumoraFuzz::Require(Lumora::LumoraWrapper::Create(0, 64, 64)); // a context was there a moment ago
		return Lumora::LumoraWrapper::GetInstance();
	}();
	return ourFacade;
}
} // namespace

bool LumoraFuzz::LevelAvailable()
{
	return Facade() != nullptr;
}

void LumoraFuzz::ShutDownLevel()
{
	if (Facade() != nullptr)
	{
		Lumora::LumoraWrapper::ShutDown();
		Lumora::LumoraWrapper::SetFatalReportLevels(std::bitset<4>(12));
		fs::current_path(ourPreviousDirectory);
		fs::remove_all(ourScratch);
	}
}

int LumoraFuzz::Level(const uint8_t* someData, size_t aSize)
{
	Lumora::LumoraWrapper* facade = Facade();
	if (facade == nullptr)
	{
		return 0;
	}
	std::string_view rest(reinterpret_cast<const char*>(someData), aSize);
	for (const char* file : ourFiles)
	{
		if (rest.data() == nullptr)
		{
			std::remove(file);
			continue;
		}
		const size_t end = rest.find('\0');
		std::ofstream(file, std::ios::binary | std::ios::trunc) << rest.substr(0, end);
		rest = end == std::string_view::npos ? std::string_view() : rest.substr(end + 1);
	}
	facade->ReloadCatalogues();
	facade->ParseLevel(u"fuzz");
	// What the editor saves loads again, with the same records (what the loader left out stays
	// left out, and stays in the files).
	const auto records = [facade] {
		return std::array{facade->GetPointLights().Count(), facade->GetSpotLights().Count(),
		                  facade->GetDecals().Count(), facade->GetNodes().Count(),
		                  facade->GetEdges().Count()};
	};
	const std::array<int, 5> loaded = records();
	facade->SaveLights(u"fuzz");
	facade->SaveDecals(u"fuzz");
	facade->ParseLevel(u"fuzz");
	Require(records() == loaded);
	return 0;
}
