// hbctl with the real daemon.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstdlib>
#include <memory>
#include <nlohmann/json.hpp>

#include "hbctl_process.h"
#include "support/temporary_directory.h"

namespace hb_test {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;

constexpr const char* kScenario = R"(
[cluster]
name = "test"
local_node = 0
max_nodes = 3
adapters_per_node = 2

[[network]]
name = "net0"
type = "ether"

[[network]]
name = "net1"
type = "ether"

[[node]]
number = 0
adapters = [
  { offset = 0, network = "net0", address = "10.0.0.1", type = "en0" },
  { offset = 1, network = "net1", address = "10.0.1.1", type = "en1" },
]

[[node]]
number = 1
adapters = [
  { offset = 0, network = "net0", address = "10.0.0.2", type = "en0" },
  { offset = 1, network = "net1", address = "10.0.1.2", type = "en1" },
]

[[event]]
at = "1s"
kind = "adapter-death"
node = 1
offset = 1

[[event]]
at = "2s"
kind = "adapter-join"
node = 1
offset = 1

[[event]]
at = "3s"
kind = "node-death"
node = 1
ffdc_id = "crash"

[[event]]
at = "4s"
kind = "node-join"
node = 1

[[event]]
at = "5s"
kind = "configuration-update"
add = [{ node = 2, offset = 0, network = "net0", address = "10.0.0.3", type = "en0" }]

[[event]]
at = "6s"
kind = "different-instance"
address = "10.0.0.99"
instance = 7

[[event]]
at = "7s"
kind = "heartbeat"
threshold = "3s"
enabled = true
)";

class HbctlWithDaemon : public testing::Test {
 protected:
  HbctlWithDaemon() {
    for (const char* variable : {"HA_DOMAIN_NAME", "HA_SYSPAR_NAME"}) unsetenv(variable);
    setenv("HB_SERVER_SOCKET", directory_.path("socket").c_str(), 1);
    start_daemon();
  }
  ~HbctlWithDaemon() override { stop_daemon(); }

  // The timeline waits for the three subscriptions of a watch and goes on as it reads.
  void start_daemon() {
    int ready[2] = {-1, -1};
    ASSERT_EQ(pipe(ready), 0);
    ASSERT_EQ(fcntl(ready[0], F_SETFD, FD_CLOEXEC), 0);
    daemon_ = std::make_unique<ChildProcess>(std::vector<std::string>{
        HBD_PATH, "--scenario", directory_.write("scenario.toml", kScenario), "--as-fast-as-read",
        "--start-after-subscriptions", "3", "--ready-fd", std::to_string(ready[1])});
    close(ready[1]);
    pollfd entry{ready[0], POLLIN, 0};
    ASSERT_EQ(poll(&entry, 1, 30000), 1);
    char byte = 0;
    ASSERT_EQ(read(ready[0], &byte, 1), 1) << daemon_->finish().errors;
    close(ready[0]);
  }

  void stop_daemon() {
    if (!daemon_) return;
    daemon_->send_signal(SIGTERM);
    daemon_->finish();
    daemon_.reset();
  }

  static Finished run(const std::vector<std::string>& arguments) { return ChildProcess(hbctl(arguments)).finish(); }

  TemporaryDirectory directory_;
  std::unique_ptr<ChildProcess> daemon_;
};

// The events of a watch, up to the heartbeat settings that the timeline ends with.
std::vector<json> watched_events(ChildProcess& watch) {
  std::vector<json> events;
  do {
    events.push_back(json::parse(watch.read_line()));
  } while (events.back()["event"] != "heartbeat");
  return events;
}

// What is told of members, in order, without the groups: "death [3]".
std::vector<std::string> changes_of(const std::vector<json>& events, const char* subject) {
  std::vector<std::string> changes;
  for (const json& event : events) {
    if (!event.contains(subject) || event["event"] == "new-group") continue;
    json numbers = json::array();
    for (const json& member : event[subject]) numbers.push_back(member.is_object() ? member["number"] : member);
    changes.push_back(event["event"].get<std::string>() + " " + numbers.dump());
  }
  return changes;
}

json first_of(const std::vector<json>& events, const std::string& name) {
  for (const json& event : events)
    if (event["event"] == name) return event;
  return nullptr;
}

TEST_F(HbctlWithDaemon, shows_the_status) {
  const json status = json::parse(run({"status", "--json"}).output);
  EXPECT_EQ(status["connected"], true);
  EXPECT_EQ(status["nodes"], json({{"configured", 2}, {"up", 2}, {"down", 0}}));
  EXPECT_EQ(status["adapters"], json({{"configured", 4}, {"up", 4}, {"down", 0}}));
}

TEST_F(HbctlWithDaemon, lists_nodes_adapters_and_networks) {
  EXPECT_EQ(run({"nodes"}).output,
            "NODE  LOCAL  ADAPTERS  STATE  REASON\n"
            "   0  yes           2  up     up\n"
            "   1  no            2  up     up\n");
  EXPECT_EQ(run({"adapters"}).output,
            "ADAPTER  NODE  OFFSET  NETWORK  TYPE  ADDRESS   STATE\n"
            "      0     0       0  net0     en0   10.0.0.1  up\n"
            "      1     0       1  net1     en1   10.0.1.1  up\n"
            "      2     1       0  net0     en0   10.0.0.2  up\n"
            "      3     1       1  net1     en1   10.0.1.2  up\n");
  EXPECT_EQ(run({"networks"}).output,
            "NETWORK  NAME  TYPE   ADAPTERS  UP\n"
            "      0  net0  ether         2   2\n"
            "      1  net1  ether         2   2\n");
}

