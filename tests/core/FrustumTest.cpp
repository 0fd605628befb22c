// The view frustum from a view-projection matrix: spheres wholly outside a plane are
// culled, spheres touching the view are kept, whatever the depth range convention.
#include "core/Frustum.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <iterator>

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
	// Turned cameras (a view before the projection) are the probe faces of the ambient bake, whose
	// culling must leave its volume unchanged (AmbientBakeTest).
	Matrix44<float> zero;
	std::fill(std::begin(zero.myMatrix), std::end(zero.myMatrix), 0.0f);
	const Matrix44<float> ahead = Perspective(0.1f, 100.0f); // the camera at the origin looking along +z
	const struct
	{
		const char* myName;
		Matrix44<float> myViewProjection;
		V3 myCenter;
		float myRadius;
		bool myOutsideFlag;
	} cases[] = {
	    {"behind", ahead, V3(0.0f, 0.0f, -10.0f), 1.0f, true},
	    {"0.71 from the side plane x = z", ahead, V3(11.0f, 0.0f, 10.0f), 1.0f, false},
	    {"1.06 from the side plane", ahead, V3(11.5f, 0.0f, 10.0f), 1.0f, true},
	    {"beyond the far plane", ahead, V3(0.0f, 0.0f, 102.0f), 1.0f, true},
	    {"across the far plane", ahead, V3(0.0f, 0.0f, 100.5f), 1.0f, false},
	    {"around the camera", ahead, V3(0.0f, 0.0f, -0.5f), 1.0f, false},
	    {"a broken matrix culls nothing", zero, V3(1000.0f, -1000.0f, 5.0f), 0.0f, false},
	};
	for (const auto& test : cases)
	{
		Intersection::Frustum frustum;
		frustum.Init(test.myViewProjection);
		EXPECT_EQ(frustum.IsSphereOutside(test.myCenter, test.myRadius), test.myOutsideFlag) << test.myName;
	}
}
