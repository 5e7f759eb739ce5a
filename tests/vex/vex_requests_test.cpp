// The small entry points of VEX mode: a node's daemon was heard of, and the daemon is to stop later.
#include <algorithm>
#include <csignal>

#include "VEX_EVMONEventPipeHandler.h"
#include "support/bytes.h"
#include "support/running_client.h"
#include "table_state.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class VexRequests : public TableState {
 protected:
  VexRequests() {
    IsVEX = Hb_True;
    client_initialized = Hb_True;
  }
  ~VexRequests() override {
    event_pipe_handler_p = nullptr;
    client_initialized = Hb_False;
    IsVEX = Hb_False;
  }

  void make_event_pipe() {
    ends = new_pipe();
    char label[] = "events";
    handler = std::make_unique<EVMONEventPipeHandler>(ends.fds, label);
    event_pipe_handler_p = handler.get();
    start_tracing();
  }

  Ends ends = {};
  std::unique_ptr<EVMONEventPipeHandler> handler;
};

// Messages.

TEST_F(VexRequests, AMessageOfANodeQueuesThatItsDaemonIsUpAndWakesTheCaller) {
  make_event_pipe();
  EXPECT_EQ(hb_vex_msg_received_from(7), Hb_Success);
  const std::unique_ptr<Hb_VEX_Event> event = take();
  ASSERT_NE(event, nullptr);
  EXPECT_EQ(event->type, 1U);
  EXPECT_EQ(event->node_num, 7);
  EXPECT_EQ(event->sequence_num, 0);
  EXPECT_EQ(event->group.Hb_group_type, Hb_Node_Group);
  EXPECT_EQ(event->group.Hb_events, 2);
  const Hb_Node_Membership_Grp& members = event->group.Hb_membership_grp_union.Hb_node_membership_grp;
  EXPECT_EQ(members.Hb_node_list[7], Hb_True);
  EXPECT_EQ(members.Hb_node_list[8], Hb_False);
  EXPECT_EQ(members.Hb_num_nodes, 1);
  EXPECT_EQ(take(), nullptr);
  EXPECT_EQ(waiting_bytes(ends.read()), 1);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 92: 7", "Info 59"));
}

TEST_F(VexRequests, AMessageWithoutAnEventPipeFails) {
  EXPECT_EQ(hb_vex_msg_received_from(7), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 90);
  EXPECT_EQ(take(), nullptr);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 92: 7", "Info 245"));
}

TEST_F(VexRequests, AMessageIsNotTracedWhenNothingIs) {
  trace_nothing();
  EXPECT_EQ(hb_vex_msg_received_from(7), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 90);
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

TEST_F(VexRequests, AMessageThatCannotWakeTheCallerFailsAndStaysQueued) {
  make_event_pipe();
  std::signal(SIGPIPE, SIG_DFL);
  close(ends.read());
  EXPECT_EQ(hb_vex_msg_received_from(7), Hb_Failure);
  EXPECT_EQ(errno, EPIPE);
  EXPECT_EQ(hb_get_errno(), 59);
  EXPECT_NE(take(), nullptr);
}

TEST_F(VexRequests, AMessageWithoutMemoryForItsEventQueuesNothing) {
  make_event_pipe();
  trace_nothing();
  {
    const AllocationFailure failure(1);
    EXPECT_EQ(hb_vex_msg_received_from(7), Hb_Success);
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_EQ(take(), nullptr);
  EXPECT_EQ(waiting_bytes(ends.read()), 0);
}

class VexRequestsFromOddNode : public VexRequests, public testing::WithParamInterface<int> {};

TEST_P(VexRequestsFromOddNode, NamesNoNodeInTheGroup) {
  make_event_pipe();
  EXPECT_EQ(hb_vex_msg_received_from(static_cast<Hb_Node_Number>(GetParam())), Hb_Success);
  const std::unique_ptr<Hb_VEX_Event> event = take();
  ASSERT_NE(event, nullptr);
  EXPECT_EQ(event->node_num, static_cast<uint16_t>(GetParam()));
  const Hb_Node_Membership_Grp& members = event->group.Hb_membership_grp_union.Hb_node_membership_grp;
  EXPECT_EQ(std::count(std::begin(members.Hb_node_list), std::end(members.Hb_node_list), Hb_True), 0);
}

INSTANTIATE_TEST_SUITE_P(Numbers, VexRequestsFromOddNode, testing::Values(-1, -32768, 2049, 32767));

TEST_F(VexRequests, AMessageWithoutAStartThatSucceedsFails) {
  client_initialized = Hb_False;
  scripted_cluster().has_services = false;
  make_event_pipe();
  EXPECT_EQ(hb_vex_msg_received_from(7), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), untouched_number);
  EXPECT_EQ(take(), nullptr);
  EXPECT_TRUE(platform_double().traces_of(92).empty());
}

// The shutdown.

TEST_F(VexRequests, AShutdownInVexModeSucceedsAndIsTraced) {
  EXPECT_EQ(hb_vex_delayed_daemon_shutdown(), Hb_Success);
  EXPECT_EQ(trace_lines().front(), "Info 109");
  EXPECT_EQ(hb_get_errno(), untouched_number);
}

TEST_F(VexRequests, AShutdownWithoutAStartThatSucceedsFails) {
  client_initialized = Hb_False;
  scripted_cluster().has_services = false;
  EXPECT_EQ(hb_vex_delayed_daemon_shutdown(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), untouched_number);
  EXPECT_TRUE(platform_double().traces_of(109).empty());
}

class DaemonShutdown : public RunningClient {
 protected:
  DaemonShutdown() : RunningClient(small_cluster(), 1) {}
};

TEST_F(DaemonShutdown, IsOneRequestWithoutData) {
  EXPECT_EQ(hb_vex_delayed_daemon_shutdown(), Hb_Success);
  EXPECT_EQ(connection.receive_request(), ByteBuilder().zeros(8).i32(227).zeros(52).i32(getpid()).zeros(8).bytes());
  EXPECT_EQ(platform_double().traces_of(109).size(), 1U);
}

TEST_F(DaemonShutdown, OfADaemonThatHasGoneFails) {
  connection.close();
  EXPECT_EQ(hb_vex_delayed_daemon_shutdown(), Hb_Failure);
}

}  // namespace
}  // namespace hb_test
