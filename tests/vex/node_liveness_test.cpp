// The monitor of nodes: what it tells of a node that went down or came up.
#include "VEX_EVMONNodeLivenessHandler.h"

#include <functional>

#include "monitored_cluster.h"
#include "support/allocation_faults.h"

namespace {

bool node_events_can_be_made = true;

}  // namespace

extern "C" Hb_VEX_Event* __real__Z13VEX_new_event13Hb_Group_Type(Hb_Group_Type type);
extern "C" Hb_VEX_Event* __wrap__Z13VEX_new_event13Hb_Group_Type(Hb_Group_Type type);
Hb_VEX_Event* __wrap__Z13VEX_new_event13Hb_Group_Type(Hb_Group_Type type) {
  return type == Hb_Node_Group && !node_events_can_be_made ? nullptr : __real__Z13VEX_new_event13Hb_Group_Type(type);
}

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;

constexpr uint64_t sequence = 0x500000007;
constexpr uint32_t low_sequence = 7;

class NodeLiveness : public MonitorTest<EVMONNodeLivenessHandler> {
 protected:
  static zu_evm_event_node_liveness_t report(zu_evm_event_type_t type, uint32_t node) {
    return {type, node, 0x1122334455667788, sequence, 21, ZU_EVM_NODE_DOWN_LINK_DOWN};
  }
  Hb_Rc down(uint32_t node) { return take(report(ZU_EVM_EVENT_DOWN, node)); }
  Hb_Rc up(uint32_t node) { return take(report(ZU_EVM_EVENT_UP, node)); }

  void expect_nothing_told(Hb_Seq_Num number) {
    EXPECT_EQ(0, out.events);
    EXPECT_EQ("<EMPTY EVENT>", name());
    EXPECT_EQ(number, out.sequence);
    EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
    EXPECT_EQ(0, client.bytes_in_pipe());
  }
  void expect_node_in_group(uint32_t node, Hb_Events events) {
    EXPECT_EQ(Hb_Node_Group, out.group->Hb_group_type);
    EXPECT_EQ(events, out.group->Hb_events);
    EXPECT_EQ(Hb_Group_Stable, out.group->Hb_group_status);
    EXPECT_EQ(1, count_of(*out.group));
    EXPECT_THAT(nodes_of(*out.group), ElementsAre(node));
  }
  void expect_empty_delivery(uint32_t node, Hb_Seq_Num number) {
    expect_nothing_told(number);
    expect_node_in_group(node, 0);
  }
};

// Reading.

TEST_F(NodeLiveness, ThatCannotBeReadFailsAndWritesNothing) {
  platform_double().errno_after_trace = 5;
  EXPECT_EQ(Hb_Failure, take_result(-1, ENXIO));
  EXPECT_EQ(ENXIO, errno);
  EXPECT_TRUE(out.untouched());
  EXPECT_EQ(no_number, hb_get_errno());
  EXPECT_THAT(traced(), ElementsAre(Pair(231U, info), Pair(11U, errors), Pair(284U, info)));
  const auto fd = static_cast<uint64_t>(descriptor());
  EXPECT_THAT(numbers_of(231), ElementsAre(fd));
  EXPECT_THAT(numbers_of(11), ElementsAre(minus_one, ENXIO, fd));
  EXPECT_THAT(numbers_of(284), ElementsAre(fd, 3));
}

TEST_F(NodeLiveness, ThatCannotBeReadFailsWithoutTraceAsWell) {
  Monitored_Client::trace_nothing();
  EXPECT_EQ(Hb_Failure, take_result(-7, EIO));
  EXPECT_EQ(EIO, errno);
  EXPECT_TRUE(out.untouched());
  EXPECT_THAT(traced(), IsEmpty());
}

TEST_F(NodeLiveness, OfAPlatformWithoutMonitorsFails) {
  scripted_cluster().has_monitors = false;
  EVMONNodeLivenessHandler absent(path);
  Monitored_Client::forget_traces();
  errno = 77;
  EXPECT_EQ(Hb_Failure, absent.handler(&out.events, out.name, out.group.get(), &out.sequence));
  EXPECT_EQ(77, errno);
  EXPECT_TRUE(out.untouched());
  EXPECT_THAT(numbers_of(11), ElementsAre(minus_one, 77, minus_one));
}

TEST_F(NodeLiveness, WithNothingToReadIsTheEventNone) {
  scripted_cluster().wake(descriptor());
  errno = 77;
  EXPECT_EQ(Hb_Success, take());
  EXPECT_EQ(77, errno);
  EXPECT_EQ(0, out.events);
  out.events = 0x7A;
  EXPECT_TRUE(out.untouched());
  EXPECT_THAT(traced(), ElementsAre(Pair(231U, info), Pair(236U, info), Pair(284U, info)));
  EXPECT_THAT(numbers_of(284), ElementsAre(static_cast<uint64_t>(descriptor()), 2));
}

