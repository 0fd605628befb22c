#pragma once
// PointLightStruct: the selected point light's values as the front end reads them
// (filled by LumoraWrapper::TryGetCurrentPointLight). The arrays keep their lengths.
#include <array>

namespace Lumora
{
struct PointLightStruct
{
	float falloff = 0.0f;
	std::array<float, 3> pos{};
	std::array<float, 4> col{};

	// Ends the record's use; it holds nothing that needs releasing.
	void Dispose() {}
};
} // namespace Lumora
