// Deaths, joins and new groups of nodes.
#include <gtest/gtest.h>

#include <ostream>

#include "event_reception.h"
#include "hb_communication/event_reception.h"

namespace hb_test {
namespace {

struct Node_Event {
  const char* name;
  int32_t kind;
  int32_t events;
  int32_t state;
  int32_t reason;
};

void PrintTo(const Node_Event& event, std::ostream* stream) { *stream << event.name; }

class NodeEvents : public EventReception, public testing::WithParamInterface<Node_Event> {
 protected:
  GroupBytes expected_group(const std::vector<uint32_t>& flags, int32_t count) const {
    GroupBytes group(*out.group);
    group.type(0).events(GetParam().events).status(1).no_ffdc();
    if (GetParam().kind != 7) group.put(16, ByteBuilder().text("packet's identifier", 43).bytes());
    group.i32(60, count);
    for (size_t node = 0; node < flags.size(); ++node) group.u32(64 + 4 * node, flags[node]);
    return group;
  }
};

TEST_P(NodeEvents, FillTheRecordAndNothingBeyondIt) {
  const std::vector<uint32_t> flags = {1, 0, 2, 1, 0, 0, 0xFFFFFFFF, 1};
  const GroupBytes expected = expected_group(flags, 3);
  EXPECT_TRUE(succeeds([&] { return deliver(telling_packet(GetParam().kind).message(node_event_message(flags))); }));
  EXPECT_TRUE(expected.is(*out.group));
  EXPECT_EQ(GetParam().events, out.events);
  EXPECT_STREQ("followers", out.name);
  EXPECT_EQ(0x01020304U, out.sequence);
}

TEST_P(NodeEvents, SetStateAndReasonOfTheNodesThatAreExactlyTrue) {
  set_node_states(77, 88);
  deliver(telling_packet(GetParam().kind).message(node_event_message({1, 1, 1, 2, 0, 0, 0, 0})));
  EXPECT_EQ(GetParam().state, node_state(0).state);
  EXPECT_EQ(GetParam().reason, node_state(0).reason);
  EXPECT_EQ(77, node_state(3).state);
  EXPECT_EQ(88, node_state(3).reason);
  EXPECT_EQ(77, node_state(4).state);
  EXPECT_EQ(88, node_state(4).reason);
}

TEST_P(NodeEvents, CountNoValueThatOnlyHoldsAByteOfOne) {
  set_node_states(77, 88);
  const std::vector<uint32_t> flags = {0, 256, 0x01000000, 257, 0x00010000, 0, 1, 0};
  const GroupBytes expected = expected_group(flags, 1);
  EXPECT_EQ(Hb_Success, deliver(telling_packet(GetParam().kind).message(node_event_message(flags))));
  EXPECT_TRUE(expected.is(*out.group));
  EXPECT_EQ(77, node_state(3).state);
  EXPECT_EQ(88, node_state(3).reason);
}

TEST_P(NodeEvents, CountNodesThatAreNotConfiguredToo) {
  EXPECT_EQ(Hb_Success, deliver(telling_packet(GetParam().kind).message(node_event_message({1, 1, 1, 1, 1, 1, 1, 1}))));
  EXPECT_EQ(8, out.group->Hb_membership_grp_union.Hb_node_membership_grp.Hb_num_nodes);
}

TEST_P(NodeEvents, DoNotLookBehindTheMaximumOfNodes) {
  const std::vector<uint32_t> flags = {0, 0, 0, 1, 0, 0, 0, 0};
  const GroupBytes expected = expected_group(flags, 1);
  std::vector<uint32_t> longer = flags;
  longer.resize(2049, 1);
  EXPECT_EQ(Hb_Success, deliver(telling_packet(GetParam().kind).message(node_event_message(longer))));
  EXPECT_TRUE(expected.is(*out.group));
}

TEST_P(NodeEvents, LeaveTheAdaptersStates) {
  set_adapter_states(77);
  deliver(telling_packet(GetParam().kind).message(node_event_message({1, 1, 1, 1, 1, 1, 1, 1})));
  for (const uint32_t adapter : {0U, 2U, 12U, 13U, 17U}) EXPECT_EQ(77U, adapter_state(adapter));
}

TEST_P(NodeEvents, AreFilledByTheirOwnFunctionToo) {
  const std::vector<uint32_t> flags = {0, 0, 0, 1, 0, 0, 0, 0};
  std::memset(out.group->Hb_ffdc_id, 0, 43);
  const GroupBytes expected = expected_group(flags, 1);
  Packet packet = packet_of(telling_packet(GetParam().kind).message(node_event_message(flags)).bytes());
  EXPECT_TRUE(succeeds([&] { return hb_get_node_event(&out.events, out.name, out.group.get(), packet.release()); }));
  EXPECT_TRUE(expected.is(*out.group));
  EXPECT_STREQ("followers", out.name);
}

INSTANTIATE_TEST_SUITE_P(EventReception, NodeEvents,
                         testing::Values(Node_Event{"Death", 5, 1, 2, 0}, Node_Event{"Join", 6, 2, 1, 1},
                                         Node_Event{"NewGroup", 7, 4, 1, 1}),
                         [](const auto& test) { return std::string(test.param.name); });

TEST_F(EventReception, TheStatusOfANewNodeGroupIsAsSent) {
  for (const int32_t status : {0, 1, 7}) {
    EXPECT_EQ(Hb_Success,
              deliver(telling_packet(7).status(status).message(node_event_message({0, 0, 0, 0, 0, 0, 0, 0}))));
    EXPECT_EQ(status, out.group->Hb_group_status);
  }
}

TEST_F(EventReception, DeathsAndJoinsOfNodesAreUnstableWhateverThePacketSays) {
  for (const int32_t kind : {5, 6}) {
    out.group->Hb_group_status = Hb_Group_Stable;
    EXPECT_EQ(Hb_Success,
              deliver(telling_packet(kind).status(0).message(node_event_message({1, 0, 0, 0, 0, 0, 0, 0}))));
    EXPECT_EQ(1, out.group->Hb_group_status);
  }
}

TEST_F(EventReception, ResettingTheNodeListClearsItsEntriesAndNothingElse) {
  GroupBytes expected(*out.group);
  expected.put(64, Bytes(2049 * 4, '\0'));
  reset_node_membership_group_node_list(out.group.get());
  EXPECT_TRUE(expected.is(*out.group));
}

}  // namespace
}  // namespace hb_test
