// The semaphores of the reader lock as the daemon and other readers see them.
#pragma once

#include <sys/ipc.h>
#include <sys/sem.h>

#include <chrono>
#include <stdexcept>
#include <thread>

namespace hb_test {

class Reader_Lock {
 public:
  explicit Reader_Lock(int set) : set_(set) {}

  int readers() const { return control(0, GETVAL); }
  int writer() const { return control(1, GETVAL); }
  void set_readers(int count) const { control(0, SETVAL, count); }
  void set_writer(int value) const { control(1, SETVAL, value); }

  // Waits until somebody waits for the writer to leave.
  void await_waiting_reader() const {
    await([this] { return control(1, GETZCNT) == 1; });
  }
  // Waits until somebody leaves who was not counted, and so waits for a reader to be counted.
  void await_leaving_reader() const {
    await([this] { return control(0, GETNCNT) == 1; });
  }

  // Throws when it does not come true within ten seconds.
  template <typename Condition>
  static void await(Condition condition) {
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(10);
    while (!condition()) {
      if (std::chrono::steady_clock::now() > deadline) {
        throw std::runtime_error("waited in vain");
      }
      std::this_thread::yield();
    }
  }

 private:
  int control(int semaphore, int command, int value = 0) const {
    union {
      int value;
      void* other;
    } argument = {value};
    const int result = semctl(set_, semaphore, command, argument);
    if (result < 0) {
      throw std::runtime_error("semctl failed");
    }
    return result;
  }

  int set_;
};

}  // namespace hb_test
