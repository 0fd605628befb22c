#include "core/Intersection.h"

#include <gtest/gtest.h>

#include <cmath>

#include "core/AABB.h"
#include "core/CollisionObject.h"
#include "core/Ray.h"
#include "core/Sphere.h"

using Intersection::AABB;
using Intersection::Ray;
using Intersection::Sphere;
using V3 = Vector3<float>;

namespace
{
AABB<float> Box(const V3& aMin, const V3& aMax)
{
	AABB<float> box;
	box.myMinPos = aMin;
	box.myMaxPos = aMax;
	return box;
}

const AABB<float> ourUnitBox = Box(V3(-1.0f, -1.0f, -1.0f), V3(1.0f, 1.0f, 1.0f));

bool Hits(const V3& anOrigin, const V3& aDirection, const AABB<float>& aBox = ourUnitBox)
{
	return Intersection::RayVsAABB(Ray<float>(anOrigin, aDirection), aBox);
}

// The smallest shape: relies on the base for everything optional, and records
// the spheres handed to it.
class Marker : public Intersection::CollisionObject
{
public:
	bool Collide(const CollisionObject&) const override { return false; }
	bool CollideWithSphere(const Sphere& aSphere) const override
	{
		++myCallCount;
		return aSphere.myRadius > 1.0f;
	}
	mutable int myCallCount = 0;
};
} // namespace

TEST(IntersectionRayVsAABB, UnitBoxCases)
{
	struct Case
	{
		const char* myName;
		V3 myOrigin;
		V3 myDirection;
		bool myHit;
	};
	const Case cases[] = {
	    {"straight through", V3(0.0f, 0.0f, -10.0f), V3(0.0f, 0.0f, 1.0f), true},
	    {"box behind the origin: the whole line counts", V3(0.0f, 0.0f, -10.0f), V3(0.0f, 0.0f, -1.0f), true},
	    {"beside the box at x = 2", V3(2.0f, 0.0f, -10.0f), V3(0.0f, 0.0f, 1.0f), false},
	    {"diagonal through", V3(-5.0f, -4.0f, -3.0f), V3(5.0f, 4.5f, 3.5f), true},
	    {"diagonal past", V3(-5.0f, -4.0f, -3.0f), V3(5.0f, -4.0f, 3.0f), false},
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
		EXPECT_EQ(Hits(ray.myOrigin, ray.myDirection), ray.myHit) << ray.myName;
	}

	// -0 takes the non-negative branch: the x slab runs from +inf to -inf and the
	// ray misses, where +0 (the first case) or a branch on the sign bit would hit.
	const Ray<float> negativeZero(V3(0.0f, 0.0f, -10.0f), V3(-0.0f, 0.0f, 1.0f));
	ASSERT_TRUE(std::signbit(negativeZero.myDirection.x));
	EXPECT_FALSE(Intersection::RayVsAABB(negativeZero, ourUnitBox));
}

TEST(IntersectionRayVsAABB, OffCentreBoxFromEveryOctant)
{
	const AABB<float> box = Box(V3(2.0f, 3.0f, 4.0f), V3(3.0f, 5.0f, 7.0f));
	for (int octant = 0; octant < 8; ++octant)
	{
		const V3 direction(octant & 1 ? -1.0f : 1.0f, octant & 2 ? -0.5f : 0.5f, octant & 4 ? -2.0f : 2.0f);
		const V3 start = V3(2.5f, 4.0f, 5.5f) - direction * 10.0f; // the line through the centre
		EXPECT_TRUE(Hits(start, direction, box)) << "octant " << octant;
		EXPECT_FALSE(Hits(start + V3(0.0f, 2.5f, 0.0f), direction, box)) << "octant " << octant;
	}
}

TEST(IntersectionPointInsideAABB, StrictOnEveryAxis)
{
	EXPECT_TRUE(Intersection::PointInsideAABB(ourUnitBox, V3(0.99f, -0.99f, 0.5f)));
	EXPECT_FALSE(Intersection::PointInsideAABB(ourUnitBox, V3(-3.0f, 0.0f, 0.0f)));
	// A point on any of the six faces is outside.
	for (int axis = 0; axis < 3; ++axis)
	{
		for (float side : {-1.0f, 1.0f})
		{
			V3 onFace(0.25f, -0.25f, 0.5f);
			(axis == 0 ? onFace.x : axis == 1 ? onFace.y : onFace.z) = side;
			EXPECT_FALSE(Intersection::PointInsideAABB(ourUnitBox, onFace))
			    << "axis " << axis << " side " << side;
		}
	}
}

TEST(IntersectionSphere, TouchingSpheresCollideAndOtherShapesDecide)
{
	const Sphere a(V3(0.0f, 0.0f, 0.0f), 1.0f);
	const Sphere touching(V3(2.0f, 0.0f, 0.0f), 1.0f);
	EXPECT_TRUE(a.CollideWithSphere(touching));
	EXPECT_TRUE(touching.CollideWithSphere(a));
	EXPECT_FALSE(a.CollideWithSphere(Sphere(V3(0.0f, 2.01f, 0.0f), 1.0f)));
	EXPECT_TRUE(a.CollideWithSphere(Sphere(V3(0.0f, 0.0f, -0.5f), 0.25f)));
	EXPECT_TRUE(a.Collide(static_cast<const Intersection::CollisionObject&>(touching)));
	EXPECT_FALSE(a.Collide(Sphere(V3(3.0f, 0.0f, 0.0f), 1.0f)));

	// The other shape decides, with this sphere handed over.
	Marker marker;
	EXPECT_FALSE(a.Collide(marker));
	EXPECT_TRUE(Sphere(V3(0.0f, 0.0f, 0.0f), 2.0f).Collide(marker));
	EXPECT_EQ(marker.myCallCount, 2);

	// Boxes take part in no shape test, even with a sphere inside.
	EXPECT_FALSE(a.Collide(ourUnitBox));
	EXPECT_FALSE(ourUnitBox.Collide(a));
	EXPECT_FALSE(ourUnitBox.CollideWithSphere(a));
}
