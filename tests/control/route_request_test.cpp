// Asking the daemon for a route.
#include <gtest/gtest.h>
#include <sys/socket.h>

#include <utility>

#include "core/scripted_socket.h"
#include "route_outputs.h"
#include "steering.h"
#include "support/allocation_faults.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

class RouteRequest : public Steering {
 protected:
  static Bytes answer(int32_t value, const Bytes& message) {
    return ReplyPacket(8).value(value).message(message).bytes();
  }

  Hb_Rc ask(Hb_Node_Number node) { return hb_get_route(node, &out.route, &out.length); }

  Hb_Rc ask_with(const Bytes& packet) {
    connection.send_frame(packet);
    return ask(4);
  }

  testing::AssertionResult is_refused_with(int error, Hb_Node_Number node) {
    return refuses(error, [&] { return ask(node); });
  }

  // The failure writes nothing and leaves no packet behind.
  testing::AssertionResult fails_on(const Bytes& packet, int error) {
    connection.send_frame(packet);
    const long live = live_allocations();
    const testing::AssertionResult result = fails_with(error, [this] { return ask(4); });
    if (result && (!out.untouched() || live_allocations() != live)) {
      return testing::AssertionFailure() << "something was written or kept";
    }
    return result;
  }

  Route_Outputs out;
};

TEST_F(RouteRequest, CarriesTheNodeInItsLength) {
  for (const Hb_Node_Number node : std::initializer_list<Hb_Node_Number>{0, 3, 4}) {
    connection.send_frame(answer(1, Bytes(176, 'r')));
    EXPECT_TRUE(succeeds([&] { return ask(node); }));
    EXPECT_TRUE(sent(request_with_number(211, node)));
  }
}

TEST_F(RouteRequest, IsAnsweredWithLengthAndHops) {
  connection.send_frame(answer(35, some_hops()));
  const long live = live_allocations();
  EXPECT_TRUE(succeeds([this] { return ask(4); }));
  EXPECT_EQ(live, live_allocations());
  EXPECT_EQ(35, out.length);
  EXPECT_EQ(some_hops(), out.hops());
}

TEST_F(RouteRequest, TakesTheFirst176BytesOfTheMessage) {
  EXPECT_TRUE(succeeds([this] { return ask_with(answer(35, some_hops() + Bytes(500, 'x'))); }));
  EXPECT_EQ(some_hops(), out.hops());
}

TEST_F(RouteRequest, KeepsTheLow16BitsOfTheLength) {
  const std::pair<int32_t, int> lengths[] = {
      {0x12345, 0x2345}, {65536, 0}, {-1, 65535}, {-2147483647 - 1, 0}, {65535, 65535}};
  for (const auto& [value, length] : lengths) {
    const Bytes packet = answer(value, some_hops());
    EXPECT_TRUE(succeeds([&] { return ask_with(packet); })) << value;
    EXPECT_EQ(length, out.length) << value;
  }
}

TEST_F(RouteRequest, AnsweredWithLengthZeroFindsNoRoute) {
  EXPECT_TRUE(fails_on(answer(0, some_hops()), 6));
  EXPECT_TRUE(fails_on(answer(0, ""), 6));
  EXPECT_TRUE(fails_on(ByteBuilder().i32(8).bytes(), 6));
}

TEST_F(RouteRequest, AnsweredWithLessThanARouteIsRefused) {
  EXPECT_TRUE(fails_on(answer(1, Bytes(175, 'r')), 10));
  EXPECT_TRUE(fails_on(answer(1, ""), 10));
  EXPECT_TRUE(fails_on(answer(1, "").substr(0, 60), 10));
}

TEST_F(RouteRequest, AnsweredWithAnotherKindLosesThePacket) {
  for (int32_t kind = -1; kind <= 17; ++kind) {
    if (kind != 8) {
      EXPECT_TRUE(fails_on(ReplyPacket(kind).value(1).message(some_hops()).bytes(), 10)) << kind;
    }
  }
  EXPECT_TRUE(succeeds([this] { return ask_with(answer(1, some_hops())); }));
}

TEST_F(RouteRequest, ForANodeBeyondTheClusterIsInvalid) {
  for (const Hb_Node_Number node : std::initializer_list<Hb_Node_Number>{-1, 8, -32768, 32767}) {
    EXPECT_TRUE(is_refused_with(4, node)) << node;
  }
}

TEST_F(RouteRequest, ForANodeWithoutAdaptersFindsNoNode) {
  for (const Hb_Node_Number node : std::initializer_list<Hb_Node_Number>{1, 2, 5, 7}) {
    EXPECT_TRUE(is_refused_with(9, node)) << node;
  }
}

TEST_F(RouteRequest, NeedsPlacesForTheRoute) {
  EXPECT_TRUE(refuses(4, [this] { return hb_get_route(4, nullptr, &out.length); }));
  EXPECT_TRUE(refuses(4, [this] { return hb_get_route(4, &out.route, nullptr); }));
  EXPECT_TRUE(out.untouched());
}

TEST_F(RouteRequest, ToADaemonThatClosesTheConnectionFailsWithThat) {
  ASSERT_EQ(0, shutdown(connection.descriptor(), SHUT_WR));
  EXPECT_TRUE(fails_with(16, [this] { return ask(4); }));
  EXPECT_TRUE(sent(request_with_number(211, 4)));
  EXPECT_TRUE(out.untouched());
}

TEST_F(RouteRequest, WhoseAnswerBreaksOffFailsAsTheDaemonIsGone) {
  connection.send_raw(framed(answer(1, some_hops())).substr(0, 200));
  ASSERT_EQ(0, shutdown(connection.descriptor(), SHUT_WR));
  EXPECT_TRUE(fails_with(16, [this] { return ask(4); }));
  EXPECT_TRUE(out.untouched());
}

TEST_F(RouteRequest, WhoseAnswerCannotBeReadOtherwiseIsACommunicationError) {
  connection.send_raw(ByteBuilder().i32(-1).bytes());
  EXPECT_TRUE(fails_with(12, [this] { return ask(4); }));
  replace_client_socket<ScriptedReceiver>()->error = 13;
  EXPECT_TRUE(fails_with(12, [this] { return ask(4); }));
  EXPECT_TRUE(out.untouched());
}

TEST_F(RouteRequest, WaitsWithoutALimit) {
  reply_from_server_deftimeout = {0, 0};
  daemon.run([this](FakeDaemon&) {
    connection.receive_request();
    connection.send_byte_by_byte(framed(answer(35, some_hops())));
  });
  SystemCalls calls;
  EXPECT_TRUE(succeeds([this] { return ask(4); }));
  daemon.join();
  EXPECT_TRUE(calls.of("select").empty());
  EXPECT_EQ(some_hops(), out.hops());
  reply_from_server_deftimeout = {55, 0};
}

}  // namespace
}  // namespace hb_test
