/* libzu_vex: the operating system's event monitors, files that become readable when something has happened. */
#ifndef ZU_EVM_H
#define ZU_EVM_H

#include <stdint.h>

#include "zu_vex.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef enum zu_evm_event_type_t ZU_VEX_ENUM_BASE {
  ZU_EVM_EVENT_DOWN = 0,
  ZU_EVM_EVENT_UP = 1,
  ZU_EVM_EVENT_ADD = 2,
  ZU_EVM_EVENT_DELETE = 3,
  ZU_EVM_ADDRESS_ADD = 4,
  ZU_EVM_ADDRESS_DELETE = 5,
  ZU_EVM_ADDRESS_CHG = 6,
  ZU_EVM_SITE_ADD = 7,
  ZU_EVM_SITE_DELETE = 8,
  ZU_EVM_SITE_UP = 9,
  ZU_EVM_SITE_DOWN = 10,
  ZU_EVM_SITE_MODIFY = 11,
  ZU_EVM_CAP_UP = 12,
  ZU_EVM_HOSTNAME_CHG = 13,
  ZU_EVM_SUBCLUSTER_SPLIT = 14,
  ZU_EVM_SUBCLUSTER_MERGE = 15,
} zu_evm_event_type_t;

typedef enum zu_evm_event_category_t ZU_VEX_ENUM_BASE {
  ZU_EVM_EVENT_CATEGORY_NODE_LIVENESS = 0,
  ZU_EVM_EVENT_CATEGORY_ADAPTER_LIVENESS = 1,
  ZU_EVM_EVENT_CATEGORY_PROCESS_LIVENESS = 2,
  ZU_EVM_EVENT_CATEGORY_NODE_CFG = 3,
  ZU_EVM_EVENT_CATEGORY_ADDR_CFG = 4,
  ZU_EVM_EVENT_CATEGORY_IP_CHANGE = 5,
  ZU_EVM_EVENT_CATEGORY_NODE_LIST = 6,
  ZU_EVM_EVENT_CATEGORY_REPOS_DISK = 7,
  ZU_EVM_EVENT_CATEGORY_SITE_CFG = 8,
  ZU_EVM_EVENT_CATEGORY_CAP_UP = 9,
} zu_evm_event_category_t;

typedef enum zu_evm_node_down_event_reason_type_t ZU_VEX_ENUM_BASE {
  ZU_EVM_NODE_DOWN_LINK_DOWN = 0,
  ZU_EVM_NODE_DOWN_SHUTDOWN = 1,
  ZU_EVM_NODE_DOWN_STOPPED = 2,
  ZU_EVM_NODE_DOWN_FORCED_DOWN = 3,
} zu_evm_node_down_event_reason_type_t;

typedef enum zu_evm_site_down_event_reason_type_t ZU_VEX_ENUM_BASE {
  ZU_EVM_SITE_REASON_LINK_DOWN = 0,
  ZU_EVM_SITE_REASON_RESYNC_SITES = 1,
} zu_evm_site_down_event_reason_type_t;

typedef enum zu_evm_splitmerge_event_subtype_t ZU_VEX_ENUM_BASE {
  ZU_EVM_SPLITMERGE_EVENT_SUBTYPE_LOCAL = 0,
  ZU_EVM_SPLITMERGE_EVENT_SUBTYPE_REMOTE = 1,
} zu_evm_splitmerge_event_subtype_t;

typedef zu_vex_uuid_t zu_evm_node_id_t;
typedef zu_vex_uuid_t zu_evm_site_id_t;
typedef zu_vex_uuid_t zu_evm_cluster_id_t;

/** A node went down or came up. */
typedef struct zu_evm_event_node_liveness_t {
  zu_evm_event_type_t event_type;
  uint32_t node_number;
  uint64_t node_id;
  uint64_t sequence_number;
  uint32_t reason_number;
  zu_evm_node_down_event_reason_type_t node_down_reason;
} zu_evm_event_node_liveness_t;

