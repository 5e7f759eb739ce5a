/* Records of the route family. */
#ifndef HB_CLIENT_ROUTE_H
#define HB_CLIENT_ROUTE_H

#include "hb_client/types.h"

enum { HB_ROUTE_HOPS = 11 /**< addresses in a source route */ };

/** The hops by which a node is reached. */
typedef struct Hb_Source_Route {
  Hb_IP_address6 sr_address[HB_ROUTE_HOPS];
} Hb_Source_Route;

HB_STATIC_ASSERT(sizeof(Hb_Source_Route) == 176, "source routes are 176 bytes");

#endif
