// What the stream socket allocates, and where memory runs out.
#include <gtest/gtest.h>

#include <cstdint>
#include <memory>

#include "hb_communication/connection.h"
#include "platform/Hb_Csock.h"
#include "support/allocation_faults.h"
#include "support/fake_daemon.h"

namespace hb_test {
namespace {

class ReceivingMemory : public testing::Test {
 protected:
  ReceivingMemory() {
    daemon.path().copy(SERVER_SOCK_FNAME, sizeof SERVER_SOCK_FNAME - 1);
    SERVER_SOCK_FNAME[daemon.path().size()] = '\0';
    socket = std::make_unique<Hb_Csock>();
    peer = daemon.accept();
  }

  FakeDaemon daemon{Publication::none()};
  std::unique_ptr<Hb_Csock> socket;
  DaemonConnection peer;
  char* message = nullptr;
  int length = -7;
};

TEST_F(ReceivingMemory, IsOneArrayOfTheLengthSent) {
  peer.send_frame(Bytes(77, 'x'));
  const long live = live_allocations();
  ASSERT_EQ(socket->receive(&message, length), Hb_Success);
  EXPECT_EQ(live_allocations(), live + 1);
  EXPECT_EQ(last_allocation(), 77U);
  delete[] message;
  EXPECT_EQ(live_allocations(), live);
}

TEST_F(ReceivingMemory, IsReleasedWhenTheMessageDoesNotCome) {
  peer.send_raw(framed(Bytes(77, 'x')).substr(0, 40));
  peer.close();
  const long live = live_allocations();
  EXPECT_EQ(socket->receive(&message, length), Hb_Failure);
  EXPECT_EQ(last_allocation(), 77U);
  EXPECT_EQ(live_allocations(), live);
  EXPECT_NE(message, nullptr);  // the released address stays
}

TEST_F(ReceivingMemory, ThatIsNotToBeHadFailsAsARead) {
  peer.send_raw(ByteBuilder().i32(INT32_MAX).bytes());
  const AllocationFailure failure(1);
  const Hb_Rc rc = socket->receive(&message, length);
  EXPECT_TRUE(failure.happened());
  EXPECT_EQ(rc, Hb_Failure);
  EXPECT_EQ(socket->Error(), 13);
  EXPECT_EQ(socket->eof(), Hb_False);
  EXPECT_EQ(length, -7);
}

}  // namespace
}  // namespace hb_test
