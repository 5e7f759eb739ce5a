// A client of a live daemon that moves to the cluster services while it runs, or tries to.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <poll.h>

#include <csignal>
#include <cstdlib>
#include <functional>
#include <optional>
#include <string>

#include "../vex/scripted_life.h"
#include "VEX_EVMONHandler.h"
#include "daemon_process.h"
#include "support/process_state.h"
#include "support/running_client.h"
#include "support/temporary_directory.h"

namespace hb_test {
namespace {

using testing::IsEmpty;

// What Scripted_Life(4) starts as.
std::string cluster_of_four() {
  std::string text =
      "[cluster]\nname = \"four\"\nlocal_node = 1\nmax_nodes = 8\nadapters_per_node = 2\n"
      "[[network]]\nname = \"net0\"\n[[network]]\nname = \"net1\"\n";
  for (int node = 1; node <= 4; ++node) {
    const std::string number = std::to_string(node);
    text += "[[node]]\nnumber = " + number +
            "\nadapters = [\n"
            "  { offset = 0, network = \"net0\", address = \"10.0.0." +
            number +
            "\", type = \"en0\" },\n"
            "  { offset = 1, network = \"net1\", address = \"10.1.0." +
            number + "\", type = \"en1\" },\n]\n";
  }
  return text;
}

class MoveToVex : public testing::Test {
 protected:
  MoveToVex()
      : daemon_(directory_,
                {"--socket", directory_.path("socket"), "--scenario", directory_.write("s.toml", cluster_of_four())}) {
    std::signal(SIGPIPE, SIG_IGN);
    reset_platform();
    EXPECT_TRUE(daemon_.wait_until_ready()) << daemon_.log();
    setenv("HB_SERVER_SOCKET", directory_.path("socket").c_str(), 1);
    unsetenv("HA_DOMAIN_NAME");
    unsetenv("HA_SYSPAR_NAME");
  }

  ~MoveToVex() override {
    hb_migrate_to_vex_abort();
    hb_terminate();
    IsVEX = Hb_False;
    EXPECT_EQ(0U, Scripted_Cluster::wrong_releases());
  }

  // A client that follows four nodes by the daemon.
  void start_with_daemon() {
    ASSERT_EQ(Hb_Success, caller.subscribe());
    caller.read_configuration();
    ASSERT_EQ(Hb_Success, caller.follow());
    while (caller.nodes_up.size() < 4 || caller.adapters_up.size() < 8) {
      caller.wait_and_take_one();
    }
  }

  void expect_true_picture() const {
    EXPECT_EQ(life->configured_nodes(), caller.configured_nodes);
    EXPECT_EQ(life->nodes_up(), caller.nodes_up);
    EXPECT_EQ(life->configured_adapters(), caller.configured_adapters);
    EXPECT_EQ(life->adapters_up(), caller.adapters_up);
    EXPECT_EQ(0, caller.unknown_adapters);
  }

  // The daemon answers a subscription, and it is the daemon's configuration that is asked.
  void expect_daemon_in_use() {
    EXPECT_EQ(Hb_False, IsVEX);
    EXPECT_EQ(0, EVMONHandler::getNumbersOfFileDescriptors());
    caller.nodes_up.clear();
    caller.adapters_up.clear();
    ASSERT_NO_FATAL_FAILURE(start_with_daemon());
    EXPECT_EQ(4U, caller.configured_nodes.size());
  }

  void move() {
    ASSERT_EQ(Hb_Success, hb_migrate_to_vex_prep()) << hb_get_errno();
    ASSERT_EQ(Hb_Success, hb_migrate_to_vex_commit());
    EXPECT_EQ(Hb_True, IsVEX);
    ASSERT_EQ(Hb_Success, caller.follow());
    caller.taken.clear();
    EXPECT_GT(64U, caller.take_all(64));
  }

