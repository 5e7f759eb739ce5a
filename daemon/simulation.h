/* A membership source that plays a scenario. */
#ifndef HBD_SIMULATION_H
#define HBD_SIMULATION_H

#include "audience.h"
#include "loop.h"
#include "membership_source.h"
#include "scenario.h"
#include "timeline.h"

namespace hbd {

/** How fast a scenario is played. */
struct Pace {
  double speed = 1;                          /**< times real time */
  bool as_fast_as_read = false;              /**< a step whenever all clients have read, whatever its time */
  std::size_t start_after_subscriptions = 0; /**< the timeline starts when there are so many */
};

/** Plays a scenario to an audience. */
class Simulation : public MembershipSource {
 public:
  Simulation(Loop& loop, Scenario scenario, Pace pace);

  /** Says who listens; to be called before start(). */
  void set_audience(Audience& audience);

  [[nodiscard]] Configuration configuration() const override { return scenario_.configuration; }
  [[nodiscard]] ControlSettings control_settings() const override { return scenario_.control; }
  void start(ChangeSink& sink, const Cluster& cluster) override;

 private:
  void on_audience();
  void begin();
  void schedule();
  void play_what_is_due();
  void play_what_can_be_read();
  void take_step();
  [[nodiscard]] bool may_play() const;
  [[nodiscard]] std::chrono::milliseconds time_of_next() const;

  Loop& loop_;
  Scenario scenario_;
  Pace pace_;
  Timeline timeline_;
  Audience* audience_ = nullptr;
  ChangeSink* sink_ = nullptr;
  const Cluster* cluster_ = nullptr;
  bool running_ = false;
  std::chrono::milliseconds begun_{};
  Timer timer_;
  Idle idle_;
};

}  // namespace hbd

#endif
