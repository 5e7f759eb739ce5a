// What a new table changes, as one event of each kind.
#include "table_comparison.h"
#include "VEX_EVMONConfigurationHandler.h"
#include "VEX_migration.h"
#include "table_state.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr zu_int32_t death = 1;
constexpr zu_int32_t join = 2;

const zu_vex_IP_address6_t address_0 = scripted_address(1, 1, 0);
const zu_vex_IP_address6_t address_1 = scripted_address(1, 1, 1);

// An event and what it says.
class Told {
 public:
  ~Told() { delete event; }
  Told() = default;
  Told(const Told&) = delete;
  Told& operator=(const Told&) = delete;

  // As "events 1, 2: 48 49", or "none".
  std::string text() const {
    if (event == nullptr) return "none";
    const Hb_Group& group = event->group;
    std::string text = "events " + std::to_string(group.Hb_events);
    if (group.Hb_group_type == Hb_Adapter_Group)
      return text + adapters(group.Hb_membership_grp_union.Hb_adapter_membership_grp);
    if (group.Hb_group_type == Hb_Node_Group) return text + nodes(group.Hb_membership_grp_union.Hb_node_membership_grp);
    return text;
  }

  Hb_VEX_Event* event = nullptr;

 private:
  static std::string adapters(const Hb_Adapter_Membership_Grp& group) {
    std::string text = ", " + std::to_string(group.Hb_num_adapters) + " adapters:";
    for (uint32_t i = 0; i < 98352; ++i) {
      if (group.Hb_adapter_list[i] == 0) text += ' ' + std::to_string(i);
    }
    return text;
  }
  static std::string nodes(const Hb_Node_Membership_Grp& group) {
    std::string text = ", " + std::to_string(group.Hb_num_nodes) + " nodes:";
    for (int i = 0; i < 2049; ++i) {
      if (group.Hb_node_list[i] == Hb_True) text += ' ' + std::to_string(i);
    }
    return text;
  }
};

class TableComparison : public TableState {
 protected:
  TableComparison() {
    scripted_cluster().has_monitors = false;
    handler = std::make_unique<EVMONConfigurationHandler>(path, "");
    start_tracing();
  }
  ~TableComparison() override {
    migrate_to_vex_prep = false;
    empty_global_config_table(&other);
  }

  void tables(const std::vector<Table_Adapter>& first, const std::vector<Table_Adapter>& second) {
    fill_table(table, 2049, 48, {}, first);
    fill_table(other, 2049, 48, {}, second);
  }
  void node_tables(const std::vector<Table_Node>& first, const std::vector<Table_Node>& second) {
    fill_table(table, 2049, 48, first, {});
    fill_table(other, 2049, 48, second, {});
  }

  std::string adapters_told(zu_int32_t kind = death) {
    Told told;
    handler->generate_event_for_missing_tbl2_adapters(&table, &other, kind, &told.event);
    return told.text();
  }
  std::string nodes_told(zu_int32_t kind = death) {
    Told told;
    handler->generate_event_for_missing_tbl2_node(&table, &other, kind, &told.event);
    return told.text();
  }
  std::string change_told() {
    Told told;
    handler->generate_event_for_config_change(&table, &other, &told.event);
    return told.text();
  }

  Hb_Configuration_Internal other = {};
  char path[8] = "monitor";
  std::unique_ptr<EVMONConfigurationHandler> handler;
};

// Adapters.

struct States {
  int first;
  int second;  // -1 when it is gone
  bool is_lost;
};

class AdapterStates : public TableComparison, public testing::WithParamInterface<States> {};

TEST_P(AdapterStates, AreLostWhenOneThatWasUpIsSoNoMore) {
  std::vector<Table_Adapter> second;
  if (GetParam().second >= 0) second.push_back({50, static_cast<Hb_Entity_State>(GetParam().second), "en0", address_0});
  tables({{48, static_cast<Hb_Entity_State>(GetParam().first), "en0", address_0}}, second);
  EXPECT_EQ(adapters_told(), GetParam().is_lost ? "events 1, 1 adapters: 48" : "none");
}

