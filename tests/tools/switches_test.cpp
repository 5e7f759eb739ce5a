// hbctl stale and hbctl monitors: what is switched on and off.
#include <gmock/gmock.h>

#include "steered.h"

namespace hb_test {
namespace {

using nlohmann::json;
using testing::HasSubstr;

class HbctlStale : public Steered {};
class HbctlMonitors : public Steered {};

TEST_F(HbctlStale, is_dropped_or_not) {
  expect_request({"stale", "on"}, 219, Bytes());
  EXPECT_EQ(end().output, "have stale events dropped on this connection: sent\n");
  expect_request({"stale", "off"}, 220, Bytes());
  const Finished finished = end();
  EXPECT_EQ(finished.output, "have stale events delivered on this connection: sent\n");
  EXPECT_EQ(finished.errors, "");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlStale, has_the_switch_in_json) {
  begin({"stale", "off", "--json"}, 220);
  const json expected = {{"version", 1}, {"type", "request"}, {"request", "stale"}, {"outcome", "sent"}, {"on", false}};
  EXPECT_EQ(parse(end()), expected);
}

TEST_F(HbctlStale, says_in_its_help_that_it_concerns_its_own_connection_alone) {
  const Finished finished = ChildProcess(hbctl({"stale", "--help"})).finish();
  EXPECT_THAT(finished.output, HasSubstr("the connection of this command alone"));
  EXPECT_THAT(finished.output, HasSubstr("hbctl watch --discard-stale"));
}

TEST_F(HbctlStale, is_dropped_for_a_watch_that_asks_so_before_it_subscribes) {
  const Bytes request = begin({"watch", "--discard-stale", "--node", "0", "--events", "death", "--count", "1"}, 219);
  EXPECT_EQ(request, request_packet(child().pid(), 219, 0, Bytes()));
  daemon().expect_subscription("hbctl.nodes");
  daemon().send_nodes(5, "hbctl.nodes", 3, {1, 0, 0});
  daemon().expect_withdrawal("hbctl.nodes");
  EXPECT_EQ(end().status, 0);
}

TEST_F(HbctlMonitors, of_an_interface_go_under_manual_control_and_off_it) {
  expect_request({"monitors", "on", "en0"}, 225, "en0");
  EXPECT_EQ(end().output, "put the monitor of interface en0 under manual control: sent\n");
  expect_request({"monitors", "off", "en0"}, 226, "en0");
  const Finished finished = end();
  EXPECT_EQ(finished.output, "take the monitor of interface en0 off manual control: sent\n");
  EXPECT_EQ(finished.errors, "");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlMonitors, of_all_interfaces_go_without_a_name) {
  expect_request({"monitors", "on"}, 225, Bytes());
  EXPECT_EQ(end().output, "put the monitors of all interfaces under manual control: sent\n");
}

TEST_F(HbctlMonitors, have_the_switch_and_the_name_in_json) {
  begin({"monitors", "on", "en0", "--json"}, 225);
  const json named = {{"version", 1},      {"type", "request"}, {"request", "monitors"},
                      {"outcome", "sent"}, {"on", true},        {"interface", "en0"}};
  EXPECT_EQ(parse(end()), named);
  begin({"monitors", "off", "--json"}, 226);
  EXPECT_EQ(parse(end())["interface"], nullptr);
}

TEST_F(HbctlMonitors, of_a_name_that_is_too_long_are_refused) {
  const Finished finished = run_without_request({"monitors", "on", std::string(16461, 'n')});
  EXPECT_THAT(finished.errors, HasSubstr(": HB_EINVAL (4), "));
  EXPECT_EQ(finished.status, 1);
}

}  // namespace
}  // namespace hb_test
