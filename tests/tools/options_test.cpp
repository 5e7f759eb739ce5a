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

TEST(HbctlOptions, for_help_and_version_leave_nothing_to_do) {
  EXPECT_EQ(parse({"--help"}).status, 0);
  EXPECT_EQ(parse({"watch", "--help"}).status, 0);
  EXPECT_EQ(parse({"--version"}).status, 0);
}

}  // namespace
}  // namespace hbctl
