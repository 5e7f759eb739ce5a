// Delivery of queued events through the event pipe.
#include <fcntl.h>
#include <poll.h>

#include "VEX_EVMONEventPipeHandler.h"
#include "handler_state.h"
#include "support/allocation_faults.h"
#include "support/process_state.h"
#include "support/system_calls.h"

namespace {

// Whether another thread takes the event between the look at the queue and the taking.
bool event_is_taken_by_another = false;

}  // namespace

extern "C" {
Hb_VEX_Event* __real__Z23VEX_get_event_from_headv();
Hb_VEX_Event* __wrap__Z23VEX_get_event_from_headv();
Hb_VEX_Event* __wrap__Z23VEX_get_event_from_headv() {
  Hb_VEX_Event* event = __real__Z23VEX_get_event_from_headv();
  if (!event_is_taken_by_another) return event;
  event_is_taken_by_another = false;
  delete event;
  return nullptr;
}
}

namespace hb_test {
namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::IsSupersetOf;
using testing::Not;

class EventPipeHandler : public HandlerState {
 protected:
  EventPipeHandler() {
    ends = new_pipe();
    event_pipe_handler_p = new EVMONEventPipeHandler(ends.fds, label);
    set_name(nodeEventSubscriptionName, "nodes");
    set_name(networkEventSubscriptionName, "networks");
    set_name(siteEventSubscriptionName, "sites");
    fill_table(global_config_tbl, 4, 3,
               {{1, Hb_Entity_Up, Hb_Entity_State_Reason_Up},
                {2, Hb_Entity_Down, Hb_Entity_State_Reason_BRIXD_Down},
                {3, Hb_Entity_Down, Hb_Entity_State_Reason_Down}},
               {});
    start_tracing();
  }

  Hb_Rc serve() {
    start_tracing();
    return out.call(*event_pipe_handler_p);
  }

  void put(const char* byte) { ASSERT_EQ(write(ends.write(), byte, 1), 1); }

  // Record `line` with the read descriptor behind it.
  std::string of_pipe(const char* line) const { return line + std::to_string(ends.read()); }

  char label[11] = "event pipe";
  Ends ends = {{-1, -1}};
  Handler_Outputs out;
};

TEST_F(EventPipeHandler, OwnsBothEndsAndRegistersTheReadEnd) {
  EXPECT_EQ(event_pipe_handler_p->getFileDescriptor(), ends.read());
  EXPECT_EQ(event_pipe_handler_p->getWriteFd(), ends.write());
  EXPECT_EQ(event_pipe_handler_p->getVEXEVMOpenRCInConstructor(), -1);
  const std::unique_ptr<int[]> listed(EVMONHandler::getFileDescriptors());
  EXPECT_EQ(listed[0], ends.read());
  EXPECT_EQ(listed[1], -1);
}

TEST_F(EventPipeHandler, TellsItsDescriptorsWhenItIsMade) {
  Ends others = new_pipe();
  const EVMONEventPipeHandler handler(others.fds, nullptr);
  EXPECT_THAT(trace_lines(),
              ElementsAre("Info 55: " + std::to_string(others.read()) + " " + std::to_string(others.write())));
}

TEST_F(EventPipeHandler, ClosesBothEnds) {
  const int before = open_descriptors();
  delete event_pipe_handler_p;
  event_pipe_handler_p = nullptr;
  EXPECT_EQ(open_descriptors(), before - 2);
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 0);
}

TEST_F(EventPipeHandler, CanBeMadeOfAMonitor) {
  scripted_cluster().appear();
  char path[] = "/monitor";
  EVMONEventPipeHandler handler(path);
  EXPECT_TRUE(scripted_cluster().is_open_monitor(handler.getFileDescriptor()));
  EXPECT_TRUE(scripted_cluster().asked[0].init_string.empty());
  EXPECT_EQ(handler.getWriteFd(), -1);
}

TEST_F(EventPipeHandler, ReportsTheEmptyEventForAByteWithoutAnEvent) {
  put("\x01");
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_TRUE(out.is_empty_event());
  EXPECT_EQ(waiting_bytes(ends.read()), 0);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 166"));
}

