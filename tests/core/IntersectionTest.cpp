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

namespace
{
AABB<float> Box(const Vector3<float>& aMin, const Vector3<float>& aMax)
{
	AABB<float> box;
	box.myMinPos = aMin;
	box.myMaxPos = aMax;
	return box;
}

AABB<float> UnitBox()
{
	return Box(Vector3<float>(-1.0f, -1.0f, -1.0f), Vector3<float>(1.0f, 1.0f, 1.0f));
}

bool Hits(const Vector3<float>& anOrigin, const Vector3<float>& aDirection, const AABB<float>& aBox)
{
	return Intersection::RayVsAABB(Ray<float>(anOrigin, aDirection), aBox);
}

// The smallest shape there is: relies on the base for everything optional.
class Marker : public Intersection::CollisionObject
{
public:
	bool Collide(const CollisionObject& anObject) const override
	{
		static_cast<void>(anObject);
		return false;
	}
	bool CollideWithSphere(const Sphere& aSphere) const override
	{
		++myCallCount;
		return aSphere.myRadius > 1.0f;
	}
	mutable int myCallCount = 0;
};
} // namespace

TEST(IntersectionRay, ConstructorNormalisesTheDirection)
{
	const Ray<float> ray(Vector3<float>(1.0f, 2.0f, 3.0f), Vector3<float>(0.0f, 3.0f, 4.0f));
	EXPECT_EQ(ray.myOrigin.z, 3.0f);
	EXPECT_NEAR(ray.myDirection.y, 0.6f, 1e-6f);
	EXPECT_NEAR(ray.myDirection.z, 0.8f, 1e-6f);

	const Ray<float> still(Vector3<float>(0.0f, 0.0f, 0.0f), Vector3<float>(0.0f, 0.0f, 0.0f));
	EXPECT_EQ(still.myDirection.LengthFast(), 0.0f);
}

TEST(IntersectionRayVsAABB, HitsAndMissesAlongTheLine)
{
	const AABB<float> box = UnitBox();
	EXPECT_TRUE(Hits(Vector3<float>(0.0f, 0.0f, -10.0f), Vector3<float>(0.0f, 0.0f, 1.0f), box));
	// Pointing away still hits: the whole line is tested, not the half in front.
	EXPECT_TRUE(Hits(Vector3<float>(0.0f, 0.0f, -10.0f), Vector3<float>(0.0f, 0.0f, -1.0f), box));
	EXPECT_FALSE(Hits(Vector3<float>(2.0f, 0.0f, -10.0f), Vector3<float>(0.0f, 0.0f, 1.0f), box));
	EXPECT_TRUE(Hits(Vector3<float>(-5.0f, -4.0f, -3.0f), Vector3<float>(5.0f, 4.5f, 3.5f), box));
	EXPECT_FALSE(Hits(Vector3<float>(-5.0f, -4.0f, -3.0f), Vector3<float>(5.0f, -4.0f, 3.0f), box));

	// An off-centre box, reached on a diagonal from every octant.
	const AABB<float> offset = Box(Vector3<float>(2.0f, 3.0f, 4.0f), Vector3<float>(3.0f, 5.0f, 7.0f));
	const Vector3<float> centre(2.5f, 4.0f, 5.5f);
	for (float sx : {-1.0f, 1.0f})
	{
		for (float sy : {-1.0f, 1.0f})
		{
			for (float sz : {-1.0f, 1.0f})
			{
				const Vector3<float> direction(sx, sy * 0.5f, sz * 2.0f);
				EXPECT_TRUE(Hits(centre - direction * 10.0f, direction, offset)) << sx << sy << sz;
				EXPECT_FALSE(
				    Hits(centre - direction * 10.0f + Vector3<float>(0.0f, 2.5f, 0.0f), direction, offset))
				    << sx << sy << sz;
			}
		}
	}
}

TEST(IntersectionRayVsAABB, IeeeEdgeCases)
{
	const AABB<float> box = UnitBox();

	// Origin on a slab plane with the ray parallel to it: 0/0 is NaN. On x the NaN
	// becomes tmin or tmax directly and the final comparison fails; on y and z it
	// never replaces a bound, so the same ray on those planes hits.
	EXPECT_FALSE(Hits(Vector3<float>(1.0f, 0.0f, -10.0f), Vector3<float>(0.0f, 0.0f, 1.0f), box));
	EXPECT_FALSE(Hits(Vector3<float>(-1.0f, 0.0f, -10.0f), Vector3<float>(0.0f, 0.0f, 1.0f), box));
	EXPECT_TRUE(Hits(Vector3<float>(0.0f, -1.0f, -10.0f), Vector3<float>(0.0f, 0.0f, 1.0f), box));
	EXPECT_TRUE(Hits(Vector3<float>(0.0f, 1.0f, -10.0f), Vector3<float>(0.0f, 0.0f, 1.0f), box));
	EXPECT_TRUE(Hits(Vector3<float>(-10.0f, 0.0f, 1.0f), Vector3<float>(1.0f, 0.0f, 0.0f), box));

	// Grazing the edge x = 1, z = 1: entry and exit coincide (tmin == tmax), a miss,
	// while the same line moved inwards hits.
	EXPECT_FALSE(Hits(Vector3<float>(0.0f, 0.0f, 2.0f), Vector3<float>(1.0f, 0.0f, -1.0f), box));
	EXPECT_TRUE(Hits(Vector3<float>(0.0f, 0.0f, 1.5f), Vector3<float>(1.0f, 0.0f, -1.0f), box));

	// Negative zero counts as non-negative: the x slab then runs from +inf to -inf
	// and the ray misses, where +0 (or a branch on the sign bit) would hit.
	EXPECT_TRUE(Hits(Vector3<float>(0.0f, 0.0f, -10.0f), Vector3<float>(0.0f, 0.0f, 1.0f), box));
	const Ray<float> negativeZero(Vector3<float>(0.0f, 0.0f, -10.0f), Vector3<float>(-0.0f, 0.0f, 1.0f));
	ASSERT_TRUE(std::signbit(negativeZero.myDirection.x));
	EXPECT_FALSE(Intersection::RayVsAABB(negativeZero, box));

	// A zero direction is parallel to every slab: from outside the box it misses,
	// from strictly inside every slab spans -inf..+inf and it hits.
	EXPECT_FALSE(Hits(Vector3<float>(5.0f, 0.0f, 0.0f), Vector3<float>(0.0f, 0.0f, 0.0f), box));
	EXPECT_TRUE(Hits(Vector3<float>(0.5f, 0.0f, 0.0f), Vector3<float>(0.0f, 0.0f, 0.0f), box));
}

