#pragma once
// Shared set-up of the XML suites: a scratch directory holding one hand-edited document and a Debug
// log whose critical errors are not fatal, so a test can read every report the cursor makes.

#include <gtest/gtest.h>

#include <bitset>
#include <filesystem>
#include <string>
#include <vector>

#include "core/Vector4.h"
#include "engine/Debug.h"
#include "support/TestSupport.h"

inline const char* const ourLightsText = R"(<?xml version="1.0" ?>
<!-- keep: written by hand -->
<root>
	<!-- first child -->
	<bare />
	<lights>
		<!-- first light -->
		<light id="1">
			<position x="1" y="2" z="3" />
			<color r="0.5" g="0.25" b="1" a="4" />
			<falloff value="2.5" />
			<angles inner="0.9" />
			<empty />
		</light>
		<note text="not a light" />
		<!-- between -->
		<light id="2">
			<color a="1" b="0" g="0" r="2" />
			<falloff v="0.5" />
			<angles inner="0.9" outer="0.7" />
		</light>
	</lights>
	<!-- keep: between sections -->
</root>
)";

class XMLFixture : public ::testing::Test
{
protected:
	void SetUp() override
	{
		ASSERT_TRUE(Debug::Create(myScratch.File("DebugLogger.txt"), std::bitset<4>(0)));
		myPath = WriteDocument("levels/demo/lights.xml", ourLightsText);
	}

	void TearDown() override
	{
		if (Debug::GetInstance() != nullptr) // a test may have destroyed it
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
	bool Logged(const std::string& aMessage) const { return Log().find(aMessage) != std::string::npos; }

	// Reports in the log from byte aFrom on.
	int ReportCount(std::size_t aFrom = 0) const
	{
		const std::string log = Log();
		int count = 0;
		for (std::size_t at = log.find("CRITICAL ERROR", aFrom); at != std::string::npos; ++count)
		{
			at = log.find("CRITICAL ERROR", at + 1);
		}
		return count;
	}

	static std::vector<float> Components(const Vector4<float>& aV) { return {aV.x, aV.y, aV.z, aV.w}; }

	TestSupport::ScratchDir myScratch;
	std::string myPath;
};
