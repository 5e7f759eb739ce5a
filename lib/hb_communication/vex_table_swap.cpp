#include <algorithm>
#include <cstring>
#include <memory>
#include <new>

#include "VEX_HBC_trace.h"
#include "hb_communication/configuration_parts.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/record_index.h"

namespace {

// Whether the table was built since it was emptied.
bool is_built(const Hb_Configuration_Internal& table) {
  return table.node_list != nullptr || table.Hb_global_adapter_list != nullptr || table.Hb_max_nodes != 0;
}

// Throws std::bad_alloc, as the next does.
void copy_nodes(const Hb_Configuration_Internal& from, Configuration_Parts& parts) {
  parts.nodes_by_number.reset(Hash_init("VEX_node list", prime(node_table_size)));
  parts.nodes = std::make_unique<Hb_Node_config_state[]>(HB_MAX_NODES);
  trace_values(Trace_Info, trace_table_copied, from.Hb_num_nodes);
  parts.node_count = nodes_in_list(from);
  std::copy_n(from.node_list, parts.node_count, parts.nodes.get());
  std::for_each_n(parts.nodes.get(), parts.node_count, [&](Hb_Node_config_state& node) {
    Hash_insert(static_cast<uint32_t>(node.node_num), parts.nodes_by_number.get(), &node);
  });
}

void copy_adapters(const Hb_Configuration_Internal& from, Configuration_Parts& parts) {
  const int count = std::max(adapters_in_list(from), 0);
  parts.adapters = std::make_unique_for_overwrite<Hb_Adapter[]>(static_cast<size_t>(count));
  parts.by_number.reset(Hash_init("Hb_Adapter list", prime(2 * count)));
  parts.by_address.reset(Hash_init("Hb_IP list", prime(2 * count)));
  std::copy_n(from.Hb_global_adapter_list, count, parts.adapters.get());
  std::for_each_n(parts.adapters.get(), count, [&](Hb_Adapter& adapter) {
    H_IPv6_key_t address;
    std::memcpy(&address, &adapter.Hb_ip_address, sizeof address);
    Hash_insert(adapter.Hb_adapter_num, parts.by_number.get(), &adapter);
    Hash_insert_IPv6(&address, parts.by_address.get(), &adapter);
  });
}

// Sites and the periods of simulated death stay those of the table in force.
void copy_numbers_and_networks(const Hb_Configuration_Internal& from, Hb_Configuration_Internal& to) {
  to.Hb_num_adapters = std::max(adapters_in_list(from), 0);
  std::copy(std::begin(from.Hb_global_network_list), std::end(from.Hb_global_network_list),
            std::begin(to.Hb_global_network_list));
  to.local_node_number = from.local_node_number;
  to.Hb_max_nodes = from.Hb_max_nodes;
  to.Hb_adapters_per_node = from.Hb_adapters_per_node;
  to.Hb_num_networks = from.Hb_num_networks;
}

void free_and_forget(H_table_str*& table) {
  if (table != nullptr) {
    Hash_free(table);
    table = nullptr;
  }
}

}  // namespace

void VEX_copy_and_delete_global_config_tbl() {
  if (!is_built(global_config_tbl_new)) {
    return;
  }
  Configuration_Parts copy;
  try {
    copy_nodes(global_config_tbl_new, copy);
    copy_adapters(global_config_tbl_new, copy);
  } catch (const std::bad_alloc&) {
    set_hb_errno(HB_EVEXTBL_COPY);
    return;
  }
  empty_global_config_table(&global_config_tbl);
  copy.release_to(global_config_tbl);
  copy_numbers_and_networks(global_config_tbl_new, global_config_tbl);
  empty_global_config_table(&global_config_tbl_new);
  index_configuration();
}

void empty_global_config_table(Hb_Configuration_Internal* table) {
  if (table == nullptr) {
    return;
  }
  if (table == &global_config_tbl) {
    forget_configuration();
  }
  delete[] table->Hb_global_adapter_list;
  table->Hb_global_adapter_list = nullptr;
  delete[] table->node_list;
  table->node_list = nullptr;
  free_and_forget(table->adap_hash);
  free_and_forget(table->ip_hash);
  free_and_forget(table->node_hash);
  free_and_forget(table->site_hash);
  table->local_node_number = 0;
  table->Hb_max_nodes = 0;
  table->Hb_num_nodes = 0;
  table->Hb_adapters_per_node = 0;
  table->Hb_num_adapters = 0;
  table->Hb_num_networks = 0;
}
