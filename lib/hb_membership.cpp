#include <cstdlib>
#include <cstring>

#include "VEX_HBC_trace.h"
#include "argument_check.h"
#include "hb_client/events.h"
#include "hb_client/group.h"

namespace {

const Hb_Configuration_Internal& table() { return global_config_tbl; }

Hb_Adapter_Membership_Grp& adapters_of(Hb_Group* group) {
  return group->Hb_membership_grp_union.Hb_adapter_membership_grp;
}

Hb_Node_Membership_Grp& nodes_of(Hb_Group* group) { return group->Hb_membership_grp_union.Hb_node_membership_grp; }

Hb_Rc check_type(const Hb_Group* group, Hb_Group_Type type) {
  return group->Hb_group_type == type ? Hb_Success : fail(HB_EGROUPTYPE);
}

Hb_Rc check_event(const Hb_Group* group, Hb_Events event) {
  return group->Hb_events == event ? Hb_Success : fail(HB_EWRONGSTATE);
}

Hb_Rc check_new_adapter_group(const Hb_Group* group) {
  return check_type(group, Hb_Adapter_Group) == Hb_Success ? check_event(group, HB_EVENT_NEW_GROUP) : Hb_Failure;
}

// Range first, then type: a number that no group can hold is told before the kind of group is looked at.
Hb_Rc check_adapter(const Hb_Group* group, Hb_Adapter_Number adapter) {
  if (group == nullptr || adapter >= adapter_number_limit(table())) {
    return fail(HB_EINVAL);
  }
  return check_type(group, Hb_Adapter_Group);
}

template <typename Record>
Hb_Rc copy_union(Hb_Group* group, Record* record) {
  if (!all_given(group, record)) {
    return fail(HB_EINVAL);
  }
  std::memcpy(record, &group->Hb_membership_grp_union, sizeof *record);
  return Hb_Success;
}

// The first position of list, from start on and below bound, that qualifies; bound when there is none.
template <typename Item, typename Qualifies>
int find_member(const Item* list, int start, int bound, Qualifies qualifies) {
  int position = start < 0 ? bound : start;
  while (position < bound && !qualifies(list[position])) {
    ++position;
  }
  return position < bound ? position : bound;
}

Hb_Rc process_adapter_group(Hb_Group* group, Hb_Adapter_Identifier* id, int trans) {
  if (start_with(group, id) != Hb_Success) {
    return Hb_Failure;
  }
  trace_values(Trace_Debug, trace_group_walk, group->Hb_group_type, group->Hb_cursor);
  if (check_type(group, Hb_Adapter_Group) != Hb_Success) {
    trace_values(Trace_Debug, trace_group_walk_wrong_type, group->Hb_group_type, HB_EGROUPTYPE);
    return Hb_Failure;
  }
  const int bound = static_cast<int>(adapter_number_limit(table()));
  const Hb_Incarnation* list = adapters_of(group).Hb_adapter_list;
  const int position = find_member(list, trans == 1 ? 0 : group->Hb_cursor, bound,
                                   [](Hb_Incarnation value) { return value != HB_NOT_IN_GROUP; });
  const bool found = position < bound;
  trace_values(Trace_Debug, trace_group_walk_search, found, position);
  if (!found) {
    trace_values(Trace_Debug, trace_group_walk_end, group->Hb_cursor);
    return fail(HB_ENOMORE);
  }
  id->Hb_adapter_number = static_cast<Hb_Adapter_Number>(position);
  id->Hb_died_because_removed = (list[position] & HB_DIED_BECAUSE_REMOVED_BIT) != 0 ? Hb_True : Hb_False;
  id->Hb_incarnation = list[position] & ~HB_DIED_BECAUSE_REMOVED_BIT;
  group->Hb_cursor = position + 1;
  trace_values(Trace_Debug, trace_group_walk_cursor, group->Hb_cursor);
  return Hb_Success;
}

Hb_Rc process_node_group(Hb_Group* group, Hb_Node_Number* node, int trans) {
  if (start_with(group, node) != Hb_Success || check_type(group, Hb_Node_Group) != Hb_Success) {
    return Hb_Failure;
  }
  const int bound = table().Hb_max_nodes;
  const int position = find_member(nodes_of(group).Hb_node_list, trans == 1 ? 0 : group->Hb_cursor, bound,
                                   [](Hb_Boolean member) { return member == Hb_True; });
  if (position >= bound) {
    *node = HB_NO_NODE;
    return fail(HB_ENOMORE);
  }
  *node = static_cast<Hb_Node_Number>(position);
  group->Hb_cursor = position + 1;
  return Hb_Success;
}

void release_node_numbers(Hb_Subcluster_Info& subcluster) {
  std::free(subcluster.node_numbers);
  subcluster.node_numbers = nullptr;
}

constexpr int first = 1;
constexpr int next = 0;

}  // namespace

