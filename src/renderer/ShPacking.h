#pragma once
// ShPacking: one SH coefficient vector as a texel of the irradiance volume: each
// component clamped to -1..1, mapped to 0..1 by (c + 1) / 2, times 255 truncated toward
// zero, x in the lowest byte (R8G8B8A8_UNORM in memory). The ambient pass decodes a
// byte as byte / 255 * 2 - 1, so 0 is stored as 127, 1.5 as 255 and -3 as 0.
#include <algorithm>
#include <cstdint>

namespace Zeph
{
inline uint32_t PackSHVector(float anX, float aY, float aZ, float aW)
{
	uint32_t texel = 0;
	const float values[4] = {anX, aY, aZ, aW};
	for (int component = 0; component < 4; ++component)
	{
		const float mapped = (std::clamp(values[component], -1.0f, 1.0f) + 1.0f) * 0.5f;
		texel |= static_cast<uint32_t>(mapped * 255.0f) << (8 * component);
	}
	return texel;
}

// A cell with no computed value: 127 in every byte, about no irradiance.
inline constexpr uint32_t ourNeutralSHTexel = 0x7F7F7F7Fu;
} // namespace Zeph
