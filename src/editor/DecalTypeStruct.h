#pragma once
// DecalTypeStruct: the names of the known decal types, appended by
// LumoraWrapper::GetCurrentDecalTypes in ascending byte-wise order.
#include <string>
#include <vector>

namespace Lumora
{
struct DecalTypeStruct
{
	std::vector<std::u16string> decalTypes;

	void Dispose() {}
};
} // namespace Lumora
