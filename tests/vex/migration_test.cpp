// Moving a running client from its daemon to VEX mode: prepared, committed, aborted, and each failure.
#include "VEX_migration.h"

#include "migrating_client.h"
#include "support/allocation_faults.h"

namespace {

int times_dropped = 0;
Hb_Boolean mode_when_dropped = Hb_False;

}  // namespace

extern "C" Hb_Rc __real__Z16hb_remove_socketv();
extern "C" Hb_Rc __wrap__Z16hb_remove_socketv();
Hb_Rc __wrap__Z16hb_remove_socketv() {
  ++times_dropped;
  mode_when_dropped = IsVEX;
  return __real__Z16hb_remove_socketv();
}

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;

int errors_after(Hb_Rc (*operation)()) {
  operation();
  return hb_get_errno();
}

class Migration : public testing::Test {
 protected:
  static Hb_Rc prepare() { return Migrating_Client::prepare(); }
  static Hb_Rc commit() { return Migrating_Client::commit(); }
  static size_t handlers() { return Migrating_Client::handlers(); }

  Migrating_Client client;
};

// Preparing.

TEST_F(Migration, APreparationOpensEveryMonitorAndKeepsTheDaemon) {
  EXPECT_EQ(Hb_Success, prepare());
  EXPECT_EQ(no_number, hb_get_errno());
  EXPECT_TRUE(migrate_to_vex_prep);
  EXPECT_EQ(all_handlers, handlers());
  EXPECT_EQ(8U, scripted_cluster().open_monitors().size());
  EXPECT_EQ(1U, Migrating_Client::descriptors().size());
  EXPECT_TRUE(client.daemon_is_followed());
}

TEST_F(Migration, APreparationAsksForATableWithoutANotification) {
  prepare();
  EXPECT_EQ(1U, scripted_cluster().times_asked("zu_vex_get_node_info"));
  EXPECT_EQ(1U, scripted_cluster().times_asked("zu_vex_get_net_intf_info"));
  EXPECT_EQ(0U, scripted_cluster().times_asked("zu_vex_get_boot_addrs"));
}

TEST_F(Migration, APreparationChangesNothingThatIsConfigured) {
  add_scripted_node(7);
  EXPECT_EQ(Hb_Success, prepare());
  int nodes = 0;
  EXPECT_EQ(Hb_Success, hb_get_number_of_configured_nodes(&nodes));
  EXPECT_EQ(3, nodes);
  EXPECT_EQ(Hb_False, global_node_tbl[7]);
  EXPECT_EQ(Hb_True, global_node_tbl[2]);
  EXPECT_EQ(2, global_config_tbl.Hb_adapters_per_node);
  Hb_Adapter_Number number = 0;
  EXPECT_EQ(Hb_Success, hb_get_adapter_number_by_node_number(2, 1, &number));
  EXPECT_EQ(5U, number);
  EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
}

TEST_F(Migration, NodesThatTheDaemonDoesNotKnowAreNoObstacle) {
  add_scripted_node(3);
  add_scripted_node(4);
  EXPECT_EQ(Hb_Success, prepare());
  EXPECT_EQ(all_handlers, handlers());
}

TEST_F(Migration, WithoutAMonitorAPreparationFailsAndClosesTheOthers) {
  scripted_cluster().open_results = {platform_as_usual, platform_as_usual, {-3, EACCES}};
  EXPECT_EQ(Hb_Failure, prepare());
  EXPECT_EQ(74, hb_get_errno());
  EXPECT_THAT(numbers_of(98), ElementsAre(3, 74));
  EXPECT_EQ(errors, platform_double().traces_of(98)[0].category);
  EXPECT_EQ(0U, handlers());
  EXPECT_THAT(scripted_cluster().open_monitors(), IsEmpty());
  EXPECT_EQ(0U, scripted_cluster().times_asked("zu_vex_get_node_info"));
  EXPECT_TRUE(migrate_to_vex_prep);
  EXPECT_TRUE(client.daemon_is_followed());
}

TEST_F(Migration, WithoutATableAPreparationFailsAndKeepsTheMonitors) {
  platform_double().node_info.answers.push_back({-1, nullptr});
  EXPECT_EQ(Hb_Failure, prepare());
  EXPECT_EQ(64, hb_get_errno());
  EXPECT_THAT(numbers_of(99), ElementsAre(3));
  EXPECT_EQ(errors, platform_double().traces_of(99)[0].category);
  EXPECT_EQ(all_handlers, handlers());
  EXPECT_TRUE(client.daemon_is_followed());
}

