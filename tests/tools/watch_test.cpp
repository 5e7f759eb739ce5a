// hbctl watch: what it subscribes to, and how it shows each event.
#include <gmock/gmock.h>

#include <nlohmann/json.hpp>

#include "hbctl_process.h"
#include "played_daemon.h"

namespace hb_test {
namespace {

using nlohmann::json;
using testing::EndsWith;
using testing::HasSubstr;
using testing::MatchesRegex;

// A watch in JSON that has made its subscriptions.
class WatchInJson {
 public:
  explicit WatchInJson(const std::vector<std::string>& more = {"--events", "death,join,new-group"})
      : child_(command(more)) {
    daemon_.start();
    daemon_.expect_subscription("hbctl.nodes");
    daemon_.expect_subscription("hbctl.adapters");
  }
  PlayedDaemon& daemon() { return daemon_; }

  // The next event. The time is checked for its form and taken out.
  json next() {
    json event = json::parse(child_.read_line());
    EXPECT_THAT(event["time"].get<std::string>(),
                MatchesRegex("[0-9]{4}-[0-9]{2}-[0-9]{2}T[0-9]{2}:[0-9]{2}:[0-9]{2}\\.[0-9]{3}Z"));
    event.erase("time");
    return event;
  }

 private:
  static std::vector<std::string> command(const std::vector<std::string>& more) {
    std::vector<std::string> arguments{"watch", "--json"};
    arguments.insert(arguments.end(), more.begin(), more.end());
    return hbctl(arguments);
  }

  PlayedDaemon daemon_;
  ChildProcess child_;
};

// The lines of a watch in text; the heading has been read.
class WatchInText {
 public:
  WatchInText() : child_(hbctl({"watch", "--events", "death,join,new-group"})) {
    daemon_.start();
    daemon_.expect_subscription("hbctl.nodes");
    daemon_.expect_subscription("hbctl.adapters");
    heading_ = child_.read_line();
  }
  PlayedDaemon& daemon() { return daemon_; }
  const std::string& heading() const { return heading_; }

  // The next line without its time.
  std::string next() {
    const std::string line = child_.read_line();
    EXPECT_THAT(line, MatchesRegex("[0-9]{2}:[0-9]{2}:[0-9]{2}\\.[0-9]{3}  .*"));
    return line.substr(14);
  }

 private:
  PlayedDaemon daemon_;
  ChildProcess child_;
  std::string heading_;
};

TEST(HbctlWatchSubscribes, to_every_node_and_adapter_unless_told_otherwise) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"watch"}));
  daemon.start();
  const Bytes nodes = daemon.expect_subscription("hbctl.nodes");
  EXPECT_EQ(subscription_type(nodes), 1);
  EXPECT_EQ(subscription_events(nodes), 0x207);  // with the heartbeat settings
  EXPECT_EQ(subscription_count(nodes), 3);
  EXPECT_EQ(subscription_members(nodes, 1), "\xE0");  // nodes 0, 1, 2
  const Bytes adapters = daemon.expect_subscription("hbctl.adapters");
  EXPECT_EQ(subscription_type(adapters), 3);
  EXPECT_EQ(subscription_events(adapters), 7);
  EXPECT_EQ(subscription_count(adapters), 6);
  EXPECT_EQ(subscription_members(adapters, 1), "\xFC");  // adapters 0 to 5
  const Bytes instance = daemon.expect_subscription("hbctl.instance");
  EXPECT_EQ(subscription_type(instance), 6);
  EXPECT_EQ(subscription_events(instance), 0x100);
}

TEST(HbctlWatchSubscribes, to_the_nodes_that_were_named) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"watch", "--node", "2", "0", "--events", "death"}));
  daemon.start();
  const Bytes nodes = daemon.expect_subscription("hbctl.nodes");
  EXPECT_EQ(subscription_type(nodes), 0);
  EXPECT_EQ(subscription_events(nodes), 1);
  EXPECT_EQ(subscription_count(nodes), 2);
  EXPECT_EQ(subscription_members(nodes, 1), "\xA0");  // nodes 0 and 2
}

