// Reading a route from the daemon's shared memory, alone and while the daemon rewrites it.
#include <sched.h>
#include <sys/ipc.h>
#include <sys/sem.h>
#include <sys/shm.h>

#include <array>
#include <atomic>
#include <chrono>
#include <cstring>
#include <stdexcept>
#include <string>
#include <thread>
#include <utility>

#include "client.h"
#include "hb_protocol/shared_memory.h"
#include "rows.h"

namespace bench {
namespace {

constexpr size_t batch = 200;
constexpr size_t timed_reads = 500000;
constexpr std::chrono::milliseconds rewriting_interval{1};

key_t key_of(const Peer& peer, int project) {
  const key_t key = ftok(peer.socket_path().c_str(), project);
  if (key == -1) throw_errno("ftok");
  return key;
}

// The routes and their lock, as whoever has the keys sees them.
class BareRoutes {
 public:
  explicit BareRoutes(const Peer& peer)
      : semaphores_(semget(key_of(peer, HB_SEMAPHORE_SET_ID), HB_SEMAPHORE_COUNT, 0)),
        routes_(static_cast<route_sequence*>(shmat(shmget(key_of(peer, HB_ROUTE_SEGMENT_ID), 0, 0), nullptr, 0))) {
    if (semaphores_ < 0 || reinterpret_cast<intptr_t>(routes_) == -1) throw_errno("attaching the routes");
  }
  ~BareRoutes() { shmdt(routes_); }
  BareRoutes(const BareRoutes&) = delete;
  BareRoutes& operator=(const BareRoutes&) = delete;

  void read(int node, Hb_Source_Route& option) const {
    std::array<sembuf, 2> enter{{{HB_READERS_SEMAPHORE, 1, SEM_UNDO}, {HB_WRITER_SEMAPHORE, 0, 0}}};
    sembuf leave{HB_READERS_SEMAPHORE, -1, SEM_UNDO};
    semop(semaphores_, enter.data(), enter.size());
    std::memcpy(&option, &routes_[node].ip_option, sizeof option);
    semop(semaphores_, &leave, 1);
  }

  // All routes anew, under the writer's side of the lock.
  void rewrite() const {
    std::array<sembuf, 1> enter{{{HB_WRITER_SEMAPHORE, 1, SEM_UNDO}}};
    std::array<sembuf, 1> wait{{{HB_READERS_SEMAPHORE, 0, 0}}};
    std::array<sembuf, 1> leave{{{HB_WRITER_SEMAPHORE, -1, SEM_UNDO}}};
    semop(semaphores_, enter.data(), enter.size());
    semop(semaphores_, wait.data(), wait.size());
    std::fill_n(routes_, HB_MAX_NODES, route);
    semop(semaphores_, leave.data(), leave.size());
  }

 private:
  static constexpr route_sequence route{.sequence_number = 1, .length = 36, .nonip = 0, .ip_option = {}};

  int semaphores_;
  route_sequence* routes_;
};

using Read = Hb_Rc (*)(Hb_Node_Number, Hb_Source_Route*, unsigned short*);

void compare_reads(const Compare& compare, Read read) {
  const Peer peer(full_size);
  const Client client(peer);
  const BareRoutes bare(peer);
  bare.rewrite();
  Hb_Source_Route option;
  unsigned short length = 0;
  compare({.run =
               [&] {
                 for (size_t done = 0; done < batch; ++done) require(read(7, &option, &length), "reading a route");
               },
           .operations = batch},
          {.run =
               [&] {
                 for (size_t done = 0; done < batch; ++done) bare.read(7, option);
               },
           .operations = batch});
}

// While it lives this thread may use any processor, and so may a thread for all its life that is started meanwhile.
class Any_Processor {
 public:
  Any_Processor() {
    sched_getaffinity(0, sizeof before_, &before_);
    cpu_set_t all;
    std::memset(&all, 0xFF, sizeof all);
    sched_setaffinity(0, sizeof all, &all);
  }
  ~Any_Processor() { sched_setaffinity(0, sizeof before_, &before_); }
  Any_Processor(const Any_Processor&) = delete;
  Any_Processor& operator=(const Any_Processor&) = delete;

 private:
  cpu_set_t before_{};
};

// Rewrites the routes at its pace for as long as it lives, from another processor where there is one, as a daemon does.
class Rewriter {
 public:
  explicit Rewriter(const BareRoutes& routes) : routes_(routes) {
    const Any_Processor any;
    thread_ = std::jthread([this](const std::stop_token& stop) { rewrite_until(stop); });
    rewritten_.wait(0);
  }

  // Throws when it did not keep its pace.
  void check_pace() const {
    const auto expected = (std::chrono::steady_clock::now() - start_) / rewriting_interval;
    if (rewritten_ < expected * 9 / 10) {
      throw std::runtime_error("the routes were rewritten " + std::to_string(rewritten_) + " times, not " +
                               std::to_string(expected) + " times; is there a second processor?");
    }
  }

 private:
  void rewrite_until(const std::stop_token& stop) {
    auto next = start_;
    while (!stop.stop_requested()) {
      routes_.rewrite();
      ++rewritten_;
      rewritten_.notify_one();
      next += rewriting_interval;
      std::this_thread::sleep_until(next);
    }
  }

  const BareRoutes& routes_;
  std::chrono::steady_clock::time_point start_ = std::chrono::steady_clock::now();
  std::atomic<int64_t> rewritten_ = 0;
  std::jthread thread_;
};

double timed(const std::function<void()>& operation) {
  const auto start = std::chrono::steady_clock::now();
  operation();
  return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

// One read of each in turns, as a writer would not be the same for two runs.
Comparison compare_reads_beside_a_writer(double fraction) {
  const Peer peer(full_size);
  const Client client(peer);
  const BareRoutes bare(peer);
  bare.rewrite();
  Samples ours;
  Samples floor;
  Hb_Source_Route option;
  unsigned short length = 0;
  const Rewriter rewriter(bare);
  while (ours.size() < timed_reads) {
    ours.push_back(timed([&] { require(hb_read_route(7, &option, &length), "hb_read_route"); }));
    floor.push_back(timed([&] { bare.read(7, option); }));
  }
  rewriter.check_pace();
  Comparison result;
  result.ours = quantile(ours, fraction);
  result.floor = quantile(floor, fraction);
  result.ratio = result.ratio_low = result.ratio_high = result.ours / result.floor;
  result.rounds = timed_reads;
  result.stable = true;
  return result;
}

}  // namespace

void add_route_rows() {
  const char* lock_and_copy = "semop, copy, semop";
  add_row({.name = "route/hb_read_route", .floor = lock_and_copy, .limit = 1.15},
          [](const Compare& compare) { compare_reads(compare, hb_read_route); });
  add_row({.name = "route/hb_read_ip_route", .floor = lock_and_copy, .limit = 1.15},
          [](const Compare& compare) { compare_reads(compare, hb_read_ip_route); });
  for (const auto& [name, fraction] :
       {std::pair("median", 0.5), {"99th percentile", 0.99}, {"99.9th percentile", 0.999}}) {
    add_figures(std::string("route/read, rewritten 1,000 times a second, ") + name, lock_and_copy,
                [fraction = fraction] { return compare_reads_beside_a_writer(fraction); });
  }
}

}  // namespace bench
