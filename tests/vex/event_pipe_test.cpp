// The byte that wakes a caller.
#include <csignal>

#include "VEX_EVMONEventPipeHandler.h"
#include "support/process_state.h"
#include "tests_of_the_queue.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class EventPipe : public EventQueue {
 protected:
  EventPipe() { pthread_sigmask(SIG_BLOCK, nullptr, &blocked_before_); }
  ~EventPipe() override {
    std::signal(SIGPIPE, SIG_IGN);  // drops one that waits
    pthread_sigmask(SIG_SETMASK, &blocked_before_, nullptr);
    std::signal(SIGPIPE, SIG_DFL);
  }

  // An event pipe with that many waiting events.
  void make_pipe(int events) {
    ends = new_pipe();
    event_pipe_handler_p = new EVMONEventPipeHandler(ends.fds, nullptr);
    for (int i = 0; i < events; ++i) {
      queue(Hb_Node_Group, 1);
    }
    start_tracing();
  }

  void write_where_nobody_reads() {
    make_pipe(1);
    close(ends.read());
    EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Failure);
    EXPECT_EQ(errno, EPIPE);
  }

  static void block(int signal) {
    sigset_t signals;
    sigemptyset(&signals);
    sigaddset(&signals, signal);
    pthread_sigmask(SIG_BLOCK, &signals, nullptr);
  }
  static bool is_blocked(int signal) {
    sigset_t blocked;
    pthread_sigmask(SIG_BLOCK, nullptr, &blocked);
    return sigismember(&blocked, signal) == 1;
  }
  static bool waits(int signal) {
    sigset_t waiting;
    sigpending(&waiting);
    return sigismember(&waiting, signal) == 1;
  }

  Ends ends = {{-1, -1}};

 private:
  sigset_t blocked_before_;
};

TEST_F(EventPipe, IsNotWrittenForAnEmptyQueueWhoseNumberingStartsAnew) {
  event_sequence = 5;
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Success);
  EXPECT_EQ(event_sequence, 0);
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(EventPipe, GetsNoByteForAnEmptyQueue) {
  make_pipe(0);
  event_sequence = 5;
  QueueMutexCalls calls;
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Success);
  EXPECT_EQ(event_sequence, 0);
  EXPECT_TRUE(calls.of("write").empty());
  EXPECT_EQ(waiting_bytes(ends.read()), 0);
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(EventPipe, IsMissedWhenEventsWait) {
  queue(Hb_Node_Group, 1);
  set_hb_errno(0);
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 90);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 245"));
  EXPECT_EQ(VEX_event_queue_is_empty(), Hb_False);
  EXPECT_EQ(event_sequence, 1);
  EXPECT_TRUE(is_mutex_free());
}

TEST_F(EventPipe, IsMissedSilentlyWithoutInfoTracing) {
  queue(Hb_Node_Group, 1);
  platform_double().set_levels({1, 0, 1});
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 90);
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(EventPipe, GetsOneByteHoweverManyEventsWait) {
  make_pipe(5);
  QueueMutexCalls calls;
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Success);
  ASSERT_EQ(calls.of("write").size(), 1U);
  EXPECT_EQ(calls.of("write")[0].arguments[0], ends.write());
  EXPECT_EQ(calls.of("write")[0].bytes, "\x01");
  EXPECT_EQ(waiting_bytes(ends.read()), 1);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 59"));
  EXPECT_EQ(event_sequence, 5);
  EXPECT_TRUE(is_mutex_free());
}

TEST_F(EventPipe, GetsAByteOfEachNotification) {
  make_pipe(1);
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Success);
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Success);
  EXPECT_EQ(waiting_bytes(ends.read()), 2);
}

TEST_F(EventPipe, LeavesTheErrorNumberOfAnEarlierFailure) {
  make_pipe(1);
  set_hb_errno(4);
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Success);
  EXPECT_EQ(hb_get_errno(), 4);
}

TEST_F(EventPipe, TellsWhenItCannotBeWritten) {
  make_pipe(1);
  QueueMutexCalls calls;
  calls.script("write", {fail(EIO)});
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 59);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 58: -1 5"));
  EXPECT_EQ(VEX_event_queue_is_empty(), Hb_False);
  EXPECT_TRUE(is_mutex_free());
}

TEST_F(EventPipe, TakesAWriteOfNothingForAFailure) {
  make_pipe(1);
  QueueMutexCalls calls;
  calls.script("write", {{false, 0, ENOSPC, 0, {}}});
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 59);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 58: 0 28"));
}

