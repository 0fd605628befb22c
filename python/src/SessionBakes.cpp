// The bakes: the level's whole bake, on a thread of its own so that the caller's thread can
// report progress and take Ctrl-C; and the pieces of a bake spread over machines, which run on
// the caller's thread with Python's lock released.
#include <pybind11/stl.h>

#include <atomic>
#include <chrono>
#include <exception>
#include <functional>
#include <thread>

#include "EngineSession.h"
#include "Errors.h"
#include "ReportCollector.h"
#include "WorkingFolder.h"
#include "editor/LumoraWrapper.h"
#include "editor/StringConversion.h"
#include "engine/Engine.h"
#include "renderer/Renderer.h"

namespace py = pybind11;

namespace LumoraPython
{
namespace
{
py::dict StatusDict(const Zeph::BakeStatus& aStatus, int aProgress)
{
	py::dict status;
	status["phase"] = Zeph::GetBakePhaseName(aStatus.myPhase);
	status["bounce"] = aStatus.myBounce;
	status["bounces"] = aStatus.myBounceCount;
	status["probes_done"] = aStatus.myProbesDone;
	status["probes_total"] = aStatus.myProbesTotal;
	status["rooms_done"] = aStatus.myRoomsDone;
	status["rooms_total"] = aStatus.myRoomsTotal;
	status["elapsed"] = aStatus.myElapsedSeconds;
	status["seconds_left"] = aStatus.mySecondsLeft >= 0.0 ? py::cast(aStatus.mySecondsLeft) : py::none();
	status["last_result"] = Zeph::GetBakeResultName(aStatus.myLastResult);
	status["last_message"] = aStatus.myLastMessage;
	status["percent"] = aProgress;
	return status;
}

std::string JoinProblems(const std::vector<std::string>& someProblems)
{
	std::string text;
	for (const std::string& problem : someProblems)
	{
		text += "\n" + problem;
	}
	return text;
}
} // namespace

void EngineSession::CancelBake()
{
	if (Lumora::LumoraWrapper* facade = Lumora::LumoraWrapper::GetInstance(); facade != nullptr && myOpenFlag)
	{
		facade->CancelBake();
	}
}

py::dict EngineSession::GetBakeStatus() const
{
	const Lumora::LumoraWrapper& facade = Facade();
	return StatusDict(facade.GetBakeStatus(), facade.GetBakeProgress());
}

py::dict EngineSession::Bake(int aBounces, bool anAmbientFlag, bool aReflectionsFlag,
                             const std::vector<std::string>& someRooms, const py::object& aProgress,
                             double aPollSeconds)
{
	RequireLevel();
	Lumora::LumoraWrapper& facade = Facade();
	if (aBounces < 0 || aBounces > 16)
	{
		throw std::invalid_argument("bounces must be 0..16, not " + std::to_string(aBounces));
	}
	const std::u16string level = Lumora::ToWide(myLevel);
	WorkingFolder here(myDataFolder);
	const size_t mark = ReportCollector::Get().Mark();
	std::atomic<bool> doneFlag{false};
	std::string refusal;
	bool ambientFinishedFlag = false;
	long long probes = 0;
	const auto start = std::chrono::steady_clock::now();
	std::thread bake([&] {
		const auto finished = [&facade] {
			return facade.GetBakeStatus().myLastResult == Zeph::BakeResult::FINISHED;
		};
		bool goOnFlag = true;
		if (anAmbientFlag)
		{
			if (someRooms.empty())
			{
				facade.BakeAmbient(level, aBounces, false);
			}
			else
			{
				facade.BakeAmbientRooms(level, aBounces, someRooms, refusal);
			}
			goOnFlag = refusal.empty() && finished();
			ambientFinishedFlag = goOnFlag;
			probes = Zeph::Engine::GetInstance()->GetRenderer().GetBakedProbeCount();
		}
		if (aReflectionsFlag && goOnFlag)
		{
			if (someRooms.empty())
			{
				facade.BakeSpecular(level);
			}
			else
			{
				facade.BakeSpecularRooms(level, someRooms, refusal);
			}
		}
		doneFlag = true;
	});
	// This thread polls: the progress callback and Ctrl-C need Python's lock, the bake must not.
	std::exception_ptr raised;
	bool interruptedFlag = false;
	const auto poll = std::chrono::duration<double>(std::max(0.01, aPollSeconds));
	while (!doneFlag.load())
	{
		{
			py::gil_scoped_release unlocked;
			const auto until = std::chrono::steady_clock::now() + poll;
			while (!doneFlag.load() && std::chrono::steady_clock::now() < until)
			{
				std::this_thread::sleep_for(std::chrono::milliseconds(5));
			}
		}
		if (raised || interruptedFlag || doneFlag.load())
		{
			continue;
		}
		if (PyErr_CheckSignals() != 0)
		{
			// Ctrl-C: the bake stops within a probe or a cube face, writing nothing more.
			facade.CancelBake();
			interruptedFlag = true;
			continue;
		}
		if (!aProgress.is_none())
		{
			try
			{
				aProgress(StatusDict(facade.GetBakeStatus(), facade.GetBakeProgress()));
			}
			catch (...)
			{
				facade.CancelBake();
				raised = std::current_exception();
			}
		}
	}
	{
		py::gil_scoped_release unlocked;
		bake.join();
	}
	if (interruptedFlag)
	{
		throw py::error_already_set();
	}
	if (raised)
	{
		std::rethrow_exception(raised);
	}
	const Zeph::BakeStatus status = facade.GetBakeStatus();
	py::dict outcome;
	outcome["result"] = refusal.empty() ? Zeph::GetBakeResultName(status.myLastResult) : "failed";
	outcome["message"] = refusal.empty() ? status.myLastMessage : refusal;
	outcome["ambient_written"] = anAmbientFlag && ambientFinishedFlag && aBounces > 0;
	outcome["probes"] = probes;
	outcome["seconds"] = std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
	outcome["problems"] = ReportCollector::Get().ProblemsSince(mark);
	if (!aProgress.is_none())
	{
		aProgress(StatusDict(status, facade.GetBakeProgress()));
	}
	return outcome;
}

void EngineSession::RunPiece(const std::string& aWhat,
                             const std::function<bool(Lumora::LumoraWrapper&, std::string&)>& aPiece)
{
	RequireLevel();
	Lumora::LumoraWrapper& facade = Facade();
	WorkingFolder here(myDataFolder);
	const size_t mark = ReportCollector::Get().Mark();
	std::string problem;
	bool doneFlag = false;
	{
		py::gil_scoped_release unlocked;
		doneFlag = aPiece(facade, problem);
	}
	if (!doneFlag)
	{
		throw LumoraError(aWhat + ": " + problem + JoinProblems(ReportCollector::Get().ProblemsSince(mark)));
	}
}

void EngineSession::BakeAmbientPart(int aBounce, const std::string& aPrevious, long long aFirst,
                                    long long aCount, const std::string& anOutFile)
{
	RunPiece("ambient part not baked", [&](Lumora::LumoraWrapper& aFacade, std::string& aProblem) {
		return aFacade.BakeAmbientPart(Lumora::ToWide(myLevel), aBounce, aPrevious, aFirst, aCount, anOutFile,
		                               aProblem);
	});
}

void EngineSession::MergeAmbientParts(const std::vector<std::string>& someParts, const std::string& anOutFile)
{
	RunPiece("ambient parts not merged", [&](Lumora::LumoraWrapper& aFacade, std::string& aProblem) {
		return aFacade.MergeAmbientParts(Lumora::ToWide(myLevel), someParts, anOutFile, aProblem);
	});
}

void EngineSession::BakeReflectionPart(const std::string& aRoom, const std::string& anAmbientFile,
                                       const std::string& anOutFile)
{
	RunPiece("reflection of room '" + aRoom + "' not baked", [&](Lumora::LumoraWrapper& aFacade,
	                                                             std::string& aProblem) {
		return aFacade.BakeSpecularPart(Lumora::ToWide(myLevel), aRoom, anAmbientFile, anOutFile, aProblem);
	});
}

std::string EngineSession::RecordBake(const std::string& aPhase, const std::vector<std::string>& someRooms,
                                      int aBounces, double aSeconds)
{
	RequireLevel();
	if (aPhase != "ambient" && aPhase != "reflections")
	{
		throw std::invalid_argument("phase must be 'ambient' or 'reflections', not '" + aPhase + "'");
	}
	Lumora::LumoraWrapper& facade = Facade();
	WorkingFolder here(myDataFolder);
	std::string message;
	bool writtenFlag = false;
	{
		py::gil_scoped_release unlocked;
		writtenFlag = facade.RecordBake(Lumora::ToWide(myLevel),
		                                aPhase == "ambient" ? Lumora::BakePhase::AMBIENT
		                                                    : Lumora::BakePhase::REFLECTIONS,
		                                someRooms, aBounces, {{"total", aSeconds}}, message);
	}
	if (!writtenFlag)
	{
		throw LumoraError("bake record not written: " + message);
	}
	return message;
}
} // namespace LumoraPython