Hb_Rc hb_get_group_id(Hb_Group* group, Hb_Adapter_Identifier* id) {
  if (start_with(group, id) != Hb_Success || check_new_adapter_group(group) != Hb_Success) {
    return Hb_Failure;
  }
  id->Hb_adapter_number = adapters_of(group).Hb_group_leader;
  id->Hb_incarnation = adapters_of(group).Hb_group_incarnation;
  return Hb_Success;
}

Hb_Rc hb_get_group_leader_id(Hb_Group* group, Hb_Adapter_Identifier* id) {
  if (start_with(group, id) != Hb_Success || check_new_adapter_group(group) != Hb_Success) {
    return Hb_Failure;
  }
  const Hb_Adapter_Number leader = adapters_of(group).Hb_group_leader;
  id->Hb_adapter_number = leader;
  id->Hb_incarnation = leader < HB_MAX_ADAPTERS ? adapters_of(group).Hb_adapter_list[leader] : HB_NOT_IN_GROUP;
  return Hb_Success;
}

Hb_Rc hb_get_group_status(Hb_Group* group, Hb_Group_Status* status) {
  if (start_with(group, status) != Hb_Success || check_event(group, HB_EVENT_NEW_GROUP) != Hb_Success) {
    return Hb_Failure;
  }
  *status = group->Hb_group_status;
  return Hb_Success;
}

Hb_Rc hb_get_adapter_id(Hb_Group* group, Hb_Adapter_Number adapter, Hb_Adapter_Identifier* id) {
  if (start_with(group, id) != Hb_Success || check_adapter(group, adapter) != Hb_Success) {
    return Hb_Failure;
  }
  const Hb_Incarnation value = adapters_of(group).Hb_adapter_list[adapter];
  if (value == HB_NOT_IN_GROUP) {
    return fail(HB_ENOADAPTER);
  }
  id->Hb_adapter_number = adapter;
  id->Hb_incarnation = value;
  return Hb_Success;
}

Hb_Boolean hb_is_adapter_in_group(Hb_Group* group, Hb_Adapter_Number adapter) {
  if (check_adapter(group, adapter) != Hb_Success) {
    return Hb_False;
  }
  return adapters_of(group).Hb_adapter_list[adapter] != HB_NOT_IN_GROUP ? Hb_True : Hb_False;
}

Hb_Boolean hb_is_node_in_group(Hb_Group* group, Hb_Node_Number node) {
  if (group == nullptr || !is_node_number(table(), node)) {
    set_hb_errno(HB_EINVAL);
    return Hb_False;
  }
  return check_type(group, Hb_Node_Group) == Hb_Success ? nodes_of(group).Hb_node_list[node] : Hb_False;
}

Hb_Rc hb_get_first_adapter(Hb_Group* group, Hb_Adapter_Identifier* id) {
  return process_adapter_group(group, id, first);
}
Hb_Rc hb_get_next_adapter(Hb_Group* group, Hb_Adapter_Identifier* id) { return process_adapter_group(group, id, next); }

