// The view frustum from a view-projection matrix: spheres wholly outside a plane are
// culled, spheres touching the view are kept, whatever the depth range convention.
#include "core/Frustum.h"

#include <gtest/gtest.h>

#include <cmath>

using V3 = Vector3<float>;

namespace
{
// A left-handed perspective with a 90 degree field of view, depth 0..1 (row vectors).
Matrix44<float> Perspective(float aNear, float aFar)
{
	Matrix44<float> projection;
	projection.myMatrix[0] = 1.0f;
	projection.myMatrix[5] = 1.0f;
	projection.myMatrix[10] = aFar / (aFar - aNear);
	projection.myMatrix[11] = 1.0f;
	projection.myMatrix[14] = -aNear * aFar / (aFar - aNear);
	projection.myMatrix[15] = 0.0f;
	return projection;
}
} // namespace

TEST(FrustumTest, SpheresOutsideAPlaneAreCulledAndThoseTouchingTheViewKept)
{
	Intersection::Frustum frustum;
	frustum.Init(Perspective(0.1f, 100.0f)); // the camera at the origin looking along +z
	EXPECT_FALSE(frustum.IsSphereOutside(V3(0.0f, 0.0f, 10.0f), 1.0f)) << "straight ahead";
	EXPECT_TRUE(frustum.IsSphereOutside(V3(0.0f, 0.0f, -10.0f), 1.0f)) << "behind";
	EXPECT_TRUE(frustum.IsSphereOutside(V3(20.0f, 0.0f, 10.0f), 1.0f)) << "right of the 45 degree side";
	EXPECT_TRUE(frustum.IsSphereOutside(V3(0.0f, -20.0f, 10.0f), 1.0f)) << "below";
	// 0.71 from the side plane x = z, radius 1: it reaches into the view.
	EXPECT_FALSE(frustum.IsSphereOutside(V3(11.0f, 0.0f, 10.0f), 1.0f));
	EXPECT_TRUE(frustum.IsSphereOutside(V3(11.5f, 0.0f, 10.0f), 1.0f));
	EXPECT_TRUE(frustum.IsSphereOutside(V3(0.0f, 0.0f, 102.0f), 1.0f)) << "beyond the far plane";
	EXPECT_FALSE(frustum.IsSphereOutside(V3(0.0f, 0.0f, 100.5f), 1.0f)) << "across the far plane";
	// A sphere around the camera is always seen.
	EXPECT_FALSE(frustum.IsSphereOutside(V3(0.0f, 0.0f, -0.5f), 1.0f));
}

TEST(FrustumTest, FollowsTheViewAndCullsNothingForABrokenMatrix)
{
	// The camera at x = 5 turned to look along -x (its forward row is (-1, 0, 0)): the
	// view is the inverse of its world.
	Matrix44<float> world = Matrix44<float>::CreateRotateAroundY(static_cast<float>(M_PI / 2.0));
	world.SetPosition(V3(5.0f, 0.0f, 0.0f));
	Intersection::Frustum frustum;
	frustum.Init(world.Inverse() * Perspective(0.1f, 100.0f));
	EXPECT_FALSE(frustum.IsSphereOutside(V3(-5.0f, 0.0f, 0.0f), 0.5f)) << "ahead, along -x";
	EXPECT_TRUE(frustum.IsSphereOutside(V3(15.0f, 0.0f, 0.0f), 0.5f)) << "behind, along +x";
	EXPECT_TRUE(frustum.IsSphereOutside(V3(5.0f, 0.0f, 10.0f), 0.5f)) << "to the side";

	Matrix44<float> zero;
	for (float& value : zero.myMatrix)
	{
		value = 0.0f;
	}
	frustum.Init(zero);
	EXPECT_FALSE(frustum.IsSphereOutside(V3(1000.0f, -1000.0f, 5.0f), 0.0f));
}
