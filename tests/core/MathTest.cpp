#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <iterator>
#include <limits>
#include <numbers>
#include <tuple>
#include <vector>

#include "core/Matrix33.h"
#include "core/Matrix44.h"
#include "core/Vector3.h"
#include "core/Vector4.h"

using V3 = Vector3<float>;
using V4 = Vector4<float>;
using M33 = Matrix33<float>;
using M44 = Matrix44<float>;

namespace
{
constexpr float ourHalfPi = std::numbers::pi_v<float> / 2.0f;

std::vector<float> Values(const V3& aVector)
{
	return {aVector.x, aVector.y, aVector.z};
}

template <typename Matrix> std::vector<float> Values(const Matrix& aMatrix)
{
	return {std::begin(aMatrix.myMatrix), std::end(aMatrix.myMatrix)};
}

// Every component within aTolerance of anExpected's.
auto Near(const std::vector<float>& anExpected, float aTolerance)
{
	return testing::Pointwise(testing::FloatNear(aTolerance), anExpected);
}

M44 Translation(float aX, float anY, float aZ)
{
	M44 matrix;
	matrix.SetPosition(V3(aX, anY, aZ));
	return matrix;
}

M44 Scale(float aX, float anY, float aZ)
{
	M44 matrix;
	matrix.myMatrix[0] = aX;
	matrix.myMatrix[5] = anY;
	matrix.myMatrix[10] = aZ;
	return matrix;
}

// Every component distinct, so swapped indices or a transposed product show.
M44 Distinct()
{
	M44 matrix;
	for (int i = 0; i < 16; ++i)
	{
		matrix.myMatrix[i] = static_cast<float>(i + 1) * 0.25f - static_cast<float>(i % 3);
	}
	return matrix;
}
} // namespace

TEST(MathVector, NormalizeLeavesZeroAndNanAlone)
{
	V3 v(3.0f, 4.0f, 0.0f);
	const V3 returned = v.Normalize();
	EXPECT_THAT(Values(v), Near({0.6f, 0.8f, 0.0f}, 1e-6f));
	EXPECT_THAT(Values(returned), Near(Values(v), 0.0f));

	// A zero or NaN length must not divide: the vector stays as it was.
	V3 zero(0.0f, 0.0f, 0.0f);
	zero.Normalize();
	EXPECT_THAT(Values(zero), Near({0.0f, 0.0f, 0.0f}, 0.0f));
	V3 withNan(std::numeric_limits<float>::quiet_NaN(), 2.0f, 3.0f);
	withNan.Normalize();
	EXPECT_THAT((std::vector<float>{withNan.y, withNan.z}), Near({2.0f, 3.0f}, 0.0f));
}

TEST(MathMatrix, RowVectorQuarterTurnsAndProductOrder)
{
	// this x argument: rotate first (+90 degrees about z takes x to -y), then translate.
	const M44 rotateThenMove = M44::CreateRotateAroundZ(ourHalfPi) * Translation(5.0f, 0.0f, 0.0f);
	EXPECT_THAT(Values(V3(V4(1.0f, 0.0f, 0.0f, 1.0f) * rotateThenMove)), Near({5.0f, -1.0f, 0.0f}, 1e-6f));

	const std::tuple<M33, V3, V3> cases[] = {
	    {M33::CreateRotateAroundZ(ourHalfPi), V3(1.0f, 0.0f, 0.0f), V3(0.0f, -1.0f, 0.0f)},
	    {M33(M44::CreateRotateAroundX(ourHalfPi)), V3(0.0f, 1.0f, 0.0f), V3(0.0f, 0.0f, -1.0f)},
	    {M44::CreateRotateAroundY(ourHalfPi).Get33(), V3(0.0f, 0.0f, 1.0f), V3(-1.0f, 0.0f, 0.0f)},
	    {M33::CreateRotateAroundX(ourHalfPi) * M33::CreateRotateAroundZ(ourHalfPi), V3(0.0f, 1.0f, 0.0f),
	     V3(0.0f, 0.0f, -1.0f)},
	    {M33::CreateRotateAroundZ(ourHalfPi) * M33::CreateRotateAroundX(ourHalfPi), V3(1.0f, 0.0f, 0.0f),
	     V3(0.0f, 0.0f, 1.0f)},
	};
	for (const auto& [rotation, input, expected] : cases)
	{
		V3 rotated = input;
		rotated *= rotation;
		EXPECT_THAT(Values(rotated), Near(Values(expected), 1e-6f)) << input.x << input.y << input.z;
	}
}

