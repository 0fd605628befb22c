// Drives the fuzz entry with fixed mutations of the real documents, so every build (the sanitizer
// build included) checks what a fuzzer would: no crash, no read out of range. The entry aborts
// when a loaded document breaks its guarantees.

#include <fstream>
#include <gtest/gtest.h>
#include <iterator>
#include <random>
#include <string>
#include <vector>

#include "platform/collada/Document.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* someData, size_t aSize);

TEST(ColladaFuzzTest, MutatedDocumentsNeverCrash)
{
	// The large teapots file is left out: its size would only slow the run, not add kinds of element.
	std::vector<std::string> seeds;
	for (const char* file : {"Cinema4D.dae", "ConcavePolygon.dae", "box_nested_animation.dae", "cameras.dae",
	                         "cube_tristrips.dae", "kwxport_test_vcolors.dae", "lights.dae", "sphere.dae"})
	{
		std::ifstream in(std::string("../shared/testdata/collada/") + file, std::ios::binary);
		seeds.emplace_back(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
		ASSERT_FALSE(seeds.back().empty()) << file;
	}
	const char interesting[] = {'<', '>', '/', '"', '#', '-', '0', '9', ' ', 'x'};
	std::mt19937 random(20261123);
	int loaded = 0;
	int refused = 0;
	for (int iteration = 0; iteration < 3000; ++iteration)
	{
		std::string bytes = seeds[random() % seeds.size()];
		const int changes = 1 + int(random() % 3);
		for (int change = 0; change < changes; ++change)
		{
			switch (random() % 4)
			{
			case 0:
				bytes[random() % bytes.size()] ^= char(1u << (random() % 8));
				break;
			case 1:
				bytes[random() % bytes.size()] = interesting[random() % std::size(interesting)];
				break;
			case 2:
				bytes.resize(std::max<size_t>(1, random() % bytes.size()));
				break;
			case 3: {
				// Digits are where counts and indices live: change one into another.
				const size_t at = random() % bytes.size();
				if (bytes[at] >= '0' && bytes[at] <= '9')
				{
					bytes[at] = char('0' + random() % 10);
				}
				break;
			}
			}
		}
		ASSERT_EQ(LLVMFuzzerTestOneInput(reinterpret_cast<const uint8_t*>(bytes.data()), bytes.size()), 0);
		Collada::Document document;
		std::string error;
		(document.LoadFromMemory(bytes.data(), bytes.size(), error) ? loaded : refused) += 1;
	}
	// Both paths were exercised: the mutations are neither all harmless nor all fatal.
	EXPECT_GT(loaded, 100);
	EXPECT_GT(refused, 100);
}
