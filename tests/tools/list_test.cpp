// The commands that list: what they ask the daemon, and what they print.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <unistd.h>

#include <nlohmann/json.hpp>

#include "hbctl_process.h"
#include "played_daemon.h"

namespace hb_test {
namespace {

using nlohmann::json;

Finished run_told(PlayedDaemon& daemon, const std::vector<std::string>& arguments) {
  ChildProcess child(hbctl(arguments));
  daemon.start();
  daemon.tell_who_is_up();
  return child.finish();
}

Finished run_untold(PlayedDaemon& daemon, const std::vector<std::string>& arguments) {
  ChildProcess child(hbctl(arguments));
  daemon.start();
  return child.finish();
}

TEST(HbctlStatus, shows_the_socket_the_local_node_and_the_counts) {
  PlayedDaemon daemon;
  const Finished finished = run_told(daemon, {"status"});
  EXPECT_EQ(finished.output, "Socket      " + daemon.daemon().path() +
                                 "\n"
                                 "Connected   yes\n"
                                 "Local node  0\n"
                                 "Nodes       3 configured, 2 up, 1 down\n"
                                 "Adapters    6 configured, 4 up, 2 down\n"
                                 "Networks    2 configured\n"
                                 "Sites       0 configured\n");
  EXPECT_EQ(finished.errors, "");
  EXPECT_EQ(finished.status, 0);
}

TEST(HbctlStatus, has_the_same_in_json) {
  PlayedDaemon daemon;
  const Finished finished = run_told(daemon, {"status", "--json"});
  const json expected = {{"version", 1},
                         {"type", "status"},
                         {"socket", daemon.daemon().path()},
                         {"connected", true},
                         {"local_node", 0},
                         {"nodes", {{"configured", 3}, {"up", 2}, {"down", 1}}},
                         {"adapters", {{"configured", 6}, {"up", 4}, {"down", 2}}},
                         {"networks", 2},
                         {"sites", 0}};
  EXPECT_EQ(json::parse(finished.output), expected);
  EXPECT_EQ(finished.status, 0);
}

TEST(HbctlStatus, does_not_ask_who_is_up_when_it_may_not_wait) {
  PlayedDaemon daemon;
  const Finished finished = run_untold(daemon, {"status", "--wait", "0"});
  EXPECT_THAT(finished.output, testing::HasSubstr("Nodes       3 configured\n"));
  EXPECT_TRUE(daemon.connection().at_end());
}

TEST(HbctlNodes, asks_for_the_groups_of_every_node_and_every_adapter) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"nodes"}));
  daemon.start();
  const Bytes nodes = daemon.expect_subscription("hbctl.probe.nodes");
  const Bytes adapters = daemon.expect_subscription("hbctl.probe.adapters");
  EXPECT_EQ(subscription_type(nodes), 1);
  EXPECT_EQ(subscription_events(nodes), 7);
  EXPECT_EQ(subscription_type(adapters), 3);
  EXPECT_EQ(subscription_events(adapters), 7);
}

TEST(HbctlNodes, lists_number_adapters_state_and_reason) {
  PlayedDaemon daemon;
  const Finished finished = run_told(daemon, {"nodes"});
  EXPECT_EQ(finished.output,
            "NODE  LOCAL  ADAPTERS  STATE  REASON\n"
            "   0  yes           2  up     up\n"
            "   1  no            2  up     up\n"
            "   2  no            2  down   not in the node group\n");
  EXPECT_EQ(finished.status, 0);
}

TEST(HbctlNodes, has_state_reason_and_membership_in_json) {
  PlayedDaemon daemon;
  const json nodes = json::parse(run_told(daemon, {"nodes", "--json"}).output);
  EXPECT_EQ(nodes["version"], 1);
  EXPECT_EQ(nodes["type"], "nodes");
  ASSERT_EQ(nodes["nodes"].size(), 3U);
  EXPECT_EQ(
      nodes["nodes"][0],
      json({{"number", 0}, {"local", true}, {"adapters", 2}, {"state", "up"}, {"reason", "up"}, {"member", true}}));
  EXPECT_EQ(nodes["nodes"][2], json({{"number", 2},
                                     {"local", false},
                                     {"adapters", 2},
                                     {"state", "down"},
                                     {"reason", nullptr},
                                     {"member", false}}));
}