TEST(HbctlWatchSubscribes, to_the_adapters_that_were_named_under_a_name_of_ones_own) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"watch", "--adapter", "1,5", "--adapter", "4", "--name", "mine", "--events", "join"}));
  daemon.start();
  const Bytes adapters = daemon.expect_subscription("mine.adapters");
  EXPECT_EQ(subscription_type(adapters), 2);
  EXPECT_EQ(subscription_events(adapters), 2);
  EXPECT_EQ(subscription_members(adapters, 1), "\x4C");  // adapters 1, 4 and 5
}

TEST(HbctlWatchSubscribes, to_each_network_under_a_name_of_its_own) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"watch", "--network", "net1", "0", "--events", "new-group"}));
  daemon.start();
  const Bytes net1 = daemon.expect_subscription("hbctl.network1");
  EXPECT_EQ(subscription_type(net1), 5);
  EXPECT_EQ(subscription_events(net1), 4);
  EXPECT_EQ(subscription_members(net1, 1), "\x54");  // adapters 1, 3, 5
  const Bytes net0 = daemon.expect_subscription("hbctl.network0");
  EXPECT_EQ(subscription_type(net0), 5);
  EXPECT_EQ(subscription_members(net0, 1), "\xA8");  // adapters 0, 2, 4
}

TEST(HbctlWatchSubscribes, to_sites_and_splits_each_with_a_mask_of_its_own) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"watch", "--events", "sites", "split-merge"}));
  daemon.start();
  const Bytes sites = daemon.expect_subscription("hbctl.sites");
  EXPECT_EQ(subscription_type(sites), 8);
  EXPECT_EQ(subscription_events(sites), 0x60);
  const Bytes splits = daemon.expect_subscription("hbctl.splits");
  EXPECT_EQ(subscription_type(splits), 9);
  EXPECT_EQ(subscription_events(splits), 0x3000);
}

TEST(HbctlWatchSubscribes, to_nothing_when_something_is_not_configured) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"watch", "--node", "0", "7", "--network", "net9", "--adapter", "66"}));
  daemon.start();
  const Finished finished = child.finish();
  EXPECT_TRUE(daemon.connection().at_end());
  EXPECT_THAT(finished.errors, testing::StartsWith("hbctl: not configured: node 7, adapter 66, network net9\n"));
  EXPECT_EQ(finished.output, "");
  EXPECT_EQ(finished.status, 1);
}

TEST(HbctlWatchInJson, shows_a_new_group_of_nodes) {
  WatchInJson watch;
  watch.daemon().send(ReplyPacket(7).name("hbctl.nodes").sequence(1).status(0).message(node_event_message({1, 1, 0})));
  const json expected = {
      {"version", 1},         {"type", "event"}, {"sequence", 1},
      {"event", "new-group"}, {"bits", 4},       {"subscription", "hbctl.nodes"},
      {"nodes", {0, 1}},      {"stable", true},  {"watched", {{"up", 2}, {"down", 1}, {"unknown", 0}}}};
  EXPECT_EQ(watch.next(), expected);
}

TEST(HbctlWatchInJson, shows_a_new_group_of_adapters_with_leader_and_incarnation) {
  WatchInJson watch;
  watch.daemon().send(ReplyPacket(4)
                          .name("hbctl.adapters")
                          .sequence(2)
                          .leader(4, 0)
                          .group(0, 9)
                          .status(1)
                          .message(adapter_event_message({{4, 3}})));
  const json expected = {{"version", 1},
                         {"type", "event"},
                         {"sequence", 2},
                         {"event", "new-group"},
                         {"bits", 4},
                         {"subscription", "hbctl.adapters"},
                         {"adapters",
                          {{{"number", 4},
                            {"node", 2},
                            {"network", "net0"},
                            {"address", "10.0.0.5"},
                            {"incarnation", 3},
                            {"removed", false}}}},
                         {"stable", false},
                         {"leader", 4},
                         {"group_incarnation", 9},
                         {"watched", {{"up", 1}, {"down", 5}, {"unknown", 0}}}};
  EXPECT_EQ(watch.next(), expected);
}

