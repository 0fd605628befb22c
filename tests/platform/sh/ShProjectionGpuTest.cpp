// SH projection of textures: cube maps and atlases read back from the GPU project as their texels do;
// textures that are not float cubes are refused.

#include <algorithm>
#include <array>
#include <cstdint>
#include <cstring>
#include <random>
#include <vector>

#include "GpuTest.h"
#include "platform/sh/ShProjection.h"

namespace
{
// Random RGBA values in [0, 4), each exactly a half float so that both formats hold them unchanged.
std::vector<float> RandomHalfTexels(size_t aCount, unsigned aSeed)
{
	std::mt19937 generator(aSeed);
	std::uniform_int_distribution<int> distribution(0, 1023);
	std::vector<float> values(aCount);
	for (float& value : values)
	{
		value = static_cast<float>(distribution(generator)) / 256.0f;
	}
	return values;
}

// The texels as the given format stores them: floats, or halves.
std::vector<uint8_t> Encode(const std::vector<float>& someValues, Dds::Format aFormat)
{
	std::vector<uint8_t> bytes;
	if (aFormat == Dds::Format::R32G32B32A32_FLOAT)
	{
		bytes.resize(someValues.size() * sizeof(float));
		std::memcpy(bytes.data(), someValues.data(), bytes.size());
		return bytes;
	}
	for (const float value : someValues)
	{
		const _Float16 half = static_cast<_Float16>(value);
		uint8_t halfBytes[2];
		std::memcpy(halfBytes, &half, 2);
		bytes.insert(bytes.end(), halfBytes, halfBytes + 2);
	}
	return bytes;
}

using ShProjectionGpuTest = GpuTest;

TEST_F(ShProjectionGpuTest, CubeTexturesProjectLikeTheirTexels)
{
	for (const Dds::Format format : {Dds::Format::R32G32B32A32_FLOAT, Dds::Format::R16G16B16A16_FLOAT})
	{
		const int width = format == Dds::Format::R32G32B32A32_FLOAT ? 16 : 32;
		const std::vector<float> texels =
		    RandomHalfTexels(static_cast<size_t>(6 * width * width * 4), static_cast<unsigned>(format));
		const std::vector<uint8_t> bytes = Encode(texels, format);
		Gpu::Texture* cube = MakeCube(format, width, 0);
		ASSERT_NE(cube, nullptr);
		const size_t faceBytes = bytes.size() / 6;
		for (int face = 0; face < 6; ++face)
		{
			ASSERT_TRUE(cube->Upload(0, face, bytes.data() + faceBytes * static_cast<size_t>(face),
			                         static_cast<uint32_t>(faceBytes / static_cast<size_t>(width))));
		}
		// Both formats hold the texels exactly, so the coefficients are the same to the bit.
		std::array<float, 27> expected{};
		ASSERT_TRUE(
		    Sh::ProjectCubeTexels(texels.data(), width, 4, &expected[0], &expected[9], &expected[18]));
		std::array<float, 27> actual{};
		ASSERT_TRUE(Sh::ProjectCubeMap(GetContext(), 3, *cube, &actual[0], &actual[9], &actual[18]));
		EXPECT_EQ(actual, expected) << "format " << static_cast<int>(format);
	}
}

TEST_F(ShProjectionGpuTest, AtlasTexturesProjectLikeTheirTexels)
{
	// 5 cubes of 4-texel faces, 8 tiles per row: 30 tiles in 4 tile rows.
	const int faceWidth = 4;
	const int cubeCount = 5;
	const int width = 8 * faceWidth;
	const int height = 4 * faceWidth;
	const std::vector<float> texels = RandomHalfTexels(static_cast<size_t>(width * height * 4), 5u);
	Gpu::Texture* atlas = MakeTarget(Dds::Format::R32G32B32A32_FLOAT, width, height);
	ASSERT_NE(atlas, nullptr);
	ASSERT_TRUE(atlas->Upload(0, 0, texels.data(), static_cast<uint32_t>(width * 4 * sizeof(float))));
	std::vector<float> expected(cubeCount * 27);
	ASSERT_TRUE(Sh::ProjectCubeAtlas(texels.data(), width, height, 4, faceWidth, cubeCount, expected.data()));
	std::vector<float> actual(cubeCount * 27);
	ASSERT_TRUE(Sh::ProjectCubeAtlas(GetContext(), *atlas, faceWidth, cubeCount, actual.data()));
	EXPECT_EQ(actual, expected);
	// A sixth cube does not fit.
	EXPECT_FALSE(Sh::ProjectCubeAtlas(GetContext(), *atlas, faceWidth, cubeCount + 1, actual.data()));
	ExpectReports({{"Sh::ProjectCubeAtlas", "32x16 atlas cannot hold 6 cubes"}});
}

TEST_F(ShProjectionGpuTest, TexturesThatAreNotFloatCubesAreRefused)
{
	Gpu::Texture* byteCube = MakeCube(Dds::Format::R8G8B8A8_UNORM, 4);
	Gpu::Texture* cubeArray = MakeCube(Dds::Format::R32G32B32A32_FLOAT, 4, 1, 12);
	ASSERT_TRUE(byteCube && cubeArray);
	float r[9], g[9], b[9];
	std::fill_n(r, 9, -5.0f);
	EXPECT_FALSE(Sh::ProjectCubeMap(GetContext(), 3, *byteCube, r, g, b));
	EXPECT_FALSE(Sh::ProjectCubeMap(GetContext(), 3, *cubeArray, r, g, b));
	EXPECT_EQ(r[0], -5.0f);
	std::vector<float> coefficients(27);
	EXPECT_FALSE(Sh::ProjectCubeAtlas(GetContext(), *cubeArray, 4, 1, coefficients.data()));
	ExpectReports({{"Sh::ProjectCubeMap", "'test cube'", "not a single float cube", "format 28"},
	               {"Sh::ProjectCubeMap", "'test cube'", "12 slices"},
	               {"Sh::ProjectCubeAtlas", "not a 2D float texture"}});
}
} // namespace
