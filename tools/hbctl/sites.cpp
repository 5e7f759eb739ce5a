#include <fmt/format.h>

#include "command.h"
#include "daemon_link.h"
#include "json.h"

namespace hbctl {
namespace {

Json sites_json(const Cluster& cluster) {
  Json json = json_object("sites");
  json["sites"] = Json::array();
  for (Hb_Site_Number site : cluster.sites) json["sites"].push_back({{"number", site}});
  return json;
}

Table sites_table(const Cluster& cluster) {
  Table table({{"SITE", Align::Right}});
  for (Hb_Site_Number site : cluster.sites) table.add({{fmt::format("{}", site)}});
  return table;
}

}  // namespace

void sites_command(const Context& context) {
  const DaemonLink link(context.socket_path);
  const Cluster cluster = read_cluster();
  context.output.write(context.options.json ? json_document(sites_json(cluster))
                                            : sites_table(cluster).render(context.style));
}

}  // namespace hbctl
