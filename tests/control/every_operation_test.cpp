// What the operations have in common: starting the client, VEX mode, a missing connection, failures of sending, locks.
#include <gtest/gtest.h>
#include <sys/socket.h>

#include <cerrno>
#include <csignal>

#include "control_operations.h"
#include "support/allocation_faults.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

std::string name_of_operation(const testing::TestParamInfo<Operation>& test) { return test.param.name; }

bool asks(const Operation& operation) { return operation.request != 0; }

template <typename Wanted>
std::vector<Operation> operations_where(Wanted wanted) {
  std::vector<Operation> chosen;
  for (const Operation& operation : operations_that_start()) {
    if (wanted(operation)) {
      chosen.push_back(operation);
    }
  }
  return chosen;
}

// An entry of the route segment: number of the configuration, length, whether it is no IP route, hops.
Bytes good_route() { return ByteBuilder().u32(1).u16(36).u16(0).raw(Bytes(176, 'r')).bytes(); }

class EveryOperation : public testing::TestWithParam<Operation> {
 protected:
  EveryOperation() {
    forget_leftovers();
    reset_platform();
    operation_outputs.clear();
  }
  ~EveryOperation() override { IsVEX = Hb_False; }

  static Hb_Rc call() { return GetParam().call(); }

  static testing::AssertionResult ends_with(int outcome) {
    return outcome == no_failure ? succeeds(call) : fails_with(outcome > 0 ? outcome : untouched_error, call);
  }
};

TEST_P(EveryOperation, FailsAsTheStartDoesWhileNoDaemonIsThere) {
  FakeDaemon daemon;
  daemon.stop_listening();
  EXPECT_TRUE(fails_with(15, call));
  EXPECT_TRUE(operation_outputs.untouched());
}

TEST_P(EveryOperation, FailsAsTheStartDoesAndSendsNothingWhileNothingIsPublished) {
  FakeDaemon daemon(Publication::none());
  EXPECT_TRUE(fails_with(33, call));
  EXPECT_FALSE(daemon.accept().has_input());
  EXPECT_TRUE(operation_outputs.untouched());
  hb_remove_client_select();  // such a start keeps its connection
  hb_remove_socket();
}

TEST_P(EveryOperation, FailsInVexModeWithoutClusterServicesAndSetsNoErrorNumber) {
  FakeDaemon daemon;
  IsVEX = Hb_True;
  SystemCalls calls;
  EXPECT_TRUE(fails_without_error_number(call));
  EXPECT_TRUE(calls.of("socket").empty());
  EXPECT_TRUE(operation_outputs.untouched());
}

TEST_P(EveryOperation, StartsTheClientByItself) {
  FakeDaemon daemon(Publication::for_nodes(8));
  daemon.write_segment(Segment::route, size_t{4} * 184, good_route());
  DaemonConnection connection;
  daemon.run([&connection](FakeDaemon& peer) {
    connection = peer.accept();
    connection.receive_request();
    connection.send_frame(configuration_answer(sparse_cluster()));
    if (!GetParam().answer.empty()) {
      connection.send_frame(GetParam().answer);
    }
  });
  EXPECT_TRUE(succeeds(call));
  daemon.join();
  EXPECT_EQ(Hb_True, client_initialized);
  EXPECT_EQ(asks(GetParam()), connection.has_input());
  if (asks(GetParam())) {
    EXPECT_EQ(GetParam().request, i32_at(connection.receive_request(), 8));
    EXPECT_FALSE(connection.has_input());
  }
  hb_terminate();
}

TEST_P(EveryOperation, WithoutAConnectionSendsNothingInVexMode) {
  load(sparse_cluster());
  IsVEX = Hb_True;
  EXPECT_TRUE(ends_with(GetParam().in_vex_mode));
  EXPECT_EQ(nullptr, client_socket);
  unload();
}

TEST_P(EveryOperation, WithoutAConnectionSaysSoInDaemonMode) {
  load(sparse_cluster());
  EXPECT_TRUE(ends_with(GetParam().without_connection));
  unload();
}

TEST_P(EveryOperation, TakesNoMutex) {
  FakeDaemon daemon(Publication::for_nodes(8));
  daemon.write_segment(Segment::route, size_t{4} * 184, good_route());
  DaemonConnection connection = start_client(daemon, sparse_cluster());
  if (!GetParam().answer.empty()) {
    connection.send_frame(GetParam().answer);
  }
  SystemCalls calls;
  EXPECT_TRUE(succeeds(call));
  EXPECT_TRUE(calls.of("pthread_mutex_lock").empty());
  const bool reads_routes = GetParam().without_connection == 6;
  EXPECT_EQ(reads_routes ? 2U : 0U, calls.of("semop").size());
  hb_terminate();
}

