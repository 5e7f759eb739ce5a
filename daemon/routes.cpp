#include "routes.h"

#include <algorithm>
#include <cstring>
#include <deque>
#include <utility>

namespace hbd {
namespace {

bool is_unspecified(const Hb_IP_address6& address) {
  static const Hb_IP_address6 none{};
  return std::memcmp(&address, &none, sizeof(none)) == 0;
}

/* Spreads from the local node over networks, one network after the other, the nearest first. */
class Search {
 public:
  Search(const Configuration& configuration, bool ip_only)
      : configuration_(configuration),
        on_network_(configuration.networks.size()),
        routes_(static_cast<std::size_t>(configuration.max_nodes)),
        ip_only_(ip_only) {
    for (const auto& [number, adapter] : configuration.adapters) {
      if (!is_unspecified(adapter.address)) {
        on_network_[static_cast<std::size_t>(adapter.network)].push_back(&adapter);
      }
    }
  }

  std::vector<std::optional<Route>> run() {
    start();
    while (!next_.empty()) {
      const int node = next_.front();
      next_.pop_front();
      spread_from(node);
    }
    return std::move(routes_);
  }

 private:
  /* The local node's route to itself is its first address. */
  void start() {
    const int local = configuration_.local_node;
    const auto first = configuration_.adapters.lower_bound(configuration_.adapter_number(local, 0));
    if (first != configuration_.adapters.end() && configuration_.node_of(first->first) == local) {
      routes_[static_cast<std::size_t>(local)] = Route{{first->second.address}, network_of(first->second).ip};
      next_.push_back(local);
    }
  }

  void spread_from(int node) {
    const auto end = configuration_.adapters.lower_bound(configuration_.adapter_number(node + 1, 0));
    for (auto each = configuration_.adapters.lower_bound(configuration_.adapter_number(node, 0)); each != end; ++each) {
      if (!is_unspecified(each->second.address) && (!ip_only_ || network_of(each->second).ip)) {
        spread_over(each->second.network, node);
      }
    }
  }

  void spread_over(Hb_Network_Number network, int from) {
    /* Once is enough: whoever is on it has a route then. */
    for (const Adapter* adapter : std::exchange(on_network_[static_cast<std::size_t>(network)], {})) {
      const int node = configuration_.node_of(adapter->number);
      auto& route = routes_[static_cast<std::size_t>(node)];
      if (!route && extend(from, *adapter, route)) {
        next_.push_back(node);
      }
    }
  }

  bool extend(int from, const Adapter& adapter, std::optional<Route>& route) {
    Route longer = from == configuration_.local_node ? Route{} : *routes_[static_cast<std::size_t>(from)];
    longer.hops.push_back(adapter.address);
    longer.ip = longer.ip && network_of(adapter).ip;
    if (longer.hops.size() <= HB_ROUTE_HOPS) {
      route = std::move(longer);
    }
    return route.has_value();
  }

  [[nodiscard]] const Network& network_of(const Adapter& adapter) const {
    return configuration_.networks[static_cast<std::size_t>(adapter.network)];
  }

  const Configuration& configuration_;
  std::vector<std::vector<const Adapter*>> on_network_;
  std::vector<std::optional<Route>> routes_;
  std::deque<int> next_;
  bool ip_only_;
};

}  // namespace

std::vector<std::optional<Route>> routes_of(const Configuration& configuration) {
  auto routes = Search(configuration, true).run();
  const auto others = Search(configuration, false).run();
  for (std::size_t node = 0; node < routes.size(); ++node) {
    if (!routes[node]) {
      routes[node] = others[node];
    }
  }
  for (const auto& [node, route] : configuration.given_routes) {
    routes[static_cast<std::size_t>(node)] = route;
  }
  return routes;
}

const std::vector<std::optional<Route>>& RouteTable::all() {
  if (configuration_ != cluster_.configuration_sequence()) {
    routes_ = routes_of(cluster_.configuration());
    configuration_ = cluster_.configuration_sequence();
  }
  return routes_;
}

const Route* RouteTable::to(std::int32_t node) {
  const auto& routes = all();
  const bool is_known = node >= 0 && static_cast<std::size_t>(node) < routes.size();
  return is_known && routes[static_cast<std::size_t>(node)] ? &*routes[static_cast<std::size_t>(node)] : nullptr;
}

Hb_Source_Route source_route(const Route& route) {
  Hb_Source_Route option{};
  std::copy(route.hops.begin(), route.hops.end(), option.sr_address);
  return option;
}

std::uint16_t length_of(const Route& route) {
  return static_cast<std::uint16_t>(route.hops.size() * sizeof(Hb_IP_address6));
}

}  // namespace hbd
