// Routes that carry a checksum in their last hop, so that bytes of two routes do not fit together.
#pragma once

#include <cstdint>
#include <cstring>

#include "hb_client/route.h"

namespace hb_test {

// A route has 44 words, 4 for each hop.
inline void seal(uint32_t (&words)[44]) {
  uint32_t sum = 0x811C9DC5;
  for (size_t i = 0; i < 40; ++i) sum = (sum ^ words[i]) * 0x01000193;
  for (size_t i = 40; i < 44; ++i) words[i] = sum + static_cast<uint32_t>(i);
}

inline bool is_sealed(const Hb_Source_Route& route) {
  uint32_t words[44];
  std::memcpy(words, &route, sizeof words);
  uint32_t sealed[44];
  std::memcpy(sealed, words, sizeof sealed);
  seal(sealed);
  return std::memcmp(words, sealed, sizeof words) == 0;
}

}  // namespace hb_test
