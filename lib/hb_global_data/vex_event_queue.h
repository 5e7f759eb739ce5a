// The queue of synthesized events, their numbering, and the byte that wakes a caller.
#pragma once

#include "hb_client/events.h"
#include "hb_global_data/state.h"

// What is written into the event pipe.
inline constexpr char VEX_wake_up = 1;

// Large, and so never copied: the queue owns it from the moment that it is appended until it is taken.
struct VEX_Event {
  int32_t sequence_num;  // in the queue's numbering
  Hb_Group group;
  VEX_Event* next;
  uint32_t type;            // a VEX_Event_Type
  uint16_t node_num;        // the node that VEX_Daemon_Up is about
  Hb_Site_Number site_num;  // 0: events of sites say in their group which sites they are about
};

enum VEX_Event_Type : uint32_t {
  VEX_Deliver = 0,    // as it is
  VEX_Daemon_Up = 1,  // only when the node is down because its group-services daemon was
};

// A new event of that group type that names nobody yet, stable and to be delivered as it is; null without memory. What
// is in the group's union is the caller's to fill: 384 KiB are not written twice.
Hb_VEX_Event* VEX_new_event(Hb_Group_Type type);

// A new event that says that the configuration changed, or null. Its group is of no kind that would be copied.
Hb_VEX_Event* VEX_new_configuration_event();

Hb_Boolean VEX_event_queue_is_empty();

// Numbers the event and appends it. The pipe is written by whoever has appended all events of one notification.
void VEX_add_event_at_end(Hb_VEX_Event* _event);

// The first event, which is the caller's then; null when there is none. Its `next` is stale.
Hb_VEX_Event* VEX_get_event_from_head();

// Puts one that was taken from there back, with its number.
void VEX_put_event_back_at_head(Hb_VEX_Event* event);

// Traces what is in the queue.
void VEX_display_event_list();

// Writes one byte when an event waits, and otherwise starts the numbering anew.
Hb_Rc VEX_write_to_event_pipe();

// Takes one number out of the queue's numbering.
zu_int32_t hb_vex_next_event_sequence();
