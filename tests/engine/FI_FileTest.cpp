#include "engine/FI_File.h"

#include <filesystem>
#include <gtest/gtest.h>

#include "support/TestSupport.h"

using TestSupport::ReadWholeFile;
using TestSupport::ScratchDir;
using TestSupport::WriteWholeFile;

namespace
{
constexpr int READ = FI_File::FileFlags::READ;
constexpr int WRITE = FI_File::FileFlags::WRITE;
constexpr int APPEND = FI_File::FileFlags::APPEND;
constexpr int BINARY = FI_File::FileFlags::BINARY;

std::string OpenAndCaptureError(FI_File& aFile, const std::string& aName, int someFlags, bool& anOpenedFlag)
{
	testing::internal::CaptureStderr();
	anOpenedFlag = aFile.Open(aName, someFlags);
	return testing::internal::GetCapturedStderr();
}
} // namespace

TEST(FI_FileTest, TextStringsAreQuotedAndReadBack)
{
	ScratchDir scratch;
	const std::string name = scratch.File("strings.txt");
	{
		FI_File file;
		ASSERT_TRUE(file.Open(name, WRITE));
		EXPECT_TRUE(file.Write("a b"));
		EXPECT_TRUE(file.Write(std::string("c")));
		EXPECT_TRUE(file.NewLine());
		EXPECT_TRUE(file.Close());
	}
	EXPECT_EQ(ReadWholeFile(name), "\"a b\"\"c\"\n");

	FI_File file;
	ASSERT_TRUE(file.Open(name, READ));
	std::string first;
	std::string second;
	EXPECT_TRUE(file.Read(first));
	EXPECT_TRUE(file.Read(second));
	EXPECT_EQ(first, "a b");
	EXPECT_EQ(second, "c");
	EXPECT_TRUE(file.Close());
}

TEST(FI_FileTest, TextNumbersUseDefaultFormattingWithoutSeparators)
{
	ScratchDir scratch;
	const std::string name = scratch.File("numbers.txt");
	{
		FI_File file;
		ASSERT_TRUE(file.Open(name, WRITE));
		file.Write("Line:");
		file.Write(34);
		file.NewLine();
		file.Write(1.0f / 3.0f);
		file.WriteWord(" ");
		file.Write(2.5);
		file.WriteWord(" ");
		file.Write(-7);
		file.WriteWord(" 65535");
		file.NewLine();
		ASSERT_TRUE(file.Close());
	}
	EXPECT_EQ(ReadWholeFile(name), "\"Line:\"34\n0.333333 2.5 -7 65535\n");

	FI_File file;
	ASSERT_TRUE(file.Open(name, READ));
	EXPECT_TRUE(file.NewLine()) << "skips the first line";
	float third = 0.0f;
	double half = 0.0;
	int negative = 0;
	unsigned short big = 0;
	EXPECT_TRUE(file.Read(third));
	EXPECT_TRUE(file.Read(half));
	EXPECT_TRUE(file.Read(negative));
	EXPECT_TRUE(file.Read(big));
	EXPECT_FLOAT_EQ(third, 0.333333f);
	EXPECT_DOUBLE_EQ(half, 2.5);
	EXPECT_EQ(negative, -7);
	EXPECT_EQ(big, 65535);
	EXPECT_TRUE(file.Close());
}

TEST(FI_FileTest, BinaryValuesAreRawLittleEndianBytes)
{
	ScratchDir scratch;
	const std::string name = scratch.File("values.bin");
	{
		FI_File file;
		ASSERT_TRUE(file.Open(name, WRITE | BINARY));
		EXPECT_TRUE(file.Write("abc"));
		EXPECT_TRUE(file.Write(0x01020304));
		EXPECT_FALSE(file.NewLine()) << "binary files have no lines";
		ASSERT_TRUE(file.Close());
	}
	EXPECT_EQ(ReadWholeFile(name), std::string("\x03\0\0\0abc\x04\x03\x02\x01", 11));
}

TEST(FI_FileTest, BinaryRoundTripOfEveryType)
{
	ScratchDir scratch;
	const std::string name = scratch.File("round.bin");
	const unsigned char shortBytes[] = {0xfe, 0xca};
	const std::string withNul("x\0y\"z", 5);
	{
		FI_File file;
		ASSERT_TRUE(file.Open(name, WRITE | BINARY));
		EXPECT_TRUE(file.WriteData(shortBytes, 2));
		EXPECT_TRUE(file.Write(-123456));
		EXPECT_TRUE(file.Write(3.25f));
		EXPECT_TRUE(file.Write(-1.0e300));
		EXPECT_TRUE(file.Write(withNul));
		EXPECT_TRUE(file.WriteWord("word"));
		EXPECT_TRUE(file.Write(std::string()));
		ASSERT_TRUE(file.Close());
	}
	EXPECT_EQ(std::filesystem::file_size(name), 2u + 4 + 4 + 8 + (4 + 5) + (4 + 4) + 4);

	FI_File file;
	ASSERT_TRUE(file.Open(name, READ | BINARY));
	unsigned short shortValue = 0;
	int intValue = 0;
	float floatValue = 0.0f;
	double doubleValue = 0.0;
	std::string stringValue;
	std::string word;
	std::string empty = "not cleared";
	EXPECT_TRUE(file.Read(shortValue));
	EXPECT_TRUE(file.Read(intValue));
	EXPECT_TRUE(file.Read(floatValue));
	EXPECT_TRUE(file.Read(doubleValue));
	EXPECT_TRUE(file.Read(stringValue));
	EXPECT_TRUE(file.ReadWord(word));
	EXPECT_TRUE(file.Read(empty));
	EXPECT_EQ(shortValue, 0xcafe);
	EXPECT_EQ(intValue, -123456);
	EXPECT_EQ(floatValue, 3.25f);
	EXPECT_EQ(doubleValue, -1.0e300);
	EXPECT_EQ(stringValue, withNul);
	EXPECT_EQ(word, "word");
	EXPECT_EQ(empty, "");
	EXPECT_TRUE(file.Close()) << "every read stayed inside the file";
}

