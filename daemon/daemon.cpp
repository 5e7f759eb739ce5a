#include "daemon.h"

#include <fmt/ranges.h>
#include <spdlog/spdlog.h>

#include <algorithm>

#include "failure.h"

namespace hbd {
namespace {

const char* outcome_of(const SuspicionEnd& suspicion, bool has_events, const Cluster& cluster) {
  if (has_events) {
    return "confirmed by their silence";
  }
  const bool lives = std::any_of(suspicion.adapters.begin(), suspicion.adapters.end(),
                                 [&](auto number) { return cluster.up_adapters().contains(number); });
  return lives ? "cleared by their heartbeats" : "over: they were down before";
}

}  // namespace

Daemon::Daemon(Loop& loop, const std::string& path, MembershipSource& source, std::size_t queue_bytes,
               const ServiceSettings& settings)
    : queue_bytes_(queue_bytes),
      cluster_(source.configuration()),
      routes_(cluster_),
      handler_(loop, cluster_, *this, source.interfaces(), routes_, source.control_settings()),
      keys_(settings.key_file),
      claim_(loop, path, publication(), settings.reader_patience),
      server_(loop, claim_.listening(),
              [this](Client& client, const Request& request) { handler_.handle(client, request); }),
      key_rotation_(settings.key_rotation),
      rotation_(loop, [this] {
        rotate_keys();
        schedule_rotation();
      }) {
  handler_.on_delayed_shutdown([this, &loop] {
    server_.when_alone([&loop] {
      spdlog::info("the last client has left");
      loop.stop();
    });
  });
  claim_.publisher().publish(keys_.published());
  schedule_rotation();
  server_.set_stale_age(settings.stale_age);
  keep_room_for_configurations();
}

void Daemon::apply(const Change& change) {
  const auto before = cluster_.configuration_sequence();
  const auto events = cluster_.apply(change);
  if (cluster_.configuration_sequence() != before) {
    claim_.publisher().publish(publication());
    keep_room_for_configurations();
  }
  for (const Event& event : events) {
    spdlog::debug("event {} goes to {} clients", event.sequence, server_.clients());
    server_.deliver(event, cluster_);
  }
  if (const auto* suspicion = std::get_if<SuspicionEnd>(&change)) {
    spdlog::info("the suspicion of adapters {} is {}", fmt::join(suspicion->adapters, ", "),
                 outcome_of(*suspicion, !events.empty(), cluster_));
  }
}

void Daemon::rotate_keys() {
  try {
    if (keys_.rotate()) {
      claim_.publisher().publish(keys_.published());
      spdlog::info("the security key has changed; the keys have number {}", keys_.published().sequence_number);
    } else {
      spdlog::info("the key file holds the current security key; nothing has changed");
    }
  } catch (const Failure& failure) {
    spdlog::error("{}; the security key stays", failure.what());
  }
}

void Daemon::schedule_rotation() {
  if (key_rotation_.count() > 0) {
    rotation_.start(key_rotation_);
  }
}

Publication Daemon::publication() {
  const Configuration& configuration = cluster_.configuration();
  const Hb_Sequence_Number sequence = cluster_.configuration_sequence();
  Publication publication;
  publication.configuration = {sequence, static_cast<std::uint32_t>(configuration.max_nodes),
                               static_cast<std::uint32_t>(configuration.adapters.size())};
  for (const auto& route : routes_.all()) {
    publication.routes.push_back(route ? route_sequence{sequence, length_of(*route),
                                                        static_cast<std::uint16_t>(route->ip ? 0 : 1),
                                                        source_route(*route)}
                                       : route_sequence{});
  }
  return publication;
}

void Daemon::keep_room_for_configurations() {
  server_.set_queue_bound(std::max(queue_bytes_, 2 * handler_.configuration_size()));
}

}  // namespace hbd
