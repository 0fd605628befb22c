#pragma once
// SpotLightStruct: the selected spot light's values as the front end reads them
// (LumoraWrapper::TryGetCurrentSpotLight): position and direction are the position
// and forward rows of the light's orientation; angles holds the inner then the outer
// angle value.
#include <array>

namespace Lumora
{
struct SpotLightStruct
{
	float falloff = 0.0f;
	std::array<float, 3> pos{};
	std::array<float, 4> col{};
	std::array<float, 3> direction{};
	std::array<float, 2> angles{};

	void Dispose() {}
};
} // namespace Lumora
