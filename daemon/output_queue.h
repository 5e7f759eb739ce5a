/* Bytes on their way to one client. */
#ifndef HBD_OUTPUT_QUEUE_H
#define HBD_OUTPUT_QUEUE_H

#include <chrono>
#include <cstddef>
#include <deque>
#include <optional>

#include "frame.h"

namespace hbd {

/** Sends at once what the socket takes and keeps the rest, up to a bound. It never waits. */
class OutputQueue {
 public:
  enum class Result {
    Sent,  /**< nothing is left to send */
    Kept,  /**< something is left; call flush() when the socket takes more */
    Full,  /**< the frame would go beyond the bound; it is not kept */
    Broken /**< the socket takes nothing any more; errno says why */
  };

  /** When an event was told; answers have no such time. */
  using Time = std::optional<std::chrono::milliseconds>;

  /** Sends or keeps one frame, under a subscription's name. */
  Result push(int socket, SharedFrame frame, const SubscriptionName& name, std::size_t bound, Time told_at = {});

  /** Drops the events that were told before that time, unless a part of one is sent; yields how many. */
  std::size_t drop_told_before(std::chrono::milliseconds time);

  /** Sends what is kept, as far as the socket takes it. */
  Result flush(int socket);

  [[nodiscard]] bool empty() const { return entries_.empty(); }
  /** Bytes that are kept. */
  [[nodiscard]] std::size_t size() const { return size_; }

 private:
  struct Entry {
    SharedFrame frame;
    SubscriptionName name;
    std::size_t sent;
    Time told_at;
  };

  std::deque<Entry> entries_;
  std::size_t size_ = 0;
};

}  // namespace hbd

#endif
