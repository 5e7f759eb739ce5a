/* Clients that read slowly or not at all, and many clients. */
#include <gmock/gmock.h>
#include <sys/resource.h>

#include <filesystem>
#include <memory>
#include <utility>

#include "daemon_process.h"
#include "scripted_daemon.h"
#include "small_cluster.h"
#include "wire.h"

namespace {

using testing::HasSubstr;

const std::string endless = small_cluster + "\n[random]\nseed = 3\nmean_interval = \"100us\"\n";
const std::string two_thousand_steps = small_cluster + "\n[random]\nseed = 3\nmean_interval = \"1s\"\ncount = 2000\n";

/* Leaves the daemon one free descriptor: the limit is a number that no descriptor reaches. */
void leave_one_descriptor(const DaemonProcess& daemon) {
  const std::string descriptors = "/proc/" + std::to_string(daemon.pid()) + "/fd/";
  rlim_t limit = 0;
  for (int unused = 0; unused < 2; ++limit) {
    unused += std::filesystem::is_symlink(descriptors + std::to_string(limit)) ? 0 : 1;
  }
  rlimit limits{};
  ASSERT_EQ(prlimit(daemon.pid(), RLIMIT_NOFILE, nullptr, &limits), 0);
  limits.rlim_cur = limit - 1;
  ASSERT_EQ(prlimit(daemon.pid(), RLIMIT_NOFILE, &limits, nullptr), 0);
}

TEST(Client, that_does_not_read_is_disconnected_and_logged_while_another_is_served) {
  const TemporaryDirectory directory;
  DaemonProcess daemon(directory, {"--socket", directory.path("socket"), "--scenario",
                                   directory.write("s.toml", endless), "--client-queue-bytes", "100000"});
  ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
  const Connection lazy(directory.path("socket"));
  lazy.subscribe(SubscriptionType::AllAdapters, 7, "lazy");
  Connection busy(directory.path("socket"));
  busy.subscribe(SubscriptionType::AllAdapters, 1, "busy");
  std::optional<Bytes> packet = busy.receive();
  while (packet && daemon.log().find("does not read") == std::string::npos) {
    packet = busy.receive();
  }
  EXPECT_TRUE(packet);
  EXPECT_TRUE(lazy.wait_until_ended());
  EXPECT_TRUE(busy.receive());
  EXPECT_THAT(daemon.log(), testing::ContainsRegex("client 1 \\(process [0-9]+\\): does not read, [0-9]+ bytes are "
                                                   "kept for it; disconnected"));
}

TEST(Client, that_asks_without_end_and_does_not_read_is_disconnected) {
  ScriptedDaemon daemon;
  const TemporaryDirectory directory;
  DaemonProcess bounded(directory, {"--socket", directory.path("socket"), "--client-queue-bytes", "1"});
  ASSERT_TRUE(bounded.wait_until_ready());
  const Connection client(directory.path("socket"));
  Bytes many;
  for (int i = 0; i < 100; ++i) {
    const Bytes one = request(201, {});
    many.insert(many.end(), one.begin(), one.end());
  }
  while (bounded.log().find("does not read") == std::string::npos) {
    client.send(many);
  }
  EXPECT_TRUE(client.wait_until_ended());
}

TEST(Client, finds_room_for_two_configurations_whatever_the_bound) {
  const TemporaryDirectory directory;
  DaemonProcess daemon(directory, {"--socket", directory.path("socket"), "--client-queue-bytes", "1"});
  ASSERT_TRUE(daemon.wait_until_ready());
  Connection client(directory.path("socket"));
  client.send(ByteWriter().raw(request(201, {})).raw(request(201, {})).bytes());
  EXPECT_TRUE(client.receive());
  EXPECT_TRUE(client.receive());
}

TEST(Client, is_turned_away_while_no_descriptor_is_free_and_the_others_are_served) {
  const TemporaryDirectory directory;
  DaemonProcess daemon(directory, {"--socket", directory.path("socket")});
  ASSERT_TRUE(daemon.wait_until_ready());
  auto served = std::make_unique<Connection>(directory.path("socket"));
  ASSERT_TRUE(served->configuration());
  leave_one_descriptor(daemon);
  Connection last(directory.path("socket"));
  ASSERT_TRUE(last.configuration()) << daemon.log();

  const Connection unwanted(directory.path("socket"));
  EXPECT_TRUE(unwanted.wait_until_ended());
  EXPECT_THAT(daemon.log(), HasSubstr("a client was turned away: no descriptor is free, with 2 clients; raise the "
                                      "limit (ulimit -n)"));
  EXPECT_TRUE(last.configuration());
  served.reset();
  EXPECT_TRUE(last.configuration());
  Connection next(directory.path("socket"));
  EXPECT_TRUE(next.configuration());
}

/* New groups that come to a client which starts to read now, up to the answer to its last request. */
std::size_t groups_that_come(Connection& late) {
  late.send(request(201, {}));
  std::size_t groups = 0;
  std::uint32_t last = 0;
  for (auto packet = late.receive(); packet && field(*packet, 0) != 0; packet = late.receive()) {
    EXPECT_GT(field(*packet, 104), last);
    last = field(*packet, 104);
    groups += field(*packet, 0) == 4 ? 1 : 0;
  }
  return groups;
}

/* Groups of two clients that start to read when all has happened; the second one has never asked to drop anything. */
std::pair<std::size_t, std::size_t> groups_of_late_readers(std::uint32_t request_before) {
  const TemporaryDirectory directory;
  DaemonProcess daemon(
      directory, {"--socket", directory.path("socket"), "--scenario", directory.write("s.toml", two_thousand_steps),
                  "--speed", "1e6", "--start-after-subscriptions", "3", "--stale-age", "1ms"});
  EXPECT_TRUE(daemon.wait_until_ready());
  Connection late(directory.path("socket"));
  late.send(request(219, {}));
  late.send(request(request_before, {}));
  late.subscribe(SubscriptionType::AllAdapters, 7, "late");
  Connection patient(directory.path("socket"));
  patient.subscribe(SubscriptionType::AllAdapters, 7, "patient");
  Connection other(directory.path("socket"));
  other.subscribe(SubscriptionType::AllAdapters, 4, "other");
  for (int groups = 0; groups < 2001 && other.receive(); ++groups) {
  }
  const std::size_t groups = groups_that_come(late);
  return {groups, groups_that_come(patient)};
}

TEST(StaleEvents, are_dropped_for_a_client_that_has_asked_so_alone_and_answers_are_not) {
  const auto [asked, patient] = groups_of_late_readers(219);
  EXPECT_LT(asked, 2001U);
  EXPECT_EQ(patient, 2001U);
}

TEST(StaleEvents, are_kept_for_a_client_that_wants_them_again) {
  EXPECT_EQ(groups_of_late_readers(220), std::pair(std::size_t{2001}, std::size_t{2001}));
}

TEST(AsFastAsRead, loses_nothing_for_a_client_that_starts_to_read_late) {
  const TemporaryDirectory directory;
  DaemonProcess daemon(
      directory, {"--socket", directory.path("socket"), "--scenario", directory.write("s.toml", two_thousand_steps),
                  "--as-fast-as-read", "--client-queue-bytes", "4096"});
  ASSERT_TRUE(daemon.wait_until_ready());
  Connection late(directory.path("socket"));
  late.subscribe(SubscriptionType::AllAdapters, 7, "late");
  Connection other(directory.path("socket"));
  ASSERT_TRUE(other.configuration());

  std::uint32_t last = 0;
  std::size_t steps = 0;
  for (auto packet = late.receive(); packet; packet = late.receive()) {
    const std::uint32_t sequence = field(*packet, 104);
    EXPECT_GT(sequence, last);
    last = sequence;
    steps += field(*packet, 0) == 4 ? 1 : 0;
    /* Each step of this churn makes one new group; the first is that of the subscription. */
    if (steps == 2001) {
      break;
    }
  }
  EXPECT_EQ(steps, 2001U);
  EXPECT_EQ(daemon.log().find("does not read"), std::string::npos);
}

TEST(AsFastAsRead, does_not_wait_for_a_client_that_has_taken_nothing_for_seconds) {
  const TemporaryDirectory directory;
  DaemonProcess daemon(directory,
                       {"--socket", directory.path("socket"), "--scenario", directory.write("s.toml", endless),
                        "--as-fast-as-read", "--start-after-subscriptions", "2", "--client-queue-bytes", "4096"});
  ASSERT_TRUE(daemon.wait_until_ready());
  const Connection stuck(directory.path("socket"));
  stuck.subscribe(SubscriptionType::AllAdapters, 7, "stuck");
  Connection reads(directory.path("socket"));
  reads.subscribe(SubscriptionType::AllAdapters, 7, "reads");
  std::optional<Bytes> packet = reads.receive();
  while (packet && daemon.log().find("does not read") == std::string::npos) {
    packet = reads.receive();
  }
  EXPECT_TRUE(packet);
  EXPECT_TRUE(stuck.wait_until_ended());
}

TEST(Clients, by_the_hundreds_get_the_same_event) {
  ScriptedDaemon daemon("[[event]]\nat = \"1s\"\nkind = \"adapter-death\"\nnode = 0\noffset = 1\n", 300);
  std::vector<std::unique_ptr<Connection>> clients;
  for (int i = 0; i < 300; ++i) {
    clients.push_back(std::make_unique<Connection>(daemon.socket()));
    clients.back()->subscribe(SubscriptionType::AllAdapters, 1, "s");
  }
  const auto first = clients.front()->receive();
  ASSERT_TRUE(first);
  EXPECT_EQ(field(*first, 0), 2U);
  for (std::size_t i = 1; i < clients.size(); ++i) {
    EXPECT_EQ(clients[i]->receive(), first);
  }
}

}  // namespace
