// Readers and writers of the published routes that are killed inside the lock: it stays free, and no reader takes a
// route that was half written.
#include <gtest/gtest.h>
#include <sched.h>
#include <sys/sem.h>
#include <sys/shm.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <random>

#include "child_process.h"
#include "hb_client/route.h"
#include "queries/test_cluster.h"
#include "sealed_route.h"
#include "support/running_client.h"

namespace hb_test {
namespace {

constexpr int reader_kills = 10000;
constexpr int writer_kills = 1000;
constexpr uint32_t nodes = 8;
constexpr int readers_semaphore = 0;
constexpr int writer_semaphore = 1;

// What the processes of a test tell each other.
struct Progress {
  std::atomic<uint64_t> reads = 0;
  std::atomic<uint64_t> accepted = 0;
  std::atomic<uint64_t> torn = 0;
  std::atomic<uint64_t> written = 0;
  std::atomic<bool> ends = false;
};

// The daemon's side of the lock and of the two segments, by the numbers.
class Writer {
 public:
  explicit Writer(FakeDaemon& daemon)
      : semaphores_(daemon.semaphore_id()),
        configuration_(attach(daemon.segment_id(Segment::configuration))),
        routes_(attach(daemon.segment_id(Segment::route))) {}

  // Rewrites all routes so many times inside the lock.
  void publish(int times) {
    operate(writer_semaphore, 1, SEM_UNDO);
    operate(readers_semaphore, 0, 0);
    for (int i = 0; i < times; ++i) rewrite();
    operate(writer_semaphore, -1, SEM_UNDO);
  }

 private:
  static uint32_t* attach(int id) { return static_cast<uint32_t*>(shmat(id, nullptr, 0)); }

  void operate(unsigned short semaphore, short change, short flags) const {
    sembuf operation = {semaphore, change, flags};
    while (semop(semaphores_, &operation, 1) != 0 && errno == EINTR) {
    }
  }

  // The number goes first and comes back last: what lies between is valid to nobody.
  void rewrite() {
    set_number(0);
    const uint32_t number = ++number_ == 0 ? ++number_ : number_;
    for (uint32_t node = 0; node < nodes; ++node) {
      uint32_t words[44];
      for (uint32_t& word : words) word = (seed_ = seed_ * 1664525 + 1013904223);
      seal(words);
      volatile uint32_t* route = routes_ + node * 46;
      route[0] = number;
      route[1] = 36;
      for (size_t i = 0; i < 44; ++i) route[2 + i] = words[i];
    }
    set_number(number);
  }

  void set_number(uint32_t number) const { std::atomic_ref(*configuration_).exchange(number); }

  int semaphores_;
  uint32_t* configuration_;
  volatile uint32_t* routes_;
  uint32_t number_ = 0;
  uint32_t seed_ = static_cast<uint32_t>(getpid());
};

class KilledProcesses : public RunningClient {
 protected:
  KilledProcesses() : RunningClient(Publication::for_nodes(nodes), sparse_cluster()) {}

  int semaphore(int number) { return semctl(daemon.semaphore_id(), number, GETVAL); }

  // Until it is told to end; every route that is taken has to be whole.
  void read_routes() {
    Hb_Source_Route route;
    unsigned short length = 0;
    for (Hb_Node_Number node = 0; !progress->ends; node = static_cast<Hb_Node_Number>((node + 1) % int{nodes})) {
      if (hb_read_route(node, &route, &length) == Hb_Success) {
        progress->accepted++;
        if (!is_sealed(route) || length != 36) progress->torn++;
      }
      progress->reads++;
    }
  }

  // Until it is told to end; a read is let through before the next writing.
  void write_routes(int times) {
    Writer writer(daemon);
    while (!progress->ends) {
      const uint64_t before = progress->reads;
      writer.publish(times);
      progress->written++;
      while (progress->reads == before && !progress->ends) sched_yield();
    }
  }

  // Up to some tens of microseconds, in which a child gets to any place of its loop.
  void pass_a_moment() { pass(random_() % 20000); }

  void expect_free_lock() {
    EXPECT_EQ(0, semaphore(readers_semaphore));
    EXPECT_EQ(0, semaphore(writer_semaphore));
  }

  Shared<Progress> progress;

 private:
  std::minstd_rand random_{4711};
};

TEST_F(KilledProcesses, ReadersLeaveNoHoldAndNoTornRouteIsTaken) {
  Child writer([this] { write_routes(1); });
  await_above(progress->written, 0);
  for (int i = 0; i < reader_kills; ++i) {
    const uint64_t before = progress->reads;
    Child reader([this] { read_routes(); });
    await_above(progress->reads, before);
    pass_a_moment();
    reader.kill_and_wait();
  }
  progress->ends = true;
  EXPECT_EQ(0, writer.wait());
  expect_free_lock();
  EXPECT_EQ(0U, progress->torn);
  EXPECT_GE(progress->reads, uint64_t{reader_kills});
  EXPECT_GT(progress->accepted, 0U);
}

TEST_F(KilledProcesses, WritersLeaveTheLockFreeAndNoHalfWrittenRouteIsTaken) {
  Child reader([this] { read_routes(); });
  int kills = 0;
  while (kills < writer_kills) {
    const uint64_t before = progress->written;
    Child writer([this] { write_routes(20); });
    await_above(progress->written, before);
    pass_a_moment();
    writer.stop();
    kills += semaphore(writer_semaphore);
    writer.kill_and_wait();
    EXPECT_EQ(0, semaphore(writer_semaphore));
  }
  const uint64_t reads = progress->reads;
  await_above(progress->reads, reads + nodes);
  progress->ends = true;
  EXPECT_EQ(0, reader.wait());
  expect_free_lock();
  EXPECT_EQ(0U, progress->torn);
  EXPECT_GT(progress->accepted, 0U);
}

}  // namespace
}  // namespace hb_test
