/* Bytes that are ready to be sent. */
#ifndef HBD_FRAME_H
#define HBD_FRAME_H

#include <array>
#include <cstdint>
#include <memory>
#include <vector>

#include "hb_protocol/framing.h"
#include "hb_protocol/replies.h"

namespace hbd {

/** Name of a subscription, filled with zeros. */
using SubscriptionName = std::array<char, HB_NAME_LENGTH>;

/** One packet with its length in front; built once and shared by all clients that it goes to. */
using Frame = std::vector<std::uint8_t>;
using SharedFrame = std::shared_ptr<const Frame>;

/** Where the one field stands that differs between receivers. */
inline constexpr std::size_t frame_name_offset = HB_FRAME_PREFIX_SIZE + offsetof(client_packet, subscription_name);

}  // namespace hbd

#endif
