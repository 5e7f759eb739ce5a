#include "event.h"

#include <cstring>

#include "address.h"
#include "hb_client.h"

namespace hbctl {
namespace {

// The events that come with a membership; with the others the record keeps what it had.
constexpr Hb_Events kMembershipEvents = HB_EVENT_DEATH | HB_EVENT_JOIN | HB_EVENT_NEW_GROUP;

void read_nodes(Hb_Group& group, Event& event) {
  event.subject = Subject::Nodes;
  Hb_Node_Number node = HB_NO_NODE;
  Hb_Rc result = hb_get_first_node(&group, &node);
  for (; result == Hb_Success; result = hb_get_next_node(&group, &node)) event.nodes.push_back(node);
}

void read_adapters(Hb_Group& group, Event& event) {
  event.subject = Subject::Adapters;
  Hb_Adapter_Identifier member{};
  Hb_Rc result = hb_get_first_adapter(&group, &member);
  for (; result == Hb_Success; result = hb_get_next_adapter(&group, &member)) {
    event.adapters.push_back({member.Hb_adapter_number, hb_adapter_incarnation(&member),
                              hb_has_adapter_died_because_removed(&member) == Hb_True});
  }
}

void read_membership(Hb_Group& group, Event& event) {
  if (group.Hb_group_type == Hb_Node_Group) read_nodes(group, event);
  if (group.Hb_group_type == Hb_Adapter_Group) read_adapters(group, event);
}

void read_new_group(Hb_Group& group, Event& event) {
  Hb_Group_Status status = Hb_Group_Unstable;
  if (hb_get_group_status(&group, &status) == Hb_Success) event.stable = status == Hb_Group_Stable;
  Hb_Adapter_Identifier id{};
  if (event.subject == Subject::Adapters && hb_get_group_id(&group, &id) == Hb_Success)
    event.identity = {id.Hb_adapter_number, hb_adapter_incarnation(&id)};
}

void read_failure_data(Hb_Group& group, Event& event) {
  Hb_FFDC_Id id{};
  if (hb_get_FFDC_id(&group, &id) == Hb_Success) event.failure_data = printable({id, strnlen(id, sizeof id)});
}

void read_sender(Hb_Group& group, Event& event) {
  Hb_Diff_Instance_Info sender{};
  if (hb_get_different_instance_sender(&group, &sender) == Hb_Success)
    event.sender = {address_text(sender.addr), sender.machinesInst};
}

void read_heartbeat(Event& event) {
  Hb_client_hb_info_t info{};
  if (hb_get_client_hb_info(&info) != Hb_Success) return;
  event.heartbeat = {info.client_hb_thresh.tv_sec + info.client_hb_thresh.tv_usec / 1e6,
                     info.client_hb_is_enabled == Hb_True, info.client_hb_daemon_pid};
}

}  // namespace

std::vector<Hb_Adapter_Number> Event::adapter_numbers() const {
  std::vector<Hb_Adapter_Number> numbers;
  for (const Member& member : adapters) numbers.push_back(member.number);
  return numbers;
}

void read_group(Hb_Group& group, Event& event) {
  if ((event.bits & kMembershipEvents) != 0) read_membership(group, event);
  if (event.bits == HB_EVENT_NEW_GROUP) read_new_group(group, event);
  if (event.bits == HB_EVENT_DEATH || event.bits == HB_EVENT_JOIN || event.bits == HB_EVENT_FFDC_ID)
    read_failure_data(group, event);
  if (event.bits == HB_EVENT_DIFF_INSTANCE) read_sender(group, event);
  if (event.bits == HB_EVENT_NODE_HEARTBEAT) read_heartbeat(event);
}

}  // namespace hbctl
