#include "hb_client/route.h"

#include <fmt/format.h>

#include <algorithm>

#include "address.h"
#include "daemon_link.h"
#include "request.h"

namespace hbctl {
namespace {

// Where a route can be taken from, by the option that says so.
struct RouteSource {
  const char* word;  // in JSON
  const char* what;  // for people; {} is the node
  Hb_Rc (*take)(Hb_Node_Number node, Hb_Source_Route* route, unsigned short* length);
};

constexpr RouteSource kPublished = {"published", "read the route to node {}", hb_read_route};
constexpr RouteSource kPublishedIp = {"published-ip", "read the IP route to node {}", hb_read_ip_route};
constexpr RouteSource kDaemon = {"daemon", "get the route to node {} from the daemon", hb_get_route};

const RouteSource& source_of(const Options& options) {
  if (options.from_daemon) return kDaemon;
  return options.ip ? kPublishedIp : kPublished;
}

struct Route {
  unsigned short length = 0;  // in bytes, as the daemon says
  std::vector<std::string> hops;
};

Route take_route(const RouteSource& source, Hb_Node_Number node) {
  Route route;
  Hb_Source_Route hops{};
  if (source.take(node, &hops, &route.length) != Hb_Success) {
    throw request_error(fmt::format(fmt::runtime(source.what), node),
                        "the number is beyond those of the cluster: see hbctl nodes");
  }
  const size_t count = std::min<size_t>(route.length / sizeof hops.sr_address[0], HB_ROUTE_HOPS);
  for (size_t i = 0; i < count; ++i) route.hops.push_back(address_text(hops.sr_address[i]));
  return route;
}

Json route_json(const RouteSource& source, Hb_Node_Number node, const Route& route) {
  Json json = json_object("route");
  json["node"] = node;
  json["source"] = source.word;
  json["length"] = route.length;
  json["hops"] = route.hops;
  return json;
}

Table route_table(const Route& route) {
  Table table({{"HOP", Align::Right}, {"ADDRESS"}});
  for (size_t i = 0; i < route.hops.size(); ++i) table.add({{fmt::format("{}", i + 1)}, {route.hops[i]}});
  return table;
}

}  // namespace

void route_command(const Context& context) {
  const DaemonLink link(context.socket_path);
  const RouteSource& source = source_of(context.options);
  const Route route = take_route(source, context.options.node);
  context.output.write(context.options.json ? json_document(route_json(source, context.options.node, route))
                                            : route_table(route).render(context.style));
}

}  // namespace hbctl
