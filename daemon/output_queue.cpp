#include "output_queue.h"

#include <sys/socket.h>
#include <sys/uio.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <optional>
#include <span>
#include <utility>

namespace hbd {
namespace {

using Bytes = std::span<const std::uint8_t>;

/* The frame in three pieces: before the name, the name, behind it; less the bytes that are sent. */
std::array<iovec, 3> pieces(const Frame& frame, const SubscriptionName& name, std::size_t sent) {
  const Bytes whole(frame);
  const std::array<Bytes, 3> all = {whole.first(frame_name_offset),
                                    Bytes(reinterpret_cast<const std::uint8_t*>(name.data()), name.size()),
                                    whole.subspan(frame_name_offset + name.size())};
  std::array<iovec, 3> rest{};
  for (std::size_t i = 0; i < all.size(); ++i) {
    const std::size_t skipped = std::min(sent, all[i].size());
    sent -= skipped;
    const Bytes left = all[i].subspan(skipped);
    rest[i] = {const_cast<std::uint8_t*>(left.data()), left.size()};
  }
  return rest;
}

/* So much is copied with its name put in, which costs less than a send of several pieces. */
constexpr std::size_t small_frame = 4096;

ssize_t send_copy(int socket, const Frame& frame, const SubscriptionName& name, std::size_t sent) {
  std::array<std::uint8_t, small_frame> copy;
  std::copy(frame.begin(), frame.end(), copy.begin());
  std::copy(name.begin(), name.end(), copy.begin() + frame_name_offset);
  return send(socket, copy.data() + sent, frame.size() - sent, MSG_DONTWAIT | MSG_NOSIGNAL);
}

ssize_t send_in_pieces(int socket, const Frame& frame, const SubscriptionName& name, std::size_t sent) {
  auto rest = pieces(frame, name, sent);
  msghdr message{};
  message.msg_iov = rest.data();
  message.msg_iovlen = rest.size();
  return sendmsg(socket, &message, MSG_DONTWAIT | MSG_NOSIGNAL);
}

/* Bytes that the socket took, 0 when it takes none now; nothing when it is broken. */
std::optional<std::size_t> send_pieces(int socket, const Frame& frame, const SubscriptionName& name, std::size_t sent) {
  for (;;) {
    const ssize_t taken =
        frame.size() <= small_frame ? send_copy(socket, frame, name, sent) : send_in_pieces(socket, frame, name, sent);
    if (taken >= 0) {
      return static_cast<std::size_t>(taken);
    }
    if (errno == EAGAIN || errno == EWOULDBLOCK) {
      return 0;
    }
    if (errno != EINTR) {
      return std::nullopt;
    }
  }
}

}  // namespace

OutputQueue::Result OutputQueue::push(int socket, SharedFrame frame, const SubscriptionName& name, std::size_t bound,
                                      Time told_at) {
  std::size_t sent = 0;
  if (entries_.empty()) {
    const auto taken = send_pieces(socket, *frame, name, 0);
    if (!taken) {
      return Result::Broken;
    }
    sent = *taken;
  }
  const std::size_t left = frame->size() - sent;
  if (left == 0) {
    return Result::Sent;
  }
  if (size_ + left > bound) {
    return Result::Full;
  }
  size_ += left;
  entries_.push_back({std::move(frame), name, sent, told_at});
  return Result::Kept;
}

std::size_t OutputQueue::drop_told_before(std::chrono::milliseconds time) {
  return std::erase_if(entries_, [&](const Entry& entry) {
    const bool is_stale = entry.sent == 0 && entry.told_at && *entry.told_at < time;
    size_ -= is_stale ? entry.frame->size() : 0;
    return is_stale;
  });
}

OutputQueue::Result OutputQueue::flush(int socket) {
  while (!entries_.empty()) {
    Entry& entry = entries_.front();
    const auto taken = send_pieces(socket, *entry.frame, entry.name, entry.sent);
    if (!taken) {
      return Result::Broken;
    }
    if (*taken == 0) {
      return Result::Kept;
    }
    entry.sent += *taken;
    size_ -= *taken;
    if (entry.sent == entry.frame->size()) {
      entries_.pop_front();
    }
  }
  return Result::Sent;
}

}  // namespace hbd
