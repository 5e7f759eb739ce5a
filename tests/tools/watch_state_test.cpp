#include "watch_state.h"

#include <gmock/gmock.h>

#include "sample_cluster.h"

namespace hbctl {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

TEST(HbctlWatchState, tells_what_a_new_configuration_brings_and_takes) {
  WatchState state(sample_cluster());
  Cluster next = sample_cluster();
  next.nodes.erase(next.nodes.begin());
  next.nodes.push_back({7, 1});
  next.adapters.erase(next.adapters.begin(), next.adapters.begin() + 2);
  next.adapters.push_back({14, Hb_Node_Number{7}, 0, Hb_Network_Number{0}, "ether", "10.0.0.15"});
  state.replace_cluster(next);
  EXPECT_THAT(state.last_change().nodes_added, ElementsAre(7));
  EXPECT_THAT(state.last_change().nodes_removed, ElementsAre(0));
  EXPECT_THAT(state.last_change().adapters_added, ElementsAre(14U));
  EXPECT_THAT(state.last_change().adapters_removed, ElementsAre(0U, 1U));
}

TEST(HbctlWatchState, tells_of_no_change_when_there_is_none) {
  const ConfigurationChange change = compare(sample_cluster(), sample_cluster());
  EXPECT_THAT(change.nodes_added, IsEmpty());
  EXPECT_THAT(change.nodes_removed, IsEmpty());
  EXPECT_THAT(change.adapters_added, IsEmpty());
  EXPECT_THAT(change.adapters_removed, IsEmpty());
  EXPECT_THAT(change.addresses_changed, IsEmpty());
}

TEST(HbctlWatchState, tells_of_adapters_with_another_address_alone) {
  Cluster next = sample_cluster();
  next.adapters[1].address = "10.0.0.99";
  next.adapters[4].address = "";
  next.adapters.erase(next.adapters.begin());
  next.adapters.push_back({14, Hb_Node_Number{2}, 0, Hb_Network_Number{0}, "ether", "10.0.0.15"});
  EXPECT_THAT(compare(sample_cluster(), next).addresses_changed, ElementsAre(1U, 4U));
}

TEST(HbctlWatchState, finds_adapters_of_the_new_configuration) {
  WatchState state(sample_cluster());
  EXPECT_EQ(state.adapter(3)->address, "10.0.0.4");
  EXPECT_EQ(state.adapter(14), nullptr);
  Cluster next = sample_cluster();
  next.adapters[3].address = "10.1.1.1";
  state.replace_cluster(next);
  EXPECT_EQ(state.adapter(3)->address, "10.1.1.1");
}

}  // namespace
}  // namespace hbctl
