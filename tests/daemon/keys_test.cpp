/* The security keys that the daemon publishes. */
#include <gmock/gmock.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>

#include "published_segments.h"
#include "scripted_daemon.h"

namespace {

using testing::HasSubstr;

constexpr std::size_t previous_at = 4;
constexpr std::size_t current_at = 284;
constexpr std::size_t cache_at = 564;
constexpr std::size_t cache_count_at = 564 + 2600;
constexpr std::size_t key_at = 20; /* in a status */

/* A status with one key: on, one key, not for the older form, signing or not, authenticating. */
Bytes status(std::uint32_t signing, std::uint32_t version, const Bytes& value) {
  Bytes bytes = ByteWriter()
                    .u32(1)
                    .u32(1)
                    .u32(0)
                    .u32(signing)
                    .u32(1)
                    .u32(static_cast<std::uint32_t>(value.size() + 12))
                    .u32(1)
                    .u32(version)
                    .u32(static_cast<std::uint32_t>(value.size()))
                    .raw(value)
                    .bytes();
  bytes.resize(280);
  return bytes;
}

class Keys : public testing::Test {
 protected:
  std::string key_file(const std::string& text, mode_t mode = 0600) {
    const std::string file = directory_.write("key", text);
    EXPECT_EQ(chmod(file.c_str(), mode), 0);
    return file;
  }

  std::string socket() const { return directory_.path("socket"); }

  std::vector<std::string> arguments(const std::vector<std::string>& more) const {
    std::vector<std::string> words = {"--socket", socket(), "--scenario", scenario_};
    words.insert(words.end(), more.begin(), more.end());
    return words;
  }

  /* Signals are taken in the order of the loop: the log tells when. */
  static void rotate(DaemonProcess& daemon, const std::string& expected) {
    daemon.signal(SIGUSR1);
    while (daemon.log().find(expected) == std::string::npos) {
    }
  }

