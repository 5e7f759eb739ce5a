// Failure data, senders of other instances, sites and splits, and the state of a node.
#include <gmock/gmock.h>

#include <cstdlib>
#include <cstring>
#include <type_traits>

#include "membership.h"
#include "platform_doubles.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

TEST_F(Membership, TheFailureDataIdentifierComesWithAllItsBytesAndNoMore) {
  for (const Hb_Events events : {1, 2, 8}) {
    for (const int type : {0, 1, 2}) {
      make_adapter_group(events);
      set_type(type);
      for (size_t index = 0; index < 43; ++index) group->Hb_ffdc_id[index] = static_cast<char>('A' + index);
      struct {
        Hb_FFDC_Id id;
        char guard[5];
      } read;
      std::memset(&read, 0xEE, sizeof read);
      EXPECT_TRUE(succeeds([&] { return hb_get_FFDC_id(group.get(), &read.id); })) << events;
      EXPECT_EQ(0, std::memcmp(read.id, group->Hb_ffdc_id, 43));
      EXPECT_EQ('A', read.id[0]);
      EXPECT_EQ('k', read.id[42]);
      EXPECT_EQ(Bytes(5, '\xEE'), Bytes(read.guard, sizeof read.guard));
    }
  }
}

TEST_F(Membership, NoFailureDataIdentifierIsToldOfAnotherEvent) {
  for (const Hb_Events events : {0, 3, 4, 9, 128, 256, 512}) {
    make_adapter_group(events);
    set_text(group->Hb_ffdc_id, "identifier");
    Hb_FFDC_Id identifier = "before";
    EXPECT_TRUE(fails_with(3, [&] { return hb_get_FFDC_id(group.get(), &identifier); })) << events;
    EXPECT_STREQ("before", identifier);
  }
}

TEST_F(Membership, AnEmptyFailureDataIdentifierIsNotTold) {
  for (const Hb_Events events : {1, 2, 8}) {
    make_adapter_group(events);
    std::memcpy(group->Hb_ffdc_id, "\0rest", 5);
    Hb_FFDC_Id identifier = "before";
    EXPECT_TRUE(fails_with(3, [&] { return hb_get_FFDC_id(group.get(), &identifier); })) << events;
    EXPECT_STREQ("before", identifier);
  }
}

TEST_F(Membership, TheSenderOfAnotherInstanceIsTold) {
  make_node_group(256);
  group->Hb_group_type = Hb_Diff_Instance_Type;
  group->Hb_membership_grp_union.diff_instance_info.addr = address_of("10.9.8.7");
  group->Hb_membership_grp_union.diff_instance_info.machinesInst = 0x01020304;
  Hb_Diff_Instance_Info sender = {};
  EXPECT_TRUE(succeeds([&] { return hb_get_different_instance_sender(group.get(), &sender); }));
  EXPECT_EQ(address_bytes("10.9.8.7"), Bytes(reinterpret_cast<char*>(&sender.addr), 16));
  EXPECT_EQ(0x01020304U, sender.machinesInst);
}

TEST_F(Membership, NoSenderIsToldOfAnotherEventOrType) {
  Hb_Diff_Instance_Info sender = {};
  sender.machinesInst = 99;
  for (const Hb_Events events : {0, 1, 4, 0x101, 512}) {
    make_node_group(events);
    group->Hb_group_type = Hb_Diff_Instance_Type;
    EXPECT_TRUE(fails_with(3, [&] { return hb_get_different_instance_sender(group.get(), &sender); })) << events;
  }
  for (const int type : {0, 1, 3, 4, 5}) {
    make_node_group(256);
    set_type(type);
    EXPECT_TRUE(fails_with(3, [&] { return hb_get_different_instance_sender(group.get(), &sender); })) << type;
  }
  EXPECT_EQ(99U, sender.machinesInst);
}

TEST_F(Membership, ANullGroupOrOutputForTheSenderIsRefusedWhateverTheRecord) {
  Hb_Diff_Instance_Info sender = {};
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_different_instance_sender(nullptr, &sender); }));
  const std::pair<int, Hb_Events> records[] = {{2, 256}, {2, 4}, {1, 256}};
  for (const auto& [type, events] : records) {
    make_node_group(events);
    set_type(type);
    EXPECT_TRUE(fails_with(4, [&] { return hb_get_different_instance_sender(group.get(), nullptr); })) << events;
  }
}

