#include "SampleLevels.h"

#include <cmath>
#include <string>
#include <utility>

#include "RoomShapes.h"

namespace Content
{
namespace
{
using Point = Vector3<float>;
using Color = Vector4<float>;

constexpr double ourPi = 3.14159265358979323846;
// Path nodes stand this high, so their quarter-metre marker boxes rest on the floor.
constexpr float ourNodeHeight = 0.25f;
const Color ourWhite(1.0f, 1.0f, 1.0f, 1.0f);
constexpr float ourIntensity = 4.0f;
// The falloffs below are scaled by this: the reach at which a light's window has taken it to nothing,
// well past the floor it lights.
constexpr float ourReach = 1.3f;

float Cosine(double aDegrees)
{
	return static_cast<float>(std::cos(aDegrees * ourPi / 180.0));
}

// Collects one level; every Add appends in the order the files list their records.
class LevelBuilder
{
public:
	explicit LevelBuilder(const std::string& aName) { myLevel.myName = aName; }

	// A room model with its floor centre at (anX, 0, aZ), turned about y by aYaw degrees (a multiple of
	// 90): its shell entity and its bounds.
	void AddRoom(const std::string& anId, const std::string& aShape, float anX, float aZ, int aYaw)
	{
		const RoomShape* shape = FindRoomShape(aShape);
		const bool turnedFlag = aYaw % 180 != 0;
		const float halfX = static_cast<float>((turnedFlag ? shape->myDepth : shape->myWidth) * 0.5);
		const float halfZ = static_cast<float>((turnedFlag ? shape->myWidth : shape->myDepth) * 0.5);
		myLevel.myRooms.push_back({anId, Point(anX - halfX, 0.0f, aZ - halfZ),
		                           Point(anX + halfX, static_cast<float>(shape->myHeight), aZ + halfZ)});
		AddProp(aShape, Point(anX, 0.0f, aZ), static_cast<float>(aYaw));
	}

	void AddProp(const std::string& aType, const Point& aPosition, float aYaw = 0.0f)
	{
		myLevel.myEntities.push_back({aType, aPosition, Point(0.0f, aYaw, 0.0f)});
	}

	void AddPointLight(const Point& aPosition, const Color& aColor, float aFalloff)
	{
		myLevel.myPointLights.push_back({aPosition, Intensity(aColor), aFalloff * ourReach});
	}

	// aDirection must be of unit length; the cone's half-angles are given in degrees.
	void AddSpotLight(const Point& aPosition, const Point& aDirection, const Color& aColor, float aFalloff,
	                  double anInnerDegrees, double anOuterDegrees)
	{
		myLevel.mySpotLights.push_back({aPosition, Intensity(aColor), aFalloff * ourReach, aDirection,
		                                Cosine(anInnerDegrees), Cosine(anOuterDegrees)});
	}

	void AddDecal(const std::string& aType, const Point& aPosition, const Point& aNorm, float aSize,
	              float aDepth)
	{
		myLevel.myDecals.push_back({aType, aPosition, aNorm, ourWhite, aSize, aDepth});
	}

	// Nodes at the floor positions (x, z) joined in order; a closed path joins the last to the first.
	void AddPath(const std::vector<std::pair<float, float>>& somePoints, bool aClosedFlag)
	{
		const int first = static_cast<int>(myLevel.myNodes.size()) + 1;
		for (const auto& [x, z] : somePoints)
		{
			const int id = static_cast<int>(myLevel.myNodes.size()) + 1;
			myLevel.myNodes.push_back({id, Point(x, ourNodeHeight, z)});
			if (id > first)
			{
				myLevel.myEdges.push_back({id - 1, id});
			}
		}
		if (aClosedFlag)
		{
			myLevel.myEdges.push_back({static_cast<int>(myLevel.myNodes.size()), first});
		}
	}

	LevelDescription Take() { return std::move(myLevel); }

private:
	// A light's colour as the renderer takes it: a linear intensity, the light a surface 1 m away
	// facing it receives, falling off with the square of the distance.
	static Color Intensity(const Color& aColor)
	{
		return Color(aColor.x * ourIntensity, aColor.y * ourIntensity, aColor.z * ourIntensity, aColor.w);
	}

