/* What the daemon publishes, clears, refuses and removes. */
#include <fcntl.h>
#include <gmock/gmock.h>
#include <sys/ipc.h>
#include <sys/sem.h>
#include <sys/shm.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <memory>

#include "daemon_process.h"
#include "small_cluster.h"
#include "wire.h"

namespace {

using testing::HasSubstr;

constexpr int configuration_id = 103;
constexpr int route_id = 104;
constexpr int semaphore_id = 105;
constexpr int security_id = 112;

/* Identifiers of the four objects of a socket path; -1 for those that are not there. */
struct Objects {
  explicit Objects(const std::string& socket)
      : segments{shmget(ftok(socket.c_str(), configuration_id), 0, 0), shmget(ftok(socket.c_str(), route_id), 0, 0),
                 shmget(ftok(socket.c_str(), security_id), 0, 0)},
        semaphores(semget(ftok(socket.c_str(), semaphore_id), 0, 0)) {}

  [[nodiscard]] bool all_are_there() const {
    for (const int segment : segments) {
      if (!is_there(segment)) {
        return false;
      }
    }
    return semctl(semaphores, 0, GETVAL) >= 0;
  }

  [[nodiscard]] bool none_is_there() const {
    for (const int segment : segments) {
      if (is_there(segment)) {
        return false;
      }
    }
    return semctl(semaphores, 0, GETVAL) == -1;
  }

  static bool is_there(int segment) {
    shmid_ds state{};
    /* A segment that is removed while somebody is attached has lost its key. */
    return shmctl(segment, IPC_STAT, &state) == 0 && state.shm_perm.__key != 0;
  }

  std::array<int, 3> segments;
  int semaphores;
};

bool exists(const std::string& path) { return access(path.c_str(), F_OK) == 0; }

shmid_ds state_of(int segment) {
  shmid_ds state{};
  EXPECT_EQ(shmctl(segment, IPC_STAT, &state), 0);
  return state;
}

Bytes contents_of(int segment) {
  const void* attached = shmat(segment, nullptr, SHM_RDONLY);
  EXPECT_NE(attached, reinterpret_cast<void*>(-1));
  const auto* first = static_cast<const std::uint8_t*>(attached);
  Bytes contents(first, first + state_of(segment).shm_segsz);
  shmdt(attached);
  return contents;
}

class Daemon : public testing::Test {
 protected:
  std::unique_ptr<DaemonProcess> start(const std::vector<std::string>& more = {}) {
    std::vector<std::string> arguments = {"--socket", socket_};
    arguments.insert(arguments.end(), more.begin(), more.end());
    auto daemon = std::make_unique<DaemonProcess>(directory_, arguments);
    EXPECT_TRUE(daemon->wait_until_ready()) << daemon->log();
    return daemon;
  }

