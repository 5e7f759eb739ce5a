// Walking what is configured, and the bound of network numbers.
#include <gmock/gmock.h>

#include <cstring>
#include <functional>
#include <ostream>
#include <utility>

#include "configuration_queries.h"

namespace hb_test {
namespace {

using testing::ElementsAre;

// One first/next pair, with what it is to yield in the sparse cluster.
struct Walk {
  const char* name;
  std::function<Hb_Rc(int64_t*, Hb_Cursor*)> first;
  std::function<Hb_Rc(int64_t*, Hb_Cursor*)> next;
  std::vector<int64_t> items;
  std::vector<Hb_Cursor> cursors;  // after each item
  int64_t none;
};

void PrintTo(const Walk& walk, std::ostream* stream) { *stream << walk.name; }

// The pair with its output widened, so that all walks look alike.
template <typename Number, typename Call>
std::function<Hb_Rc(int64_t*, Hb_Cursor*)> widened(Call call) {
  return [call](int64_t* item, Hb_Cursor* cursor) {
    auto number = static_cast<Number>(*item);
    const Hb_Rc result = call(&number, cursor);
    *item = number;
    return result;
  };
}

template <typename Number, typename First, typename Next>
Walk walk(const char* name, First first, Next next, std::vector<int64_t> items, std::vector<Hb_Cursor> cursors,
          int64_t none) {
  return {name, widened<Number>(first), widened<Number>(next), std::move(items), std::move(cursors), none};
}

std::vector<Walk> walks() {
  return {
      walk<Hb_Node_Number>("Nodes", hb_get_first_configured_node_number, hb_get_next_configured_node_number, {0, 3, 4},
                           {1, 4, 5}, -1),
      walk<Hb_Adapter_Number>("Adapters", hb_get_first_configured_adapter_number, hb_get_next_configured_adapter_number,
                              {13, 0, 12, 17, 2}, {1, 2, 3, 4, 5}, 0xFFFFFFFF),
      walk<Hb_Adapter_Number>(
          "AdaptersOfANode",
          [](auto* item, auto* cursor) { return hb_get_first_configured_adapter_in_node(0, item, cursor); },
          [](auto* item, auto* cursor) { return hb_get_next_configured_adapter_in_node(0, item, cursor); }, {0, 2},
          {1, 3}, 0xFFFFFFFF),
      walk<Hb_Adapter_Number>(
          "AdaptersOfAnotherNode",
          [](auto* item, auto* cursor) { return hb_get_first_configured_adapter_in_node(3, item, cursor); },
          [](auto* item, auto* cursor) { return hb_get_next_configured_adapter_in_node(3, item, cursor); }, {12, 13},
          {1, 2}, 0xFFFFFFFF),
      walk<Hb_Network_Number>("Networks", hb_get_first_configured_network_number, hb_get_next_configured_network_number,
                              {0, 1, 3}, {1, 2, 4}, -1),
      walk<Hb_Adapter_Number>(
          "AdaptersOfANetwork",
          [](auto* item, auto* cursor) { return hb_get_first_configured_adapter_in_network(1, item, cursor); },
          [](auto* item, auto* cursor) { return hb_get_next_configured_adapter_in_network(1, item, cursor); }, {13, 17},
          {1, 4}, 0xFFFFFFFF),
      walk<Hb_Site_Number>("Sites", hb_get_first_configured_site_number, hb_get_next_configured_site_number, {1}, {2},
                           65535),
  };
}

class Walks : public ConfigurationQueries, public testing::WithParamInterface<Walk> {
 protected:
  Walks() {
    global_config_tbl.Hb_max_sites = 2;
    global_site_tbl[1] = Hb_True;
  }

