#include "core/Intersection.h"

#include <gtest/gtest.h>

#include <cmath>

#include "core/AABB.h"
#include "core/Ray.h"

using Intersection::AABB;
using Intersection::Ray;
using V3 = Vector3<float>;

namespace
{
// The box from -1 to 1 on every axis.
const AABB<float> ourUnitBox = [] {
	AABB<float> box;
	box.myMinPos = V3(-1.0f, -1.0f, -1.0f);
	box.myMaxPos = V3(1.0f, 1.0f, 1.0f);
	return box;
}();
} // namespace

TEST(IntersectionRayVsAABB, EdgeCasesOfTheSlabTest)
{
	// The lines through a click that picking meets every day are its own tests' (editor/PickingTest).
	struct Case
	{
		const char* myName;
		V3 myOrigin;
		V3 myDirection;
		bool myHit;
	};
	const Case cases[] = {
	    // On a slab plane and parallel to it, 0/0 is NaN. On x it becomes tmin or tmax
	    // and the final comparison fails; on y and z it never replaces a bound.
	    {"NaN on the x = 1 plane", V3(1.0f, 0.0f, -10.0f), V3(0.0f, 0.0f, 1.0f), false},
	    {"NaN on the y = -1 plane", V3(0.0f, -1.0f, -10.0f), V3(0.0f, 0.0f, 1.0f), true},
	    {"NaN on the z = 1 plane", V3(-10.0f, 0.0f, 1.0f), V3(1.0f, 0.0f, 0.0f), true},
	    {"grazing the x = 1, z = 1 edge", V3(0.0f, 0.0f, 2.0f), V3(1.0f, 0.0f, -1.0f), false},
	    {"the grazing line moved inwards", V3(0.0f, 0.0f, 1.5f), V3(1.0f, 0.0f, -1.0f), true},
	    // A zero direction is parallel to every slab.
	    {"zero direction outside", V3(5.0f, 0.0f, 0.0f), V3(0.0f, 0.0f, 0.0f), false},
	    {"zero direction inside", V3(0.5f, 0.0f, 0.0f), V3(0.0f, 0.0f, 0.0f), true},
	};
	for (const Case& ray : cases)
	{
		EXPECT_EQ(Intersection::RayVsAABB(Ray<float>(ray.myOrigin, ray.myDirection), ourUnitBox), ray.myHit)
		    << ray.myName;
	}

	// -0 takes the non-negative branch: the x slab runs from +inf to -inf and the
	// ray misses, where +0 or a branch on the sign bit would hit.
	const Ray<float> negativeZero(V3(0.0f, 0.0f, -10.0f), V3(-0.0f, 0.0f, 1.0f));
	ASSERT_TRUE(std::signbit(negativeZero.myDirection.x));
	EXPECT_FALSE(Intersection::RayVsAABB(negativeZero, ourUnitBox));
}

TEST(IntersectionPointInsideAABB, StrictOnEveryAxis)
{
	EXPECT_TRUE(Intersection::PointInsideAABB(ourUnitBox, V3(0.99f, -0.99f, 0.5f)));
	// A point on any of the six faces is outside.
	for (const V3& onFace : {V3(-1.0f, 0.0f, 0.0f), V3(1.0f, 0.0f, 0.0f), V3(0.0f, -1.0f, 0.0f),
	                         V3(0.0f, 1.0f, 0.0f), V3(0.0f, 0.0f, -1.0f), V3(0.0f, 0.0f, 1.0f)})
	{
		EXPECT_FALSE(Intersection::PointInsideAABB(ourUnitBox, onFace)) << onFace.x << onFace.y << onFace.z;
	}
}
