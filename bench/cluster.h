// The cluster that is measured with, and the daemon's packets about it.
#pragma once

#include <cstddef>
#include <vector>

#include "hb_client/types.h"
#include "hb_protocol/configuration_message.h"
#include "hb_protocol/replies.h"

namespace bench {

using Bytes = std::vector<char>;

struct Cluster {
  int nodes = HB_MAX_NODES;
  int adapters_per_node = HB_MAX_NETWORKS;

  int adapters() const { return nodes * adapters_per_node; }
};

inline constexpr Cluster full_size{};

// A packet of that kind with a message of zeros.
Bytes packet(Hb_Client_Reply kind, size_t message_size);

// HB_CONFIGURATION_INFO or HB_CONFIGURATION_UPDATE. The address of an adapter holds the number of another one, so that
// looking up one after the other leads through all of them in random order.
Bytes configuration(Hb_Client_Reply kind, const Cluster& cluster);

// Every step-th adapter, from 0, with an incarnation.
Bytes adapter_event(Hb_Client_Reply kind, size_t count, size_t step);

// Every step-th node is in the event.
Bytes node_event(Hb_Client_Reply kind, const Cluster& cluster, int step);

// A failure-data identifier.
Bytes failure_data_event(size_t message_size);

// The bytes as they travel: the length first.
Bytes framed(const Bytes& packet);

Hb_IP_address6 address_with_number(uint32_t number);
uint32_t number_in_address(const Hb_IP_address6& address);

}  // namespace bench
