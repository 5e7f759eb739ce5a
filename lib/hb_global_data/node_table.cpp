#include "hb_global_data/node_table.h"

#include <algorithm>

#include "hb_communication/configuration_parts.h"
#include "hb_global_data/record_index.h"

Record_Index<Hb_Adapter, HB_MAX_ADAPTERS> adapter_index;
Record_Index<Hb_Node_config_state, HB_MAX_NODES> node_index;

// A number that comes twice leads to its last record, as it does in the tables.
void index_configuration() {
  const Hb_Configuration_Internal& table = global_config_tbl;
  adapter_index.start(table.adap_hash, adapter_number_limit(table));
  std::for_each_n(table.Hb_global_adapter_list, table.Hb_num_adapters,
                  [](Hb_Adapter& adapter) { adapter_index.add(adapter.Hb_adapter_num, adapter); });
  node_index.start(table.node_hash, static_cast<uint32_t>(table.Hb_max_nodes));
  std::for_each_n(table.node_list, table.Hb_num_nodes,
                  [](Hb_Node_config_state& node) { node_index.add(static_cast<uint32_t>(node.node_num), node); });
}

namespace {

bool has_configured_adapter(int node) {
  const auto slots = static_cast<Hb_Adapter_Number>(std::max(global_config_tbl.Hb_adapters_per_node, 0));
  const Hb_Adapter_Number first = static_cast<Hb_Adapter_Number>(node) * slots;
  for (Hb_Adapter_Number slot = 0; slot < slots; ++slot) {
    if (find_configured_adapter(first + slot) != nullptr) {
      return true;
    }
  }
  return false;
}

}  // namespace

void hb_init_global_node_tbl() {
  int32_t count = 0;
  for (int node = 0; node < global_config_tbl.Hb_max_nodes && node < HB_MAX_NODES; ++node) {
    const bool present = has_configured_adapter(node);
    global_node_tbl[node] = present ? Hb_True : Hb_False;
    count += present ? 1 : 0;
  }
  global_num_nodes = count;
}

void hb_deinit_global_config_and_node_tbl() {
  forget_configuration();
  delete[] global_config_tbl.Hb_global_adapter_list;
  global_config_tbl.Hb_global_adapter_list = nullptr;
  delete[] global_config_tbl.node_list;
  global_config_tbl.node_list = nullptr;
  free_and_forget(global_config_tbl.adap_hash);
  free_and_forget(global_config_tbl.ip_hash);
  free_and_forget(global_config_tbl.node_hash);
  global_num_nodes = 0;
}

Hb_Adapter* hb_get_adap_entry(Hb_Adapter_Number adap_num) {
  Hb_Adapter* adapter = find_configured_adapter(adap_num);
  return adapter != nullptr ? adapter : &HB_INVALID_ADAP;
}
