#include "wait.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <utility>

namespace hbctl {
namespace {

using std::chrono::steady_clock;

struct Pipe {
  int read_end = -1;
  int write_end = -1;
  Pipe() {
    int ends[2] = {-1, -1};
    EXPECT_EQ(pipe2(ends, O_CLOEXEC), 0);
    read_end = ends[0];
    write_end = ends[1];
  }
  ~Pipe() {
    close(read_end);
    close(write_end);
  }
  Pipe(const Pipe&) = delete;
  Pipe& operator=(const Pipe&) = delete;
  void fill() const { EXPECT_EQ(write(write_end, "x", 1), 1); }
};

class HbctlWait : public testing::Test {
 protected:
  Wake wait(const Deadline& deadline = std::nullopt) const {
    return wait_for({events_, stop_.read_end, output_.write_end}, deadline);
  }
  Pipe event_;
  Pipe stop_;
  Pipe output_;
  std::vector<int> events_{event_.read_end};
};

TEST_F(HbctlWait, ends_with_an_event) {
  event_.fill();
  EXPECT_EQ(wait(), Wake::Event);
}

TEST_F(HbctlWait, ends_with_the_end_of_the_stream) {
  close(std::exchange(event_.write_end, -1));
  EXPECT_EQ(wait(), Wake::Event);
}

TEST_F(HbctlWait, prefers_to_stop) {
  event_.fill();
  stop_.fill();
  EXPECT_EQ(wait(steady_clock::now()), Wake::Stop);
}

TEST_F(HbctlWait, notices_that_the_output_has_no_reader) {
  event_.fill();
  close(std::exchange(output_.read_end, -1));
  EXPECT_EQ(wait(), Wake::OutputClosed);
}

TEST_F(HbctlWait, is_over_when_the_time_is_even_while_events_come) {
  event_.fill();
  EXPECT_EQ(wait(steady_clock::now()), Wake::TimeUp);
  EXPECT_EQ(wait(steady_clock::now() + std::chrono::hours(1)), Wake::Event);
}

TEST_F(HbctlWait, is_over_when_the_time_is_and_nothing_comes) {
  const auto deadline = steady_clock::now() + std::chrono::milliseconds(3);
  EXPECT_EQ(wait(deadline), Wake::TimeUp);
  EXPECT_GE(steady_clock::now(), deadline);
}

TEST_F(HbctlWait, needs_no_stop_and_no_output) {
  event_.fill();
  EXPECT_EQ(wait_for({events_}, std::nullopt), Wake::Event);
}

}  // namespace
}  // namespace hbctl
