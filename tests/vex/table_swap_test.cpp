// The new table takes the place of the one in force.
#include "hb_global_data/record_index.h"
#include "table_state.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class TableSwap : public TableState {
 protected:
  // The table in force: nodes 1 and 2 with an adapter each. The new one: nodes 2 and 3, and three adapters.
  TableSwap() {
    fill_table(global_config_tbl, 2049, 48, {{1}, {2}}, {{48, Hb_Entity_Up, "old0"}, {96, Hb_Entity_Up, "old1"}});
    index_configuration();
    fill_table(global_config_tbl_new, 2049, 48, {{2, Hb_Entity_Down, Hb_Entity_State_Reason_SHUT_Down}, {3}},
               {{96, Hb_Entity_Down, "en0", scripted_address(1, 2, 0)},
                {144, Hb_Entity_Up, "en0", scripted_address(1, 3, 0)},
                {145, Hb_Entity_Undef, "en1", scripted_address(1, 3, 1)}});
    global_config_tbl_new.local_node_number = 3;
    global_config_tbl_new.Hb_num_networks = 48;
    std::strcpy(global_config_tbl_new.Hb_global_network_list[0].Hb_network_name, "VEX_Network");
    std::strcpy(global_config_tbl_new.Hb_global_network_list[47].Hb_network_type, "last");
    start_tracing();
  }
  ~TableSwap() override {
    global_config_tbl.Hb_max_sites = global_config_tbl.Hb_num_sites = 0;
    global_config_tbl.site_list = nullptr;
  }
};

TEST_F(TableSwap, PutsTheNewTableInForceAndEmptiesIt) {
  VEX_copy_and_delete_global_config_tbl();
  const Hb_Configuration_Internal& in_force = global_config_tbl;
  EXPECT_EQ(in_force.local_node_number, 3);
  EXPECT_EQ(in_force.Hb_max_nodes, 2049);
  EXPECT_EQ(in_force.Hb_num_nodes, 2);
  EXPECT_EQ(in_force.Hb_adapters_per_node, 48);
  EXPECT_EQ(in_force.Hb_num_adapters, 3);
  EXPECT_EQ(in_force.Hb_num_networks, 48);
  EXPECT_EQ(global_config_tbl_new.Hb_num_nodes, 0);
  EXPECT_EQ(global_config_tbl_new.Hb_num_adapters, 0);
  EXPECT_EQ(global_config_tbl_new.node_list, nullptr);
  EXPECT_EQ(global_config_tbl_new.Hb_global_adapter_list, nullptr);
  EXPECT_EQ(global_config_tbl_new.adap_hash, nullptr);
  EXPECT_EQ(global_config_tbl_new.ip_hash, nullptr);
  EXPECT_EQ(global_config_tbl_new.node_hash, nullptr);
  EXPECT_EQ(hb_get_errno(), untouched_number);
}

TEST_F(TableSwap, KeepsTheOrderStatesAndReasonsOfNodes) {
  VEX_copy_and_delete_global_config_tbl();
  const Hb_Node_config_state* nodes = global_config_tbl.node_list;
  EXPECT_EQ(nodes[0].node_num, 2);
  EXPECT_EQ(nodes[0].state, Hb_Entity_Down);
  EXPECT_EQ(nodes[0].reason, Hb_Entity_State_Reason_SHUT_Down);
  EXPECT_EQ(nodes[1].node_num, 3);
  EXPECT_EQ(nodes[1].state, Hb_Entity_Up);
  EXPECT_EQ(nodes[1].reason, Hb_Entity_State_Reason_Up);
  EXPECT_EQ(by_node(global_config_tbl, 1), nullptr);
  EXPECT_EQ(by_node(global_config_tbl, 2), &nodes[0]);
  EXPECT_EQ(by_node(global_config_tbl, 3), &nodes[1]);
}

TEST_F(TableSwap, CopiesAdaptersWholeAndFindsThemByNumberAndAddress) {
  VEX_copy_and_delete_global_config_tbl();
  Hb_Adapter* adapters = global_config_tbl.Hb_global_adapter_list;
  const Hb_Adapter last = record_of({145, Hb_Entity_Undef, "en1", scripted_address(1, 3, 1)});
  EXPECT_EQ(std::memcmp(&adapters[2], &last, sizeof last), 0);
  for (uint8_t i = 0; i < 3; ++i) {
    EXPECT_EQ(by_number(global_config_tbl, adapters[i].Hb_adapter_num), &adapters[i]);
  }
  EXPECT_EQ(by_address(global_config_tbl, scripted_address(1, 2, 0)), &adapters[0]);
  EXPECT_EQ(by_address(global_config_tbl, scripted_address(1, 3, 1)), &adapters[2]);
  EXPECT_EQ(by_number(global_config_tbl, 48), nullptr);
}

