#pragma once
// RoomData: the room an instance stands in, as the renderer needs it for the
// instance's reflections: the room's cubemap and its box (published to effects as
// "EnvBoxPos", "EnvBoxMax" and "EnvBoxMin"). A plain value copied into instances.
#include "core/Vector3.h"

namespace Zeph
{
class DynamicCubemap;

struct RoomData
{
	DynamicCubemap* myCubemap = nullptr; // not owned
	int myRoomIndex = -1;                // -1: in no room
	Vector3<float> myCenter{0.0f, 0.0f, 0.0f};
	Vector3<float> myMax{0.0f, 0.0f, 0.0f};
	Vector3<float> myMin{0.0f, 0.0f, 0.0f};
};
} // namespace Zeph