  TemporaryDirectory directory_;
  std::string scenario_ = directory_.write("s.toml", small_cluster);
};

TEST_F(Keys, of_a_file_are_published_in_the_typed_format) {
  DaemonProcess daemon(directory_, arguments({"--key-file", key_file("secret")}));
  ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
  const PublishedSegment security(socket(), 112);
  EXPECT_EQ(security.word(0), 1U);
  EXPECT_EQ(security.bytes(current_at, 280), status(1, 1, {'s', 'e', 'c', 'r', 'e', 't'}));
  EXPECT_EQ(security.bytes(previous_at, 280), Bytes(280));
  EXPECT_EQ(security.bytes(cache_at, 2604), Bytes(2604));
}

TEST_F(Keys, change_with_their_file_on_a_signal) {
  DaemonProcess daemon(directory_, arguments({"--key-file", key_file("one")}));
  ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
  const PublishedSegment security(socket(), 112);
  rotate(daemon, "holds the current security key");
  EXPECT_EQ(security.word(0), 1U);
  key_file("two");
  rotate(daemon, "the keys have number 2");
  EXPECT_EQ(security.word(0), 2U);
  EXPECT_EQ(security.bytes(current_at, 280), status(1, 2, {'t', 'w', 'o'}));
  EXPECT_EQ(security.bytes(previous_at, 280), status(0, 1, {'o', 'n', 'e'}));
  EXPECT_EQ(security.word(cache_count_at), 0U);
  key_file("three");
  rotate(daemon, "the keys have number 3");
  EXPECT_EQ(security.word(cache_count_at), 1U);
  Bytes cached = ByteWriter().u32(15).u32(1).u32(1).u32(3).raw({'o', 'n', 'e'}).bytes();
  cached.resize(260);
  EXPECT_EQ(security.bytes(cache_at, 260), cached);
  EXPECT_EQ(security.bytes(cache_at + 260, 260), Bytes(260));
}

TEST_F(Keys, stay_when_their_file_cannot_be_used_any_more) {
  const std::string file = key_file("one");
  DaemonProcess daemon(directory_, arguments({"--key-file", file}));
  ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
  const PublishedSegment security(socket(), 112);
  key_file("two", 0644);
  rotate(daemon, "is open to group or others (mode 0644)");
  EXPECT_EQ(security.word(0), 1U);
  EXPECT_EQ(security.bytes(current_at, 280), status(1, 1, {'o', 'n', 'e'}));
}

TEST_F(Keys, are_made_at_random_without_a_file) {
  Bytes first;
  for (int i = 0; i < 2; ++i) {
    DaemonProcess daemon(directory_, arguments({}));
    ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
    const PublishedSegment security(socket(), 112);
    const Bytes value = security.bytes(current_at + key_at + 16, 32);
    EXPECT_EQ(security.bytes(current_at, 280), status(1, 1, value));
    EXPECT_NE(value, Bytes(32));
    EXPECT_NE(value, first);
    first = value;
  }
}

TEST_F(Keys, change_by_themselves_when_a_time_is_given) {
  DaemonProcess daemon(directory_, arguments({"--key-rotation", "5ms"}));
  ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
  const PublishedSegment security(socket(), 112);
  while (security.word(0) < 13) {
  }
  daemon.stop();
  /* 13 keys and more: the current one, the one before, and as many older ones as there is room for. */
  EXPECT_THAT(daemon.log(), HasSubstr("the keys have number 13"));
}

TEST_F(Keys, are_not_changed_while_a_reader_is_inside) {
  DaemonProcess daemon(directory_, arguments({"--key-file", key_file("one")}));
  ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
  const PublishedSegment security(socket(), 112);
  const ReaderLock lock(socket());
  lock.enter();
  key_file("two");
  rotate(daemon, "the keys have number 2");
  EXPECT_EQ(security.word(0), 1U);
  EXPECT_EQ(security.bytes(current_at, 280), status(1, 1, {'o', 'n', 'e'}));
  lock.leave();
  lock.wait_for_writer();
  EXPECT_EQ(security.word(0), 2U);
}

TEST_F(Keys, are_wiped_from_the_segment_when_the_daemon_stops) {
  DaemonProcess daemon(directory_, arguments({"--key-file", key_file("secret")}));
  ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
  const PublishedSegment security(socket(), 112);
  EXPECT_EQ(daemon.stop(), 0);
  EXPECT_EQ(security.bytes(0, 3168), Bytes(3168));
}

TEST_F(Keys, never_stand_in_the_log) {
  DaemonProcess daemon(directory_, arguments({"--key-file", key_file("Zq9secret"), "--log-level", "trace"}));
  ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
  daemon.stop();
  EXPECT_THAT(daemon.log(), testing::Not(HasSubstr("Zq9")));
}

struct Refused {
  std::string name;
  std::string text;
  mode_t mode;
  std::string complaint;
};

void PrintTo(const Refused& each, std::ostream* out) { *out << each.name; }

class RefusedKeyFile : public Keys, public testing::WithParamInterface<Refused> {};

TEST_P(RefusedKeyFile, keeps_the_daemon_from_starting) {
  DaemonProcess daemon(directory_, arguments({"--key-file", key_file(GetParam().text, GetParam().mode)}));
  EXPECT_FALSE(daemon.wait_until_ready());
  EXPECT_EQ(daemon.wait_for_end(), 1);
  EXPECT_THAT(daemon.log(), HasSubstr("hbd: the key file " + directory_.path("key") + " " + GetParam().complaint));
}

INSTANTIATE_TEST_SUITE_P(
    Of, RefusedKeyFile,
    testing::Values(Refused{"group_readable", "key", 0640, "is open to group or others (mode 0640)"},
                    Refused{"world_readable", "key", 0604, "is open to group or others (mode 0604)"},
                    Refused{"group_writable", "key", 0620, "is open to group or others (mode 0620)"},
                    Refused{"no_bytes", "", 0600, "has 0 bytes; a key has 1 to 244"},
                    Refused{"too_many_bytes", std::string(245, 'k'), 0600, "has 245 bytes; a key has 1 to 244"}),
    [](const auto& each) { return each.param.name; });

TEST_F(Keys, of_the_largest_size_are_taken) {
  DaemonProcess daemon(directory_, arguments({"--key-file", key_file(std::string(244, 'k'))}));
  ASSERT_TRUE(daemon.wait_until_ready()) << daemon.log();
  EXPECT_EQ(PublishedSegment(socket(), 112).bytes(current_at, 280), status(1, 1, Bytes(244, 'k')));
}

TEST_F(Keys, of_what_is_no_file_keep_the_daemon_from_starting) {
  for (const std::string& file : {directory_.path("missing"), directory_.path("")}) {
    DaemonProcess daemon(directory_, arguments({"--key-file", file}));
    EXPECT_FALSE(daemon.wait_until_ready());
    EXPECT_EQ(daemon.wait_for_end(), 1);
    EXPECT_THAT(daemon.log(), HasSubstr("the key file " + file));
  }
}

TEST_F(Keys, of_another_user_keep_the_daemon_from_starting) {
  /* Only the superuser can give a file away; to everybody else the superuser is another user. */
  const bool is_superuser = geteuid() == 0;
  const std::string file = is_superuser ? key_file("secret") : "/etc/passwd";
  if (is_superuser) {
    ASSERT_EQ(chown(file.c_str(), 1, 1), 0);
  }
  DaemonProcess daemon(directory_, arguments({"--key-file", file}));
  EXPECT_FALSE(daemon.wait_until_ready());
  EXPECT_EQ(daemon.wait_for_end(), 1);
  EXPECT_THAT(daemon.log(), HasSubstr("hbd: the key file " + file + " belongs to user " + (is_superuser ? "1" : "0")));
}

}  // namespace