TEST_P(EveryOperation, TracesNothing) {
  FakeDaemon daemon(Publication::for_nodes(8));
  daemon.write_segment(Segment::route, size_t{4} * 184, good_route());
  DaemonConnection connection = start_client(daemon, sparse_cluster());
  trace_all();
  if (!GetParam().answer.empty()) {
    connection.send_frame(GetParam().answer);
  }
  EXPECT_TRUE(succeeds(call));
  std::signal(SIGPIPE, SIG_IGN);
  connection.close();
  call();
  EXPECT_TRUE(platform_double().traces.empty());
  trace_nothing();
  hb_terminate();
}

TEST_P(EveryOperation, FailsWhereMemoryRunsOut) {
  bool happened = true;
  for (size_t nth = 1; happened; ++nth) {
    FakeDaemon daemon(Publication::for_nodes(8));
    daemon.write_segment(Segment::route, size_t{4} * 184, good_route());
    DaemonConnection connection = start_client(daemon, sparse_cluster());
    if (!GetParam().answer.empty()) {
      connection.send_frame(GetParam().answer);
    }
    operation_outputs.clear();
    Hb_Rc result = Hb_Success;
    const long live = live_allocations();
    {
      const AllocationFailure failure(nth);
      result = call();
      happened = failure.happened();
    }
    EXPECT_EQ(live, live_allocations()) << nth;
    EXPECT_EQ(happened ? Hb_Failure : Hb_Success, result) << nth;
    if (happened) {
      // What was asked is not sent, or its answer not read.
      EXPECT_EQ(connection.has_input() ? 12 : 17, hb_get_errno()) << nth;
      EXPECT_TRUE(operation_outputs.bytes_untouched()) << nth;
    }
    hb_terminate();
  }
}

INSTANTIATE_TEST_SUITE_P(Control, EveryOperation, testing::ValuesIn(operations_that_start()), name_of_operation);

class EveryRequest : public Steering, public testing::WithParamInterface<Operation> {
 protected:
  EveryRequest() { operation_outputs.clear(); }
  ~EveryRequest() override { IsVEX = Hb_False; }

  static Hb_Rc call() { return GetParam().call(); }
};

TEST_P(EveryRequest, IsNotSentInVexModeThoughThereIsAConnection) {
  IsVEX = Hb_True;
  if (!GetParam().answer.empty()) {
    connection.send_frame(GetParam().answer);
  }
  EXPECT_TRUE(succeeds(call));
  EXPECT_TRUE(nothing_sent());
}

TEST_P(EveryRequest, ToADaemonThatIsGoneFailsWithThat) {
  connection.close();
  EXPECT_TRUE(fails_with(16, call));
  EXPECT_NE(nullptr, client_socket);
}

TEST_P(EveryRequest, FailsAsSendingDoes) {
  for (const auto& [system_error, error] :
       {std::pair(EFAULT, 18), std::pair(EIO, 21), std::pair(EPIPE, 16), std::pair(ENOBUFS, 22)}) {
    SystemCalls calls;
    calls.script("writev", {fail(system_error)});
    EXPECT_TRUE(fails_with(error, call));
    EXPECT_EQ(1U, calls.of("writev").size());
  }
  EXPECT_TRUE(nothing_sent());
}

TEST_P(EveryRequest, GoesOutInOneWrite) {
  if (!GetParam().answer.empty()) {
    connection.send_frame(GetParam().answer);
  }
  SystemCalls calls;
  EXPECT_TRUE(succeeds(call));
  EXPECT_EQ(1U, calls.of("writev").size());
}

INSTANTIATE_TEST_SUITE_P(Control, EveryRequest, testing::ValuesIn(operations_where(asks)), name_of_operation);

class UnansweredRequest : public EveryRequest {};

TEST_P(UnansweredRequest, ReadsNothing) {
  connection.send_frame(ReplyPacket(12).bytes());
  SystemCalls calls;
  EXPECT_TRUE(succeeds(call));
  EXPECT_TRUE(calls.of("read").empty());
  EXPECT_TRUE(calls.of("select").empty());
}

TEST_P(UnansweredRequest, SucceedsThoughTheDaemonWillNeverSayAnything) {
  ASSERT_EQ(0, shutdown(connection.descriptor(), SHUT_WR));
  EXPECT_TRUE(succeeds(call));
  EXPECT_EQ(GetParam().request, i32_at(connection.receive_request(), 8));
}

INSTANTIATE_TEST_SUITE_P(Control, UnansweredRequest, testing::ValuesIn(operations_where([](const Operation& operation) {
                           return asks(operation) && operation.answer.empty();
                         })),
                         name_of_operation);

TEST(OperationsWithoutAClient, AreTheTwoThatReadAndFreeWhatTheCallerHas) {
  reset_platform();
  FakeDaemon daemon;
  Hb_client_hb_info_t settings;
  Hb_Security_Status current = {};
  Hb_Security_Status previous = {};
  Hb_Key_Cache cache = {};
  EXPECT_TRUE(succeeds([&] { return hb_get_client_hb_info(&settings); }));
  EXPECT_TRUE(succeeds([&] { return hb_free_security_info_keys(&current, &previous, &cache); }));
  EXPECT_EQ(Hb_False, client_initialized);
  EXPECT_FALSE(daemon.has_client());
}

}  // namespace
}  // namespace hb_test
