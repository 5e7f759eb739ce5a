// The connected stream socket: opening, framing, writing in parts, reading in parts.
#include "platform/Hb_Csock.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <sys/socket.h>
#include <sys/uio.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "hb_communication/connection.h"
#include "hb_global_data/state.h"
#include "support/fake_daemon.h"
#include "support/process_state.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

using testing::ElementsAre;

// A daemon to connect to, whose path is the one in use.
class StreamSocket : public testing::Test {
 protected:
  StreamSocket() {
    std::signal(SIGPIPE, SIG_IGN);
    set_hb_errno(0);
    daemon.path().copy(SERVER_SOCK_FNAME, sizeof SERVER_SOCK_FNAME - 1);
    SERVER_SOCK_FNAME[daemon.path().size()] = '\0';
  }

  void connect_to_daemon() {
    socket = std::make_unique<Hb_Csock>();
    ASSERT_EQ(socket->Error(), 0);
    peer = daemon.accept();
  }

  // A failure of the connected socket that sets its code to 8.
  void fail_once_with_io_error() {
    SystemCalls calls;
    calls.script("writev", {fail(EIO)});
    char byte = 0;
    EXPECT_EQ(socket->send(&byte, 1), Hb_Failure);
    EXPECT_EQ(socket->Error(), 8);
  }

  FakeDaemon daemon{Publication::none()};
  std::unique_ptr<Hb_Csock> socket;
  DaemonConnection peer;
};

// Opening.

TEST_F(StreamSocket, OpensSizesBothBuffersAndConnects) {
  SystemCalls calls;
  const Hb_Csock opened;
  EXPECT_THAT(calls.sequence(), ElementsAre("socket", "setsockopt", "setsockopt", "connect"));
  EXPECT_THAT(calls.of("socket")[0].arguments, ElementsAre(AF_UNIX, SOCK_STREAM, 0));
  const std::vector<SystemCall>& options = calls.of("setsockopt");
  EXPECT_EQ(options[0].arguments[1], SOL_SOCKET);
  EXPECT_EQ(options[0].arguments[2], SO_SNDBUF);
  EXPECT_EQ(options[0].bytes, ByteBuilder().i32(32768).bytes());
  EXPECT_EQ(options[1].arguments[1], SOL_SOCKET);
  EXPECT_EQ(options[1].arguments[2], SO_RCVBUF);
  EXPECT_EQ(options[1].bytes, ByteBuilder().i32(32768).bytes());
}

TEST_F(StreamSocket, ConnectsWithTheLengthOfThePathPlusTwo) {
  SystemCalls calls;
  const Hb_Csock opened;
  const SystemCall& call = calls.of("connect")[0];
  EXPECT_EQ(call.arguments[0], opened.socket());
  EXPECT_EQ(call.arguments[2], static_cast<intptr_t>(daemon.path().size() + 2));
  EXPECT_EQ(call.bytes, ByteBuilder().u16(AF_UNIX).raw(daemon.path()).bytes());
}

TEST_F(StreamSocket, ConnectedHasNoErrorAndIsNotAtItsEnd) {
  connect_to_daemon();
  EXPECT_EQ(socket->Error(), 0);
  EXPECT_EQ(socket->eof(), Hb_False);
  EXPECT_GE(socket->socket(), 0);
  EXPECT_EQ(hb_get_errno(), 0);
}

TEST_F(StreamSocket, StaysBlocking) {
  connect_to_daemon();
  EXPECT_EQ(fcntl(socket->socket(), F_GETFL) & O_NONBLOCK, 0);
}

TEST_F(StreamSocket, ThatCannotBeCreatedReportsIt) {
  SystemCalls calls;
  calls.script("socket", {fail(EMFILE)});
  Hb_Csock failed;
  EXPECT_EQ(failed.Error(), 2);
  EXPECT_LT(failed.socket(), 0);
  EXPECT_EQ(hb_get_errno(), 13);
  EXPECT_THAT(calls.sequence(), ElementsAre("socket"));
}

