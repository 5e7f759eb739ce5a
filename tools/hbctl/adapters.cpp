#include <fmt/format.h>

#include <algorithm>
#include <set>

#include "command.h"
#include "daemon_link.h"
#include "json.h"
#include "liveness_probe.h"
#include "words.h"

namespace hbctl {
namespace {

// Which nodes and networks to list; an empty set is all of them.
struct Filter {
  std::set<Hb_Node_Number> nodes;
  std::set<Hb_Network_Number> networks;

  bool takes(const Adapter& adapter) const {
    if (!nodes.empty() && (!adapter.node || nodes.count(*adapter.node) == 0)) return false;
    return networks.empty() || (adapter.network && networks.count(*adapter.network) != 0);
  }
};

Filter make_filter(const Selection& selection, const Cluster& cluster) {
  Filter filter;
  std::vector<std::string> unknown;
  const auto known_nodes = cluster.node_numbers();
  for (Hb_Node_Number node : selection.nodes) {
    if (std::find(known_nodes.begin(), known_nodes.end(), node) == known_nodes.end())
      unknown.push_back(fmt::format("node {}", node));
    filter.nodes.insert(node);
  }
  for (const std::string& name : selection.networks) {
    const Network* network = find_network(cluster, name);
    if (network == nullptr) {
      unknown.push_back(fmt::format("network {}", name));
    } else {
      filter.networks.insert(network->number);
    }
  }
  if (!unknown.empty()) throw not_configured(unknown);
  return filter;
}

std::vector<const Adapter*> selected(const Cluster& cluster, const Filter& filter) {
  std::vector<const Adapter*> adapters;
  for (const Adapter& adapter : cluster.adapters)
    if (filter.takes(adapter)) adapters.push_back(&adapter);
  return adapters;
}

std::string network_name(const Cluster& cluster, const Adapter& adapter) {
  const Network* network = cluster.network(adapter.network);
  return network != nullptr ? network->name : "";
}

Json network_json(const Network* network) {
  if (network == nullptr) return nullptr;
  return {{"number", network->number}, {"name", network->name}};
}

Json adapters_json(const Cluster& cluster, const std::vector<const Adapter*>& adapters, const Liveness& liveness) {
  Json json = json_object("adapters");
  json["adapters"] = Json::array();
  for (const Adapter* adapter : adapters) {
    json["adapters"].push_back({{"number", adapter->number},
                                {"node", or_null(adapter->node)},
                                {"offset", or_null(adapter->offset)},
                                {"network", network_json(cluster.network(adapter->network))},
                                {"adapter_type", adapter->type},
                                {"address", adapter->address},
                                {"state", state_word(liveness.adapters().state(adapter->number))}});
  }
  return json;
}

template <class Number>
std::string number_or_dash(const std::optional<Number>& number) {
  return number ? fmt::format("{}", *number) : "-";
}

Table adapters_table(const Cluster& cluster, const std::vector<const Adapter*>& adapters, const Liveness& liveness) {
  Table table({{"ADAPTER", Align::Right},
               {"NODE", Align::Right},
               {"OFFSET", Align::Right},
               {"NETWORK"},
               {"TYPE"},
               {"ADDRESS"},
               {"STATE"}});
  for (const Adapter* adapter : adapters) {
    table.add({{fmt::format("{}", adapter->number)},
               {number_or_dash(adapter->node)},
               {number_or_dash(adapter->offset)},
               {or_dash(network_name(cluster, *adapter))},
               {or_dash(adapter->type)},
               {or_dash(adapter->address)},
               state_cell(liveness.adapters().state(adapter->number))});
  }
  return table;
}

}  // namespace

void adapters_command(const Context& context) {
  const DaemonLink link(context.socket_path);
  const Cluster cluster = read_cluster();
  const auto adapters = selected(cluster, make_filter(context.options.selection, cluster));
  const Liveness liveness = probe_liveness(cluster, as_milliseconds(context.options.wait));
  context.output.write(context.options.json ? json_document(adapters_json(cluster, adapters, liveness))
                                            : adapters_table(cluster, adapters, liveness).render(context.style));
}

}  // namespace hbctl
