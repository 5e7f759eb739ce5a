/* The published segments and the reader lock, as a client has them. */
#ifndef HB_TESTS_DAEMON_PUBLISHED_SEGMENTS_H
#define HB_TESTS_DAEMON_PUBLISHED_SEGMENTS_H

#include <gtest/gtest.h>
#include <sys/ipc.h>
#include <sys/sem.h>
#include <sys/shm.h>

#include <array>
#include <cstring>
#include <string>

#include "wire.h"

/** One attached segment. */
class PublishedSegment {
 public:
  PublishedSegment(const std::string& socket, int project)
      : address_(
            static_cast<const std::uint8_t*>(shmat(shmget(ftok(socket.c_str(), project), 0, 0), nullptr, SHM_RDONLY))) {
  }
  PublishedSegment(const PublishedSegment&) = delete;
  PublishedSegment& operator=(const PublishedSegment&) = delete;
  ~PublishedSegment() { shmdt(address_); }

  [[nodiscard]] Bytes bytes(std::size_t offset, std::size_t size) const {
    return {address_ + offset, address_ + offset + size};
  }
  [[nodiscard]] std::uint32_t word(std::size_t offset) const {
    return *reinterpret_cast<const volatile std::uint32_t*>(address_ + offset);
  }

 private:
  const std::uint8_t* address_;
};

/** The semaphores of the reader lock. */
class ReaderLock {
 public:
  explicit ReaderLock(const std::string& socket) : semaphores_(semget(ftok(socket.c_str(), 105), 2, 0)) {}

  void enter() const {
    std::array<sembuf, 2> operations = {{{0, 1, SEM_UNDO}, {1, 0, 0}}};
    ASSERT_EQ(semop(semaphores_, operations.data(), operations.size()), 0);
  }
  void leave() const {
    sembuf operation{0, -1, SEM_UNDO};
    ASSERT_EQ(semop(semaphores_, &operation, 1), 0);
  }
  /** Waits until no writer holds the lock. */
  void wait_for_writer() const {
    sembuf operation{1, 0, 0};
    const timespec patience{20, 0};
    ASSERT_EQ(semtimedop(semaphores_, &operation, 1, &patience), 0);
  }
  [[nodiscard]] int value(int semaphore) const { return semctl(semaphores_, semaphore, GETVAL); }
  [[nodiscard]] int id() const { return semaphores_; }

 private:
  int semaphores_;
};

#endif
