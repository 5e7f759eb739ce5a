#include "VEX_untold_changes.h"

#include <algorithm>
#include <cstring>

#include "platform_membership.h"

namespace {

void hold_back(Hb_Node_config_state& node) {
  const auto number = static_cast<uint32_t>(node.node_num);
  const auto* present = static_cast<const Hb_Node_config_state*>(Hash_search(number, global_config_tbl.node_hash));
  node.state = present != nullptr ? present->state : Hb_Entity_Down;
  node.reason = present != nullptr ? present->reason : Hb_Entity_State_Reason_Down;
}

void hold_back(Hb_Adapter& adapter, uint32_t node) {
  zu_vex_net_intf_info_t interface = {};
  interface.node_number = node;
  interface.p_name = adapter.Hb_adapter_type;
  std::memcpy(&interface.ip_addr, &adapter.Hb_ip_address, sizeof interface.ip_addr);
  const Hb_Adapter* present = find_adapter_of_interface(global_config_tbl, interface);
  adapter.Hb_state = present != nullptr ? present->Hb_state : Hb_Entity_Down;
}

}  // namespace

void hold_back_changes_of_others(Hb_Configuration_Internal& new_table, uint32_t node) {
  std::for_each_n(new_table.node_list, nodes_in_list(new_table), [node](Hb_Node_config_state& other) {
    if (static_cast<uint32_t>(other.node_num) != node) {
      hold_back(other);
    }
  });
  if (new_table.Hb_adapters_per_node <= 0) {
    return;
  }
  const auto slots = static_cast<uint32_t>(new_table.Hb_adapters_per_node);
  std::for_each_n(new_table.Hb_global_adapter_list, adapters_in_list(new_table), [node, slots](Hb_Adapter& adapter) {
    const uint32_t other = adapter.Hb_adapter_num / slots;
    if (other != node) {
      hold_back(adapter, other);
    }
  });
}
