// Requests that are answered: what each status means, and answers that do not come as they should.
#include <gtest/gtest.h>
#include <sys/socket.h>

#include <cerrno>
#include <functional>
#include <map>
#include <ostream>

#include "core/scripted_socket.h"
#include "steering.h"
#include "support/allocation_faults.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

struct Awaited {
  const char* name;
  std::function<Hb_Rc()> call;
  int32_t answer;  // its kind
  bool is_limited;
  std::map<int32_t, int> errors;  // by status; those that are not here are unexpected
};

void PrintTo(const Awaited& request, std::ostream* stream) { *stream << request.name; }

constexpr auto no_state = static_cast<Hb_Adapter_state_t>(0x77777777);
Hb_Adapter_state_t state_output;

const Awaited awaited_requests[] = {
    {"hb_configure_adapter",
     [] {
       return hb_configure_adapter(13, ipv4({10, 9, 8, 7}));
     },
     10,
     true,
     {{1, 8}, {3, 3}, {4, 7}, {5, 50}, {6, 51}}},
    {"hb_unconfigure_adapter", [] { return hb_unconfigure_adapter(13); }, 10, true, {{1, 8}, {3, 3}, {4, 7}}},
    {"hb_swap_adapters",
     [] {
       return hb_swap_adapters(13, ipv4({10, 0, 0, 3}));
     },
     10,
     true,
     {{1, 8}, {3, 3}, {4, 7}}},
    {"hb_adapter_grace", [] { return hb_adapter_grace(13, 5); }, 11, false, {{1, 8}, {7, 52}, {8, 55}, {9, 56}}},
    {"hb_get_adapter_state", [] { return hb_get_adapter_state(13, &state_output); }, 14, true, {{1, 8}, {4, 7}}},
};

std::string name_of_request(const testing::TestParamInfo<Awaited>& test) { return test.param.name; }

class AwaitedAnswer : public Steering, public testing::WithParamInterface<Awaited> {
 protected:
  AwaitedAnswer() { state_output = no_state; }
  ~AwaitedAnswer() override { reply_from_server_deftimeout = {55, 0}; }

  static ReplyPacket packet(int32_t kind, int32_t status = 0) {
    return ReplyPacket(kind).value(status).message(octets({2, 0, 0, 0}));
  }
  static Bytes answer(int32_t status) { return packet(GetParam().answer, status).bytes(); }

  static Hb_Rc call() { return GetParam().call(); }

  // Nothing more comes from the daemon; what the client sends still arrives.
  void end_stream() const { ASSERT_EQ(0, shutdown(connection.descriptor(), SHUT_WR)); }

  // The failure leaves no packet behind.
  static testing::AssertionResult fails_and_keeps_nothing(int error) {
    const long live = live_allocations();
    const testing::AssertionResult result = fails_with(error, call);
    if (!result) {
      return result;
    }
    if (state_output != no_state) {
      return testing::AssertionFailure() << "the state was written";
    }
    return live_allocations() == live ? testing::AssertionSuccess()
                                      : testing::AssertionFailure() << live_allocations() - live << " blocks are left";
  }
};

TEST_P(AwaitedAnswer, OfStatusZeroIsSuccess) {
  connection.send_frame(answer(0));
  const long live = live_allocations();
  EXPECT_TRUE(succeeds(call));
  EXPECT_EQ(live, live_allocations());
}

TEST_P(AwaitedAnswer, OfEveryOtherStatusHasItsError) {
  for (const int32_t status : {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 55, 256, 65536, 0x7FFFFFFF, -1, -2147483647 - 1}) {
    const auto known = GetParam().errors.find(status);
    connection.send_frame(answer(status));
    EXPECT_TRUE(fails_and_keeps_nothing(known != GetParam().errors.end() ? known->second : 10)) << status;
  }
}

