#include "engine/Debug.h"

#include <cstdlib>
#include <filesystem>
#include <gtest/gtest.h>
#include <optional>
#include <sstream>
#include <vector>

#include "core/CoreReport.h"
#include "core/GrowingArray.h"
#include "support/TestSupport.h"

using TestSupport::ReadWholeFile;
using TestSupport::ScratchDir;

namespace
{
// A decimal number without leading zeros, advancing aPosition past it.
bool SkipNumber(const std::string& aText, std::size_t& aPosition)
{
	const std::size_t start = aPosition;
	while (aPosition < aText.size() && aText[aPosition] >= '0' && aText[aPosition] <= '9')
	{
		++aPosition;
	}
	return aPosition > start && (aText[start] != '0' || aPosition == start + 1);
}

bool SkipNumbers(const std::string& aText, std::size_t& aPosition, int aCount, char aSeparator)
{
	for (int i = 0; i < aCount; ++i)
	{
		if (!SkipNumber(aText, aPosition) ||
		    (i + 1 < aCount && (aPosition >= aText.size() || aText[aPosition++] != aSeparator)))
		{
			return false;
		}
	}
	return true;
}

// The log after its leading time stamp (two lines: year/month/day and
// hour:minute:second:millisecond, no leading zeros, quoted as one item), or a
// failure when the stamp is malformed. std::regex is avoided: its headers do not
// compile warning-free under the sanitizers.
testing::AssertionResult AfterStamp(const std::string& aText, std::string& aRest)
{
	std::size_t position = 0;
	const bool stampFlag = aText.starts_with('"') && SkipNumbers(aText, ++position, 3, '/') &&
	                       aText.compare(position, 1, "\n") == 0 && SkipNumbers(aText, ++position, 4, ':') &&
	                       aText.compare(position, 2, "\"\n") == 0;
	if (!stampFlag)
	{
		return testing::AssertionFailure() << "no time stamp at the start of:\n" << aText;
	}
	aRest = aText.substr(position + 2);
	return testing::AssertionSuccess();
}

std::vector<std::string> Lines(const std::string& aText)
{
	std::vector<std::string> lines;
	std::istringstream in(aText);
	for (std::string line; std::getline(in, line);)
	{
		lines.push_back(line);
	}
	return lines;
}

std::size_t CountOf(const std::string& aText, const std::string& aPart)
{
	std::size_t count = 0;
	for (std::size_t at = aText.find(aPart); at != std::string::npos; at = aText.find(aPart, at + 1))
	{
		++count;
	}
	return count;
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

__attribute__((noinline)) void ReportFromKnownPlace(int aValue)
{
	Debug::GetInstance()->CriticalErrorMessage(34, "AI::NGNode::AddEdge", "Tried to connect %d edges to node",
	                                           aValue);
	asm volatile("" ::: "memory");
}
} // namespace

TEST_F(DebugTest, EntryIsWrittenByteForByte)
{
	const std::string log = myScratch.File("DebugLogger.txt");
	ASSERT_TRUE(Debug::Create(log, std::bitset<4>(0)));
	ReportFromKnownPlace(3);
	ASSERT_TRUE(Debug::Destroy());

	std::string rest;
	ASSERT_TRUE(AfterStamp(ReadWholeFile(log), rest));
	EXPECT_EQ(rest, "\"Error Type:\"\"CRITICAL ERROR\"\n"
	                "\"Line:\"34\n"
	                "\"Function:\"\"AI::NGNode::AddEdge\"\n"
	                "\"Tried to connect 3 edges to node\n"
	                "\"\n");
}

TEST_F(DebugTest, EachLevelWritesItsTagAndNonFatalLevelsContinue)
{
	const std::string log = myScratch.File("DebugLogger.txt");
	ASSERT_TRUE(Debug::Create(log, std::bitset<4>(12)));
	Debug* debug = Debug::GetInstance();
	debug->DebugMessage(1, "Zeph::SpriteEffect::Init", "debug %s", "text");
	debug->ErrorMessage(2, "Zeph::A", "error");
	ASSERT_TRUE(Debug::Destroy());
	ASSERT_TRUE(Debug::Create(log, std::bitset<4>(0)));
	Debug::GetInstance()->SevereErrorMessage(3, "Zeph::B", "severe");
	Debug::GetInstance()->CriticalErrorMessage(4, "Zeph::C", "critical");
	ASSERT_TRUE(Debug::Destroy());

	const std::string text = ReadWholeFile(log);
	EXPECT_EQ(CountOf(text, "\"Error Type:\""), 2u) << "the second log truncates the first";
	EXPECT_NE(text.find("\"Error Type:\"\"SEVERE ERROR\"\n\"Line:\"3\n"), std::string::npos) << text;
	EXPECT_NE(text.find("\"Error Type:\"\"CRITICAL ERROR\"\n\"Line:\"4\n"), std::string::npos) << text;
	EXPECT_EQ(text.find("Assertion Failed:"), std::string::npos);
}

TEST_F(DebugTest, DebugMessageWithFatalLevelsIsLoggedAndContinues)
{
	const std::string log = myScratch.File("DebugLogger.txt");
	ASSERT_TRUE(Debug::Create(log, std::bitset<4>(12)));
	Debug::GetInstance()->DebugMessage(7, "Zeph::SpriteEffect::Init", "Loaded %s", "sprite.fx");
	Debug::GetInstance()->ErrorMessage(8, "Zeph::Other", "also kept");

	// The file is flushed after every entry, so it is readable while the log is open.
	const std::string text = ReadWholeFile(log);
	EXPECT_NE(text.find("\"Error Type:\"\"DEBUG\"\n\"Line:\"7\n\"Function:\"\"Zeph::SpriteEffect::Init\"\n"
	                    "\"Loaded sprite.fx\n\"\n"),
	          std::string::npos)
	    << text;
	EXPECT_NE(text.find("\"Error Type:\"\"ERROR\"\n\"Line:\"8\n"), std::string::npos) << text;
	EXPECT_EQ(text.find("Assertion Failed:"), std::string::npos);
}

TEST_F(DebugTest, CreateTwiceKeepsTheFirstLog)
{
	const std::string first = myScratch.File("first.txt");
	const std::string second = myScratch.File("second.txt");
	ASSERT_TRUE(Debug::Create(first, std::bitset<4>(0)));
	Debug* instance = Debug::GetInstance();
	EXPECT_FALSE(Debug::Create(second, std::bitset<4>(8)));
	EXPECT_EQ(Debug::GetInstance(), instance);
	Debug::GetInstance()->CriticalErrorMessage(5, "Test::Second", "still %s", "here");
	EXPECT_TRUE(Debug::Destroy());

	EXPECT_FALSE(std::filesystem::exists(second));
	EXPECT_NE(ReadWholeFile(first).find("\"still here\n\""), std::string::npos)
	    << "levels 8 were not taken either";
}

TEST_F(DebugTest, DestroyClearsTheInstanceAndTheCoreHandler)
{
	EXPECT_EQ(Debug::GetInstance(), nullptr);
	EXPECT_FALSE(Debug::Destroy()) << "nothing to destroy";
	ASSERT_TRUE(Debug::Create(myScratch.File("log.txt"), std::bitset<4>(0)));
	EXPECT_NE(Debug::GetInstance(), nullptr);
	EXPECT_NE(CoreReport::GetCriticalHandler(), nullptr);
	EXPECT_TRUE(Debug::Destroy());
	EXPECT_EQ(Debug::GetInstance(), nullptr);
	EXPECT_EQ(CoreReport::GetCriticalHandler(), nullptr);
	EXPECT_TRUE(Debug::Create(myScratch.File("again.txt"), std::bitset<4>(0))) << "a new log after Destroy";
}

TEST_F(DebugTest, LongMessagesAreCutAt4095Characters)
{
	const std::string log = myScratch.File("DebugLogger.txt");
	ASSERT_TRUE(Debug::Create(log, std::bitset<4>(0)));
	const std::string longText(5000, 'x');
	Debug::GetInstance()->CriticalErrorMessage(1, "Test::Long", "%s", longText.c_str());
	ASSERT_TRUE(Debug::Destroy());

	const std::string text = ReadWholeFile(log);
	EXPECT_NE(text.find("\"" + std::string(4095, 'x') + "\n\"\n"), std::string::npos);
	EXPECT_EQ(CountOf(text, "x"), 4095u);
}

TEST_F(DebugTest, FormatArgumentsAreExpanded)
{
	const std::string log = myScratch.File("DebugLogger.txt");
	ASSERT_TRUE(Debug::Create(log, std::bitset<4>(0)));
	Debug::GetInstance()->CriticalErrorMessage(9, "XML::Error", "Failed to open %s: %d%%", "level.xml", 42);
	ASSERT_TRUE(Debug::Destroy());
	EXPECT_NE(ReadWholeFile(log).find("\"Failed to open level.xml: 42%\n\"\n"), std::string::npos);
}

TEST_F(DebugTest, CoreReportsReachTheLog)
{
	const std::string log = myScratch.File("DebugLogger.txt");
	ASSERT_TRUE(Debug::Create(log, std::bitset<4>(0)));
	GrowingArray<int> numbers(16, 1024);
	for (int i = 0; i < 65535; ++i)
	{
		numbers.Add(i);
	}
	EXPECT_EQ(ReadWholeFile(log), "") << "no report before the limit";
	numbers.Add(65535);
	EXPECT_EQ(numbers.Count(), 65535);
	EXPECT_EQ(numbers.Last(), 65534);
	ASSERT_TRUE(Debug::Destroy());

	std::string rest;
	ASSERT_TRUE(AfterStamp(ReadWholeFile(log), rest));
	EXPECT_TRUE(rest.starts_with("\"Error Type:\"\"CRITICAL ERROR\"\n\"Line:\"")) << rest;
	EXPECT_NE(rest.find("\"Function:\"\"GrowingArray::Add\"\n\"Tried to grow past 65535 elements"),
	          std::string::npos)
	    << rest;
}

// Death tests re-run the test in a child process; the child must write its log
// where the parent will look, so the parent passes the path through the
// environment (the child's own scratch directory would be lost when it aborts).
class DebugDeathTest : public testing::Test
{
protected:
	static constexpr const char* ourLogVariable = "LUMORA_DEBUG_DEATH_TEST_LOG";

