#include "support/configuration_model.h"

#include <algorithm>

namespace fuzz {

namespace {

bool lies_within(int64_t value, int64_t low, int64_t high) { return value >= low && value <= high; }

hb_configuration_header header_of(Bytes message) {
  return Input(message.data(), message.size()).take<hb_configuration_header>();
}

}  // namespace

Configuration_Model::Configuration_Model() : present_(HB_MAX_NODES) {}

bool Configuration_Model::is_usable(Bytes message) {
  const hb_configuration_header header = header_of(message);
  const int64_t needed = 52 + int64_t{64} * header.num_adapters + int64_t{86} * header.num_networks;
  return message.size() >= 52 && lies_within(header.max_nodes, 0, 2049) &&
         lies_within(header.adapters_per_node, 1, 98352) &&
         lies_within(int64_t{header.max_nodes} * header.adapters_per_node, 0, 98352) &&
         lies_within(header.num_adapters, 0, 98352) && lies_within(header.num_networks, 0, 48) &&
         lies_within(needed, 52, static_cast<int64_t>(message.size()));
}

void Configuration_Model::load(Bytes message) {
  Input input(message.data(), message.size());
  header_ = input.take<hb_configuration_header>();
  adapters_.resize(static_cast<size_t>(header_.num_adapters));
  Hb_Adapter_Number position = 0;
  numbers_are_positions_ = true;
  for (Hb_Adapter& adapter : adapters_) {
    adapter = input.take<Hb_Adapter>();
    numbers_are_positions_ = numbers_are_positions_ && adapter.Hb_adapter_num == position++;
  }
  for (int network = 0; network < header_.num_networks; ++network) {
    networks_[static_cast<size_t>(network)] = input.take<Hb_Network>();
  }
  find_present_nodes();
}

void Configuration_Model::find_present_nodes() {
  std::fill(present_.begin(), present_.end(), false);
  for (const Hb_Adapter& adapter : adapters_) {
    if (adapter.Hb_adapter_num < adapter_limit()) {
      present_[adapter.Hb_adapter_num / static_cast<uint32_t>(header_.adapters_per_node)] = true;
    }
  }
  present_nodes_ = static_cast<int>(std::count(present_.begin(), present_.end(), true));
}

uint32_t Configuration_Model::adapter_limit() const {
  return static_cast<uint32_t>(header_.max_nodes) * static_cast<uint32_t>(header_.adapters_per_node);
}

bool Configuration_Model::is_used_network(int network) const {
  return network >= 0 && network < HB_MAX_NETWORKS &&
         networks_[static_cast<size_t>(network)].Hb_network_name[0] != '\0';
}

Hb_Adapter* Configuration_Model::find(Hb_Adapter_Number number) {
  if (numbers_are_positions_) {
    return number < adapters_.size() ? &adapters_[number] : nullptr;
  }
  const auto found = std::find_if(adapters_.rbegin(), adapters_.rend(),
                                  [number](const Hb_Adapter& adapter) { return adapter.Hb_adapter_num == number; });
  return found != adapters_.rend() ? &*found : nullptr;
}

Hb_Adapter_Number Configuration_Model::number_of(int node, int offset) const {
  return static_cast<uint32_t>(node) * static_cast<uint32_t>(header_.adapters_per_node) + static_cast<uint32_t>(offset);
}

}  // namespace fuzz
