// Where routes are written, filled with a pattern, and a route that differs in each byte.
#pragma once

#include <cstring>

#include "hb_client/route.h"
#include "support/bytes.h"

namespace hb_test {

struct Route_Outputs {
  Route_Outputs() { std::memset(&route, 0xB7, sizeof route); }

  Bytes hops() const { return Bytes(reinterpret_cast<const char*>(&route), sizeof route); }
  bool untouched() const { return length == 0xB7B7 && hops() == Bytes(176, '\xB7'); }

  Hb_Source_Route route;
  unsigned short length = 0xB7B7;
};

inline Bytes some_hops() {
  ByteBuilder hops;
  for (int byte = 0; byte < 176; ++byte) {
    hops.u8(static_cast<uint8_t>(byte));
  }
  return hops.bytes();
}

}  // namespace hb_test
