#include "scenario_parser.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <optional>
#include <set>
#include <utility>

#include "address.h"
#include "churn.h"
#include "hb_client/route.h"
#include "scripted_answers.h"
#include "toml_table.h"

namespace hbd {
namespace {

/* An adapter of a [[node]], before the limits of the cluster are known. */
struct PlacedAdapter {
  int node;
  int offset;
  TomlTable table;
};

/* The scenario so far, and which adapters are configured at the time that the reader has got to. */
class ScenarioReader {
 public:
  Scenario read(TomlTable root);

 private:
  void read_networks(TomlTable& root);
  void read_cluster(TomlTable& root);
  void read_limits(TomlTable& cluster, const std::vector<PlacedAdapter>& adapters);
  void read_routes(TomlTable& root);
  void read_client_heartbeat(TomlTable& root);
  void read_answers(TomlTable& root);
  void read_events(TomlTable& root);
  void read_churn(TomlTable& root);
  [[nodiscard]] ChurnKind read_kind(const std::string& name, unsigned line) const;

  Adapter read_adapter(TomlTable& table, int node, int offset);
  void add_adapter(const TomlTable& table, const Adapter& adapter);
  Hb_Network_Number read_network(TomlTable& table);
  int read_node(TomlTable& table);
  int read_configured_node(TomlTable& table);
  int read_offset(TomlTable& table);
  Hb_Adapter_Number read_configured_adapter(TomlTable& table);
  [[nodiscard]] std::vector<Hb_Adapter_Number> adapters_of(int node) const;

  Change read_change(TomlTable& event);
  Change adapter_death(TomlTable& event) { return AdapterDeath{{read_configured_adapter(event)}}; }
  Change adapter_join(TomlTable& event) { return AdapterJoin{{read_configured_adapter(event)}}; }
  Change adapter_silence(TomlTable& event) { return AdapterSilence{{read_configured_adapter(event)}}; }
  Change node_death(TomlTable& event);
  Change node_join(TomlTable& event);
  Change network_loss(TomlTable& event) { return NetworkLoss{read_network(event)}; }
  Change network_return(TomlTable& event) { return NetworkReturn{read_network(event)}; }
  Change configuration_update(TomlTable& event);
  Change failure_data(TomlTable& event) { return FailureData{event.text("id", HB_FFDC_ID_LENGTH - 1)}; }
  Change different_instance(TomlTable& event);
  Change heartbeat(TomlTable& event);

  struct Kind {
    ChurnKind kind;
    Change (ScenarioReader::*read)(TomlTable&);
  };
  static const std::array<Kind, 11> kinds;

