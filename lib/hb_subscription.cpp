#include "hb_subscription.h"

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "VEX_EVMONNewGroupEventHandler.h"
#include "VEX_HBC_trace.h"
#include "argument_check.h"
#include "configured_numbers.h"
#include "hb_client/events.h"
#include "hb_communication/connection.h"
#include "hb_global_data/node_table.h"
#include "member_set.h"
#include "network_slots.h"
#include "platform/Pipe.h"

namespace {

const Hb_Configuration_Internal& table() { return global_config_tbl; }

enum class Transition { proceed, reject, reset };

// What one kind of member does to a group: how many bytes its set has, what an empty group becomes, and what happens
// with each type that the group can have.
struct Worker {
  size_t set_length;
  Hb_Subscription_Type reset_type;
  Transition transitions[10];  // by Hb_Subscription_Type
};

constexpr Transition go = Transition::proceed;
constexpr Transition no = Transition::reject;
constexpr Transition re = Transition::reset;

//                                                       type: 0   1   2   3   4   5   6   7   8   9
constexpr Worker adapter_worker = {
    HB_ADAPTER_SET_LENGTH, Hb_Adapter_Subscription, {no, go, go, go, re, go, go, no, go, go}};
constexpr Worker network_worker = {
    HB_ADAPTER_SET_LENGTH, Hb_Network_Subscription, {no, go, no, go, re, no, go, no, go, go}};
constexpr Worker node_worker = {HB_NODE_SET_LENGTH, Hb_Node_Subscription, {go, go, no, go, re, go, go, no, go, go}};
constexpr Worker site_worker = {HB_SITE_SET_LENGTH, Hb_Site_Subscription, {no, go, no, go, re, go, go, go, go, go}};

Transition transition_of(const Worker& worker, Hb_Subscription_Type type) {
  const auto index = static_cast<uint32_t>(type);
  return index < std::size(worker.transitions) ? worker.transitions[index] : Transition::reject;
}

// Resets the group to a set of one kind.
void reset(Hb_Subscription_Group* group, const Worker& worker) {
  Member_Set(group).clear(worker.set_length);
  group->Hb_subscription_type = worker.reset_type;
}

// Prepares the group for a change. True when the change is to be made; otherwise rc is the operation's result.
bool prepare(Hb_Subscription_Group* group, const Worker& worker, int add, Hb_Rc& rc) {
  switch (transition_of(worker, group->Hb_subscription_type)) {
    case Transition::reject:
      rc = fail(HB_ESUBSCRIBE);
      return false;
    case Transition::reset:
      reset(group, worker);
      rc = Hb_Success;
      return add == 1;
    default:
      rc = Hb_Success;
      return true;
  }
}

Hb_Rc change_member(Hb_Subscription_Group* group, const Worker& worker, uint32_t member, int add) {
  Hb_Rc rc = Hb_Failure;
  if (prepare(group, worker, add, rc)) {
    Member_Set(group).change(member, add == 1);
  }
  return rc;
}

Hb_Rc hb_change_adapter_subscription_group(Hb_Subscription_Group* group, Hb_Adapter_Number adapter, int add) {
  if (start_with(group) != Hb_Success) {
    return Hb_Failure;
  }
  if (adapter >= adapter_number_limit(table())) {
    return fail(HB_EINVAL);
  }
  if (hb_get_adap_entry(adapter) == &HB_INVALID_ADAP) {
    return fail(HB_ENOADAPTER);
  }
  return change_member(group, adapter_worker, adapter, add);
}

Hb_Rc hb_change_network_in_subscription_group(Hb_Subscription_Group* group, Hb_Network_Number network, int add) {
  Hb_Rc rc = Hb_Failure;
  if (start_with(group) != Hb_Success || check_configured_network(table(), network) != Hb_Success ||
      !prepare(group, network_worker, add, rc)) {
    return rc;
  }
  std::for_each_n(table().Hb_global_adapter_list, adapters_in_list(table()), [=](const Hb_Adapter& adapter) {
    if (adapter.Hb_network == network) {
      Member_Set(group).change(adapter.Hb_adapter_num, add == 1);
    }
  });
  return Hb_Success;
}

Hb_Rc hb_change_node_subscription_group(Hb_Subscription_Group* group, Hb_Node_Number node, int add) {
  if (start_with(group) != Hb_Success || check_configured_node(node) != Hb_Success) {
    return Hb_Failure;
  }
  return change_member(group, node_worker, static_cast<uint32_t>(node), add);
}

bool is_configured_site(int site) { return site < HB_MAX_SITES && global_site_tbl[site] == Hb_True; }

Hb_Rc hb_change_site_subscription_group(Hb_Subscription_Group* group, Hb_Site_Number site, int add) {
  if (start_with(group) != Hb_Success) {
    return Hb_Failure;
  }
  if (site >= table().Hb_max_sites) {
    return fail(HB_EINVAL);
  }
  if (!is_configured_site(site)) {
    return fail(HB_ESITESUB);
  }
  return change_member(group, site_worker, site, add);
}

template <typename Number>
Hb_Rc walk(Hb_Subscription_Group* group, Number* member, int trans, Hb_Subscription_Type type, int bound, Number none) {
  if (start_with(group, member) != Hb_Success) {
    return Hb_Failure;
  }
  if (group->Hb_subscription_type != type) {
    return fail(HB_ESUBSCRIBE);
  }
  const int position = Member_Set(group).find(trans == 1 ? 0 : group->Hb_cursor, bound);
  if (position < 0) {
    *member = none;
    return fail(HB_ENOMORE);
  }
  *member = static_cast<Number>(position);
  group->Hb_cursor = position + 1;
  return Hb_Success;
}

Hb_Rc process_adapter_subscription(Hb_Subscription_Group* group, Hb_Adapter_Number* adapter, int trans) {
  if (hb_init() != Hb_Success) {
    return Hb_Failure;
  }
  const int bound = static_cast<int>(adapter_number_limit(table()));
  return walk(group, adapter, trans, Hb_Adapter_Subscription, bound, HB_NO_ADAPTER);
}

Hb_Rc process_node_subscription(Hb_Subscription_Group* group, Hb_Node_Number* node, int trans) {
  if (hb_init() != Hb_Success) {
    return Hb_Failure;
  }
  return walk(group, node, trans, Hb_Node_Subscription, table().Hb_max_nodes, HB_NO_NODE);
}

Hb_Rc process_site_subscription(Hb_Subscription_Group* group, Hb_Site_Number* site, int trans) {
  if (hb_init() != Hb_Success) {
    return Hb_Failure;
  }
  const int bound = std::min<int>(table().Hb_max_sites, HB_SITE_SET_LENGTH * 8);
  return walk(group, site, trans, Hb_Site_Subscription, bound, HB_NO_SITE);
}

constexpr int first = 1;
constexpr int next = 0;
constexpr int add_member = 1;
constexpr int remove_member = 0;

// Copies what a name slot keeps of a name, the rest zero. The name may lie in the slot itself.
void copy_name(Hb_Name& to, const char* name) {
  Hb_Name kept = {};
  std::memcpy(kept, name, strnlen(name, sizeof kept - 1));
  std::memcpy(to, kept, sizeof to);
}

// What the record is sent as, and what its type is afterwards.
struct Sent_Type {
  Hb_Subscription_Type sent;
  Hb_Subscription_Type left;
};

// Three masks, each alone, name what is subscribed whatever the members are.
Sent_Type type_by_mask(Hb_Subscription_Type type, int events) {
  switch (events) {
    case HB_EVENT_DIFF_INSTANCE:
      return {Hb_Diff_Inst_Num_Subscription, Hb_Diff_Inst_Num_Subscription};
    case HB_EVENT_SPLIT_MERGE:
      return {Hb_Split_Merge_Subscription, Hb_Split_Merge_Subscription};
    case HB_EVENT_SITES:
      return {Hb_All_Sites_Subscription, Hb_Site_Subscription};
    default:
      return {type, type};
  }
}

// A group of everything is sent as such, so that it stays one when the configuration grows.
Hb_Subscription_Type type_to_send(Hb_Subscription_Type type, int32_t members) {
  if (type == Hb_Adapter_Subscription && members == table().Hb_num_adapters) {
    return Hb_All_Adapters_Subscription;
  }
  if (type == Hb_Node_Subscription && members == global_num_nodes) {
    return Hb_All_Nodes_Subscription;
  }
  return type;
}

Hb_Rc wake_new_group_monitor(const char& request) {
  if (new_group_event_handler_p == nullptr) {
    trace(Trace_Info, trace_no_new_group_handler);
    return fail(HB_ENOGROUPHANDLER);
  }
  const int descriptor = new_group_event_handler_p->getWriteFd();
  const ssize_t written = write_to_pipe(descriptor, request);
  if (written != 1) {
    trace_values(Trace_Info, trace_new_group_write_failed, written, errno);
    return fail(HB_EEVENTPIPE);
  }
  trace_values(Trace_Info, trace_new_group_written, descriptor);
  return Hb_Success;
}

// Remembers the name under which a kind of event is delivered in VEX mode, and wakes the monitor that answers.
Hb_Rc remember_subscription(char* name, Hb_Subscription_Type type) {
  const bool vex_mode = IsVEX != Hb_False;
  switch (type) {
    case Hb_Node_Subscription:
    case Hb_All_Nodes_Subscription:
      copy_name(nodeEventSubscriptionName, name);
      return vex_mode ? wake_new_group_monitor(VEX_ask_for_node_group) : Hb_Success;
    case Hb_Adapter_Subscription:
    case Hb_All_Adapters_Subscription:
    case Hb_Network_Subscription:
      copy_name(networkEventSubscriptionName, name);
      return vex_mode ? wake_new_group_monitor(VEX_ask_for_adapter_group) : Hb_Success;
    case Hb_Site_Subscription:
    case Hb_All_Sites_Subscription:
      copy_name(siteEventSubscriptionName, name);
      return Hb_Success;
    case Hb_Split_Merge_Subscription:
      copy_name(splitMergeEventSubscriptionName, name);
      return Hb_Success;
    default:
      return Hb_Success;
  }
}

void forget_name(Hb_Name& slot, const Hb_Name& name) {
  if (std::strncmp(slot, name, sizeof slot) == 0) {
    std::memset(slot, 0, sizeof slot - 1);
  }
}

}  // namespace