TEST_F(NodeLiveness, WithARecordThatIsNoneFailsAsAReadDoes) {
  EXPECT_EQ(Hb_Failure, take_result(2, 0));
  EXPECT_EQ(Hb_Failure, take_result(1, 0));
  EXPECT_EQ(Hb_Failure, take_result(0, 0));
  EXPECT_TRUE(out.untouched());
  const std::vector<Recorded_Trace> failed = platform_double().traces_of(11);
  ASSERT_EQ(3U, failed.size());
  EXPECT_EQ(2U, failed[0].values[0]);
  EXPECT_EQ(1U, failed[1].values[0]);
  EXPECT_EQ(0U, failed[2].values[0]);
}

TEST_F(NodeLiveness, IsArmedWithNothing) {
  const Platform_Question& opened = scripted_cluster().asked.back();
  EXPECT_EQ("zu_evm_open", std::string(opened.call));
  EXPECT_EQ("monitor", std::string(opened.path.c_str()));
  EXPECT_EQ("", std::string(opened.init_string.c_str()));
}

TEST_F(NodeLiveness, RecordsWhatWasRead) {
  down(local_node);
  EXPECT_THAT(numbers_of(10), ElementsAre(0, local_node, 0x1122334455667788, sequence, 21));
  EXPECT_THAT(sizes_of(10), ElementsAre(4, 4, 8, 8, 4));
  EXPECT_EQ(info, platform_double().traces_of(10)[0].category);
}

TEST_F(NodeLiveness, HandsASplitOnAndYieldsItsResult) {
  uint32_t nodes[] = {1};
  zu_evm_event_split_merge_cfg_t split = {};
  split.event_type = ZU_EVM_SUBCLUSTER_MERGE;
  split.num_local_node_up = 1;
  split.local_node_numbers = nodes;
  Monitored_Client::subscribe();
  EXPECT_EQ(Hb_Success, take(split));
  EXPECT_EQ(8192, out.events);
  hb_free_split_info(&out.group->Hb_membership_grp_union.split_info);
  split.event_subtype = ZU_EVM_SPLITMERGE_EVENT_SUBTYPE_REMOTE;
  EXPECT_EQ(Hb_Failure, take(split));
  EXPECT_EQ(3U, platform_double().traces_of(284).at(1).values.at(1));
}

// Before a report is looked at.

TEST_F(NodeLiveness, TellsNothingOfThisNode) {
  Monitored_Client::goes_down(local_node);
  EXPECT_EQ(Hb_Success, down(local_node));
  expect_empty_delivery(local_node, low_sequence);
  EXPECT_EQ(0U, scripted_cluster().times_asked("zu_vex_get_node_info_after_event"));
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of(local_node).first);
}

TEST_F(NodeLiveness, TellsNothingWhileTheInterfacesCannotBeListed) {
  Monitored_Client::goes_down(3);
  platform_double().net_intf_info.answers.push_back({-1, nullptr});
  EXPECT_EQ(Hb_Success, down(3));
  expect_empty_delivery(3, 0);
  EXPECT_EQ(0U, scripted_cluster().times_asked("zu_vex_get_node_info_after_event"));
}

TEST_F(NodeLiveness, FailsAsTheBuildOfTheTableDoes) {
  Monitored_Client::goes_down(3);
  platform_double().node_info_after_event.answers.push_back({-1, nullptr});
  errno = 77;
  EXPECT_EQ(Hb_Failure, down(3));
  EXPECT_EQ(77, errno);
  EXPECT_EQ(64, hb_get_errno());
  EXPECT_TRUE(out.untouched());
  EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of(3).first);
  EXPECT_THAT(numbers_of(284), ElementsAre(static_cast<uint64_t>(descriptor()), 3));
}

TEST_F(NodeLiveness, AsksForTheNodesAsTheReportLeavesThem) {
  int category = -1;
  uint32_t node = 0;
  scripted_cluster().at_query_after_event = [&](const zu_evm_event_metadata_t* event) {
    category = event->category;
    node = event->event.p_node_liveness->node_number;
    Monitored_Client::goes_down(3);
  };
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_EQ(0, category);
  EXPECT_EQ(3U, node);
  EXPECT_EQ(1, out.group->Hb_events);
}

// Down.

