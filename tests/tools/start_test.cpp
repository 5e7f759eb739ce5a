// The daemon that is not there, not ready, or gone; and the socket that is tried.
#include <gmock/gmock.h>

#include <cstdlib>
#include <nlohmann/json.hpp>

#include "hbctl_process.h"
#include "played_daemon.h"
#include "support/temporary_directory.h"

namespace hb_test {
namespace {

using nlohmann::json;
using testing::HasSubstr;
using testing::StartsWith;

class HbctlStart : public testing::Test {
 protected:
  HbctlStart() {
    for (const char* variable : {"HB_SERVER_SOCKET", "HA_DOMAIN_NAME", "HA_SYSPAR_NAME"}) unsetenv(variable);
  }

  std::string absent() const { return directory_.path("absent"); }

  static Finished run(const std::vector<std::string>& arguments) { return ChildProcess(hbctl(arguments)).finish(); }

  TemporaryDirectory directory_;
};

TEST_F(HbctlStart, without_a_daemon_names_the_socket_the_error_and_how_to_start_one) {
  const Finished finished = run({"nodes", "--socket", absent()});
  EXPECT_EQ(finished.output, "");
  EXPECT_EQ(finished.errors, "hbctl: no daemon answers on " + absent() +
                                 ": HB_ECONNECT (15), the daemon's socket could not be connected to\n"
                                 "start a daemon with: hbd --socket " +
                                 absent() +
                                 "\n"
                                 "or name another socket with --socket PATH\n");
  EXPECT_EQ(finished.status, 3);
}

TEST_F(HbctlStart, without_a_daemon_fails_alike_in_every_command) {
  const std::vector<std::vector<std::string>> commands = {
      {"status"},
      {"nodes"},
      {"adapters"},
      {"networks"},
      {"sites"},
      {"watch"},
      {"adapter", "1", "ifdown", "--yes"},
      {"adapter", "1", "state"},
      {"node", "1", "may-be-down"},
      {"route", "1"},
      {"route", "1", "--from-daemon"},
      {"security"},
      {"send", "--node", "1", "--port", "7"},
      {"heartbeat"},
      {"simulate-death", "1", "--yes"},
      {"stale", "on"},
      {"monitors", "on"},
  };
  for (std::vector<std::string> command : commands) {
    command.insert(command.begin(), {"--socket", absent()});
    const Finished finished = run(command);
    EXPECT_THAT(finished.errors, StartsWith("hbctl: no daemon answers on " + absent() + ": HB_ECONNECT (15)"))
        << testing::PrintToString(command);
    EXPECT_EQ(finished.status, 3) << testing::PrintToString(command);
  }
}

TEST_F(HbctlStart, without_a_daemon_is_a_status_too) {
  const Finished finished = run({"status", "--socket", absent()});
  EXPECT_EQ(finished.output, "Socket      " + absent() + "\nConnected   no\n");
  EXPECT_EQ(finished.status, 3);
}

TEST_F(HbctlStart, without_a_daemon_is_a_status_in_json) {
  const json status = json::parse(run({"status", "--json", "--socket", absent()}).output);
  EXPECT_EQ(status["type"], "status");
  EXPECT_EQ(status["connected"], false);
  EXPECT_EQ(status["socket"], absent());
  EXPECT_EQ(status["error"]["name"], "HB_ECONNECT");
  EXPECT_EQ(status["error"]["number"], 15);
}

TEST_F(HbctlStart, without_a_daemon_is_one_error_object_in_json) {
  const json error = json::parse(run({"nodes", "--json", "--socket", absent()}).output);
  const json expected = {
      {"version", 1},
      {"type", "error"},
      {"error",
       {{"exit_status", 3},
        {"name", "HB_ECONNECT"},
        {"number", 15},
        {"message",
         "no daemon answers on " + absent() + ": HB_ECONNECT (15), the daemon's socket could not be connected to"},
        {"advice", "start a daemon with: hbd --socket " + absent() + "\nor name another socket with --socket PATH"}}}};
  EXPECT_EQ(error, expected);
}

TEST_F(HbctlStart, tries_the_default_socket) {
  EXPECT_THAT(run({"status"}).output, StartsWith("Socket      /var/ha/soc/mowl/server_socket\n"));
}

TEST_F(HbctlStart, tries_the_socket_and_the_domain_of_the_environment) {
  setenv("HB_SERVER_SOCKET", absent().c_str(), 1);
  EXPECT_THAT(run({"status"}).output, StartsWith("Socket      " + absent() + "\n"));
  setenv("HA_SYSPAR_NAME", "p1", 1);
  EXPECT_THAT(run({"status"}).output, StartsWith("Socket      " + absent() + ".p1\n"));
  setenv("HA_DOMAIN_NAME", "d1", 1);
  EXPECT_THAT(run({"status"}).output, StartsWith("Socket      " + absent() + ".d1\n"));
}

TEST_F(HbctlStart, connects_to_exactly_the_socket_that_the_option_names) {
  PlayedDaemon daemon;
  setenv("HB_SERVER_SOCKET", absent().c_str(), 1);
  setenv("HA_DOMAIN_NAME", "d1", 1);
  setenv("HA_SYSPAR_NAME", "p1", 1);
  ChildProcess child(hbctl({"sites", "--socket", daemon.daemon().path()}));
  daemon.start();
  EXPECT_EQ(child.finish().status, 0);
}

TEST_F(HbctlStart, with_a_path_that_no_address_can_hold_is_refused) {
  const std::string path = directory_.path(std::string(120, 'x'));
  const Finished finished = run({"nodes", "--socket", path});
  EXPECT_THAT(finished.errors, StartsWith("hbctl: no daemon answers on " + path + ": HB_ECONNECT (15)"));
  EXPECT_EQ(finished.status, 3);
}

TEST_F(HbctlStart, with_nothing_published_tells_of_the_shared_memory) {
  PlayedDaemon daemon(Publication::none());
  const Finished finished = run({"nodes"});
  EXPECT_THAT(finished.errors, StartsWith("hbctl: cannot start with the daemon on " + daemon.daemon().path() +
                                          ": HB_ESHMGET_NOENT (33), "));
  EXPECT_THAT(finished.errors, HasSubstr("shared memory"));
  EXPECT_EQ(finished.status, 1);
}

TEST_F(HbctlStart, with_a_daemon_that_hangs_up_ends_with_a_status_of_its_own) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"nodes"}));
  DaemonConnection connection = daemon.daemon().accept();
  connection.receive_request();
  connection.close();
  const Finished finished = child.finish();
  EXPECT_THAT(finished.errors, HasSubstr("HB_EDAEMONGONE (16)"));
  EXPECT_EQ(finished.status, 4);
}

