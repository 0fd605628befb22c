#pragma once
// FlyCamera: the view's camera as a designer steers it: look with the mouse, fly with
// W/A/S/D, Q/E down and up, Shift faster, the wheel to move along the view, frame an object,
// back to the level's start. Plain C++ over CameraPlacement; the view sends the result to the
// engine once per frame.
#include "bridge/CameraPlacement.h"

namespace LumoraEditor
{
struct FlyKeys
{
	bool myForwardFlag = false;
	bool myBackFlag = false;
	bool myLeftFlag = false;
	bool myRightFlag = false;
	bool myDownFlag = false;
	bool myUpFlag = false;
	bool myFastFlag = false;

	bool AnyMove() const
	{
		return myForwardFlag || myBackFlag || myLeftFlag || myRightFlag || myDownFlag || myUpFlag;
	}
};

class FlyCamera
{
public:
	// Radians per device pixel of mouse movement.
	static constexpr float ourLookSpeed = 0.004f;
	static constexpr float ourFastFactor = 4.0f;
	// The pitch stops short of straight up and down, where yaw loses meaning.
	static constexpr float ourPitchLimit = 1.5f;

	const CameraPlacement& GetPlacement() const { return myPlacement; }
	void SetPlacement(const CameraPlacement& aPlacement) { myPlacement = aPlacement; }
	// Metres per second while flying.
	float GetSpeed() const { return mySpeed; }
	void SetSpeed(float aSpeed);

	// A mouse move of (dx, dy) device pixels with the look button held: right turns right,
	// down looks down.
	void Look(float aDx, float aDy);
	// Flies for aSeconds with the keys held.
	void Fly(const FlyKeys& someKeys, float aSeconds);
	// Wheel steps (positive: forward), each a fifth of a second of flying.
	void Wheel(float aSteps, bool aFastFlag);
	// Looks at aTarget from aDistance along the current view direction.
	void Frame(const std::array<float, 3>& aTarget, float aDistance);

private:
	CameraPlacement myPlacement;
	float mySpeed = 8.0f;
};
} // namespace LumoraEditor
