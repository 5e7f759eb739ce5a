#include "liveness.h"

#include <gtest/gtest.h>

#include "sample_cluster.h"

namespace hbctl {
namespace {

std::vector<Subscription> everything() { return plan_subscriptions({}, 7, "p", sample_cluster()).subscriptions; }

Event node_event(Hb_Events bits, std::vector<Hb_Node_Number> nodes) {
  Event event;
  event.bits = bits;
  event.subscription = "p.nodes";
  event.subject = Subject::Nodes;
  event.nodes = std::move(nodes);
  return event;
}

Event adapter_event(Hb_Events bits, const std::vector<Hb_Adapter_Number>& adapters, const char* name = "p.adapters") {
  Event event;
  event.bits = bits;
  event.subscription = name;
  event.subject = Subject::Adapters;
  for (Hb_Adapter_Number adapter : adapters) event.adapters.push_back({adapter, 1, false});
  return event;
}

TEST(HbctlLiveness, is_unknown_before_the_first_event) {
  Liveness liveness;
  liveness.follow(everything());
  EXPECT_EQ(liveness.nodes().state(1), State::Unknown);
  EXPECT_EQ(liveness.nodes().tally().unknown, 3);
  EXPECT_EQ(liveness.adapters().tally().unknown, 6);
}

TEST(HbctlLiveness, learns_from_a_new_group_who_is_up_and_who_is_not) {
  Liveness liveness;
  liveness.follow(everything());
  liveness.apply(node_event(4, {0, 2}));
  EXPECT_EQ(liveness.nodes().state(0), State::Up);
  EXPECT_EQ(liveness.nodes().state(1), State::Down);
  EXPECT_EQ(liveness.nodes().state(2), State::Up);
  EXPECT_EQ(liveness.adapters().tally().unknown, 6);
}

TEST(HbctlLiveness, learns_from_death_and_join_about_those_alone) {
  Liveness liveness;
  liveness.follow(everything());
  liveness.apply(adapter_event(1, {3}));
  liveness.apply(adapter_event(2, {5}));
  EXPECT_EQ(liveness.adapters().state(3), State::Down);
  EXPECT_EQ(liveness.adapters().state(5), State::Up);
  EXPECT_EQ(liveness.adapters().state(0), State::Unknown);
  liveness.apply(adapter_event(2, {3}));
  EXPECT_EQ(liveness.adapters().state(3), State::Up);
}

TEST(HbctlLiveness, learns_from_a_new_group_only_about_the_subscription_that_it_belongs_to) {
  Liveness liveness;
  liveness.follow(plan_subscriptions({{}, {}, {"net0", "net1"}}, 7, "p", sample_cluster()).subscriptions);
  liveness.apply(adapter_event(4, {0, 2}, "p.network0"));
  EXPECT_EQ(liveness.adapters().state(4), State::Down);
  EXPECT_EQ(liveness.adapters().state(1), State::Unknown);
}

TEST(HbctlLiveness, counts_only_what_is_followed) {
  Liveness liveness;
  liveness.follow(plan_subscriptions({{1}, {}, {}}, 7, "p", sample_cluster()).subscriptions);
  liveness.apply(node_event(4, {0, 1, 2}));
  EXPECT_EQ(liveness.nodes().tally().up, 1);
  EXPECT_EQ(liveness.nodes().tally().all(), 1);
}

TEST(HbctlLiveness, keeps_what_it_knows_when_more_is_followed) {
  Liveness liveness;
  liveness.follow(plan_subscriptions({{1}, {}, {}}, 7, "p", sample_cluster()).subscriptions);
  liveness.apply(node_event(1, {1}));
  liveness.follow(everything());
  EXPECT_EQ(liveness.nodes().state(1), State::Down);
  EXPECT_EQ(liveness.nodes().state(0), State::Unknown);
  liveness.follow(plan_subscriptions({{0}, {}, {}}, 7, "p", sample_cluster()).subscriptions);
  liveness.follow(everything());
  EXPECT_EQ(liveness.nodes().state(1), State::Unknown);
}

}  // namespace
}  // namespace hbctl
