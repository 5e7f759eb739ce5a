// Reading routes from the daemon's shared memory: which are valid, and the reader lock around them.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <pthread.h>
#include <sys/sem.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <fstream>
#include <ostream>
#include <string>
#include <thread>

#include "hb_communication/reader_hold.h"
#include "hb_communication/shared_memory.h"
#include "reader_lock.h"
#include "route_outputs.h"
#include "steering.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

struct Read {
  const char* name;
  Hb_Rc (*call)(Hb_Node_Number, Hb_Source_Route*, unsigned short*);
};

void PrintTo(const Read& read, std::ostream* stream) { *stream << read.name; }

const Read reads[] = {{"hb_read_route", hb_read_route}, {"hb_read_ip_route", hb_read_ip_route}};

std::string name_of_read(const testing::TestParamInfo<Read>& test) { return test.param.name; }

// A client of the sparse cluster, whose daemon publishes routes under the number 7.
class Routes : public testing::Test {
 protected:
  explicit Routes(uint32_t published_nodes = 8) : daemon(Publication::for_nodes(published_nodes)) {
    std::signal(SIGPIPE, SIG_IGN);
    reset_platform();
    publish_configuration(7);
    connection = start_client(daemon, sparse_cluster());
  }
  ~Routes() override { hb_terminate(); }

  void publish_configuration(uint32_t sequence) {
    daemon.write_segment(Segment::configuration, 0, ByteBuilder().u32(sequence).bytes());
  }

  void publish_route(size_t node, uint32_t sequence, uint16_t length, uint16_t nonip, const Bytes& hops) {
    daemon.write_segment(Segment::route, node * 184,
                         ByteBuilder().u32(sequence).u16(length).u16(nonip).raw(hops).bytes());
  }

  FakeDaemon daemon;
  DaemonConnection connection;
  Reader_Lock lock{daemon.semaphore_id()};
  Route_Outputs out;
};

class PublishedRoute : public Routes, public testing::WithParamInterface<Read> {
 protected:
  explicit PublishedRoute(uint32_t published_nodes = 8) : Routes(published_nodes) {}

  Hb_Rc read(Hb_Node_Number node) { return GetParam().call(node, &out.route, &out.length); }

  // And holds nothing, asks nothing and writes nothing.
  testing::AssertionResult is_refused_with(int error, Hb_Node_Number node) {
    const testing::AssertionResult result = fails_with(error, [&] { return read(node); });
    if (result && (!out.untouched() || lock.readers() != 0 || lock.writer() != 0 || connection.has_input())) {
      return testing::AssertionFailure() << "something was written, held or sent";
    }
    return result;
  }

  testing::AssertionResult is_read(Hb_Node_Number node) {
    const testing::AssertionResult result = succeeds([&] { return read(node); });
    if (result && (lock.readers() != 0 || lock.writer() != 0 || connection.has_input())) {
      return testing::AssertionFailure() << "something is held or was sent";
    }
    return result;
  }
};

TEST_P(PublishedRoute, IsReadWithLengthAndHops) {
  publish_route(4, 7, 0xABCD, 0, some_hops());
  EXPECT_TRUE(is_read(4));
  EXPECT_EQ(0xABCD, out.length);
  EXPECT_EQ(some_hops(), out.hops());
}

TEST_P(PublishedRoute, HasElevenHopsOf16Bytes) {
  publish_route(4, 7, 1, 0, some_hops());
  EXPECT_TRUE(is_read(4));
  ASSERT_EQ(176U, sizeof out.route);
  ASSERT_EQ(11U, std::size(out.route.sr_address));
  for (size_t hop = 0; hop < 11; ++hop) {
    const Bytes address(reinterpret_cast<const char*>(&out.route.sr_address[hop]), sizeof out.route.sr_address[hop]);
    EXPECT_EQ(some_hops().substr(hop * 16, 16), address);
  }
}

TEST_P(PublishedRoute, IsFoundByItsNode) {
  for (size_t node = 0; node < 8; ++node) {
    publish_route(node, 7, static_cast<uint16_t>(100 + node), 0, Bytes(176, static_cast<char>('a' + node)));
  }
  for (Hb_Node_Number node = 0; node < 8; ++node) {  // also of nodes without adapters
    EXPECT_TRUE(is_read(node));
    EXPECT_EQ(100 + node, out.length);
    EXPECT_EQ(Bytes(176, static_cast<char>('a' + node)), out.hops());
  }
}