Hb_Rc VEX_handle_subscription(char* name, Hb_Subscription_Group* group) {
  const Hb_Rc rc = remember_subscription(name, group->Hb_subscription_type);
  return IsVEX != Hb_False ? rc : hb_send(HB_SUBSCRIBE, group, sizeof *group);
}

Hb_Rc hb_empty_subscription_group(Hb_Subscription_Group* group) {
  if (start_with(group) != Hb_Success) {
    return Hb_Failure;
  }
  group->Hb_subscription_type = Hb_Empty_Subscription;
  return Hb_Success;
}

Hb_Rc hb_add_all_adapters_to_subscription_group(Hb_Subscription_Group* group) {
  if (start_with(group) != Hb_Success) {
    return Hb_Failure;
  }
  reset(group, adapter_worker);
  Member_Set members(group);
  std::for_each_n(table().Hb_global_adapter_list, adapters_in_list(table()),
                  [&members](const Hb_Adapter& adapter) { members.change(adapter.Hb_adapter_num, true); });
  members.set_count(table().Hb_num_adapters);
  return Hb_Success;
}

Hb_Rc hb_add_all_nodes_to_subscription_group(Hb_Subscription_Group* group) {
  if (start_with(group) != Hb_Success) {
    return Hb_Failure;
  }
  reset(group, node_worker);
  Member_Set members(group);
  for (int node = 0; node < std::min<int>(table().Hb_max_nodes, HB_MAX_NODES); ++node) {
    if (global_node_tbl[node] == Hb_True) {
      members.change(static_cast<uint32_t>(node), true);
    }
  }
  members.set_count(global_num_nodes);
  return Hb_Success;
}

