// hbctl heartbeat: signs of life, and what the daemon expects of them.
#include <gmock/gmock.h>

#include <algorithm>
#include <csignal>

#include "steered.h"

namespace hb_test {
namespace {

using nlohmann::json;
using testing::HasSubstr;

class HbctlHeartbeat : public Steered {
 protected:
  void expect_beat(uint8_t sequence) {
    const Bytes request = daemon().expect(222);
    EXPECT_EQ(request, request_packet(child().pid(), 222, 4, octets({sequence, 0, 0, 0})));
  }

  // 2.25 s, watched, process 4711.
  void tell_settings() {
    answer(ReplyPacket(15)
               .name("hbctl.heartbeat.nodes")
               .message(ByteBuilder().i32(2).i32(250000).u32(1).i32(4711).bytes()));
  }
};

TEST_F(HbctlHeartbeat, is_one_with_the_number_1_unless_told_otherwise) {
  expect_request({"heartbeat"}, 222, octets({1, 0, 0, 0}));
  const Finished finished = end();
  EXPECT_EQ(finished.output, "send heartbeat 1: sent\n");
  EXPECT_EQ(finished.errors, "");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlHeartbeat, has_a_number_of_ones_own) {
  expect_request({"heartbeat", "--sequence", "4294967295", "--json"}, 222, octets({255, 255, 255, 255}));
  const Finished finished = end();
  EXPECT_EQ(std::count(finished.output.begin(), finished.output.end(), '\n'), 1);
  const json expected = {
      {"version", 1}, {"type", "request"}, {"request", "heartbeat"}, {"outcome", "sent"}, {"sequence", 4294967295U}};
  EXPECT_EQ(parse(finished), expected);
}

TEST_F(HbctlHeartbeat, goes_on_with_the_next_numbers_as_often_as_is_said) {
  begin({"heartbeat", "--sequence", "7", "--every", "0.001", "--count", "3"}, 222);
  expect_beat(8);
  expect_beat(9);
  EXPECT_EQ(end().output, "send heartbeat 7: sent\nsend heartbeat 8: sent\nsend heartbeat 9: sent\n");
}

TEST_F(HbctlHeartbeat, goes_on_until_it_is_interrupted) {
  begin({"heartbeat", "--every", "1000"}, 222);
  EXPECT_EQ(child().read_line(), "send heartbeat 1: sent");
  child().send_signal(SIGINT);
  const Finished finished = end();
  EXPECT_EQ(finished.errors, "");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlHeartbeat, ends_while_it_waits_when_the_daemon_goes) {
  begin({"heartbeat", "--every", "1000", "--json"}, 222);
  EXPECT_EQ(json::parse(child().read_line())["outcome"], "sent");
  daemon().connection().close();
  const json error = json::parse(child().read_line())["error"];
  EXPECT_EQ(error["name"], "HB_EDAEMONGONE");
  EXPECT_EQ(error["exit_status"], 4);
  const Finished finished = child().finish();
  EXPECT_THAT(finished.errors, HasSubstr("HB_EDAEMONGONE (16)"));
  EXPECT_EQ(finished.status, 4);
}

// As much as no socket holds: the daemon could not send it if it stayed there.
TEST_F(HbctlHeartbeat, takes_what_the_daemon_sends_in_between) {
  begin({"heartbeat", "--every", "1000"}, 222);
  answer(ReplyPacket(10));  // no event
  for (int i = 0; i < 1000; ++i) answer(ReplyPacket(9).message(small_cluster().bytes()));
  EXPECT_EQ(child().read_line(), "send heartbeat 1: sent");
  child().send_signal(SIGTERM);
  EXPECT_EQ(child().finish().status, 0);
}

TEST_F(HbctlHeartbeat, shows_what_the_daemon_expects_when_it_is_asked_to) {
  const Bytes subscription = begin({"heartbeat", "--settings"}, 209);
  EXPECT_EQ(subscription_name(subscription), "hbctl.heartbeat.nodes");
  EXPECT_EQ(subscription_events(subscription), 0x200);
  expect_beat(1);
  tell_settings();
  daemon().expect_withdrawal("hbctl.heartbeat.nodes");
  const Finished finished = end();
  EXPECT_EQ(finished.output,
            "send heartbeat 1: sent\n"
            "client heartbeats: one every 2.25 s at least, watched, daemon process 4711\n");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlHeartbeat, has_what_the_daemon_expects_on_a_line_of_json) {
  begin({"heartbeat", "--settings", "--json"}, 209);
  expect_beat(1);
  child().read_line();
  answer(ReplyPacket(9).message(small_cluster().bytes()));
  tell_settings();
  const json expected = {
      {"version", 1}, {"type", "heartbeat-settings"}, {"threshold", 2.25}, {"watched", true}, {"daemon_pid", 4711}};
  EXPECT_EQ(json::parse(child().read_line()), expected);
}

TEST_F(HbctlHeartbeat, is_in_doubt_when_the_daemon_does_not_tell) {
  begin({"heartbeat", "--settings", "--wait", "0.01"}, 209);
  expect_beat(1);
  daemon().expect_withdrawal("hbctl.heartbeat.nodes");
  const Finished finished = end();
  EXPECT_EQ(finished.output, "send heartbeat 1: sent\n");
  EXPECT_THAT(finished.errors, HasSubstr("the daemon did not tell its settings for heartbeats within 0.01 s\n"));
  EXPECT_EQ(finished.status, 7);
}

}  // namespace
}  // namespace hb_test
