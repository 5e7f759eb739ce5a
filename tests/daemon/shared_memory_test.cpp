/* The writer's side of the reader lock, seen by a reader. */
#include <gmock/gmock.h>
#include <sys/ipc.h>
#include <sys/sem.h>
#include <sys/shm.h>

#include <array>

#include "scripted_daemon.h"

namespace {

const std::string removal =
    "[[event]]\nat = \"1s\"\nkind = \"configuration-update\"\nremove = [{ node = 2 }]\n"
    "[[event]]\nat = \"2s\"\nkind = \"configuration-update\"\nremove = [{ node = 0, offset = 1 }]\n";

/* The published configuration and the reader lock, as a client has them. */
class Reader {
 public:
  explicit Reader(const std::string& socket)
      : semaphores_(semget(ftok(socket.c_str(), 105), 2, 0)),
        published_(static_cast<const volatile std::uint32_t*>(
            shmat(shmget(ftok(socket.c_str(), 103), 12, 0), nullptr, SHM_RDONLY))) {}
  Reader(const Reader&) = delete;
  Reader& operator=(const Reader&) = delete;
  ~Reader() { shmdt(const_cast<const std::uint32_t*>(published_)); }

  void enter() const {
    std::array<sembuf, 2> operations = {{{0, 1, SEM_UNDO}, {1, 0, 0}}};
    ASSERT_EQ(semop(semaphores_, operations.data(), operations.size()), 0);
  }
  void leave() const {
    sembuf operation{0, -1, SEM_UNDO};
    ASSERT_EQ(semop(semaphores_, &operation, 1), 0);
  }
  /* Waits until no writer holds the lock. */
  void wait_for_writer() const {
    sembuf operation{1, 0, 0};
    const timespec patience{20, 0};
    ASSERT_EQ(semtimedop(semaphores_, &operation, 1, &patience), 0);
  }
  [[nodiscard]] int value(int semaphore) const { return semctl(semaphores_, semaphore, GETVAL); }
  [[nodiscard]] std::uint32_t sequence() const { return published_[0]; }
  [[nodiscard]] std::uint32_t nodes() const { return published_[1]; }
  [[nodiscard]] std::uint32_t adapters() const { return published_[2]; }

 private:
  int semaphores_;
  const volatile std::uint32_t* published_;
};

TEST(PublishedConfiguration, has_a_new_number_after_each_update) {
  ScriptedDaemon daemon(removal);
  const Reader reader(daemon.socket());
  EXPECT_EQ(reader.sequence(), 1U);
  EXPECT_EQ(reader.adapters(), 5U);
  daemon.follow(SubscriptionType::AllAdapters, 1);
  reader.wait_for_writer();
  EXPECT_EQ(reader.sequence(), 3U);
  EXPECT_EQ(reader.nodes(), 4U);
  EXPECT_EQ(reader.adapters(), 3U);
}

TEST(PublishedConfiguration, is_not_changed_while_a_reader_is_inside) {
  ScriptedDaemon daemon(removal);
  const Reader reader(daemon.socket());
  reader.enter();
  /* The clients are told all the same: nobody waits for a reader but the memory. */
  daemon.follow(SubscriptionType::AllAdapters, 1);
  EXPECT_EQ(reader.value(1), 1);
  EXPECT_EQ(reader.sequence(), 1U);
  EXPECT_EQ(reader.adapters(), 5U);

  reader.leave();
  reader.wait_for_writer();
  EXPECT_EQ(reader.sequence(), 3U);
  EXPECT_EQ(reader.adapters(), 3U);
  EXPECT_EQ(reader.value(0), 0);
  EXPECT_EQ(reader.value(1), 0);
}

TEST(PublishedConfiguration, keeps_new_readers_out_while_it_waits) {
  ScriptedDaemon daemon(removal);
  const Reader reader(daemon.socket());
  reader.enter();
  daemon.follow(SubscriptionType::AllAdapters, 1);
  const int semaphores = semget(ftok(daemon.socket().c_str(), 105), 2, 0);
  std::array<sembuf, 2> second = {{{0, 1, IPC_NOWAIT}, {1, 0, IPC_NOWAIT}}};
  EXPECT_EQ(semop(semaphores, second.data(), second.size()), -1);
  reader.leave();
  reader.wait_for_writer();
}

TEST(PublishedConfiguration, leaves_both_semaphores_at_0) {
  ScriptedDaemon daemon(removal);
  const Reader reader(daemon.socket());
  daemon.follow(SubscriptionType::AllAdapters, 1);
  reader.wait_for_writer();
  EXPECT_EQ(reader.value(0), 0);
  EXPECT_EQ(reader.value(1), 0);
}

TEST(Stopping, does_not_wait_for_a_reader_that_is_inside) {
  ScriptedDaemon daemon(removal);
  const Reader reader(daemon.socket());
  reader.enter();
  daemon.follow(SubscriptionType::AllAdapters, 1);
  EXPECT_EQ(daemon.process().stop(), 0);
}

}  // namespace