TEST_P(PublishedRoute, OfLengthZeroIsARouteToo) {
  publish_route(4, 7, 0, 0, Bytes(176, '\0'));
  EXPECT_TRUE(is_read(4));
  EXPECT_EQ(0, out.length);
}

TEST_P(PublishedRoute, OfANodeBeyondTheClusterIsInvalid) {
  for (const Hb_Node_Number node : std::initializer_list<Hb_Node_Number>{-1, 8, -32768, 32767}) {
    SystemCalls calls;
    EXPECT_TRUE(is_refused_with(4, node)) << node;
    EXPECT_TRUE(calls.of("semop").empty());
  }
}

TEST_P(PublishedRoute, ThatWasNeverPublishedIsNone) { EXPECT_TRUE(is_refused_with(6, 4)); }

TEST_P(PublishedRoute, OfAnotherConfigurationIsNone) {
  publish_route(4, 6, 1, 0, some_hops());
  EXPECT_TRUE(is_refused_with(6, 4));
  publish_route(4, 8, 1, 0, some_hops());
  EXPECT_TRUE(is_refused_with(6, 4));
  publish_route(4, 0x10007, 1, 0, some_hops());
  EXPECT_TRUE(is_refused_with(6, 4));
}

TEST_P(PublishedRoute, GoesStaleWithTheConfigurationAndComesBack) {
  publish_route(4, 7, 1, 0, some_hops());
  publish_configuration(8);
  EXPECT_TRUE(is_refused_with(6, 4));
  publish_route(4, 8, 1, 0, some_hops());
  EXPECT_TRUE(is_read(4));
}

TEST_P(PublishedRoute, UnderTheNumberZeroIsNone) {
  publish_configuration(0);
  publish_route(4, 0, 1, 0, some_hops());
  EXPECT_TRUE(is_refused_with(6, 4));
}

TEST_P(PublishedRoute, UnderTheLargestNumberIsRead) {
  publish_configuration(0xFFFFFFFFU);
  publish_route(4, 0xFFFFFFFFU, 1, 0, some_hops());
  EXPECT_TRUE(is_read(4));
}

TEST_P(PublishedRoute, OfAStaleConfigurationIsNoneAlsoWhenItIsNoIpRoute) {
  publish_route(4, 6, 1, 1, some_hops());
  EXPECT_TRUE(is_refused_with(6, 4));
}

TEST_P(PublishedRoute, NeedsPlaces) {
  publish_route(4, 7, 1, 0, some_hops());
  EXPECT_TRUE(fails_with(4, [] {
    unsigned short length = 0;
    return GetParam().call(4, nullptr, &length);
  }));
  EXPECT_TRUE(fails_with(4, [this] { return GetParam().call(4, &out.route, nullptr); }));
  EXPECT_TRUE(out.untouched());
  EXPECT_EQ(0, lock.readers());
}

TEST_P(PublishedRoute, IsNoneWhereNothingIsAttached) {
  publish_route(4, 7, 1, 0, some_hops());
  hb_detach_shared_memory();
  EXPECT_TRUE(is_refused_with(6, 4));
}

TEST_P(PublishedRoute, IsNoneWithoutTheConfigurationSegment) {
  publish_route(4, 7, 1, 0, some_hops());
  Hb_memory_configuration_data* const attached = std::exchange(data_for_client, nullptr);
  EXPECT_TRUE(is_refused_with(6, 4));
  data_for_client = attached;
}

// The lock.

TEST_P(PublishedRoute, IsReadBetweenEnteringAndLeavingOnce) {
  publish_route(4, 7, 1, 0, some_hops());
  SystemCalls calls;
  EXPECT_TRUE(is_read(4));
  const auto operation = [](uint16_t semaphore, int16_t change, int16_t flags) {
    return ByteBuilder().u16(semaphore).i16(change).i16(flags).bytes();
  };
  ASSERT_EQ(2U, calls.of("semop").size());
  EXPECT_EQ(daemon.semaphore_id(), calls.of("semop")[0].arguments[0]);
  EXPECT_EQ(operation(0, 1, SEM_UNDO) + operation(1, 0, 0), calls.of("semop")[0].bytes);
  EXPECT_EQ(daemon.semaphore_id(), calls.of("semop")[1].arguments[0]);
  EXPECT_EQ(operation(0, -1, SEM_UNDO), calls.of("semop")[1].bytes);
}

