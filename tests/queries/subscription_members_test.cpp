// Subscription groups: their layout, filling them whole, and changing one member.
#include <gmock/gmock.h>

#include <functional>
#include <ostream>
#include <utility>

#include "subscription_record.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

TEST(SubscriptionRecord, HasTheLayoutThatTheDaemonReads) {
  EXPECT_EQ(record_size, sizeof(Hb_Subscription_Group));
  Hb_Subscription_Group group = group_of_type(0x01020304);
  group.Hb_cursor = 0x05060708;
  group.Hb_events = 0x090A0B0C;
  group.Hb_name[0] = 'n';
  group.Hb_netnum = 0x0D0E;
  group.Hb_subscription_grp_union.Hb_adapter_subscription_grp.Hb_num_adapters = 0x11121314;
  group.Hb_subscription_grp_union.Hb_adapter_subscription_grp.Hb_adapter_list[12293] = 0x77;
  EXPECT_EQ(0x04, byte_at(group, 0));
  EXPECT_EQ(0x08, byte_at(group, 4));
  EXPECT_EQ(0x0C, byte_at(group, 8));
  EXPECT_EQ('n', byte_at(group, 12));
  EXPECT_EQ(0x0E, byte_at(group, 44));
  EXPECT_EQ(0x14, byte_at(group, 48));
  EXPECT_EQ(0x77, byte_at(group, 52 + 12293));
}

TEST(SubscriptionRecord, KeepsAllThreeMemberSetsAtTheSamePlace) {
  Hb_Subscription_Group group = group_of_type(0);
  group.Hb_subscription_grp_union.Hb_node_subscription_grp.Hb_node_list[256] = 0x55;
  EXPECT_EQ(0x55, byte_at(group, 52 + 256));
  group.Hb_subscription_grp_union.Hb_site_subscription_grp.Hb_site_list[0] = 0x66;
  EXPECT_EQ(0x66, byte_at(group, 52));
}

TEST(SubscriptionRecord, TypesHaveTheirNumbers) {
  EXPECT_EQ(0, Hb_Node_Subscription);
  EXPECT_EQ(1, Hb_All_Nodes_Subscription);
  EXPECT_EQ(2, Hb_Adapter_Subscription);
  EXPECT_EQ(3, Hb_All_Adapters_Subscription);
  EXPECT_EQ(4, Hb_Empty_Subscription);
  EXPECT_EQ(5, Hb_Network_Subscription);
  EXPECT_EQ(6, Hb_Diff_Inst_Num_Subscription);
  EXPECT_EQ(7, Hb_Site_Subscription);
  EXPECT_EQ(8, Hb_All_Sites_Subscription);
  EXPECT_EQ(9, Hb_Split_Merge_Subscription);
}

TEST_F(Subscription, EmptyingAGroupChangesItsTypeAlone) {
  Hb_Subscription_Group group = group_filled_with(0xA5, 2);
  Hb_Subscription_Group expected = group;
  expected.Hb_subscription_type = static_cast<Hb_Subscription_Type>(4);
  EXPECT_TRUE(succeeds([&] { return hb_empty_subscription_group(&group); }));
  EXPECT_TRUE(same_bytes(expected, group));
}

TEST_F(Subscription, AllAdaptersSetsTheBitOfEachConfiguredAdapter) {
  Hb_Subscription_Group group = group_filled_with(0xFF, 7);
  EXPECT_TRUE(succeeds([&] { return hb_add_all_adapters_to_subscription_group(&group); }));
  EXPECT_EQ(2, group.Hb_subscription_type);
  EXPECT_EQ(5, count_of(group));
  EXPECT_THAT(members_of(group, 12294), ElementsAre(0, 2, 12, 13, 17));
}

TEST_F(Subscription, AllAdaptersClearsTheSetAndNothingBehindIt) {
  Hb_Subscription_Group group = group_filled_with(0xFF, 4);
  hb_add_all_adapters_to_subscription_group(&group);
  EXPECT_EQ(0x00, set_byte(group, 12293));
  EXPECT_EQ(0xFF, set_byte(group, 12294));
  EXPECT_EQ(0xFF, set_byte(group, 12295));
  expect_header_untouched(group);
}

