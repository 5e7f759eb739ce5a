/* The record that every event is delivered with, and its accessors. The record belongs to the caller. */
#ifndef HB_CLIENT_GROUP_H
#define HB_CLIENT_GROUP_H

#include <stddef.h>

#include "hb_client/types.h"

HB_BEGIN_DECLS

/** What kind of record an `Hb_Group` is. */
typedef enum Hb_Group_Type HB_ENUM_BASE {
  Hb_Node_Group = 0,
  Hb_Adapter_Group = 1,
  Hb_Diff_Instance_Type = 2,
  Hb_Repository_Disk_Type = 3,
  Hb_Site_Group = 4,
  Hb_Subcluster_Group = 5,
} Hb_Group_Type;

#define HB_NOT_IN_GROUP ((Hb_Incarnation)0xFFFFFFFFU)             /**< list value of an adapter that is no member */
#define HB_DIED_BECAUSE_REMOVED_BIT ((Hb_Incarnation)0x08000000U) /**< flag inside a member's list value */

/** One member, or the group itself, as the accessors report it. */
typedef struct Hb_Adapter_Identifier {
  Hb_Adapter_Number Hb_adapter_number;
  Hb_Incarnation Hb_incarnation;
  Hb_Boolean Hb_died_because_removed; /**< filled by the iteration only */
} Hb_Adapter_Identifier;

typedef Hb_Adapter_Identifier Hb_Group_Identifier;

/** Membership of an adapter group. */
typedef struct Hb_Adapter_Membership_Grp {
  int32_t Hb_num_adapters;
  Hb_Adapter_Number Hb_group_leader;
  Hb_Incarnation Hb_group_incarnation;
  Hb_Incarnation Hb_adapter_list[HB_MAX_ADAPTERS]; /**< by adapter number */
} Hb_Adapter_Membership_Grp;

/** Membership of the node group. */
typedef struct Hb_Node_Membership_Grp {
  int32_t Hb_num_nodes;
  Hb_Boolean Hb_node_list[HB_MAX_NODES]; /**< by node number */
} Hb_Node_Membership_Grp;

/** A sender that runs another configuration instance. */
typedef struct Hb_Diff_Instance_Info {
  Hb_IP_address6 addr;
  Hb_Config_Instance machinesInst;
} Hb_Diff_Instance_Info;

/* The site and sub-cluster records hold 8-byte fields at offsets that are multiples of 4 only. */
#pragma pack(push, 4)

typedef struct node_id_t {
  uint64_t high;
  uint64_t low;
} node_id_t;

typedef struct site_id_t {
  uint64_t high;
  uint64_t low;
} site_id_t;

typedef struct cluster_id_t {
  uint64_t high;
  uint64_t low;
} cluster_id_t;

/** One side of a site event. */
typedef struct Hb_Site_Info {
  node_id_t node_id;
  uint32_t node_number;
  site_id_t site_id;
  uint32_t site_number;
  uint32_t site_priority;
  uint32_t site_policy;
  uint32_t site_merge_flag;
  cluster_id_t cluster_id;
} Hb_Site_Info;

/** One side of a sub-cluster event. */
typedef struct Hb_Subcluster_Info {
  uint32_t num_up_nodes;
  uint32_t* node_numbers; /**< `num_up_nodes` node numbers, released by hb_free_split_info() */
} Hb_Subcluster_Info;

typedef struct Hb_Site_Split_Info {
  Hb_Site_Info local_site;
  Hb_Site_Info remote_site;
} Hb_Site_Split_Info;

typedef struct Hb_Site_Merge_Info {
  uint32_t num_local_up_nodes;
  uint32_t num_remote_up_nodes;
  Hb_Site_Info local_site;
  Hb_Site_Info remote_site;
} Hb_Site_Merge_Info;

typedef struct Hb_Split_Merge_Info {
  Hb_Site_Info local_site;
  Hb_Site_Info remote_site;
  Hb_Subcluster_Info local_subcluster;
  Hb_Subcluster_Info remote_subcluster;
  uint32_t subtype;
} Hb_Split_Merge_Info;

#pragma pack(pop)

