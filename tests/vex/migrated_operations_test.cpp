// What every operation yields after a move to VEX mode, without the daemon.
#include "VEX_EVMONNewGroupEventHandler.h"
#include "control/control_operations.h"
#include "migrating_client.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

// The client of the sparse cluster, moved; the configuration that the move brings waits to be taken.
class Moved_Client : public Migrating_Client {
 public:
  Moved_Client() : Migrating_Client(sparse_cluster()) {
    scripted_cluster().local_node = 3;
    scripted_cluster().nodes.clear();
    scripted_cluster().interfaces.clear();
    for (const uint32_t node : {0U, 3U, 4U}) add_scripted_node(node);
    operation_outputs.clear();
  }
  Hb_Rc move() { return prepare() == Hb_Success ? commit() : Hb_Failure; }

  // The daemon got the request of the move, and nothing more.
  bool nothing_more_was_sent() { return i32_at(connection.receive_request(), 8) == 227 && connection.at_end(); }
};

class AfterTheMove : public testing::TestWithParam<Operation> {
 protected:
  static Hb_Rc call() { return GetParam().call(); }
  static std::pair<Hb_Rc, int> outcome() {
    set_hb_errno(untouched_error);
    const Hb_Rc rc = call();
    return {rc, hb_get_errno()};
  }

  Moved_Client client;
};

TEST_P(AfterTheMove, WhatSendsSucceedsAndWhatAwaitsAnAnswerHasNoConnection) {
  if (GetParam().request == 0) {
    const auto before = outcome();
    operation_outputs.clear();
    ASSERT_EQ(Hb_Success, client.move());
    EXPECT_EQ(before, outcome());
  } else {
    ASSERT_EQ(Hb_Success, client.move());
    const bool awaits = !GetParam().answer.empty();
    EXPECT_EQ(awaits ? std::pair(Hb_Failure, 12) : std::pair(Hb_Success, untouched_error), outcome());
    EXPECT_TRUE(!awaits || operation_outputs.untouched());
  }
  EXPECT_TRUE(client.nothing_more_was_sent());
}

INSTANTIATE_TEST_SUITE_P(Control, AfterTheMove, testing::ValuesIn(operations_that_start()),
                         [](const testing::TestParamInfo<Operation>& test) { return std::string(test.param.name); });

class MovedClient : public testing::Test {
 protected:
  void SetUp() override { ASSERT_EQ(Hb_Success, client.move()); }

  Hb_Rc take() {
    std::vector<int> ready = Migrating_Client::readable();
    ready.push_back(-1);
    return hb_get_event_message(ready.data(), nullptr, &out.events, out.name, out.group.get(), &out.sequence);
  }

  Moved_Client client;
  EventOutputs out;
};

TEST_F(MovedClient, IsStarted) {
  EXPECT_EQ(Hb_Success, hb_init());
  EXPECT_TRUE(client.nothing_more_was_sent());
}

TEST_F(MovedClient, SubscribesThroughThePipeAndSendsNothing) {
  while (!Migrating_Client::readable().empty()) ASSERT_EQ(Hb_Success, take());
  Hb_Subscription_Group group = {};
  hb_empty_subscription_group(&group);
  ASSERT_EQ(Hb_Success, hb_add_all_nodes_to_subscription_group(&group));
  char name[] = "nodes";
  EXPECT_EQ(Hb_Success, hb_subscribe(name, &group, 7));
  EXPECT_THAT(Migrating_Client::readable(), ElementsAre(new_group_event_handler_p->getFileDescriptor()));
  EXPECT_EQ(Hb_Success, take());
  EXPECT_EQ("nodes", std::string(out.name));
  EXPECT_THAT(nodes_of(*out.group), ElementsAre(0, 3, 4));
  EXPECT_EQ(Hb_Success, hb_unsubscribe(name));
  EXPECT_TRUE(client.nothing_more_was_sent());
}

TEST_F(MovedClient, AnswersQueriesFromTheConfigurationThatWasTaken) {
  while (!Migrating_Client::readable().empty()) ASSERT_EQ(Hb_Success, take());
  int count = 0;
  EXPECT_EQ(Hb_Success, hb_get_number_of_configured_nodes(&count));
  EXPECT_EQ(3, count);
  EXPECT_EQ(Hb_Success, hb_get_number_of_configured_adapters(&count));
  EXPECT_EQ(6, count);
  Hb_Node_Number node = -1;
  EXPECT_EQ(Hb_Success, hb_get_my_node_number(&node));
  EXPECT_EQ(3, node);
  EXPECT_EQ(Hb_Success, hb_get_node_number_by_adapter_number(4 * 48 + 1, &node));
  EXPECT_EQ(4, node);
}

TEST_F(MovedClient, TakesNothingWhereNothingWaits) {
  while (!Migrating_Client::readable().empty()) ASSERT_EQ(Hb_Success, take());
  int monitor[] = {event_pipe_handler_p->getFileDescriptor(), -1};
  EXPECT_EQ(Hb_Success, hb_get_event_message(monitor, nullptr, &out.events, out.name, out.group.get(), &out.sequence));
  EXPECT_EQ(0, out.events);
  EXPECT_EQ("<EMPTY EVENT>", std::string(out.name));
}

TEST_F(MovedClient, HearsOfDaemonsAndAsksItsOwnForNothing) {
  while (!Migrating_Client::readable().empty()) ASSERT_EQ(Hb_Success, take());
  EXPECT_EQ(Hb_Success, hb_vex_msg_received_from(4));
  EXPECT_EQ(1U, Migrating_Client::readable().size());
  EXPECT_EQ(Hb_Success, hb_vex_delayed_daemon_shutdown());
  EXPECT_TRUE(client.nothing_more_was_sent());
}

TEST_F(MovedClient, StopsWithEverythingClosed) {
  EXPECT_EQ(Hb_Success, hb_terminate());
  EXPECT_EQ(Hb_False, IsVEX);
  EXPECT_EQ(0U, Migrating_Client::handlers());
  EXPECT_THAT(scripted_cluster().open_monitors(), IsEmpty());
  EXPECT_EQ(0, attached_segments());
}

TEST_F(MovedClient, CanBeMovedNoFurther) {
  hb_migrate_to_vex_abort();
  EXPECT_EQ(0U, Migrating_Client::handlers());
  EXPECT_EQ(Hb_Success, Migrating_Client::commit());
  EXPECT_EQ(91, hb_get_errno());
  EXPECT_TRUE(client.nothing_more_was_sent());
}

}  // namespace
}  // namespace hb_test
