// An event that is no queue's yet.
#pragma once

#include <memory>

#include "hb_global_data/vex_event_queue.h"

using Owned_Event = std::unique_ptr<Hb_VEX_Event>;

// Hands it to the queue; there may be none.
inline void append_event(Owned_Event event) {
  if (event != nullptr) {
    VEX_add_event_at_end(event.release());
  }
}