/** The cluster fell into two, or came together again. */
typedef struct zu_evm_event_split_merge_cfg_t {
  zu_evm_event_type_t event_type;
  zu_evm_splitmerge_event_subtype_t event_subtype;
  uint32_t node_number;
  zu_evm_node_id_t node_id;
  zu_evm_site_id_t site_id;
  uint32_t site_priority;
  uint32_t site_number;
  uint64_t sequence_number;
  uint32_t reason_number;
  uint32_t num_local_node_up;
  uint32_t num_remote_node_up;
  uint32_t* local_node_numbers;  /**< `num_local_node_up` of them */
  uint32_t* remote_node_numbers; /**< `num_remote_node_up` of them */
} zu_evm_event_split_merge_cfg_t;

/** What the node-liveness monitor delivers; the result of the read says which. */
typedef union zu_evm_event_node_or_split_merge_cfg_t {
  zu_evm_event_node_liveness_t* p_event_node_liveness;
  zu_evm_event_split_merge_cfg_t* p_event_split_merge_cfg;
} zu_evm_event_node_or_split_merge_cfg_t;

/** An interface went down or came up, or is there now or no more. */
typedef struct zu_evm_event_adapter_liveness_t {
  zu_evm_event_type_t event_type;
  uint32_t node_number;
  uint64_t node_id;
  uint64_t sequence_number;
  uint32_t reason_number;
  char* p_interface_name;
} zu_evm_event_adapter_liveness_t;

/** An address of an interface came, went or changed. */
typedef struct zu_evm_event_ip_change_t {
  zu_evm_event_type_t event_type;
  uint32_t node_number;
  uint64_t node_id;
  uint64_t sequence_number;
  uint32_t reason_number;
  char* p_interface_name;
  zu_vex_IP_address6_t ip_addr;
} zu_evm_event_ip_change_t;

/** An address of the cluster's configuration; a linked list. */
typedef struct zu_evm_event_addr_cfg_t {
  zu_evm_event_type_t event_type;
  uint32_t node_number;
  uint64_t node_id;
  uint64_t sequence_number;
  uint32_t reason_number;
  char* intf_name;
  char* ipaddr;
  char* netmask;
  struct zu_evm_event_addr_cfg_t* next;
} zu_evm_event_addr_cfg_t;

/** A node is in the cluster now or no more; a linked list. */
typedef struct zu_evm_event_node_list_t {
  zu_evm_event_type_t event_type;
  uint32_t node_number;
  zu_evm_node_id_t node_id;
  uint64_t sequence_number;
  uint32_t reason_number;
  char* node_name;
  struct zu_evm_event_node_list_t* next;
} zu_evm_event_node_list_t;

/** A watched process started or ended. */
typedef struct zu_evm_event_process_liveness_t {
  zu_evm_event_type_t event_type;
  int32_t process_id;
  uint64_t sequence_number;
  uint32_t reason_number;
  char* process_name;
} zu_evm_event_process_liveness_t;

/** The cluster was set up anew. */
typedef struct zu_evm_event_cluster_reconfig_t {
  zu_evm_event_type_t event_type;
  uint32_t node_number;
  zu_evm_cluster_id_t cluster_id;
  uint64_t sequence_number;
  uint32_t reason_number;
} zu_evm_event_cluster_reconfig_t;

/** The disk that keeps the cluster's configuration came or went. */
typedef struct zu_evm_event_repository_disk_t {
  zu_evm_event_type_t event_type;
  uint32_t node_number;
  uint64_t sequence_number;
  uint32_t reason_number;
  char* disk_name;
} zu_evm_event_repository_disk_t;

/** A site came, went, or is another one now; a linked list. */
typedef struct zu_evm_event_site_cfg_t {
  zu_evm_event_type_t event_type;
  uint32_t node_number;
  zu_evm_node_id_t node_id;
  uint32_t site_number;
  zu_evm_site_id_t site_id;
  zu_evm_cluster_id_t cluster_id;
  uint64_t sequence_number;
  uint32_t reason_number;
  uint32_t site_priority;
  uint32_t site_policy;
  uint32_t num_local_node_up;
  uint32_t num_remote_node_up;
  zu_evm_site_down_event_reason_type_t event_reason;
  char* node_name;
  char* site_name;
  struct zu_evm_event_site_cfg_t* next;
} zu_evm_event_site_cfg_t;

