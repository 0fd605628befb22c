#pragma once
// RoomShapes: the box rooms of the sample content, shared by the room models and the sample levels.
//
//   for (const Content::RoomShape& shape : Content::RoomShapes())
//   {
//       for (const Content::DoorOpening& door : Content::RoomDoors(shape)) { ... }
//   }
//
// A room spans [-w/2, w/2] x [0, h] x [-d/2, d/2] in model space, seen from inside. Every door is one
// opening of the same size in the middle of its wall, so two rooms whose walls touch join wherever
// both have a door at the same place: a level lines its rooms up by their door centres.

#include <string>
#include <vector>

#include "Materials.h"
#include "MeshBuilder.h"

namespace Content
{
enum DoorSide
{
	DoorNorth = 1, // the wall at -z
	DoorSouth = 2, // +z
	DoorEast = 4,  // +x
	DoorWest = 8   // -x
};

constexpr double ourDoorWidth = 1.2;
// 2.2 m, or less in a room too low to keep 0.3 m of wall above it.
double DoorHeight(double aRoomHeight);

struct RoomShape
{
	std::string myName;    // the model's name: models/<name>.dae
	double myWidth = 0.0;  // along x
	double myHeight = 0.0; // along y
	double myDepth = 0.0;  // along z
	int myDoors = 0;       // DoorSide bits
	MaterialKind myWallMaterial = MaterialKind::Concrete;
	MaterialKind myFloorMaterial = MaterialKind::Concrete;
};

// One door in model space: the centre of its opening at floor level (y = 0), the outward normal of
// its wall, and the opening's size.
struct DoorOpening
{
	Vec3 myCenter;
	Vec3 myOutward;
	double myWidth = 0.0;
	double myHeight = 0.0;
};

const std::vector<RoomShape>& RoomShapes();
// Null when no room model has the name.
const RoomShape* FindRoomShape(const std::string& aName);
std::vector<DoorOpening> RoomDoors(const RoomShape& aShape);
} // namespace Content