TEST_F(StreamSocket, WhoseSendBufferCannotBeSizedReportsIt) {
  SystemCalls calls;
  calls.script("setsockopt", {fail(ENOBUFS)});
  Hb_Csock failed;
  EXPECT_EQ(failed.Error(), 3);
  EXPECT_EQ(hb_get_errno(), 14);
  EXPECT_THAT(calls.sequence(), ElementsAre("socket", "setsockopt"));
}

TEST_F(StreamSocket, WhoseReceiveBufferCannotBeSizedReportsIt) {
  SystemCalls calls;
  calls.script("setsockopt", {pass(), fail(ENOBUFS)});
  Hb_Csock failed;
  EXPECT_EQ(failed.Error(), 3);
  EXPECT_EQ(hb_get_errno(), 14);
  EXPECT_THAT(calls.sequence(), ElementsAre("socket", "setsockopt", "setsockopt"));
}

TEST_F(StreamSocket, ThatCannotConnectReportsItAndStaysOpen) {
  daemon.stop_listening();
  const int descriptors = open_descriptors();
  {
    Hb_Csock failed;
    EXPECT_EQ(failed.Error(), 4);
    EXPECT_EQ(hb_get_errno(), 15);
    EXPECT_EQ(open_descriptors(), descriptors + 1);
  }
  EXPECT_EQ(open_descriptors(), descriptors);
}

TEST_F(StreamSocket, IsClosedWhenItIsDestroyed) {
  connect_to_daemon();
  const int descriptor = socket->socket();
  SystemCalls calls;
  socket.reset();
  ASSERT_EQ(calls.of("close").size(), 1U);
  EXPECT_EQ(calls.of("close")[0].arguments[0], descriptor);
  EXPECT_TRUE(peer.at_end());
}

TEST_F(StreamSocket, ThatWasNeverCreatedIsClosedToo) {
  SystemCalls calls;
  calls.script("socket", {fail(EMFILE)});
  { const Hb_Csock failed; }
  ASSERT_EQ(calls.of("close").size(), 1U);
  EXPECT_EQ(calls.of("close")[0].arguments[0], -1);
}

TEST_F(StreamSocket, FieldsLieInTheirOrder) {
  connect_to_daemon();
  fail_once_with_io_error();
  ASSERT_EQ(sizeof(Hb_Csock), 136U);
  Bytes object(reinterpret_cast<const char*>(socket.get()), sizeof(Hb_Csock));
  EXPECT_EQ(i32_at(object, 8), 0);  // the base's error
  EXPECT_EQ(i32_at(object, 12), socket->socket());
  EXPECT_EQ(i32_at(object, 16), 0);  // end of file
  EXPECT_EQ(u16_at(object, 20), AF_UNIX);
  EXPECT_STREQ(object.data() + 22, daemon.path().c_str());
  EXPECT_EQ(i32_at(object, 132), 8);  // its own error
  EXPECT_EQ(socket->Hb_Csock_Base::Error(), 0);
}

template <typename Pointer>
long slot_of(Pointer pointer) {
  static_assert(sizeof pointer == 16);
  long words[2];
  std::memcpy(words, &pointer, sizeof words);
  EXPECT_EQ(words[0] % 8, 1) << "not virtual";
  return words[0] / 8;
}

TEST_F(StreamSocket, VirtualOperationsHaveTheirSlots) {
  // Slots 0 and 1 are the destructor's.
  EXPECT_EQ(slot_of(&Hb_Csock_Base::Error), 2);
  EXPECT_EQ(slot_of(&Hb_Csock_Base::send), 3);
  EXPECT_EQ(slot_of(&Hb_Csock_Base::receive), 4);
  EXPECT_EQ(slot_of(&Hb_Csock_Base::socket), 5);
}

