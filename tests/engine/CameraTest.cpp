// The editor camera: fly-through moves, turning limits, the look-to view and the
// lens matrices, with the numbers the renderer and the bakes depend on.

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <numbers>

#include "core/Matrix44.h"
#include "core/Vector4.h"
#include "engine/Camera.h"
#include "engine/CameraInstance.h"

namespace
{
constexpr float ourTolerance = 1e-5f;

// Relative for large values (far-plane corners), absolute near zero.
float Tolerance(float anExpected)
{
	return ourTolerance * std::max(1.0f, std::abs(anExpected));
}

#define EXPECT_VEC3_NEAR(actual, ex, ey, ez)                                                                 \
	do                                                                                                       \
	{                                                                                                        \
		const Vector3<float> value = (actual);                                                               \
		EXPECT_NEAR(value.x, (ex), Tolerance(ex));                                                           \
		EXPECT_NEAR(value.y, (ey), Tolerance(ey));                                                           \
		EXPECT_NEAR(value.z, (ez), Tolerance(ez));                                                           \
	} while (false)

Vector3<float> Transform(const Vector3<float>& aPoint, const Matrix44<float>& aMatrix)
{
	return Vector3<float>(Vector4<float>(aPoint) * aMatrix);
}
} // namespace

TEST(CameraTest, NewCameraLooksAlongZFromFiveUnitsBack)
{
	Zeph::Camera lens(4.0f / 3.0f);
	Zeph::CameraInstance camera(&lens);

	EXPECT_VEC3_NEAR(camera.GetPosition(), 0.0f, 0.0f, 5.0f);
	EXPECT_VEC3_NEAR(camera.GetForward(), 0.0f, 0.0f, 1.0f);
	EXPECT_VEC3_NEAR(Transform(Vector3<float>(0.0f, 0.0f, 6.0f), camera.GetView()), 0.0f, 0.0f, 1.0f);
	// The orientation is the inverse of the view: camera space back to the world.
	EXPECT_VEC3_NEAR(Transform(Vector3<float>(0.0f, 0.0f, 1.0f), camera.GetActualOrientation()), 0.0f, 0.0f,
	                 6.0f);
	EXPECT_FLOAT_EQ(camera.GetFarPlane(), 1000.0f);

	camera.Move(2.0f);
	EXPECT_VEC3_NEAR(camera.GetPosition(), 0.0f, 0.0f, 7.0f);
	camera.Strafe(1.5f);
	EXPECT_VEC3_NEAR(camera.GetPosition(), 1.5f, 0.0f, 7.0f);
}

TEST(CameraTest, YawTurnsAboutUpAndPitchIsRefusedNearVertical)
{
	Zeph::Camera lens(1.0f);
	const float quarter = std::numbers::pi_v<float> / 2.0f;
	for (const float yaw : {quarter, -quarter})
	{
		Zeph::CameraInstance camera(&lens);
		camera.Yaw(yaw);
		EXPECT_VEC3_NEAR(camera.GetForward(), yaw > 0.0f ? -1.0f : 1.0f, 0.0f, 0.0f);
	}
	{
		Zeph::CameraInstance camera(&lens);
		camera.Pitch(1.0f);
		EXPECT_VEC3_NEAR(camera.GetForward(), 0.0f, std::sin(1.0f), std::cos(1.0f));
		// The camera keeps the world up; the view derives its tilted up axis from it.
		EXPECT_VEC3_NEAR(camera.GetUp(), 0.0f, 1.0f, 0.0f);
		EXPECT_VEC3_NEAR(camera.GetActualOrientation().GetUp(), 0.0f, std::cos(1.0f), -std::sin(1.0f));
		// A tilted camera strafes by the cosine of its pitch.
		camera.Strafe(1.0f);
		EXPECT_VEC3_NEAR(camera.GetPosition(), std::cos(1.0f), 0.0f, 5.0f);
	}
	{
		Zeph::CameraInstance camera(&lens);
		const Matrix44<float> viewBefore = camera.GetView();
		camera.Pitch(1.4f);
		EXPECT_VEC3_NEAR(camera.GetForward(), 0.0f, 0.0f, 1.0f);
		EXPECT_TRUE(std::equal(viewBefore.myMatrix, viewBefore.myMatrix + 16, camera.GetView().myMatrix));
		camera.Pitch(-1.4f);
		EXPECT_VEC3_NEAR(camera.GetForward(), 0.0f, 0.0f, 1.0f);
	}
}

