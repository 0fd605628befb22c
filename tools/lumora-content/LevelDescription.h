#pragma once
// LevelDescription: everything one sample level's five XML files hold, in world units and in the
// values the files store (degrees for entity rotations, cosines for spot-light cone angles, falloff
// as the light's reach in metres). LevelWriter turns it into the files; SampleLevels builds the two
// sample levels.
//
// Room bounds are the world-space box of the room; the writer mirrors x as rooms.xml expects. Node
// IDs start at 1, and each edge names the IDs of its two nodes.

#include <string>
#include <vector>

#include "core/Vector3.h"
#include "core/Vector4.h"

namespace Content
{
struct LevelRoom
{
	std::string myId; // names the room's reflection cubemap
	Vector3<float> myMin;
	Vector3<float> myMax;
};

struct LevelEntity
{
	std::string myType; // an id of the entity type catalogue
	Vector3<float> myPosition;
	Vector3<float> myRotation; // degrees about x, y and z
};

struct LevelPointLight
{
	Vector3<float> myPosition;
	Vector4<float> myColor;
	float myFalloff = 1.0f;
};

struct LevelSpotLight
{
	Vector3<float> myPosition;
	Vector4<float> myColor;
	float myFalloff = 1.0f;
	Vector3<float> myDirection; // unit length, so that a save writes it back unchanged
	float myInner = 0.9f;       // cosines of the cone's half-angles, inner > outer
	float myOuter = 0.7f;
};

struct LevelNode
{
	int myId = 0;
	Vector3<float> myPosition;
};

struct LevelEdge
{
	int myFirstId = 0;
	int mySecondId = 0;
};

struct LevelDecal
{
	std::string myType; // an id of the decal type catalogue
	Vector3<float> myPosition;
	Vector3<float> myNorm; // the normal of the surface the decal lies on
	Vector4<float> myColor;
	float mySize = 1.0f;
	float myDepth = 0.3f;
};

struct LevelDescription
{
	std::string myName; // the level's directory under data/XML/levels
	std::vector<LevelRoom> myRooms;
	std::vector<LevelEntity> myEntities;
	std::vector<LevelPointLight> myPointLights;
	std::vector<LevelSpotLight> mySpotLights;
	std::vector<LevelNode> myNodes;
	std::vector<LevelEdge> myEdges;
	std::vector<LevelDecal> myDecals;
};
} // namespace Content
