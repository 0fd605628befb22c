#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <numbers>
#include <random>

#include "core/Matrix33.h"
#include "core/Matrix44.h"
#include "core/Vector2.h"
#include "core/Vector3.h"
#include "core/Vector4.h"

namespace
{
constexpr float ourHalfPi = std::numbers::pi_v<float> / 2.0f;
constexpr float ourTolerance = 1e-6f;

void ExpectNear(const Vector3<float>& anActual, const Vector3<float>& anExpected,
                float aTolerance = ourTolerance)
{
	EXPECT_NEAR(anActual.x, anExpected.x, aTolerance);
	EXPECT_NEAR(anActual.y, anExpected.y, aTolerance);
	EXPECT_NEAR(anActual.z, anExpected.z, aTolerance);
}

void ExpectNear(const Matrix44<float>& anActual, const Matrix44<float>& anExpected, float aTolerance)
{
	for (int i = 0; i < 16; ++i)
	{
		EXPECT_NEAR(anActual.myMatrix[i], anExpected.myMatrix[i], aTolerance) << "component " << i;
	}
}

Matrix44<float> Translation(float aX, float anY, float aZ)
{
	Matrix44<float> matrix;
	matrix.SetPosition(Vector3<float>(aX, anY, aZ));
	return matrix;
}

Matrix44<float> Scale(float aX, float anY, float aZ)
{
	Matrix44<float> matrix;
	matrix.myMatrix[0] = aX;
	matrix.myMatrix[5] = anY;
	matrix.myMatrix[10] = aZ;
	return matrix;
}

// Every component distinct, so swapped indices or a transposed product show.
Matrix44<float> Distinct()
{
	Matrix44<float> matrix;
	for (int i = 0; i < 16; ++i)
	{
		matrix.myMatrix[i] = static_cast<float>(i + 1) * 0.25f - static_cast<float>(i % 3);
	}
	return matrix;
}
} // namespace

TEST(MathVector, LengthAndNormalize)
{
	const Vector3<float> v(3.0f, 4.0f, 0.0f);
	EXPECT_EQ(v.LengthFast(), 25.0f);
	EXPECT_EQ(v.Length(), 5.0f);

	Vector3<float> unit(3.0f, 4.0f, 0.0f);
	const Vector3<float> returned = unit.Normalize();
	ExpectNear(unit, Vector3<float>(0.6f, 0.8f, 0.0f));
	ExpectNear(returned, unit, 0.0f);

	// A zero or NaN length must not divide: the vector stays as it was.
	Vector3<float> zero(0.0f, 0.0f, 0.0f);
	zero.Normalize();
	EXPECT_EQ(zero.x, 0.0f);
	EXPECT_EQ(zero.y, 0.0f);
	EXPECT_EQ(zero.z, 0.0f);
	EXPECT_FALSE(std::isnan(zero.x));

	const float nan = std::numeric_limits<float>::quiet_NaN();
	Vector3<float> withNan(nan, 2.0f, 3.0f);
	withNan.Normalize();
	EXPECT_EQ(withNan.y, 2.0f);
	EXPECT_EQ(withNan.z, 3.0f);
}

TEST(MathVector, ArithmeticAndCross)
{
	const Vector3<float> a(1.0f, 2.0f, 3.0f);
	const Vector3<float> b(4.0f, -5.0f, 6.0f);
	ExpectNear(a + b, Vector3<float>(5.0f, -3.0f, 9.0f), 0.0f);
	ExpectNear(a - b, Vector3<float>(-3.0f, 7.0f, -3.0f), 0.0f);
	ExpectNear(a * 2.0f, Vector3<float>(2.0f, 4.0f, 6.0f), 0.0f);
	ExpectNear(-a, Vector3<float>(-1.0f, -2.0f, -3.0f), 0.0f);

	// x cross y is z; swapping the operands flips the sign.
	const Vector3<float> x(1.0f, 0.0f, 0.0f);
	const Vector3<float> y(0.0f, 1.0f, 0.0f);
	ExpectNear(x.Cross(y), Vector3<float>(0.0f, 0.0f, 1.0f), 0.0f);
	ExpectNear(y.Cross(x), Vector3<float>(0.0f, 0.0f, -1.0f), 0.0f);
	ExpectNear(a.Cross(b), Vector3<float>(27.0f, 6.0f, -13.0f), 0.0f);

	const Vector4<float> p(1.0f, 2.0f, 3.0f, 4.0f);
	const Vector4<float> sum = p + Vector4<float>(1.0f, 1.0f, 1.0f, 1.0f) * 2.0f;
	EXPECT_EQ(sum.w, 6.0f);
	EXPECT_EQ((-p).w, -4.0f);

	const Vector2<int> size = Vector2<int>(640, 480) - Vector2<int>(40, 80);
	EXPECT_EQ(size.x, 600);
	EXPECT_EQ(size.y, 400);
	Vector2<int> doubled = size * 2;
	doubled += Vector2<int>(1, 1);
	EXPECT_EQ(doubled.x, 1201);
	EXPECT_EQ(doubled.y, 801);
}

