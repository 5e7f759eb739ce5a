// The stream of events.
#pragma once

#include <memory>
#include <optional>
#include <vector>

#include "event.h"

namespace hbctl {

class EventSource {
 public:
  EventSource();
  ~EventSource();
  EventSource(const EventSource&) = delete;
  EventSource& operator=(const EventSource&) = delete;

  // What to poll before take().
  const std::vector<int>& descriptors() const { return to_poll_; }

  // One event if one is there, without waiting. Throws CommandError: with HB_EBADREPLY as its number a single packet
  // was lost and the stream goes on; any other number ends it.
  std::optional<Event> take();

 private:
  int* descriptors_ = nullptr;
  std::vector<int> to_poll_;
  std::unique_ptr<Hb_Group> group_;
};

}  // namespace hbctl
