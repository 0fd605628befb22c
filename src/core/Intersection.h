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
// Slab test. The order of the comparisons matters for NaN: a NaN distance (origin
// exactly on a slab plane of an axis the ray is parallel to) never rejects and
// never replaces tmin or tmax, but makes the final tmin < tmax false. A zero
// direction component of either sign takes the non-negative branch. A ray that
// only grazes the box (tmin equal to tmax) misses.
template <typename T> bool RayVsAABB(const Ray<T>& aRay, const AABB<T>& anAABB)
{
	const Vector3<T>& origin = aRay.myOrigin;
	const Vector3<T>& direction = aRay.myDirection;
	const Vector3<T>& minPos = anAABB.myMinPos;
	const Vector3<T>& maxPos = anAABB.myMaxPos;

	T tmin;
	T tmax;
	if (direction.x >= 0)
	{
		tmin = (minPos.x - origin.x) / direction.x;
		tmax = (maxPos.x - origin.x) / direction.x;
	}
	else
	{
		tmin = (maxPos.x - origin.x) / direction.x;
		tmax = (minPos.x - origin.x) / direction.x;
	}

	T tymin;
	T tymax;
	if (direction.y >= 0)
	{
		tymin = (minPos.y - origin.y) / direction.y;
		tymax = (maxPos.y - origin.y) / direction.y;
	}
	else
	{
		tymin = (maxPos.y - origin.y) / direction.y;
		tymax = (minPos.y - origin.y) / direction.y;
	}

	if (tmin > tymax || tymin > tmax)
	{
		return false;
	}
	if (tymin > tmin)
	{
		tmin = tymin;
	}
	if (tymax < tmax)
	{
		tmax = tymax;
	}

	T tzmin;
	T tzmax;
	if (direction.z >= 0)
	{
		tzmin = (minPos.z - origin.z) / direction.z;
		tzmax = (maxPos.z - origin.z) / direction.z;
	}
	else
	{
		tzmin = (maxPos.z - origin.z) / direction.z;
		tzmax = (minPos.z - origin.z) / direction.z;
	}

	if (tmin > tzmax || tzmin > tmax)
	{
		return false;
	}
	if (tzmin > tmin)
	{
		tmin = tzmin;
	}
	if (tzmax < tmax)
	{
		tmax = tzmax;
	}

	return tmin < tmax;
}

// Strictly inside on every axis: a point on a face is outside.
bool PointInsideAABB(const AABB<float>& anAABB, const Vector3<float>& aPoint);
} // namespace Intersection
