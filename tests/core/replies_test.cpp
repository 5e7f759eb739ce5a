// Awaiting one packet of a kind.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cerrno>
#include <csignal>
#include <string>

#include "core/scripted_socket.h"
#include "support/allocation_faults.h"
#include "support/running_client.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

class Replies : public testing::Test {
 protected:
  Replies() {
    std::signal(SIGPIPE, SIG_IGN);
    reset_platform();
    set_hb_errno(0);
    EXPECT_EQ(hb_init_communication(), Hb_Success);
    peer = daemon.accept();
  }

  ~Replies() override {
    delete[] reinterpret_cast<char*>(packet);
    hb_remove_client_select();
    hb_remove_socket();
  }

  Hb_Rc await(Hb_Client_Reply kind) { return hb_get_reply_from_server(kind, packet, &time_limit); }

  FakeDaemon daemon{Publication::none()};
  DaemonConnection peer;
  client_packet_t* packet = nullptr;
  timeval time_limit = {5, 0};
};

TEST_F(Replies, OfTheAwaitedKindAreHandedOver) {
  peer.send_frame(ReplyPacket(10).value(3).sequence(77).message("message").bytes());
  ASSERT_EQ(await(HB_CONFIG_ADAPTER), Hb_Success);
  const Bytes bytes(reinterpret_cast<const char*>(packet), 115);
  EXPECT_EQ(bytes, ReplyPacket(10).value(3).sequence(77).message("message").bytes());
}

TEST_F(Replies, AreOneArrayThatTheCallerReleases) {
  peer.send_frame(ReplyPacket(10).bytes());
  const long live = live_allocations();
  ASSERT_EQ(await(HB_CONFIG_ADAPTER), Hb_Success);
  EXPECT_EQ(live_allocations(), live + 1);
  delete[] reinterpret_cast<char*>(packet);
  packet = nullptr;
  EXPECT_EQ(live_allocations(), live);
}

TEST_F(Replies, OfAnotherKindAreLost) {
  peer.send_frame(ReplyPacket(2).bytes());
  peer.send_frame(ReplyPacket(10).value(6).bytes());
  const long live = live_allocations();
  EXPECT_EQ(await(HB_CONFIG_ADAPTER), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 10);
  EXPECT_EQ(live_allocations(), live);
  EXPECT_EQ(packet, nullptr);
  ASSERT_EQ(await(HB_CONFIG_ADAPTER), Hb_Success);
  EXPECT_EQ(packet->value, 6);
}

TEST_F(Replies, ThatDoNotComeInTimeAreNotAwaitedLonger) {
  time_limit = {0, 1000};
  EXPECT_EQ(await(HB_CONFIG_ADAPTER), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 2);
  EXPECT_EQ(time_limit.tv_sec, 0);
  EXPECT_EQ(time_limit.tv_usec, 1000);
}

TEST_F(Replies, MayBePolledFor) {
  time_limit = {0, 0};
  EXPECT_EQ(await(HB_CONFIG_ADAPTER), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 2);
  peer.send_frame(ReplyPacket(10).bytes());
  EXPECT_EQ(await(HB_CONFIG_ADAPTER), Hb_Success);
}

TEST_F(Replies, AreAwaitedOnTheSocketAloneWithTheTimeGiven) {
  client_select->rd_set(3);
  client_select->wr_set(4);
  client_select->ex_set(5);
  peer.send_frame(ReplyPacket(10).bytes());
  SystemCalls calls;
  time_limit = {12, 34};
  ASSERT_EQ(await(HB_CONFIG_ADAPTER), Hb_Success);
  ASSERT_EQ(calls.of("select").size(), 1U);
  const Bytes& given = calls.of("select")[0].bytes;
  const auto descriptor = static_cast<size_t>(client_socket->socket());
  ASSERT_LT(descriptor, 64U);
  EXPECT_EQ(u64_at(given, 0), uint64_t{1} << descriptor);
  EXPECT_EQ(given.substr(8, 376), Bytes(376, '\0'));
  EXPECT_EQ(u64_at(given, 384), 12U);
  EXPECT_EQ(u64_at(given, 392), 34U);
}