INSTANTIATE_TEST_SUITE_P(States, AdapterStates,
                         testing::Values(States{1, -1, true}, States{1, 1, false}, States{1, 2, true},
                                         States{1, 0, true}, States{1, 7, false}, States{2, -1, false},
                                         States{2, 1, false}, States{2, 2, false}, States{0, -1, false},
                                         States{0, 2, false}, States{7, -1, false}));

TEST_F(TableComparison, ACounterpartHasTheSameNodeTypeAndAddress) {
  tables({{48, Hb_Entity_Up, "en0", address_0},
          {49, Hb_Entity_Up, "en1", address_0},
          {50, Hb_Entity_Up, "en2", address_0},
          {51, Hb_Entity_Up, "en3", address_0}},
         {{48, Hb_Entity_Up, "en3", address_0},    // of 51, whatever its number
          {96, Hb_Entity_Up, "en0", address_0},    // another node
          {49, Hb_Entity_Up, "en01", address_0},   // another type
          {50, Hb_Entity_Up, "en2", address_1}});  // another address
  EXPECT_EQ(adapters_told(), "events 1, 3 adapters: 48 49 50");
}

TEST_F(TableComparison, EachWordOfAnAddressCounts) {
  for (int byte = 0; byte < 16; byte += 4) {
    zu_vex_IP_address6_t changed = address_0;
    reinterpret_cast<uint8_t*>(&changed)[byte] ^= 1U;
    empty_global_config_table(&table);
    empty_global_config_table(&other);
    tables({{48, Hb_Entity_Up, "en0", address_0}}, {{48, Hb_Entity_Up, "en0", changed}});
    EXPECT_EQ(adapters_told(), "events 1, 1 adapters: 48") << byte;
  }
}

TEST_F(TableComparison, TheFirstCounterpartInTheOrderOfTheTableDecides) {
  tables({{48, Hb_Entity_Up, "en0", address_0}}, {{60, Hb_Entity_Up, "en0", address_1},
                                                  {61, Hb_Entity_Down, "en0", address_0},
                                                  {62, Hb_Entity_Up, "en0", address_0}});
  EXPECT_EQ(adapters_told(), "events 1, 1 adapters: 48");
}

TEST_F(TableComparison, TheFirstCounterpartDecidesWithoutTraceAsWell) {
  trace_nothing();
  tables({{48, Hb_Entity_Up, "en0", address_0}, {96, Hb_Entity_Up, "en0", address_0}},
         {{61, Hb_Entity_Down, "en0", address_0},
          {62, Hb_Entity_Up, "en0", address_0},
          {100, Hb_Entity_Up, "en0", address_0},
          {101, Hb_Entity_Down, "en0", address_0}});
  EXPECT_EQ(adapters_told(), "events 1, 1 adapters: 48");
}

TEST_F(TableComparison, EachTableHasItsOwnAdaptersOfANode) {
  fill_table(table, 2049, 48, {}, {{48, Hb_Entity_Up, "en0", address_0}, {96, Hb_Entity_Up, "en0", address_1}});
  fill_table(other, 2049, 8, {}, {{8, Hb_Entity_Up, "en0", address_0}, {96, Hb_Entity_Up, "en0", address_1}});
  // Number 96 is of node 2 in the one table, and of node 12 in the other.
  EXPECT_EQ(adapters_told(), "events 1, 1 adapters: 96");
}

TEST_F(TableComparison, AddsEveryAdapterToOneEventOfTheKind) {
  tables({{48, Hb_Entity_Up, "en0", address_0}, {144, Hb_Entity_Up, "en0", address_0}, {98351, Hb_Entity_Up}}, {});
  EXPECT_EQ(adapters_told(join), "events 2, 3 adapters: 48 144 98351");
  EXPECT_THAT(value_lines(77), ElementsAre("Info 77: 2 1", "Info 77: 2 2", "Info 77: 2 3"));
}

