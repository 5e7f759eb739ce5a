#include "platform_membership.h"

#include <cstring>

#include "hb_global_data/record_index.h"
#include "vex_platform_records.h"

namespace {

bool is_same(const Hb_Configuration_Internal& table, const Hb_Adapter& adapter,
             const zu_vex_net_intf_info_t& interface) {
  const char* name = interface.p_name != nullptr ? interface.p_name : "";
  return is_adapter_of(table, adapter, interface.node_number) &&
         std::strncmp(adapter.Hb_adapter_type, name, interface_name_length) == 0 &&
         std::memcmp(&adapter.Hb_ip_address, &interface.ip_addr, sizeof interface.ip_addr) == 0;
}

// Two adapters may have one address, and the table of addresses has one of them. A node has few adapters.
Hb_Adapter* search_node(const Hb_Configuration_Internal& table, const zu_vex_net_intf_info_t& interface) {
  return find_adapter_of(table, interface.node_number,
                         [&](const Hb_Adapter& adapter) { return is_same(table, adapter, interface); });
}

}  // namespace

Hb_Adapter* find_adapter_of_interface(const Hb_Configuration_Internal& table, const zu_vex_net_intf_info_t& interface) {
  H_IPv6_key_t key;
  std::memcpy(&key, &interface.ip_addr, sizeof key);
  auto* adapter = static_cast<Hb_Adapter*>(Hash_search_IPv6(&key, table.ip_hash));
  if (adapter != nullptr && !is_same(table, *adapter, interface)) {
    adapter = search_node(table, interface);
  }
  return adapter;
}

bool is_known_node_up(const zu_vex_node_info_t& node) {
  const Hb_Node_config_state* known = node.number < HB_MAX_NODES ? find_configured_node(node.number) : nullptr;
  return known != nullptr && node.status == ZU_VEX_NODE_STATUS_UP &&
         (known->state != Hb_Entity_Down || known->reason != Hb_Entity_State_Reason_BRIXD_Down);
}

Hb_Configuration_Internal& table_about_to_take_effect() {
  return global_config_tbl_new.ip_hash != nullptr ? global_config_tbl_new : global_config_tbl;
}
