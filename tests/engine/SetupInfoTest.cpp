// The settings file of SetupInfo: its exact text, reading it back, and the "NULL" guard.

#include <gtest/gtest.h>

#include "engine/Camera.h"
#include "engine/SetupInfo.h"
#include "support/TestSupport.h"

using TestSupport::ReadWholeFile;
using TestSupport::ScratchDir;
using TestSupport::WriteWholeFile;

TEST(SetupInfoTest, SettingsFileIsWrittenAsTextAndReadsBackEveryField)
{
	ScratchDir scratch;
	const struct
	{
		bool windowed;
		bool vsync;
		int shadows;
		const char* fullscreenText;
		const char* vsyncText;
		const char* shadowText;
		int readShadows;
	} cases[] = {
	    {true, true, 3, "false", "true", "high", 3},     {false, false, 2, "true", "false", "medium", 2},
	    {true, false, 1, "false", "false", "low", 1},    {true, true, 0, "false", "true", "disabled", 0},
	    {true, true, 7, "false", "true", "disabled", 0}, // any other value is written as disabled
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
		              test.fullscreenText + "\"\nVsync \"" + test.vsyncText + "\"\nShadows \"" +
		              test.shadowText + "\"");

		Zeph::SetupInfo read;
		read.myFolder = info.myFolder;
		read.myFileName = info.myFileName;
		ASSERT_TRUE(read.LoadSettings());
		EXPECT_EQ(read.mySessionName, "Level Session");
		EXPECT_EQ(read.myWidth, 1920);
		EXPECT_EQ(read.myHeight, 1080);
		EXPECT_EQ(read.myWindowed, test.windowed);
		EXPECT_EQ(read.myVSync, test.vsync);
		EXPECT_EQ(read.myShadowQuality, test.readShadows);
	}
}

TEST(SetupInfoTest, NoSettingsFileWhileFolderOrNameIsNullAndACutFileChangesNothing)
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
}

TEST(SetupInfoTest, CameraWithoutAnEngineTakesTheDefaultResolution)
{
	EXPECT_FLOAT_EQ(Zeph::Camera().GetAspectRatio(), 1280.0f / 720.0f);
}
