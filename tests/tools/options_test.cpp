#include "options.h"

#include <gmock/gmock.h>

namespace hbctl {
namespace {

using testing::ElementsAre;

struct Parsed {
  std::optional<int> status;
  Options options;
};

Parsed parse(std::vector<const char*> arguments) {
  arguments.insert(arguments.begin(), "hbctl");
  Parsed parsed;
  parsed.status = parse_options(static_cast<int>(arguments.size()), arguments.data(), parsed.options);
  return parsed;
}

TEST(HbctlOptions, name_the_command) {
  for (const char* command : {"status", "nodes", "adapters", "networks", "sites", "watch"}) {
    const Parsed parsed = parse({command});
    EXPECT_EQ(parsed.status, std::nullopt);
    EXPECT_EQ(parsed.options.command, command);
    EXPECT_FALSE(parsed.options.json);
  }
}

TEST(HbctlOptions, stand_before_or_after_the_command) {
  EXPECT_EQ(parse({"--socket", "/tmp/hb", "nodes"}).options.socket, "/tmp/hb");
  EXPECT_EQ(parse({"nodes", "--socket=/tmp/hb"}).options.socket, "/tmp/hb");
  EXPECT_EQ(parse({"nodes", "--color", "never"}).options.colour, "never");
}

TEST(HbctlOptions, have_defaults) {
  const Options options = parse({"watch"}).options;
  EXPECT_EQ(options.socket, "");
  EXPECT_EQ(options.colour, "auto");
  EXPECT_EQ(options.wait, 1.0);
  EXPECT_EQ(options.events, 0x307);  // death, join, new group, different instance, heartbeat
  EXPECT_EQ(options.name_prefix, "hbctl");
  EXPECT_EQ(options.count, std::nullopt);
  EXPECT_EQ(options.duration, std::nullopt);
  EXPECT_TRUE(options.selection.everything());
}

TEST(HbctlOptions, take_several_values_with_spaces_with_commas_and_again) {
  const Options options =
      parse({"watch", "--node", "0", "1,2", "--node", "5", "--adapter", "98351", "--network", "net0,3", "--json"})
          .options;
  EXPECT_THAT(options.selection.nodes, ElementsAre(0, 1, 2, 5));
  EXPECT_THAT(options.selection.adapters, ElementsAre(98351U));
  EXPECT_THAT(options.selection.networks, ElementsAre("net0", "3"));
  EXPECT_TRUE(options.json);
}

TEST(HbctlOptions, add_up_the_words_of_events) {
  EXPECT_EQ(parse({"watch", "--events", "death,join", "heartbeat"}).options.events, 0x203);
}

TEST(HbctlOptions, limit_a_watch) {
  const Options options = parse({"watch", "--count", "3", "--duration", "1.5"}).options;
  EXPECT_EQ(options.count, 3U);
  EXPECT_EQ(options.duration, 1.5);
  EXPECT_EQ(as_milliseconds(1.5), std::chrono::milliseconds(1500));
}

TEST(HbctlOptions, accept_the_limits_of_their_numbers) {
  EXPECT_THAT(parse({"watch", "--node", "2048"}).options.selection.nodes, ElementsAre(2048));
  EXPECT_EQ(parse({"nodes", "--wait", "0"}).options.wait, 0.0);
  EXPECT_EQ(parse({"watch", "--name", "123456789012345678901"}).status, std::nullopt);
}

TEST(HbctlOptions, refuse_what_cannot_be_meant) {
  const std::vector<std::vector<const char*>> mistakes = {
      {},
      {"nodes", "sites"},
      {"watch", "--node", "2049"},
      {"watch", "--node", "-1"},
      {"watch", "--node", "one"},
      {"watch", "--adapter", "98352"},
      {"watch", "--count", "0"},
      {"watch", "--duration", "-1"},
      {"watch", "--duration", "nan"},
      {"watch", "--events", "configuration"},
      {"watch", "--name", ""},
      {"watch", "--name", "1234567890123456789012"},
      {"nodes", "--node", "1"},
      {"sites", "--wait", "1"},
      {"--color", "red", "nodes"},
  };
  for (const auto& mistake : mistakes) EXPECT_EQ(parse(mistake).status, 2) << testing::PrintToString(mistake);
}

TEST(HbctlOptions, of_an_adapter_are_its_number_the_action_and_its_value) {
  const Options options = parse({"adapter", "98351", "configure", "10.0.0.9", "--yes"}).options;
  EXPECT_EQ(options.command, "adapter");
  EXPECT_EQ(options.adapter, 98351U);
  EXPECT_EQ(options.action, "configure");
  EXPECT_EQ(options.value, "10.0.0.9");
  EXPECT_TRUE(options.yes);
  EXPECT_FALSE(parse({"adapter", "0", "enable"}).options.yes);
}

TEST(HbctlOptions, of_an_adapter_know_every_action) {
  for (const char* action : {"enable", "disable", "ifdown", "ifup", "unconfigure", "state", "may-be-down", "is-down"})
    EXPECT_EQ(parse({"adapter", "1", action}).options.action, action);
  EXPECT_EQ(parse({"adapter", "1", "swap", "255.255.255.255"}).status, std::nullopt);
  EXPECT_EQ(parse({"adapter", "1", "grace", "0"}).status, std::nullopt);
  EXPECT_EQ(parse({"adapter", "1", "grace", "2147483647"}).status, std::nullopt);
}

TEST(HbctlOptions, of_a_node_and_of_a_route) {
  const Options node = parse({"node", "2048", "is-down"}).options;
  EXPECT_EQ(node.node, 2048);
  EXPECT_EQ(node.action, "is-down");
  EXPECT_TRUE(parse({"route", "1", "--from-daemon"}).options.from_daemon);
  EXPECT_TRUE(parse({"route", "1", "--ip"}).options.ip);
  EXPECT_FALSE(parse({"route", "1"}).options.ip);
}

TEST(HbctlOptions, of_a_message) {
  const Options options = parse({"send", "--node", "1,2", "--node", "5", "--port", "65535", "--", "-hello"}).options;
  EXPECT_THAT(options.selection.nodes, ElementsAre(1, 2, 5));
  EXPECT_EQ(options.port, 65535);
  EXPECT_EQ(options.text, "-hello");
  EXPECT_EQ(parse({"send", "--node", "1", "--port", "7", "-"}).options.text, "-");
}

TEST(HbctlOptions, of_heartbeats) {
  const Options options = parse({"heartbeat", "--every", "0.5", "--count", "3", "--sequence", "0"}).options;
  EXPECT_EQ(options.every, 0.5);
  EXPECT_EQ(options.count, 3U);
  EXPECT_EQ(options.sequence, 0U);
  EXPECT_FALSE(options.settings);
  EXPECT_EQ(parse({"heartbeat"}).options.sequence, 1U);
  EXPECT_EQ(parse({"heartbeat"}).options.every, std::nullopt);
  EXPECT_EQ(parse({"heartbeat", "--settings", "--wait", "2"}).options.wait, 2.0);
}

TEST(HbctlOptions, that_switch) {
  EXPECT_TRUE(parse({"stale", "on"}).options.on);
  EXPECT_FALSE(parse({"stale", "off"}).options.on);
  const Options monitors = parse({"monitors", "on", "en0"}).options;
  EXPECT_TRUE(monitors.on);
  EXPECT_EQ(monitors.interface, "en0");
  EXPECT_EQ(parse({"monitors", "off"}).options.interface, "");
  EXPECT_TRUE(parse({"watch", "--discard-stale"}).options.discard_stale);
  EXPECT_FALSE(parse({"watch"}).options.discard_stale);
  EXPECT_EQ(parse({"simulate-death", "5"}).options.seconds, 5);
  EXPECT_TRUE(parse({"security", "--reveal"}).options.reveal);
  EXPECT_FALSE(parse({"security"}).options.reveal);
}

TEST(HbctlOptions, that_steer_refuse_what_cannot_be_meant) {
  const std::vector<std::vector<const char*>> mistakes = {
      {"adapter"},
      {"adapter", "1"},
      {"adapter", "1", "break"},
      {"adapter", "98352", "enable"},
      {"adapter", "-1", "enable"},
      {"adapter", "one", "enable"},
      {"adapter", "1", "enable", "5"},
      {"adapter", "1", "configure"},
      {"adapter", "1", "configure", "10.0.0"},
      {"adapter", "1", "configure", "2001:db8::1"},
      {"adapter", "1", "swap"},
      {"adapter", "1", "grace"},
      {"adapter", "1", "grace", "-1"},
      {"adapter", "1", "grace", "1.5"},
      {"adapter", "1", "grace", "2147483648"},
      {"adapter", "1", "grace", "5", "6"},
      {"node", "1"},
      {"node", "2049", "is-down"},
      {"node", "1", "enable"},
      {"route"},
      {"route", "-1"},
      {"route", "2049"},
      {"route", "1", "--ip", "--from-daemon"},
      {"security", "1"},
      {"send", "x", "--port", "7"},
      {"send", "x", "--node", "1"},
      {"send", "x", "--node", "1", "--port", "65536"},
      {"send", "--node", "1", "x", "--port", "7"},
      {"heartbeat", "--count", "3"},
      {"heartbeat", "--every", "0"},
      {"heartbeat", "--every", "1", "--count", "0"},
      {"heartbeat", "--sequence", "4294967296"},
      {"heartbeat", "--wait", "1"},
      {"simulate-death"},
      {"simulate-death", "-1"},
      {"stale"},
      {"stale", "maybe"},
      {"monitors", "en0"},
      {"stale", "on", "en0"},
      {"watch", "--yes"},
  };
  for (const auto& mistake : mistakes) EXPECT_EQ(parse(mistake).status, 2) << testing::PrintToString(mistake);
}

TEST(HbctlOptions, for_help_and_version_leave_nothing_to_do) {
  EXPECT_EQ(parse({"--help"}).status, 0);
  EXPECT_EQ(parse({"watch", "--help"}).status, 0);
  EXPECT_EQ(parse({"--version"}).status, 0);
}

}  // namespace
}  // namespace hbctl
