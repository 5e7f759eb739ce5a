/* The cluster as it is configured: what a client learns before anything happens. */
#ifndef HBD_CONFIGURATION_H
#define HBD_CONFIGURATION_H

#include <sys/time.h>

#include <map>
#include <string>
#include <vector>

#include "hb_client/types.h"

namespace hbd {

/** One configured adapter. */
struct Adapter {
  Hb_Adapter_Number number = 0;
  Hb_IP_address6 address{};
  Hb_Network_Number network = 0;
  std::string type;
  bool up = true; /**< whether it works when it is configured */
};

/** One network; its number is its place in the list. */
struct Network {
  std::string name;
  std::string type;
  bool ip = true; /**< whether it carries IP */
};

/** How a node is reached. */
struct Route {
  std::vector<Hb_IP_address6> hops; /**< its own address is the last one */
  bool ip = true;                   /**< whether all networks on the way carry IP */
};

/** The configuration that is published and sent to clients. */
struct Configuration {
  std::string name;
  Hb_Node_Number local_node = 0;
  int max_nodes = 1;
  int adapters_per_node = 1;
  std::vector<Network> networks;
  std::map<Hb_Adapter_Number, Adapter> adapters;
  std::map<Hb_Node_Number, Route> given_routes; /**< these hold whatever the adapters say */
  timeval remote_node_down_period{};
  timeval local_node_down_period{};

  /** Adapter numbers of this cluster are below this. */
  [[nodiscard]] Hb_Adapter_Number adapter_limit() const {
    return static_cast<Hb_Adapter_Number>(max_nodes) * static_cast<Hb_Adapter_Number>(adapters_per_node);
  }
  /** The node that an adapter number belongs to. */
  [[nodiscard]] Hb_Node_Number node_of(Hb_Adapter_Number adapter) const {
    return static_cast<Hb_Node_Number>(adapter / static_cast<Hb_Adapter_Number>(adapters_per_node));
  }
  /** The number of the adapter in a slot of a node. */
  [[nodiscard]] Hb_Adapter_Number adapter_number(int node, int offset) const {
    return static_cast<Hb_Adapter_Number>(node) * static_cast<Hb_Adapter_Number>(adapters_per_node) +
           static_cast<Hb_Adapter_Number>(offset);
  }
};

}  // namespace hbd

#endif
