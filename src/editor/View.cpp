// The facade's view: the size it draws at, where the camera stands and where it draws a
// point, and the light icons and wires drawn over the frame.
#include <algorithm>
#include <cmath>

#include "editor/LumoraWrapper.h"
#include "engine/Camera.h"
#include "engine/CameraInstance.h"
#include "engine/Engine.h"
#include "renderer/Renderer.h"

namespace Lumora
{
namespace
{
// The opacity of the wires of lights other than the selected one (LightVolumes::ALL), so
// that the selection's stands out among them.
constexpr float ourOtherWireOpacity = 0.55f;
} // namespace

bool LumoraWrapper::Resize(int aWidth, int aHeight)
{
	// Only this thread changes the size, so the test needs no claim.
	if (aWidth == myWidth.load() && aHeight == myHeight.load())
	{
		return true;
	}
	ClaimAfterTheFrame();
	Zeph::Engine* engine = Zeph::Engine::GetInstance();
	const bool resizedFlag = engine->Resize(aWidth, aHeight);
	if (resizedFlag)
	{
		myWidth = aWidth;
		myHeight = aHeight;
		// The lens keeps its field of view and planes; its aspect follows the view. The
		// full-screen passes' view rays follow at once, the collector's camera with the next Update.
		myCameraInstance->SetProjection(myCamera->GetFov(),
		                                static_cast<float>(aWidth) / static_cast<float>(aHeight),
		                                myCamera->GetNearPlane(), myCamera->GetFarPlane());
		engine->GetRenderer().UpdateScreenCamera(*myCameraInstance);
	}
	Release();
	return resizedFlag;
}

bool LumoraWrapper::ProjectToView(const Vector3<float>& aWorld, float& aX, float& aY) const
{
	const LightOverlays::View view =
	    LightOverlays::MakeView(*myCameraInstance, myWidth.load(), myHeight.load());
	float depth = 0.0f;
	return LightOverlays::Project(view, aWorld, aX, aY, depth);
}

void LumoraWrapper::GetCameraPlacement(Vector3<float>& aPosition, float& aYaw, float& aPitch) const
{
	// PlaceCamera's rotation (about x by -pitch, then about y by yaw) turns the forward axis
	// into (-cos(pitch) sin(yaw), -sin(pitch), cos(pitch) cos(yaw)). The camera never rolls,
	// so the forward axis is all there is to undo.
	Vector3<float> forward = myCameraInstance->GetActualOrientation().GetForward();
	const float length = forward.Length();
	if (length > 0.0f && std::isfinite(length))
	{
		forward *= 1.0f / length;
	}
	aPosition = myCameraInstance->GetPosition();
	aYaw = std::atan2(-forward.x, forward.z);
	aPitch = std::asin(std::clamp(-forward.y, -1.0f, 1.0f));
}

void LumoraWrapper::SetLightIconsFlag(bool aFlag)
{
	myLightIconsFlag = aFlag;
}

void LumoraWrapper::SetLightVolumes(LightVolumes aWhich)
{
	myLightVolumes = aWhich;
}

void LumoraWrapper::QueueLightOverlays(int aSelectedPoint, int aSelectedSpot, bool anIconsFlag)
{
	// Lights are edited in LIGHT_MODE and only there do their overlays show, as the marker
	// boxes do: in the decal and path modes they would hide what is being edited.
	const LightVolumes volumes = myLightVolumes.load();
	if (myMode != LIGHT_MODE || !myLightOverlays || !myLightOverlays->IsReady() ||
	    (!anIconsFlag && volumes == LightVolumes::NONE))
	{
		return;
	}
	Zeph::Renderer& renderer = Zeph::Engine::GetInstance()->GetRenderer();
	LightOverlays& overlays = *myLightOverlays;
	const LightOverlays::View view =
	    LightOverlays::MakeView(*myCameraInstance, myWidth.load(), myHeight.load());
	overlays.BeginFrame();
	const auto wireColor = [](const Vector4<float>& aLightColor, bool aSelectedFlag) {
		Vector4<float> color = LightOverlays::DisplayColor(aLightColor);
		color.w = aSelectedFlag ? 1.0f : ourOtherWireOpacity;
		return color;
	};
	const auto showsVolume = [volumes](bool aSelectedFlag) {
		return volumes == LightVolumes::ALL || (volumes == LightVolumes::SELECTED && aSelectedFlag);
	};
	// Wires first, so the icons lie over them, and the selection's last of each kind.
	for (int pass = 0; pass < 2; ++pass)
	{
		const bool selectedPass = pass == 1;
		for (int index = 0; index < myEnvironmentPointLights.Count(); ++index)
		{
			const bool selectedFlag = index == aSelectedPoint;
			if (selectedFlag == selectedPass && showsVolume(selectedFlag))
			{
				const Zeph::PointLightData& light = myEnvironmentPointLights[index];
				overlays.QueuePointVolume(renderer, light, wireColor(light.myColor, selectedFlag));
			}
		}
		for (int index = 0; index < myEnvironmentSpotLights.Count(); ++index)
		{
			const bool selectedFlag = index == aSelectedSpot;
			if (selectedFlag == selectedPass && showsVolume(selectedFlag))
			{
				const Zeph::SpotLightData& light = myEnvironmentSpotLights[index];
				overlays.QueueSpotVolume(renderer, light, wireColor(light.myColor, selectedFlag));
			}
		}
	}
	if (!anIconsFlag)
	{
		return;
	}
	for (int pass = 0; pass < 2; ++pass)
	{
		const bool selectedPass = pass == 1;
		for (int index = 0; index < myEnvironmentPointLights.Count(); ++index)
		{
			const bool selectedFlag = index == aSelectedPoint;
			if (selectedFlag == selectedPass)
			{
				const Zeph::PointLightData& light = myEnvironmentPointLights[index];
				overlays.QueueIcon(renderer, view, LightOverlays::POINT_ICON, light.myPosition,
				                   LightOverlays::DisplayColor(light.myColor), selectedFlag);
			}
		}
		for (int index = 0; index < myEnvironmentSpotLights.Count(); ++index)
		{
			const bool selectedFlag = index == aSelectedSpot;
			if (selectedFlag == selectedPass)
			{
				const Zeph::SpotLightData& light = myEnvironmentSpotLights[index];
				const Vector4<float> color = LightOverlays::DisplayColor(light.myColor);
				overlays.QueueSpotTick(renderer, view, light, color);
				overlays.QueueIcon(renderer, view, LightOverlays::SPOT_ICON,
				                   light.myOrientation.GetPosition(), color, selectedFlag);
			}
		}
	}
}
} // namespace Lumora
