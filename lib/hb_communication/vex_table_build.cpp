#include "hb_communication/vex_table_build.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <memory>
#include <new>

#include "VEX_HBC_trace.h"
#include "hb_communication/configuration_parts.h"
#include "hb_communication/vex_table_queries.h"
#include "hb_global_data/address_text.h"
#include "hb_global_data/record_index.h"
#include "platform_list.h"
#include "zu_cu.h"

namespace {

constexpr uint32_t adapters_per_node = HB_MAX_NETWORKS;

// Where the table whose states are carried over is consulted. It never fires: it is consulted only where there is one.
void assert_source(const Hb_Configuration_Internal* src_cfg_table) {
  if (src_cfg_table == nullptr) {
    __zu_assert("src_cfg_table != NULL", "lib/hb_communication", __LINE__);
  }
}

bool was_taken_down_with_its_daemon(const Hb_Configuration_Internal* src_cfg_table, uint32_t number) {
  if (src_cfg_table == nullptr) {
    return false;
  }
  assert_source(src_cfg_table);
  const auto* node = static_cast<const Hb_Node_config_state*>(Hash_search(number, src_cfg_table->node_hash));
  return node != nullptr && node->state == Hb_Entity_Down && node->reason == Hb_Entity_State_Reason_BRIXD_Down;
}

Hb_Entity_State_Reason reason_of(zu_vex_node_down_reason_t reason) {
  switch (reason) {
    case ZU_VEX_NODE_DOWN_REASON_LINK_DOWN:
      return Hb_Entity_State_Reason_LINK_Down;
    case ZU_VEX_NODE_DOWN_REASON_SHUTDOWN:
      return Hb_Entity_State_Reason_SHUT_Down;
    case ZU_VEX_NODE_DOWN_REASON_STOPPED:
      return Hb_Entity_State_Reason_STOPPED_Down;
    case ZU_VEX_NODE_DOWN_REASON_FORCE_DOWN:
      return Hb_Entity_State_Reason_FORCE_Down;
    default:
      return Hb_Entity_State_Reason_Down;
  }
}

Hb_Node_config_state state_of(const zu_vex_node_info_t& node, const Hb_Configuration_Internal* src_cfg_table) {
  const auto number = static_cast<Hb_Node_Number>(node.number);
  if (was_taken_down_with_its_daemon(src_cfg_table, node.number)) {
    const bool is_down = node.status == ZU_VEX_NODE_STATUS_DOWN;
    return {number, Hb_Entity_Down, is_down ? Hb_Entity_State_Reason_Down : Hb_Entity_State_Reason_BRIXD_Down};
  }
  if (node.status == ZU_VEX_NODE_STATUS_UP) {
    return {number, Hb_Entity_Up, Hb_Entity_State_Reason_Up};
  }
  return {number, Hb_Entity_Down, reason_of(node.node_down_reason)};
}

Hb_Entity_State unknown_state() {
  set_hb_errno(HB_EADAPTERSTATE);
  return Hb_Entity_Undef;
}

// What a stale interface is, nobody knows: it stays what it was.
Hb_Entity_State stale_state(const zu_vex_IP_address6_t& ip_addr, const Hb_Configuration_Internal* src_cfg_table) {
  if (src_cfg_table == nullptr) {
    return Hb_Entity_Down;
  }
  assert_source(src_cfg_table);
  H_IPv6_key_t address;
  std::memcpy(&address, &ip_addr, sizeof address);
  const auto* adapter = static_cast<const Hb_Adapter*>(Hash_search_IPv6(&address, src_cfg_table->ip_hash));
  return adapter != nullptr ? adapter->Hb_state : unknown_state();
}

Hb_Entity_State state_of(const zu_vex_net_intf_info_t& interface, const Hb_Configuration_Internal* src_cfg_table) {
  switch (interface.status) {
    case ZU_VEX_INTF_STATUS_UP:
      return Hb_Entity_Up;
    case ZU_VEX_INTF_STATUS_DOWN:
      return Hb_Entity_Down;
    case ZU_VEX_INTF_STATUS_STALE:
      return stale_state(interface.ip_addr, src_cfg_table);
    default:
      return unknown_state();
  }
}

// Hands out the adapter numbers of each node, as many as a node has slots.
class Adapter_Slots {
 public:
  // HB_NO_ADAPTER when the node has no slot left, or has a number that no table has a place for.
  Hb_Adapter_Number take(zu_vex_node_num_t node) {
    if (node >= HB_MAX_NODES || taken_[node] == adapters_per_node) {
      return HB_NO_ADAPTER;
    }
    return node * adapters_per_node + taken_[node]++;
  }

