#include "RoomShapes.h"

#include <algorithm>

namespace Content
{
double DoorHeight(double aRoomHeight)
{
	return std::min(2.2, aRoomHeight - 0.3);
}

const std::vector<RoomShape>& RoomShapes()
{
	static const std::vector<RoomShape> ourShapes = {
	    {"room_small", 4.0, 3.0, 4.0, DoorSouth, MaterialKind::Bricks, MaterialKind::WoodPlanks},
	    {"room_medium", 6.0, 3.0, 8.0, DoorNorth | DoorSouth, MaterialKind::Concrete, MaterialKind::Concrete},
	    {"room_large", 10.0, 4.0, 10.0, DoorNorth | DoorSouth | DoorEast | DoorWest, MaterialKind::Bricks,
	     MaterialKind::Marble},
	    // A corner piece: turned in steps of 90 degrees it joins any two perpendicular neighbours.
	    {"room_corner", 6.0, 3.0, 6.0, DoorSouth | DoorEast, MaterialKind::Concrete,
	     MaterialKind::WoodPlanks},
	    {"room_hall", 10.0, 3.5, 6.0, DoorNorth | DoorEast, MaterialKind::Bricks, MaterialKind::Concrete},
	    // A narrow passage with a door at each end.
	    {"corridor", 2.4, 3.0, 6.0, DoorNorth | DoorSouth, MaterialKind::MetalPanels,
	     MaterialKind::Concrete}};
	return ourShapes;
}

const RoomShape* FindRoomShape(const std::string& aName)
{
	for (const RoomShape& shape : RoomShapes())
	{
		if (shape.myName == aName)
		{
			return &shape;
		}
	}
	return nullptr;
}

std::vector<DoorOpening> RoomDoors(const RoomShape& aShape)
{
	const struct
	{
		int myDoor;
		Vec3 myOutward;
		double myDistance;
	} sides[4] = {{DoorNorth, Vec3(0.0, 0.0, -1.0), aShape.myDepth * 0.5},
	              {DoorEast, Vec3(1.0, 0.0, 0.0), aShape.myWidth * 0.5},
	              {DoorSouth, Vec3(0.0, 0.0, 1.0), aShape.myDepth * 0.5},
	              {DoorWest, Vec3(-1.0, 0.0, 0.0), aShape.myWidth * 0.5}};
	std::vector<DoorOpening> doors;
	for (const auto& side : sides)
	{
		if ((aShape.myDoors & side.myDoor) != 0)
		{
			doors.push_back({side.myOutward * side.myDistance, side.myOutward, ourDoorWidth,
			                 DoorHeight(aShape.myHeight)});
		}
	}
	return doors;
}
} // namespace Content
