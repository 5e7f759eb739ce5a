#include "hb_communication/event_reception.h"

#include <algorithm>
#include <iterator>

#include "VEX_EVMONEventPipeHandler.h"
#include "VEX_HBC_trace.h"
#include "event_names.h"
#include "hb_communication/configuration_load.h"
#include "hb_communication/connection.h"
#include "hb_global_data/record_index.h"
#include "hb_global_data/vex_event_queue.h"

Hb_client_hb_info_t client_hb_info = {};

namespace {

// The caller's outputs of one event.
struct Outputs {
  Hb_Events* events;
  char* name;
  Hb_Group* group;
};

// The name fills its field when it came without a terminator, and the caller's buffer is no longer than the field.
void copy_subscription_name(char* name, const Hb_Name& from) {
  std::memcpy(name, from, HB_NAME_LENGTH);
  name[HB_NAME_LENGTH - 1] = '\0';
}

void set_event(const Outputs& out, Hb_Events event) {
  *out.events = event;
  out.group->Hb_events = event;
}

size_t adapter_entries_size(int32_t last_index) {
  return last_index >= 0 ? (static_cast<size_t>(last_index) + 1) * sizeof(hb_adapter_event_entry) : 0;
}

bool is_whole_adapter_event(const Message& message) {
  if (!message.holds(0, sizeof(hb_adapter_event_header))) {
    return false;
  }
  const auto header = message.at<hb_adapter_event_header>(0);
  return message.holds(sizeof header, adapter_entries_size(header.last_index));
}

// Whether everything that the packet's kind promises was sent.
bool is_whole(const Packet& packet) {
  const Message message(packet);
  switch (packet->kind) {
    case HB_ADAPTER_DEATH:
    case HB_ADAPTER_JOIN:
    case HB_ADAPTER_NEW_GROUP:
      return is_whole_adapter_event(message);
    case HB_NODE_DEATH:
    case HB_NODE_JOIN:
    case HB_NODE_NEW_GROUP:
      return message.holds(0, static_cast<size_t>(global_config_tbl.Hb_max_nodes) * sizeof(Hb_Boolean));
    case HB_NODE_HEARTBEAT:
      return message.holds(0, sizeof(Hb_client_hb_info_t));
    case HB_CONFIGURATION_UPDATE:
      return is_usable_configuration(packet);
    case HB_DIFF_INSTANCE_NUM:
      return message.holds(0, sizeof(Hb_Diff_Instance_Info));
    default:
      return true;
  }
}

void set_adapter_state(Hb_Adapter_Number number, Hb_Entity_State state) {
  Hb_Adapter* found = find_configured_adapter(number);
  if (found != nullptr) {
    found->Hb_state = state;
  }
}

void set_node_state(int node, bool up) {
  Hb_Node_config_state* entry = find_configured_node(static_cast<uint32_t>(node));
  if (entry == nullptr) {
    return;
  }
  entry->state = up ? Hb_Entity_Up : Hb_Entity_Down;
  entry->reason = up ? Hb_Entity_State_Reason_Up : Hb_Entity_State_Reason_Down;
}

void fill_adapter_list(Hb_Adapter_Membership_Grp& membership, const client_packet_t* pack) {
  std::fill_n(membership.Hb_adapter_list, adapter_number_limit(global_config_tbl), HB_NOT_IN_GROUP);
  const Message message(pack);
  const auto header = message.at<hb_adapter_event_header>(0);
  const size_t end = std::min(sizeof header + adapter_entries_size(header.last_index), sizeof pack->message);
  const Hb_Entity_State state = pack->kind == HB_ADAPTER_DEATH ? Hb_Entity_Down : Hb_Entity_Up;
  for (size_t offset = sizeof header; offset + sizeof(hb_adapter_event_entry) <= end;
       offset += sizeof(hb_adapter_event_entry)) {
    const auto entry = message.at<hb_adapter_event_entry>(offset);
    if (entry.adapter >= HB_MAX_ADAPTERS) {
      continue;  // the list has no place for it
    }
    membership.Hb_adapter_list[entry.adapter] = entry.incarnation;
    set_adapter_state(entry.adapter, state);
  }
  membership.Hb_num_adapters = static_cast<int32_t>(static_cast<uint32_t>(header.last_index) + 1);
}

// The first member from node on, or nodes. Few nodes are in most events, so the others are passed many at once.
int next_member(const Hb_Boolean* list, int node, int nodes) {
  while (node < nodes && list[node] != Hb_True) {
    const void* rest = list + node + 1;
    const void* found = std::memchr(rest, Hb_True, static_cast<size_t>(nodes - node - 1) * sizeof *list);
    node = found != nullptr ? static_cast<int>((static_cast<const char*>(found) - reinterpret_cast<const char*>(list)) /
                                               static_cast<ptrdiff_t>(sizeof *list))
                            : nodes;
  }
  return node;
}

void fill_node_list(Hb_Group& group, const client_packet_t* pack) {
  Hb_Node_Membership_Grp& membership = group.Hb_membership_grp_union.Hb_node_membership_grp;
  const int nodes = global_config_tbl.Hb_max_nodes;
  Message(pack).copy(membership.Hb_node_list, 0, static_cast<size_t>(nodes) * sizeof(Hb_Boolean));
  group.Hb_group_type = Hb_Node_Group;
  membership.Hb_num_nodes = 0;
  for (int node = next_member(membership.Hb_node_list, 0, nodes); node < nodes;
       node = next_member(membership.Hb_node_list, node + 1, nodes)) {
    set_node_state(node, pack->kind != HB_NODE_DEATH);
    ++membership.Hb_num_nodes;
  }
}

// Deaths and joins name members only; a new group says who leads it and whether it is stable.
void fill_adapter_group_identity(Hb_Group& group, const client_packet_t* pack) {
  Hb_Adapter_Membership_Grp& membership = group.Hb_membership_grp_union.Hb_adapter_membership_grp;
  const bool new_group = pack->kind == HB_ADAPTER_NEW_GROUP;
  membership.Hb_group_leader = new_group ? pack->leader_id.word[0] : HB_NO_ADAPTER;
  membership.Hb_group_incarnation = new_group ? pack->group_id.word[1] : HB_NOT_IN_GROUP;
  group.Hb_group_status = new_group ? pack->group_status : Hb_Group_Unstable;
}

Hb_Events adapter_event(int32_t kind) {
  switch (kind) {
    case HB_ADAPTER_DEATH:
      return HB_EVENT_DEATH;
    case HB_ADAPTER_JOIN:
      return HB_EVENT_JOIN;
    default:
      return HB_EVENT_NEW_GROUP;
  }
}

Hb_Events fill_node_event(Hb_Group& group, const client_packet_t* pack) {
  switch (pack->kind) {
    case HB_NODE_HEARTBEAT:
      Message(pack).copy(&client_hb_info, 0, sizeof client_hb_info);
      return HB_EVENT_NODE_HEARTBEAT;
    case HB_NODE_NEW_GROUP:
      group.Hb_group_status = pack->group_status;
      return HB_EVENT_NEW_GROUP;
    default:
      group.Hb_group_status = Hb_Group_Unstable;
      std::memcpy(group.Hb_ffdc_id, pack->ffdc_id, sizeof group.Hb_ffdc_id);
      return pack->kind == HB_NODE_DEATH ? HB_EVENT_DEATH : HB_EVENT_JOIN;
  }
}

Hb_Rc deliver_configuration_update(const Outputs& out, const Packet& packet) {
  if (load_configuration_update(packet) != Hb_Success) {
    return Hb_Failure;
  }
  *out.events = HB_EVENT_CONFIGURATION;
  std::memcpy(out.name, configuration_event_name, sizeof configuration_event_name);
  return Hb_Success;
}

Hb_Rc deliver_ffdc_id(const Outputs& out, const Packet& packet) {
  set_event(out, HB_EVENT_FFDC_ID);
  std::memcpy(out.name, ffdc_event_name, sizeof ffdc_event_name);
  std::memcpy(out.group->Hb_ffdc_id, packet->ffdc_id, sizeof out.group->Hb_ffdc_id);
  return Hb_Success;
}

Hb_Rc deliver_diff_instance(const Outputs& out, const Packet& packet) {
  copy_subscription_name(out.name, packet->subscription_name);
  Hb_Diff_Instance_Info& info = out.group->Hb_membership_grp_union.diff_instance_info;
  Message(packet).copy(&info, 0, sizeof info);
  set_event(out, HB_EVENT_DIFF_INSTANCE);
  out.group->Hb_group_type = Hb_Diff_Instance_Type;
  return Hb_Success;
}

Hb_Rc deliver(const Outputs& out, Packet packet) {
  switch (packet->kind) {
    case HB_ADAPTER_DEATH:
    case HB_ADAPTER_JOIN:
    case HB_ADAPTER_NEW_GROUP:
      return hb_get_adapter_event(out.events, out.name, out.group, packet.release());
    case HB_NODE_DEATH:
    case HB_NODE_JOIN:
    case HB_NODE_NEW_GROUP:
    case HB_NODE_HEARTBEAT:
      return hb_get_node_event(out.events, out.name, out.group, packet.release());
    case HB_CONFIGURATION_UPDATE:
      return deliver_configuration_update(out, packet);
    case HB_FFDC_ID:
      return deliver_ffdc_id(out, packet);
    case HB_DIFF_INSTANCE_NUM:
      return deliver_diff_instance(out, packet);
    default:
      return fail(HB_EBADREPLY);  // the answer to a request, which is lost here
  }
}

Hb_Rc get_daemon_event(const timeval* timeout, const Outputs& out, Hb_Seq_Num* seqnum_p) {
  if (timeout != nullptr && await_readable(*timeout) != Hb_Success) {
    return Hb_Failure;
  }
  Packet packet;
  if (receive_packet(packet) != Hb_Success) {
    return Hb_Failure;
  }
  if (!is_whole(packet)) {
    return fail(HB_EBADREPLY);
  }
  std::fill(std::begin(out.group->Hb_ffdc_id), std::end(out.group->Hb_ffdc_id), '\0');
  *seqnum_p = packet->notification_sequence_no;
  return deliver(out, std::move(packet));
}

// A queued event is taken before a descriptor is looked at.
Hb_Rc get_vex_event(int* descriptors, const Outputs& out, Hb_Seq_Num* seqnum_p) {
  Hb_Rc rc = Hb_Failure;
  if (VEX_event_queue_is_empty() == Hb_True) {
    EVMONHandler::dispatch(descriptors, out.events, out.name, out.group, seqnum_p, &rc);
  } else {
    trace(Trace_Info, trace_queued_event);
    rc = event_pipe_handler_p->handler(out.events, out.name, out.group, seqnum_p);
  }
  trace(Trace_Info, trace_event_wait_ends);
  return rc;
}

Hb_Rc stop_without_event_pipe() {
  trace(Trace_Info, trace_no_event_pipe);
  set_hb_errno(HB_ENOPIPEHANDLER);
  trace(Trace_Info, trace_event_wait_ends);
  return Hb_Failure;
}

}  // namespace

