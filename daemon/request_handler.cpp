#include "request_handler.h"

#include <fmt/ranges.h>
#include <spdlog/spdlog.h>
#include <unistd.h>

#include <algorithm>
#include <optional>
#include <set>
#include <span>

#include "packet_writer.h"

namespace hbd {
namespace {

constexpr std::int32_t no_route = 0;
constexpr std::size_t nodes_to_name = 8;

/* A request about an adapter of this node, what the log calls it, and the kind of its answer if it has one. */
struct AdapterEffect {
  Hb_Client_Request request;
  std::string_view name;
  std::optional<Hb_Client_Reply> answer;
  Hb_Request_Status (AdapterControl::*act)(const AdapterTarget& target);
};

constexpr AdapterEffect adapter_effects[] = {
    {HB_ENABLE_ADAPTER, "monitor the adapter", std::nullopt, &AdapterControl::enable},
    {HB_DISABLE_ADAPTER, "monitor the adapter no more", std::nullopt, &AdapterControl::disable},
    {HB_IFCONFIG_DOWN, "switch the interface off", std::nullopt, &AdapterControl::interface_down},
    {HB_IFCONFIG_UP, "switch the interface on", std::nullopt, &AdapterControl::interface_up},
    {HB_CONFIGURE_ADAPTER, "configure the adapter", HB_CONFIG_ADAPTER, &AdapterControl::configure},
    {HB_UNCONFIGURE_ADAPTER, "take the adapter's address", HB_CONFIG_ADAPTER, &AdapterControl::unconfigure},
    {HB_SWAP_ADAPTERS, "swap addresses", HB_CONFIG_ADAPTER, &AdapterControl::swap},
    {HB_ADAPTER_GRACE_REQ, "give a time of grace", HB_ADAPTER_GRACE, &AdapterControl::grace},
};

struct ReportEffect {
  Hb_Client_Request request;
  std::string_view meaning;
  bool (Reports::*act)(std::int32_t number);
};

constexpr ReportEffect report_effects[] = {
    {HB_NODE_MAY_BE_DOWN, "node {} may be down", &Reports::node_may_be_down},
    {HB_NODE_IS_DOWN, "node {} is down", &Reports::node_is_down},
    {HB_ADAPTER_MAY_BE_DOWN, "adapter {} may be down", &Reports::adapter_may_be_down},
    {HB_ADAPTER_IS_DOWN, "adapter {} is down", &Reports::adapter_is_down},
};

template <typename Effects>
const auto& effect_of(const Effects& effects, Hb_Client_Request request) {
  return *std::find_if(std::begin(effects), std::end(effects),
                       [&](const auto& each) { return each.request == request; });
}

std::string_view name_of(Hb_Request_Status status) {
  return std::find_if(std::begin(scripted_statuses), std::end(scripted_statuses),
                      [&](const auto& each) { return each.value == status; })
      ->name;
}

/* Interfaces of the local node: the one that is named, or all of them. */
std::set<std::string> local_interfaces(const Configuration& configuration, const std::string& name) {
  std::set<std::string> found;
  const auto end = configuration.adapters.lower_bound(configuration.adapter_number(configuration.local_node + 1, 0));
  for (auto each = configuration.adapters.lower_bound(configuration.adapter_number(configuration.local_node, 0));
       each != end; ++each) {
    if (!each->second.type.empty() && (name.empty() || name == each->second.type)) {
      found.insert(each->second.type);
    }
  }
  return found;
}

}  // namespace

const RequestHandler::Effect RequestHandler::effects[] = {
    {HB_GET_CONFIG_INFO, &RequestHandler::send_configuration},
    {HB_NODE_MAY_BE_DOWN, &RequestHandler::take_report},
    {HB_NODE_IS_DOWN, &RequestHandler::take_report},
    {HB_ADAPTER_MAY_BE_DOWN, &RequestHandler::take_report},
    {HB_ADAPTER_IS_DOWN, &RequestHandler::take_report},
    {HB_ENABLE_ADAPTER, &RequestHandler::steer_adapter},
    {HB_DISABLE_ADAPTER, &RequestHandler::steer_adapter},
    {HB_GET_ROUTE, &RequestHandler::send_route},
    {HB_IFCONFIG_DOWN, &RequestHandler::steer_adapter},
    {HB_IFCONFIG_UP, &RequestHandler::steer_adapter},
    {HB_CONFIGURE_ADAPTER, &RequestHandler::steer_adapter},
    {HB_UNCONFIGURE_ADAPTER, &RequestHandler::steer_adapter},
    {HB_ADAPTER_GRACE_REQ, &RequestHandler::steer_adapter},
    {HB_SIMULATE_DEATH, &RequestHandler::simulate_death},
    {HB_SWAP_ADAPTERS, &RequestHandler::steer_adapter},
    {HB_DISCARD_STALE_MESSAGES, &RequestHandler::discard_stale},
    {HB_DONT_DISCARD_STALE_MESSAGES, &RequestHandler::discard_stale},
    {HB_DAEMON_ROUTING_REQUEST, &RequestHandler::route_message},
    {HB_CLIENT_HEARTBEAT, &RequestHandler::take_heartbeat},
    {HB_GET_ADAPTER_STATE, &RequestHandler::send_state},
    {HB_ENABLE_MANUAL_CONTROL_NIMS, &RequestHandler::switch_manual_control},
    {HB_DISABLE_MANUAL_CONTROL_NIMS, &RequestHandler::switch_manual_control},
    {HB_DELAYED_DAEMON_SHUTDOWN, &RequestHandler::shut_down_later},
};

RequestHandler::RequestHandler(Loop& loop, const Cluster& cluster, ChangeSink& sink, InterfaceControl* interfaces,
                               RouteTable& routes, const ControlSettings& settings)
    : cluster_(cluster),
      sink_(sink),
      routes_(routes),
      simulated_(changes_),
      deadlines_(loop, sink),
      adapters_(cluster, changes_, interfaces == nullptr ? simulated_ : *interfaces, deadlines_),
      reports_(cluster, changes_, deadlines_, settings.suspicion),
      answers_(settings.answers),
      heartbeat_(settings.heartbeat) {
  if (heartbeat_.settings.daemon_pid == 0) {
    heartbeat_.settings.daemon_pid = getpid();
  }
}

void RequestHandler::handle(Client& client, const Request& request) {
  std::visit([&](const auto& one) { serve(client, one); }, request);
  changes_.pass_on(sink_);
}

void RequestHandler::serve(Client& client, const PlainRequest& request) {
  spdlog::debug("{}: request {} with {}", client.label(), static_cast<int>(request.code), request.number);
  const auto* const found = std::find_if(std::begin(effects), std::end(effects),
                                         [&](const auto& each) { return each.request == request.code; });
  if (found != std::end(effects)) {
    (this->*found->serve)(client, request);
  }
}

void RequestHandler::serve(Client& client, const SubscribeRequest& request) {
  const Subscription& subscription = request.subscription;
  spdlog::debug("{}: subscribes to events {:#x} of type {} as \"{}\"", client.label(), subscription.events,
                static_cast<int>(subscription.type), subscription.name.data());
  client.subscriptions.put(subscription);
  for (const Event& event : subscription.first_events(cluster_)) {
    client.tell(event_frame(event, cluster_), subscription.name);
  }
}

void RequestHandler::serve(Client& client, const UnsubscribeRequest& request) {
  const bool known = client.subscriptions.remove(request.name);
  spdlog::debug("{}: unsubscribes \"{}\"{}", client.label(), request.name.data(), known ? "" : ", which it had not");
}

/* Those that are malformed never get here: their connection ends first. */
void RequestHandler::serve(Client& client, const MalformedRequest& /*request*/) { client.disconnect(); }

void RequestHandler::send_configuration(Client& client, const PlainRequest& /*request*/) {
  client.follows_configuration = true;
  client.send(configuration());
}

void RequestHandler::send_route(Client& client, const PlainRequest& request) {
  const Route* route = routes_.to(request.number);
  client.send(route == nullptr ? answer_frame(HB_ROUTE, no_route)
                               : route_frame(length_of(*route), source_route(*route)));
}

void RequestHandler::send_state(Client& client, const PlainRequest& request) {
  Hb_Adapter_state_t state = Hb_Adapter_Unknown;
  auto status = adapters_.state(std::get<AdapterTarget>(request.data), state);
  if (const auto scripted = answers_.take(request.code)) {
    status = scripted->status;
    state = scripted->state.value_or(state);
  }
  client.send(status == HB_REQUEST_SUCCESSFUL ? state_frame(status, state) : answer_frame(HB_ADAPTER_STATE, status));
}

void RequestHandler::steer_adapter(Client& client, const PlainRequest& request) {
  const AdapterEffect& effect = effect_of(adapter_effects, request.code);
  const auto& target = std::get<AdapterTarget>(request.data);
  const auto scripted = answers_.take(request.code);
  const auto status = scripted ? scripted->status : (adapters_.*effect.act)(target);
  spdlog::info("{}: asks to {} on network {}: {}", client.label(), effect.name, target.network, name_of(status));
  if (effect.answer) {
    client.send(answer_frame(*effect.answer, status));
  }
}

void RequestHandler::take_report(Client& client, const PlainRequest& request) {
  const ReportEffect& effect = effect_of(report_effects, request.code);
  const bool is_known = (reports_.*effect.act)(request.number);
  spdlog::info("{}: reports that {}{}", client.label(), fmt::format(fmt::runtime(effect.meaning), request.number),
               is_known ? "" : ", which is not configured");
}

void RequestHandler::simulate_death(Client& client, const PlainRequest& request) {
  const auto seconds = static_cast<std::int32_t>(std::get<std::uint32_t>(request.data));
  spdlog::info("{}: asks this node to play dead for {} s", client.label(), seconds);
  reports_.simulate_death(seconds);
}

void RequestHandler::discard_stale(Client& client, const PlainRequest& request) {
  client.discards_stale = request.code == HB_DISCARD_STALE_MESSAGES;
  spdlog::debug("{}: stale events are {} for it", client.label(), client.discards_stale ? "dropped" : "kept");
}

/* There is nobody behind the nodes who would take the message: it is counted. */
void RequestHandler::route_message(Client& client, const PlainRequest& request) {
  const auto& message = std::get<RoutingMessage>(request.data);
  const auto reached = std::count_if(message.nodes.begin(), message.nodes.end(), [&](auto node) {
    return routes_.to(node) != nullptr && cluster_.up_nodes().contains(static_cast<std::size_t>(node));
  });
  const auto named = std::span(message.nodes).first(std::min(message.nodes.size(), nodes_to_name));
  ++routed_messages_;
  routed_bytes_ += message.bytes.size();
  spdlog::info("{}: message of {} bytes to port {} of {} nodes ({}{}), {} of them up; {} messages with {} bytes so far",
               client.label(), message.bytes.size(), message.port, message.nodes.size(), fmt::join(named, ", "),
               named.size() < message.nodes.size() ? " and others" : "", reached, routed_messages_, routed_bytes_);
}

void RequestHandler::take_heartbeat(Client& client, const PlainRequest& request) {
  spdlog::debug("{}: heartbeat {}", client.label(), std::get<std::uint32_t>(request.data));
  if (!heartbeat_.is_given) {
    return;
  }
  const Event event{cluster_.sequence(), heartbeat_.settings};
  for (const auto& subscription : client.subscriptions) {
    if (subscription.wants(event, cluster_)) {
      client.tell(event_frame(event, cluster_), subscription.name);
    }
  }
}

void RequestHandler::switch_manual_control(Client& client, const PlainRequest& request) {
  const auto& name = std::get<std::string>(request.data);
  const bool on = request.code == HB_ENABLE_MANUAL_CONTROL_NIMS;
  const auto interfaces = local_interfaces(cluster_.configuration(), name);
  if (interfaces.empty()) {
    spdlog::warn("{}: asks for manual control of an interface that this node does not have", client.label());
  }
  for (const std::string& interface : interfaces) {
    spdlog::info("{}: the monitor of {} is under {} control", client.label(), interface, on ? "manual" : "its own");
    changes_.apply(ManualControl{interface, on});
  }
}

/* Clients that move to another source of events leave one by one; the daemon stays for those that have not yet. */
void RequestHandler::shut_down_later(Client& client, const PlainRequest& /*request*/) {
  spdlog::info("{}: asks for a shutdown when the last client has left", client.label());
  delayed_shutdown_();
}

std::size_t RequestHandler::configuration_size() { return configuration()->size(); }

const SharedFrame& RequestHandler::configuration() {
  if (!configuration_ || configuration_stands_for_ != cluster_.sequence()) {
    configuration_ = configuration_frame(cluster_);
    configuration_stands_for_ = cluster_.sequence();
  }
  return configuration_;
}

}  // namespace hbd
