// lumora check: the level read the way the editor reads it, with every report made
// non-fatal and listed, and what loading passes over in silence (LevelCheck.h).
#include <cstdio>
#include <string>
#include <vector>

#include "Commands.h"
#include "EditorSession.h"
#include "LevelCheck.h"

namespace LumoraTool
{
int RunCheck(const std::string& aLevel)
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
