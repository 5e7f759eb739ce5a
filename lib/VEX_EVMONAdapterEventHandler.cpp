#include "VEX_EVMONAdapterEventHandler.h"

#include <cerrno>

#include "VEX_interface_changes.h"
#include "adapter_list.h"
#include "vex_present_interfaces.h"

namespace {

typedef zu_evm_event_adapter_liveness_t Notification;

Hb_Adapter_Membership_Grp& members_of(Hb_Group& group) {
  return group.Hb_membership_grp_union.Hb_adapter_membership_grp;
}

void clear_members(Hb_Group& group) { clear_adapter_list(members_of(group), adapter_number_limit(global_config_tbl)); }

zu_evm_event_metadata_t metadata_of(Notification& notification) {
  zu_evm_event_metadata_t metadata = {};
  metadata.category = ZU_EVM_EVENT_CATEGORY_ADAPTER_LIVENESS;
  metadata.event.p_adapter_liveness = &notification;
  return metadata;
}

// What an interface that went down or came up does to its adapters, and how each that changes is told.
struct Transition {
  Hb_Entity_State state;
  Hb_Events event;
  Trace_Record changed;
};

constexpr Transition went_down = {Hb_Entity_Down, HB_EVENT_DEATH, trace_adapter_went_down};
constexpr Transition came_up = {Hb_Entity_Up, HB_EVENT_JOIN, trace_adapter_came_up};

struct Transition_Count {
  int32_t changed_cnt = 0;
  int32_t duplicated_cnt = 0;
};

// In the table in force; those that change are named in the group, if there is one.
Transition_Count change_adapters(const Notification& notification, const Transition& transition,
                                 Present_Interfaces& present, Hb_Group* group) {
  Transition_Count count;
  for_each_adapter_on(global_config_tbl, notification.node_number, notification.p_interface_name,
                      [&](Hb_Adapter& adapter) {
                        trace(Trace_Info, trace_adapter_in_table);
                        if (adapter.Hb_state == transition.state || present.contradict(adapter, transition.state)) {
                          ++count.duplicated_cnt;
                          return;
                        }
                        ++count.changed_cnt;
                        adapter.Hb_state = transition.state;
                        if (group != nullptr) {
                          members_of(*group).Hb_adapter_list[adapter.Hb_adapter_num] = VEX_named_in_group;
                        }
                        trace(Trace_Info, transition.changed);
                      });
  return count;
}

void change_waiting_table(const Notification& notification, const Transition& transition, Present_Interfaces& present) {
  for_each_adapter_on(global_config_tbl_new, notification.node_number, notification.p_interface_name,
                      [&](Hb_Adapter& adapter) {
                        if (adapter.Hb_state != transition.state && !present.contradict(adapter, transition.state)) {
                          adapter.Hb_state = transition.state;
                        }
                      });
}

// One notification, and where it is told.
class Interface_Change {
 public:
  Interface_Change(EVMONConfigurationHandler& handler, Notification& notification, const Vex_Outputs& out)
      : handler_(handler), notification_(notification), out_(out) {}

  Hb_Rc tell();

 private:
  Hb_Rc came_or_went();
  Hb_Rc changed_state(const Transition& transition);
  Hb_Rc not_in_table(const Transition& transition);
  Hb_Rc deliver(const Transition& transition, int32_t count);

  EVMONConfigurationHandler& handler_;
  Notification& notification_;
  Vex_Outputs out_;
};

Hb_Rc Interface_Change::tell() {
  trace_data(Trace_Info, trace_adapter_liveness, {block_of_interface(notification_.p_interface_name)});
  switch (notification_.event_type) {
    case ZU_EVM_EVENT_ADD:
    case ZU_EVM_EVENT_DELETE:
      return came_or_went();
    case ZU_EVM_EVENT_DOWN:
      return changed_state(went_down);
    case ZU_EVM_EVENT_UP:
      return changed_state(came_up);
    default:
      return deliver_no_event(out_, 0);
  }
}

Hb_Rc Interface_Change::came_or_went() {
  if (!is_boot_interface(notification_.node_number, notification_.p_interface_name, nullptr)) {
    trace_data(Trace_Info, trace_adapter_is_alias, {block_of_interface(notification_.p_interface_name)});
    return deliver_alias(out_);
  }
  return rebuild_and_tell(handler_, metadata_of(notification_), out_);
}

Hb_Rc Interface_Change::changed_state(const Transition& transition) {
  trace(Trace_Info, trace_adapter_compared_with_table);
  Present_Interfaces present(notification_.node_number, metadata_of(notification_));
  const Transition_Count count = change_adapters(notification_, transition, present, out_.group);
  change_waiting_table(notification_, transition, present);
  if (count.changed_cnt != 0) {
    return deliver(transition, count.changed_cnt);
  }
  if (count.duplicated_cnt == 0) {
    return not_in_table(transition);
  }
  trace(Trace_Info, trace_adapter_repeated);
  return deliver_no_event(out_, 0);
}

Hb_Rc Interface_Change::not_in_table(const Transition& transition) {
  trace(Trace_Info, trace_adapter_not_in_table);
  return transition.state == Hb_Entity_Up ? rebuild_and_tell(handler_, metadata_of(notification_), out_)
                                          : deliver_no_event(out_, 0);
}

Hb_Rc Interface_Change::deliver(const Transition& transition, int32_t count) {
  *out_.events = transition.event;
  handler_.fillInOneAdapterEvent(out_.events, out_.name, out_.group, out_.seqnum);
  if (out_.group != nullptr) {
    members_of(*out_.group).Hb_num_adapters = count;
  }
  return Hb_Success;
}

}  // namespace

EVMONAdapterEventHandler::EVMONAdapterEventHandler(char* path)
    : EVMONConfigurationHandler(path, p_adapterEVMONinitstr) {}

Hb_Rc EVMONAdapterEventHandler::handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) {
  trace_values(Trace_Info, trace_adapter_liveness_begins, evmon_fd);
  if (group != nullptr) {
    clear_members(*group);
  }
  const Hb_Rc rc = read_and_tell({events, name, group, seqnum_p});
  trace_values(Trace_Info, trace_adapter_liveness_ends, evmon_fd);
  return rc;
}

Hb_Rc EVMONAdapterEventHandler::read_and_tell(const Vex_Outputs& out) {
  Notification* record = nullptr;
  const int read_result = zu_evm_read_adapter_liveness(evmon_fd, &record);
  if (read_result == ZU_EVM_NOTHING) {
    trace(Trace_Info, trace_adapter_liveness_nothing);
    *out.events = HB_EVENT_NONE;
    return Hb_Success;
  }
  if (read_result != ZU_EVM_RECORD || record == nullptr) {
    return cannot_be_read(trace_adapter_liveness_read_failed, read_result, evmon_fd, errno);
  }
  const Monitor_Record<Notification> notification(record);
  return Interface_Change(*this, *notification, out).tell();
}
