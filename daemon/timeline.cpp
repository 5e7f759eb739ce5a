#include "timeline.h"

namespace hbd {

Timeline::Timeline(const Scenario& scenario) : steps_(scenario.steps) {
  if (scenario.churn) {
    churn_.emplace(*scenario.churn);
  }
}

std::optional<std::chrono::microseconds> Timeline::next_time() const {
  if (script_is_next()) {
    return steps_[taken_].at;
  }
  return churn_ ? churn_->next_time() : std::nullopt;
}

std::optional<Change> Timeline::take(const Cluster& cluster) {
  if (script_is_next()) {
    return steps_[taken_++].change;
  }
  return churn_->take(cluster);
}

/* At the same time the script goes first. */
bool Timeline::script_is_next() const {
  if (taken_ == steps_.size()) {
    return false;
  }
  const auto random = churn_ ? churn_->next_time() : std::nullopt;
  return !random || steps_[taken_].at <= *random;
}

}  // namespace hbd
