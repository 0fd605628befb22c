// lumora check: the level read the way the editor reads it, with every report made
// non-fatal and listed, and what loading passes over in silence (LevelCheck.h).
#include <cstdio>
#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "Commands.h"
#include "EditorSession.h"
#include "LevelCheck.h"

namespace LumoraTool
{
namespace
{
nlohmann::json ProblemRecord(const std::string& aProblem, bool aBakedFlag)
{
	const CheckRecord record = MakeCheckRecord(aProblem, aBakedFlag);
	nlohmann::json json;
	json["message"] = record.myMessage;
	json["file"] = record.myFile;
	json["element"] = record.myElement;
	json["baked"] = record.myBakedFlag;
	return json;
}

int PrintJson(const std::string& aLevel, const LevelReport& aReport)
{
	nlohmann::json out;
	out["level"] = aLevel;
	out["problems"] = nlohmann::json::array();
	for (const std::string& problem : aReport.myProblems)
	{
		out["problems"].push_back(ProblemRecord(problem, false));
	}
	for (const std::string& problem : aReport.myBakedProblems)
	{
		out["problems"].push_back(ProblemRecord(problem, true));
	}
	out["notes"] = aReport.myNotes;
	std::printf("%s\n", out.dump(1).c_str());
	return aReport.myProblems.empty() && aReport.myBakedProblems.empty() ? 0 : 1;
}
} // namespace

int RunCheck(const std::string& aLevel, bool aJsonFlag)
{
	if (const std::string problem = LevelFolderProblem(aLevel); !problem.empty())
	{
		PrintError(problem);
		return 1;
	}
	EditorSession session;
	if (!session.Start(aLevel, 64, 64, true))
	{
		return 1;
	}
	const LevelReport report = CheckLevel(session, aLevel);
	if (aJsonFlag)
	{
		return PrintJson(aLevel, report);
	}
	std::printf("level %s: the catalogues data/XML/EntityTypes.xml and DecalTypes.xml, and rooms.xml, "
	            "entities.xml, lights.xml, nodegraph.xml, decals.xml, ambient.sh, bake.json and the rooms' "
	            "cubemaps\n",
	            aLevel.c_str());
	for (const std::string& note : report.myNotes)
	{
		std::printf("  note: %s\n", note.c_str());
	}
	const size_t total = report.myProblems.size() + report.myBakedProblems.size();
	if (total == 0)
	{
		std::printf("no problems\n");
		return 0;
	}
	std::printf("%zu problem%s:\n", total, total == 1 ? "" : "s");
	for (const std::vector<std::string>* list : {&report.myProblems, &report.myBakedProblems})
	{
		for (const std::string& problem : *list)
		{
			std::printf("  %s\n", problem.c_str());
		}
	}
	return 1;
}
} // namespace LumoraTool