TEST_F(NodeLiveness, ADeathThatIsNoneIsStale) {
  EXPECT_EQ(Hb_Success, down(3));
  expect_nothing_told(0);
  EXPECT_TRUE(is_group_untouched());
  EXPECT_THAT(numbers_of(168), ElementsAre(0, 3, 0x1122334455667788, sequence, 21));
  EXPECT_THAT(sizes_of(168), ElementsAre(4, 4, 8, 8, 4));
  EXPECT_EQ(info, platform_double().traces_of(168)[0].category);
}

TEST_F(NodeLiveness, ADeathThatIsKnownIsRepeated) {
  Monitored_Client::goes_down(3);
  Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
  EXPECT_EQ(Hb_Success, down(3));
  expect_empty_delivery(3, low_sequence);
  EXPECT_THAT(numbers_of(267), ElementsAre(0, 3, 2, 6));
  EXPECT_EQ(info, platform_double().traces_of(267)[0].category);
}

TEST_F(NodeLiveness, ADeathTellsTheAdaptersAtOnceAndQueuesTheNode) {
  Monitored_Client::subscribe();
  Monitored_Client::goes_down(3);
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_EQ(1, out.events);
  EXPECT_EQ("adapters", name());
  EXPECT_EQ(0U, out.sequence);
  EXPECT_EQ(Hb_Adapter_Group, out.group->Hb_group_type);
  EXPECT_EQ(1, out.group->Hb_events);
  EXPECT_EQ(2, count_of(*out.group));
  EXPECT_THAT(adapters_of(*out.group), ElementsAre(adapter(3, 0), adapter(3, 1)));
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(Queued_Event{1, {3}, 1}, configuration_event));
  EXPECT_EQ(1, client.bytes_in_pipe());
  EXPECT_EQ(1U, times_traced(78));
  EXPECT_EQ(info, platform_double().traces_of(78).at(0).category);
  EXPECT_EQ(Hb_Entity_Down, Monitored_Client::state_of_adapter(3, 0));
  EXPECT_EQ(Hb_Entity_Down, Monitored_Client::state_of_adapter(3, 1));
}

TEST_F(NodeLiveness, ADeathWhoseEventCannotBeMadeIsTracedAndNothingIsTold) {
  Monitored_Client::subscribe();
  Monitored_Client::goes_down(3);
  node_events_can_be_made = false;
  EXPECT_EQ(Hb_Failure, down(3));
  node_events_can_be_made = true;
  EXPECT_EQ(17, hb_get_errno());
  EXPECT_EQ(1U, times_traced(86));
  EXPECT_EQ(info, platform_double().traces_of(86)[0].category);
  EXPECT_TRUE(out.untouched());
  EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(3, 0));
  EXPECT_EQ(nullptr, global_config_tbl_new.node_list);
}

TEST_F(NodeLiveness, ADeathLeavesTheTableInForceUntilItsConfigurationIsTaken) {
  Monitored_Client::goes_down(3, ZU_VEX_NODE_DOWN_REASON_STOPPED);
  down(3);
  EXPECT_THAT(Monitored_Client::state_of(3), Pair(Hb_Entity_Up, Hb_Entity_State_Reason_Up));
  Monitored_Client::take_configuration();
  EXPECT_THAT(Monitored_Client::state_of(3), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_STOPPED_Down));
}

TEST_F(NodeLiveness, AStaleInterfaceOfADeadNodeDoesNotComeBackWithTheTable) {
  Monitored_Client::goes_down(3);
  Monitored_Client::interface(3, 0).status = ZU_VEX_INTF_STATUS_STALE;
  down(3);
  Monitored_Client::take_configuration();
  EXPECT_EQ(Hb_Entity_Down, Monitored_Client::state_of_adapter(3, 0));
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(2, 0));
}

TEST_F(NodeLiveness, WithoutASubscriptionToNetworksADeadNodesAdaptersAreNoEvent) {
  Monitored_Client::goes_down(3);
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_EQ(0, out.events);
  EXPECT_EQ("<EMPTY EVENT>", name());
  EXPECT_EQ(1U, times_traced(192));
  EXPECT_EQ(info, platform_double().traces_of(192).at(0).category);
  EXPECT_EQ(0U, out.sequence);
  EXPECT_THAT(adapters_of(*out.group), ElementsAre(adapter(3, 0), adapter(3, 1)));
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(Queued_Event{1, {3}, 1}, configuration_event));
}

TEST_F(NodeLiveness, ADeathWithoutAdaptersIsToldAtOnce) {
  Monitored_Client::subscribe();
  Monitored_Client::goes_down(3, ZU_VEX_NODE_DOWN_REASON_SHUTDOWN);
  Monitored_Client::mark_adapters(3, Hb_Entity_Down);
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_EQ(1, out.events);
  EXPECT_EQ("nodes", name());
  EXPECT_EQ(low_sequence, out.sequence);
  expect_node_in_group(3, 1);
  EXPECT_THAT(Monitored_Client::state_of(3), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_SHUT_Down));
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(configuration_event));
  EXPECT_EQ(1, client.bytes_in_pipe());
  EXPECT_EQ(0U, times_traced(78));
}

