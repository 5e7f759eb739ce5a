/* The steps of a scenario, scripted and random, in order of time. */
#ifndef HBD_TIMELINE_H
#define HBD_TIMELINE_H

#include <optional>

#include "churn.h"
#include "cluster.h"
#include "scenario.h"

namespace hbd {

/** Walks a scenario. It looks at no clock: whoever calls keeps the pace. */
class Timeline {
 public:
  explicit Timeline(const Scenario& scenario);

  /** When the next step is due; nothing at the end. */
  [[nodiscard]] std::optional<std::chrono::microseconds> next_time() const;
  /** The step that is due, and on to the next; nothing when it has no subject at present. */
  std::optional<Change> take(const Cluster& cluster);

 private:
  [[nodiscard]] bool script_is_next() const;

  std::vector<Step> steps_;
  std::size_t taken_ = 0;
  std::optional<Churn> churn_;
};

}  // namespace hbd

#endif
