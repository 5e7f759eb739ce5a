// A client of the sparse cluster that steers its daemon, and requests as they go over the connection.
#pragma once

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstring>
#include <initializer_list>

#include "hb_communication/connection.h"
#include "queries/test_cluster.h"
#include "support/running_client.h"

namespace hb_test {

// Length, 76 bytes of header, data.
inline Bytes request_frame(int32_t kind, int32_t len, const Bytes& data) {
  return framed(ByteBuilder().zeros(8).i32(kind).i32(len).zeros(48).i32(getpid()).zeros(8).raw(data).bytes());
}

inline Bytes request_with(int32_t kind, const Bytes& data) {
  return request_frame(kind, static_cast<int32_t>(data.size()), data);
}

inline Bytes request_without_data(int32_t kind) { return request_frame(kind, 0, Bytes()); }

// The length field carries the number, and as many zero bytes follow.
inline Bytes request_with_number(int32_t kind, int32_t number) {
  return request_frame(kind, number, Bytes(static_cast<size_t>(number), '\0'));
}

inline Bytes octets(std::initializer_list<uint8_t> values) { return Bytes(values.begin(), values.end()); }

// The four bytes in that order in memory, whatever the host's order.
inline Hb_IP_address4 ipv4(std::initializer_list<uint8_t> bytes) {
  Hb_IP_address4 address;
  std::memcpy(&address, octets(bytes).data(), sizeof address);
  return address;
}

// That is what was sent, all of it.
inline testing::AssertionResult sends(DaemonConnection& connection, const Bytes& frame) {
  if (!connection.has_input()) {
    return testing::AssertionFailure() << "nothing was sent";
  }
  if (connection.receive_raw(frame.size()) != frame) {
    return testing::AssertionFailure() << "another request was sent";
  }
  return connection.has_input() ? testing::AssertionFailure() << "more was sent" : testing::AssertionSuccess();
}

class Steering : public RunningClient {
 protected:
  explicit Steering(const ConfigurationMessage& configuration = sparse_cluster()) : RunningClient(configuration) {}

  testing::AssertionResult sent(const Bytes& frame) { return sends(connection, frame); }

  // The call fails with that error and sends nothing. There is no answer: one that is awaited all the same would be for
  // ever, but for the end of the stream.
  template <typename Call>
  testing::AssertionResult refuses(int error, Call call) {
    shutdown(connection.descriptor(), SHUT_WR);
    const testing::AssertionResult result = fails_with(error, call);
    return result ? nothing_sent() : result;
  }

  testing::AssertionResult nothing_sent() const {
    return connection.has_input() ? testing::AssertionFailure() << "something was sent" : testing::AssertionSuccess();
  }
};

}  // namespace hb_test
