#include <fmt/format.h>

#include "command.h"
#include "daemon_link.h"
#include "json.h"
#include "liveness_probe.h"

namespace hbctl {
namespace {

Tally tally_of(const Network& network, const Liveness& liveness) {
  StateMap<Hb_Adapter_Number> states;
  states.follow(network.adapters);
  for (Hb_Adapter_Number adapter : network.adapters) states.set({adapter}, liveness.adapters().state(adapter));
  return states.tally();
}

// Until every adapter's state is known, the number that are up is not.
std::optional<int> adapters_up(const Network& network, const Liveness& liveness) {
  const Tally tally = tally_of(network, liveness);
  return tally.unknown == 0 ? std::optional(tally.up) : std::nullopt;
}

Json networks_json(const Cluster& cluster, const Liveness& liveness) {
  Json json = json_object("networks");
  json["networks"] = Json::array();
  for (const Network& network : cluster.networks) {
    json["networks"].push_back({{"number", network.number},
                                {"name", network.name},
                                {"network_type", network.type},
                                {"adapters", network.adapters.size()},
                                {"up", or_null(adapters_up(network, liveness))}});
  }
  return json;
}

Table networks_table(const Cluster& cluster, const Liveness& liveness) {
  Table table({{"NETWORK", Align::Right}, {"NAME"}, {"TYPE"}, {"ADAPTERS", Align::Right}, {"UP", Align::Right}});
  for (const Network& network : cluster.networks) {
    const std::optional<int> up = adapters_up(network, liveness);
    table.add({{fmt::format("{}", network.number)},
               {network.name},
               {or_dash(network.type)},
               {fmt::format("{}", network.adapters.size())},
               {up ? fmt::format("{}", *up) : "-"}});
  }
  return table;
}

}  // namespace

void networks_command(const Context& context) {
  const DaemonLink link(context.socket_path);
  const Cluster cluster = read_cluster();
  const Liveness liveness = probe_liveness(cluster, as_milliseconds(context.options.wait));
  context.output.write(context.options.json ? json_document(networks_json(cluster, liveness))
                                            : networks_table(cluster, liveness).render(context.style));
}

}  // namespace hbctl
