#include "engine/FI_File.h"

#include <filesystem>
#include <gtest/gtest.h>
#include <vector>

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

// Quoted strings, whole numbers and words are the settings file's (SetupInfo's tests).
TEST_F(FI_FileTest, TextModeWritesFloatsAsTextReadsThemBackAndSkipsCommentLines)
{
	const std::string name = myScratch.File("text.txt");
	FI_File file;
	ASSERT_TRUE(file.Open(name, WRITE));
	EXPECT_TRUE(file.Write(1.0f / 3.0f) && file.WriteWord(" 65535 rest of line") && file.NewLine() &&
	            file.Write(2.5));
	ASSERT_TRUE(file.Close());
	EXPECT_EQ(ReadWholeFile(name), "0.333333 65535 rest of line\n2.5");
	ASSERT_TRUE(file.Open(name, READ));
	EXPECT_FLOAT_EQ(Next<float>(file), 0.333333f);
	EXPECT_EQ(Next<unsigned short>(file), 65535);
	EXPECT_TRUE(file.NewLine()) << "skips the rest of the line";
	EXPECT_DOUBLE_EQ(Next<double>(file), 2.5);
	EXPECT_TRUE(file.Close());

	// ReadWord passes over comment lines; a file ending in one has no further word.
	WriteWholeFile(name, "// a comment with SURF in it\n//another\n  SURF next\n//trailing");
	ASSERT_TRUE(file.Open(name, READ));
	std::string words[3] = {"", "", "not cleared"};
	EXPECT_TRUE(file.ReadWord(words[0]) && file.ReadWord(words[1]) && file.ReadWord(words[2]));
	EXPECT_EQ(std::vector<std::string>(words, words + 3), (std::vector<std::string>{"SURF", "next", ""}));
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

// GetFileSize, which rewinds, is read before every compiled effect and baked volume.
TEST_F(FI_FileTest, CorruptLengthFailsAtClose)
{
	const std::string name = myScratch.File("corrupt.bin");
	WriteWholeFile(name, std::string("\xff\xff\xff\x7f"
	                                 "abc",
	                                 7));

	FI_File file;
	ASSERT_TRUE(file.Open(name, READ | BINARY));
	EXPECT_EQ(Next<std::string>(file, "old"), "") << "no 2 GiB string was built; the call still returns true";
	EXPECT_FALSE(file.Close()) << "the caller learns of the bad length at Close";
}

// Creating folders and truncating are the settings file's (SetupInfo's tests write one file into
// a new folder, longer then shorter); finding a file whatever the case of its name is the path
// resolver's, seen in every data load.
TEST_F(FI_FileTest, OperationsWithoutTheirFlagAreRefusedAndAppendWritesAfterTheFile)
{
	const std::string name = myScratch.File("flags.txt");
	WriteWholeFile(name, "\"kept\" ");
	std::string text;
	char byte = 0;
	FI_File file;
	ASSERT_TRUE(file.Open(name, READ));
	EXPECT_FALSE(file.Write("x") || file.WriteWord("x") || file.Write(1) || file.Flush() ||
	             file.ReadData(&byte, 1));
	EXPECT_EQ(Next<std::string>(file), "kept") << "the refused calls moved nothing";
	EXPECT_TRUE(file.Close());

	ASSERT_TRUE(file.Open(name, WRITE | APPEND));
	EXPECT_FALSE(file.Read(text) || file.ReadWord(text) || file.WriteData("raw", 3));
	EXPECT_TRUE(file.Write(5));
	EXPECT_TRUE(file.Close());
	EXPECT_EQ(ReadWholeFile(name), "\"kept\" 5") << "the refused calls wrote nothing";
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
