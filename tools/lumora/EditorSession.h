#pragma once
// EditorSession: the editor facade started headless for one command of the tool, with
// no report fatal: every report of the error level and above is collected as a
// problem, so a damaged file is listed and answered, never the end of the process.
//
//   LumoraTool::EditorSession session;
//   if (!session.Start("sample_small", 320, 180) || !session.Load("sample_small")) return 1;
//   session.Editor().BakeAmbient(u"sample_small", 1, false);
//   if (session.PrintProblems() > 0) return 1;
//
// Start and Load print one line to standard error when they fail.
#include <mutex>
#include <string>
#include <vector>

#include "editor/LumoraWrapper.h"
#include "engine/Debug.h"

namespace LumoraTool
{
struct Problem
{
	Debug::AssertLevels myLevel;
	std::string myFunction;
	std::string myText;
};

// Prints "lumora: " and the message to standard error.
void PrintError(const std::string& aMessage);

// Why the level cannot be opened from the working directory, or empty: no data/, or
// no folder for it under data/XML/levels/.
std::string LevelFolderProblem(const std::string& aLevel);

// Level names are matched case-insensitively, as every data path is: the name as the
// level's folder spells it (so outputs such as data/Cubemaps/<level>/ take that
// spelling), or the name unchanged when no such folder exists.
std::string LevelSpelledOnDisk(const std::string& aLevel);

class EditorSession
{
public:
	EditorSession() = default;
	~EditorSession();
	EditorSession(const EditorSession&) = delete;
	EditorSession& operator=(const EditorSession&) = delete;

	// Checks data/ (and the level's folder when aLevel is not empty) and that an OpenGL
	// 4.5 context can be had, then creates the facade at the size. Problems reported
	// while it starts (the decal catalogue is read then) fail it unless aListOnlyFlag.
	bool Start(const std::string& aLevel, int aWidth, int aHeight, bool aListOnlyFlag = false);
	// Loads the level; false, with its first problem printed, when loading reported any.
	// A bake passes aBakingFlag: a damaged ambient.sh is what it is about to replace.
	bool Load(const std::string& aLevel, bool aBakingFlag = false);
	// Loads the level and returns how many problems loading reported, printing none.
	size_t LoadAndCount(const std::string& aLevel);
	Lumora::LumoraWrapper& Editor() { return *Lumora::LumoraWrapper::GetInstance(); }

	std::vector<Problem> GetProblems() const;
	size_t GetProblemCount() const;
	// Prints the problems from the index on, one per line; returns how many it printed.
	size_t PrintProblems(size_t aFirst = 0) const;

private:
	mutable std::mutex myMutex;
	std::vector<Problem> myProblems;
	bool myStartedFlag = false;
};

// One problem as the tool prints it.
std::string Describe(const Problem& aProblem);
} // namespace LumoraTool