TEST_F(Subscription, AnAdapterListThatIsNotThereHasNoMembers) {
  Hb_Adapter* const list = std::exchange(global_config_tbl.Hb_global_adapter_list, nullptr);
  Hb_Subscription_Group group = group_of_type(1);
  const Hb_Subscription_Group before = group;
  EXPECT_TRUE(succeeds([&] { return hb_add_network_to_subscription_group(&group, 1); }));
  EXPECT_TRUE(same_bytes(before, group));
  EXPECT_TRUE(succeeds([&] { return hb_add_all_adapters_to_subscription_group(&group); }));
  EXPECT_THAT(members_of(group, 12294), IsEmpty());
  global_config_tbl.Hb_global_adapter_list = list;
}

TEST_F(Subscription, AllNodesSetsTheBitOfEachConfiguredNode) {
  Hb_Subscription_Group group = group_filled_with(0xFF, 2);
  EXPECT_TRUE(succeeds([&] { return hb_add_all_nodes_to_subscription_group(&group); }));
  EXPECT_EQ(0, group.Hb_subscription_type);
  EXPECT_EQ(3, count_of(group));
  EXPECT_EQ(0x98, set_byte(group, 0));
  EXPECT_THAT(members_of(group, 257), ElementsAre(0, 3, 4));
}

TEST_F(Subscription, AllNodesClearsTheNodeSetAndNothingBehindIt) {
  Hb_Subscription_Group group = group_filled_with(0xFF, 2);
  hb_add_all_nodes_to_subscription_group(&group);
  EXPECT_EQ(0x00, set_byte(group, 256));
  EXPECT_EQ(0xFF, set_byte(group, 257));
}

TEST_F(Subscription, AllNodesLooksOnlyAtNodesBelowTheMaximum) {
  global_node_tbl[8] = Hb_True;
  Hb_Subscription_Group group = group_of_type(4);
  EXPECT_TRUE(succeeds([&] { return hb_add_all_nodes_to_subscription_group(&group); }));
  EXPECT_THAT(members_of(group, 257), ElementsAre(0, 3, 4));
}

TEST_F(Subscription, AllNodesFollowsTheFlagsOfTheNodes) {
  global_node_tbl[1] = Hb_True;
  global_node_tbl[3] = Hb_False;
  global_node_tbl[7] = Hb_True;
  Hb_Subscription_Group group = group_of_type(4);
  EXPECT_TRUE(succeeds([&] { return hb_add_all_nodes_to_subscription_group(&group); }));
  EXPECT_THAT(members_of(group, 257), ElementsAre(0, 1, 4, 7));
  EXPECT_EQ(3, count_of(group));
}

TEST_F(Subscription, AllNodesTakesItsCountFromTheNodeCount) {
  global_num_nodes = 7;
  Hb_Subscription_Group group = group_of_type(4);
  EXPECT_TRUE(succeeds([&] { return hb_add_all_nodes_to_subscription_group(&group); }));
  EXPECT_EQ(7, count_of(group));
}

TEST_F(Subscription, AllSitesSetsTheBitOfEachConfiguredSite) {
  Hb_Subscription_Group group = group_filled_with(0xFF, 2);
  EXPECT_TRUE(succeeds([&] { return hb_add_all_sites_to_subscription_group(&group); }));
  EXPECT_EQ(7, group.Hb_subscription_type);
  EXPECT_EQ(1, count_of(group));
  EXPECT_EQ(0x40, set_byte(group, 0));
  EXPECT_EQ(0xFF, set_byte(group, 1));
}

TEST_F(Subscription, AllSitesOfAConfigurationWithoutSitesIsAnEmptySet) {
  configure_sites({});
  Hb_Subscription_Group group = group_filled_with(0xFF, 2);
  EXPECT_TRUE(succeeds([&] { return hb_add_all_sites_to_subscription_group(&group); }));
  EXPECT_EQ(7, group.Hb_subscription_type);
  EXPECT_EQ(0, count_of(group));
  EXPECT_EQ(0x00, set_byte(group, 0));
}

TEST_F(Subscription, AllSitesTakesItsCountFromTheSiteCount) {
  global_num_sites = 2;
  Hb_Subscription_Group group = group_of_type(4);
  EXPECT_TRUE(succeeds([&] { return hb_add_all_sites_to_subscription_group(&group); }));
  EXPECT_EQ(2, count_of(group));
}