// The union starts at byte 60 of the group.
uint8_t* union_of(Hb_Group& group) { return reinterpret_cast<uint8_t*>(&group) + 60; }

TEST_F(Membership, EveryRecordOfSitesAndSplitsStandsAtTheStartOfTheUnion) {
  auto& members = group->Hb_membership_grp_union;
  const void* start = union_of(*group);
  EXPECT_EQ(start, &members.site_split_info);
  EXPECT_EQ(start, &members.site_merge_info);
  EXPECT_EQ(start, &members.split_info);
  EXPECT_EQ(start, &members.merge_info);
  EXPECT_EQ(136U, sizeof members.site_split_info);
  EXPECT_EQ(144U, sizeof members.site_merge_info);
  EXPECT_EQ(164U, sizeof members.split_info);
  EXPECT_TRUE((std::is_same_v<Hb_Split_Merge_Info, decltype(members.merge_info)>));
}

TEST(GroupRecord, AGroupIsIdentifiedAsAnAdapterIs) {
  EXPECT_TRUE((std::is_same_v<Hb_Group_Identifier, Hb_Adapter_Identifier>));
}

void fill_union(Hb_Group& group) {
  for (size_t index = 0; index < 200; ++index) union_of(group)[index] = static_cast<uint8_t>(index + 1);
}

// Whether `getter` copies exactly `size` bytes of the union, for a group of any type and event.
template <typename Info, typename Getter>
void expect_copied(Hb_Group& group, size_t size, Getter getter) {
  for (int type = -1; type <= 6; ++type) {
    group.Hb_group_type = static_cast<Hb_Group_Type>(type);
    group.Hb_events = type * 3;
    fill_union(group);
    union {
      uint8_t bytes[256];
      Info info;
    } copy;
    std::memset(copy.bytes, 0xEE, sizeof copy.bytes);
    EXPECT_TRUE(succeeds([&] { return getter(&group, &copy.info); }));
    EXPECT_EQ(0, std::memcmp(copy.bytes, union_of(group), size));
    EXPECT_EQ(0xEE, copy.bytes[size]);
  }
}

TEST_F(Membership, ASiteSplitIsTheFirst136BytesWhateverTheGroup) {
  expect_copied<Hb_Site_Split_Info>(*group, 136, hb_get_site_split_info);
}

TEST_F(Membership, ASiteMergeIsTheFirst144BytesWhateverTheGroup) {
  expect_copied<Hb_Site_Merge_Info>(*group, 144, hb_get_site_merge_info);
}

TEST_F(Membership, ASplitIsTheFirst164BytesWhateverTheGroup) {
  expect_copied<Hb_Split_Merge_Info>(*group, 164, hb_get_split_info);
}

TEST_F(Membership, AMergeIsTheFirst164BytesWhateverTheGroup) {
  expect_copied<Hb_Split_Merge_Info>(*group, 164, hb_get_merge_info);
}

TEST_F(Membership, SplitAndMergeShareOneFunction) {
  EXPECT_EQ(&hb_get_split_info, &hb_get_merge_info);
  EXPECT_EQ(&hb_free_split_info, &hb_free_merge_info);
  EXPECT_EQ(&hb_site_down, &hb_site_merge);
}

// A field by value: those of the packed records may lie at odd addresses, which a reference must not.
template <typename T>
T copied(T field) {
  return field;
}

