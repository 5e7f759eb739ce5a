#include <fmt/format.h>

#include "daemon_link.h"
#include "event_json.h"
#include "event_source.h"
#include "event_text.h"
#include "hb_client/control.h"
#include "hb_client/error.h"
#include "hb_client/events.h"
#include "request.h"
#include "stop_signals.h"
#include "subscriber.h"
#include "wait.h"

namespace hbctl {
namespace {

constexpr const char* kName = "hbctl.heartbeat";

class Heart {
 public:
  explicit Heart(const Context& context) : context_(context) {}

  void run() {
    const Options& options = context_.options;
    if (options.settings) ask_for_settings();
    auto next = std::chrono::steady_clock::now();
    for (uint32_t sent = 0; sent < options.count.value_or(UINT32_MAX); ++sent) {
      if (sent != 0 && !pause_until(next += as_milliseconds(*options.every))) return;
      beat(options.sequence + sent);
      if (sent == 0 && options.settings) await_settings();
      if (!options.every) return;
    }
  }

 private:
  void ask_for_settings() {
    const Cluster cluster = read_cluster();
    subscriber_.apply(plan_subscriptions({}, HB_EVENT_NODE_HEARTBEAT, kName, cluster).subscriptions);
  }

  void beat(Hb_Seq_Num sequence) {
    const Request request = {
        "heartbeat", fmt::format("send heartbeat {}", sequence), Outcome::Sent, "", "", {{"sequence", sequence}}};
    if (hb_client_heartbeat(sequence) != Hb_Success) throw request_error(request.what, request.if_invalid);
    write_outcome(context_, request);
  }

  // Takes what comes meanwhile, so that the daemon never finds this connection full. False when it is to end.
  bool pause_until(std::chrono::steady_clock::time_point end) {
    for (;;) {
      switch (wait_for(waits_, end)) {
        case Wake::Event:
          take_event();
          break;
        case Wake::TimeUp:
          return true;
        case Wake::Stop:
        case Wake::OutputClosed:
          return false;
      }
    }
  }

  // A packet that was no event is lost alone.
  std::optional<Event> take_event() {
    try {
      return source_.take();
    } catch (const CommandError& error) {
      if (error.number() != HB_EBADREPLY) throw;
      return std::nullopt;
    }
  }

  void await_settings() {
    const Deadline end = std::chrono::steady_clock::now() + as_milliseconds(context_.options.wait);
    while (wait_for(waits_, end) == Wake::Event) {
      const std::optional<Event> event = take_event();
      if (event && event->heartbeat) return show(*event->heartbeat);
    }
    throw CommandError(ExitStatus::Unclear,
                       fmt::format("the daemon did not tell its settings for heartbeats within {} s\n"
                                   "wait longer with --wait, or see whether it tells them at all",
                                   context_.options.wait));
  }

  void show(const HeartbeatSettings& settings) {
    if (!context_.options.json) return context_.output.write(describe(settings) + '\n');
    Json json = json_object("heartbeat-settings");
    json.update(heartbeat_json(settings));
    context_.output.write(json_text(context_, json));
  }

  const Context& context_;
  const StopSignals stop_;
  EventSource source_;
  Subscriber subscriber_;
  const WaitSet waits_{source_.descriptors(), stop_.descriptor(), context_.output.descriptor()};
};

}  // namespace

void heartbeat_command(const Context& context) {
  const DaemonLink link(context.socket_path);
  Heart(context).run();
}

}  // namespace hbctl