TEST_P(PublishedRoute, LeavesOtherReadersCounted) {
  lock.set_readers(2);
  publish_route(4, 7, 1, 0, some_hops());
  EXPECT_TRUE(succeeds([this] { return read(4); }));
  EXPECT_EQ(2, lock.readers());
  EXPECT_TRUE(fails_with(6, [this] { return read(3); }));
  EXPECT_EQ(2, lock.readers());
}

// Reads on a thread of its own while the writer holds the lock.
class Waiting_Read {
 public:
  template <typename Call>
  Waiting_Read(const Reader_Lock& lock, Call call) : lock_(lock) {
    lock_.set_writer(1);
    thread_ = std::thread([this, call] {
      id_ = gettid();
      result = call();
      is_done = true;
      pthread_testcancel();
    });
    lock_.await_waiting_reader();
  }
  ~Waiting_Read() { finish(); }
  Waiting_Read(const Waiting_Read&) = delete;
  Waiting_Read& operator=(const Waiting_Read&) = delete;

  pthread_t thread() { return thread_.native_handle(); }

  // Interrupts it with a signal, and waits until it has been interrupted.
  void interrupt(int signal) {
    ASSERT_EQ(0, pthread_kill(thread(), signal));
    Reader_Lock::await([this] { return has_no_pending_signal(); });
  }

  // The writer leaves.
  void finish() {
    if (thread_.joinable()) {
      lock_.set_writer(0);
      thread_.join();
    }
  }

  std::atomic<bool> is_done = false;
  std::atomic<Hb_Rc> result = Hb_Failure;

 private:
  bool has_no_pending_signal() const {
    std::ifstream status("/proc/self/task/" + std::to_string(id_) + "/status");
    std::string line;
    while (std::getline(status, line)) {
      if (line.starts_with("SigPnd:")) {
        return line.find_first_not_of("SigPnd:\t0") == std::string::npos;
      }
    }
    return false;
  }

  Reader_Lock lock_;
  std::thread thread_;
  std::atomic<pid_t> id_ = 0;
};

TEST_P(PublishedRoute, IsNotReadWhileTheDaemonWrites) {
  publish_route(4, 7, 1, 0, Bytes(176, 'o'));
  Waiting_Read waiting(lock, [this] { return read(4); });
  EXPECT_FALSE(waiting.is_done);
  EXPECT_EQ(0, lock.readers());  // the daemon does not wait for one that waits for it
  publish_configuration(8);
  publish_route(4, 8, 2, 0, Bytes(176, 'n'));
  EXPECT_FALSE(waiting.is_done);
  waiting.finish();
  EXPECT_EQ(Hb_Success, waiting.result);
  EXPECT_EQ(2, out.length);
  EXPECT_EQ(Bytes(176, 'n'), out.hops());
  EXPECT_EQ(0, lock.readers());
}

TEST_P(PublishedRoute, ThatIsGoneWhenTheDaemonHasWrittenIsNone) {
  publish_route(4, 7, 1, 0, some_hops());
  Waiting_Read waiting(lock, [this] { return read(4); });
  publish_configuration(0);
  waiting.finish();
  EXPECT_EQ(Hb_Failure, waiting.result);
  EXPECT_EQ(6, hb_get_errno());
  EXPECT_TRUE(out.untouched());
  EXPECT_EQ(0, lock.readers());
}

// The reader is made to wait where it leaves: what is published from then on is not seen any more.
TEST_P(PublishedRoute, IsCopiedAndComparedBeforeTheReaderLeaves) {
  publish_route(4, 7, 1, 0, Bytes(176, 'o'));
  std::atomic<Hb_Rc> result = Hb_Failure;
  std::thread reader([&] {
    SystemCalls calls;
    calls.script("semop", {hb_test::result(0)});  // it does not enter
    result = read(4);
  });
  lock.await_leaving_reader();
  publish_route(4, 8, 2, 1, Bytes(176, 'n'));
  lock.set_readers(1);
  reader.join();
  EXPECT_EQ(Hb_Success, result);
  EXPECT_EQ(1, out.length);
  EXPECT_EQ(Bytes(176, 'o'), out.hops());
  EXPECT_EQ(0, lock.readers());
}

