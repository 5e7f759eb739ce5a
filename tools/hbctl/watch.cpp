#include <fmt/format.h>

#include <algorithm>
#include <iostream>

#include "command.h"
#include "daemon_link.h"
#include "event_json.h"
#include "event_source.h"
#include "event_text.h"
#include "hb_client.h"
#include "stop_signals.h"
#include "subscriber.h"
#include "wait.h"

namespace hbctl {
namespace {

void warn(const std::string& text) { std::cerr << "hbctl: " << text << std::endl; }

class Watch {
 public:
  explicit Watch(const Context& context) : context_(context), state_(read_cluster()) {}

  void run() {
    const StopSignals stop;
    SubscriptionPlan first = plan();
    if (!first.unknown.empty()) throw not_configured(first.unknown);
    if (context_.options.discard_stale) discard_stale();
    follow(first.subscriptions);
    if (!context_.options.json) context_.output.write(event_heading(context_.style));
    take_events({source_.descriptors(), stop.descriptor(), context_.output.descriptor()}, end_of_duration());
  }

 private:
  static void discard_stale() {
    if (hb_discard_stale_messages(Hb_True) != Hb_Success) throw library_error("cannot have stale events dropped");
  }

  SubscriptionPlan plan() const {
    const Options& options = context_.options;
    return plan_subscriptions(options.selection, options.events, options.name_prefix, state_.cluster());
  }

  void follow(const std::vector<Subscription>& subscriptions) {
    state_.liveness().follow(subscriptions);
    subscriber_.apply(subscriptions);
  }

  Deadline end_of_duration() const {
    if (!context_.options.duration) return std::nullopt;
    return std::chrono::steady_clock::now() + as_milliseconds(*context_.options.duration);
  }

  void take_events(const WaitSet& waits, const Deadline& deadline) {
    uint32_t shown = 0;
    while (!context_.options.count || shown < *context_.options.count) {
      if (wait_for(waits, deadline) != Wake::Event) return;
      const std::optional<Event> event = take_event();
      if (!event) continue;
      show(*event);
      ++shown;
    }
  }

  // A packet that was no event is lost alone.
  std::optional<Event> take_event() {
    try {
      return source_.take();
    } catch (const CommandError& error) {
      if (error.number() != HB_EBADREPLY) throw describe_end(error);
      warn(fmt::format("{}; watching goes on", error.what()));
      return std::nullopt;
    }
  }

  CommandError describe_end(const CommandError& error) const {
    if (error.number() != HB_EDAEMONGONE) return error;
    return {ExitStatus::DaemonGone,
            fmt::format("the daemon on {} is gone: {}\nstart it again with: hbd --socket {}\nthen watch again",
                        context_.socket_path, error.what(), context_.socket_path),
            error.number()};
  }

  void show(const Event& event) {
    if (event.bits == HB_EVENT_CONFIGURATION) state_.replace_cluster(read_cluster());
    state_.liveness().apply(event);
    context_.output.write(context_.options.json ? json_line(event_json(event, state_))
                                                : event_line(event, state_, context_.style));
    if (event.bits == HB_EVENT_CONFIGURATION) follow_configuration();
  }

  void follow_configuration() {
    const SubscriptionPlan next = plan();
    for (const std::string& item : next.unknown) {
      if (std::find(missing_.begin(), missing_.end(), item) == missing_.end())
        warn(item + " is not configured any more; it is followed again when it comes back");
    }
    missing_ = next.unknown;
    follow(next.subscriptions);
  }

  const Context& context_;
  WatchState state_;
  EventSource source_;
  Subscriber subscriber_;
  std::vector<std::string> missing_;
};

}  // namespace

void watch_command(const Context& context) {
  const DaemonLink link(context.socket_path);
  Watch(context).run();
}

}  // namespace hbctl
