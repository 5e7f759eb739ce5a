/* How the daemon takes requests, as far as a scenario says so. */
#ifndef HBD_CONTROL_SETTINGS_H
#define HBD_CONTROL_SETTINGS_H

#include <chrono>
#include <cstdint>
#include <optional>
#include <vector>

#include "change.h"
#include "hb_client/control.h"
#include "hb_protocol/replies.h"
#include "hb_protocol/requests.h"

namespace hbd {

/** A status that is given in place of an effect. */
struct ScriptedAnswer {
  Hb_Client_Request request = HB_CONFIGURE_ADAPTER;
  Hb_Request_Status status = HB_TRY_AGAIN;
  std::uint64_t count = 1;                 /**< to so many requests; 0: to all from then on */
  std::optional<Hb_Adapter_state_t> state; /**< given with the status HB_REQUEST_SUCCESSFUL */
};

/** What a client's heartbeat brings it. */
struct HeartbeatAnswer {
  bool is_given = true;
  HeartbeatSettings settings{5, 0, true, 0}; /**< a process of 0 stands for the daemon's own */
};

/** Settings of the requests. */
struct ControlSettings {
  std::chrono::milliseconds suspicion{1000}; /**< time in which one that may be down can give a sign of life */
  HeartbeatAnswer heartbeat;
  std::vector<ScriptedAnswer> answers;
};

}  // namespace hbd

#endif
