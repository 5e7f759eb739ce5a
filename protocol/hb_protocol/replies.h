/* Packets from daemon to client: answers and events. */
#ifndef HB_PROTOCOL_REPLIES_H
#define HB_PROTOCOL_REPLIES_H

#include <stddef.h>
#include <stdint.h>

#include "hb_client/types.h"
#include "hb_protocol/requests.h"

/** What a packet of the daemon is. */
typedef enum Hb_Client_Reply HB_ENUM_BASE {
  HB_CONFIGURATION_INFO = 0,   /**< answer to HB_GET_CONFIG_INFO: hb_configuration_header and its records */
  HB_ADAPTER_GROUP = 1,        /**< adapter membership group */
  HB_ADAPTER_DEATH = 2,        /**< event: hb_adapter_event_header and its entries */
  HB_ADAPTER_JOIN = 3,         /**< event: the same */
  HB_ADAPTER_NEW_GROUP = 4,    /**< event: the same */
  HB_NODE_DEATH = 5,           /**< event: one `Hb_Boolean` for each node number */
  HB_NODE_JOIN = 6,            /**< event: the same */
  HB_NODE_NEW_GROUP = 7,       /**< event: the same */
  HB_ROUTE = 8,                /**< answer to HB_GET_ROUTE: the source route; its length is in `value` */
  HB_CONFIGURATION_UPDATE = 9, /**< event: hb_configuration_header and its records */
  HB_CONFIG_ADAPTER = 10,      /**< answer to HB_CONFIGURE_ADAPTER, HB_UNCONFIGURE_ADAPTER and HB_SWAP_ADAPTERS */
  HB_ADAPTER_GRACE = 11,       /**< answer to HB_ADAPTER_GRACE_REQ */
  HB_FFDC_ID = 12,             /**< event: the identifier is in the header */
  HB_DIFF_INSTANCE_NUM = 13,   /**< event: 20 bytes, address and instance of the sender */
  HB_ADAPTER_STATE = 14,       /**< answer to HB_GET_ADAPTER_STATE: one 32-bit state */
  HB_NODE_HEARTBEAT = 15,      /**< event: 16 bytes, the client's heartbeat settings */
} Hb_Client_Reply;

/** Status of an answer, in `value`. */
typedef enum Hb_Request_Status HB_ENUM_BASE {
  HB_REQUEST_SUCCESSFUL = 0,
  HB_NO_SUCH_NETWORK = 1,
  HB_TRY_AGAIN = 2,
  HB_ADAPTER_ENABLED = 3,
  HB_ADAPTER_NOT_CONFIG = 4,
  HB_INVALID_SERVICE_ADDRESS = 5,
  HB_SAME_ADDRESS = 6,
  HB_NOT_SUPPORTED = 7,
  HB_GRACE_FAILED = 8,
  HB_GRACE_TIME_OUT = 9,
} Hb_Request_Status;

enum {
  HB_REPLY_HEADER_SIZE = 108,     /**< bytes of a packet before its message */
  HB_REPLY_MESSAGE_SIZE = 6298708 /**< longest message: a configuration of the largest cluster */
};

/** An answer or an event. The framed length says how much of it was sent. */
typedef struct client_packet {
  int32_t kind;                 /**< an `Hb_Client_Reply` */
  GSid_t leader_id;             /**< events: group leader, in the first word */
  GSgid_t group_id;             /**< events: group incarnation, in the second word */
  Hb_Group_Status group_status; /**< events: group status */
  Hb_Name subscription_name;    /**< events: the subscription that the event belongs to */
  int32_t value;                /**< answers: an `Hb_Request_Status`, or a number */
  fc_eid_t ffdc_id;             /**< events: failure-data identifier */
  char padding;
  Hb_Seq_Num notification_sequence_no; /**< events: their number */
  char message[HB_REPLY_MESSAGE_SIZE];
} client_packet;

typedef client_packet client_packet_t;

/** Front of an adapter event's message. `last_index` + 1 entries follow. */
typedef struct hb_adapter_event_header {
  int32_t last_index;
} hb_adapter_event_header;

typedef struct hb_adapter_event_entry {
  Hb_Adapter_Number adapter;
  Hb_Incarnation incarnation;
} hb_adapter_event_entry;

HB_STATIC_ASSERT(sizeof(Hb_Client_Reply) == 4, "packet kinds are 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Request_Status) == 4, "states of answers are 4 bytes");
HB_STATIC_ASSERT(offsetof(client_packet, kind) == 0, "kind first");
HB_STATIC_ASSERT(offsetof(client_packet, leader_id) == 4, "leader at 4");
HB_STATIC_ASSERT(offsetof(client_packet, group_id) == 12, "group at 12");
HB_STATIC_ASSERT(offsetof(client_packet, group_status) == 20, "group status at 20");
HB_STATIC_ASSERT(offsetof(client_packet, subscription_name) == 24, "subscription name at 24");
HB_STATIC_ASSERT(offsetof(client_packet, value) == 56, "value at 56");
HB_STATIC_ASSERT(offsetof(client_packet, ffdc_id) == 60, "failure-data identifier at 60");
HB_STATIC_ASSERT(offsetof(client_packet, notification_sequence_no) == 104, "sequence number at 104");
HB_STATIC_ASSERT(offsetof(client_packet, message) == HB_REPLY_HEADER_SIZE, "message after the header");
HB_STATIC_ASSERT(sizeof(client_packet) == 6298816, "packets are at most 6,298,816 bytes");
HB_STATIC_ASSERT(sizeof(hb_adapter_event_header) == 4, "adapter events start with 4 bytes");
HB_STATIC_ASSERT(sizeof(hb_adapter_event_entry) == 8, "entries of adapter events are 8 bytes");

#endif