/** An event's record: 393,480 bytes, so best kept in static storage or on the heap. */
typedef struct Hb_Group {
  Hb_Group_Type Hb_group_type;
  Hb_Cursor Hb_cursor; /**< position of the first and next calls */
  Hb_Events Hb_events; /**< the event that the record came with */
  Hb_Group_Status Hb_group_status;
  Hb_FFDC_Id Hb_ffdc_id;
  union {
    Hb_Adapter_Membership_Grp Hb_adapter_membership_grp;
    Hb_Node_Membership_Grp Hb_node_membership_grp;
    Hb_Diff_Instance_Info diff_instance_info;
    Hb_Site_Split_Info site_split_info;
    Hb_Site_Merge_Info site_merge_info;
    Hb_Split_Merge_Info split_info;
    Hb_Split_Merge_Info merge_info;
  } Hb_membership_grp_union;
} Hb_Group;

HB_STATIC_ASSERT(sizeof(Hb_Group_Type) == 4, "group types are 4 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Adapter_Identifier) == 12, "identifiers are 12 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Diff_Instance_Info) == 20, "senders of another instance are 20 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Site_Info) == 68, "sites are 68 bytes");
HB_STATIC_ASSERT(offsetof(Hb_Site_Info, node_number) == 16, "node number after the node's identifier");
HB_STATIC_ASSERT(offsetof(Hb_Site_Info, site_id) == 20, "site identifier after the node number");
HB_STATIC_ASSERT(offsetof(Hb_Site_Info, site_number) == 36, "site number after the site's identifier");
HB_STATIC_ASSERT(offsetof(Hb_Site_Info, cluster_id) == 52, "cluster identifier last");
HB_STATIC_ASSERT(sizeof(Hb_Subcluster_Info) == 4 + sizeof(void*), "sub-clusters have no padding");
HB_STATIC_ASSERT(sizeof(Hb_Site_Split_Info) == 136, "site splits are 136 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Site_Merge_Info) == 144, "site merges are 144 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Split_Merge_Info) == 140 + 2 * (4 + sizeof(void*)), "splits and merges have no padding");
HB_STATIC_ASSERT(offsetof(Hb_Split_Merge_Info, local_subcluster) == 136, "sub-clusters after the sites");
HB_STATIC_ASSERT(offsetof(Hb_Group, Hb_cursor) == 4, "cursor at 4");
HB_STATIC_ASSERT(offsetof(Hb_Group, Hb_events) == 8, "events at 8");
HB_STATIC_ASSERT(offsetof(Hb_Group, Hb_group_status) == 12, "status at 12");
HB_STATIC_ASSERT(offsetof(Hb_Group, Hb_ffdc_id) == 16, "failure-data identifier at 16");
HB_STATIC_ASSERT(offsetof(Hb_Group, Hb_membership_grp_union) == 60, "membership at 60");
HB_STATIC_ASSERT(offsetof(Hb_Adapter_Membership_Grp, Hb_adapter_list) == 12, "adapter list after three words");
HB_STATIC_ASSERT(offsetof(Hb_Node_Membership_Grp, Hb_node_list) == 4, "node list after its count");
HB_STATIC_ASSERT(sizeof(Hb_Group) == 393480, "groups are 393,480 bytes");

/*
 * Every accessor below also fails with `HB_EINVAL` when a pointer is null, where it is not said otherwise. Those that
 * start the client first fail as hb_init() does when that fails; the others work on the record alone.
 */

/**
 * The group's identity: `Hb_adapter_number` is its leader, `Hb_incarnation` its incarnation.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EGROUPTYPE` (no adapter group) or `HB_EWRONGSTATE` (the event is no
 * new group). Starts the client.
 */
HB_API Hb_Rc hb_get_group_id(Hb_Group* group, Hb_Adapter_Identifier* id);

/**
 * The group's leader with the leader's own list value, the died-because-removed bit included; a leader that the list
 * has no place for is reported with `HB_NOT_IN_GROUP`.
 *
 * @return as hb_get_group_id(). Starts the client.
 */
HB_API Hb_Rc hb_get_group_leader_id(Hb_Group* group, Hb_Adapter_Identifier* id);

/**
 * Whether a new group is stable.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EWRONGSTATE` (the event is no new group). Starts the client.
 */
HB_API Hb_Rc hb_get_group_status(Hb_Group* group, Hb_Group_Status* status);

/**
 * One adapter of the group: its number and its list value as it stands, the died-because-removed bit included.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (number not below the cluster's limit), `HB_EGROUPTYPE` or
 * `HB_ENOADAPTER` (no member). Starts the client.
 */
HB_API Hb_Rc hb_get_adapter_id(Hb_Group* group, Hb_Adapter_Number adapter, Hb_Adapter_Identifier* id);

/**
 * Whether an adapter is a member.
 *
 * @return `Hb_True` or `Hb_False`; `Hb_False` also with `HB_EINVAL` or `HB_EGROUPTYPE`.
 */
