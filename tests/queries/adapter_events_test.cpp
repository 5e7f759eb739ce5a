// Deaths, joins and new groups of adapters.
#include <gmock/gmock.h>

#include <ostream>

#include "event_reception.h"
#include "hb_communication/event_reception.h"

namespace hb_test {
namespace {

struct Adapter_Event {
  const char* name;
  int32_t kind;
  int32_t events;
  uint32_t state;  // of the adapters listed
};

void PrintTo(const Adapter_Event& event, std::ostream* stream) { *stream << event.name; }

class AdapterEvents : public EventReception, public testing::WithParamInterface<Adapter_Event> {
 protected:
  // What a death or join leaves in the record, or a new group of the telling packet.
  GroupBytes expected_group(const std::vector<AdapterEntry>& entries) const {
    const bool new_group = GetParam().kind == 4;
    GroupBytes group(*out.group);
    group.type(1).events(GetParam().events).status(1).no_ffdc();
    group.i32(60, static_cast<int32_t>(entries.size()));
    group.u32(64, new_group ? 0xA1A2A3A4 : 0xFFFFFFFF);
    group.u32(68, new_group ? 0xD1D2D3D4 : 0xFFFFFFFF);
    for (size_t adapter = 0; adapter < 32; ++adapter) group.u32(72 + 4 * adapter, 0xFFFFFFFF);
    for (const AdapterEntry& entry : entries) group.u32(72 + 4 * entry.adapter, entry.incarnation);
    return group;
  }
};

TEST_P(AdapterEvents, FillTheRecordAndNothingBeyondIt) {
  const std::vector<AdapterEntry> entries = {{13, 0x1000}, {2, 0x08000005}};
  const GroupBytes expected = expected_group(entries);
  EXPECT_TRUE(
      succeeds([&] { return deliver(telling_packet(GetParam().kind).message(adapter_event_message(entries))); }));
  EXPECT_TRUE(expected.is(*out.group));
  EXPECT_EQ(GetParam().events, out.events);
  EXPECT_STREQ("followers", out.name);
  EXPECT_EQ(0x01020304U, out.sequence);
}

TEST_P(AdapterEvents, SetTheStateOfTheListedAdaptersOnly) {
  set_adapter_states(77);
  deliver(telling_packet(GetParam().kind).message(adapter_event_message({{13, 1}, {2, 1}})));
  EXPECT_EQ(GetParam().state, adapter_state(13));
  EXPECT_EQ(GetParam().state, adapter_state(2));
  EXPECT_EQ(77U, adapter_state(0));
  EXPECT_EQ(77U, adapter_state(12));
  EXPECT_EQ(77U, adapter_state(17));
}

TEST_P(AdapterEvents, ListAnAdapterThatIsNotConfiguredWithoutAnError) {
  const std::vector<AdapterEntry> entries = {{3, 4}, {7, 8}};
  const GroupBytes expected = expected_group(entries);
  EXPECT_TRUE(
      succeeds([&] { return deliver(telling_packet(GetParam().kind).message(adapter_event_message(entries))); }));
  EXPECT_TRUE(expected.is(*out.group));
}

TEST_P(AdapterEvents, ListAnAdapterBeyondTheClusterWhereItsNumberSays) {
  const std::vector<AdapterEntry> entries = {{32, 4}, {98351, 8}};
  const GroupBytes expected = expected_group(entries);
  EXPECT_EQ(Hb_Success, deliver(telling_packet(GetParam().kind).message(adapter_event_message(entries))));
  EXPECT_TRUE(expected.is(*out.group));
}

TEST_P(AdapterEvents, KeepTheLaterOfTwoEntriesOfOneAdapter) {
  EXPECT_EQ(Hb_Success, deliver(telling_packet(GetParam().kind).message(adapter_event_message({{13, 1}, {13, 2}}))));
  EXPECT_EQ(2U, out.group->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_adapter_list[13]);
  EXPECT_EQ(2, out.group->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_num_adapters);
}

TEST_P(AdapterEvents, MayListNoAdapter) {
  const GroupBytes expected = expected_group({});
  EXPECT_EQ(Hb_Success, deliver(telling_packet(GetParam().kind).message(adapter_event_message({}))));
  EXPECT_TRUE(expected.is(*out.group));
}

TEST_P(AdapterEvents, DoNotLookBehindTheirEntries) {
  const GroupBytes expected = expected_group({{13, 9}});
  const Bytes longer = adapter_event_message({{13, 9}}) + ByteBuilder().u32(2).u32(5).bytes();
  EXPECT_EQ(Hb_Success, deliver(telling_packet(GetParam().kind).message(longer)));
  EXPECT_TRUE(expected.is(*out.group));
}

TEST_P(AdapterEvents, FollowOneAnother) {
  deliver(telling_packet(2).message(adapter_event_message({{13, 1}})));
  out.group->Hb_cursor = 0x5A5A5A5A;
  const GroupBytes expected = expected_group({{12, 3}});
  EXPECT_EQ(Hb_Success, deliver(telling_packet(GetParam().kind).message(adapter_event_message({{12, 3}}))));
  EXPECT_TRUE(expected.is(*out.group));
}

TEST_P(AdapterEvents, AreFilledByTheirOwnFunctionToo) {
  const GroupBytes expected = expected_group({{13, 9}});
  Packet packet = packet_of(telling_packet(GetParam().kind).message(adapter_event_message({{13, 9}})).bytes());
  std::memset(out.group->Hb_ffdc_id, 0, 43);
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_event(&out.events, out.name, out.group.get(), packet.release()); }));
  EXPECT_TRUE(expected.is(*out.group));
  EXPECT_EQ(GetParam().events, out.events);
  EXPECT_STREQ("followers", out.name);
  EXPECT_EQ(0x7BU, out.sequence);
}

