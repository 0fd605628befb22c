#include "engine/CameraInstance.h"

#include <cmath>

#include "core/LookTo.h"
#include "core/Matrix33.h"
#include "engine/Camera.h"

namespace Zeph
{
namespace
{
// A pitch that would bring the view closer than this to straight up or down is
// refused whole: the look-to basis degenerates as forward approaches the world up.
constexpr float ourPitchLimit = 0.96f;
} // namespace

CameraInstance::CameraInstance(Camera* aCamera)
    : myCamera(aCamera), myPosition(0.0f, 0.0f, 5.0f), myForward(0.0f, 0.0f, 1.0f), myUp(0.0f, 1.0f, 0.0f)
{
	BuildProjection();
	UpdateMatrices();
}

void CameraInstance::SetPosition(const Vector3<float>& aPosition)
{
	myPosition = aPosition;
	UpdateMatrices();
}

void CameraInstance::SetOrientation(const Matrix44<float>& anOrientation)
{
	myUp = anOrientation.GetUp();
	myForward = anOrientation.GetForward();
	myPosition = anOrientation.GetPosition();
	UpdateMatrices();
}

float CameraInstance::GetFarPlane() const
{
	return myCamera->GetFarPlane();
}

void CameraInstance::Move(float aDistance)
{
	myPosition += myForward * aDistance;
	UpdateMatrices();
}

void CameraInstance::Strafe(float aDistance)
{
	// Not normalised: with the world up its length is the cosine of the pitch, so a
	// tilted camera strafes more slowly.
	myPosition += myUp.Cross(myForward) * aDistance;
	UpdateMatrices();
}

Matrix44<float> CameraInstance::TurnedOrientation(const Matrix44<float>& aRotation) const
{
	Matrix44<float> turned = myOrientation;
	turned *= aRotation.Get33();
	return turned;
}

void CameraInstance::Yaw(float anAngle)
{
	myForward = TurnedOrientation(Matrix44<float>::CreateRotateAroundY(anAngle)).GetForward();
	myUp.Set(0.0f, 1.0f, 0.0f);
	UpdateMatrices();
}

void CameraInstance::Pitch(float anAngle)
{
	const Vector3<float> forward =
	    TurnedOrientation(Matrix44<float>::CreateRotateAroundX(anAngle)).GetForward();
	// Written as "not inside" so that a NaN direction is refused too.
	if (!(forward.y >= -ourPitchLimit && forward.y <= ourPitchLimit))
	{
		return;
	}
	myUp.Set(0.0f, 1.0f, 0.0f);
	myForward = forward;
	UpdateMatrices();
}

void CameraInstance::SetProjection(float aFov, float anAspectRatio, float aNearPlane, float aFarPlane)
{
	myCamera->SetLens(aFov, anAspectRatio, aNearPlane, aFarPlane);
	BuildProjection();
	UpdateMatrices();
}

void CameraInstance::LookTo(const Vector3<float>& aPosition, const Vector3<float>& aDirection,
                            const Vector3<float>& anUp)
{
	myUp = anUp;
	myPosition = aPosition;
	myView = CreateLookToLH(aPosition, aDirection, anUp);
	myOrientation = myView.Inverse();
	myUp = myOrientation.GetUp();
	myForward = myOrientation.GetForward();
	UpdateMatrices();
}

void CameraInstance::BuildProjection()
{
	const float fov = myCamera->GetFov();
	const float aspect = myCamera->GetAspectRatio();
	const float nearPlane = myCamera->GetNearPlane();
	const float farPlane = myCamera->GetFarPlane();

	const float halfFov = fov * 0.5f;
	const float ys = std::cos(halfFov) / std::sin(halfFov);
	const float xs = ys / aspect;
	float* m = myProjection.myMatrix;
	for (int i = 0; i < 16; ++i)
	{
		m[i] = 0.0f;
	}
	m[0] = xs;
	m[5] = ys;
	m[10] = farPlane / (farPlane - nearPlane);
	m[11] = 1.0f;
	m[14] = -nearPlane * farPlane / (farPlane - nearPlane);

	// The corners' z is -far although the view looks along +z: the full-screen
	// passes that rebuild view-space positions from them expect that sign.
	const float h = farPlane * std::tan(halfFov);
	const float w = h * aspect;
	myFarCorners[0].Set(w, -h, -farPlane);
	myFarCorners[1].Set(-w, -h, -farPlane);
	myFarCorners[2].Set(-w, h, -farPlane);
	myFarCorners[3].Set(w, h, -farPlane);
}

void CameraInstance::UpdateMatrices()
{
	myForward.Normalize();
	myUp.Normalize();
	myView = CreateLookToLH(myPosition, (myPosition + myForward) - myPosition, myUp);
	myOrientation = myView.Inverse();
}
} // namespace Zeph
