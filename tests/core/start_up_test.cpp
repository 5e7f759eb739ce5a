// Starting and stopping in daemon mode.
#include "hb_global_data/start_up.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <string>
#include <vector>

#include "VEX_EVMONEventPipeHandler.h"
#include "VEX_EVMONNewGroupEventHandler.h"
#include "hb_communication/connection.h"
#include "support/process_state.h"
#include "support/running_client.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

using testing::ElementsAre;

std::vector<std::string> without_mutexes_and_reads(const std::vector<std::string>& sequence) {
  std::vector<std::string> kept;
  for (const std::string& name : sequence) {
    if (!name.starts_with("pthread_") && name != "read") {
      kept.push_back(name);
    }
  }
  return kept;
}

class StartUp : public testing::Test {
 protected:
  StartUp() {
    reset_platform();
    set_hb_errno(0);
  }
  ~StartUp() override { hb_terminate(); }
};

TEST_F(StartUp, ConnectsThenAttachesThenAsksForTheConfiguration) {
  FakeDaemon daemon;
  daemon.serve_configuration(configuration_answer(small_cluster()));
  SystemCalls calls;
  ASSERT_EQ(hb_init(), Hb_Success);
  EXPECT_THAT(without_mutexes_and_reads(calls.sequence()),
              ElementsAre("socket", "setsockopt", "setsockopt", "connect", "ftok", "ftok", "ftok", "ftok", "shmget",
                          "shmat", "shmget", "shmat", "shmget", "shmat", "semget", "writev"));
  daemon.join();
}

TEST_F(StartUp, LeavesAnInitialisedClientWithItsTablesLoaded) {
  FakeDaemon daemon;
  const DaemonConnection connection = start_client(daemon, small_cluster());
  EXPECT_EQ(client_initialized, Hb_True);
  EXPECT_NE(client_socket, nullptr);
  EXPECT_NE(client_select, nullptr);
  EXPECT_NE(data_for_client, nullptr);
  EXPECT_NE(shared_route_info, nullptr);
  EXPECT_NE(security_info, nullptr);
  EXPECT_EQ(global_config_tbl.Hb_num_adapters, 6);
  EXPECT_EQ(global_num_nodes, 3);
  EXPECT_EQ(platform_double().registrations.size(), 1U);
}

TEST_F(StartUp, AgainReturnsAtOnceAndDoesNothing) {
  FakeDaemon daemon;
  const DaemonConnection connection = start_client(daemon, small_cluster());
  hbc_trace_inited = 0;
  platform_double().registrations.clear();
  std::memset(nodeEventSubscriptionName, 'n', 32);
  const int descriptor = client_socket->socket();
  SystemCalls calls;
  EXPECT_EQ(hb_init(), Hb_Success);
  EXPECT_TRUE(calls.sequence().empty());
  EXPECT_EQ(client_socket->socket(), descriptor);
  EXPECT_FALSE(daemon.has_client());
  EXPECT_FALSE(connection.has_input());
  EXPECT_TRUE(platform_double().registrations.empty());  // not even the trace registration
  EXPECT_EQ(nodeEventSubscriptionName[0], 'n');
  hbc_trace_inited = 1;
}

TEST_F(StartUp, DoesNotClearTheErrorNumber) {
  FakeDaemon daemon;
  set_hb_errno(49);
  const DaemonConnection connection = start_client(daemon, small_cluster());
  EXPECT_EQ(hb_get_errno(), 49);
  EXPECT_EQ(hb_init(), Hb_Success);
  EXPECT_EQ(hb_terminate(), Hb_Success);
  EXPECT_EQ(hb_get_errno(), 49);
}

TEST_F(StartUp, ClearsAllButTheLastByteOfTheTwoSubscriptionNames) {
  FakeDaemon daemon;
  std::memset(nodeEventSubscriptionName, 'n', 32);
  std::memset(networkEventSubscriptionName, 'w', 32);
  const DaemonConnection connection = start_client(daemon, small_cluster());
  EXPECT_EQ(std::string(nodeEventSubscriptionName, 32), std::string(31, '\0') + 'n');
  EXPECT_EQ(std::string(networkEventSubscriptionName, 32), std::string(31, '\0') + 'w');
}

