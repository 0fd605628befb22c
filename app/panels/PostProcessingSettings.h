#pragma once
// PostProcessingSettings: the ambient-occlusion and exposure/bloom values the renderer starts
// from, as the settings files hold them (data/Shaders/SSAO.xml, element "ssao": scale,
// sample-rad, bias, intensity; data/Shaders/HDRBloom.xml, element "hdr-bloom": auto-exposure,
// lum-min, lum-max, bloom-threshold, bloom-factor, emissive-mult).
//
// The defaults are what the full-screen effect declares for exposure and bloom, and the
// values the engine ships in SSAO.xml for the occlusion (which the effect leaves unset).
#include <QString>
#include <QStringList>

namespace LumoraEditor
{
struct PostProcessingSettings
{
	static constexpr const char* ourSsaoFile = "data/Shaders/SSAO.xml";
	static constexpr const char* ourHdrFile = "data/Shaders/HDRBloom.xml";

	float mySsaoScale = 1.0f;
	float mySsaoSampleRadius = 0.5f;
	float mySsaoBias = 0.05f;
	float mySsaoIntensity = 1.5f;
	float myAutoExposure = 0.3f;
	float myLumMin = 0.05f;
	float myLumMax = 4.0f;
	float myBloomThreshold = 0.8f;
	float myBloomFactor = 0.25f;
	float myEmissiveMultiplier = 2.0f;

	bool operator==(const PostProcessingSettings&) const = default;

	// Reads both files. Whatever cannot be read (a missing file, broken XML, a missing
	// element or attribute, a value that is no number) keeps its default, with a line in
	// someNotesOut naming the file and what was wrong.
	static PostProcessingSettings Read(const QString& aSsaoFile, const QString& aHdrFile,
	                                   QStringList& someNotesOut);
};
} // namespace LumoraEditor
