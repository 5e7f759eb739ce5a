// Three nodes of two adapters: adapter a is slot a mod 2 of node a / 2, on network a mod 2, at 10.0.0.(a + 1).
#pragma once

#include "cluster.h"

namespace hbctl {

inline Cluster sample_cluster() {
  Cluster cluster;
  cluster.local_node = 0;
  cluster.networks = {{0, "net0", "ether", {}}, {1, "net1", "ether", {}}};
  for (Hb_Node_Number node = 0; node < 3; ++node) cluster.nodes.push_back({node, 2});
  for (Hb_Adapter_Number number = 0; number < 6; ++number) {
    const auto network = static_cast<Hb_Network_Number>(number % 2);
    cluster.adapters.push_back({number, static_cast<Hb_Node_Number>(number / 2), static_cast<int>(number % 2), network,
                                "ether", "10.0.0." + std::to_string(number + 1)});
    cluster.networks[static_cast<size_t>(network)].adapters.push_back(number);
  }
  return cluster;
}

}  // namespace hbctl