TEST_F(NodeLiveness, WithoutASubscriptionToNodesADeathKeepsItsCode) {
  Monitored_Client::goes_down(3);
  Monitored_Client::mark_adapters(3, Hb_Entity_Down);
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_EQ(1, out.events);
  EXPECT_EQ("<EMPTY EVENT>", name());
  EXPECT_EQ(low_sequence, out.sequence);
  expect_node_in_group(3, 1);
}

TEST_F(NodeLiveness, OfANodeThatLeftTheConfigurationTheReasonStays) {
  Monitored_Client::mark_node(4, Hb_Entity_Up, Hb_Entity_State_Reason_BRIXD_Up);
  Monitored_Client::mark_adapters(4, Hb_Entity_Down);
  scripted_cluster().nodes.pop_back();
  EXPECT_EQ(Hb_Success, down(4));
  EXPECT_EQ(1, out.events);
  EXPECT_THAT(Monitored_Client::state_of(4), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_BRIXD_Up));
  Monitored_Client::take_configuration();
  EXPECT_FALSE(Monitored_Client::is_configured(4));
}

TEST_F(NodeLiveness, ADeathOfANodeThatWasNotConfiguredIsTold) {
  Monitored_Client::add_node(5, ZU_VEX_NODE_STATUS_DOWN);
  EXPECT_EQ(Hb_Success, down(5));
  EXPECT_EQ(1, out.events);
  EXPECT_EQ(low_sequence, out.sequence);
  expect_node_in_group(5, 1);
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(configuration_event));
  EXPECT_FALSE(Monitored_Client::is_configured(5));
}

TEST_F(NodeLiveness, OfANodeWhoseDaemonWasDownOnlyTheAdaptersAreTold) {
  Monitored_Client::subscribe();
  Monitored_Client::mark_node(3, Hb_Entity_Down, Hb_Entity_State_Reason_BRIXD_Down);
  Monitored_Client::goes_down(3);
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_EQ(1, out.events);
  EXPECT_EQ("adapters", name());
  EXPECT_EQ(0U, out.sequence);
  EXPECT_THAT(adapters_of(*out.group), ElementsAre(adapter(3, 0), adapter(3, 1)));
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(configuration_event));
}

TEST_F(NodeLiveness, OfANodeWhoseDaemonWasDownWithoutAdaptersTheTableIsTold) {
  Monitored_Client::subscribe();
  Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_BRIXD_Down);
  Monitored_Client::goes_down(3);
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_EQ(128, out.events);
  EXPECT_EQ("Hb_Config_Group", name());
  EXPECT_EQ(0U, out.sequence);
  EXPECT_TRUE(is_group_untouched());
  EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
  EXPECT_EQ(0, client.bytes_in_pipe());
  EXPECT_THAT(Monitored_Client::state_of(3), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_Down));
  EXPECT_EQ(0, global_config_tbl_new.Hb_num_nodes);
}

// Up.

TEST_F(NodeLiveness, AReturnThatIsNoneIsStale) {
  Monitored_Client::goes_down(3);
  EXPECT_EQ(Hb_Success, up(3));
  expect_nothing_told(0);
  EXPECT_TRUE(is_group_untouched());
  EXPECT_THAT(numbers_of(174), ElementsAre(1, 3, 0x1122334455667788, sequence, 21));
  EXPECT_THAT(sizes_of(174), ElementsAre(4, 4, 8, 8, 4));
  EXPECT_EQ(info, platform_double().traces_of(174)[0].category);
}

TEST_F(NodeLiveness, AReturnThatIsKnownIsRepeated) {
  EXPECT_EQ(Hb_Success, up(3));
  expect_empty_delivery(3, low_sequence);
  EXPECT_THAT(numbers_of(267), ElementsAre(1, 3, 1, 1));
}

TEST_F(NodeLiveness, AReturnTellsTheNodeAtOnceAndQueuesTheConfigurationBeforeTheAdapters) {
  Monitored_Client::subscribe();
  Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
  EXPECT_EQ(Hb_Success, up(3));
  EXPECT_EQ(2, out.events);
  EXPECT_EQ("nodes", name());
  EXPECT_EQ(low_sequence, out.sequence);
  expect_node_in_group(3, 2);
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(configuration_event, Queued_Event{2, {adapter(3, 0), adapter(3, 1)}, 2}));
  EXPECT_EQ(1, client.bytes_in_pipe());
  // The reason comes with the table.
  EXPECT_THAT(Monitored_Client::state_of(3), Pair(Hb_Entity_Up, Hb_Entity_State_Reason_LINK_Down));
}