 private:
  std::array<uint8_t, HB_MAX_NODES> taken_{};
};

int accepted_interfaces(const zu_vex_net_intf_info_t* list) {
  Adapter_Slots slots;
  int count = 0;
  for (const zu_vex_net_intf_info_t& interface : records_of(list)) {
    count += slots.take(interface.node_number) != HB_NO_ADAPTER ? 1 : 0;
  }
  return count;
}

void trace_insertion(Trace_Record record, Hb_Adapter& adapter) {
  if (trace_is_on(Trace_Debug)) {
    const Errno_Kept kept;
    char address[INET6_ADDRSTRLEN];
    trace_data(Trace_Debug, record,
               {block_of_text(mowllib_ntop(&adapter.Hb_ip_address, address)), block_of(adapter.Hb_adapter_num)});
  }
}

Hb_Adapter adapter_of(const zu_vex_net_intf_info_t& interface, Hb_Adapter_Number number,
                      const Hb_Configuration_Internal* src_cfg_table) {
  Hb_Adapter adapter = {};
  std::memcpy(&adapter.Hb_ip_address, &interface.ip_addr, sizeof adapter.Hb_ip_address);
  if (interface.p_name != nullptr) {
    std::memcpy(adapter.Hb_adapter_type, interface.p_name, strnlen(interface.p_name, interface_name_in_table));
  }
  adapter.Hb_adapter_num = number;
  adapter.Hb_state = state_of(interface, src_cfg_table);
  return adapter;
}

void insert_adapter(Configuration_Parts& parts, Hb_Adapter& adapter) {
  parts.insert_by_number(adapter);
  trace_insertion(trace_adapter_under_number, adapter);
  parts.insert_by_address(adapter);
  trace_insertion(trace_adapter_under_address, adapter);
}

// Throws std::bad_alloc, as the next does.
void add_nodes(Configuration_Parts& parts, const zu_vex_node_info_t* list,
               const Hb_Configuration_Internal* src_cfg_table) {
  parts.start_vex_nodes();
  for (const zu_vex_node_info_t& node : records_of(list)) {
    if (parts.node_count == HB_MAX_NODES) {
      return;
    }
    if (node.number < HB_MAX_NODES) {
      parts.add_vex_node(state_of(node, src_cfg_table));
    }
  }
}

void add_adapters(Configuration_Parts& parts, int count, const zu_vex_net_intf_info_t* list,
                  const Hb_Configuration_Internal* src_cfg_table) {
  parts.start_vex_adapters(count);
  Adapter_Slots slots;
  for (const zu_vex_net_intf_info_t& interface : records_of(list)) {
    if (parts.adapter_count == count) {
      return;
    }
    const Hb_Adapter_Number number = slots.take(interface.node_number);
    if (number != HB_NO_ADAPTER) {
      insert_adapter(parts, parts.append_adapter(adapter_of(interface, number, src_cfg_table)));
    }
  }
}

void mark_nodes(const Hb_Configuration_Internal& table) {
  std::fill(std::begin(global_node_tbl), std::end(global_node_tbl), Hb_False);
  std::for_each_n(table.node_list, table.Hb_num_nodes,
                  [](const Hb_Node_config_state& node) { global_node_tbl[node.node_num] = Hb_True; });
  global_num_nodes = table.Hb_num_nodes;
}

void set_networks(Hb_Configuration_Internal& table) {
  std::fill(std::begin(table.Hb_global_network_list), std::end(table.Hb_global_network_list), Hb_Network{});
  table.Hb_global_network_list[0] = {"VEX_Network", "ether"};
}

void install(Configuration_Parts& parts, zu_vex_node_num_t local_node, Hb_Configuration_Internal& table) {
  empty_global_config_table(&table);
  parts.release_to(table);
  table.local_node_number = static_cast<Hb_Node_Number>(local_node);
  table.Hb_max_nodes = HB_MAX_NODES;
  table.Hb_num_networks = HB_MAX_NETWORKS;
  table.Hb_adapters_per_node = adapters_per_node;
  set_networks(table);
  mark_nodes(table);
  if (&table == &global_config_tbl) {
    index_configuration();
  }
}

// Beside what the table has, so that a failure changes nothing.
Hb_Rc build(const Table_Answers& answers, const Hb_Configuration_Internal* src_cfg_table,
            Hb_Configuration_Internal& table) {
  try {
    Configuration_Parts parts;
    add_nodes(parts, answers.nodes.get(), src_cfg_table);
    const int adapters = accepted_interfaces(answers.interfaces);
    trace_values(Trace_Info, trace_adapters_accepted, adapters);
    add_adapters(parts, adapters, answers.interfaces, src_cfg_table);
    install(parts, answers.cluster->local_node_number, table);
  } catch (const std::bad_alloc&) {
    return fail_table_build(answers.interface_source, -1, ENOMEM, HB_EVEXTBL_BUILD);
  }
  return Hb_Success;
}

}  // namespace

Hb_Rc hb_vex_update_global_tbl(Hb_Configuration_Internal* cfg_table, zu_evm_event_metadata_t* event_metadata_p,
                               Hb_Configuration_Internal* src_cfg_table, zu_vex_net_intf_info_t* p_src_intf_tbl) {
  const int saved_errno = errno;
  const Errno_Kept kept;
  Table_Answers answers;
  const Hb_Rc rc = ask_cluster_services(answers, event_metadata_p, p_src_intf_tbl, saved_errno);
  return rc == Hb_Success ? build(answers, src_cfg_table, *cfg_table) : rc;
}
