// One packet of a client, as the daemon reads it, and what it makes of a subscription.
#include <algorithm>
#include <array>

#include "hb_client/events.h"
#include "hb_client/subscription.h"
#include "request_parser.h"
#include "support/input.h"
#include "support/require.h"

namespace {

constexpr size_t header_size = 76;
constexpr size_t kind_at = 8;
constexpr size_t length_at = 12;
constexpr int32_t subscribe = 209;
constexpr int32_t unsubscribe = 210;
constexpr int32_t routed_message = 221;
constexpr size_t routed_front = 56;

// Requests whose length is the same for every client that keeps to the protocol: none of them may be refused.
struct Rule {
  int32_t code;
  int32_t shortest;
  int32_t longest;
};
constexpr std::array<Rule, 19> rules = {{
    {201, 0, 0},     {203, 0, 98351}, {204, 0, 98351}, {205, 0, 98351}, {206, 0, 98351}, {207, 2, 2}, {208, 2, 2},
    {211, 0, 98351}, {212, 2, 2},     {213, 2, 2},     {214, 8, 8},     {215, 2, 2},     {216, 8, 8}, {217, 4, 4},
    {218, 8, 8},     {219, 0, 0},     {220, 0, 0},     {222, 4, 4},     {223, 2, 2},
}};

int32_t number_at(fuzz::Bytes packet, size_t offset) {
  int32_t number = 0;
  std::memcpy(&number, packet.data() + offset, sizeof number);
  return number;
}

bool is_complete(fuzz::Bytes packet) {
  return packet.size() >= header_size &&
         static_cast<int64_t>(number_at(packet, length_at)) == static_cast<int64_t>(packet.size() - header_size);
}

bool are_ascending_nodes(fuzz::Bytes data, int32_t count) {
  int32_t before = -1;
  for (int32_t i = 0; i < count; ++i) {
    const int32_t node = number_at(data, routed_front + static_cast<size_t>(i) * 4);
    if (node <= before || node > 2048) {
      return false;
    }
    before = node;
  }
  return true;
}

// A message to be routed as a client sends it: port, hops to live, version, ten words of 0, the nodes, size and bytes.
bool is_routed_message(fuzz::Bytes data) {
  if (data.size() < routed_front || data.size() > 10000 || number_at(data, 4) != 20 || number_at(data, 8) != 1 ||
      std::any_of(data.begin() + 12, data.begin() + 52, [](uint8_t byte) { return byte != 0; })) {
    return false;
  }
  const int64_t count = number_at(data, 52);
  const int64_t bytes_at = int64_t{routed_front} + count * 4 + 4;
  if (number_at(data, 0) < 0 || number_at(data, 0) > 65535 || count < 1 || count > 2049 ||
      bytes_at > static_cast<int64_t>(data.size())) {
    return false;
  }
  return are_ascending_nodes(data, static_cast<int32_t>(count)) &&
         number_at(data, static_cast<size_t>(bytes_at) - 4) == static_cast<int64_t>(data.size()) - bytes_at;
}

bool has_to_be_accepted(fuzz::Bytes packet) {
  if (!is_complete(packet)) {
    return false;
  }
  const int32_t code = number_at(packet, kind_at);
  const int32_t length = number_at(packet, length_at);
  if (code == subscribe) {
    const int32_t type = length >= 4 ? number_at(packet, header_size) : -1;
    return length == 12348 && type >= 0 && type <= 9 && type != 4;
  }
  if (code == unsubscribe) {
    const fuzz::Bytes name = packet.subspan(header_size);
    return length >= 1 && length <= 32 && std::find(name.begin(), name.end(), 0) != name.end();
  }
  if (code == routed_message) {
    return is_routed_message(packet.subspan(header_size));
  }
  return std::any_of(rules.begin(), rules.end(), [=](const Rule& rule) {
    return rule.code == code && length >= rule.shortest && length <= rule.longest;
  });
}

bool is_name(const hbd::SubscriptionName& name) { return name.back() == '\0'; }

const hbd::Cluster& cluster() {
  static const hbd::Cluster four_nodes([] {
    hbd::Configuration configuration;
    configuration.max_nodes = 4;
    configuration.adapters_per_node = 2;
    configuration.networks = {{"service", "ether"}, {"standby", "ether"}};
    for (Hb_Adapter_Number number = 0; number < 8; ++number) {
      configuration.adapters[number] = {number, {}, static_cast<Hb_Network_Number>(number % 2), "en0", true};
    }
    return configuration;
  }());
  return four_nodes;
}

// Every event that there can be, tried on the subscription.
void use(const hbd::Subscription& subscription) {
  static const std::array<hbd::Event, 8> events = {{
      {1, hbd::AdapterEvent{hbd::Direction::Death, {{1, 1}, {7, 1}}}},
      {2, hbd::NodeEvent{hbd::Direction::Join, {0, 3}, "id"}},
      {3, hbd::AdapterGroupEvent{hbd::MemberSet(8)}},
      {4, hbd::NodeGroupEvent{hbd::MemberSet(4)}},
      {5, hbd::ConfigurationEvent{}},
      {6, hbd::FailureData{"id"}},
      {7, hbd::DifferentInstance{}},
      {8, hbd::HeartbeatSettings{}},
  }};
  for (const hbd::Event& event : events) {
    REQUIRE(!subscription.wants(event, cluster()) || subscription.events != 0);
  }
  REQUIRE(subscription.first_events(cluster()).size() <= 1);
}

void check_subscription(const hbd::Subscription& subscription, fuzz::Bytes packet) {
  REQUIRE(is_name(subscription.name) && subscription.type == number_at(packet, header_size));
  REQUIRE(subscription.events == number_at(packet, header_size + offsetof(Hb_Subscription_Group, Hb_events)));
  use(subscription);
  hbd::SubscriptionList list;
  list.put(subscription);
  list.put(subscription);
  REQUIRE(list.size() == 1 && list.remove(subscription.name) && list.size() == 0);
}

// What is passed on names nodes that there can be, each once, and as many bytes as there are.
void check_routed_message(const hbd::RoutingMessage& message, fuzz::Bytes data) {
  REQUIRE(!message.nodes.empty() && message.nodes.size() == static_cast<size_t>(number_at(data, 52)));
  REQUIRE(are_ascending_nodes(data, static_cast<int32_t>(message.nodes.size())));
  REQUIRE(message.port == static_cast<uint16_t>(data[0] << 8U | data[1]));
  const fuzz::Bytes end = data.last(message.bytes.size());
  REQUIRE(std::equal(end.begin(), end.end(), message.bytes.begin()));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  const fuzz::Bytes packet(bytes, size);
  const hbd::Request request = hbd::parse_request(packet);
  if (const auto* malformed = std::get_if<hbd::MalformedRequest>(&request)) {
    REQUIRE(!malformed->reason.empty() && !has_to_be_accepted(packet));
    return 0;
  }
  REQUIRE(is_complete(packet));
  const int32_t code = number_at(packet, kind_at);
  if (const auto* plain = std::get_if<hbd::PlainRequest>(&request)) {
    REQUIRE(plain->code == code && code >= 201 && code <= 227 && code != subscribe && code != unsubscribe);
    REQUIRE(plain->number == number_at(packet, length_at));
    if (code == routed_message) {
      check_routed_message(std::get<hbd::RoutingMessage>(plain->data), packet.subspan(header_size));
    }
  } else if (const auto* registration = std::get_if<hbd::SubscribeRequest>(&request)) {
    REQUIRE(code == subscribe);
    check_subscription(registration->subscription, packet);
  } else {
    REQUIRE(code == unsubscribe && is_name(std::get<hbd::UnsubscribeRequest>(request).name));
  }
  return 0;
}
