// A promise that the code under test must keep. Broken, it ends the run, and the fuzzer keeps the input.
#pragma once

#include <cstdio>
#include <cstdlib>

namespace fuzz {

[[noreturn]] inline void broken(const char* promise, const char* file, int line) {
  std::fprintf(stderr, "%s:%d: this does not hold: %s\n", file, line, promise);
  std::abort();
}

}  // namespace fuzz

#define REQUIRE(promise)                          \
  do {                                            \
    if (!(promise)) {                             \
      fuzz::broken(#promise, __FILE__, __LINE__); \
    }                                             \
  } while (false)
