// Waiting for an event, and receiving it.
#include <gmock/gmock.h>

#include <cerrno>
#include <thread>

#include "event_reception.h"
#include "hb_global_data/vex_event_queue.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

using testing::IsEmpty;

TEST_F(EventReception, NothingWithinTheTimeIsNotReady) {
  timeval at_once = {0, 0};
  EXPECT_TRUE(fails_with(2, [&] { return take(&at_once); }));
  timeval shortly = {0, 10000};
  EXPECT_TRUE(fails_with(2, [&] { return take(&shortly); }));
  EXPECT_EQ(0, shortly.tv_sec);
  EXPECT_EQ(10000, shortly.tv_usec);
  EXPECT_TRUE(out.untouched());
}

TEST_F(EventReception, AnEventThatIsThereIsTakenWithinNoTime) {
  connection.send_frame(ReplyPacket(12).bytes());
  timeval at_once = {0, 0};
  EXPECT_EQ(Hb_Success, take(&at_once));
}

TEST_F(EventReception, TheWaitIsForTheSocketsInputAndTheTimeGiven) {
  connection.send_frame(ReplyPacket(12).bytes());
  SystemCalls calls;
  timeval time = {3, 4};
  EXPECT_EQ(Hb_Success, take(&time));
  ASSERT_EQ(1U, calls.of("select").size());
  const Bytes& given = calls.of("select")[0].bytes;
  Bytes read_set(128, '\0');
  read_set[static_cast<size_t>(descriptors[0]) / 8] = static_cast<char>(1 << (descriptors[0] % 8));
  EXPECT_EQ(read_set, given.substr(0, 128));
  EXPECT_EQ(Bytes(256, '\0'), given.substr(128, 256));
  EXPECT_EQ(ByteBuilder().u64(3).u64(4).bytes(), given.substr(384));
}

TEST_F(EventReception, WithoutATimeTheCallWaitsInTheReceive) {
  SystemCalls calls;
  std::thread sender([&] { connection.send_frame(ReplyPacket(12).sequence(9).bytes()); });
  EXPECT_EQ(Hb_Success, take(nullptr));
  sender.join();
  EXPECT_EQ(9U, out.sequence);
  EXPECT_THAT(calls.of("select"), IsEmpty());
}

TEST_F(EventReception, AWaitThatASignalEndsIsRepeated) {
  connection.send_frame(ReplyPacket(12).bytes());
  SystemCalls calls;
  calls.script("select", {fail(EINTR), fail(EINTR)});
  EXPECT_EQ(Hb_Success, take());
  EXPECT_EQ(3U, calls.of("select").size());
}

TEST_F(EventReception, AWaitThatFailsIsAFailureOfCommunication) {
  for (const int error : {EBADF, EINVAL, ENOMEM, EFAULT, EAGAIN}) {
    SystemCalls calls;
    calls.script("select", {fail(error)});
    EXPECT_TRUE(fails_with(12, [&] { return take(); })) << error;
  }
  EXPECT_TRUE(out.untouched());
}

TEST_F(EventReception, ADaemonThatClosesIsGone) {
  connection.close();
  EXPECT_TRUE(fails_with(16, [&] { return take(); }));
  EXPECT_TRUE(fails_with(16, [&] { return take(nullptr); }));
  EXPECT_TRUE(out.untouched());
}

TEST_F(EventReception, ADaemonThatClosesInsideAFrameIsGone) {
  const Bytes frame = framed(telling_packet(12).bytes());
  for (const size_t sent : {1U, 4U, 5U, 111U}) {
    connection.send_raw(frame.substr(0, sent));
    connection.close();
    EXPECT_TRUE(fails_with(16, [&] { return take(); })) << sent;
    hb_terminate();
    connection = start_client(daemon, sparse_cluster());
    descriptors[0] = client_socket->socket();
  }
  EXPECT_TRUE(out.untouched());
}

TEST_F(EventReception, AReadThatFailsIsAFailureOfCommunication) {
  for (const int error : {EIO, EFAULT, ECONNRESET}) {
    SystemCalls calls;
    calls.script("read", {fail(error)});
    EXPECT_TRUE(fails_with(12, [&] { return take(nullptr); })) << error;
  }
  EXPECT_TRUE(out.untouched());
}