TEST_F(EventPipeHandler, ReportsTheEmptyEventWithoutAByte) {
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_TRUE(out.is_empty_event());
  EXPECT_TRUE(same_bytes(*out.group, *group_of_bytes(0x5A)));
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 180", "Info 166"));
}

TEST_F(EventPipeHandler, WritesNothingBehindTheNameOfTheEmptyEvent) {
  serve();
  EXPECT_EQ(std::memcmp(out.name, "<EMPTY EVENT>\0ZZ", 16), 0);
}

TEST_F(EventPipeHandler, DeliversOneEventAndWakesForTheNext) {
  Hb_VEX_Event* first = queue(Hb_Node_Group, 1);
  first->group.Hb_membership_grp_union.Hb_node_membership_grp.Hb_num_nodes = 1;
  queue(Hb_Node_Group, 2);
  put("\x01");
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(out.events, 1);
  EXPECT_EQ(out.seqnum, 0U);
  EXPECT_STREQ(out.name, "nodes");
  EXPECT_EQ(waiting_bytes(ends.read()), 1);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 59", of_pipe("Info 224: ")));
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(out.events, 2);
  EXPECT_EQ(out.seqnum, 0U);
  EXPECT_EQ(waiting_bytes(ends.read()), 0);
  EXPECT_EQ(event_sequence, 0);
}

TEST_F(EventPipeHandler, DeliversAnEventWithoutAByte) {
  queue(Hb_Node_Group, 1);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(out.events, 1);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 180", of_pipe("Info 224: ")));
}

TEST_F(EventPipeHandler, LooksOnceAndNeverWaits) {
  SystemCalls calls;
  serve();
  ASSERT_EQ(calls.of("poll").size(), 1U);
  EXPECT_THAT(calls.of("poll")[0].arguments, ElementsAre(testing::_, 1, 0, ends.read(), POLLIN));
  EXPECT_TRUE(calls.of("read").empty());
}

TEST_F(EventPipeHandler, ServesTheQueueWhenThePollFails) {
  queue(Hb_Node_Group, 1);
  SystemCalls calls;
  calls.script("poll", {fail(EINTR)});
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(out.events, 1);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 176: -1 4", of_pipe("Info 224: ")));
}

TEST_F(EventPipeHandler, KeepsTheErrnoOfThePollThatFailed) {
  platform_double().errno_after_trace = EXDEV;
  SystemCalls calls;
  calls.script("poll", {fail(EINTR)});
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(errno, EINTR);
}

TEST_F(EventPipeHandler, ServesTheQueueWhenTheReadFails) {
  queue(Hb_Node_Group, 1);
  put("\x01");
  SystemCalls calls;
  calls.script("read", {fail(EIO)});
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(out.events, 1);
  EXPECT_EQ(hb_get_errno(), 0);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 177: -1 5", of_pipe("Info 224: ")));
}

TEST_F(EventPipeHandler, ServesTheQueueBehindAForeignByte) {
  queue(Hb_Node_Group, 1);
  put("\x07");
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(hb_get_errno(), 72);
  EXPECT_EQ(out.events, 1);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 60: 7 1 72", of_pipe("Info 224: ")));
}

TEST_F(EventPipeHandler, TracesAForeignByteWithoutASign) {
  put("\xFF");
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(hb_get_errno(), 72);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 60: 255 1 72", "Info 166"));
}

TEST_F(EventPipeHandler, ReadsOneOfManyForeignBytesAtATime) {
  ASSERT_EQ(write(ends.write(), "\x02\x03\x04", 3), 3);
  for (const int bytes : {2, 1, 0}) {
    EXPECT_EQ(serve(), Hb_Success);
    EXPECT_TRUE(out.is_empty_event());
    EXPECT_EQ(waiting_bytes(ends.read()), bytes);
  }
}

