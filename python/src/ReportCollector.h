#pragma once
// ReportCollector: every report of the library's log while the module's engine is open, so that
// a call can tell what went wrong during it and raise it as a Python exception. Reports come on
// whichever thread makes them (a bake's), so the list is locked.
//
//   const size_t mark = ReportCollector::Get().Mark();
//   editor.SaveLights(u"level");
//   const std::vector<std::string> problems = ReportCollector::Get().ProblemsSince(mark);
#include <cstddef>
#include <mutex>
#include <string>
#include <vector>

namespace LumoraPython
{
class ReportCollector
{
public:
	struct Report
	{
		int myLevel = 0; // 0 debug, 1 error, 2 severe, 3 critical
		std::string myFunction;
		std::string myText;
	};

	static ReportCollector& Get();

	// Starts (or stops) listening to the library's log.
	void Listen();
	void StopListening();

	size_t Mark() const;
	std::vector<Report> Since(size_t aMark) const;
	// The reports of the error level and above since the mark, one line each.
	std::vector<std::string> ProblemsSince(size_t aMark) const;
	// The last report's text since the mark, of any level, or empty.
	std::string LastSince(size_t aMark) const;

private:
	mutable std::mutex myMutex;
	std::vector<Report> myReports;
};

// "error in Function: text", as the command line tool prints a problem.
std::string DescribeReport(const ReportCollector::Report& aReport);
} // namespace LumoraPython
