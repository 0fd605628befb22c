// SH projection of textures: cube maps and atlases read back from the GPU project as their texels do;
// textures that are not float cubes are refused.

#include <algorithm>
#include <array>
#include <random>
#include <vector>

#include "GpuTest.h"
#include "platform/sh/ShProjection.h"

namespace
{
// Random RGBA values in [0, 4).
std::vector<float> RandomTexels(size_t aCount, unsigned aSeed)
{
	std::mt19937 generator(aSeed);
	std::uniform_real_distribution<float> distribution(0.0f, 4.0f);
	std::vector<float> values(aCount);
	for (float& value : values)
	{
		value = distribution(generator);
	}
	return values;
}

using ShProjectionGpuTest = GpuTest;

// The texture holds the texels exactly, so the coefficients are the same to the bit.
TEST_F(ShProjectionGpuTest, CubeTexturesProjectLikeTheirTexels)
{
	const int width = 16;
	const std::vector<float> texels = RandomTexels(static_cast<size_t>(6 * width * width * 4), 7u);
	Gpu::Texture* cube = MakeCube(Dds::Format::R32G32B32A32_FLOAT, width, 0);
	ASSERT_NE(cube, nullptr);
	for (int face = 0; face < 6; ++face)
	{
		ASSERT_TRUE(cube->Upload(0, face, texels.data() + face * width * width * 4, uint32_t(width) * 16));
	}
	std::array<float, 27> expected{};
	ASSERT_TRUE(Sh::ProjectCubeTexels(texels.data(), width, 4, &expected[0], &expected[9], &expected[18]));
	std::array<float, 27> actual{};
	ASSERT_TRUE(Sh::ProjectCubeMap(GetContext(), 3, *cube, &actual[0], &actual[9], &actual[18]));
	EXPECT_EQ(actual, expected);
}

TEST_F(ShProjectionGpuTest, AtlasTexturesProjectLikeTheirTexels)
{
	// 5 cubes of 4-texel faces, 8 tiles per row: 30 tiles in 4 tile rows.
	const int faceWidth = 4;
	const int cubeCount = 5;
	const int width = 8 * faceWidth;
	const int height = 4 * faceWidth;
	const std::vector<float> texels = RandomTexels(static_cast<size_t>(width * height * 4), 5u);
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
