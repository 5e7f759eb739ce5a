#include <fmt/format.h>

#include "command.h"
#include "daemon_link.h"
#include "json.h"
#include "liveness_probe.h"
#include "text.h"

namespace hbctl {
namespace {

Json tally_json(const Tally& tally, size_t configured) {
  return {{"configured", configured}, {"up", tally.up}, {"down", tally.down}};
}

Json status_json(const std::string& socket_path, const Cluster& cluster, const Liveness& liveness) {
  Json json = json_object("status");
  json["socket"] = socket_path;
  json["connected"] = true;
  json["local_node"] = cluster.local_node;
  json["nodes"] = tally_json(liveness.nodes().tally(), cluster.nodes.size());
  json["adapters"] = tally_json(liveness.adapters().tally(), cluster.adapters.size());
  json["networks"] = cluster.networks.size();
  json["sites"] = cluster.sites.size();
  return json;
}

std::string tally_text(const Tally& tally, size_t configured) {
  std::string text = fmt::format("{} configured", configured);
  if (tally.up + tally.down > 0) text += fmt::format(", {} up, {} down", tally.up, tally.down);
  return text;
}

std::string labelled(const Style& style, const std::vector<std::pair<std::string, Cell>>& rows) {
  std::string text;
  for (const auto& [label, cell] : rows) {
    text +=
        style.apply(Paint::Heading, fmt::format("{:<10}", label)) + "  " + style.apply(cell.paint, cell.text) + '\n';
  }
  return text;
}

std::string status_text(const Context& context, const Cluster& cluster, const Liveness& liveness) {
  return labelled(context.style, {{"Socket", {context.socket_path}},
                                  {"Connected", {"yes", Paint::Good}},
                                  {"Local node", {fmt::format("{}", cluster.local_node)}},
                                  {"Nodes", {tally_text(liveness.nodes().tally(), cluster.nodes.size())}},
                                  {"Adapters", {tally_text(liveness.adapters().tally(), cluster.adapters.size())}},
                                  {"Networks", {fmt::format("{} configured", cluster.networks.size())}},
                                  {"Sites", {fmt::format("{} configured", cluster.sites.size())}}});
}

std::string disconnected(const Context& context, const CommandError& error) {
  if (!context.options.json)
    return labelled(context.style, {{"Socket", {context.socket_path}}, {"Connected", {"no", Paint::Bad}}});
  Json json = json_object("status");
  json["socket"] = context.socket_path;
  json["connected"] = false;
  json["error"] = error_json(error);
  return json_document(json);
}

}  // namespace

void status_command(const Context& context) {
  try {
    const DaemonLink link(context.socket_path);
    const Cluster cluster = read_cluster();
    const Liveness liveness = probe_liveness(cluster, as_milliseconds(context.options.wait));
    context.output.write(context.options.json ? json_document(status_json(context.socket_path, cluster, liveness))
                                              : status_text(context, cluster, liveness));
  } catch (const CommandError& error) {
    context.output.write(disconnected(context, error));
    throw ReportedError(error);
  }
}

}  // namespace hbctl
