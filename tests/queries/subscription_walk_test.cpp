// Walking the members of a subscription group.
#include <gmock/gmock.h>

#include <iterator>

#include "subscription_record.h"

namespace hb_test {
namespace {

using testing::ElementsAre;

TEST_F(Subscription, AdaptersAreWalkedAscendingToTheEnd) {
  Hb_Subscription_Group group = group_of_type(4);
  hb_add_all_adapters_to_subscription_group(&group);
  std::vector<Hb_Adapter_Number> walked;
  Hb_Adapter_Number adapter = 0;
  for (Hb_Rc rc = hb_get_first_subscription_adapter(&group, &adapter); rc == Hb_Success;
       rc = hb_get_next_subscription_adapter(&group, &adapter)) {
    walked.push_back(adapter);
    EXPECT_EQ(static_cast<Hb_Cursor>(adapter) + 1, group.Hb_cursor);
  }
  EXPECT_THAT(walked, ElementsAre(0, 2, 12, 13, 17));
  EXPECT_EQ(0xFFFFFFFFU, adapter);
  EXPECT_EQ(1, hb_get_errno());
  EXPECT_EQ(18, group.Hb_cursor);
}

TEST_F(Subscription, NodesAreWalkedAscendingToTheEnd) {
  Hb_Subscription_Group group = group_of_type(4);
  hb_add_all_nodes_to_subscription_group(&group);
  std::vector<Hb_Node_Number> walked;
  Hb_Node_Number node = 0;
  for (Hb_Rc rc = hb_get_first_subscription_node(&group, &node); rc == Hb_Success;
       rc = hb_get_next_subscription_node(&group, &node)) {
    walked.push_back(node);
    EXPECT_EQ(node + 1, group.Hb_cursor);
  }
  EXPECT_THAT(walked, ElementsAre(0, 3, 4));
  EXPECT_EQ(-1, node);
  EXPECT_EQ(1, hb_get_errno());
  EXPECT_EQ(5, group.Hb_cursor);
}

TEST_F(Subscription, SitesAreWalkedAscendingToTheEnd) {
  configure_sites({true, true});
  Hb_Subscription_Group group = group_of_type(4);
  hb_add_all_sites_to_subscription_group(&group);
  Hb_Site_Number site = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_first_subscription_site(&group, &site); }));
  EXPECT_EQ(0, site);
  EXPECT_EQ(1, group.Hb_cursor);
  EXPECT_TRUE(succeeds([&] { return hb_get_next_subscription_site(&group, &site); }));
  EXPECT_EQ(1, site);
  EXPECT_EQ(2, group.Hb_cursor);
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_subscription_site(&group, &site); }));
  EXPECT_EQ(65535, site);
  EXPECT_EQ(2, group.Hb_cursor);
}

TEST_F(Subscription, ANextCallAfterTheLastNodeKeepsFailing) {
  Hb_Subscription_Group group = group_of_type(4);
  hb_add_node_to_subscription_group(&group, 4);
  Hb_Node_Number node = 0;
  hb_get_first_subscription_node(&group, &node);
  for (int call = 0; call < 3; ++call) {
    node = 77;
    EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_subscription_node(&group, &node); }));
    EXPECT_EQ(-1, node);
  }
}

TEST_F(Subscription, AFirstCallStartsAgainWhateverTheCursor) {
  Hb_Subscription_Group group = group_of_type(4);
  hb_add_all_adapters_to_subscription_group(&group);
  group.Hb_cursor = 1000;
  Hb_Adapter_Number adapter = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_first_subscription_adapter(&group, &adapter); }));
  EXPECT_EQ(0U, adapter);
}

TEST_F(Subscription, AWalkOfNoMembersLeavesTheCursor) {
  Hb_Subscription_Group group = group_of_type(2);
  group.Hb_cursor = 55;
  Hb_Adapter_Number adapter = 99;
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_first_subscription_adapter(&group, &adapter); }));
  EXPECT_EQ(0xFFFFFFFFU, adapter);
  EXPECT_EQ(55, group.Hb_cursor);
}