	void SetUp() override
	{
		GTEST_FLAG_SET(death_test_style, "threadsafe");
		if (const char* inherited = std::getenv(ourLogVariable))
		{
			myLog = inherited;
			return;
		}
		myScratch.emplace();
		myLog = myScratch->File("DebugLogger.txt");
		::setenv(ourLogVariable, myLog.c_str(), 1);
	}

	void TearDown() override { ::unsetenv(ourLogVariable); }

	std::optional<ScratchDir> myScratch;
	std::string myLog;
};

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
	EXPECT_DEATH(FailFatally(myLog), "");

	std::string rest;
	ASSERT_TRUE(AfterStamp(ReadWholeFile(myLog), rest));
	const std::string entry = "\"Error Type:\"\"CRITICAL ERROR\"\n"
	                          "\"Line:\"77\n"
	                          "\"Function:\"\"Zeph::Engine::D3DDeviceSetup\"\n"
	                          "\"Failed to open device:\n"
	                          "\"\n";
	ASSERT_TRUE(rest.starts_with(entry)) << rest;
	std::string report;
	ASSERT_TRUE(AfterStamp(rest.substr(entry.size()), report));
	const std::string block = "\"Assertion Failed:\"\"Critical Error Message\"\n"
	                          "\"File:\"\"Debug.cpp\"\n"
	                          "\"Function:\"\"Zeph::Engine::D3DDeviceSetup\"\n"
	                          "\"Line:\"77\n"
	                          "\n";
	ASSERT_TRUE(report.starts_with(block)) << report;

