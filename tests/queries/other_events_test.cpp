// Heartbeat settings, failure data, other instances, packets that are no events, and what all events share.
#include <gmock/gmock.h>

#include <thread>

#include "event_reception.h"
#include "hb_communication/event_reception.h"

namespace hb_test {
namespace {

TEST_F(EventReception, HeartbeatSettingsAreKeptAndTheMembershipStays) {
  GroupBytes expected(*out.group);
  expected.events(512).no_ffdc();
  const Bytes settings = ByteBuilder().i32(5).i32(250000).i32(1).i32(4711).bytes();
  EXPECT_TRUE(succeeds([&] { return deliver(telling_packet(15).message(settings)); }));
  EXPECT_TRUE(expected.is(*out.group));
  EXPECT_EQ(512, out.events);
  EXPECT_STREQ("followers", out.name);
  EXPECT_EQ(0x01020304U, out.sequence);
  EXPECT_EQ(5, client_hb_info.client_hb_thresh.tv_sec);
  EXPECT_EQ(250000, client_hb_info.client_hb_thresh.tv_usec);
  EXPECT_EQ(Hb_True, client_hb_info.client_hb_is_enabled);
  EXPECT_EQ(4711, client_hb_info.client_hb_daemon_pid);
}

TEST_F(EventReception, HeartbeatSettingsLeaveTheNodesStates) {
  set_node_states(77, 88);
  deliver(telling_packet(15).message(ByteBuilder().i32(1).i32(1).i32(1).i32(1).bytes()));
  for (const uint32_t node : {0U, 3U, 4U}) EXPECT_EQ(77, node_state(node).state);
}

TEST_F(EventReception, AFailureDataIdentifierComesUnderItsOwnName) {
  GroupBytes expected(*out.group);
  expected.events(8).put(16, ByteBuilder().text("packet's identifier", 43).bytes());
  EXPECT_TRUE(succeeds([&] { return deliver(telling_packet(12)); }));
  EXPECT_TRUE(expected.is(*out.group));
  EXPECT_EQ(8, out.events);
  EXPECT_STREQ("Hb_FFDC_Group", out.name);
  EXPECT_EQ(0x01020304U, out.sequence);
  Hb_FFDC_Id identifier;
  EXPECT_EQ(Hb_Success, hb_get_FFDC_id(out.group.get(), &identifier));
  EXPECT_STREQ("packet's identifier", identifier);
}

TEST_F(EventReception, AFailureDataIdentifierIsCopiedWithAll43Bytes) {
  const std::string whole(43, 'f');
  for (const int32_t kind : {5, 6, 12}) {
    std::memset(out.group->Hb_ffdc_id, 'o', 43);
    EXPECT_EQ(Hb_Success,
              deliver(telling_packet(kind).ffdc(whole).message(node_event_message({1, 0, 0, 0, 0, 0, 0, 0}))));
    EXPECT_EQ(whole, std::string(out.group->Hb_ffdc_id, 43)) << kind;
    EXPECT_EQ(0x5A, reinterpret_cast<const char*>(out.group.get())[59]) << kind;
  }
}

TEST_F(EventReception, AnotherInstanceIsToldWithItsSender) {
  const Bytes sender = address_bytes("10.9.8.7") + ByteBuilder().u32(0xCAFE0001).bytes();
  GroupBytes expected(*out.group);
  expected.type(2).events(256).no_ffdc().put(60, sender);
  EXPECT_TRUE(succeeds([&] { return deliver(telling_packet(13).message(sender)); }));
  EXPECT_TRUE(expected.is(*out.group));
  EXPECT_EQ(256, out.events);
  EXPECT_STREQ("followers", out.name);
  EXPECT_EQ(0x01020304U, out.sequence);
  Hb_Diff_Instance_Info info;
  EXPECT_EQ(Hb_Success, hb_get_different_instance_sender(out.group.get(), &info));
  EXPECT_EQ(0xCAFE0001U, info.machinesInst);
}

TEST_F(EventReception, OfAnotherInstancesMessageTheFirst20BytesCount) {
  GroupBytes expected(*out.group);
  expected.type(2).events(256).no_ffdc().put(60, Bytes(20, 'i'));
  EXPECT_EQ(Hb_Success, deliver(telling_packet(13).message(Bytes(64, 'i'))));
  EXPECT_TRUE(expected.is(*out.group));
}

class NoEvents : public EventReception, public testing::WithParamInterface<int32_t> {};

TEST_P(NoEvents, AreRefusedAndLost) {
  GroupBytes expected(*out.group);
  expected.no_ffdc();
  EXPECT_TRUE(fails_with(10, [&] { return deliver(telling_packet(GetParam()).message(Bytes(400, '\1'))); }));
  EXPECT_TRUE(expected.is(*out.group));
  EXPECT_EQ(0x7A, out.events);
  EXPECT_EQ('x', out.name[0]);
  EXPECT_EQ(0x01020304U, out.sequence);
  EXPECT_EQ(Hb_Success, deliver(telling_packet(12)));
}

INSTANTIATE_TEST_SUITE_P(EventReception, NoEvents,
                         testing::Values(0, 1, 8, 10, 11, 14, 16, 17, 201, 2147483647, -1, -2147483647 - 1),
                         [](const auto& test) {
                           const std::string digits = std::to_string(test.param);
                           return test.param < 0 ? "KindMinus" + digits.substr(1) : "Kind" + digits;
                         });

TEST_F(EventReception, SequenceNumbersAreHandedOnWhateverTheyAre) {
  for (const uint32_t number : {5U, 4U, 4U, 0xFFFFFFFFU, 0U, 1000U}) {
    EXPECT_EQ(Hb_Success, deliver(ReplyPacket(12).sequence(number)));
    EXPECT_EQ(number, out.sequence);
  }
}

TEST_F(EventReception, AnEarlierFailureDataIdentifierIsCleared) {
  std::memset(out.group->Hb_ffdc_id, 'f', 43);
  EXPECT_EQ(Hb_Success, deliver(telling_packet(4).message(adapter_event_message({{0, 1}}))));
  EXPECT_EQ(Bytes(43, '\0'), Bytes(out.group->Hb_ffdc_id, 43));
}

TEST_F(EventReception, TheCallersCursorStays) {
  for (const int32_t kind : {2, 3, 4}) {
    out.group->Hb_cursor = 4711;
    deliver(telling_packet(kind).message(adapter_event_message({{0, 1}})));
    EXPECT_EQ(4711, out.group->Hb_cursor);
  }
}

TEST_F(EventReception, ANameOf31CharactersComesWhole) {
  const std::string longest(31, 'n');
  EXPECT_EQ(Hb_Success, deliver(telling_packet(4).name(longest).message(adapter_event_message({{0, 1}}))));
  EXPECT_EQ(longest, out.name);
  EXPECT_EQ('x', out.name[32]);
}

TEST_F(EventReception, EventsAreReadFromAnySplitOfTheStream) {
  connection.send_byte_by_byte(framed(telling_packet(12).bytes()) +
                               framed(telling_packet(4).message(adapter_event_message({{0, 1}})).bytes()));
  EXPECT_EQ(Hb_Success, take());
  EXPECT_EQ(8, out.events);
  EXPECT_EQ(Hb_Success, take());
  EXPECT_EQ(4, out.events);
}

TEST_F(EventReception, OneCallTakesOneEvent) {
  connection.send_raw(framed(ReplyPacket(12).sequence(1).bytes()) + framed(ReplyPacket(12).sequence(2).bytes()));
  EXPECT_EQ(Hb_Success, take());
  EXPECT_EQ(1U, out.sequence);
  EXPECT_EQ(Hb_Success, take());
  EXPECT_EQ(2U, out.sequence);
  timeval at_once = {0, 0};
  EXPECT_TRUE(fails_with(2, [&] { return take(&at_once); }));
}

TEST_F(EventReception, AFrameLongerThanAnyPacketIsTakenAsSent) {
  constexpr size_t longest_packet = 6298816;
  const Bytes message(longest_packet, 'm');
  std::thread sender([&] {
    connection.send_frame(ReplyPacket(12).message(message).sequence(1).bytes());
    connection.send_frame(ReplyPacket(12).sequence(2).bytes());
  });
  EXPECT_TRUE(succeeds([&] { return take(); }));
  EXPECT_EQ(8, out.events);
  EXPECT_EQ(1U, out.sequence);
  EXPECT_TRUE(succeeds([&] { return take(); }));
  EXPECT_EQ(2U, out.sequence);
  sender.join();
}

TEST_F(EventReception, ANewAdapterGroupAnswersTheAccessors) {
  deliver(telling_packet(4).leader(13, 0).group(0, 42).status(0).message(
      adapter_event_message({{13, 5}, {2, 0x08000006}})));
  Hb_Adapter_Identifier id = {};
  EXPECT_EQ(Hb_Success, hb_get_group_id(out.group.get(), &id));
  EXPECT_EQ(13U, id.Hb_adapter_number);
  EXPECT_EQ(42U, id.Hb_incarnation);
  EXPECT_EQ(Hb_Success, hb_get_group_leader_id(out.group.get(), &id));
  EXPECT_EQ(5U, id.Hb_incarnation);
  EXPECT_EQ(Hb_Success, hb_get_first_adapter(out.group.get(), &id));
  EXPECT_EQ(2U, id.Hb_adapter_number);
  EXPECT_EQ(6U, hb_adapter_incarnation(&id));
  EXPECT_EQ(Hb_True, hb_has_adapter_died_because_removed(&id));
  EXPECT_EQ(Hb_Success, hb_get_next_adapter(out.group.get(), &id));
  EXPECT_EQ(13U, id.Hb_adapter_number);
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_adapter(out.group.get(), &id); }));
}

TEST_F(EventReception, ANodeDeathAnswersTheAccessors) {
  deliver(telling_packet(5).message(node_event_message({0, 0, 0, 1, 0, 0, 0, 0})));
  Hb_Node_Number node = 99;
  EXPECT_EQ(Hb_Success, hb_get_first_node(out.group.get(), &node));
  EXPECT_EQ(3, node);
  EXPECT_EQ(Hb_True, hb_is_node_in_group(out.group.get(), 3));
  Hb_Entity_State state;
  Hb_Entity_State_Reason reason;
  EXPECT_EQ(Hb_Success, hb_get_node_status_reason(3, &state, &reason));
  EXPECT_EQ(2, state);
  EXPECT_EQ(0, reason);
  Hb_FFDC_Id identifier;
  EXPECT_EQ(Hb_Success, hb_get_FFDC_id(out.group.get(), &identifier));
  EXPECT_STREQ("packet's identifier", identifier);
}

}  // namespace
}  // namespace hb_test
