#include "subscription_plan.h"

#include <fmt/format.h>

#include <algorithm>

#include "hb_client/events.h"

namespace hbctl {
namespace {

constexpr Hb_Events kMembershipEvents = HB_EVENT_DEATH | HB_EVENT_JOIN | HB_EVENT_NEW_GROUP;

// Events that the library takes only with a mask of their own, whatever the members.
struct SeparateEvents {
  Hb_Events events;
  const char* suffix;
};
constexpr SeparateEvents kSeparateEvents[] = {
    {HB_EVENT_DIFF_INSTANCE, "instance"},
    {HB_EVENT_SITES, "sites"},
    {HB_EVENT_SPLIT_MERGE, "splits"},
};

class Planner {
 public:
  Planner(Hb_Events events, const std::string& prefix, const Cluster& cluster)
      : events_(events), prefix_(prefix), cluster_(cluster) {}

  void add_everything() {
    add_nodes(Members::EveryNode, cluster_.node_numbers());
    add_adapters(Members::EveryAdapter, cluster_.adapter_numbers(), "adapters", HB_NO_NETWORK);
  }

  void add_selected_nodes(const std::vector<Hb_Node_Number>& wanted) {
    add_nodes(Members::Nodes, configured(wanted, cluster_.node_numbers(), "node"));
  }

  void add_selected_adapters(const std::vector<Hb_Adapter_Number>& wanted) {
    add_adapters(Members::Adapters, configured(wanted, cluster_.adapter_numbers(), "adapter"), "adapters",
                 HB_NO_NETWORK);
  }

  void add_network(const std::string& name_or_number) {
    const Network* network = find_network(cluster_, name_or_number);
    if (network == nullptr) {
      plan_.unknown.push_back(fmt::format("network {}", name_or_number));
      return;
    }
    const std::string suffix = fmt::format("network{}", network->number);
    if (!has(suffix)) add_adapters(Members::Network, network->adapters, suffix, network->number);
  }

  void add_separate_events() {
    for (const SeparateEvents& separate : kSeparateEvents) {
      if ((events_ & separate.events) != 0)
        plan_.subscriptions.push_back({name(separate.suffix), Members::None, {}, {}, HB_NO_NETWORK, separate.events});
    }
  }

  SubscriptionPlan take() { return std::move(plan_); }

 private:
  std::string name(const std::string& suffix) const { return prefix_ + '.' + suffix; }

  bool has(const std::string& suffix) const {
    return std::any_of(plan_.subscriptions.begin(), plan_.subscriptions.end(),
                       [&](const Subscription& item) { return item.name == name(suffix); });
  }

  // Heartbeat settings come once per subscription that asks for them, so the first one asks for all.
  Hb_Events next_mask() const {
    return (events_ & kMembershipEvents) | (plan_.subscriptions.empty() ? events_ & HB_EVENT_NODE_HEARTBEAT : 0);
  }

  void add_nodes(Members kind, std::vector<Hb_Node_Number> nodes) {
    if (nodes.empty() || next_mask() == 0) return;
    plan_.subscriptions.push_back({name("nodes"), kind, std::move(nodes), {}, HB_NO_NETWORK, next_mask()});
  }

  void add_adapters(Members kind, std::vector<Hb_Adapter_Number> adapters, const std::string& suffix,
                    Hb_Network_Number network) {
    if (adapters.empty() || next_mask() == 0) return;
    plan_.subscriptions.push_back({name(suffix), kind, {}, std::move(adapters), network, next_mask()});
  }

  template <class Number>
  std::vector<Number> configured(std::vector<Number> wanted, std::vector<Number> known, const char* thing) {
    std::sort(wanted.begin(), wanted.end());
    wanted.erase(std::unique(wanted.begin(), wanted.end()), wanted.end());
    std::sort(known.begin(), known.end());
    std::vector<Number> result;
    for (Number number : wanted) {
      if (std::binary_search(known.begin(), known.end(), number)) {
        result.push_back(number);
      } else {
        plan_.unknown.push_back(fmt::format("{} {}", thing, number));
      }
    }
    return result;
  }

  Hb_Events events_;
  const std::string& prefix_;
  const Cluster& cluster_;
  SubscriptionPlan plan_;
};

}  // namespace

SubscriptionPlan plan_subscriptions(const Selection& selection, Hb_Events events, const std::string& prefix,
                                    const Cluster& cluster) {
  Planner planner(events, prefix, cluster);
  if (selection.everything()) planner.add_everything();
  planner.add_selected_nodes(selection.nodes);
  planner.add_selected_adapters(selection.adapters);
  for (const std::string& network : selection.networks) planner.add_network(network);
  planner.add_separate_events();
  return planner.take();
}

const Network* find_network(const Cluster& cluster, const std::string& name_or_number) {
  for (const Network& network : cluster.networks)
    if (network.name == name_or_number) return &network;
  for (const Network& network : cluster.networks)
    if (std::to_string(network.number) == name_or_number) return &network;
  return nullptr;
}

}  // namespace hbctl
