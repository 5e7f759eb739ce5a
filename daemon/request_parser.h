/* Requests, from the bytes of one packet. */
#ifndef HBD_REQUEST_PARSER_H
#define HBD_REQUEST_PARSER_H

#include <cstdint>
#include <span>
#include <string>
#include <variant>

#include "adapter_control.h"
#include "frame.h"
#include "hb_protocol/requests.h"
#include "routing_message.h"
#include "subscription.h"

namespace hbd {

/** Shortest and longest packet that a client may send. */
inline constexpr std::int32_t shortest_request = HB_REQUEST_HEADER_SIZE;
inline constexpr std::int32_t longest_request = shortest_request + HB_REQUEST_NUMBER_IN_LEN;

/** HB_SUBSCRIBE. */
struct SubscribeRequest {
  Subscription subscription;
};

/** HB_UNSUBSCRIBE. */
struct UnsubscribeRequest {
  SubscriptionName name{};
};

/** Every other request that is known. */
struct PlainRequest {
  /** What it carries: an adapter of this node, a number of 32 bits, an interface's name, or a message to route. */
  using Data = std::variant<std::monostate, AdapterTarget, std::uint32_t, std::string, RoutingMessage>;

  Hb_Client_Request code = HB_GET_CONFIG_INFO;
  std::int32_t number = 0; /**< what `len` says: a number for those that carry one, else the size of the data */
  Data data;
};

/** A packet that is no request; says what is wrong with it. */
struct MalformedRequest {
  std::string reason;
};

using Request = std::variant<PlainRequest, SubscribeRequest, UnsubscribeRequest, MalformedRequest>;

/** Reads one packet, without the length that stands before it. Any bytes will do. */
Request parse_request(std::span<const std::uint8_t> packet);

}  // namespace hbd

#endif
