/* What a caller wants to hear about: subscription groups, and registering them under a name. */
#ifndef HB_CLIENT_SUBSCRIPTION_H
#define HB_CLIENT_SUBSCRIPTION_H

#include <stddef.h>

#include "hb_client/types.h"

HB_BEGIN_DECLS

/** What the members of a subscription group are. */
typedef enum Hb_Subscription_Type HB_ENUM_BASE {
  Hb_Node_Subscription = 0,
  Hb_All_Nodes_Subscription = 1,
  Hb_Adapter_Subscription = 2,
  Hb_All_Adapters_Subscription = 3,
  Hb_Empty_Subscription = 4,
  Hb_Network_Subscription = 5,
  Hb_Diff_Inst_Num_Subscription = 6,
  Hb_Site_Subscription = 7,
  Hb_All_Sites_Subscription = 8,
  Hb_Split_Merge_Subscription = 9,
} Hb_Subscription_Type;

enum {
  HB_ADAPTER_SET_LENGTH = 12294, /**< bytes of a set of adapter numbers */
  HB_NODE_SET_LENGTH = 257,      /**< bytes of a set of node numbers */
  HB_SITE_SET_LENGTH = 1         /**< bytes of a set of site numbers */
};

/* In every set member i is the bit 7 - i % 8 of byte i / 8: the most significant bit of a byte comes first. */

typedef struct Hb_Adapter_Subscription_Grp {
  int32_t Hb_num_adapters; /**< members in the set */
  uint8_t Hb_adapter_list[HB_ADAPTER_SET_LENGTH];
} Hb_Adapter_Subscription_Grp;

typedef struct Hb_Node_Subscription_Grp {
  int32_t Hb_num_nodes; /**< members in the set */
  uint8_t Hb_node_list[HB_NODE_SET_LENGTH];
} Hb_Node_Subscription_Grp;

typedef struct Hb_Site_Subscription_Grp {
  int32_t Hb_num_sites; /**< members in the set */
  uint8_t Hb_site_list[HB_SITE_SET_LENGTH];
} Hb_Site_Subscription_Grp;

/** A subscription, sent to the daemon byte for byte. The record is the caller's; the library keeps no pointer to it. */
typedef struct Hb_Subscription_Group {
  Hb_Subscription_Type Hb_subscription_type;
  Hb_Cursor Hb_cursor;         /**< position of the first and next calls */
  Hb_Events Hb_events;         /**< written by hb_subscribe() */
  Hb_Name Hb_name;             /**< written by hb_subscribe() */
  Hb_Network_Number Hb_netnum; /**< written by nobody */
  union {
    Hb_Adapter_Subscription_Grp Hb_adapter_subscription_grp;
    Hb_Node_Subscription_Grp Hb_node_subscription_grp;
    Hb_Site_Subscription_Grp Hb_site_subscription_grp;
  } Hb_subscription_grp_union;
} Hb_Subscription_Group;

HB_STATIC_ASSERT(sizeof(Hb_Subscription_Type) == 4, "subscription types are 4 bytes");
HB_STATIC_ASSERT(offsetof(Hb_Subscription_Group, Hb_cursor) == 4, "cursor at 4");
HB_STATIC_ASSERT(offsetof(Hb_Subscription_Group, Hb_events) == 8, "events at 8");
HB_STATIC_ASSERT(offsetof(Hb_Subscription_Group, Hb_name) == 12, "name at 12");
HB_STATIC_ASSERT(offsetof(Hb_Subscription_Group, Hb_netnum) == 44, "network number at 44");
HB_STATIC_ASSERT(offsetof(Hb_Subscription_Group, Hb_subscription_grp_union) == 48, "members at 48");
HB_STATIC_ASSERT(offsetof(Hb_Adapter_Subscription_Grp, Hb_adapter_list) == 4, "adapter set after its count");
HB_STATIC_ASSERT(offsetof(Hb_Node_Subscription_Grp, Hb_node_list) == 4, "node set after its count");
HB_STATIC_ASSERT(offsetof(Hb_Site_Subscription_Grp, Hb_site_list) == 4, "site set after its count");
HB_STATIC_ASSERT(sizeof(Hb_Subscription_Group) == 12348, "subscriptions are 12,348 bytes");

/*
 * All functions but hb_subscribe() and hb_unsubscribe() start the client when it is not running, and fail as hb_init()
 * does when that fails. A null pointer is `HB_EINVAL`. Numbers are checked before anything changes.
 */

/** Makes the group empty; its members are cleared when the first one is added. */
HB_API Hb_Rc hb_empty_subscription_group(Hb_Subscription_Group* group);

/** Makes it a group of every configured adapter. */
HB_API Hb_Rc hb_add_all_adapters_to_subscription_group(Hb_Subscription_Group* group);

/** Makes it a group of every configured node, as hb_get_number_of_configured_nodes() counts them. */
HB_API Hb_Rc hb_add_all_nodes_to_subscription_group(Hb_Subscription_Group* group);

/** Makes it a group of every configured site. */
HB_API Hb_Rc hb_add_all_sites_to_subscription_group(Hb_Subscription_Group* group);

