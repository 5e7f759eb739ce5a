/* Source routes, and messages that the daemon routes to other nodes. */
#ifndef HB_CLIENT_ROUTE_H
#define HB_CLIENT_ROUTE_H

#include <sys/uio.h>

#include "hb_client/types.h"

enum { HB_ROUTE_HOPS = 11 /**< addresses in a source route */ };

/** The hops by which a node is reached. */
typedef struct Hb_Source_Route {
  Hb_IP_address6 sr_address[HB_ROUTE_HOPS];
} Hb_Source_Route;

HB_STATIC_ASSERT(sizeof(Hb_Source_Route) == 176, "source routes are 176 bytes");

enum {
  HB_ROUTED_BUFFERS = 6,         /**< most buffers of a routed message */
  HB_ROUTED_MESSAGE_SIZE = 10000 /**< most bytes of a routed message, its destinations and header included */
};

HB_BEGIN_DECLS

/*
 * Each of these starts the client when it is not running, and fails as hb_init() does when that fails. A null pointer
 * is `HB_EINVAL`. Outputs are written on success alone. In VEX mode nothing is sent and nothing is published: a message
 * is then taken as sent, asking for a route is `HB_ECOMM`, and reading one is `HB_ENOROUTE`.
 */

/**
 * Asks the daemon for the route to a node, and waits for the answer without a limit.
 *
 * @param option receives the hops, 176 bytes.
 * @param length receives the length of the route.
 * `HB_EINVAL` the node is negative or not below the nodes; `HB_ENONODE` no adapter of it is configured; `HB_ENOROUTE`
 * there is no route; `HB_EBADREPLY` something else came, and is lost; `HB_EDAEMONGONE`, `HB_ECOMM` no answer could be
 * read; or a send error.
 */
HB_API Hb_Rc hb_get_route(Hb_Node_Number node, Hb_Source_Route* option, unsigned short* length);

/**
 * Reads the route to a node from the daemon's shared memory, under the reader lock: it waits while the daemon writes.
 *
 * @param option receives the hops, 176 bytes.
 * @param length receives the length of the route.
 * `HB_EINVAL` the node is negative or not below the nodes; `HB_ENOROUTE` no route is published for it, or one of an
 * earlier configuration.
 */
HB_API Hb_Rc hb_read_route(Hb_Node_Number node, Hb_Source_Route* option, unsigned short* length);

/** As hb_read_route(), and `HB_ENOIPROUTE` when the route is not an IP route. */
HB_API Hb_Rc hb_read_ip_route(Hb_Node_Number node, Hb_Source_Route* option, unsigned short* length);

/**
 * Has the daemon forward a message to a set of nodes. No answer.
 *
 * @param iovec the message's buffers, in order; each with bytes in it.
 * @param iov_cnt 0 to 6 of them.
 * @param port_number the port that it is for; its low 16 bits are sent in the other byte order.
 * @param nodes the numbers of the nodes, each once. More than two are sorted in place, also when the call fails
 *   afterwards.
 * @param num_nodes 1 to 2,049 of them.
 * `HB_EINVAL` a count, a buffer or a repeated node; `HB_EMSGTOOBIG` more than 10,000 bytes, or more than that with four
 * for each node and 60 for the header; or a send error.
 */
HB_API Hb_Rc hb_daemon_route_mcast(struct iovec* iovec, int iov_cnt, int port_number, int* nodes, int num_nodes);

HB_END_DECLS

#endif