TEST_F(Subscription, MembersAtTheBoundOfTheClusterAreNotWalked) {
  Hb_Subscription_Group adapters = group_of_type(2);
  set_member(adapters, 31);
  set_member(adapters, 32);
  Hb_Adapter_Number adapter = 0;
  EXPECT_TRUE(succeeds([&] { return hb_get_first_subscription_adapter(&adapters, &adapter); }));
  EXPECT_EQ(31U, adapter);
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_subscription_adapter(&adapters, &adapter); }));

  Hb_Subscription_Group nodes = group_of_type(0);
  set_member(nodes, 7);
  set_member(nodes, 8);
  Hb_Node_Number node = 0;
  EXPECT_TRUE(succeeds([&] { return hb_get_first_subscription_node(&nodes, &node); }));
  EXPECT_EQ(7, node);
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_subscription_node(&nodes, &node); }));

  Hb_Subscription_Group sites = group_of_type(7);
  set_member(sites, 2);
  Hb_Site_Number site = 0;
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_first_subscription_site(&sites, &site); }));
}

template <typename Number>
using Walk_Function = Hb_Rc (*)(Hb_Subscription_Group*, Number*);

template <typename Number>
std::vector<size_t> walked_by(Walk_Function<Number> first, Walk_Function<Number> next, Hb_Subscription_Group& group) {
  std::vector<size_t> walked;
  Number member = 0;
  for (Hb_Rc rc = first(&group, &member); rc == Hb_Success; rc = next(&group, &member)) walked.push_back(member);
  return walked;
}

std::vector<size_t> walked_adapters(Hb_Subscription_Group& group) {
  return walked_by(hb_get_first_subscription_adapter, hb_get_next_subscription_adapter, group);
}

TEST_F(Subscription, AllEightSitesAreWalkedAndNoMore) {
  for (const int max_sites : {8, 100}) {
    global_config_tbl.Hb_max_sites = max_sites;
    Hb_Subscription_Group group = group_filled_with(0xFF, 7);
    EXPECT_THAT(walked_by(hb_get_first_subscription_site, hb_get_next_subscription_site, group),
                ElementsAre(0, 1, 2, 3, 4, 5, 6, 7))
        << max_sites;
    Hb_Site_Number site = 99;
    EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_subscription_site(&group, &site); })) << max_sites;
    EXPECT_EQ(65535, site);
  }
}

template <typename Number>
void expect_cursor_alone_written(Walk_Function<Number> first, Walk_Function<Number> next, int32_t type) {
  Hb_Subscription_Group group = group_filled_with(0xFF, type);
  Hb_Subscription_Group expected = group;
  Number member = 99;
  EXPECT_TRUE(succeeds([&] { return first(&group, &member); })) << type;
  expected.Hb_cursor = 1;
  EXPECT_TRUE(same_bytes(expected, group)) << type;
  EXPECT_TRUE(succeeds([&] { return next(&group, &member); })) << type;
  expected.Hb_cursor = 2;
  EXPECT_TRUE(same_bytes(expected, group)) << type;
}

TEST_F(Subscription, AWalkWritesNothingButTheCursor) {
  expect_cursor_alone_written(hb_get_first_subscription_adapter, hb_get_next_subscription_adapter, 2);
  expect_cursor_alone_written(hb_get_first_subscription_node, hb_get_next_subscription_node, 0);
  expect_cursor_alone_written(hb_get_first_subscription_site, hb_get_next_subscription_site, 7);
}