  const Walk& walk_ = GetParam();
};

TEST_P(Walks, YieldTheirItemsInOrderAndMoveTheCursorBehindEach) {
  int64_t item = 77;
  Hb_Cursor cursor = 1000;
  for (size_t index = 0; index < walk_.items.size(); ++index) {
    EXPECT_TRUE(succeeds([&] { return index == 0 ? walk_.first(&item, &cursor) : walk_.next(&item, &cursor); }));
    EXPECT_EQ(walk_.items[index], item);
    EXPECT_EQ(walk_.cursors[index], cursor);
  }
}

TEST_P(Walks, KeepFailingAtTheEndWithNoneAndLeaveTheCursor) {
  Hb_Cursor cursor = walk_.cursors.back();
  for (int call = 0; call < 3; ++call) {
    int64_t item = 77;
    EXPECT_TRUE(fails_with(1, [&] { return walk_.next(&item, &cursor); }));
    EXPECT_EQ(walk_.none, item);
    EXPECT_EQ(walk_.cursors.back(), cursor);
  }
}

TEST_P(Walks, StartAgainWithAFirstCall) {
  int64_t item = 77;
  Hb_Cursor cursor = walk_.cursors.back();
  EXPECT_TRUE(succeeds([&] { return walk_.first(&item, &cursor); }));
  EXPECT_EQ(walk_.items.front(), item);
  EXPECT_EQ(walk_.cursors.front(), cursor);
}

TEST_P(Walks, TakeACursorOutsideTheListAsItsEnd) {
  for (const Hb_Cursor outside : {-1, -2147483647 - 1, 98352, 2147483647}) {
    Hb_Cursor cursor = outside;
    int64_t item = 77;
    EXPECT_TRUE(fails_with(1, [&] { return walk_.next(&item, &cursor); })) << outside;
    EXPECT_EQ(walk_.none, item) << outside;
    EXPECT_EQ(outside, cursor);
  }
}

TEST_P(Walks, RefuseANullCursor) {
  int64_t item = 77;
  EXPECT_TRUE(fails_with(4, [&] { return walk_.first(&item, nullptr); }));
  EXPECT_TRUE(fails_with(4, [&] { return walk_.next(&item, nullptr); }));
}

INSTANTIATE_TEST_SUITE_P(ConfigurationQueries, Walks, testing::ValuesIn(walks()),
                         [](const auto& test) { return std::string(test.param.name); });

// All items of a walk, and behind them what it stores at its end.
template <typename Number, typename First, typename Next>
std::vector<int64_t> walked(First first, Next next) {
  constexpr size_t too_many = 100;
  std::vector<int64_t> items;
  Number item = 77;
  Hb_Cursor cursor = 55;
  set_hb_errno(untouched_error);
  Hb_Rc result = first(&item, &cursor);
  while (result == Hb_Success && items.size() < too_many) {
    items.push_back(item);
    result = next(&item, &cursor);
  }
  EXPECT_EQ(1, hb_get_errno());
  items.push_back(item);
  return items;
}

std::vector<int64_t> walked_nodes() {
  return walked<Hb_Node_Number>(hb_get_first_configured_node_number, hb_get_next_configured_node_number);
}

std::vector<int64_t> walked_adapters() {
  return walked<Hb_Adapter_Number>(hb_get_first_configured_adapter_number, hb_get_next_configured_adapter_number);
}

std::vector<int64_t> walked_adapters_of_node(Hb_Node_Number node) {
  return walked<Hb_Adapter_Number>(
      [node](auto* item, auto* cursor) { return hb_get_first_configured_adapter_in_node(node, item, cursor); },
      [node](auto* item, auto* cursor) { return hb_get_next_configured_adapter_in_node(node, item, cursor); });
}

std::vector<int64_t> walked_networks() {
  return walked<Hb_Network_Number>(hb_get_first_configured_network_number, hb_get_next_configured_network_number);
}

std::vector<int64_t> walked_adapters_of_network(Hb_Network_Number network) {
  return walked<Hb_Adapter_Number>(
      [network](auto* item, auto* cursor) { return hb_get_first_configured_adapter_in_network(network, item, cursor); },
      [network](auto* item, auto* cursor) { return hb_get_next_configured_adapter_in_network(network, item, cursor); });
}

std::vector<int64_t> walked_sites() {
  return walked<Hb_Site_Number>(hb_get_first_configured_site_number, hb_get_next_configured_site_number);
}

TEST_F(ConfigurationQueries, EveryRecordOfTheListCounts) {
  // One number for the second time, and one behind the last node's.
  reload(sparse_cluster().adapter(17, "10.0.9.9", 1).adapter(32, "10.9.9.9", 1));
  int adapters = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_adapters(&adapters); }));
  EXPECT_EQ(7, adapters);
  EXPECT_THAT(walked_adapters(), ElementsAre(13, 0, 12, 17, 2, 17, 32, 0xFFFFFFFF));
  EXPECT_THAT(walked_adapters_of_network(1), ElementsAre(13, 17, 17, 32, 0xFFFFFFFF));
  Hb_Adapter_Number adapter = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_number_by_address(address_of("10.9.9.9"), &adapter); }));
  EXPECT_EQ(32U, adapter);
}

