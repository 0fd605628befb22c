#include "engine/SetupInfo.h"

#include "engine/FI_File.h"
#include "platform/paths/Paths.h"

namespace Zeph
{
namespace
{
const char* ShadowQualityName(int aQuality)
{
	switch (aQuality)
	{
	case SetupInfo::SHADOWS_HIGH:
		return "high";
	case SetupInfo::SHADOWS_MEDIUM:
		return "medium";
	case SetupInfo::SHADOWS_LOW:
		return "low";
	default:
		return "disabled";
	}
}

int ShadowQualityFromName(const std::string& aName)
{
	if (aName == "high")
	{
		return SetupInfo::SHADOWS_HIGH;
	}
	if (aName == "medium")
	{
		return SetupInfo::SHADOWS_MEDIUM;
	}
	if (aName == "low")
	{
		return SetupInfo::SHADOWS_LOW;
	}
	return SetupInfo::SHADOWS_DISABLED;
}
} // namespace

bool SetupInfo::HasSettingsFile() const
{
	return myFolder != "NULL" && myFileName != "NULL";
}

bool SetupInfo::SaveSettings() const
{
	if (!HasSettingsFile())
	{
		return false;
	}
	// The settings are written whole to a temporary beside the file and renamed over it: a
	// full disk or a killed process leaves the previous settings, never half of new ones.
	const std::string target = Paths::PrepareForWrite(myFolder + myFileName);
	const std::string temporary = target.empty() ? std::string() : Paths::TemporaryFor(target);
	FI_File file;
	if (temporary.empty() || !file.Open(temporary, FI_File::FileFlags::WRITE))
	{
		Paths::Discard(temporary);
		return false;
	}
	// Each label is followed by a space: the reader takes labels as whitespace-separated
	// words, and a label glued to its value would swallow the value.
	file.WriteWord("SessionName ");
	file.Write(mySessionName);
	file.NewLine();
	file.WriteWord("Resolution ");
	file.Write(myWidth);
	file.WriteWord(" ");
	file.Write(myHeight);
	file.NewLine();
	file.WriteWord("Fullscreen ");
	file.Write(myWindowed ? "false" : "true");
	file.NewLine();
	file.WriteWord("Vsync ");
	file.Write(myVSync ? "true" : "false");
	file.NewLine();
	file.WriteWord("Shadows ");
	file.Write(ShadowQualityName(myShadowQuality));
	if (!file.Close() || !Paths::ReplaceWith(temporary, target))
	{
		Paths::Discard(temporary);
		return false;
	}
	return true;
}

bool SetupInfo::LoadSettings()
{
	if (!HasSettingsFile())
	{
		return false;
	}
	FI_File file;
	if (!file.Open(myFolder + myFileName, FI_File::FileFlags::READ))
	{
		return false;
	}
	// Labels are read and not checked; the values come in their fixed order.
	std::string label;
	std::string sessionName;
	std::string fullscreen;
	std::string vsync;
	std::string shadows;
	int width = 0;
	int height = 0;
	file.ReadWord(label);
	file.Read(sessionName);
	file.ReadWord(label);
	file.Read(width);
	file.Read(height);
	file.ReadWord(label);
	file.Read(fullscreen);
	file.ReadWord(label);
	file.Read(vsync);
	file.ReadWord(label);
	file.Read(shadows);
	// A file cut short fails the stream; nothing of it is taken then.
	if (!file.Close())
	{
		return false;
	}
	mySessionName = sessionName;
	myWidth = width;
	myHeight = height;
	myWindowed = fullscreen != "true";
	myVSync = vsync == "true";
	myShadowQuality = ShadowQualityFromName(shadows);
	return true;
}
} // namespace Zeph