TEST_F(HbctlStart, with_a_wrong_answer_fails) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"nodes"}));
  DaemonConnection connection = daemon.daemon().accept();
  connection.receive_request();
  connection.send_frame(ReplyPacket(10).bytes());
  const Finished finished = child.finish();
  EXPECT_THAT(finished.errors, HasSubstr("HB_EBADREPLY (10)"));
  EXPECT_EQ(finished.status, 1);
}

TEST_F(HbctlStart, with_a_daemon_that_goes_while_it_is_asked_ends_with_that_status) {
  PlayedDaemon daemon;
  ChildProcess child(hbctl({"nodes"}));
  daemon.start();
  daemon.expect_subscription("hbctl.probe.nodes");
  daemon.expect_subscription("hbctl.probe.adapters");
  daemon.connection().close();
  const Finished finished = child.finish();
  EXPECT_THAT(finished.errors, HasSubstr("HB_EDAEMONGONE (16)"));
  EXPECT_EQ(finished.status, 4);
}

TEST_F(HbctlStart, with_a_wrong_command_line_is_a_usage_error) {
  const std::vector<std::vector<std::string>> command_lines = {{},
                                                               {"nonsense"},
                                                               {"nodes", "extra"},
                                                               {"nodes", "--wait", "soon"},
                                                               {"watch", "--node", "2049"},
                                                               {"--color", "red"},
                                                               {"adapter", "1"},
                                                               {"adapter", "1", "configure"}};
  for (const auto& command_line : command_lines) {
    const Finished finished = run(command_line);
    EXPECT_THAT(finished.errors, StartsWith("hbctl: ")) << testing::PrintToString(command_line);
    EXPECT_EQ(finished.status, 2) << testing::PrintToString(command_line);
  }
}

TEST_F(HbctlStart, helps_on_every_level_with_examples) {
  for (const char* command : {"status", "nodes", "adapters", "networks", "sites", "watch", "adapter", "node", "route",
                              "security", "send", "heartbeat", "simulate-death", "stale", "monitors"}) {
    const Finished finished = run({command, "--help"});
    EXPECT_THAT(finished.output, HasSubstr(std::string("Examples:\n  hbctl ") + command)) << command;
    EXPECT_THAT(finished.output, HasSubstr("--json")) << command;
    EXPECT_EQ(finished.status, 0) << command;
  }
  const Finished finished = run({"--help"});
  EXPECT_THAT(finished.output, HasSubstr("Examples:\n"));
  EXPECT_THAT(finished.output, HasSubstr("Exit status: 0 done, 1 failed, 2 wrong command line"));
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlStart, tells_its_version) {
  const Finished finished = run({"--version"});
  EXPECT_THAT(finished.output, testing::MatchesRegex("hbctl [0-9]+\\.[0-9]+\\.[0-9]+\n"));
  EXPECT_EQ(finished.status, 0);
}

}  // namespace
}  // namespace hb_test