TEST_F(Membership, FieldsOfSitesStandWhereTheyAreSent) {
  for (size_t index = 0; index < 200; ++index) union_of(*group)[index] = 0;
  union_of(*group)[0] = 1;     // high half of the node identifier
  union_of(*group)[8] = 2;     // low half
  union_of(*group)[16] = 3;    // node number
  union_of(*group)[20] = 4;    // site identifier
  union_of(*group)[36] = 5;    // site number
  union_of(*group)[40] = 6;    // priority
  union_of(*group)[44] = 7;    // policy
  union_of(*group)[48] = 8;    // merge flag
  union_of(*group)[52] = 9;    // cluster identifier
  union_of(*group)[68] = 10;   // the remote site
  union_of(*group)[136] = 11;  // number of nodes up in the local sub-cluster
  union_of(*group)[148] = 12;  // and in the remote one
  union_of(*group)[160] = 13;  // subtype
  Hb_Split_Merge_Info info;
  ASSERT_EQ(Hb_Success, hb_get_split_info(group.get(), &info));
  EXPECT_EQ(1U, copied(info.local_site.node_id.high));
  EXPECT_EQ(2U, copied(info.local_site.node_id.low));
  EXPECT_EQ(3U, copied(info.local_site.node_number));
  EXPECT_EQ(4U, copied(info.local_site.site_id.high));
  EXPECT_EQ(5U, copied(info.local_site.site_number));
  EXPECT_EQ(6U, copied(info.local_site.site_priority));
  EXPECT_EQ(7U, copied(info.local_site.site_policy));
  EXPECT_EQ(8U, copied(info.local_site.site_merge_flag));
  EXPECT_EQ(9U, copied(info.local_site.cluster_id.high));
  EXPECT_EQ(10U, copied(info.remote_site.node_id.high));
  EXPECT_EQ(11U, copied(info.local_subcluster.num_up_nodes));
  EXPECT_EQ(nullptr, copied(info.local_subcluster.node_numbers));
  EXPECT_EQ(12U, copied(info.remote_subcluster.num_up_nodes));
  EXPECT_EQ(13U, copied(info.subtype));
}

TEST_F(Membership, ASiteSplitIsTheLocalAndTheRemoteSite) {
  union_of(*group)[0] = 1;
  union_of(*group)[68] = 2;
  Hb_Site_Split_Info info;
  ASSERT_EQ(Hb_Success, hb_get_site_split_info(group.get(), &info));
  EXPECT_EQ(1U, copied(info.local_site.node_id.high));
  EXPECT_EQ(2U, copied(info.remote_site.node_id.high));
}

TEST_F(Membership, ASiteMergeIsTheTwoCountsThenTheLocalAndTheRemoteSite) {
  union_of(*group)[0] = 1;
  union_of(*group)[4] = 2;
  union_of(*group)[8] = 3;
  union_of(*group)[76] = 4;
  Hb_Site_Merge_Info info;
  ASSERT_EQ(Hb_Success, hb_get_site_merge_info(group.get(), &info));
  EXPECT_EQ(1U, copied(info.num_local_up_nodes));
  EXPECT_EQ(2U, copied(info.num_remote_up_nodes));
  EXPECT_EQ(3U, copied(info.local_site.node_id.high));
  EXPECT_EQ(4U, copied(info.remote_site.node_id.high));
}

uint32_t* new_node_numbers() { return static_cast<uint32_t*>(std::malloc(3 * sizeof(uint32_t))); }

TEST_F(Membership, NodeNumbersOfASplitAreSharedWithTheGroup) {
  uint32_t* numbers = new_node_numbers();
  group->Hb_membership_grp_union.split_info.local_subcluster.node_numbers = numbers;
  Hb_Split_Merge_Info info = {};
  ASSERT_EQ(Hb_Success, hb_get_split_info(group.get(), &info));
  EXPECT_EQ(numbers, copied(info.local_subcluster.node_numbers));
  hb_free_split_info(&info);
}

TEST_F(Membership, FreeingASplitReleasesAndNullsBothSidesAndNothingElse) {
  Hb_Split_Merge_Info info = {};
  info.local_subcluster = {3, new_node_numbers()};
  info.remote_subcluster = {2, new_node_numbers()};
  info.subtype = 5;
  hb_free_split_info(&info);
  EXPECT_EQ(nullptr, copied(info.local_subcluster.node_numbers));
  EXPECT_EQ(nullptr, copied(info.remote_subcluster.node_numbers));
  EXPECT_EQ(3U, copied(info.local_subcluster.num_up_nodes));
  EXPECT_EQ(2U, copied(info.remote_subcluster.num_up_nodes));
  EXPECT_EQ(5U, copied(info.subtype));
}

TEST_F(Membership, FreeingASplitTwiceIsHarmless) {
  Hb_Split_Merge_Info info = {};
  info.remote_subcluster = {1, new_node_numbers()};
  hb_free_split_info(&info);
  hb_free_merge_info(&info);
  EXPECT_EQ(nullptr, copied(info.remote_subcluster.node_numbers));
}

