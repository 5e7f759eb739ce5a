#include "hb_client/configuration.h"

#include <arpa/inet.h>

#include <algorithm>
#include <cstring>

#include "VEX_HBC_trace.h"
#include "argument_check.h"
#include "configured_numbers.h"
#include "hb_global_data/address_text.h"
#include "hb_global_data/node_table.h"
#include "hb_global_data/record_index.h"
#include "network_slots.h"

namespace {

const Hb_Configuration_Internal& table() { return global_config_tbl; }

bool is_configured(Hb_Adapter_Number adapter) { return find_configured_adapter(adapter) != nullptr; }

Hb_Adapter_Number adapter_in_slot(int node, int offset) {
  return static_cast<Hb_Adapter_Number>(node) * static_cast<Hb_Adapter_Number>(table().Hb_adapters_per_node) +
         static_cast<Hb_Adapter_Number>(offset);
}

// Copies a text field with a terminator into a buffer of the field's size.
template <size_t N>
void copy_text(char* to, const char (&from)[N]) {
  const size_t length = strnlen(from, N - 1);
  std::memcpy(to, from, length);
  to[length] = '\0';
}

// The common part of all walkers: the first position that qualifies, from the start or the cursor up to the bound.
template <typename Item, typename Qualifies, typename Item_At>
Hb_Rc walk(Item* item, Hb_Cursor* cursor, int trans, int bound, Item none, Qualifies qualifies, Item_At item_at) {
  const int start = trans == 1 ? 0 : *cursor;
  for (int position = start; position >= 0 && position < bound; ++position) {
    if (qualifies(position)) {
      *item = item_at(position);
      *cursor = position + 1;
      return Hb_Success;
    }
  }
  *item = none;
  return fail(HB_ENOMORE);
}

Hb_Rc process_node_number_list(Hb_Node_Number* node, Hb_Cursor* cursor, int trans) {
  if (start_with(node, cursor) != Hb_Success) {
    return Hb_Failure;
  }
  return walk(
      node, cursor, trans, std::min<int>(table().Hb_max_nodes, HB_MAX_NODES), HB_NO_NODE,
      [](int position) { return global_node_tbl[position] == Hb_True; },
      [](int position) { return static_cast<Hb_Node_Number>(position); });
}

Hb_Rc process_adapter_number_list(Hb_Adapter_Number* adapter, Hb_Cursor* cursor, int trans) {
  if (start_with(adapter, cursor) != Hb_Success) {
    return Hb_Failure;
  }
  return walk(
      adapter, cursor, trans, adapters_in_list(table()), HB_NO_ADAPTER, [](int) { return true; },
      [](int position) { return table().Hb_global_adapter_list[position].Hb_adapter_num; });
}

Hb_Rc process_adapter_in_node_list(Hb_Node_Number node, Hb_Adapter_Number* adapter, Hb_Cursor* cursor, int trans) {
  if (start_with(adapter, cursor) != Hb_Success || check_configured_node(node) != Hb_Success) {
    return Hb_Failure;
  }
  return walk(
      adapter, cursor, trans, table().Hb_adapters_per_node, HB_NO_ADAPTER,
      [node](int offset) { return is_configured(adapter_in_slot(node, offset)); },
      [node](int offset) { return adapter_in_slot(node, offset); });
}

Hb_Rc process_network_number_list(Hb_Network_Number* network, Hb_Cursor* cursor, int trans) {
  if (start_with(network, cursor) != Hb_Success) {
    return Hb_Failure;
  }
  return walk(
      network, cursor, trans, table().Hb_adapters_per_node, HB_NO_NETWORK,
      [](int position) { return is_used_network(table(), position); },
      [](int position) { return static_cast<Hb_Network_Number>(position); });
}

Hb_Rc process_adapter_in_network_list(Hb_Network_Number network, Hb_Adapter_Number* adapter, Hb_Cursor* cursor,
                                      int trans) {
  if (start_with(adapter, cursor) != Hb_Success || check_configured_network(table(), network) != Hb_Success) {
    return Hb_Failure;
  }
  return walk(
      adapter, cursor, trans, adapters_in_list(table()), HB_NO_ADAPTER,
      [network](int position) { return table().Hb_global_adapter_list[position].Hb_network == network; },
      [](int position) { return table().Hb_global_adapter_list[position].Hb_adapter_num; });
}

Hb_Rc process_site_number_list(Hb_Site_Number* site, Hb_Cursor* cursor, int trans) {
  if (start_with(site, cursor) != Hb_Success) {
    return Hb_Failure;
  }
  return walk(
      site, cursor, trans, std::min<int>(table().Hb_max_sites, HB_MAX_SITES), HB_NO_SITE,
      [](int position) { return global_site_tbl[position] == Hb_True; },
      [](int position) { return static_cast<Hb_Site_Number>(position); });
}

[[gnu::cold, gnu::noinline]] void trace_address(Hb_IP_address6* address, Hb_Adapter_Number adapter) {
  char text[INET6_ADDRSTRLEN];
  mowllib_ntop(address, text);
  trace_data(Trace_Info, trace_address_of_adapter, {block_of_text(text), block_of(adapter)});
}

Hb_Rc get_number(int value, int* number) {
  *number = value;
  return Hb_Success;
}

constexpr int first = 1;
constexpr int next = 0;

}  // namespace

