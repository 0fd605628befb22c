#pragma once
// Fnv1a: the 64-bit FNV-1a hash that compiled effects carry for staleness checks
// and over their own bytes against damage. Chain calls by passing the last result.

#include <cstddef>
#include <cstdint>

namespace Fx
{
constexpr uint64_t ourFnv1aStart = 0xcbf29ce484222325ull;

inline uint64_t Fnv1a(const void* someBytes, size_t aSize, uint64_t aHash = ourFnv1aStart)
{
	const uint8_t* bytes = static_cast<const uint8_t*>(someBytes);
	for (size_t index = 0; index < aSize; ++index)
	{
		aHash ^= bytes[index];
		aHash *= 0x100000001b3ull;
	}
	return aHash;
}
} // namespace Fx