TEST_F(ConfigurationQueries, AnAdapterTakenOutOfItsTableIsLeftInTheListOnly) {
  ASSERT_NE(nullptr, Hash_delete(12, global_config_tbl.adap_hash));
  Hb_Adapter_Number adapter = 99;
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_adapter_number_by_node_number(3, 0, &adapter); }));
  EXPECT_EQ(99U, adapter);
  Hb_Node_Number node;
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_node_number_by_adapter_number(12, &node); }));
  Hb_IP_address6 address;
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_adapter_address_by_number(12, &address); }));
  char type[36];
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_adapter_type_by_number(12, type); }));
  int adapters = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_adapters_in_node(3, &adapters); }));
  EXPECT_EQ(1, adapters);
  EXPECT_THAT(walked_adapters_of_node(3), ElementsAre(13, 0xFFFFFFFF));
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_adapters(&adapters); }));
  EXPECT_EQ(5, adapters);
  EXPECT_THAT(walked_adapters(), ElementsAre(13, 0, 12, 17, 2, 0xFFFFFFFF));
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_number_by_address(address_of("10.0.0.3"), &adapter); }));
  EXPECT_EQ(12U, adapter);
}

TEST_F(ConfigurationQueries, TheFlagOfANodeSaysWhetherItIsConfiguredNotItsAdapters) {
  global_node_tbl[1] = Hb_True;
  global_node_tbl[3] = Hb_False;
  EXPECT_THAT(walked_nodes(), ElementsAre(0, 1, 4, -1));
  int adapters = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_adapters_in_node(1, &adapters); }));
  EXPECT_EQ(0, adapters);
  EXPECT_THAT(walked_adapters_of_node(1), ElementsAre(0xFFFFFFFF));
  EXPECT_TRUE(fails_with(9, [&] { return hb_get_number_of_configured_adapters_in_node(3, &adapters); }));
  Hb_Adapter_Number adapter = 99;
  Hb_Cursor cursor = 0;
  EXPECT_TRUE(fails_with(9, [&] { return hb_get_first_configured_adapter_in_node(3, &adapter, &cursor); }));
  EXPECT_TRUE(fails_with(9, [&] { return hb_get_next_configured_adapter_in_node(3, &adapter, &cursor); }));
  EXPECT_EQ(99U, adapter);
}

TEST_F(ConfigurationQueries, WithoutAnAdapterListNoAdapterIsFoundInIt) {
  Hb_Adapter* const list = std::exchange(global_config_tbl.Hb_global_adapter_list, nullptr);
  Hb_Adapter_Number adapter = 99;
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_adapter_number_by_address(address_of("10.0.1.3"), &adapter); }));
  EXPECT_EQ(0xFFFFFFFFU, adapter);
  EXPECT_THAT(walked_adapters(), ElementsAre(0xFFFFFFFF));
  EXPECT_THAT(walked_adapters_of_network(1), ElementsAre(0xFFFFFFFF));
  global_config_tbl.Hb_global_adapter_list = list;
}

TEST_F(ConfigurationQueries, ANetworkBeyondTheAdaptersPerNodeIsNotWalked) {
  reload(sparse_cluster().network("net_fifth"));
  EXPECT_THAT(walked_networks(), ElementsAre(0, 1, 3, -1));
}

TEST_F(ConfigurationQueries, SitesAreWalkedBelowTheirMaximumAndNoFurtherThanTheirFlags) {
  global_site_tbl[0] = global_site_tbl[1] = Hb_True;
  global_config_tbl.Hb_max_sites = 1;
  EXPECT_THAT(walked_sites(), ElementsAre(0, 65535));
  global_config_tbl.Hb_max_sites = 5;
  EXPECT_THAT(walked_sites(), ElementsAre(0, 1, 65535));
}

