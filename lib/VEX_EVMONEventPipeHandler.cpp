#include "VEX_EVMONEventPipeHandler.h"

#include <poll.h>
#include <unistd.h>

#include <cerrno>
#include <utility>

#include "VEX_HBC_trace.h"
#include "hb_communication/event_reception.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/record_index.h"
#include "owned_event.h"
#include "vex_outputs.h"

namespace {

void read_wake_up(int descriptor) {
  unsigned char byte = 0;
  const ssize_t result = read(descriptor, &byte, sizeof byte);
  if (result < 0) {
    trace_values(Trace_Info, trace_event_pipe_read_failed, result, errno);
  } else if (result == 0) {
    trace(Trace_Info, trace_event_pipe_at_end);
  } else if (byte != VEX_wake_up) {
    set_hb_errno(HB_EPIPEMSG);
    trace_values(Trace_Info, trace_event_pipe_message, byte, result, HB_EPIPEMSG);
  }
}

// Whatever comes of it, the queue is served.
void take_wake_up(int descriptor) {
  pollfd polled = {descriptor, POLLIN, 0};
  const int ready = poll(&polled, 1, 0);
  if (ready < 0) {
    trace_values(Trace_Info, trace_event_pipe_poll_failed, ready, errno);
  } else if (ready == 0) {
    trace(Trace_Info, trace_event_pipe_not_ready);
  } else {
    read_wake_up(descriptor);
    if (polled.revents != POLLIN) {
      trace_values(Trace_Info, trace_event_pipe_polled, polled.revents);
    }
  }
}

// A node that went down for another reason is not revived by its daemon.
bool revive(uint32_t number) {
  Hb_Node_config_state* node = find_configured_node(number);
  if (node == nullptr) {
    trace_values(Trace_Info, trace_daemon_up_node_unknown, number);
    return false;
  }
  if (node->state != Hb_Entity_Down || node->reason != Hb_Entity_State_Reason_BRIXD_Down) {
    trace_values(Trace_Info, trace_daemon_up_dropped, number, node->state);
    return false;
  }
  node->state = Hb_Entity_Up;
  node->reason = Hb_Entity_State_Reason_BRIXD_Up;
  trace_values(Trace_Info, trace_daemon_up, number);
  return true;
}

// The kinds of group that are delivered under a subscription's name.
struct Delivery {
  Hb_Group_Type type;
  const Hb_Name& name;
  Trace_Record unsubscribed;
  void (*copy)(EVMONHandler& handler, Hb_Group* from, Hb_Group* to);
};

void copy_nodes(EVMONHandler& handler, Hb_Group* from, Hb_Group* to) {
  if (to != nullptr) {
    reset_node_membership_group_node_list(to);
  }
  handler.copy_node_Hb_Group(from, to);
}

void copy_sites(EVMONHandler& handler, Hb_Group* from, Hb_Group* to) {
  if (from->Hb_events == HB_EVENT_SITE_MERGE) {
    handler.copy_site_merge_Hb_Group(from, to);
  } else if (from->Hb_events == HB_EVENT_SITE_SPLIT) {
    handler.copy_site_split_Hb_Group(from, to);
  }
}

constexpr Delivery deliveries[] = {
    {Hb_Adapter_Group, networkEventSubscriptionName, trace_adapter_event_unsubscribed,
     [](EVMONHandler& handler, Hb_Group* from, Hb_Group* to) { handler.copy_adapter_Hb_Group(from, to); }},
    {Hb_Node_Group, nodeEventSubscriptionName, trace_node_event_unsubscribed, copy_nodes},
    {Hb_Site_Group, siteEventSubscriptionName, trace_site_event_unsubscribed, copy_sites},
};

void deliver_group(EVMONHandler& handler, const Delivery& delivery, Hb_Group& from, const Vex_Outputs& out) {
  if (!put_subscription_name(out.events, out.name, delivery.name)) {
    trace(Trace_Info, delivery.unsubscribed);
  }
  delivery.copy(handler, &from, out.group);
}

Hb_Rc deliver_configuration(const Vex_Outputs& out) {
  trace(Trace_Info, trace_delivering_configuration);
  const Hb_Rc rc = put_waiting_table_in_force();
  hb_vex_dump_global_table(&global_config_tbl, "Event pipe handler: after copy");
  put_name(out.name, configuration_event_name);
  return rc;
}

// Fails when there is no memory for a new configuration.
Hb_Rc deliver(EVMONHandler& handler, Hb_VEX_Event& event, const Vex_Outputs& out) {
  *out.events = event.group.Hb_events;
  *out.seqnum = 0;
  for (const Delivery& delivery : deliveries) {
    if (delivery.type == event.group.Hb_group_type) {
      deliver_group(handler, delivery, event.group, out);
    }
  }
  return event.group.Hb_events == HB_EVENT_CONFIGURATION ? deliver_configuration(out) : Hb_Success;
}

// Before what is behind it, which may speak of the new configuration.
void keep_for_later(Owned_Event event, const Vex_Outputs& out) {
  VEX_put_event_back_at_head(event.release());
  deliver_no_event(out, 0);
}

}  // namespace

EVMONEventPipeHandler::EVMONEventPipeHandler(int32_t* fds, char* path)
    : EVMONHandler(fds, path), evmon_pipe_write_fd(fds[1]) {
  evmon_fd = fds[0];
  trace_values(Trace_Info, trace_event_pipe, evmon_fd, evmon_pipe_write_fd);
  selfRegister();
}

EVMONEventPipeHandler::EVMONEventPipeHandler(char* path)
    : EVMONHandler(path, static_cast<const char*>(nullptr)), evmon_pipe_write_fd(-1) {}

int32_t EVMONEventPipeHandler::getWriteFd() { return evmon_pipe_write_fd; }

EVMONEventPipeHandler::~EVMONEventPipeHandler() {
  if (evmon_pipe_write_fd != -1) {
    close(evmon_pipe_write_fd);
    evmon_pipe_write_fd = -1;
  }
}

Hb_Rc EVMONEventPipeHandler::handler(Hb_Events* events, char* name, Hb_Group* group, Hb_Seq_Num* seqnum_p) {
  const Vex_Outputs out = {events, name, group, seqnum_p};
  trace_values(Trace_Info, trace_event_pipe_begins, evmon_fd);
  take_wake_up(evmon_fd);
  if (VEX_event_queue_is_empty() == Hb_True) {
    trace(Trace_Info, trace_event_pipe_queue_empty);
    return deliver_no_event(out, 0);
  }
  Hb_Rc rc = Hb_Success;
  Owned_Event event(VEX_get_event_from_head());
  if (event != nullptr) {
    if (event->type == VEX_Daemon_Up && !revive(event->node_num)) {
      return deliver_no_event(out, 0);
    }
    rc = deliver(*this, *event, out);
    if (rc != Hb_Success) {
      keep_for_later(std::move(event), out);
    }
    event = nullptr;
  }
  const Hb_Rc written = VEX_write_to_event_pipe();
  trace_values(Trace_Info, trace_event_pipe_ends, evmon_fd);
  return rc == Hb_Success ? written : rc;
}
