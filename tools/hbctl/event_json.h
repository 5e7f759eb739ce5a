// Events as JSON.
#pragma once

#include "json.h"
#include "watch_state.h"

namespace hbctl {

Json heartbeat_json(const HeartbeatSettings& settings);

Json event_json(const Event& event, const WatchState& state);

}  // namespace hbctl