TEST_F(Migration, OnAPlatformWithNeitherAPreparationFailsInTheTableWithoutAMonitor) {
  scripted_cluster().has_services = scripted_cluster().has_monitors = false;
  EXPECT_EQ(Hb_Failure, prepare());
  EXPECT_EQ(63, hb_get_errno());
  EXPECT_THAT(numbers_of(99), ElementsAre(3));
  EXPECT_EQ(0U, times_traced(98));
  EXPECT_EQ(0U, handlers());
  EXPECT_TRUE(client.daemon_is_followed());
}

TEST_F(Migration, WithAnotherNumberForThisNodeAPreparationFailsWithoutAnErrorNumber) {
  scripted_cluster().local_node = 1;
  EXPECT_EQ(Hb_Failure, prepare());
  EXPECT_EQ(no_number, hb_get_errno());
  EXPECT_THAT(numbers_of(100), ElementsAre(0, 1));
  EXPECT_EQ(errors, platform_double().traces_of(100)[0].category);
  EXPECT_EQ(0U, handlers());
  EXPECT_TRUE(client.daemon_is_followed());
}

TEST_F(Migration, WithoutANodeOfTheDaemonAPreparationFails) {
  scripted_cluster().nodes.erase(scripted_cluster().nodes.begin() + 1, scripted_cluster().nodes.end());
  EXPECT_EQ(Hb_Failure, prepare());
  EXPECT_EQ(75, hb_get_errno());
  EXPECT_THAT(numbers_of(97), ElementsAre(1));
  EXPECT_THAT(numbers_of(101), ElementsAre(3));
  EXPECT_EQ(errors, platform_double().traces_of(97)[0].category);
  EXPECT_EQ(errors, platform_double().traces_of(101)[0].category);
  EXPECT_EQ(0U, handlers());
  EXPECT_TRUE(client.daemon_is_followed());
}

TEST_F(Migration, APreparationThatFailsSaysSoWithoutTraceAsWell) {
  Monitored_Client::trace_nothing();
  scripted_cluster().nodes.pop_back();
  EXPECT_EQ(Hb_Failure, prepare());
  EXPECT_EQ(75, hb_get_errno());
  EXPECT_THAT(traced(), IsEmpty());
}

TEST_F(Migration, APreparationCanBeTriedAgain) {
  scripted_cluster().local_node = 1;
  EXPECT_EQ(Hb_Failure, prepare());
  scripted_cluster().local_node = 0;
  EXPECT_EQ(Hb_Success, prepare());
  EXPECT_EQ(all_handlers, handlers());
}

TEST_F(Migration, OfAPreparationOneTableStaysAndNothingElse) {
  Monitored_Client::trace_nothing();
  Hb_Configuration_Internal table = {};
  const long before_table = live_allocations();
  ASSERT_EQ(Hb_Success, hb_vex_update_global_tbl(&table, nullptr, nullptr, nullptr));
  const long blocks_of_table = live_allocations() - before_table;
  empty_global_config_table(&table);
  prepare();
  hb_migrate_to_vex_abort();
  const long before = live_allocations();
  const size_t handed_out_before = Scripted_Cluster::outstanding();
  EXPECT_EQ(Hb_Success, prepare());
  EXPECT_EQ(Hb_Success, hb_migrate_to_vex_abort());
  EXPECT_LT(0, blocks_of_table);
  EXPECT_EQ(blocks_of_table, live_allocations() - before);
  EXPECT_EQ(handed_out_before, Scripted_Cluster::outstanding());
}

TEST_F(Migration, WithoutMemoryAPreparationFailsOrIsWholeAndTheDaemonIsKept) {
  Monitored_Client::trace_nothing();
  size_t failures = 0;
  bool happened = true;
  for (size_t nth = 1; happened; ++nth) {
    Hb_Rc rc = Hb_Success;
    {
      const AllocationFailure failure(nth);
      rc = prepare();
      happened = failure.happened();
    }
    if (rc == Hb_Success) {
      EXPECT_EQ(all_handlers, handlers()) << nth;
      EXPECT_NE(nullptr, evmon_cluster_name) << nth;
    }
    failures += rc == Hb_Failure ? 1 : 0;
    EXPECT_EQ(Hb_Success, hb_migrate_to_vex_abort());
    EXPECT_EQ(0U, handlers());
    ASSERT_TRUE(client.daemon_is_followed()) << nth;
  }
  EXPECT_LT(20U, failures);
}

// The node check.

TEST_F(Migration, EveryNodeOfATableIsInItself) {
  EXPECT_EQ(Hb_Success, VEX_find_tbl1_node_in_tbl2(&global_config_tbl, &global_config_tbl));
  EXPECT_EQ(no_number, hb_get_errno());
}

