#include "subscription.h"

#include <algorithm>
#include <utility>

#include "hb_client/events.h"

namespace hbd {
namespace {

/* What one event asks of a subscription. */
struct Match {
  const Subscription& subscription;
  const Cluster& cluster;

  [[nodiscard]] bool mask(Hb_Events bits) const { return (subscription.events & bits) != 0; }

  [[nodiscard]] bool everybody() const {
    return subscription.type == Hb_All_Adapters_Subscription || subscription.type == Hb_All_Nodes_Subscription;
  }

  bool operator()(const AdapterEvent& event) const {
    return subscription.follows_adapters() &&
           mask(event.direction == Direction::Death ? HB_EVENT_DEATH : HB_EVENT_JOIN) &&
           (everybody() || std::any_of(event.adapters.begin(), event.adapters.end(), [&](const auto& entry) {
              return subscription.members.contains(entry.adapter);
            }));
  }

  bool operator()(const NodeEvent& event) const {
    return subscription.follows_nodes() && mask(event.direction == Direction::Death ? HB_EVENT_DEATH : HB_EVENT_JOIN) &&
           (everybody() || std::any_of(event.nodes.begin(), event.nodes.end(), [&](auto node) {
              return subscription.members.contains(static_cast<std::size_t>(node));
            }));
  }

  bool operator()(const AdapterGroupEvent& event) const {
    return subscription.follows_adapters() && mask(HB_EVENT_NEW_GROUP) &&
           (everybody() || subscription.members.overlaps(cluster.up_adapters()) ||
            subscription.members.overlaps(event.left));
  }

  bool operator()(const NodeGroupEvent& event) const {
    return subscription.follows_nodes() && mask(HB_EVENT_NEW_GROUP) &&
           (everybody() || subscription.members.overlaps(cluster.up_nodes()) ||
            subscription.members.overlaps(event.left));
  }

  bool operator()(const ConfigurationEvent& /*event*/) const { return false; }
  bool operator()(const FailureData& /*event*/) const { return mask(HB_EVENT_FFDC_ID); }
  bool operator()(const DifferentInstance& /*event*/) const { return mask(HB_EVENT_DIFF_INSTANCE); }
  bool operator()(const HeartbeatSettings& /*event*/) const { return mask(HB_EVENT_NODE_HEARTBEAT); }
};

MemberSet members_of(const Hb_Subscription_Group& record) {
  const auto& groups = record.Hb_subscription_grp_union;
  switch (record.Hb_subscription_type) {
    case Hb_Node_Subscription:
      return MemberSet(groups.Hb_node_subscription_grp.Hb_node_list);
    case Hb_Adapter_Subscription:
    case Hb_Network_Subscription:
      return MemberSet(groups.Hb_adapter_subscription_grp.Hb_adapter_list);
    default:
      return {};
  }
}

}  // namespace

bool Subscription::follows_adapters() const {
  return type == Hb_Adapter_Subscription || type == Hb_All_Adapters_Subscription || type == Hb_Network_Subscription;
}

bool Subscription::follows_nodes() const { return type == Hb_Node_Subscription || type == Hb_All_Nodes_Subscription; }

bool Subscription::wants(const Event& event, const Cluster& cluster) const {
  return std::visit(Match{*this, cluster}, event.body);
}

std::vector<Event> Subscription::first_events(const Cluster& cluster) const {
  if ((events & HB_EVENT_NEW_GROUP) == 0) {
    return {};
  }
  if (follows_adapters()) {
    return {{cluster.sequence(), AdapterGroupEvent{}}};
  }
  if (follows_nodes()) {
    return {{cluster.sequence(), NodeGroupEvent{}}};
  }
  return {};
}

Subscription subscription_of(const Hb_Subscription_Group& record) {
  Subscription subscription;
  std::copy_n(record.Hb_name, HB_NAME_LENGTH - 1, subscription.name.begin());
  /* What stands behind the terminator is no part of the name. */
  std::fill(std::find(subscription.name.begin(), subscription.name.end(), '\0'), subscription.name.end(), '\0');
  subscription.type = record.Hb_subscription_type;
  subscription.events = record.Hb_events;
  subscription.members = members_of(record);
  return subscription;
}

void SubscriptionList::put(Subscription subscription) {
  const auto same = std::find_if(list_.begin(), list_.end(),
                                 [&](const Subscription& each) { return each.name == subscription.name; });
  if (same != list_.end()) {
    *same = std::move(subscription);
  } else {
    list_.push_back(std::move(subscription));
  }
}

bool SubscriptionList::remove(const SubscriptionName& name) {
  return std::erase_if(list_, [&](const Subscription& each) { return each.name == name; }) != 0;
}

}  // namespace hbd