TEST_F(EventReception, TheEventQueueIsNotLookedAtInDaemonMode) {
  VEX_Event queued = {};
  event_queue_list = &queued;
  EXPECT_TRUE(succeeds([&] { return deliver(ReplyPacket(12)); }));
  EXPECT_EQ(8, out.events);
  EXPECT_EQ(&queued, event_queue_list);
  event_queue_list = nullptr;
}

TEST_F(EventReception, AnEmptyDescriptorArrayFailsWithoutAnErrorNumberAndTakesNothing) {
  connection.send_frame(ReplyPacket(12).bytes());
  descriptors[0] = -1;
  EXPECT_TRUE(fails_without_error_number([&] { return take(); }));
  EXPECT_TRUE(out.untouched());
  descriptors[0] = client_socket->socket();
  EXPECT_EQ(Hb_Success, take());
}

TEST_F(EventReception, AnEmptyDescriptorArrayIsSeenBeforeTheOutputs) {
  descriptors[0] = -1;
  EXPECT_TRUE(fails_without_error_number(
      [&] { return hb_get_event_message(descriptors, nullptr, nullptr, nullptr, nullptr, nullptr); }));
}

TEST_F(EventReception, TheDescriptorArrayOfTheLibraryServesToTakeEvents) {
  int* array = nullptr;
  int count = 0;
  ASSERT_EQ(Hb_Success, hb_get_file_descriptor_array(&array, &count));
  connection.send_frame(ReplyPacket(12).bytes());
  EXPECT_EQ(Hb_Success, hb_get_event_message(array, nullptr, &out.events, out.name, out.group.get(), &out.sequence));
  EXPECT_EQ(Hb_Success, hb_free_file_descriptor_array(array));
}

TEST_F(EventReception, NullPointersAreRefusedAndNothingIsTaken) {
  connection.send_frame(ReplyPacket(12).bytes());
  Hb_Group* group = out.group.get();
  EXPECT_TRUE(fails_with(
      4, [&] { return hb_get_event_message(nullptr, nullptr, &out.events, out.name, group, &out.sequence); }));
  EXPECT_TRUE(fails_with(
      4, [&] { return hb_get_event_message(descriptors, nullptr, nullptr, out.name, group, &out.sequence); }));
  EXPECT_TRUE(fails_with(
      4, [&] { return hb_get_event_message(descriptors, nullptr, &out.events, nullptr, group, &out.sequence); }));
  EXPECT_TRUE(fails_with(
      4, [&] { return hb_get_event_message(descriptors, nullptr, &out.events, out.name, nullptr, &out.sequence); }));
  EXPECT_TRUE(
      fails_with(4, [&] { return hb_get_event_message(descriptors, nullptr, &out.events, out.name, group, nullptr); }));
  EXPECT_TRUE(out.untouched());
  EXPECT_EQ(Hb_Success, take());
}

TEST_F(EventReception, NothingIsTakenAfterTheStop) {
  hb_terminate();
  EXPECT_TRUE(fails_with(12, [&] { return take(); }));
  EXPECT_TRUE(fails_with(12, [&] { return take(nullptr); }));
  EXPECT_TRUE(out.untouched());
}

TEST(UnstartedReception, DoesNotStartTheClient) {
  reset_platform();
  FakeDaemon daemon;
  EventOutputs out;
  int descriptors[] = {0, -1};
  EXPECT_TRUE(fails_with(12, [&] {
    return hb_get_event_message(descriptors, nullptr, &out.events, out.name, out.group.get(), &out.sequence);
  }));
  EXPECT_FALSE(daemon.has_client());
  EXPECT_TRUE(out.untouched());
}

TEST_F(EventReception, NothingIsTracedOfAnEventInDaemonMode) {
  trace_all();
  deliver(telling_packet(2).message(adapter_event_message({{3, 1}})));
  deliver(telling_packet(5).message(node_event_message({1, 0, 0, 0, 0, 0, 0, 0})));
  deliver(telling_packet(1));
  EXPECT_THAT(platform_double().traces, IsEmpty());
  trace_nothing();
}

}  // namespace
}  // namespace hb_test