TEST_F(HbctlWithDaemon, follows_deaths_joins_and_what_else_happens) {
  ChildProcess watch(hbctl({"watch", "--json"}));
  const std::vector<json> events = watched_events(watch);
  EXPECT_THAT(changes_of(events, "adapters"),
              ElementsAre("death [3]", "join [3]", "death [2,3]", "join [2,3]", "join [4]"));
  EXPECT_THAT(changes_of(events, "nodes"), ElementsAre("death [1]", "join [1]", "join [2]"));
  EXPECT_EQ(first_of(events, "different-instance")["sender"], json({{"address", "10.0.0.99"}, {"instance", 7}}));
  EXPECT_EQ(first_of(events, "configuration")["added"], json({{"nodes", {2}}, {"adapters", {4}}}));
  EXPECT_EQ(events.front()["event"], "new-group");
  const auto is_node_death = [](const json& event) { return event["event"] == "death" && event.contains("nodes"); };
  const auto node_death = std::find_if(events.begin(), events.end(), is_node_death);
  ASSERT_NE(node_death, events.end());
  EXPECT_EQ((*node_death)["failure_data"], "crash");
}

TEST_F(HbctlWithDaemon, counts_who_is_up_after_each_event) {
  ChildProcess watch(hbctl({"watch", "--json"}));
  const std::vector<json> events = watched_events(watch);
  json adapters;
  json nodes;
  for (const json& event : events) {
    if (event.contains("adapters")) adapters = event["watched"];
    if (event.contains("nodes")) nodes = event["watched"];
  }
  EXPECT_EQ(adapters, json({{"up", 5}, {"down", 0}, {"unknown", 0}}));
  EXPECT_EQ(nodes, json({{"up", 3}, {"down", 0}, {"unknown", 0}}));
}

// What a watch of the adapter shows next, without the groups.
json next_change(ChildProcess& watch) {
  json event;
  do {
    event = json::parse(watch.read_line());
  } while (event["event"] == "new-group");
  return event;
}

TEST_F(HbctlWithDaemon, steers_what_a_watch_beside_it_sees) {
  ChildProcess watch(hbctl({"watch", "--json", "--adapter", "1", "--events", "death", "join", "new-group"}));
  ASSERT_EQ(json::parse(watch.read_line())["event"], "new-group");  // it has subscribed
  EXPECT_EQ(run({"adapter", "1", "ifdown", "--yes"}).status, 0);
  EXPECT_EQ(next_change(watch)["event"], "death");
  EXPECT_EQ(run({"adapter", "1", "state"}).output, "adapter 1: interface-down\n");
  EXPECT_EQ(run({"adapter", "1", "ifup"}).status, 0);
  EXPECT_EQ(next_change(watch)["event"], "join");
  EXPECT_EQ(run({"adapter", "1", "configure", "10.0.1.9"}).status, 6);
  EXPECT_EQ(run({"adapter", "1", "disable", "--yes"}).status, 0);
  EXPECT_EQ(run({"adapter", "1", "configure", "10.0.1.9"}).status, 0);
  EXPECT_EQ(next_change(watch)["addresses_changed"], json({1}));
  const json again = next_change(watch);
  EXPECT_EQ(again["event"], "join");
  EXPECT_EQ(again["adapters"][0]["address"], "10.0.1.9");
}

TEST_F(HbctlWithDaemon, reads_what_it_publishes_and_answers) {
  for (const char* option : {"--ip", "--from-daemon"})
    EXPECT_EQ(json::parse(run({"route", "1", "--json", option}).output)["hops"], json({"10.0.0.2"})) << option;
  EXPECT_EQ(run({"route", "2"}).status, 1);
  const json keys = json::parse(run({"security", "--json"}).output);
  EXPECT_EQ(keys["current"]["key"], json({{"type", 1}, {"key_version", 1}, {"length", 32}}));
  EXPECT_EQ(keys["previous"]["key"], nullptr);
  const Finished heartbeat = run({"heartbeat", "--settings", "--json"});
  EXPECT_THAT(heartbeat.output, HasSubstr("\"threshold\":5.0,\"watched\":true"));
  EXPECT_EQ(heartbeat.status, 0);
}

TEST_F(HbctlWithDaemon, ends_with_the_daemon_and_finds_none_afterwards) {
  ChildProcess watch(hbctl({"watch", "--node", "0", "--events", "new-group"}));
  watch.read_line();
  EXPECT_THAT(watch.read_line(), HasSubstr("new-group"));
  stop_daemon();
  const Finished finished = watch.finish();
  EXPECT_THAT(finished.errors, HasSubstr("HB_EDAEMONGONE (16)"));
  EXPECT_EQ(finished.status, 4);
  EXPECT_EQ(run({"status"}).status, 3);
}

}  // namespace
}  // namespace hb_test