TEST(CameraTest, SetOrientationAndLookToPlaceTheCamera)
{
	Zeph::Camera lens(1.0f);
	Zeph::CameraInstance camera(&lens);

	Matrix44<float> placed;
	placed.SetPosition(Vector3<float>(1.0f, 2.0f, 3.0f));
	camera.SetOrientation(placed);
	EXPECT_VEC3_NEAR(camera.GetForward(), 0.0f, 0.0f, 1.0f);
	EXPECT_VEC3_NEAR(camera.GetUp(), 0.0f, 1.0f, 0.0f);
	EXPECT_VEC3_NEAR(camera.GetPosition(), 1.0f, 2.0f, 3.0f);

	// A cube-face camera: looking down -Y with +Z as up, from (4, 5, 6).
	camera.LookTo(Vector3<float>(4.0f, 5.0f, 6.0f), Vector3<float>(0.0f, -2.0f, 0.0f),
	              Vector3<float>(0.0f, 0.0f, 1.0f));
	EXPECT_VEC3_NEAR(camera.GetForward(), 0.0f, -1.0f, 0.0f);
	EXPECT_VEC3_NEAR(camera.GetUp(), 0.0f, 0.0f, 1.0f);
	EXPECT_VEC3_NEAR(camera.GetPosition(), 4.0f, 5.0f, 6.0f);
	EXPECT_VEC3_NEAR(Transform(Vector3<float>(4.0f, 2.0f, 6.0f), camera.GetView()), 0.0f, 0.0f, 3.0f);
	// Right = up x forward = (1, 0, 0): a point to the +X side is to the right.
	EXPECT_VEC3_NEAR(Transform(Vector3<float>(5.0f, 5.0f, 6.0f), camera.GetView()), 1.0f, 0.0f, 0.0f);

	camera.StorePreviousView();
	const Matrix44<float> stored = camera.GetView();
	camera.Move(1.0f);
	EXPECT_EQ(camera.GetPreviousView().myMatrix[13], stored.myMatrix[13]);
	EXPECT_NE(camera.GetView().myMatrix[14], stored.myMatrix[14]);
}

TEST(CameraTest, ProjectionMapsNearAndFarToZeroAndOne)
{
	Zeph::Camera lens(2.0f);
	Zeph::CameraInstance camera(&lens);
	camera.SetProjection(std::numbers::pi_v<float> / 2.0f, 2.0f, 1.0f, 101.0f);

	const Matrix44<float>& projection = camera.GetProjection();
	EXPECT_NEAR(projection.myMatrix[0], 0.5f, ourTolerance);
	EXPECT_NEAR(projection.myMatrix[5], 1.0f, ourTolerance);
	EXPECT_FLOAT_EQ(projection.myMatrix[11], 1.0f);
	EXPECT_FLOAT_EQ(projection.myMatrix[15], 0.0f);
	const auto depthAt = [&projection](float aZ) {
		const Vector4<float> clip = Vector4<float>(0.0f, 0.0f, aZ, 1.0f) * projection;
		return clip.z / clip.w;
	};
	EXPECT_NEAR(depthAt(1.0f), 0.0f, ourTolerance);
	EXPECT_NEAR(depthAt(101.0f), 1.0f, ourTolerance);
	EXPECT_FLOAT_EQ(lens.GetFarPlane(), 101.0f);
	EXPECT_FLOAT_EQ(camera.GetFarPlane(), 101.0f);

	// Far corners: h = far * tan(fov / 2) = 101, w = 2h, z = -far, in corner order.
	const Vector3<float>* corners = camera.GetFarCorners();
	EXPECT_VEC3_NEAR(corners[0], 202.0f, -101.0f, -101.0f);
	EXPECT_VEC3_NEAR(corners[1], -202.0f, -101.0f, -101.0f);
	EXPECT_VEC3_NEAR(corners[2], -202.0f, 101.0f, -101.0f);
	EXPECT_VEC3_NEAR(corners[3], 202.0f, 101.0f, -101.0f);
}
