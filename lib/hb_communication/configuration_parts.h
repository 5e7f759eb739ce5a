// What a configuration table owns, while it is built beside the one in force.
#pragma once

#include <memory>

#include "hb_global_data/state.h"

struct Hash_Release {
  void operator()(H_table_str* table) const { Hash_free(table); }
};
using Hash_Table = std::unique_ptr<H_table_str, Hash_Release>;

struct Configuration_Parts {
  std::unique_ptr<Hb_Adapter[]> adapters;
  Hash_Table by_number;
  Hash_Table nodes_by_number;
  std::unique_ptr<Hb_Node_config_state[]> nodes;
  Hash_Table by_address;
  int node_count = 0;

  // Hands everything over to a table that owns nothing of the kind.
  void release_to(Hb_Configuration_Internal& table) {
    table.Hb_num_nodes = node_count;
    table.Hb_global_adapter_list = adapters.release();
    table.adap_hash = by_number.release();
    table.node_hash = nodes_by_number.release();
    table.node_list = nodes.release();
    table.ip_hash = by_address.release();
  }
};

inline constexpr int node_table_size = 4098;  // twice the nodes that a cluster can have