TEST(MathMatrix, AMatrix33TurnsOnlyTheBlock)
{
	// Position row and fourth column stay; the block becomes rotation x block.
	M44 transform = Distinct();
	const M33 rotation = M33::CreateRotateAroundZ(0.9f);
	M44 expected = transform;
	const M33 turned = rotation * transform.Get33();
	for (int i = 0; i < 9; ++i)
	{
		expected.myMatrix[4 * (i / 3) + i % 3] = turned.myMatrix[i];
	}
	transform *= rotation;
	EXPECT_THAT(Values(transform), Near(Values(expected), 1e-5f));
}

TEST(MathMatrix, SetRotationFromForward)
{
	M44 matrix;
	matrix.SetPosition(V3(7.0f, 8.0f, 9.0f));
	matrix.myMatrix[3] = 0.5f;
	// Forward, right, up. Straight up or down the z axis replaces world up; nothing
	// is normalised.
	const V3 cases[][3] = {
	    {V3(0.0f, 0.0f, 1.0f), V3(-1.0f, 0.0f, 0.0f), V3(0.0f, 1.0f, 0.0f)},
	    {V3(0.0f, 1.0f, 0.0f), V3(1.0f, 0.0f, 0.0f), V3(0.0f, 0.0f, 1.0f)},
	    {V3(0.0f, -1.0f, 0.0f), V3(-1.0f, 0.0f, 0.0f), V3(0.0f, 0.0f, 1.0f)},
	    {V3(0.0f, 0.0f, 2.0f), V3(-2.0f, 0.0f, 0.0f), V3(0.0f, 4.0f, 0.0f)},
	};
	for (const auto& [forward, right, up] : cases)
	{
		matrix.SetRotation(forward);
		// Rows right, up, forward, position; the fourth column as it was.
		const std::vector<float> expected = {right.x,   right.y,   right.z,   0.5f, up.x, up.y, up.z, 0.0f,
		                                     forward.x, forward.y, forward.z, 0.0f, 7.0f, 8.0f, 9.0f, 1.0f};
		EXPECT_THAT(Values(matrix), Near(expected, 0.0f)) << forward.x << forward.y << forward.z;
	}
}

TEST(MathMatrix, InverseUndoesTransformsAndIsIdentityForSingularOrNan)
{
	M44 flattened = Scale(1.0f, 0.0f, 1.0f);
	flattened.SetPosition(V3(4.0f, 5.0f, 6.0f));
	M44 withNan = Distinct();
	withNan.myMatrix[6] = std::numeric_limits<float>::quiet_NaN();
	for (const M44& matrix : {flattened, withNan})
	{
		EXPECT_THAT(Values(matrix.Inverse()), Near(Values(M44()), 0.0f));
	}

	// Turned about every axis, scaled unevenly and moved.
	M44 transform = Scale(0.5f, 2.0f, 3.0f) * M44::CreateRotateAroundX(0.3f) *
	                M44::CreateRotateAroundY(-1.2f) * M44::CreateRotateAroundZ(2.0f);
	transform *= Translation(10.0f, -20.0f, 30.0f);
	EXPECT_THAT(Values(transform.Inverse() * transform), Near(Values(M44()), 1e-4f));
	EXPECT_THAT(Values(transform * transform.Inverse()), Near(Values(M44()), 1e-4f));
}
