#include "engine/Camera.h"

#include "engine/Engine.h"

namespace Zeph
{
namespace
{
float EngineAspectRatio()
{
	const Engine* engine = Engine::GetInstance();
	const SetupInfo setupInfo = engine != nullptr ? engine->GetSetupInfo() : SetupInfo();
	return setupInfo.myHeight != 0
	           ? static_cast<float>(setupInfo.myWidth) / static_cast<float>(setupInfo.myHeight)
	           : 1.0f;
}
} // namespace

Camera::Camera() : Camera(EngineAspectRatio())
{
}

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
