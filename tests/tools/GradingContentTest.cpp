// The colour-grading lookups read back: 32^3 RGBA8 UNORM volumes (red along x, green down the rows,
// blue through the slices); the default one is the identity, the warm one a gentle monotonic grade.

#include <gtest/gtest.h>

#include <array>
#include <cmath>
#include <functional>
#include <string>

#include "GeneratedContent.h"
#include "platform/dds/Format.h"

namespace
{
using Bytes = std::array<int, 4>;

Bytes At(const Dds::Image& anImage, uint32_t aRed, uint32_t aGreen, uint32_t aBlue)
{
	const uint8_t* texel =
	    anImage.Data(0, 0) + aBlue * anImage.SlicePitch(0) + aGreen * anImage.RowPitch(0) + aRed * 4;
	return {texel[0], texel[1], texel[2], texel[3]};
}

int Encoded(uint32_t anIndex)
{
	return int(std::floor(anIndex * 255.0 / 31.0 + 0.5));
}

void Load(const std::string& aName, Dds::Image& anImageOut)
{
	ASSERT_NO_FATAL_FAILURE(ContentTestSupport::LoadGeneratedImage(aName, anImageOut));
	const Dds::ImageInfo& info = anImageOut.Info();
	ASSERT_TRUE(info.IsVolume() && info.myWidth == 32 && info.myHeight == 32 && info.myDepth == 32) << aName;
	EXPECT_EQ(info.myMipLevels, 1u) << aName;
	EXPECT_EQ(info.myFormat, Dds::Format::R8G8B8A8_UNORM) << aName;
}

// Fails for each texel (the first five) that anOk refuses, given the texel and its red, green and
// blue indices.
void ExpectEveryTexel(const Dds::Image& anImage,
                      const std::function<bool(const Bytes&, const uint32_t*)>& anOk)
{
	int wrong = 0;
	for (uint32_t index = 0; index < 32 * 32 * 32 && wrong < 5; ++index)
	{
		const uint32_t at[3] = {index % 32, index / 32 % 32, index / 1024};
		if (!anOk(At(anImage, at[0], at[1], at[2]), at) && ++wrong)
		{
			ADD_FAILURE() << "texel (" << at[0] << ", " << at[1] << ", " << at[2] << ")";
		}
	}
}
} // namespace

TEST(GradingContentTest, DefaultLookupIsTheIdentity)
{
	Dds::Image image;
	ASSERT_NO_FATAL_FAILURE(Load("grading/default.dds", image));
	ExpectEveryTexel(image, [](const Bytes& aTexel, const uint32_t* anAt) {
		return aTexel == Bytes{Encoded(anAt[0]), Encoded(anAt[1]), Encoded(anAt[2]), 255};
	});
}

TEST(GradingContentTest, WarmLookupIsMonotonicLiftsShadowsAndWarmsHighlights)
{
	Dds::Image image;
	ASSERT_NO_FATAL_FAILURE(Load("grading/warm.dds", image));
	ExpectEveryTexel(image, [&](const Bytes& aTexel, const uint32_t* anAt) {
		bool ok = aTexel[3] == 255;
		for (int channel = 0; channel < 3; ++channel)
		{
			// Not below the texel one step lower along its own axis, and still close to the input.
			uint32_t lower[3] = {anAt[0], anAt[1], anAt[2]};
			lower[channel] -= lower[channel] > 0 ? 1 : 0;
			ok = ok && At(image, lower[0], lower[1], lower[2])[channel] <= aTexel[channel] &&
			     std::abs(aTexel[channel] - Encoded(anAt[channel])) <= 40;
		}
		return ok;
	});
	const Bytes black = At(image, 0, 0, 0);
	EXPECT_TRUE(black[0] > 0 && black[1] > 0 && black[2] > 0 && black[0] < 20) << "shadows not lifted";
	for (const uint32_t level : {24u, 31u})
	{
		EXPECT_GT(At(image, level, level, level)[0], At(image, level, level, level)[2]) << "not warmer";
	}
	// A muted colour spreads its channels further apart.
	const Bytes graded = At(image, 20, 14, 10);
	EXPECT_GT(graded[0] - graded[2], Encoded(20) - Encoded(10));
}
