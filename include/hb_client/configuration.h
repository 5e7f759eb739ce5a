/* The configuration of the cluster: nodes, adapters, networks and sites, as loaded at start-up and on updates. */
#ifndef HB_CLIENT_CONFIGURATION_H
#define HB_CLIENT_CONFIGURATION_H

#include <stddef.h>

#include "hb_client/types.h"

HB_BEGIN_DECLS

/** One configured adapter. */
typedef struct Hb_Adapter {
  Hb_IP_address6 Hb_ip_address;
  Hb_Network_Number Hb_network;
  Hb_Adapter_Type Hb_adapter_type;
  Hb_Adapter_Number Hb_adapter_num;
  Hb_Entity_State Hb_state;
} Hb_Adapter;

/** One network slot. */
typedef struct Hb_Network {
  Hb_Network_Name Hb_network_name;
  Hb_Network_Type Hb_network_type;
} Hb_Network;

/** One site. */
typedef struct Hb_Site {
  Hb_Site_Number Hb_site_number;
  Hb_Entity_State Hb_state;
} Hb_Site;

/** One configured node. */
typedef struct Hb_Node_config_state {
  Hb_Node_Number node_num;
  Hb_Entity_State state;
  Hb_Entity_State_Reason reason;
} Hb_Node_config_state;

HB_STATIC_ASSERT(sizeof(Hb_Adapter) == 64, "adapters are 64 bytes");
HB_STATIC_ASSERT(offsetof(Hb_Adapter, Hb_network) == 16, "network number at 16");
HB_STATIC_ASSERT(offsetof(Hb_Adapter, Hb_adapter_type) == 18, "adapter type at 18");
HB_STATIC_ASSERT(offsetof(Hb_Adapter, Hb_adapter_num) == 56, "adapter number at 56");
HB_STATIC_ASSERT(offsetof(Hb_Adapter, Hb_state) == 60, "adapter state at 60");
HB_STATIC_ASSERT(sizeof(Hb_Network) == 86, "networks are 86 bytes");
HB_STATIC_ASSERT(offsetof(Hb_Network, Hb_network_type) == 70, "network type at 70");
HB_STATIC_ASSERT(sizeof(Hb_Node_config_state) == 12, "node states are 12 bytes");
HB_STATIC_ASSERT(sizeof(Hb_Site) == 8, "sites are 8 bytes");
HB_STATIC_ASSERT(offsetof(Hb_Site, Hb_state) == 4, "site state at 4");

/*
 * Every query starts the client when it is not running, and fails as hb_init() does when that fails. A null output
 * pointer is `HB_EINVAL`. On any other failure an output is written only where it is said so. "Unused slots" are
 * network numbers below the adapters per node whose name is empty; numbers are checked against that limit.
 *
 * The first/next pairs keep their place in the cursor, which the first call sets and the next call moves on; at the
 * end they fail with `HB_ENOMORE`, store the "none" value and leave the cursor, so that a next call keeps failing.
 */

/** Number of configured nodes: those that have a configured adapter, and in VEX mode all nodes of the cluster. */
HB_API Hb_Rc hb_get_number_of_configured_nodes(int* nodes);

/** Number of configured adapters. */
HB_API Hb_Rc hb_get_number_of_configured_adapters(int* adapters);

/** Number of configured networks. */
HB_API Hb_Rc hb_get_number_of_configured_networks(int* networks);

/** Number of configured sites; 0, as no source of sites exists. */
HB_API Hb_Rc hb_get_number_of_configured_sites(int* sites);

/** Number of the node that this process runs on. */
HB_API Hb_Rc hb_get_my_node_number(Hb_Node_Number* node);

/**
 * The adapter in a slot of a node.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (node or offset out of range) or `HB_ENOADAPTER`.
 */
HB_API Hb_Rc hb_get_adapter_number_by_node_number(Hb_Node_Number node, int offset, Hb_Adapter_Number* adapter);

/**
 * The node that an adapter belongs to.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (number out of range) or `HB_ENOADAPTER`.
 */
HB_API Hb_Rc hb_get_node_number_by_adapter_number(Hb_Adapter_Number adapter, Hb_Node_Number* node);

/**
 * Number of configured adapters of one node.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (number out of range) or `HB_ENONODE`.
 */
HB_API Hb_Rc hb_get_number_of_configured_adapters_in_node(Hb_Node_Number node_num, int* adapters);

/**
 * The first adapter of the configuration with that address, all 16 bytes compared.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_ENOADAPTER`; the output is then `HB_NO_ADAPTER`.
 */
