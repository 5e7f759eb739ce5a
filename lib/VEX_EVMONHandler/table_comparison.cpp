#include "table_comparison.h"

#include <algorithm>
#include <cstring>

#include "VEX_HBC_trace.h"
#include "VEX_migration.h"
#include "chain_index.h"
#include "vex_platform_records.h"

namespace {

uint32_t node_of(const Hb_Configuration_Internal& table, const Hb_Adapter& adapter) {
  return table.Hb_adapters_per_node > 0 ? adapter.Hb_adapter_num / static_cast<uint32_t>(table.Hb_adapters_per_node)
                                        : 0;
}

bool same_type(const Hb_Adapter& one, const Hb_Adapter& other) {
  return std::strncmp(one.Hb_adapter_type, other.Hb_adapter_type, sizeof one.Hb_adapter_type) == 0;
}

bool same_address(const Hb_Adapter& one, const Hb_Adapter& other) {
  return std::memcmp(&one.Hb_ip_address, &other.Hb_ip_address, sizeof one.Hb_ip_address) == 0;
}

bool is_not_up(Hb_Entity_State state) { return state == Hb_Entity_Down || state == Hb_Entity_Undef; }

Trace_Block block_of_type(const Hb_Adapter& adapter) {
  return block_of_name(adapter.Hb_adapter_type, sizeof adapter.Hb_adapter_type);
}

// A table's adapters by their node, and by as much more as the index is for.
class Adapter_Index {
 public:
  enum class By { node, type, address };

  Adapter_Index(const Hb_Configuration_Internal& table, By by)
      : table_(table), by_(by), index_(static_cast<uint32_t>(count())) {
    for (int record = count() - 1; record >= 0; --record) {
      const Hb_Adapter& adapter = table.Hb_global_adapter_list[record];
      index_.put(static_cast<uint32_t>(record), hash_of(adapter, node_of(table, adapter)));
    }
  }

  // The first adapter of the node, in the table's order, that `is_it` holds for, or null. It is asked about all that
  // agree in what the index is for, and maybe others.
  template <typename Is_It>
  const Hb_Adapter* find(const Hb_Adapter& like, uint32_t node, Is_It is_it) const {
    for (uint32_t record = index_.first(hash_of(like, node)); record != Chain_Index::none;
         record = index_.after(record)) {
      const Hb_Adapter& candidate = table_.Hb_global_adapter_list[record];
      if (node_of(table_, candidate) == node && is_it(candidate)) {
        return &candidate;
      }
    }
    return nullptr;
  }

 private:
  int count() const { return std::max(adapters_in_list(table_), 0); }
  uint32_t hash_of(const Hb_Adapter& adapter, uint32_t node) const {
    uint32_t hash = hash_with(0, node);
    if (by_ != By::node) {
      hash = hash_with_text(hash, adapter.Hb_adapter_type, sizeof adapter.Hb_adapter_type);
    }
    return by_ == By::address ? hash_with_address(hash, &adapter.Hb_ip_address) : hash;
  }

