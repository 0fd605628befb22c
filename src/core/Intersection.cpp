#include "core/Intersection.h"

namespace Intersection
{
bool PointInsideAABB(const AABB<float>& anAABB, const Vector3<float>& aPoint)
{
	const Vector3<float>& minPos = anAABB.myMinPos;
	const Vector3<float>& maxPos = anAABB.myMaxPos;
	return minPos.x < aPoint.x && aPoint.x < maxPos.x && minPos.y < aPoint.y && aPoint.y < maxPos.y &&
	       minPos.z < aPoint.z && aPoint.z < maxPos.z;
}

// The library's own instantiation, so the slab test is compiled (and warned about)
// with the core's flags even before a caller uses it.
template bool RayVsAABB<float>(const Ray<float>& aRay, const AABB<float>& anAABB);
} // namespace Intersection
