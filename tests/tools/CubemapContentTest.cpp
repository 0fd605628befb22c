// The generated cube maps read back: Direct3D's face order and orientation on the normal test map,
// the fallback interior's brightness, and its mips averaging down to each face's mean.

#include <gtest/gtest.h>

#include <array>
#include <cmath>

#include "GeneratedContent.h"
#include "HalfFloat.h"
#include "platform/dds/Format.h"

namespace
{
constexpr uint32_t ourSize = 256;

using Texel = std::array<double, 4>;

Texel At(const Dds::Image& anImage, uint32_t aMip, uint32_t aFace, uint32_t anX, uint32_t aY)
{
	const uint8_t* bytes = anImage.Data(aMip, aFace) + aY * anImage.RowPitch(aMip) + anX * 8;
	Texel texel;
	for (size_t channel = 0; channel < 4; ++channel)
	{
		texel[channel] = Content::HalfToFloat(uint16_t(bytes[channel * 2] | bytes[channel * 2 + 1] << 8));
	}
	return texel;
}

void Load(const char* aName, uint32_t aMipCount, Dds::Image& anImageOut)
{
	ASSERT_NO_FATAL_FAILURE(ContentTestSupport::LoadGeneratedImage(aName, anImageOut));
	const Dds::ImageInfo& info = anImageOut.Info();
	ASSERT_TRUE(info.IsCube() && info.myArraySize == 6 && info.myWidth == ourSize && info.myHeight == ourSize)
	    << aName;
	ASSERT_EQ(info.myMipLevels, aMipCount) << aName;
	EXPECT_EQ(info.myFormat, Dds::Format::R16G16B16A16_FLOAT) << aName;
}
} // namespace

TEST(CubemapContentTest, NormalTestMapFollowsTheDirect3DFaceLayout)
{
	Dds::Image image;
	ASSERT_NO_FATAL_FAILURE(Load("Cubemaps/normaltest.dds", 1, image));
	// Per face (+X, -X, +Y, -Y, +Z, -Z) the directions of its top-left, top-right and bottom-left
	// corners seen from inside the cube.
	const int corners[6][3][3] = {
	    {{1, 1, 1}, {1, 1, -1}, {1, -1, 1}},   {{-1, 1, -1}, {-1, 1, 1}, {-1, -1, -1}},
	    {{-1, 1, -1}, {1, 1, -1}, {-1, 1, 1}}, {{-1, -1, 1}, {1, -1, 1}, {-1, -1, -1}},
	    {{-1, 1, 1}, {1, 1, 1}, {-1, -1, 1}},  {{1, 1, -1}, {-1, 1, -1}, {1, -1, -1}},
	};
	const uint32_t texels[3][2] = {{0, 0}, {ourSize - 1, 0}, {0, ourSize - 1}};
	for (uint32_t face = 0; face < 6; ++face)
	{
		for (int corner = 0; corner < 3; ++corner)
		{
			const Texel texel = At(image, 0, face, texels[corner][0], texels[corner][1]);
			const int* expected = corners[face][corner];
			const double cosine =
			    (texel[0] * expected[0] + texel[1] * expected[1] + texel[2] * expected[2]) / std::sqrt(3.0);
			EXPECT_GT(cosine, 0.999) << "face " << face << " corner " << corner;
			EXPECT_EQ(texel[3], 1.0);
		}
	}
	// The +Y face's first row looks towards -Z.
	for (uint32_t x = 0; x < ourSize; x += 15)
	{
		EXPECT_LT(At(image, 0, 2, x, 0)[2], -0.5) << x;
	}
}

TEST(CubemapContentTest, FallbackInteriorIsLitFromAboveWithGreyWallsADarkFloorAndAveragingMips)
{
	Dds::Image image;
	ASSERT_NO_FATAL_FAILURE(Load("Cubemaps/cubemap.dds", 9, image));
	const uint32_t middle = ourSize / 2;
	struct Probe
	{
		uint32_t myFace, myY;
		double myExpected, myTolerance;
	} const probes[] = {{2, middle, 1.0, 0.02},  {3, middle, 0.08, 0.01},     {0, middle, 0.25, 0.02},
	                    {1, middle, 0.25, 0.02}, {4, middle, 0.25, 0.02},     {5, middle, 0.25, 0.02},
	                    {4, 10, 0.5, 0.15},      {4, ourSize - 1, 0.08, 0.02}};
	for (const Probe& probe : probes)
	{
		const Texel texel = At(image, 0, probe.myFace, middle, probe.myY);
		EXPECT_NEAR(texel[0], probe.myExpected, probe.myTolerance) << probe.myFace << ", row " << probe.myY;
		EXPECT_TRUE(texel[1] == texel[0] && texel[2] == texel[0] && texel[3] == 1.0) << "not opaque grey";
	}

	// The mips average down to each face's mean. Halves keep 11 significant bits; the mean of rounded values
	// may be two roundings away.
	auto near = [](double aValue, double anExpected) {
		return std::abs(aValue - anExpected) <= 1.5e-3 * anExpected;
	};
	for (uint32_t face = 0; face < 6; ++face)
	{
		double mean = 0.0;
		for (uint32_t index = 0; index < ourSize * ourSize; ++index)
		{
			mean += At(image, 0, face, index % ourSize, index / ourSize)[0] / (ourSize * ourSize);
		}
		EXPECT_TRUE(near(At(image, 8, face, 0, 0)[0], mean)) << "face " << face << ": mean " << mean;
		// Each level between is the 2x2 average of the one above.
		for (uint32_t mip = 1; mip < 8; ++mip)
		{
			const uint32_t x = (ourSize >> mip) / 3, y = (ourSize >> mip) / 4;
			const double average =
			    (At(image, mip - 1, face, x * 2, y * 2)[0] + At(image, mip - 1, face, x * 2 + 1, y * 2)[0] +
			     At(image, mip - 1, face, x * 2, y * 2 + 1)[0] +
			     At(image, mip - 1, face, x * 2 + 1, y * 2 + 1)[0]) /
			    4.0;
			EXPECT_TRUE(near(At(image, mip, face, x, y)[0], average)) << "face " << face << " mip " << mip;
		}
	}
	// The ceiling's mean is the brightest, the floor's the darkest.
	EXPECT_GT(At(image, 8, 2, 0, 0)[0], At(image, 8, 0, 0, 0)[0] + 0.1);
	EXPECT_GT(At(image, 8, 0, 0, 0)[0], At(image, 8, 3, 0, 0)[0] + 0.1);
}