TEST_F(NodeLiveness, EveryOtherTypeOfReportIsAReturn) {
  Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
  EXPECT_EQ(Hb_Success, take(report(static_cast<zu_evm_event_type_t>(77), 3)));
  EXPECT_EQ(2, out.events);
}

TEST_F(NodeLiveness, AReturnLeavesTheRebuiltTableToTheConfigurationEvent) {
  Monitored_Client::add_node(5);
  EXPECT_EQ(Hb_Success, up(5));
  EXPECT_EQ(2, out.events);
  expect_node_in_group(5, 2);
  EXPECT_FALSE(Monitored_Client::is_configured(5));
  Monitored_Client::take_configuration();
  EXPECT_TRUE(Monitored_Client::is_configured(5));
}

TEST_F(NodeLiveness, AReturnWithoutAnAnswerAboutAdaptersIsToldWithThoseOfTheRebuiltTable) {
  Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
  platform_double().net_intf_info.answers = {{0, nullptr, 0, true}, {-1, nullptr}};
  EXPECT_EQ(Hb_Success, up(3));
  EXPECT_EQ(2, out.events);
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(configuration_event, Queued_Event{2, {adapter(3, 0), adapter(3, 1)}, 2}));
}

// Others.

TEST_F(NodeLiveness, OfTwoNodesThatDieAtOnceTheFirstReportTellsBothAndTheSecondIsRepeated) {
  Monitored_Client::subscribe();
  Monitored_Client::goes_down(3);
  Monitored_Client::goes_down(4);
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_EQ(1, out.events);
  EXPECT_EQ(2, count_of(*out.group));
  EXPECT_THAT(adapters_of(*out.group), ElementsAre(adapter(3, 0), adapter(3, 1)));
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(Queued_Event{1, {3}, 1}, Queued_Event{1, {adapter(4, 0), adapter(4, 1)}, 2},
                          Queued_Event{1, {4}, 1}, configuration_event));
  EXPECT_EQ(1, client.bytes_in_pipe());
  Monitored_Client::drop_queue();
  Monitored_Client::take_configuration();
  EXPECT_THAT(Monitored_Client::state_of(4), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down));
  EXPECT_EQ(Hb_Success, down(4));
  EXPECT_EQ(0, out.events);
  EXPECT_THAT(numbers_of(267), ElementsAre(0, 4, 2, 6));
}

TEST_F(NodeLiveness, OfTwoNodesThatReturnAtOnceTheFirstReportTellsBothBehindTheConfiguration) {
  Monitored_Client::subscribe();
  Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
  Monitored_Client::mark(4, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
  EXPECT_EQ(Hb_Success, up(3));
  EXPECT_EQ(2, out.events);
  expect_node_in_group(3, 2);
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(configuration_event, Queued_Event{2, {adapter(3, 0), adapter(3, 1)}, 2},
                          Queued_Event{2, {4}, 1}, Queued_Event{2, {adapter(4, 0), adapter(4, 1)}, 2}));
  Monitored_Client::drop_queue();
  Monitored_Client::take_configuration();
  EXPECT_THAT(Monitored_Client::state_of(4), Pair(Hb_Entity_Up, Hb_Entity_State_Reason_Up));
  EXPECT_EQ(Hb_Success, up(4));
  EXPECT_EQ(0, out.events);
}

TEST_F(NodeLiveness, ADeathTellsJoinsOfOthersBehindItsConfigurationAndAReturnTheirDeathsBeforeIt) {
  Monitored_Client::subscribe();
  Monitored_Client::mark(4, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
  Monitored_Client::goes_down(3);
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(Queued_Event{1, {3}, 1}, configuration_event, Queued_Event{2, {4}, 1},
                          Queued_Event{2, {adapter(4, 0), adapter(4, 1)}, 2}));
  Monitored_Client::drop_queue();
  Monitored_Client::take_configuration();
  Monitored_Client::comes_up(3);
  Monitored_Client::goes_down(4);
  EXPECT_EQ(Hb_Success, up(3));
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(Queued_Event{1, {adapter(4, 0), adapter(4, 1)}, 2}, Queued_Event{1, {4}, 1},
                          configuration_event, Queued_Event{2, {adapter(3, 0), adapter(3, 1)}, 2}));
}

TEST_F(NodeLiveness, ANodeWhoseDaemonIsDownIsNotJoinedByTheReportOfAnother) {
  Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
  Monitored_Client::mark_node(4, Hb_Entity_Down, Hb_Entity_State_Reason_BRIXD_Down);
  EXPECT_EQ(Hb_Success, up(3));
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(configuration_event, Queued_Event{2, {adapter(3, 0), adapter(3, 1)}, 2}));
  Monitored_Client::take_configuration();
  EXPECT_THAT(Monitored_Client::state_of(4), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_BRIXD_Down));
}

