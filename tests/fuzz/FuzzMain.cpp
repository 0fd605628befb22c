// The libFuzzer entry of one fuzz program: LUMORA_FUZZ_ENTRY names the LumoraFuzz function
// that the program drives (see tests/fuzz/CMakeLists.txt).
#include "FuzzEntries.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* someData, size_t aSize)
{
	return LumoraFuzz::LUMORA_FUZZ_ENTRY(someData, aSize);
}
