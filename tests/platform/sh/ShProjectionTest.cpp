// SH projection on the CPU: cube maps whose coefficients follow from integrals over the sphere (each
// face's frame and texel weights must be right for every one of them), the atlas layout, and refused
// arguments.

#include <array>
#include <cmath>
#include <functional>
#include <gtest/gtest.h>
#include <numbers>
#include <random>
#include <string>
#include <vector>

#include "platform/ReportTest.h"
#include "platform/sh/ShProjection.h"

namespace
{
using Coefficients = std::array<double, Sh::ourCoefficientCount>;
using Function = std::function<float(const std::array<float, 3>&)>;

const double ourRootPi = std::sqrt(std::numbers::pi);

// Where each face looks and which way its columns (right) and rows (up, row 0 at the top) run, seen
// from inside the cube: a viewer facing +Z has +X on the right and +Y up.
struct FaceFrame
{
	std::array<float, 3> myAxis;
	std::array<float, 3> myRight;
	std::array<float, 3> myUp;
};

const std::array<FaceFrame, 6> ourFrames = {{
    {{1, 0, 0}, {0, 0, -1}, {0, 1, 0}},  // +X
    {{-1, 0, 0}, {0, 0, 1}, {0, 1, 0}},  // -X
    {{0, 1, 0}, {1, 0, 0}, {0, 0, -1}},  // +Y
    {{0, -1, 0}, {1, 0, 0}, {0, 0, 1}},  // -Y
    {{0, 0, 1}, {1, 0, 0}, {0, 1, 0}},   // +Z
    {{0, 0, -1}, {-1, 0, 0}, {0, 1, 0}}, // -Z
}};

std::array<float, 3> FrameDirection(int aFace, int aColumn, int aRow, int aWidth)
{
	const FaceFrame& frame = ourFrames[static_cast<size_t>(aFace)];
	const float right = -1.0f + (2.0f * static_cast<float>(aColumn) + 1.0f) / static_cast<float>(aWidth);
	const float up = 1.0f - (2.0f * static_cast<float>(aRow) + 1.0f) / static_cast<float>(aWidth);
	std::array<float, 3> direction{};
	for (size_t axis = 0; axis < 3; ++axis)
	{
		direction[axis] = frame.myAxis[axis] + right * frame.myRight[axis] + up * frame.myUp[axis];
	}
	const float length =
	    std::sqrt(direction[0] * direction[0] + direction[1] * direction[1] + direction[2] * direction[2]);
	return {direction[0] / length, direction[1] / length, direction[2] / length};
}

// Six faces of RGBA texels, each channel a function of the texel's direction (alpha a distraction).
std::vector<float> MakeCube(int aWidth, const Function& aRed, const Function& aGreen, const Function& aBlue)
{
	std::vector<float> texels;
	for (int face = 0; face < 6; ++face)
	{
		for (int row = 0; row < aWidth; ++row)
		{
			for (int column = 0; column < aWidth; ++column)
			{
				const std::array<float, 3> direction = FrameDirection(face, column, row, aWidth);
				texels.insert(texels.end(), {aRed(direction), aGreen(direction), aBlue(direction), 7.0f});
			}
		}
	}
	return texels;
}

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

// Red, green and blue coefficients one after the other, as an atlas holds them per cube.
using Projection = std::array<float, Sh::ourCubeCoefficientCount>;

Projection Project(const std::vector<float>& someTexels, int aWidth, int aChannelCount)
{
	Projection coefficients{};
	EXPECT_TRUE(Sh::ProjectCubeTexels(someTexels.data(), aWidth, aChannelCount, coefficients.data(),
	                                  coefficients.data() + 9, coefficients.data() + 18));
	return coefficients;
}

void ExpectCoefficients(const float* someActual, const Coefficients& someExpected, double aTolerance,
                        const std::string& aWhat)
{
	for (size_t k = 0; k < someExpected.size(); ++k)
	{
		EXPECT_NEAR(someActual[k], someExpected[k], aTolerance) << aWhat << ", coefficient " << k;
	}
}

using ShProjectionTest = ReportTest;

TEST_F(ShProjectionTest, PolynomialCubeMapsGiveTheirIntegrals)
{
	// Coefficient k of f is the integral of f Y_k over the sphere. With the normalisations
	// 1 / (2 sqrt pi), sqrt 3 / (2 sqrt pi), sqrt 15 / (2 sqrt pi), sqrt 5 / (4 sqrt pi) (3z^2 - 1) and
	// sqrt 15 / (4 sqrt pi) (x^2 - y^2), and the sphere's moments 4pi/3 (x^2), 4pi/5 (x^4), 4pi/15 (x^2 y^2):
	const double linear = 2.0 * ourRootPi / std::sqrt(3.0);
	const double product = 2.0 * ourRootPi / std::sqrt(15.0);
	struct Case
	{
		const char* myName;
		Function myFunction;
		Coefficients myExpected;
	};
	const std::vector<Case> cases = {
	    {"1", [](const auto&) { return 1.0f; }, {2.0 * ourRootPi, 0, 0, 0, 0, 0, 0, 0, 0}},
	    {"x", [](const auto& d) { return d[0]; }, {0, 0, 0, -linear, 0, 0, 0, 0, 0}},
	    {"y", [](const auto& d) { return d[1]; }, {0, -linear, 0, 0, 0, 0, 0, 0, 0}},
	    {"z", [](const auto& d) { return d[2]; }, {0, 0, linear, 0, 0, 0, 0, 0, 0}},
	    {"xy", [](const auto& d) { return d[0] * d[1]; }, {0, 0, 0, 0, product, 0, 0, 0, 0}},
	    {"yz", [](const auto& d) { return d[1] * d[2]; }, {0, 0, 0, 0, 0, -product, 0, 0, 0}},
	    {"xz", [](const auto& d) { return d[0] * d[2]; }, {0, 0, 0, 0, 0, 0, 0, -product, 0}},
	    {"x^2-y^2",
	     [](const auto& d) { return d[0] * d[0] - d[1] * d[1]; },
	     {0, 0, 0, 0, 0, 0, 0, 0, 2.0 * product}},
	    {"z^2",
	     [](const auto& d) { return d[2] * d[2]; },
	     {2.0 * ourRootPi / 3.0, 0, 0, 0, 0, 0, 4.0 * std::sqrt(5.0 * std::numbers::pi) / 15.0, 0, 0}},
	};
	// Three cases at a time, one per channel, so that each channel must keep to its own.
	const int width = 32;
	for (size_t first = 0; first < cases.size(); ++first)
	{
		const Case& red = cases[first];
		const Case& green = cases[(first + 1) % cases.size()];
		const Case& blue = cases[(first + 2) % cases.size()];
		const std::vector<float> rgba = MakeCube(width, red.myFunction, green.myFunction, blue.myFunction);
		std::vector<float> rgb;
		for (size_t texel = 0; texel < rgba.size(); texel += 4)
		{
			rgb.insert(rgb.end(), {rgba[texel], rgba[texel + 1], rgba[texel + 2]});
		}
		const Projection projection = Project(rgba, width, 4);
		ExpectCoefficients(projection.data(), red.myExpected, 1e-3, std::string("red ") + red.myName);
		ExpectCoefficients(projection.data() + 9, green.myExpected, 1e-3,
		                   std::string("green ") + green.myName);
		ExpectCoefficients(projection.data() + 18, blue.myExpected, 1e-3, std::string("blue ") + blue.myName);
		EXPECT_EQ(Project(rgb, width, 3), projection) << "three channels project as four do";
	}
	// The weights add up to 4 pi at any width, a single texel per face and widths too wide to keep a
	// table for included.
	for (const int constantWidth : {1, 2, 7, 130})
	{
		const std::vector<float> constant =
		    MakeCube(constantWidth, cases[0].myFunction, cases[0].myFunction, cases[0].myFunction);
		const Projection projection = Project(constant, constantWidth, 4);
		ExpectCoefficients(projection.data() + 9, cases[0].myExpected, 1e-5,
		                   "width " + std::to_string(constantWidth));
	}
}

TEST_F(ShProjectionTest, AtlasCubesProjectExactlyLikeSeparateCubes)
{
	// 7 cubes of 8-texel faces in an atlas 5 tiles and 3 spare texels wide: 42 tiles in 9 tile rows.
	const int faceWidth = 8;
	const int cubeCount = 7;
	const int atlasWidth = 5 * faceWidth + 3;
	const int atlasHeight = 9 * faceWidth;
	for (const int channels : {3, 4})
	{
		const std::vector<float> atlas =
		    RandomTexels(static_cast<size_t>(atlasWidth * atlasHeight * channels), 11u + channels);
		std::vector<float> coefficients(cubeCount * Sh::ourCubeCoefficientCount, -1.0f);
		ASSERT_TRUE(Sh::ProjectCubeAtlas(atlas.data(), atlasWidth, atlasHeight, channels, faceWidth,
		                                 cubeCount, coefficients.data()));
		for (int cube = 0; cube < cubeCount; ++cube)
		{
			std::vector<float> faces;
			for (int face = 0; face < 6; ++face)
			{
				const int tile = cube * 6 + face;
				for (int row = 0; row < faceWidth; ++row)
				{
					const auto first =
					    atlas.begin() +
					    ((tile / 5 * faceWidth + row) * atlasWidth + tile % 5 * faceWidth) * channels;
					faces.insert(faces.end(), first, first + faceWidth * channels);
				}
			}
			Projection actual;
			std::copy_n(coefficients.begin() + cube * 27, 27, actual.begin());
			EXPECT_EQ(actual, Project(faces, faceWidth, channels)) << "cube " << cube;
		}
	}
}

TEST_F(ShProjectionTest, BadArgumentsAreReportedAndRefused)
{
	const std::vector<float> texels = RandomTexels(6 * 4 * 4 * 4, 3u);
	float r[9], g[9], b[9];
	std::fill_n(r, 9, -5.0f);
	EXPECT_FALSE(Sh::ProjectCubeTexels(texels.data(), 4, 2, r, g, b));
	EXPECT_EQ(r[0], -5.0f);
	ExpectReports({{"Sh::ProjectCubeTexels: ", "2 channels"}});

	std::vector<float> coefficients(27, -5.0f);
	// Four 4-texel tiles per row need two tile rows (8 texels) for one cube.
	EXPECT_FALSE(Sh::ProjectCubeAtlas(texels.data(), 16, 7, 4, 4, 1, coefficients.data()));
	EXPECT_FALSE(Sh::ProjectCubeAtlas(texels.data(), 3, 64, 4, 4, 1, coefficients.data()));
	ExpectReports({{"Sh::ProjectCubeAtlas: ", "16x7 atlas cannot hold 1 cubes of 4-texel faces"},
	               {"Sh::ProjectCubeAtlas: ", "3x64 atlas cannot hold"}});
	EXPECT_EQ(coefficients[0], -5.0f);
	EXPECT_TRUE(Sh::ProjectCubeAtlas(texels.data(), 16, 8, 4, 4, 0, coefficients.data()));
	EXPECT_EQ(coefficients[0], -5.0f);
}
} // namespace