TEST_F(NodeLiveness, ANodeThatIsNewWithTheReportOfAnotherIsToldWithIt) {
  Monitored_Client::add_node(5);
  Monitored_Client::goes_down(3);
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(Queued_Event{1, {3}, 1}, configuration_event, Queued_Event{2, {5}, 1},
                          Queued_Event{2, {adapter(5, 0), adapter(5, 1)}, 2}));
  Monitored_Client::take_configuration();
  EXPECT_THAT(Monitored_Client::state_of(5), Pair(Hb_Entity_Up, Hb_Entity_State_Reason_Up));
}

TEST_F(NodeLiveness, ANodeThatIsGoneWithTheReportOfAnotherIsToldWithIt) {
  scripted_cluster().nodes.pop_back();
  std::erase_if(scripted_cluster().interfaces, [](const Scripted_Interface& each) { return each.node == 4; });
  Monitored_Client::goes_down(3);
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(Queued_Event{1, {3}, 1}, Queued_Event{1, {adapter(4, 0), adapter(4, 1)}, 2},
                          Queued_Event{1, {4}, 1}, configuration_event));
}

TEST_F(NodeLiveness, AnInterfaceOfAnotherNodeIsToldWithTheReport) {
  Monitored_Client::goes_down(3);
  Monitored_Client::interface(2, 1).status = ZU_VEX_INTF_STATUS_DOWN;
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(Queued_Event{1, {3}, 1}, Queued_Event{1, {adapter(2, 1)}, 1}, configuration_event));
  Monitored_Client::take_configuration();
  EXPECT_EQ(Hb_Entity_Down, Monitored_Client::state_of_adapter(2, 1));
}

TEST_F(NodeLiveness, ADeathThatIsToldAtOnceTellsOthersAsWell) {
  Monitored_Client::subscribe();
  Monitored_Client::goes_down(3);
  Monitored_Client::mark_adapters(3, Hb_Entity_Down);
  Monitored_Client::interface(2, 1).status = ZU_VEX_INTF_STATUS_DOWN;
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_EQ("nodes", name());
  expect_node_in_group(3, 1);
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(Queued_Event{1, {adapter(2, 1)}, 1}, configuration_event));
}

TEST_F(NodeLiveness, ATableThatIsToldAloneWaitsBehindTheDeathsOfOthers) {
  Monitored_Client::subscribe();
  Monitored_Client::goes_down(3);
  Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_BRIXD_Down);
  Monitored_Client::interface(2, 1).status = ZU_VEX_INTF_STATUS_DOWN;
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_EQ(0, out.events);
  EXPECT_EQ("<EMPTY EVENT>", name());
  EXPECT_EQ(0U, out.sequence);
  EXPECT_TRUE(is_group_untouched());
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(Queued_Event{1, {adapter(2, 1)}, 1}, configuration_event));
  EXPECT_EQ(1, client.bytes_in_pipe());
  EXPECT_THAT(Monitored_Client::state_of(3), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_BRIXD_Down));
  Monitored_Client::take_configuration();
  EXPECT_THAT(Monitored_Client::state_of(3), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_Down));
}

TEST_F(NodeLiveness, ATableThatIsToldAloneDoesNotWaitForTheJoinsOfOthers) {
  Monitored_Client::subscribe();
  Monitored_Client::goes_down(3);
  Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_BRIXD_Down);
  Monitored_Client::mark(4, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_EQ(128, out.events);
  EXPECT_THAT(Monitored_Client::queue(),
              ElementsAre(Queued_Event{2, {4}, 1}, Queued_Event{2, {adapter(4, 0), adapter(4, 1)}, 2}));
  EXPECT_EQ(1, client.bytes_in_pipe());
  EXPECT_THAT(Monitored_Client::state_of(4), Pair(Hb_Entity_Up, Hb_Entity_State_Reason_Up));
}

// Its own notification waits, and finds it down when it is read.
TEST_F(NodeLiveness, AReturnTellsTheDeathOfAnAdapterOfTheNodeThatWasUp) {
  Monitored_Client::mark_node(3, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
  Monitored_Client::interface(3, 1).status = ZU_VEX_INTF_STATUS_DOWN;
  EXPECT_EQ(Hb_Success, up(3));
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(Queued_Event{1, {adapter(3, 1)}, 1}, configuration_event,
                                                     Queued_Event{2, {adapter(3, 0)}, 1}));
}