TEST(MathVector, ConversionsBetweenThreeAndFourComponents)
{
	const Vector4<float> homogeneous(Vector3<float>(1.0f, 2.0f, 3.0f));
	EXPECT_EQ(homogeneous.w, 1.0f);

	// w = 1 picks up the translation row.
	const Vector4<float> moved = homogeneous * Translation(10.0f, 20.0f, 30.0f);
	ExpectNear(Vector3<float>(moved), Vector3<float>(11.0f, 22.0f, 33.0f), 0.0f);
	EXPECT_EQ(moved.w, 1.0f);

	// A direction (w = 0) is not moved.
	Vector4<float> direction(1.0f, 2.0f, 3.0f, 0.0f);
	direction *= Translation(10.0f, 20.0f, 30.0f);
	ExpectNear(Vector3<float>(direction), Vector3<float>(1.0f, 2.0f, 3.0f), 0.0f);
}

TEST(MathMatrix, RowVectorRotations)
{
	// Row vector on the left: z rotation by +90 degrees takes x to -y.
	Vector4<float> x(1.0f, 0.0f, 0.0f, 1.0f);
	x *= Matrix44<float>::CreateRotateAroundZ(ourHalfPi);
	ExpectNear(Vector3<float>(x), Vector3<float>(0.0f, -1.0f, 0.0f));

	Vector3<float> x3(1.0f, 0.0f, 0.0f);
	x3 *= Matrix33<float>::CreateRotateAroundZ(ourHalfPi);
	ExpectNear(x3, Vector3<float>(0.0f, -1.0f, 0.0f));

	Vector3<float> y3(0.0f, 1.0f, 0.0f);
	y3 *= Matrix33<float>(Matrix44<float>::CreateRotateAroundX(ourHalfPi));
	ExpectNear(y3, Vector3<float>(0.0f, 0.0f, -1.0f));

	Vector3<float> z3(0.0f, 0.0f, 1.0f);
	z3 *= Matrix44<float>::CreateRotateAroundY(ourHalfPi).Get33();
	ExpectNear(z3, Vector3<float>(-1.0f, 0.0f, 0.0f));

	// The 3x3 and 4x4 factories agree on the shared block.
	const Matrix33<float> block(Matrix44<float>::CreateRotateAroundY(0.7f));
	const Matrix33<float> direct = Matrix33<float>::CreateRotateAroundY(0.7f);
	for (int i = 0; i < 9; ++i)
	{
		EXPECT_EQ(block.myMatrix[i], direct.myMatrix[i]);
	}
}

TEST(MathMatrix, DefaultsAndIdentity)
{
	const Matrix44<float> fresh;
	const Matrix33<float> fresh33;
	for (int row = 0; row < 4; ++row)
	{
		for (int column = 0; column < 4; ++column)
		{
			const float expected = row == column ? 1.0f : 0.0f;
			EXPECT_EQ(fresh.myMatrix[4 * row + column], expected);
			EXPECT_EQ(Matrix44<float>::Identity.myMatrix[4 * row + column], expected);
			if (row < 3 && column < 3)
			{
				EXPECT_EQ(fresh33.myMatrix[3 * row + column], expected);
			}
		}
	}
}

