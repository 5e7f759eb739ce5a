#include "client.h"

#include <spdlog/spdlog.h>
#include <sys/socket.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <utility>

namespace hbd {

Client::Client(Loop& loop, Descriptor socket, std::string label, ClientOwner& owner)
    : loop_(loop),
      socket_(std::move(socket)),
      label_(std::move(label)),
      owner_(owner),
      poll_(loop, socket_.get(), [this](int events) { on_ready(events); }) {
  poll_.watch(UV_READABLE);
}

void Client::push(SharedFrame frame, const SubscriptionName& name, OutputQueue::Time told_at) {
  if (!connected()) {
    return;
  }
  const bool was_behind = is_behind();
  const auto result = output_.push(socket_.get(), std::move(frame), name, owner_.queue_bound(), told_at);
  if (result == OutputQueue::Result::Kept && !was_behind) {
    last_progress_ = loop_.now();
    poll_.watch(UV_READABLE | UV_WRITABLE);
  }
  settle(result);
}

void Client::disconnect() {
  if (!connected()) {
    return;
  }
  poll_.close();
  socket_.close();
  owner_.on_relief(*this);
}

void Client::on_ready(int events) {
  if ((events & UV_WRITABLE) != 0 && is_behind()) {
    flush();
  }
  if ((events & UV_READABLE) != 0 && connected()) {
    receive();
  }
}

void Client::receive() {
  std::array<std::uint8_t, 16384> buffer;
  const ssize_t received = recv(socket_.get(), buffer.data(), buffer.size(), MSG_DONTWAIT);
  if (received < 0 && (errno == EAGAIN || errno == EWOULDBLOCK || errno == EINTR)) {
    return;
  }
  if (received <= 0) {
    spdlog::debug("{}: has left", label_);
    disconnect();
    return;
  }
  input_.append({buffer.data(), static_cast<std::size_t>(received)});
  take_requests();
}

void Client::take_requests() {
  while (connected()) {
    switch (input_.next()) {
      case FrameReader::State::Incomplete:
        return;
      case FrameReader::State::BadLength:
        refuse(fmt::format("a packet length of {}", input_.length()));
        return;
      case FrameReader::State::Packet: {
        const Request request = parse_request(input_.packet());
        if (const auto* malformed = std::get_if<MalformedRequest>(&request)) {
          refuse(malformed->reason);
        } else {
          owner_.on_request(*this, request);
        }
      }
    }
  }
}

void Client::drop_stale() {
  const std::size_t dropped = output_.drop_told_before(loop_.now() - owner_.stale_age());
  if (dropped != 0) {
    spdlog::debug("{}: {} events were stale before it read them; dropped", label_, dropped);
  }
}

void Client::flush() {
  if (discards_stale) {
    drop_stale();
  }
  const std::size_t before = output_.size();
  const auto result = output_.flush(socket_.get());
  if (output_.size() != before) {
    last_progress_ = loop_.now();
  }
  settle(result);
  if (connected() && !is_behind()) {
    poll_.watch(UV_READABLE);
    owner_.on_relief(*this);
  }
}

void Client::settle(OutputQueue::Result result) {
  if (result == OutputQueue::Result::Full) {
    spdlog::warn("{}: does not read, {} bytes are kept for it; disconnected", label_, output_.size());
    disconnect();
  } else if (result == OutputQueue::Result::Broken) {
    spdlog::debug("{}: cannot be sent to: {}", label_, std::strerror(errno));
    disconnect();
  }
}

void Client::refuse(const std::string& reason) {
  spdlog::warn("{}: sent {}; disconnected", label_, reason);
  disconnect();
}

}  // namespace hbd
