#include "daemon.h"

#include <fmt/ranges.h>
#include <spdlog/spdlog.h>

#include <algorithm>

namespace hbd {

Daemon::Daemon(Loop& loop, const std::string& path, MembershipSource& source, std::size_t queue_bytes,
               const ServiceSettings& settings)
    : queue_bytes_(queue_bytes),
      cluster_(source.configuration()),
      routes_(cluster_),
      handler_(loop, cluster_, *this, source.interfaces(), routes_, source.control_settings()),
      claim_(loop, path, published()),
      server_(loop, claim_.listening(),
              [this](Client& client, const Request& request) { handler_.handle(client, request); }) {
  server_.set_stale_age(settings.stale_age);
  keep_room_for_configurations();
}

void Daemon::apply(const Change& change) {
  const auto before = cluster_.configuration_sequence();
  const auto events = cluster_.apply(change);
  if (cluster_.configuration_sequence() != before) {
    claim_.publisher().publish(published());
    keep_room_for_configurations();
  }
  for (const Event& event : events) {
    spdlog::debug("event {} goes to {} clients", event.sequence, server_.clients());
    server_.deliver(event, cluster_);
  }
  if (const auto* suspicion = std::get_if<SuspicionEnd>(&change)) {
    spdlog::info("the suspicion of adapters {} is {}", fmt::join(suspicion->adapters, ", "),
                 events.empty() ? "cleared by their heartbeats" : "confirmed by their silence");
  }
}

memory_configuration_data Daemon::published() const {
  const Configuration& configuration = cluster_.configuration();
  return {cluster_.configuration_sequence(), static_cast<std::uint32_t>(configuration.max_nodes),
          static_cast<std::uint32_t>(configuration.adapters.size())};
}

void Daemon::keep_room_for_configurations() {
  server_.set_queue_bound(std::max(queue_bytes_, 2 * handler_.configuration_size()));
}

}  // namespace hbd
