#include "engine/Debug.h"

#include <algorithm>
#include <filesystem>
#include <gmock/gmock-matchers.h>
#include <gtest/gtest.h>
#include <sstream>
#include <vector>

#include "core/CoreReport.h"
#include "support/TestSupport.h"

using TestSupport::ReadWholeFile;
using TestSupport::ScratchDir;

namespace
{
// Advances aPosition past aCount decimal numbers without leading zeros, joined by aSeparator.
bool SkipNumbers(const std::string& aText, std::size_t& aPosition, int aCount, char aSeparator)
{
	for (int i = 0; i < aCount; ++i)
	{
		const std::size_t start = aPosition;
		while (aPosition < aText.size() && aText[aPosition] >= '0' && aText[aPosition] <= '9')
		{
			++aPosition;
		}
		if (aPosition == start || (aText[start] == '0' && aPosition > start + 1) ||
		    (i + 1 < aCount && (aPosition >= aText.size() || aText[aPosition++] != aSeparator)))
		{
			return false;
		}
	}
	return true;
}

// The text after its leading time stamp: "year/month/day\nh:m:s:ms" quoted as one
// item, then a line end. (std::regex does not compile warning-free under the sanitizers.)
testing::AssertionResult AfterStamp(const std::string& aText, std::string& aRest)
{
	std::size_t at = 0;
	if (!(aText.starts_with('"') && SkipNumbers(aText, ++at, 3, '/') && aText.compare(at, 1, "\n") == 0 &&
	      SkipNumbers(aText, ++at, 4, ':') && aText.compare(at, 2, "\"\n") == 0))
	{
		return testing::AssertionFailure() << "no time stamp at the start of:\n" << aText;
	}
	aRest = aText.substr(at + 2);
	return testing::AssertionSuccess();
}

// Every test leaves no log behind, whatever it asserted.
class DebugTest : public testing::Test
{
protected:
	void TearDown() override
	{
		if (Debug::GetInstance() != nullptr)
		{
			Debug::Destroy();
		}
	}

	ScratchDir myScratch;
};

using Report = void (Debug::*)(int, const char*, const char*, ...);
} // namespace

TEST_F(DebugTest, EntryIsWrittenByteForByteAndNonFatalLevelsContinue)
{
	const struct
	{
		unsigned long levels;
		Report report;
		std::string tag;
	} cases[] = {
	    {0, &Debug::CriticalErrorMessage, "CRITICAL ERROR"},
	    {0, &Debug::SevereErrorMessage, "SEVERE ERROR"},
	    {12, &Debug::DebugMessage, "DEBUG"},
	    {12, &Debug::ErrorMessage, "ERROR"},
	};
	for (const auto& test : cases)
	{
		const std::string log = myScratch.File(test.tag + ".txt");
		ASSERT_TRUE(Debug::Create(log, std::bitset<4>(test.levels)));
		(Debug::GetInstance()->*test.report)(34, "AI::NGNode::AddEdge", "Tried to connect %d edges to %s", 3,
		                                     "node");
		// Read before Destroy: every entry is flushed as it is written.
		std::string rest;
		ASSERT_TRUE(AfterStamp(ReadWholeFile(log), rest));
		EXPECT_EQ(rest, "\"Error Type:\"\"" + test.tag +
		                    "\"\n"
		                    "\"Line:\"34\n"
		                    "\"Function:\"\"AI::NGNode::AddEdge\"\n"
		                    "\"Tried to connect 3 edges to node\n"
		                    "\"\n");
		ASSERT_TRUE(Debug::Destroy());
	}
}

TEST_F(DebugTest, CreateTwiceKeepsTheFirstLogAndDestroyClearsTheInstance)
{
	const std::string first = myScratch.File("first.txt");
	const std::string second = myScratch.File("second.txt");
	EXPECT_EQ(Debug::GetInstance(), nullptr);
	ASSERT_TRUE(Debug::Create(first, std::bitset<4>(0)));
	Debug* instance = Debug::GetInstance();
	EXPECT_FALSE(Debug::Create(second, std::bitset<4>(8)));
	EXPECT_EQ(Debug::GetInstance(), instance);
	Debug::GetInstance()->CriticalErrorMessage(5, "Test::Second", "still %s", "here");
	EXPECT_NE(CoreReport::GetCriticalHandler(), nullptr);
	EXPECT_TRUE(Debug::Destroy());

	EXPECT_EQ(Debug::GetInstance(), nullptr);
	EXPECT_EQ(CoreReport::GetCriticalHandler(), nullptr);
	EXPECT_FALSE(std::filesystem::exists(second));
	EXPECT_THAT(ReadWholeFile(first), testing::HasSubstr("\"still here\n\""))
	    << "levels 8 were not taken either";
}

