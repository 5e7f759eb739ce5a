// Numbers of adapters and nodes as callers give them.
#pragma once

#include "hb_global_data/record_index.h"

// The adapter's record, or null with HB_EINVAL (beyond the cluster) or HB_ENOADAPTER set.
inline Hb_Adapter* configured_adapter(Hb_Adapter_Number adapter) {
  if (adapter >= adapter_number_limit(global_config_tbl)) {
    set_hb_errno(HB_EINVAL);
    return nullptr;
  }
  Hb_Adapter* record = find_configured_adapter(adapter);
  if (record == nullptr) {
    set_hb_errno(HB_ENOADAPTER);
  }
  return record;
}

// Fails with HB_EINVAL (beyond the cluster) or HB_ENONODE (no adapter of the node is configured).
inline Hb_Rc check_configured_node(Hb_Node_Number node) {
  if (!is_node_number(global_config_tbl, node)) {
    return fail(HB_EINVAL);
  }
  return global_node_tbl[node] == Hb_True ? Hb_Success : fail(HB_ENONODE);
}
