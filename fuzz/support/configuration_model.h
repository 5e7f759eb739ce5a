// What a configuration message says, read independently of the library, and how the answers to queries follow from it.
#pragma once

#include <array>
#include <vector>

#include "hb_client/configuration.h"
#include "hb_protocol/configuration_message.h"
#include "support/input.h"

namespace fuzz {

class Configuration_Model {
 public:
  Configuration_Model();

  // Whether the message is one that a client has to accept.
  static bool is_usable(Bytes message);

  // Empties the network slots.
  void clear_networks() { networks_ = {}; }

  // Takes over what a usable message says. Network slots that it does not fill keep what they had.
  void load(Bytes message);

  const hb_configuration_header& header() const { return header_; }
  const std::vector<Hb_Adapter>& adapters() const { return adapters_; }
  std::vector<Hb_Adapter>& adapters() { return adapters_; }
  uint32_t adapter_limit() const;
  int present_nodes() const { return present_nodes_; }

  bool is_node_number(int node) const { return node >= 0 && node < header_.max_nodes; }
  bool is_network_number(int network) const { return network >= 0 && network < header_.adapters_per_node; }
  bool is_present(int node) const { return present_[static_cast<size_t>(node)]; }
  bool is_used_network(int network) const;
  const Hb_Network& network(int number) const { return networks_[static_cast<size_t>(number)]; }

  // The adapter that a look-up by number finds: the last one of that number; null when there is none.
  Hb_Adapter* find(Hb_Adapter_Number number);
  bool has(Hb_Adapter_Number number) { return find(number) != nullptr; }

  // The number of a slot of a node.
  Hb_Adapter_Number number_of(int node, int offset) const;

 private:
  void find_present_nodes();

  hb_configuration_header header_{};
  std::vector<Hb_Adapter> adapters_;
  std::vector<bool> present_;  // by node number
  int present_nodes_ = 0;
  bool numbers_are_positions_ = false;  // every adapter stands at its number, as in the largest configuration
  std::array<Hb_Network, HB_MAX_NETWORKS> networks_{};
};

}  // namespace fuzz
