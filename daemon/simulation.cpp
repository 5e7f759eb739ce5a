#include "simulation.h"

#include <spdlog/spdlog.h>

#include <algorithm>
#include <cmath>
#include <utility>

namespace hbd {
namespace {

/* Steps that are played before other input gets its turn. */
constexpr int steps_in_a_row = 64;
constexpr std::chrono::milliseconds look_again{1000};

}  // namespace

Simulation::Simulation(Loop& loop, Scenario scenario, Pace pace)
    : loop_(loop),
      scenario_(std::move(scenario)),
      pace_(pace),
      timeline_(scenario_),
      timer_(loop, [this] { pace_.as_fast_as_read ? play_what_can_be_read() : play_what_is_due(); }),
      idle_(loop, [this] { play_what_can_be_read(); }) {}

void Simulation::set_audience(Audience& audience) {
  audience_ = &audience;
  audience_->on_change([this] { on_audience(); });
}

void Simulation::start(ChangeSink& sink, const Cluster& cluster) {
  sink_ = &sink;
  cluster_ = &cluster;
  on_audience();
}

void Simulation::on_audience() {
  if (sink_ == nullptr) {
    return;
  }
  if (!running_ && audience_->subscriptions() >= pace_.start_after_subscriptions) {
    begin();
  } else if (running_ && pace_.as_fast_as_read && timeline_.next_time() && may_play()) {
    idle_.start();
  }
}

void Simulation::begin() {
  running_ = true;
  begun_ = loop_.now();
  spdlog::info("the timeline of \"{}\" starts", scenario_.configuration.name);
  schedule();
}

void Simulation::schedule() {
  if (!timeline_.next_time()) {
    idle_.stop();
    spdlog::info("the timeline is at its end; the cluster stays as it is");
    return;
  }
  if (pace_.as_fast_as_read) {
    idle_.start();
  } else {
    timer_.start(std::max(std::chrono::milliseconds(0), time_of_next() - (loop_.now() - begun_)));
  }
}

void Simulation::play_what_is_due() {
  for (int i = 0; i < steps_in_a_row; ++i) {
    if (!timeline_.next_time() || time_of_next() > loop_.now() - begun_) {
      break;
    }
    take_step();
  }
  schedule();
}

void Simulation::play_what_can_be_read() {
  for (int i = 0; i < steps_in_a_row && timeline_.next_time(); ++i) {
    if (!may_play()) {
      /* A client that never reads tells nothing, so its patience is looked at by time. */
      idle_.stop();
      timer_.start(look_again);
      return;
    }
    take_step();
  }
  schedule();
}

void Simulation::take_step() {
  if (const auto change = timeline_.take(*cluster_)) {
    sink_->apply(*change);
  }
}

bool Simulation::may_play() const { return audience_->subscriptions() > 0 && audience_->has_read(); }

std::chrono::milliseconds Simulation::time_of_next() const {
  const auto at = static_cast<double>(timeline_.next_time()->count()) / 1000.0 / pace_.speed;
  /* A very slow pace ends in a century rather than beyond what a timer takes. */
  return std::chrono::milliseconds(static_cast<long long>(std::min(std::ceil(at), 3.2e12)));
}

}  // namespace hbd
