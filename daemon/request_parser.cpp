#include "request_parser.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <optional>

namespace hbd {
namespace {

/* How many data bytes a request has; `at_least` to `at_most` of them. */
struct Rule {
  Hb_Client_Request code;
  std::int32_t at_least;
  std::int32_t at_most;
};

constexpr std::int32_t subscription_size = sizeof(Hb_Subscription_Group);
constexpr std::int32_t value_size = sizeof(hb_adapter_value);

constexpr std::array<Rule, 27> rules = {{
    {HB_GET_CONFIG_INFO, 0, 0},
    {HB_GET_ADAPTER_GROUP, 0, HB_REQUEST_MESSAGE_SIZE},
    {HB_NODE_MAY_BE_DOWN, 0, HB_REQUEST_NUMBER_IN_LEN},
    {HB_NODE_IS_DOWN, 0, HB_REQUEST_NUMBER_IN_LEN},
    {HB_ADAPTER_MAY_BE_DOWN, 0, HB_REQUEST_NUMBER_IN_LEN},
    {HB_ADAPTER_IS_DOWN, 0, HB_REQUEST_NUMBER_IN_LEN},
    {HB_ENABLE_ADAPTER, 2, 2},
    {HB_DISABLE_ADAPTER, 2, 2},
    {HB_SUBSCRIBE, subscription_size, subscription_size},
    {HB_UNSUBSCRIBE, 1, HB_NAME_LENGTH},
    {HB_GET_ROUTE, 0, HB_REQUEST_NUMBER_IN_LEN},
    {HB_IFCONFIG_DOWN, 2, 2},
    {HB_IFCONFIG_UP, 2, 2},
    {HB_CONFIGURE_ADAPTER, value_size, value_size},
    {HB_UNCONFIGURE_ADAPTER, 2, 2},
    {HB_ADAPTER_GRACE_REQ, value_size, value_size},
    {HB_SIMULATE_DEATH, 4, 4},
    {HB_SWAP_ADAPTERS, value_size, value_size},
    {HB_DISCARD_STALE_MESSAGES, 0, 0},
    {HB_DONT_DISCARD_STALE_MESSAGES, 0, 0},
    {HB_DAEMON_ROUTING_REQUEST, 0, HB_REQUEST_MESSAGE_SIZE},
    {HB_CLIENT_HEARTBEAT, 4, 4},
    {HB_GET_ADAPTER_STATE, 2, 2},
    {HB_SEND_CONFIG_INFO, 0, HB_REQUEST_MESSAGE_SIZE},
    {HB_ENABLE_MANUAL_CONTROL_NIMS, 0, HB_REQUEST_MESSAGE_SIZE},
    {HB_DISABLE_MANUAL_CONTROL_NIMS, 0, HB_REQUEST_MESSAGE_SIZE},
    {HB_DELAYED_DAEMON_SHUTDOWN, 0, HB_REQUEST_MESSAGE_SIZE},
}};

template <typename Field>
Field field_at(std::span<const std::uint8_t> packet, std::size_t offset) {
  Field field{};
  std::memcpy(&field, packet.data() + offset, sizeof(field));
  return field;
}

const Rule* rule_of(std::int32_t code) {
  const auto found =
      std::find_if(rules.begin(), rules.end(), [&](const Rule& rule) { return static_cast<int>(rule.code) == code; });
  return found == rules.end() ? nullptr : &*found;
}

Request parse_subscribe(std::span<const std::uint8_t> data) {
  const auto record = field_at<Hb_Subscription_Group>(data, 0);
  const auto type = static_cast<std::int32_t>(record.Hb_subscription_type);
  if (type < Hb_Node_Subscription || type > Hb_Split_Merge_Subscription || type == Hb_Empty_Subscription) {
    return MalformedRequest{fmt::format("a subscription of type {}", type)};
  }
  return SubscribeRequest{subscription_of(record)};
}

Request parse_unsubscribe(std::span<const std::uint8_t> data) {
  const auto end = std::find(data.begin(), data.end(), 0);
  if (end == data.end()) {
    return MalformedRequest{"a name without its terminator"};
  }
  UnsubscribeRequest request;
  std::copy(data.begin(), end, request.name.begin());
  return request;
}

/* Data of a request about an adapter of this node; the value follows the network in those that have one. */
AdapterTarget target_in(std::span<const std::uint8_t> data) {
  hb_adapter_value target{};
  std::memcpy(&target, data.data(), std::min(data.size(), sizeof(target)));
  return {target.network, target.value};
}

Request parse_routing(std::int32_t length, std::span<const std::uint8_t> data) {
  auto message = parse_routing_message(data);
  if (const auto* reason = std::get_if<std::string>(&message)) {
    return MalformedRequest{*reason};
  }
  return PlainRequest{HB_DAEMON_ROUTING_REQUEST, length, std::get<RoutingMessage>(std::move(message))};
}

PlainRequest::Data data_in(Hb_Client_Request code, std::span<const std::uint8_t> data) {
  switch (code) {
    case HB_ENABLE_ADAPTER:
    case HB_DISABLE_ADAPTER:
    case HB_IFCONFIG_DOWN:
    case HB_IFCONFIG_UP:
    case HB_CONFIGURE_ADAPTER:
    case HB_UNCONFIGURE_ADAPTER:
    case HB_ADAPTER_GRACE_REQ:
    case HB_SWAP_ADAPTERS:
    case HB_GET_ADAPTER_STATE:
      return target_in(data);
    case HB_SIMULATE_DEATH:
    case HB_CLIENT_HEARTBEAT:
      return field_at<std::uint32_t>(data, 0);
    case HB_ENABLE_MANUAL_CONTROL_NIMS:
    case HB_DISABLE_MANUAL_CONTROL_NIMS:
      return std::string(data.begin(), data.end());
    default:
      return {};
  }
}

std::optional<MalformedRequest> complaint(const Rule* rule, std::int32_t code, std::int32_t length,
                                          std::size_t data_size) {
  if (rule == nullptr) {
    return MalformedRequest{fmt::format("the unknown request {}", code)};
  }
  if (length < 0 || static_cast<std::size_t>(length) != data_size) {
    return MalformedRequest{
        fmt::format("request {} with a length of {} and {} bytes of data", code, length, data_size)};
  }
  if (length < rule->at_least || length > rule->at_most) {
    return MalformedRequest{fmt::format("request {} with {} bytes of data; {} to {} are allowed", code, length,
                                        rule->at_least, rule->at_most)};
  }
  return std::nullopt;
}

}  // namespace

Request parse_request(std::span<const std::uint8_t> packet) {
  if (packet.size() < HB_REQUEST_HEADER_SIZE) {
    return MalformedRequest{fmt::format("a packet of {} bytes", packet.size())};
  }
  const auto code = field_at<std::int32_t>(packet, offsetof(packet_str, kind));
  const auto length = field_at<std::int32_t>(packet, offsetof(packet_str, len));
  const auto data = packet.subspan(HB_REQUEST_HEADER_SIZE);
  const Rule* rule = rule_of(code);
  if (auto wrong = complaint(rule, code, length, data.size())) {
    return *wrong;
  }
  switch (rule->code) {
    case HB_SUBSCRIBE:
      return parse_subscribe(data);
    case HB_UNSUBSCRIBE:
      return parse_unsubscribe(data);
    case HB_DAEMON_ROUTING_REQUEST:
      return parse_routing(length, data);
    default:
      return PlainRequest{rule->code, length, data_in(rule->code, data)};
  }
}

}  // namespace hbd
