// Asking the daemon who is alive at this moment.
#pragma once

#include <chrono>

#include "liveness.h"

namespace hbctl {

// Follows every node and adapter until the daemon has sent both groups or the time is over; what is then not known is
// `State::Unknown`. No time at all asks nothing.
Liveness probe_liveness(const Cluster& cluster, std::chrono::milliseconds limit);

}  // namespace hbctl