TEST_P(AwaitedAnswer, OfAnotherKindIsLost) {
  for (int32_t kind = -1; kind <= 17; ++kind) {
    if (kind != GetParam().answer) {
      connection.send_frame(packet(kind).bytes());
      EXPECT_TRUE(fails_and_keeps_nothing(10)) << kind;
    }
  }
  connection.send_frame(answer(0));
  EXPECT_TRUE(succeeds(call));
}

TEST_P(AwaitedAnswer, BehindAnEventIsNotReachedAndTheEventIsLost) {
  connection.send_frame(ReplyPacket(2).name("followers").message(adapter_event_message({{17, 1}})).bytes());
  connection.send_frame(answer(1));
  EXPECT_TRUE(fails_and_keeps_nothing(10));
  EXPECT_TRUE(fails_and_keeps_nothing(8));
  EXPECT_TRUE(fails_with(2, [] { return await_readable({0, 0}); }));  // nothing is left
}

TEST_P(AwaitedAnswer, ThatEndsBehindItsStatusStillTellsIt) {
  connection.send_frame(answer(1).substr(0, 60));
  EXPECT_TRUE(fails_and_keeps_nothing(8));
}

TEST_P(AwaitedAnswer, OfItsKindAloneHasStatusZero) {
  connection.send_frame(ByteBuilder().i32(GetParam().answer).bytes());
  if (GetParam().answer == 14) {
    EXPECT_TRUE(fails_and_keeps_nothing(10));  // but no state
  } else {
    EXPECT_TRUE(succeeds(call));
  }
}

TEST_P(AwaitedAnswer, OfADaemonThatClosedTheConnection) {
  end_stream();
  EXPECT_TRUE(fails_and_keeps_nothing(16));
  EXPECT_TRUE(fails_and_keeps_nothing(16));
  EXPECT_TRUE(connection.has_input());  // it was asked all the same
}

TEST_P(AwaitedAnswer, ThatBreaksOffIsOfADaemonThatIsGone) {
  connection.send_raw(framed(answer(0)).substr(0, 60));
  end_stream();
  EXPECT_TRUE(fails_and_keeps_nothing(16));
}

TEST_P(AwaitedAnswer, OfANegativeLengthCannotBeRead) {
  connection.send_raw(ByteBuilder().i32(-1).bytes());
  EXPECT_TRUE(fails_and_keeps_nothing(12));
}

TEST_P(AwaitedAnswer, ThatComesInPiecesIsTakenWhole) {
  daemon.run([this](FakeDaemon&) { connection.send_byte_by_byte(framed(answer(4))); });
  const auto known = GetParam().errors.find(4);
  EXPECT_TRUE(fails_with(known != GetParam().errors.end() ? known->second : 10, call));
  daemon.join();
}

TEST_P(AwaitedAnswer, IsNotAwaitedWhenSendingFails) {
  connection.send_frame(answer(0));
  SystemCalls calls;
  calls.script("writev", {fail(EIO)});
  EXPECT_TRUE(fails_with(21, call));
  EXPECT_TRUE(calls.of("select").empty());
  EXPECT_TRUE(calls.of("read").empty());
}

TEST_P(AwaitedAnswer, IsAwaitedFor55SecondsAtMostExceptThatOfTheGrace) {
  for (int call_number = 0; call_number < 2; ++call_number) {
    connection.send_frame(answer(0));
    SystemCalls calls;
    calls.script("select", {interrupted({3, 500})});
    EXPECT_TRUE(succeeds(call));
    if (!GetParam().is_limited) {
      EXPECT_TRUE(calls.of("select").empty());
      continue;
    }
    ASSERT_EQ(2U, calls.of("select").size());
    EXPECT_EQ(55U, u64_at(calls.of("select")[0].bytes, 384));
    EXPECT_EQ(0U, u64_at(calls.of("select")[0].bytes, 392));
    EXPECT_EQ(3U, u64_at(calls.of("select")[1].bytes, 384));  // what remained after a signal
    EXPECT_EQ(500U, u64_at(calls.of("select")[1].bytes, 392));
  }
}

INSTANTIATE_TEST_SUITE_P(Control, AwaitedAnswer, testing::ValuesIn(awaited_requests), name_of_request);

