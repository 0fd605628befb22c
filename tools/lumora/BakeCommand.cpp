#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <thread>

#include "BakeSupport.h"
#include "BakeWorkers.h"
#include "Commands.h"
#include "EditorSession.h"
#include "LevelCheck.h"
#include "ParallelBake.h"
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
// What the last bake of the facade ended with, when it did not finish.
bool Finished(EditorSession& aSession)
{
	return aSession.Editor().GetBakeStatus().myLastResult == Zeph::BakeResult::FINISHED;
}

bool BakeAmbient(EditorSession& aSession, const BakeOptions& someOptions)
{
	Lumora::LumoraWrapper& editor = aSession.Editor();
	const std::string path = AmbientFile(someOptions.myLevel);
	const auto start = std::chrono::steady_clock::now();
	const size_t problemsBefore = aSession.GetProblemCount();
	std::string refusal;
	{
		ProgressBar bar("ambient", [&editor] { return PollBake(editor); });
		if (someOptions.myRooms.empty())
		{
			editor.BakeAmbient(Lumora::ToWide(someOptions.myLevel), someOptions.myBounces,
			                   someOptions.myDebugCapturesFlag);
		}
		else
		{
			editor.BakeAmbientRooms(Lumora::ToWide(someOptions.myLevel), someOptions.myBounces,
			                        someOptions.myRooms, refusal);
		}
		bar.Stop(Finished(aSession));
	}
	const double seconds = SecondsSince(start);
	const Zeph::BakeStatus status = editor.GetBakeStatus();
	if (status.myLastResult == Zeph::BakeResult::CANCELLED)
	{
		return false;
	}
	// A volume too large to bake, or a file the disk would not take: the old file (if
	// any) is still there and readable, so its reading below would look like success.
	if (aSession.GetProblemCount() > problemsBefore)
	{
		PrintError("the ambient bake did not write " + path + ": " +
		           Describe(aSession.GetProblems()[problemsBefore]));
		return false;
	}
	if (status.myLastResult != Zeph::BakeResult::FINISHED)
	{
		PrintError("the ambient bake did not write " + path + ": " + status.myLastMessage);
		return false;
	}
	if (!status.myLastMessage.empty())
	{
		std::printf("ambient: %s\n", status.myLastMessage.c_str());
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
		ProgressBar bar("reflections", [&editor] { return PollBake(editor); });
		std::string refusal;
		if (someOptions.myRooms.empty())
		{
			editor.BakeSpecular(Lumora::ToWide(someOptions.myLevel));
		}
		else
		{
			editor.BakeSpecularRooms(Lumora::ToWide(someOptions.myLevel), someOptions.myRooms, refusal);
		}
		bar.Stop(Finished(aSession));
	}
	if (!Finished(aSession))
	{
		return false;
	}
	const double seconds = SecondsSince(start);
	const auto& rooms = editor.GetRooms();
	bool allWritten = true;
	int baked = 0;
	for (int index = 0; index < rooms.Count(); ++index)
	{
		const std::string& id = rooms[index]->GetID();
		if (!someOptions.myRooms.empty() && std::find(someOptions.myRooms.begin(), someOptions.myRooms.end(),
		                                              id) == someOptions.myRooms.end())
		{
			continue;
		}
		++baked;
		// A room whose ID names no file is not baked (the bake said so).
		const std::string path = Zeph::CubemapContainer::GetRoomFile(someOptions.myLevel, id);
		if (path.empty())
		{
			allWritten = false;
			continue;
		}
		allWritten = allWritten && std::filesystem::is_regular_file(path);
		std::printf("reflections: %s (%s)\n", path.c_str(), SizeOf(path).c_str());
	}
	std::printf("reflections: %d room%s in %.1f s (%.2f s per room)\n", baked, baked == 1 ? "" : "s", seconds,
	            baked > 0 ? seconds / baked : 0.0);
	if (!allWritten)
	{
		PrintError("the reflection bake did not write every room's cubemap");
	}
	return allWritten;
}

// One range of one bounce into a part file.
bool BakePart(EditorSession& aSession, const BakeOptions& someOptions)
{
	Lumora::LumoraWrapper& editor = aSession.Editor();
	const auto start = std::chrono::steady_clock::now();
	std::string problem;
	bool bakedFlag = false;
	{
		ProgressBar bar("ambient part", [&editor] { return PollBake(editor); });
		bakedFlag = editor.BakeAmbientPart(Lumora::ToWide(someOptions.myLevel), someOptions.myPartBounce,
		                                   someOptions.myPrevious, someOptions.myFirst, someOptions.myCount,
		                                   someOptions.myPartOutput, problem);
		bar.Stop(bakedFlag);
	}
	if (editor.GetBakeStatus().myLastResult == Zeph::BakeResult::CANCELLED)
	{
		return false;
	}
	if (!bakedFlag)
	{
		PrintError(problem);
		return false;
	}
	std::printf("ambient part: bounce %d, cells %lld to %lld (%lld probes) into %s (%s) in %.1f s\n",
	            someOptions.myPartBounce, someOptions.myFirst, someOptions.myFirst + someOptions.myCount - 1,
	            Zeph::Engine::GetInstance()->GetRenderer().GetBakedProbeCount(),
	            someOptions.myPartOutput.c_str(), SizeOf(someOptions.myPartOutput).c_str(),
	            SecondsSince(start));
	return true;
}

