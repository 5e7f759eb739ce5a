/* Messages that the daemon routes: the data of HB_DAEMON_ROUTING_REQUEST. */
#ifndef HB_PROTOCOL_ROUTING_H
#define HB_PROTOCOL_ROUTING_H

#include <stddef.h>
#include <stdint.h>

#include "hb_client/types.h"

enum { HB_ROUTING_TTL = 20, HB_ROUTING_VERSION = 1, HB_ROUTING_EXPANSION = 9 };

/** Front of the data, before the destinations, the 4-byte size of the message, and the message. */
typedef struct daemon_routing_front {
  int32_t port_number; /**< 16 bits, in the other byte order than the caller's */
  int32_t ttl;
  int32_t daemon_routing_version;
  int32_t expansion[HB_ROUTING_EXPANSION]; /**< 0 */
  int32_t MOWL_only_flag;                  /**< 0 */
  int32_t num_nodes;                       /**< destinations that follow: node numbers of 4 bytes, ascending */
} daemon_routing_front;

HB_STATIC_ASSERT(offsetof(daemon_routing_front, ttl) == 4, "time to live at 4");
HB_STATIC_ASSERT(offsetof(daemon_routing_front, daemon_routing_version) == 8, "version at 8");
HB_STATIC_ASSERT(offsetof(daemon_routing_front, expansion) == 12, "expansion at 12");
HB_STATIC_ASSERT(offsetof(daemon_routing_front, MOWL_only_flag) == 48, "flag at 48");
HB_STATIC_ASSERT(offsetof(daemon_routing_front, num_nodes) == 52, "number of destinations at 52");
HB_STATIC_ASSERT(sizeof(daemon_routing_front) == 56, "destinations at 56");

#endif
