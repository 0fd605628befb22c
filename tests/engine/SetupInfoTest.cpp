// The settings file of SetupInfo: its exact text, reading it back, and the "NULL" guard.

#include <gtest/gtest.h>
#include <tuple>

#include "engine/Camera.h"
#include "engine/SetupInfo.h"
#include "support/FileSizeLimit.h"
#include "support/TestSupport.h"

using TestSupport::ReadWholeFile;
using TestSupport::ScratchDir;
using TestSupport::WriteWholeFile;

TEST(SetupInfoTest, SettingsFileIsWrittenAsTextAndReadsBackEveryField)
{
	ScratchDir scratch;
	// The rows write one file, longer then shorter: a write that did not truncate shows.
	const struct
	{
		bool windowed;
		bool vsync;
		int shadows;
		const char* shadowText;
		int readShadows;
	} cases[] = {
	    {true, true, 3, "high", 3},     {false, false, 2, "medium", 2}, {true, false, 1, "low", 1},
	    {true, true, 0, "disabled", 0}, {true, true, 7, "disabled", 0}, // any other value is written as
	                                                                    // disabled
	};
	for (const auto& test : cases)
	{
		SCOPED_TRACE(test.shadowText);
		Zeph::SetupInfo info;
		info.myWindowed = test.windowed;
		info.myVSync = test.vsync;
		info.myShadowQuality = test.shadows;
		info.myWidth = 1920;
		info.myHeight = 1080;
		info.mySessionName = "Level Session";
		info.myFolder = scratch.Path().string() + "/settings/";
		info.myFileName = "Setup.txt";
		ASSERT_TRUE(info.SaveSettings());
		EXPECT_EQ(ReadWholeFile(info.myFolder + info.myFileName),
		          std::string("SessionName \"Level Session\"\nResolution 1920 1080\nFullscreen \"") +
		              (test.windowed ? "false" : "true") + "\"\nVsync \"" + (test.vsync ? "true" : "false") +
		              "\"\nShadows \"" + test.shadowText + "\"");

		Zeph::SetupInfo read;
		read.myFolder = info.myFolder;
		read.myFileName = info.myFileName;
		ASSERT_TRUE(read.LoadSettings());
		EXPECT_EQ(std::tuple(read.mySessionName, read.myWidth, read.myHeight, read.myWindowed, read.myVSync,
		                     read.myShadowQuality),
		          std::tuple(info.mySessionName, 1920, 1080, test.windowed, test.vsync, test.readShadows));
	}
}

TEST(SetupInfoTest, NoSettingsFileWhileFolderOrNameIsNullAndACutFileOrAFullDiskChangesNothing)
{
	ScratchDir scratch;
	Zeph::SetupInfo info;
	info.myFolder = scratch.Path().string() + "/";
	EXPECT_FALSE(info.SaveSettings()) << "file name still NULL";
	EXPECT_FALSE(info.LoadSettings());
	EXPECT_TRUE(std::filesystem::is_empty(scratch.Path()));

	info.myFileName = "Cut.txt";
	WriteWholeFile(info.myFolder + info.myFileName, "SessionName \"Other\"\nResolution 640");
	EXPECT_FALSE(info.LoadSettings());
	EXPECT_EQ(info.mySessionName, Zeph::SetupInfo().mySessionName);
	EXPECT_EQ(info.myWidth, Zeph::SetupInfo().myWidth);

	// A save that cannot finish leaves the settings that were there, and no temporary.
	info.myFileName = "Saved.txt";
	ASSERT_TRUE(info.SaveSettings());
	const std::string saved = ReadWholeFile(info.myFolder + info.myFileName);
	info.mySessionName = "A session name long enough not to fit";
	{
		TestSupport::FileSizeLimit full(16);
		EXPECT_FALSE(info.SaveSettings());
	}
	EXPECT_EQ(ReadWholeFile(info.myFolder + info.myFileName), saved);
	EXPECT_EQ(std::distance(std::filesystem::directory_iterator(scratch.Path()),
	                        std::filesystem::directory_iterator()),
	          2)
	    << "Cut.txt and Saved.txt only";
}

TEST(SetupInfoTest, CameraWithoutAnEngineTakesTheDefaultResolution)
{
	EXPECT_FLOAT_EQ(Zeph::Camera().GetAspectRatio(), 1280.0f / 720.0f);
}
