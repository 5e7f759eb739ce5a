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
  int adapter_count = 0;

  // The lists and hash tables of VEX mode, first empty, then record by record. No more adapters are added than there
  // is room for, and no more nodes than a cluster can have. All but adding to a list throw std::bad_alloc.
  void start_vex_nodes();
  void add_vex_node(const Hb_Node_config_state& node);
  void start_vex_adapters(int room);
  Hb_Adapter& append_adapter(const Hb_Adapter& adapter) {
    return adapters[static_cast<size_t>(adapter_count++)] = adapter;
  }
  void insert_by_number(Hb_Adapter& adapter);
  void insert_by_address(Hb_Adapter& adapter);

  // Hands everything over to a table that owns nothing of the kind.
  void release_to(Hb_Configuration_Internal& table) {
    table.Hb_num_nodes = node_count;
    table.Hb_num_adapters = adapter_count;
    table.Hb_global_adapter_list = adapters.release();
    table.adap_hash = by_number.release();
    table.node_hash = nodes_by_number.release();
    table.node_list = nodes.release();
    table.ip_hash = by_address.release();
  }
};

inline constexpr int node_table_size = 4098;  // twice the nodes that a cluster can have

inline void free_and_forget(H_table_str*& table) {
  Hash_free(table);
  table = nullptr;
}