TEST_F(TableComparison, TracesCandidatesAndWhatTheyLack) {
  tables({{48, Hb_Entity_Up, "en0", address_0}, {49, Hb_Entity_Up, "en0", address_1}, {50, Hb_Entity_Up, "en9"}},
         {{48, Hb_Entity_Up, "en1", address_0},
          {49, Hb_Entity_Up, "en0", scripted_address(9, 9, 9)},
          {50, Hb_Entity_Down, "en0", address_1},
          {51, Hb_Entity_Up, "en0", address_1}});
  EXPECT_EQ(adapters_told(), "events 1, 3 adapters: 48 49 50");
  // The first looks at three of its type, the second stops at its counterpart.
  EXPECT_THAT(data_lines(74, 1), ElementsAre("Info 74: [en0] 1", "Info 74: [en0] 1", "Info 74: [en0] 1",
                                             "Info 74: [en0] 1", "Info 74: [en0] 1"));
  EXPECT_THAT(data_lines(75, 1), ElementsAre("Info 75: [en0] 48 1 1", "Info 75: [en9] 50 1 1"));
  EXPECT_THAT(data_lines(76, 1), ElementsAre("Info 76: [en0] 49 1 1"));
  EXPECT_THAT(value_lines(77), ElementsAre("Info 77: 1 1", "Info 77: 1 2", "Info 77: 1 3"));
}

TEST_F(TableComparison, TracesTheStepsOfOneAdapterInTheirOrder) {
  tables({{48, Hb_Entity_Up, "en0", address_0}}, {{48, Hb_Entity_Down, "en0", address_0}});
  EXPECT_EQ(adapters_told(), "events 1, 1 adapters: 48");
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(74, 76, 80, 81, 77));
}

TEST_F(TableComparison, WithoutAPlaceForTheAdapterEventIsTraced) {
  tables({{48, Hb_Entity_Up, "en0", address_0}}, {});
  handler->generate_event_for_missing_tbl2_adapters(&table, &other, death, nullptr);
  EXPECT_THAT(trace_lines(), ElementsAre("Errors 112"));
}

TEST_F(TableComparison, StartsWithoutAnAdapterEvent) {
  tables({}, {});
  auto* stale = reinterpret_cast<Hb_VEX_Event*>(this);
  handler->generate_event_for_missing_tbl2_adapters(&table, &other, death, &stale);
  EXPECT_EQ(stale, nullptr);
}

TEST_F(TableComparison, ATypeWithoutAnEndIsReadUpToItsField) {
  tables({{48, Hb_Entity_Up, "en0", address_0}}, {{48, Hb_Entity_Up, "en0", address_0}});
  std::memset(table.Hb_global_adapter_list[0].Hb_adapter_type, 'x', 36);
  std::memset(other.Hb_global_adapter_list[0].Hb_adapter_type, 'x', 36);
  EXPECT_EQ(adapters_told(), "none");
  EXPECT_EQ(platform_double().traces_of(74)[0].blocks[0].size(), 36U);
}

TEST_F(TableComparison, OfATableWithoutAdaptersOfANodeDoesNotDivide) {
  tables({{48, Hb_Entity_Up, "en0", address_0}}, {{0, Hb_Entity_Up, "en0", address_0}});
  table.Hb_adapters_per_node = 0;
  other.Hb_adapters_per_node = -1;
  EXPECT_EQ(adapters_told(), "none");
}

TEST_F(TableComparison, FindsCounterpartsWithLittleMemoryAsWell) {
  tables({{48, Hb_Entity_Up, "en0", address_0}, {49, Hb_Entity_Up, "en0", address_1}},
         {{96, Hb_Entity_Up, "en0", address_0},
          {48, Hb_Entity_Up, "en0", address_0},
          {50, Hb_Entity_Down, "en0", address_1},
          {51, Hb_Entity_Up, "en0", address_1}});
  trace_nothing();
  for (size_t nth = 1; nth <= 2; ++nth) {
    Told told;
    {
      const AllocationFailure failure(nth);
      handler->generate_event_for_missing_tbl2_adapters(&table, &other, death, &told.event);
      EXPECT_TRUE(failure.happened());
    }
    EXPECT_EQ(told.text(), "events 1, 1 adapters: 49") << nth;
  }
}

