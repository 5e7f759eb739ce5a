#include "hb_communication/configuration_parts.h"

#include <cstring>

void Configuration_Parts::start_vex_nodes() {
  nodes_by_number.reset(Hash_init("VEX_node list", prime(node_table_size)));
  nodes = std::make_unique<Hb_Node_config_state[]>(HB_MAX_NODES);
  node_count = 0;
}

void Configuration_Parts::add_vex_node(const Hb_Node_config_state& node) {
  Hb_Node_config_state& entry = nodes[static_cast<size_t>(node_count++)];
  entry = node;
  Hash_insert(static_cast<uint32_t>(node.node_num), nodes_by_number.get(), &entry);
}

void Configuration_Parts::start_vex_adapters(int room) {
  adapters = std::make_unique_for_overwrite<Hb_Adapter[]>(static_cast<size_t>(room));
  by_number.reset(Hash_init("Hb_Adapter list", prime(2 * room)));
  by_address.reset(Hash_init("Hb_IP list", prime(2 * room)));
  adapter_count = 0;
}

void Configuration_Parts::insert_by_number(Hb_Adapter& adapter) {
  Hash_insert(adapter.Hb_adapter_num, by_number.get(), &adapter);
}

void Configuration_Parts::insert_by_address(Hb_Adapter& adapter) {
  H_IPv6_key_t address;
  std::memcpy(&address, &adapter.Hb_ip_address, sizeof address);
  Hash_insert_IPv6(&address, by_address.get(), &adapter);
}
