// A request and the answer that is awaited, of any kind, while reading, writing and waiting may fail.
#include <array>

#include "hb_communication/connection.h"
#include "support/conventions.h"
#include "support/packets.h"
#include "support/system.h"

namespace {

using fuzz::the_system;

struct Exchange {
  int32_t request;
  int32_t request_length;
  int32_t awaited_kind;
  uint8_t flags;
  uint8_t faults;  // bytes of script that follow; none: all goes well
};

enum Exchange_Flag : uint8_t { with_data = 1, with_time_out = 2, with_length = 4, answer_is_awaited = 8 };

void check_sent(const Exchange& exchange, int32_t length, bool has_data) {
  const fuzz::Sent& sent = the_system.sent;
  REQUIRE(sent.length == 4 + 76 + static_cast<size_t>(length));
  REQUIRE(sent.at<int32_t>(0) == 76 + length);
  REQUIRE(sent.at<int32_t>(4 + 8) == exchange.request);
  REQUIRE(sent.at<int32_t>(4 + 12) == length);
  REQUIRE(sent.at<int32_t>(4 + 64) == 4711);  // the process
  REQUIRE(length == 0 || sent.front[4 + 76] == (has_data ? 'd' : 0));
}

// Most lengths are brought near to what a request can have; the rest is hostile.
int32_t length_of(const Exchange& exchange) {
  return exchange.request_length % 4 == 0 ? exchange.request_length : exchange.request_length % 20000;
}

void send(const Exchange& exchange) {
  static std::array<char, HB_REQUEST_MESSAGE_SIZE> data = [] {
    std::array<char, HB_REQUEST_MESSAGE_SIZE> filled;
    filled.fill('d');
    return filled;
  }();
  const bool has_data = (exchange.flags & with_data) != 0;
  const int32_t length = length_of(exchange);
  const auto call = [&] {
    return hb_send(static_cast<Hb_Client_Request>(exchange.request), has_data ? data.data() : nullptr, length);
  };
  if (length < 0 || length > (has_data ? 16460 : 98351)) {
    fuzz::expect(HB_EINVAL, call);
  } else if (!the_system.script.empty()) {
    fuzz::expect_one_of({HB_ESENDFAULT, HB_ESENDIO, HB_ESEND, HB_EDAEMONGONE}, call);
  } else {
    fuzz::expect(fuzz::no_error, call);
    check_sent(exchange, length, has_data);
  }
}

// The answer is what was sent, with zeros for what is missing of the header.
void check_answer(const client_packet_t* answer, fuzz::Bytes packet) {
  const auto* bytes = reinterpret_cast<const uint8_t*>(answer);
  REQUIRE(std::memcmp(bytes, packet.data(), packet.size()) == 0);
  for (size_t i = packet.size(); i < HB_REPLY_HEADER_SIZE; ++i) {
    REQUIRE(bytes[i] == 0);
  }
}

template <typename Call>
Hb_Rc expect_answer(fuzz::Bytes packet, int32_t kind, Call call) {
  if (!the_system.script.empty()) {
    return fuzz::expect_one_of({HB_ENOTREADY, HB_ECOMM, HB_EDAEMONGONE, HB_EBADREPLY}, call);
  }
  const bool right = fuzz::field<int32_t>(packet, 0) == kind;
  fuzz::expect(right ? fuzz::no_error : int{HB_EBADREPLY}, call);
  return right ? Hb_Success : Hb_Failure;
}

void await(const Exchange& exchange, fuzz::Bytes packet) {
  timeval limit = {55, 0};
  timeval* timeout = (exchange.flags & with_time_out) != 0 ? &limit : nullptr;
  const auto kind = static_cast<Hb_Client_Reply>(
      (exchange.flags & answer_is_awaited) != 0 ? fuzz::field<int32_t>(packet, 0) : exchange.awaited_kind);
  if ((exchange.flags & with_length) != 0) {
    Packet answer;
    if (expect_answer(packet, kind, [&] { return await_reply(kind, answer, timeout); }) == Hb_Success) {
      REQUIRE(answer.message_length() == fuzz::message_of(packet).size());
      check_answer(answer.get(), packet);
    }
    return;
  }
  client_packet_t* answer = nullptr;
  if (expect_answer(packet, kind, [&] { return hb_get_reply_from_server(kind, answer, timeout); }) == Hb_Success) {
    check_answer(answer, packet);
    delete[] reinterpret_cast<char*>(answer);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
  static fuzz::Buffer frame;
  fuzz::Input input(bytes, size);
  const auto exchange = input.take<Exchange>();
  const fuzz::Bytes script = input.take_bytes(exchange.faults % 32U);
  const fuzz::Bytes packet = input.rest();
  const auto length = static_cast<int32_t>(packet.size());
  frame.assign(sizeof length, 0);
  std::memcpy(frame.data(), &length, sizeof length);
  frame.insert(frame.end(), packet.begin(), packet.end());

  fuzz::expect(fuzz::no_error, hb_init_communication);
  the_system.script = script;
  the_system.stream = frame;
  send(exchange);
  await(exchange, packet);
  the_system.script = {};
  hb_remove_client_select();
  hb_remove_socket();
  REQUIRE(the_system.open_connections == 0);
  return 0;
}
