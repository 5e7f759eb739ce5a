// hbctl watch while the configuration changes.
#include <gmock/gmock.h>

#include <nlohmann/json.hpp>

#include "hbctl_process.h"
#include "played_daemon.h"

namespace hb_test {
namespace {

using nlohmann::json;
using testing::HasSubstr;

Bytes update(const ConfigurationMessage& configuration) {
  return ReplyPacket(9).sequence(30).message(configuration.bytes()).bytes();
}

// The small cluster without its last adapter, number 5.
ConfigurationMessage without_adapter_5() {
  ConfigurationMessage configuration;
  configuration.local_node(0).max_nodes(3).adapters_per_node(2);
  for (uint32_t number = 0; number < 5; ++number)
    configuration.adapter(number, "10.0.0." + std::to_string(number + 1), static_cast<int16_t>(number % 2));
  return configuration.network("net0").network("net1");
}

// Nodes 0 and 1 with one adapter each on the network in slot 0; slot 1 is unused.
ConfigurationMessage shrunken() {
  return ConfigurationMessage()
      .local_node(0)
      .max_nodes(3)
      .adapters_per_node(2)
      .adapter(0, "10.0.0.1", 0)
      .adapter(2, "10.0.0.3", 0)
      .network("net0");
}

TEST(HbctlWatchConfiguration, tells_what_came_and_went_in_text) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"watch", "--events", "death"}));
  daemon.start(without_adapter_5());
  daemon.expect_subscription("hbctl.nodes");
  daemon.expect_subscription("hbctl.adapters");
  child.read_line();
  daemon.connection().send_frame(update(small_cluster()));
  EXPECT_THAT(child.read_line(),
              testing::EndsWith("30  -        configuration       3 nodes, 6 adapters, 2 networks; adapters added 5"));
  daemon.expect_subscription("hbctl.adapters");
  daemon.connection().send_frame(update(shrunken()));
  EXPECT_THAT(child.read_line(),
              testing::EndsWith(
                  "configuration       2 nodes, 2 adapters, 1 network; nodes removed 2; adapters removed 1, 3-5"));
}

TEST(HbctlWatchConfiguration, tells_what_came_and_went_in_json) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"watch", "--json", "--events", "death"}));
  daemon.start();
  daemon.expect_subscription("hbctl.nodes");
  daemon.expect_subscription("hbctl.adapters");
  daemon.connection().send_frame(update(shrunken()));
  json event = json::parse(child.read_line());
  event.erase("time");
  const json expected = {{"version", 1},
                         {"type", "event"},
                         {"sequence", 30},
                         {"event", "configuration"},
                         {"bits", 128},
                         {"subscription", "Hb_Config_Group"},
                         {"configured", {{"nodes", 2}, {"adapters", 2}, {"networks", 1}, {"sites", 0}}},
                         {"added", {{"nodes", json::array()}, {"adapters", json::array()}}},
                         {"removed", {{"nodes", {2}}, {"adapters", {1, 3, 4, 5}}}},
                         {"addresses_changed", json::array()}};
  EXPECT_EQ(event, expected);
}

TEST(HbctlWatchConfiguration, subscribes_again_to_all_when_all_has_changed) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"watch", "--events", "death"}));
  daemon.start(without_adapter_5());
  daemon.expect_subscription("hbctl.nodes");
  daemon.expect_subscription("hbctl.adapters");
  daemon.connection().send_frame(update(small_cluster()));
  const Bytes adapters = daemon.expect_subscription("hbctl.adapters");
  EXPECT_EQ(subscription_type(adapters), 3);
  EXPECT_EQ(subscription_count(adapters), 6);
  EXPECT_EQ(subscription_members(adapters, 1), "\xFC");  // adapters 0 to 5
}

TEST(HbctlWatchConfiguration, shows_later_events_with_the_new_names) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"watch", "--adapter", "0", "--events", "death"}));
  daemon.start();
  daemon.expect_subscription("hbctl.adapters");
  child.read_line();
  daemon.connection().send_frame(update(ConfigurationMessage()
                                            .max_nodes(3)
                                            .adapters_per_node(2)
                                            .adapter(0, "192.168.7.7", 1)
                                            .network("net0")
                                            .network("renamed")));
  child.read_line();
  daemon.send_adapters(2, "hbctl.adapters", 31, {{0, 1}});
  EXPECT_THAT(child.read_line(), HasSubstr("0 (node 0, renamed, 192.168.7.7); 0 of 1 up"));
}

TEST(HbctlWatchConfiguration, leaves_out_what_is_no_longer_configured_until_it_comes_back) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"watch", "--network", "net0,net1", "--events", "death"}));
  daemon.start();
  daemon.expect_subscription("hbctl.network0");
  daemon.expect_subscription("hbctl.network1");
  daemon.connection().send_frame(update(shrunken()));
  daemon.expect_withdrawal("hbctl.network1");
  const Bytes net0 = daemon.expect_subscription("hbctl.network0");
  EXPECT_EQ(subscription_members(net0, 1), "\xA0");  // adapters 0 and 2
  EXPECT_EQ(child.read_error_line(),
            "hbctl: network net1 is not configured any more; it is followed again when it comes back");
  daemon.connection().send_frame(update(small_cluster()));
  EXPECT_EQ(subscription_members(daemon.expect_subscription("hbctl.network0"), 1), "\xA8");
  EXPECT_EQ(subscription_members(daemon.expect_subscription("hbctl.network1"), 1), "\x54");
}

TEST(HbctlWatchConfiguration, does_not_subscribe_again_to_what_has_not_changed) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"watch", "--node", "0", "--adapter", "5", "--events", "death", "--count", "1"}));
  daemon.start();
  daemon.expect_subscription("hbctl.nodes");
  daemon.expect_subscription("hbctl.adapters");
  daemon.connection().send_frame(update(without_adapter_5()));
  daemon.expect_withdrawal("hbctl.adapters");  // adapter 5 has gone
  daemon.expect_withdrawal("hbctl.nodes");     // the count is reached
  EXPECT_TRUE(daemon.connection().at_end());
  EXPECT_EQ(child.finish().status, 0);
}

TEST(HbctlWatchConfiguration, that_cannot_be_used_is_reported_and_the_watch_goes_on) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"watch", "--node", "0", "--events", "death"}));
  daemon.start();
  daemon.expect_subscription("hbctl.nodes");
  child.read_line();
  daemon.connection().send_frame(update(small_cluster().claim_adapters(-1)));
  EXPECT_THAT(child.read_error_line(), testing::StartsWith("hbctl: cannot take an event: HB_EBADREPLY (10), "));
  daemon.send_nodes(5, "hbctl.nodes", 31, {1, 0, 0});
  EXPECT_THAT(child.read_line(), HasSubstr("death               0; 0 of 1 up"));
}

}  // namespace
}  // namespace hb_test
