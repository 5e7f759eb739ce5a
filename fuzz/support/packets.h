// Packets of a daemon, and the clusters that the targets start with.
#pragma once

#include <vector>

#include "hb_protocol/configuration_message.h"
#include "hb_protocol/replies.h"
#include "support/input.h"

namespace fuzz {

using Buffer = std::vector<uint8_t>;

// Messages of two configurations. The small one has what configurations can have: unused nodes, slots and networks, a
// repeated address, a number beyond the limit. In the large one every adapter number is in use.
Buffer small_configuration();
Buffer largest_configuration();

// A packet of that kind, with its length in front.
Buffer framed(int32_t kind, Bytes message);

// Makes a usable configuration message small enough to be checked quickly; leaves any other as it is.
void shrink_configuration(std::span<uint8_t> message);

// A field of a packet; zero where the packet ended before it.
template <typename T>
T field(Bytes packet, size_t offset) {
  T value{};
  if (offset < packet.size()) {
    std::memcpy(&value, packet.data() + offset, std::min(sizeof value, packet.size() - offset));
  }
  return value;
}

inline Bytes message_of(Bytes packet) { return packet.subspan(std::min<size_t>(packet.size(), HB_REPLY_HEADER_SIZE)); }

}  // namespace fuzz
