#include "engine/Camera.h"

namespace Zeph
{
Camera::Camera(float anAspectRatio)
    : myFov(0.7853982f), myNearPlane(0.1f), myFarPlane(1000.0f), myAspectRatio(anAspectRatio)
{
}

void Camera::SetLens(float aFov, float anAspectRatio, float aNearPlane, float aFarPlane)
{
	myFov = aFov;
	myAspectRatio = anAspectRatio;
	myNearPlane = aNearPlane;
	myFarPlane = aFarPlane;
}
} // namespace Zeph
