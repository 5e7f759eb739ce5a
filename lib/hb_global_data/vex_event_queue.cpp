#include "hb_global_data/vex_event_queue.h"

#include <cerrno>
#include <new>

#include "VEX_EVMONEventPipeHandler.h"
#include "VEX_HBC_trace.h"
#include "hb_global_data/mutex_section.h"
#include "hb_global_data/start_up.h"
#include "platform/Pipe.h"

Hb_VEX_Event* event_queue_list = nullptr;
zu_int32_t event_sequence = 0;

namespace {

constexpr auto no_group = static_cast<Hb_Group_Type>(-1);

// The counter has no end of its own; behind the last number it goes on with the lowest.
zu_int32_t take_number() {
  const zu_int32_t number = event_sequence;
  event_sequence = static_cast<zu_int32_t>(static_cast<uint32_t>(number) + 1U);
  return number;
}

void append(Hb_VEX_Event* event) {
  event->sequence_num = take_number();
  Hb_VEX_Event** end = &event_queue_list;
  while (*end != nullptr) {
    end = &(*end)->next;
  }
  *end = event;
  event->next = nullptr;
}

Hb_VEX_Event* unlink_head() {
  Hb_VEX_Event* head = event_queue_list;
  if (head != nullptr) {
    event_queue_list = head->next;
  }
  return head;
}

void trace_list() {
  for (const Hb_VEX_Event* event = event_queue_list; event != nullptr; event = event->next) {
    trace_values(Trace_Info, trace_event_in_list, event->sequence_num, event->group.Hb_group_type,
                 event->group.Hb_events);
  }
}

// `errno` is that of the write when it fails.
Hb_Rc wake_caller() {
  if (event_pipe_handler_p == nullptr) {
    trace(Trace_Info, trace_no_event_pipe);
    return fail(HB_ENOPIPEHANDLER);
  }
  const ssize_t written = write_to_pipe(event_pipe_handler_p->getWriteFd(), VEX_wake_up);
  if (written != 1) {
    trace_values(Trace_Info, trace_event_pipe_write_failed, written, errno);
    return fail(HB_EEVENTPIPE);
  }
  trace(Trace_Info, trace_event_pipe_written);
  return Hb_Success;
}

}  // namespace

Hb_VEX_Event* VEX_new_event(Hb_Group_Type type) {
  auto* event = new (std::nothrow) Hb_VEX_Event;
  if (event == nullptr) {
    return nullptr;
  }
  event->sequence_num = 0;
  event->next = nullptr;
  event->type = VEX_Deliver;
  event->node_num = 0;
  event->site_num = 0;
  event->group.Hb_group_type = type;
  event->group.Hb_cursor = 0;
  event->group.Hb_events = HB_EVENT_NONE;
  event->group.Hb_group_status = Hb_Group_Stable;
  event->group.Hb_ffdc_id[0] = '\0';
  return event;
}

Hb_VEX_Event* VEX_new_configuration_event() {
  Hb_VEX_Event* event = VEX_new_event(no_group);
  if (event != nullptr) {
    event->group.Hb_events = HB_EVENT_CONFIGURATION;
  }
  return event;
}

Hb_Boolean VEX_event_queue_is_empty() {
  make_mutex_once();
  Hb_Boolean empty = Hb_True;
  HB_MUTEX_SECTION_BEGIN(event_queue_list_and_sequence_mutex)
  empty = event_queue_list == nullptr ? Hb_True : Hb_False;
  HB_MUTEX_SECTION_END(event_queue_list_and_sequence_mutex)
  return empty;
}

void VEX_add_event_at_end(Hb_VEX_Event* _event) {
  make_mutex_once();
  if (_event == nullptr) {
    return;
  }
  HB_MUTEX_SECTION_BEGIN(event_queue_list_and_sequence_mutex)
  append(_event);
  HB_MUTEX_SECTION_END(event_queue_list_and_sequence_mutex)
}

Hb_VEX_Event* VEX_get_event_from_head() {
  make_mutex_once();
  Hb_VEX_Event* head = nullptr;
  HB_MUTEX_SECTION_BEGIN(event_queue_list_and_sequence_mutex)
  head = unlink_head();
  HB_MUTEX_SECTION_END(event_queue_list_and_sequence_mutex)
  return head;
}

void VEX_put_event_back_at_head(Hb_VEX_Event* event) {
  make_mutex_once();
  HB_MUTEX_SECTION_BEGIN(event_queue_list_and_sequence_mutex)
  event->next = event_queue_list;
  event_queue_list = event;
  HB_MUTEX_SECTION_END(event_queue_list_and_sequence_mutex)
}

void VEX_display_event_list() {
  make_mutex_once();
  HB_MUTEX_SECTION_BEGIN(event_queue_list_and_sequence_mutex)
  trace_list();
  HB_MUTEX_SECTION_END(event_queue_list_and_sequence_mutex)
  trace_text(Trace_Info, trace_event_list_ends, "End of event list");
}

// The byte is written under the mutex: nobody takes the event between the look at the queue and the byte.
Hb_Rc VEX_write_to_event_pipe() {
  make_mutex_once();
  Hb_Rc rc = Hb_Success;
  int error = 0;
  HB_MUTEX_SECTION_BEGIN(event_queue_list_and_sequence_mutex)
  if (event_queue_list != nullptr) {
    rc = wake_caller();
    error = errno;
  } else {
    event_sequence = 0;
  }
  HB_MUTEX_SECTION_END(event_queue_list_and_sequence_mutex)
  if (rc == Hb_Failure) {
    errno = error;
  }
  return rc;
}

zu_int32_t hb_vex_next_event_sequence() {
  make_mutex_once();
  zu_int32_t number = 0;
  HB_MUTEX_SECTION_BEGIN(event_queue_list_and_sequence_mutex)
  number = take_number();
  HB_MUTEX_SECTION_END(event_queue_list_and_sequence_mutex)
  return number;
}
