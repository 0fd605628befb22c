// check(data, level): the level read as the editor reads it, every report listed and none fatal,
// and what loading passes over in silence (the command line's `lumora check`).
#include <pybind11/stl.h>

#include "Bindings.h"
#include "EditorSession.h"
#include "Errors.h"
#include "LevelCheck.h"
#include "WorkingFolder.h"
#include "editor/LumoraWrapper.h"

namespace py = pybind11;

namespace LumoraPython
{
namespace
{
py::dict Check(const std::string& aDataFolder, const std::string& aLevel)
{
	const std::string folder = WorkingFolder::CheckDataFolder(aDataFolder);
	// The check loads the level into an engine of its own; an open Editor's level and its
	// unsaved edits must not be replaced.
	if (Lumora::LumoraWrapper::GetInstance() != nullptr)
	{
		throw LumoraError("check() starts an engine of its own, and an Editor is open in this process: check "
		                  "before opening the Editor, or after closing it");
	}
	WorkingFolder here(folder);
	if (const std::string problem = LumoraTool::LevelFolderProblem(aLevel); !problem.empty())
	{
		throw LumoraError(problem);
	}
	LumoraTool::LevelReport report;
	bool startedFlag = false;
	{
		py::gil_scoped_release unlocked;
		LumoraTool::EditorSession session;
		startedFlag = session.Start(aLevel, 64, 64, true);
		if (startedFlag)
		{
			report = LumoraTool::CheckLevel(session, aLevel);
		}
	}
	if (!startedFlag)
	{
		throw LumoraError("the engine did not start to check '" + aLevel +
		                  "' (the reason is on standard error)");
	}
	py::list problems;
	for (const auto& [list, bakedFlag] :
	     {std::pair{&report.myProblems, false}, std::pair{&report.myBakedProblems, true}})
	{
		for (const std::string& line : *list)
		{
			const LumoraTool::CheckRecord record = LumoraTool::MakeCheckRecord(line, bakedFlag);
			py::dict entry;
			entry["message"] = record.myMessage;
			entry["file"] = record.myFile;
			entry["element"] = record.myElement;
			entry["baked"] = record.myBakedFlag;
			problems.append(entry);
		}
	}
	py::dict result;
	result["level"] = LumoraTool::LevelSpelledOnDisk(aLevel);
	result["problems"] = problems;
	result["notes"] = report.myNotes;
	return result;
}
} // namespace

void RegisterCheck(py::module_& aModule)
{
	aModule.def(
	    "engine_running", [] { return Lumora::LumoraWrapper::GetInstance() != nullptr; },
	    "Whether this process's engine is taken (an Editor is open): check() then runs in a process of "
	    "its own.");
	aModule.def(
	    "check", &Check, py::arg("data"), py::arg("level"),
	    "The level's problems (dicts: message, file, element, baked) and notes, as `lumora check --json` "
	    "lists them.");
}
} // namespace LumoraPython