TEST_F(Replies, AreAwaitedForTheTimeThatRemainsAfterASignal) {
  peer.send_frame(ReplyPacket(10).bytes());
  SystemCalls calls;
  calls.script("select", {interrupted({3, 500}), interrupted({1, 250})});
  ASSERT_EQ(await(HB_CONFIG_ADAPTER), Hb_Success);
  ASSERT_EQ(calls.of("select").size(), 3U);
  EXPECT_EQ(u64_at(calls.of("select")[1].bytes, 384), 3U);
  EXPECT_EQ(u64_at(calls.of("select")[1].bytes, 392), 500U);
  EXPECT_EQ(u64_at(calls.of("select")[2].bytes, 384), 1U);
  EXPECT_EQ(u64_at(calls.of("select")[2].bytes, 392), 250U);
  const auto descriptor = static_cast<size_t>(client_socket->socket());
  EXPECT_EQ(u64_at(calls.of("select")[2].bytes, 0), uint64_t{1} << descriptor);
}

TEST_F(Replies, WithoutATimeLimitAreReceivedWithoutSelect) {
  daemon.run([this](FakeDaemon&) { peer.send_byte_by_byte(framed(ReplyPacket(11).value(9).bytes())); });
  SystemCalls calls;
  ASSERT_EQ(hb_get_reply_from_server(HB_ADAPTER_GRACE, packet, nullptr), Hb_Success);
  daemon.join();
  EXPECT_EQ(packet->value, 9);
  EXPECT_TRUE(calls.of("select").empty());
}

class RepliesWaitError : public Replies, public testing::WithParamInterface<int> {};

TEST_P(RepliesWaitError, IsACommunicationError) {
  SystemCalls calls;
  calls.script("select", {fail(GetParam())});
  EXPECT_EQ(await(HB_CONFIG_ADAPTER), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 12);
  EXPECT_EQ(calls.of("select").size(), 1U);
}

INSTANTIATE_TEST_SUITE_P(Errors, RepliesWaitError, testing::Values(EBADF, EAGAIN, EFAULT, EINVAL, ENOMEM));

TEST_F(Replies, OnADescriptorThatSelectCannotHoldAreNotAwaited) {
  replace_client_socket<ScriptedSocket>()->descriptor = 1024;
  EXPECT_EQ(await(HB_CONFIG_ADAPTER), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 12);
}

TEST_F(Replies, OfADaemonThatIsGone) {
  peer.close();
  EXPECT_EQ(await(HB_CONFIG_ADAPTER), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 16);
  EXPECT_NE(client_socket, nullptr);
  EXPECT_EQ(client_socket->eof(), Hb_True);
  EXPECT_EQ(await(HB_CONFIG_ADAPTER), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 16);
}

TEST_F(Replies, ThatEndBetweenLengthAndBody) {
  peer.send_raw(ByteBuilder().i32(108).bytes());
  peer.close();
  EXPECT_EQ(await(HB_CONFIG_ADAPTER), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 16);
}

TEST_F(Replies, ThatCannotBeReceivedOtherwise) {
  replace_client_socket<ScriptedReceiver>()->error = 13;
  EXPECT_EQ(hb_get_reply_from_server(HB_CONFIG_ADAPTER, packet, nullptr), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 12);
}

TEST_F(Replies, WithANegativeLengthAreACommunicationError) {
  peer.send_raw(ByteBuilder().i32(-5).bytes());
  EXPECT_EQ(await(HB_CONFIG_ADAPTER), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 12);
}

