#include "ParallelBake.h"

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <map>
#include <vector>

#include "BakeSupport.h"
#include "BakeWorkers.h"
#include "EditorSession.h"
#include "ProgressBar.h"
#include "editor/BakeRecord.h"
#include "editor/StringConversion.h"
#include "engine/Room.h"
#include "platform/paths/Paths.h"
#include "renderer/AmbientGrid.h"
#include "renderer/CubemapContainer.h"

namespace LumoraTool
{
namespace
{
using Job = std::vector<std::string>;

struct CellRange
{
	long long myFirst = 0;
	long long myCount = 0;
};

// The grid's cells in at most aParts consecutive ranges that cover them all, each holding
// about as many of the probes a bounce renders (the cells outside every room cost nothing).
std::vector<CellRange> SplitByProbes(const Zeph::AmbientGrid& aGrid,
                                     const GrowingArray<Zeph::Room*>& someRooms, int aParts)
{
	std::vector<long long> probeCells;
	aGrid.ForEachProbe([&](const Vector3<float>& aPosition, int, int, int, size_t aCell) {
		if (Zeph::AmbientGrid::StrictlyInsideAnyRoom(someRooms, aPosition))
		{
			probeCells.push_back(static_cast<long long>(aCell));
		}
	});
	const long long probes = static_cast<long long>(probeCells.size());
	const long long parts = std::clamp<long long>(aParts, 1, std::max<long long>(probes, 1));
	std::vector<long long> starts{0};
	for (long long part = 1; part < parts; ++part)
	{
		const long long cell = probeCells[static_cast<size_t>(part * probes / parts)];
		if (cell > starts.back())
		{
			starts.push_back(cell);
		}
	}
	std::vector<CellRange> ranges;
	for (size_t index = 0; index < starts.size(); ++index)
	{
		const long long end = index + 1 < starts.size() ? starts[index + 1] : aGrid.GetCellCount();
		ranges.push_back({starts[index], end - starts[index]});
	}
	return ranges;
}

// A folder of its own under the system's temporary folder (or, where that cannot be had, a
// hidden one in aFallbackParent), removed with what it holds.
class ScratchFolder
{
public:
	explicit ScratchFolder(const std::string& aFallbackParent)
	{
		std::error_code error;
		const std::filesystem::path system = std::filesystem::temp_directory_path(error);
		for (const std::string& pattern : {error ? std::string() : (system / "lumora-bake-XXXXXX").string(),
		                                   aFallbackParent + "/.lumora-bake-XXXXXX"})
		{
			std::string path = pattern;
			if (!path.empty() && mkdtemp(path.data()) != nullptr)
			{
				myPath = path;
				return;
			}
		}
	}
	~ScratchFolder()
	{
		if (!myPath.empty())
		{
			std::error_code error;
			std::filesystem::remove_all(myPath, error);
		}
	}
	ScratchFolder(const ScratchFolder&) = delete;
	ScratchFolder& operator=(const ScratchFolder&) = delete;

