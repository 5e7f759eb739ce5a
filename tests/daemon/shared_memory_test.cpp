/* The writer's side of the reader lock, seen by a reader. */
#include <gmock/gmock.h>
#include <unistd.h>

#include <array>
#include <csignal>

#include "published_segments.h"
#include "scripted_daemon.h"

namespace {

const std::string removal =
    "[[event]]\nat = \"1s\"\nkind = \"configuration-update\"\nremove = [{ node = 2 }]\n"
    "[[event]]\nat = \"2s\"\nkind = \"configuration-update\"\nremove = [{ node = 0, offset = 1 }]\n";

/* The published configuration with the reader lock. */
class Reader : public ReaderLock {
 public:
  explicit Reader(const std::string& socket) : ReaderLock(socket), published_(socket, 103) {}

  [[nodiscard]] std::uint32_t sequence() const { return published_.word(0); }
  [[nodiscard]] std::uint32_t nodes() const { return published_.word(4); }
  [[nodiscard]] std::uint32_t adapters() const { return published_.word(8); }

 private:
  PublishedSegment published_;
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
  std::array<sembuf, 2> second = {{{0, 1, IPC_NOWAIT}, {1, 0, IPC_NOWAIT}}};
  EXPECT_EQ(semop(reader.id(), second.data(), second.size()), -1);
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

TEST(Writer, that_is_killed_while_it_waits_leaves_no_lock) {
  ScriptedDaemon daemon(removal);
  const Reader reader(daemon.socket());
  reader.enter();
  daemon.follow(SubscriptionType::AllAdapters, 1);
  EXPECT_EQ(reader.value(1), 1);
  daemon.process().signal(SIGKILL);
  daemon.process().wait_for_end();
  EXPECT_EQ(reader.value(1), 0);
  EXPECT_EQ(reader.value(0), 1);
  reader.leave();
}

TEST(Writer, reports_a_reader_that_is_too_long_inside_and_waits_for_it_all_the_same) {
  ScriptedDaemon daemon(removal, 2, small_cluster, {"--reader-patience", "20ms"});
  const Reader reader(daemon.socket());
  reader.enter();
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllAdapters, 1, "s");
  daemon.go(client);
  /* The daemon serves its clients meanwhile. */
  while (daemon.process().log().find("a reader has been inside") == std::string::npos) {
    ASSERT_TRUE(client.configuration());
  }
  EXPECT_THAT(daemon.process().log(), testing::ContainsRegex("a reader has been inside the shared segments for [0-9]+ "
                                                             "ms, process " +
                                                             std::to_string(getpid())));
  EXPECT_EQ(reader.sequence(), 1U);
  EXPECT_EQ(reader.value(0), 1);
  reader.leave();
  reader.wait_for_writer();
  EXPECT_EQ(reader.sequence(), 3U);
}

}  // namespace