TEST_F(ConfigurationQueries, TheAdaptersOfANodeOutOfRangeOrWithoutAnyAreNotWalked) {
  Hb_Adapter_Number adapter = 99;
  Hb_Cursor cursor = 55;
  for (const int number : {-1, 8}) {
    const auto node = static_cast<Hb_Node_Number>(number);
    EXPECT_TRUE(fails_with(4, [&] { return hb_get_first_configured_adapter_in_node(node, &adapter, &cursor); }));
    EXPECT_TRUE(fails_with(4, [&] { return hb_get_next_configured_adapter_in_node(node, &adapter, &cursor); }));
  }
  EXPECT_TRUE(fails_with(9, [&] { return hb_get_first_configured_adapter_in_node(1, &adapter, &cursor); }));
  EXPECT_TRUE(fails_with(9, [&] { return hb_get_next_configured_adapter_in_node(1, &adapter, &cursor); }));
  EXPECT_EQ(99U, adapter);
  EXPECT_EQ(55, cursor);
}

TEST_F(ConfigurationQueries, TheAdaptersOfANetworkOutOfRangeOrUnusedAreNotWalked) {
  Hb_Adapter_Number adapter = 99;
  Hb_Cursor cursor = 55;
  for (const int number : {-1, 4}) {
    const auto network = static_cast<Hb_Network_Number>(number);
    EXPECT_TRUE(fails_with(4, [&] { return hb_get_first_configured_adapter_in_network(network, &adapter, &cursor); }));
    EXPECT_TRUE(fails_with(4, [&] { return hb_get_next_configured_adapter_in_network(network, &adapter, &cursor); }));
  }
  EXPECT_TRUE(fails_with(8, [&] { return hb_get_first_configured_adapter_in_network(2, &adapter, &cursor); }));
  EXPECT_TRUE(fails_with(8, [&] { return hb_get_next_configured_adapter_in_network(2, &adapter, &cursor); }));
  EXPECT_EQ(99U, adapter);
  EXPECT_EQ(55, cursor);
}

TEST_F(ConfigurationQueries, ANetworkInUseWithoutAdaptersEndsAtOnce) {
  set_text(global_config_tbl.Hb_global_network_list[2].Hb_network_name, "net_idle");
  Hb_Adapter_Number adapter = 99;
  Hb_Cursor cursor = 55;
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_first_configured_adapter_in_network(2, &adapter, &cursor); }));
  EXPECT_EQ(0xFFFFFFFFU, adapter);
  EXPECT_EQ(55, cursor);
}

TEST_F(ConfigurationQueries, WithoutSitesTheFirstSiteFailsAtOnce) {
  Hb_Site_Number site = 99;
  Hb_Cursor cursor = 55;
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_first_configured_site_number(&site, &cursor); }));
  EXPECT_EQ(65535, site);
  EXPECT_EQ(55, cursor);
}

TEST_F(ConfigurationQueries, NodesAtTheMaximumAreNotWalked) {
  global_node_tbl[8] = Hb_True;
  Hb_Node_Number node = 99;
  Hb_Cursor cursor = 5;
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_configured_node_number(&node, &cursor); }));
}

TEST_F(ConfigurationQueries, OfNodes0And3Of8OnlyTheseAreWalked) {
  reload(ConfigurationMessage().max_nodes(8).adapters_per_node(2).adapter(0, "10.0.0.1").adapter(7, "10.0.0.2"));
  Hb_Node_Number node = 99;
  Hb_Cursor cursor = 0;
  EXPECT_EQ(Hb_Success, hb_get_first_configured_node_number(&node, &cursor));
  EXPECT_EQ(0, node);
  EXPECT_EQ(Hb_Success, hb_get_next_configured_node_number(&node, &cursor));
  EXPECT_EQ(3, node);
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_configured_node_number(&node, &cursor); }));
  EXPECT_EQ(-1, node);
}

