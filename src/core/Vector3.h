#pragma once
// Vector3: positions, directions and colours throughout the engine and editor.
//
// Row-vector convention (Direct3D): a vector is multiplied on the left of a
// matrix. The default constructor leaves the components uninitialised so that
// large arrays of vectors cost nothing to allocate; the layout is exactly x, y, z
// with nothing else, so arrays can be handed to the graphics interfaces as they are.

#include <cmath>
#include <type_traits>

template <typename T> class Vector4;
template <typename T> class Matrix33;

template <typename T> class Vector3
{
public:
	Vector3() = default;
	Vector3(const T aX, const T anY, const T aZ) : x(aX), y(anY), z(aZ) {}
	// Drops w: callers use this to read the position back after a 4x4 transform.
	Vector3(const Vector4<T>& aVector4) : x(aVector4.x), y(aVector4.y), z(aVector4.z) {}

	void Set(const T anX, const T aY, const T aZ)
	{
		x = anX;
		y = aY;
		z = aZ;
	}

	Vector3& operator+=(const Vector3& aVector3)
	{
		x += aVector3.x;
		y += aVector3.y;
		z += aVector3.z;
		return *this;
	}

	Vector3& operator-=(const Vector3& aVector3)
	{
		x -= aVector3.x;
		y -= aVector3.y;
		z -= aVector3.z;
		return *this;
	}

	Vector3& operator*=(const T aType)
	{
		x *= aType;
		y *= aType;
		z *= aType;
		return *this;
	}

	// Row vector times matrix: each result component is a dot product with a column.
	Vector3& operator*=(const Matrix33<T>& aM33)
	{
		const T* m = aM33.myMatrix;
		const T newX = x * m[0] + y * m[3] + z * m[6];
		const T newY = x * m[1] + y * m[4] + z * m[7];
		const T newZ = x * m[2] + y * m[5] + z * m[8];
		x = newX;
		y = newY;
		z = newZ;
		return *this;
	}

	Vector3 operator-() const { return Vector3(-x, -y, -z); }

	T Length() const { return std::sqrt(x * x + y * y + z * z); }

	// Squared length: callers compare it against squared distances and skip the root.
	T LengthFast() const { return x * x + y * y + z * z; }

	// A zero or not-a-number length leaves the vector as it is rather than filling
	// it with NaN; a degenerate direction then stays visibly degenerate.
	Vector3& Normalize()
	{
		const T length = Length();
		if (length > 0)
		{
			x /= length;
			y /= length;
			z /= length;
		}
		return *this;
	}

	Vector3 Cross(const Vector3& aVector3) const
	{
		return Vector3(y * aVector3.z - z * aVector3.y, z * aVector3.x - x * aVector3.z,
		               x * aVector3.y - y * aVector3.x);
	}

	T x;
	T y;
	T z;
};

template <typename T> Vector3<T> operator+(const Vector3<T>& aLeft, const Vector3<T>& aRight)
{
	Vector3<T> result(aLeft);
	result += aRight;
	return result;
}

template <typename T> Vector3<T> operator-(const Vector3<T>& aLeft, const Vector3<T>& aRight)
{
	Vector3<T> result(aLeft);
	result -= aRight;
	return result;
}

template <typename T> Vector3<T> operator*(const Vector3<T>& aVector, const T aType)
{
	Vector3<T> result(aVector);
	result *= aType;
	return result;
}

static_assert(sizeof(Vector3<float>) == 3 * sizeof(float), "Vector3 must be three packed floats");
static_assert(std::is_trivially_copyable_v<Vector3<float>>, "Vector3 is copied as bytes");

// The vector and matrix types refer to each other; each header brings in the
// others after its own definition, so including any one of them is enough.
#include "core/Matrix33.h"
#include "core/Vector4.h"