HB_API Hb_Boolean hb_is_adapter_in_group(Hb_Group* group, Hb_Adapter_Number adapter);

/**
 * Whether a node is a member: the value that the record holds for it.
 *
 * @return that value; `Hb_False` also with `HB_EINVAL` or `HB_EGROUPTYPE`.
 */
HB_API Hb_Boolean hb_is_node_in_group(Hb_Group* group, Hb_Node_Number node);

/**
 * The first member of an adapter group; hb_get_next_adapter() the one after the last that was returned.
 *
 * The incarnation comes without the died-because-removed bit, which has its own field.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EGROUPTYPE` or, at the end, `HB_ENOMORE`; the output is then
 * untouched. Starts the client.
 */
HB_API Hb_Rc hb_get_first_adapter(Hb_Group* group, Hb_Adapter_Identifier* id);
/** See hb_get_first_adapter(). */
HB_API Hb_Rc hb_get_next_adapter(Hb_Group* group, Hb_Adapter_Identifier* id);

/**
 * The first member of a node group; hb_get_next_node() the one after the last that was returned.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EGROUPTYPE` or, at the end, `HB_ENOMORE` and `HB_NO_NODE` as the
 * output. Starts the client.
 */
HB_API Hb_Rc hb_get_first_node(Hb_Group* group, Hb_Node_Number* node);
/** See hb_get_first_node(). */
HB_API Hb_Rc hb_get_next_node(Hb_Group* group, Hb_Node_Number* node);

/**
 * Whether the adapter left because it was removed from the configuration.
 *
 * @return the identifier's flag, or 3 (the value of `Hb_Failure`) when the client cannot be started or the pointer is
 * null.
 */
HB_API Hb_Boolean hb_has_adapter_died_because_removed(Hb_Adapter_Identifier* id);

/** The identifier's incarnation; `HB_NOT_IN_GROUP` for a null pointer. */
HB_API Hb_Incarnation hb_adapter_incarnation(Hb_Adapter_Identifier* id);

/**
 * The failure-data identifier of a death, a join or a failure-data event: 43 bytes as the daemon sent them. They need
 * not hold a terminator: print at most 43 characters.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EWRONGSTATE` (another event, or none stored). Starts the client.
 */
HB_API Hb_Rc hb_get_FFDC_id(Hb_Group* group, Hb_FFDC_Id* ffdc_id);

/**
 * The sender of another configuration instance.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (null pointer) or `HB_EWRONGSTATE` (another event). Starts
 * the client.
 */
HB_API Hb_Rc hb_get_different_instance_sender(Hb_Group* group, Hb_Diff_Instance_Info* sender);

/** The record of a site split, 136 bytes as they stand, whatever the group's kind. */
HB_API Hb_Rc hb_get_site_split_info(Hb_Group* group, Hb_Site_Split_Info* info);

/** The record of a site merge, 144 bytes as they stand, whatever the group's kind. */
HB_API Hb_Rc hb_get_site_merge_info(Hb_Group* group, Hb_Site_Merge_Info* info);

/**
 * The record of a sub-cluster split, 164 bytes as they stand, whatever the group's kind. The arrays of node numbers
 * are shared with the group: release them once, with hb_free_split_info() on one of the two.
 */
HB_API Hb_Rc hb_get_split_info(Hb_Group* group, Hb_Split_Merge_Info* p_split_info);
/** The same function as hb_get_split_info(). */
HB_API Hb_Rc hb_get_merge_info(Hb_Group* group, Hb_Split_Merge_Info* p_split_info);

/**
 * Releases the node numbers of both sides and nulls their pointers; a second call does nothing. Only for the record of
 * a split or merge event: in a copy from another kind of group the pointers are other bytes.
 */
HB_API void hb_free_split_info(Hb_Split_Merge_Info* p_split_info);
/** The same function as hb_free_split_info(). */
HB_API void hb_free_merge_info(Hb_Split_Merge_Info* p_split_info);

/**
 * State of a configured node and why, from the configuration as it stands.
 *
 * @return `Hb_Success`, or `Hb_Failure` without an error number for a node that is not configured.
 */
HB_API Hb_Rc hb_get_node_status_reason(Hb_Node_Number node_number, Hb_Entity_State* node_status,
                                       Hb_Entity_State_Reason* node_reason);

/** Does nothing and succeeds; kept for programs that call it. */
HB_API Hb_Rc hb_site_down(Hb_Group* group);
/** The same function as hb_site_down(). */
HB_API Hb_Rc hb_site_merge(Hb_Group* group);

HB_END_DECLS

#endif
