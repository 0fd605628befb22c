#include "EditorSession.h"

#include <bitset>
#include <cstdio>
#include <filesystem>

#include "editor/StringConversion.h"
#include "platform/gpu/Device.h"
#include "platform/paths/Paths.h"

namespace LumoraTool
{
void PrintError(const std::string& aMessage)
{
	std::fprintf(stderr, "lumora: %s\n", aMessage.c_str());
}

namespace
{
// The level's folder on disk, or empty when the name is no plain folder name or names none.
std::filesystem::path LevelFolder(const std::string& aLevel)
{
	if (aLevel.empty() || aLevel.find('/') != std::string::npos || aLevel == "." || aLevel == "..")
	{
		return {};
	}
	const std::filesystem::path resolved = Paths::Resolve("data/XML/levels/" + aLevel);
	std::error_code ignored;
	return std::filesystem::is_directory(resolved, ignored) ? resolved : std::filesystem::path();
}
} // namespace

std::string LevelFolderProblem(const std::string& aLevel)
{
	namespace fs = std::filesystem;
	std::error_code ignored;
	if (!fs::is_directory("data", ignored))
	{
		return "no data/ folder in " + fs::current_path(ignored).string() +
		       " (run from the repository root or a copy of its data/)";
	}
	if (!aLevel.empty() && LevelFolder(aLevel).empty())
	{
		return "no level '" + aLevel + "' under data/XML/levels/";
	}
	return {};
}

std::string LevelSpelledOnDisk(const std::string& aLevel)
{
	const std::filesystem::path folder = LevelFolder(aLevel);
	return folder.empty() ? aLevel : folder.filename().string();
}

std::string Describe(const Problem& aProblem)
{
	static const char* const ourLevels[] = {"debug", "error", "severe error", "critical error"};
	return std::string(ourLevels[aProblem.myLevel]) + " in " + aProblem.myFunction + ": " + aProblem.myText;
}

EditorSession::~EditorSession()
{
	if (myStartedFlag)
	{
		Lumora::LumoraWrapper::ShutDown();
	}
	Debug::SetReportListener({});
}

bool EditorSession::Start(const std::string& aLevel, int aWidth, int aHeight, bool aListOnlyFlag)
{
	if (const std::string problem = LevelFolderProblem(aLevel); !problem.empty())
	{
		PrintError(problem);
		return false;
	}
	{
		Gpu::Device probe;
		if (!probe.Init(16, 16))
		{
			PrintError("no OpenGL 4.5 core context on this machine: " + probe.GetFailureText());
			return false;
		}
		probe.Destroy();
	}
	// Nothing ends the process: what the log reports is collected and answered here.
	Lumora::LumoraWrapper::SetFatalReportLevels(std::bitset<4>());
	Debug::SetReportListener(
	    [this](Debug::AssertLevels aLevel, int, const char* aFunction, const char* aText) {
		    if (aLevel == Debug::DEBUG_MESSAGE)
		    {
			    return;
		    }
		    std::string text = aText;
		    while (!text.empty() && (text.back() == '\n' || text.back() == ' '))
		    {
			    text.pop_back();
		    }
		    const std::lock_guard<std::mutex> lock(myMutex);
		    myProblems.push_back({aLevel, aFunction, text});
	    });
	if (!Lumora::LumoraWrapper::Create(0, aWidth, aHeight))
	{
		// Create leaves no scene to shut down; what it reported says why.
		const std::vector<Problem> problems = GetProblems();
		PrintError("the editor could not start" + (problems.empty() ? std::string(" (see DebugLogger.txt)")
		                                                            : ": " + Describe(problems.front())));
		return false;
	}
	myStartedFlag = true;
	if (!aListOnlyFlag && GetProblemCount() > 0)
	{
		PrintError("starting the editor reported " + std::to_string(GetProblemCount()) +
		           " problem(s); the first: " + Describe(GetProblems().front()));
		return false;
	}
	return true;
}

size_t EditorSession::LoadAndCount(const std::string& aLevel)
{
	const size_t before = GetProblemCount();
	Editor().ParseLevel(Lumora::ToWide(aLevel));
	return GetProblemCount() - before;
}

bool EditorSession::Load(const std::string& aLevel, bool aBakingFlag)
{
	const size_t before = GetProblemCount();
	LoadAndCount(aLevel);
	std::vector<Problem> found = GetProblems();
	found.erase(found.begin(), found.begin() + static_cast<std::ptrdiff_t>(before));
	if (aBakingFlag)
	{
		std::erase_if(found,
		              [](const Problem& aProblem) { return aProblem.myFunction == "Zeph::Renderer::SetSH"; });
	}
	if (!found.empty())
	{
		PrintError("level '" + aLevel + "' has " + std::to_string(found.size()) +
		           " problem(s) (lumora check lists them); the first: " + Describe(found.front()));
		return false;
	}
	return true;
}

std::vector<Problem> EditorSession::GetProblems() const
{
	const std::lock_guard<std::mutex> lock(myMutex);
	return myProblems;
}

size_t EditorSession::GetProblemCount() const
{
	const std::lock_guard<std::mutex> lock(myMutex);
	return myProblems.size();
}

size_t EditorSession::PrintProblems(size_t aFirst) const
{
	const std::vector<Problem> problems = GetProblems();
	for (size_t index = aFirst; index < problems.size(); ++index)
	{
		std::printf("  %s\n", Describe(problems[index]).c_str());
	}
	return problems.size() > aFirst ? problems.size() - aFirst : 0;
}
} // namespace LumoraTool
