// Which subscriptions a selection takes. The library's records hold members of one kind, and one network at most.
#pragma once

#include <string>
#include <vector>

#include "cluster.h"

namespace hbctl {

// What a person asked for. Nothing at all means every node and every adapter.
struct Selection {
  std::vector<Hb_Node_Number> nodes;
  std::vector<Hb_Adapter_Number> adapters;
  std::vector<std::string> networks;  // names or numbers

  bool everything() const { return nodes.empty() && adapters.empty() && networks.empty(); }
};

// What a subscription's members are.
enum class Members { EveryNode, Nodes, EveryAdapter, Adapters, Network, None };

struct Subscription {
  std::string name;
  Members kind;
  std::vector<Hb_Node_Number> nodes;
  std::vector<Hb_Adapter_Number> adapters;
  Hb_Network_Number network;
  Hb_Events events;
  bool operator==(const Subscription&) const = default;
};

struct SubscriptionPlan {
  std::vector<Subscription> subscriptions;
  std::vector<std::string> unknown;  // what was selected but is not configured, as "node 9"
};

// The longest prefix that leaves room for every suffix in a subscription's name.
constexpr size_t kLongestNamePrefix = 21;

SubscriptionPlan plan_subscriptions(const Selection& selection, Hb_Events events, const std::string& prefix,
                                    const Cluster& cluster);

// The network of that name or, failing that, of that number; null when there is none.
const Network* find_network(const Cluster& cluster, const std::string& name_or_number);

}  // namespace hbctl
