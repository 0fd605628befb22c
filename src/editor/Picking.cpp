// Picking and the selection queries of LumoraWrapper: a ray from the editor camera
// through the clicked pixel selects the nearest object of the current mode; the
// queries copy the selected light's or decal's values into the front end's records.
// None of this touches the handshake flags: it runs on the user-interface thread,
// which is also the only writer of the arrays it reads.
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

// Tests one candidate: its box around aPosition, skipped when the camera stands inside
// it; accepted when the ray's line hits the box and the centre lies strictly nearer
// than aLimitInOut (a squared distance), which then becomes the new limit. Strict
// comparison keeps the earlier candidate on a tie.
bool TakeIfNearer(const Intersection::Ray<float>& aRay, const Vector3<float>& aPosition,
                  const Vector3<float>& someHalfExtents, float& aLimitInOut)
{
	Intersection::AABB<float> box;
	box.myCenterPosition = aPosition;
	box.myExtents = someHalfExtents;
	box.myMinPos = aPosition - someHalfExtents;
	box.myMaxPos = aPosition + someHalfExtents;
	if (Intersection::PointInsideAABB(box, aRay.myOrigin))
	{
		return false;
	}
	if (!Intersection::RayVsAABB(aRay, box))
	{
		return false;
	}
	const float distance = (aPosition - aRay.myOrigin).LengthFast();
	if (!(distance < aLimitInOut))
	{
		return false;
	}
	aLimitInOut = distance;
	return true;
}

// The same for a light icon: accepted when the icon covers the pixel and the light lies
// strictly nearer than aLimitInOut, which then becomes the new limit.
bool TakeIconIfNearer(const LightOverlays::View& aView, const Intersection::Ray<float>& aRay,
                      const Vector3<float>& aPosition, float aMouseX, float aMouseY, float& aLimitInOut)
{
	if (!LightOverlays::IconCovers(aView, aPosition, aMouseX, aMouseY))
	{
		return false;
	}
	const float distance = (aPosition - aRay.myOrigin).LengthFast();
	if (!(distance < aLimitInOut))
	{
		return false;
	}
	aLimitInOut = distance;
	return true;
}
} // namespace

void LumoraWrapper::DoIntersection(float aMouseX, float aMouseY)
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

	const float farPlane = myCameraInstance->GetFarPlane();
	float limit = farPlane * farPlane;
	ResetIndices();

	const float half = myNodeHalfDimensions;
	const Vector3<float> markerHalfExtents(half, half, half);
	switch (myMode)
	{
	case LIGHT_MODE: {
		// A light is hit by its marker box or, when icons are shown, by its icon; point and
		// spot lights share one limit, so the nearest light of either kind wins.
		const bool iconsFlag = myLightIconsFlag.load();
		const LightOverlays::View view =
		    LightOverlays::MakeView(*myCameraInstance, setup.myWidth, setup.myHeight);
		const auto hit = [&](const Vector3<float>& aPosition) {
			return TakeIfNearer(ray, aPosition, markerHalfExtents, limit) ||
			       (iconsFlag && TakeIconIfNearer(view, ray, aPosition, aMouseX, aMouseY, limit));
		};
		for (int index = 0; index < myEnvironmentPointLights.Count(); ++index)
		{
			if (hit(myEnvironmentPointLights[index].myPosition))
			{
				myCurrentSelectedPoint = index;
			}
		}
		for (int index = 0; index < myEnvironmentSpotLights.Count(); ++index)
		{
			if (hit(myEnvironmentSpotLights[index].myOrientation.GetPosition()))
			{
				myCurrentSelectedSpot = index;
			}
		}
		// A spot light taken after a point light was nearer: only one light stays selected.
		if (myCurrentSelectedSpot != -1)
		{
			myCurrentSelectedPoint = -1;
		}
		break;
	}
	case NODE_MODE:
		for (int index = 0; index < myNodes.Count(); ++index)
		{
			if (TakeIfNearer(ray, myNodes[index].GetPosition(), markerHalfExtents, limit))
			{
				myCurrentSelectedNode = index;
			}
		}
		break;
	case DECAL_MODE:
		for (int index = 0; index < myDecals.Count(); ++index)
		{
			const Zeph::DecalData& decal = myDecals[index];
			const Vector3<float> halfExtents(decal.mySize, decal.mySize, ourDecalPickDepth);
			if (TakeIfNearer(ray, decal.myPosition, halfExtents, limit))
			{
				myCurrentSelectedDecal = index;
			}
		}
		break;
	default:
		// A mode outside the three picks nothing.
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