  const Hb_Configuration_Internal& table_;
  By by_;
  Chain_Index index_;
};

// Every adapter of the same type is traced, so that none of them may be passed over then.
Adapter_Index counterparts_in(const Hb_Configuration_Internal& table) {
  return {table, trace_is_on(Trace_Info) ? Adapter_Index::By::type : Adapter_Index::By::address};
}

const Hb_Adapter* find_counterpart(const Adapter_Index& index, const Hb_Adapter& adapter, uint32_t node) {
  return index.find(adapter, node, [&](const Hb_Adapter& candidate) {
    if (!same_type(adapter, candidate)) {
      return false;
    }
    trace_data(Trace_Info, trace_counterpart_adapter, {block_of_type(adapter), block_of(node)});
    return same_address(adapter, candidate);
  });
}

// Whether the adapter was up and is so no more in the other table.
bool is_lost(const Hb_Adapter& adapter, uint32_t node, const Adapter_Index& other) {
  const Hb_Adapter* counterpart = find_counterpart(other, adapter, node);
  if (adapter.Hb_state != Hb_Entity_Up || (counterpart != nullptr && !is_not_up(counterpart->Hb_state))) {
    return false;
  }
  trace_data(Trace_Info, counterpart == nullptr ? trace_adapter_without_counterpart : trace_adapter_counterpart_not_up,
             {block_of_type(adapter), block_of(adapter.Hb_adapter_num), block_of(adapter.Hb_state), block_of(node)});
  return true;
}

// The same for a node.
bool is_lost(const Hb_Node_config_state& node, H_table_str* other, zu_int32_t kind) {
  const auto* counterpart =
      static_cast<const Hb_Node_config_state*>(Hash_search(static_cast<uint32_t>(node.node_num), other));
  if (node.state != Hb_Entity_Up || (counterpart != nullptr && !is_not_up(counterpart->state))) {
    return false;
  }
  trace_values(Trace_Info, counterpart == nullptr ? trace_node_without_counterpart : trace_node_counterpart_not_up,
               node.node_num, node.state, kind);
  return true;
}

bool counts_differ(const Hb_Configuration_Internal& table1, const Hb_Configuration_Internal& table2) {
  const bool differ = table1.Hb_num_nodes != table2.Hb_num_nodes || table1.Hb_num_adapters != table2.Hb_num_adapters ||
                      table1.Hb_num_networks != table2.Hb_num_networks;
  if (differ) {
    trace_values(Trace_Info, trace_counts_differ, table1.Hb_num_nodes, table2.Hb_num_nodes, table1.Hb_num_adapters,
                 table2.Hb_num_adapters, table1.Hb_num_networks, table2.Hb_num_networks);
  }
  return differ;
}

bool differs(const Hb_Adapter& adapter, uint32_t node, const Adapter_Index& other) {
  trace(Trace_Debug, trace_adapter_looked_for);
  const Hb_Adapter* found = other.find(adapter, node, [&](const Hb_Adapter& candidate) {
    trace(Trace_Debug, trace_adapter_candidate);
    return same_type(adapter, candidate);
  });
  if (found != nullptr) {
    trace(Trace_Debug, trace_adapter_found);
  }
  const bool different = found == nullptr || found->Hb_network != adapter.Hb_network || !same_address(adapter, *found);
  if (different) {
    trace(Trace_Info, trace_adapter_differs);
  }
  return different;
}

// Every adapter of the node is a candidate, which only a trace shows.
bool an_adapter_differs(const Hb_Configuration_Internal& table1, const Hb_Configuration_Internal& table2) {
  const Adapter_Index other(table2, trace_is_on(Trace_Debug) ? Adapter_Index::By::node : Adapter_Index::By::type);
  const Hb_Adapter* first = table1.Hb_global_adapter_list;
  return std::any_of(first, first + std::max(adapters_in_list(table1), 0),
                     [&](const Hb_Adapter& adapter) { return differs(adapter, node_of(table1, adapter), other); });
}

// What is no change by itself, but worth knowing.
void trace_cluster_differences(Hb_Configuration_Internal& table1, Hb_Configuration_Internal& table2) {
  if (table1.local_node_number != table2.local_node_number) {
    trace_values(Trace_Info, trace_local_node_differs, table1.local_node_number, table2.local_node_number);
  }
  const Hb_Rc rc = VEX_find_tbl1_node_in_tbl2(&table1, &table2);
  if (rc != Hb_Success) {
    trace_values(Trace_Info, trace_node_missing_in_table, rc);
  }
}

}  // namespace

Hb_Rc tell_lost_adapters(EVMONHandler& handler, const Hb_Configuration_Internal& table1,
                         const Hb_Configuration_Internal& table2, zu_int32_t kind, Hb_VEX_Event** event,
                         zu_int32_t left_out) {
  if (event == nullptr) {
    trace(Trace_Errors, trace_no_adapter_event_pointer);
    return Hb_Success;
  }
  *event = nullptr;
  zu_int32_t count = 0;
  const Adapter_Index other(counterparts_in(table2));
  const int adapters = adapters_in_list(table1);
  for (int record = 0; record < adapters; ++record) {
    const Hb_Adapter& adapter = table1.Hb_global_adapter_list[record];
    const uint32_t node = node_of(table1, adapter);
    if (node == static_cast<uint32_t>(left_out) || !is_lost(adapter, node, other) ||
        adapter.Hb_adapter_num >= HB_MAX_ADAPTERS) {
      continue;
    }
    handler.construct_an_adapter_event(event, kind, adapter.Hb_adapter_num);
    if (*event == nullptr) {
      return Hb_Failure;
    }
    trace_values(Trace_Info, trace_adapter_event_extended, kind, ++count);
  }
  if (*event != nullptr) {
    (*event)->group.Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_num_adapters = count;
  }
  return Hb_Success;
}