/**
 * Adds one adapter. One that is a member already changes nothing and succeeds.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (number out of range), `HB_ENOADAPTER`, or `HB_ESUBSCRIBE`
 * (a group of nodes or sites).
 */
HB_API Hb_Rc hb_add_adapter_to_subscription_group(Hb_Subscription_Group* group, Hb_Adapter_Number adapter);
/** Removes one adapter; otherwise as hb_add_adapter_to_subscription_group(). */
HB_API Hb_Rc hb_remove_adapter_from_subscription_group(Hb_Subscription_Group* group, Hb_Adapter_Number adapter);

/**
 * Adds every adapter of one network to an empty group. A second network does not fit.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (number out of range), `HB_ENONETWORK` (unused slot), or
 * `HB_ESUBSCRIBE` (a group of nodes, adapters, sites or a network).
 */
HB_API Hb_Rc hb_add_network_to_subscription_group(Hb_Subscription_Group* group, Hb_Network_Number network);
/** Removes every adapter of one network; otherwise as hb_add_network_to_subscription_group(). */
HB_API Hb_Rc hb_remove_network_from_subscription_group(Hb_Subscription_Group* group, Hb_Network_Number network);

/**
 * Adds one node. One that is a member already changes nothing and succeeds.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (number out of range), `HB_ENONODE`, or `HB_ESUBSCRIBE` (a
 * group of adapters or sites).
 */
HB_API Hb_Rc hb_add_node_to_subscription_group(Hb_Subscription_Group* group, Hb_Node_Number node);
/** Removes one node; otherwise as hb_add_node_to_subscription_group(). */
HB_API Hb_Rc hb_remove_node_from_subscription_group(Hb_Subscription_Group* group, Hb_Node_Number node);

/**
 * Adds one site. One that is a member already changes nothing and succeeds.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (number out of range), `HB_ESITESUB` (not configured), or
 * `HB_ESUBSCRIBE` (a group of nodes or adapters).
 */
HB_API Hb_Rc hb_add_site_to_subscription_group(Hb_Subscription_Group* group, Hb_Site_Number site);
/** Removes one site; otherwise as hb_add_site_to_subscription_group(). */
HB_API Hb_Rc hb_remove_site_from_subscription_group(Hb_Subscription_Group* group, Hb_Site_Number site);

/**
 * First member of a group of adapters, ascending; the place is kept in the group.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_ESUBSCRIBE` (another type; all-adapters and network groups cannot be
 * walked) or, at the end, `HB_ENOMORE` with `HB_NO_ADAPTER`.
 */
HB_API Hb_Rc hb_get_first_subscription_adapter(Hb_Subscription_Group* group, Hb_Adapter_Number* adapter);
/** See hb_get_first_subscription_adapter(). */
HB_API Hb_Rc hb_get_next_subscription_adapter(Hb_Subscription_Group* group, Hb_Adapter_Number* adapter);

/**
 * First member of a group of nodes, ascending; the place is kept in the group.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_ESUBSCRIBE` (another type) or, at the end, `HB_ENOMORE` with
 * `HB_NO_NODE`.
 */
HB_API Hb_Rc hb_get_first_subscription_node(Hb_Subscription_Group* group, Hb_Node_Number* node);
/** See hb_get_first_subscription_node(). */
HB_API Hb_Rc hb_get_next_subscription_node(Hb_Subscription_Group* group, Hb_Node_Number* node);

/**
 * First member of a group of sites, ascending; the place is kept in the group.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_ESUBSCRIBE` (another type) or, at the end, `HB_ENOMORE` with
 * `HB_NO_SITE`.
 */
HB_API Hb_Rc hb_get_first_subscription_site(Hb_Subscription_Group* group, Hb_Site_Number* site);
/** See hb_get_first_subscription_site(). */
HB_API Hb_Rc hb_get_next_subscription_site(Hb_Subscription_Group* group, Hb_Site_Number* site);

/**
 * Registers the group under a name.
 *
 * Name and events are written into the record. The events 0x100, 0x60 and 0x3000, each alone, subscribe to senders of
 * another instance, to all sites, and to splits and merges, whatever the members; the record is left with the types
 * 6, 7 and 9. A group of every adapter or node is sent as "all" and left as it was.
 *
 * @param name at most 31 characters are kept.
 * @param events bits within `HB_EVENT_SUBSCRIBABLE`, at least one.
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (events), `HB_ESUBSCRIBE` (empty group), a send error
 * (`HB_ESENDFAULT` to `HB_ESEND`, `HB_EDAEMONGONE`), `HB_ECOMM` (client not started), or in VEX mode
 * `HB_ENOGROUPHANDLER` and `HB_EEVENTPIPE`.
 */
HB_API Hb_Rc hb_subscribe(char* name, Hb_Subscription_Group* group, int events);

/**
 * Withdraws a name.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (null), a send error or `HB_ECOMM` (client not started). The
 * daemon does not answer, so a name that it does not know is no failure.
 */
HB_API Hb_Rc hb_unsubscribe(char* name);

HB_END_DECLS

#endif
