#pragma once
// DownSampleChain: the half, quarter and eighth size targets that bloom and the
// outline glow blur through, two per level (A holds the level's result, B is the
// scratch target between the horizontal and the vertical blur).
//
//   Zeph::DownSampleChain chain;
//   chain.Init(width, height, Dds::Format::R8G8B8A8_UNORM_SRGB);
//   chain.Render(helper, &source, "DownSamplePointHiPass", "HorBlur", "VertBlur");
//   helper.SetDiffuseTextures(chain.GetResult(0)->GetShaderResourceView(), ...);

#include <memory>

#include "engine/Texture.h"
#include "platform/dds/Format.h"

namespace Zeph
{
class FullScreenHelper;

class DownSampleChain
{
public:
	static constexpr int ourLevelCount = 3;

	DownSampleChain() = default;
	~DownSampleChain() = default;
	DownSampleChain(const DownSampleChain&) = delete;
	DownSampleChain& operator=(const DownSampleChain&) = delete;

	// Level n is (aWidth >> (n + 1)) x (aHeight >> (n + 1)), at least 1x1. False when
	// a target cannot be made (the texture reports it).
	bool Init(int aWidth, int aHeight, Dds::Format aFormat);
	// The levels made again for a new frame size; when one cannot be made the old levels stay.
	bool Resize(int aWidth, int aHeight, Dds::Format aFormat);
	void Destroy();

	// aFirstTechnique takes aSource to level 0, "DownSamplePoint" each level to the
	// next; then every level is blurred, aHorizontal from A into B and aVertical from
	// B back into A.
	void Render(FullScreenHelper& aHelper, Texture* aSource, const char* aFirstTechnique,
	            const char* aHorizontal, const char* aVertical);

	// Level aLevel's result (A) and its scratch target (B); null out of range.
	Texture* GetResult(int aLevel) const;
	Texture* GetScratch(int aLevel) const;

private:
	// Every level's pair made into the given arrays; false at the first that cannot be made.
	static bool MakeLevels(int aWidth, int aHeight, Dds::Format aFormat,
	                       std::unique_ptr<Texture> (&someResultsOut)[ourLevelCount],
	                       std::unique_ptr<Texture> (&someScratchesOut)[ourLevelCount]);

	std::unique_ptr<Texture> myResults[ourLevelCount];
	std::unique_ptr<Texture> myScratches[ourLevelCount];
};
} // namespace Zeph