TEST_F(Membership, SiteDownAndSiteMergeDoNothingAndSucceed) {
  fill_union(*group);
  const auto before = std::make_unique<Hb_Group>(*group);
  EXPECT_TRUE(succeeds([&] { return hb_site_down(group.get()); }));
  EXPECT_TRUE(succeeds([&] { return hb_site_merge(group.get()); }));
  EXPECT_TRUE(succeeds([&] { return hb_site_down(nullptr); }));
  EXPECT_EQ(0, std::memcmp(before.get(), group.get(), sizeof *group));
}

Hb_Node_config_state* configured_node(int16_t node) {
  return static_cast<Hb_Node_config_state*>(
      Hash_search(static_cast<uint32_t>(static_cast<int32_t>(node)), global_config_tbl.node_hash));
}

TEST_F(Membership, AConfiguredNodeTellsItsStateAndWhy) {
  ASSERT_NE(nullptr, configured_node(3));
  configured_node(3)->state = Hb_Entity_Down;
  configured_node(3)->reason = Hb_Entity_State_Reason_SHUT_Down;
  Hb_Entity_State state = Hb_Entity_Undef;
  Hb_Entity_State_Reason reason = Hb_Entity_State_Reason_Undef;
  EXPECT_TRUE(succeeds([&] { return hb_get_node_status_reason(3, &state, &reason); }));
  EXPECT_EQ(2, state);
  EXPECT_EQ(7, reason);
}

TEST_F(Membership, ANodeIsLookedUpByItsNumberExtendedWithItsSign) {
  Hb_Node_config_state odd = {-2, Hb_Entity_Up, Hb_Entity_State_Reason_Up};
  Hash_insert(0xFFFFFFFEU, global_config_tbl.node_hash, &odd);
  Hb_Entity_State state = Hb_Entity_Undef;
  Hb_Entity_State_Reason reason = Hb_Entity_State_Reason_Undef;
  EXPECT_TRUE(succeeds([&] { return hb_get_node_status_reason(-2, &state, &reason); }));
  EXPECT_EQ(1, state);
  EXPECT_EQ(1, reason);
}

TEST_F(Membership, AConfiguredNodeIsNotTraced) {
  trace_all();
  Hb_Entity_State state;
  Hb_Entity_State_Reason reason;
  EXPECT_EQ(Hb_Success, hb_get_node_status_reason(3, &state, &reason));
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

TEST_F(Membership, AnUnknownNodeFailsWithoutAnErrorNumberAndIsTraced) {
  for (const Hb_Node_Number node : {Hb_Node_Number{5}, Hb_Node_Number{-2}}) {
    trace_only(trace_errors);
    Hb_Entity_State state = Hb_Entity_Undef;
    Hb_Entity_State_Reason reason = Hb_Entity_State_Reason_Undef;
    EXPECT_TRUE(fails_without_error_number([&] { return hb_get_node_status_reason(node, &state, &reason); }));
    EXPECT_EQ(0, state);
    EXPECT_EQ(10, reason);
    ASSERT_EQ(1U, platform_double().traces.size());
    EXPECT_EQ(315U, platform_double().traces[0].id);
    EXPECT_EQ(0, platform_double().traces[0].category);
    EXPECT_THAT(platform_double().traces[0].values, ElementsAre(node == 5 ? 5U : 0xFFFFFFFEU));
  }
}

TEST_F(Membership, AnUnknownNodeIsNotTracedWithTheErrorsCategoryOff) {
  trace_only(trace_info);
  Hb_Entity_State state;
  Hb_Entity_State_Reason reason;
  hb_get_node_status_reason(5, &state, &reason);
  trace_only(trace_debug);
  hb_get_node_status_reason(5, &state, &reason);
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

TEST(UnloadedMembership, ANodeIsUnknownBeforeAConfigurationIsLoaded) {
  Hb_Entity_State state = Hb_Entity_Undef;
  Hb_Entity_State_Reason reason = Hb_Entity_State_Reason_Undef;
  EXPECT_TRUE(fails_without_error_number([&] { return hb_get_node_status_reason(0, &state, &reason); }));
}

}  // namespace
}  // namespace hb_test
