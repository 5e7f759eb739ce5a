#include "VEX_EVMONNewGroupEventHandler.h"

#include <unistd.h>

#include <cerrno>

#include "VEX_HBC_trace.h"
#include "adapter_list.h"
#include "platform_list.h"
#include "platform_membership.h"
#include "vex_outputs.h"
#include "vex_platform_records.h"

namespace {

bool is_member(const Hb_Boolean& entry) { return entry == Hb_True; }
bool is_member(const Hb_Incarnation& entry) { return entry == VEX_named_in_group; }

Hb_Rc deliver_nothing(const Vex_Outputs& out, Trace_Record unsubscribed) {
  const Hb_Rc rc = deliver_no_event(out, 0);
  trace(Trace_Info, unsubscribed);
  return rc;
}

// Each yields the number of members that it named.
int32_t name_nodes(const zu_vex_node_info_t* nodes, Hb_Boolean* list) {
  int32_t count = 0;
  for (const zu_vex_node_info_t& node : records_of(nodes)) {
    if (is_known_node_up(node) && !is_member(list[node.number])) {
      list[node.number] = Hb_True;
      ++count;
    }
  }
  return count;
}

int32_t name_adapters(const zu_vex_net_intf_info_t* interfaces, Hb_Incarnation* list) {
  int32_t count = 0;
  for (const zu_vex_net_intf_info_t& interface : records_of(interfaces)) {
    const Hb_Adapter* adapter = find_adapter_of_interface(global_config_tbl, interface);
    if (adapter != nullptr && adapter->Hb_adapter_num < HB_MAX_ADAPTERS && is_interface_up(interface, *adapter) &&
        !is_member(list[adapter->Hb_adapter_num])) {
      list[adapter->Hb_adapter_num] = VEX_named_in_group;
      ++count;
    }
  }
  return count;
}

Hb_Rc answer_with_nodes(EVMONHandler& handler, const Vex_Outputs& out) {
  if (nodeEventSubscriptionName[0] == '\0') {
    return deliver_nothing(out, trace_new_node_group_unsubscribed);
  }
  zu_vex_node_info_t* list = nullptr;
  const int result = zu_vex_get_node_info(&list);
  if (result != 0) {
    trace_values(Trace_Info, trace_new_group_nodes_failed, result, HB_EVEXTBL_ENTRY);
    return fail(HB_EVEXTBL_ENTRY);
  }
  const Node_List nodes(list);
  *out.events = HB_EVENT_NEW_GROUP;
  *out.seqnum = 0;
  handler.fillInNodeEventInfo(VEX_no_node, HB_EVENT_NEW_GROUP, out.name, out.group);
  if (out.group != nullptr) {
    Hb_Node_Membership_Grp& membership = out.group->Hb_membership_grp_union.Hb_node_membership_grp;
    membership.Hb_num_nodes = name_nodes(nodes.get(), membership.Hb_node_list);
  }
  return Hb_Success;
}

void clear_members(Hb_Group* group) {
  if (group != nullptr) {
    clear_adapter_list(group->Hb_membership_grp_union.Hb_adapter_membership_grp,
                       adapter_number_limit(global_config_tbl));
  }
}

Hb_Rc answer_with_adapters(EVMONHandler& handler, const Vex_Outputs& out) {
  if (networkEventSubscriptionName[0] == '\0') {
    return deliver_nothing(out, trace_new_adapter_group_unsubscribed);
  }
  clear_members(out.group);
  zu_vex_net_intf_info_t* list = nullptr;
  const int result = zu_vex_get_net_intf_info(&list);
  if (result != 0) {
    trace_values(Trace_Info, trace_new_group_adapters_failed, result, errno, HB_EVEXTBL_INTF);
    return fail(HB_EVEXTBL_INTF);
  }
  const Interface_List interfaces(list);
  *out.events = HB_EVENT_NEW_GROUP;
  handler.fillInOneAdapterEvent(out.events, out.name, out.group, out.seqnum);
  if (out.group != nullptr) {
    Hb_Adapter_Membership_Grp& membership = out.group->Hb_membership_grp_union.Hb_adapter_membership_grp;
    membership.Hb_num_adapters = name_adapters(interfaces.get(), membership.Hb_adapter_list);
  }
  return Hb_Success;
}

Hb_Rc answer(EVMONHandler& handler, unsigned char request, ssize_t count, const Vex_Outputs& out) {
  switch (request) {
    case VEX_ask_for_node_group:
      return answer_with_nodes(handler, out);
    case VEX_ask_for_adapter_group:
      return answer_with_adapters(handler, out);
    default:
      trace_values(Trace_Info, trace_new_group_unknown, request, count, HB_EVEXGROUP);
      return fail(HB_EVEXGROUP);
  }
}

Hb_Rc read_and_answer(EVMONHandler& handler, int descriptor, const Vex_Outputs& out) {
  unsigned char request = 0;
  const ssize_t count = read(descriptor, &request, sizeof request);
  if (count != 1) {
    trace_values(Trace_Info, trace_new_group_read_failed, count, errno);
    return fail(HB_EMONITOR_READ);
  }
  if (evmon_cluster_name == nullptr) {
    trace(Trace_Info, trace_new_group_without_cluster_name);
  }
  return answer(handler, request, count, out);
}

}  // namespace

EVMONNewGroupEventHandler::EVMONNewGroupEventHandler(int32_t* fds, char* path)
    : EVMONHandler(fds, path), evmon_pipe_write_fd(fds[1]) {
  evmon_fd = fds[0];
  selfRegister();
}

EVMONNewGroupEventHandler::EVMONNewGroupEventHandler(char* path)
    : EVMONHandler(path, static_cast<const char*>(nullptr)), evmon_pipe_write_fd(-1) {}

int32_t EVMONNewGroupEventHandler::getWriteFd() { return evmon_pipe_write_fd; }

EVMONNewGroupEventHandler::~EVMONNewGroupEventHandler() {
  if (evmon_pipe_write_fd != -1) {
    close(evmon_pipe_write_fd);
    evmon_pipe_write_fd = -1;
  }
}

Hb_Rc EVMONNewGroupEventHandler::handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) {
  trace_values(Trace_Info, trace_new_group_begins, evmon_fd);
  const Hb_Rc rc = read_and_answer(*this, evmon_fd, {events, name, group, seqnum_p});
  trace(Trace_Info, trace_new_group_ends);
  return rc;
}
