#pragma once
// CompiledFormat: the .fxal file, an EffectDesc as little-endian bytes.
//
//   std::vector<uint8_t> bytes;
//   Fx::WriteCompiled(desc, bytes);
//   Fx::EffectDesc again;
//   std::string error;
//   if (!Fx::ReadCompiled(bytes, again, error)) { ... "damaged: ..." ... }
//
// The layout is documented in data/Shaders/README.md. The reader checks the magic,
// the format version, a checksum of the body, and then every size, count, string
// length, enum value and index before it uses it: a damaged file is refused with
// a message, never read out of range.

#include <cstdint>
#include <span>
#include <string>
#include <vector>

#include "platform/fx/EffectDesc.h"

namespace Fx
{
constexpr uint32_t ourCompiledFormatVersion = 1;
// Texture units an effect may use (Gpu::StateCache tracks this many sampler units).
constexpr int ourMaxTextureUnits = 32;

void WriteCompiled(const EffectDesc& aDesc, std::vector<uint8_t>& someBytesOut);
bool ReadCompiled(std::span<const uint8_t> someBytes, EffectDesc& aDescOut, std::string& anError);
// The source hash from the header alone.
bool ReadCompiledSourceHash(std::span<const uint8_t> someBytes, uint64_t& aHashOut, std::string& anError);
// Recomputes the body checksum in place, so tests can damage a body on purpose and
// reach the structural checks behind the checksum.
void ResealCompiled(std::vector<uint8_t>& someBytes);
} // namespace Fx
