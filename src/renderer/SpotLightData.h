#pragma once
// SpotLightData: one spot light. myAngles holds the cosines of the inner and outer
// cone half-angles (inner > outer); myOrientation places the light, its forward row
// (row 2) is the cone axis and its position row the apex.
#include "core/Matrix44.h"
#include "core/Vector2.h"
#include "core/Vector4.h"

namespace Zeph
{
struct SpotLightData
{
	float myFalloff = 1.0f;
	Vector2<float> myAngles{0.9f, 0.7f};
	Vector4<float> myColor{1.0f, 1.0f, 1.0f, 1.0f};
	Matrix44<float> myOrientation;
};
} // namespace Zeph