TEST_F(TableComparison, AnAdapterBeyondTheListIsAddedToNothingAndNotCounted) {
  tables({{98352, Hb_Entity_Up, "en0", address_0}, {98351, Hb_Entity_Up, "en1", address_1}}, {});
  EXPECT_EQ(adapters_told(), "events 1, 1 adapters: 98351");
  EXPECT_THAT(value_lines(77), ElementsAre("Info 77: 1 1"));
}

TEST_F(TableComparison, OfAdaptersBeyondTheListAloneThereIsNoEvent) {
  tables({{98352, Hb_Entity_Up, "en0", address_0}, {0xFFFFFFFF, Hb_Entity_Up, "en1", address_1}}, {});
  EXPECT_EQ(adapters_told(), "none");
}

TEST_F(TableComparison, WithoutMemoryForTheAdapterEventFails) {
  tables({{48, Hb_Entity_Up, "en0", address_0}}, {});
  trace_nothing();
  Told told;
  const AllocationFailure failure(3);  // behind the two arrays of the index
  EXPECT_EQ(tell_lost_adapters(*handler, table, other, death, &told.event), Hb_Failure);
  EXPECT_EQ(told.event, nullptr);
}

// Nodes.

class NodeStates : public TableComparison, public testing::WithParamInterface<States> {};

TEST_P(NodeStates, AreLostWhenOneThatWasUpIsSoNoMore) {
  std::vector<Table_Node> second;
  if (GetParam().second >= 0) second.push_back({7, static_cast<Hb_Entity_State>(GetParam().second)});
  node_tables({{7, static_cast<Hb_Entity_State>(GetParam().first)}}, second);
  EXPECT_EQ(nodes_told(), GetParam().is_lost ? "events 1, 1 nodes: 7" : "none");
}

INSTANTIATE_TEST_SUITE_P(States, NodeStates,
                         testing::Values(States{1, -1, true}, States{1, 1, false}, States{1, 2, true},
                                         States{1, 0, true}, States{1, 7, false}, States{2, -1, false},
                                         States{2, 2, false}, States{0, -1, false}, States{0, 0, false}));

TEST_F(TableComparison, AddsEveryNodeToOneEventOfTheKind) {
  node_tables({{0}, {5}, {2048}}, {{5, Hb_Entity_Down, Hb_Entity_State_Reason_Down}});
  EXPECT_EQ(nodes_told(join), "events 2, 3 nodes: 0 5 2048");
  EXPECT_THAT(trace_lines(), ElementsAre("Info 247: 0 1 2", "Info 249: 2 0 1", "Info 248: 5 1 2", "Info 249: 2 5 2",
                                         "Info 247: 2048 1 2", "Info 249: 2 2048 3"));
}

TEST_F(TableComparison, WithoutAPlaceForTheNodeEventIsNotTracedAsSuch) {
  node_tables({{1}}, {});
  handler->generate_event_for_missing_tbl2_node(&table, &other, death, nullptr);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 247: 1 1 1", "Info 249: 1 1 1"));
}

TEST_F(TableComparison, ANodeBeyondTheListIsAddedToNothingAndNotCounted) {
  node_tables({{2049}, {-1}, {2048}}, {});
  EXPECT_EQ(nodes_told(), "events 1, 1 nodes: 2048");
  EXPECT_THAT(value_lines(249), ElementsAre("Info 249: 1 2048 1"));
}

TEST_F(TableComparison, OfNodesBeyondTheListAloneThereIsNoEvent) {
  node_tables({{2049}, {-1}}, {});
  EXPECT_EQ(nodes_told(), "none");
}

