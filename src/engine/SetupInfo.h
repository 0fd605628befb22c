#pragma once
// SetupInfo: the engine's settings (window mode, vsync, shadow quality, size, session),
// owned by the Engine. The picking code and the camera read the size from here.
//
// The settings file is used only when both myFolder and myFileName name one (neither
// is "NULL"); the engine's Create leaves them "NULL", so it never reads or writes it.
// Its text form, through FI_File in text mode:
//
//   SessionName "Orvanta"
//   Resolution 1280 720
//   Fullscreen "false"
//   Vsync "true"
//   Shadows "high"

#include <string>

namespace Zeph
{
struct SetupInfo
{
	enum ShadowQuality
	{
		SHADOWS_DISABLED = 0,
		SHADOWS_LOW = 1,
		SHADOWS_MEDIUM = 2,
		SHADOWS_HIGH = 3,
	};

	bool myWindowed = true;
	bool myVSync = true;
	int myShadowQuality = SHADOWS_HIGH;
	int myWidth = 1280;
	int myHeight = 720;
	std::string mySessionName = "Orvanta";
	std::string myFolder = "NULL";
	std::string myFileName = "NULL";

	// False (and nothing touched) while folder or file name is "NULL", or when the
	// file cannot be opened or read in full; a failed read leaves the fields as they were.
	bool SaveSettings() const;
	bool LoadSettings();

private:
	bool HasSettingsFile() const;
};
} // namespace Zeph