TEST_F(Replies, WithoutAConnectionFail) {
  hb_remove_socket();
  EXPECT_EQ(await(HB_CONFIG_ADAPTER), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 12);
  set_hb_errno(0);
  EXPECT_EQ(hb_get_reply_from_server(HB_CONFIG_ADAPTER, packet, nullptr), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 12);
}

// Packets shorter than their header.

TEST_F(Replies, ThatEndBehindTheirValueStillWork) {
  peer.send_frame(ReplyPacket(14).value(4).sequence(77).bytes().substr(0, 60));
  ASSERT_EQ(await(HB_ADAPTER_STATE), Hb_Success);
  EXPECT_EQ(packet->kind, 14);
  EXPECT_EQ(packet->value, 4);
  EXPECT_EQ(packet->ffdc_id[0], '\0');
  EXPECT_EQ(packet->notification_sequence_no, 0U);
}

TEST_F(Replies, OfTheirKindAloneHaveZerosForTheRest) {
  peer.send_frame(ByteBuilder().i32(10).bytes());
  ASSERT_EQ(await(HB_CONFIG_ADAPTER), Hb_Success);
  EXPECT_EQ(Bytes(reinterpret_cast<const char*>(packet), 108), ByteBuilder().i32(10).zeros(104).bytes());
}

TEST_F(Replies, OfHalfAKindHaveZerosForTheOtherHalf) {
  peer.send_frame(ByteBuilder().u8(10).u8(0).bytes());
  ASSERT_EQ(await(HB_CONFIG_ADAPTER), Hb_Success);
  EXPECT_EQ(packet->kind, 10);
}

TEST_F(Replies, WithoutBytesAreOfKindZero) {
  peer.send_frame("");
  EXPECT_EQ(await(HB_CONFIG_ADAPTER), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 10);
  peer.send_frame("");
  ASSERT_EQ(await(HB_CONFIGURATION_INFO), Hb_Success);
  EXPECT_EQ(Bytes(reinterpret_cast<const char*>(packet), 108), Bytes(108, '\0'));
}

// Memory.

TEST_F(Replies, WithoutMemoryForAShortOneFailAndHoldNothing) {
  peer.send_frame(ByteBuilder().i32(10).bytes());
  const long live = live_allocations();
  Hb_Rc rc = Hb_Success;
  {
    const AllocationFailure failure(2);  // the bytes, then the whole header
    rc = await(HB_CONFIG_ADAPTER);
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_EQ(rc, Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 17);
  EXPECT_EQ(live_allocations(), live);
}

TEST_F(Replies, WithoutMemoryFail) {
  peer.send_frame(ReplyPacket(10).bytes());
  Hb_Rc rc = Hb_Success;
  {
    const AllocationFailure failure(1);
    rc = await(HB_CONFIG_ADAPTER);
  }
  EXPECT_EQ(rc, Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 12);
}

TEST_F(Replies, RequestWithANumberWithoutMemoryIsNotSent) {
  Hb_Rc rc = Hb_Success;
  {
    const AllocationFailure failure(1);
    rc = hb_send(HB_NODE_IS_DOWN, nullptr, 2000);
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_EQ(rc, Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 17);
  EXPECT_FALSE(peer.has_input());
}

class ConnectingMemory : public testing::TestWithParam<size_t> {};

TEST_P(ConnectingMemory, ThatRunsOutLeavesTheConnectionClosed) {
  FakeDaemon daemon(Publication::none());
  reset_platform();
  const long live = live_allocations();
  Hb_Rc rc = Hb_Success;
  {
    const AllocationFailure failure(GetParam());
    rc = hb_init_communication();
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_EQ(rc, Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 17);
  EXPECT_EQ(client_socket, nullptr);
  EXPECT_EQ(client_select, nullptr);
  EXPECT_EQ(live_allocations(), live);
}

INSTANTIATE_TEST_SUITE_P(SocketAndSelector, ConnectingMemory, testing::Values(1U, 2U));

}  // namespace
}  // namespace hb_test
