/* The membership model: what each change means. */
#include "cluster.h"

#include <gmock/gmock.h>

#include "hb_client/group.h"

namespace {

using hbd::Adapter;
using hbd::AdapterEvent;
using hbd::Cluster;
using hbd::Event;
using hbd::NodeEvent;
using testing::ElementsAre;
using testing::IsEmpty;

/* Three nodes on two networks, an adapter on each; the second adapter of node 2 is missing. */
hbd::Configuration three_nodes() {
  hbd::Configuration configuration;
  configuration.max_nodes = 4;
  configuration.adapters_per_node = 2;
  configuration.networks = {{"public", ""}, {"storage", ""}};
  for (const Hb_Adapter_Number number : {0U, 1U, 2U, 3U, 4U}) {
    configuration.adapters[number] = {number, {}, static_cast<Hb_Network_Number>(number % 2), "", true};
  }
  return configuration;
}

std::vector<std::size_t> members(const hbd::MemberSet& set) {
  std::vector<std::size_t> numbers;
  set.for_each([&](std::size_t number) { numbers.push_back(number); });
  return numbers;
}

std::vector<std::size_t> kinds(const std::vector<Event>& events) {
  std::vector<std::size_t> indexes;
  for (const auto& event : events) {
    indexes.push_back(event.body.index());
  }
  return indexes;
}

constexpr std::size_t adapter_event = 0;
constexpr std::size_t node_event = 1;
constexpr std::size_t adapter_group = 2;
constexpr std::size_t node_group = 3;
constexpr std::size_t configuration_event = 4;

TEST(Cluster, starts_with_everything_up_that_works) {
  auto configuration = three_nodes();
  configuration.adapters[4].up = false;
  const Cluster cluster(configuration);
  EXPECT_THAT(members(cluster.up_adapters()), ElementsAre(0, 1, 2, 3));
  EXPECT_THAT(members(cluster.up_nodes()), ElementsAre(0, 1));
  EXPECT_EQ(cluster.sequence(), 1U);
  EXPECT_EQ(cluster.configuration_sequence(), 1U);
}

TEST(Cluster, keeps_a_node_up_until_its_last_adapter_dies) {
  Cluster cluster(three_nodes());
  EXPECT_THAT(kinds(cluster.apply(hbd::AdapterDeath{{2}})), ElementsAre(adapter_event, adapter_group));
  EXPECT_THAT(kinds(cluster.apply(hbd::AdapterDeath{{3}})),
              ElementsAre(adapter_event, node_event, adapter_group, node_group));
  EXPECT_THAT(members(cluster.up_nodes()), ElementsAre(0, 2));
}

TEST(Cluster, does_not_revive_a_broken_adapter_with_its_node) {
  Cluster cluster(three_nodes());
  cluster.apply(hbd::AdapterDeath{{2}});
  cluster.apply(hbd::NodeDeath{1, {}});
  cluster.apply(hbd::NodeJoin{1, {}});
  EXPECT_THAT(members(cluster.up_adapters()), ElementsAre(0, 1, 3, 4));
}

TEST(Cluster, does_not_revive_an_adapter_on_a_lost_network_with_its_node) {
  Cluster cluster(three_nodes());
  cluster.apply(hbd::NetworkLoss{0});
  cluster.apply(hbd::NodeDeath{1, {}});
  cluster.apply(hbd::NodeJoin{1, {}});
  EXPECT_THAT(members(cluster.up_adapters()), ElementsAre(1, 3));
  cluster.apply(hbd::NetworkReturn{0});
  EXPECT_THAT(members(cluster.up_adapters()), ElementsAre(0, 1, 2, 3, 4));
}

TEST(Cluster, repairs_an_adapter_of_a_stopped_node_without_an_event_and_brings_it_up_with_the_node) {
  Cluster cluster(three_nodes());
  cluster.apply(hbd::AdapterDeath{{2}});
  cluster.apply(hbd::NodeDeath{1, {}});
  EXPECT_THAT(cluster.apply(hbd::AdapterJoin{{2}}), IsEmpty());
  cluster.apply(hbd::NodeJoin{1, {}});
  EXPECT_THAT(members(cluster.up_adapters()), ElementsAre(0, 1, 2, 3, 4));
}

TEST(Cluster, counts_events_and_group_incarnations) {
  Cluster cluster(three_nodes());
  const auto events = cluster.apply(hbd::NodeDeath{1, {}});
  ASSERT_EQ(events.size(), 4U);
  EXPECT_EQ(events.front().sequence, 2U);
  EXPECT_EQ(events.back().sequence, 5U);
  EXPECT_EQ(cluster.adapter_group_incarnation(), 2U);
  EXPECT_EQ(cluster.node_group_incarnation(), 2U);
  cluster.apply(hbd::AdapterDeath{{0}});
  EXPECT_EQ(cluster.adapter_group_incarnation(), 3U);
  EXPECT_EQ(cluster.node_group_incarnation(), 2U);
}

TEST(Cluster, tells_nothing_of_a_change_without_effect) {
  Cluster cluster(three_nodes());
  EXPECT_THAT(cluster.apply(hbd::AdapterJoin{{0}}), IsEmpty());
  EXPECT_THAT(cluster.apply(hbd::NodeJoin{0, {}}), IsEmpty());
  EXPECT_THAT(cluster.apply(hbd::NetworkReturn{1}), IsEmpty());
  EXPECT_THAT(cluster.apply(hbd::AdapterDeath{{7}}), IsEmpty());
  EXPECT_EQ(cluster.sequence(), 1U);
}

TEST(Cluster, replaces_an_adapter_in_its_slot_as_a_removal_and_a_join) {
  Cluster cluster(three_nodes());
  const auto events = cluster.apply(hbd::ConfigurationChange{{4}, {}, {Adapter{4, {}, 1, "new", true}}});
  ASSERT_THAT(kinds(events), ElementsAre(adapter_event, configuration_event, adapter_event, adapter_group));
  EXPECT_EQ(std::get<AdapterEvent>(events[0].body).adapters.at(0).incarnation, 1U | HB_DIED_BECAUSE_REMOVED_BIT);
  EXPECT_EQ(std::get<AdapterEvent>(events[2].body).adapters.at(0).incarnation, 2U);
  EXPECT_EQ(cluster.configuration().adapters.at(4).type, "new");
  EXPECT_EQ(cluster.configuration_sequence(), 2U);
}

TEST(Cluster, removes_an_adapter_that_is_down_without_a_death) {
  Cluster cluster(three_nodes());
  cluster.apply(hbd::AdapterDeath{{3}});
  EXPECT_THAT(kinds(cluster.apply(hbd::ConfigurationChange{{3}, {}, {}})), ElementsAre(configuration_event));
}

TEST(Cluster, starts_a_node_that_is_configured_anew_although_it_had_stopped) {
  Cluster cluster(three_nodes());
  cluster.apply(hbd::NodeDeath{2, {}});
  cluster.apply(hbd::ConfigurationChange{{4}, {}, {}});
  const auto events = cluster.apply(hbd::ConfigurationChange{{}, {}, {Adapter{4, {}, 0, "", true}}});
  EXPECT_THAT(kinds(events), ElementsAre(configuration_event, adapter_event, node_event, adapter_group, node_group));
}

TEST(Cluster, takes_new_networks_before_new_adapters) {
  Cluster cluster(three_nodes());
  cluster.apply(hbd::ConfigurationChange{{}, {{"third", ""}}, {Adapter{5, {}, 2, "", true}}});
  EXPECT_EQ(cluster.configuration().networks.size(), 3U);
  EXPECT_TRUE(cluster.up_adapters().contains(5));
  EXPECT_TRUE(cluster.network_is_available(2));
}

/* Adapters that the only event of a kind names. */
std::vector<Hb_Adapter_Number> named(const std::vector<Event>& events, hbd::Direction direction) {
  std::vector<Hb_Adapter_Number> numbers;
  for (const auto& event : events) {
    const auto* adapters = std::get_if<AdapterEvent>(&event.body);
    if (adapters != nullptr && adapters->direction == direction) {
      for (const auto& entry : adapters->adapters) {
        numbers.push_back(entry.adapter);
      }
    }
  }
  return numbers;
}

TEST(UnmonitoredAdapter, keeps_the_state_that_was_told_of_it) {
  Cluster cluster(three_nodes());
  EXPECT_THAT(cluster.apply(hbd::MonitoringSwitch{2, false}), IsEmpty());
  EXPECT_THAT(cluster.apply(hbd::AdapterDeath{{2}}), IsEmpty());
  EXPECT_THAT(named(cluster.apply(hbd::NetworkLoss{0}), hbd::Direction::Death), ElementsAre(0, 4));
  EXPECT_TRUE(cluster.up_adapters().contains(2));
  EXPECT_EQ(cluster.state(2), Hb_Adapter_Not_Monitored);
  EXPECT_THAT(named(cluster.apply(hbd::MonitoringSwitch{2, true}), hbd::Direction::Death), ElementsAre(2));
}

TEST(UnmonitoredAdapter, does_not_keep_its_node_alive) {
  Cluster cluster(three_nodes());
  cluster.apply(hbd::MonitoringSwitch{4, false});
  EXPECT_THAT(kinds(cluster.apply(hbd::NodeDeath{2, {}})), ElementsAre(node_event, node_group));
  EXPECT_THAT(members(cluster.up_nodes()), ElementsAre(0, 1));
}

TEST(UnmonitoredAdapter, goes_with_the_configuration_and_comes_back_monitored) {
  Cluster cluster(three_nodes());
  cluster.apply(hbd::MonitoringSwitch{2, false});
  EXPECT_THAT(named(cluster.apply(hbd::ConfigurationChange{{2}, {}, {}}), hbd::Direction::Death), ElementsAre(2));
  cluster.apply(hbd::ConfigurationChange{{}, {}, {Adapter{2, {}, 0, "", true}}});
  EXPECT_TRUE(cluster.is_monitored(2));
}

TEST(Grace, holds_a_death_back_and_nothing_else) {
  Cluster cluster(three_nodes());
  cluster.apply(hbd::GraceSwitch{2, true});
  EXPECT_THAT(cluster.apply(hbd::AdapterDeath{{2}}), IsEmpty());
  EXPECT_THAT(named(cluster.apply(hbd::GraceSwitch{2, false}), hbd::Direction::Death), ElementsAre(2));
  cluster.apply(hbd::GraceSwitch{2, true});
  EXPECT_THAT(named(cluster.apply(hbd::AdapterJoin{{2}}), hbd::Direction::Join), ElementsAre(2));
}

TEST(Grace, tells_at_its_end_what_a_request_did_to_an_interface_under_manual_control) {
  auto configuration = three_nodes();
  configuration.local_node = 1;
  configuration.adapters[2].type = "en0";
  Cluster cluster(configuration);
  cluster.apply(hbd::ManualControl{"en0", true});
  cluster.apply(hbd::GraceSwitch{2, true});
  EXPECT_THAT(cluster.apply(hbd::InterfaceSwitch{2, false}), IsEmpty());
  EXPECT_THAT(named(cluster.apply(hbd::GraceSwitch{2, false}), hbd::Direction::Death), ElementsAre(2));
}

TEST(Grace, tells_nothing_at_its_end_of_what_a_monitor_under_manual_control_saw) {
  auto configuration = three_nodes();
  configuration.local_node = 1;
  configuration.adapters[2].type = "en0";
  Cluster cluster(configuration);
  cluster.apply(hbd::ManualControl{"en0", true});
  cluster.apply(hbd::GraceSwitch{2, true});
  EXPECT_THAT(cluster.apply(hbd::AdapterDeath{{2}}), IsEmpty());
  EXPECT_THAT(cluster.apply(hbd::GraceSwitch{2, false}), IsEmpty());
}

/* A change after which an adapter that was reported down is up again. */
struct Revival {
  const char* name;
  std::vector<hbd::Change> changes;
};

class ReportedAdapter : public testing::TestWithParam<Revival> {};

TEST_P(ReportedAdapter, stays_dead_until_this) {
  Cluster cluster(three_nodes());
  EXPECT_THAT(named(cluster.apply(hbd::ReportedDeath{{2}}), hbd::Direction::Death), ElementsAre(2));
  EXPECT_EQ(cluster.state(2), Hb_Adapter_Down);
  EXPECT_THAT(cluster.apply(hbd::SuspicionEnd{{2}}), IsEmpty());
  std::vector<Hb_Adapter_Number> joined;
  for (const auto& change : GetParam().changes) {
    EXPECT_FALSE(cluster.up_adapters().contains(2));
    joined = named(cluster.apply(change), hbd::Direction::Join);
  }
  EXPECT_THAT(joined, testing::Contains(2U));
}

INSTANTIATE_TEST_SUITE_P(Cluster, ReportedAdapter,
                         testing::Values(Revival{"its_join", {hbd::AdapterJoin{{2}}}},
                                         Revival{"its_interface_is_switched_on", {hbd::InterfaceSwitch{2, true}}},
                                         Revival{"it_is_watched_anew",
                                                 {hbd::MonitoringSwitch{2, false}, hbd::MonitoringSwitch{2, true}}},
                                         Revival{"its_node_joins", {hbd::NodeDeath{1, {}}, hbd::NodeJoin{1, {}}}}),
                         [](const auto& each) { return std::string(each.param.name); });

TEST(Silence, is_noticed_by_suspicion_alone) {
  Cluster cluster(three_nodes());
  EXPECT_THAT(cluster.apply(hbd::AdapterSilence{{2}}), IsEmpty());
  EXPECT_THAT(named(cluster.apply(hbd::SuspicionEnd{{0, 2, 4}}), hbd::Direction::Death), ElementsAre(2));
  EXPECT_THAT(cluster.apply(hbd::SuspicionEnd{{0, 2, 7}}), IsEmpty());
}

TEST(Monitor, under_manual_control_leaves_the_state_to_requests) {
  auto configuration = three_nodes();
  configuration.local_node = 1;
  configuration.adapters[2].type = "en0";
  configuration.adapters[0].type = "en0";
  Cluster cluster(configuration);
  cluster.apply(hbd::ManualControl{"en0", true});
  EXPECT_TRUE(cluster.is_under_manual_control("en0"));
  EXPECT_THAT(named(cluster.apply(hbd::NetworkLoss{0}), hbd::Direction::Death), ElementsAre(0, 4));
  cluster.apply(hbd::NetworkReturn{0});
  EXPECT_THAT(named(cluster.apply(hbd::InterfaceSwitch{2, false}), hbd::Direction::Death), ElementsAre(2));
  EXPECT_EQ(cluster.state(2), Hb_Adapter_ifconfig_Down);
  EXPECT_THAT(named(cluster.apply(hbd::InterfaceSwitch{2, true}), hbd::Direction::Join), ElementsAre(2));
  EXPECT_THAT(named(cluster.apply(hbd::ReportedDeath{{2}}), hbd::Direction::Death), ElementsAre(2));
  EXPECT_THAT(cluster.apply(hbd::AdapterJoin{{2}}), IsEmpty());
  EXPECT_THAT(named(cluster.apply(hbd::ManualControl{"en0", false}), hbd::Direction::Join), ElementsAre(2));
}

TEST(Address, that_is_taken_away_takes_the_adapter_down_until_there_is_another) {
  Cluster cluster(three_nodes());
  EXPECT_THAT(kinds(cluster.apply(hbd::AddressChange{{{2, std::nullopt}}})),
              ElementsAre(adapter_event, configuration_event, adapter_group));
  EXPECT_FALSE(cluster.has_address(2));
  EXPECT_EQ(cluster.configuration_sequence(), 2U);
  EXPECT_THAT(kinds(cluster.apply(hbd::AddressChange{{{2, Hb_IP_address6{}}}})),
              ElementsAre(configuration_event, adapter_event, adapter_group));
  EXPECT_EQ(cluster.configuration_sequence(), 3U);
}

}  // namespace