TEST_F(NodeLiveness, WhatTellsNothingLeavesNoTableBehind) {
  const auto expect_no_table = [] {
    EXPECT_EQ(nullptr, global_config_tbl_new.node_list);
    EXPECT_EQ(0, global_config_tbl_new.Hb_num_nodes);
  };
  Monitored_Client::goes_down(4);
  EXPECT_EQ(Hb_Success, down(3));
  EXPECT_EQ(1U, times_traced(168));
  expect_no_table();
  EXPECT_EQ(Hb_Success, up(4));
  EXPECT_EQ(1U, times_traced(174));
  expect_no_table();
  EXPECT_EQ(Hb_Success, up(3));
  EXPECT_EQ(1U, times_traced(267));
  expect_no_table();
  Monitored_Client::mark(4, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
  EXPECT_EQ(Hb_Success, down(4));
  EXPECT_EQ(2U, times_traced(267));
  expect_no_table();
}

TEST_F(NodeLiveness, WhatTellsNothingLeavesATableThatAnEventWaitsFor) {
  Monitored_Client::goes_down(4);
  EXPECT_EQ(Hb_Success, down(4));
  Monitored_Client::interface(2, 1).status = ZU_VEX_INTF_STATUS_DOWN;
  EXPECT_EQ(Hb_Success, down(3));
  Monitored_Client::take_configuration();
  EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(2, 1)) << "what was not told";
  EXPECT_THAT(Monitored_Client::state_of(4), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down));
}

// The pipe.

TEST_F(NodeLiveness, FailsWhenTheCallerCannotBeWokenAndKeepsTheEvents) {
  Monitored_Client::goes_down(3);
  client.remove_event_pipe();
  EXPECT_EQ(Hb_Failure, down(3));
  EXPECT_EQ(90, hb_get_errno());
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(Queued_Event{1, {3}, 1}, configuration_event));
  Monitored_Client::drop_queue();
  Monitored_Client::comes_up(3);
  Monitored_Client::mark_adapters(3, Hb_Entity_Up);
  Monitored_Client::mark(2, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
  EXPECT_EQ(Hb_Failure, up(2));
  EXPECT_EQ(2U, Monitored_Client::queue().size());
}

// Memory.

long blocks_of_a_list() {
  const LeakAllowed list_stays;
  const long before = live_allocations();
  zu_vex_net_intf_info_t* list = nullptr;
  EXPECT_EQ(Hb_Success, hb_get_new_net_intf_info(&list));
  zu_vex_free_net_intf_info(list);
  return live_allocations() - before;
}

TEST_F(NodeLiveness, OfAReportOneListOfBootInterfacesStaysAndNothingElse) {
  Monitored_Client::trace_nothing();
  const size_t handed_out = Scripted_Cluster::outstanding();
  const long blocks = blocks_of_a_list();
  EXPECT_LT(0, blocks);
  const auto stays = [&](Hb_Rc rc, long before) {
    EXPECT_EQ(Hb_Success, rc);
    Monitored_Client::drop_queue();
    empty_global_config_table(&global_config_tbl_new);
    EXPECT_EQ(blocks, live_allocations() - before);
    EXPECT_EQ(handed_out, Scripted_Cluster::outstanding());
  };
  const std::function<void()> situations[] = {
      [] { Monitored_Client::mark(3, Hb_Entity_Up, Hb_Entity_State_Reason_Up); },
      [] { Monitored_Client::mark_adapters(3, Hb_Entity_Down); },
      [] { Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_BRIXD_Down); },
      [] { Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down); },
  };
  for (const auto& situation : situations) {
    Monitored_Client::goes_down(3);
    situation();
    long before = live_allocations();
    stays(down(3), before);
    Monitored_Client::comes_up(3);
    before = live_allocations();
    stays(up(3), before);
  }
}

// A report with changes of others, for which the n-th allocation fails.
class ReportWithoutMemory {
 public:
  explicit ReportWithoutMemory(zu_evm_event_type_t type) {
    Monitored_Client::subscribe();
    Monitored_Client::trace_nothing();
    Monitored_Client::add_node(5);
    Monitored_Client::goes_down(4);
    if (type == ZU_EVM_EVENT_DOWN) {
      Monitored_Client::goes_down(3);
    } else {
      Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_LINK_Down);
    }
    before = states();
    scripted_cluster().notify(monitor.getFileDescriptor(), zu_evm_event_node_liveness_t{type, 3, 1, 2, 3, {}});
  }

  // Whether an allocation failed.
  bool take(size_t nth) {
    const LeakAllowed lists_stay;
    const AllocationFailure failure(nth);
    rc = monitor.handler(&out.events, out.name, out.group.get(), &out.sequence);
    return failure.happened();
  }

  void expect_nothing_told() {
    EXPECT_TRUE(out.untouched());
    EXPECT_THAT(Monitored_Client::queue(), IsEmpty());
    EXPECT_EQ(before, states());
    EXPECT_EQ(nullptr, global_config_tbl_new.node_list);
  }

  static std::vector<int> states() {
    std::vector<int> all;
    for (uint32_t node = 1; node <= 4; ++node) {
      const auto [state, reason] = Monitored_Client::state_of(node);
      all.insert(all.end(), {state, reason, Monitored_Client::state_of_adapter(node, 0),
                             Monitored_Client::state_of_adapter(node, 1)});
    }
    return all;
  }

  Hb_Rc rc = Hb_Failure;

 private:
  Monitored_Client client;
  char path[8] = "monitor";
  EVMONNodeLivenessHandler monitor{path};
  EventOutputs out;
  std::vector<int> before;
};

