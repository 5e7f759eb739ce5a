#include "routing_message.h"

#include <arpa/inet.h>
#include <fmt/format.h>

#include <algorithm>
#include <cstring>

#include "hb_client/route.h"
#include "hb_client/types.h"
#include "hb_protocol/routing.h"

namespace hbd {
namespace {

using Bytes = std::span<const std::uint8_t>;

constexpr std::size_t size_field = sizeof(std::int32_t);

std::string front_complaint(const daemon_routing_front& front) {
  if (front.daemon_routing_version != HB_ROUTING_VERSION) {
    return fmt::format("a routed message of version {}", front.daemon_routing_version);
  }
  if (front.ttl < 1 || front.ttl > HB_ROUTING_TTL) {
    return fmt::format("a routed message with {} hops to live", front.ttl);
  }
  if (front.port_number < 0 || front.port_number > UINT16_MAX) {
    return fmt::format("a routed message to port {}", front.port_number);
  }
  if (front.MOWL_only_flag != Hb_False && front.MOWL_only_flag != Hb_True) {
    return fmt::format("a routed message with a flag of {}", front.MOWL_only_flag);
  }
  if (std::any_of(std::begin(front.expansion), std::end(front.expansion), [](auto word) { return word != 0; })) {
    return "a routed message with something in its reserved words";
  }
  if (front.num_nodes < 1 || front.num_nodes > HB_MAX_NODES) {
    return fmt::format("a routed message to {} nodes", front.num_nodes);
  }
  return {};
}

bool are_destinations(const std::vector<std::int32_t>& nodes) {
  return nodes.front() >= 0 && nodes.back() < HB_MAX_NODES &&
         std::adjacent_find(nodes.begin(), nodes.end(), std::greater_equal<>()) == nodes.end();
}

}  // namespace

std::variant<RoutingMessage, std::string> parse_routing_message(Bytes data) {
  daemon_routing_front front{};
  if (data.size() < sizeof(front) || data.size() > HB_ROUTED_MESSAGE_SIZE) {
    return fmt::format("a routed message in {} bytes of data", data.size());
  }
  std::memcpy(&front, data.data(), sizeof(front));
  if (auto complaint = front_complaint(front); !complaint.empty()) {
    return complaint;
  }
  Bytes rest = data.subspan(sizeof(front));
  const std::size_t list_size = static_cast<std::size_t>(front.num_nodes) * sizeof(std::int32_t);
  if (rest.size() < list_size + size_field) {
    return fmt::format("a routed message to {} nodes in {} bytes of data", front.num_nodes, data.size());
  }
  RoutingMessage message;
  /* On the wire the bytes of the number are exchanged once more. */
  message.port = ntohs(static_cast<std::uint16_t>(front.port_number));
  message.nodes.resize(static_cast<std::size_t>(front.num_nodes));
  std::memcpy(message.nodes.data(), rest.data(), list_size);
  if (!are_destinations(message.nodes)) {
    return "a routed message whose nodes are not ascending node numbers";
  }
  std::int32_t size = 0;
  std::memcpy(&size, rest.data() + list_size, size_field);
  rest = rest.subspan(list_size + size_field);
  if (size < 0 || static_cast<std::size_t>(size) != rest.size()) {
    return fmt::format("a routed message of {} bytes with {} bytes", size, rest.size());
  }
  message.bytes.assign(rest.begin(), rest.end());
  return message;
}

}  // namespace hbd
