// The descriptors that a caller waits on.
#include <gtest/gtest.h>

#include "hb_client/events.h"
#include "hb_communication/connection.h"
#include "support/allocation_faults.h"
#include "support/process_state.h"
#include "support/running_client.h"

namespace hb_test {
namespace {

class DescriptorArray : public RunningClient {
 protected:
  DescriptorArray() { set_hb_errno(49); }

  int* descriptors = nullptr;
  int count = -7;
};

TEST_F(DescriptorArray, IsTheSocketAndMinusOne) {
  ASSERT_EQ(hb_get_file_descriptor_array(&descriptors, &count), Hb_Success);
  EXPECT_EQ(count, 1);
  EXPECT_EQ(descriptors[0], client_socket->socket());
  EXPECT_EQ(descriptors[1], -1);
  EXPECT_EQ(hb_free_file_descriptor_array(descriptors), Hb_Success);
}

TEST_F(DescriptorArray, IsNewEachTime) {
  ASSERT_EQ(hb_get_file_descriptor_array(&descriptors, &count), Hb_Success);
  int* others = nullptr;
  ASSERT_EQ(hb_get_file_descriptor_array(&others, &count), Hb_Success);
  EXPECT_NE(descriptors, others);
  hb_free_file_descriptor_array(descriptors);
  hb_free_file_descriptor_array(others);
}

TEST_F(DescriptorArray, FreedLeavesTheDescriptorOpen) {
  ASSERT_EQ(hb_get_file_descriptor_array(&descriptors, &count), Hb_Success);
  const int open = open_descriptors();
  hb_free_file_descriptor_array(descriptors);
  EXPECT_EQ(open_descriptors(), open);
}

TEST_F(DescriptorArray, WithoutAPlaceForItFailsWithoutAnErrorNumber) {
  EXPECT_EQ(hb_get_file_descriptor_array(nullptr, &count), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 49);
  EXPECT_EQ(count, -7);
  EXPECT_EQ(hb_get_file_descriptor_array(&descriptors, nullptr), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 49);
  EXPECT_EQ(descriptors, nullptr);
}

TEST_F(DescriptorArray, OfNullIsNotFreed) {
  EXPECT_EQ(hb_free_file_descriptor_array(nullptr), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 49);
}

TEST_F(DescriptorArray, InVexModeWithoutHandlersIsEmpty) {
  IsVEX = Hb_True;
  ASSERT_EQ(hb_get_file_descriptor_array(&descriptors, &count), Hb_Success);
  EXPECT_EQ(count, 0);
  EXPECT_EQ(descriptors[0], -1);
  hb_free_file_descriptor_array(descriptors);
}

TEST_F(DescriptorArray, WithoutAConnectionFails) {
  hb_remove_socket();
  EXPECT_EQ(hb_get_file_descriptor_array(&descriptors, &count), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 12);
  EXPECT_EQ(descriptors, nullptr);
}

TEST_F(DescriptorArray, WithoutMemoryFails) {
  for (const Hb_Boolean mode : {Hb_False, Hb_True}) {
    IsVEX = mode;
    set_hb_errno(0);
    Hb_Rc rc = Hb_Success;
    {
      const AllocationFailure failure(1);
      rc = hb_get_file_descriptor_array(&descriptors, &count);
      EXPECT_TRUE(failure.happened());
    }
    EXPECT_EQ(rc, Hb_Failure);
    EXPECT_EQ(hb_get_errno(), 17);
    EXPECT_EQ(descriptors, nullptr);
    EXPECT_EQ(count, -7);
  }
}

TEST(DescriptorArrayOfAStoppedClient, StartsIt) {
  reset_platform();
  FakeDaemon daemon;
  daemon.serve_configuration(configuration_answer(small_cluster()));
  int* descriptors = nullptr;
  int count = 0;
  ASSERT_EQ(hb_get_file_descriptor_array(&descriptors, &count), Hb_Success);
  daemon.join();
  EXPECT_EQ(client_initialized, Hb_True);
  EXPECT_EQ(descriptors[0], client_socket->socket());
  hb_free_file_descriptor_array(descriptors);
  hb_terminate();
}

TEST(DescriptorArrayOfAStoppedClient, FailsWhenTheStartFails) {
  reset_platform();
  FakeDaemon daemon;
  daemon.stop_listening();
  int* descriptors = nullptr;
  int count = -7;
  EXPECT_EQ(hb_get_file_descriptor_array(&descriptors, &count), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 15);
  EXPECT_EQ(descriptors, nullptr);
  EXPECT_EQ(count, -7);
}

// After the daemon went away.

TEST_F(DescriptorArray, IsGivenByANewConnectionAfterTheDaemonWasGone) {
  connection.close();
  EXPECT_EQ(hb_send(HB_DISCARD_STALE_MESSAGES, nullptr, 0), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 16);
  EXPECT_EQ(hb_init(), Hb_Success);  // nothing reconnects by itself
  EXPECT_EQ(hb_send(HB_DISCARD_STALE_MESSAGES, nullptr, 0), Hb_Failure);
  EXPECT_EQ(hb_terminate(), Hb_Success);
  connection = start_client(daemon, small_cluster());
  EXPECT_EQ(hb_send(HB_DISCARD_STALE_MESSAGES, nullptr, 0), Hb_Success);
  EXPECT_EQ(i32_at(connection.receive_request(), 8), 219);
  EXPECT_EQ(client_socket->eof(), Hb_False);
}

}  // namespace
}  // namespace hb_test
