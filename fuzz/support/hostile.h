// Arguments and record fields that no well-meaning caller would pass, taken from the front of an input.
#pragma once

#include <cstdint>

#include "hb_client/types.h"

namespace fuzz {

struct Hostile {
  int32_t cursor;
  int32_t group_type;
  int32_t group_events;
  uint32_t adapter;
  int32_t offset;
  int32_t subscription_type;
  int32_t subscription_count;
  int32_t subscription_events;
  int16_t node;
  int16_t network;
  uint16_t site;
  uint16_t flags;
  uint8_t address[16];  // serves as a text, too
  uint8_t members[8];   // at the front of a subscription's bit set
};

static_assert(sizeof(Hostile) == 64);

enum Hostile_Flag : uint16_t {
  wait_without_limit = 1,
  address_of_an_adapter = 2,  // look up an address that is there
  name_of_a_network = 4,      // look up a name that is there
  whole_node_list = 8,        // lengthen the packet with zeros to one entry for each node
};

}  // namespace fuzz
