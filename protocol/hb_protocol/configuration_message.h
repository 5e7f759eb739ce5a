/* The configuration, as HB_CONFIGURATION_INFO and HB_CONFIGURATION_UPDATE carry it in their message. */
#ifndef HB_PROTOCOL_CONFIGURATION_MESSAGE_H
#define HB_PROTOCOL_CONFIGURATION_MESSAGE_H

#include <stddef.h>
#include <stdint.h>

#include "hb_client/configuration.h"
#include "hb_protocol/replies.h"

/* The two periods stand at offsets that are no multiples of 8. */
#pragma pack(push, 4)

/** Front of the message. `num_adapters` records of 64 bytes follow, then `num_networks` of 86 bytes. */
typedef struct hb_configuration_header {
  int32_t local_node_number; /**< the low 16 bits count */
  int32_t max_nodes;
  int32_t adapters_per_node;
  int32_t num_adapters;
  int32_t num_networks;
  struct timeval rem_node_down_sim_period;
  struct timeval local_node_down_sim_period;
} hb_configuration_header;

#pragma pack(pop)

HB_STATIC_ASSERT(sizeof(struct timeval) == 16, "times are two 64-bit fields");
HB_STATIC_ASSERT(offsetof(hb_configuration_header, max_nodes) == 4, "maximum number of nodes at 4");
HB_STATIC_ASSERT(offsetof(hb_configuration_header, adapters_per_node) == 8, "adapters per node at 8");
HB_STATIC_ASSERT(offsetof(hb_configuration_header, num_adapters) == 12, "number of adapters at 12");
HB_STATIC_ASSERT(offsetof(hb_configuration_header, num_networks) == 16, "number of networks at 16");
HB_STATIC_ASSERT(offsetof(hb_configuration_header, rem_node_down_sim_period) == 20, "remote period at 20");
HB_STATIC_ASSERT(offsetof(hb_configuration_header, local_node_down_sim_period) == 36, "local period at 36");
HB_STATIC_ASSERT(sizeof(hb_configuration_header) == 52, "records start at 52");
HB_STATIC_ASSERT(sizeof(hb_configuration_header) + HB_MAX_ADAPTERS * sizeof(Hb_Adapter) +
                         HB_MAX_NETWORKS * sizeof(Hb_Network) ==
                     HB_REPLY_MESSAGE_SIZE,
                 "the largest configuration fills a packet");

#endif