	LevelDescription myLevel;
};

// Light colours, each scaled by ourIntensity: a lamp 2.5 m above the floor lights it with about a
// sixth of its intensity, so the lights are bright near them and pool where they point.
const Color ourWarm(2.0f, 1.6f, 1.1f, 1.0f);
const Color ourCool(1.2f, 1.4f, 1.8f, 1.0f);
const Color ourNeutral(1.6f, 1.5f, 1.3f, 1.0f);
const Color ourLamp(1.2f, 0.7f, 0.3f, 1.0f);
const Color ourSpot(2.6f, 2.4f, 2.0f, 1.0f);
const Color ourColdSpot(1.6f, 1.9f, 2.6f, 1.0f);

const Point ourDown(0.0f, -1.0f, 0.0f);
const Point ourUp(0.0f, 1.0f, 0.0f);
const Point ourFacingEast(1.0f, 0.0f, 0.0f);
const Point ourFacingWest(-1.0f, 0.0f, 0.0f);
const Point ourFacingSouth(0.0f, 0.0f, 1.0f);
const Point ourFacingNorth(0.0f, 0.0f, -1.0f);

// One room_medium (x -3..3, z -4..4, 3 m high) with its two doors open to the outside.
LevelDescription SampleSmall()
{
	LevelBuilder level("sample_small");
	level.AddRoom("main", "room_medium", 0.0f, 0.0f, 0);
	level.AddProp("crate", Point(-2.2f, 0.0f, -3.2f));
	level.AddProp("crate", Point(-2.2f, 0.9f, -3.2f), 15.0f);
	level.AddProp("crate", Point(-0.9f, 0.0f, -3.2f), 30.0f);
	level.AddProp("pillar", Point(2.0f, 0.0f, 1.5f));
	level.AddProp("sculpture_knot", Point(1.0f, 0.0f, -2.0f));
	for (const float z : {1.0f, 2.0f, 3.0f})
	{
		level.AddProp("floor_tile_marble", Point(0.0f, 0.0f, z));
	}

	level.AddPointLight(Point(0.0f, 2.6f, -2.0f), ourWarm, 4.0f);
	level.AddPointLight(Point(0.0f, 2.6f, 2.0f), ourCool, 4.0f);
	level.AddPointLight(Point(-2.2f, 2.5f, -3.2f), ourLamp, 2.5f);
	// One on the sculpture, one on the sign on the west wall.
	level.AddSpotLight(Point(2.5f, 2.8f, -2.0f), Point(-0.6f, -0.8f, 0.0f), ourSpot, 4.0f, 20.0, 30.0);
	level.AddSpotLight(Point(-1.0f, 2.8f, 0.0f), Point(-0.8f, -0.6f, 0.0f), ourColdSpot, 3.5f, 15.0, 25.0);

	level.AddDecal("hazard", Point(-3.0f, 1.5f, 0.0f), ourFacingEast, 1.2f, 0.4f);

	level.AddPath({{0.0f, 3.5f}, {0.0f, 1.5f}, {-1.2f, -0.5f}, {0.3f, -3.5f}}, false);
	return level.Take();
}

// Eight rooms, every door joined to the neighbour's (x east, z south; walls at the given bounds):
//
//                 north_alcove (-2..2, -9..-5)
//                       |
//   west_corner ---- atrium (-5..5, -5..5) ---- east_alcove (5..9, -2..2)
//   (-11..-5, -3..3)    |
//        |           corridor (-1.2..1.2, 5..11)
//   gallery             |
//   (-11..-5, 3..11)    |
//        |              |
//   hall (-13..-3, 11..17) ---- south_corner (-3..3, 11..17)
//
// The path ring runs atrium, west_corner, gallery, hall, south_corner, corridor and back.
LevelDescription SampleLarge()
{
	LevelBuilder level("sample_large");
	level.AddRoom("atrium", "room_large", 0.0f, 0.0f, 0);
	level.AddRoom("north_alcove", "room_small", 0.0f, -7.0f, 0);
	level.AddRoom("east_alcove", "room_small", 7.0f, 0.0f, 90);
	level.AddRoom("west_corner", "room_corner", -8.0f, 0.0f, 0);
	level.AddRoom("gallery", "room_medium", -8.0f, 7.0f, 0);
	level.AddRoom("hall", "room_hall", -8.0f, 14.0f, 0);
	level.AddRoom("south_corner", "room_corner", 0.0f, 14.0f, 180);
	level.AddRoom("corridor", "corridor", 0.0f, 8.0f, 0);

	// Atrium: four pillars and an arch over the way to the west door.
	for (const float x : {-3.5f, 3.5f})
	{
		for (const float z : {-3.5f, 3.5f})
		{
			level.AddProp("pillar", Point(x, 0.0f, z));
		}
	}
	level.AddProp("arch", Point(-3.0f, 0.0f, 0.0f), 90.0f);
	level.AddProp("crate", Point(-1.2f, 0.0f, -8.2f));
	level.AddProp("crate", Point(-1.2f, 0.9f, -8.2f), 20.0f);
	// The east alcove shows the sculpture on a marble plinth.
	level.AddProp("sculpture_knot", Point(7.5f, 0.0f, 0.0f));
	for (const float x : {7.0f, 8.0f})
	{
		for (const float z : {-0.5f, 0.5f})
		{
			level.AddProp("floor_tile_marble", Point(x, 0.0f, z));
		}
	}
	level.AddProp("crate", Point(-10.2f, 0.0f, -2.2f));
	level.AddProp("crate", Point(-9.2f, 0.0f, -2.3f), 25.0f);
	for (const float x : {-10.0f, -6.0f})
	{
		for (const float z : {5.0f, 9.0f})
		{
			level.AddProp("pillar", Point(x, 0.0f, z));
		}
	}
	level.AddProp("crate", Point(-12.0f, 0.0f, 16.0f));
	level.AddProp("crate", Point(-12.0f, 0.9f, 16.0f), 10.0f);
	level.AddProp("crate", Point(-10.9f, 0.0f, 16.2f), 35.0f);
	level.AddProp("floor_tile_concrete", Point(-5.0f, 0.0f, 16.0f));
	level.AddProp("crate", Point(2.0f, 0.0f, 16.0f));
	level.AddProp("pillar", Point(2.0f, 0.0f, 12.0f));

	// Atrium (4 m high).
	level.AddPointLight(Point(0.0f, 3.4f, 0.0f), Color(2.2f, 1.9f, 1.5f, 1.0f), 7.0f);
	level.AddPointLight(Point(2.5f, 2.8f, -1.5f), ourCool, 4.5f);
	level.AddPointLight(Point(-1.5f, 2.8f, 3.0f), ourWarm, 4.5f);
	for (const float x : {-3.5f, 3.5f})
	{
		for (const float z : {-3.5f, 3.5f})
		{
			level.AddSpotLight(Point(x, 3.8f, z), ourDown, ourSpot, 4.5f, 18.0, 28.0);
		}
	}
	level.AddSpotLight(Point(-0.5f, 3.6f, 0.0f), Point(-0.6f, -0.8f, 0.0f), ourNeutral, 4.5f, 20.0, 30.0);
	// North alcove.
	level.AddPointLight(Point(0.0f, 2.5f, -7.0f), ourNeutral, 3.5f);
	level.AddSpotLight(Point(0.8f, 2.8f, -6.5f), Point(0.0f, -0.6f, -0.8f), ourSpot, 3.5f, 20.0, 32.0);
	// East alcove: the sculpture lit from two sides.
	level.AddPointLight(Point(6.0f, 2.5f, 1.5f), Color(1.4f, 1.2f, 1.0f, 1.0f), 3.0f);
	level.AddSpotLight(Point(7.5f, 2.85f, -1.2f), Point(0.0f, -0.8f, 0.6f), Color(3.0f, 2.7f, 2.2f, 1.0f),
	                   4.0f, 15.0, 25.0);
	level.AddSpotLight(Point(5.6f, 2.85f, 0.0f), Point(0.8f, -0.6f, 0.0f), ourColdSpot, 4.5f, 15.0, 25.0);
	// West corner.
	level.AddPointLight(Point(-8.0f, 2.5f, 0.0f), ourNeutral, 4.0f);
	level.AddPointLight(Point(-10.0f, 2.2f, 2.0f), ourLamp, 3.0f);
	level.AddSpotLight(Point(-9.5f, 2.85f, -1.0f), Point(-0.8f, -0.6f, 0.0f), ourColdSpot, 3.0f, 20.0, 30.0);
	// Gallery.
	level.AddPointLight(Point(-8.0f, 2.6f, 5.0f), ourNeutral, 3.5f);
	level.AddPointLight(Point(-8.0f, 2.6f, 9.0f), ourNeutral, 3.5f);
	level.AddSpotLight(Point(-8.0f, 2.85f, 7.0f), ourDown, ourSpot, 3.5f, 25.0, 35.0);
	level.AddSpotLight(Point(-6.5f, 2.85f, 8.0f), Point(0.8f, -0.6f, 0.0f), ourSpot, 3.0f, 20.0, 30.0);
	// Hall (3.5 m high).
	level.AddPointLight(Point(-11.0f, 3.0f, 14.0f), ourWarm, 4.5f);
	level.AddPointLight(Point(-6.0f, 3.0f, 14.0f), ourWarm, 4.5f);
	level.AddPointLight(Point(-12.0f, 2.6f, 16.0f), ourLamp, 2.5f);
	level.AddSpotLight(Point(-8.0f, 3.35f, 15.5f), Point(0.0f, -0.8f, 0.6f), ourSpot, 3.5f, 20.0, 30.0);
	level.AddSpotLight(Point(-4.5f, 3.35f, 12.5f), ourDown, ourNeutral, 4.0f, 25.0, 35.0);
	level.AddSpotLight(Point(-11.0f, 3.35f, 13.0f), ourDown, ourSpot, 4.0f, 20.0, 30.0);
	// Corridor.
	level.AddPointLight(Point(0.0f, 2.6f, 6.5f), ourCool, 2.5f);
	level.AddPointLight(Point(0.0f, 2.6f, 9.5f), ourCool, 2.5f);
	level.AddSpotLight(Point(0.8f, 2.85f, 8.0f), Point(-0.8f, -0.6f, 0.0f), ourSpot, 3.0f, 20.0, 30.0);
	// South corner.
	level.AddPointLight(Point(0.0f, 2.5f, 14.0f), ourNeutral, 4.0f);
	level.AddPointLight(Point(-2.0f, 2.5f, 16.0f), ourLamp, 3.0f);
	level.AddSpotLight(Point(1.0f, 2.85f, 14.0f), Point(0.8f, -0.6f, 0.0f), ourSpot, 3.5f, 20.0, 30.0);
	level.AddSpotLight(Point(0.5f, 2.85f, 15.2f), ourDown, ourColdSpot, 3.5f, 20.0, 30.0);

	// Decals: walls at their planes with the room-facing normal, floors at y = 0.
	level.AddDecal("target", Point(3.0f, 2.0f, -5.0f), ourFacingSouth, 1.2f, 0.4f);
	level.AddDecal("crack", Point(2.0f, 0.0f, 2.0f), ourUp, 2.0f, 0.3f);
	level.AddDecal("brick", Point(0.8f, 1.5f, -9.0f), ourFacingSouth, 1.2f, 0.4f);
	level.AddDecal("target", Point(9.0f, 1.7f, 0.0f), ourFacingWest, 1.2f, 0.4f);
	level.AddDecal("crack", Point(-11.0f, 1.5f, -1.0f), ourFacingEast, 1.5f, 0.4f);
	level.AddDecal("arrow", Point(-8.0f, 0.0f, 5.0f), ourUp, 0.8f, 0.3f);
	level.AddDecal("arrow", Point(-8.0f, 0.0f, 9.0f), ourUp, 0.8f, 0.3f);
	level.AddDecal("stain", Point(-5.0f, 2.1f, 8.0f), ourFacingWest, 1.5f, 0.4f);
	level.AddDecal("hazard", Point(-8.0f, 1.5f, 17.0f), ourFacingNorth, 1.2f, 0.4f);
	level.AddDecal("stain", Point(-11.0f, 0.0f, 13.0f), ourUp, 1.5f, 0.3f);
	level.AddDecal("brick", Point(3.0f, 1.4f, 14.0f), ourFacingWest, 1.4f, 0.4f);
	level.AddDecal("crack", Point(0.5f, 0.0f, 15.2f), ourUp, 1.5f, 0.3f);
	level.AddDecal("hazard", Point(-1.2f, 1.6f, 8.0f), ourFacingEast, 1.0f, 0.4f);
	level.AddDecal("stain", Point(1.2f, 2.1f, 7.0f), ourFacingWest, 1.2f, 0.4f);

	// Doors at (-5, 0), (-8, 3), (-8, 11), (-3, 14), (0, 11) and (0, 5); the second node passes
	// under the arch.
	level.AddPath({{0.0f, 2.5f},
	               {-3.0f, 0.0f},
	               {-5.0f, 0.0f},
	               {-8.0f, 0.0f},
	               {-8.0f, 3.0f},
	               {-8.0f, 7.0f},
	               {-8.0f, 11.0f},
	               {-8.0f, 14.0f},
	               {-3.0f, 14.0f},
	               {-1.5f, 12.5f},
	               {0.0f, 11.0f},
	               {0.0f, 8.0f},
	               {0.0f, 5.0f}},
	              true);
	return level.Take();
}
} // namespace

std::vector<LevelDescription> BuildSampleLevels()
{
	std::vector<LevelDescription> levels;
	levels.push_back(SampleSmall());
	levels.push_back(SampleLarge());
	return levels;
}
} // namespace Content
