#include "churn.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <utility>

namespace hbd {
namespace {

constexpr std::array<std::pair<ChurnKind, std::string_view>, 11> names = {{
    {ChurnKind::AdapterDeath, "adapter-death"},
    {ChurnKind::AdapterJoin, "adapter-join"},
    {ChurnKind::NodeDeath, "node-death"},
    {ChurnKind::NodeJoin, "node-join"},
    {ChurnKind::NetworkLoss, "network-loss"},
    {ChurnKind::NetworkReturn, "network-return"},
    {ChurnKind::ConfigurationUpdate, "configuration-update"},
    {ChurnKind::FailureData, "ffdc-id"},
    {ChurnKind::DifferentInstance, "different-instance"},
    {ChurnKind::Heartbeat, "heartbeat"},
    {ChurnKind::AdapterSilence, "adapter-silence"},
}};

template <typename Keep>
std::vector<Hb_Adapter_Number> up_adapters(const Cluster& cluster, Keep keep) {
  std::vector<Hb_Adapter_Number> numbers;
  cluster.up_adapters().for_each([&](std::size_t number) {
    if (keep(static_cast<Hb_Adapter_Number>(number))) {
      numbers.push_back(static_cast<Hb_Adapter_Number>(number));
    }
  });
  return numbers;
}

bool is_local(const Cluster& cluster, Hb_Adapter_Number number) {
  return cluster.configuration().node_of(number) == cluster.configuration().local_node;
}

/* Whether the local node stays up when it loses its adapters that `lost` names. */
template <typename Lost>
bool local_node_survives(const Cluster& cluster, Lost lost) {
  return !up_adapters(cluster, [&](Hb_Adapter_Number number) {
            return is_local(cluster, number) && !lost(number);
          }).empty();
}

template <typename Keep>
std::vector<const Adapter*> configured(const Cluster& cluster, Keep keep) {
  std::vector<const Adapter*> adapters;
  for (const auto& [number, adapter] : cluster.configuration().adapters) {
    if (keep(adapter)) {
      adapters.push_back(&adapter);
    }
  }
  return adapters;
}

std::vector<Hb_Network_Number> networks(const Cluster& cluster, bool available) {
  std::vector<Hb_Network_Number> numbers;
  for (std::size_t i = 0; i < cluster.configuration().networks.size(); ++i) {
    const auto number = static_cast<Hb_Network_Number>(i);
    if (cluster.network_is_available(number) == available) {
      numbers.push_back(number);
    }
  }
  return numbers;
}

}  // namespace

std::string_view name_of(ChurnKind kind) {
  return std::find_if(names.begin(), names.end(), [&](const auto& each) { return each.first == kind; })->second;
}

Churn::Churn(const ChurnSettings& settings) : settings_(settings), generator_(settings.seed) { draw_time(); }

std::optional<std::chrono::microseconds> Churn::next_time() const {
  if (settings_.count != 0 && made_ == settings_.count) {
    return std::nullopt;
  }
  return next_;
}

std::optional<Change> Churn::take(const Cluster& cluster) {
  ++made_;
  draw_time();
  const std::size_t first = below(settings_.kinds.size());
  for (std::size_t i = 0; i < settings_.kinds.size(); ++i) {
    if (auto change = make(settings_.kinds[(first + i) % settings_.kinds.size()], cluster)) {
      return change;
    }
  }
  return std::nullopt;
}

/* Between half and one and a half times the mean. */
void Churn::draw_time() {
  const auto mean = static_cast<std::uint64_t>(settings_.mean_interval.count());
  next_ += std::chrono::microseconds(mean / 2 + below(mean + 1));
}

std::optional<Change> Churn::make(ChurnKind kind, const Cluster& cluster) {
  switch (kind) {
    case ChurnKind::AdapterDeath:
      return adapter_death(cluster);
    case ChurnKind::AdapterJoin:
      return adapter_join(cluster);
    case ChurnKind::NodeDeath:
      return node_death(cluster);
    case ChurnKind::NodeJoin:
      return node_join(cluster);
    case ChurnKind::NetworkLoss:
      return network_loss(cluster);
    case ChurnKind::NetworkReturn:
      return network_return(cluster);
    case ChurnKind::ConfigurationUpdate:
      return configuration_update(cluster);
    case ChurnKind::FailureData:
      return failure_data();
    case ChurnKind::DifferentInstance:
      return different_instance(cluster);
    case ChurnKind::Heartbeat:
      return heartbeat();
    case ChurnKind::AdapterSilence:
      return adapter_silence(cluster);
  }
  return std::nullopt;
}

/* Adapters that the local node can do without. */
std::vector<Hb_Adapter_Number> Churn::victims(const Cluster& cluster) {
  return up_adapters(cluster, [&](Hb_Adapter_Number victim) {
    return !is_local(cluster, victim) || local_node_survives(cluster, [&](auto number) { return number == victim; });
  });
}

std::optional<Change> Churn::adapter_death(const Cluster& cluster) {
  const auto all = victims(cluster);
  const auto* victim = pick(all);
  return victim == nullptr ? std::nullopt : std::optional<Change>(AdapterDeath{{*victim}});
}

std::optional<Change> Churn::adapter_silence(const Cluster& cluster) {
  const auto all = victims(cluster);
  const auto* victim = pick(all);
  return victim == nullptr ? std::nullopt : std::optional<Change>(AdapterSilence{{*victim}});
}

std::optional<Change> Churn::adapter_join(const Cluster& cluster) {
  const auto broken = configured(cluster, [&](const Adapter& adapter) {
    return !adapter.up && cluster.node_is_running(cluster.configuration().node_of(adapter.number)) &&
           cluster.network_is_available(adapter.network);
  });
  const auto* adapter = pick(broken);
  return adapter == nullptr ? std::nullopt : std::optional<Change>(AdapterJoin{{(*adapter)->number}});
}

std::optional<Change> Churn::node_death(const Cluster& cluster) {
  std::vector<Hb_Node_Number> victims;
  cluster.up_nodes().for_each([&](std::size_t node) {
    if (static_cast<Hb_Node_Number>(node) != cluster.configuration().local_node) {
      victims.push_back(static_cast<Hb_Node_Number>(node));
    }
  });
  const auto* victim = pick(victims);
  return victim == nullptr ? std::nullopt : std::optional<Change>(NodeDeath{*victim, {}});
}

std::optional<Change> Churn::node_join(const Cluster& cluster) {
  std::vector<Hb_Node_Number> stopped;
  for (const Adapter* adapter : configured(cluster, [](const Adapter&) { return true; })) {
    const Hb_Node_Number node = cluster.configuration().node_of(adapter->number);
    if (!cluster.node_is_running(node) && (stopped.empty() || stopped.back() != node)) {
      stopped.push_back(node);
    }
  }
  const auto* node = pick(stopped);
  return node == nullptr ? std::nullopt : std::optional<Change>(NodeJoin{*node, {}});
}

std::optional<Change> Churn::network_loss(const Cluster& cluster) {
  auto victims = networks(cluster, true);
  std::erase_if(victims, [&](Hb_Network_Number victim) {
    return !local_node_survives(
        cluster, [&](auto number) { return cluster.configuration().adapters.at(number).network == victim; });
  });
  const auto* victim = pick(victims);
  return victim == nullptr ? std::nullopt : std::optional<Change>(NetworkLoss{*victim});
}

std::optional<Change> Churn::network_return(const Cluster& cluster) {
  const auto lost = networks(cluster, false);
  const auto* network = pick(lost);
  return network == nullptr ? std::nullopt : std::optional<Change>(NetworkReturn{*network});
}

/* Adapters of other nodes go and come back; at most a quarter of them is away. */
std::optional<Change> Churn::configuration_update(const Cluster& cluster) {
  const auto others = configured(cluster, [&](const Adapter& adapter) { return !is_local(cluster, adapter.number); });
  const bool may_remove = !others.empty() && (removed_.size() + 1) * 4 <= others.size() + removed_.size();
  if (!removed_.empty() && (!may_remove || below(2) == 0)) {
    const std::size_t place = below(removed_.size());
    ConfigurationChange change{{}, {}, {removed_[place]}};
    removed_.erase(removed_.begin() + static_cast<std::ptrdiff_t>(place));
    return change;
  }
  if (!may_remove) {
    return std::nullopt;
  }
  removed_.push_back(**pick(others));
  return ConfigurationChange{{removed_.back().number}, {}, {}};
}

Change Churn::failure_data() { return FailureData{fmt::format("{:x}.{}", settings_.seed, made_)}; }

std::optional<Change> Churn::different_instance(const Cluster& cluster) {
  const auto senders = configured(cluster, [](const Adapter&) { return true; });
  const auto* sender = pick(senders);
  if (sender == nullptr) {
    return std::nullopt;
  }
  return DifferentInstance{(*sender)->address, static_cast<Hb_Config_Instance>(1 + below(1000))};
}

Change Churn::heartbeat() { return HeartbeatSettings{static_cast<std::int32_t>(1 + below(10)), 0, below(2) == 0, 1}; }

}  // namespace hbd