TEST(HbctlWatchInJson, shows_a_node_death_with_its_failure_data) {
  WatchInJson watch;
  watch.daemon().send(
      ReplyPacket(5).name("hbctl.nodes").sequence(17).ffdc("a1b2").message(node_event_message({0, 0, 1})));
  const json expected = {{"version", 1},
                         {"type", "event"},
                         {"sequence", 17},
                         {"event", "death"},
                         {"bits", 1},
                         {"subscription", "hbctl.nodes"},
                         {"nodes", {2}},
                         {"failure_data", "a1b2"},
                         {"watched", {{"up", 0}, {"down", 1}, {"unknown", 2}}}};
  EXPECT_EQ(watch.next(), expected);
}

TEST(HbctlWatchInJson, shows_an_adapter_that_died_because_it_was_removed) {
  WatchInJson watch;
  watch.daemon().send_adapters(2, "hbctl.adapters", 18, {{3, 0x08000005}});
  const json event = watch.next();
  EXPECT_EQ(event["event"], "death");
  EXPECT_EQ(event["adapters"][0]["incarnation"], 5);
  EXPECT_EQ(event["adapters"][0]["removed"], true);
}

TEST(HbctlWatchInJson, shows_an_adapter_join_and_counts_who_is_up) {
  WatchInJson watch;
  watch.daemon().send_adapters(4, "hbctl.adapters", 1, {{0, 1}, {1, 1}});
  watch.daemon().send_adapters(3, "hbctl.adapters", 2, {{2, 1}, {3, 1}});
  watch.next();
  const json event = watch.next();
  EXPECT_EQ(event["event"], "join");
  EXPECT_EQ(event["watched"], json({{"up", 4}, {"down", 2}, {"unknown", 0}}));
}

TEST(HbctlWatchInJson, shows_a_failure_data_identifier) {
  WatchInJson watch;
  watch.daemon().send(ReplyPacket(12).sequence(3).ffdc("f00d"));
  const json expected = {{"version", 1},
                         {"type", "event"},
                         {"sequence", 3},
                         {"event", "failure-data"},
                         {"bits", 8},
                         {"subscription", "Hb_FFDC_Group"},
                         {"failure_data", "f00d"}};
  EXPECT_EQ(watch.next(), expected);
}

TEST(HbctlWatchInJson, shows_the_sender_of_a_different_instance) {
  WatchInJson watch;
  watch.daemon().send(ReplyPacket(13)
                          .name("hbctl.instance")
                          .sequence(4)
                          .message(address_bytes("10.9.8.7") + ByteBuilder().u32(77).bytes()));
  const json expected = {{"version", 1},
                         {"type", "event"},
                         {"sequence", 4},
                         {"event", "different-instance"},
                         {"bits", 256},
                         {"subscription", "hbctl.instance"},
                         {"sender", {{"address", "10.9.8.7"}, {"instance", 77}}}};
  EXPECT_EQ(watch.next(), expected);
}

TEST(HbctlWatchInJson, shows_heartbeat_settings_without_the_membership_of_an_earlier_event) {
  WatchInJson watch;
  watch.daemon().send_nodes(7, "hbctl.nodes", 1, {1, 1, 1});
  watch.daemon().send(
      ReplyPacket(15).name("hbctl.nodes").sequence(5).message(ByteBuilder().u32(10).u32(0).u32(1).u32(1234).bytes()));
  watch.next();
  const json expected = {{"version", 1},
                         {"type", "event"},
                         {"sequence", 5},
                         {"event", "heartbeat"},
                         {"bits", 512},
                         {"subscription", "hbctl.nodes"},
                         {"heartbeat", {{"threshold", 10.0}, {"watched", true}, {"daemon_pid", 1234}}}};
  EXPECT_EQ(watch.next(), expected);
}

TEST(HbctlWatchInJson, replaces_bytes_that_are_not_utf_8) {
  WatchInJson watch;
  watch.daemon().send(ReplyPacket(12).sequence(3).ffdc("\xFF"));
  EXPECT_EQ(watch.next()["failure_data"], "\xEF\xBF\xBD");
}

