#pragma once
// Vector4: homogeneous positions and RGBA colours.
//
// Built from a Vector3 it gets w = 1, so multiplying it by a transform applies
// the translation in the matrix's fourth row. The default constructor leaves the
// components uninitialised; the layout is exactly x, y, z, w.

#include <type_traits>

template <typename T> class Vector3;
template <typename T> class Matrix44;

template <typename T> class Vector4
{
public:
	Vector4() = default;
	Vector4(const T aX, const T anY, const T aZ, const T aW) : x(aX), y(anY), z(aZ), w(aW) {}
	Vector4(const Vector3<T>& aVector3) : x(aVector3.x), y(aVector3.y), z(aVector3.z), w(static_cast<T>(1)) {}

	void Set(const T anX, const T aY, const T aZ, const T aW)
	{
		x = anX;
		y = aY;
		z = aZ;
		w = aW;
	}

	Vector4& operator+=(const Vector4& aVector4)
	{
		x += aVector4.x;
		y += aVector4.y;
		z += aVector4.z;
		w += aVector4.w;
		return *this;
	}

	Vector4& operator-=(const Vector4& aVector4)
	{
		x -= aVector4.x;
		y -= aVector4.y;
		z -= aVector4.z;
		w -= aVector4.w;
		return *this;
	}

	Vector4& operator*=(const T aType)
	{
		x *= aType;
		y *= aType;
		z *= aType;
		w *= aType;
		return *this;
	}

	// Row vector times the full 4x4 matrix, w included (projections need it).
	Vector4& operator*=(const Matrix44<T>& aM44)
	{
		const T* m = aM44.myMatrix;
		const T newX = x * m[0] + y * m[4] + z * m[8] + w * m[12];
		const T newY = x * m[1] + y * m[5] + z * m[9] + w * m[13];
		const T newZ = x * m[2] + y * m[6] + z * m[10] + w * m[14];
		const T newW = x * m[3] + y * m[7] + z * m[11] + w * m[15];
		x = newX;
		y = newY;
		z = newZ;
		w = newW;
		return *this;
	}

	Vector4 operator-() const { return Vector4(-x, -y, -z, -w); }

	T x;
	T y;
	T z;
	T w;
};

template <typename T> Vector4<T> operator+(const Vector4<T>& aLeft, const Vector4<T>& aRight)
{
	Vector4<T> result(aLeft);
	result += aRight;
	return result;
}

template <typename T> Vector4<T> operator-(const Vector4<T>& aLeft, const Vector4<T>& aRight)
{
	Vector4<T> result(aLeft);
	result -= aRight;
	return result;
}

template <typename T> Vector4<T> operator*(const Vector4<T>& aVector, const T aType)
{
	Vector4<T> result(aVector);
	result *= aType;
	return result;
}

template <typename T> Vector4<T> operator*(const Vector4<T>& aVector, const Matrix44<T>& aM44)
{
	Vector4<T> result(aVector);
	result *= aM44;
	return result;
}

static_assert(sizeof(Vector4<float>) == 4 * sizeof(float), "Vector4 must be four packed floats");
static_assert(std::is_trivially_copyable_v<Vector4<float>>, "Vector4 is copied as bytes");

// The vector and matrix types refer to each other; each header brings in the
// others after its own definition, so including any one of them is enough.
#include "core/Matrix44.h"
#include "core/Vector3.h"
