#pragma once
// Drives a fuzz entry over its committed seed corpus (tests/fuzz/corpus/<name>/, read from the
// repository root, the tests' working directory) and fixed mutations of it, under the compiler of the build
// (the sanitizer build included): what a fuzzer would check, in every test run. An entry aborts when a
// guarantee breaks; a crash ends the test the same way.

#include <algorithm>
#include <filesystem>
#include <gtest/gtest.h>
#include <iterator>
#include <random>
#include <string>
#include <vector>

#include "FuzzEntries.h"
#include "support/GlSupport.h"
#include "support/TestSupport.h"

namespace FuzzCorpus
{
inline std::vector<std::string> ReadCorpus(const std::string& aName)
{
	std::vector<std::string> seeds;
	for (const auto& entry : std::filesystem::directory_iterator("tests/fuzz/corpus/" + aName))
	{
		seeds.push_back(TestSupport::ReadWholeFile(entry.path().string()));
	}
	std::sort(seeds.begin(), seeds.end()); // the same order on every file system
	return seeds;
}

// One to three byte-level changes of the kinds that reach a reader's checks: bits, markup and
// digits of text formats, 32-bit counts of binary ones, cuts and repeated stretches.
inline std::string Mutate(std::string aBytes, std::mt19937& aRandom)
{
	const char markup[] = {'<', '>', '/', '"', '-', '0', '9', ' ', '\0', 'x'};
	const uint32_t words[] = {0, 1, 2, 3, 7, 42, 57, 0xFF, 0x10000, 0x7FFFFFFF, 0x80000000, 0xFFFFFFFF};
	const int changes = 1 + static_cast<int>(aRandom() % 3);
	for (int change = 0; change < changes && !aBytes.empty(); ++change)
	{
		const size_t at = aRandom() % aBytes.size();
		switch (aRandom() % 5)
		{
		case 0:
			aBytes[at] = static_cast<char>(aBytes[at] ^ (1 << (aRandom() % 8)));
			break;
		case 1:
			aBytes[at] = markup[aRandom() % std::size(markup)];
			break;
		case 2: {
			const uint32_t word = words[aRandom() % std::size(words)];
			// Near the end the word may lengthen the bytes by up to three.
			aBytes.replace(at / 4 * 4, 4, reinterpret_cast<const char*>(&word), 4);
			break;
		}
		case 3:
			aBytes.resize(at);
			break;
		case 4:
			aBytes.insert(at, aBytes.substr(at, aRandom() % 64));
			break;
		}
	}
	return aBytes;
}

// The seeds are anEntry's corpus, read by the caller (ReadCorpus) while the working directory
// is still the repository root.
inline void Run(int (*anEntry)(const uint8_t*, size_t), int someMutations,
                const std::vector<std::string>& someSeeds, std::mt19937& aRandom)
{
	ASSERT_FALSE(someSeeds.empty());
	for (const std::string& seed : someSeeds)
	{
		ASSERT_EQ(anEntry(reinterpret_cast<const uint8_t*>(seed.data()), seed.size()), 0);
	}
	for (int iteration = 0; iteration < someMutations; ++iteration)
	{
		const std::string bytes = Mutate(someSeeds[aRandom() % someSeeds.size()], aRandom);
		ASSERT_EQ(anEntry(reinterpret_cast<const uint8_t*>(bytes.data()), bytes.size()), 0);
	}
}
} // namespace FuzzCorpus