Hb_Rc hb_get_number_of_configured_nodes(int* nodes) {
  return start_with(nodes) == Hb_Success ? get_number(global_num_nodes, nodes) : Hb_Failure;
}

Hb_Rc hb_get_number_of_configured_adapters(int* adapters) {
  return start_with(adapters) == Hb_Success ? get_number(table().Hb_num_adapters, adapters) : Hb_Failure;
}

Hb_Rc hb_get_number_of_configured_networks(int* networks) {
  return start_with(networks) == Hb_Success ? get_number(table().Hb_num_networks, networks) : Hb_Failure;
}

Hb_Rc hb_get_number_of_configured_sites(int* sites) {
  return start_with(sites) == Hb_Success ? get_number(global_num_sites, sites) : Hb_Failure;
}

Hb_Rc hb_get_my_node_number(Hb_Node_Number* node) {
  if (start_with(node) != Hb_Success) {
    return Hb_Failure;
  }
  *node = table().local_node_number;
  return Hb_Success;
}

Hb_Rc hb_get_adapter_number_by_node_number(Hb_Node_Number node, int offset, Hb_Adapter_Number* adapter) {
  if (start_with(adapter) != Hb_Success) {
    return Hb_Failure;
  }
  if (!is_node_number(table(), node) || offset < 0 || offset >= table().Hb_adapters_per_node) {
    return fail(HB_EINVAL);
  }
  const Hb_Adapter_Number number = adapter_in_slot(node, offset);
  if (!is_configured(number)) {
    return fail(HB_ENOADAPTER);
  }
  *adapter = number;
  return Hb_Success;
}

Hb_Rc hb_get_node_number_by_adapter_number(Hb_Adapter_Number adapter, Hb_Node_Number* node) {
  if (start_with(node) != Hb_Success || configured_adapter(adapter) == nullptr) {
    return Hb_Failure;
  }
  *node = static_cast<Hb_Node_Number>(adapter / static_cast<Hb_Adapter_Number>(table().Hb_adapters_per_node));
  trace_values(Trace_Info, trace_node_of_adapter, adapter, *node);
  return Hb_Success;
}

Hb_Rc hb_get_number_of_configured_adapters_in_node(Hb_Node_Number node_num, int* adapters) {
  if (start_with(adapters) != Hb_Success || check_configured_node(node_num) != Hb_Success) {
    return Hb_Failure;
  }
  int count = 0;
  for (int offset = 0; offset < table().Hb_adapters_per_node; ++offset) {
    count += is_configured(adapter_in_slot(node_num, offset)) ? 1 : 0;
  }
  return get_number(count, adapters);
}

Hb_Rc hb_get_adapter_number_by_address(Hb_IP_address6 address, Hb_Adapter_Number* adapter) {
  if (start_with(adapter) != Hb_Success) {
    return Hb_Failure;
  }
  const Hb_Adapter* const begin = table().Hb_global_adapter_list;
  const Hb_Adapter* const end = begin + adapters_in_list(table());
  const Hb_Adapter* const found = std::find_if(begin, end, [&address](const Hb_Adapter& candidate) {
    return std::memcmp(&candidate.Hb_ip_address, &address, sizeof address) == 0;
  });
  if (found == end) {
    *adapter = HB_NO_ADAPTER;
    return fail(HB_ENOADAPTER);
  }
  *adapter = found->Hb_adapter_num;
  return Hb_Success;
}

Hb_Rc hb_get_adapter_address_by_number(Hb_Adapter_Number adapter, Hb_IP_address6* address) {
  if (start_with(address) != Hb_Success) {
    return Hb_Failure;
  }
  Hb_Adapter* record = configured_adapter(adapter);
  if (record == nullptr) {
    return Hb_Failure;
  }
  *address = record->Hb_ip_address;
  if (trace_is_on(Trace_Info)) {
    trace_address(address, adapter);
  }
  return Hb_Success;
}

