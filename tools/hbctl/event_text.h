// Events as lines for people.
#pragma once

#include <string>

#include "style.h"
#include "watch_state.h"

namespace hbctl {

std::string describe(const HeartbeatSettings& settings);

// The heading over the lines.
std::string event_heading(const Style& style);

// One line, its line feed included.
std::string event_line(const Event& event, const WatchState& state, const Style& style);

}  // namespace hbctl