  TemporaryDirectory directory_;
  std::string socket_ = directory_.path("socket");
};

TEST_F(Daemon, publishes_segments_of_the_prescribed_sizes_with_valid_contents) {
  const auto daemon = start({"--scenario", directory_.write("s.toml", small_cluster)});
  const Objects objects(socket_);
  EXPECT_EQ(contents_of(objects.segments[0]), ByteWriter().u32(1).u32(4).u32(5).bytes());
  /* Routes and keys have tests of their own. */
  EXPECT_EQ(contents_of(objects.segments[1]).size(), std::size_t{4} * 184);
  EXPECT_EQ(contents_of(objects.segments[2]).size(), 3168U);
}

TEST_F(Daemon, publishes_two_semaphores_that_are_both_0) {
  const auto daemon = start();
  const Objects objects(socket_);
  semid_ds state{};
  ASSERT_EQ(semctl(objects.semaphores, 0, IPC_STAT, &state), 0);
  EXPECT_EQ(state.sem_nsems, 2U);
  EXPECT_EQ(semctl(objects.semaphores, 0, GETVAL), 0);
  EXPECT_EQ(semctl(objects.semaphores, 1, GETVAL), 0);
}

TEST_F(Daemon, guards_what_it_publishes_by_modes) {
  const auto daemon = start();
  const Objects objects(socket_);
  EXPECT_EQ(state_of(objects.segments[0]).shm_perm.mode & 0777, 0644);
  EXPECT_EQ(state_of(objects.segments[1]).shm_perm.mode & 0777, 0640);
  EXPECT_EQ(state_of(objects.segments[2]).shm_perm.mode & 0777, 0640);
  semid_ds state{};
  semctl(objects.semaphores, 0, IPC_STAT, &state);
  EXPECT_EQ(state.sem_perm.mode & 0777, 0660);
  struct stat file {};
  ASSERT_EQ(lstat(socket_.c_str(), &file), 0);
  EXPECT_EQ(file.st_mode & 07777, 0660U);
}

class StopSignal : public Daemon, public testing::WithParamInterface<int> {};

TEST_P(StopSignal, removes_socket_segments_and_semaphores_and_ends_with_0) {
  const auto daemon = start();
  const Objects objects(socket_);
  ASSERT_TRUE(objects.all_are_there());
  daemon->signal(GetParam());
  EXPECT_EQ(daemon->wait_for_end(), 0) << daemon->log();
  EXPECT_TRUE(objects.none_is_there());
  EXPECT_FALSE(exists(socket_));
}

INSTANTIATE_TEST_SUITE_P(Of, StopSignal, testing::Values(SIGTERM, SIGINT),
                         [](const auto& each) { return each.param == SIGTERM ? "terminate" : "interrupt"; });

TEST_F(Daemon, that_stops_disconnects_its_clients) {
  const auto daemon = start();
  Connection client(socket_);
  ASSERT_TRUE(client.configuration());
  EXPECT_EQ(daemon->stop(), 0);
  EXPECT_TRUE(client.is_ended());
}

TEST_F(Daemon, clears_what_a_killed_one_left_when_it_starts) {
  const auto killed = start();
  const Objects left(socket_);
  killed->signal(SIGKILL);
  EXPECT_EQ(killed->wait_for_end(), 128 + SIGKILL);
  ASSERT_TRUE(left.all_are_there());
  ASSERT_TRUE(exists(socket_));

  const auto next = start();
  EXPECT_TRUE(left.none_is_there());
  EXPECT_TRUE(Objects(socket_).all_are_there());
  EXPECT_TRUE(Connection(socket_).configuration());
  EXPECT_THAT(next->log(), HasSubstr("that was left behind"));
}

TEST_F(Daemon, clears_what_a_killed_one_left_although_a_client_is_attached) {
  const auto killed = start();
  const Objects left(socket_);
  const void* attached = shmat(left.segments[0], nullptr, SHM_RDONLY);
  killed->signal(SIGKILL);
  killed->wait_for_end();

  const auto next = start();
  EXPECT_TRUE(left.none_is_there());
  /* The client's memory stays as it was until it detaches. */
  EXPECT_EQ(*static_cast<const std::uint32_t*>(attached), 1U);
  shmdt(attached);
}

TEST_F(Daemon, clears_a_readers_hold_with_what_a_killed_one_left) {
  const auto killed = start();
  const Objects left(socket_);
  std::array<sembuf, 2> enter = {{{0, 1, SEM_UNDO}, {1, 0, SEM_UNDO}}};
  ASSERT_EQ(semop(left.semaphores, enter.data(), enter.size()), 0);
  killed->signal(SIGKILL);
  killed->wait_for_end();
  const auto next = start();
  EXPECT_EQ(semctl(Objects(socket_).semaphores, 0, GETVAL), 0);
}

TEST_F(Daemon, refuses_to_start_beside_a_live_one_and_leaves_it_alone) {
  const auto live = start();
  const Objects objects(socket_);
  DaemonProcess second(directory_, {"--socket", socket_});
  EXPECT_FALSE(second.wait_until_ready());
  EXPECT_EQ(second.wait_for_end(), 1);
  EXPECT_EQ(second.log(),
            "hbd: a daemon listens at " + socket_ + " already; stop it, or give another path with --socket\n");
  EXPECT_TRUE(objects.all_are_there());
  EXPECT_TRUE(Connection(socket_).configuration());
}

TEST_F(Daemon, that_starts_at_once_with_others_is_the_only_one_that_stays) {
  std::vector<std::unique_ptr<DaemonProcess>> all;
  for (int i = 0; i < 4; ++i) {
    all.push_back(std::make_unique<DaemonProcess>(directory_, std::vector<std::string>{"--socket", socket_}));
  }
  int staying = 0;
  for (const auto& daemon : all) {
    if (daemon->wait_until_ready()) {
      ++staying;
    } else {
      EXPECT_EQ(daemon->wait_for_end(), 1);
    }
  }
  EXPECT_EQ(staying, 1);
  EXPECT_TRUE(Connection(socket_).configuration());
}

TEST_F(Daemon, refuses_a_path_that_is_no_socket_and_leaves_the_file_alone) {
  const std::string file = directory_.write("socket", "precious");
  DaemonProcess daemon(directory_, {"--socket", file});
  EXPECT_EQ(daemon.wait_for_end(), 1);
  EXPECT_THAT(daemon.log(), HasSubstr(file + " is there and is no socket; remove it"));
  EXPECT_TRUE(exists(file));
}

TEST_F(Daemon, refuses_a_path_of_108_characters) {
  DaemonProcess daemon(directory_, {"--socket", "/tmp/" + std::string(103, 'x')});
  EXPECT_EQ(daemon.wait_for_end(), 1);
  EXPECT_THAT(daemon.log(), HasSubstr("has 108 characters; 107 are the most"));
}

TEST_F(Daemon, makes_the_directories_of_its_socket_with_mode_0755) {
  socket_ = directory_.path("a/b/socket");
  const auto daemon = start();
  for (const char* made : {"a", "a/b"}) {
    struct stat directory {};
    ASSERT_EQ(stat(directory_.path(made).c_str(), &directory), 0);
    EXPECT_EQ(directory.st_mode & 0777, 0755U);
  }
}

TEST_F(Daemon, that_cannot_make_its_directory_says_which_and_ends_with_1) {
  const std::string file = directory_.write("file", "");
  DaemonProcess daemon(directory_, {"--socket", file + "/socket"});
  EXPECT_EQ(daemon.wait_for_end(), 1);
  EXPECT_THAT(daemon.log(), HasSubstr("hbd: "));
  EXPECT_THAT(daemon.log(), HasSubstr(file));
}

TEST_F(Daemon, removes_no_socket_file_that_has_taken_the_place_of_its_own) {
  const auto daemon = start();
  ASSERT_EQ(unlink(socket_.c_str()), 0);
  const std::string other = directory_.write("socket", "another's");
  EXPECT_EQ(daemon->stop(), 0);
  EXPECT_TRUE(exists(other));
}

struct Environment {
  std::string name;
  std::map<std::string, std::string> variables; /* DIR stands for the test's directory */
  std::string socket;
};

void PrintTo(const Environment& each, std::ostream* out) { *out << each.name; }

class SocketPath : public testing::TestWithParam<Environment> {};

TEST_P(SocketPath, is_the_one_that_clients_resolve) {
  const TemporaryDirectory directory;
  auto variables = GetParam().variables;
  variables["HB_SERVER_SOCKET"] = directory.path("base");
  DaemonProcess daemon(directory, {}, variables);
  ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
  EXPECT_TRUE(Connection(directory.path(GetParam().socket)).configuration());
}

INSTANTIATE_TEST_SUITE_P(From, SocketPath,
                         testing::Values(Environment{"base_alone", {}, "base"},
                                         Environment{"domain", {{"HA_DOMAIN_NAME", "d1"}}, "base.d1"},
                                         Environment{"partition", {{"HA_SYSPAR_NAME", "p1"}}, "base.p1"},
                                         Environment{"domain_before_partition",
                                                     {{"HA_DOMAIN_NAME", "d1"}, {"HA_SYSPAR_NAME", "p1"}},
                                                     "base.d1"},
                                         Environment{"partition_when_the_domain_is_empty",
                                                     {{"HA_DOMAIN_NAME", ""}, {"HA_SYSPAR_NAME", "p1"}},
                                                     "base.p1"}),
                         [](const auto& each) { return each.param.name; });

TEST(SocketPathOption, replaces_the_environment) {
  const TemporaryDirectory directory;
  DaemonProcess daemon(directory, {"--socket", directory.path("mine")},
                       {{"HB_SERVER_SOCKET", directory.path("other")}, {"HA_DOMAIN_NAME", "d1"}});
  ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
  EXPECT_TRUE(Connection(directory.path("mine")).configuration());
}

TEST(SocketPathFromEnvironment, that_is_empty_is_refused) {
  const TemporaryDirectory directory;
  DaemonProcess daemon(directory, {}, {{"HB_SERVER_SOCKET", ""}});
  EXPECT_EQ(daemon.wait_for_end(), 1);
  EXPECT_THAT(daemon.log(), HasSubstr("the socket path is empty"));
}

struct Usage {
  std::string name;
  std::vector<std::string> arguments;
};

void PrintTo(const Usage& each, std::ostream* out) { *out << each.name; }

class UsageMistake : public testing::TestWithParam<Usage> {};

TEST_P(UsageMistake, ends_with_2_and_a_message) {
  const TemporaryDirectory directory;
  DaemonProcess daemon(directory, GetParam().arguments);
  EXPECT_EQ(daemon.wait_for_end(), 2);
  EXPECT_NE(daemon.log(), "");
}

INSTANTIATE_TEST_SUITE_P(
    Of, UsageMistake,
    testing::Values(Usage{"unknown_option", {"--bogus"}}, Usage{"unexpected_word", {"now"}},
                    Usage{"check_without_scenario", {"--check"}},
                    Usage{"scenario_that_is_not_there", {"--scenario", "/no/such/file"}},
                    Usage{"host_with_scenario", {"--host", "--scenario", HBD_SCENARIOS "/demo.toml"}},
                    Usage{"host_with_speed", {"--host", "--speed", "2"}},
                    Usage{"speed_with_as_fast", {"--speed", "2", "--as-fast-as-read"}},
                    Usage{"speed_0", {"--speed", "0"}}, Usage{"bad_log_level", {"--log-level", "loud"}},
                    Usage{"queue_of_no_bytes", {"--client-queue-bytes", "0"}},
                    Usage{"stale_age_without_unit", {"--stale-age", "10"}},
                    Usage{"negative_patience", {"--reader-patience", "-1s"}},
                    Usage{"key_rotation_that_is_no_time", {"--key-rotation", "often"}}),
    [](const auto& each) { return each.param.name; });

TEST(Help, and_version_go_to_standard_output_and_end_with_0) {
  const TemporaryDirectory directory;
  DaemonProcess help(directory, {"--help"});
  EXPECT_EQ(help.wait_for_end(), 0);
  EXPECT_THAT(help.output(), HasSubstr("--scenario"));
  DaemonProcess version(directory, {"--version"});
  EXPECT_EQ(version.wait_for_end(), 0);
  EXPECT_THAT(version.output(), testing::MatchesRegex("hbd [0-9]+\\.[0-9]+\\.[0-9]+\n"));
}

TEST(Check, tells_the_line_of_a_mistake_and_ends_with_1) {
  const TemporaryDirectory directory;
  const std::string file = directory.write("bad.toml", "[cluster]\nnmae = \"x\"\n[[node]]\nnumber = 0\n");
  DaemonProcess daemon(directory, {"--check", "--scenario", file});
  EXPECT_EQ(daemon.wait_for_end(), 1);
  EXPECT_THAT(daemon.log(), HasSubstr("hbd: " + file + ":"));
}

TEST(Check, finds_no_mistake_in_the_scenarios_that_are_installed) {
  const TemporaryDirectory directory;
  for (const char* file : {HBD_SCENARIOS "/demo.toml", HBD_SCENARIOS "/churn.toml"}) {
    DaemonProcess daemon(directory, {"--check", "--scenario", file});
    EXPECT_EQ(daemon.wait_for_end(), 0) << daemon.log();
    EXPECT_THAT(daemon.output(), HasSubstr(file));
  }
}

TEST(WithoutArguments, a_cluster_of_4_nodes_on_2_networks_is_simulated) {
  const TemporaryDirectory directory;
  DaemonProcess daemon(directory, {}, {{"HB_SERVER_SOCKET", directory.path("socket")}});
  ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
  const auto answer = Connection(directory.path("socket")).configuration();
  ASSERT_TRUE(answer);
  EXPECT_EQ(field(*answer, 108 + 4), 4U);  /* nodes */
  EXPECT_EQ(field(*answer, 108 + 12), 8U); /* adapters */
  EXPECT_EQ(field(*answer, 108 + 16), 2U); /* networks */
}

}  // namespace