TEST_F(TableComparison, WithoutMemoryForTheNodeEventFails) {
  node_tables({{1}}, {});
  trace_nothing();
  Told told;
  const AllocationFailure failure(1);
  EXPECT_EQ(tell_lost_nodes(*handler, table, other, death, &told.event), Hb_Failure);
  EXPECT_EQ(told.event, nullptr);
}

TEST_F(TableComparison, ATableWithoutNodesHasNone) {
  EXPECT_EQ(nodes_told(), "none");
  fill_table(table, 2049, 48, {{1}}, {});
  EXPECT_EQ(nodes_told(), "events 1, 1 nodes: 1");  // there is no table of nodes to find it in
}

// Changes of the configuration.

TEST_F(TableComparison, EqualTablesAreNoChange) {
  tables({{48, Hb_Entity_Up, "en0", address_0}}, {{48, Hb_Entity_Down, "en0", address_0}});
  EXPECT_EQ(change_told(), "none");
  EXPECT_THAT(trace_lines(), ElementsAre("Debug 105", "Debug 106", "Debug 107"));
}

TEST_F(TableComparison, AnotherLocalNodeIsTracedAndNoChange) {
  table.local_node_number = 3;
  other.local_node_number = 4;
  EXPECT_EQ(change_told(), "none");
  EXPECT_THAT(trace_lines(), ElementsAre("Info 102: 3 4"));
}

TEST_F(TableComparison, AMissingNodeIsTracedAndNoChangeByItself) {
  node_tables({{7}}, {{8}});
  EXPECT_EQ(change_told(), "none");
  EXPECT_THAT(value_lines(103), ElementsAre("Info 103: 3"));
  EXPECT_TRUE(value_lines(104).empty());
}

TEST_F(TableComparison, AnotherNumberOfNodesIsAChange) {
  node_tables({{7}}, {{7}, {8}});
  EXPECT_EQ(change_told(), "events 128");
  EXPECT_THAT(trace_lines(), ElementsAre("Info 104: 1 2 0 0 0 0"));
}

TEST_F(TableComparison, AnotherNumberOfAdaptersIsAChange) {
  tables({{48, Hb_Entity_Up, "en0", address_0}}, {});
  EXPECT_EQ(change_told(), "events 128");
  EXPECT_THAT(value_lines(104), ElementsAre("Info 104: 0 0 1 0 0 0"));
}

TEST_F(TableComparison, AnotherNumberOfNetworksIsAChange) {
  table.Hb_num_networks = 2;
  other.Hb_num_networks = 48;
  EXPECT_EQ(change_told(), "events 128");
  EXPECT_THAT(value_lines(104), ElementsAre("Info 104: 0 0 0 0 2 48"));
}

TEST_F(TableComparison, AnAdapterOfAnotherTypeIsAChange) {
  tables({{48, Hb_Entity_Up, "en0", address_0}}, {{48, Hb_Entity_Up, "en1", address_0}});
  EXPECT_EQ(change_told(), "events 128");
  EXPECT_THAT(trace_lines(), ElementsAre("Debug 105", "Debug 106", "Info 108"));
}

TEST_F(TableComparison, AnAdapterOfAnotherNodeIsAChange) {
  tables({{48, Hb_Entity_Up, "en0", address_0}}, {{96, Hb_Entity_Up, "en0", address_0}});
  EXPECT_EQ(change_told(), "events 128");
  EXPECT_THAT(trace_lines(), ElementsAre("Debug 105", "Info 108"));
}

TEST_F(TableComparison, AnotherAddressIsAChange) {
  for (int byte = 3; byte < 16; byte += 4) {
    zu_vex_IP_address6_t changed = address_0;
    reinterpret_cast<uint8_t*>(&changed)[byte] ^= 1U;
    empty_global_config_table(&table);
    empty_global_config_table(&other);
    tables({{48, Hb_Entity_Up, "en0", address_0}}, {{48, Hb_Entity_Up, "en0", changed}});
    start_tracing();
    EXPECT_EQ(change_told(), "events 128") << byte;
    EXPECT_THAT(trace_lines(), ElementsAre("Debug 105", "Debug 106", "Debug 107", "Info 108"));
  }
}