/** A notification and its kind, as it is handed on to the queries that look behind it. */
typedef struct zu_evm_event_metadata_t {
  zu_evm_event_category_t category;
  union {
    int32_t i32;
    int64_t i64;
    uint32_t u32;
    uint64_t u64;
    float f32;
    double f64;
    zu_evm_event_node_liveness_t* p_node_liveness;
    zu_evm_event_adapter_liveness_t* p_adapter_liveness;
    zu_evm_event_process_liveness_t* p_process_liveness;
    zu_evm_event_ip_change_t* p_ip_change;
    zu_evm_event_addr_cfg_t* p_addr_cfg;
    zu_evm_event_node_list_t* p_node_list;
    zu_evm_event_repository_disk_t* p_repository_disk;
    zu_evm_event_site_cfg_t* p_site_cfg;
    zu_evm_event_cluster_reconfig_t* p_cluster_reconfig;
    void* p_cap_up;
    void* p_node_cfg;
  } event;
} zu_evm_event_metadata_t;

/* Where what the platform hands out has its fields. */
#define ZU_EVM_SIZE(type, size) static_assert(sizeof(type) == (size), #type)
#define ZU_EVM_FIELD(type, field, offset) static_assert(offsetof(type, field) == (offset), #type "." #field)

ZU_EVM_SIZE(zu_evm_event_node_liveness_t, 32);
ZU_EVM_FIELD(zu_evm_event_node_liveness_t, event_type, 0);
ZU_EVM_FIELD(zu_evm_event_node_liveness_t, node_number, 4);
ZU_EVM_FIELD(zu_evm_event_node_liveness_t, node_id, 8);
ZU_EVM_FIELD(zu_evm_event_node_liveness_t, sequence_number, 16);
ZU_EVM_FIELD(zu_evm_event_node_liveness_t, reason_number, 24);
ZU_EVM_FIELD(zu_evm_event_node_liveness_t, node_down_reason, 28);

ZU_EVM_SIZE(zu_evm_event_split_merge_cfg_t, 96);
ZU_EVM_FIELD(zu_evm_event_split_merge_cfg_t, event_type, 0);
ZU_EVM_FIELD(zu_evm_event_split_merge_cfg_t, event_subtype, 4);
ZU_EVM_FIELD(zu_evm_event_split_merge_cfg_t, node_number, 8);
ZU_EVM_FIELD(zu_evm_event_split_merge_cfg_t, node_id, 16);
ZU_EVM_FIELD(zu_evm_event_split_merge_cfg_t, site_id, 32);
ZU_EVM_FIELD(zu_evm_event_split_merge_cfg_t, site_priority, 48);
ZU_EVM_FIELD(zu_evm_event_split_merge_cfg_t, site_number, 52);
ZU_EVM_FIELD(zu_evm_event_split_merge_cfg_t, sequence_number, 56);
ZU_EVM_FIELD(zu_evm_event_split_merge_cfg_t, reason_number, 64);
ZU_EVM_FIELD(zu_evm_event_split_merge_cfg_t, num_local_node_up, 68);
ZU_EVM_FIELD(zu_evm_event_split_merge_cfg_t, num_remote_node_up, 72);
ZU_EVM_FIELD(zu_evm_event_split_merge_cfg_t, local_node_numbers, 80);
ZU_EVM_FIELD(zu_evm_event_split_merge_cfg_t, remote_node_numbers, 88);

ZU_EVM_SIZE(zu_evm_event_adapter_liveness_t, 40);
ZU_EVM_FIELD(zu_evm_event_adapter_liveness_t, event_type, 0);
ZU_EVM_FIELD(zu_evm_event_adapter_liveness_t, node_number, 4);
ZU_EVM_FIELD(zu_evm_event_adapter_liveness_t, node_id, 8);
ZU_EVM_FIELD(zu_evm_event_adapter_liveness_t, sequence_number, 16);
ZU_EVM_FIELD(zu_evm_event_adapter_liveness_t, reason_number, 24);
ZU_EVM_FIELD(zu_evm_event_adapter_liveness_t, p_interface_name, 32);

