/* Changes that are made after a time. */
#ifndef HBD_DEADLINES_H
#define HBD_DEADLINES_H

#include <cstdint>
#include <map>
#include <set>
#include <tuple>
#include <utility>

#include "change.h"
#include "loop.h"

namespace hbd {

/** What a change waits for. There is one for each purpose and number; a later one takes its place. */
struct DeadlineKey {
  enum class Purpose { Grace, AdapterSuspicion, NodeSuspicion, NodeReturn };

  Purpose purpose = Purpose::Grace;
  std::uint32_t number = 0; /**< of the adapter or node */

  bool operator<(const DeadlineKey& other) const {
    return std::tie(purpose, number) < std::tie(other.purpose, other.number);
  }
};

/** Makes changes when their time has come. */
class Deadlines {
 public:
  Deadlines(Loop& loop, ChangeSink& sink);

  void set(DeadlineKey key, std::chrono::milliseconds delay, Change change);
  void cancel(DeadlineKey key);

 private:
  struct Entry {
    std::chrono::milliseconds due;
    Change change;
  };

  void make_what_is_due();
  void schedule();

  Loop& loop_;
  ChangeSink& sink_;
  std::map<DeadlineKey, Entry> entries_;
  std::set<std::pair<std::chrono::milliseconds, DeadlineKey>> order_;
  Timer timer_;
};

}  // namespace hbd

#endif