TEST(HbctlNodes, takes_a_death_that_comes_with_the_group_into_account) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"nodes"}));
  daemon.start();
  daemon.expect_subscription("hbctl.probe.nodes");
  daemon.expect_subscription("hbctl.probe.adapters");
  daemon.send_nodes(7, "hbctl.probe.nodes", 1, {1, 1, 1});
  daemon.send_nodes(5, "hbctl.probe.nodes", 2, {0, 1, 0});
  daemon.send_adapters(4, "hbctl.probe.adapters", 3, {{0, 1}});
  EXPECT_THAT(child.finish().output, testing::HasSubstr("   1  no            2  down   down\n"));
}

TEST(HbctlNodes, are_unknown_when_the_daemon_does_not_tell_in_time) {
  PlayedDaemon daemon;
  const Finished finished = run_untold(daemon, {"nodes", "--wait", "0.02"});
  EXPECT_EQ(finished.output,
            "NODE  LOCAL  ADAPTERS  STATE    REASON\n"
            "   0  yes           2  unknown  -\n"
            "   1  no            2  unknown  -\n"
            "   2  no            2  unknown  -\n");
  EXPECT_EQ(finished.status, 0);
}

TEST(HbctlAdapters, lists_number_node_offset_network_type_address_and_state) {
  PlayedDaemon daemon;
  const Finished finished = run_told(daemon, {"adapters"});
  EXPECT_EQ(finished.output,
            "ADAPTER  NODE  OFFSET  NETWORK  TYPE   ADDRESS   STATE\n"
            "      0     0       0  net0     ether  10.0.0.1  up\n"
            "      1     0       1  net1     ether  10.0.0.2  up\n"
            "      2     1       0  net0     ether  10.0.0.3  up\n"
            "      3     1       1  net1     ether  10.0.0.4  up\n"
            "      4     2       0  net0     ether  10.0.0.5  down\n"
            "      5     2       1  net1     ether  10.0.0.6  down\n");
  EXPECT_EQ(finished.status, 0);
}

TEST(HbctlAdapters, have_their_network_in_json) {
  PlayedDaemon daemon;
  const json adapters = json::parse(run_told(daemon, {"adapters", "--json"}).output);
  ASSERT_EQ(adapters["adapters"].size(), 6U);
  EXPECT_EQ(adapters["adapters"][3], json({{"number", 3},
                                           {"node", 1},
                                           {"offset", 1},
                                           {"network", {{"number", 1}, {"name", "net1"}}},
                                           {"adapter_type", "ether"},
                                           {"address", "10.0.0.4"},
                                           {"state", "up"}}));
}

TEST(HbctlAdapters, are_selected_by_node) {
  PlayedDaemon daemon;
  const Finished finished = run_untold(daemon, {"adapters", "--wait", "0", "--node", "0", "2"});
  EXPECT_EQ(finished.output,
            "ADAPTER  NODE  OFFSET  NETWORK  TYPE   ADDRESS   STATE\n"
            "      0     0       0  net0     ether  10.0.0.1  unknown\n"
            "      1     0       1  net1     ether  10.0.0.2  unknown\n"
            "      4     2       0  net0     ether  10.0.0.5  unknown\n"
            "      5     2       1  net1     ether  10.0.0.6  unknown\n");
}

TEST(HbctlAdapters, are_selected_by_network_name_and_number_and_node_together) {
  PlayedDaemon daemon;
  const Finished finished = run_untold(daemon, {"adapters", "--wait", "0", "--network", "net1", "--node", "1"});
  EXPECT_EQ(finished.output,
            "ADAPTER  NODE  OFFSET  NETWORK  TYPE   ADDRESS   STATE\n"
            "      3     1       1  net1     ether  10.0.0.4  unknown\n");
  const Finished by_number = run_untold(daemon, {"adapters", "--wait", "0", "--network", "1", "--node", "1"});
  EXPECT_EQ(by_number.output, finished.output);
}

