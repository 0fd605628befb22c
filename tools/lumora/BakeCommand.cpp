#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>

#include "Commands.h"
#include "EditorSession.h"
#include "LevelCheck.h"
#include "ProgressBar.h"
#include "editor/StringConversion.h"
#include "engine/Engine.h"
#include "engine/Room.h"
#include "renderer/AmbientVolumeFile.h"
#include "renderer/CubemapContainer.h"
#include "renderer/Renderer.h"

namespace LumoraTool
{
namespace
{
double SecondsSince(std::chrono::steady_clock::time_point aStart)
{
	return std::chrono::duration<double>(std::chrono::steady_clock::now() - aStart).count();
}

std::string SizeOf(const std::string& aPath)
{
	std::error_code error;
	const auto bytes = std::filesystem::file_size(aPath, error);
	return error ? std::string("missing") : std::to_string(bytes) + " bytes";
}

bool BakeAmbient(EditorSession& aSession, const BakeOptions& someOptions)
{
	Lumora::LumoraWrapper& editor = aSession.Editor();
	const std::string path = "data/XML/levels/" + someOptions.myLevel + "/ambient.sh";
	const auto start = std::chrono::steady_clock::now();
	const size_t problemsBefore = aSession.GetProblemCount();
	{
		ProgressBar bar("ambient", [&editor] { return editor.GetBakeProgress(); });
		editor.BakeAmbient(Lumora::ToWide(someOptions.myLevel), someOptions.myBounces,
		                   someOptions.myDebugCapturesFlag);
	}
	const double seconds = SecondsSince(start);
	// A volume too large to bake, or a file the disk would not take: the old file (if
	// any) is still there and readable, so its reading below would look like success.
	if (aSession.GetProblemCount() > problemsBefore)
	{
		PrintError("the ambient bake did not write " + path + ": " +
		           Describe(aSession.GetProblems()[problemsBefore]));
		return false;
	}
	const long long probes = Zeph::Engine::GetInstance()->GetRenderer().GetBakedProbeCount();
	if (someOptions.myBounces == 0)
	{
		std::printf("ambient: 0 bounces, nothing written\n");
		return true;
	}
	Zeph::AmbientVolume volume;
	std::string problem;
	if (Zeph::ReadAmbientVolume(path, volume, problem) != Zeph::AmbientVolumeRead::OK)
	{
		PrintError("the ambient bake wrote no readable " + path + ": " + problem);
		return false;
	}
	std::printf("ambient: %s (%s): %d x %d x %d cells, %lld probes rendered over %d bounce%s in %.1f s "
	            "(%.0f probes/s)\n",
	            path.c_str(), SizeOf(path).c_str(), volume.myCounts[0], volume.myCounts[1],
	            volume.myCounts[2], probes, someOptions.myBounces, someOptions.myBounces == 1 ? "" : "s",
	            seconds, seconds > 0.0 ? static_cast<double>(probes) / seconds : 0.0);
	if (someOptions.myDebugCapturesFlag)
	{
		std::printf("ambient: probe captures in data/cubemaps/sh debug/\n");
	}
	return true;
}

bool BakeReflections(EditorSession& aSession, const BakeOptions& someOptions)
{
	Lumora::LumoraWrapper& editor = aSession.Editor();
	const auto start = std::chrono::steady_clock::now();
	{
		ProgressBar bar("reflections", [&editor] { return editor.GetBakeProgress(); });
		editor.BakeSpecular(Lumora::ToWide(someOptions.myLevel));
	}
	const double seconds = SecondsSince(start);
	const auto& rooms = editor.GetRooms();
	bool allWritten = true;
	for (int index = 0; index < rooms.Count(); ++index)
	{
		// A room whose ID names no file is not baked (the bake said so).
		const std::string path =
		    Zeph::CubemapContainer::GetRoomFile(someOptions.myLevel, rooms[index]->GetID());
		if (path.empty())
		{
			allWritten = false;
			continue;
		}
		allWritten = allWritten && std::filesystem::is_regular_file(path);
		std::printf("reflections: %s (%s)\n", path.c_str(), SizeOf(path).c_str());
	}
	std::printf("reflections: %d room%s in %.1f s (%.2f s per room)\n", rooms.Count(),
	            rooms.Count() == 1 ? "" : "s", seconds, rooms.Count() > 0 ? seconds / rooms.Count() : 0.0);
	if (!allWritten)
	{
		PrintError("the reflection bake did not write every room's cubemap");
	}
	return allWritten;
}
} // namespace

int RunBake(const BakeOptions& someOptions)
{
	// A bake draws thousands of tiny targets, each waiting for the last: Mesa's
	// software rasterizer spends more handing them to its worker threads than the
	// threads save (the ambient bake runs about 1.7 times faster without them, the
	// reflections as fast). Only when nobody chose otherwise; other drivers ignore it.
	setenv("LP_NUM_THREADS", "0", 0);
	EditorSession session;
	if (!session.Start(someOptions.myLevel, 320, 180, true))
	{
		return 1;
	}
	// What check finds wrong would be baked in (a misspelt catalogue entry bakes an empty
	// level over a good bake); damaged baked files are what the bake replaces.
	const LevelReport report = CheckLevel(session, someOptions.myLevel);
	if (!report.myProblems.empty())
	{
		const std::string count = std::to_string(report.myProblems.size()) + " problem" +
		                          (report.myProblems.size() == 1 ? "" : "s");
		if (!someOptions.myForceFlag)
		{
			PrintError("level '" + someOptions.myLevel + "' has " + count +
			           "; not baked (lumora check lists them, --force bakes anyway):");
			for (const std::string& problem : report.myProblems)
			{
				std::fprintf(stderr, "  %s\n", problem.c_str());
			}
			return 1;
		}
		std::printf("level %s: %s, baked anyway (--force)\n", someOptions.myLevel.c_str(), count.c_str());
	}
	const auto& editor = session.Editor();
	std::printf("level %s: %d rooms, %d point and %d spot lights\n", someOptions.myLevel.c_str(),
	            editor.GetRooms().Count(), editor.GetPointLights().Count(), editor.GetSpotLights().Count());
	const size_t before = session.GetProblemCount();
	bool done = true;
	if (!someOptions.mySpecularOnlyFlag)
	{
		done = BakeAmbient(session, someOptions) && done;
	}
	if (!someOptions.myAmbientOnlyFlag)
	{
		done = BakeReflections(session, someOptions) && done;
	}
	if (session.GetProblemCount() > before)
	{
		PrintError("the bake reported problems:");
		session.PrintProblems(before);
		return 1;
	}
	return done ? 0 : 1;
}
} // namespace LumoraTool