TEST(FI_FileTest, CorruptBinaryLengthFailsTheStreamWithoutAllocating)
{
	ScratchDir scratch;
	const std::string name = scratch.File("corrupt.bin");
	WriteWholeFile(name, std::string("\xff\xff\xff\x7f"
	                                 "abc",
	                                 7));

	FI_File file;
	ASSERT_TRUE(file.Open(name, READ | BINARY));
	std::string value = "old";
	EXPECT_TRUE(file.Read(value));
	EXPECT_EQ(value, "");
	EXPECT_FALSE(file.Close()) << "the caller learns of the bad length at Close";
}

TEST(FI_FileTest, ReadWordSkipsCommentLines)
{
	ScratchDir scratch;
	const std::string name = scratch.File("words.txt");
	WriteWholeFile(name, "// a comment with SURF in it\n//another\n  SURF next\n//trailing");

	FI_File file;
	ASSERT_TRUE(file.Open(name, READ));
	std::string word;
	EXPECT_TRUE(file.ReadWord(word));
	EXPECT_EQ(word, "SURF");
	EXPECT_TRUE(file.ReadWord(word));
	EXPECT_EQ(word, "next");
	EXPECT_TRUE(file.ReadWord(word));
	EXPECT_EQ(word, "") << "a file ending in a comment has no further word";
}

TEST(FI_FileTest, TextNewLineSkipsTheRestOfALine)
{
	ScratchDir scratch;
	const std::string name = scratch.File("lines.txt");
	WriteWholeFile(name, "12 ignored \"text\"\n34\n");

	FI_File file;
	ASSERT_TRUE(file.Open(name, READ));
	int first = 0;
	int second = 0;
	EXPECT_TRUE(file.Read(first));
	EXPECT_TRUE(file.NewLine());
	EXPECT_TRUE(file.Read(second));
	EXPECT_EQ(first, 12);
	EXPECT_EQ(second, 34);
}

TEST(FI_FileTest, GetFileSizeCountsFromTheReadPositionAndRewinds)
{
	ScratchDir scratch;
	const std::string name = scratch.File("ten.bin");
	WriteWholeFile(name, "0123456789");

	FI_File file;
	ASSERT_TRUE(file.Open(name, READ | BINARY));
	EXPECT_EQ(file.GetFileSize(), 10);
	char bytes[3] = {};
	EXPECT_TRUE(file.ReadData(bytes, 3));
	EXPECT_EQ(std::string(bytes, 3), "012");
	EXPECT_EQ(file.GetFileSize(), 7);
	EXPECT_TRUE(file.ReadData(bytes, 3));
	EXPECT_EQ(std::string(bytes, 3), "012") << "GetFileSize leaves the position at the start";
}

TEST(FI_FileTest, OperationsWithoutTheirFlagDoNothing)
{
	ScratchDir scratch;
	const std::string name = scratch.File("flags.txt");
	WriteWholeFile(name, "\"kept\" 5\n");

	FI_File reader;
	ASSERT_TRUE(reader.Open(name, READ));
	EXPECT_FALSE(reader.Write("x"));
	EXPECT_FALSE(reader.WriteWord("x"));
	EXPECT_FALSE(reader.Write(1));
	EXPECT_FALSE(reader.Write(1.0f));
	EXPECT_FALSE(reader.Write(1.0));
	EXPECT_FALSE(reader.Flush());
	char byte = 0;
	EXPECT_FALSE(reader.ReadData(&byte, 1)) << "raw reads need binary mode";
	EXPECT_FALSE(reader.WriteData(&byte, 1));
	std::string text;
	EXPECT_TRUE(reader.Read(text));
	EXPECT_EQ(text, "kept") << "the refused calls moved nothing";
	EXPECT_TRUE(reader.Close());
	EXPECT_EQ(ReadWholeFile(name), "\"kept\" 5\n");

	FI_File writer;
	ASSERT_TRUE(writer.Open(name, WRITE));
	int number = 7;
	unsigned short shortNumber = 7;
	float floatNumber = 7;
	double doubleNumber = 7;
	EXPECT_FALSE(writer.Read(number));
	EXPECT_FALSE(writer.Read(shortNumber));
	EXPECT_FALSE(writer.Read(floatNumber));
	EXPECT_FALSE(writer.Read(doubleNumber));
	EXPECT_FALSE(writer.Read(text));
	EXPECT_FALSE(writer.ReadWord(text));
	EXPECT_FALSE(writer.WriteData("raw", 3)) << "text mode refuses raw bytes";
	EXPECT_TRUE(writer.Close());
	EXPECT_EQ(number, 7);
	EXPECT_EQ(text, "kept");
	EXPECT_EQ(ReadWholeFile(name), "") << "WriteData wrote nothing into the truncated file";

	FI_File unopened;
	EXPECT_FALSE(unopened.Write("x"));
	EXPECT_FALSE(unopened.Read(text));
	EXPECT_FALSE(unopened.NewLine());
}