INSTANTIATE_TEST_SUITE_P(EventReception, AdapterEvents,
                         testing::Values(Adapter_Event{"Death", 2, 1, 2}, Adapter_Event{"Join", 3, 2, 1},
                                         Adapter_Event{"NewGroup", 4, 4, 1}),
                         [](const auto& test) { return std::string(test.param.name); });

TEST_F(EventReception, ADeathOfAdapters3And7ListsThese) {
  EXPECT_EQ(Hb_Success, deliver(telling_packet(2).message(adapter_event_message({{3, 30}, {7, 70}}))));
  const Hb_Adapter_Membership_Grp& members = out.group->Hb_membership_grp_union.Hb_adapter_membership_grp;
  for (uint32_t adapter = 0; adapter < 32; ++adapter) {
    const uint32_t expected = adapter == 3 ? 30 : adapter == 7 ? 70 : 0xFFFFFFFF;
    EXPECT_EQ(expected, members.Hb_adapter_list[adapter]) << adapter;
  }
  EXPECT_EQ(2, members.Hb_num_adapters);
  EXPECT_EQ(0xFFFFFFFFU, members.Hb_group_leader);
  EXPECT_EQ(0xFFFFFFFFU, members.Hb_group_incarnation);
}

TEST_F(EventReception, TheStatusOfANewAdapterGroupIsAsSent) {
  for (const int32_t status : {0, 1, 7, -1}) {
    EXPECT_EQ(Hb_Success, deliver(telling_packet(4).status(status).message(adapter_event_message({{0, 1}}))));
    EXPECT_EQ(status, out.group->Hb_group_status);
  }
}

TEST_F(EventReception, DeathsAndJoinsOfAdaptersAreUnstableWhateverThePacketSays) {
  for (const int32_t kind : {2, 3}) {
    out.group->Hb_group_status = Hb_Group_Stable;
    EXPECT_EQ(Hb_Success, deliver(telling_packet(kind).status(0).message(adapter_event_message({{0, 1}}))));
    EXPECT_EQ(1, out.group->Hb_group_status);
  }
}

TEST_F(EventReception, ADeathBehindAnUpdateReachesTheNewAdapters) {
  const ConfigurationMessage changed = ConfigurationMessage()
                                           .max_nodes(3)
                                           .adapters_per_node(2)
                                           .adapter(2, "10.2.0.2", 0, "en2", 1)
                                           .adapter(3, "10.2.0.3", 0, "en3", 1)
                                           .network("net_changed", "ether");
  EXPECT_EQ(Hb_Success, deliver(ReplyPacket(9).message(changed.bytes())));
  EXPECT_EQ(Hb_Success, deliver(ReplyPacket(2).message(adapter_event_message({{3, 30}}))));
  EXPECT_EQ(1U, adapter_state(2));
  EXPECT_EQ(2, global_config_tbl.Hb_global_adapter_list[1].Hb_state);
  const Hb_Incarnation* list = out.group->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_adapter_list;
  EXPECT_THAT(std::vector<Hb_Incarnation>(list, list + 7),
              testing::ElementsAre(0xFFFFFFFF, 0xFFFFFFFF, 0xFFFFFFFF, 30, 0xFFFFFFFF, 0xFFFFFFFF, 0x5A5A5A5A));
}

}  // namespace
}  // namespace hb_test
