#pragma once
// The left-handed look-to view matrix (the world-to-camera transform of a camera at
// anEye looking along aDirection), in the row-vector convention of the math types.
//
//   Matrix44<float> view = CreateLookToLH(eye, forward, Vector3<float>(0, 1, 0));
//
// z is the normalised direction, x = normalise(up x z), y = z x x; rows 0 to 2 hold
// the columns of the basis and row 3 moves the eye to the origin.

#include "core/Matrix44.h"
#include "core/Vector3.h"

template <typename T>
Matrix44<T> CreateLookToLH(const Vector3<T>& anEye, const Vector3<T>& aDirection, const Vector3<T>& anUp)
{
	Vector3<T> zAxis = aDirection;
	zAxis.Normalize();
	Vector3<T> xAxis = anUp.Cross(zAxis);
	xAxis.Normalize();
	const Vector3<T> yAxis = zAxis.Cross(xAxis);

	const auto dot = [](const Vector3<T>& aLeft, const Vector3<T>& aRight) {
		return aLeft.x * aRight.x + aLeft.y * aRight.y + aLeft.z * aRight.z;
	};

	Matrix44<T> view;
	T* m = view.myMatrix;
	m[0] = xAxis.x;
	m[1] = yAxis.x;
	m[2] = zAxis.x;
	m[3] = 0;
	m[4] = xAxis.y;
	m[5] = yAxis.y;
	m[6] = zAxis.y;
	m[7] = 0;
	m[8] = xAxis.z;
	m[9] = yAxis.z;
	m[10] = zAxis.z;
	m[11] = 0;
	m[12] = -dot(xAxis, anEye);
	m[13] = -dot(yAxis, anEye);
	m[14] = -dot(zAxis, anEye);
	m[15] = 1;
	return view;
}
