/* The cluster of the tests that compare bytes: 3 nodes, 2 adapters each but for node 2, 2 networks. */
#ifndef HB_TESTS_DAEMON_SMALL_CLUSTER_H
#define HB_TESTS_DAEMON_SMALL_CLUSTER_H

#include <string>

/* Adapter numbers: node 0 has 0 and 1, node 1 has 2 and 3, node 2 has 4; 6 and 7 are free on node 3. */
inline const std::string small_cluster = R"(
[cluster]
name = "small"
local_node = 1
max_nodes = 4
adapters_per_node = 2
remote_node_down_simulation = "7s"
local_node_down_simulation = "1500ms"

[[network]]
name = "public"
type = "ether"

[[network]]
name = "storage"

[[node]]
number = 0
adapters = [
  { offset = 0, network = "public", address = "192.0.2.1", type = "en0" },
  { offset = 1, network = "storage", address = "2001:db8::1", type = "en1" },
]

[[node]]
number = 1
adapters = [
  { offset = 0, network = "public", address = "192.0.2.2", type = "en0" },
  { offset = 1, network = "storage", address = "2001:db8::2", type = "en1", up = false },
]

[[node]]
number = 2
adapters = [{ offset = 0, network = "public", address = "192.0.2.3" }]
)";

#endif