TEST_P(PublishedRoute, IsComparedWithTheConfigurationBeforeTheReaderLeaves) {
  publish_route(4, 7, 1, 0, some_hops());
  std::atomic<Hb_Rc> result = Hb_Failure;
  std::thread reader([&] {
    SystemCalls calls;
    calls.script("semop", {hb_test::result(0)});
    result = read(4);
  });
  lock.await_leaving_reader();
  publish_configuration(8);
  lock.set_readers(1);
  reader.join();
  EXPECT_EQ(Hb_Success, result);
  EXPECT_EQ(some_hops(), out.hops());
}

TEST_P(PublishedRoute, HoldsNothingWhenItsReaderIsCancelledWhileItWaits) {
  publish_route(4, 7, 1, 0, some_hops());
  Waiting_Read waiting(lock, [this] { return read(4); });
  ASSERT_EQ(0, pthread_cancel(waiting.thread()));
  lock.await_waiting_reader();
  waiting.finish();
  EXPECT_TRUE(waiting.is_done);  // it was cancelled behind the read
  EXPECT_EQ(Hb_Success, waiting.result);
  EXPECT_EQ(0, lock.readers());
}

TEST_P(PublishedRoute, IsAwaitedFurtherAfterASignal) {
  struct sigaction action = {};
  action.sa_handler = [](int) {};
  ASSERT_EQ(0, sigaction(SIGUSR1, &action, nullptr));
  publish_route(4, 7, 1, 0, some_hops());
  Waiting_Read waiting(lock, [this] { return read(4); });
  for (int count = 1; count <= 3; ++count) {
    waiting.interrupt(SIGUSR1);
    lock.await_waiting_reader();
    EXPECT_FALSE(waiting.is_done);
    EXPECT_EQ(0, lock.readers());
  }
  waiting.finish();
  EXPECT_EQ(Hb_Success, waiting.result);
  EXPECT_EQ(0, lock.readers());
}

TEST_P(PublishedRoute, IsLeftAlsoWhenASignalComesInBetween) {
  publish_route(4, 7, 1, 0, some_hops());
  SystemCalls calls;
  calls.script("semop", {fail(EINTR), fail(EINTR), pass(), fail(EINTR), pass()});
  EXPECT_TRUE(is_read(4));
  EXPECT_EQ(5U, calls.of("semop").size());
}

TEST_P(PublishedRoute, IsReadWithoutALockWhenTheSemaphoresAreGone) {
  publish_route(4, 7, 5, 0, some_hops());
  daemon.remove_semaphores();
  EXPECT_TRUE(succeeds([this] { return read(4); }));
  EXPECT_EQ(5, out.length);
  EXPECT_EQ(some_hops(), out.hops());
}

TEST_P(PublishedRoute, DoesNotWaitForSemaphoresThatWereRemoved) {
  publish_route(4, 7, 5, 0, some_hops());
  lock.set_writer(1);
  std::atomic<Hb_Rc> result = Hb_Failure;
  std::thread thread([&] { result = read(4); });
  lock.await_waiting_reader();
  daemon.remove_semaphores();
  thread.join();
  EXPECT_EQ(Hb_Success, result);
  EXPECT_EQ(5, out.length);
}

INSTANTIATE_TEST_SUITE_P(Routes, PublishedRoute, testing::ValuesIn(reads), name_of_read);

// A segment with fewer entries than the cluster has nodes.
class RouteOfAShortSegment : public PublishedRoute {
 protected:
  RouteOfAShortSegment() : PublishedRoute(3) {}
};

TEST_P(RouteOfAShortSegment, IsReadUpToTheLastEntry) {
  publish_route(2, 7, 1, 0, some_hops());
  EXPECT_TRUE(is_read(2));
  EXPECT_EQ(some_hops(), out.hops());
}

TEST_P(RouteOfAShortSegment, IsNoneBeyondTheLastEntry) {
  // What looks like a route lies in the rest of the segment's last page.
  publish_route(3, 7, 1, 0, some_hops());
  publish_route(7, 7, 1, 0, some_hops());
  EXPECT_TRUE(is_refused_with(6, 3));
  EXPECT_TRUE(is_refused_with(6, 7));
}

TEST_P(RouteOfAShortSegment, IsNoneBeyondTheSegmentWhateverTheDaemonCountsNow) {
  publish_route(3, 7, 1, 0, some_hops());
  daemon.write_segment(Segment::configuration, 4, ByteBuilder().u32(8).bytes());
  EXPECT_TRUE(is_refused_with(6, 3));
}