TEST_F(TableComparison, AnotherNetworkIsAChange) {
  tables({{48, Hb_Entity_Up, "en0", address_0}}, {{48, Hb_Entity_Up, "en0", address_0}});
  other.Hb_global_adapter_list[0].Hb_network = 1;
  EXPECT_EQ(change_told(), "events 128");
}

TEST_F(TableComparison, OfTwoAdaptersOfOneTypeTheFirstIsTheOneThatCounts) {
  tables({{48, Hb_Entity_Up, "en0", address_1}, {49, Hb_Entity_Up, "en1", address_0}},
         {{48, Hb_Entity_Up, "en0", address_0}, {49, Hb_Entity_Up, "en0", address_1}});
  platform_double().set_levels({1, 1, 0});
  EXPECT_EQ(change_told(), "events 128");
  EXPECT_THAT(trace_lines(), ElementsAre("Info 108"));  // with the first adapter already
}

TEST_F(TableComparison, TheFirstDifferenceEndsTheSearch) {
  tables({{48, Hb_Entity_Up, "en0", address_0}, {49, Hb_Entity_Up, "en1", address_0}},
         {{48, Hb_Entity_Up, "en8", address_0}, {49, Hb_Entity_Up, "en9", address_0}});
  EXPECT_EQ(change_told(), "events 128");
  EXPECT_THAT(value_lines(108), ElementsAre("Info 108"));
}

TEST_F(TableComparison, AConfigurationEventDrawsANumberWhenItIsBuilt) {
  event_sequence = 5;
  table.Hb_num_networks = 1;
  Told told;
  handler->generate_event_for_config_change(&table, &other, &told.event);
  ASSERT_NE(told.event, nullptr);
  EXPECT_EQ(told.event->sequence_num, 5);
  EXPECT_EQ(event_sequence, 6);
  const Hb_VEX_Event* first = told.event;
  handler->generate_event_for_config_change(&other, &table, &told.event);
  EXPECT_EQ(told.event, first);  // the one that there is says it all
  EXPECT_EQ(event_sequence, 6);
}

TEST_F(TableComparison, WithoutMemoryForTheConfigurationEventFails) {
  table.Hb_num_networks = 1;
  trace_nothing();
  Told told;
  const AllocationFailure failure(1);
  EXPECT_EQ(tell_configuration_change(*handler, table, other, &told.event), Hb_Failure);
  EXPECT_EQ(told.event, nullptr);
}

static_assert(std::is_void_v<decltype(std::declval<EVMONHandler>().compare_global_config_tables(
                  nullptr, nullptr, nullptr, nullptr, nullptr, nullptr))>,
              "the comparison has no result");

// The whole comparison with the table in force.

class WholeComparison : public TableComparison {
 protected:
  // Node 2 and its adapter go, node 3 and its adapter come, node 1 stays.
  WholeComparison() {
    fill_table(global_config_tbl, 2049, 48, {{1}, {2}},
               {{48, Hb_Entity_Up, "en0", address_0}, {96, Hb_Entity_Up, "en0", address_0}});
    fill_table(table, 2049, 48, {{1}, {3}},
               {{48, Hb_Entity_Up, "en0", address_0}, {144, Hb_Entity_Up, "en0", address_0}});
    start_tracing();
  }

  void compare() {
    handler->compare_global_config_tables(&table, &adapter_death.event, &node_death.event, &config.event,
                                          &adapter_join.event, &node_join.event);
  }
  std::vector<std::string> told() const {
    return {adapter_death.text(), node_death.text(), config.text(), adapter_join.text(), node_join.text()};
  }

  Told adapter_death, node_death, config, adapter_join, node_join;
};

TEST_F(WholeComparison, TellsDeathsAndJoins) {
  compare();
  EXPECT_THAT(told(), ElementsAre("events 1, 1 adapters: 96", "events 1, 1 nodes: 2", "none",
                                  "events 2, 1 adapters: 144", "events 2, 1 nodes: 3"));
}

