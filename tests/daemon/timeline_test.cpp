/* Churn and scripts: the same each time, whoever looks. */
#include "timeline.h"

#include <gmock/gmock.h>

#include "packet_writer.h"
#include "scenario_parser.h"
#include "small_cluster.h"

namespace {

using namespace std::chrono_literals;

hbd::Scenario scenario_of(const std::string& more) {
  return std::get<hbd::Scenario>(hbd::parse_scenario(small_cluster + more));
}

std::string churn(int seed, const std::string& kinds) {
  return "[random]\nseed = " + std::to_string(seed) + "\nmean_interval = \"10ms\"\ncount = 500\nkinds = [" + kinds +
         "]\n";
}

const std::string all_kinds =
    R"("adapter-death", "adapter-join", "node-death", "node-join", "network-loss", "network-return",)"
    R"("configuration-update", "ffdc-id", "different-instance", "heartbeat")";

/* The bytes of all events of a scenario. */
std::vector<hbd::Frame> play(const hbd::Scenario& scenario) {
  std::vector<hbd::Frame> frames;
  hbd::Cluster cluster(scenario.configuration);
  hbd::Timeline timeline(scenario);
  while (timeline.next_time()) {
    const auto change = timeline.take(cluster);
    if (!change) {
      continue;
    }
    for (const auto& event : cluster.apply(*change)) {
      frames.push_back(*hbd::event_frame(event, cluster));
    }
  }
  return frames;
}

TEST(Churn, of_one_seed_is_the_same_byte_for_byte) {
  const auto once = play(scenario_of(churn(5, all_kinds)));
  EXPECT_GT(once.size(), 500U);
  EXPECT_EQ(once, play(scenario_of(churn(5, all_kinds))));
}

TEST(Churn, of_another_seed_is_another) {
  EXPECT_NE(play(scenario_of(churn(5, all_kinds))), play(scenario_of(churn(6, all_kinds))));
}

TEST(Churn, never_takes_the_local_node_down) {
  const auto scenario = scenario_of(churn(7, all_kinds));
  hbd::Cluster cluster(scenario.configuration);
  hbd::Timeline timeline(scenario);
  int changes = 0;
  while (timeline.next_time()) {
    if (const auto change = timeline.take(cluster)) {
      cluster.apply(*change);
      ++changes;
    }
    ASSERT_TRUE(cluster.up_nodes().contains(1)) << changes;
  }
  EXPECT_GT(changes, 400);
}

TEST(Churn, makes_only_changes_that_have_an_effect) {
  const auto scenario = scenario_of(churn(8, all_kinds));
  hbd::Cluster cluster(scenario.configuration);
  hbd::Timeline timeline(scenario);
  while (timeline.next_time()) {
    if (const auto change = timeline.take(cluster)) {
      /* A network may come back, or go, with no adapter that works: all others tell something. */
      const bool of_a_network = std::holds_alternative<hbd::NetworkReturn>(*change) ||
                                std::holds_alternative<hbd::NetworkLoss>(*change) ||
                                std::holds_alternative<hbd::NodeJoin>(*change);
      EXPECT_TRUE(!cluster.apply(*change).empty() || of_a_network);
    }
  }
}

TEST(Churn, comes_between_half_and_one_and_a_half_times_its_mean_interval) {
  const auto scenario = scenario_of(churn(9, all_kinds));
  const hbd::Cluster cluster(scenario.configuration);
  hbd::Timeline timeline(scenario);
  auto before = std::chrono::microseconds(0);
  for (auto at = timeline.next_time(); at; at = timeline.next_time()) {
    EXPECT_GE(*at - before, 5ms);
    EXPECT_LE(*at - before, 15ms);
    before = *at;
    timeline.take(cluster);
  }
}

TEST(Churn, ends_after_its_count) {
  const auto scenario = scenario_of("[random]\nseed = 1\nmean_interval = \"1s\"\ncount = 3\nkinds = [\"ffdc-id\"]\n");
  EXPECT_EQ(play(scenario).size(), 3U);
}

TEST(Churn, uses_only_the_kinds_that_it_is_given) {
  for (const auto& frame : play(scenario_of(churn(2, R"("heartbeat")")))) {
    EXPECT_EQ(frame[4], 15);
  }
}

TEST(Timeline, merges_script_and_churn_by_time) {
  const auto scenario = scenario_of(
      "[[event]]\nat = \"12ms\"\nkind = \"ffdc-id\"\nid = \"s\"\n"
      "[[event]]\nat = \"1h\"\nkind = \"ffdc-id\"\nid = \"t\"\n" +
      churn(3, R"("heartbeat")"));
  const hbd::Cluster cluster(scenario.configuration);
  hbd::Timeline timeline(scenario);
  auto before = std::chrono::microseconds(0);
  std::size_t scripted = 0;
  std::size_t all = 0;
  for (auto at = timeline.next_time(); at; at = timeline.next_time()) {
    EXPECT_GE(*at, before);
    before = *at;
    const auto change = timeline.take(cluster);
    ASSERT_TRUE(change);
    scripted += std::holds_alternative<hbd::FailureData>(*change) ? 1 : 0;
    ++all;
  }
  EXPECT_EQ(scripted, 2U);
  EXPECT_EQ(all, 502U);
  EXPECT_EQ(before, 1h);
}

}  // namespace