TEST_F(Migration, TheNodesOfNoTableAreInEveryOther) {
  Hb_Configuration_Internal none = {};
  EXPECT_EQ(Hb_Success, VEX_find_tbl1_node_in_tbl2(&none, &global_config_tbl));
  EXPECT_EQ(Hb_Success, VEX_find_tbl1_node_in_tbl2(&none, &none));
}

TEST_F(Migration, ANodeOfATableIsNotInNoTable) {
  Hb_Configuration_Internal none = {};
  EXPECT_EQ(Hb_Failure, VEX_find_tbl1_node_in_tbl2(&global_config_tbl, &none));
  EXPECT_EQ(73, hb_get_errno());
  EXPECT_THAT(numbers_of(97), ElementsAre(0));
}

TEST_F(Migration, TheNodeCheckStaysInsideItsList) {
  Hb_Configuration_Internal bad = global_config_tbl;
  bad.Hb_num_nodes = -5;
  EXPECT_EQ(Hb_Success, VEX_find_tbl1_node_in_tbl2(&bad, &global_config_tbl));
  bad.node_list = nullptr;
  bad.Hb_num_nodes = 4;
  EXPECT_EQ(Hb_Success, VEX_find_tbl1_node_in_tbl2(&bad, &global_config_tbl));
}

// Committing.

TEST_F(Migration, ACommitLeavesTheDaemonWithItsDelayedShutdown) {
  prepare();
  EXPECT_EQ(Hb_Success, commit());
  const Bytes request = client.connection.receive_request();
  EXPECT_EQ(227, i32_at(request, 8));
  EXPECT_EQ(0, i32_at(request, 12));
  EXPECT_EQ(76U, request.size());
  EXPECT_TRUE(client.connection.at_end());
  EXPECT_NE(Hb_False, IsVEX);
  EXPECT_FALSE(migrate_to_vex_prep);
}

TEST_F(Migration, ACommitHandsOutTheDescriptorsOfTheMonitors) {
  prepare();
  commit();
  EXPECT_EQ(all_handlers, Migrating_Client::descriptors().size());
}

TEST_F(Migration, ACommitDoesItsStepsInTheirOrder) {
  prepare();
  Monitored_Client::forget_traces();
  commit();
  std::vector<uint32_t> steps;
  for (const Recorded_Trace& trace : platform_double().traces) {
    for (const uint32_t step : {109U, 110U, 111U, 272U, 282U, 283U, 233U, 285U}) {
      if (trace.id == step) steps.push_back(step);
    }
  }
  EXPECT_THAT(steps, ElementsAre(109, 111, 110, 272, 282, 283, 233, 285));
}

TEST_F(Migration, ACommitIsInVexModeWhenItDropsTheConnection) {
  prepare();
  times_dropped = 0;
  commit();
  EXPECT_EQ(1, times_dropped);
  EXPECT_EQ(Hb_True, mode_when_dropped);
}

TEST_F(Migration, ACommitQueuesWhatTheMoveChangesAndWakesTheCaller) {
  scripted_cluster().nodes[2].status = ZU_VEX_NODE_STATUS_DOWN;
  scripted_cluster().interfaces[3].status = ZU_VEX_INTF_STATUS_DOWN;
  prepare();
  commit();
  // The daemon does not tell which nodes are up: those that are join.
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(Queued_Event{1, {3}, 1}, configuration_event, Queued_Event{2, {0, 1}, 2}));
  EXPECT_THAT(Migrating_Client::readable(), ElementsAre(event_pipe_handler_p->getFileDescriptor()));
}

TEST_F(Migration, WhatTheMoveChangesIsTakenEventByEvent) {
  add_scripted_node(3);
  prepare();
  commit();
  Monitored_Client::subscribe();
  std::vector<std::pair<Hb_Events, std::string>> taken;
  EventOutputs out;
  for (std::vector<int> ready; !(ready = Migrating_Client::readable()).empty();) {
    ready.push_back(-1);
    ASSERT_EQ(Hb_Success,
              hb_get_event_message(ready.data(), nullptr, &out.events, out.name, out.group.get(), &out.sequence));
    taken.emplace_back(out.events, out.name);
  }
  EXPECT_THAT(taken, ElementsAre(Pair(128, "Hb_Config_Group"), Pair(2, "nodes"), Pair(2, "adapters")));
  EXPECT_THAT(adapters_of(*out.group), ElementsAre(adapter(3, 0), adapter(3, 1)));
  int nodes = 0;
  EXPECT_EQ(Hb_Success, hb_get_number_of_configured_nodes(&nodes));
  EXPECT_EQ(4, nodes);
  Hb_Adapter_Number number = 0;
  EXPECT_EQ(Hb_Success,
            hb_get_adapter_number_by_address({.i6_ipv6 = scripted_address(2, 3, 0).zu_vex_i6_ipv6}, &number));
  EXPECT_EQ(3U, number / 48);
}

