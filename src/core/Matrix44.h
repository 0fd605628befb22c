#pragma once
// Matrix44: the transform of every instance, camera and light.
//
// Row-major with row vectors on the left (Direct3D convention): element (r, c)
// is myMatrix[4 * r + c]; rows 0, 1, 2 are the right, up and forward axes and
// row 3 is the position. Uploaded unchanged to a GLSL mat4, a shader computing
// M * v gets the same result as v * M here. Default-constructed it is the identity.

#include <cmath>
#include <type_traits>

template <typename T> class Matrix33;
template <typename T> class Vector3;

template <typename T> class Matrix44
{
public:
	constexpr Matrix44() : myMatrix{1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1} {}

	// Defined for Matrix44<float> only (in Matrix44.cpp).
	static const Matrix44 Identity;

	// this = this x aMatrix, computed into a temporary so that M *= M works.
	Matrix44& operator*=(const Matrix44& aMatrix)
	{
		const T* right = aMatrix.myMatrix;
		T product[16];
		for (int row = 0; row < 4; ++row)
		{
			for (int column = 0; column < 4; ++column)
			{
				product[4 * row + column] =
				    myMatrix[4 * row] * right[column] + myMatrix[4 * row + 1] * right[4 + column] +
				    myMatrix[4 * row + 2] * right[8 + column] + myMatrix[4 * row + 3] * right[12 + column];
			}
		}
		for (int i = 0; i < 16; ++i)
		{
			myMatrix[i] = product[i];
		}
		return *this;
	}

	// Turns the orientation in place: the upper-left block becomes aMatrix x block
	// (aMatrix on the left), while the position row and the fourth column stay.
	Matrix44& operator*=(const Matrix33<T>& aMatrix)
	{
		const T* left = aMatrix.myMatrix;
		T block[9];
		for (int row = 0; row < 3; ++row)
		{
			for (int column = 0; column < 3; ++column)
			{
				block[3 * row + column] = left[3 * row] * myMatrix[column] +
				                          left[3 * row + 1] * myMatrix[4 + column] +
				                          left[3 * row + 2] * myMatrix[8 + column];
			}
		}
		for (int row = 0; row < 3; ++row)
		{
			for (int column = 0; column < 3; ++column)
			{
				myMatrix[4 * row + column] = block[3 * row + column];
			}
		}
		return *this;
	}

	Matrix33<T> Get33() const { return Matrix33<T>(*this); }

	// General inverse by cofactors over the determinant. A singular (or NaN)
	// matrix gives the identity rather than infinities, so a degenerate transform
	// never spreads NaN into whatever is derived from it.
	Matrix44 Inverse() const
	{
		const T* m = myMatrix;
		T inv[16];

		inv[0] = m[5] * m[10] * m[15] - m[5] * m[11] * m[14] - m[9] * m[6] * m[15] + m[9] * m[7] * m[14] +
		         m[13] * m[6] * m[11] - m[13] * m[7] * m[10];
		inv[4] = -m[4] * m[10] * m[15] + m[4] * m[11] * m[14] + m[8] * m[6] * m[15] - m[8] * m[7] * m[14] -
		         m[12] * m[6] * m[11] + m[12] * m[7] * m[10];
		inv[8] = m[4] * m[9] * m[15] - m[4] * m[11] * m[13] - m[8] * m[5] * m[15] + m[8] * m[7] * m[13] +
		         m[12] * m[5] * m[11] - m[12] * m[7] * m[9];
		inv[12] = -m[4] * m[9] * m[14] + m[4] * m[10] * m[13] + m[8] * m[5] * m[14] - m[8] * m[6] * m[13] -
		          m[12] * m[5] * m[10] + m[12] * m[6] * m[9];

		const T determinant = m[0] * inv[0] + m[1] * inv[4] + m[2] * inv[8] + m[3] * inv[12];
		if (determinant == 0 || std::isnan(determinant))
		{
			return Matrix44();
		}

		inv[1] = -m[1] * m[10] * m[15] + m[1] * m[11] * m[14] + m[9] * m[2] * m[15] - m[9] * m[3] * m[14] -
		         m[13] * m[2] * m[11] + m[13] * m[3] * m[10];
		inv[5] = m[0] * m[10] * m[15] - m[0] * m[11] * m[14] - m[8] * m[2] * m[15] + m[8] * m[3] * m[14] +
		         m[12] * m[2] * m[11] - m[12] * m[3] * m[10];
		inv[9] = -m[0] * m[9] * m[15] + m[0] * m[11] * m[13] + m[8] * m[1] * m[15] - m[8] * m[3] * m[13] -
		         m[12] * m[1] * m[11] + m[12] * m[3] * m[9];
		inv[13] = m[0] * m[9] * m[14] - m[0] * m[10] * m[13] - m[8] * m[1] * m[14] + m[8] * m[2] * m[13] +
		          m[12] * m[1] * m[10] - m[12] * m[2] * m[9];
		inv[2] = m[1] * m[6] * m[15] - m[1] * m[7] * m[14] - m[5] * m[2] * m[15] + m[5] * m[3] * m[14] +
		         m[13] * m[2] * m[7] - m[13] * m[3] * m[6];
		inv[6] = -m[0] * m[6] * m[15] + m[0] * m[7] * m[14] + m[4] * m[2] * m[15] - m[4] * m[3] * m[14] -
		         m[12] * m[2] * m[7] + m[12] * m[3] * m[6];
		inv[10] = m[0] * m[5] * m[15] - m[0] * m[7] * m[13] - m[4] * m[1] * m[15] + m[4] * m[3] * m[13] +
		          m[12] * m[1] * m[7] - m[12] * m[3] * m[5];
		inv[14] = -m[0] * m[5] * m[14] + m[0] * m[6] * m[13] + m[4] * m[1] * m[14] - m[4] * m[2] * m[13] -
		          m[12] * m[1] * m[6] + m[12] * m[2] * m[5];
		inv[3] = -m[1] * m[6] * m[11] + m[1] * m[7] * m[10] + m[5] * m[2] * m[11] - m[5] * m[3] * m[10] -
		         m[9] * m[2] * m[7] + m[9] * m[3] * m[6];
		inv[7] = m[0] * m[6] * m[11] - m[0] * m[7] * m[10] - m[4] * m[2] * m[11] + m[4] * m[3] * m[10] +
		         m[8] * m[2] * m[7] - m[8] * m[3] * m[6];
		inv[11] = -m[0] * m[5] * m[11] + m[0] * m[7] * m[9] + m[4] * m[1] * m[11] - m[4] * m[3] * m[9] -
		          m[8] * m[1] * m[7] + m[8] * m[3] * m[5];
		inv[15] = m[0] * m[5] * m[10] - m[0] * m[6] * m[9] - m[4] * m[1] * m[10] + m[4] * m[2] * m[9] +
		          m[8] * m[1] * m[6] - m[8] * m[2] * m[5];

		Matrix44 result;
		const T inverseDeterminant = static_cast<T>(1) / determinant;
		for (int i = 0; i < 16; ++i)
		{
			result.myMatrix[i] = inv[i] * inverseDeterminant;
		}
		return result;
	}

	// Angles in radians; sine and cosine are taken in double precision so a float
	// matrix gets the correctly rounded values.
	static Matrix44 CreateRotateAroundX(const T anAngleInRadians)
	{
		const T c = static_cast<T>(std::cos(static_cast<double>(anAngleInRadians)));
		const T s = static_cast<T>(std::sin(static_cast<double>(anAngleInRadians)));
		Matrix44 result;
		result.myMatrix[5] = c;
		result.myMatrix[6] = -s;
		result.myMatrix[9] = s;
		result.myMatrix[10] = c;
		return result;
	}

	static Matrix44 CreateRotateAroundY(const T anAngleInRadians)
	{
		const T c = static_cast<T>(std::cos(static_cast<double>(anAngleInRadians)));
		const T s = static_cast<T>(std::sin(static_cast<double>(anAngleInRadians)));
		Matrix44 result;
		result.myMatrix[0] = c;
		result.myMatrix[2] = s;
		result.myMatrix[8] = -s;
		result.myMatrix[10] = c;
		return result;
	}

	static Matrix44 CreateRotateAroundZ(const T anAngleInRadians)
	{
		const T c = static_cast<T>(std::cos(static_cast<double>(anAngleInRadians)));
		const T s = static_cast<T>(std::sin(static_cast<double>(anAngleInRadians)));
		Matrix44 result;
		result.myMatrix[0] = c;
		result.myMatrix[1] = -s;
		result.myMatrix[4] = s;
		result.myMatrix[5] = c;
		return result;
	}

	Vector3<T> GetPosition() const { return Vector3<T>(myMatrix[12], myMatrix[13], myMatrix[14]); }

	void SetPosition(const Vector3<T>& aPosition)
	{
		myMatrix[12] = aPosition.x;
		myMatrix[13] = aPosition.y;
		myMatrix[14] = aPosition.z;
	}

	Vector3<T> GetRight() const { return Vector3<T>(myMatrix[0], myMatrix[1], myMatrix[2]); }
	Vector3<T> GetUp() const { return Vector3<T>(myMatrix[4], myMatrix[5], myMatrix[6]); }
	Vector3<T> GetForward() const { return Vector3<T>(myMatrix[8], myMatrix[9], myMatrix[10]); }

	// Writes the three axes as given (nothing is normalised); the position row and
	// the fourth column are left alone.
	void SetRotation(const Vector3<T>& aForwardVector, const Vector3<T>& anUpVector,
	                 const Vector3<T>& aRightVector)
	{
		SetRow(0, aRightVector);
		SetRow(1, anUpVector);
		SetRow(2, aForwardVector);
	}

	// Look-to basis from one direction. World up serves as the helper axis unless
	// the direction is exactly vertical, where it would give a zero cross product.
	// Lengths are kept as they come: callers that need unit axes pass a unit forward
	// vector that is perpendicular to the helper axis, or normalise afterwards.
	void SetRotation(const Vector3<T>& aForwardVector)
	{
		Vector3<T> auxiliaryUp(0, 1, 0);
		if (std::abs(aForwardVector.y) == static_cast<T>(1))
		{
			auxiliaryUp.Set(0, 0, 1);
		}
		const Vector3<T> right = aForwardVector.Cross(auxiliaryUp);
		const Vector3<T> up = right.Cross(aForwardVector);
		SetRotation(aForwardVector, up, right);
	}

	T myMatrix[16];

private:
	void SetRow(const int aRow, const Vector3<T>& aVector)
	{
		myMatrix[4 * aRow] = aVector.x;
		myMatrix[4 * aRow + 1] = aVector.y;
		myMatrix[4 * aRow + 2] = aVector.z;
	}
};

template <typename T> Matrix44<T> operator*(const Matrix44<T>& aLeft, const Matrix44<T>& aRight)
{
	Matrix44<T> result(aLeft);
	result *= aRight;
	return result;
}

// Declared here so every user sees that the float identity is a specialisation
// defined once, in Matrix44.cpp, with constant initialisation.
template <> const Matrix44<float> Matrix44<float>::Identity;

static_assert(sizeof(Matrix44<float>) == 16 * sizeof(float), "Matrix44 must be sixteen packed floats");
static_assert(std::is_trivially_copyable_v<Matrix44<float>>, "Matrix44 is copied as bytes");

// The vector and matrix types refer to each other; each header brings in the
// others after its own definition, so including any one of them is enough.
#include "core/Matrix33.h"
#include "core/Vector3.h"
