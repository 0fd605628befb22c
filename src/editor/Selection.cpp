// The facade's selection by kind and index, and absolute placement of the selection: what
// an outliner and a properties panel need beside picking in the view and relative moves.
#include <cmath>

#include "editor/LumoraWrapper.h"

namespace Lumora
{
bool LumoraWrapper::Select(ObjectKind aKind, int anIndex)
{
	Claim();
	const int counts[] = {myEnvironmentPointLights.Count(), myEnvironmentSpotLights.Count(), myDecals.Count(),
	                      myNodes.Count()};
	const int count = counts[static_cast<int>(aKind)];
	if (anIndex < -1 || anIndex >= count)
	{
		Release();
		return false;
	}
	ResetIndices();
	switch (aKind)
	{
	case ObjectKind::POINT_LIGHT:
		myMode = LIGHT_MODE;
		myCurrentSelectedPoint = anIndex;
		break;
	case ObjectKind::SPOT_LIGHT:
		myMode = LIGHT_MODE;
		myCurrentSelectedSpot = anIndex;
		break;
	case ObjectKind::DECAL:
		myMode = DECAL_MODE;
		myCurrentSelectedDecal = anIndex;
		break;
	case ObjectKind::PATH_NODE:
		myMode = NODE_MODE;
		myCurrentSelectedNode = anIndex;
		break;
	}
	Release();
	return true;
}

bool LumoraWrapper::SetSelectedPosition(const Vector3<float>& aPosition)
{
	if (!std::isfinite(aPosition.x) || !std::isfinite(aPosition.y) || !std::isfinite(aPosition.z))
	{
		return false;
	}
	return PlaceSelected([&aPosition](const Vector3<float>&) { return aPosition; }, true);
}

bool LumoraWrapper::SetSelectedDirection(const Vector3<float>& aDirection)
{
	const float length = aDirection.Length();
	if (!std::isfinite(length) || length <= 0.0f)
	{
		return false;
	}
	const Vector3<float> forward = aDirection * (1.0f / length);
	Claim();
	bool doneFlag = true;
	if (myMode == LIGHT_MODE && myCurrentSelectedSpot != -1)
	{
		Matrix44<float>& orientation = myEnvironmentSpotLights[myCurrentSelectedSpot].myOrientation;
		// A unit basis around the new axis (the light is round about it, so its roll is free):
		// world up as the helper axis, or world z for a light pointing (nearly) straight up
		// or down.
		const Vector3<float> helper = std::abs(forward.y) > 0.999f ? Vector3<float>(0.0f, 0.0f, 1.0f)
		                                                           : Vector3<float>(0.0f, 1.0f, 0.0f);
		// Rows as a new light has them: forward = right x up.
		Vector3<float> right = helper.Cross(forward);
		right *= 1.0f / right.Length();
		const Vector3<float> position = orientation.GetPosition();
		orientation.SetRotation(forward, forward.Cross(right), right);
		orientation.SetPosition(position);
	}
	else if (myMode == DECAL_MODE && myCurrentSelectedDecal != -1)
	{
		Vector3<float>& direction = myDecals[myCurrentSelectedDecal].myNorm;
		direction = forward * direction.Length();
	}
	else
	{
		doneFlag = false;
	}
	Release();
	return doneFlag;
}
} // namespace Lumora