TEST_F(Migration, ACommitWithoutAPreparationIsVexModeWithoutEvents) {
  EXPECT_EQ(Hb_Success, commit());
  EXPECT_EQ(91, hb_get_errno());
  EXPECT_EQ(1U, times_traced(246));
  EXPECT_EQ(info, platform_double().traces_of(246).at(0).category);
  EXPECT_EQ(0U, times_traced(272));
  EXPECT_NE(Hb_False, IsVEX);
  EXPECT_EQ(227, i32_at(client.connection.receive_request(), 8));
  EXPECT_TRUE(client.connection.at_end());
  EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
  EXPECT_EQ(3, global_config_tbl.Hb_num_nodes);
  EXPECT_EQ(2, global_config_tbl.Hb_adapters_per_node);
  EXPECT_THAT(Migrating_Client::descriptors(), IsEmpty());
}

TEST_F(Migration, ACommitWithoutAnAnswerOfTheServicesSucceedsWithTheTableAsItWas) {
  prepare();
  scripted_cluster().has_services = false;
  EXPECT_EQ(Hb_Success, commit());
  EXPECT_EQ(63, hb_get_errno());
  EXPECT_EQ(3, global_config_tbl.Hb_num_nodes);
  EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
  EXPECT_FALSE(migrate_to_vex_prep);
}

TEST_F(Migration, ACommitSucceedsWhenTheDaemonHasGone) {
  prepare();
  client.connection.close();
  EXPECT_EQ(Hb_Success, commit());
  EXPECT_NE(Hb_False, IsVEX);
  EXPECT_EQ(2U, Monitored_Client::queue().size());
}

TEST_F(Migration, WithoutMemoryACommitSucceedsAndTellsAllOrNothing) {
  prepare();
  Monitored_Client::trace_nothing();
  {
    const AllocationFailure failure(1, false);
    EXPECT_EQ(Hb_Success, commit());
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_NE(Hb_False, IsVEX);
  EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
  EXPECT_EQ(3, global_config_tbl.Hb_num_nodes);
}

// Aborting.

TEST_F(Migration, AnAbortClosesEveryMonitorAndKeepsTheDaemon) {
  const int open_before = open_descriptors();
  prepare();
  EXPECT_LT(open_before, open_descriptors());
  EXPECT_EQ(Hb_Success, hb_migrate_to_vex_abort());
  EXPECT_EQ(0U, handlers());
  EXPECT_EQ(nullptr, peer_GS_liveness_handler_p);
  EXPECT_THAT(scripted_cluster().open_monitors(), IsEmpty());
  EXPECT_TRUE(migrate_to_vex_prep);
  EXPECT_TRUE(client.daemon_is_followed());
  EXPECT_EQ(no_number, hb_get_errno());
}

TEST_F(Migration, AnAbortWithoutAPreparationSucceeds) {
  EXPECT_EQ(Hb_Success, hb_migrate_to_vex_abort());
  EXPECT_FALSE(migrate_to_vex_prep);
  EXPECT_TRUE(client.daemon_is_followed());
}

TEST_F(Migration, AnAbortClosesTheMonitorsThatAFailedTableLeft) {
  platform_double().net_intf_info.answers.push_back({-1, nullptr});
  EXPECT_EQ(65, errors_after(prepare));
  EXPECT_EQ(all_handlers, handlers());
  EXPECT_EQ(Hb_Success, hb_migrate_to_vex_abort());
  EXPECT_EQ(0U, handlers());
}

// The configuration event behind it stays in the queue, and a later start would take it.
TEST_F(Migration, OfAnAbortedPreparationNoTableOutlivesTheStop) {
  prepare();
  ASSERT_EQ(Hb_Success, hb_vex_update_global_tbl(&global_config_tbl_new, nullptr, nullptr, nullptr));
  hb_migrate_to_vex_abort();
  EXPECT_EQ(3, global_config_tbl_new.Hb_num_nodes);
  EXPECT_EQ(Hb_Success, hb_terminate());
  EXPECT_EQ(nullptr, global_config_tbl_new.node_list);
  EXPECT_EQ(0, global_config_tbl_new.Hb_num_nodes);
}

TEST_F(Migration, CanBePreparedAgainAfterAnAbortAndCommitted) {
  prepare();
  hb_migrate_to_vex_abort();
  EXPECT_EQ(Hb_Success, prepare());
  EXPECT_EQ(Hb_Success, commit());
  EXPECT_EQ(all_handlers, Migrating_Client::descriptors().size());
}

}  // namespace
}  // namespace hb_test
