#include "cluster.h"

#include <algorithm>
#include <optional>
#include <utility>

#include "hb_client/group.h"

namespace hbd {

/* What one change has done so far. */
struct Cluster::Delta {
  std::vector<hb_adapter_event_entry> died;
  std::vector<hb_adapter_event_entry> joined;
  std::set<Hb_Node_Number> touched_nodes;
  std::vector<Hb_Node_Number> died_nodes;
  std::vector<Hb_Node_Number> joined_nodes;
  std::string ffdc_id;
  bool reconfigured = false;
  std::vector<Event> notices;
};

Cluster::Cluster(Configuration configuration)
    : configuration_(std::move(configuration)),
      up_adapters_(configuration_.adapter_limit()),
      up_nodes_(static_cast<std::size_t>(configuration_.max_nodes)),
      up_count_(static_cast<std::size_t>(configuration_.max_nodes)),
      incarnations_(configuration_.adapter_limit()),
      runs_(static_cast<std::size_t>(configuration_.max_nodes), true),
      available_(configuration_.networks.size(), true) {
  Delta start;
  for (const auto& [number, adapter] : configuration_.adapters) {
    settle(adapter, Cause::Monitor, start);
  }
  settle_nodes(start);
}

bool Cluster::network_is_available(Hb_Network_Number network) const {
  return available_[static_cast<std::size_t>(network)];
}

std::vector<Event> Cluster::apply(const Change& wanted) {
  Delta delta;
  std::visit([&](const auto& one) { change(one, delta); }, wanted);
  settle_nodes(delta);
  return events_of(delta);
}

void Cluster::change(const AdapterDeath& death, Delta& delta) {
  set_working(death.adapters, false, Cause::Monitor, delta);
}

void Cluster::change(const AdapterJoin& join, Delta& delta) { set_working(join.adapters, true, Cause::Monitor, delta); }

void Cluster::change(const NodeDeath& death, Delta& delta) {
  delta.ffdc_id = death.ffdc_id;
  set_running(death.node, false, delta);
}

void Cluster::change(const NodeJoin& join, Delta& delta) {
  delta.ffdc_id = join.ffdc_id;
  set_running(join.node, true, delta);
}

void Cluster::change(const NetworkLoss& loss, Delta& delta) { set_available(loss.network, false, delta); }

void Cluster::change(const NetworkReturn& back, Delta& delta) { set_available(back.network, true, delta); }

void Cluster::change(const ConfigurationChange& update, Delta& delta) {
  for (const auto number : update.remove) {
    remove_adapter(number, delta);
  }
  for (const auto& network : update.add_networks) {
    configuration_.networks.push_back(network);
    available_.push_back(true);
  }
  for (const auto& adapter : update.add) {
    add_adapter(adapter, delta);
  }
  ++configuration_sequence_;
  delta.reconfigured = true;
}

void Cluster::change(const FailureData& data, Delta& delta) { delta.notices.emplace_back().body = data; }

void Cluster::change(const DifferentInstance& sender, Delta& delta) { delta.notices.emplace_back().body = sender; }

void Cluster::change(const HeartbeatSettings& settings, Delta& delta) { delta.notices.emplace_back().body = settings; }

void Cluster::change(const AdapterSilence& silence, Delta& /*delta*/) {
  for_each_configured(silence.adapters, [](Adapter& adapter) { adapter.up = false; });
}

void Cluster::change(const ReportedDeath& report, Delta& delta) {
  for_each_configured(report.adapters, [&](const Adapter& adapter) {
    steering_[adapter.number].reported_down = true;
    settle(adapter, Cause::Request, delta);
  });
}

void Cluster::change(const SuspicionEnd& end, Delta& delta) {
  for_each_configured(end.adapters, [&](const Adapter& adapter) { settle(adapter, Cause::Request, delta); });
}

void Cluster::change(const MonitoringSwitch& wanted, Delta& delta) {
  for_each_configured({wanted.adapter}, [&](const Adapter& adapter) {
    Steering& steering = steering_[adapter.number];
    const bool before = std::exchange(steering.monitored, wanted.on);
    if (wanted.on && !before) {
      steering.reported_down = false;
      tell_again(adapter, delta);
    }
  });
}

void Cluster::change(const InterfaceSwitch& wanted, Delta& delta) {
  for_each_configured({wanted.adapter}, [&](const Adapter& adapter) {
    Steering& steering = steering_[adapter.number];
    steering.interface_on = wanted.on;
    steering.reported_down = steering.reported_down && !wanted.on;
    settle(adapter, Cause::Request, delta);
  });
}

void Cluster::change(const GraceSwitch& grace, Delta& delta) {
  for_each_configured({grace.adapter}, [&](const Adapter& adapter) {
    Steering& steering = steering_[adapter.number];
    steering.has_grace = grace.on;
    const bool is_owed = std::exchange(steering.request_is_held, false);
    settle(adapter, is_owed ? Cause::Request : Cause::Monitor, delta);
  });
}

void Cluster::change(const ManualControl& control, Delta& delta) {
  if (control.on) {
    manual_.insert(control.interface);
    return;
  }
  manual_.erase(control.interface);
  for (const auto& [number, adapter] : configuration_.adapters) {
    settle(adapter, Cause::Monitor, delta);
  }
}

void Cluster::change(const AddressChange& update, Delta& delta) {
  for (const NewAddress& each : update.addresses) {
    for_each_configured({each.adapter}, [&](Adapter& adapter) {
      adapter.address = each.address.value_or(Hb_IP_address6{});
      steering_[adapter.number].has_address = each.address.has_value();
      settle(adapter, Cause::Request, delta);
    });
  }
  ++configuration_sequence_;
  delta.reconfigured = true;
}

template <typename Visit>
void Cluster::for_each_configured(const std::vector<Hb_Adapter_Number>& adapters, Visit visit) {
  for (const auto number : adapters) {
    const auto found = configuration_.adapters.find(number);
    if (found != configuration_.adapters.end()) {
      visit(found->second);
    }
  }
}

void Cluster::set_working(const std::vector<Hb_Adapter_Number>& adapters, bool working, Cause cause, Delta& delta) {
  for_each_configured(adapters, [&](Adapter& adapter) {
    adapter.up = working;
    if (working) {
      forget_report(adapter.number);
    }
    settle(adapter, cause, delta);
  });
}

void Cluster::forget_report(Hb_Adapter_Number number) {
  const auto found = steering_.find(number);
  if (found != steering_.end()) {
    found->second.reported_down = false;
  }
}

void Cluster::set_running(Hb_Node_Number node, bool running, Delta& delta) {
  runs_[static_cast<std::size_t>(node)] = running;
  delta.touched_nodes.insert(node);
  const auto& adapters = configuration_.adapters;
  const auto end = adapters.lower_bound(configuration_.adapter_number(node + 1, 0));
  for (auto each = adapters.lower_bound(configuration_.adapter_number(node, 0)); each != end; ++each) {
    if (running) {
      forget_report(each->first);
    }
    settle(each->second, Cause::Request, delta);
  }
}

void Cluster::set_available(Hb_Network_Number network, bool available, Delta& delta) {
  available_[static_cast<std::size_t>(network)] = available;
  for (const auto& [number, adapter] : configuration_.adapters) {
    if (adapter.network == network) {
      settle(adapter, Cause::Monitor, delta);
    }
  }
}

void Cluster::remove_adapter(Hb_Adapter_Number number, Delta& delta) {
  steering_.erase(number);
  if (configuration_.adapters.erase(number) != 0 && up_adapters_.contains(number)) {
    lower(number, HB_DIED_BECAUSE_REMOVED_BIT, delta);
  }
}

void Cluster::add_adapter(const Adapter& adapter, Delta& delta) {
  const Hb_Node_Number node = configuration_.node_of(adapter.number);
  if (!has_adapters(node)) {
    runs_[static_cast<std::size_t>(node)] = true;
  }
  const auto [place, added] = configuration_.adapters.insert_or_assign(adapter.number, adapter);
  settle(place->second, Cause::Request, delta);
}

bool Cluster::has_adapters(Hb_Node_Number node) const {
  const auto first = configuration_.adapters.lower_bound(configuration_.adapter_number(node, 0));
  return first != configuration_.adapters.end() && configuration_.node_of(first->first) == node;
}

bool Cluster::should_be_up(const Adapter& adapter) const {
  const auto node = static_cast<std::size_t>(configuration_.node_of(adapter.number));
  const Steering steering = steering_of(adapter.number);
  return adapter.up && steering.has_address && steering.interface_on && !steering.reported_down && runs_[node] &&
         available_[static_cast<std::size_t>(adapter.network)];
}

Cluster::Steering Cluster::steering_of(Hb_Adapter_Number adapter) const {
  const auto found = steering_.find(adapter);
  return found == steering_.end() ? Steering{} : found->second;
}

bool Cluster::is_manual(const Adapter& adapter) const {
  return !manual_.empty() && configuration_.node_of(adapter.number) == configuration_.local_node &&
         manual_.contains(adapter.type);
}

bool Cluster::is_held(const Adapter& adapter, bool wanted, Cause cause) const {
  const Steering steering = steering_of(adapter.number);
  return !steering.monitored || (steering.has_grace && !wanted) || (cause == Cause::Monitor && is_manual(adapter));
}

Hb_Adapter_state_t Cluster::state(Hb_Adapter_Number adapter) const {
  const Steering steering = steering_of(adapter);
  if (!steering.monitored) {
    return Hb_Adapter_Not_Monitored;
  }
  if (!steering.interface_on) {
    return Hb_Adapter_ifconfig_Down;
  }
  return up_adapters_.contains(adapter) ? Hb_Adapter_Up : Hb_Adapter_Down;
}

void Cluster::settle(const Adapter& adapter, Cause cause, Delta& delta) {
  const bool wanted = should_be_up(adapter);
  if (wanted == up_adapters_.contains(adapter.number)) {
    return;
  }
  if (is_held(adapter, wanted, cause)) {
    steering_[adapter.number].request_is_held |= cause == Cause::Request && steering_of(adapter.number).has_grace;
    return;
  }
  if (wanted) {
    raise(adapter.number, delta);
  } else {
    lower(adapter.number, 0, delta);
  }
}

/* Whoever was not told of an adapter for a while learns how it is, changed or not. */
void Cluster::tell_again(const Adapter& adapter, Delta& delta) {
  const bool wanted = should_be_up(adapter);
  if (wanted != up_adapters_.contains(adapter.number)) {
    settle(adapter, Cause::Request, delta);
  } else if (wanted) {
    join(adapter.number, delta);
  } else {
    delta.died.push_back({adapter.number, incarnations_[adapter.number]});
  }
}

void Cluster::raise(Hb_Adapter_Number number, Delta& delta) {
  const Hb_Node_Number node = configuration_.node_of(number);
  up_adapters_.add(number);
  ++up_count_[static_cast<std::size_t>(node)];
  delta.touched_nodes.insert(node);
  join(number, delta);
}

void Cluster::join(Hb_Adapter_Number number, Delta& delta) {
  /* The flag's bit never becomes part of an incarnation. */
  incarnations_[number] = (incarnations_[number] + 1) & (HB_DIED_BECAUSE_REMOVED_BIT - 1);
  delta.joined.push_back({number, incarnations_[number]});
}

void Cluster::lower(Hb_Adapter_Number number, Hb_Incarnation flag, Delta& delta) {
  const Hb_Node_Number node = configuration_.node_of(number);
  up_adapters_.remove(number);
  --up_count_[static_cast<std::size_t>(node)];
  delta.died.push_back({number, incarnations_[number] | flag});
  delta.touched_nodes.insert(node);
}

void Cluster::settle_nodes(Delta& delta) {
  for (const auto node : delta.touched_nodes) {
    const auto index = static_cast<std::size_t>(node);
    const bool wanted = runs_[index] && up_count_[index] > 0;
    if (wanted == up_nodes_.contains(index)) {
      continue;
    }
    if (wanted) {
      up_nodes_.add(index);
      delta.joined_nodes.push_back(node);
    } else {
      up_nodes_.remove(index);
      delta.died_nodes.push_back(node);
    }
  }
}

namespace {

template <typename Numbers, typename NumberOf>
MemberSet set_of(const Numbers& numbers, std::size_t limit, NumberOf number_of) {
  if (numbers.empty()) {
    return {};
  }
  MemberSet set(limit);
  for (const auto& each : numbers) {
    set.add(static_cast<std::size_t>(number_of(each)));
  }
  return set;
}

}  // namespace

std::vector<Event> Cluster::events_of(Delta& delta) {
  std::vector<Event> events;
  events.reserve(4 + delta.notices.size());
  const auto tell = [&](auto body) {
    Event& event = events.emplace_back();
    event.sequence = ++sequence_;
    event.body = std::move(body);
  };
  const bool new_adapter_group = !delta.died.empty() || !delta.joined.empty();
  const bool new_node_group = !delta.died_nodes.empty() || !delta.joined_nodes.empty();
  adapter_group_ += new_adapter_group ? 1 : 0;
  node_group_ += new_node_group ? 1 : 0;

  auto left = set_of(delta.died, configuration_.adapter_limit(), [](const auto& entry) { return entry.adapter; });
  auto left_nodes =
      set_of(delta.died_nodes, static_cast<std::size_t>(configuration_.max_nodes), [](auto node) { return node; });
  if (!delta.died.empty()) {
    tell(AdapterEvent{Direction::Death, std::move(delta.died)});
  }
  if (!delta.died_nodes.empty()) {
    tell(NodeEvent{Direction::Death, std::move(delta.died_nodes), delta.ffdc_id});
  }
  if (delta.reconfigured) {
    tell(ConfigurationEvent{});
  }
  if (!delta.joined.empty()) {
    tell(AdapterEvent{Direction::Join, std::move(delta.joined)});
  }
  if (!delta.joined_nodes.empty()) {
    tell(NodeEvent{Direction::Join, std::move(delta.joined_nodes), delta.ffdc_id});
  }
  if (new_adapter_group) {
    tell(AdapterGroupEvent{std::move(left)});
  }
  if (new_node_group) {
    tell(NodeGroupEvent{std::move(left_nodes)});
  }
  for (auto& notice : delta.notices) {
    tell(std::move(notice.body));
  }
  return events;
}

}  // namespace hbd
