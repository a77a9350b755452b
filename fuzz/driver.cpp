// The libFuzzer entry of one fuzzer: LUN_FUZZ_ENTRY names its LunFuzz<Name> function.
#include "fuzz/fuzz_support.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) { return LUN_FUZZ_ENTRY(data, size); }