Hb_Rc hb_add_all_sites_to_subscription_group(Hb_Subscription_Group* group) {
  if (start_with(group) != Hb_Success) {
    return Hb_Failure;
  }
  reset(group, site_worker);
  Member_Set members(group);
  for (int site = 0; site < table().Hb_max_sites; ++site) {
    if (is_configured_site(site)) {
      members.change(static_cast<uint32_t>(site), true);
    }
  }
  members.set_count(global_num_sites);
  return Hb_Success;
}

Hb_Rc hb_add_adapter_to_subscription_group(Hb_Subscription_Group* group, Hb_Adapter_Number adapter) {
  return hb_change_adapter_subscription_group(group, adapter, add_member);
}
Hb_Rc hb_remove_adapter_from_subscription_group(Hb_Subscription_Group* group, Hb_Adapter_Number adapter) {
  return hb_change_adapter_subscription_group(group, adapter, remove_member);
}

Hb_Rc hb_add_network_to_subscription_group(Hb_Subscription_Group* group, Hb_Network_Number network) {
  return hb_change_network_in_subscription_group(group, network, add_member);
}
Hb_Rc hb_remove_network_from_subscription_group(Hb_Subscription_Group* group, Hb_Network_Number network) {
  return hb_change_network_in_subscription_group(group, network, remove_member);
}

