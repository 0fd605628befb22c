#pragma once
// How a drag in the view moves or turns the selection: plain functions of the camera, the
// view's size and the mouse's movement in device pixels, so the object under the cursor
// stays under it.
#include <array>

#include "bridge/CameraPlacement.h"

namespace LumoraEditor
{
using Vec3 = std::array<float, 3>;

// The engine's vertical field of view (radians): its editor camera's lens.
constexpr float ourVerticalFov = 0.7853982f;

// 0 x, 1 y, 2 z; -1: the camera's plane.
using DragAxis = int;

// Where an object that was at aStart is after the mouse moved (aDx, aDy) pixels (y down) in a
// view aHeight pixels high: in the plane facing the camera through aStart, or along one world
// axis (the plane's movement projected on it).
Vec3 DragMove(const CameraPlacement& aCamera, int aHeight, const Vec3& aStart, float aDx, float aDy,
              DragAxis anAxis);
// A direction turned by a drag: right turns it about the world's up, down about the camera's
// right axis, ourTurnSpeed radians per pixel.
constexpr float ourTurnSpeed = 0.01f;
Vec3 DragTurn(const CameraPlacement& aCamera, const Vec3& aDirection, float aDx, float aDy);
// Rotates aVector about the unit axis by anAngle (right-handed about the axis in a
// left-handed world: as the engine's rotation matrices turn).
Vec3 Rotate(const Vec3& aVector, const Vec3& anAxis, float anAngle);
} // namespace LumoraEditor
