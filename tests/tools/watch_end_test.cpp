// How hbctl watch ends.
#include <gmock/gmock.h>
#include <linux/sockios.h>
#include <sys/ioctl.h>

#include <csignal>
#include <memory>
#include <nlohmann/json.hpp>
#include <thread>

#include "hbctl_process.h"
#include "played_daemon.h"

namespace hb_test {
namespace {

using nlohmann::json;
using testing::HasSubstr;

// Bytes that were sent and not yet taken.
int unread_bytes(const DaemonConnection& connection) {
  int count = 0;
  EXPECT_EQ(ioctl(connection.descriptor(), SIOCOUTQ, &count), 0);
  return count;
}

// A watch of node 0 that has subscribed and written its heading.
class HbctlWatchEnd : public testing::Test {
 protected:
  ChildProcess& start(const std::vector<std::string>& more = {}) {
    std::vector<std::string> arguments{"watch", "--node", "0", "--events", "death"};
    arguments.insert(arguments.end(), more.begin(), more.end());
    child_ = std::make_unique<ChildProcess>(hbctl(arguments));
    daemon_.start();
    daemon_.expect_subscription("hbctl.nodes");
    return *child_;
  }

  static Bytes death(uint32_t sequence) {
    return framed(ReplyPacket(5).name("hbctl.nodes").sequence(sequence).message(node_event_message({1, 0, 0})).bytes());
  }
  void send_death(uint32_t sequence) { daemon_.connection().send_raw(death(sequence)); }

  void expect_clean_end(ChildProcess& child) {
    daemon_.expect_withdrawal("hbctl.nodes");
    EXPECT_TRUE(daemon_.connection().at_end());
    const Finished finished = child.finish();
    EXPECT_EQ(finished.errors, "");
    EXPECT_EQ(finished.status, 0);
  }

  PlayedDaemon daemon_;
  std::unique_ptr<ChildProcess> child_;
};

TEST_F(HbctlWatchEnd, comes_after_so_many_events) {
  ChildProcess& child = start({"--count", "2"});
  child.read_line();
  // In one piece: behind the second one the watch may be gone.
  daemon_.connection().send_raw(death(1) + death(2) + death(3));
  EXPECT_THAT(child.read_line(), HasSubstr("       1  node     death"));
  EXPECT_THAT(child.read_line(), HasSubstr("       2  node     death"));
  daemon_.expect_withdrawal("hbctl.nodes");
  const Finished finished = child.finish();
  EXPECT_EQ(finished.output, "");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlWatchEnd, comes_after_so_long) {
  ChildProcess& child = start({"--duration", "0.02"});
  expect_clean_end(child);
}

TEST_F(HbctlWatchEnd, comes_with_an_interrupt) {
  ChildProcess& child = start();
  child.read_line();
  child.send_signal(SIGINT);
  expect_clean_end(child);
}

TEST_F(HbctlWatchEnd, comes_with_a_termination) {
  ChildProcess& child = start();
  child.read_line();
  child.send_signal(SIGTERM);
  expect_clean_end(child);
}

TEST_F(HbctlWatchEnd, comes_with_a_second_interrupt_while_half_a_packet_keeps_it_waiting) {
  ChildProcess& child = start();
  child.read_line();
  daemon_.connection().send_raw(ByteBuilder().u32(120).zeros(1).bytes());
  while (unread_bytes(daemon_.connection()) != 0) std::this_thread::yield();
  child.send_signal(SIGINT);
  while (child.catches(SIGINT)) std::this_thread::yield();
  child.send_signal(SIGINT);
  EXPECT_EQ(child.finish().status, 128 + SIGINT);
}

TEST_F(HbctlWatchEnd, comes_when_the_daemon_goes_and_tells_so) {
  ChildProcess& child = start();
  daemon_.connection().close();
  const Finished finished = child.finish();
  const std::string path = daemon_.daemon().path();
  EXPECT_EQ(finished.errors, "hbctl: the daemon on " + path +
                                 " is gone: cannot take an event: HB_EDAEMONGONE (16), the daemon closed the "
                                 "connection\nstart it again with: hbd --socket " +
                                 path + "\nthen watch again\n");
  EXPECT_EQ(finished.status, 4);
}

TEST_F(HbctlWatchEnd, comes_when_the_daemon_goes_and_is_the_last_line_of_json) {
  ChildProcess& child = start({"--json"});
  send_death(1);
  daemon_.connection().close();
  EXPECT_EQ(json::parse(child.read_line())["event"], "death");
  const json error = json::parse(child.read_line());
  EXPECT_EQ(error["type"], "error");
  EXPECT_EQ(error["error"]["name"], "HB_EDAEMONGONE");
  EXPECT_EQ(error["error"]["exit_status"], 4);
  EXPECT_EQ(child.finish().status, 4);
}

TEST_F(HbctlWatchEnd, comes_when_the_daemon_goes_within_a_packet) {
  ChildProcess& child = start();
  daemon_.connection().send_raw(ByteBuilder().u32(120).zeros(8).bytes());
  daemon_.connection().close();
  EXPECT_EQ(child.finish().status, 4);
}

TEST_F(HbctlWatchEnd, does_not_come_with_a_packet_that_is_no_event) {
  ChildProcess& child = start({"--count", "1"});
  child.read_line();
  daemon_.send(ReplyPacket(10));
  EXPECT_THAT(child.read_error_line(),
              testing::MatchesRegex("hbctl: cannot take an event: HB_EBADREPLY \\(10\\), .*; watching goes on"));
  send_death(1);
  EXPECT_THAT(child.read_line(), HasSubstr("death"));
  EXPECT_EQ(child.finish().status, 0);
}

TEST_F(HbctlWatchEnd, comes_when_the_stream_cannot_be_read_any_more) {
  ChildProcess& child = start();
  daemon_.connection().send_raw(ByteBuilder().i32(-1).bytes());
  const Finished finished = child.finish();
  EXPECT_THAT(finished.errors, HasSubstr("HB_ECOMM (12)"));
  EXPECT_EQ(finished.status, 1);
}

TEST_F(HbctlWatchEnd, comes_quietly_when_nobody_reads_its_output_any_more) {
  ChildProcess& child = start();
  child.read_line();
  child.close_output();
  expect_clean_end(child);
}

}  // namespace
}  // namespace hb_test