TEST_F(Subscription, MembersFarApartAreWalkedWhereverTheyLieInTheirBytes) {
  reload(ConfigurationMessage().max_nodes(2049).adapters_per_node(48));
  const std::vector<size_t> members = {0,    7,    8,    63,    64,    65,    127,   128,   191,  1000,
                                       1001, 4095, 4096, 50000, 98288, 98343, 98344, 98350, 98351};
  Hb_Subscription_Group group = group_of_type(2);
  for (const size_t member : members) set_member(group, member);
  EXPECT_EQ(members, walked_adapters(group));
}

TEST_F(Subscription, TheOnlyMemberOfALargeSetIsFoundAtEachPlace) {
  reload(ConfigurationMessage().max_nodes(2049).adapters_per_node(48));
  for (size_t member = 0; member < 98352; member += member < 300 || member > 98000 ? 1 : 1009) {
    Hb_Subscription_Group group = group_of_type(2);
    set_member(group, member);
    ASSERT_THAT(walked_adapters(group), ElementsAre(member));
  }
}

TEST_F(Subscription, ABoundInsideAByteEndsTheWalk) {
  for (const int32_t bound : {1, 63, 64, 65, 100, 127, 129}) {
    reload(ConfigurationMessage().max_nodes(1).adapters_per_node(bound));
    Hb_Subscription_Group group = group_of_type(2);
    set_member(group, static_cast<size_t>(bound) - 1);
    for (size_t beyond = static_cast<size_t>(bound); beyond < 300; ++beyond) set_member(group, beyond);
    EXPECT_THAT(walked_adapters(group), ElementsAre(static_cast<size_t>(bound) - 1)) << bound;
  }
}

TEST_F(Subscription, MembersAreWalkedWithoutAskingTheConfiguration) {
  Hb_Subscription_Group group = group_of_type(2);
  set_member(group, 1);
  Hb_Adapter_Number adapter = 0;
  EXPECT_TRUE(succeeds([&] { return hb_get_first_subscription_adapter(&group, &adapter); }));
  EXPECT_EQ(1U, adapter);
}

template <typename Number>
void expect_walked_alone(Walk_Function<Number> first, Walk_Function<Number> next, int32_t walked_type) {
  std::vector<int32_t> types(std::begin(odd_types), std::end(odd_types));
  for (int32_t type = 0; type <= 9; ++type) types.push_back(type);
  for (const int32_t type : types) {
    if (type == walked_type) continue;
    Hb_Subscription_Group group = group_filled_with(0xFF, type);
    const Hb_Subscription_Group before = group;
    Number member = 99;
    EXPECT_TRUE(fails_with(11, [&] { return first(&group, &member); })) << type;
    EXPECT_TRUE(fails_with(11, [&] { return next(&group, &member); })) << type;
    EXPECT_TRUE(same_bytes(before, group)) << type;
  }
}

TEST_F(Subscription, OnlyAGroupOfAdaptersIsWalkedByAdapter) {
  expect_walked_alone(hb_get_first_subscription_adapter, hb_get_next_subscription_adapter, 2);
}

TEST_F(Subscription, OnlyAGroupOfNodesIsWalkedByNode) {
  expect_walked_alone(hb_get_first_subscription_node, hb_get_next_subscription_node, 0);
}

TEST_F(Subscription, OnlyAGroupOfSitesIsWalkedBySite) {
  expect_walked_alone(hb_get_first_subscription_site, hb_get_next_subscription_site, 7);
}

TEST_F(Subscription, ANullOutputIsRefused) {
  Hb_Subscription_Group group = group_filled_with(0xFF, 2);
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_first_subscription_adapter(&group, nullptr); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_next_subscription_adapter(&group, nullptr); }));
  group = group_filled_with(0xFF, 0);
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_first_subscription_node(&group, nullptr); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_next_subscription_node(&group, nullptr); }));
  group = group_filled_with(0xFF, 7);
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_first_subscription_site(&group, nullptr); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_next_subscription_site(&group, nullptr); }));
  EXPECT_EQ(-1, group.Hb_cursor);
}

}  // namespace
}  // namespace hb_test