TEST(FI_FileTest, OpenReportsBadFlagsAndMissingFiles)
{
	ScratchDir scratch;
	FI_File file;
	bool openedFlag = true;

	EXPECT_EQ(OpenAndCaptureError(file, scratch.File("a.txt"), APPEND, openedFlag),
	          "error: can't have append without read access.\n\n");
	EXPECT_FALSE(openedFlag);
	EXPECT_EQ(OpenAndCaptureError(file, scratch.File("a.txt"), READ | APPEND, openedFlag),
	          "error: can't have append without read access.\n\n");
	EXPECT_FALSE(openedFlag);
	EXPECT_EQ(OpenAndCaptureError(file, scratch.File("a.txt"), 0, openedFlag),
	          "error: must have at least read or write access.\n\n");
	EXPECT_FALSE(openedFlag);
	EXPECT_EQ(OpenAndCaptureError(file, scratch.File("a.txt"), BINARY, openedFlag),
	          "error: must have at least read or write access.\n\n");
	EXPECT_FALSE(openedFlag);
	EXPECT_FALSE(std::filesystem::exists(scratch.File("a.txt")));

	const std::string missing = scratch.File("missing.txt");
	EXPECT_EQ(OpenAndCaptureError(file, missing, READ, openedFlag),
	          "error: unable to open file:" + missing + "\n\n");
	EXPECT_FALSE(openedFlag);
	EXPECT_EQ(file.GetFlags(), 0);

	WriteWholeFile(scratch.File("plain"), "x");
	const std::string underFile = scratch.File("plain/log.txt");
	EXPECT_EQ(OpenAndCaptureError(file, underFile, WRITE, openedFlag),
	          "error: unable to open file:" + underFile + "\n\n");
	EXPECT_FALSE(openedFlag);
	EXPECT_FALSE(file.Write("lost")) << "nothing is written after a failed open";
}

TEST(FI_FileTest, OpenResolvesCaseAndCreatesDirectoriesForWriting)
{
	ScratchDir scratch;
	std::filesystem::create_directories(scratch.Path() / "data/Shaders");
	WriteWholeFile(scratch.File("data/Shaders/x.fx"), "\"shader\"");

	FI_File reader;
	ASSERT_TRUE(reader.Open(scratch.File("DATA/shaders/X.FX"), READ));
	std::string text;
	reader.Read(text);
	EXPECT_EQ(text, "shader");

	FI_File writer;
	ASSERT_TRUE(writer.Open(scratch.File("Data/shaders/Misc/new.txt"), WRITE));
	writer.Write(5);
	ASSERT_TRUE(writer.Close());
	EXPECT_EQ(ReadWholeFile(scratch.File("data/Shaders/Misc/new.txt")), "5");
}

TEST(FI_FileTest, AppendKeepsWhatWasThere)
{
	ScratchDir scratch;
	const std::string name = scratch.File("log.txt");
	WriteWholeFile(name, "first\n");

	FI_File file;
	ASSERT_TRUE(file.Open(name, WRITE | APPEND));
	file.WriteWord("second");
	file.NewLine();
	ASSERT_TRUE(file.Close());
	EXPECT_EQ(ReadWholeFile(name), "first\nsecond\n");

	ASSERT_TRUE(file.Open(name, WRITE));
	ASSERT_TRUE(file.Close());
	EXPECT_EQ(ReadWholeFile(name), "") << "plain write truncates";
}

TEST(FI_FileTest, CloseReportsAFailedStream)
{
	ScratchDir scratch;
	const std::string name = scratch.File("short.bin");
	WriteWholeFile(name, "ab");

	FI_File file;
	ASSERT_TRUE(file.Open(name, READ | BINARY));
	int value = 0;
	EXPECT_TRUE(file.Read(value)) << "reading past the end still reports the call as done";
	EXPECT_FALSE(file.Close());
	EXPECT_FALSE(file.Close()) << "a second close has nothing open";

	ASSERT_TRUE(file.Open(name, READ | BINARY)) << "reopening clears the failed state";
	EXPECT_EQ(file.GetFileSize(), 2);
	EXPECT_TRUE(file.Close());
}
