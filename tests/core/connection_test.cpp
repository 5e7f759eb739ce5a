// Where the daemon's socket is, and making and dropping the connection.
#include "hb_communication/connection.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <optional>
#include <string>

#include "hb_communication/event_reception.h"
#include "support/process_state.h"
#include "support/running_client.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

using testing::ElementsAre;

const std::string path_at_start = HB_SERVER_SOCKET;

TEST(ConnectionState, StartsWithTheDefaults) {
  EXPECT_EQ(path_at_start, "/var/ha/soc/mowl/server_socket");
  EXPECT_EQ(sizeof HB_SERVER_SOCKET, 108U);
  EXPECT_EQ(sizeof SERVER_SOCK_FNAME, 108U);
  EXPECT_EQ(reply_from_server_deftimeout.tv_sec, 55);
  EXPECT_EQ(reply_from_server_deftimeout.tv_usec, 0);
  EXPECT_EQ(sizeof client_hb_info, 16U);
}

void set_variable(const char* name, const std::optional<std::string>& value) {
  if (value) {
    setenv(name, value->c_str(), 1);
  } else {
    unsetenv(name);
  }
}

void set_base_path(const std::string& path) {
  path.copy(HB_SERVER_SOCKET, sizeof HB_SERVER_SOCKET - 1);
  HB_SERVER_SOCKET[path.size()] = '\0';
}

// Paths.

struct Path_Case {
  const char* name;
  std::optional<std::string> base;
  std::optional<std::string> domain;
  std::optional<std::string> partition;
  std::string expected;
};

class ResolvedPath : public testing::TestWithParam<Path_Case> {
 protected:
  ResolvedPath() {
    reset_platform();
    set_base_path("/var/ha/soc/mowl/server_socket");
  }
};

TEST_P(ResolvedPath, FollowsFromTheEnvironment) {
  set_variable("HB_SERVER_SOCKET", GetParam().base);
  set_variable("HA_DOMAIN_NAME", GetParam().domain);
  set_variable("HA_SYSPAR_NAME", GetParam().partition);
  SystemCalls calls;
  calls.always("connect", fail(ECONNREFUSED));
  EXPECT_EQ(hb_init_communication(), Hb_Failure);
  EXPECT_EQ(SERVER_SOCK_FNAME, GetParam().expected);
  ASSERT_EQ(calls.of("connect").size(), 1U);
  EXPECT_EQ(calls.of("connect")[0].bytes.substr(2), GetParam().expected);
}

constexpr auto unset = std::nullopt;

INSTANTIATE_TEST_SUITE_P(
    Variables, ResolvedPath,
    testing::Values(Path_Case{"Default", unset, unset, unset, "/var/ha/soc/mowl/server_socket"},
                    Path_Case{"Base", "/tmp/x/socket", unset, unset, "/tmp/x/socket"},
                    Path_Case{"EmptyBase", "", unset, unset, ""},
                    Path_Case{"EmptyBaseWithDomain", "", "d1", unset, ".d1"},
                    Path_Case{"DomainBeforePartition", unset, "d1", "p1", "/var/ha/soc/mowl/server_socket.d1"},
                    Path_Case{"Partition", unset, unset, "p1", "/var/ha/soc/mowl/server_socket.p1"},
                    Path_Case{"EmptyDomainFallsBackToPartition", unset, "", "p1", "/var/ha/soc/mowl/server_socket.p1"},
                    Path_Case{"BothEmpty", unset, "", "", "/var/ha/soc/mowl/server_socket"},
                    Path_Case{"EmptyPartition", unset, unset, "", "/var/ha/soc/mowl/server_socket"},
                    Path_Case{"BaseAndDomain", "/tmp/s", "d1", unset, "/tmp/s.d1"},
                    Path_Case{"BaseAndPartition", "/tmp/s", unset, "p1", "/tmp/s.p1"},
                    Path_Case{"NothingIsFormatted", "/tmp/%s%n", "%d", unset, "/tmp/%s%n.%d"},
                    Path_Case{"LongestPath", std::string(107, 'x'), unset, unset, std::string(107, 'x')},
                    Path_Case{"LongestPathWithDomain", std::string(100, 'x'), "domain", unset,
                              std::string(100, 'x') + ".domain"}),
    [](const auto& path_case) { return path_case.param.name; });

