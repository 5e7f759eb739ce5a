/* libzu_vex: the operating system's cluster services and event monitors. */
#ifndef ZU_VEX_H
#define ZU_VEX_H

#include <assert.h>
#include <netinet/in.h>
#include <stddef.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#define ZU_VEX_ENUM_BASE : int32_t
#else
#define ZU_VEX_ENUM_BASE
#endif

typedef uint32_t zu_vex_node_num_t;
typedef uint32_t zu_vex_IP_address4_t;
typedef char* zu_vex_intf_name_t;

/** A 16-byte address in network byte order; IPv4 addresses are IPv4-mapped. */
typedef union zu_vex_IP_address6_t {
  struct {
    uint32_t filler[3];
    zu_vex_IP_address4_t v4_in_v6_ipv4;
  } zu_vex_v4_in_v6;
  struct in6_addr zu_vex_i6_ipv6;
} zu_vex_IP_address6_t;

typedef enum zu_vex_net_intf_dev_subtype_t ZU_VEX_ENUM_BASE {
  ZU_VEX_DEVTYPE_UNSUPPORTED = 0,
  ZU_VEX_DEVTYPE_ETHER = 1,
  ZU_VEX_DEVTYPE_TOKENRING = 800,
} zu_vex_net_intf_dev_subtype_t;

typedef enum zu_vex_intf_status_t ZU_VEX_ENUM_BASE {
  ZU_VEX_INTF_STATUS_UNDEF = -1,
  ZU_VEX_INTF_STATUS_DOWN = 0,
  ZU_VEX_INTF_STATUS_UP = 1,
  ZU_VEX_INTF_STATUS_STALE = 2,
} zu_vex_intf_status_t;

typedef struct zu_vex_hwaddr_t {
  uint8_t ieee802mac[6];
} zu_vex_hwaddr_t;

/** Bit of `flags`: the address is an alias, not a boot address. */
#define ZU_VEX_INTF_ALIAS UINT64_C(0x2)

/** One interface address of one node; a linked list. */
typedef struct zu_vex_net_intf_info {
  zu_vex_node_num_t node_number;
  zu_vex_intf_name_t p_name; /**< 32 characters are compared, 35 get into a table; it ends, or 255 can be read */
  zu_vex_IP_address6_t ip_addr;
  zu_vex_IP_address6_t netmask;
  uint64_t flags;
  zu_vex_net_intf_dev_subtype_t type;
  zu_vex_hwaddr_t hwaddr;
  zu_vex_intf_status_t status;
  uint32_t cfg_op;
  void* caller_data;
  struct zu_vex_net_intf_info* p_next;
} zu_vex_net_intf_info_t;
static_assert(sizeof(zu_vex_net_intf_info_t) == 96, "zu_vex_net_intf_info_t");
static_assert(sizeof(zu_vex_IP_address6_t) == 16, "zu_vex_IP_address6_t");
static_assert(sizeof(zu_vex_hwaddr_t) == 6, "zu_vex_hwaddr_t");

typedef struct zu_vex_uuid_t {
  uint64_t high;
  uint64_t low;
} zu_vex_uuid_t;
static_assert(sizeof(zu_vex_uuid_t) == 16, "zu_vex_uuid_t");

/** The cluster. */
typedef struct zu_vex_cluster_info_t {
  zu_vex_node_num_t local_node_number;
  char* p_cluster_name;
  char cluster_id[64];
  zu_vex_uuid_t uuid;
  uint32_t cluster_shid;
  uint32_t cluster_type;
} zu_vex_cluster_info_t;

typedef zu_vex_uuid_t zu_vex_node_id_t;
typedef zu_vex_uuid_t zu_vex_site_id_t;
typedef uint32_t zu_vex_site_num_t;
typedef uint32_t zu_vex_cfg_chg_op_t;

typedef enum zu_vex_node_status_t ZU_VEX_ENUM_BASE {
  ZU_VEX_NODE_STATUS_UNDEF = -1,
  ZU_VEX_NODE_STATUS_DOWN = 0,
  ZU_VEX_NODE_STATUS_UP = 1,
} zu_vex_node_status_t;

typedef enum zu_vex_node_down_reason_t ZU_VEX_ENUM_BASE {
  ZU_VEX_NODE_DOWN_REASON_NONE = 0,
  ZU_VEX_NODE_DOWN_REASON_LINK_DOWN = 1,
  ZU_VEX_NODE_DOWN_REASON_SHUTDOWN = 2,
  ZU_VEX_NODE_DOWN_REASON_STOPPED = 3,
  ZU_VEX_NODE_DOWN_REASON_FORCE_DOWN = 4,
} zu_vex_node_down_reason_t;

/** One node of the cluster; a linked list. */
typedef struct zu_vex_node_info_t {
  zu_vex_node_num_t number;
  zu_vex_node_id_t id;
  char* p_name;
  zu_vex_node_status_t status;
  zu_vex_site_id_t site_id;
  zu_vex_site_num_t site_number;
  zu_vex_cfg_chg_op_t cfg_op;
  struct zu_vex_node_info_t* p_next;
  zu_vex_node_down_reason_t node_down_reason;
} zu_vex_node_info_t;

typedef uint32_t zu_vex_site_policy_t;

/** A site. */
typedef struct zu_vex_site_info_t {
  zu_vex_site_id_t id;
  zu_vex_site_num_t number;
  uint32_t priority;
} zu_vex_site_info_t;

struct zu_evm_event_metadata_t;

/*
 * Each query returns 0 and hands out what it found, or another value and leaves the output alone. A platform without
 * cluster services yields -1. An empty list is null. What is handed out belongs to the library, whole, until it gives
 * it back with the function of its kind below. It sets and clears ZU_VEX_INTF_ALIAS in it. A list ends with a null
 * p_next; of one that does not, 393,408 addresses or 32,784 nodes are looked at.
 *
 * Records of clusters and nodes come back at once, and so do interfaces when the table that they are for is built. Boot
 * addresses, and the interfaces of a start, are kept until boot addresses are read anew or the next start; those of a
 * start that failed never come back, nor does the list of interfaces that a client moves to VEX mode with. What the
 * library copies is never given back here.
 */
int zu_vex_get_cluster_info(zu_vex_cluster_info_t** info);

/** All nodes of the cluster, this one included. */
int zu_vex_get_node_info(zu_vex_node_info_t** list);

/** The same, as it is once what the notification tells of has happened. */
int zu_vex_get_node_info_after_event(const struct zu_evm_event_metadata_t* event, zu_vex_node_info_t** list);

/** The interface addresses of all nodes. */
int zu_vex_get_net_intf_info(zu_vex_net_intf_info_t** list);

/** The same, as it is once what the notification tells of has happened. */
int zu_vex_get_net_intf_info_after_event(const struct zu_evm_event_metadata_t* event, zu_vex_net_intf_info_t** list);

/** The addresses that the nodes start with. */
int zu_vex_get_boot_addrs(zu_vex_net_intf_info_t** list);

/* Each releases a record or a whole list with everything in it; null is nothing. None is a point of cancellation. */
void zu_vex_free_cluster_info(zu_vex_cluster_info_t* info);
void zu_vex_free_node_info(zu_vex_node_info_t* list);
void zu_vex_free_net_intf_info(zu_vex_net_intf_info_t* list);

#ifdef __cplusplus
}
#endif

#endif
