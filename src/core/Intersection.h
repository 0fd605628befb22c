#pragma once
// Intersection tests between rays, points and boxes, used by picking and by
// assigning entities to rooms.
//
// RayVsAABB tests the whole line through the ray, not only the half in front of
// the origin; picking sorts out boxes behind the camera itself. It relies on IEEE
// arithmetic (division by zero gives an infinity, NaN compares false), so this
// code must never be built with -ffast-math or -ffinite-math-only.

#include "core/AABB.h"
#include "core/Ray.h"
#include "core/Vector3.h"

#if defined(__FAST_MATH__) || (defined(__FINITE_MATH_ONLY__) && __FINITE_MATH_ONLY__)
#error "Intersection needs IEEE infinities and NaN; build without -ffast-math"
#endif

namespace Intersection
{
namespace Detail
{
// Entry and exit distances of the line along one axis's slab. A zero direction
// component of either sign takes the non-negative branch (-0 >= 0 is true).
template <typename T>
void SlabDistances(T anOrigin, T aDirection, T aMin, T aMax, T& aNearOut, T& aFarOut)
{
	if (aDirection >= 0)
	{
		aNearOut = (aMin - anOrigin) / aDirection;
		aFarOut = (aMax - anOrigin) / aDirection;
	}
	else
	{
		aNearOut = (aMax - anOrigin) / aDirection;
		aFarOut = (aMin - anOrigin) / aDirection;
	}
}

// Narrows [aMin, aMax] by one more slab. Written so that a NaN distance never
// rejects and never replaces a bound: every comparison with NaN is false.
template <typename T> bool NarrowBySlab(T& aMin, T& aMax, T aSlabMin, T aSlabMax)
{
	if (aMin > aSlabMax || aSlabMin > aMax)
	{
		return false;
	}
	if (aSlabMin > aMin)
	{
		aMin = aSlabMin;
	}
	if (aSlabMax < aMax)
	{
		aMax = aSlabMax;
	}
	return true;
}
} // namespace Detail

// Slab test. The order of the comparisons matters for NaN: a NaN distance (origin
// exactly on a slab plane of an axis the ray is parallel to) never rejects and
// never replaces tmin or tmax, but makes the final tmin < tmax false when it
// starts there (the x axis). A ray that only grazes the box (tmin equal to tmax)
// misses.
template <typename T> bool RayVsAABB(const Ray<T>& aRay, const AABB<T>& anAABB)
{
	const Vector3<T>& origin = aRay.myOrigin;
	const Vector3<T>& direction = aRay.myDirection;
	const Vector3<T>& minPos = anAABB.myMinPos;
	const Vector3<T>& maxPos = anAABB.myMaxPos;

	T tmin;
	T tmax;
	Detail::SlabDistances(origin.x, direction.x, minPos.x, maxPos.x, tmin, tmax);

	T tymin;
	T tymax;
	Detail::SlabDistances(origin.y, direction.y, minPos.y, maxPos.y, tymin, tymax);
	if (!Detail::NarrowBySlab(tmin, tmax, tymin, tymax))
	{
		return false;
	}

	T tzmin;
	T tzmax;
	Detail::SlabDistances(origin.z, direction.z, minPos.z, maxPos.z, tzmin, tzmax);
	if (!Detail::NarrowBySlab(tmin, tmax, tzmin, tzmax))
	{
		return false;
	}

	return tmin < tmax;
}

// Strictly inside on every axis: a point on a face is outside.
bool PointInsideAABB(const AABB<float>& anAABB, const Vector3<float>& aPoint);
} // namespace Intersection