	const std::vector<std::string> stack = Lines(report.substr(block.size()));
	ASSERT_FALSE(stack.empty());
	bool helperFound = false;
	for (const std::string& line : stack)
	{
		// "file (line): function" or "address (module): file: function", as one item.
		EXPECT_TRUE(line.size() > 2 && line.starts_with('"') && line.ends_with('"') &&
		            line.find("): ") != std::string::npos)
		    << line;
		EXPECT_EQ(line.find("Debug::"), std::string::npos) << "logger frame in the stack: " << line;
		const std::size_t source = line.find("DebugTest.cpp (");
		helperFound =
		    helperFound || (source != std::string::npos &&
		                    line.find("): (anonymous namespace)::FailFatally", source) != std::string::npos);
	}
	EXPECT_TRUE(helperFound) << report;
	EXPECT_TRUE(stack[0].find("FailFatally") != std::string::npos) << "the stack starts at the reporter";
}

TEST_F(DebugDeathTest, UnopenableLogExplainsItselfOnStandardError)
{
	// /dev/null is no directory, so the log cannot be created below it.
	EXPECT_DEATH(Debug::Create("/dev/null/logs/DebugLogger.txt", std::bitset<4>(12)),
	             "error: unable to open file:/dev/null/logs/DebugLogger.txt\n\n"
	             "\"[0-9/]+\n[0-9:]+\"\n"
	             "\"Assertion Failed:\"\"Failed to initialize debug system\"\n"
	             "\"File:\"\"Debug.cpp\"\n"
	             "\"Function:\"\"Debug::Init\"\n"
	             "\"Line:\"155\n\n"
	             "\".*DebugTest\\.cpp");
}
