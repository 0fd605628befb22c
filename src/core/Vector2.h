#pragma once
// Vector2: a pair of components, used for screen positions, texture
// coordinates and (as Vector2<int>) integer sizes such as a render target's.
//
// The default constructor leaves the components uninitialised so arrays of
// vectors cost nothing to allocate; the layout is exactly x then y, so arrays can
// be handed to the graphics interfaces unchanged.

#include <type_traits>

template <typename T> class Vector2
{
public:
	Vector2() = default;
	Vector2(const T aX, const T anY) : x(aX), y(anY) {}

	void Set(const T anX, const T aY)
	{
		x = anX;
		y = aY;
	}

	Vector2& operator+=(const Vector2& aVector2)
	{
		x += aVector2.x;
		y += aVector2.y;
		return *this;
	}

	Vector2& operator-=(const Vector2& aVector2)
	{
		x -= aVector2.x;
		y -= aVector2.y;
		return *this;
	}

	Vector2& operator*=(const T aType)
	{
		x *= aType;
		y *= aType;
		return *this;
	}

	Vector2 operator-() const { return Vector2(-x, -y); }

	T x;
	T y;
};

template <typename T> Vector2<T> operator+(const Vector2<T>& aLeft, const Vector2<T>& aRight)
{
	Vector2<T> result(aLeft);
	result += aRight;
	return result;
}

template <typename T> Vector2<T> operator-(const Vector2<T>& aLeft, const Vector2<T>& aRight)
{
	Vector2<T> result(aLeft);
	result -= aRight;
	return result;
}

template <typename T> Vector2<T> operator*(const Vector2<T>& aVector, const T aType)
{
	Vector2<T> result(aVector);
	result *= aType;
	return result;
}

static_assert(sizeof(Vector2<float>) == 2 * sizeof(float), "Vector2 must be two packed floats");
static_assert(sizeof(Vector2<int>) == 2 * sizeof(int), "Vector2<int> must be two packed ints");
static_assert(std::is_trivially_copyable_v<Vector2<float>>, "Vector2 is copied as bytes");
