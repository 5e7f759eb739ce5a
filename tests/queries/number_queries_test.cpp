// Counts, numbers, addresses, types and names of the configuration.
#include <gmock/gmock.h>

#include <cstring>

#include "configuration_queries.h"

namespace hb_test {
namespace {

using testing::ElementsAre;

TEST_F(ConfigurationQueries, TheNumberOfNodesIsThatOfNodesWithAdapters) {
  int nodes = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_nodes(&nodes); }));
  EXPECT_EQ(3, nodes);
}

TEST_F(ConfigurationQueries, TheNumberOfNodesIsTheCompanionNotTheCountAsLoaded) {
  global_num_nodes = 6;
  int nodes = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_nodes(&nodes); }));
  EXPECT_EQ(6, nodes);
  EXPECT_EQ(3, global_config_tbl.Hb_num_nodes);
}

TEST_F(ConfigurationQueries, TheNumberOfAdaptersIsThatOfTheList) {
  int adapters = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_adapters(&adapters); }));
  EXPECT_EQ(5, adapters);
}

TEST_F(ConfigurationQueries, TheNumberOfNetworksIsAsLoaded) {
  int networks = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_networks(&networks); }));
  EXPECT_EQ(4, networks);
}

TEST_F(ConfigurationQueries, ThereAreNoSites) {
  int sites = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_sites(&sites); }));
  EXPECT_EQ(0, sites);
}

TEST_F(ConfigurationQueries, TheNumberOfSitesIsTheCompanion) {
  global_num_sites = 2;
  int sites = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_sites(&sites); }));
  EXPECT_EQ(2, sites);
}

TEST_F(ConfigurationQueries, ThisNodeIsTheLocalNodeOfTheTable) {
  Hb_Node_Number node = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_my_node_number(&node); }));
  EXPECT_EQ(3, node);
}

TEST_F(ConfigurationQueries, AnAdapterNumberIsNodeTimesAdaptersPerNodePlusOffset) {
  Hb_Adapter_Number adapter = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_number_by_node_number(4, 1, &adapter); }));
  EXPECT_EQ(17U, adapter);
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_number_by_node_number(0, 0, &adapter); }));
  EXPECT_EQ(0U, adapter);
}

TEST_F(ConfigurationQueries, AnAdapterOfANodeOrOffsetOutOfRangeIsRefused) {
  Hb_Adapter_Number adapter = 99;
  for (const int node : {-1, 8, -32768, 32767}) {
    EXPECT_TRUE(fails_with(4, [&] {
      return hb_get_adapter_number_by_node_number(static_cast<Hb_Node_Number>(node), 0, &adapter);
    })) << node;
  }
  for (const int offset : {-1, 4, 2147483647, -2147483647 - 1}) {
    EXPECT_TRUE(fails_with(4, [&] { return hb_get_adapter_number_by_node_number(0, offset, &adapter); })) << offset;
  }
  EXPECT_EQ(99U, adapter);
}

TEST_F(ConfigurationQueries, AnUnconfiguredSlotOfANodeIsNoAdapter) {
  Hb_Adapter_Number adapter = 99;
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_adapter_number_by_node_number(0, 3, &adapter); }));
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_adapter_number_by_node_number(7, 3, &adapter); }));
  EXPECT_EQ(99U, adapter);
}

TEST_F(ConfigurationQueries, TheNodeOfAnAdapterIsItsNumberDividedByAdaptersPerNode) {
  Hb_Node_Number node = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_node_number_by_adapter_number(17, &node); }));
  EXPECT_EQ(4, node);
  EXPECT_TRUE(succeeds([&] { return hb_get_node_number_by_adapter_number(2, &node); }));
  EXPECT_EQ(0, node);
}

TEST_F(ConfigurationQueries, TheNodeOfAnAdapterOutOfRangeIsRefused) {
  Hb_Node_Number node = 99;
  for (const Hb_Adapter_Number adapter : {32U, 0x80000000U, 0xFFFFFFFFU}) {
    EXPECT_TRUE(fails_with(4, [&] { return hb_get_node_number_by_adapter_number(adapter, &node); })) << adapter;
  }
  EXPECT_EQ(99, node);
}

TEST_F(ConfigurationQueries, AnUnconfiguredAdapterHasNoNode) {
  Hb_Node_Number node = 99;
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_node_number_by_adapter_number(31, &node); }));
  EXPECT_EQ(99, node);
}

TEST_F(ConfigurationQueries, TheAdaptersOfANodeAreCounted) {
  int adapters = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_adapters_in_node(0, &adapters); }));
  EXPECT_EQ(2, adapters);
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_adapters_in_node(4, &adapters); }));
  EXPECT_EQ(1, adapters);
}

TEST_F(ConfigurationQueries, TheAdaptersOfANodeOutOfRangeOrWithoutAnyAreNotCounted) {
  int adapters = 99;
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_number_of_configured_adapters_in_node(-1, &adapters); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_number_of_configured_adapters_in_node(8, &adapters); }));
  EXPECT_TRUE(fails_with(9, [&] { return hb_get_number_of_configured_adapters_in_node(1, &adapters); }));
  EXPECT_EQ(99, adapters);
}

