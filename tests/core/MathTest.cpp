#include <gtest/gtest.h>

#include <iterator>
#include <limits>
#include <numbers>
#include <random>
#include <tuple>

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

// One expectation per component, so a failure names the macro's line.
#define EXPECT_VEC3_NEAR(actual, expected, tolerance)                                                        \
	EXPECT_NEAR(V3(actual).x, V3(expected).x, tolerance);                                                    \
	EXPECT_NEAR(V3(actual).y, V3(expected).y, tolerance);                                                    \
	EXPECT_NEAR(V3(actual).z, V3(expected).z, tolerance)

template <typename Matrix>
void ExpectMatrixNear(const Matrix& anActual, const Matrix& anExpected, float aTolerance)
{
	for (int i = 0; i < static_cast<int>(std::size(anActual.myMatrix)); ++i)
	{
		EXPECT_NEAR(anActual.myMatrix[i], anExpected.myMatrix[i], aTolerance) << "component " << i;
	}
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

TEST(MathVector, LengthNormalizeAndTranslation)
{
	V3 v(3.0f, 4.0f, 0.0f);
	EXPECT_EQ(v.LengthFast(), 25.0f);
	EXPECT_EQ(v.Length(), 5.0f);
	const V3 returned = v.Normalize();
	EXPECT_VEC3_NEAR(v, V3(0.6f, 0.8f, 0.0f), 1e-6f);
	EXPECT_VEC3_NEAR(returned, v, 0.0f);

	// A zero or NaN length must not divide: the vector stays as it was.
	V3 zero(0.0f, 0.0f, 0.0f);
	zero.Normalize();
	EXPECT_VEC3_NEAR(zero, V3(0.0f, 0.0f, 0.0f), 0.0f);
	V3 withNan(std::numeric_limits<float>::quiet_NaN(), 2.0f, 3.0f);
	withNan.Normalize();
	EXPECT_EQ(withNan.y, 2.0f);
	EXPECT_EQ(withNan.z, 3.0f);

	// A point from a Vector3 picks up translation; a direction does not.
	const V4 moved = V4(V3(1.0f, 2.0f, 3.0f)) * Translation(10.0f, 20.0f, 30.0f);
	EXPECT_VEC3_NEAR(moved, V3(11.0f, 22.0f, 33.0f), 0.0f);
	EXPECT_EQ(moved.w, 1.0f);
	const V4 direction = V4(1.0f, 2.0f, 3.0f, 0.0f) * Translation(10.0f, 20.0f, 30.0f);
	EXPECT_VEC3_NEAR(direction, V3(1.0f, 2.0f, 3.0f), 0.0f);
}

TEST(MathMatrix, RowVectorQuarterTurnsAndProductOrder)
{
	// Row vector on the left: +90 degrees about z takes x to -y.
	EXPECT_VEC3_NEAR(V4(1.0f, 0.0f, 0.0f, 1.0f) * M44::CreateRotateAroundZ(ourHalfPi), V3(0.0f, -1.0f, 0.0f),
	                 1e-6f);
	// this x argument: rotate first, then translate.
	const M44 rotateThenMove = M44::CreateRotateAroundZ(ourHalfPi) * Translation(5.0f, 0.0f, 0.0f);
	EXPECT_VEC3_NEAR(V4(1.0f, 0.0f, 0.0f, 1.0f) * rotateThenMove, V3(5.0f, -1.0f, 0.0f), 1e-6f);

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
		SCOPED_TRACE(testing::Message() << "rotating " << input.x << input.y << input.z);
		EXPECT_VEC3_NEAR(rotated, expected, 1e-6f);
	}
}

TEST(MathMatrix, CompoundProductsUseTheOriginalOperandsAndAMatrix33TurnsOnlyTheBlock)
{
	const M44 original = Distinct();
	M44 self = original;
	self *= self;
	ExpectMatrixNear(self, M44(original) * M44(original), 0.0f);
	M33 block = original.Get33();
	const M33 expectedBlock = M33(block) * M33(block);
	block *= block;
	ExpectMatrixNear(block, expectedBlock, 0.0f);

	M44 transform = M44::CreateRotateAroundX(0.4f) * Scale(2.0f, 3.0f, 0.5f);
	transform.SetPosition(V3(1.0f, 2.0f, 3.0f));
	for (int row = 0; row < 4; ++row)
	{
		transform.myMatrix[4 * row + 3] = 0.25f * static_cast<float>(row + 1);
	}
	const M33 rotation = M33::CreateRotateAroundZ(0.9f);

	// Position row and fourth column stay; the block becomes rotation x block.
	M44 expected = transform;
	const M33 turned = rotation * transform.Get33();
	for (int i = 0; i < 9; ++i)
	{
		expected.myMatrix[4 * (i / 3) + i % 3] = turned.myMatrix[i];
	}
	transform *= rotation;
	ExpectMatrixNear(transform, expected, 1e-6f);
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
		SCOPED_TRACE(testing::Message() << "forward " << forward.x << forward.y << forward.z);
		matrix.SetRotation(forward);
		EXPECT_VEC3_NEAR(matrix.GetForward(), forward, 0.0f);
		EXPECT_VEC3_NEAR(matrix.GetRight(), right, 0.0f);
		EXPECT_VEC3_NEAR(matrix.GetUp(), up, 0.0f);
		EXPECT_VEC3_NEAR(matrix.GetPosition(), V3(7.0f, 8.0f, 9.0f), 0.0f);
		EXPECT_EQ(matrix.myMatrix[3], 0.5f);
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
		ExpectMatrixNear(matrix.Inverse(), M44(), 0.0f);
	}

	std::mt19937 generator(20240611u);
	std::uniform_real_distribution<float> angle(-3.1f, 3.1f);
	std::uniform_real_distribution<float> offset(-100.0f, 100.0f);
	std::uniform_real_distribution<float> scale(0.25f, 4.0f);
	for (int i = 0; i < 200; ++i)
	{
		M44 transform = M44::CreateRotateAroundX(angle(generator)) *
		                M44::CreateRotateAroundY(angle(generator)) *
		                M44::CreateRotateAroundZ(angle(generator));
		if (i % 2 == 1)
		{
			transform = Scale(scale(generator), scale(generator), scale(generator)) * transform;
		}
		transform *= Translation(offset(generator), offset(generator), offset(generator));
		SCOPED_TRACE(i);
		ExpectMatrixNear(transform.Inverse() * transform, M44(), 1e-4f);
		ExpectMatrixNear(transform * transform.Inverse(), M44(), 1e-4f);
	}
}
