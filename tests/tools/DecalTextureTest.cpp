// The generated decal textures: an sRGB albedo that is opaque in its shape and transparent around it,
// whose mips keep the shape's coverage and colour instead of blending in the transparent surroundings,
// and a normal map of the same size that is flat wherever the decal leaves the surface alone.

#include <gtest/gtest.h>

#include <cmath>
#include <string>

#include "DecalTextures.h"
#include "GeneratedContent.h"
#include "platform/dds/Format.h"

namespace
{
using ContentTestSupport::LoadGeneratedImage;

double SrgbToLinear(uint8_t aByte)
{
	const double value = aByte / 255.0;
	return value <= 0.04045 ? value / 12.92 : std::pow((value + 0.055) / 1.055, 2.4);
}

struct Coverage
{
	double myMeanAlpha = 0.0;
	double myColor[3] = {0.0, 0.0, 0.0}; // linear, weighted by alpha
};

Coverage Measure(const Dds::Image& anImage, uint32_t aMip)
{
	const uint32_t size = std::max(anImage.Info().myWidth >> aMip, 1u);
	const uint8_t* texels = anImage.Data(aMip, 0);
	Coverage coverage;
	double alphaSum = 0.0;
	for (size_t index = 0; index < size_t(size) * size; ++index)
	{
		const double alpha = texels[index * 4 + 3] / 255.0;
		alphaSum += alpha;
		for (int channel = 0; channel < 3; ++channel)
		{
			coverage.myColor[channel] += SrgbToLinear(texels[index * 4 + channel]) * alpha;
		}
	}
	coverage.myMeanAlpha = alphaSum / (double(size) * size);
	for (double& channel : coverage.myColor)
	{
		channel = alphaSum > 0.0 ? channel / alphaSum : 0.0;
	}
	return coverage;
}
} // namespace

TEST(DecalTextureTest, AlbedoIsOpaqueInItsShapeWithMipsKeepingItAndTheNormalMapFlatAroundIt)
{
	for (const Content::DecalKind kind : Content::ourDecalKinds)
	{
		const std::string file = "textures/" + Content::DecalTextureFileName(kind, Content::MapKind::Albedo);
		const std::string normalFile =
		    "textures/" + Content::DecalTextureFileName(kind, Content::MapKind::Normal);
		Dds::Image image;
		Dds::Image normal;
		ASSERT_NO_FATAL_FAILURE(LoadGeneratedImage(file, image));
		ASSERT_NO_FATAL_FAILURE(LoadGeneratedImage(normalFile, normal));
		const Dds::ImageInfo& info = image.Info();
		ASSERT_EQ(info.myFormat, Dds::Format::R8G8B8A8_UNORM_SRGB) << file;
		ASSERT_EQ(info.myWidth, info.myHeight) << file;
		EXPECT_EQ(normal.Info().myFormat, Dds::Format::R8G8B8A8_UNORM) << normalFile;
		ASSERT_EQ(normal.Info().myWidth, info.myWidth) << normalFile;
		ASSERT_EQ(normal.Info().myHeight, info.myHeight) << normalFile;
		EXPECT_EQ(normal.Info().myMipLevels, info.myMipLevels) << normalFile;
		const uint32_t size = info.myWidth;
		// Nothing may show at the rim, where a decal box's edge would cut the picture off, and the
		// normal map leaves the surface alone there.
		bool rimClearFlag = true;
		uint8_t opaquest = 0;
		int tilted = 0;
		for (uint32_t y = 0; y < size; ++y)
		{
			for (uint32_t x = 0; x < size; ++x)
			{
				const uint8_t alpha = image.Data(0, 0)[(size_t(y) * size + x) * 4 + 3];
				const uint8_t* texel = normal.Data(0, 0) + (size_t(y) * size + x) * 4;
				opaquest = std::max(opaquest, alpha);
				const bool rimFlag = x < 2 || y < 2 || x + 2 >= size || y + 2 >= size;
				rimClearFlag = rimClearFlag && (!rimFlag || alpha == 0);
				EXPECT_TRUE(!rimFlag || (std::abs(texel[0] - 128) <= 1 && std::abs(texel[1] - 128) <= 1 &&
				                         texel[2] == 255))
				    << normalFile << ": texel " << x << ", " << y << " is not flat";
				tilted += std::abs(texel[0] - 128) > 8 || std::abs(texel[1] - 128) > 8 ? 1 : 0;
			}
		}
		EXPECT_TRUE(rimClearFlag) << file;
		EXPECT_GE(opaquest, 200) << file << ": the shape is nowhere opaque";
		EXPECT_GT(tilted, static_cast<int>(size)) << normalFile << ": the shape leaves no relief";
		const Coverage full = Measure(image, 0);
		EXPECT_TRUE(full.myMeanAlpha > 0.02 && full.myMeanAlpha < 0.9) << file << ": " << full.myMeanAlpha;
		// Seen from afar (a few mips down) the decal covers as much and has the same colour.
		for (const uint32_t mip : {1u, 3u})
		{
			const Coverage reduced = Measure(image, mip);
			EXPECT_NEAR(reduced.myMeanAlpha, full.myMeanAlpha, 0.01) << file << ": mip " << mip;
			for (int channel = 0; channel < 3; ++channel)
			{
				EXPECT_NEAR(reduced.myColor[channel], full.myColor[channel], 0.02)
				    << file << ": mip " << mip << " channel " << channel;
			}
		}
	}
}