TEST_F(TableSwap, NamesAndSizesTheHashTables) {
  VEX_copy_and_delete_global_config_tbl();
  EXPECT_STREQ(global_config_tbl.node_hash->name, "VEX_node list");
  EXPECT_EQ(global_config_tbl.node_hash->size, 4099);
  EXPECT_STREQ(global_config_tbl.adap_hash->name, "Hb_Adapter list");
  EXPECT_EQ(global_config_tbl.adap_hash->size, 257);  // the fewest buckets
  EXPECT_STREQ(global_config_tbl.ip_hash->name, "Hb_IP list");
  EXPECT_EQ(global_config_tbl.ip_hash->size, 257);
}

TEST_F(TableSwap, TakesAllNetworks) {
  std::strcpy(global_config_tbl.Hb_global_network_list[1].Hb_network_name, "gone");
  VEX_copy_and_delete_global_config_tbl();
  EXPECT_STREQ(global_config_tbl.Hb_global_network_list[0].Hb_network_name, "VEX_Network");
  EXPECT_STREQ(global_config_tbl.Hb_global_network_list[1].Hb_network_name, "");
  EXPECT_STREQ(global_config_tbl.Hb_global_network_list[47].Hb_network_type, "last");
}

TEST_F(TableSwap, KeepsSitesAndThePeriodsOfSimulatedDeath) {
  Hb_Site site = {};
  global_config_tbl.Hb_max_sites = 5;
  global_config_tbl.Hb_num_sites = 1;
  global_config_tbl.site_list = &site;
  global_config_tbl.Hb_rem_node_down_sim_period = {7, 8};
  global_config_tbl.Hb_local_node_down_sim_period = {9, 10};
  global_config_tbl_new.Hb_max_sites = 6;
  global_config_tbl_new.Hb_rem_node_down_sim_period = {1, 1};
  VEX_copy_and_delete_global_config_tbl();
  EXPECT_EQ(global_config_tbl.Hb_max_sites, 5);
  EXPECT_EQ(global_config_tbl.Hb_num_sites, 1);
  EXPECT_EQ(global_config_tbl.site_list, &site);
  EXPECT_EQ(global_config_tbl.Hb_rem_node_down_sim_period.tv_sec, 7);
  EXPECT_EQ(global_config_tbl.Hb_rem_node_down_sim_period.tv_usec, 8);
  EXPECT_EQ(global_config_tbl.Hb_local_node_down_sim_period.tv_sec, 9);
  EXPECT_EQ(global_config_tbl.Hb_local_node_down_sim_period.tv_usec, 10);
}

TEST_F(TableSwap, IsTracedWithTheNumberOfNodes) {
  VEX_copy_and_delete_global_config_tbl();
  EXPECT_THAT(trace_lines(), ElementsAre("Info 132: 2"));
}

TEST_F(TableSwap, IsNotTracedWhenNothingIs) {
  trace_nothing();
  VEX_copy_and_delete_global_config_tbl();
  EXPECT_THAT(platform_double().traces, IsEmpty());
  EXPECT_EQ(global_config_tbl.Hb_num_nodes, 2);
}

TEST_F(TableSwap, IsFollowedByTheIndexOfRecords) {
  ASSERT_EQ(find_configured_adapter(48), &global_config_tbl.Hb_global_adapter_list[0]);
  VEX_copy_and_delete_global_config_tbl();
  EXPECT_EQ(find_configured_adapter(48), nullptr);
  EXPECT_EQ(find_configured_adapter(96), &global_config_tbl.Hb_global_adapter_list[0]);
  EXPECT_EQ(find_configured_adapter(145), &global_config_tbl.Hb_global_adapter_list[2]);
  EXPECT_EQ(find_configured_node(1), nullptr);
  EXPECT_EQ(find_configured_node(3), &global_config_tbl.node_list[1]);
}

TEST_F(TableSwap, ReleasesWhatItReplaces) {
  trace_nothing();
  VEX_copy_and_delete_global_config_tbl();
  empty_global_config_table(&global_config_tbl);
  const long without_a_table = live_allocations();
  for (int i = 0; i < 3; ++i) {
    fill_table(global_config_tbl_new, 2049, 48, {{2}, {3}}, {{96}, {144}, {145}});
    VEX_copy_and_delete_global_config_tbl();
  }
  EXPECT_EQ(global_config_tbl.Hb_num_adapters, 3);
  empty_global_config_table(&global_config_tbl);
  EXPECT_EQ(live_allocations(), without_a_table);
}