TEST_F(ConfigurationQueries, AnAdapterIsFoundByItsAddress) {
  Hb_Adapter_Number adapter = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_number_by_address(address_of("10.0.0.3"), &adapter); }));
  EXPECT_EQ(12U, adapter);
}

TEST_F(ConfigurationQueries, AnUnknownAddressYieldsNoAdapter) {
  Hb_Adapter_Number adapter = 99;
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_adapter_number_by_address(address_of("10.0.0.4"), &adapter); }));
  EXPECT_EQ(0xFFFFFFFFU, adapter);
}

TEST_F(ConfigurationQueries, AllFourWordsOfAnAddressCount) {
  reload(sparse_cluster().adapter(8, "2001:db8:1:2:3:4:5:6"));
  Hb_Adapter_Number adapter = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_number_by_address(address_of("2001:db8:1:2:3:4:5:6"), &adapter); }));
  EXPECT_EQ(8U, adapter);
  for (const char* other :
       {"2001:db9:1:2:3:4:5:6", "2001:db8:1:3:3:4:5:6", "2001:db8:1:2:3:5:5:6", "2001:db8:1:2:3:4:5:7", "::10.0.0.3"}) {
    EXPECT_TRUE(fails_with(7, [&] { return hb_get_adapter_number_by_address(address_of(other), &adapter); })) << other;
  }
}

TEST_F(ConfigurationQueries, OfTwoAdaptersWithOneAddressTheEarlierInTheListIsFound) {
  reload(sparse_cluster().adapter(1, "10.0.0.3"));
  Hb_Adapter_Number adapter = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_number_by_address(address_of("10.0.0.3"), &adapter); }));
  EXPECT_EQ(12U, adapter);
}

TEST_F(ConfigurationQueries, AnAddressIsLookedUpInTheListNotInTheAddressTable) {
  Hash_clean(global_config_tbl.ip_hash);
  Hb_Adapter_Number adapter = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_number_by_address(address_of("10.0.1.4"), &adapter); }));
  EXPECT_EQ(17U, adapter);
}

TEST_F(ConfigurationQueries, TheAddressOfAnAdapterIsItsSixteenBytes) {
  Hb_IP_address6 address = {};
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_address_by_number(13, &address); }));
  EXPECT_EQ(Bytes("\0\0\0\0\0\0\0\0\0\0\xff\xff\x0a\0\x01\x03", 16), Bytes(reinterpret_cast<char*>(&address), 16));
}

TEST_F(ConfigurationQueries, AnAddressOfAnAdapterOutOfRangeOrUnconfiguredIsNotTold) {
  Hb_IP_address6 address = address_of("9.9.9.9");
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_adapter_address_by_number(32, &address); }));
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_adapter_address_by_number(1, &address); }));
  EXPECT_EQ(address_bytes("9.9.9.9"), Bytes(reinterpret_cast<char*>(&address), 16));
}

TEST_F(ConfigurationQueries, TheTypeOfAnAdapterComesWithItsTerminator) {
  char type[36];
  std::memset(type, 'x', sizeof type);
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_type_by_number(2, type); }));
  EXPECT_STREQ("disk2", type);
}

TEST_F(ConfigurationQueries, ATypeOf35CharactersComesWhole) {
  const std::string longest(35, 't');
  reload(sparse_cluster().adapter(8, "10.0.0.8", 0, longest));
  char type[36];
  std::memset(type, 'x', sizeof type);
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_type_by_number(8, type); }));
  EXPECT_EQ(longest, type);
}

TEST_F(ConfigurationQueries, ATypeOfAnAdapterOutOfRangeOrUnconfiguredIsNotTold) {
  char type[36] = "before";
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_adapter_type_by_number(32, type); }));
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_adapter_type_by_number(1, type); }));
  EXPECT_STREQ("before", type);
}

TEST_F(ConfigurationQueries, ANetworkIsFoundByItsName) {
  Hb_Network_Number network = 99;
  char name[] = "net_disk_01";
  EXPECT_TRUE(succeeds([&] { return hb_get_network_number_by_name(name, &network); }));
  EXPECT_EQ(3, network);
}

TEST_F(ConfigurationQueries, AnUnknownOrEmptyNameIsNoNetwork) {
  for (const char* other : {"net_disk_0", "net_disk_011", "NET_DISK_01", ""}) {
    Hb_Network_Number network = 99;
    std::string name = other;
    EXPECT_TRUE(fails_with(8, [&] { return hb_get_network_number_by_name(name.data(), &network); })) << other;
    EXPECT_EQ(-1, network);
  }
}

TEST_F(ConfigurationQueries, OfTwoNetworksWithOneNameTheFirstIsFound) {
  set_text(global_config_tbl.Hb_global_network_list[0].Hb_network_name, "net_disk_01");
  Hb_Network_Number network = 99;
  char name[] = "net_disk_01";
  EXPECT_TRUE(succeeds([&] { return hb_get_network_number_by_name(name, &network); }));
  EXPECT_EQ(0, network);
}

