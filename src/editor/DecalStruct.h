#pragma once
// DecalStruct: the selected decal's values as the front end reads them
// (LumoraWrapper::TryGetCurrentDecal). decalID, the decal type's name, is absent
// until a query fills it.
#include <array>
#include <optional>
#include <string>

namespace Lumora
{
struct DecalStruct
{
	float size = 0.0f;
	std::array<float, 3> pos{};
	std::array<float, 4> col{};
	std::array<float, 3> direction{};
	std::optional<std::u16string> decalID;
	float depth = 0.0f;

	void Dispose() {}
};
} // namespace Lumora