HB_API Hb_Rc hb_get_adapter_number_by_address(Hb_IP_address6 address, Hb_Adapter_Number* adapter);

/**
 * An adapter's address.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (number out of range) or `HB_ENOADAPTER`.
 */
HB_API Hb_Rc hb_get_adapter_address_by_number(Hb_Adapter_Number adapter, Hb_IP_address6* address);

/**
 * An adapter's type.
 *
 * @param adapter_type at least 36 bytes; always terminated.
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (number out of range) or `HB_ENOADAPTER`.
 */
HB_API Hb_Rc hb_get_adapter_type_by_number(Hb_Adapter_Number adapter, char* adapter_type);

/**
 * The first network of that name.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_ENONETWORK`; the output is then `HB_NO_NETWORK`.
 */
HB_API Hb_Rc hb_get_network_number_by_name(char* name, Hb_Network_Number* network);

/**
 * A network's name.
 *
 * @param name at least 70 bytes; always terminated.
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (number out of range) or `HB_ENONETWORK` (unused slot).
 */
HB_API Hb_Rc hb_get_network_name_by_number(Hb_Network_Number network, char* name);

/**
 * A network's type; normally empty for an unused slot.
 *
 * @param type at least 16 bytes; always terminated.
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (number out of range).
 */
HB_API Hb_Rc hb_get_network_type_by_number(Hb_Network_Number network, char* type);

/** First configured node, ascending, as hb_get_number_of_configured_nodes() counts them; `HB_NO_NODE` and `HB_ENOMORE`
 * at the end. */
HB_API Hb_Rc hb_get_first_configured_node_number(Hb_Node_Number* node, Hb_Cursor* cursor);
/** See hb_get_first_configured_node_number(). */
HB_API Hb_Rc hb_get_next_configured_node_number(Hb_Node_Number* node, Hb_Cursor* cursor);

/** First adapter in the configuration's order; `HB_NO_ADAPTER` and `HB_ENOMORE` at the end. */
HB_API Hb_Rc hb_get_first_configured_adapter_number(Hb_Adapter_Number* adapter, Hb_Cursor* cursor);
/** See hb_get_first_configured_adapter_number(). */
HB_API Hb_Rc hb_get_next_configured_adapter_number(Hb_Adapter_Number* adapter, Hb_Cursor* cursor);

/**
 * First adapter of a node, ascending; `HB_NO_ADAPTER` and `HB_ENOMORE` at the end.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (node out of range), `HB_ENONODE` or `HB_ENOMORE`.
 */
HB_API Hb_Rc hb_get_first_configured_adapter_in_node(Hb_Node_Number node, Hb_Adapter_Number* adapter,
                                                     Hb_Cursor* cursor);
/** See hb_get_first_configured_adapter_in_node(). */
HB_API Hb_Rc hb_get_next_configured_adapter_in_node(Hb_Node_Number node, Hb_Adapter_Number* adapter, Hb_Cursor* cursor);

/** First network slot in use, ascending; `HB_NO_NETWORK` and `HB_ENOMORE` at the end. */
HB_API Hb_Rc hb_get_first_configured_network_number(Hb_Network_Number* network, Hb_Cursor* cursor);
/** See hb_get_first_configured_network_number(). */
HB_API Hb_Rc hb_get_next_configured_network_number(Hb_Network_Number* network, Hb_Cursor* cursor);

/**
 * First adapter of a network in the configuration's order; `HB_NO_ADAPTER` and `HB_ENOMORE` at the end.
 *
 * @return `Hb_Success`, or `Hb_Failure` with `HB_EINVAL` (network out of range), `HB_ENONETWORK` (unused slot) or
 * `HB_ENOMORE`.
 */
HB_API Hb_Rc hb_get_first_configured_adapter_in_network(Hb_Network_Number network, Hb_Adapter_Number* adapter,
                                                        Hb_Cursor* cursor);
/** See hb_get_first_configured_adapter_in_network(). */
HB_API Hb_Rc hb_get_next_configured_adapter_in_network(Hb_Network_Number network, Hb_Adapter_Number* adapter,
                                                       Hb_Cursor* cursor);

/** First site; as no source of sites exists it fails at once with `HB_ENOMORE` and `HB_NO_SITE`. */
HB_API Hb_Rc hb_get_first_configured_site_number(Hb_Site_Number* site, Hb_Cursor* cursor);
/** See hb_get_first_configured_site_number(). */
HB_API Hb_Rc hb_get_next_configured_site_number(Hb_Site_Number* site, Hb_Cursor* cursor);

HB_END_DECLS

#endif