  Scenario scenario_;
  std::set<Hb_Adapter_Number> configured_;
};

const std::array<ScenarioReader::Kind, 11> ScenarioReader::kinds = {{
    {ChurnKind::AdapterDeath, &ScenarioReader::adapter_death},
    {ChurnKind::AdapterJoin, &ScenarioReader::adapter_join},
    {ChurnKind::NodeDeath, &ScenarioReader::node_death},
    {ChurnKind::NodeJoin, &ScenarioReader::node_join},
    {ChurnKind::NetworkLoss, &ScenarioReader::network_loss},
    {ChurnKind::NetworkReturn, &ScenarioReader::network_return},
    {ChurnKind::ConfigurationUpdate, &ScenarioReader::configuration_update},
    {ChurnKind::FailureData, &ScenarioReader::failure_data},
    {ChurnKind::DifferentInstance, &ScenarioReader::different_instance},
    {ChurnKind::Heartbeat, &ScenarioReader::heartbeat},
    {ChurnKind::AdapterSilence, &ScenarioReader::adapter_silence},
}};

constexpr std::chrono::microseconds no_time{0};

timeval timeval_of(std::chrono::microseconds duration) {
  return {static_cast<time_t>(duration.count() / 1'000'000), static_cast<suseconds_t>(duration.count() % 1'000'000)};
}

std::vector<PlacedAdapter> read_placed_adapters(TomlTable& root) {
  std::vector<PlacedAdapter> placed;
  std::set<int> known;
  for (TomlTable& node : root.tables("node", "[[node]]")) {
    const int number = static_cast<int>(node.number("number", 0, HB_MAX_NODES - 1));
    if (!known.insert(number).second) {
      node.refuse("number", fmt::format("is {} again; put all adapters of a node into one [[node]]", number));
    }
    for (TomlTable& adapter : node.tables("adapters", "an adapter")) {
      const int offset = static_cast<int>(adapter.number("offset", 0, HB_MAX_ADAPTERS - 1));
      placed.push_back({number, offset, std::move(adapter)});
    }
    node.finish();
  }
  if (placed.empty()) {
    throw ScenarioMistake{0, "no node has an adapter; add [[node]] tables with a number and adapters"};
  }
  return placed;
}

Scenario ScenarioReader::read(TomlTable root) {
  read_networks(root);
  read_cluster(root);
  read_routes(root);
  read_client_heartbeat(root);
  read_answers(root);
  read_events(root);
  read_churn(root);
  root.finish();
  return std::move(scenario_);
}

void ScenarioReader::read_networks(TomlTable& root) {
  auto& networks = scenario_.configuration.networks;
  for (TomlTable& table : root.tables("network", "[[network]]")) {
    Network network{table.text("name", HB_NETWORK_NAME_LENGTH - 1), table.text("type", HB_NETWORK_TYPE_LENGTH - 1, ""),
                    table.truth("ip", true)};
    if (std::any_of(networks.begin(), networks.end(), [&](const auto& each) { return each.name == network.name; })) {
      table.refuse("name", "is that of an earlier network; give each its own");
    }
    if (networks.size() == HB_MAX_NETWORKS) {
      table.refuse("name", fmt::format("is one too many; {} networks are the most", int{HB_MAX_NETWORKS}));
    }
    table.finish();
    networks.push_back(std::move(network));
  }
}

void ScenarioReader::read_cluster(TomlTable& root) {
  auto adapters = read_placed_adapters(root);
  TomlTable cluster = root.table("cluster", "[cluster]");
  Configuration& configuration = scenario_.configuration;
  configuration.name = cluster.text("name", HB_NAME_LENGTH - 1, "cluster");
  configuration.remote_node_down_period = timeval_of(cluster.duration("remote_node_down_simulation", no_time));
  configuration.local_node_down_period = timeval_of(cluster.duration("local_node_down_simulation", no_time));
  scenario_.control.suspicion =
      std::chrono::ceil<std::chrono::milliseconds>(cluster.duration("suspicion", scenario_.control.suspicion));
  read_limits(cluster, adapters);
  configuration.local_node =
      static_cast<Hb_Node_Number>(cluster.number("local_node", 0, configuration.max_nodes - 1, 0));
  cluster.finish();
  for (auto& [node, offset, table] : adapters) {
    const Adapter adapter = read_adapter(table, node, offset);
    add_adapter(table, adapter);
    configuration.adapters.emplace(adapter.number, adapter);
  }
  if (adapters_of(configuration.local_node).empty()) {
    cluster.refuse("local_node", fmt::format("is node {}, which has no adapter; add one, or choose another node",
                                             configuration.local_node));
  }
}

/* Clients find a network only while its number is below the adapters per node, so there is a slot for each. */
void ScenarioReader::read_limits(TomlTable& cluster, const std::vector<PlacedAdapter>& adapters) {
  Configuration& configuration = scenario_.configuration;
  int nodes = 1;
  int slots = std::max(1, static_cast<int>(configuration.networks.size()));
  for (const auto& adapter : adapters) {
    nodes = std::max(nodes, adapter.node + 1);
    slots = std::max(slots, adapter.offset + 1);
  }
  configuration.max_nodes = static_cast<int>(cluster.number("max_nodes", nodes, HB_MAX_NODES, nodes));
  configuration.adapters_per_node =
      static_cast<int>(cluster.number("adapters_per_node", slots, HB_MAX_ADAPTERS, slots));
  const auto numbers = std::int64_t{configuration.max_nodes} * configuration.adapters_per_node;
  if (numbers > HB_MAX_ADAPTERS) {
    throw ScenarioMistake{
        cluster.line(),
        fmt::format("{} nodes with {} adapters each are {} adapter numbers; {} are the most, use "
                    "lower node numbers or offsets",
                    configuration.max_nodes, configuration.adapters_per_node, numbers, int{HB_MAX_ADAPTERS})};
  }
}

Adapter ScenarioReader::read_adapter(TomlTable& table, int node, int offset) {
  Adapter adapter;
  adapter.number = scenario_.configuration.adapter_number(node, offset);
  adapter.network = read_network(table);
  adapter.address = table.address("address");
  adapter.type = table.text("type", HB_ADAPTER_TYPE_LENGTH - 1, "");
  adapter.up = table.truth("up", true);
  table.finish();
  return adapter;
}

void ScenarioReader::add_adapter(const TomlTable& table, const Adapter& adapter) {
  if (!configured_.insert(adapter.number).second) {
    table.refuse("offset", "is in use on that node; give each adapter its own");
  }
}

Hb_Network_Number ScenarioReader::read_network(TomlTable& table) {
  const std::string name = table.text("network", HB_NETWORK_NAME_LENGTH - 1);
  const auto& networks = scenario_.configuration.networks;
  const auto found =
      std::find_if(networks.begin(), networks.end(), [&](const Network& each) { return each.name == name; });
  if (found == networks.end()) {
    table.refuse("network", fmt::format("is \"{}\", which no [[network]] is called; add one, or correct it", name));
  }
  return static_cast<Hb_Network_Number>(found - networks.begin());
}

int ScenarioReader::read_node(TomlTable& table) {
  return static_cast<int>(table.number("node", 0, scenario_.configuration.max_nodes - 1));
}

int ScenarioReader::read_configured_node(TomlTable& table) {
  const int node = read_node(table);
  if (adapters_of(node).empty()) {
    table.refuse("node", fmt::format("is {}, which is not configured at that time; add it before", node));
  }
  return node;
}

int ScenarioReader::read_offset(TomlTable& table) {
  return static_cast<int>(table.number("offset", 0, scenario_.configuration.adapters_per_node - 1));
}

Hb_Adapter_Number ScenarioReader::read_configured_adapter(TomlTable& table) {
  const int node = read_configured_node(table);
  const int offset = read_offset(table);
  const Hb_Adapter_Number number = scenario_.configuration.adapter_number(node, offset);
  if (!configured_.contains(number)) {
    table.refuse("offset",
                 fmt::format("is {}, where node {} has no adapter at that time; add it before", offset, node));
  }
  return number;
}

std::vector<Hb_Adapter_Number> ScenarioReader::adapters_of(int node) const {
  return {configured_.lower_bound(scenario_.configuration.adapter_number(node, 0)),
          configured_.lower_bound(scenario_.configuration.adapter_number(node + 1, 0))};
}

void ScenarioReader::read_routes(TomlTable& root) {
  for (TomlTable& table : root.tables("route", "[[route]]")) {
    const auto node = static_cast<Hb_Node_Number>(read_node(table));
    Route route;
    for (const auto& [text, line] : table.texts("hops")) {
      const auto hop = parse_address(text);
      if (!hop) {
        throw ScenarioMistake{line,
                              fmt::format("[[route]] \"hops\" has \"{}\", which is no IPv4 or IPv6 address", text)};
      }
      route.hops.push_back(*hop);
    }
    if (route.hops.empty() || route.hops.size() > HB_ROUTE_HOPS) {
      table.refuse("hops", fmt::format("must be 1 to {} addresses, the node's own at the end", int{HB_ROUTE_HOPS}));
    }
    route.ip = table.truth("ip", true);
    table.finish();
    if (!scenario_.configuration.given_routes.emplace(node, std::move(route)).second) {
      table.refuse("node", fmt::format("is {} again; a node has one route", node));
    }
  }
}

void ScenarioReader::read_client_heartbeat(TomlTable& root) {
  TomlTable table = root.table("client_heartbeat", "[client_heartbeat]");
  HeartbeatAnswer& answer = scenario_.control.heartbeat;
  answer.is_given = table.truth("answer", true);
  const timeval threshold = timeval_of(table.duration("threshold", std::chrono::seconds(answer.settings.seconds)));
  answer.settings.seconds = static_cast<std::int32_t>(threshold.tv_sec);
  answer.settings.microseconds = static_cast<std::int32_t>(threshold.tv_usec);
  answer.settings.enabled = table.truth("enabled", true);
  answer.settings.daemon_pid = static_cast<std::int32_t>(table.number("daemon_pid", 1, INT32_MAX, 0));
  table.finish();
}

/* What a name of a list stands for. */
template <typename Value, std::size_t Size>
Value read_name(TomlTable& table, std::string_view key, const ScenarioName<Value> (&list)[Size]) {
  const std::string name = table.text(key, 64);
  std::string all;
  for (const auto& each : list) {
    if (each.name == name) {
      return each.value;
    }
    all += fmt::format("{}{}", all.empty() ? "" : ", ", each.name);
  }
  table.refuse(key, fmt::format("is \"{}\"; it must be one of: {}", name, all));
}

void ScenarioReader::read_answers(TomlTable& root) {
  for (TomlTable& table : root.tables("answer", "[[answer]]")) {
    ScriptedAnswer answer;
    answer.request = read_name(table, "request", scripted_requests);
    answer.status = read_name(table, "status", scripted_statuses);
    answer.count = static_cast<std::uint64_t>(table.number("count", 0, INT64_MAX, 1));
    if (table.has("state")) {
      answer.state = read_name(table, "state", scripted_states);
      if (answer.request != HB_GET_ADAPTER_STATE || answer.status != HB_REQUEST_SUCCESSFUL) {
        table.refuse("state", "goes with the request \"adapter-state\" and the status \"successful\" alone");
      }
    }
    table.finish();
    scenario_.control.answers.push_back(answer);
  }
}

void ScenarioReader::read_events(TomlTable& root) {
  std::vector<std::pair<std::chrono::microseconds, TomlTable>> events;
  for (TomlTable& event : root.tables("event", "[[event]]")) {
    const auto at = event.duration("at");
    events.emplace_back(at, std::move(event));
  }
  /* Those at one time keep the order of the file. */
  std::stable_sort(events.begin(), events.end(), [](const auto& a, const auto& b) { return a.first < b.first; });
  for (auto& [at, event] : events) {
    scenario_.steps.push_back({at, read_change(event)});
    event.finish();
  }
}

ChurnKind ScenarioReader::read_kind(const std::string& name, unsigned line) const {
  std::string all;
  for (const Kind& each : kinds) {
    if (name_of(each.kind) == name) {
      return each.kind;
    }
    all += fmt::format("{}{}", all.empty() ? "" : ", ", name_of(each.kind));
  }
  throw ScenarioMistake{line, fmt::format("\"{}\" is no kind of event; the kinds are: {}", name, all)};
}

Change ScenarioReader::read_change(TomlTable& event) {
  const ChurnKind wanted = read_kind(event.text("kind", 64), event.line("kind"));
  const auto found = std::find_if(kinds.begin(), kinds.end(), [&](const Kind& each) { return each.kind == wanted; });
  return (this->*found->read)(event);
}

Change ScenarioReader::node_death(TomlTable& event) {
  const auto node = static_cast<Hb_Node_Number>(read_configured_node(event));
  return NodeDeath{node, event.text("ffdc_id", HB_FFDC_ID_LENGTH - 1, "")};
}

Change ScenarioReader::node_join(TomlTable& event) {
  const auto node = static_cast<Hb_Node_Number>(read_configured_node(event));
  return NodeJoin{node, event.text("ffdc_id", HB_FFDC_ID_LENGTH - 1, "")};
}

Change ScenarioReader::configuration_update(TomlTable& event) {
  ConfigurationChange change;
  for (TomlTable& table : event.tables("remove", "a removal")) {
    std::vector<Hb_Adapter_Number> gone;
    if (table.has("offset")) {
      gone.push_back(read_configured_adapter(table));
    } else {
      gone = adapters_of(read_configured_node(table));
    }
    for (const auto number : gone) {
      configured_.erase(number);
      change.remove.push_back(number);
    }
    table.finish();
  }
  for (TomlTable& table : event.tables("add", "an addition")) {
    const int node = read_node(table);
    const int offset = read_offset(table);
    change.add.push_back(read_adapter(table, node, offset));
    add_adapter(table, change.add.back());
  }
  return change;
}

Change ScenarioReader::different_instance(TomlTable& event) {
  const Hb_IP_address6 address = event.address("address");
  return DifferentInstance{address, static_cast<Hb_Config_Instance>(event.number("instance", 0, UINT32_MAX))};
}

Change ScenarioReader::heartbeat(TomlTable& event) {
  const timeval threshold = timeval_of(event.duration("threshold"));
  return HeartbeatSettings{static_cast<std::int32_t>(threshold.tv_sec), static_cast<std::int32_t>(threshold.tv_usec),
                           event.truth("enabled", true),
                           static_cast<std::int32_t>(event.number("daemon_pid", 1, INT32_MAX, 1))};
}

void ScenarioReader::read_churn(TomlTable& root) {
  if (!root.has("random")) {
    return;
  }
  TomlTable table = root.table("random", "[random]");
  ChurnSettings churn;
  churn.seed = static_cast<std::uint64_t>(table.number("seed", 0, INT64_MAX));
  churn.mean_interval = table.duration("mean_interval");
  churn.count = static_cast<std::uint64_t>(table.number("count", 0, INT64_MAX, 0));
  for (const auto& [name, line] : table.texts("kinds")) {
    churn.kinds.push_back(read_kind(name, line));
  }
  if (churn.kinds.empty()) {
    churn.kinds = {ChurnKind::AdapterDeath, ChurnKind::AdapterJoin, ChurnKind::NodeDeath, ChurnKind::NodeJoin};
  }
  if (churn.mean_interval <= no_time) {
    table.refuse("mean_interval", "must be longer than 0");
  }
  table.finish();
  scenario_.churn = std::move(churn);
}

}  // namespace

std::variant<Scenario, ScenarioError> parse_scenario(std::string_view text) {
  try {
    const toml::table root = toml::parse(text);
    return ScenarioReader().read(TomlTable(root, "the scenario"));
  } catch (const toml::parse_error& error) {
    return ScenarioError{static_cast<unsigned>(error.source().begin.line), std::string(error.description())};
  } catch (const ScenarioMistake& mistake) {
    return ScenarioError{mistake.line, mistake.text};
  }
}

}  // namespace hbd
