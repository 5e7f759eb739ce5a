#include "hb_communication/vex_table_build.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <memory>
#include <new>

#include "VEX_HBC_trace.h"
#include "hb_communication/configuration_parts.h"
#include "hb_global_data/address_text.h"
#include "hb_global_data/record_index.h"
#include "vex_platform_records.h"
#include "zu_cu.h"

namespace {

constexpr uint32_t adapters_per_node = HB_MAX_NETWORKS;

struct Cluster_Info_Release {
  void operator()(zu_vex_cluster_info_t* info) const { zu_vex_free_cluster_info(info); }
};

struct Node_List_Release {
  void operator()(zu_vex_node_info_t* list) const { zu_vex_free_node_info(list); }
};

// What the services answered, given back when the table is built.
struct Answers {
  std::unique_ptr<zu_vex_cluster_info_t, Cluster_Info_Release> cluster;
  std::unique_ptr<zu_vex_node_info_t, Node_List_Release> nodes;
  Interface_List own_interfaces;                       // empty when the caller brought a list
  const zu_vex_net_intf_info_t* interfaces = nullptr;  // that list, or the caller's
  Trace_Block interface_source = {};                   // where it came from
};

Hb_Rc fail_build(Trace_Block call, int result, int system_error, int library_error) {
  static constexpr char variant[] = "(Default)";
  set_hb_errno(library_error);
  trace_data(Trace_Errors, trace_table_query_failed, call, {variant, sizeof variant}, block_of(result),
             block_of(system_error));
  return Hb_Failure;
}

bool is_of_category(const zu_evm_event_metadata_t* event, zu_evm_event_category_t one, zu_evm_event_category_t other) {
  return event != nullptr && (event->category == one || event->category == other);
}

Hb_Rc ask_for_cluster(Answers& answers, int saved_errno) {
  static constexpr char call[] = "zu_vex_get_cluster_info()";
  zu_vex_cluster_info_t* info = nullptr;
  const int result = zu_vex_get_cluster_info(&info);
  if (result != 0 || info == nullptr) {
    return fail_build({call, sizeof call}, result, saved_errno, HB_EVEXTBL_BUILD);
  }
  answers.cluster.reset(info);
  return Hb_Success;
}

Hb_Rc ask_for_nodes(Answers& answers, const zu_evm_event_metadata_t* event) {
  const bool after_event = is_of_category(event, ZU_EVM_EVENT_CATEGORY_NODE_LIVENESS, ZU_EVM_EVENT_CATEGORY_NODE_LIST);
  zu_vex_node_info_t* list = nullptr;
  const int result = after_event ? zu_vex_get_node_info_after_event(event, &list) : zu_vex_get_node_info(&list);
  if (result != 0) {
    return fail_build(block_of_text(after_event ? "zu_vex_get_node_info_after_event()" : "zu_vex_get_node_info()"),
                      result, errno, HB_EVEXTBL_ENTRY);
  }
  answers.nodes.reset(list);
  return Hb_Success;
}

Hb_Rc ask_for_interfaces(Answers& answers, const zu_evm_event_metadata_t* event) {
  const bool after_event =
      is_of_category(event, ZU_EVM_EVENT_CATEGORY_ADAPTER_LIVENESS, ZU_EVM_EVENT_CATEGORY_IP_CHANGE);
  answers.interface_source =
      block_of_text(after_event ? "zu_vex_get_net_intf_info_after_event()" : "zu_vex_get_net_intf_info()");
  zu_vex_net_intf_info_t* list = nullptr;
  const int result = after_event ? zu_vex_get_net_intf_info_after_event(event, &list) : zu_vex_get_net_intf_info(&list);
  if (result != 0) {
    return fail_build(answers.interface_source, result, errno, HB_EVEXTBL_INTF);
  }
  answers.own_interfaces.reset(list);
  answers.interfaces = list;
  return Hb_Success;
}

Hb_Rc ask_or_take_interfaces(Answers& answers, const zu_evm_event_metadata_t* event,
                             const zu_vex_net_intf_info_t* p_src_intf_tbl) {
  if (p_src_intf_tbl == nullptr) {
    return ask_for_interfaces(answers, event);
  }
  answers.interfaces = p_src_intf_tbl;
  answers.interface_source = block_of_text("p_src_intf_tbl");
  return Hb_Success;
}

// Nodes and adapters of the source table, whose states are carried over.

bool is_source(const Hb_Configuration_Internal* src_cfg_table) {
  if (src_cfg_table == nullptr) {
    __zu_assert("src_cfg_table != NULL", "lib/hb_communication", __LINE__);
  }
  return src_cfg_table != nullptr;
}

const Hb_Node_config_state* source_node(const Hb_Configuration_Internal* src_cfg_table, uint32_t number) {
  return is_source(src_cfg_table)
             ? static_cast<const Hb_Node_config_state*>(Hash_search(number, src_cfg_table->node_hash))
             : nullptr;
}

const Hb_Adapter* source_adapter(const Hb_Configuration_Internal* src_cfg_table, H_IPv6_key_t& address) {
  return is_source(src_cfg_table) ? static_cast<const Hb_Adapter*>(Hash_search_IPv6(&address, src_cfg_table->ip_hash))
                                  : nullptr;
}

bool was_taken_down_with_its_daemon(const Hb_Configuration_Internal* src_cfg_table, uint32_t number) {
  const Hb_Node_config_state* node = src_cfg_table != nullptr ? source_node(src_cfg_table, number) : nullptr;
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
Hb_Entity_State stale_state(H_IPv6_key_t& address, const Hb_Configuration_Internal* src_cfg_table) {
  if (src_cfg_table == nullptr) {
    return Hb_Entity_Down;
  }
  const Hb_Adapter* adapter = source_adapter(src_cfg_table, address);
  return adapter != nullptr ? adapter->Hb_state : unknown_state();
}

Hb_Entity_State state_of(zu_vex_intf_status_t status, H_IPv6_key_t& address,
                         const Hb_Configuration_Internal* src_cfg_table) {
  switch (status) {
    case ZU_VEX_INTF_STATUS_UP:
      return Hb_Entity_Up;
    case ZU_VEX_INTF_STATUS_DOWN:
      return Hb_Entity_Down;
    case ZU_VEX_INTF_STATUS_STALE:
      return stale_state(address, src_cfg_table);
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
  for (const zu_vex_net_intf_info_t* each = list; each != nullptr; each = each->p_next) {
    count += slots.take(each->node_number) != HB_NO_ADAPTER ? 1 : 0;
  }
  return count;
}

void trace_insertion(Trace_Record record, Hb_Adapter& adapter) {
  if (trace_is_on(Trace_Debug)) {
    const Errno_Kept kept;
    char address[INET6_ADDRSTRLEN];
    trace_data(Trace_Debug, record, block_of_text(mowllib_ntop(&adapter.Hb_ip_address, address)),
               block_of(adapter.Hb_adapter_num));
  }
}

void fill_adapter(Hb_Adapter& adapter, const zu_vex_net_intf_info_t& interface, Hb_Adapter_Number number) {
  adapter = {};
  std::memcpy(&adapter.Hb_ip_address, &interface.ip_addr, sizeof adapter.Hb_ip_address);
  if (interface.p_name != nullptr) {
    std::memcpy(adapter.Hb_adapter_type, interface.p_name,
                strnlen(interface.p_name, sizeof adapter.Hb_adapter_type - 1));
  }
  adapter.Hb_adapter_num = number;
}

void insert_adapter(Configuration_Parts& parts, Hb_Adapter& adapter, H_IPv6_key_t& address) {
  Hash_insert(adapter.Hb_adapter_num, parts.by_number.get(), &adapter);
  trace_insertion(trace_adapter_under_number, adapter);
  Hash_insert_IPv6(&address, parts.by_address.get(), &adapter);
  trace_insertion(trace_adapter_under_address, adapter);
}

// Throws std::bad_alloc, as the next does.
void add_nodes(Configuration_Parts& parts, const zu_vex_node_info_t* list,
               const Hb_Configuration_Internal* src_cfg_table) {
  parts.nodes_by_number.reset(Hash_init("VEX_node list", prime(node_table_size)));
  parts.nodes = std::make_unique<Hb_Node_config_state[]>(HB_MAX_NODES);
  for (const zu_vex_node_info_t* each = list; each != nullptr && parts.node_count < HB_MAX_NODES; each = each->p_next) {
    if (each->number < HB_MAX_NODES) {
      Hb_Node_config_state& node = parts.nodes[static_cast<size_t>(parts.node_count++)];
      node = state_of(*each, src_cfg_table);
      Hash_insert(each->number, parts.nodes_by_number.get(), &node);
    }
  }
}

void add_adapters(Configuration_Parts& parts, int count, const zu_vex_net_intf_info_t* list,
                  const Hb_Configuration_Internal* src_cfg_table) {
  parts.adapters = std::make_unique_for_overwrite<Hb_Adapter[]>(static_cast<size_t>(count));
  parts.by_number.reset(Hash_init("Hb_Adapter list", prime(2 * count)));
  parts.by_address.reset(Hash_init("Hb_IP list", prime(2 * count)));
  Adapter_Slots slots;
  Hb_Adapter* next = parts.adapters.get();
  const Hb_Adapter* end = next + count;
  for (const zu_vex_net_intf_info_t* each = list; each != nullptr && next != end; each = each->p_next) {
    const Hb_Adapter_Number number = slots.take(each->node_number);
    if (number != HB_NO_ADAPTER) {
      Hb_Adapter& adapter = *next++;
      H_IPv6_key_t address;
      std::memcpy(&address, &each->ip_addr, sizeof address);
      fill_adapter(adapter, *each, number);
      adapter.Hb_state = state_of(each->status, address, src_cfg_table);
      insert_adapter(parts, adapter, address);
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

void install(Configuration_Parts& parts, int adapters, zu_vex_node_num_t local_node, Hb_Configuration_Internal& table) {
  empty_global_config_table(&table);
  parts.release_to(table);
  table.local_node_number = static_cast<Hb_Node_Number>(local_node);
  table.Hb_max_nodes = HB_MAX_NODES;
  table.Hb_num_networks = HB_MAX_NETWORKS;
  table.Hb_adapters_per_node = adapters_per_node;
  table.Hb_num_adapters = adapters;
  set_networks(table);
  mark_nodes(table);
  if (&table == &global_config_tbl) {
    index_configuration();
  }
}

// Beside what the table has, so that a failure changes nothing.
Hb_Rc build(const Answers& answers, const Hb_Configuration_Internal* src_cfg_table, Hb_Configuration_Internal& table) {
  try {
    Configuration_Parts parts;
    add_nodes(parts, answers.nodes.get(), src_cfg_table);
    const int adapters = accepted_interfaces(answers.interfaces);
    trace_values(Trace_Info, trace_adapters_accepted, adapters);
    add_adapters(parts, adapters, answers.interfaces, src_cfg_table);
    install(parts, adapters, answers.cluster->local_node_number, table);
  } catch (const std::bad_alloc&) {
    return fail_build(answers.interface_source, -1, ENOMEM, HB_EVEXTBL_BUILD);
  }
  return Hb_Success;
}

}  // namespace

Hb_Rc hb_vex_update_global_tbl(Hb_Configuration_Internal* cfg_table, zu_evm_event_metadata_t* event_metadata_p,
                               Hb_Configuration_Internal* src_cfg_table, zu_vex_net_intf_info_t* p_src_intf_tbl) {
  const int saved_errno = errno;
  const Errno_Kept kept;
  Answers answers;
  if (ask_for_cluster(answers, saved_errno) != Hb_Success || ask_for_nodes(answers, event_metadata_p) != Hb_Success ||
      ask_or_take_interfaces(answers, event_metadata_p, p_src_intf_tbl) != Hb_Success) {
    return Hb_Failure;
  }
  return build(answers, src_cfg_table, *cfg_table);
}