TEST_F(StreamSocket, WorksThroughItsBase) {
  connect_to_daemon();
  Hb_Csock_Base& base = *socket;
  char data[] = "ab";
  EXPECT_EQ(base.send(data, 2), Hb_Success);
  EXPECT_EQ(peer.receive_request(), "ab");
  EXPECT_EQ(base.socket(), socket->socket());
  EXPECT_EQ(base.Error(), 0);
}

TEST(StreamSocketCodes, HaveTheirNumbers) {
  EXPECT_EQ(Hb_Csock_NO_ERROR, 0);
  EXPECT_EQ(Hb_Csock_INVALID_BUF_POINTER, 1);
  EXPECT_EQ(Hb_Csock_OPEN_FAILURE, 2);
  EXPECT_EQ(Hb_Csock_OPT_FAILURE, 3);
  EXPECT_EQ(Hb_Csock_CONNECT_FAILURE, 4);
  EXPECT_EQ(Hb_Csock_SEND_INCOMPLETE, 5);
  EXPECT_EQ(Hb_Csock_SEND_WOULD_BLOCK, 6);
  EXPECT_EQ(Hb_Csock_SEND_NOT_RESTARTED, 7);
  EXPECT_EQ(Hb_Csock_SEND_IO_ERROR, 8);
  EXPECT_EQ(Hb_Csock_SEND_FAILURE, 9);
  EXPECT_EQ(Hb_Csock_RECV_WOULD_BLOCK, 10);
  EXPECT_EQ(Hb_Csock_RECV_NOT_RESTARTED, 11);
  EXPECT_EQ(Hb_Csock_RECV_IO_ERROR, 12);
  EXPECT_EQ(Hb_Csock_RECV_FAILURE, 13);
  EXPECT_EQ(Hb_Csock_END_OF_FILE, 14);
}

// Sending.

class Sending : public StreamSocket {
 protected:
  Sending() { connect_to_daemon(); }

  Hb_Rc send_message() { return socket->send(message, 8); }

  char message[9] = "abcdefgh";
  const Bytes frame = ByteBuilder().i32(8).raw("abcdefgh").bytes();
};

TEST_F(Sending, WritesLengthAndMessageAtOnce) {
  SystemCalls calls;
  EXPECT_EQ(send_message(), Hb_Success);
  EXPECT_THAT(calls.sequence(), ElementsAre("writev"));
  EXPECT_EQ(calls.of("writev")[0].arguments[0], socket->socket());
  EXPECT_EQ(calls.of("writev")[0].arguments[2], 2);
  EXPECT_EQ(peer.receive_raw(12), frame);
}

TEST_F(Sending, OfAMessageWithoutBytesIsItsLength) {
  EXPECT_EQ(socket->send(message, 0), Hb_Success);
  EXPECT_EQ(peer.receive_raw(4), ByteBuilder().i32(0).bytes());
  EXPECT_FALSE(peer.has_input());
}

TEST_F(Sending, WhatFitsDoesNotResetTheError) {
  fail_once_with_io_error();
  EXPECT_EQ(send_message(), Hb_Success);
  EXPECT_EQ(socket->Error(), 8);
}

TEST_F(Sending, GoesOnAtOnceAfterASignal) {
  SystemCalls calls;
  calls.script("writev", {fail(EINTR), fail(EINTR)});
  EXPECT_EQ(send_message(), Hb_Success);
  EXPECT_THAT(calls.sequence(), ElementsAre("writev", "writev", "writev"));
  EXPECT_EQ(peer.receive_raw(12), frame);
}

TEST_F(Sending, WaitsWithoutLimitWhileTheSocketIsFull) {
  SystemCalls calls;
  calls.script("writev", {fail(EAGAIN)});
  EXPECT_EQ(send_message(), Hb_Success);
  EXPECT_THAT(calls.sequence(), ElementsAre("writev", "poll", "writev"));
  EXPECT_EQ(calls.of("poll")[0].arguments[1], 1);
  EXPECT_EQ(calls.of("poll")[0].arguments[2], -1);
  EXPECT_EQ(calls.of("poll")[0].arguments[3], socket->socket());
  EXPECT_EQ(calls.of("poll")[0].arguments[4], POLLOUT);
  EXPECT_EQ(peer.receive_raw(12), frame);
}

