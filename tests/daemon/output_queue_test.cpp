/* Sending to a socket that takes what it likes. */
#include "output_queue.h"

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <chrono>

#include "wire.h"

namespace {

using hbd::OutputQueue;
using hbd::SharedFrame;
using hbd::SubscriptionName;
using Result = OutputQueue::Result;

SharedFrame frame_of(std::size_t size) {
  auto frame = std::make_shared<hbd::Frame>(size);
  for (std::size_t i = 0; i < size; ++i) {
    (*frame)[i] = static_cast<std::uint8_t>(i * 7);
  }
  return frame;
}

/* The frame's bytes with the name at 28, where it stands behind the length. */
Bytes with_name(const SharedFrame& frame, const SubscriptionName& name) {
  Bytes bytes = *frame;
  std::copy(name.begin(), name.end(), bytes.begin() + 28);
  return bytes;
}

class Queue : public testing::Test {
 protected:
  Queue() {
    EXPECT_EQ(socketpair(AF_UNIX, SOCK_STREAM, 0, sockets_.data()), 0);
    const int small = 4096;
    setsockopt(sockets_[0], SOL_SOCKET, SO_SNDBUF, &small, sizeof(small));
  }
  ~Queue() override {
    close(sockets_[0]);
    close(sockets_[1]);
  }

  Bytes read_what_is_there() {
    Bytes bytes(1 << 16);
    const ssize_t size = recv(sockets_[1], bytes.data(), bytes.size(), MSG_DONTWAIT);
    bytes.resize(size < 0 ? 0 : static_cast<std::size_t>(size));
    return bytes;
  }

  std::array<int, 2> sockets_{};
  OutputQueue queue_;
  SubscriptionName name_{'m', 'i', 'n', 'e'};
};

TEST_F(Queue, sends_at_once_with_the_name_in_its_place) {
  const auto frame = frame_of(116);
  EXPECT_EQ(queue_.push(sockets_[0], frame, name_, 0), Result::Sent);
  EXPECT_TRUE(queue_.empty());
  EXPECT_EQ(read_what_is_there(), with_name(frame, name_));
}

TEST_F(Queue, keeps_what_the_socket_does_not_take_and_sends_it_later_in_order) {
  const auto large = frame_of(100000);
  const auto small = frame_of(112);
  const SubscriptionName other{'o'};
  ASSERT_EQ(queue_.push(sockets_[0], large, name_, 1000000), Result::Kept);
  ASSERT_EQ(queue_.push(sockets_[0], small, other, 1000000), Result::Kept);
  EXPECT_GT(queue_.size(), 112U);

  Bytes received;
  for (auto result = Result::Kept; result == Result::Kept || received.size() < 100112;) {
    const Bytes more = read_what_is_there();
    received.insert(received.end(), more.begin(), more.end());
    result = queue_.flush(sockets_[0]);
    ASSERT_NE(result, Result::Broken);
  }
  Bytes expected = with_name(large, name_);
  const Bytes second = with_name(small, other);
  expected.insert(expected.end(), second.begin(), second.end());
  EXPECT_EQ(received, expected);
  EXPECT_EQ(queue_.size(), 0U);
}

TEST_F(Queue, refuses_a_frame_beyond_the_bound_and_counts_what_is_left_only) {
  const auto large = frame_of(100000);
  ASSERT_EQ(queue_.push(sockets_[0], large, name_, 1000000), Result::Kept);
  const std::size_t kept = queue_.size();
  ASSERT_LT(kept, 100000U);
  EXPECT_EQ(queue_.push(sockets_[0], frame_of(112), name_, kept + 111), Result::Full);
  EXPECT_EQ(queue_.size(), kept);
  EXPECT_EQ(queue_.push(sockets_[0], frame_of(112), name_, kept + 112), Result::Kept);
  EXPECT_EQ(queue_.size(), kept + 112);
}

TEST_F(Queue, drops_events_of_before_a_time_but_no_answer_and_nothing_that_is_sent_in_part) {
  using std::chrono::milliseconds;
  const auto large = frame_of(100000);
  const auto answer = frame_of(112);
  const auto late = frame_of(113);
  ASSERT_EQ(queue_.push(sockets_[0], large, name_, 1000000, milliseconds(1)), Result::Kept);
  ASSERT_EQ(queue_.push(sockets_[0], frame_of(114), name_, 1000000, milliseconds(4)), Result::Kept);
  ASSERT_EQ(queue_.push(sockets_[0], answer, name_, 1000000), Result::Kept);
  ASSERT_EQ(queue_.push(sockets_[0], late, name_, 1000000, milliseconds(5)), Result::Kept);
  const std::size_t before = queue_.size();
  EXPECT_EQ(queue_.drop_told_before(milliseconds(5)), 1U);
  EXPECT_EQ(queue_.size(), before - 114);

  Bytes received;
  for (auto result = Result::Kept; result == Result::Kept || received.size() < 100225;) {
    const Bytes more = read_what_is_there();
    received.insert(received.end(), more.begin(), more.end());
    result = queue_.flush(sockets_[0]);
    ASSERT_NE(result, Result::Broken);
  }
  Bytes expected;
  for (const auto& frame : {large, answer, late}) {
    const Bytes bytes = with_name(frame, name_);
    expected.insert(expected.end(), bytes.begin(), bytes.end());
  }
  EXPECT_EQ(received, expected);
}

TEST_F(Queue, tells_a_broken_connection_without_a_signal) {
  close(sockets_[1]);
  sockets_[1] = -1;
  EXPECT_EQ(queue_.push(sockets_[0], frame_of(112), name_, 1000), Result::Broken);
  EXPECT_EQ(errno, EPIPE);
}

TEST_F(Queue, shares_the_bytes_instead_of_copying_them) {
  const auto large = frame_of(100000);
  ASSERT_EQ(queue_.push(sockets_[0], large, name_, 1000000), Result::Kept);
  EXPECT_EQ(large.use_count(), 2);
}

}  // namespace
