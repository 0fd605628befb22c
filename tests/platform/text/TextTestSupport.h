#pragma once
// Shared by the text suites: a FreeType instance and the reports the layer makes.

#include <gtest/gtest.h>
#include <string>
#include <vector>

#include "core/CoreReport.h"
#include "platform/text/Factory.h"

// Collects every report; a test that expects some takes them, any left over fails it.
class TextReportTest : public testing::Test
{
protected:
	void SetUp() override
	{
		ourReports.clear();
		myPreviousHandler = CoreReport::GetErrorHandler();
		CoreReport::SetErrorHandler([](int, const char* aFunctionName, const char* aMessage) {
			ourReports.push_back(std::string(aFunctionName) + ": " + aMessage);
		});
		ASSERT_TRUE(myFactory.Init());
	}

	void TearDown() override
	{
		myFactory.Destroy();
		CoreReport::SetErrorHandler(myPreviousHandler);
		EXPECT_TRUE(ourReports.empty())
		    << "Unexpected reports: " << (ourReports.empty() ? "" : ourReports[0]);
	}

	static std::vector<std::string> TakeReports() { return std::exchange(ourReports, {}); }

	Glyphs::Factory myFactory;
	CoreReport::Handler myPreviousHandler = nullptr;
	static inline std::vector<std::string> ourReports;
};
