#include <fmt/format.h>

#include "command.h"
#include "daemon_link.h"
#include "hb_client/group.h"
#include "json.h"
#include "liveness_probe.h"
#include "words.h"

namespace hbctl {
namespace {

struct NodeRow {
  Node node;
  bool local;
  State state;
  std::optional<Hb_Entity_State_Reason> reason;  // absent: no event has set one
  std::optional<bool> member;                    // absent: the node group is not known
};

std::optional<bool> membership(State observed) {
  if (observed == State::Unknown) return std::nullopt;
  return observed == State::Up;
}

// The library knows the state of a node that an event named; a node that is missing from the node group is down.
NodeRow describe(const Node& node, bool local, State observed) {
  NodeRow row{node, local, observed, std::nullopt, membership(observed)};
  Hb_Entity_State state = Hb_Entity_Undef;
  Hb_Entity_State_Reason reason = Hb_Entity_State_Reason_Undef;
  if (hb_get_node_status_reason(node.number, &state, &reason) != Hb_Success) return row;
  if (state != Hb_Entity_Up && state != Hb_Entity_Down) return row;
  row.state = state == Hb_Entity_Up ? State::Up : State::Down;
  row.reason = reason;
  return row;
}

std::vector<NodeRow> describe_all(const Cluster& cluster, const Liveness& liveness) {
  std::vector<NodeRow> rows;
  for (const Node& node : cluster.nodes)
    rows.push_back(describe(node, node.number == cluster.local_node, liveness.nodes().state(node.number)));
  return rows;
}

std::string reason_text(const NodeRow& row) {
  if (row.reason) return reason_word(*row.reason);
  return row.state == State::Down ? "not in the node group" : "-";
}

Json nodes_json(const std::vector<NodeRow>& rows) {
  Json json = json_object("nodes");
  json["nodes"] = Json::array();
  for (const NodeRow& row : rows) {
    json["nodes"].push_back({{"number", row.node.number},
                             {"local", row.local},
                             {"adapters", row.node.adapters},
                             {"state", state_word(row.state)},
                             {"reason", row.reason ? Json(reason_word(*row.reason)) : Json(nullptr)},
                             {"member", or_null(row.member)}});
  }
  return json;
}

Table nodes_table(const std::vector<NodeRow>& rows) {
  Table table({{"NODE", Align::Right}, {"LOCAL"}, {"ADAPTERS", Align::Right}, {"STATE"}, {"REASON"}});
  for (const NodeRow& row : rows) {
    table.add({{fmt::format("{}", row.node.number)},
               {row.local ? "yes" : "no"},
               {fmt::format("{}", row.node.adapters)},
               state_cell(row.state),
               {reason_text(row)}});
  }
  return table;
}

}  // namespace

void nodes_command(const Context& context) {
  const DaemonLink link(context.socket_path);
  const Cluster cluster = read_cluster();
  const Liveness liveness = probe_liveness(cluster, as_milliseconds(context.options.wait));
  const std::vector<NodeRow> rows = describe_all(cluster, liveness);
  context.output.write(context.options.json ? json_document(nodes_json(rows))
                                            : nodes_table(rows).render(context.style));
}

}  // namespace hbctl