class LimitedAnswer : public AwaitedAnswer {};

TEST_P(LimitedAnswer, ThatIsLateIsNotAwaitedLonger) {
  reply_from_server_deftimeout = {0, 1000};
  EXPECT_TRUE(fails_and_keeps_nothing(2));
  EXPECT_TRUE(connection.has_input());
  EXPECT_EQ(0, reply_from_server_deftimeout.tv_sec);
  EXPECT_EQ(1000, reply_from_server_deftimeout.tv_usec);
}

TEST_P(LimitedAnswer, CannotBeWaitedForOnABadDescriptor) {
  connection.send_frame(answer(0));
  SystemCalls calls;
  calls.script("select", {fail(EBADF)});
  EXPECT_TRUE(fails_with(12, call));
}

std::vector<Awaited> limited_requests() {
  std::vector<Awaited> limited;
  for (const Awaited& request : awaited_requests) {
    if (request.is_limited) {
      limited.push_back(request);
    }
  }
  return limited;
}

INSTANTIATE_TEST_SUITE_P(Control, LimitedAnswer, testing::ValuesIn(limited_requests()), name_of_request);

TEST_F(Steering, TheGraceIsAwaitedHoweverShortTheLimitOfOthers) {
  reply_from_server_deftimeout = {0, 0};
  daemon.run([this](FakeDaemon&) {
    connection.receive_request();
    connection.send_frame(ReplyPacket(11).bytes());
  });
  EXPECT_TRUE(succeeds([] { return hb_adapter_grace(13, 5); }));
  daemon.join();
  reply_from_server_deftimeout = {55, 0};
}

TEST_F(Steering, AGraceThatCannotBeReadOtherwiseIsACommunicationError) {
  replace_client_socket<ScriptedReceiver>()->error = 13;
  EXPECT_TRUE(fails_with(12, [] { return hb_adapter_grace(13, 5); }));
}

// States of adapters.

class AdapterState : public Steering {
 protected:
  Hb_Rc ask(const Bytes& message) {
    connection.send_frame(ReplyPacket(14).message(message).bytes());
    return hb_get_adapter_state(13, &state_output);
  }
};

TEST_F(AdapterState, IsTheFirstWordOfTheMessageWhateverItIs) {
  for (const uint32_t state : {1U, 2U, 3U, 4U, 5U, 6U, 7U, 8U, 9U, 10U, 11U, 0U, 12U, 0xFEDCBA98U}) {
    state_output = no_state;
    EXPECT_TRUE(succeeds([&] { return ask(ByteBuilder().u32(state).u32(0x55555555).bytes()); }));
    EXPECT_EQ(state, static_cast<uint32_t>(state_output));
  }
}

TEST_F(AdapterState, HasTheNumbersOfTheInterface) {
  EXPECT_EQ(1, Hb_Adapter_Unknown);
  EXPECT_EQ(2, Hb_Adapter_Up);
  EXPECT_EQ(3, Hb_Adapter_Down);
  EXPECT_EQ(4, Hb_Adapter_ifconfig_Down);
  EXPECT_EQ(5, Hb_Adapter_Misconfig);
  EXPECT_EQ(6, Hb_Adapter_Bcast_Misconfig);
  EXPECT_EQ(7, Hb_Adapter_Not_Monitored);
  EXPECT_EQ(8, Hb_Adapter_No_NIM);
  EXPECT_EQ(9, Hb_Adapter_netmon_error);
  EXPECT_EQ(10, Hb_Adapter_Cannot_bind_IP_soc);
  EXPECT_EQ(11, Hb_Adapter_Cannot_open_device);
}

TEST_F(AdapterState, ThatIsNotWholeIsRefused) {
  state_output = no_state;
  for (const size_t size : {size_t{0}, size_t{1}, size_t{3}}) {
    EXPECT_TRUE(fails_with(10, [&] { return ask(Bytes(size, '\2')); })) << size;
  }
  EXPECT_EQ(no_state, state_output);
}

}  // namespace
}  // namespace hb_test