// Neither tracing nor the release of the mutex hides why the write failed.
TEST_F(EventPipe, KeepsTheErrnoOfTheWriteThatFailed) {
  make_pipe(1);
  platform_double().errno_after_trace = EXDEV;
  QueueMutexCalls calls;
  calls.script("write", {fail(EIO)});
  calls.script("pthread_mutex_unlock", {{true, 0, EDOM, SIZE_MAX, {}}});
  errno = 0;
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Failure);
  EXPECT_EQ(errno, EIO);
  EXPECT_EQ(calls.of("pthread_mutex_unlock").size(), 1U);
}

TEST_F(EventPipe, IsWrittenWhileTheMutexIsHeld) {
  make_pipe(1);
  QueueMutexCalls calls;
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Success);
  EXPECT_THAT(calls.sequence(), ElementsAre("pthread_mutex_lock", "write", "pthread_mutex_unlock"));
}

TEST_F(EventPipe, HoldsNobodyUpWhenItIsFull) {
  scripted_cluster().appear();
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  queue(Hb_Node_Group, 1);
  int bytes = 0;
  while (VEX_write_to_event_pipe() == Hb_Success) {
    ++bytes;
  }
  EXPECT_EQ(errno, EAGAIN);
  EXPECT_EQ(hb_get_errno(), 59);
  EXPECT_EQ(waiting_bytes(event_pipe_handler_p->getFileDescriptor()), bytes);
  EXPECT_GT(bytes, 0);
}

TEST_F(EventPipe, FailsWhenItsWriteEndWasClosedBehindTheLibrary) {
  make_pipe(1);
  close(ends.write());
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Failure);
  EXPECT_EQ(errno, EBADF);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 58: -1 9"));
}

// Nobody reads, and nobody is killed for it: the program's handling of the signal is its own.
TEST_F(EventPipe, FailsWithoutASignalWhenItsReadEndWasClosed) {
  std::signal(SIGPIPE, SIG_DFL);
  write_where_nobody_reads();
  EXPECT_EQ(hb_get_errno(), 59);
  EXPECT_THAT(trace_lines(), ElementsAre("Info 58: -1 32"));
  EXPECT_FALSE(waits(SIGPIPE));
  EXPECT_FALSE(is_blocked(SIGPIPE));
  EXPECT_EQ(std::signal(SIGPIPE, SIG_DFL), SIG_DFL);
  EXPECT_EQ(VEX_event_queue_is_empty(), Hb_False);
  EXPECT_TRUE(is_mutex_free());
}

TEST_F(EventPipe, CallsNoSignalHandlerWhenItsReadEndWasClosed) {
  static volatile std::sig_atomic_t calls = 0;
  std::signal(SIGPIPE, [](int) { calls = calls + 1; });
  write_where_nobody_reads();
  EXPECT_EQ(calls, 0);
  raise(SIGPIPE);
  EXPECT_EQ(calls, 1);
}

TEST_F(EventPipe, LeavesNoSignalToAProgramThatHasItBlocked) {
  block(SIGPIPE);
  write_where_nobody_reads();
  EXPECT_FALSE(waits(SIGPIPE));
  EXPECT_TRUE(is_blocked(SIGPIPE));
}

TEST_F(EventPipe, LeavesASignalThatWaitedBefore) {
  block(SIGPIPE);
  raise(SIGPIPE);
  write_where_nobody_reads();
  EXPECT_TRUE(waits(SIGPIPE));
  EXPECT_TRUE(is_blocked(SIGPIPE));
}

TEST_F(EventPipe, BlocksTheSignalForTheWriteAlone) {
  make_pipe(1);
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Success);
  EXPECT_FALSE(is_blocked(SIGPIPE));
  block(SIGPIPE);
  EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Success);
  EXPECT_TRUE(is_blocked(SIGPIPE));
}

// Three notifications wrote a byte each; every delivery but the last writes one more.
TEST_F(EventPipe, KeepsSurplusBytesOfWhichEachReportsTheEmptyEvent) {
  make_pipe(0);
  set_name(nodeEventSubscriptionName, "nodes");
  for (int i = 0; i < 3; ++i) {
    queue(Hb_Node_Group, 1);
    ASSERT_EQ(VEX_write_to_event_pipe(), Hb_Success);
  }
  const int bytes_behind_deliveries[] = {3, 3, 2};
  for (const int bytes : bytes_behind_deliveries) {
    Handler_Outputs out;
    EXPECT_EQ(out.call(*event_pipe_handler_p), Hb_Success);
    EXPECT_EQ(out.events, 1);
    EXPECT_EQ(waiting_bytes(ends.read()), bytes);
  }
  EXPECT_EQ(event_sequence, 0);
  for (const int bytes : {1, 0, 0}) {
    Handler_Outputs out;
    EXPECT_EQ(out.call(*event_pipe_handler_p), Hb_Success);
    EXPECT_TRUE(out.is_empty_event());
    EXPECT_EQ(waiting_bytes(ends.read()), bytes);
  }
}

}  // namespace
}  // namespace hb_test
