#include "LevelCheck.h"

#include <algorithm>
#include <cctype>
#include <cstring>
#include <filesystem>
#include <map>
#include <set>
#include <sstream>
#include <string_view>
#include <system_error>
#include <utility>

#include "editor/BakeRecord.h"
#include "engine/Room.h"
#include "platform/paths/Paths.h"
#include "renderer/CubemapContainer.h"
#include "xml/XML.h"

namespace LumoraTool
{
namespace
{
constexpr const char* ourEntityCatalogue = "data/XML/EntityTypes.xml";

// Reports about files that a bake writes: what it is about to replace.
bool IsAboutBakedOutput(const Problem& aProblem)
{
	return aProblem.myFunction == "Zeph::Renderer::SetSH" ||
	       (aProblem.myFunction == "Lumora::LumoraWrapper::ParseEntities" &&
	        aProblem.myText.starts_with(Zeph::CubemapContainer::ourUnusableFileText));
}

// The IDs of every "entity" record of the catalogue, models or not.
std::set<std::string> CatalogueIDs()
{
	std::set<std::string> ids;
	XML xml(ourEntityCatalogue);
	if (xml.GoToElement("entities", "", "") && xml.EnterChild("entity"))
	{
		do
		{
			std::string id;
			if (xml.TryGetAttribute<std::string>(id, "id"))
			{
				ids.insert(id);
			}
		} while (xml.GoToNextSibling("entity"));
	}
	return ids;
}

// Entities of types that the editor does not place: a type the catalogue does not list is a
// problem (a misspelling on either side); one that it lists without a model is shown otherwise
// by the game, a note.
void CheckEntityTypes(const std::string& aLevel, const Lumora::LumoraWrapper& anEditor, LevelReport& aReport)
{
	const auto& bank = anEditor.GetEntityBank();
	if (bank.empty())
	{
		aReport.myProblems.push_back(std::string(ourEntityCatalogue) +
		                             ": no entity type with a model (a missing, empty or misspelt "
		                             "catalogue): every level loads without entities");
	}
	const std::set<std::string> listed = CatalogueIDs();
	const std::string file = "data/XML/levels/" + aLevel + "/entities.xml";
	XML xml(file);
	if (!xml.GoToElement("entities", "", "") || !xml.EnterChild("entity"))
	{
		return;
	}
	int index = 0;
	do
	{
		std::string type;
		xml.TryGetAttribute<std::string>(type, "type");
		const std::string which = file + ": entity " + std::to_string(index) + " of type [" + type + "]";
		if (!listed.contains(type))
		{
			aReport.myProblems.push_back(which + ", which " + ourEntityCatalogue +
			                             " does not list: it is left out");
		}
		else if (!bank.contains(type))
		{
			aReport.myNotes.push_back(which + " has no model in " + ourEntityCatalogue +
			                          ": the editor does not show it");
		}
		++index;
	} while (xml.GoToNextSibling("entity"));
}

std::string Number(float aValue)
{
	std::ostringstream text;
	text << aValue;
	return text.str();
}

const char* AxisName(int anAxis)
{
	return anAxis == 0 ? "x" : (anAxis == 1 ? "y" : "z");
}

// Rooms that hold no volume, and IDs that are shared or cannot name a cubemap file. A room's
// extent along x is put in order on loading (the file's x is mirrored); y and z are not.
void CheckRooms(const std::string& aLevel, const Lumora::LumoraWrapper& anEditor, LevelReport& aReport)
{
	const std::string file = "data/XML/levels/" + aLevel + "/rooms.xml";
	const auto& rooms = anEditor.GetRooms();
	std::map<std::string, int> firstWithID;
	for (int index = 0; index < rooms.Count(); ++index)
	{
		const Zeph::Room& room = *rooms[index];
		const std::string which = file + ": room " + std::to_string(index) + " ('" + room.GetID() + "')";
		const float min[3] = {room.GetMin().x, room.GetMin().y, room.GetMin().z};
		const float max[3] = {room.GetMax().x, room.GetMax().y, room.GetMax().z};
		for (int axis = 0; axis < 3; ++axis)
		{
			if (min[axis] == max[axis])
			{
				aReport.myProblems.push_back(which + " has no extent along " + AxisName(axis));
			}
			else if (min[axis] > max[axis])
			{
				aReport.myProblems.push_back(which + " is inverted along " + AxisName(axis) + " (min " +
				                             Number(min[axis]) + " > max " + Number(max[axis]) + ")");
			}
		}
		if (Zeph::CubemapContainer::GetRoomFile(aLevel, room.GetID()).empty())
		{
			aReport.myProblems.push_back(which +
			                             ": the ID cannot name a cubemap file (empty, '.', '..' or with a "
			                             "path separator): its reflections are not baked");
		}
		const auto [first, newFlag] = firstWithID.emplace(room.GetID(), index);
		if (!newFlag)
		{
			aReport.myProblems.push_back(which + " has the ID of room " + std::to_string(first->second) +
			                             ": both would bake into one cubemap file");
		}
	}
}

// What is not baked yet. Damaged files were reported by the load (the ambient volume by
// Renderer::SetSH, each room's cubemap by the entities' loading). Returns, per phase, whether
// any of its files is there.
std::pair<bool, bool> NoteUnbakedFiles(const std::string& aLevel, const Lumora::LumoraWrapper& anEditor,
                                       LevelReport& aReport)
{
	const std::string ambient = "data/XML/levels/" + aLevel + "/ambient.sh";
	std::error_code ignored;
	const bool ambientFlag = std::filesystem::exists(Paths::Resolve(ambient), ignored);
	if (!ambientFlag)
	{
		aReport.myNotes.push_back(ambient + ": not baked yet");
	}
	bool reflectionsFlag = false;
	std::string resolved;
	std::string problem;
	const auto& rooms = anEditor.GetRooms();
	for (int index = 0; index < rooms.Count(); ++index)
	{
		const std::string cubemap = Zeph::CubemapContainer::GetRoomFile(aLevel, rooms[index]->GetID());
		if (cubemap.empty())
		{
			continue;
		}
		if (Zeph::CubemapContainer::CheckFile(cubemap, resolved, problem) ==
		    Zeph::CubemapContainer::FileState::MISSING)
		{
			aReport.myNotes.push_back(cubemap + ": not baked yet (room '" + rooms[index]->GetID() +
			                          "' shows the fallback cubemap)");
		}
		else
		{
			reflectionsFlag = true;
		}
	}
	return {ambientFlag, reflectionsFlag};
}

// The bake record: a damaged one, and inputs changed since the bake it records, are the baked
// files' problems (a bake replaces the record). A phase whose files are there without a record
// of their bake is a note: whether that bake is stale cannot be told. What is not baked at all
// was noted above.
void CheckBakeRecord(const std::string& aLevel, bool anAmbientFlag, bool aReflectionsFlag,
                     LevelReport& aReport)
{
	const std::string path = Lumora::GetBakeRecordPath(aLevel);
	Lumora::BakeRecord record;
	std::string problem;
	const Lumora::BakeRecordRead read = Lumora::ReadBakeRecord(path, record, problem);
	if (read == Lumora::BakeRecordRead::DAMAGED)
	{
		aReport.myBakedProblems.push_back(problem);
		return;
	}
	std::vector<std::string> unrecorded;
	if (anAmbientFlag && !record.myAmbient)
	{
		unrecorded.push_back("ambient");
	}
	if (aReflectionsFlag && !record.myReflections)
	{
		unrecorded.push_back("reflection");
	}
	if (read == Lumora::BakeRecordRead::MISSING && !unrecorded.empty())
	{
		aReport.myNotes.push_back(path + ": not written yet (baked before bake records were kept), so "
		                                 "whether the bake is stale cannot be told");
	}
	else if (!unrecorded.empty())
	{
		aReport.myNotes.push_back(
		    path + ": no record of the " +
		    (unrecorded.size() == 2 ? "ambient and reflection bakes" : unrecorded[0] + " bake") +
		    ", so whether it is stale cannot be told");
	}
	for (const std::string& stale : Lumora::FindStaleInputs(record))
	{
		aReport.myBakedProblems.push_back(stale);
	}
}

// A file whose section is missing loads as if the section were empty, but the editor cannot
// save into it (the saver has no section to empty): said here, before a designer's edits are
// lost to a failed save. Files that do not parse were reported by loading already.
void CheckSavedSections(const std::string& aLevel, LevelReport& aReport)
{
	struct Section
	{
		const char* myFile;
		const char* myName;
		const char* myWhat;
	};
	static const Section ourSections[] = {{"lights.xml", "point-lights", "point lights"},
	                                      {"lights.xml", "spot-lights", "spot lights"},
	                                      {"nodegraph.xml", "node-graph", "path graph"},
	                                      {"decals.xml", "decals", "decals"}};
	for (const Section& section : ourSections)
	{
		const std::string path = "data/XML/levels/" + aLevel + "/" + section.myFile;
		std::error_code ignored;
		if (!std::filesystem::is_regular_file(Paths::Resolve(path), ignored))
		{
			continue;
		}
		XML xml(path);
		if (xml.HasRootElement() && !xml.GoToElement(section.myName, "", ""))
		{
			aReport.myProblems.push_back(path + ": no \"" + section.myName +
			                             "\" element under the root, so the " +
			                             "editor cannot save the level's " + section.myWhat + " into it");
		}
	}
}

// A name as the XML reader writes element and attribute names into its messages.
bool IsName(std::string_view aText)
{
	if (aText.empty() || !(std::isalpha(static_cast<unsigned char>(aText[0])) || aText[0] == '_'))
	{
		return false;
	}
	return std::all_of(aText.begin(), aText.end(), [](char aCharacter) {
		return std::isalnum(static_cast<unsigned char>(aCharacter)) ||
		       std::strchr("-_.:", aCharacter) != nullptr;
	});
}
} // namespace

LevelReport CheckLevel(EditorSession& aSession, const std::string& aLevel)
{
	aSession.LoadAndCount(aLevel);
	// Taken before the checks below read files of their own: what they meet was reported already.
	const std::vector<Problem> reported = aSession.GetProblems();
	LevelReport report;
	for (const Problem& problem : reported)
	{
		(IsAboutBakedOutput(problem) ? report.myBakedProblems : report.myProblems)
		    .push_back(Describe(problem));
	}
	const Lumora::LumoraWrapper& editor = aSession.Editor();
	CheckEntityTypes(aLevel, editor, report);
	CheckRooms(aLevel, editor, report);
	CheckSavedSections(aLevel, report);
	const auto [ambientFlag, reflectionsFlag] = NoteUnbakedFiles(aLevel, editor, report);
	CheckBakeRecord(aLevel, ambientFlag, reflectionsFlag, report);
	return report;
}

CheckRecord MakeCheckRecord(const std::string& aProblem, bool aBakedFlag)
{
	CheckRecord record;
	record.myMessage = aProblem;
	std::string file;
	if (const size_t start = aProblem.find("data/"); start != std::string::npos)
	{
		const size_t end = aProblem.find_first_of(" \t:,;\"'[]()", start);
		file = aProblem.substr(start, end == std::string::npos ? std::string::npos : end - start);
	}
	record.myFile = file;
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
	record.myElement = element;
	record.myBakedFlag = aBakedFlag;
	return record;
}
} // namespace LumoraTool