TEST_F(Sending, IgnoresHowThatWaitEnds) {
  SystemCalls calls;
  calls.script("writev", {fail(EAGAIN)});
  calls.script("poll", {fail(EINTR)});
  EXPECT_EQ(send_message(), Hb_Success);
  EXPECT_THAT(calls.sequence(), ElementsAre("writev", "poll", "writev"));
}

TEST_F(Sending, WritesTheLengthAgainWhenAWriteEndedBehindIt) {
  SystemCalls calls;
  calls.script("writev", {limit(4)});
  EXPECT_EQ(send_message(), Hb_Failure);
  EXPECT_EQ(socket->Error(), 5);
  EXPECT_THAT(calls.sequence(), ElementsAre("writev", "poll", "writev"));
  EXPECT_EQ(calls.of("writev")[1].arguments[2], 2);
  EXPECT_EQ(peer.receive_raw(16), ByteBuilder().i32(8).raw(frame).bytes());
}

TEST_F(Sending, FailsWhenAWriteEndedInsideTheLength) {
  SystemCalls calls;
  calls.script("writev", {limit(3)});
  EXPECT_EQ(send_message(), Hb_Failure);
  EXPECT_EQ(socket->Error(), 9);
  EXPECT_THAT(calls.sequence(), ElementsAre("writev", "poll", "writev"));
  EXPECT_EQ(calls.of("writev")[1].arguments[2], -1);
}

TEST_F(Sending, FailsWhenAWriteEndedInsideTheMessage) {
  SystemCalls calls;
  calls.script("writev", {limit(7)});
  EXPECT_EQ(send_message(), Hb_Failure);
  EXPECT_EQ(socket->Error(), 9);
  EXPECT_EQ(calls.of("writev")[1].arguments[2], -1);
  EXPECT_EQ(socket->eof(), Hb_False);
}

TEST_F(Sending, OfNothingIsIncomplete) {
  SystemCalls calls;
  calls.script("writev", {result(0)});
  EXPECT_EQ(send_message(), Hb_Failure);
  EXPECT_EQ(socket->Error(), 5);
  EXPECT_THAT(calls.sequence(), ElementsAre("writev"));
}

TEST_F(Sending, ToAClosedPeerIsTheEnd) {
  peer.close();
  EXPECT_EQ(send_message(), Hb_Failure);
  EXPECT_EQ(socket->Error(), 14);
  EXPECT_EQ(socket->eof(), Hb_True);
}

