// A configuration table in the trace.
#include "table_state.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class TableDump : public TableState {
 protected:
  TableDump() {
    fill_table(table, 2049, 48, {{1}, {2, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down}},
               {{48, Hb_Entity_Up, "en0", scripted_address(1, 1, 0)}, {97, Hb_Entity_Down, "en1", {}}});
    table.local_node_number = 2;
    table.Hb_num_networks = 47;
    start_tracing();
  }
};

TEST_F(TableDump, IsTheNameTheNumbersTheNodesAndTheAdapters) {
  hb_vex_dump_global_table(&table, "a table");
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(121, 134, 122, 122, 123, 123));
  EXPECT_THAT(data_lines(121, 1), ElementsAre("Info 121: [a table]"));
  EXPECT_THAT(value_lines(134), ElementsAre("Info 134: 2 2049 2 2 48 47"));
  EXPECT_THAT(value_lines(122), ElementsAre("Info 122: 1 1 1", "Info 122: 2 2 6"));
  EXPECT_THAT(data_lines(123, 2), ElementsAre("Info 123: [en0] [10.1.1.0] 48 1", "Info 123: [en1] [::] 97 2"));
}

TEST_F(TableDump, IsEmptyForAnEmptyTable) {
  empty_global_config_table(&table);
  hb_vex_dump_global_table(&table, "nothing");
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(121, 134));
  EXPECT_THAT(value_lines(134), ElementsAre("Info 134: 0 0 0 0 0 0"));
}

TEST_F(TableDump, IsNotMadeWithoutInfoTracing) {
  platform_double().set_levels({1, 0, 1});
  hb_vex_dump_global_table(&table, "a table");
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

TEST_F(TableDump, OfNoTableIsNothing) {
  hb_vex_dump_global_table(nullptr, "a table");
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

TEST_F(TableDump, KeepsErrno) {
  platform_double().errno_after_trace = 5;
  errno = 77;
  hb_vex_dump_global_table(&table, "a table");
  EXPECT_EQ(errno, 77);
}

TEST_F(TableDump, ReadsATypeWithoutAnEndUpToItsField) {
  std::memset(table.Hb_global_adapter_list[0].Hb_adapter_type, 'x',
              sizeof table.Hb_global_adapter_list[0].Hb_adapter_type);
  hb_vex_dump_global_table(&table, "a table");
  EXPECT_EQ(platform_double().traces_of(123)[0].blocks[0].size(), 36U);
  EXPECT_EQ(platform_double().traces_of(123)[0].block_text(0), std::string(36, 'x'));
}

TEST_F(TableDump, OfCountsBeyondTheListsStopsAtTheirEnd) {
  table.Hb_num_nodes = -1;
  table.Hb_num_adapters = -7;
  hb_vex_dump_global_table(&table, "a table");
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(121, 134));
}

}  // namespace
}  // namespace hb_test
