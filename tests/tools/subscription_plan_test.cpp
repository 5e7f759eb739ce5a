#include "subscription_plan.h"

#include <gmock/gmock.h>

#include "sample_cluster.h"

namespace hbctl {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr Hb_Events kMembership = 7;

TEST(HbctlSubscriptionPlan, follows_everything_when_nothing_is_selected) {
  const SubscriptionPlan plan = plan_subscriptions({}, kMembership, "p", sample_cluster());
  const Subscription nodes{"p.nodes", Members::EveryNode, {0, 1, 2}, {}, HB_NO_NETWORK, 7};
  const Subscription adapters{"p.adapters", Members::EveryAdapter, {}, {0, 1, 2, 3, 4, 5}, HB_NO_NETWORK, 7};
  EXPECT_THAT(plan.subscriptions, ElementsAre(nodes, adapters));
  EXPECT_THAT(plan.unknown, IsEmpty());
}

TEST(HbctlSubscriptionPlan, follows_nothing_else_when_nodes_are_selected) {
  const SubscriptionPlan plan = plan_subscriptions({{2, 0, 2}, {}, {}}, kMembership, "p", sample_cluster());
  const Subscription nodes{"p.nodes", Members::Nodes, {0, 2}, {}, HB_NO_NETWORK, 7};
  EXPECT_THAT(plan.subscriptions, ElementsAre(nodes));
}

TEST(HbctlSubscriptionPlan, gives_each_network_a_subscription_of_its_own) {
  const SubscriptionPlan plan = plan_subscriptions({{}, {}, {"net1", "0", "1"}}, kMembership, "p", sample_cluster());
  const Subscription net1{"p.network1", Members::Network, {}, {1, 3, 5}, 1, 7};
  const Subscription net0{"p.network0", Members::Network, {}, {0, 2, 4}, 0, 7};
  EXPECT_THAT(plan.subscriptions, ElementsAre(net1, net0));
}

TEST(HbctlSubscriptionPlan, names_what_is_not_configured) {
  const SubscriptionPlan plan = plan_subscriptions({{1, 9}, {66}, {"net9"}}, kMembership, "p", sample_cluster());
  EXPECT_THAT(plan.unknown, ElementsAre("node 9", "adapter 66", "network net9"));
  ASSERT_EQ(plan.subscriptions.size(), 1U);
  EXPECT_THAT(plan.subscriptions[0].nodes, ElementsAre(1));
}

TEST(HbctlSubscriptionPlan, asks_for_heartbeat_settings_once) {
  const SubscriptionPlan plan = plan_subscriptions({}, 0x201, "p", sample_cluster());
  ASSERT_EQ(plan.subscriptions.size(), 2U);
  EXPECT_EQ(plan.subscriptions[0].events, 0x201);
  EXPECT_EQ(plan.subscriptions[1].events, 1);
}

TEST(HbctlSubscriptionPlan, has_one_subscription_for_heartbeat_settings_alone) {
  const SubscriptionPlan plan = plan_subscriptions({}, 0x200, "p", sample_cluster());
  ASSERT_EQ(plan.subscriptions.size(), 1U);
  EXPECT_EQ(plan.subscriptions[0].name, "p.nodes");
  EXPECT_EQ(plan.subscriptions[0].events, 0x200);
}

TEST(HbctlSubscriptionPlan, keeps_apart_what_the_library_takes_only_alone) {
  const SubscriptionPlan plan = plan_subscriptions({{1}, {}, {}}, 0x3367, "p", sample_cluster());
  ASSERT_EQ(plan.subscriptions.size(), 4U);
  EXPECT_EQ(plan.subscriptions[0].events, 0x207);
  const Subscription instance{"p.instance", Members::None, {}, {}, HB_NO_NETWORK, 0x100};
  const Subscription sites{"p.sites", Members::None, {}, {}, HB_NO_NETWORK, 0x60};
  const Subscription splits{"p.splits", Members::None, {}, {}, HB_NO_NETWORK, 0x3000};
  EXPECT_THAT(plan.subscriptions, ElementsAre(plan.subscriptions[0], instance, sites, splits));
}

TEST(HbctlSubscriptionPlan, is_empty_for_an_empty_cluster) {
  EXPECT_THAT(plan_subscriptions({}, kMembership, "p", Cluster{}).subscriptions, IsEmpty());
}

TEST(HbctlSubscriptionPlan, has_names_that_fit_with_the_longest_prefix) {
  Cluster cluster = sample_cluster();
  cluster.networks[1].number = 47;
  const std::string prefix(kLongestNamePrefix, 'x');
  const SubscriptionPlan plan = plan_subscriptions({{}, {1}, {"net1"}}, 0x3367, prefix, cluster);
  ASSERT_EQ(plan.subscriptions.size(), 5U);
  for (const Subscription& subscription : plan.subscriptions) EXPECT_LE(subscription.name.size(), 31U);
}

TEST(HbctlNetworkLookUp, prefers_the_name_to_the_number) {
  Cluster cluster = sample_cluster();
  cluster.networks[0].name = "1";
  EXPECT_EQ(find_network(cluster, "1")->number, 0);
  EXPECT_EQ(find_network(cluster, "net1")->number, 1);
  EXPECT_EQ(find_network(cluster, "0")->number, 0);
  EXPECT_EQ(find_network(cluster, "7"), nullptr);
}

}  // namespace
}  // namespace hbctl
