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

// The next value of type T read from the file; aStart shows whether Read replaced it.
template <typename T> T Next(FI_File& aFile, T aStart = T())
{
	EXPECT_TRUE(aFile.Read(aStart));
	return aStart;
}

class FI_FileTest : public testing::Test
{
protected:
	ScratchDir myScratch;
};
} // namespace

TEST_F(FI_FileTest, TextModeQuotesStringsWritesNumbersBareReadsThemBackAndSkipsCommentLines)
{
	const std::string name = myScratch.File("text.txt");
	{
		FI_File file;
		ASSERT_TRUE(file.Open(name, WRITE));
		EXPECT_TRUE(file.Write("a b") && file.Write(std::string("c")) && file.NewLine());
		EXPECT_TRUE(file.Write(1.0f / 3.0f) && file.WriteWord(" ") && file.Write(-7) &&
		            file.WriteWord(" 65535 rest of line") && file.NewLine() && file.Write(2.5));
		ASSERT_TRUE(file.Close());
	}
	EXPECT_EQ(ReadWholeFile(name), "\"a b\"\"c\"\n0.333333 -7 65535 rest of line\n2.5");

	FI_File file;
	ASSERT_TRUE(file.Open(name, READ));
	EXPECT_EQ(Next<std::string>(file), "a b");
	EXPECT_EQ(Next<std::string>(file), "c");
	EXPECT_FLOAT_EQ(Next<float>(file), 0.333333f);
	EXPECT_EQ(Next<int>(file), -7);
	EXPECT_EQ(Next<unsigned short>(file), 65535);
	EXPECT_TRUE(file.NewLine()) << "skips the rest of the line";
	EXPECT_DOUBLE_EQ(Next<double>(file), 2.5);
	EXPECT_TRUE(file.Close());

	// ReadWord passes over comment lines.
	const std::string words = myScratch.File("words.txt");
	WriteWholeFile(words, "// a comment with SURF in it\n//another\n  SURF next\n//trailing");

	ASSERT_TRUE(file.Open(words, READ));
	const auto nextWord = [&file] {
		std::string word;
		EXPECT_TRUE(file.ReadWord(word));
		return word;
	};
	EXPECT_EQ(nextWord(), "SURF");
	EXPECT_EQ(nextWord(), "next");
	EXPECT_EQ(nextWord(), "") << "a file ending in a comment has no further word";
}

TEST_F(FI_FileTest, BinaryWritesRawLittleEndianBytesAndReadsThemBack)
{
	const std::string name = myScratch.File("values.bin");
	const unsigned char shortBytes[] = {0xfe, 0xca};
	const std::string withNul("x\0y\"z", 5);
	{
		FI_File file;
		ASSERT_TRUE(file.Open(name, WRITE | BINARY));
		EXPECT_TRUE(file.Write("abc"));
		EXPECT_TRUE(file.Write(0x01020304));
		EXPECT_FALSE(file.NewLine()) << "binary files have no lines";
		EXPECT_TRUE(file.WriteData(shortBytes, 2) && file.Write(3.25f) && file.Write(-1.0e300) &&
		            file.Write(withNul) && file.WriteWord("word") && file.Write(std::string()));
		ASSERT_TRUE(file.Close());
	}
	const std::string bytes = ReadWholeFile(name);
	EXPECT_EQ(bytes.substr(0, 13), std::string("\x03\0\0\0abc\x04\x03\x02\x01\xfe\xca", 13));
	EXPECT_EQ(bytes.size(), 7u + 4 + 2 + 4 + 8 + (4 + 5) + (4 + 4) + 4);

	FI_File file;
	ASSERT_TRUE(file.Open(name, READ | BINARY));
	EXPECT_EQ(Next<std::string>(file), "abc");
	EXPECT_EQ(Next<int>(file), 0x01020304);
	EXPECT_EQ(Next<unsigned short>(file), 0xcafe);
	EXPECT_EQ(Next<float>(file), 3.25f);
	EXPECT_EQ(Next<double>(file), -1.0e300);
	EXPECT_EQ(Next<std::string>(file), withNul);
	EXPECT_EQ(Next<std::string>(file), "word");
	EXPECT_EQ(Next<std::string>(file, "not cleared"), "");
	EXPECT_TRUE(file.Close()) << "every read stayed inside the file";
}

TEST_F(FI_FileTest, CorruptLengthFailsAtCloseAndAReopenStartsClean)
{
	const std::string name = myScratch.File("corrupt.bin");
	WriteWholeFile(name, std::string("\xff\xff\xff\x7f"
	                                 "abc",
	                                 7));

	FI_File file;
	ASSERT_TRUE(file.Open(name, READ | BINARY));
	EXPECT_EQ(Next<std::string>(file, "old"), "") << "no 2 GiB string was built; the call still returns true";
	EXPECT_FALSE(file.Close()) << "the caller learns of the bad length at Close";

	// GetFileSize counts from the read position and rewinds to the start.
	ASSERT_TRUE(file.Open(name, READ | BINARY));
	EXPECT_EQ(file.GetFileSize(), 7);
	char bytes[3] = {};
	EXPECT_TRUE(file.ReadData(bytes, 3));
	EXPECT_EQ(file.GetFileSize(), 4);
	EXPECT_TRUE(file.ReadData(bytes, 3));
	EXPECT_EQ(std::string(bytes, 3), "\xff\xff\xff");
	EXPECT_TRUE(file.Close());
}

