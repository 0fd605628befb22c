// Picking and the selection queries of LumoraWrapper: a ray from the editor camera
// through the clicked pixel selects the nearest object of the current mode; the
// queries copy the selected light's or decal's values into the front end's records.
// None of this touches the handshake flags: it runs on the user-interface thread,
// which is also the only writer of the arrays it reads.
#include <algorithm>
#include <vector>

#include "core/AABB.h"
#include "core/Intersection.h"
#include "core/Matrix33.h"
#include "core/Ray.h"
#include "editor/LumoraWrapper.h"
#include "editor/StringConversion.h"
#include "engine/CameraInstance.h"
#include "engine/Engine.h"

namespace Lumora
{
namespace
{
// A decal is picked by a box of plus and minus its size across and this much along z,
// whatever its direction.
constexpr float ourDecalPickDepth = 0.5f;

// Whether the ray's line hits the box around aPosition; never when the camera stands inside it.
bool HitsBox(const Intersection::Ray<float>& aRay, const Vector3<float>& aPosition,
             const Vector3<float>& someHalfExtents)
{
	Intersection::AABB<float> box;
	box.myCenterPosition = aPosition;
	box.myExtents = someHalfExtents;
	box.myMinPos = aPosition - someHalfExtents;
	box.myMaxPos = aPosition + someHalfExtents;
	return !Intersection::PointInsideAABB(box, aRay.myOrigin) && Intersection::RayVsAABB(aRay, box);
}
} // namespace

std::vector<LumoraWrapper::PickHit> LumoraWrapper::PickAll(float aMouseX, float aMouseY) const
{
	// The click in normalised device coordinates, top edge y = 1, left edge x = -1.
	const Zeph::SetupInfo& setup = Zeph::Engine::GetInstance()->GetSetupInfo();
	const double width = static_cast<double>(setup.myWidth);
	const double height = static_cast<double>(setup.myHeight);
	const float x = static_cast<float>(2.0 * static_cast<double>(aMouseX) / width - 1.0);
	const float y = static_cast<float>(-(2.0 * static_cast<double>(aMouseY) / height - 1.0));

	// Through the projection's scale into camera space, then by the camera's rotation
	// into the world: x * right + y * up + forward.
	const float* projection = myCameraInstance->GetProjection().myMatrix;
	Vector3<float> direction(x / projection[0], y / projection[5], 1.0f);
	direction *= Matrix33<float>(myCameraInstance->GetActualOrientation());
	const Intersection::Ray<float> ray(myCameraInstance->GetPosition(), direction);

	// Candidates are measured from the camera to their centres, up to the far plane's square
	// (as picking always measured).
	const float farPlane = myCameraInstance->GetFarPlane();
	const float limit = farPlane * farPlane;
	std::vector<PickHit> hits;
	const auto take = [&](ObjectKind aKind, int anIndex, const Vector3<float>& aPosition) {
		const float distance = (aPosition - ray.myOrigin).LengthFast();
		if (distance < limit)
		{
			hits.push_back({aKind, anIndex, distance});
		}
	};

	const float half = myNodeHalfDimensions;
	const Vector3<float> markerHalfExtents(half, half, half);
	switch (myMode)
	{
	case LIGHT_MODE: {
		// A light is hit by its marker box or, when icons are shown, by its icon.
		const bool iconsFlag = myLightIconsFlag.load();
		const LightOverlays::View view =
		    LightOverlays::MakeView(*myCameraInstance, setup.myWidth, setup.myHeight);
		const auto hit = [&](const Vector3<float>& aPosition) {
			return HitsBox(ray, aPosition, markerHalfExtents) ||
			       (iconsFlag && LightOverlays::IconCovers(view, aPosition, aMouseX, aMouseY));
		};
		for (int index = 0; index < myEnvironmentPointLights.Count(); ++index)
		{
			if (hit(myEnvironmentPointLights[index].myPosition))
			{
				take(ObjectKind::POINT_LIGHT, index, myEnvironmentPointLights[index].myPosition);
			}
		}
		for (int index = 0; index < myEnvironmentSpotLights.Count(); ++index)
		{
			const Vector3<float> position = myEnvironmentSpotLights[index].myOrientation.GetPosition();
			if (hit(position))
			{
				take(ObjectKind::SPOT_LIGHT, index, position);
			}
		}
		break;
	}
	case NODE_MODE:
		for (int index = 0; index < myNodes.Count(); ++index)
		{
			if (HitsBox(ray, myNodes[index].GetPosition(), markerHalfExtents))
			{
				take(ObjectKind::PATH_NODE, index, myNodes[index].GetPosition());
			}
		}
		break;
	case DECAL_MODE:
		for (int index = 0; index < myDecals.Count(); ++index)
		{
			const Zeph::DecalData& decal = myDecals[index];
			if (HitsBox(ray, decal.myPosition, Vector3<float>(decal.mySize, decal.mySize, ourDecalPickDepth)))
			{
				take(ObjectKind::DECAL, index, decal.myPosition);
			}
		}
		break;
	default:
		// A mode outside the three picks nothing.
		break;
	}
	// Nearest first; of equal distance the one met first (point lights before spot lights,
	// lower indices first), as a click has always chosen.
	std::stable_sort(hits.begin(), hits.end(),
	                 [](const PickHit& a, const PickHit& b) { return a.myDistance < b.myDistance; });
	return hits;
}

void LumoraWrapper::DoIntersection(float aMouseX, float aMouseY)
{
	const std::vector<PickHit> hits = PickAll(aMouseX, aMouseY);
	ResetIndices();
	if (hits.empty())
	{
		return;
	}
	const PickHit& nearest = hits.front();
	switch (nearest.myKind)
	{
	case ObjectKind::POINT_LIGHT:
		myCurrentSelectedPoint = nearest.myIndex;
		break;
	case ObjectKind::SPOT_LIGHT:
		myCurrentSelectedSpot = nearest.myIndex;
		break;
	case ObjectKind::DECAL:
		myCurrentSelectedDecal = nearest.myIndex;
		break;
	case ObjectKind::PATH_NODE:
		myCurrentSelectedNode = nearest.myIndex;
		break;
	}
}

bool LumoraWrapper::TryGetCurrentPointLight(PointLightStruct& aPointLightRef) const
{
	if (myCurrentSelectedPoint == -1)
	{
		return false;
	}
	const Zeph::PointLightData& light = myEnvironmentPointLights[myCurrentSelectedPoint];
	aPointLightRef.pos = {light.myPosition.x, light.myPosition.y, light.myPosition.z};
	aPointLightRef.col = {light.myColor.x, light.myColor.y, light.myColor.z, light.myColor.w};
	aPointLightRef.falloff = light.myFalloff;
	return true;
}

bool LumoraWrapper::TryGetCurrentSpotLight(SpotLightStruct& aSpotLightRef) const
{
	if (myCurrentSelectedSpot == -1)
	{
		return false;
	}
	const Zeph::SpotLightData& light = myEnvironmentSpotLights[myCurrentSelectedSpot];
	const Vector3<float> position = light.myOrientation.GetPosition();
	const Vector3<float> direction = light.myOrientation.GetForward();
	aSpotLightRef.pos = {position.x, position.y, position.z};
	aSpotLightRef.col = {light.myColor.x, light.myColor.y, light.myColor.z, light.myColor.w};
	aSpotLightRef.falloff = light.myFalloff;
	aSpotLightRef.direction = {direction.x, direction.y, direction.z};
	aSpotLightRef.angles = {light.myAngles.x, light.myAngles.y};
	return true;
}

bool LumoraWrapper::TryGetCurrentDecal(DecalStruct& aDecalRef) const
{
	if (myCurrentSelectedDecal == -1)
	{
		return false;
	}
	const Zeph::DecalData& decal = myDecals[myCurrentSelectedDecal];
	aDecalRef.pos = {decal.myPosition.x, decal.myPosition.y, decal.myPosition.z};
	aDecalRef.col = {decal.myColor.x, decal.myColor.y, decal.myColor.z, decal.myColor.w};
	aDecalRef.size = decal.mySize;
	aDecalRef.depth = decal.myDepth;
	aDecalRef.direction = {decal.myNorm.x, decal.myNorm.y, decal.myNorm.z};
	aDecalRef.decalID = ToWide(decal.myTypeId);
	return true;
}
} // namespace Lumora
