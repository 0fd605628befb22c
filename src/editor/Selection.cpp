// The facade's selection by kind and index, and absolute placement of the selection: what
// an outliner and a properties panel need beside picking in the view and relative moves.
#include <atomic>
#include <cmath>

#include "editor/LumoraWrapper.h"

namespace Lumora
{
bool LumoraWrapper::Select(ObjectKind aKind, int anIndex)
{
	Claim();
	// Per kind, in ObjectKind's order: its count, its mode and its selection.
	const struct
	{
		int myCount;
		LumoraMode myMode;
		std::atomic<int>& mySelection;
	} kinds[] = {
	    {myEnvironmentPointLights.Count(), LIGHT_MODE, myCurrentSelectedPoint},
	    {myEnvironmentSpotLights.Count(), LIGHT_MODE, myCurrentSelectedSpot},
	    {myDecals.Count(), DECAL_MODE, myCurrentSelectedDecal},
	    {myNodes.Count(), NODE_MODE, myCurrentSelectedNode},
	};
	const auto& kind = kinds[static_cast<int>(aKind)];
	const bool validFlag = anIndex >= -1 && anIndex < kind.myCount;
	if (validFlag)
	{
		ResetIndices();
		myMode = kind.myMode;
		kind.mySelection = anIndex;
	}
	Release();
	return validFlag;
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
