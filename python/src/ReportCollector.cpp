#include "ReportCollector.h"

#include "EditorSession.h"
#include "editor/LumoraWrapper.h"

namespace LumoraPython
{
namespace
{
// A process that runs for days keeps the last reports only.
constexpr size_t ourKeptReports = 100000;
} // namespace

ReportCollector& ReportCollector::Get()
{
	static ReportCollector ourCollector;
	return ourCollector;
}

void ReportCollector::Listen()
{
	Lumora::LumoraWrapper::SetReportListener(
	    [this](int aLevel, const std::string& aFunction, const std::string& aText) {
		    std::lock_guard lock(myMutex);
		    if (myReports.size() >= ourKeptReports)
		    {
			    myReports.erase(myReports.begin(), myReports.begin() + ourKeptReports / 2);
		    }
		    myReports.push_back({aLevel, aFunction, aText});
	    });
}

void ReportCollector::StopListening()
{
	Lumora::LumoraWrapper::SetReportListener({});
	std::lock_guard lock(myMutex);
	myReports.clear();
}

size_t ReportCollector::Mark() const
{
	std::lock_guard lock(myMutex);
	return myReports.size();
}

std::vector<ReportCollector::Report> ReportCollector::Since(size_t aMark) const
{
	std::lock_guard lock(myMutex);
	// A trim since the mark moved everything down; what is left is newer than the mark.
	const size_t first = aMark <= myReports.size() ? aMark : 0;
	return {myReports.begin() + static_cast<std::ptrdiff_t>(first), myReports.end()};
}

std::vector<std::string> ReportCollector::ProblemsSince(size_t aMark) const
{
	std::vector<std::string> problems;
	for (const Report& report : Since(aMark))
	{
		if (report.myLevel >= 1)
		{
			problems.push_back(DescribeReport(report));
		}
	}
	return problems;
}

std::string ReportCollector::LastSince(size_t aMark) const
{
	const std::vector<Report> reports = Since(aMark);
	return reports.empty() ? std::string() : reports.back().myText;
}

std::string DescribeReport(const ReportCollector::Report& aReport)
{
	const int level = aReport.myLevel >= 0 && aReport.myLevel <= 3 ? aReport.myLevel : 1;
	return LumoraTool::Describe(
	    {static_cast<Debug::AssertLevels>(level), aReport.myFunction, aReport.myText});
}
} // namespace LumoraPython
