#include "built_in_scenario.h"

namespace hbd {

std::string_view built_in_scenario() {
  return R"([cluster]
name = "built-in"
local_node = 0

[[network]]
name = "public"
type = "ether"

[[network]]
name = "storage"
type = "ether"

[[node]]
number = 0
adapters = [
  { offset = 0, network = "public", address = "192.0.2.10", type = "en0" },
  { offset = 1, network = "storage", address = "198.51.100.10", type = "en1" },
]

[[node]]
number = 1
adapters = [
  { offset = 0, network = "public", address = "192.0.2.11", type = "en0" },
  { offset = 1, network = "storage", address = "198.51.100.11", type = "en1" },
]

[[node]]
number = 2
adapters = [
  { offset = 0, network = "public", address = "192.0.2.12", type = "en0" },
  { offset = 1, network = "storage", address = "198.51.100.12", type = "en1" },
]

[[node]]
number = 3
adapters = [
  { offset = 0, network = "public", address = "192.0.2.13", type = "en0" },
  { offset = 1, network = "storage", address = "198.51.100.13", type = "en1" },
]

[random]
seed = 1
mean_interval = "2s"
)";
}

}  // namespace hbd
