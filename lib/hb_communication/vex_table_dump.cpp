#include <netinet/in.h>

#include <algorithm>

#include "VEX_HBC_trace.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/address_text.h"
#include "vex_platform_records.h"

namespace {

void trace_node(const Hb_Node_config_state& node) {
  trace_values(Trace_Info, trace_table_node, node.node_num, node.state, node.reason);
}

// The address becomes text whether or not it is traced.
void trace_adapter(Hb_Adapter& adapter) {
  char address[INET6_ADDRSTRLEN];
  mowllib_ntop(&adapter.Hb_ip_address, address);
  trace_data(Trace_Info, trace_table_adapter,
             {block_of_name(adapter.Hb_adapter_type, sizeof adapter.Hb_adapter_type), block_of_text(address),
              block_of(adapter.Hb_adapter_num), block_of(adapter.Hb_state)});
}

}  // namespace

void hb_vex_dump_global_table(Hb_Configuration_Internal* table, const char* name) {
  if (table == nullptr) {
    return;
  }
  const Errno_Kept kept;
  trace_data(Trace_Info, trace_table, {block_of_text(name)});
  trace_values(Trace_Info, trace_table_numbers, table->Hb_num_nodes, table->Hb_max_nodes, table->local_node_number,
               table->Hb_num_adapters, table->Hb_adapters_per_node, table->Hb_num_networks);
  std::for_each_n(table->node_list, nodes_in_list(*table), trace_node);
  std::for_each_n(table->Hb_global_adapter_list, std::max(adapters_in_list(*table), 0), trace_adapter);
}
