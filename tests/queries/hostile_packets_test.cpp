// Events that are not whole, and numbers outside what they index.
#include <gtest/gtest.h>

#include "hb_global_data/node_table.h"
#include "hostile_input.h"

namespace hb_test {
namespace {

class TruncatedPackets : public HostileInput, public testing::WithParamInterface<int32_t> {};

TEST_P(TruncatedPackets, AreRefusedAtEveryLengthAndChangeNothing) {
  const Bytes whole = whole_packet(GetParam());
  for (size_t length = 1; length < whole.size(); ++length) {
    SCOPED_TRACE(length);
    expect_refused(whole.substr(0, length));
    if (HasFailure()) return;
  }
  EXPECT_EQ(Hb_Success, deliver(whole));
}

INSTANTIATE_TEST_SUITE_P(HostileInput, TruncatedPackets, testing::Values(2, 3, 4, 5, 6, 7, 9, 13, 15),
                         [](const auto& test) { return "Kind" + std::to_string(test.param); });

TEST_F(HostileInput, AFailureDataPacketWorksAtEveryLengthThatCarriesItsKind) {
  const Bytes whole = ReplyPacket(12).sequence(0x01020304).ffdc("the identifier").bytes();
  for (size_t length = 1; length <= whole.size(); ++length) {
    EXPECT_EQ(Hb_Success, deliver(whole.substr(0, length))) << length;
    EXPECT_EQ(8, out.events);
    EXPECT_STREQ("Hb_FFDC_Group", out.name);
    const Bytes padded = whole.substr(0, length) + Bytes(whole.size() - length, '\0');
    EXPECT_EQ(padded.substr(60, 43), Bytes(out.group->Hb_ffdc_id, 43)) << length;
    EXPECT_EQ(u32_at(padded, 104), out.sequence) << length;
  }
}

TEST_F(HostileInput, APacketWithoutABytesIsOfNoKindOfEvent) {
  const Bytes before = image_of_state();
  EXPECT_TRUE(fails_with(10, [&] { return deliver(Bytes()); }));
  EXPECT_TRUE(before == image_of_state());
  EXPECT_EQ(0x7A, out.events);
  EXPECT_EQ('x', out.name[0]);
}

TEST_F(HostileInput, AnAnswerThatNobodyAwaitsIsRefusedAtEveryLength) {
  const Bytes whole = ReplyPacket(10).value(3).bytes();
  for (size_t length = 1; length <= whole.size(); ++length) {
    EXPECT_TRUE(fails_with(10, [&] { return deliver(whole.substr(0, length)); })) << length;
  }
  EXPECT_EQ(0x7A, out.events);
}

TEST_F(HostileInput, AConfigurationThatNobodyAwaitsIsNotLoaded) {
  const Bytes before = image_of_state();
  const Bytes answer = ReplyPacket(0).message(sparse_cluster().local_node(1).bytes()).bytes();
  EXPECT_TRUE(fails_with(10, [&] { return deliver(answer); }));
  EXPECT_TRUE(before == image_of_state());
  EXPECT_EQ(0x7A, out.events);
  EXPECT_EQ('x', out.name[0]);
}

TEST_F(HostileInput, AFrameOfNegativeLengthFailsTheReceive) {
  for (const int32_t length : {-1, least}) {
    const Bytes before = image_of_state();
    connection.send_raw(ByteBuilder().i32(length).raw("rest").bytes());
    const long live = live_allocations();
    EXPECT_TRUE(fails_with(12, [&] { return take(); })) << length;
    EXPECT_EQ(live, live_allocations());
    EXPECT_TRUE(before == image_of_state());
    hb_terminate();
    connection = start_client(daemon, sparse_cluster());
    connected();
  }
  EXPECT_TRUE(out.untouched());
}

Bytes adapter_event_with_last_index(int32_t kind, int32_t last_index, const Bytes& entries) {
  return ReplyPacket(kind).message(ByteBuilder().i32(last_index).raw(entries).bytes()).bytes();
}

TEST_F(HostileInput, AnAdapterEventThatPromisesMoreEntriesThanItHasIsRefused) {
  const Bytes one_entry = ByteBuilder().u32(13).u32(1).bytes();
  for (const int32_t kind : {2, 3, 4}) {
    for (const int32_t last_index : {1, 2, 98351, 98352, 0x0FFFFFFF, 0x1FFFFFFF, 0x20000000, most}) {
      SCOPED_TRACE(last_index);
      expect_refused(adapter_event_with_last_index(kind, last_index, one_entry));
    }
  }
}

TEST_F(HostileInput, AnAdapterEventWithANegativeCountListsNoAdapter) {
  const Bytes one_entry = ByteBuilder().u32(13).u32(1).bytes();
  for (const int32_t last_index : {-1, -2, -100000, least}) {
    EXPECT_EQ(Hb_Success, deliver(adapter_event_with_last_index(2, last_index, one_entry))) << last_index;
    const Hb_Adapter_Membership_Grp& members = out.group->Hb_membership_grp_union.Hb_adapter_membership_grp;
    EXPECT_EQ(last_index + 1, members.Hb_num_adapters);
    for (size_t adapter = 0; adapter < 32; ++adapter) EXPECT_EQ(0xFFFFFFFFU, members.Hb_adapter_list[adapter]);
  }
}

TEST_F(HostileInput, AnAdapterNumberBeyondTheListIsSkippedAndTheOthersCount) {
  for (const int32_t kind : {2, 3, 4}) {
    const std::vector<AdapterEntry> entries = {{98352, 7}, {13, 5}, {0xFFFFFFFF, 8}, {0x80000000, 9}, {98351, 6}};
    EXPECT_EQ(Hb_Success, deliver(ReplyPacket(kind).message(adapter_event_message(entries)).bytes()));
    const Hb_Adapter_Membership_Grp& members = out.group->Hb_membership_grp_union.Hb_adapter_membership_grp;
    EXPECT_EQ(5, members.Hb_num_adapters);
    EXPECT_EQ(5U, members.Hb_adapter_list[13]);
    EXPECT_EQ(6U, members.Hb_adapter_list[98351]);
    EXPECT_EQ(0xFFFFFFFFU, members.Hb_adapter_list[12]);
    EXPECT_EQ(0x5A5A5A5AU, members.Hb_adapter_list[98350]);
  }
}

TEST_F(HostileInput, AnAdapterThatTheListHasNoPlaceForKeepsItsState) {
  hb_terminate();
  connection = start_client(
      daemon, sparse_cluster().adapter(98352, "10.9.9.9", 0, "far", 1).adapter(98351, "10.9.9.8", 0, "last", 1));
  connected();
  EXPECT_EQ(Hb_Success, deliver(ReplyPacket(2).message(adapter_event_message({{98352, 7}, {98351, 7}})).bytes()));
  EXPECT_EQ(Hb_Entity_Up, hb_get_adap_entry(98352)->Hb_state);
  EXPECT_EQ(Hb_Entity_Down, hb_get_adap_entry(98351)->Hb_state);
}

TEST_F(HostileInput, ALeaderOutsideTheListHasNoIncarnation) {
  for (const uint32_t leader : {98352U, 0x80000000U, 0xFFFFFFFFU}) {
    EXPECT_EQ(Hb_Success, deliver(ReplyPacket(4).leader(leader, 0).message(adapter_event_message({{13, 5}})).bytes()));
    Hb_Adapter_Identifier id = {};
    EXPECT_EQ(Hb_Success, hb_get_group_leader_id(out.group.get(), &id)) << leader;
    EXPECT_EQ(leader, id.Hb_adapter_number);
    EXPECT_EQ(0xFFFFFFFFU, id.Hb_incarnation);
  }
}

TEST_F(HostileInput, ANameWithoutATerminatorIsReadToTheEndOfItsField) {
  for (const int32_t kind : {2, 3, 4, 5, 6, 7, 13, 15}) {
    Bytes packet = whole_packet(kind);
    packet.replace(24, 32, Bytes(32, 'n'));
    std::memset(out.name, 'x', sizeof out.name);
    EXPECT_EQ(Hb_Success, deliver(packet)) << kind;
    EXPECT_EQ(std::string(31, 'n'), out.name) << kind;
    EXPECT_EQ('x', out.name[32]) << kind;
  }
}

}  // namespace
}  // namespace hb_test