Hb_Rc hb_get_adapter_type_by_number(Hb_Adapter_Number adapter, char* adapter_type) {
  if (start_with(adapter_type) != Hb_Success) {
    return Hb_Failure;
  }
  const Hb_Adapter* record = configured_adapter(adapter);
  if (record == nullptr) {
    return Hb_Failure;
  }
  copy_text(adapter_type, record->Hb_adapter_type);
  trace_data(Trace_Info, trace_type_of_adapter,
             {block_of_name(record->Hb_adapter_type, sizeof record->Hb_adapter_type), block_of(adapter)});
  return Hb_Success;
}

Hb_Rc hb_get_network_number_by_name(char* name, Hb_Network_Number* network) {
  if (start_with(name, network) != Hb_Success) {
    return Hb_Failure;
  }
  for (int number = 0; number < table().Hb_adapters_per_node; ++number) {
    if (is_used_network(table(), number) && network_name(table(), number) == name) {
      *network = static_cast<Hb_Network_Number>(number);
      return Hb_Success;
    }
  }
  *network = HB_NO_NETWORK;
  return fail(HB_ENONETWORK);
}

Hb_Rc hb_get_network_name_by_number(Hb_Network_Number network, char* name) {
  if (start_with(name) != Hb_Success || check_configured_network(table(), network) != Hb_Success) {
    return Hb_Failure;
  }
  copy_text(name, table().Hb_global_network_list[network].Hb_network_name);
  return Hb_Success;
}

Hb_Rc hb_get_network_type_by_number(Hb_Network_Number network, char* type) {
  if (start_with(type) != Hb_Success) {
    return Hb_Failure;
  }
  if (!is_network_number(table(), network)) {
    return fail(HB_EINVAL);
  }
  if (network < HB_MAX_NETWORKS) {
    copy_text(type, table().Hb_global_network_list[network].Hb_network_type);
  } else {
    *type = '\0';  // a number that no slot exists for is an unused one
  }
  return Hb_Success;
}

Hb_Rc hb_get_first_configured_node_number(Hb_Node_Number* node, Hb_Cursor* cursor) {
  return process_node_number_list(node, cursor, first);
}
Hb_Rc hb_get_next_configured_node_number(Hb_Node_Number* node, Hb_Cursor* cursor) {
  return process_node_number_list(node, cursor, next);
}

Hb_Rc hb_get_first_configured_adapter_number(Hb_Adapter_Number* adapter, Hb_Cursor* cursor) {
  return process_adapter_number_list(adapter, cursor, first);
}
Hb_Rc hb_get_next_configured_adapter_number(Hb_Adapter_Number* adapter, Hb_Cursor* cursor) {
  return process_adapter_number_list(adapter, cursor, next);
}

Hb_Rc hb_get_first_configured_adapter_in_node(Hb_Node_Number node, Hb_Adapter_Number* adapter, Hb_Cursor* cursor) {
  return process_adapter_in_node_list(node, adapter, cursor, first);
}
Hb_Rc hb_get_next_configured_adapter_in_node(Hb_Node_Number node, Hb_Adapter_Number* adapter, Hb_Cursor* cursor) {
  return process_adapter_in_node_list(node, adapter, cursor, next);
}

Hb_Rc hb_get_first_configured_network_number(Hb_Network_Number* network, Hb_Cursor* cursor) {
  return process_network_number_list(network, cursor, first);
}
Hb_Rc hb_get_next_configured_network_number(Hb_Network_Number* network, Hb_Cursor* cursor) {
  return process_network_number_list(network, cursor, next);
}

Hb_Rc hb_get_first_configured_adapter_in_network(Hb_Network_Number network, Hb_Adapter_Number* adapter,
                                                 Hb_Cursor* cursor) {
  return process_adapter_in_network_list(network, adapter, cursor, first);
}
Hb_Rc hb_get_next_configured_adapter_in_network(Hb_Network_Number network, Hb_Adapter_Number* adapter,
                                                Hb_Cursor* cursor) {
  return process_adapter_in_network_list(network, adapter, cursor, next);
}

Hb_Rc hb_get_first_configured_site_number(Hb_Site_Number* site, Hb_Cursor* cursor) {
  return process_site_number_list(site, cursor, first);
}
Hb_Rc hb_get_next_configured_site_number(Hb_Site_Number* site, Hb_Cursor* cursor) {
  return process_site_number_list(site, cursor, next);
}