TEST(IntersectionPointInsideAABB, StrictOnEveryAxis)
{
	const AABB<float> box = UnitBox();
	EXPECT_TRUE(Intersection::PointInsideAABB(box, Vector3<float>(0.0f, 0.0f, 0.0f)));
	EXPECT_TRUE(Intersection::PointInsideAABB(box, Vector3<float>(0.99f, -0.99f, 0.5f)));
	// Each of the six faces on its own.
	for (int axis = 0; axis < 3; ++axis)
	{
		for (float side : {-1.0f, 1.0f})
		{
			Vector3<float> onFace(0.25f, -0.25f, 0.5f);
			(axis == 0 ? onFace.x : axis == 1 ? onFace.y : onFace.z) = side;
			EXPECT_FALSE(Intersection::PointInsideAABB(box, onFace)) << "axis " << axis << " side " << side;
		}
	}
	EXPECT_FALSE(Intersection::PointInsideAABB(box, Vector3<float>(0.0f, 0.0f, 1.5f)));
	EXPECT_FALSE(Intersection::PointInsideAABB(box, Vector3<float>(-3.0f, 0.0f, 0.0f)));
}

TEST(IntersectionSphere, TouchingSpheresCollide)
{
	const Sphere a(Vector3<float>(0.0f, 0.0f, 0.0f), 1.0f);
	const Sphere touching(Vector3<float>(2.0f, 0.0f, 0.0f), 1.0f);
	const Sphere apart(Vector3<float>(0.0f, 2.01f, 0.0f), 1.0f);
	const Sphere overlapping(Vector3<float>(0.0f, 0.0f, -0.5f), 0.25f);
	EXPECT_TRUE(a.CollideWithSphere(touching));
	EXPECT_TRUE(touching.CollideWithSphere(a));
	EXPECT_FALSE(a.CollideWithSphere(apart));
	EXPECT_TRUE(a.CollideWithSphere(overlapping));
}

TEST(IntersectionSphere, CollideDispatchesOnTheOtherShape)
{
	const Sphere a(Vector3<float>(0.0f, 0.0f, 0.0f), 1.0f);
	const Sphere touching(Vector3<float>(2.0f, 0.0f, 0.0f), 1.0f);
	const Sphere apart(Vector3<float>(3.0f, 0.0f, 0.0f), 1.0f);
	const Intersection::CollisionObject& asBase = touching;
	EXPECT_TRUE(a.Collide(asBase));
	EXPECT_FALSE(a.Collide(apart));

	// The other shape decides, with this sphere handed over.
	Marker marker;
	EXPECT_FALSE(a.Collide(marker));
	EXPECT_TRUE(Sphere(Vector3<float>(0.0f, 0.0f, 0.0f), 2.0f).Collide(marker));
	EXPECT_EQ(marker.myCallCount, 2);

	// Boxes take part in no shape test: even a sphere inside one does not collide.
	const AABB<float> box = UnitBox();
	EXPECT_FALSE(a.Collide(box));
	EXPECT_FALSE(box.Collide(a));
	EXPECT_FALSE(box.CollideWithSphere(a));
}

TEST(IntersectionCollisionObject, PositionDefaultsAndOverrides)
{
	Marker marker;
	Intersection::CollisionObject& base = marker;
	base.SetPosition(Vector3<float>(1.0f, 2.0f, 3.0f));
	const Vector3<float> position = base.GetPosition();
	EXPECT_EQ(position.x, 0.0f);
	EXPECT_EQ(position.y, 0.0f);
	EXPECT_EQ(position.z, 0.0f);

	Sphere sphere(Vector3<float>(1.0f, 1.0f, 1.0f), 0.5f);
	Intersection::CollisionObject& asBase = sphere;
	asBase.SetPosition(Vector3<float>(4.0f, 5.0f, 6.0f));
	asBase.SetPreviousPosition(Vector3<float>(9.0f, 9.0f, 9.0f));
	EXPECT_EQ(asBase.GetPosition().y, 5.0f);
	EXPECT_EQ(sphere.myPosition.z, 6.0f);
	// Nothing overrides SetPreviousPosition, so it leaves the field alone.
	EXPECT_EQ(sphere.myPreviousPosition.x, 1.0f);

	Sphere copy;
	copy = sphere;
	EXPECT_EQ(copy.myPosition.x, 4.0f);
	EXPECT_EQ(copy.myPreviousPosition.x, 1.0f);
	EXPECT_EQ(copy.myRadius, 0.5f);
}
