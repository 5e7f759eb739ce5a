// The queue between threads, and threads that are cancelled while they have its mutex.
#include <fcntl.h>
#include <poll.h>

#include <atomic>
#include <map>
#include <set>
#include <thread>

#include "VEX_EVMONEventPipeHandler.h"
#include "tests_of_the_queue.h"

namespace {

// Whether this thread looks for its cancellation before it releases a mutex.
thread_local bool is_cancelled_inside = false;

}  // namespace

extern "C" {
int __real_pthread_mutex_unlock(pthread_mutex_t* mutex);
int __wrap_pthread_mutex_unlock(pthread_mutex_t* mutex);
int __wrap_pthread_mutex_unlock(pthread_mutex_t* mutex) {
  if (is_cancelled_inside) {
    is_cancelled_inside = false;
    pthread_testcancel();
  }
  return __real_pthread_mutex_unlock(mutex);
}
}

namespace hb_test {
namespace {

constexpr int appenders = 4;
constexpr int events_of_each = 100;

// The event says who appended it, and as which of its own.
void append_many(uint16_t appender, void (*behind_each)()) {
  for (int i = 0; i < events_of_each; ++i) {
    Hb_VEX_Event* event = VEX_new_event(Hb_Node_Group);
    event->node_num = appender;
    event->group.Hb_events = i;
    VEX_add_event_at_end(event);
    behind_each();
  }
}

class QueueThreads : public EventQueue {
 protected:
  QueueThreads() { set_levels(0); }  // the doubles belong to one thread

  void start_appenders(void (*behind_each)()) {
    for (uint16_t appender = 0; appender < appenders; ++appender) {
      threads.emplace_back(append_many, appender, behind_each);
    }
  }

  void join() {
    for (std::thread& thread : threads) {
      thread.join();
    }
  }

  std::vector<std::thread> threads;
};

void do_nothing() {}

TEST_F(QueueThreads, GiveEveryEventANumberOfItsOwnAndKeepTheirOrder) {
  start_appenders(do_nothing);
  join();
  std::map<int, int> next_of;
  int number = 0;
  for (std::unique_ptr<Hb_VEX_Event> event = take(); event != nullptr; event = take()) {
    EXPECT_EQ(event->sequence_num, number++);
    EXPECT_EQ(event->group.Hb_events, next_of[event->node_num]++);
  }
  EXPECT_EQ(number, appenders * events_of_each);
}

TEST_F(QueueThreads, TakeEachEventOnce) {
  std::atomic<int> taken = 0;
  start_appenders(do_nothing);
  for (int taker = 0; taker < 2; ++taker) {
    threads.emplace_back([&taken] {
      while (taken < appenders * events_of_each) {
        if (take() != nullptr) {
          ++taken;
        } else {
          std::this_thread::yield();
        }
      }
    });
  }
  join();
  EXPECT_EQ(taken, appenders * events_of_each);
  EXPECT_EQ(VEX_event_queue_is_empty(), Hb_True);
  EXPECT_EQ(event_sequence, appenders * events_of_each);
}

TEST_F(QueueThreads, TakeEachNumberOnce) {
  std::vector<std::set<int>> numbers(appenders);
  for (std::set<int>& own : numbers) {
    threads.emplace_back([&own] {
      for (int i = 0; i < events_of_each; ++i) {
        own.insert(hb_vex_next_event_sequence());
      }
    });
  }
  join();
  std::set<int> all;
  for (const std::set<int>& own : numbers) {
    all.insert(own.begin(), own.end());
  }
  EXPECT_EQ(all.size(), static_cast<size_t>(appenders * events_of_each));
  EXPECT_EQ(*all.rbegin(), appenders * events_of_each - 1);
}

// One thread polls and takes events; it is never left asleep while one waits.
TEST_F(QueueThreads, AreWokenForEveryEvent) {
  Ends ends = new_pipe();
  event_pipe_handler_p = new EVMONEventPipeHandler(ends.fds, nullptr);
  set_name(nodeEventSubscriptionName, "nodes");
  start_appenders([] { EXPECT_EQ(VEX_write_to_event_pipe(), Hb_Success); });
  Handler_Outputs out;
  pollfd polled = {ends.read(), POLLIN, 0};
  for (int delivered = 0; delivered < appenders * events_of_each;) {
    ASSERT_EQ(poll(&polled, 1, 30000), 1) << "nobody wakes the caller for event " << delivered;
    ASSERT_EQ(out.call(*event_pipe_handler_p), Hb_Success);
    delivered += std::strcmp(out.name, "nodes") == 0 ? 1 : 0;
  }
  join();
  EXPECT_EQ(VEX_event_queue_is_empty(), Hb_True);
}

struct Section {
  const char* description;
  void (*run)();
};

class Cancelled : public EventQueue {
 protected:
  Cancelled() {
    set_levels(0);
    queue(Hb_Node_Group, 1);
  }

