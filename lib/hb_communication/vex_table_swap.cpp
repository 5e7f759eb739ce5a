#include <algorithm>
#include <memory>
#include <new>

#include "VEX_HBC_trace.h"
#include "hb_communication/configuration_parts.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/record_index.h"

namespace {

// Throws std::bad_alloc, as the next does.
void copy_nodes(const Hb_Configuration_Internal& from, Configuration_Parts& parts) {
  parts.start_vex_nodes();
  trace_values(Trace_Info, trace_table_copied, from.Hb_num_nodes);
  std::for_each_n(from.node_list, nodes_in_list(from),
                  [&](const Hb_Node_config_state& node) { parts.add_vex_node(node); });
}

void copy_adapters(const Hb_Configuration_Internal& from, Configuration_Parts& parts) {
  const int count = std::max(adapters_in_list(from), 0);
  parts.start_vex_adapters(count);
  std::for_each_n(from.Hb_global_adapter_list, count, [&](const Hb_Adapter& each) {
    Hb_Adapter& adapter = parts.append_adapter(each);
    parts.insert_by_number(adapter);
    parts.insert_by_address(adapter);
  });
}

// Sites and the periods of simulated death stay those of the table in force.
void copy_numbers_and_networks(const Hb_Configuration_Internal& from, Hb_Configuration_Internal& to) {
  std::copy(std::begin(from.Hb_global_network_list), std::end(from.Hb_global_network_list),
            std::begin(to.Hb_global_network_list));
  to.local_node_number = from.local_node_number;
  to.Hb_max_nodes = from.Hb_max_nodes;
  to.Hb_adapters_per_node = from.Hb_adapters_per_node;
  to.Hb_num_networks = from.Hb_num_networks;
}

void release_contents(Hb_Configuration_Internal& table) {
  delete[] table.Hb_global_adapter_list;
  delete[] table.node_list;
  for (H_table_str* hash_table : {table.adap_hash, table.ip_hash, table.node_hash, table.site_hash}) {
    Hash_free(hash_table);
  }
}

}  // namespace

void VEX_copy_and_delete_global_config_tbl() {
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

// An event before this one may have put the new table in force.
Hb_Rc put_waiting_table_in_force() {
  if (!is_table_built(global_config_tbl_new)) {
    trace_values(Trace_Info, trace_table_copied, 0);
    return Hb_Success;
  }
  VEX_copy_and_delete_global_config_tbl();
  return is_table_built(global_config_tbl_new) ? Hb_Failure : Hb_Success;
}

bool is_table_built(const Hb_Configuration_Internal& table) {
  const bool has_numbers = table.local_node_number != 0 || table.Hb_max_nodes != 0 || table.Hb_num_nodes != 0 ||
                           table.Hb_adapters_per_node != 0 || table.Hb_num_adapters != 0 || table.Hb_num_networks != 0;
  const bool has_lists = table.Hb_global_adapter_list != nullptr || table.node_list != nullptr;
  const bool has_hash_tables = table.adap_hash != nullptr || table.ip_hash != nullptr || table.node_hash != nullptr ||
                               table.site_hash != nullptr;
  return has_numbers || has_lists || has_hash_tables;
}

void forget_contents(Hb_Configuration_Internal& table) {
  table.Hb_global_adapter_list = nullptr;
  table.node_list = nullptr;
  table.adap_hash = nullptr;
  table.ip_hash = nullptr;
  table.node_hash = nullptr;
  table.site_hash = nullptr;
  table.local_node_number = 0;
  table.Hb_max_nodes = 0;
  table.Hb_num_nodes = 0;
  table.Hb_adapters_per_node = 0;
  table.Hb_num_adapters = 0;
  table.Hb_num_networks = 0;
}

void empty_global_config_table(Hb_Configuration_Internal* table) {
  if (table == nullptr) {
    return;
  }
  if (table == &global_config_tbl) {
    forget_configuration();
  }
  release_contents(*table);
  forget_contents(*table);
}
