// Fuzz entry for the DDS reader: any bytes must load or fail with a message,
// never crash or read out of range; what loads must save and load back the same.
//
// Run the real fuzzer (clang, libFuzzer and ASan):
//   CC=clang CXX=clang++ cmake -S . -B build-fuzz -G Ninja -DLUMORA_FUZZ=ON -DLUMORA_BUILD_BENCH=OFF
//   cmake --build build-fuzz --target dds_fuzz
//   mkdir -p build-fuzz/dds-corpus   # seed it with a few small .dds files saved by SaveToFile
//   ./build-fuzz/tests/fuzz/dds_fuzz -max_total_time=300 -max_len=70000 build-fuzz/dds-corpus
// Without clang, platform_tests drives this entry with a fixed set of mutations.

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

#include "platform/dds/DdsFile.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* someData, size_t aSize)
{
	Dds::Image image;
	std::string error;
	if (!Dds::LoadFromMemory(someData, aSize, image, error))
	{
		if (error.empty() || !image.IsEmpty())
		{
			std::abort();
		}
		return 0;
	}
	std::vector<uint8_t> saved;
	Dds::Image again;
	if (!Dds::SaveToMemory(image, saved, error) ||
	    !Dds::LoadFromMemory(saved.data(), saved.size(), again, error) || !(again.Info() == image.Info()) ||
	    again.Bytes() != image.Bytes())
	{
		std::abort();
	}
	return 0;
}
