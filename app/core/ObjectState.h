#pragma once
// ObjectState: everything a designer can set on one placed object, as the document keeps
// it for undo: a command stores whole states before and after and applies them, never an
// inverse of an operation. Comparison is exact, so "undo then redo gives identical values"
// is a plain equality.
#include <array>
#include <cstdint>
#include <string>

namespace LumoraEditor
{
enum class Kind
{
	POINT_LIGHT = 0,
	SPOT_LIGHT = 1,
	DECAL = 2,
	PATH_NODE = 3,
};
constexpr int ourKindCount = 4;

// The editor's own name for an object: it survives removals (the engine's lists move the
// last object into a removed one's place) and an undone deletion gets it back.
using ObjectId = std::uint64_t;

struct ObjectState
{
	Kind myKind = Kind::POINT_LIGHT;
	std::array<float, 3> myPosition{};
	// Linear colour; values above 1 are intensity. Path nodes have none.
	std::array<float, 3> myColor{1.0f, 1.0f, 1.0f};
	// Point and spot lights: the reach of the light.
	float myFalloff = 1.0f;
	// Spot lights: where the cone points; decals: the surface normal they project along.
	std::array<float, 3> myDirection{0.0f, 1.0f, 0.0f};
	// Spot lights: cosines of the inner and outer cone half-angles (inner > outer).
	float myInnerCos = 0.9f;
	float myOuterCos = 0.7f;
	// Decals.
	std::string myDecalType;
	float mySize = 1.0f;
	float myDepth = 1.0f;

	bool operator==(const ObjectState&) const = default;
};

// "point light", "spot light", "decal", "path node".
const char* KindName(Kind aKind);
// "Point lights", ... for lists.
const char* KindPluralTitle(Kind aKind);
bool HasColor(Kind aKind);
bool HasFalloff(Kind aKind);
bool HasDirection(Kind aKind);
} // namespace LumoraEditor