	const std::string& GetPath() const { return myPath; }

private:
	std::string myPath;
};

// Runs someJobs over the workers and this process: job j goes to process j % (workers + 1),
// the last of them being this one, which bakes its own after sending the others theirs. A
// job a worker cannot take, fails or dies on is baked here. aDone counts the jobs finished.
// False, with the reason, when a job failed here or a stop was asked.
bool ShareJobs(EditorSession& aSession, const std::string& aLevel, BakeWorkers& someWorkers,
               const std::vector<Job>& someJobs, std::atomic<int>& aDone, std::string& aProblemOut)
{
	const int workers = someWorkers.GetCount();
	std::vector<std::vector<size_t>> sent(static_cast<size_t>(workers));
	std::vector<size_t> here;
	const auto noteLoss = [](const std::string& aProblem) {
		std::fprintf(stderr, "lumora: a helper process did not bake its share (%s); this process bakes it\n",
		             aProblem.c_str());
	};
	for (size_t job = 0; job < someJobs.size(); ++job)
	{
		const int owner = static_cast<int>(job % static_cast<size_t>(workers + 1));
		std::string loss;
		if (owner < workers && someWorkers.Send(owner, someJobs[job], loss))
		{
			sent[static_cast<size_t>(owner)].push_back(job);
			continue;
		}
		if (!loss.empty())
		{
			noteLoss(loss);
		}
		here.push_back(job);
	}
	const auto bakeHere = [&](size_t aJob) {
		aProblemOut = RunBakeJob(aSession, aLevel, someJobs[aJob]);
		if (!aProblemOut.empty() || StopAsked())
		{
			return false;
		}
		++aDone;
		return true;
	};
	for (const size_t job : here)
	{
		if (!bakeHere(job))
		{
			return false;
		}
	}
	for (int worker = 0; worker < workers; ++worker)
	{
		for (const size_t job : sent[static_cast<size_t>(worker)])
		{
			std::string problem;
			if (someWorkers.Receive(worker, problem))
			{
				++aDone;
				continue;
			}
			if (StopAsked())
			{
				return false;
			}
			noteLoss(problem);
			if (!bakeHere(job))
			{
				return false;
			}
		}
	}
	return true;
}

const char* Plural(long long aCount)
{
	return aCount == 1 ? "" : "s";
}

// The phase's entry of the bake record; false (said) when it cannot be written.
bool Record(Lumora::LumoraWrapper& anEditor, const BakeOptions& someOptions, Lumora::BakePhase aPhase,
            int aBounces, double aSeconds)
{
	std::string problem;
	const std::map<std::string, double> timings{{"total", aSeconds}};
	if (!anEditor.RecordBake(Lumora::ToWide(someOptions.myLevel), aPhase, {}, aBounces, timings, problem))
	{
		PrintError("the bake record was not written: " + problem);
		return false;
	}
	return true;
}
} // namespace

int CountUsefulWorkers(EditorSession& aSession, const BakeOptions& someOptions, int aJobs)
{
	const GrowingArray<Zeph::Room*>& rooms = aSession.Editor().GetRooms();
	long long shares = 0;
	if (!someOptions.mySpecularOnlyFlag && someOptions.myBounces > 0)
	{
		const Zeph::AmbientGrid grid = Zeph::AmbientGrid::FromRooms(rooms);
		// A grid the bake refuses is refused by the bake in this process, with its numbers.
		if (!grid.IsEmpty() && grid.GetSizeProblem().empty())
		{
			shares = grid.CountProbesInside(rooms);
		}
	}
	if (!someOptions.myAmbientOnlyFlag)
	{
		shares = std::max<long long>(shares, rooms.Count());
	}
	return static_cast<int>(std::clamp<long long>(std::min<long long>(aJobs, shares) - 1, 0, aJobs));
}

bool BakeAmbientInParallel(EditorSession& aSession, const BakeOptions& someOptions, BakeWorkers& someWorkers)
{
	Lumora::LumoraWrapper& editor = aSession.Editor();
	const std::u16string level = Lumora::ToWide(someOptions.myLevel);
	const std::string path = AmbientFile(someOptions.myLevel);
	const auto start = std::chrono::steady_clock::now();
	const Zeph::AmbientGrid grid = Zeph::AmbientGrid::FromRooms(editor.GetRooms());
	const std::vector<CellRange> ranges = SplitByProbes(grid, editor.GetRooms(), someWorkers.GetCount() + 1);
	const ScratchFolder scratch("data/XML/levels/" + someOptions.myLevel);
	if (scratch.GetPath().empty())
	{
		PrintError("the ambient bake did not write " + path + ": no temporary folder for its parts");
		return false;
	}
	const int bounces = someOptions.myBounces;
	std::atomic<int> bounceNow{1};
	std::atomic<int> partsDone{0};
	std::string problem;
	bool bakedFlag = true;
	{
		// This process's own part moves the bar: the parts hold about as many probes each.
		ProgressBar bar("ambient", [&] {
			const int part = std::clamp(editor.GetBakeProgress(), 0, 100);
			const int bounce = bounceNow.load();
			char detail[96];
			std::snprintf(detail, sizeof(detail), "bounce %d/%d, %d processes", bounce, bounces,
			              static_cast<int>(ranges.size()));
			return ProgressBar::Progress{((bounce - 1) * 100 + part) / bounces, detail};
		});
		std::string previous;
		for (int bounce = 1; bounce <= bounces && bakedFlag; ++bounce)
		{
			bounceNow = bounce;
			std::vector<Job> jobs;
			std::vector<std::string> parts;
			for (const CellRange& range : ranges)
			{
				parts.push_back(scratch.GetPath() + "/bounce" + std::to_string(bounce) + "-" +
				                std::to_string(range.myFirst) + ".part");
				jobs.push_back({"ambient", std::to_string(bounce), std::to_string(range.myFirst),
				                std::to_string(range.myCount), previous, parts.back()});
			}
			// The last bounce's parts are merged straight into the level's file (through a
			// temporary beside it); the others into the volume the next bounce is lit by.
			const std::string merged =
			    bounce == bounces ? path : scratch.GetPath() + "/bounce" + std::to_string(bounce) + ".sh";
			bakedFlag = ShareJobs(aSession, someOptions.myLevel, someWorkers, jobs, partsDone, problem) &&
			            editor.MergeAmbientParts(level, parts, merged, problem);
			previous = merged;
		}
		bar.Stop(bakedFlag);
	}
	if (!bakedFlag)
	{
		// Before their folder goes: a helper still baking would make it again for its part.
		someWorkers.Stop();
	}
	if (StopAsked())
	{
		return false;
	}
	if (!bakedFlag)
	{
		PrintError("the ambient bake did not write " + path + ": " + problem);
		return false;
	}
	const double seconds = SecondsSince(start);
	const long long probes = grid.CountProbesInside(editor.GetRooms()) * bounces;
	std::printf("ambient: %s (%s): %d x %d x %d cells, %lld probes rendered over %d bounce%s in %.1f s "
	            "(%.0f probes/s, %zu processes)\n",
	            path.c_str(), SizeOf(path).c_str(), grid.myCounts[0], grid.myCounts[1], grid.myCounts[2],
	            probes, bounces, Plural(bounces), seconds,
	            seconds > 0.0 ? static_cast<double>(probes) / seconds : 0.0, ranges.size());
	return Record(editor, someOptions, Lumora::BakePhase::AMBIENT, bounces, seconds);
}

bool BakeReflectionsInParallel(EditorSession& aSession, const BakeOptions& someOptions,
                               BakeWorkers& someWorkers, const std::string& anAmbientFile)
{
	Lumora::LumoraWrapper& editor = aSession.Editor();
	const auto start = std::chrono::steady_clock::now();
	const GrowingArray<Zeph::Room*>& rooms = editor.GetRooms();
	std::vector<std::string> targets;
	std::vector<std::string> temporaries;
	std::vector<Job> jobs;
	std::string problem;
	for (int index = 0; index < rooms.Count() && problem.empty(); ++index)
	{
		const std::string& id = rooms[index]->GetID();
		const std::string file = Zeph::CubemapContainer::GetRoomFile(someOptions.myLevel, id);
		const std::string target = file.empty() ? std::string() : Paths::PrepareForWrite(file);
		const std::string temporary = target.empty() ? std::string() : Paths::TemporaryFor(target);
		if (file.empty())
		{
			problem = "room ID '" + id + "' cannot name a cubemap file";
		}
		else if (temporary.empty())
		{
			problem = file + ": no temporary file can be made beside it";
		}
		else
		{
			targets.push_back(target);
			temporaries.push_back(temporary);
			jobs.push_back({"cubemap", id, anAmbientFile, temporary});
		}
	}
	std::atomic<int> roomsDone{0};
	const int processes = std::min(someWorkers.GetCount() + 1, std::max(static_cast<int>(jobs.size()), 1));
	bool bakedFlag = problem.empty();
	if (bakedFlag)
	{
		ProgressBar bar("reflections", [&] {
			const int done = roomsDone.load();
			char detail[96];
			std::snprintf(detail, sizeof(detail), "%d/%zu rooms, %d processes", done, jobs.size(), processes);
			return ProgressBar::Progress{jobs.empty() ? 100 : done * 100 / static_cast<int>(jobs.size()),
			                             detail};
		});
		bakedFlag = ShareJobs(aSession, someOptions.myLevel, someWorkers, jobs, roomsDone, problem);
		bar.Stop(bakedFlag);
	}
	if (!bakedFlag || StopAsked())
	{
		// Before the temporaries go: a helper still baking would write its own again.
		someWorkers.Stop();
	}
	// Every cubemap is in its temporary before the first replaces its file.
	for (size_t index = 0; index < targets.size(); ++index)
	{
		if (!bakedFlag || StopAsked())
		{
			Paths::Discard(temporaries[index]);
		}
		else if (!Paths::ReplaceWith(temporaries[index], targets[index]))
		{
			problem = targets[index] + " could not be replaced";
			bakedFlag = false;
		}
	}
	if (StopAsked())
	{
		return false;
	}
	if (!bakedFlag)
	{
		PrintError("the reflection bake did not write every room's cubemap: " + problem);
		return false;
	}
	const double seconds = SecondsSince(start);
	for (const std::string& target : targets)
	{
		std::printf("reflections: %s (%s)\n", target.c_str(), SizeOf(target).c_str());
	}
	const long long baked = static_cast<long long>(targets.size());
	std::printf("reflections: %lld room%s in %.1f s (%.2f s per room, %d processes)\n", baked, Plural(baked),
	            seconds, baked > 0 ? seconds / static_cast<double>(baked) : 0.0, processes);
	return Record(editor, someOptions, Lumora::BakePhase::REFLECTIONS, 0, seconds);
}
} // namespace LumoraTool
