/* A simulated cluster and what happens to it. */
#ifndef HBD_SCENARIO_H
#define HBD_SCENARIO_H

#include <chrono>
#include <cstdint>
#include <optional>
#include <vector>

#include "change.h"
#include "configuration.h"
#include "control_settings.h"

namespace hbd {

/** A change and when it happens, from the start of the timeline. */
struct Step {
  std::chrono::microseconds at{};
  Change change;
};

/** What random churn can do. */
enum class ChurnKind {
  AdapterDeath,
  AdapterJoin,
  NodeDeath,
  NodeJoin,
  NetworkLoss,
  NetworkReturn,
  ConfigurationUpdate,
  FailureData,
  DifferentInstance,
  Heartbeat,
  AdapterSilence
};

/** Changes that a seed decides. */
struct ChurnSettings {
  std::uint64_t seed = 0;
  std::chrono::microseconds mean_interval{};
  std::uint64_t count = 0; /**< 0: without end */
  std::vector<ChurnKind> kinds;
};

/** A cluster at its start, its timeline in order of time, and random churn if there is any. */
struct Scenario {
  Configuration configuration;
  std::vector<Step> steps;
  std::optional<ChurnSettings> churn;
  ControlSettings control;
};

}  // namespace hbd

#endif
