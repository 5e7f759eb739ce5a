// Who is up, as the cluster services see it, in terms of a configuration table.
#pragma once

#include "configuration_table.h"
#include "zu_vex.h"

// The table's adapter of the interface's node, name and address, or null.
Hb_Adapter* find_adapter_of_interface(const Hb_Configuration_Internal& table, const zu_vex_net_intf_info_t& interface);

// Whether the cluster services have the interface up; a stale one is in the state that is known of its adapter.
inline bool is_interface_up(const zu_vex_net_intf_info_t& interface, const Hb_Adapter& adapter) {
  return interface.status == ZU_VEX_INTF_STATUS_UP ||
         (interface.status == ZU_VEX_INTF_STATUS_STALE && adapter.Hb_state == Hb_Entity_Up);
}

// Whether the cluster services have a node of the configuration in force up. One that is down because its
// group-services daemon is stays down.
bool is_known_node_up(const zu_vex_node_info_t& node);

// The table that is in force when what is queued now is delivered.
Hb_Configuration_Internal& table_about_to_take_effect();
