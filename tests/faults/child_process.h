// Child processes that a test kills, and memory that they share with it.
#pragma once

#include <sched.h>
#include <sys/mman.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <csignal>
#include <cstdint>
#include <functional>
#include <new>

namespace hb_test {

// A record in memory that child processes share.
template <typename Record>
class Shared {
 public:
  Shared() {
    void* memory = mmap(nullptr, sizeof(Record), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    if (memory == MAP_FAILED) throw std::bad_alloc();
    record_ = new (memory) Record;
  }
  ~Shared() { munmap(record_, sizeof(Record)); }
  Shared(const Shared&) = delete;
  Shared& operator=(const Shared&) = delete;

  Record* operator->() const { return record_; }

 private:
  Record* record_;
};

// A process that a test kills, or that ends by itself.
class Child {
 public:
  explicit Child(const std::function<void()>& work) : pid_(fork()) {
    if (pid_ == 0) {
      prctl(PR_SET_PDEATHSIG, SIGKILL);
      work();
      _exit(0);
    }
  }
  ~Child() {
    if (pid_ > 0) kill_and_wait();
  }
  Child(const Child&) = delete;
  Child& operator=(const Child&) = delete;

  void kill_and_wait() {
    ::kill(pid_, SIGKILL);
    wait();
  }
  // The exit status, or -1 when a signal ended it.
  int wait() {
    int status = 0;
    waitpid(pid_, &status, 0);
    pid_ = -1;
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }
  void stop() const {
    ::kill(pid_, SIGSTOP);
    int status = 0;
    waitpid(pid_, &status, WUNTRACED);
  }

 private:
  pid_t pid_;
};

// Lets other processes run until the count is above the value.
inline void await_above(const std::atomic<uint64_t>& count, uint64_t value) {
  while (count <= value) sched_yield();
}

// Lets so many turns of nothing pass, while a child gets to any place of its loop.
inline void pass(uint64_t turns) {
  for (uint64_t turn = 0; turn < turns; ++turn) std::atomic_signal_fence(std::memory_order_seq_cst);
}

}  // namespace hb_test