TEST_F(StartUp, LeavesTheNamesOfSiteAndSplitMergeSubscriptions) {
  FakeDaemon daemon;
  std::memset(siteEventSubscriptionName, 's', 32);
  std::memset(splitMergeEventSubscriptionName, 'm', 32);
  const DaemonConnection connection = start_client(daemon, small_cluster());
  EXPECT_EQ(std::string(siteEventSubscriptionName, 32), std::string(32, 's'));
  EXPECT_EQ(std::string(splitMergeEventSubscriptionName, 32), std::string(32, 'm'));
}

TEST_F(StartUp, ThatFailsStillRegistersTraceAndClearsTheNames) {
  FakeDaemon daemon(Publication::none());
  daemon.stop_listening();
  std::memset(nodeEventSubscriptionName, 'n', 32);
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 15);
  EXPECT_EQ(platform_double().registrations.size(), 1U);
  EXPECT_EQ(nodeEventSubscriptionName[30], '\0');
  EXPECT_EQ(nodeEventSubscriptionName[31], 'n');
  EXPECT_EQ(client_initialized, Hb_False);
}

TEST_F(StartUp, MakesTheMutexesOnceForAllStarts) {
  FakeDaemon daemon;
  hbapi_global_data_once = PTHREAD_ONCE_INIT;
  SystemCalls calls;
  for (int start = 0; start < 2; ++start) {
    const DaemonConnection connection = start_client(daemon, small_cluster());
    hb_terminate();
  }
  EXPECT_EQ(calls.of("pthread_mutexattr_init").size(), 1U);
  EXPECT_EQ(calls.of("pthread_mutex_init").size(), 2U);
  EXPECT_TRUE(calls.of("pthread_mutex_destroy").empty());
}

TEST_F(StartUp, RegistersTraceOnceForAllStarts) {
  FakeDaemon daemon;
  for (int start = 0; start < 2; ++start) {
    const DaemonConnection connection = start_client(daemon, small_cluster());
    hb_terminate();
    EXPECT_EQ(hbc_trace_inited, 1);
  }
  EXPECT_EQ(platform_double().registrations.size(), 1U);
}

TEST_F(StartUp, WithoutAConnectionLeavesTheTablesAlone) {
  FakeDaemon daemon(Publication::none());
  daemon.stop_listening();
  Hb_Adapter adapter = {};
  global_config_tbl.Hb_global_adapter_list = &adapter;
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(global_config_tbl.Hb_global_adapter_list, &adapter);
  global_config_tbl.Hb_global_adapter_list = nullptr;
}

TEST_F(StartUp, ForgetsTheAdapterTablesBeforeItAsksAndKeepsTheNodeTables) {
  FakeDaemon daemon;
  daemon.serve_configuration(ReplyPacket(10).bytes());  // no configuration
  Hb_Adapter adapter = {};
  Hb_Node_config_state node = {};
  auto* table = reinterpret_cast<H_table_str*>(&adapter);
  global_config_tbl.Hb_global_adapter_list = &adapter;
  global_config_tbl.adap_hash = table;
  global_config_tbl.ip_hash = table;
  global_config_tbl.site_hash = table;
  global_config_tbl.node_hash = table;
  global_config_tbl.node_list = &node;
  {
    const LeakAllowed connection_stays;
    EXPECT_EQ(hb_init(), Hb_Failure);
  }
  EXPECT_EQ(global_config_tbl.Hb_global_adapter_list, nullptr);
  EXPECT_EQ(global_config_tbl.adap_hash, nullptr);
  EXPECT_EQ(global_config_tbl.ip_hash, nullptr);
  EXPECT_EQ(global_config_tbl.site_hash, nullptr);
  EXPECT_EQ(global_config_tbl.node_hash, table);
  EXPECT_EQ(global_config_tbl.node_list, &node);
  global_config_tbl = {};
  daemon.join();
}

TEST_F(StartUp, WithAnUnusableAnswerIsTracedAndFails) {
  FakeDaemon daemon;
  reset_platform(1);
  daemon.serve_configuration(ReplyPacket(10).bytes());
  {
    const LeakAllowed connection_stays;
    EXPECT_EQ(hb_init(), Hb_Failure);
  }
  EXPECT_EQ(hb_get_errno(), 10);
  const std::vector<Recorded_Trace> traces = platform_double().traces_of(276);
  ASSERT_EQ(traces.size(), 1U);
  EXPECT_EQ(traces[0].form, Trace_Form::id);
  EXPECT_EQ(traces[0].category, 0);
  EXPECT_EQ(client_initialized, Hb_False);
  daemon.join();
}

