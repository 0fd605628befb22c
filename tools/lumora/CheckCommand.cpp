// lumora check: the level read the way the editor reads it, with every report made
// non-fatal and listed, and what loading passes over in silence (LevelCheck.h).
#include <algorithm>
#include <cctype>
#include <cstdio>
#include <cstring>
#include <nlohmann/json.hpp>
#include <string>
#include <string_view>
#include <vector>

#include "Commands.h"
#include "EditorSession.h"
#include "LevelCheck.h"

namespace LumoraTool
{
namespace
{
// A name as the XML reader writes element and attribute names into its messages.
bool IsName(std::string_view aText)
{
	if (aText.empty() || !(std::isalpha(static_cast<unsigned char>(aText[0])) || aText[0] == '_'))
	{
		return false;
	}
	return std::all_of(aText.begin(), aText.end(), [](char aCharacter) {
		return std::isalnum(static_cast<unsigned char>(aCharacter)) || std::strchr("-_.:", aCharacter) != nullptr;
	});
}

// One problem line as a record: the file it names (the first data/... path), the element or
// attribute it names (the first name in brackets, as the XML reader names them, or in quotes),
// and the line itself.
nlohmann::json ProblemRecord(const std::string& aProblem, bool aBakedFlag)
{
	nlohmann::json record;
	record["message"] = aProblem;
	std::string file;
	if (const size_t start = aProblem.find("data/"); start != std::string::npos)
	{
		const size_t end = aProblem.find_first_of(" \t:,;\"'[]()", start);
		file = aProblem.substr(start, end == std::string::npos ? std::string::npos : end - start);
	}
	record["file"] = file;
	std::string element;
	for (size_t open = aProblem.find_first_of("[\""); open != std::string::npos && element.empty();
	     open = aProblem.find_first_of("[\"", open + 1))
	{
		const size_t close = aProblem.find(aProblem[open] == '[' ? ']' : '"', open + 1);
		if (close == std::string::npos)
		{
			break;
		}
		const std::string_view inside = std::string_view(aProblem).substr(open + 1, close - open - 1);
		if (IsName(inside))
		{
			element = std::string(inside);
		}
		else if (aProblem[open] == '"')
		{
			// A quoted text that is no name: its closing quote opens nothing.
			open = close;
		}
	}
	record["element"] = element;
	record["baked"] = aBakedFlag;
	return record;
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