TEST_F(ConfigurationQueries, ANetworkBeyondTheAdaptersPerNodeIsNotFoundByName) {
  reload(sparse_cluster().network("net_fifth"));
  Hb_Network_Number network = 99;
  char name[] = "net_fifth";
  EXPECT_TRUE(fails_with(8, [&] { return hb_get_network_number_by_name(name, &network); }));
  EXPECT_EQ(-1, network);
  char text[70];
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_network_name_by_number(4, text); }));
}

TEST_F(ConfigurationQueries, TheNameAndTypeOfANetworkAreTold) {
  char name[70];
  std::memset(name, 'x', sizeof name);
  EXPECT_TRUE(succeeds([&] { return hb_get_network_name_by_number(1, name); }));
  EXPECT_STREQ("net_ether_02", name);
  char type[16];
  std::memset(type, 'x', sizeof type);
  EXPECT_TRUE(succeeds([&] { return hb_get_network_type_by_number(1, type); }));
  EXPECT_STREQ("fast", type);
}

TEST_F(ConfigurationQueries, NamesOf69AndTypesOf15CharactersComeWhole) {
  const std::string longest_name(69, 'n');
  const std::string longest_type(15, 't');
  reload(ConfigurationMessage()
             .max_nodes(1)
             .adapters_per_node(1)
             .adapter(0, "10.0.0.1")
             .network(longest_name, longest_type));
  char name[70];
  char type[16];
  EXPECT_TRUE(succeeds([&] { return hb_get_network_name_by_number(0, name); }));
  EXPECT_TRUE(succeeds([&] { return hb_get_network_type_by_number(0, type); }));
  EXPECT_EQ(longest_name, name);
  EXPECT_EQ(longest_type, type);
}

TEST_F(ConfigurationQueries, AnUnusedSlotHasATypeButNoName) {
  char name[70] = "before";
  EXPECT_TRUE(fails_with(8, [&] { return hb_get_network_name_by_number(2, name); }));
  EXPECT_STREQ("before", name);
  char type[16] = "before";
  EXPECT_TRUE(succeeds([&] { return hb_get_network_type_by_number(2, type); }));
  EXPECT_STREQ("", type);
}

TEST_F(ConfigurationQueries, AnUnusedSlotTellsTheTypeThatItHolds) {
  set_text(global_config_tbl.Hb_global_network_list[2].Hb_network_type, "stored");
  char type[16] = "before";
  EXPECT_TRUE(succeeds([&] { return hb_get_network_type_by_number(2, type); }));
  EXPECT_STREQ("stored", type);
}

TEST_F(ConfigurationQueries, ANetworkOutOfRangeIsRefused) {
  char text[70] = "before";
  for (const int number : {-1, 4, 48, 32767, -32768}) {
    const auto network = static_cast<Hb_Network_Number>(number);
    EXPECT_TRUE(fails_with(4, [&] { return hb_get_network_name_by_number(network, text); })) << number;
    EXPECT_TRUE(fails_with(4, [&] { return hb_get_network_type_by_number(network, text); })) << number;
  }
  EXPECT_STREQ("before", text);
}

TEST_F(ConfigurationQueries, TheNodeOfAnAdapterIsTraced) {
  trace_only(trace_info);
  Hb_Node_Number node;
  hb_get_node_number_by_adapter_number(17, &node);
  ASSERT_EQ(1U, platform_double().traces.size());
  const Recorded_Trace& trace = platform_double().traces[0];
  EXPECT_EQ("_HBC", trace.component);
  EXPECT_EQ(301U, trace.id);
  EXPECT_EQ(1, trace.category);
  EXPECT_THAT(trace.values, ElementsAre(17, 4));
}

TEST_F(ConfigurationQueries, TheAddressOfAnAdapterIsTracedAsText) {
  trace_only(trace_info);
  Hb_IP_address6 address;
  hb_get_adapter_address_by_number(13, &address);
  ASSERT_EQ(1U, platform_double().traces.size());
  const Recorded_Trace& trace = platform_double().traces[0];
  EXPECT_EQ("_HBC", trace.component);
  EXPECT_EQ(302U, trace.id);
  EXPECT_EQ(1, trace.category);
  ASSERT_EQ(2U, trace.blocks.size());
  EXPECT_EQ("10.0.1.3", trace.block_text(0));
  EXPECT_EQ(9U, trace.blocks[0].size());  // the text stands with its terminator
  EXPECT_EQ(13U, trace.block_value(1));
}

TEST_F(ConfigurationQueries, TheTypeOfAnAdapterIsTraced) {
  trace_only(trace_info);
  char type[36];
  hb_get_adapter_type_by_number(2, type);
  ASSERT_EQ(1U, platform_double().traces.size());
  const Recorded_Trace& trace = platform_double().traces[0];
  EXPECT_EQ("_HBC", trace.component);
  EXPECT_EQ(303U, trace.id);
  EXPECT_EQ(1, trace.category);
  ASSERT_EQ(2U, trace.blocks.size());
  EXPECT_EQ("disk2", trace.block_text(0));
  EXPECT_EQ(6U, trace.blocks[0].size());
  EXPECT_EQ(2U, trace.block_value(1));
}

}  // namespace
}  // namespace hb_test
