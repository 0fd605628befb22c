#pragma once
// Shared set-up of the XML suites: a scratch directory holding the documents and a Debug log whose
// critical errors are not fatal, so a test can read every report the cursor makes.

#include <gtest/gtest.h>

#include <bitset>
#include <filesystem>
#include <string>

#include "engine/Debug.h"
#include "support/TestSupport.h"

class XMLFixture : public ::testing::Test
{
protected:
	void SetUp() override
	{
		ASSERT_TRUE(Debug::Create(myScratch.File("DebugLogger.txt"), std::bitset<4>(0)));
	}

	void TearDown() override
	{
		if (Debug::GetInstance() != nullptr)
		{
			Debug::Destroy();
		}
	}

	// Writes a document below the scratch directory, creating its directories; returns its path.
	std::string WriteDocument(const std::string& aRelativePath, const std::string& someText)
	{
		const std::filesystem::path path = myScratch.Path() / aRelativePath;
		std::filesystem::create_directories(path.parent_path());
		TestSupport::WriteWholeFile(path.string(), someText);
		return path.string();
	}

	std::string Log() const { return TestSupport::ReadWholeFile(myScratch.File("DebugLogger.txt")); }

	int ReportCount() const
	{
		const std::string log = Log();
		int count = 0;
		for (std::size_t at = log.find("CRITICAL ERROR"); at != std::string::npos;
		     at = log.find("CRITICAL ERROR", at + 1))
		{
			++count;
		}
		return count;
	}

	TestSupport::ScratchDir myScratch;
};