Hb_Rc hb_add_node_to_subscription_group(Hb_Subscription_Group* group, Hb_Node_Number node) {
  return hb_change_node_subscription_group(group, node, add_member);
}
Hb_Rc hb_remove_node_from_subscription_group(Hb_Subscription_Group* group, Hb_Node_Number node) {
  return hb_change_node_subscription_group(group, node, remove_member);
}

Hb_Rc hb_add_site_to_subscription_group(Hb_Subscription_Group* group, Hb_Site_Number site) {
  return hb_change_site_subscription_group(group, site, add_member);
}
Hb_Rc hb_remove_site_from_subscription_group(Hb_Subscription_Group* group, Hb_Site_Number site) {
  return hb_change_site_subscription_group(group, site, remove_member);
}

Hb_Rc hb_get_first_subscription_adapter(Hb_Subscription_Group* group, Hb_Adapter_Number* adapter) {
  return process_adapter_subscription(group, adapter, first);
}
Hb_Rc hb_get_next_subscription_adapter(Hb_Subscription_Group* group, Hb_Adapter_Number* adapter) {
  return process_adapter_subscription(group, adapter, next);
}

Hb_Rc hb_get_first_subscription_node(Hb_Subscription_Group* group, Hb_Node_Number* node) {
  return process_node_subscription(group, node, first);
}
Hb_Rc hb_get_next_subscription_node(Hb_Subscription_Group* group, Hb_Node_Number* node) {
  return process_node_subscription(group, node, next);
}

Hb_Rc hb_get_first_subscription_site(Hb_Subscription_Group* group, Hb_Site_Number* site) {
  return process_site_subscription(group, site, first);
}
Hb_Rc hb_get_next_subscription_site(Hb_Subscription_Group* group, Hb_Site_Number* site) {
  return process_site_subscription(group, site, next);
}

Hb_Rc hb_subscribe(char* name, Hb_Subscription_Group* group, int events) {
  if (!all_given(name, group) || events == 0 || (events & ~HB_EVENT_SUBSCRIBABLE) != 0) {
    return fail(HB_EINVAL);
  }
  Sent_Type type = type_by_mask(group->Hb_subscription_type, events);
  type.sent = type_to_send(type.sent, Member_Set(group).count());
  group->Hb_subscription_type = type.sent;
  if (type.sent == Hb_Empty_Subscription) {
    return fail(HB_ESUBSCRIBE);
  }
  copy_name(group->Hb_name, name);
  group->Hb_events = events;
  const Hb_Rc rc = VEX_handle_subscription(name, group);
  group->Hb_subscription_type = type.left;
  return rc;
}

Hb_Rc hb_unsubscribe(char* name) {
  if (name == nullptr) {
    return fail(HB_EINVAL);
  }
  Hb_Name text = {};
  copy_name(text, name);
  if (IsVEX == Hb_False) {
    return hb_send(HB_UNSUBSCRIBE, text, static_cast<int>(std::strlen(text)) + 1);
  }
  forget_name(nodeEventSubscriptionName, text);
  forget_name(networkEventSubscriptionName, text);
  forget_name(siteEventSubscriptionName, text);
  forget_name(splitMergeEventSubscriptionName, text);
  return Hb_Success;
}
