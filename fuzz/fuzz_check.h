// A check that stays on in optimised builds: the fuzzers and the tests that
// replay their findings both need a broken property to stop the run loudly.
#pragma once

#include <cstdio>
#include <cstdlib>

#define CX_FUZZ_CHECK(condition)                                                    \
  do {                                                                              \
    if (!(condition)) {                                                             \
      std::fprintf(stderr, "%s:%d: check failed: %s\n", __FILE__, __LINE__, #condition); \
      std::abort();                                                                 \
    }                                                                               \
  } while (0)
