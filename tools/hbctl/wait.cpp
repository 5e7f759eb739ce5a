#include "wait.h"

#include <poll.h>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstring>

#include "errors.h"

namespace hbctl {
namespace {

using std::chrono::milliseconds;
using std::chrono::steady_clock;

std::vector<pollfd> poll_entries(const WaitSet& set) {
  std::vector<pollfd> entries{{set.stop, POLLIN, 0}, {set.output, 0, 0}};
  for (int descriptor : set.events) entries.push_back({descriptor, POLLIN, 0});
  return entries;
}

int timeout_until(const Deadline& deadline) {
  if (!deadline) return -1;
  const auto left = std::chrono::ceil<milliseconds>(*deadline - steady_clock::now()).count();
  return static_cast<int>(std::clamp<decltype(left)>(left, 0, INT_MAX));
}

}  // namespace

Wake wait_for(const WaitSet& set, const Deadline& deadline) {
  std::vector<pollfd> entries = poll_entries(set);
  for (;;) {
    const int ready = poll(entries.data(), entries.size(), timeout_until(deadline));
    if (ready < 0 && errno != EINTR)
      throw CommandError(ExitStatus::Failed, std::string("cannot wait for events: ") + std::strerror(errno));
    if (ready > 0 && entries[0].revents != 0) return Wake::Stop;
    if (ready > 0 && entries[1].revents != 0) return Wake::OutputClosed;
    // The time counts also while events keep coming.
    if (deadline && steady_clock::now() >= *deadline) return Wake::TimeUp;
    if (ready > 0) return Wake::Event;
  }
}

}  // namespace hbctl