// The core layer (a growing array past its counter's range, say) reports through the handler
// that Debug installs.
TEST_F(DebugTest, CoreReportsReachTheLogAndLongMessagesAreCutAt4095Characters)
{
	const std::string log = myScratch.File("DebugLogger.txt");
	ASSERT_TRUE(Debug::Create(log, std::bitset<4>(0)));
	CoreReport::GetCriticalHandler()(1, "GrowingArray::Add", std::string(5000, 'x').c_str());
	ASSERT_TRUE(Debug::Destroy());
	const std::string text = ReadWholeFile(log);
	EXPECT_THAT(text,
	            testing::HasSubstr(
	                "\"Error Type:\"\"CRITICAL ERROR\"\n\"Line:\"1\n\"Function:\"\"GrowingArray::Add\"\n\"" +
	                std::string(4095, 'x') + "\n\"\n"));
	EXPECT_EQ(std::count(text.begin(), text.end(), 'x'), 4095);
}

// Death tests fork (gtest's "fast" style): the child writes into the parent's scratch directory.
using DebugDeathTest = DebugTest;

namespace
{
__attribute__((noinline)) void FailFatally(const std::string& aLog)
{
	Debug::Create(aLog, std::bitset<4>(12));
	Debug::GetInstance()->CriticalErrorMessage(77, "Zeph::Engine::D3DDeviceSetup",
	                                           "Failed to open %s:", "device");
	asm volatile("" ::: "memory");
}
} // namespace

TEST_F(DebugDeathTest, FatalCriticalErrorWritesAssertionBlockAndStackThenEnds)
{
	const std::string log = myScratch.File("DebugLogger.txt");
	EXPECT_DEATH(FailFatally(log), "");

	std::string rest;
	ASSERT_TRUE(AfterStamp(ReadWholeFile(log), rest));
	const std::string entry = "\"Error Type:\"\"CRITICAL ERROR\"\n\"Line:\"77\n"
	                          "\"Function:\"\"Zeph::Engine::D3DDeviceSetup\"\n\"Failed to open device:\n\"\n";
	ASSERT_TRUE(rest.starts_with(entry)) << rest;
	std::string report;
	ASSERT_TRUE(AfterStamp(rest.substr(entry.size()), report));
	std::vector<std::string> lines;
	std::istringstream in(report);
	for (std::string line; std::getline(in, line);)
	{
		lines.push_back(line);
	}
	ASSERT_GE(lines.size(), 6u) << report;
	EXPECT_EQ(lines[0], "\"Assertion Failed:\"\"Critical Error Message\"");
	EXPECT_TRUE(lines[1].starts_with("\"File:\"\"") && lines[1].ends_with('"')) << lines[1];
	EXPECT_EQ(lines[2], "\"Function:\"\"Zeph::Engine::D3DDeviceSetup\"");
	EXPECT_EQ(lines[3], "\"Line:\"77");
	EXPECT_EQ(lines[4], "");
	// The stack starts at the reporter, one "file (line): function" item per frame.
	const std::size_t source = lines[5].find("DebugTest.cpp (");
	EXPECT_TRUE(source != std::string::npos &&
	            lines[5].find("): (anonymous namespace)::FailFatally", source) != std::string::npos)
	    << report;
	for (std::size_t i = 5; i < lines.size(); ++i)
	{
		EXPECT_TRUE(lines[i].size() > 2 && lines[i].starts_with('"') && lines[i].ends_with('"') &&
		            lines[i].find("): ") != std::string::npos)
		    << lines[i];
		EXPECT_EQ(lines[i].find("Debug::"), std::string::npos) << "logger frame in the stack: " << lines[i];
	}
}

TEST_F(DebugDeathTest, UnopenableLogExplainsItselfOnStandardError)
{
	// /dev/null is no directory, so the log cannot be created below it.
	EXPECT_DEATH(Debug::Create("/dev/null/logs/DebugLogger.txt", std::bitset<4>(12)),
	             "error: unable to open file:/dev/null/logs/DebugLogger.txt\n\n"
	             "\"[0-9/]+\n[0-9:]+\"\n"
	             "\"Assertion Failed:\"\"Failed to initialize debug system\"\n"
	             "\"File:\"\"[^\"]+\"\n"
	             "\"Function:\"\"Debug::Init\"\n"
	             "\"Line:\"155\n\n"
	             "\".*DebugTest\\.cpp");
}