class NodeLivenessMemory : public testing::TestWithParam<zu_evm_event_type_t> {};

// Six events are made for each: without any of them the report fails with HB_ENOMEM, and a return has them behind the
// first query for the interfaces, a death its own adapters' as the seventh.
TEST_P(NodeLivenessMemory, ThatRunsOutTellsNothingAndLeavesEverythingAsItWas) {
  size_t without_event = 0;
  bool happened = true;
  for (size_t nth = 1; happened; ++nth) {
    SCOPED_TRACE(nth);
    ReportWithoutMemory report(GetParam());
    happened = report.take(nth);
    if (report.rc == Hb_Failure) {
      EXPECT_TRUE(happened);
      report.expect_nothing_told();
      without_event += hb_get_errno() == HB_ENOMEM ? 1U : 0U;
    }
    EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::node_liveness));
  }
  EXPECT_EQ(GetParam() == ZU_EVM_EVENT_DOWN ? 7U : 6U, without_event);
}

INSTANTIATE_TEST_SUITE_P(DeathAndReturn, NodeLivenessMemory, testing::Values(ZU_EVM_EVENT_DOWN, ZU_EVM_EVENT_UP));

TEST_F(NodeLiveness, WithoutMemoryForATableThatIsToldAloneFailsAndTheTableWaitsForItsEvent) {
  Monitored_Client::subscribe();
  Monitored_Client::trace_nothing();
  Monitored_Client::mark(3, Hb_Entity_Down, Hb_Entity_State_Reason_BRIXD_Down);
  Monitored_Client::goes_down(3);
  Hb_Rc rc = Hb_Success;
  for (size_t nth = 1; hb_get_errno() != 70; ++nth) {
    ASSERT_GT(100U, nth);
    ASSERT_EQ(0, global_config_tbl_new.Hb_num_nodes) << nth;
    {
      const LeakAllowed lists_stay;
      scripted_cluster().notify(descriptor(), zu_evm_event_node_liveness_t{ZU_EVM_EVENT_DOWN, 3, 1, 2, 3, {}});
      const AllocationFailure failure(nth, false);
      rc = monitor.handler(&out.events, out.name, out.group.get(), &out.sequence);
    }
  }
  EXPECT_EQ(Hb_Failure, rc);
  EXPECT_EQ(0, out.events);
  EXPECT_EQ("<EMPTY EVENT>", name());
  EXPECT_THAT(Monitored_Client::state_of(3), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_BRIXD_Down));
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(configuration_event));
  EXPECT_EQ(1, client.bytes_in_pipe());
  Monitored_Client::take_configuration();
  EXPECT_THAT(Monitored_Client::state_of(3), Pair(Hb_Entity_Down, Hb_Entity_State_Reason_Down));
}

// Numbers beyond what a cluster has.

class StrangeNodes : public NodeLiveness, public testing::WithParamInterface<uint32_t> {};

TEST_P(StrangeNodes, DieWithoutAMemberAndWithoutHarm) {
  EXPECT_EQ(Hb_Success, down(GetParam()));
  EXPECT_EQ(1, out.events);
  EXPECT_THAT(nodes_of(*out.group), IsEmpty());
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(configuration_event));
  for (uint32_t node = 1; node <= 4; ++node) EXPECT_EQ(Hb_Entity_Up, Monitored_Client::state_of_adapter(node, 0));
}

TEST_P(StrangeNodes, ReturnWithoutAMemberAndWithoutHarm) {
  EXPECT_EQ(Hb_Success, up(GetParam()));
  EXPECT_EQ(2, out.events);
  EXPECT_THAT(nodes_of(*out.group), IsEmpty());
  EXPECT_THAT(Monitored_Client::queue(), ElementsAre(configuration_event));
}

INSTANTIATE_TEST_SUITE_P(Numbers, StrangeNodes, testing::Values(2049U, 65537U, 0x80000001U, minus_one));

}  // namespace
}  // namespace hb_test
