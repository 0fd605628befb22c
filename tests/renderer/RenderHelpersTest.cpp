// The decal box's world matrix without a GPU: the floor and the long direction are in no
// golden image (the wall decal is). The fitted shadow caster (looking straight down by
// default, and aslant) and the light volumes are in every lit golden frame and the
// frame tests' measured cones.
#include <gmock/gmock-matchers.h>
#include <gtest/gtest.h>

#include "renderer/DecalData.h"
#include "renderer/DecalMeshRenderTargetHelper.h"

using testing::FloatNear;
using testing::Pointwise;

TEST(DecalWorldTest, RowsFollowTheProjectionDirection)
{
	struct Case
	{
		const char* myWhat;
		Vector3<float> myNorm;
		Vector3<float> myRight;
		Vector3<float> myUp;
	};
	const Case cases[] = {
	    // A wall: right = (0,1,0) x norm, up = norm x right.
	    {"wall facing +x", {1.0f, 0.0f, 0.0f}, {0.0f, 0.0f, -1.0f}, {0.0f, 1.0f, 0.0f}},
	    // Vertical: the helper axis becomes +z.
	    {"floor", {0.0f, 1.0f, 0.0f}, {-1.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 1.0f}},
	    // The rows are not normalised: a direction of length 2 gives rows 2 and 4 long.
	    {"long direction", {0.0f, 0.0f, -2.0f}, {-2.0f, 0.0f, 0.0f}, {0.0f, 4.0f, 0.0f}},
	};
	for (const Case& test : cases)
	{
		Zeph::DecalData decal;
		decal.mySize = 2.0f;
		decal.myDepth = 0.5f;
		decal.myPosition = Vector3<float>(1.0f, 2.0f, 3.0f);
		decal.myNorm = test.myNorm;
		const Vector3<float> right = test.myRight * 2.0f;
		const Vector3<float> up = test.myUp * 2.0f;
		const Vector3<float> depth = test.myNorm * 0.5f;
		const float expected[16] = {right.x, right.y, right.z, 0.0f, up.x, up.y, up.z, 0.0f,
		                            depth.x, depth.y, depth.z, 0.0f, 1.0f, 2.0f, 3.0f, 1.0f};
		EXPECT_THAT(Zeph::DecalMeshRenderTargetHelper::BuildWorld(decal).myMatrix,
		            Pointwise(FloatNear(1e-5f), expected))
		    << test.myWhat;
	}
}