TEST_F(TableSwap, OfAnEmptyNewTableEmptiesTheOneInForce) {
  empty_global_config_table(&global_config_tbl_new);
  std::strcpy(global_config_tbl.Hb_global_network_list[1].Hb_network_name, "gone");
  start_tracing();
  VEX_copy_and_delete_global_config_tbl();
  const Hb_Configuration_Internal& in_force = global_config_tbl;
  EXPECT_EQ(in_force.local_node_number, 0);
  EXPECT_EQ(in_force.Hb_max_nodes, 0);
  EXPECT_EQ(in_force.Hb_num_nodes, 0);
  EXPECT_EQ(in_force.Hb_adapters_per_node, 0);
  EXPECT_EQ(in_force.Hb_num_adapters, 0);
  EXPECT_EQ(in_force.Hb_num_networks, 0);
  EXPECT_STREQ(in_force.Hb_global_network_list[0].Hb_network_name, "VEX_Network");
  EXPECT_STREQ(in_force.Hb_global_network_list[1].Hb_network_name, "");
  EXPECT_EQ(find_configured_adapter(48), nullptr);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 132: 0"));
}

TEST_F(TableSwap, OfAnEmptyNewTableMakesItsListsAndHashTablesAllTheSame) {
  empty_global_config_table(&global_config_tbl_new);
  VEX_copy_and_delete_global_config_tbl();
  const Hb_Configuration_Internal& in_force = global_config_tbl;
  ASSERT_NE(in_force.node_list, nullptr);
  in_force.node_list[2048] = {7, Hb_Entity_Up, Hb_Entity_State_Reason_Up};  // it has so many entries
  EXPECT_NE(in_force.Hb_global_adapter_list, nullptr);
  ASSERT_NE(in_force.node_hash, nullptr);
  EXPECT_STREQ(in_force.node_hash->name, "VEX_node list");
  EXPECT_EQ(in_force.node_hash->size, 4099);
  ASSERT_NE(in_force.adap_hash, nullptr);
  EXPECT_STREQ(in_force.adap_hash->name, "Hb_Adapter list");
  ASSERT_NE(in_force.ip_hash, nullptr);
  EXPECT_STREQ(in_force.ip_hash->name, "Hb_IP list");
  EXPECT_EQ(Hash_search(48, in_force.adap_hash), nullptr);
}

TEST_F(TableSwap, PutsANewTableWithoutMembersInForce) {
  empty_global_config_table(&global_config_tbl_new);
  global_config_tbl_new.Hb_max_nodes = 2049;
  global_config_tbl_new.local_node_number = 7;
  VEX_copy_and_delete_global_config_tbl();
  EXPECT_EQ(global_config_tbl.local_node_number, 7);
  EXPECT_EQ(global_config_tbl.Hb_max_nodes, 2049);
  EXPECT_EQ(global_config_tbl.Hb_num_nodes, 0);
  EXPECT_EQ(global_config_tbl.Hb_num_adapters, 0);
  EXPECT_EQ(find_configured_adapter(48), nullptr);
  EXPECT_EQ(global_config_tbl_new.Hb_max_nodes, 0);
}

TEST_F(TableSwap, WithoutMemoryLeavesBothTables) {
  trace_nothing();
  size_t failures = 0;
  for (size_t nth = 1;; ++nth) {
    set_hb_errno(untouched_number);
    const long before = live_allocations();
    const AllocationFailure failure(nth);
    VEX_copy_and_delete_global_config_tbl();
    if (!failure.happened()) break;
    ++failures;
    EXPECT_EQ(hb_get_errno(), 70) << nth;
    EXPECT_EQ(live_allocations(), before) << nth;
    EXPECT_EQ(find_configured_adapter(48), &global_config_tbl.Hb_global_adapter_list[0]) << nth;
    EXPECT_EQ(global_config_tbl_new.Hb_num_adapters, 3) << nth;
  }
  EXPECT_GE(failures, 8U);  // adapters, nodes and for each of three tables its record, its name and its buckets
  EXPECT_EQ(global_config_tbl.Hb_num_adapters, 3);
}

TEST_F(TableSwap, OfCountsBeyondTheListsTakesWhatIsThere) {
  delete[] global_config_tbl_new.Hb_global_adapter_list;
  global_config_tbl_new.Hb_global_adapter_list = nullptr;
  global_config_tbl_new.Hb_num_nodes = 100000;
  VEX_copy_and_delete_global_config_tbl();
  EXPECT_EQ(global_config_tbl.Hb_num_adapters, 0);
  EXPECT_EQ(global_config_tbl.Hb_num_nodes, 2049);
}

// Whether a table was built.

TEST_F(TableSwap, AnEmptiedTableIsNotBuilt) {
  EXPECT_TRUE(is_table_built(global_config_tbl));
  std::strcpy(global_config_tbl.Hb_global_network_list[0].Hb_network_name, "stays");
  global_config_tbl.Hb_max_sites = 3;  // as sites do
  empty_global_config_table(&global_config_tbl);
  EXPECT_FALSE(is_table_built(global_config_tbl));
}

