// The table that waits to take effect was built before what is told now, and must not bring back what was before it.
#pragma once

#include "hb_global_data/state.h"

inline void mark_adapters_down_in_waiting_table(uint32_t node) {
  for_each_adapter_of(global_config_tbl_new, node, [](Hb_Adapter& adapter) { adapter.Hb_state = Hb_Entity_Down; });
}

inline void mark_node_down_in_waiting_table(uint32_t number, Hb_Entity_State_Reason reason) {
  auto* node = static_cast<Hb_Node_config_state*>(Hash_search(number, global_config_tbl_new.node_hash));
  if (node != nullptr && node->state == Hb_Entity_Up) {
    node->state = Hb_Entity_Down;
    node->reason = reason;
  }
  mark_adapters_down_in_waiting_table(number);
}