Hb_Rc hb_get_event_message(int* descriptors, timeval* timeout, Hb_Events* events, char* name, Hb_Group* group,
                           Hb_Seq_Num* seqnum_p) {
  const bool vex_mode = IsVEX != Hb_False;
  if (vex_mode) {
    trace(Trace_Info, trace_event_wait_begins);
    if (event_pipe_handler_p == nullptr) {
      return stop_without_event_pipe();
    }
  }
  if (descriptors != nullptr && descriptors[0] == -1) {
    return Hb_Failure;
  }
  if (descriptors == nullptr || events == nullptr || name == nullptr || group == nullptr || seqnum_p == nullptr) {
    return fail(HB_EINVAL);
  }
  const Outputs out = {events, name, group};
  return vex_mode ? get_vex_event(descriptors, out, seqnum_p) : get_daemon_event(timeout, out, seqnum_p);
}

Hb_Rc hb_get_adapter_event(Hb_Events* events, char* name, Hb_Group* group, client_packet_t* pack) {
  fill_adapter_list(group->Hb_membership_grp_union.Hb_adapter_membership_grp, pack);
  group->Hb_group_type = Hb_Adapter_Group;
  fill_adapter_group_identity(*group, pack);
  set_event({events, name, group}, adapter_event(pack->kind));
  copy_subscription_name(name, pack->subscription_name);
  delete[] reinterpret_cast<char*>(pack);
  return Hb_Success;
}

Hb_Rc hb_get_node_event(Hb_Events* events, char* name, Hb_Group* group, client_packet_t* pack) {
  if (pack->kind != HB_NODE_HEARTBEAT) {
    fill_node_list(*group, pack);
  }
  set_event({events, name, group}, fill_node_event(*group, pack));
  copy_subscription_name(name, pack->subscription_name);
  delete[] reinterpret_cast<char*>(pack);
  return Hb_Success;
}

void reset_node_membership_group_node_list(Hb_Group* group) {
  Hb_Node_Membership_Grp& membership = group->Hb_membership_grp_union.Hb_node_membership_grp;
  std::fill(std::begin(membership.Hb_node_list), std::end(membership.Hb_node_list), Hb_False);
}