TEST(HbctlAdapters, of_what_is_not_configured_fail_and_name_it) {
  PlayedDaemon daemon;
  const Finished finished = run_untold(daemon, {"adapters", "--network", "net9", "--node", "7"});
  EXPECT_EQ(finished.output, "");
  EXPECT_THAT(finished.errors, testing::StartsWith("hbctl: not configured: node 7, network net9\n"));
  EXPECT_EQ(finished.status, 1);
}

TEST(HbctlAdapters, that_belong_to_no_node_and_no_network_are_listed_with_dashes) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"adapters", "--wait", "0"}));
  daemon.start(small_cluster().adapter(77, "fe80::1", 5));
  EXPECT_THAT(child.finish().output,
              testing::HasSubstr("\n     77     -       -  -        -      -         unknown\n"));
}

TEST(HbctlAdapters, do_not_bring_escape_sequences_of_others_to_the_terminal) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"adapters", "--wait", "0"}));
  daemon.start(ConfigurationMessage()
                   .max_nodes(1)
                   .adapters_per_node(1)
                   .adapter(0, "10.0.0.1", 0, "\033[31mred")
                   .network("n\n0"));
  const Finished finished = child.finish();
  EXPECT_THAT(finished.output, testing::HasSubstr("n?0      ?[31mred  10.0.0.1"));
  EXPECT_THAT(finished.output, testing::Not(testing::HasSubstr("\033")));
}

TEST(HbctlNetworks, lists_name_type_adapters_and_how_many_are_up) {
  PlayedDaemon daemon;
  const Finished finished = run_told(daemon, {"networks"});
  EXPECT_EQ(finished.output,
            "NETWORK  NAME  TYPE   ADAPTERS  UP\n"
            "      0  net0  ether         3   2\n"
            "      1  net1  ether         3   2\n");
  EXPECT_EQ(finished.status, 0);
}

TEST(HbctlNetworks, has_null_for_what_is_not_known_in_json) {
  PlayedDaemon daemon;
  const json networks = json::parse(run_untold(daemon, {"networks", "--json", "--wait", "0"}).output);
  const json expected = {
      {"version", 1},
      {"type", "networks"},
      {"networks",
       {{{"number", 0}, {"name", "net0"}, {"network_type", "ether"}, {"adapters", 3}, {"up", nullptr}},
        {{"number", 1}, {"name", "net1"}, {"network_type", "ether"}, {"adapters", 3}, {"up", nullptr}}}}};
  EXPECT_EQ(networks, expected);
}

TEST(HbctlSites, lists_none_as_no_source_of_sites_exists) {
  PlayedDaemon daemon;
  const Finished finished = run_untold(daemon, {"sites"});
  EXPECT_EQ(finished.output, "SITE\n");
  EXPECT_EQ(finished.status, 0);
}

TEST(HbctlSites, has_an_empty_list_in_json) {
  PlayedDaemon daemon;
  const json sites = json::parse(run_untold(daemon, {"sites", "--json"}).output);
  EXPECT_EQ(sites, json({{"version", 1}, {"type", "sites"}, {"sites", json::array()}}));
}

TEST(HbctlOutput, that_cannot_be_written_is_a_failure) {
  PlayedDaemon daemon;
  const int full = open("/dev/full", O_WRONLY | O_CLOEXEC);
  ChildProcess child(hbctl({"sites"}), {.output = full});
  daemon.start();
  const Finished finished = child.finish();
  close(full);
  EXPECT_EQ(finished.errors, "hbctl: cannot write standard output: No space left on device\n");
  EXPECT_EQ(finished.status, 1);
}

TEST(HbctlOutput, that_nobody_reads_ends_the_command_quietly) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"sites"}));
  child.close_output();
  daemon.start();
  const Finished finished = child.finish();
  EXPECT_EQ(finished.errors, "");
  EXPECT_EQ(finished.status, 0);
}

}  // namespace
}  // namespace hb_test
