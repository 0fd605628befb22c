#pragma once
// The fuzz entries, one per file kind a user hands the editor: each takes any bytes, must
// never crash, hang or read out of range, and aborts when a file its reader accepted breaks
// one of the reader's guarantees (a round trip that changes it, an index out of range).
//
// libFuzzer drives one entry per program (FuzzMain.cpp, built with LUMORA_FUZZ=ON and clang;
// scripts/fuzz.sh runs them all). fuzz_tests drives every entry over its committed seed corpus
// (tests/fuzz/corpus/<entry>/) and fixed mutations of it, under any compiler, so the normal
// and the sanitizer builds check the same guarantees.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

namespace LumoraFuzz
{
// Ends the process where a guarantee does not hold, which a fuzzer reports with its input.
inline void Require(bool aCondition)
{
	if (!aCondition)
	{
		std::abort();
	}
}

int Dds(const uint8_t* someData, size_t aSize);
int Collada(const uint8_t* someData, size_t aSize);
int Al(const uint8_t* someData, size_t aSize);
int Ambient(const uint8_t* someData, size_t aSize);
// The five level files and the two catalogues, separated by zero bytes (rooms, entities,
// lights, node graph, decals, entity types, decal types; a part left off is a missing file),
// loaded through a headless editor facade made on the first call, with the log non-fatal, then
// saved and loaded again. Without an OpenGL context it does nothing.
int Level(const uint8_t* someData, size_t aSize);

// Whether the level entry has its facade (made on first use).
bool LevelAvailable();
// Takes the level entry's facade down and returns to the working directory it started in; the
// level entry is not called again after it.
void ShutDownLevel();
} // namespace LumoraFuzz