TEST_F(Subscription, AllSitesLooksOnlyAtSitesBelowTheMaximum) {
  global_config_tbl.Hb_max_sites = 1;
  Hb_Subscription_Group group = group_filled_with(0xFF, 2);
  EXPECT_TRUE(succeeds([&] { return hb_add_all_sites_to_subscription_group(&group); }));
  EXPECT_EQ(0x00, set_byte(group, 0));
  EXPECT_EQ(1, count_of(group));
}

TEST_F(Subscription, TheMostSignificantBitOfAByteIsItsFirstMember) {
  reload(sparse_cluster().adapter(9, "10.0.0.9"));
  Hb_Subscription_Group group = group_of_type(4);
  EXPECT_TRUE(succeeds([&] { return hb_add_adapter_to_subscription_group(&group, 9); }));
  EXPECT_EQ(0x00, set_byte(group, 0));
  EXPECT_EQ(0x40, set_byte(group, 1));
  EXPECT_EQ(1, count_of(group));
  EXPECT_EQ(2, group.Hb_subscription_type);
  EXPECT_TRUE(succeeds([&] { return hb_add_adapter_to_subscription_group(&group, 9); }));
  EXPECT_EQ(0x40, set_byte(group, 1));
  EXPECT_EQ(1, count_of(group));
}

TEST_F(Subscription, RemovingANodeFromAnEmptyGroupMakesItAnEmptyNodeGroup) {
  Hb_Subscription_Group group = group_filled_with(0xFF, 4);
  EXPECT_TRUE(succeeds([&] { return hb_remove_node_from_subscription_group(&group, 3); }));
  EXPECT_EQ(0, group.Hb_subscription_type);
  EXPECT_EQ(0, count_of(group));
  EXPECT_THAT(members_of(group, 257), IsEmpty());
}

TEST_F(Subscription, TheHighestNodeIsInTheLastByteOfTheNodeSet) {
  reload(ConfigurationMessage().max_nodes(2049).adapters_per_node(1).adapter(2048, "10.0.0.1"));
  Hb_Subscription_Group group = group_of_type(4);
  EXPECT_TRUE(succeeds([&] { return hb_add_node_to_subscription_group(&group, 2048); }));
  EXPECT_EQ(0x80, set_byte(group, 256));
  EXPECT_EQ(1, count_of(group));
  Hb_Node_Number node = 0;
  EXPECT_TRUE(succeeds([&] { return hb_get_first_subscription_node(&group, &node); }));
  EXPECT_EQ(2048, node);
}

TEST_F(Subscription, MembersAddUpAndRemovingOneLeavesTheOthers) {
  Hb_Subscription_Group group = group_of_type(4);
  for (const Hb_Adapter_Number adapter : {17U, 0U, 13U}) {
    EXPECT_TRUE(succeeds([&] { return hb_add_adapter_to_subscription_group(&group, adapter); }));
  }
  EXPECT_EQ(3, count_of(group));
  EXPECT_TRUE(succeeds([&] { return hb_remove_adapter_from_subscription_group(&group, 0); }));
  EXPECT_EQ(2, count_of(group));
  EXPECT_THAT(members_of(group, 12294), ElementsAre(13, 17));
}

TEST_F(Subscription, RemovingAnAbsentMemberChangesNothingAndSucceeds) {
  Hb_Subscription_Group group = group_of_type(4);
  hb_add_node_to_subscription_group(&group, 3);
  const Hb_Subscription_Group before = group;
  EXPECT_TRUE(succeeds([&] { return hb_remove_node_from_subscription_group(&group, 4); }));
  EXPECT_TRUE(same_bytes(before, group));
}

TEST_F(Subscription, ACountAtItsEndGoesOnAtTheOther) {
  Hb_Subscription_Group group = group_of_type(6);
  set_count(group, std::numeric_limits<int32_t>::max());
  EXPECT_TRUE(succeeds([&] { return hb_add_node_to_subscription_group(&group, 3); }));
  EXPECT_EQ(std::numeric_limits<int32_t>::min(), count_of(group));
  EXPECT_TRUE(succeeds([&] { return hb_remove_node_from_subscription_group(&group, 3); }));
  EXPECT_EQ(std::numeric_limits<int32_t>::max(), count_of(group));
}

