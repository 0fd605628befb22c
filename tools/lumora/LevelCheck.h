#pragma once
// LevelCheck: what `lumora check` lists and what `lumora bake` refuses a level for. A level is
// loaded the way the editor loads it (every report collected, none fatal) and then looked at
// for what loading passes over in silence but would make a bake wrong: entity types that the
// catalogue lacks (a misspelt catalogue leaves a level empty), rooms without extent, room IDs
// that are shared or cannot name a cubemap file. The bake record (bake.json) says whether the
// baked files are older than the level's files, catalogues, models and textures.
//
//   LumoraTool::EditorSession session;
//   if (!session.Start(level, 64, 64, true)) return 1;
//   const LumoraTool::LevelReport report = LumoraTool::CheckLevel(session, level);
//   if (!report.myProblems.empty()) ...   // the level's own files are wrong
#include <string>
#include <vector>

#include "EditorSession.h"

namespace LumoraTool
{
struct LevelReport
{
	// The level's files and the catalogues, as one line each: a bake of the level would be wrong.
	std::vector<std::string> myProblems;
	// The baked outputs (a damaged ambient.sh, a room cubemap that is no cube, a damaged bake record,
	// an input changed since the bake): a bake replaces them.
	std::vector<std::string> myBakedProblems;
	// What is not baked yet: not a problem.
	std::vector<std::string> myNotes;
};

// One problem line as a record for tools: the file it names (the first data/... path), the element
// or attribute it names (the first name in brackets, as the XML reader names them, or in quotes),
// and the line itself. aBakedFlag: one of the baked outputs' problems.
struct CheckRecord
{
	std::string myMessage;
	std::string myFile;
	std::string myElement;
	bool myBakedFlag = false;
};
CheckRecord MakeCheckRecord(const std::string& aProblem, bool aBakedFlag);

// Loads aLevel into the started session and checks it. The reports made while the session
// started (the catalogues are read then) count as the level's problems too.
LevelReport CheckLevel(EditorSession& aSession, const std::string& aLevel);
} // namespace LumoraTool
