#pragma once
// The fixture for tests of the layers below the engine, which report their failures at
// the error level (a broken invariant of the core would come at the critical level): it
// collects both as "function: message". A test that expects reports takes them with
// TakeReports() or ExpectReports(); any left over fail the test.

#include <gtest/gtest.h>
#include <string>
#include <utility>
#include <vector>

#include "core/CoreReport.h"

class ReportTest : public testing::Test
{
protected:
	void SetUp() override
	{
		ourReports.clear();
		myPreviousHandler = CoreReport::GetCriticalHandler();
		myPreviousErrorHandler = CoreReport::GetErrorHandler();
		CoreReport::SetCriticalHandler(&Record);
		CoreReport::SetErrorHandler(&Record);
	}

	void TearDown() override
	{
		CoreReport::SetCriticalHandler(myPreviousHandler);
		CoreReport::SetErrorHandler(myPreviousErrorHandler);
		EXPECT_TRUE(ourReports.empty()) << "Unexpected reports: " << Joined();
	}

	static void Record(int, const char* aFunctionName, const char* aMessage)
	{
		ourReports.push_back(std::string(aFunctionName) + ": " + aMessage);
	}

	// The reports made since the last call, as "function: message".
	static std::vector<std::string> TakeReports() { return std::exchange(ourReports, {}); }

	// Expects exactly one report per entry, each containing all of that entry's parts.
	static void ExpectReports(const std::vector<std::vector<std::string>>& someParts)
	{
		const std::string all = Joined();
		const std::vector<std::string> reports = TakeReports();
		ASSERT_EQ(reports.size(), someParts.size()) << all;
		for (size_t index = 0; index < reports.size(); ++index)
		{
			for (const std::string& part : someParts[index])
			{
				EXPECT_NE(reports[index].find(part), std::string::npos) << part << " in: " << reports[index];
			}
		}
	}

	static std::string Joined()
	{
		std::string text;
		for (const std::string& report : ourReports)
		{
			text += report + "; ";
		}
		return text;
	}

	CoreReport::Handler myPreviousHandler = nullptr;
	CoreReport::Handler myPreviousErrorHandler = nullptr;
	static inline std::vector<std::string> ourReports;
};
