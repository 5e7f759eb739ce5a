// Requests as the daemon sees them, and sending that fails.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstring>
#include <string>

#include "core/scripted_socket.h"
#include "support/running_client.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

// A connection without a started client.
class Requests : public testing::Test {
 protected:
  Requests() {
    std::signal(SIGPIPE, SIG_IGN);
    reset_platform();
    set_hb_errno(0);
    EXPECT_EQ(hb_init_communication(), Hb_Success);
    peer = daemon.accept();
  }

  ~Requests() override {
    IsVEX = Hb_False;
    hb_remove_client_select();
    hb_remove_socket();
  }

  // The 76 bytes in front of a request's data.
  static Bytes header(int32_t kind, int32_t len) {
    return ByteBuilder().zeros(8).i32(kind).i32(len).zeros(48).i32(getpid()).zeros(8).bytes();
  }

  FakeDaemon daemon{Publication::none()};
  DaemonConnection peer;
};

TEST_F(Requests, WithoutDataAreTheirHeader) {
  EXPECT_EQ(hb_send(HB_DISCARD_STALE_MESSAGES, nullptr, 0), Hb_Success);
  EXPECT_EQ(peer.receive_raw(4 + 76), ByteBuilder().i32(76).raw(header(219, 0)).bytes());
  EXPECT_FALSE(peer.has_input());
}

TEST_F(Requests, WithDataCarryThemBehindTheHeader) {
  char data[] = {'\x05', '\x00'};
  EXPECT_EQ(hb_send(HB_ENABLE_ADAPTER, data, 2), Hb_Success);
  EXPECT_EQ(peer.receive_raw(4 + 78), ByteBuilder().i32(78).raw(header(207, 2)).u8(5).u8(0).bytes());
  EXPECT_FALSE(peer.has_input());
}

TEST_F(Requests, WithANumberInTheLengthSendThatManyZeroBytes) {
  EXPECT_EQ(hb_send(HB_ADAPTER_IS_DOWN, nullptr, 7), Hb_Success);
  EXPECT_EQ(peer.receive_raw(4 + 76 + 7), ByteBuilder().i32(83).raw(header(206, 7)).zeros(7).bytes());
  EXPECT_EQ(hb_send(HB_NODE_IS_DOWN, nullptr, 7), Hb_Success);
  EXPECT_EQ(peer.receive_raw(4 + 76 + 7), ByteBuilder().i32(83).raw(header(204, 7)).zeros(7).bytes());
  EXPECT_FALSE(peer.has_input());
}

class RequestsWithALargeNumber : public Requests, public testing::WithParamInterface<int> {};

TEST_P(RequestsWithALargeNumber, SendThatManyZeroBytesToo) {
  const int number = GetParam();
  Bytes request;
  daemon.run([&](FakeDaemon&) { request = peer.receive_request(); });
  EXPECT_EQ(hb_send(HB_ADAPTER_MAY_BE_DOWN, nullptr, number), Hb_Success);
  daemon.join();
  EXPECT_EQ(request, header(205, number) + Bytes(static_cast<size_t>(number), '\0'));
  EXPECT_FALSE(peer.has_input());
}

INSTANTIATE_TEST_SUITE_P(Numbers, RequestsWithALargeNumber, testing::Values(2048, 16460, 16461, 98351));

TEST_F(Requests, GoOutInOneWrite) {
  char data[] = "data";
  SystemCalls calls;
  EXPECT_EQ(hb_send(HB_UNSUBSCRIBE, data, 5), Hb_Success);
  ASSERT_EQ(calls.of("writev").size(), 1U);
  EXPECT_EQ(calls.of("writev")[0].bytes.size(), 85U);
}

TEST_F(Requests, WithAsMuchDataAsThePacketHolds) {
  Bytes data(16460, 'd');
  Bytes request;
  daemon.run([&](FakeDaemon&) { request = peer.receive_request(); });
  EXPECT_EQ(hb_send(HB_SUBSCRIBE, data.data(), 16460), Hb_Success);
  daemon.join();
  EXPECT_EQ(request, header(209, 16460) + data);
}

TEST_F(Requests, WithMoreDataThanThePacketHoldsAreNotSent) {
  Bytes data(16461, 'd');
  EXPECT_EQ(hb_send(HB_SUBSCRIBE, data.data(), 16461), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 4);
  EXPECT_FALSE(peer.has_input());
}

TEST_F(Requests, WithANegativeLengthAreNotSent) {
  char data[] = "data";
  EXPECT_EQ(hb_send(HB_SUBSCRIBE, data, -1), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 4);
  EXPECT_EQ(hb_send(HB_NODE_IS_DOWN, nullptr, -1), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 4);
  EXPECT_FALSE(peer.has_input());
}

TEST_F(Requests, CarryTheProcessIdTakenAtTheConnection) {
  client_pid = 0x01020304;
  EXPECT_EQ(hb_send(HB_GET_CONFIG_INFO, nullptr, 0), Hb_Success);
  EXPECT_EQ(i32_at(peer.receive_request(), 64), 0x01020304);
}

TEST_F(Requests, AreNotSentInVexModeAndSucceed) {
  IsVEX = Hb_True;
  EXPECT_EQ(hb_send(HB_GET_CONFIG_INFO, nullptr, 0), Hb_Success);
  EXPECT_FALSE(peer.has_input());
}

TEST_F(Requests, WithoutAConnectionFail) {
  hb_remove_socket();
  EXPECT_EQ(hb_send(HB_GET_CONFIG_INFO, nullptr, 0), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 12);
}

TEST_F(Requests, ToADaemonThatIsGoneFailAndKeepTheConnection) {
  peer.close();
  EXPECT_EQ(hb_send(HB_GET_CONFIG_INFO, nullptr, 0), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 16);
  ASSERT_NE(client_socket, nullptr);
  EXPECT_EQ(client_socket->eof(), Hb_True);
  EXPECT_EQ(hb_send(HB_GET_CONFIG_INFO, nullptr, 0), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 16);
}

class RequestsError : public Requests, public testing::WithParamInterface<std::pair<int, int>> {};

TEST_P(RequestsError, FollowsFromTheSocketError) {
  replace_client_socket<ScriptedSocket>()->error = GetParam().first;
  EXPECT_EQ(hb_send(HB_GET_CONFIG_INFO, nullptr, 0), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), GetParam().second);
  EXPECT_NE(client_socket, nullptr);
}

INSTANTIATE_TEST_SUITE_P(SocketErrors, RequestsError,
                         testing::Values(std::pair(1, 18), std::pair(6, 19), std::pair(7, 20), std::pair(8, 21),
                                         std::pair(14, 16), std::pair(5, 22), std::pair(9, 22), std::pair(0, 22),
                                         std::pair(13, 22)));

class RequestsErrno : public Requests, public testing::WithParamInterface<std::pair<int, int>> {};

TEST_P(RequestsErrno, ReachesTheLibraryError) {
  SystemCalls calls;
  calls.script("writev", {fail(GetParam().first)});
  EXPECT_EQ(hb_send(HB_GET_CONFIG_INFO, nullptr, 0), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), GetParam().second);
}

INSTANTIATE_TEST_SUITE_P(Errors, RequestsErrno,
                         testing::Values(std::pair(EFAULT, 18), std::pair(EIO, 21), std::pair(EPIPE, 16),
                                         std::pair(ENOBUFS, 22)));

}  // namespace
}  // namespace hb_test