  // The trial table of each preparation, and the interface lists that rebuilds replace, stay by definition.
  LeakAllowed prescribed;
  TemporaryDirectory directory_;
  DaemonProcess daemon_;
  std::optional<Scripted_Life> life;
  Caller caller;
};

TEST_F(MoveToVex, TheDaemonEndsWithTheLastClientThatMoves) {
  start_with_daemon();
  life.emplace(4);
  move();
  EXPECT_EQ(0, daemon_.wait_for_end()) << daemon_.log();
  life->node_dies(2, ZU_VEX_NODE_DOWN_REASON_NONE);
  caller.take_all();
  expect_true_picture();
}

TEST_F(MoveToVex, AClientThatMovesGoesOnFromWhereItWas) {
  start_with_daemon();
  life.emplace(4);
  move();
  expect_true_picture();
  for (const uint32_t node : {2U, 3U}) {
    life->node_dies(node, ZU_VEX_NODE_DOWN_REASON_NONE);
    caller.take_all();
    expect_true_picture();
  }
  life->node_returns(2);
  caller.take_all();
  expect_true_picture();
}

TEST_F(MoveToVex, WhatIsDifferentIsToldByEvents) {
  start_with_daemon();
  life.emplace(5);
  scripted_cluster().nodes[3].status = ZU_VEX_NODE_STATUS_DOWN;
  scripted_cluster().interfaces[6].status = scripted_cluster().interfaces[7].status = ZU_VEX_INTF_STATUS_DOWN;
  scripted_cluster().interfaces[1].status = ZU_VEX_INTF_STATUS_DOWN;
  move();
  expect_true_picture();
  std::vector<Hb_Events> kinds;
  for (const Taken_Event& event : caller.taken) {
    if (event.events != HB_EVENT_NONE) {
      kinds.push_back(event.events);
    }
  }
  EXPECT_THAT(kinds, testing::ElementsAre(HB_EVENT_DEATH, HB_EVENT_DEATH, HB_EVENT_CONFIGURATION, HB_EVENT_JOIN,
                                          HB_EVENT_JOIN));
}

// The answers to the subscriptions are in the socket, and go with it.
TEST_F(MoveToVex, WhatTheDaemonSaidAndNobodyReadIsLostAndANewSubscriptionTellsIt) {
  ASSERT_EQ(Hb_Success, caller.subscribe());
  caller.read_configuration();
  int* descriptors = nullptr;
  int count = 0;
  ASSERT_EQ(Hb_Success, hb_get_file_descriptor_array(&descriptors, &count));
  ASSERT_EQ(1, count);
  pollfd socket = {descriptors[0], POLLIN, 0};
  EXPECT_EQ(1, poll(&socket, 1, -1));
  hb_free_file_descriptor_array(descriptors);
  life.emplace(4);
  move();
  for (const Taken_Event& event : caller.taken) {
    EXPECT_EQ(Hb_Success, event.result) << event.error;
    EXPECT_NE(HB_EVENT_NEW_GROUP, event.events);
  }
  ASSERT_EQ(Hb_Success, caller.subscribe());
  caller.take_all();
  expect_true_picture();
}

TEST_F(MoveToVex, ThePreparationLeavesTheDaemonInUse) {
  start_with_daemon();
  life.emplace(5);
  ASSERT_EQ(Hb_Success, hb_migrate_to_vex_prep());
  EXPECT_EQ(Hb_False, IsVEX);
  EXPECT_EQ(10, EVMONHandler::getNumbersOfFileDescriptors());
  caller.read_configuration();
  EXPECT_EQ(4U, caller.configured_nodes.size());
  const int open = open_descriptors();
  EXPECT_EQ(Hb_Success, hb_migrate_to_vex_abort());
  // Eight monitors and both ends of two pipes.
  EXPECT_EQ(open - 12, open_descriptors());
  expect_daemon_in_use();
}

TEST_F(MoveToVex, AnAbortedMoveCanBeMadeLater) {
  start_with_daemon();
  life.emplace(4);
  ASSERT_EQ(Hb_Success, hb_migrate_to_vex_prep());
  hb_migrate_to_vex_abort();
  expect_daemon_in_use();
  move();
  expect_true_picture();
}

TEST_F(MoveToVex, WhatKeepsAClientFromMovingLeavesTheDaemonInUse) {
  start_with_daemon();
  life.emplace(4);
  const struct {
    const char* what;
    std::function<void(Scripted_Cluster&)> spoil;
    int error;
  } obstacles[] = {
      {"no monitors and no services", [](Scripted_Cluster& cluster) { cluster = {}; }, HB_EVEXTBL_BUILD},
      {"no services", [](Scripted_Cluster& cluster) { cluster.has_services = false; }, HB_EVEXTBL_BUILD},
      {"a monitor fails",
       [](Scripted_Cluster& cluster) {
         cluster.open_results = {platform_as_usual, {5, 13}};
       },
       HB_EMIGRATE_PREP},
      {"this node has another number", [](Scripted_Cluster& cluster) { cluster.local_node = 2; }, HB_EINVAL},
      {"a node is missing", [](Scripted_Cluster& cluster) { cluster.nodes.pop_back(); }, HB_EMIGRATE_TBL},
  };
  for (const auto& obstacle : obstacles) {
    SCOPED_TRACE(obstacle.what);
    scripted_cluster().reset();
    life.emplace(4);
    obstacle.spoil(scripted_cluster());
    set_hb_errno(HB_EINVAL);
    EXPECT_EQ(Hb_Failure, hb_migrate_to_vex_prep());
    EXPECT_EQ(obstacle.error, hb_get_errno());
    EXPECT_EQ(Hb_Success, hb_migrate_to_vex_abort());
    ASSERT_NO_FATAL_FAILURE(expect_daemon_in_use());
  }
  scripted_cluster().reset();
  life.emplace(4);
  move();
  expect_true_picture();
}

}  // namespace
}  // namespace hb_test
