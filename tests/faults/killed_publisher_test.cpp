// The daemon's own publisher, killed while it writes: the lock is free, what is published is whole or marked as
// nothing, and the next daemon publishes at the same path.
#include <gtest/gtest.h>
#include <spdlog/spdlog.h>
#include <sys/ipc.h>
#include <sys/sem.h>
#include <sys/shm.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <random>
#include <string>

#include "child_process.h"
#include "publisher.h"
#include "sealed_route.h"
#include "stale_objects.h"
#include "support/temporary_directory.h"

namespace hb_test {
namespace {

constexpr int kills_to_see = 1000;
constexpr uint32_t nodes = 1024;  // copying so many routes takes a while
constexpr uint16_t route_length = 176;

// What the publisher tells the test.
struct Progress {
  std::atomic<uint64_t> published = 0;
  std::atomic<bool> cannot_start = false;
};

// The words of each route follow from its node and from one of two colours.
hbd::Publication publication_of(uint32_t colour) {
  hbd::Publication publication;
  publication.configuration = {0, nodes, 1};
  publication.routes.resize(nodes);
  uint32_t state = colour;
  for (route_sequence& route : publication.routes) {
    uint32_t words[44];
    for (uint32_t& word : words) word = (state = state * 1664525 + 1013904223);
    seal(words);
    route.length = route_length;
    std::memcpy(&route.ip_option, words, sizeof words);
  }
  return publication;
}

void stamp(hbd::Publication& publication, uint32_t number) {
  publication.configuration.sequence_number = number;
  for (route_sequence& route : publication.routes) route.sequence_number = number;
}

// Keys whose bytes are all made of their number.
security_information keys_of(uint32_t number) {
  security_information keys;
  std::memset(&keys, static_cast<int>(number & 0xFF), sizeof keys);
  keys.sequence_number = number;
  return keys;
}

// A published segment as a client has it.
class Attached {
 public:
  Attached(const std::string& path, int project)
      : address_(shmat(shmget(ftok(path.c_str(), project), 0, 0), nullptr, SHM_RDONLY)) {}
  ~Attached() { shmdt(address_); }
  Attached(const Attached&) = delete;
  Attached& operator=(const Attached&) = delete;

  template <typename Record>
  const Record* records() const {
    return static_cast<const Record*>(address_);
  }

 private:
  const void* address_;
};

class KilledPublisher : public testing::Test {
 protected:
  KilledPublisher() : path_(free_path()) {
    spdlog::set_level(spdlog::level::off);
    for (hbd::Publication& publication : publications_) stamp(publication, 1);
  }
  ~KilledPublisher() override { hbd::remove_stale_objects(path_); }

  // Publishes without end: routes and keys, with a new number each time.
  void publish() {
    try {
      hbd::Loop loop;
      hbd::remove_stale_objects(path_);
      hbd::Publisher publisher(loop, path_, publications_[0], std::chrono::seconds(1));
      for (uint32_t number = 2;; ++number) {
        hbd::Publication& next = publications_[number % 2];
        stamp(next, number);
        publisher.publish(hbd::Publication(next));
        const security_information keys = keys_of(number);
        publisher.publish(keys);
        progress_->published++;
      }
    } catch (const std::exception&) {
      progress_->cannot_start = true;
    }
  }

  // False when the publisher could not start.
  bool await_publication() {
    const uint64_t before = progress_->published;
    while (progress_->published == before && !progress_->cannot_start) sched_yield();
    return !progress_->cannot_start;
  }

  // Up to some rounds of the publisher.
  void pass_a_moment() { pass(random_() % 100000); }

  int semaphore(int number) const {
    return semctl(semget(ftok(path_.c_str(), HB_SEMAPHORE_SET_ID), 2, 0), number, GETVAL);
  }

  // Whether routes are published; those that are have to be of one publication, each of them whole.
  bool has_whole_routes() const {
    const Attached configuration(path_, HB_CONFIGURATION_SEGMENT_ID);
    const uint32_t number = configuration.records<memory_configuration_data>()->sequence_number;
    if (number == 0) return false;
    const Attached segment(path_, HB_ROUTE_SEGMENT_ID);
    const auto* routes = segment.records<route_sequence>();
    EXPECT_EQ(nodes, std::count_if(routes, routes + nodes, [&](const route_sequence& route) {
                return route.sequence_number == number && route.length == route_length && is_sealed(route.ip_option);
              }));
    return true;
  }

  void expect_whole_keys() const {
    const Attached segment(path_, HB_SECURITY_SEGMENT_ID);
    const auto* keys = segment.records<security_information>();
    if (keys->sequence_number != 0) {
      const security_information expected = keys_of(keys->sequence_number);
      EXPECT_EQ(0, std::memcmp(&expected, keys, sizeof expected));
    }
  }

  TemporaryDirectory directory_;
  std::string path_;
  hbd::Publication publications_[2] = {publication_of(1), publication_of(2)};
  Shared<Progress> progress_;

 private:
  // A file whose keys nobody has. Those of other files stay, so that none gets the same keys again.
  std::string free_path() {
    hbd::Loop loop;
    for (int i = 0;; ++i) {
      std::string path = directory_.write(std::to_string(i), "");
      try {
        const hbd::Publisher publisher(loop, path, {{1, nodes, 1}, {}}, std::chrono::seconds(1));
        return path;
      } catch (const hbd::KeyTaken&) {
        if (i == 100) throw;
      }
    }
  }

  std::minstd_rand random_{4711};
};

TEST_F(KilledPublisher, LeavesTheLockFreeAndNothingHalfWrittenAndMakesWayForTheNext) {
  int tries = 0;
  int kills = 0;
  int half_written = 0;
  for (; kills < kills_to_see && !HasFailure(); ++tries) {
    Child publisher([this] { publish(); });
    ASSERT_TRUE(await_publication());
    pass_a_moment();
    publisher.stop();
    const bool writes = semaphore(HB_WRITER_SEMAPHORE) == 1;
    publisher.kill_and_wait();
    kills += writes ? 1 : 0;
    EXPECT_EQ(0, semaphore(HB_READERS_SEMAPHORE));
    EXPECT_EQ(0, semaphore(HB_WRITER_SEMAPHORE));
    half_written += has_whole_routes() ? 0 : 1;
    expect_whole_keys();
  }
  RecordProperty("tries", tries);
  RecordProperty("kills", kills);
  RecordProperty("half_written", half_written);
  EXPECT_GT(half_written, 0);
  EXPECT_LE(half_written, kills);

  hbd::Loop loop;
  hbd::remove_stale_objects(path_);
  const hbd::Publisher next(loop, path_, publications_[0], std::chrono::seconds(1));
  EXPECT_TRUE(has_whole_routes());
}

}  // namespace
}  // namespace hb_test
