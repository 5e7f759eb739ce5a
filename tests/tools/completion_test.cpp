// Completion in bash.
#include <gmock/gmock.h>

#include <cstdlib>
#include <filesystem>
#include <sstream>

#include "hbctl_process.h"
#include "played_daemon.h"

namespace hb_test {
namespace {

using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Not;
using testing::UnorderedElementsAre;

// Completes the last of these words, as bash calls it; the first one is the command.
std::vector<std::string> completion_of(const std::vector<std::string>& words) {
  std::vector<std::string> command{
      "/bin/bash",
      "--norc",
      "-c",
      "source \"$1\"; shift; COMP_WORDS=(\"$@\"); COMP_CWORD=$(($# - 1)); _hbctl; printf '%s\\n' \"${COMPREPLY[@]}\"",
      "bash",
      HBCTL_COMPLETION};
  command.insert(command.end(), words.begin(), words.end());
  return command;
}

std::vector<std::string> lines_of(const std::string& text) {
  std::istringstream stream(text);
  std::vector<std::string> lines;
  for (std::string line; std::getline(stream, line);)
    if (!line.empty()) lines.push_back(line);
  return lines;
}

std::vector<std::string> offered(std::vector<std::string> words) {
  words.insert(words.begin(), HBCTL_PATH);
  const Finished finished = ChildProcess(completion_of(words)).finish();
  EXPECT_EQ(finished.errors, "");
  return lines_of(finished.output);
}

// The same while a daemon answers.
std::vector<std::string> offered_by(PlayedDaemon& daemon, std::vector<std::string> words,
                                    const ConfigurationMessage& configuration = small_cluster()) {
  words.insert(words.begin(), HBCTL_PATH);
  ChildProcess child(completion_of(words));
  daemon.start(configuration);
  const Finished finished = child.finish();
  EXPECT_EQ(finished.errors, "");
  return lines_of(finished.output);
}

TEST(HbctlCompletion, offers_the_commands) {
  EXPECT_THAT(offered({""}),
              UnorderedElementsAre("status", "nodes", "adapters", "networks", "sites", "watch", "adapter", "node",
                                   "route", "security", "send", "heartbeat", "simulate-death", "stale", "monitors"));
  EXPECT_THAT(offered({"n"}), UnorderedElementsAre("nodes", "networks", "node"));
}

TEST(HbctlCompletion, offers_a_command_after_an_option_with_its_value) {
  EXPECT_THAT(offered({"--color", "never", "wat"}), ElementsAre("watch"));
  EXPECT_THAT(offered({"--color=never", "wat"}), ElementsAre("watch"));
}

TEST(HbctlCompletion, offers_the_options_of_the_command) {
  EXPECT_THAT(offered({"watch", "--"}),
              UnorderedElementsAre("--help", "--socket", "--color", "--json", "--node", "--adapter", "--network",
                                   "--events", "--count", "--duration", "--name", "--discard-stale"));
  EXPECT_THAT(offered({"sites", "--"}), UnorderedElementsAre("--help", "--socket", "--color", "--json"));
  EXPECT_THAT(offered({"--v"}), ElementsAre("--version"));
}

TEST(HbctlCompletion, offers_only_options_that_the_command_has) {
  for (const char* command : {"status", "nodes", "adapters", "networks", "sites", "watch", "adapter", "node", "route",
                              "security", "send", "heartbeat", "simulate-death", "stale", "monitors"}) {
    const std::string help = ChildProcess(hbctl({command, "--help"})).finish().output;
    const std::string common = ChildProcess(hbctl({"--help"})).finish().output;
    for (const std::string& option : offered({command, "--"}))
      EXPECT_THAT(help + common, testing::HasSubstr(option)) << command;
  }
}

TEST(HbctlCompletion, offers_fixed_values) {
  EXPECT_THAT(offered({"--color", "a"}), UnorderedElementsAre("auto", "always"));
  EXPECT_THAT(offered({"--color", "=", "n"}), ElementsAre("never"));
  EXPECT_THAT(offered({"watch", "--events", "j"}), ElementsAre("join"));
  EXPECT_THAT(offered({"watch", "--events", "join", "n"}), ElementsAre("new-group"));
}

TEST(HbctlCompletion, offers_every_word_of_events_that_the_command_takes) {
  const std::string help = ChildProcess(hbctl({"watch", "--help"})).finish().output;
  const std::vector<std::string> words = offered({"watch", "--events", ""});
  EXPECT_THAT(words, Contains("all"));
  for (const std::string& word : words) EXPECT_THAT(help, testing::HasSubstr(word));
  EXPECT_EQ(words.size(), 8U);
}

TEST(HbctlCompletion, offers_the_nodes_of_the_daemon) {
  PlayedDaemon daemon;
  EXPECT_THAT(offered_by(daemon, {"watch", "--node", ""}), ElementsAre("0", "1", "2"));
}

TEST(HbctlCompletion, offers_the_adapters_of_the_daemon) {
  PlayedDaemon daemon;
  EXPECT_THAT(offered_by(daemon, {"watch", "--adapter", ""}), ElementsAre("0", "1", "2", "3", "4", "5"));
}

TEST(HbctlCompletion, offers_the_networks_of_the_daemon) {
  PlayedDaemon daemon;
  EXPECT_THAT(offered_by(daemon, {"adapters", "--network", "net"}), ElementsAre("net0", "net1"));
}

TEST(HbctlCompletion, asks_the_daemon_whose_socket_is_on_the_command_line) {
  PlayedDaemon daemon;
  setenv("HB_SERVER_SOCKET", (daemon.daemon().directory() + "/absent").c_str(), 1);
  EXPECT_THAT(offered_by(daemon, {"--socket", daemon.daemon().path(), "watch", "--node", ""}),
              ElementsAre("0", "1", "2"));
  EXPECT_THAT(offered_by(daemon, {"--socket", "=", daemon.daemon().path(), "watch", "--node", ""}),
              ElementsAre("0", "1", "2"));
}

TEST(HbctlCompletion, offers_what_stands_at_each_place_of_an_adapter) {
  PlayedDaemon daemon;
  EXPECT_THAT(offered_by(daemon, {"adapter", ""}), ElementsAre("0", "1", "2", "3", "4", "5"));
  EXPECT_THAT(offered({"adapter", "0", ""}),
              ElementsAre("enable", "disable", "ifdown", "ifup", "configure", "unconfigure", "swap", "grace", "state",
                          "may-be-down", "is-down"));
  EXPECT_THAT(offered({"adapter", "--yes", "0", "if"}), ElementsAre("ifdown", "ifup"));
  EXPECT_THAT(offered({"--socket", daemon.daemon().path(), "adapter", "--color", "=", "never", "0", "st"}),
              ElementsAre("state"));
  EXPECT_THAT(offered_by(daemon, {"adapter", "0", "swap", "10.0.0.2"}), ElementsAre("10.0.0.2"));
  EXPECT_THAT(offered({"adapter", "0", "grace", ""}), IsEmpty());
  EXPECT_THAT(offered({"adapter", "0", "--"}),
              UnorderedElementsAre("--help", "--socket", "--color", "--json", "--yes"));
}

TEST(HbctlCompletion, offers_every_action_that_the_command_takes) {
  const std::string help = ChildProcess(hbctl({"adapter", "--help"})).finish().output;
  std::string actions;
  for (const std::string& action : offered({"adapter", "0", ""})) actions += (actions.empty() ? "" : ", ") + action;
  EXPECT_THAT(help, testing::HasSubstr("What to do: " + actions + "\n"));
}

TEST(HbctlCompletion, offers_what_stands_at_each_place_of_the_other_commands_that_steer) {
  PlayedDaemon daemon;
  EXPECT_THAT(offered_by(daemon, {"node", ""}), ElementsAre("0", "1", "2"));
  EXPECT_THAT(offered({"node", "1", ""}), ElementsAre("may-be-down", "is-down"));
  EXPECT_THAT(offered_by(daemon, {"route", ""}), ElementsAre("0", "1", "2"));
  EXPECT_THAT(offered_by(daemon, {"send", "--node", ""}), ElementsAre("0", "1", "2"));
  EXPECT_THAT(offered({"stale", ""}), ElementsAre("on", "off"));
  EXPECT_THAT(offered({"monitors", "o"}), ElementsAre("on", "off"));
  EXPECT_THAT(offered_by(daemon, {"monitors", "on", ""}), ElementsAre("ether"));
}

TEST(HbctlCompletion, offers_nothing_and_says_nothing_without_a_daemon) {
  PlayedDaemon daemon;
  setenv("HB_SERVER_SOCKET", (daemon.daemon().directory() + "/absent").c_str(), 1);
  EXPECT_THAT(offered({"watch", "--node", ""}), IsEmpty());
  EXPECT_THAT(offered({"watch", "--network", ""}), IsEmpty());
}

TEST(HbctlCompletion, runs_nothing_that_a_network_is_named) {
  PlayedDaemon daemon;
  const std::string marker = daemon.daemon().directory() + "/marker";
  const auto names = offered_by(daemon, {"adapters", "--network", ""},
                                ConfigurationMessage()
                                    .max_nodes(1)
                                    .adapters_per_node(2)
                                    .adapter(0, "10.0.0.1")
                                    .network("$(touch " + marker + ")"));
  EXPECT_FALSE(std::filesystem::exists(marker));
  EXPECT_THAT(names, ElementsAre("\\$\\(touch\\ " + marker + "\\)"));
}

TEST(HbctlCompletion, offers_files_for_the_socket) {
  PlayedDaemon daemon;
  EXPECT_THAT(offered({"--socket", daemon.daemon().directory() + "/so"}), ElementsAre(daemon.daemon().path()));
}

TEST(HbctlCompletion, offers_nothing_where_a_number_is_to_be_typed) {
  EXPECT_THAT(offered({"watch", "--count", ""}), IsEmpty());
  EXPECT_THAT(offered({"nodes", "--wait", ""}), Not(Contains("status")));
}

}  // namespace
}  // namespace hb_test
