// What is configured, read from the library in one go.
#pragma once

#include <optional>
#include <string>
#include <unordered_map>
#include <vector>

#include "hb_client/types.h"

namespace hbctl {

struct Node {
  Hb_Node_Number number;
  int adapters;
};

// What the library does not tell about an adapter is absent: a number beyond the cluster's limits has no node.
struct Adapter {
  Hb_Adapter_Number number;
  std::optional<Hb_Node_Number> node;
  std::optional<int> offset;
  std::optional<Hb_Network_Number> network;
  std::string type;
  std::string address;
};

struct Network {
  Hb_Network_Number number;
  std::string name;
  std::string type;
  std::vector<Hb_Adapter_Number> adapters;
};

struct Cluster {
  Hb_Node_Number local_node = HB_NO_NODE;
  std::vector<Node> nodes;
  std::vector<Adapter> adapters;
  std::vector<Network> networks;
  std::vector<Hb_Site_Number> sites;

  const Network* network(std::optional<Hb_Network_Number> number) const;
  std::vector<Hb_Node_Number> node_numbers() const;
  std::vector<Hb_Adapter_Number> adapter_numbers() const;
};

// Finds adapters by number in one step.
class AdapterIndex {
 public:
  explicit AdapterIndex(const Cluster& cluster);
  const Adapter* find(Hb_Adapter_Number number) const;

 private:
  std::unordered_map<Hb_Adapter_Number, const Adapter*> adapters_;
};

// Throws CommandError when a query fails that cannot fail on a sound configuration.
Cluster read_cluster();

}  // namespace hbctl