  // Runs the section on a thread that is cancelled before it releases the mutex. Yields whether it was.
  static bool run_cancelled(void (*section)()) {
    pthread_t thread;
    if (pthread_create(&thread, nullptr, be_cancelled, reinterpret_cast<void*>(section)) != 0) {
      return false;
    }
    void* result = nullptr;
    return pthread_join(thread, &result) == 0 && result == PTHREAD_CANCELED;
  }

 private:
  static void* be_cancelled(void* section) {
    is_cancelled_inside = true;
    pthread_cancel(pthread_self());
    reinterpret_cast<void (*)()>(section)();
    return nullptr;
  }
};

class CancelledInside : public Cancelled, public testing::WithParamInterface<Section> {};

TEST_P(CancelledInside, LeavesTheMutexFreeAndTheQueueUsable) {
  Ends ends = new_pipe();
  event_pipe_handler_p = new EVMONEventPipeHandler(ends.fds, nullptr);
  EXPECT_TRUE(run_cancelled(GetParam().run));
  EXPECT_TRUE(is_mutex_free());
  queue(Hb_Node_Group, 77);
  Hb_Events last = 0;
  for (std::unique_ptr<Hb_VEX_Event> event = take(); event != nullptr; event = take()) {
    last = event->group.Hb_events;
  }
  EXPECT_EQ(last, 77);
}

INSTANTIATE_TEST_SUITE_P(Sections, CancelledInside,
                         testing::Values(Section{"Look", [] { VEX_event_queue_is_empty(); }},
                                         Section{"Append", [] { VEX_add_event_at_end(VEX_new_event(Hb_Node_Group)); }},
                                         Section{"Show", [] { VEX_display_event_list(); }},
                                         Section{"Wake", [] { VEX_write_to_event_pipe(); }},
                                         Section{"Number", [] { hb_vex_next_event_sequence(); }}),
                         [](const auto& test) { return test.param.description; });

// What was unlinked by then is lost with the thread that was to have it.
class CancelledWhileTaking : public Cancelled {};

TEST_F(CancelledWhileTaking, LeavesTheMutexFreeAndTheOtherEventsQueued) {
  const std::unique_ptr<Hb_VEX_Event> lost(event_queue_list);
  const Hb_VEX_Event* second = queue(Hb_Node_Group, 2);
  EXPECT_TRUE(run_cancelled([] { VEX_get_event_from_head(); }));
  EXPECT_TRUE(is_mutex_free());
  EXPECT_EQ(event_queue_list, second);
}

// Nobody reads the pipe, so the write itself is where the thread is cancelled.
class CancelledWhileWriting : public Cancelled {};

TEST_F(CancelledWhileWriting, LeavesTheMutexFreeAndTheEventQueued) {
  Ends ends = new_pipe();
  event_pipe_handler_p = new EVMONEventPipeHandler(ends.fds, nullptr);
  fcntl(ends.write(), F_SETFL, O_NONBLOCK);
  while (write(ends.write(), "\x01", 1) == 1) {
  }
  fcntl(ends.write(), F_SETFL, 0);
  EXPECT_TRUE(run_cancelled([] { VEX_write_to_event_pipe(); }));
  EXPECT_TRUE(is_mutex_free());
  EXPECT_EQ(VEX_event_queue_is_empty(), Hb_False);
}

}  // namespace
}  // namespace hb_test