// Both the end of the file and the unusual state of the descriptor are told.
TEST_F(EventPipeHandler, ServesTheQueueWhenTheWriteEndWasClosed) {
  queue(Hb_Node_Group, 1);
  close(ends.write());
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(out.events, 1);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 178", "Info 179: 16", of_pipe("Info 224: ")));
}

TEST_F(EventPipeHandler, ServesTheQueueWhenTheReadEndWasClosed) {
  queue(Hb_Node_Group, 1);
  close(ends.read());
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(out.events, 1);
  EXPECT_THAT(trace_lines(),
              ElementsAre(of_pipe("Info 223: "), "Info 177: -1 9", "Info 179: 32", of_pipe("Info 224: ")));
}

TEST_F(EventPipeHandler, IsSilentWithoutTracing) {
  set_levels(0);
  queue(Hb_Node_Group, 1);
  put("\x07");
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(hb_get_errno(), 72);
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(EventPipeHandler, YieldsTheFailureOfTheWakeUpForTheNextEvent) {
  queue(Hb_Node_Group, 1);
  queue(Hb_Node_Group, 2);
  platform_double().errno_after_trace = EXDEV;
  SystemCalls calls;
  calls.script("write", {fail(ENOSPC)});
  EXPECT_EQ(serve(), Hb_Failure);
  EXPECT_EQ(errno, ENOSPC);
  EXPECT_EQ(hb_get_errno(), 59);
  EXPECT_EQ(out.events, 1);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 180", "Info 58: -1 28", of_pipe("Info 224: ")));
}

TEST_F(EventPipeHandler, LeavesTheOutputsAloneWhenSomebodyElseTookTheEvent) {
  queue(Hb_Node_Group, 1);
  event_is_taken_by_another = true;
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_TRUE(out.is_untouched());
  EXPECT_EQ(event_sequence, 0);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 180", of_pipe("Info 224: ")));
}

struct Named_Kind {
  const char* description;
  Hb_Group_Type type;
  Hb_Events events;
  const char* name;
  char* subscription;
  const char* unsubscribed;
};

class EventsOfAKind : public EventPipeHandler, public testing::WithParamInterface<Named_Kind> {};

TEST_P(EventsOfAKind, AreDeliveredUnderTheNameOfTheirSubscription) {
  queue(GetParam().type, GetParam().events);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_STREQ(out.name, GetParam().name);
  EXPECT_EQ(out.events, GetParam().events);
  EXPECT_EQ(out.group->Hb_group_type, GetParam().type);
  EXPECT_EQ(out.group->Hb_events, GetParam().events);
  EXPECT_THAT(trace_lines(), Not(Contains(GetParam().unsubscribed)));
}

TEST_P(EventsOfAKind, ComeEmptyButWithTheirGroupWithoutASubscription) {
  GetParam().subscription[0] = '\0';
  queue(GetParam().type, GetParam().events);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_TRUE(out.is_empty_event());
  EXPECT_EQ(out.group->Hb_group_type, GetParam().type);
  EXPECT_EQ(out.group->Hb_events, GetParam().events);
  EXPECT_THAT(trace_lines(), Contains(GetParam().unsubscribed));
}

INSTANTIATE_TEST_SUITE_P(
    Kinds, EventsOfAKind,
    testing::Values(Named_Kind{"Adapters", Hb_Adapter_Group, 2, "networks", networkEventSubscriptionName, "Info 188"},
                    Named_Kind{"Nodes", Hb_Node_Group, 1, "nodes", nodeEventSubscriptionName, "Info 189"},
                    Named_Kind{"SiteSplit", Hb_Site_Group, 32, "sites", siteEventSubscriptionName, "Info 213"},
                    Named_Kind{"SiteMerge", Hb_Site_Group, 64, "sites", siteEventSubscriptionName, "Info 213"}),
    [](const auto& test) { return test.param.description; });

TEST_F(EventPipeHandler, CopiesAnAdapterGroup) {
  Hb_VEX_Event* event = queue(Hb_Adapter_Group, 2);
  Hb_Adapter_Membership_Grp& from = event->group.Hb_membership_grp_union.Hb_adapter_membership_grp;
  from.Hb_num_adapters = 1;
  from.Hb_group_leader = 8;
  from.Hb_group_incarnation = 9;
  std::fill_n(from.Hb_adapter_list, 12, HB_NOT_IN_GROUP);
  from.Hb_adapter_list[5] = 0;
  serve();
  const auto expected = group_of_bytes(0x5A);
  expected->Hb_group_type = Hb_Adapter_Group;
  expected->Hb_events = 2;
  expected->Hb_group_status = Hb_Group_Stable;
  Hb_Adapter_Membership_Grp& membership = expected->Hb_membership_grp_union.Hb_adapter_membership_grp;
  membership.Hb_num_adapters = 1;
  membership.Hb_group_leader = 8;
  membership.Hb_group_incarnation = 9;
  std::fill_n(membership.Hb_adapter_list, 12, 0xFFFFFFFFU);
  membership.Hb_adapter_list[5] = 0;
  EXPECT_TRUE(same_bytes(*out.group, *expected));
}

TEST_F(EventPipeHandler, CopiesTheVariantOfASite) {
  for (const Hb_Events events : {32, 64, 96}) {
    Hb_VEX_Event* event = queue(Hb_Site_Group, events);
    std::memset(&event->group.Hb_membership_grp_union, 0x33, 200);
    out = Handler_Outputs();
    EXPECT_EQ(serve(), Hb_Success);
    const auto expected = group_of_bytes(0x5A);
    if (events != 96) {
      expected->Hb_group_type = Hb_Site_Group;
      expected->Hb_events = events;
      expected->Hb_group_status = Hb_Group_Stable;
      const size_t copied = events == 32 ? 2 * sizeof(Hb_Site_Info) : 8 + 2 * sizeof(Hb_Site_Info);
      std::memset(&expected->Hb_membership_grp_union, 0x33, copied);
    }
    if (events == 32) {
      expected->Hb_membership_grp_union.site_split_info.local_site.node_number = 0x5A5A5A5A;
    } else if (events == 64) {
      expected->Hb_membership_grp_union.site_merge_info.local_site.node_number = 0x5A5A5A5A;
    }
    EXPECT_TRUE(same_bytes(*out.group, *expected)) << events;
    EXPECT_EQ(out.events, events);
    EXPECT_STREQ(out.name, "sites");
  }
}

TEST_F(EventPipeHandler, LeavesGroupAndNameAloneForAnotherKind) {
  queue(Hb_Subcluster_Group, 4096);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(out.events, 4096);
  EXPECT_EQ(out.seqnum, 0U);
  const Handler_Outputs fresh;
  EXPECT_EQ(std::memcmp(out.name, fresh.name, sizeof out.name), 0);
  EXPECT_TRUE(same_bytes(*out.group, *fresh.group));
}

TEST_F(EventPipeHandler, NeedsNoGroupOfTheCaller) {
  queue(Hb_Node_Group, 1);
  start_tracing();
  EXPECT_EQ(event_pipe_handler_p->handler(&out.events, out.name, nullptr, &out.seqnum), Hb_Success);
  EXPECT_EQ(out.events, 1);
  EXPECT_THAT(trace_lines(), Contains("Info 66"));
}

// The table that queries see changes at the delivery, not before.
TEST_F(EventPipeHandler, BringsTheNewConfigurationIntoForce) {
  fill_table(global_config_tbl_new, 9, 3, {{1}, {4}}, {{3, Hb_Entity_Up, "en3", scripted_address(0, 0, 3)}});
  Hb_VEX_Event* event = nullptr;
  event_pipe_handler_p->constructConfigEvent(&event);
  VEX_add_event_at_end(event);
  EXPECT_EQ(global_config_tbl.Hb_max_nodes, 4);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(out.events, 128);
  EXPECT_EQ(out.seqnum, 0U);
  EXPECT_STREQ(out.name, "Hb_Config_Group");
  EXPECT_TRUE(same_bytes(*out.group, *group_of_bytes(0x5A)));
  EXPECT_EQ(global_config_tbl.Hb_max_nodes, 9);
  EXPECT_EQ(node_of(4).node_num, 4);
  EXPECT_EQ(Hash_search(2, global_config_tbl.node_hash), nullptr);
  EXPECT_EQ(global_config_tbl_new.node_list, nullptr);
  const std::vector<std::string> lines = trace_lines();
  EXPECT_THAT(lines, IsSupersetOf({of_pipe("Info 223: "), std::string("Info 131"), std::string("Info 121"),
                                   of_pipe("Info 224: ")}));
  const auto copied = std::find(lines.begin(), lines.end(), "Info 132: 2");
  EXPECT_LT(std::find(lines.begin(), lines.end(), "Info 131"), copied);
  EXPECT_LT(copied, std::find(lines.begin(), lines.end(), "Info 121"));
  ASSERT_EQ(platform_double().traces_of(134).size(), 1U);
  EXPECT_THAT(platform_double().traces_of(134)[0].values, ElementsAre(2U, 9U, 0U, 1U, 3U, 0U));
  EXPECT_EQ(platform_double().traces_of(121)[0].block_text(0), "Event pipe handler: after copy");
}

// An event before this one has brought the table into force.
TEST_F(EventPipeHandler, LeavesTheConfigurationInForceWhereNoneWaits) {
  const Hb_Node_config_state* in_force = global_config_tbl.node_list;
  Hb_VEX_Event* event = nullptr;
  event_pipe_handler_p->constructConfigEvent(&event);
  VEX_add_event_at_end(event);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(out.events, 128);
  EXPECT_STREQ(out.name, "Hb_Config_Group");
  EXPECT_EQ(global_config_tbl.node_list, in_force);
  EXPECT_EQ(global_config_tbl.Hb_max_nodes, 4);
  EXPECT_THAT(trace_lines(), IsSupersetOf({"Info 131", "Info 132: 0", "Info 121"}));
}

// It would be lost otherwise: the queue is the only one that knows of it.
TEST_F(EventPipeHandler, KeepsAConfigurationEventForWhichThereIsNoMemory) {
  platform_double().set_levels({0, 0, 0});
  fill_table(global_config_tbl_new, 9, 3, {{1}, {4}}, {});
  queue(Hb_Node_Group, 128);
  queue(Hb_Node_Group, 2);
  {
    const AllocationFailure failure(1);
    EXPECT_EQ(serve(), Hb_Failure);
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_EQ(hb_get_errno(), 70);
  EXPECT_TRUE(out.is_empty_event());
  EXPECT_EQ(global_config_tbl.Hb_max_nodes, 4);
  EXPECT_EQ(waiting_bytes(ends.read()), 1);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(out.events, 128);
  EXPECT_EQ(global_config_tbl.Hb_max_nodes, 9);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(out.events, 2);
}

TEST_F(EventPipeHandler, NamesAConfigurationEventWhateverItsGroup) {
  fill_table(global_config_tbl_new, 9, 3, {{1}}, {});
  queue(Hb_Node_Group, 128);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_STREQ(out.name, "Hb_Config_Group");
  EXPECT_EQ(out.events, 128);
  EXPECT_EQ(global_config_tbl.Hb_max_nodes, 9);
}

TEST_F(EventPipeHandler, NamesAConfigurationEventAlsoWhereItsGroupIsNotSubscribedTo) {
  fill_table(global_config_tbl_new, 9, 3, {{1}}, {});
  nodeEventSubscriptionName[0] = '\0';
  queue(Hb_Node_Group, 128);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_STREQ(out.name, "Hb_Config_Group");
  EXPECT_EQ(out.events, 0);
  EXPECT_EQ(global_config_tbl.Hb_max_nodes, 9);
  EXPECT_THAT(trace_lines(), Contains("Info 189"));
}

// Only type 1 asks for the state of a node, here of one that would be unknown.
TEST_F(EventPipeHandler, DeliversAnEventOfAnotherTypeAsItIs) {
  Hb_VEX_Event* event = queue(Hb_Node_Group, 2);
  event->type = 2;
  event->node_num = 9;
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(out.events, 2);
  EXPECT_STREQ(out.name, "nodes");
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 180", of_pipe("Info 224: ")));
}

class DaemonUp : public EventPipeHandler {
 protected:
  // A node event that is delivered only when the node's daemon was down, and one behind it.
  void queue_daemon_up(Hb_Node_Number node) {
    Hb_VEX_Event* event = queue(Hb_Node_Group, 2);
    event->type = 1;
    event->node_num = static_cast<uint16_t>(node);
    queue(Hb_Node_Group, 1);
    put("\x01");
  }
};

TEST_F(DaemonUp, BringsANodeBackThatWentDownWithIt) {
  queue_daemon_up(2);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_EQ(out.events, 2);
  EXPECT_STREQ(out.name, "nodes");
  EXPECT_EQ(node_of(2).state, Hb_Entity_Up);
  EXPECT_EQ(node_of(2).reason, Hb_Entity_State_Reason_BRIXD_Up);
  EXPECT_EQ(waiting_bytes(ends.read()), 1);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 171: 2", "Info 59", of_pipe("Info 224: ")));
}

TEST_F(DaemonUp, RevivesNoNodeThatWentDownForAnotherReason) {
  queue_daemon_up(3);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_TRUE(out.is_empty_event());
  EXPECT_EQ(node_of(3).state, Hb_Entity_Down);
  EXPECT_EQ(node_of(3).reason, Hb_Entity_State_Reason_Down);
  EXPECT_EQ(waiting_bytes(ends.read()), 0);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 172: 3 2"));
  EXPECT_EQ(take()->group.Hb_events, 1);
}

TEST_F(DaemonUp, SaysNothingOfANodeThatIsUp) {
  queue_daemon_up(1);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_TRUE(out.is_empty_event());
  EXPECT_EQ(node_of(1).reason, Hb_Entity_State_Reason_Up);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 172: 1 1"));
}

TEST_F(DaemonUp, LeavesANodeAsItIsThatIsUpWhateverItsReason) {
  node_of(1).reason = Hb_Entity_State_Reason_BRIXD_Down;
  queue_daemon_up(1);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_TRUE(out.is_empty_event());
  EXPECT_EQ(node_of(1).state, Hb_Entity_Up);
  EXPECT_EQ(node_of(1).reason, Hb_Entity_State_Reason_BRIXD_Down);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 172: 1 1"));
}

TEST_F(DaemonUp, SaysNothingOfAnUnknownNode) {
  queue_daemon_up(9);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_TRUE(out.is_empty_event());
  EXPECT_EQ(waiting_bytes(ends.read()), 0);
  EXPECT_THAT(trace_lines(), ElementsAre(of_pipe("Info 223: "), "Info 173: 9"));
  EXPECT_EQ(take()->group.Hb_events, 1);
}

TEST_F(DaemonUp, SaysNothingWithoutAConfiguration) {
  empty_global_config_table(&global_config_tbl);
  queue_daemon_up(2);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_TRUE(out.is_empty_event());
}

TEST_F(EventPipeHandler, ServesTheClientBeforeAnyDescriptor) {
  IsVEX = Hb_True;
  queue(Hb_Node_Group, 1);
  int descriptors[] = {9999, -1};
  EXPECT_EQ(hb_get_event_message(descriptors, nullptr, &out.events, out.name, out.group.get(), &out.seqnum),
            Hb_Success);
  EXPECT_EQ(out.events, 1);
  EXPECT_EQ(hb_get_event_message(descriptors, nullptr, &out.events, out.name, out.group.get(), &out.seqnum),
            Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 81);
  descriptors[0] = ends.read();
  EXPECT_EQ(hb_get_event_message(descriptors, nullptr, &out.events, out.name, out.group.get(), &out.seqnum),
            Hb_Success);
  EXPECT_TRUE(out.is_empty_event());
}

}  // namespace
}  // namespace hb_test