// The one line a cancelled bake leaves: what was written before the cancel, and that
// the rest is as it was.
int ReportCancel(const BakeOptions& someOptions, bool anAmbientWrittenFlag)
{
	const char* signal = GetStopSignal() == SIGTERM ? "SIGTERM" : "SIGINT";
	std::string kept;
	if (someOptions.myPartBounce > 0)
	{
		kept = "no part written";
	}
	else if (anAmbientWrittenFlag)
	{
		kept = "ambient.sh was written; every room cubemap is as it was";
	}
	else
	{
		kept = someOptions.myAmbientOnlyFlag    ? "ambient.sh is as it was"
		       : someOptions.mySpecularOnlyFlag ? "every room cubemap is as it was"
		                                        : "ambient.sh and every room cubemap are as they were";
	}
	PrintError("bake cancelled (" + std::string(signal) + "): " + kept);
	return 130;
}
} // namespace

int RunBake(const BakeOptions& someOptions)
{
	// A bake draws thousands of tiny targets, each waiting for the last: Mesa's
	// software rasterizer spends more handing them to its worker threads than the
	// threads save (the ambient bake runs about 1.7 times faster without them, the
	// reflections as fast). Only when nobody chose otherwise; other drivers ignore it.
	setenv("LP_NUM_THREADS", "0", 0);
	const StopSignals signals;
	EditorSession session;
	if (!session.Start(someOptions.myLevel, 320, 180, true))
	{
		return 1;
	}
	// Helpers start loading the level while this process checks it. (Their number is
	// trimmed once the level's probes and rooms are known; a refused bake stops them.)
	BakeWorkers workers;
	const int jobs = someOptions.myJobs > 0
	                     ? someOptions.myJobs
	                     : static_cast<int>(std::max(1u, std::thread::hardware_concurrency()));
	if (jobs > 1 && someOptions.myPartBounce == 0 && !workers.Init(someOptions.myLevel, jobs - 1))
	{
		std::fprintf(stderr, "lumora: no helper process could be started; the bake runs in this one\n");
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
	auto& editor = session.Editor();
	// Room IDs are checked before anything is baked: a misspelt one bakes nothing.
	for (const std::string& id : someOptions.myRooms)
	{
		bool foundFlag = false;
		for (int index = 0; index < editor.GetRooms().Count(); ++index)
		{
			foundFlag = foundFlag || editor.GetRooms()[index]->GetID() == id;
		}
		if (!foundFlag)
		{
			PrintError("level '" + someOptions.myLevel + "' has no room with the ID '" + id + "'");
			return 2;
		}
	}
	std::printf("level %s: %d rooms, %d point and %d spot lights\n", someOptions.myLevel.c_str(),
	            editor.GetRooms().Count(), editor.GetPointLights().Count(), editor.GetSpotLights().Count());
	const size_t before = session.GetProblemCount();
	// Fewer helpers than started when the level has fewer probes and rooms to share.
	workers.Keep(CountUsefulWorkers(session, someOptions, workers.GetCount() + 1));
	const bool sharedFlag = workers.GetCount() > 0;
	bool done = true;
	bool ambientWrittenFlag = false;
	if (someOptions.myPartBounce > 0)
	{
		done = !StopAsked() && BakePart(session, someOptions);
	}
	else
	{
		if (!someOptions.mySpecularOnlyFlag && !StopAsked())
		{
			done = sharedFlag && someOptions.myBounces > 0
			           ? BakeAmbientInParallel(session, someOptions, workers)
			           : BakeAmbient(session, someOptions);
			ambientWrittenFlag = done && someOptions.myBounces > 0;
		}
		if (!someOptions.myAmbientOnlyFlag && !StopAsked())
		{
			const std::string ambient = ambientWrittenFlag ? AmbientFile(someOptions.myLevel) : std::string();
			done = (sharedFlag ? BakeReflectionsInParallel(session, someOptions, workers, ambient)
			                   : BakeReflections(session, someOptions)) &&
			       done;
		}
	}
	if (StopAsked() || !done)
	{
		// Their running jobs are cancelled: nothing they bake would be used.
		workers.Stop();
	}
	workers.Destroy();
	if (StopAsked())
	{
		return ReportCancel(someOptions, ambientWrittenFlag);
	}
	if (session.GetProblemCount() > before)
	{
		PrintError("the bake reported problems:");
		session.PrintProblems(before);
		return 1;
	}
	return done ? 0 : 1;
}

int RunBakeMerge(const MergeOptions& someOptions)
{
	EditorSession session;
	if (!session.Start(someOptions.myLevel, 64, 64, true) || !session.Load(someOptions.myLevel))
	{
		return 1;
	}
	std::string problem;
	if (!session.Editor().MergeAmbientParts(Lumora::ToWide(someOptions.myLevel), someOptions.myParts,
	                                        someOptions.myOutput, problem))
	{
		PrintError("not merged: " + problem);
		return 1;
	}
	std::printf("merged %zu part%s into %s (%s)\n", someOptions.myParts.size(),
	            someOptions.myParts.size() == 1 ? "" : "s", someOptions.myOutput.c_str(),
	            SizeOf(someOptions.myOutput).c_str());
	return 0;
}
} // namespace LumoraTool
