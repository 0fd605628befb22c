#include "view/FlyCamera.h"

#include <algorithm>

namespace LumoraEditor
{
void FlyCamera::SetSpeed(float aSpeed)
{
	mySpeed = std::clamp(aSpeed, 0.1f, 500.0f);
}

void FlyCamera::Look(float aDx, float aDy)
{
	// Yaw turns the view toward -x as it grows (left-handed, y up), so a move to the right
	// lowers it.
	myPlacement.myYaw -= aDx * ourLookSpeed;
	myPlacement.myPitch = std::clamp(myPlacement.myPitch + aDy * ourLookSpeed, -ourPitchLimit, ourPitchLimit);
}

void FlyCamera::Fly(const FlyKeys& someKeys, float aSeconds)
{
	const float step = mySpeed * aSeconds * (someKeys.myFastFlag ? ourFastFactor : 1.0f);
	const auto forward = myPlacement.Forward();
	const auto right = myPlacement.Right();
	const float along = (someKeys.myForwardFlag ? 1.0f : 0.0f) - (someKeys.myBackFlag ? 1.0f : 0.0f);
	const float across = (someKeys.myRightFlag ? 1.0f : 0.0f) - (someKeys.myLeftFlag ? 1.0f : 0.0f);
	const float rise = (someKeys.myUpFlag ? 1.0f : 0.0f) - (someKeys.myDownFlag ? 1.0f : 0.0f);
	for (int axis = 0; axis < 3; ++axis)
	{
		myPlacement.myPosition[axis] += step * (forward[axis] * along + right[axis] * across);
	}
	myPlacement.myPosition[1] += step * rise;
}

void FlyCamera::Wheel(float aSteps, bool aFastFlag)
{
	FlyKeys keys;
	keys.myForwardFlag = aSteps > 0.0f;
	keys.myBackFlag = aSteps < 0.0f;
	keys.myFastFlag = aFastFlag;
	Fly(keys, 0.2f * std::abs(aSteps));
}

void FlyCamera::Frame(const std::array<float, 3>& aTarget, float aDistance)
{
	const auto forward = myPlacement.Forward();
	for (int axis = 0; axis < 3; ++axis)
	{
		myPlacement.myPosition[axis] = aTarget[axis] - forward[axis] * aDistance;
	}
}
} // namespace LumoraEditor