Hb_Rc hb_get_first_node(Hb_Group* group, Hb_Node_Number* node) { return process_node_group(group, node, first); }
Hb_Rc hb_get_next_node(Hb_Group* group, Hb_Node_Number* node) { return process_node_group(group, node, next); }

Hb_Boolean hb_has_adapter_died_because_removed(Hb_Adapter_Identifier* id) {
  return start_with(id) == Hb_Success ? id->Hb_died_because_removed : static_cast<Hb_Boolean>(Hb_Failure);
}

Hb_Incarnation hb_adapter_incarnation(Hb_Adapter_Identifier* id) {
  return id != nullptr ? id->Hb_incarnation : HB_NOT_IN_GROUP;
}

Hb_Rc hb_get_FFDC_id(Hb_Group* group, Hb_FFDC_Id* ffdc_id) {
  if (start_with(group, ffdc_id) != Hb_Success) {
    return Hb_Failure;
  }
  const Hb_Events events = group->Hb_events;
  const bool carries_id = events == HB_EVENT_DEATH || events == HB_EVENT_JOIN || events == HB_EVENT_FFDC_ID;
  if (!carries_id || group->Hb_ffdc_id[0] == '\0') {
    return fail(HB_EWRONGSTATE);
  }
  std::memcpy(ffdc_id, group->Hb_ffdc_id, sizeof *ffdc_id);
  return Hb_Success;
}

Hb_Rc hb_get_different_instance_sender(Hb_Group* group, Hb_Diff_Instance_Info* sender) {
  if (start_with(group, sender) != Hb_Success) {
    return Hb_Failure;
  }
  if (group->Hb_events != HB_EVENT_DIFF_INSTANCE || group->Hb_group_type != Hb_Diff_Instance_Type) {
    return fail(HB_EWRONGSTATE);
  }
  *sender = group->Hb_membership_grp_union.diff_instance_info;
  return Hb_Success;
}

Hb_Rc hb_get_site_split_info(Hb_Group* group, Hb_Site_Split_Info* info) { return copy_union(group, info); }
Hb_Rc hb_get_site_merge_info(Hb_Group* group, Hb_Site_Merge_Info* info) { return copy_union(group, info); }

Hb_Rc hb_get_split_info(Hb_Group* group, Hb_Split_Merge_Info* p_split_info) { return copy_union(group, p_split_info); }
__attribute__((alias("hb_get_split_info"))) Hb_Rc hb_get_merge_info(Hb_Group* group, Hb_Split_Merge_Info* p_split_info);

void hb_free_split_info(Hb_Split_Merge_Info* p_split_info) {
  if (p_split_info != nullptr) {
    release_node_numbers(p_split_info->local_subcluster);
    release_node_numbers(p_split_info->remote_subcluster);
  }
}
__attribute__((alias("hb_free_split_info"))) void hb_free_merge_info(Hb_Split_Merge_Info* p_split_info);

Hb_Rc hb_get_node_status_reason(Hb_Node_Number node_number, Hb_Entity_State* node_status,
                                Hb_Entity_State_Reason* node_reason) {
  if (!all_given(node_status, node_reason)) {
    return fail(HB_EINVAL);
  }
  const auto key = static_cast<uint32_t>(int32_t{node_number});
  const auto* node = static_cast<const Hb_Node_config_state*>(Hash_search(key, table().node_hash));
  if (node == nullptr) {
    trace_values(Trace_Errors, trace_node_unknown, key);
    return Hb_Failure;
  }
  *node_status = node->state;
  *node_reason = node->reason;
  return Hb_Success;
}

Hb_Rc hb_site_down(Hb_Group* /*group*/) { return Hb_Success; }
__attribute__((alias("hb_site_down"))) Hb_Rc hb_site_merge(Hb_Group* group);