struct Something_Built {
  const char* description;
  void (*build)(Hb_Configuration_Internal& table);
};

class BuiltTable : public TableState, public testing::WithParamInterface<Something_Built> {};

TEST_P(BuiltTable, IsToldByAnythingInIt) {
  EXPECT_FALSE(is_table_built(table));
  GetParam().build(table);
  EXPECT_TRUE(is_table_built(table));
}

INSTANTIATE_TEST_SUITE_P(
    Parts, BuiltTable,
    testing::Values(Something_Built{"LocalNode", [](auto& table) { table.local_node_number = 1; }},
                    Something_Built{"MostNodes", [](auto& table) { table.Hb_max_nodes = 1; }},
                    Something_Built{"Nodes", [](auto& table) { table.Hb_num_nodes = 1; }},
                    Something_Built{"AdaptersOfANode", [](auto& table) { table.Hb_adapters_per_node = 1; }},
                    Something_Built{"Adapters", [](auto& table) { table.Hb_num_adapters = 1; }},
                    Something_Built{"Networks", [](auto& table) { table.Hb_num_networks = 1; }},
                    Something_Built{"AdapterList",
                                    [](auto& table) { table.Hb_global_adapter_list = new Hb_Adapter[1]; }},
                    Something_Built{"NodeList", [](auto& table) { table.node_list = new Hb_Node_config_state[1]; }},
                    Something_Built{"AdapterHash", [](auto& table) { table.adap_hash = Hash_init("a", 1); }},
                    Something_Built{"AddressHash", [](auto& table) { table.ip_hash = Hash_init("a", 1); }},
                    Something_Built{"NodeHash", [](auto& table) { table.node_hash = Hash_init("a", 1); }},
                    Something_Built{"SiteHash", [](auto& table) { table.site_hash = Hash_init("a", 1); }}),
    [](const auto& test) { return test.param.description; });

// Emptying.

TEST_F(TableSwap, EmptyingNoTableDoesNothing) {
  empty_global_config_table(nullptr);
  EXPECT_EQ(global_config_tbl.Hb_num_nodes, 2);
}

TEST_F(TableSwap, EmptyingReleasesListsAndHashTablesAndZeroesTheNumbers) {
  global_config_tbl.local_node_number = 4;
  global_config_tbl.Hb_num_networks = 2;
  global_config_tbl.site_hash = Hash_init("sites", 1);
  empty_global_config_table(&global_config_tbl);
  EXPECT_EQ(global_config_tbl.Hb_global_adapter_list, nullptr);
  EXPECT_EQ(global_config_tbl.node_list, nullptr);
  EXPECT_EQ(global_config_tbl.adap_hash, nullptr);
  EXPECT_EQ(global_config_tbl.ip_hash, nullptr);
  EXPECT_EQ(global_config_tbl.node_hash, nullptr);
  EXPECT_EQ(global_config_tbl.site_hash, nullptr);
  EXPECT_EQ(global_config_tbl.local_node_number, 0);
  EXPECT_EQ(global_config_tbl.Hb_max_nodes, 0);
  EXPECT_EQ(global_config_tbl.Hb_num_nodes, 0);
  EXPECT_EQ(global_config_tbl.Hb_adapters_per_node, 0);
  EXPECT_EQ(global_config_tbl.Hb_num_adapters, 0);
  EXPECT_EQ(global_config_tbl.Hb_num_networks, 0);
}

TEST_F(TableSwap, EmptyingLeavesSitesAndTheNamesOfNetworks) {
  Hb_Site site = {};
  global_config_tbl.site_list = &site;
  global_config_tbl.Hb_max_sites = 3;
  global_config_tbl.Hb_num_sites = 2;
  std::strcpy(global_config_tbl.Hb_global_network_list[0].Hb_network_name, "net");
  for (int i = 0; i < 2; ++i) {  // also when it is empty already
    empty_global_config_table(&global_config_tbl);
    EXPECT_EQ(global_config_tbl.site_list, &site);
    EXPECT_EQ(global_config_tbl.Hb_max_sites, 3);
    EXPECT_EQ(global_config_tbl.Hb_num_sites, 2);
    EXPECT_STREQ(global_config_tbl.Hb_global_network_list[0].Hb_network_name, "net");
  }
}

TEST_F(TableSwap, EmptyingTheTableInForceLeavesNothingToFind) {
  empty_global_config_table(&global_config_tbl);
  EXPECT_EQ(find_configured_adapter(48), nullptr);
  EXPECT_EQ(find_configured_node(1), nullptr);
}

}  // namespace
}  // namespace hb_test