TEST_F(Subscription, ANetworkBringsAllItsAdapters) {
  Hb_Subscription_Group group = group_of_type(4);
  EXPECT_TRUE(succeeds([&] { return hb_add_network_to_subscription_group(&group, 1); }));
  EXPECT_EQ(5, group.Hb_subscription_type);
  EXPECT_EQ(2, count_of(group));
  EXPECT_THAT(members_of(group, 12294), ElementsAre(13, 17));
}

TEST_F(Subscription, ASecondNetworkDoesNotFit) {
  Hb_Subscription_Group group = group_of_type(4);
  hb_add_network_to_subscription_group(&group, 1);
  const Hb_Subscription_Group before = group;
  EXPECT_TRUE(fails_with(11, [&] { return hb_add_network_to_subscription_group(&group, 0); }));
  EXPECT_TRUE(same_bytes(before, group));
}

TEST_F(Subscription, ANetworkCountsOnlyTheAdaptersThatItAdds) {
  Hb_Subscription_Group group = group_of_type(1);
  set_member(group, 17);
  set_count(group, 1);
  EXPECT_TRUE(succeeds([&] { return hb_add_network_to_subscription_group(&group, 1); }));
  EXPECT_EQ(2, count_of(group));
}

TEST_F(Subscription, ANetworkRemovesOnlyItsOwnAdapters) {
  Hb_Subscription_Group group = group_of_type(3);
  for (const size_t member : {0U, 13U, 12U}) set_member(group, member);
  set_count(group, 3);
  EXPECT_TRUE(succeeds([&] { return hb_remove_network_from_subscription_group(&group, 1); }));
  EXPECT_EQ(2, count_of(group));
  EXPECT_THAT(members_of(group, 12294), ElementsAre(0, 12));
}

TEST_F(Subscription, NoMemberFunctionWritesTheNetworkNumberOfTheRecord) {
  Hb_Subscription_Group group = group_of_type(4);
  group.Hb_netnum = 0x1234;
  hb_add_network_to_subscription_group(&group, 1);
  EXPECT_EQ(0x1234, group.Hb_netnum);
}

struct Number_Check {
  const char* name;
  int error;
  std::function<Hb_Rc(Hb_Subscription_Group*)> add;
  std::function<Hb_Rc(Hb_Subscription_Group*)> remove;
};

void PrintTo(const Number_Check& check, std::ostream* stream) { *stream << check.name; }

Number_Check adapter_check(const char* name, Hb_Adapter_Number adapter, int error) {
  return {name, error,
          [=](Hb_Subscription_Group* group) { return hb_add_adapter_to_subscription_group(group, adapter); },
          [=](Hb_Subscription_Group* group) { return hb_remove_adapter_from_subscription_group(group, adapter); }};
}

Number_Check network_check(const char* name, Hb_Network_Number network, int error) {
  return {name, error,
          [=](Hb_Subscription_Group* group) { return hb_add_network_to_subscription_group(group, network); },
          [=](Hb_Subscription_Group* group) { return hb_remove_network_from_subscription_group(group, network); }};
}

Number_Check node_check(const char* name, Hb_Node_Number node, int error) {
  return {name, error, [=](Hb_Subscription_Group* group) { return hb_add_node_to_subscription_group(group, node); },
          [=](Hb_Subscription_Group* group) { return hb_remove_node_from_subscription_group(group, node); }};
}

Number_Check site_check(const char* name, Hb_Site_Number site, int error) {
  return {name, error, [=](Hb_Subscription_Group* group) { return hb_add_site_to_subscription_group(group, site); },
          [=](Hb_Subscription_Group* group) { return hb_remove_site_from_subscription_group(group, site); }};
}

void expect_refused(const Number_Check& check) {
  for (int32_t type = 0; type <= 9; ++type) {
    Hb_Subscription_Group group = group_filled_with(0x3C, type);
    const Hb_Subscription_Group before = group;
    EXPECT_TRUE(fails_with(check.error, [&] { return check.add(&group); })) << check.name << ", type " << type;
    EXPECT_TRUE(fails_with(check.error, [&] { return check.remove(&group); })) << check.name << ", type " << type;
    EXPECT_TRUE(same_bytes(before, group)) << check.name << ", type " << type;
  }
}