TEST_F(WholeComparison, GoesThroughItsStepsInAFixedOrder) {
  platform_double().set_levels({0, 1, 0});
  compare();
  EXPECT_THAT(platform_double().trace_ids(),
              ElementsAre(124, 74, 75, 81, 77, 125, 247, 249, 126, 74, 75, 81, 77, 127, 247, 249));
}

TEST_F(WholeComparison, OfEqualTablesTellsNothing) {
  empty_global_config_table(&table);
  fill_table(table, 2049, 48, {{1}, {2}}, {{48, Hb_Entity_Up, "en0", address_0}, {96, Hb_Entity_Up, "en0", address_0}});
  migrate_to_vex_prep = true;
  compare();
  EXPECT_THAT(told(), ElementsAre("none", "none", "none", "none", "none"));
}

TEST_F(WholeComparison, OfAMovingClientTellsOfTheConfigurationAsWell) {
  migrate_to_vex_prep = true;
  compare();
  EXPECT_THAT(told(), ElementsAre("events 1, 1 adapters: 96", "events 1, 1 nodes: 2", "events 128",
                                  "events 2, 1 adapters: 144", "events 2, 1 nodes: 3"));
  EXPECT_EQ(value_lines(103).size(), 2U);  // both ways
}

TEST_F(WholeComparison, OfAMovingClientLooksForChangesBothWays) {
  empty_global_config_table(&global_config_tbl);
  empty_global_config_table(&table);
  // Everything of the table in force is in the new one, but not the other way round.
  fill_table(global_config_tbl, 2049, 48, {},
             {{48, Hb_Entity_Up, "en0", address_0}, {49, Hb_Entity_Up, "en0", address_0}});
  fill_table(table, 2049, 48, {}, {{48, Hb_Entity_Up, "en0", address_0}, {49, Hb_Entity_Down, "en1", address_1}});
  migrate_to_vex_prep = true;
  compare();
  EXPECT_THAT(told(), ElementsAre("none", "none", "events 128", "none", "none"));
}

TEST_F(WholeComparison, WithoutMemoryFailsAndLosesNothingElse) {
  trace_nothing();
  size_t failures = 0;
  for (size_t nth = 1;; ++nth) {
    Told events[5];
    bool happened = false;
    Hb_Rc rc = Hb_Success;
    {
      const AllocationFailure failure(nth);
      rc = tell_table_changes(
          *handler, table, {&events[0].event, &events[1].event, &events[2].event, &events[3].event, &events[4].event});
      happened = failure.happened();
    }
    if (!happened) break;
    int built = 0;
    for (int i : {0, 1, 3, 4}) built += events[i].event != nullptr ? 1 : 0;
    EXPECT_EQ(built, rc == Hb_Success ? 4 : 3) << nth;
    failures += rc == Hb_Failure ? 1U : 0U;
  }
  EXPECT_EQ(failures, 4U);  // one for each event; an index that cannot be had is done without
}

// The largest cluster.

TEST_F(TableComparison, OfTheLargestClusterFindsTheOneAdapterThatChanged) {
  std::vector<Table_Adapter> adapters;
  for (uint32_t number = 0; number < 98352; ++number) {
    const auto node = static_cast<uint16_t>(number / 48);
    adapters.push_back({number, Hb_Entity_Up, "en" + std::to_string(number % 3),
                        scripted_address(static_cast<uint8_t>(node >> 8U), static_cast<uint8_t>(node),
                                         static_cast<uint8_t>(number % 48))});
  }
  fill_table(table, 2049, 48, {}, adapters);
  std::swap(adapters.front(), adapters.back());
  adapters[50000].state = Hb_Entity_Down;
  fill_table(other, 2049, 48, {}, adapters);
  platform_double().set_levels({1, 0, 0});
  EXPECT_EQ(adapters_told(), "events 1, 1 adapters: 50000");
}

}  // namespace
}  // namespace hb_test
