#pragma once
// Matrix33: the rotation-and-scale block of a transform.
//
// Row-major with row vectors on the left (Direct3D convention): element (r, c)
// is myMatrix[3 * r + c]. Default-constructed it is the identity. Used to turn
// directions without touching a position, and to rotate the block of a Matrix44.

#include <cmath>
#include <type_traits>

template <typename T> class Matrix44;

template <typename T> class Matrix33
{
public:
	constexpr Matrix33() : myMatrix{1, 0, 0, 0, 1, 0, 0, 0, 1} {}
	Matrix33(const Matrix44<T>& aMatrix) { *this = aMatrix; }

	Matrix33& operator=(const Matrix44<T>& aMatrix)
	{
		const T* m = aMatrix.myMatrix;
		for (int row = 0; row < 3; ++row)
		{
			for (int column = 0; column < 3; ++column)
			{
				myMatrix[3 * row + column] = m[4 * row + column];
			}
		}
		return *this;
	}

	// this = this x aRightSideMatrix. The product goes through a temporary so a
	// matrix may be multiplied by itself.
	Matrix33& operator*=(const Matrix33& aRightSideMatrix)
	{
		const T* right = aRightSideMatrix.myMatrix;
		T product[9];
		for (int row = 0; row < 3; ++row)
		{
			for (int column = 0; column < 3; ++column)
			{
				product[3 * row + column] = myMatrix[3 * row] * right[column] +
				                            myMatrix[3 * row + 1] * right[3 + column] +
				                            myMatrix[3 * row + 2] * right[6 + column];
			}
		}
		for (int i = 0; i < 9; ++i)
		{
			myMatrix[i] = product[i];
		}
		return *this;
	}

	// Angles in radians; sine and cosine are taken in double precision so a float
	// matrix gets the correctly rounded values.
	static Matrix33 CreateRotateAroundX(const T anAngleInRadians)
	{
		const T c = static_cast<T>(std::cos(static_cast<double>(anAngleInRadians)));
		const T s = static_cast<T>(std::sin(static_cast<double>(anAngleInRadians)));
		Matrix33 result;
		result.myMatrix[4] = c;
		result.myMatrix[5] = -s;
		result.myMatrix[7] = s;
		result.myMatrix[8] = c;
		return result;
	}

	static Matrix33 CreateRotateAroundY(const T anAngleInRadians)
	{
		const T c = static_cast<T>(std::cos(static_cast<double>(anAngleInRadians)));
		const T s = static_cast<T>(std::sin(static_cast<double>(anAngleInRadians)));
		Matrix33 result;
		result.myMatrix[0] = c;
		result.myMatrix[2] = s;
		result.myMatrix[6] = -s;
		result.myMatrix[8] = c;
		return result;
	}

	static Matrix33 CreateRotateAroundZ(const T anAngleInRadians)
	{
		const T c = static_cast<T>(std::cos(static_cast<double>(anAngleInRadians)));
		const T s = static_cast<T>(std::sin(static_cast<double>(anAngleInRadians)));
		Matrix33 result;
		result.myMatrix[0] = c;
		result.myMatrix[1] = -s;
		result.myMatrix[3] = s;
		result.myMatrix[4] = c;
		return result;
	}

	T myMatrix[9];
};

template <typename T> Matrix33<T> operator*(const Matrix33<T>& aLeft, const Matrix33<T>& aRight)
{
	Matrix33<T> result(aLeft);
	result *= aRight;
	return result;
}

static_assert(sizeof(Matrix33<float>) == 9 * sizeof(float), "Matrix33 must be nine packed floats");
static_assert(std::is_trivially_copyable_v<Matrix33<float>>, "Matrix33 is copied as bytes");

// Matrix33 and Matrix44 convert into each other; whichever is included first
// brings in the other so one include is always enough.
#include "core/Matrix44.h"
