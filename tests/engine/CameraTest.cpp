// The editor camera: turning limits, the previous view and the lens, with the numbers the
// bakes depend on. The start pose and the fly-through moves are the editor's tests (the
// info line's position, picking after turns and moves) and every rendered frame's.

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

} // namespace

TEST(CameraTest, PitchTiltsTheViewAboutTheWorldUpAndIsRefusedNearVertical)
{
	Zeph::Camera lens(1.0f);
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

// The cube-face cameras of LookTo are the reflection bake's (its faces are checked there).
TEST(CameraTest, ThePreviousViewIsKeptWhenTheCameraMoves)
{
	Zeph::Camera lens(1.0f);
	Zeph::CameraInstance camera(&lens);

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
