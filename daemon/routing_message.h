/* Messages that clients have routed to other nodes. */
#ifndef HBD_ROUTING_MESSAGE_H
#define HBD_ROUTING_MESSAGE_H

#include <cstdint>
#include <span>
#include <string>
#include <variant>
#include <vector>

namespace hbd {

/** A message and where it is to go. */
struct RoutingMessage {
  std::uint16_t port = 0; /**< in this machine's byte order, when the sender had it so */
  std::vector<std::int32_t> nodes;
  std::vector<std::uint8_t> bytes;
};

/** Reads the data of HB_DAEMON_ROUTING_REQUEST; says what is wrong with them otherwise. Any bytes will do. */
std::variant<RoutingMessage, std::string> parse_routing_message(std::span<const std::uint8_t> data);

}  // namespace hbd

#endif
