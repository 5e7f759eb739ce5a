/* How the local node reaches the others. */
#ifndef HBD_ROUTES_H
#define HBD_ROUTES_H

#include <optional>
#include <vector>

#include "cluster.h"
#include "configuration.h"
#include "hb_protocol/shared_memory.h"

namespace hbd {

/**
 * The shortest routes over the configured networks, by node number; nothing for nodes that cannot be reached with 11
 * hops. Networks with IP are tried first: a route without it is made when there is no other. Whether adapters are up
 * does not matter, so routes change with the configuration alone.
 */
std::vector<std::optional<Route>> routes_of(const Configuration& configuration);

/** The routes of a cluster, found anew when its configuration has changed. */
class RouteTable {
 public:
  explicit RouteTable(const Cluster& cluster) : cluster_(cluster) {}

  /** By node number. */
  const std::vector<std::optional<Route>>& all();
  /** To one node, which may be any number. */
  const Route* to(std::int32_t node);

 private:
  const Cluster& cluster_;
  std::vector<std::optional<Route>> routes_;
  Hb_Sequence_Number configuration_ = 0; /* that the routes are of */
};

/** Hops as they are published and sent. */
Hb_Source_Route source_route(const Route& route);

/** Length that is told with a route: the bytes of its hops. */
std::uint16_t length_of(const Route& route);

}  // namespace hbd

#endif
