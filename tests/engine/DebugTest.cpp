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

// The core layer (a growing array past its counter's range, say) reports through the handler
// that Debug installs, and takes it away again. (A Destroy that left the instance would fail
// every later fixture's Create.)
TEST_F(DebugTest, CoreReportsReachTheFirstLogAndLongMessagesAreCutAt4095Characters)
{
	const std::string log = myScratch.File("DebugLogger.txt");
	ASSERT_TRUE(Debug::Create(log, std::bitset<4>(0)));
	EXPECT_FALSE(Debug::Create(myScratch.File("second.txt"), std::bitset<4>(12))) << "the first log stays";
	CoreReport::GetCriticalHandler()(1, "GrowingArray::Add", std::string(5000, 'x').c_str());
	ASSERT_TRUE(Debug::Destroy());
	EXPECT_EQ(CoreReport::GetCriticalHandler(), nullptr);
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
	lines[1] = lines[1].starts_with("\"File:\"\"") && lines[1].ends_with('"') ? "(file)" : lines[1];
	EXPECT_EQ(std::vector<std::string>(lines.begin(), lines.begin() + 5),
	          (std::vector<std::string>{"\"Assertion Failed:\"\"Critical Error Message\"", "(file)",
	                                    "\"Function:\"\"Zeph::Engine::D3DDeviceSetup\"", "\"Line:\"77", ""}));
	// The stack starts at the reporter (each frame's form is the stack trace's own test).
	const std::size_t source = lines[5].find("DebugTest.cpp (");
	EXPECT_TRUE(source != std::string::npos &&
	            lines[5].find("): (anonymous namespace)::FailFatally", source) != std::string::npos)
	    << report;
	for (std::size_t i = 5; i < lines.size(); ++i)
	{
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