TEST_F(Sending, LeavesTheLibraryErrorAlone) {
  set_hb_errno(49);
  peer.close();
  EXPECT_EQ(send_message(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 49);
}

struct Errno_Case {
  int system_error;
  int socket_error;
  bool is_end;
};

class SendingError : public Sending, public testing::WithParamInterface<Errno_Case> {};

TEST_P(SendingError, FollowsFromErrno) {
  SystemCalls calls;
  calls.script("writev", {fail(GetParam().system_error)});
  EXPECT_EQ(send_message(), Hb_Failure);
  EXPECT_EQ(socket->Error(), GetParam().socket_error);
  EXPECT_EQ(socket->eof(), GetParam().is_end ? Hb_True : Hb_False);
  EXPECT_THAT(calls.sequence(), ElementsAre("writev"));
}

INSTANTIATE_TEST_SUITE_P(Errors, SendingError,
                         testing::Values(Errno_Case{EFAULT, 1, false}, Errno_Case{EPIPE, 14, true},
                                         Errno_Case{EIO, 8, false}, Errno_Case{EINVAL, 9, false},
                                         Errno_Case{ENOBUFS, 9, false}, Errno_Case{ECONNRESET, 9, false}));

TEST_F(Sending, WriteOfTwoVectorsReturnsTheirBytes) {
  char one[] = "12345";
  char two[] = "678";
  iovec vectors[] = {{one, 5}, {two, 3}};
  EXPECT_EQ(hb_writev_retry(socket->socket(), vectors, 2), 8);
  EXPECT_EQ(peer.receive_raw(8), "12345678");
  EXPECT_EQ(vectors[0].iov_base, one);  // the caller's vectors are copied
  EXPECT_EQ(vectors[1].iov_len, 3U);
}

TEST_F(Sending, WriteOfTwoVectorsReturnsMinusOneOnAnError) {
  char one[] = "12345";
  iovec vectors[] = {{one, 5}, {one, 5}};
  EXPECT_EQ(hb_writev_retry(-1, vectors, 2), -1);
  EXPECT_EQ(errno, EBADF);
}

TEST_F(Sending, WriteOfTwoVectorsReturnsWhatWasWrittenBeforeAWriteOfNothing) {
  SystemCalls calls;
  calls.script("writev", {limit(4), result(0)});
  char one[] = "1234";
  char two[] = "678";
  iovec vectors[] = {{one, 4}, {two, 3}};
  EXPECT_EQ(hb_writev_retry(socket->socket(), vectors, 2), 4);
}

TEST_F(Sending, OfMoreThanTheSocketHoldsWaitsForTheReader) {
  const Bytes large(1 << 20, 'x');
  Bytes copy = large;
  Bytes read;
  daemon.run([&](FakeDaemon&) { read = peer.receive_raw(large.size() + 4); });
  EXPECT_EQ(socket->send(copy.data(), static_cast<int>(copy.size())), Hb_Success);
  daemon.join();
  EXPECT_EQ(read, framed(large));
}

// Receiving so many bytes.

class ReceivingBytes : public StreamSocket {
 protected:
  ReceivingBytes() { connect_to_daemon(); }

  char buffer[9] = "????????";
};

TEST_F(ReceivingBytes, TakesExactlyThatMany) {
  peer.send_raw("abcdefgh");
  EXPECT_EQ(socket->recvn(buffer, 5), Hb_Success);
  EXPECT_STREQ(buffer, "abcde???");
  EXPECT_EQ(socket->recvn(buffer, 3), Hb_Success);
  EXPECT_STREQ(buffer, "fghde???");
}

TEST_F(ReceivingBytes, ReadsTheRestAfterAPart) {
  peer.send_raw("abcdefgh");
  SystemCalls calls;
  calls.script("read", {limit(3), limit(1)});
  EXPECT_EQ(socket->recvn(buffer, 8), Hb_Success);
  EXPECT_STREQ(buffer, "abcdefgh");
  ASSERT_EQ(calls.of("read").size(), 3U);
  const intptr_t start = reinterpret_cast<intptr_t>(buffer);
  EXPECT_THAT(calls.of("read")[0].arguments, ElementsAre(socket->socket(), start, 8));
  EXPECT_THAT(calls.of("read")[1].arguments, ElementsAre(socket->socket(), start + 3, 5));
  EXPECT_THAT(calls.of("read")[2].arguments, ElementsAre(socket->socket(), start + 4, 4));
}

TEST_F(ReceivingBytes, OfNoneReadsNothing) {
  SystemCalls calls;
  EXPECT_EQ(socket->recvn(buffer, 0), Hb_Success);
  EXPECT_TRUE(calls.sequence().empty());
}

TEST_F(ReceivingBytes, WholeResetsTheError) {
  fail_once_with_io_error();
  peer.send_raw("ab");
  EXPECT_EQ(socket->recvn(buffer, 2), Hb_Success);
  EXPECT_EQ(socket->Error(), 0);
}

TEST_F(ReceivingBytes, AtTheEndFailsAndRemembersIt) {
  peer.send_raw("ab");
  peer.close();
  EXPECT_EQ(socket->recvn(buffer, 3), Hb_Failure);
  EXPECT_EQ(socket->Error(), 14);
  EXPECT_EQ(socket->eof(), Hb_True);
}

TEST_F(ReceivingBytes, ReadsAgainAfterASignal) {
  peer.send_raw("ab");
  SystemCalls calls;
  calls.script("read", {fail(EINTR), fail(EINTR)});
  EXPECT_EQ(socket->recvn(buffer, 2), Hb_Success);
  EXPECT_THAT(calls.sequence(), ElementsAre("read", "read", "read"));
}

TEST_F(ReceivingBytes, WaitsFiveSecondsForReadabilityWhenAReadWouldBlock) {
  peer.send_raw("ab");
  SystemCalls calls;
  calls.script("read", {fail(EAGAIN)});
  EXPECT_EQ(socket->recvn(buffer, 2), Hb_Success);
  EXPECT_THAT(calls.sequence(), ElementsAre("read", "select", "read"));
  const Bytes& given = calls.of("select")[0].bytes;
  EXPECT_EQ(calls.of("select")[0].arguments[0], 1024);
  const auto descriptor = static_cast<size_t>(socket->socket());
  EXPECT_EQ(u64_at(given, descriptor / 64 * 8), uint64_t{1} << (descriptor % 64));
  EXPECT_EQ(given.substr(128, 256), Bytes(256, '\0'));  // nothing but readability
  EXPECT_EQ(u64_at(given, 384), 5U);
  EXPECT_EQ(u64_at(given, 392), 0U);
}

TEST_F(ReceivingBytes, ReadsAgainWhenThatTimeIsOver) {
  peer.send_raw("ab");
  SystemCalls calls;
  calls.script("read", {fail(EAGAIN), fail(EAGAIN)});
  calls.script("select", {result(0), result(0)});
  EXPECT_EQ(socket->recvn(buffer, 2), Hb_Success);
  EXPECT_THAT(calls.sequence(), ElementsAre("read", "select", "read", "select", "read"));
  EXPECT_EQ(u64_at(calls.of("select")[1].bytes, 384), 5U);  // each wait has its whole time
}

TEST_F(ReceivingBytes, ReadsAgainWhenThatWaitWouldBlock) {
  peer.send_raw("ab");
  SystemCalls calls;
  calls.script("read", {fail(EAGAIN)});
  calls.script("select", {fail(EAGAIN)});
  EXPECT_EQ(socket->recvn(buffer, 2), Hb_Success);
}

class ReceivingWaitError : public ReceivingBytes, public testing::WithParamInterface<int> {};

TEST_P(ReceivingWaitError, FailsAndLeavesTheErrorAsItWas) {
  fail_once_with_io_error();
  SystemCalls calls;
  calls.script("read", {fail(EAGAIN)});
  calls.script("select", {fail(GetParam())});
  EXPECT_EQ(socket->recvn(buffer, 2), Hb_Failure);
  EXPECT_EQ(socket->Error(), 8);
  EXPECT_EQ(socket->eof(), Hb_False);
  EXPECT_THAT(calls.sequence(), ElementsAre("read", "select"));
}

INSTANTIATE_TEST_SUITE_P(Errors, ReceivingWaitError, testing::Values(EINTR, EBADF, EINVAL, EFAULT, ENOMEM));

class ReceivingError : public ReceivingBytes, public testing::WithParamInterface<Errno_Case> {};

TEST_P(ReceivingError, FollowsFromErrno) {
  SystemCalls calls;
  calls.script("read", {fail(GetParam().system_error)});
  EXPECT_EQ(socket->recvn(buffer, 2), Hb_Failure);
  EXPECT_EQ(socket->Error(), GetParam().socket_error);
  EXPECT_EQ(socket->eof(), Hb_False);
  EXPECT_THAT(calls.sequence(), ElementsAre("read"));
}

INSTANTIATE_TEST_SUITE_P(Errors, ReceivingError,
                         testing::Values(Errno_Case{EIO, 12, false}, Errno_Case{EFAULT, 1, false},
                                         Errno_Case{ECONNRESET, 13, false}, Errno_Case{EBADF, 13, false}));

// Receiving a message.

class Receiving : public StreamSocket {
 protected:
  Receiving() { connect_to_daemon(); }
  ~Receiving() override { delete[] message; }

  // On a failure the pointer is not ours.
  Hb_Rc receive() {
    char* received = nullptr;
    const Hb_Rc rc = socket->receive(&received, length);
    if (rc == Hb_Success) {
      message = received;
    }
    return rc;
  }

  char* message = nullptr;
  int length = -7;
};

TEST_F(Receiving, HandsOverAnArrayOfTheLengthSent) {
  peer.send_frame("abcde");
  ASSERT_EQ(receive(), Hb_Success);
  EXPECT_EQ(length, 5);
  EXPECT_EQ(Bytes(message, 5), "abcde");
}

TEST_F(Receiving, LeavesWhatFollows) {
  peer.send_raw(framed("abc") + framed("defg"));
  ASSERT_EQ(receive(), Hb_Success);
  EXPECT_EQ(Bytes(message, static_cast<size_t>(length)), "abc");
  delete[] message;
  ASSERT_EQ(receive(), Hb_Success);
  EXPECT_EQ(Bytes(message, static_cast<size_t>(length)), "defg");
}

TEST_F(Receiving, PutsAMessageTogetherThatComesByteByByte) {
  daemon.run([this](FakeDaemon&) { peer.send_byte_by_byte(framed("abcdefgh")); });
  ASSERT_EQ(receive(), Hb_Success);
  daemon.join();
  EXPECT_EQ(Bytes(message, 8), "abcdefgh");
}

TEST_F(Receiving, TakesAMessageWithoutBytes) {
  peer.send_frame("");
  ASSERT_EQ(receive(), Hb_Success);
  EXPECT_EQ(length, 0);
  EXPECT_NE(message, nullptr);
}

TEST_F(Receiving, TakesAMessageFarLargerThanTheBuffers) {
  const Bytes large = Bytes(3 << 20, 'x') + "end";
  daemon.run([&](FakeDaemon&) { peer.send_frame(large); });
  ASSERT_EQ(receive(), Hb_Success);
  daemon.join();
  EXPECT_EQ(length, static_cast<int>(large.size()));
  EXPECT_EQ(Bytes(message, large.size()), large);
}

TEST_F(Receiving, FailsAtTheEndOfTheStream) {
  peer.close();
  EXPECT_EQ(receive(), Hb_Failure);
  EXPECT_EQ(socket->Error(), 14);
  EXPECT_EQ(socket->eof(), Hb_True);
  EXPECT_EQ(length, -7);
}

TEST_F(Receiving, FailsWhenTheStreamEndsInsideTheLength) {
  peer.send_raw(Bytes(3, '\0'));
  peer.close();
  EXPECT_EQ(receive(), Hb_Failure);
  EXPECT_EQ(socket->Error(), 14);
}

TEST_F(Receiving, FailsWhenTheStreamEndsInsideTheMessage) {
  peer.send_raw(framed("abcde").substr(0, 8));
  peer.close();
  EXPECT_EQ(receive(), Hb_Failure);
  EXPECT_EQ(socket->Error(), 14);
  EXPECT_EQ(socket->eof(), Hb_True);
  EXPECT_EQ(length, -7);
}

class ReceivingNegativeLength : public Receiving, public testing::WithParamInterface<int32_t> {};

TEST_P(ReceivingNegativeLength, FailsAsARead) {
  peer.send_raw(ByteBuilder().i32(GetParam()).raw("abc").bytes());
  EXPECT_EQ(receive(), Hb_Failure);
  EXPECT_EQ(socket->Error(), 13);
  EXPECT_EQ(socket->eof(), Hb_False);
}

INSTANTIATE_TEST_SUITE_P(Lengths, ReceivingNegativeLength, testing::Values(-1, -4, INT32_MIN));

}  // namespace
}  // namespace hb_test