TEST(MathMatrix, ProductOrderAndSelfMultiplication)
{
	// this x argument: rotate first, then translate.
	const Matrix44<float> rotateThenMove =
	    Matrix44<float>::CreateRotateAroundZ(ourHalfPi) * Translation(5.0f, 0.0f, 0.0f);
	const Vector4<float> point = Vector4<float>(1.0f, 0.0f, 0.0f, 1.0f) * rotateThenMove;
	ExpectNear(Vector3<float>(point), Vector3<float>(5.0f, -1.0f, 0.0f));

	const Matrix44<float> original = Distinct();
	const Matrix44<float> expected = Matrix44<float>(original) * Matrix44<float>(original);
	Matrix44<float> self = original;
	self *= self;
	ExpectNear(self, expected, 0.0f);

	Matrix33<float> block = original.Get33();
	const Matrix33<float> expectedBlock = Matrix33<float>(block) * Matrix33<float>(block);
	block *= block;
	for (int i = 0; i < 9; ++i)
	{
		EXPECT_EQ(block.myMatrix[i], expectedBlock.myMatrix[i]);
	}

	// Matrix33 product order: x then z rotation differs from z then x.
	Vector3<float> y(0.0f, 1.0f, 0.0f);
	y *= Matrix33<float>::CreateRotateAroundX(ourHalfPi) * Matrix33<float>::CreateRotateAroundZ(ourHalfPi);
	ExpectNear(y, Vector3<float>(0.0f, 0.0f, -1.0f));
	Vector3<float> x(1.0f, 0.0f, 0.0f);
	x *= Matrix33<float>::CreateRotateAroundX(ourHalfPi) * Matrix33<float>::CreateRotateAroundZ(ourHalfPi);
	ExpectNear(x, Vector3<float>(0.0f, -1.0f, 0.0f));
	Vector3<float> xOtherOrder(1.0f, 0.0f, 0.0f);
	xOtherOrder *=
	    Matrix33<float>::CreateRotateAroundZ(ourHalfPi) * Matrix33<float>::CreateRotateAroundX(ourHalfPi);
	ExpectNear(xOtherOrder, Vector3<float>(0.0f, 0.0f, 1.0f));
}

TEST(MathMatrix, RotatingTheBlockKeepsPositionAndFourthColumn)
{
	Matrix44<float> transform = Matrix44<float>::CreateRotateAroundX(0.4f) * Scale(2.0f, 3.0f, 0.5f);
	transform.SetPosition(Vector3<float>(1.0f, 2.0f, 3.0f));
	// Unusual values in the fourth column, to see that nothing touches it.
	transform.myMatrix[3] = 0.25f;
	transform.myMatrix[7] = 0.5f;
	transform.myMatrix[11] = 0.75f;
	transform.myMatrix[15] = 2.0f;
	const Matrix44<float> before = transform;

	const Matrix33<float> rotation = Matrix33<float>::CreateRotateAroundZ(0.9f);
	transform *= rotation;

	ExpectNear(transform.GetPosition(), Vector3<float>(1.0f, 2.0f, 3.0f), 0.0f);
	EXPECT_EQ(transform.myMatrix[3], 0.25f);
	EXPECT_EQ(transform.myMatrix[7], 0.5f);
	EXPECT_EQ(transform.myMatrix[11], 0.75f);
	EXPECT_EQ(transform.myMatrix[15], 2.0f);

	// The argument goes on the left of the old block.
	const Matrix33<float> expected = rotation * before.Get33();
	const Matrix33<float> actual = transform.Get33();
	for (int i = 0; i < 9; ++i)
	{
		EXPECT_NEAR(actual.myMatrix[i], expected.myMatrix[i], ourTolerance) << "block component " << i;
	}
	const Matrix33<float> wrongOrder = before.Get33() * rotation;
	EXPECT_GT(std::abs(actual.myMatrix[1] - wrongOrder.myMatrix[1]), 0.1f);
}