TEST(HbctlWatchInText, has_a_heading) {
  WatchInText watch;
  EXPECT_EQ(watch.heading(), "TIME          SEQUENCE  SUBJECT  EVENT               DETAILS");
}

TEST(HbctlWatchInText, shows_new_groups_in_ranges) {
  WatchInText watch;
  watch.daemon().send_nodes(7, "hbctl.nodes", 1, {1, 1, 1});
  watch.daemon().send(ReplyPacket(4)
                          .name("hbctl.adapters")
                          .sequence(2)
                          .leader(0, 0)
                          .group(0, 9)
                          .message(adapter_event_message({{0, 1}, {1, 1}, {2, 1}, {5, 1}})));
  EXPECT_EQ(watch.next(), "       1  node     new-group           0-2; stable; 3 of 3 up");
  EXPECT_EQ(watch.next(), "       2  adapter  new-group           0-2, 5; leader 0, incarnation 9, stable; 4 of 6 up");
}

TEST(HbctlWatchInText, says_where_an_adapter_is_that_died) {
  WatchInText watch;
  watch.daemon().send_adapters(2, "hbctl.adapters", 18, {{3, 5}, {4, 0x08000001}});
  EXPECT_EQ(watch.next(),
            "      18  adapter  death               3 (node 1, net1, 10.0.0.4), 4 (node 2, net0, 10.0.0.5) removed "
            "from the configuration");
}

TEST(HbctlWatchInText, counts_the_rest_when_many_adapters_die) {
  WatchInText watch;
  watch.daemon().send_adapters(2, "hbctl.adapters", 18, {{0, 1}, {1, 1}, {2, 1}, {3, 1}, {4, 1}, {5, 1}});
  EXPECT_THAT(watch.next(), EndsWith("3 (node 1, net1, 10.0.0.4) and 2 more; 0 of 6 up"));
}

TEST(HbctlWatchInText, shows_node_death_and_join) {
  WatchInText watch;
  watch.daemon().send_nodes(7, "hbctl.nodes", 1, {1, 1, 1});
  watch.daemon().send(
      ReplyPacket(5).name("hbctl.nodes").sequence(2).ffdc("a1b2").message(node_event_message({0, 1, 0})));
  watch.daemon().send_nodes(6, "hbctl.nodes", 3, {0, 1, 0});
  watch.next();
  EXPECT_EQ(watch.next(), "       2  node     death               1; failure data a1b2; 2 of 3 up");
  EXPECT_EQ(watch.next(), "       3  node     join                1; 3 of 3 up");
}

TEST(HbctlWatchInText, shows_the_events_that_are_about_no_member) {
  WatchInText watch;
  watch.daemon().send(ReplyPacket(12).sequence(3).ffdc("f00d"));
  watch.daemon().send(ReplyPacket(13)
                          .name("hbctl.instance")
                          .sequence(4)
                          .message(address_bytes("10.9.8.7") + ByteBuilder().u32(77).bytes()));
  watch.daemon().send(
      ReplyPacket(15).name("hbctl.nodes").sequence(5).message(ByteBuilder().u32(10).u32(0).u32(1).u32(1234).bytes()));
  EXPECT_EQ(watch.next(), "       3  -        failure-data        failure data f00d");
  EXPECT_EQ(watch.next(), "       4  -        different-instance  10.9.8.7 runs instance 77");
  EXPECT_EQ(watch.next(),
            "       5  -        heartbeat           client heartbeats: one every 10 s at least, watched, daemon "
            "process 1234");
}

TEST(HbctlWatchInText, is_written_while_events_come_and_not_at_the_end) {
  WatchInText watch;
  for (uint32_t sequence = 1; sequence <= 3; ++sequence) {
    watch.daemon().send_nodes(6, "hbctl.nodes", sequence, {1, 0, 0});
    EXPECT_THAT(watch.next(), HasSubstr("join"));
  }
}

}  // namespace
}  // namespace hb_test