TEST_F(FI_FileTest, OperationsWithoutTheirFlagAreRefusedAndTouchNothing)
{
	const std::string name = myScratch.File("flags.txt");
	WriteWholeFile(name, "\"kept\" 5\n");
	std::string text;
	char byte = 0;
	FI_File file;
	ASSERT_TRUE(file.Open(name, READ));
	EXPECT_FALSE(file.Write("x") || file.WriteWord("x") || file.Write(1) || file.Flush() ||
	             file.ReadData(&byte, 1));
	EXPECT_EQ(Next<std::string>(file), "kept") << "the refused calls moved nothing";
	EXPECT_TRUE(file.Close());
	EXPECT_EQ(ReadWholeFile(name), "\"kept\" 5\n");

	ASSERT_TRUE(file.Open(name, WRITE));
	EXPECT_FALSE(file.Read(text) || file.ReadWord(text) || file.WriteData("raw", 3));
	EXPECT_TRUE(file.Close());
	EXPECT_EQ(ReadWholeFile(name), "") << "WriteData wrote nothing into the truncated file";
	EXPECT_FALSE(FI_File().Write("x")) << "nothing is written to a file never opened";
}

TEST_F(FI_FileTest, OpenReportsBadFlagsAndUnopenableFiles)
{
	const std::string missing = myScratch.File("missing.txt");
	const struct
	{
		std::string name;
		int flags;
		std::string error;
	} cases[] = {
	    {myScratch.File("a.txt"), READ | APPEND, "error: can't have append without read access.\n\n"},
	    {myScratch.File("a.txt"), BINARY, "error: must have at least read or write access.\n\n"},
	    {missing, READ, "error: unable to open file:" + missing + "\n\n"},
	};
	for (const auto& test : cases)
	{
		FI_File file;
		testing::internal::CaptureStderr();
		EXPECT_FALSE(file.Open(test.name, test.flags)) << test.flags;
		EXPECT_EQ(testing::internal::GetCapturedStderr(), test.error);
		EXPECT_FALSE(file.Write("lost")) << "nothing is written after a failed open";
	}
	EXPECT_FALSE(std::filesystem::exists(myScratch.File("a.txt")));
}

// Finding a file whatever the case of its name is the path resolver's, seen in every data load.
TEST_F(FI_FileTest, OpenCreatesDirectoriesAppendsAndTruncates)
{
	const std::string written = myScratch.File("data/Misc/new.txt");
	FI_File file;
	ASSERT_TRUE(file.Open(written, WRITE));
	EXPECT_TRUE(file.WriteWord("first "));
	ASSERT_TRUE(file.Close());
	ASSERT_TRUE(file.Open(written, WRITE | APPEND));
	EXPECT_TRUE(file.Write(5));
	ASSERT_TRUE(file.Close());
	EXPECT_EQ(ReadWholeFile(written), "first 5");
	ASSERT_TRUE(file.Open(written, WRITE));
	ASSERT_TRUE(file.Close());
	EXPECT_EQ(ReadWholeFile(written), "") << "plain write truncates";
}

TEST_F(FI_FileTest, WritesFlushAndCloseReportADiskThatRefusesThem)
{
	// /dev/full refuses every byte, as a full disk does, whoever writes (root included).
	if (!std::filesystem::exists("/dev/full"))
	{
		GTEST_SKIP() << "no /dev/full";
	}
	const std::string big(1 << 16, 'x');
	for (const int flags : {WRITE, WRITE | BINARY})
	{
		SCOPED_TRACE(flags);
		FI_File file;
		ASSERT_TRUE(file.Open("/dev/full", flags));
		EXPECT_TRUE(file.Write(1)) << "a small write only fills the stream's buffer";
		EXPECT_FALSE(file.Flush()) << "the buffer could not be written out";
		EXPECT_FALSE(file.Write("more") || file.Write(2.5f) || file.WriteWord("w") || file.NewLine())
		    << "a failed stream takes nothing more";
		EXPECT_FALSE(file.Close());

		ASSERT_TRUE(file.Open("/dev/full", flags));
		EXPECT_FALSE(flags & BINARY ? file.WriteData(big.data(), static_cast<int>(big.size()))
		                            : file.WriteWord(big))
		    << "a write larger than the buffer fails at once";
		EXPECT_FALSE(file.Close());
	}
}