TEST(BasePath, StaysWhenTheVariableIsGone) {
  reset_platform();
  setenv("HB_SERVER_SOCKET", "/tmp/once", 1);
  unsetenv("HA_DOMAIN_NAME");
  unsetenv("HA_SYSPAR_NAME");
  SystemCalls calls;
  calls.always("connect", fail(ECONNREFUSED));
  hb_init_communication();
  EXPECT_STREQ(HB_SERVER_SOCKET, "/tmp/once");
  unsetenv("HB_SERVER_SOCKET");
  setenv("HA_DOMAIN_NAME", "d1", 1);
  hb_init_communication();
  EXPECT_STREQ(HB_SERVER_SOCKET, "/tmp/once");
  EXPECT_STREQ(SERVER_SOCK_FNAME, "/tmp/once.d1");
}

TEST(BasePath, IsTakenWhereThePathWithTheDomainIsTooLong) {
  reset_platform();
  set_base_path("/tmp/once");
  const std::string base(100, 'x');
  setenv("HB_SERVER_SOCKET", base.c_str(), 1);
  setenv("HA_DOMAIN_NAME", "domains", 1);
  unsetenv("HA_SYSPAR_NAME");
  EXPECT_EQ(hb_init_communication(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 15);
  EXPECT_EQ(HB_SERVER_SOCKET, base);
}

class TooLongPath : public testing::TestWithParam<Path_Case> {};

TEST_P(TooLongPath, IsNotConnectedTo) {
  set_base_path("/var/ha/soc/mowl/server_socket");
  set_variable("HB_SERVER_SOCKET", GetParam().base);
  set_variable("HA_DOMAIN_NAME", GetParam().domain);
  set_variable("HA_SYSPAR_NAME", GetParam().partition);
  set_hb_errno(0);
  const timeval time_limit = reply_from_server_deftimeout;
  SystemCalls calls;
  EXPECT_EQ(hb_init_communication(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 15);
  EXPECT_TRUE(calls.of("connect").empty());
  EXPECT_EQ(client_socket, nullptr);
  EXPECT_LT(strnlen(HB_SERVER_SOCKET, 108), 108U);
  EXPECT_LT(strnlen(SERVER_SOCK_FNAME, 108), 108U);
  EXPECT_EQ(reply_from_server_deftimeout.tv_sec, time_limit.tv_sec);
}

TEST(TooLongPathAfterAFailedStart, LeavesTheConnectionClosed) {
  const LeakAllowed connection_stays;
  set_base_path("/tmp/once");
  client_socket = new Hb_Csock;
  setenv("HB_SERVER_SOCKET", std::string(108, 'x').c_str(), 1);
  EXPECT_EQ(hb_init_communication(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 15);
  EXPECT_EQ(client_socket, nullptr);
  EXPECT_EQ(client_select, nullptr);
}

INSTANTIATE_TEST_SUITE_P(Variables, TooLongPath,
                         testing::Values(Path_Case{"Base", std::string(108, 'x'), unset, unset, ""},
                                         Path_Case{"LongBase", std::string(100000, 'x'), unset, unset, ""},
                                         Path_Case{"Domain", std::string(100, 'x'), "domains", unset, ""},
                                         Path_Case{"LongDomain", unset, std::string(5000, 'd'), unset, ""},
                                         Path_Case{"Partition", std::string(106, 'x'), unset, "p", ""}),
                         [](const auto& path_case) { return path_case.param.name; });

// Connecting.

class Connecting : public testing::Test {
 protected:
  Connecting() {
    reset_platform();
    set_hb_errno(0);
  }
  ~Connecting() override {
    hb_remove_client_select();
    hb_remove_socket();
  }

  FakeDaemon daemon{Publication::none()};
};

TEST_F(Connecting, MakesTheSocketAndTheSelector) {
  EXPECT_EQ(hb_init_communication(), Hb_Success);
  ASSERT_NE(client_socket, nullptr);
  ASSERT_NE(client_select, nullptr);
  EXPECT_EQ(client_socket->Error(), 0);
  EXPECT_EQ(client_select->Error(), 0);
  EXPECT_EQ(client_pid, getpid());
  EXPECT_EQ(hb_get_errno(), 0);
  EXPECT_TRUE(daemon.has_client());
}

struct Connect_Failure {
  const char* call;
  int error;
  int expected;
};

class ConnectingFailure : public Connecting, public testing::WithParamInterface<Connect_Failure> {};

TEST_P(ConnectingFailure, LeavesTheConnectionClosed) {
  const int descriptors = open_descriptors();
  {
    SystemCalls calls;
    calls.always(GetParam().call, fail(GetParam().error));
    EXPECT_EQ(hb_init_communication(), Hb_Failure);
  }
  EXPECT_EQ(hb_get_errno(), GetParam().expected);
  EXPECT_EQ(client_socket, nullptr);
  EXPECT_EQ(client_select, nullptr);
  EXPECT_EQ(open_descriptors(), descriptors);
}

INSTANTIATE_TEST_SUITE_P(Steps, ConnectingFailure,
                         testing::Values(Connect_Failure{"socket", EMFILE, 13},
                                         Connect_Failure{"setsockopt", ENOBUFS, 14},
                                         Connect_Failure{"connect", ECONNREFUSED, 15},
                                         Connect_Failure{"connect", EACCES, 15}),
                         [](const auto& step) { return step.param.call + std::to_string(step.param.error); });

TEST_F(Connecting, FailureOfTheSocketIsTracedAsItsRemoval) {
  reset_platform(1);
  platform_double().levels = {1, 1, 1};
  hbc_initialize_trace_once();
  SystemCalls calls;
  calls.always("connect", fail(ECONNREFUSED));
  EXPECT_EQ(hb_init_communication(), Hb_Failure);
  EXPECT_EQ(platform_double().traces_of(110).size(), 1U);
}

// Dropping.

TEST_F(Connecting, RemovingTheSocketClosesItAndIsTraced) {
  reset_platform(1);
  hbc_initialize_trace_once();
  ASSERT_EQ(hb_init_communication(), Hb_Success);
  DaemonConnection peer = daemon.accept();
  EXPECT_EQ(hb_remove_socket(), Hb_Success);
  EXPECT_EQ(client_socket, nullptr);
  EXPECT_NE(client_select, nullptr);
  EXPECT_TRUE(peer.at_end());
  ASSERT_EQ(platform_double().traces.size(), 1U);
  EXPECT_EQ(platform_double().traces[0].id, 110U);
  EXPECT_EQ(platform_double().traces[0].category, 1);
  EXPECT_EQ(platform_double().traces[0].form, Trace_Form::id);
}

TEST_F(Connecting, RemovingTheSelectorIsTraced) {
  reset_platform(1);
  hbc_initialize_trace_once();
  ASSERT_EQ(hb_init_communication(), Hb_Success);
  EXPECT_EQ(hb_remove_client_select(), Hb_Success);
  EXPECT_EQ(client_select, nullptr);
  EXPECT_NE(client_socket, nullptr);
  ASSERT_EQ(platform_double().traces.size(), 1U);
  EXPECT_EQ(platform_double().traces[0].id, 111U);
  EXPECT_EQ(platform_double().traces[0].category, 1);
  EXPECT_EQ(platform_double().traces[0].form, Trace_Form::id);
}

TEST_F(Connecting, RemovingWhatIsNotThereSucceedsAndIsTracedToo) {
  reset_platform(1);
  hbc_initialize_trace_once();
  EXPECT_EQ(hb_remove_client_select(), Hb_Success);
  EXPECT_EQ(hb_remove_socket(), Hb_Success);
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(111U, 110U));
}

TEST_F(Connecting, RemovingIsNotTracedWhileInfoIsOff) {
  platform_double().levels = {1, 0, 1};
  hbc_initialize_trace_once();
  hb_remove_client_select();
  hb_remove_socket();
  EXPECT_TRUE(platform_double().traces.empty());
}

}  // namespace
}  // namespace hb_test
