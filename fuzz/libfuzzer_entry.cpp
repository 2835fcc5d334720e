// The libFuzzer entry point of one target; CARDOVEX_FUZZ_FUNCTION names it.
#include <cstddef>
#include <cstdint>

#include "fuzz/targets.h"

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
  return CARDOVEX_FUZZ_FUNCTION(data, size);
}