Hb_Rc tell_lost_nodes(EVMONHandler& handler, const Hb_Configuration_Internal& table1,
                      const Hb_Configuration_Internal& table2, zu_int32_t kind, Hb_VEX_Event** event,
                      zu_int32_t left_out) {
  zu_int32_t count = 0;
  const int nodes = nodes_in_list(table1);
  for (int record = 0; record < nodes; ++record) {
    const Hb_Node_config_state& node = table1.node_list[record];
    if (node.node_num == left_out || !is_lost(node, table2.node_hash, kind) || node.node_num < 0 ||
        node.node_num >= HB_MAX_NODES) {
      continue;
    }
    handler.constructNodeEvent(node.node_num, event, kind);
    if (event != nullptr && *event == nullptr) {
      return Hb_Failure;
    }
    trace_values(Trace_Info, trace_node_event_extended, kind, node.node_num, ++count);
  }
  if (event != nullptr && *event != nullptr) {
    (*event)->group.Hb_membership_grp_union.Hb_node_membership_grp.Hb_num_nodes = count;
  }
  return Hb_Success;
}

Hb_Rc tell_configuration_change(EVMONHandler& handler, Hb_Configuration_Internal& table1,
                                Hb_Configuration_Internal& table2, Hb_VEX_Event** event) {
  trace_cluster_differences(table1, table2);
  if (!counts_differ(table1, table2) && !an_adapter_differs(table1, table2)) {
    return Hb_Success;
  }
  handler.constructConfigEvent(event);
  return event == nullptr || *event != nullptr ? Hb_Success : Hb_Failure;
}

Hb_Rc tell_table_changes(EVMONHandler& handler, Hb_Configuration_Internal& new_table, const Comparison_Events& events) {
  Hb_Configuration_Internal& present = global_config_tbl;
  bool whole = true;
  trace(Trace_Info, trace_comparing_gone_adapters);
  whole &= tell_lost_adapters(handler, present, new_table, HB_EVENT_DEATH, events.adapter_death) == Hb_Success;
  trace(Trace_Info, trace_comparing_gone_nodes);
  whole &= tell_lost_nodes(handler, present, new_table, HB_EVENT_DEATH, events.node_death) == Hb_Success;
  if (migrate_to_vex_prep) {
    whole &= tell_configuration_change(handler, present, new_table, events.config) == Hb_Success;
    whole &= tell_configuration_change(handler, new_table, present, events.config) == Hb_Success;
  }
  trace(Trace_Info, trace_comparing_new_adapters);
  whole &= tell_lost_adapters(handler, new_table, present, HB_EVENT_JOIN, events.adapter_join) == Hb_Success;
  trace(Trace_Info, trace_comparing_new_nodes);
  whole &= tell_lost_nodes(handler, new_table, present, HB_EVENT_JOIN, events.node_join) == Hb_Success;
  return whole ? Hb_Success : Hb_Failure;
}

void EVMONHandler::generate_event_for_missing_tbl2_adapters(Hb_Configuration_Internal* table1,
                                                            Hb_Configuration_Internal* table2, zu_int32_t kind,
                                                            Hb_VEX_Event** event) {
  tell_lost_adapters(*this, *table1, *table2, kind, event);
}

void EVMONHandler::generate_event_for_missing_tbl2_node(Hb_Configuration_Internal* table1,
                                                        Hb_Configuration_Internal* table2, zu_int32_t kind,
                                                        Hb_VEX_Event** event) {
  tell_lost_nodes(*this, *table1, *table2, kind, event);
}

void EVMONHandler::generate_event_for_config_change(Hb_Configuration_Internal* table1,
                                                    Hb_Configuration_Internal* table2, Hb_VEX_Event** event) {
  tell_configuration_change(*this, *table1, *table2, event);
}

void EVMONHandler::compare_global_config_tables(Hb_Configuration_Internal* new_table, Hb_VEX_Event** adapter_death,
                                                Hb_VEX_Event** node_death, Hb_VEX_Event** config,
                                                Hb_VEX_Event** adapter_join, Hb_VEX_Event** node_join) {
  tell_table_changes(*this, *new_table, {adapter_death, node_death, config, adapter_join, node_join});
}
