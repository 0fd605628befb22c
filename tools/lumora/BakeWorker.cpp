// "lumora bake-worker LEVEL": the other end of BakeWorkers. It loads the level, then
// bakes the jobs it reads on standard input until that ends, answering each on what was
// standard output. Everything else the process prints goes to standard error, so
// nothing the library writes can be taken for an answer.
#include <cstdio>
#include <cstdlib>
#include <string>
#include <unistd.h>
#include <vector>

#include "BakeSupport.h"
#include "BakeWorkers.h"
#include "Commands.h"
#include "EditorSession.h"
#include "editor/StringConversion.h"

namespace LumoraTool
{
namespace
{
std::vector<std::string> SplitFields(const std::string& aLine)
{
	std::vector<std::string> fields;
	size_t start = 0;
	while (true)
	{
		const size_t end = aLine.find('\t', start);
		fields.push_back(aLine.substr(start, end == std::string::npos ? std::string::npos : end - start));
		if (end == std::string::npos)
		{
			return fields;
		}
		start = end + 1;
	}
}
} // namespace

std::string RunBakeJob(EditorSession& aSession, const std::string& aLevel,
                       const std::vector<std::string>& someFields)
{
	Lumora::LumoraWrapper& editor = aSession.Editor();
	std::string problem;
	const size_t problemsBefore = aSession.GetProblemCount();
	bool doneFlag = false;
	if (someFields.size() == 6 && someFields[0] == "ambient")
	{
		// The numbers come from the process that started this one; the bake refuses bad ones.
		const long bounce = std::strtol(someFields[1].c_str(), nullptr, 10);
		const long long first = std::strtoll(someFields[2].c_str(), nullptr, 10);
		const long long count = std::strtoll(someFields[3].c_str(), nullptr, 10);
		doneFlag = editor.BakeAmbientPart(Lumora::ToWide(aLevel), static_cast<int>(bounce), someFields[4],
		                                  first, count, someFields[5], problem);
	}
	else if (someFields.size() == 4 && someFields[0] == "cubemap")
	{
		doneFlag = editor.BakeSpecularPart(Lumora::ToWide(aLevel), someFields[1], someFields[2],
		                                   someFields[3], problem);
	}
	else
	{
		return "a job not understood";
	}
	if (doneFlag && aSession.GetProblemCount() > problemsBefore)
	{
		return Describe(aSession.GetProblems()[problemsBefore]);
	}
	return doneFlag ? std::string() : problem.empty() ? std::string("the job failed") : problem;
}

int RunBakeWorker(const std::string& aLevel)
{
	const int answers = dup(STDOUT_FILENO);
	FILE* answerStream = answers >= 0 ? fdopen(answers, "w") : nullptr;
	if (answerStream == nullptr || dup2(STDERR_FILENO, STDOUT_FILENO) < 0)
	{
		return 1;
	}
	const StopSignals signals;
	EditorSession session;
	if (!session.Start(aLevel, 320, 180, true))
	{
		return 1;
	}
	// The process that started this one checked the level (or was told to bake it anyway).
	session.LoadAndCount(aLevel);
	char* line = nullptr;
	size_t capacity = 0;
	ssize_t length = 0;
	while (!StopAsked() && (length = getline(&line, &capacity, stdin)) > 0)
	{
		std::string text(line, static_cast<size_t>(length));
		if (!text.empty() && text.back() == '\n')
		{
			text.pop_back();
		}
		std::string problem = RunBakeJob(session, aLevel, SplitFields(text));
		if (StopAsked())
		{
			break;
		}
		for (char& character : problem)
		{
			character = character == '\n' || character == '\t' ? ' ' : character;
		}
		const std::string answer = problem.empty() ? "ok\n" : "error\t" + problem + "\n";
		if (std::fputs(answer.c_str(), answerStream) < 0 || std::fflush(answerStream) != 0)
		{
			break;
		}
	}
	std::free(line);
	std::fclose(answerStream);
	return StopAsked() ? 130 : 0;
}
} // namespace LumoraTool
