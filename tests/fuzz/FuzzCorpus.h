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
struct Target
{
	const char* myName;
	int (*myEntry)(const uint8_t*, size_t);
	int myMutations;
	// Whether the entry counts the inputs it accepts (ourAcceptedCount).
	bool myCountsAcceptedFlag = true;
};

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
		switch (aRandom() % 6)
		{
		case 0:
			aBytes[at] = static_cast<char>(aBytes[at] ^ (1 << (aRandom() % 8)));
			break;
		case 1:
			aBytes[at] = markup[aRandom() % std::size(markup)];
			break;
		case 2:
			if (aBytes[at] >= '0' && aBytes[at] <= '9')
			{
				aBytes[at] = static_cast<char>('0' + aRandom() % 10);
			}
			break;
		case 3: {
			const uint32_t word = words[aRandom() % std::size(words)];
			const size_t aligned = at / 4 * 4;
			aBytes.replace(aligned, std::min<size_t>(4, aBytes.size() - aligned),
			               reinterpret_cast<const char*>(&word),
			               std::min<size_t>(4, aBytes.size() - aligned));
			break;
		}
		case 4:
			aBytes.resize(at);
			break;
		case 5:
			aBytes.insert(at, aBytes.substr(at, aRandom() % 64));
			break;
		}
	}
	return aBytes;
}

// The seeds are aTarget's corpus, read by the caller (ReadCorpus) while the working directory
// is still the repository root.
inline void Run(const Target& aTarget, const std::vector<std::string>& seeds, std::mt19937& aRandom)
{
	ASSERT_FALSE(seeds.empty());
	const int acceptedBefore = LumoraFuzz::ourAcceptedCount;
	for (const std::string& seed : seeds)
	{
		ASSERT_EQ(aTarget.myEntry(reinterpret_cast<const uint8_t*>(seed.data()), seed.size()), 0);
	}
	const int acceptedSeeds = LumoraFuzz::ourAcceptedCount - acceptedBefore;
	for (int iteration = 0; iteration < aTarget.myMutations; ++iteration)
	{
		const std::string bytes = Mutate(seeds[aRandom() % seeds.size()], aRandom);
		ASSERT_EQ(aTarget.myEntry(reinterpret_cast<const uint8_t*>(bytes.data()), bytes.size()), 0);
	}
	if (aTarget.myCountsAcceptedFlag)
	{
		// The seeds are valid files, and the mutations reach both the accepting and the refusing paths.
		EXPECT_EQ(acceptedSeeds, static_cast<int>(seeds.size()));
		const int acceptedMutations = LumoraFuzz::ourAcceptedCount - acceptedBefore - acceptedSeeds;
		EXPECT_GT(acceptedMutations, aTarget.myMutations / 20);
		EXPECT_LT(acceptedMutations, aTarget.myMutations - aTarget.myMutations / 20);
	}
}
} // namespace FuzzCorpus
