/* Requests that steer adapters, in bytes, for the tests of what they do. */
#ifndef HB_TESTS_DAEMON_STEERING_H
#define HB_TESTS_DAEMON_STEERING_H

#include <optional>

#include "wire.h"

/** A request about the local adapter on a network. */
inline Bytes steer(std::uint32_t code, unsigned network) {
  return request(code, ByteWriter().u16(network & 0xFFFF).bytes());
}

/** The same with a 32-bit value. */
inline Bytes steer(std::uint32_t code, unsigned network, std::uint32_t value) {
  return request(code, ByteWriter().u16(network & 0xFFFF).u16(0).u32(value).bytes());
}

/** The four bytes of an IPv4 address as a value that is sent in this order. */
constexpr std::uint32_t address4(std::uint32_t a, std::uint32_t b, std::uint32_t c, std::uint32_t d) {
  return a | b << 8 | c << 16 | d << 24;
}

/** The 16 bytes of an IPv4 address as it stands in records. */
inline Bytes mapped(unsigned a, unsigned b, unsigned c, unsigned d) {
  return ByteWriter().zeros(10).u8(0xFF).u8(0xFF).u8(a).u8(b).u8(c).u8(d).bytes();
}

/** Sends a request and yields its answer. */
inline Bytes ask(Connection& client, const Bytes& wanted) {
  client.send(wanted);
  return client.receive().value_or(Bytes(112));
}

/** An answer without a message. */
inline Bytes answer(std::uint32_t kind, std::uint32_t status) {
  ExpectedPacket packet;
  packet.kind = kind;
  packet.value = status;
  return packet.bytes();
}

/** Address of the adapter that is the n-th record of a configuration. */
inline Bytes address_of_record(const Bytes& configuration, std::size_t n) {
  const auto start = configuration.begin() + static_cast<std::ptrdiff_t>(108 + 52 + n * 64);
  return {start, start + 16};
}

/** Its state: 1 is up, 2 is down. */
inline std::uint32_t state_of_record(const Bytes& configuration, std::size_t n) {
  return field(configuration, 108 + 52 + n * 64 + 60);
}

#endif
