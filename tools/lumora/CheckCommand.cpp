// lumora check: the level read the way the editor reads it, with every report made
// non-fatal and listed, then the baked files beside it checked with their readers.
#include <cstdio>
#include <filesystem>
#include <string>
#include <vector>

#include "Commands.h"
#include "EditorSession.h"
#include "engine/Room.h"
#include "platform/dds/DdsFile.h"
#include "platform/dds/ImageInfo.h"

namespace LumoraTool
{
namespace
{
// Problems of the baked files: a damaged file is one, a missing one only a note.
void CheckBakedFiles(const std::string& aLevel, const Lumora::LumoraWrapper& anEditor,
                     std::vector<std::string>& someProblems, std::vector<std::string>& someNotes)
{
	namespace fs = std::filesystem;
	// The level load has read the ambient volume (and reported it if damaged).
	const std::string ambient = "data/XML/levels/" + aLevel + "/ambient.sh";
	if (!fs::exists(ambient))
	{
		someNotes.push_back(ambient + ": not baked yet");
	}
	const auto& rooms = anEditor.GetRooms();
	for (int index = 0; index < rooms.Count(); ++index)
	{
		const std::string cubemap = "data/Cubemaps/" + aLevel + "/" + rooms[index]->GetID() + ".dds";
		if (!fs::exists(cubemap))
		{
			someNotes.push_back(cubemap + ": not baked yet (room '" + rooms[index]->GetID() +
			                    "' shows the fallback cubemap)");
			continue;
		}
		Dds::ImageInfo info;
		std::string error;
		if (!Dds::GetImageInfoFromFile(cubemap, info, error))
		{
			someProblems.push_back(cubemap + ": " + error);
		}
		else if (!info.IsCube() || info.myArraySize != 6)
		{
			someProblems.push_back(cubemap + ": not a cubemap of 6 faces");
		}
	}
}
} // namespace

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
	session.LoadAndCount(aLevel);
	std::vector<std::string> fileProblems;
	std::vector<std::string> notes;
	CheckBakedFiles(aLevel, session.Editor(), fileProblems, notes);

	const std::vector<Problem> reported = session.GetProblems();
	std::printf("level %s: the catalogues data/XML/EntityTypes.xml and DecalTypes.xml, and rooms.xml, "
	            "entities.xml, lights.xml, nodegraph.xml, decals.xml, ambient.sh and the rooms' cubemaps\n",
	            aLevel.c_str());
	for (const std::string& note : notes)
	{
		std::printf("  note: %s\n", note.c_str());
	}
	const size_t total = reported.size() + fileProblems.size();
	if (total == 0)
	{
		std::printf("no problems\n");
		return 0;
	}
	std::printf("%zu problem%s:\n", total, total == 1 ? "" : "s");
	session.PrintProblems();
	for (const std::string& problem : fileProblems)
	{
		std::printf("  %s\n", problem.c_str());
	}
	return 1;
}
} // namespace LumoraTool
