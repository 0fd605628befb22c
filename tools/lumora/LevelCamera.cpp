#include "LevelCamera.h"

#include <cmath>

#include "editor/LumoraWrapper.h"
#include "engine/CameraInstance.h"

namespace LumoraTool
{
namespace
{
constexpr float ourHalfPi = 1.57079633f;
} // namespace

// From the start position (0, 10, 0), looking along +z: turned round toward -z (turns
// are about the camera's own up, so they come first), back over the first room's edge,
// down at a steep angle (the camera's pitch is limited) to eye height in the room, a
// slight downward tilt, and backed off toward the wall.
void WalkIntoTheFirstRoom(Lumora::LumoraWrapper& anEditor)
{
	const auto forward = [&anEditor] {
		return anEditor.GetCameraInstance()->GetActualOrientation().GetForward();
	};
	constexpr float steep = 0.9f;
	anEditor.YawCamera(2.0f * ourHalfPi);
	anEditor.Zoom(-5.0f);
	anEditor.PitchCamera(steep);
	const float down = forward().y < 0.0f ? 1.0f : -1.0f;
	if (down < 0.0f)
	{
		anEditor.PitchCamera(-2.0f * steep);
	}
	anEditor.Zoom(7.5f / std::sin(steep));
	anEditor.PitchCamera(-down * (steep - 0.18f));
	anEditor.Zoom(-4.5f);
}
} // namespace LumoraTool