TEST(MathMatrix, AxesAndSetRotation)
{
	Matrix44<float> matrix;
	matrix.SetPosition(Vector3<float>(7.0f, 8.0f, 9.0f));
	matrix.myMatrix[3] = 0.5f;

	matrix.SetRotation(Vector3<float>(0.0f, 0.0f, 1.0f));
	ExpectNear(matrix.GetRight(), Vector3<float>(-1.0f, 0.0f, 0.0f), 0.0f);
	ExpectNear(matrix.GetUp(), Vector3<float>(0.0f, 1.0f, 0.0f), 0.0f);
	ExpectNear(matrix.GetForward(), Vector3<float>(0.0f, 0.0f, 1.0f), 0.0f);
	ExpectNear(matrix.GetPosition(), Vector3<float>(7.0f, 8.0f, 9.0f), 0.0f);
	EXPECT_EQ(matrix.myMatrix[3], 0.5f);

	// Straight up: world up cannot serve, the z axis takes its place.
	matrix.SetRotation(Vector3<float>(0.0f, 1.0f, 0.0f));
	ExpectNear(matrix.GetRight(), Vector3<float>(1.0f, 0.0f, 0.0f), 0.0f);
	ExpectNear(matrix.GetUp(), Vector3<float>(0.0f, 0.0f, 1.0f), 0.0f);
	matrix.SetRotation(Vector3<float>(0.0f, -1.0f, 0.0f));
	ExpectNear(matrix.GetRight(), Vector3<float>(-1.0f, 0.0f, 0.0f), 0.0f);
	ExpectNear(matrix.GetUp(), Vector3<float>(0.0f, 0.0f, 1.0f), 0.0f);

	// The forward vector is stored as given, not normalised, and nor are the others.
	matrix.SetRotation(Vector3<float>(0.0f, 0.0f, 2.0f));
	ExpectNear(matrix.GetForward(), Vector3<float>(0.0f, 0.0f, 2.0f), 0.0f);
	ExpectNear(matrix.GetRight(), Vector3<float>(-2.0f, 0.0f, 0.0f), 0.0f);
	ExpectNear(matrix.GetUp(), Vector3<float>(0.0f, 4.0f, 0.0f), 0.0f);

	matrix.SetRotation(Vector3<float>(1.0f, 2.0f, 3.0f), Vector3<float>(4.0f, 5.0f, 6.0f),
	                   Vector3<float>(7.0f, 8.0f, 9.0f));
	ExpectNear(matrix.GetForward(), Vector3<float>(1.0f, 2.0f, 3.0f), 0.0f);
	ExpectNear(matrix.GetUp(), Vector3<float>(4.0f, 5.0f, 6.0f), 0.0f);
	ExpectNear(matrix.GetRight(), Vector3<float>(7.0f, 8.0f, 9.0f), 0.0f);
	ExpectNear(matrix.GetPosition(), Vector3<float>(7.0f, 8.0f, 9.0f), 0.0f);
	EXPECT_EQ(matrix.myMatrix[3], 0.5f);
}

TEST(MathMatrix, InverseOfSingularMatrixIsIdentity)
{
	Matrix44<float> flattened = Scale(1.0f, 0.0f, 1.0f);
	flattened.SetPosition(Vector3<float>(4.0f, 5.0f, 6.0f));
	ExpectNear(flattened.Inverse(), Matrix44<float>(), 0.0f);

	Matrix44<float> repeatedRows = Distinct();
	for (int column = 0; column < 4; ++column)
	{
		repeatedRows.myMatrix[4 + column] = repeatedRows.myMatrix[column];
	}
	ExpectNear(repeatedRows.Inverse(), Matrix44<float>(), 0.0f);

	Matrix44<float> withNan = Distinct();
	withNan.myMatrix[6] = std::numeric_limits<float>::quiet_NaN();
	ExpectNear(withNan.Inverse(), Matrix44<float>(), 0.0f);
}

TEST(MathMatrix, InverseUndoesRigidAndScaledTransforms)
{
	const Matrix44<float> translationInverse = Translation(1.0f, -2.0f, 3.0f).Inverse();
	ExpectNear(translationInverse.GetPosition(), Vector3<float>(-1.0f, 2.0f, -3.0f));

	std::mt19937 generator(20240611u);
	std::uniform_real_distribution<float> angle(-3.1f, 3.1f);
	std::uniform_real_distribution<float> offset(-100.0f, 100.0f);
	std::uniform_real_distribution<float> scale(0.25f, 4.0f);
	for (int i = 0; i < 200; ++i)
	{
		Matrix44<float> transform = Matrix44<float>::CreateRotateAroundX(angle(generator)) *
		                            Matrix44<float>::CreateRotateAroundY(angle(generator)) *
		                            Matrix44<float>::CreateRotateAroundZ(angle(generator));
		if (i % 2 == 1)
		{
			transform = Scale(scale(generator), scale(generator), scale(generator)) * transform;
		}
		transform *= Translation(offset(generator), offset(generator), offset(generator));

		const Matrix44<float> inverse = transform.Inverse();
		SCOPED_TRACE(i);
		ExpectNear(inverse * transform, Matrix44<float>(), 1e-4f);
		ExpectNear(transform * inverse, Matrix44<float>(), 1e-4f);
	}
}
