// The shared library leaves the process that uses it as it was: no thread, no signal disposition, no descriptor.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <cstdlib>
#include <string>
#include <thread>
#include <vector>

#include "hb_client.h"
#include "support/fake_daemon.h"
#include "support/process_state.h"

namespace hb_test {
namespace {

struct Disposition {
  void* handler;
  int flags;
  bool operator==(const Disposition&) const = default;
};

std::vector<Disposition> signal_dispositions() {
  std::vector<Disposition> dispositions;
  for (int signal = 1; signal < NSIG; ++signal) {
    struct sigaction action = {};
    if (sigaction(signal, nullptr, &action) == 0) {
      dispositions.push_back({reinterpret_cast<void*>(action.sa_handler), action.sa_flags});
    }
  }
  return dispositions;
}

std::string blocked_signals() {
  sigset_t mask;
  sigemptyset(&mask);
  sigprocmask(SIG_SETMASK, nullptr, &mask);
  std::string blocked;
  for (int signal = 1; signal < NSIG; ++signal) {
    blocked += sigismember(&mask, signal) == 1 ? '1' : '0';
  }
  return blocked;
}

class QuietLibrary : public testing::Test {
 protected:
  // A whole cycle; what holds while the client runs is checked by the function.
  template <typename Check>
  void start_and_stop(Check check) {
    FakeDaemon daemon;
    daemon.serve_configuration(configuration_answer(small_cluster()));
    ASSERT_EQ(hb_init(), Hb_Success);
    const DaemonConnection connection = daemon.take_connection();
    int* descriptors = nullptr;
    int count = 0;
    ASSERT_EQ(hb_get_file_descriptor_array(&descriptors, &count), Hb_Success);
    check();
    hb_free_file_descriptor_array(descriptors);
    ASSERT_EQ(hb_terminate(), Hb_Success);
  }
};

// A thread that was joined is listed until the system has cleared it away.
template <typename Condition>
bool comes_true(Condition condition) {
  const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(5);
  while (!condition() && std::chrono::steady_clock::now() < deadline) {
    std::this_thread::yield();
  }
  return condition();
}

// Threads of the process before the library runs. A sanitizer starts its own with the first thread of ours.
int threads_at_rest() {
  pid_t thread = 0;
  std::thread([&thread] { thread = gettid(); }).join();
  const std::string entry = "/proc/self/task/" + std::to_string(thread);
  EXPECT_TRUE(comes_true([&entry] { return access(entry.c_str(), F_OK) != 0; }));
  return running_threads();
}

TEST_F(QuietLibrary, StartsNoThread) {
  const int threads = threads_at_rest();
  const auto no_more_run = [threads] { return running_threads() == threads; };
  start_and_stop([&no_more_run] { EXPECT_TRUE(comes_true(no_more_run)); });
  EXPECT_TRUE(comes_true(no_more_run));
}

TEST_F(QuietLibrary, ChangesNoSignalDisposition) {
  const std::vector<Disposition> before = signal_dispositions();
  ASSERT_GT(before.size(), 30U);
  start_and_stop([&before] { EXPECT_EQ(signal_dispositions(), before); });
  EXPECT_EQ(signal_dispositions(), before);
}

TEST_F(QuietLibrary, ChangesNoSignalMask) {
  const std::string before = blocked_signals();
  start_and_stop([&before] { EXPECT_EQ(blocked_signals(), before); });
  EXPECT_EQ(blocked_signals(), before);
}

TEST_F(QuietLibrary, HoldsNothingAfterItsStop) {
  start_and_stop([] {});  // whatever the platform keeps from the first start on
  const int descriptors = open_descriptors();
  const int segments = attached_segments();
  start_and_stop([segments] { EXPECT_EQ(attached_segments(), segments + 3); });
  EXPECT_EQ(open_descriptors(), descriptors);
  EXPECT_EQ(attached_segments(), segments);
}

TEST_F(QuietLibrary, LeavesTheFileModeMaskAlone) {
  const mode_t before = umask(027);
  start_and_stop([] {});
  EXPECT_EQ(umask(before), 027U);
}

TEST_F(QuietLibrary, TalksThroughItsSharedFormAsThroughItsStaticOne) {
  FakeDaemon daemon;
  daemon.serve_configuration(configuration_answer(small_cluster().local_node(1)));
  Hb_Node_Number node = -7;
  ASSERT_EQ(hb_get_my_node_number(&node), Hb_Success);  // starts the client
  daemon.join();
  EXPECT_EQ(node, 1);
  hb_exit();
}

TEST_F(QuietLibrary, FailsWithItsNumberWhereThereIsNoDaemon) {
  FakeDaemon daemon;
  daemon.stop_listening();
  int nodes = -7;
  EXPECT_EQ(hb_get_number_of_configured_nodes(&nodes), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), HB_ECONNECT);
  EXPECT_EQ(nodes, -7);
}

TEST_F(QuietLibrary, StartsInDaemonMode) { EXPECT_EQ(IsVEX, Hb_False); }

// The mode that a program sets is the mode that the library reads: no connection is tried, so no error number is set.
TEST(ModeFlag, OfTheProgramIsThatOfTheLibrary) {
  setenv("HB_SERVER_SOCKET", "/nonexistent/socket", 1);
  IsVEX = Hb_True;
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 0);
  IsVEX = Hb_False;
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 15);
}

}  // namespace
}  // namespace hb_test