TEST_F(StartUp, WithAnUnusableAnswerIsNotTracedWhileErrorsAreOff) {
  FakeDaemon daemon;
  platform_double().levels = {0, 1, 1};
  daemon.serve_configuration(ReplyPacket(10).bytes());
  {
    const LeakAllowed connection_stays;
    EXPECT_EQ(hb_init(), Hb_Failure);
  }
  EXPECT_TRUE(platform_double().traces_of(276).empty());
  daemon.join();
}

// What a failed start keeps.

TEST_F(StartUp, ThatFailsAtTheSegmentsKeepsItsConnectionAndTheNextOneOpensAnother) {
  FakeDaemon daemon(Publication::none());
  const int descriptors = open_descriptors();
  const LeakAllowed connections_stay;
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 33);
  EXPECT_EQ(open_descriptors(), descriptors + 1);
  const int first = client_socket->socket();
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(open_descriptors(), descriptors + 2);
  EXPECT_NE(client_socket->socket(), first);
  EXPECT_EQ(fcntl(first, F_GETFD), 0);
  const DaemonConnection one = daemon.accept();
  const DaemonConnection two = daemon.accept();
  EXPECT_FALSE(one.has_input());  // open, and nothing was asked
  EXPECT_FALSE(two.has_input());
}

TEST_F(StartUp, ThatFailedIsNotUndoneByTerminate) {
  FakeDaemon daemon(Publication::none());
  const LeakAllowed connection_stays;
  EXPECT_EQ(hb_init(), Hb_Failure);
  const int descriptors = open_descriptors();
  EXPECT_EQ(hb_terminate(), Hb_Success);
  EXPECT_EQ(open_descriptors(), descriptors);
  EXPECT_NE(client_socket, nullptr);
}

TEST_F(StartUp, ThatFailsAtTheConfigurationKeepsTheSegmentsAttached) {
  FakeDaemon daemon;
  daemon.serve_configuration(ReplyPacket(10).bytes());
  const int segments = attached_segments();
  const int descriptors = open_descriptors();
  {
    const LeakAllowed connection_stays;
    EXPECT_EQ(hb_init(), Hb_Failure);
  }
  EXPECT_EQ(attached_segments(), segments + 3);
  EXPECT_EQ(open_descriptors(), descriptors + 2);  // the client's end and the daemon's
  hb_terminate();
  EXPECT_EQ(attached_segments(), segments + 3);
  daemon.join();
}

TEST_F(StartUp, AfterAFailedOneTakesOverWithNewObjects) {
  FakeDaemon daemon(Publication::none());
  {
    const LeakAllowed connection_stays;
    EXPECT_EQ(hb_init(), Hb_Failure);
  }
  const Hb_Csock* failed = client_socket;
  FakeDaemon other;
  const DaemonConnection connection = start_client(other, small_cluster());
  EXPECT_NE(client_socket, failed);
  EXPECT_EQ(client_initialized, Hb_True);
}

// Stopping.

TEST_F(StartUp, TerminateWithoutAStartDoesNothing) {
  SystemCalls calls;
  EXPECT_EQ(hb_terminate(), Hb_Success);
  EXPECT_TRUE(calls.sequence().empty());
}

TEST_F(StartUp, TerminateWithoutAStartKeepsTheMode) {
  IsVEX = Hb_True;
  EXPECT_EQ(hb_terminate(), Hb_Success);
  EXPECT_EQ(IsVEX, Hb_True);
  IsVEX = Hb_False;
}

