// The system that the library runs on in a target. Its calls are answered from memory, so that a run makes none of its
// own: the daemon's end of the connection, the segments, and whatever the input makes fail.
#pragma once

#include <array>
#include <cerrno>

#include "hb_protocol/shared_memory.h"
#include "support/input.h"

namespace fuzz {

inline constexpr int descriptor = 900;  // of the connection; no descriptor of the fuzzer itself gets that high

// What the library sent last, as far as it fits.
struct Sent {
  std::array<uint8_t, 256> front;
  size_t length;  // framing included

  template <typename T>
  T at(size_t offset) const {
    T value;
    std::memcpy(&value, front.data() + offset, sizeof value);
    return value;
  }
};

struct System {
  Bytes stream;  // what the daemon has sent and nobody has read
  Bytes script;  // how the next calls go, one byte for each; afterwards all go well

  Sent sent;
  size_t largest_array;  // that there is memory for
  int open_connections;
  int attached_segments;
  int readers;  // inside the shared memory

  memory_configuration_data configuration;
  size_t route_segment_size;  // no larger than route_segment below
  std::array<route_sequence, 64> route_segment;
  security_information security;

  // The number of the next call's fault, 0 for none; the rest of its byte in `detail`.
  unsigned next_fault(unsigned& detail);
};

extern System the_system;

}  // namespace fuzz
