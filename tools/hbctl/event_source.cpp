#include "event_source.h"

#include "errors.h"
#include "hb_client.h"

namespace hbctl {

EventSource::EventSource() : group_(std::make_unique<Hb_Group>()) {
  int count = 0;
  if (hb_get_file_descriptor_array(&descriptors_, &count) != Hb_Success)
    throw library_error("cannot get the descriptors to wait on");
  to_poll_.assign(descriptors_, descriptors_ + count);
}

EventSource::~EventSource() { hb_free_file_descriptor_array(descriptors_); }

std::optional<Event> EventSource::take() {
  Event event;
  Hb_Name name{};
  timeval no_wait{0, 0};
  if (hb_get_event_message(descriptors_, &no_wait, &event.bits, name, group_.get(), &event.sequence) != Hb_Success) {
    if (hb_get_errno() == HB_ENOTREADY) return std::nullopt;
    throw library_error("cannot take an event");
  }
  event.time = WallClock::now();
  event.subscription = printable(name);
  read_group(*group_, event);
  return event;
}

}  // namespace hbctl
