// A packet of the daemon with the length that was sent, and reading it without running past its end.
#pragma once

#include <cstddef>
#include <cstring>
#include <memory>
#include <utility>

#include "hb_protocol/replies.h"

class Packet {
 public:
  Packet() = default;

  // Takes over an array as it was received. One that is shorter than a header is copied into a whole header with
  // zeros for what was not sent. Without memory for that the packet stays empty.
  Packet(char* bytes, size_t length);

  explicit operator bool() const { return bytes_ != nullptr; }

  client_packet_t* get() const { return reinterpret_cast<client_packet_t*>(bytes_.get()); }
  client_packet_t* operator->() const { return get(); }
  client_packet_t* release() { return reinterpret_cast<client_packet_t*>(bytes_.release()); }

  // Bytes of the message that were sent.
  size_t message_length() const { return length_ > HB_REPLY_HEADER_SIZE ? length_ - HB_REPLY_HEADER_SIZE : 0; }

 private:
  std::unique_ptr<char[]> bytes_;
  size_t length_ = 0;
};

// The message of a packet: whether something lies in it whole, and copies of it.
class Message {
 public:
  Message(const char* bytes, size_t length) : bytes_(bytes), length_(length) {}
  explicit Message(const Packet& packet) : Message(packet->message, packet.message_length()) {}

  // A packet that came by pointer alone is as long as its type says.
  explicit Message(const client_packet_t* packet) : Message(packet->message, sizeof packet->message) {}

  bool holds(size_t offset, size_t size) const { return offset <= length_ && size <= length_ - offset; }

  // Requires holds(offset, sizeof(T)).
  template <typename T>
  T at(size_t offset) const {
    T value;
    std::memcpy(&value, bytes_ + offset, sizeof value);
    return value;
  }

  // Requires holds(offset, size).
  void copy(void* to, size_t offset, size_t size) const { std::memcpy(to, bytes_ + offset, size); }

 private:
  const char* bytes_;
  size_t length_;
};
