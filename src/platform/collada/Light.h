#pragma once
// Light: a <light>'s technique_common. Falloff angle in degrees. A light without
// technique_common (some exporters write an empty <light> before the real one with the same id)
// has the kind Undefined; Document::FindLight prefers a defined light of that id.

#include <string>

namespace Collada
{
enum class LightKind
{
	Undefined,
	Ambient,
	Directional,
	Point,
	Spot
};

struct Light
{
	std::string myId;
	std::string myName;
	LightKind myKind = LightKind::Undefined;
	float myColor[3] = {1.0f, 1.0f, 1.0f};
	float myConstantAttenuation = 1.0f;
	float myLinearAttenuation = 0.0f;
	float myQuadraticAttenuation = 0.0f;
	float myFalloffAngle = 180.0f;
	float myFalloffExponent = 0.0f;
	int myLine = 0;
};
} // namespace Collada
