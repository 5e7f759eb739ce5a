#include "hb_communication/configuration_load.h"

#include <arpa/inet.h>

#include <algorithm>
#include <cstddef>
#include <new>

#include "VEX_HBC_trace.h"
#include "hb_communication/configuration_parts.h"
#include "hb_global_data/address_text.h"
#include "hb_global_data/node_table.h"
#include "hb_global_data/record_index.h"
#include "hb_protocol/configuration_message.h"

namespace {

size_t adapters_end(const hb_configuration_header& header) {
  return sizeof header + static_cast<size_t>(header.num_adapters) * sizeof(Hb_Adapter);
}

bool in_range(int value, int low, int high) { return value >= low && value <= high; }

// Whether the table can hold it and the message has all of it.
bool is_usable(const Message& message) {
  if (!message.holds(0, sizeof(hb_configuration_header))) {
    return false;
  }
  const auto header = message.at<hb_configuration_header>(0);
  return in_range(header.max_nodes, 0, HB_MAX_NODES) && in_range(header.adapters_per_node, 1, HB_MAX_ADAPTERS) &&
         int64_t{header.max_nodes} * header.adapters_per_node <= HB_MAX_ADAPTERS &&
         in_range(header.num_adapters, 0, HB_MAX_ADAPTERS) && in_range(header.num_networks, 0, HB_MAX_NETWORKS) &&
         message.holds(adapters_end(header), static_cast<size_t>(header.num_networks) * sizeof(Hb_Network));
}

void add_node(Configuration_Parts& tables, Hb_Adapter_Number node) {
  if (Hash_search(node, tables.nodes_by_number.get()) != nullptr) {
    return;
  }
  Hb_Node_config_state& entry = tables.nodes[static_cast<size_t>(tables.node_count)];
  entry.node_num = static_cast<Hb_Node_Number>(node);
  Hash_insert(node, tables.nodes_by_number.get(), &entry);
  ++tables.node_count;
}

void trace_repeated_address(Hb_Adapter& adapter) {
  if (!trace_is_on(Trace_Info)) {
    return;
  }
  char address[INET6_ADDRSTRLEN];
  mowllib_ntop(&adapter.Hb_ip_address, address);
  trace_data(Trace_Info, trace_adapter_address_repeated,
             {block_of_text(address), block_of_name(adapter.Hb_adapter_type, sizeof adapter.Hb_adapter_type),
              block_of(adapter.Hb_adapter_num), block_of(adapter.Hb_state)});
}

void add_address(Configuration_Parts& tables, Hb_Adapter& adapter) {
  H_IPv6_key_t key;
  std::memcpy(&key, &adapter.Hb_ip_address, sizeof key);
  if (Hash_search_IPv6(&key, tables.by_address.get()) != nullptr) {
    trace_repeated_address(adapter);
  } else {
    Hash_insert_IPv6(&key, tables.by_address.get(), &adapter);
  }
}

void add_adapter(Configuration_Parts& tables, const hb_configuration_header& header, Hb_Adapter& adapter) {
  const Hb_Adapter_Number number = adapter.Hb_adapter_num;
  Hash_insert(number, tables.by_number.get(), &adapter);
  const Hb_Adapter_Number node = number / static_cast<Hb_Adapter_Number>(header.adapters_per_node);
  trace_values(Trace_Info, trace_adapter_loaded, number, node);
  if (node < static_cast<Hb_Adapter_Number>(header.max_nodes)) {
    add_node(tables, node);
  }
  add_address(tables, adapter);
}

// Throws std::bad_alloc.
void build(Configuration_Parts& tables, const hb_configuration_header& header, const Message& message) {
  const auto count = static_cast<size_t>(header.num_adapters);
  tables.adapters = std::make_unique_for_overwrite<Hb_Adapter[]>(count);
  tables.adapter_count = header.num_adapters;
  tables.by_number.reset(Hash_init("Hb_Adapter list", prime(header.num_adapters * 2)));
  tables.nodes_by_number.reset(Hash_init("preVEX_node list", prime(node_table_size)));
  tables.nodes = std::make_unique<Hb_Node_config_state[]>(HB_MAX_NODES);
  tables.by_address.reset(Hash_init("preVEX_Hb_IP list", prime(header.num_adapters * 2)));
  message.copy(tables.adapters.get(), sizeof header, count * sizeof(Hb_Adapter));
  std::for_each_n(tables.adapters.get(), count, [&](Hb_Adapter& adapter) { add_adapter(tables, header, adapter); });
}

void install(Configuration_Parts& tables, const hb_configuration_header& header, const Message& message) {
  Hb_Configuration_Internal& table = global_config_tbl;
  table.local_node_number = static_cast<Hb_Node_Number>(header.local_node_number);
  table.Hb_max_nodes = header.max_nodes;
  table.Hb_adapters_per_node = header.adapters_per_node;
  table.Hb_num_networks = header.num_networks;
  // The periods are not aligned in the header: no reference to them may be made.
  table.Hb_rem_node_down_sim_period = message.at<timeval>(offsetof(hb_configuration_header, rem_node_down_sim_period));
  table.Hb_local_node_down_sim_period =
      message.at<timeval>(offsetof(hb_configuration_header, local_node_down_sim_period));
  tables.release_to(table);
  message.copy(table.Hb_global_network_list, adapters_end(header),
               static_cast<size_t>(header.num_networks) * sizeof(Hb_Network));
  index_configuration();
}

// Builds beside the table in force, so that a failure changes nothing, and calls make_room before the exchange.
template <typename Make_Room>
Hb_Rc load(const Message& message, Make_Room make_room) {
  if (!is_usable(message)) {
    return fail(HB_EBADREPLY);
  }
  const auto header = message.at<hb_configuration_header>(0);
  try {
    Configuration_Parts tables;
    build(tables, header, message);
    make_room();
    install(tables, header, message);
  } catch (const std::bad_alloc&) {
    return fail(HB_ENOMEM);
  }
  return Hb_Success;
}

}  // namespace

bool is_usable_configuration(const Packet& packet) { return is_usable(Message(packet)); }

void hb_get_adapter_network(client_packet_t* recv_pack) {
  load(Message(recv_pack), [] {});
}

Hb_Rc load_first_configuration(const Packet& packet) {
  return load(Message(packet), [] {});
}

Hb_Rc load_configuration_update(const Packet& packet) {
  const Hb_Rc rc = load(Message(packet), hb_deinit_global_config_and_node_tbl);
  if (rc == Hb_Success) {
    hb_init_global_node_tbl();
  }
  return rc;
}