ZU_EVM_SIZE(zu_evm_event_ip_change_t, 56);
ZU_EVM_FIELD(zu_evm_event_ip_change_t, event_type, 0);
ZU_EVM_FIELD(zu_evm_event_ip_change_t, node_number, 4);
ZU_EVM_FIELD(zu_evm_event_ip_change_t, node_id, 8);
ZU_EVM_FIELD(zu_evm_event_ip_change_t, sequence_number, 16);
ZU_EVM_FIELD(zu_evm_event_ip_change_t, reason_number, 24);
ZU_EVM_FIELD(zu_evm_event_ip_change_t, p_interface_name, 32);
ZU_EVM_FIELD(zu_evm_event_ip_change_t, ip_addr, 40);

ZU_EVM_SIZE(zu_evm_event_addr_cfg_t, 64);
ZU_EVM_FIELD(zu_evm_event_addr_cfg_t, event_type, 0);
ZU_EVM_FIELD(zu_evm_event_addr_cfg_t, node_number, 4);
ZU_EVM_FIELD(zu_evm_event_addr_cfg_t, node_id, 8);
ZU_EVM_FIELD(zu_evm_event_addr_cfg_t, sequence_number, 16);
ZU_EVM_FIELD(zu_evm_event_addr_cfg_t, reason_number, 24);
ZU_EVM_FIELD(zu_evm_event_addr_cfg_t, intf_name, 32);
ZU_EVM_FIELD(zu_evm_event_addr_cfg_t, ipaddr, 40);
ZU_EVM_FIELD(zu_evm_event_addr_cfg_t, netmask, 48);
ZU_EVM_FIELD(zu_evm_event_addr_cfg_t, next, 56);

ZU_EVM_SIZE(zu_evm_event_metadata_t, 16);
ZU_EVM_FIELD(zu_evm_event_metadata_t, category, 0);
ZU_EVM_FIELD(zu_evm_event_metadata_t, event, 8);

#undef ZU_EVM_SIZE
#undef ZU_EVM_FIELD

enum {
  ZU_EVM_RECORD = 0,               /**< a record was read; the node-liveness monitor has the two below instead */
  ZU_EVM_SPLIT_MERGE_RECORD = 1,   /**< the node-liveness monitor delivered a split or a merge */
  ZU_EVM_NODE_LIVENESS_RECORD = 2, /**< the node-liveness monitor delivered a node */
  ZU_EVM_NOTHING = -16             /**< there is nothing to read */
};

/**
 * Opens a monitor file and arms it.
 *
 * @param path which monitor.
 * @param init_string what to write to it first; may be null.
 * @param descriptor receives a descriptor that becomes readable with each notification. It belongs to the caller, who
 *   closes it.
 * @return 0; -1 when there are no monitors here; or any other value, with `errno` set, when this one could not be
 *   opened. Of the first monitor that a client opens -1 means that it does without any of them; of every other one it
 *   is a failure as well.
 */
int zu_evm_open(const char* path, const char* init_string, int* descriptor);

/*
 * Each reads one notification and never waits. It returns ZU_EVM_RECORD (the node-liveness monitor: one of its two
 * kinds) and hands out a record or a list that the caller gives back with zu_evm_free(); ZU_EVM_NOTHING; or any other
 * value with `errno` set, and leaves the output alone.
 */
int zu_evm_read_node_liveness(int descriptor, zu_evm_event_node_or_split_merge_cfg_t* record);
int zu_evm_read_split_merge(int descriptor, zu_evm_event_split_merge_cfg_t** record);
int zu_evm_read_adapter_liveness(int descriptor, zu_evm_event_adapter_liveness_t** record);
int zu_evm_read_ip_change(int descriptor, zu_evm_event_ip_change_t** record);
int zu_evm_read_node_list(int descriptor, zu_evm_event_node_list_t** list);
int zu_evm_read_process_liveness(int descriptor, zu_evm_event_process_liveness_t** record);
int zu_evm_read_cluster_reconfig(int descriptor, zu_evm_event_cluster_reconfig_t** record);
int zu_evm_read_repository_disk(int descriptor, zu_evm_event_repository_disk_t** record);
int zu_evm_read_site_cfg(int descriptor, zu_evm_event_site_cfg_t** list);

/** Releases what one of the reads handed out, with everything in it; null is nothing. */
void zu_evm_free(void* record);

#ifdef __cplusplus
}
#endif

#endif
