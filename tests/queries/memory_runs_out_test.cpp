// Memory: no event leaks, and running out of it fails the operation alone.
#include <gmock/gmock.h>

#include "hb_communication/configuration_load.h"
#include "hb_communication/shared_memory.h"
#include "hostile_input.h"

namespace hb_test {
namespace {

using testing::AnyOf;
using testing::Eq;

TEST_F(HostileInput, NoEventLeaksItsPacket) {
  for (const int32_t kind : {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16}) {
    const Bytes packet = whole_packet(kind);
    connection.send_frame(packet);
    const long live = live_allocations();
    take();
    EXPECT_EQ(live, live_allocations()) << kind;
  }
}

TEST_F(HostileInput, WithoutMemoryForAPacketTheReceiveFails) {
  for (const int32_t kind : {2, 5, 9, 12, 13, 15}) {
    const Bytes before = image_of_state();
    connection.send_frame(whole_packet(kind));
    {
      const AllocationFailure failure(1);
      EXPECT_TRUE(fails_with(12, [&] { return take(); })) << kind;
      EXPECT_TRUE(failure.happened());
    }
    EXPECT_TRUE(before == image_of_state());
    EXPECT_TRUE(out.untouched());
    hb_terminate();
    connection = start_client(daemon, sparse_cluster());
    connected();
  }
}

TEST_F(HostileInput, WithoutMemoryForTheHeaderOfAShortPacketItIsLost) {
  connection.send_frame(Bytes("\x0c\0\0\0", 4));
  {
    const AllocationFailure failure(2);
    EXPECT_TRUE(fails_with(17, [&] { return take(); }));
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_TRUE(out.untouched());
  EXPECT_EQ(Hb_Success, deliver(whole_packet(12)));
}

// Runs the operation with the first, the second, ... allocation failing until none fails, and looks after each.
template <typename Operation, typename Check>
size_t with_each_allocation_failing(Operation operation, Check check) {
  for (size_t nth = 1;; ++nth) {
    bool happened = false;
    Hb_Rc result = Hb_Success;
    const long live = live_allocations();
    {
      const AllocationFailure failure(nth);
      result = operation();
      happened = failure.happened();
    }
    if (!happened) {
      EXPECT_EQ(Hb_Success, result);
      return nth - 1;
    }
    EXPECT_EQ(Hb_Failure, result) << nth;
    EXPECT_EQ(live, live_allocations()) << nth;
    check(nth);
  }
}

TEST_F(HostileInput, AnUpdateWithoutMemoryFailsAtEveryAllocationAndTheOldTableStays) {
  const Packet packet = packet_of(ReplyPacket(9).message(sparse_cluster().adapter(31, "10.7.7.7").bytes()).bytes());
  const Bytes before = image_of_state();
  const size_t failures = with_each_allocation_failing([&] { return load_configuration_update(packet); },
                                                       [&](size_t nth) {
                                                         EXPECT_EQ(17, hb_get_errno()) << nth;
                                                         EXPECT_TRUE(before == image_of_state()) << nth;
                                                       });
  // The list of adapters, the list of nodes, three tables of three blocks, and the entries of 6 adapters, 6 addresses
  // and 4 nodes.
  EXPECT_EQ(2U + 9U + 6U + 6U + 4U, failures);
  EXPECT_EQ(6, global_config_tbl.Hb_num_adapters);
}

TEST_F(HostileInput, AnUpdateOverTheSocketWithoutMemoryFailsAndTheOldTableStays) {
  const Bytes update = whole_packet(9);
  for (const size_t nth : {2U, 3U, 10U, 20U}) {
    const Bytes before = image_of_state();
    connection.send_frame(update);
    {
      const AllocationFailure failure(nth);
      EXPECT_TRUE(fails_with(17, [&] { return take(); })) << nth;
      EXPECT_TRUE(failure.happened());
    }
    EXPECT_TRUE(before == image_of_state()) << nth;
    EXPECT_EQ(0x7A, out.events);
    EXPECT_EQ('x', out.name[0]);
  }
  EXPECT_EQ(Hb_Success, deliver(update));
}

TEST_F(HostileInput, ADescriptorArrayWithoutMemoryFails) {
  int* array = nullptr;
  int count = 77;
  {
    const AllocationFailure failure(1);
    EXPECT_TRUE(fails_with(17, [&] { return hb_get_file_descriptor_array(&array, &count); }));
  }
  EXPECT_EQ(nullptr, array);
  EXPECT_EQ(77, count);
}

TEST_F(HostileInput, QueriesAndSubscriptionsNeedNoMemory) {
  ASSERT_EQ(Hb_Success, deliver(whole_packet(4)));
  Hb_Subscription_Group group = {};
  group.Hb_subscription_type = Hb_Empty_Subscription;
  const Hb_IP_address6 address = address_of("10.0.0.3");
  char name[] = "net_disk_01";
  Hb_Adapter_Number adapter = 0;
  Hb_Network_Number network = 0;
  Hb_Adapter_Identifier id = {};
  const AllocationFailure failure(1, false);
  EXPECT_EQ(Hb_Success, hb_get_adapter_number_by_address(address, &adapter));
  EXPECT_EQ(Hb_Success, hb_get_network_number_by_name(name, &network));
  EXPECT_EQ(Hb_Success, hb_get_first_adapter(out.group.get(), &id));
  EXPECT_EQ(Hb_Success, hb_add_network_to_subscription_group(&group, 1));
  EXPECT_EQ(Hb_Success, hb_subscribe(name, &group, 1));
  EXPECT_EQ(Hb_Success, hb_unsubscribe(name));
  EXPECT_FALSE(failure.happened());
}

class StartWithoutMemory : public testing::Test {
 protected:
  StartWithoutMemory() {
    reset_platform();
    trace_nothing();
  }

  // A start that fails keeps what it made; the next one forgets it.
  static void give_back() {
    hb_remove_client_select();
    hb_remove_socket();
    hb_detach_shared_memory();
  }
};

TEST_F(StartWithoutMemory, FailsBeforeItConnects) {
  const FakeDaemon daemon;
  const AllocationFailure failure(1);
  EXPECT_TRUE(fails_with(17, [] { return hb_init(); }));
  EXPECT_FALSE(daemon.has_client());
  EXPECT_EQ(nullptr, client_socket);
  EXPECT_EQ(nullptr, client_select);
}

TEST_F(StartWithoutMemory, FailsForTheSelectorAndClosesTheConnection) {
  FakeDaemon daemon;
  {
    const AllocationFailure failure(2);
    EXPECT_TRUE(fails_with(17, [] { return hb_init(); }));
  }
  EXPECT_EQ(nullptr, client_socket);
  EXPECT_EQ(nullptr, client_select);
  EXPECT_TRUE(daemon.accept().at_end());
}

// Answers one client's request; one that gives up before it asks is no failure.
void serve_one_client(FakeDaemon& daemon) {
  DaemonConnection client = daemon.accept();
  if (client.at_end()) return;
  client.receive_request();
  client.send_frame(configuration_answer(sparse_cluster()));
  client.at_end();
}

TEST_F(StartWithoutMemory, FailsAtEveryLaterAllocationAndLoadsNothing) {
  size_t nth = 2;
  for (bool happened = true; happened;) {
    ++nth;
    FakeDaemon daemon;
    daemon.run(serve_one_client);
    Hb_Rc result = Hb_Success;
    {
      const AllocationFailure failure(nth);
      result = hb_init();
      happened = failure.happened();
    }
    EXPECT_EQ(happened ? Hb_Failure : Hb_Success, result) << nth;
    EXPECT_EQ(happened ? Hb_False : Hb_True, client_initialized) << nth;
    if (happened) {
      EXPECT_THAT(hb_get_errno(), AnyOf(Eq(17), Eq(27))) << nth;
      EXPECT_EQ(nullptr, global_config_tbl.Hb_global_adapter_list) << nth;
      give_back();
    }
    hb_terminate();
    daemon.join();
  }
  // At least the packet, two lists and three tables of three blocks were tried.
  EXPECT_GT(nth, 2U + 1U + 2U + 9U);
}

}  // namespace
}  // namespace hb_test
