#include "wire.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cstring>
#include <stdexcept>

namespace {
constexpr int patience_ms = 20000;
}

ByteWriter& ByteWriter::u8(unsigned value) {
  bytes_.push_back(static_cast<std::uint8_t>(value));
  return *this;
}

ByteWriter& ByteWriter::u16(unsigned value) { return u8(value & 0xFF).u8(value >> 8); }

ByteWriter& ByteWriter::u32(std::uint32_t value) { return u16(value & 0xFFFF).u16(value >> 16); }

ByteWriter& ByteWriter::u64(std::uint64_t value) {
  return u32(static_cast<std::uint32_t>(value)).u32(static_cast<std::uint32_t>(value >> 32));
}

ByteWriter& ByteWriter::zeros(std::size_t count) {
  bytes_.insert(bytes_.end(), count, 0);
  return *this;
}

ByteWriter& ByteWriter::raw(const Bytes& bytes) {
  bytes_.insert(bytes_.end(), bytes.begin(), bytes.end());
  return *this;
}

ByteWriter& ByteWriter::text(const std::string& text, std::size_t size) {
  bytes_.insert(bytes_.end(), text.begin(), text.end());
  return zeros(size - text.size());
}

Bytes ExpectedPacket::bytes() const {
  return ByteWriter()
      .u32(kind)               // 0
      .u32(leader)             // 4
      .u32(0)                  // 8
      .u32(0)                  // 12
      .u32(group_incarnation)  // 16
      .u32(group_status)       // 20
      .text(name, 32)          // 24
      .u32(value)              // 56
      .text(ffdc_id, 43)       // 60
      .u8(0)                   // 103
      .u32(sequence)           // 104
      .raw(message)            // 108
      .bytes();
}

namespace {

Bytes framed_request(std::uint32_t code, std::uint32_t len, const Bytes& data) {
  return ByteWriter()
      .u32(static_cast<std::uint32_t>(76 + data.size()))
      .u64(0)                                     // 0
      .u32(code)                                  // 8
      .u32(len)                                   // 12
      .zeros(48)                                  // 16
      .u32(static_cast<std::uint32_t>(getpid()))  // 64
      .u64(0)                                     // 68
      .raw(data)                                  // 76
      .bytes();
}

}  // namespace

Bytes request(std::uint32_t code, const Bytes& data) {
  return framed_request(code, static_cast<std::uint32_t>(data.size()), data);
}

Bytes request_with_number(std::uint32_t code, std::uint32_t number) {
  return framed_request(code, number, Bytes(number));
}

Bytes subscription(SubscriptionType type, std::uint32_t events, const std::string& name, const Bytes& set) {
  Bytes record = ByteWriter()
                     .u32(static_cast<std::uint32_t>(type))  // 0
                     .u32(0)                                 // 4
                     .u32(events)                            // 8
                     .text(name, 32)                         // 12
                     .u16(0)                                 // 44
                     .u16(0)                                 // 46
                     .u32(0)                                 // 48: the number of members, which nobody reads
                     .raw(set)                               // 52
                     .bytes();
  record.resize(12348);
  return record;
}

std::uint32_t field(const Bytes& packet, std::size_t offset) {
  std::uint32_t value = 0;
  std::memcpy(&value, packet.data() + offset, sizeof(value));
  return value;
}

std::string text_field(const Bytes& packet, std::size_t offset) {
  return reinterpret_cast<const char*>(packet.data() + offset);
}

Connection::Connection(const std::string& path) : socket_(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
  sockaddr_un address{};
  address.sun_family = AF_UNIX;
  path.copy(address.sun_path, sizeof(address.sun_path) - 1);
  if (connect(socket_, reinterpret_cast<const sockaddr*>(&address), sizeof(address)) != 0) {
    throw std::runtime_error("no connection to " + path);
  }
}

Connection::~Connection() { close(socket_); }

void Connection::send(const Bytes& bytes) const {
  std::size_t sent = 0;
  while (sent < bytes.size()) {
    const ssize_t taken = ::send(socket_, bytes.data() + sent, bytes.size() - sent, MSG_NOSIGNAL);
    if (taken < 0) {
      return;
    }
    sent += static_cast<std::size_t>(taken);
  }
}

bool Connection::read_exactly(std::uint8_t* to, std::size_t size) const {
  while (size > 0) {
    pollfd ready{socket_, POLLIN, 0};
    if (poll(&ready, 1, patience_ms) != 1) {
      return false;
    }
    const ssize_t taken = recv(socket_, to, size, 0);
    if (taken <= 0) {
      return false;
    }
    to += taken;
    size -= static_cast<std::size_t>(taken);
  }
  return true;
}

std::optional<Bytes> Connection::receive() {
  Bytes length(4);
  if (!read_exactly(length.data(), length.size())) {
    return std::nullopt;
  }
  Bytes packet(field(length, 0));
  if (!read_exactly(packet.data(), packet.size())) {
    return std::nullopt;
  }
  return packet;
}

void Connection::subscribe(SubscriptionType type, std::uint32_t events, const std::string& name,
                           const Bytes& set) const {
  send(request(209, subscription(type, events, name, set)));
}

std::optional<Bytes> Connection::configuration() {
  send(request(201, {}));
  return receive();
}

bool Connection::is_ended() {
  std::uint8_t byte = 0;
  for (;;) {
    pollfd ready{socket_, POLLIN, 0};
    if (poll(&ready, 1, patience_ms) != 1) {
      return false;
    }
    if (recv(socket_, &byte, 1, 0) <= 0) {
      return true;
    }
  }
}

bool Connection::wait_until_ended() const {
  pollfd ended{socket_, POLLRDHUP, 0};
  return poll(&ended, 1, patience_ms) == 1 && (ended.revents & (POLLHUP | POLLRDHUP)) != 0;
}

bool Connection::is_quiet() const {
  pollfd ready{socket_, POLLIN, 0};
  return poll(&ready, 1, 0) == 0;
}