class NumberCheck : public Subscription, public testing::WithParamInterface<Number_Check> {};

TEST_P(NumberCheck, FailsAndLeavesTheGroupWhateverItsType) { expect_refused(GetParam()); }

INSTANTIATE_TEST_SUITE_P(
    Subscription, NumberCheck,
    testing::Values(adapter_check("AdapterAtTheLimitOfTheCluster", 32, 4),
                    adapter_check("AdapterNumberOfNone", 0xFFFFFFFFU, 4),
                    adapter_check("AdapterThatIsNotConfigured", 1, 7),
                    adapter_check("LastAdapterBelowTheLimitNotConfigured", 31, 7),
                    network_check("NegativeNetwork", -1, 4), network_check("NetworkAtAdaptersPerNode", 4, 4),
                    network_check("NetworkOfAnUnusedSlot", 2, 8), node_check("NegativeNode", -1, 4),
                    node_check("NodeAtTheMaximum", 8, 4), node_check("NodeWithoutAdapters", 1, 9),
                    node_check("LastNodeBelowTheMaximumWithoutAdapters", 7, 9), site_check("SiteAtTheMaximum", 2, 4),
                    site_check("SiteNumberOfNone", 65535, 4), site_check("SiteThatIsNotConfigured", 0, 84)),
    [](const auto& test) { return std::string(test.param.name); });

TEST_F(Subscription, ANodeIsTakenByItsFlag) {
  global_node_tbl[1] = Hb_True;
  global_node_tbl[3] = Hb_False;
  global_node_tbl[7] = Hb_True;
  Hb_Subscription_Group group = group_of_type(4);
  EXPECT_TRUE(succeeds([&] { return hb_add_node_to_subscription_group(&group, 1); }));
  EXPECT_TRUE(succeeds([&] { return hb_add_node_to_subscription_group(&group, 7); }));
  EXPECT_THAT(members_of(group, 257), ElementsAre(1, 7));
  expect_refused(node_check("node whose flag is cleared", 3, 9));
}

TEST_F(Subscription, AnAdapterIsTakenByItsTableAndANetworkByTheList) {
  ASSERT_NE(nullptr, Hash_delete(13, global_config_tbl.adap_hash));
  expect_refused(adapter_check("adapter in the list alone", 13, 7));
  Hb_Subscription_Group group = group_of_type(4);
  EXPECT_TRUE(succeeds([&] { return hb_add_network_to_subscription_group(&group, 1); }));
  EXPECT_THAT(members_of(group, 12294), ElementsAre(13, 17));
}

TEST_F(Subscription, NetworksAreBoundByTheAdaptersPerNodeNotByTheirCountOrTheirSlots) {
  struct Cluster {
    int32_t adapters_per_node;
    int networks;
    std::vector<Number_Check> checks;
  };
  const Cluster clusters[] = {
      {2, 4, {network_check("used slot at the bound", 2, 4)}},
      {6, 4, {network_check("last below the bound", 5, 8), network_check("at the bound", 6, 4)}},
      {60, 48, {network_check("behind the slots", 48, 8), network_check("last", 59, 8), network_check("at 60", 60, 4)}},
  };
  for (const Cluster& cluster : clusters) {
    ConfigurationMessage configuration;
    configuration.max_nodes(2).adapters_per_node(cluster.adapters_per_node);
    for (int network = 0; network < cluster.networks; ++network) configuration.network("net");
    reload(configuration);
    for (const Number_Check& check : cluster.checks) expect_refused(check);
  }
}

TEST_F(Subscription, SitesBeyondTheTwoFlagsAreNotConfigured) {
  global_config_tbl.Hb_max_sites = 9;
  expect_refused(site_check("first without a flag", 2, 84));
  expect_refused(site_check("last below the maximum", 8, 84));
  Hb_Subscription_Group group = group_of_type(4);
  EXPECT_TRUE(succeeds([&] { return hb_add_all_sites_to_subscription_group(&group); }));
  EXPECT_THAT(members_of(group, 2), ElementsAre(1));
}

}  // namespace
}  // namespace hb_test
