// The configuration table: the one in-memory description of the cluster.
#pragma once

#include <algorithm>

#include "hash.h"
#include "hb_client/configuration.h"

struct Hb_Configuration_Internal {
  Hb_Node_Number local_node_number;
  int Hb_max_nodes;
  int Hb_num_nodes;          // as loaded; the node-count query reports global_num_nodes
  int Hb_adapters_per_node;  // also the number of network slots that the network queries range over
  int Hb_num_adapters;
  int Hb_num_networks;
  int Hb_max_sites;
  int Hb_num_sites;
  timeval Hb_rem_node_down_sim_period;
  timeval Hb_local_node_down_sim_period;
  Hb_Adapter* Hb_global_adapter_list;  // Hb_num_adapters records, owned
  Hb_Network Hb_global_network_list[HB_MAX_NETWORKS];
  H_table_str* adap_hash;           // by adapter number
  H_table_str* ip_hash;             // by address
  H_table_str* node_hash;           // by node number
  H_table_str* site_hash;           // filled by nothing
  Hb_Node_config_state* node_list;  // HB_MAX_NODES records, owned
  Hb_Site* site_list;
};

// Adapter numbers of a cluster are below this; 0 before a configuration is loaded.
inline Hb_Adapter_Number adapter_number_limit(const Hb_Configuration_Internal& table) {
  return static_cast<Hb_Adapter_Number>(std::max(table.Hb_adapters_per_node, 0)) *
         static_cast<Hb_Adapter_Number>(std::max(table.Hb_max_nodes, 0));
}

// How many records the adapter list holds; none while there is no list.
inline int adapters_in_list(const Hb_Configuration_Internal& table) {
  return table.Hb_global_adapter_list != nullptr ? table.Hb_num_adapters : 0;
}

// The same of the node list, whatever the count says.
inline int nodes_in_list(const Hb_Configuration_Internal& table) {
  return table.node_list != nullptr ? std::clamp<int>(table.Hb_num_nodes, 0, HB_MAX_NODES) : 0;
}

// An adapter's number says whose it is.
inline bool is_adapter_of(const Hb_Configuration_Internal& table, const Hb_Adapter& adapter, uint32_t node) {
  return node < HB_MAX_NODES && table.Hb_adapters_per_node > 0 &&
         adapter.Hb_adapter_num / static_cast<uint32_t>(table.Hb_adapters_per_node) == node;
}

// The first adapter of the node, by its number, that `is_it` holds for, or null. Numbers that no list of adapters has a
// place for are left out.
template <typename Is_It>
Hb_Adapter* find_adapter_of(const Hb_Configuration_Internal& table, uint32_t node, Is_It is_it) {
  if (node >= HB_MAX_NODES || table.Hb_adapters_per_node <= 0) {
    return nullptr;
  }
  const auto slots = static_cast<uint64_t>(table.Hb_adapters_per_node);
  const uint64_t end = std::min<uint64_t>((node + uint64_t{1}) * slots, HB_MAX_ADAPTERS);
  for (uint64_t number = node * slots; number < end; ++number) {
    auto* adapter = static_cast<Hb_Adapter*>(Hash_search(static_cast<uint32_t>(number), table.adap_hash));
    if (adapter != nullptr && is_it(*adapter)) {
      return adapter;
    }
  }
  return nullptr;
}

// Calls use(adapter) for each of them.
template <typename Use>
void for_each_adapter_of(const Hb_Configuration_Internal& table, uint32_t node, Use use) {
  find_adapter_of(table, node, [&](Hb_Adapter& adapter) {
    use(adapter);
    return false;
  });
}

inline bool is_node_number(const Hb_Configuration_Internal& table, int node) {
  return node >= 0 && node < table.Hb_max_nodes;
}

// A network number is checked against the adapters per node, which may be more than the slots that exist.
inline bool is_network_number(const Hb_Configuration_Internal& table, int network) {
  return network >= 0 && network < table.Hb_adapters_per_node;
}