TEST_F(StartUp, TerminateDetachesReleasesAndCloses) {
  const int descriptors = open_descriptors();
  const int segments = attached_segments();
  {
    FakeDaemon daemon;
    const DaemonConnection connection = start_client(daemon, small_cluster());
    EXPECT_EQ(hb_terminate(), Hb_Success);
  }
  EXPECT_EQ(client_initialized, Hb_False);
  EXPECT_EQ(client_socket, nullptr);
  EXPECT_EQ(client_select, nullptr);
  EXPECT_EQ(data_for_client, nullptr);
  EXPECT_EQ(shared_route_info, nullptr);
  EXPECT_EQ(security_info, nullptr);
  EXPECT_EQ(global_config_tbl.Hb_global_adapter_list, nullptr);
  EXPECT_EQ(global_config_tbl.adap_hash, nullptr);
  EXPECT_EQ(global_num_nodes, 0);
  EXPECT_EQ(open_descriptors(), descriptors);
  EXPECT_EQ(attached_segments(), segments);
}

TEST_F(StartUp, TerminateDetachesBeforeItCloses) {
  FakeDaemon daemon;
  const DaemonConnection connection = start_client(daemon, small_cluster());
  SystemCalls calls;
  hb_terminate();
  EXPECT_THAT(calls.sequence(), ElementsAre("shmdt", "shmdt", "shmdt", "close"));
}

TEST_F(StartUp, TerminateRemovesTheSelectorThenTheSocket) {
  reset_platform(1);
  FakeDaemon daemon;
  const DaemonConnection connection = start_client(daemon, small_cluster());
  platform_double().traces.clear();
  hb_terminate();
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(111U, 110U));
}

TEST_F(StartUp, TerminateLeavesVexModeAndDeletesTheHandlers) {
  int events[2];
  int groups[2];
  ASSERT_EQ(pipe(events), 0);
  ASSERT_EQ(pipe(groups), 0);
  char name[] = "pipe";
  IsVEX = Hb_True;
  client_initialized = Hb_True;
  event_pipe_handler_p = new EVMONEventPipeHandler(events, name);
  new_group_event_handler_p = new EVMONNewGroupEventHandler(groups, name);
  const int descriptors = open_descriptors();
  EXPECT_EQ(hb_terminate(), Hb_Success);
  EXPECT_EQ(IsVEX, Hb_False);
  EXPECT_EQ(event_pipe_handler_p, nullptr);
  EXPECT_EQ(new_group_event_handler_p, nullptr);
  EXPECT_EQ(open_descriptors(), descriptors - 4);
}

TEST_F(StartUp, TerminateLeavesTheSitesAlone) {
  FakeDaemon daemon;
  const DaemonConnection connection = start_client(daemon, small_cluster());
  Hb_Site site = {};
  auto* table = reinterpret_cast<H_table_str*>(&site);
  global_config_tbl.site_hash = table;
  global_config_tbl.site_list = &site;
  global_site_tbl[1] = Hb_True;
  global_num_sites = 1;
  hb_terminate();
  EXPECT_EQ(global_config_tbl.site_hash, table);
  EXPECT_EQ(global_config_tbl.site_list, &site);
  EXPECT_THAT(global_site_tbl, ElementsAre(Hb_False, Hb_True));
  EXPECT_EQ(global_num_sites, 1);
  global_config_tbl = {};
  global_site_tbl[1] = Hb_False;
  global_num_sites = 0;
}

TEST_F(StartUp, TerminateTwiceDoesNothingTheSecondTime) {
  FakeDaemon daemon;
  const DaemonConnection connection = start_client(daemon, small_cluster());
  EXPECT_EQ(hb_terminate(), Hb_Success);
  SystemCalls calls;
  EXPECT_EQ(hb_terminate(), Hb_Success);
  EXPECT_TRUE(calls.sequence().empty());
}

TEST_F(StartUp, ExitStopsTheClientToo) {
  FakeDaemon daemon;
  DaemonConnection connection = start_client(daemon, small_cluster());
  hb_exit();
  EXPECT_EQ(client_initialized, Hb_False);
  EXPECT_EQ(client_socket, nullptr);
  EXPECT_TRUE(connection.at_end());
}

TEST_F(StartUp, FollowsATerminateWithANewConnection) {
  FakeDaemon daemon;
  DaemonConnection first = start_client(daemon, small_cluster());
  hb_terminate();
  EXPECT_TRUE(first.at_end());
  const DaemonConnection second = start_client(daemon, small_cluster());
  EXPECT_EQ(client_initialized, Hb_True);
  EXPECT_EQ(global_num_nodes, 3);
}

}  // namespace
}  // namespace hb_test
