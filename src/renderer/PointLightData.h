#pragma once
// PointLightData: one point light as the frame draws it. The light volume is the
// unit sphere scaled by falloff x 1.2; the colour reaches the shader unchanged.
#include "core/Vector3.h"
#include "core/Vector4.h"

namespace Zeph
{
struct PointLightData
{
	float myFalloff = 0.5f;
	Vector3<float> myPosition{0.0f, 0.0f, 0.0f};
	Vector4<float> myColor{1.0f, 1.0f, 1.0f, 1.0f};
};
} // namespace Zeph
