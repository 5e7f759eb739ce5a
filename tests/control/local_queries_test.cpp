// What is answered without asking the daemon: heartbeat settings and periods of simulated deaths.
#include <gtest/gtest.h>

#include <cstring>

#include "hb_communication/event_reception.h"
#include "queries/event_outputs.h"
#include "steering.h"

namespace hb_test {
namespace {

class HeartbeatSettings : public Steering {
 protected:
  HeartbeatSettings() { std::memset(&settings, 0xB7, sizeof settings); }
  ~HeartbeatSettings() override { client_hb_info = {}; }  // a stop keeps them

  // Has the daemon tell them in an event.
  Hb_Rc told(int32_t seconds, int32_t microseconds, int32_t enabled, int32_t process) {
    connection.send_frame(ReplyPacket(15)
                              .message(ByteBuilder().i32(seconds).i32(microseconds).i32(enabled).i32(process).bytes())
                              .bytes());
    int descriptors[2] = {client_socket->socket(), -1};
    EventOutputs out;
    return hb_get_event_message(descriptors, nullptr, &out.events, out.name, out.group.get(), &out.sequence);
  }

  Bytes bytes() const { return Bytes(reinterpret_cast<const char*>(&settings), sizeof settings); }

  Hb_client_hb_info_t settings;
};

TEST_F(HeartbeatSettings, AreZeroBeforeTheFirstEvent) {
  EXPECT_TRUE(succeeds([this] { return hb_get_client_hb_info(&settings); }));
  EXPECT_EQ(Bytes(16, '\0'), bytes());
  EXPECT_TRUE(nothing_sent());
}

TEST_F(HeartbeatSettings, AreThoseOfTheLastEvent) {
  ASSERT_EQ(Hb_Success, told(1, 2, 1, 3));
  ASSERT_EQ(Hb_Success, told(5, 250000, 1, 4711));
  EXPECT_TRUE(succeeds([this] { return hb_get_client_hb_info(&settings); }));
  EXPECT_EQ(5, settings.client_hb_thresh.tv_sec);
  EXPECT_EQ(250000, settings.client_hb_thresh.tv_usec);
  EXPECT_EQ(Hb_True, settings.client_hb_is_enabled);
  EXPECT_EQ(4711, settings.client_hb_daemon_pid);
  const Bytes first = bytes();
  std::memset(&settings, 0xB7, sizeof settings);
  EXPECT_TRUE(succeeds([this] { return hb_get_client_hb_info(&settings); }));
  EXPECT_EQ(first, bytes());  // and stay
  EXPECT_TRUE(nothing_sent());
}

TEST_F(HeartbeatSettings, AreCopiedAsTheyWereSent) {
  ASSERT_EQ(Hb_Success, told(-1, -2, 0x01020304, -3));
  EXPECT_TRUE(succeeds([this] { return hb_get_client_hb_info(&settings); }));
  EXPECT_EQ(octets({0xFF, 0xFF, 0xFF, 0xFF, 0xFE, 0xFF, 0xFF, 0xFF, 4, 3, 2, 1, 0xFD, 0xFF, 0xFF, 0xFF}), bytes());
}

TEST_F(HeartbeatSettings, NeedAPlace) {
  EXPECT_TRUE(fails_with(4, [] { return hb_get_client_hb_info(nullptr); }));
}

TEST(HeartbeatSettingsWithoutAClient, AreZeroAndStartNone) {
  reset_platform();
  FakeDaemon daemon;
  Hb_client_hb_info_t settings;
  std::memset(&settings, 0xB7, sizeof settings);
  EXPECT_TRUE(succeeds([&] { return hb_get_client_hb_info(&settings); }));
  EXPECT_EQ(Bytes(16, '\0'), Bytes(reinterpret_cast<const char*>(&settings), sizeof settings));
  EXPECT_EQ(Hb_False, client_initialized);
  EXPECT_FALSE(daemon.has_client());
}

class DeathPeriods : public Steering {
 protected:
  DeathPeriods() : Steering(sparse_cluster().remote_period(3, 500000).local_period(0x123456789A, 250000)) {}

  timeval remote = {77, 78};
  timeval local = {79, 80};
};

TEST_F(DeathPeriods, AreThoseOfTheConfiguration) {
  EXPECT_TRUE(succeeds([this] { return hb_get_local_rem_sim_node_down_period(&remote, &local); }));
  EXPECT_EQ(3, remote.tv_sec);
  EXPECT_EQ(500000, remote.tv_usec);
  EXPECT_EQ(0x123456789A, local.tv_sec);
  EXPECT_EQ(250000, local.tv_usec);
  EXPECT_TRUE(nothing_sent());
}

TEST_F(DeathPeriods, MayBeAskedForOneByOne) {
  EXPECT_TRUE(succeeds([this] { return hb_get_local_rem_sim_node_down_period(&remote, nullptr); }));
  EXPECT_EQ(3, remote.tv_sec);
  EXPECT_EQ(500000, remote.tv_usec);
  remote = {77, 78};
  EXPECT_TRUE(succeeds([this] { return hb_get_local_rem_sim_node_down_period(nullptr, &local); }));
  EXPECT_EQ(0x123456789A, local.tv_sec);
  EXPECT_EQ(250000, local.tv_usec);
  EXPECT_EQ(77, remote.tv_sec);
  EXPECT_TRUE(succeeds([] { return hb_get_local_rem_sim_node_down_period(nullptr, nullptr); }));
}

TEST_F(DeathPeriods, FollowAnUpdateOfTheConfiguration) {
  connection.send_frame(
      ReplyPacket(9).message(sparse_cluster().remote_period(9, 1).local_period(8, 2).bytes()).bytes());
  int descriptors[2] = {client_socket->socket(), -1};
  EventOutputs out;
  ASSERT_EQ(Hb_Success,
            hb_get_event_message(descriptors, nullptr, &out.events, out.name, out.group.get(), &out.sequence));
  EXPECT_TRUE(succeeds([this] { return hb_get_local_rem_sim_node_down_period(&remote, &local); }));
  EXPECT_EQ(9, remote.tv_sec);
  EXPECT_EQ(1, remote.tv_usec);
  EXPECT_EQ(8, local.tv_sec);
  EXPECT_EQ(2, local.tv_usec);
}

}  // namespace
}  // namespace hb_test