// Two nodes of 60 slots; all 48 networks that a configuration can hold.
ConfigurationMessage wide_nodes() {
  ConfigurationMessage configuration;
  configuration.max_nodes(2).adapters_per_node(60).adapter(59, "10.0.0.1", 50).adapter(60, "10.0.0.2", 47);
  for (int network = 0; network < 48; ++network) configuration.network("net" + std::to_string(network));
  return configuration;
}

TEST_F(ConfigurationQueries, NetworksBeyondThe48SlotsAreUnusedOnes) {
  reload(wide_nodes());
  for (const int number : {48, 59}) {
    const auto network = static_cast<Hb_Network_Number>(number);
    char text[70] = "before";
    Hb_Adapter_Number adapter = 99;
    Hb_Cursor cursor = 55;
    EXPECT_TRUE(fails_with(8, [&] { return hb_get_network_name_by_number(network, text); })) << number;
    EXPECT_STREQ("before", text);
    EXPECT_TRUE(fails_with(8, [&] { return hb_get_first_configured_adapter_in_network(network, &adapter, &cursor); }));
    EXPECT_TRUE(succeeds([&] { return hb_get_network_type_by_number(network, text); })) << number;
    EXPECT_STREQ("", text);
  }
  char text[70];
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_network_name_by_number(60, text); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_network_type_by_number(60, text); }));
}

TEST_F(ConfigurationQueries, AllSlotsAreWalkedAndSearchedWhenNodesHaveMoreAdaptersThanSlots) {
  reload(wide_nodes());
  Hb_Network_Number network = 99;
  Hb_Cursor cursor = 47;
  EXPECT_TRUE(succeeds([&] { return hb_get_next_configured_network_number(&network, &cursor); }));
  EXPECT_EQ(47, network);
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_configured_network_number(&network, &cursor); }));
  EXPECT_EQ(-1, network);
  char last[] = "net47";
  EXPECT_TRUE(succeeds([&] { return hb_get_network_number_by_name(last, &network); }));
  EXPECT_EQ(47, network);
  char unknown[] = "net48";
  EXPECT_TRUE(fails_with(8, [&] { return hb_get_network_number_by_name(unknown, &network); }));
}

TEST_F(ConfigurationQueries, ASlotOfANodeBeyond48IsAnAdapterLikeAnyOther) {
  reload(wide_nodes());
  Hb_Adapter_Number adapter = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_number_by_node_number(0, 59, &adapter); }));
  EXPECT_EQ(59U, adapter);
  Hb_Node_Number node = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_node_number_by_adapter_number(60, &node); }));
  EXPECT_EQ(1, node);
}

TEST_F(ConfigurationQueries, ASlotBeyondTheNumberOfNetworksCountsWhenItHoldsAName) {
  reload(ConfigurationMessage().max_nodes(1).adapters_per_node(5).adapter(0, "10.0.0.1", 3).network("only"));
  set_text(global_config_tbl.Hb_global_network_list[3].Hb_network_name, "net_left");
  Hb_Network_Number network = 99;
  Hb_Cursor cursor = 2;
  EXPECT_TRUE(succeeds([&] { return hb_get_next_configured_network_number(&network, &cursor); }));
  EXPECT_EQ(3, network);
  network = 99;
  char name[] = "net_left";
  EXPECT_TRUE(succeeds([&] { return hb_get_network_number_by_name(name, &network); }));
  EXPECT_EQ(3, network);
  Hb_Adapter_Number adapter = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_first_configured_adapter_in_network(3, &adapter, &cursor); }));
  EXPECT_EQ(0U, adapter);
  int networks = 99;
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_networks(&networks); }));
  EXPECT_EQ(1, networks);
}

TEST_F(ConfigurationQueries, FewerNetworksThanAdaptersPerNodeLeaveUnusedSlots) {
  reload(ConfigurationMessage().max_nodes(1).adapters_per_node(5).adapter(0, "10.0.0.1").network("only"));
  char text[70] = "before";
  EXPECT_TRUE(fails_with(8, [&] { return hb_get_network_name_by_number(4, text); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_network_name_by_number(5, text); }));
}

}  // namespace
}  // namespace hb_test
