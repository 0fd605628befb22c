#pragma once
// Ray: an origin and a unit direction, for picking from the camera.
//
// The direction is normalised on construction; a zero direction stays zero
// (Normalize leaves it alone), which the box test then treats as parallel to
// every slab.

#include "core/Vector3.h"

namespace Intersection
{
template <typename T> class Ray
{
public:
	Ray(const Vector3<T>& anOrigin, const Vector3<T>& aDirection)
	    : myOrigin(anOrigin), myDirection(aDirection)
	{
		myDirection.Normalize();
	}

	Vector3<T> myOrigin;
	Vector3<T> myDirection;
};
} // namespace Intersection
