// Waiting for whichever comes first.
#pragma once

#include <chrono>
#include <optional>
#include <vector>

namespace hbctl {

using Deadline = std::optional<std::chrono::steady_clock::time_point>;  // absent: no limit

enum class Wake { Stop, OutputClosed, TimeUp, Event };

struct WaitSet {
  const std::vector<int>& events;  // readable: an event, or the end of the stream
  int stop = -1;                   // readable: the command is to end; -1 for none
  int output = -1;                 // nobody reads it any more; -1 for none
};

Wake wait_for(const WaitSet& set, const Deadline& deadline);

}  // namespace hbctl