INSTANTIATE_TEST_SUITE_P(Routes, RouteOfAShortSegment, testing::ValuesIn(reads), name_of_read);

// What a program has put in the place of the two segments.
class RouteOfTheProgram : public PublishedRoute {
 protected:
  RouteOfTheProgram() : attached_header(data_for_client), attached_routes_segment(shared_route_info) {
    data_for_client = &header;
    shared_route_info = routes;
    routes[2] = {7, 9, 0, {}};
    routes[3] = {7, 9, 0, {}};
  }
  ~RouteOfTheProgram() override {
    data_for_client = attached_header;
    shared_route_info = attached_routes_segment;
  }

  Hb_memory_configuration_data header = {.sequence_number = 7, .number_of_nodes = 3, .number_of_adapters = 0};
  Hb_route_sequence routes[8] = {};
  Hb_memory_configuration_data* attached_header;
  Hb_route_sequence* attached_routes_segment;
};

TEST_P(RouteOfTheProgram, IsReadUpToTheNumberOfItsHeader) {
  EXPECT_TRUE(is_read(2));
  EXPECT_EQ(9, out.length);
  out = Route_Outputs();
  EXPECT_TRUE(is_refused_with(6, 3));
}

INSTANTIATE_TEST_SUITE_P(Routes, RouteOfTheProgram, testing::ValuesIn(reads), name_of_read);

// Routes that are no IP routes.

TEST_F(Routes, ThatAreNoIpRoutesAreReadAsSuchOnly) {
  for (const uint16_t nonip : std::initializer_list<uint16_t>{1, 2, 256, 0xFFFF}) {
    out = Route_Outputs();
    publish_route(4, 7, 9, nonip, some_hops());
    EXPECT_TRUE(fails_with(49, [this] { return hb_read_ip_route(4, &out.route, &out.length); })) << nonip;
    EXPECT_TRUE(out.untouched());
    EXPECT_EQ(0, lock.readers());
    EXPECT_TRUE(succeeds([this] { return hb_read_route(4, &out.route, &out.length); })) << nonip;
    EXPECT_EQ(9, out.length);
    EXPECT_EQ(some_hops(), out.hops());
    EXPECT_EQ(0, lock.readers());
  }
}

// A process that dies inside.

TEST_F(Routes, AreHeldByNobodyWhenTheReaderIsKilled) {
  const pid_t reader = fork();
  if (reader == 0) {
    const Reader_Hold hold;
    for (;;) {
      pause();
    }
  }
  ASSERT_GT(reader, 0);
  Reader_Lock::await([this] { return lock.readers() == 1; });
  ASSERT_EQ(0, kill(reader, SIGKILL));
  ASSERT_EQ(reader, waitpid(reader, nullptr, 0));
  EXPECT_EQ(0, lock.readers());
  EXPECT_EQ(0, lock.writer());
}

TEST_F(Routes, AreHeldByEachReaderOnItsOwn) {
  {
    const Reader_Hold first;
    const Reader_Hold second;
    EXPECT_EQ(2, lock.readers());
    publish_route(4, 7, 1, 0, some_hops());
    EXPECT_EQ(Hb_Success, hb_read_route(4, &out.route, &out.length));
    EXPECT_EQ(2, lock.readers());
  }
  EXPECT_EQ(0, lock.readers());
}

TEST_F(Routes, KeepTheirReaderFromBeingCancelledWhileHeld) {
  int inside = -1;
  int outside = -1;
  {
    const Reader_Hold hold;
    pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, &inside);
  }
  pthread_setcancelstate(PTHREAD_CANCEL_ENABLE, &outside);
  EXPECT_EQ(PTHREAD_CANCEL_DISABLE, inside);
  EXPECT_EQ(PTHREAD_CANCEL_ENABLE, outside);
}

TEST_F(Routes, LeaveACancelStateThatTheCallerDisabled) {
  int before = -1;
  int after = -1;
  pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, &before);
  EXPECT_EQ(Hb_Failure, hb_read_route(4, &out.route, &out.length));
  pthread_setcancelstate(before, &after);
  EXPECT_EQ(PTHREAD_CANCEL_DISABLE, after);
}

}  // namespace
}  // namespace hb_test
