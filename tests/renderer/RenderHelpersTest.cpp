// The geometry of the frame's passes without a GPU: the decal box's world matrix,
// the fitted shadow caster and the light volumes' transforms.
#include <algorithm>
#include <cmath>
#include <gtest/gtest.h>

#include "engine/Camera.h"
#include "engine/CameraInstance.h"
#include "renderer/DecalData.h"
#include "renderer/DecalMeshRenderTargetHelper.h"
#include "renderer/LightVolumes.h"
#include "renderer/PointLightData.h"
#include "renderer/ShadowRenderTargetHelper.h"
#include "renderer/SpotLightData.h"

namespace
{
void ExpectRow(const Matrix44<float>& aMatrix, int aRow, float anX, float aY, float aZ, const char* aWhat)
{
	EXPECT_NEAR(aMatrix.myMatrix[aRow * 4 + 0], anX, 1e-5f) << aWhat << " row " << aRow;
	EXPECT_NEAR(aMatrix.myMatrix[aRow * 4 + 1], aY, 1e-5f) << aWhat << " row " << aRow;
	EXPECT_NEAR(aMatrix.myMatrix[aRow * 4 + 2], aZ, 1e-5f) << aWhat << " row " << aRow;
}
} // namespace

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
	    // A wall facing the camera: right = (0,1,0) x norm, up = norm x right.
	    {"wall facing -z", {0.0f, 0.0f, -1.0f}, {-1.0f, 0.0f, 0.0f}, {0.0f, 1.0f, 0.0f}},
	    {"wall facing +x", {1.0f, 0.0f, 0.0f}, {0.0f, 0.0f, -1.0f}, {0.0f, 1.0f, 0.0f}},
	    // Vertical: the helper axis becomes +z.
	    {"floor", {0.0f, 1.0f, 0.0f}, {-1.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 1.0f}},
	    {"ceiling", {0.0f, -1.0f, 0.0f}, {1.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 1.0f}},
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
		const Matrix44<float> world = Zeph::DecalMeshRenderTargetHelper::BuildWorld(decal);
		ExpectRow(world, 0, test.myRight.x * 2.0f, test.myRight.y * 2.0f, test.myRight.z * 2.0f, test.myWhat);
		ExpectRow(world, 1, test.myUp.x * 2.0f, test.myUp.y * 2.0f, test.myUp.z * 2.0f, test.myWhat);
		ExpectRow(world, 2, test.myNorm.x * 0.5f, test.myNorm.y * 0.5f, test.myNorm.z * 0.5f, test.myWhat);
		ExpectRow(world, 3, 1.0f, 2.0f, 3.0f, test.myWhat);
	}
}

TEST(ShadowCasterTest, FittedProjectionEnclosesTheViewersBoxExactly)
{
	Zeph::Camera lens(16.0f / 9.0f);
	Zeph::CameraInstance camera(&lens);
	camera.SetPosition({4.0f, 3.0f, -7.0f});
	camera.Yaw(0.7f);
	camera.Pitch(-0.3f);
	for (const Vector3<float>& direction :
	     {Vector3<float>(0.0f, 1.0f, 0.0f), Vector3<float>(0.0f, -1.0f, 0.0f),
	      Vector3<float>(0.4f, -0.8f, 0.3f)})
	{
		const Matrix44<float> casterViewProjection = Zeph::ShadowRenderTargetHelper::FitCaster(
		    direction, camera.GetActualOrientation(), 0.0025f, 25.0f);
		float low[3] = {10.0f, 10.0f, 10.0f};
		float high[3] = {-10.0f, -10.0f, -10.0f};
		for (int corner = 0; corner < 8; ++corner)
		{
			const Vector4<float> local((corner & 1) != 0 ? 25.0f : -25.0f, (corner & 2) != 0 ? 25.0f : -25.0f,
			                           (corner & 4) != 0 ? 25.0f : 0.0025f, 1.0f);
			const Vector4<float> clip = local * camera.GetActualOrientation() * casterViewProjection;
			EXPECT_NEAR(clip.w, 1.0f, 1e-5f) << "the caster is orthographic";
			const float coordinates[3] = {clip.x, clip.y, clip.z};
			for (int axis = 0; axis < 3; ++axis)
			{
				low[axis] = std::min(low[axis], coordinates[axis]);
				high[axis] = std::max(high[axis], coordinates[axis]);
			}
		}
		// The box touches every side of the caster's clip volume: x, y in -1..1, depth 0..1.
		for (int axis = 0; axis < 3; ++axis)
		{
			EXPECT_NEAR(low[axis], axis < 2 ? -1.0f : 0.0f, 1e-3f) << axis;
			EXPECT_NEAR(high[axis], 1.0f, 1e-3f) << axis;
		}
		// Depth grows along the caster direction: a point further along it is deeper.
		const Vector4<float> near(0.0f, 0.0f, 0.0f, 1.0f);
		const Vector4<float> far(direction.x, direction.y, direction.z, 1.0f);
		EXPECT_LT((near * casterViewProjection).z, (far * casterViewProjection).z);
	}
}

TEST(LightVolumeTest, VolumesCoverTheLightsReach)
{
	Zeph::PointLightData point;
	point.myFalloff = 2.5f;
	point.myPosition = Vector3<float>(1.0f, -2.0f, 3.0f);
	const Matrix44<float> world = Zeph::LightVolumes::PointLightWorld(point);
	ExpectRow(world, 0, 3.0f, 0.0f, 0.0f, "point");
	ExpectRow(world, 2, 0.0f, 0.0f, 3.0f, "point");
	ExpectRow(world, 3, 1.0f, -2.0f, 3.0f, "point");

	Zeph::SpotLightData spot;
	spot.myFalloff = 2.0f;
	spot.myAngles = Vector2<float>(0.9f, 0.7f);
	const Matrix44<float> scale = Zeph::LightVolumes::SpotLightScale(spot);
	const float radius = std::tan(std::acos(0.7f)) * 2.0f * 1.1f;
	ExpectRow(scale, 0, radius, 0.0f, 0.0f, "spot");
	ExpectRow(scale, 1, 0.0f, radius, 0.0f, "spot");
	ExpectRow(scale, 2, 0.0f, 0.0f, 2.0f, "spot");
}
