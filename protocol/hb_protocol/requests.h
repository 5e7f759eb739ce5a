/* Packets from client to daemon. */
#ifndef HB_PROTOCOL_REQUESTS_H
#define HB_PROTOCOL_REQUESTS_H

#include <stddef.h>
#include <stdint.h>

#include "hb_client/types.h"

/** What a client asks. The comment says what `len` is and what data follow. */
typedef enum Hb_Client_Request HB_ENUM_BASE {
  HB_GET_CONFIG_INFO = 201,             /**< 0; answered by HB_CONFIGURATION_INFO */
  HB_GET_ADAPTER_GROUP = 202,           /**< no client sends it */
  HB_NODE_MAY_BE_DOWN = 203,            /**< the node number, and that many zero bytes */
  HB_NODE_IS_DOWN = 204,                /**< the node number, and that many zero bytes */
  HB_ADAPTER_MAY_BE_DOWN = 205,         /**< the adapter number, and that many zero bytes */
  HB_ADAPTER_IS_DOWN = 206,             /**< the adapter number, and that many zero bytes */
  HB_ENABLE_ADAPTER = 207,              /**< 2: network number */
  HB_DISABLE_ADAPTER = 208,             /**< 2: network number */
  HB_SUBSCRIBE = 209,                   /**< 12,348: the subscription group */
  HB_UNSUBSCRIBE = 210,                 /**< the name with its terminator */
  HB_GET_ROUTE = 211,                   /**< the node number, and that many zero bytes; answered by HB_ROUTE */
  HB_IFCONFIG_DOWN = 212,               /**< 2: network number */
  HB_IFCONFIG_UP = 213,                 /**< 2: network number */
  HB_CONFIGURE_ADAPTER = 214,           /**< 8: hb_adapter_value with an address; answered by HB_CONFIG_ADAPTER */
  HB_UNCONFIGURE_ADAPTER = 215,         /**< 2: network number; answered by HB_CONFIG_ADAPTER */
  HB_ADAPTER_GRACE_REQ = 216,           /**< 8: hb_adapter_value with seconds; answered by HB_ADAPTER_GRACE */
  HB_SIMULATE_DEATH = 217,              /**< 4: seconds */
  HB_SWAP_ADAPTERS = 218,               /**< 8: hb_adapter_value with an address; answered by HB_CONFIG_ADAPTER */
  HB_DISCARD_STALE_MESSAGES = 219,      /**< 0 */
  HB_DONT_DISCARD_STALE_MESSAGES = 220, /**< 0 */
  HB_DAEMON_ROUTING_REQUEST = 221,      /**< routing header and message */
  HB_CLIENT_HEARTBEAT = 222,            /**< 4: the caller's sequence number */
  HB_GET_ADAPTER_STATE = 223,           /**< 2: network number; answered by HB_ADAPTER_STATE */
  HB_SEND_CONFIG_INFO = 224,            /**< no client sends it */
  HB_ENABLE_MANUAL_CONTROL_NIMS = 225,  /**< the interface name without terminator, or 0 */
  HB_DISABLE_MANUAL_CONTROL_NIMS = 226, /**< the interface name without terminator, or 0 */
  HB_DELAYED_DAEMON_SHUTDOWN = 227,     /**< 0 */
  MONITOR_LAST_MESSAGE = 227,
} Hb_Client_Request;

typedef struct Version {
  int16_t major;
  int16_t minor;
} Version;

typedef struct GSid_t {
  uint32_t word[2];
} GSid_t;

typedef struct GSgid_t {
  uint32_t word[2];
} GSgid_t;

enum {
  HB_REQUEST_HEADER_SIZE = 76,     /**< bytes of a request before its data */
  HB_REQUEST_MESSAGE_SIZE = 16460, /**< most data bytes of a request */
  HB_REQUEST_NUMBER_IN_LEN = 98351 /**< largest number that `len` carries in place of a data length */
};

/** A request. Only the header and the data are sent, so the framed length is 76 and the number of data bytes. */
typedef struct packet_str {
  zu_timeval32 Treceive;  /**< 0 */
  int32_t kind;           /**< an `Hb_Client_Request` */
  int32_t len;            /**< data bytes, or a number, see `Hb_Client_Request` */
  Version vers;           /**< 0, 0 */
  GSid_t from_id;         /**< 0 */
  GSgid_t from_group;     /**< 0 */
  GSid_t to_id;           /**< 0 */
  GSgid_t to_group;       /**< 0 */
  uint32_t requestor;     /**< 0 */
  uint32_t reserved;      /**< 0 */
  Hb_Group_Status status; /**< 0 */
  union {
    struct {
      int32_t pid;    /**< the client's process */
      int32_t sfd;    /**< 0 */
      int32_t extra3; /**< 0 */
    } client;
    struct {
      uint32_t machinesId;
      int32_t fromOffset;
      uint32_t machinesInst;
    } server;
  } origin;
  char message[HB_REQUEST_MESSAGE_SIZE];
} packet_str;

/** Data of the requests about a local adapter that carry a value. */
typedef struct hb_adapter_value {
  Hb_Network_Number network;
  uint16_t padding; /**< 0 */
  uint32_t value;   /**< an IPv4 address in network byte order, or seconds */
} hb_adapter_value;

HB_STATIC_ASSERT(sizeof(Hb_Client_Request) == 4, "request codes are 4 bytes");
HB_STATIC_ASSERT(sizeof(Version) == 4, "versions are 4 bytes");
HB_STATIC_ASSERT(sizeof(GSid_t) == 8, "identifiers are 8 bytes");
HB_STATIC_ASSERT(sizeof(GSgid_t) == 8, "group identifiers are 8 bytes");
HB_STATIC_ASSERT(offsetof(packet_str, kind) == 8, "kind at 8");
HB_STATIC_ASSERT(offsetof(packet_str, len) == 12, "len at 12");
HB_STATIC_ASSERT(offsetof(packet_str, vers) == 16, "version at 16");
HB_STATIC_ASSERT(offsetof(packet_str, from_id) == 20, "sender at 20");
HB_STATIC_ASSERT(offsetof(packet_str, from_group) == 28, "sender's group at 28");
HB_STATIC_ASSERT(offsetof(packet_str, to_id) == 36, "receiver at 36");
HB_STATIC_ASSERT(offsetof(packet_str, to_group) == 44, "receiver's group at 44");
HB_STATIC_ASSERT(offsetof(packet_str, requestor) == 52, "requestor at 52");
HB_STATIC_ASSERT(offsetof(packet_str, reserved) == 56, "reserved at 56");
HB_STATIC_ASSERT(offsetof(packet_str, status) == 60, "status at 60");
HB_STATIC_ASSERT(offsetof(packet_str, origin) == 64, "origin at 64");
HB_STATIC_ASSERT(offsetof(packet_str, message) == HB_REQUEST_HEADER_SIZE, "message after the header");
HB_STATIC_ASSERT(sizeof(packet_str) == 16536, "requests are at most 16,536 bytes");
HB_STATIC_ASSERT(sizeof(hb_adapter_value) == 8, "adapter values are 8 bytes");
HB_STATIC_ASSERT(offsetof(hb_adapter_value, value) == 4, "value at 4");

#endif
