// Cursors from elsewhere, adapter numbers beyond the bit set, and null pointers.
#include <gmock/gmock.h>

#include "hostile_input.h"

namespace hb_test {
namespace {

using testing::ElementsAre;

constexpr Hb_Cursor cursors_outside[] = {-1, least, 98352, most};

TEST_F(HostileInput, ACursorOutsideAGroupIsItsEnd) {
  ASSERT_EQ(Hb_Success, deliver(whole_packet(2)));
  for (const Hb_Cursor cursor : cursors_outside) {
    out.group->Hb_cursor = cursor;
    Hb_Adapter_Identifier id = {77, 88, Hb_False};
    EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_adapter(out.group.get(), &id); })) << cursor;
    EXPECT_EQ(77U, id.Hb_adapter_number);
    EXPECT_EQ(cursor, out.group->Hb_cursor);
  }
  ASSERT_EQ(Hb_Success, deliver(whole_packet(5)));
  for (const Hb_Cursor cursor : cursors_outside) {
    out.group->Hb_cursor = cursor;
    Hb_Node_Number node = 77;
    EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_node(out.group.get(), &node); })) << cursor;
    EXPECT_EQ(-1, node);
    EXPECT_EQ(cursor, out.group->Hb_cursor);
  }
}

TEST_F(HostileInput, ACursorOutsideASubscriptionIsItsEnd) {
  Hb_Subscription_Group group;
  std::memset(&group, 0xFF, sizeof group);
  for (const Hb_Cursor cursor : cursors_outside) {
    group.Hb_cursor = cursor;
    group.Hb_subscription_type = Hb_Adapter_Subscription;
    Hb_Adapter_Number adapter = 77;
    EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_subscription_adapter(&group, &adapter); })) << cursor;
    EXPECT_EQ(0xFFFFFFFFU, adapter);
    group.Hb_subscription_type = Hb_Node_Subscription;
    Hb_Node_Number node = 77;
    EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_subscription_node(&group, &node); })) << cursor;
    EXPECT_EQ(-1, node);
    group.Hb_subscription_type = Hb_Site_Subscription;
    Hb_Site_Number site = 77;
    EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_subscription_site(&group, &site); })) << cursor;
    EXPECT_EQ(65535, site);
    EXPECT_EQ(cursor, group.Hb_cursor);
  }
}

class AdaptersBeyondTheSet : public HostileInput {
 protected:
  AdaptersBeyondTheSet() {
    deliver(ReplyPacket(9)
                .message(sparse_cluster()
                             .adapter(98352, "10.9.0.1", 1)
                             .adapter(98351, "10.9.0.2", 1)
                             .adapter(0xFFFFFFFF, "10.9.0.3", 1)
                             .adapter(0x80000000, "10.9.0.4", 1)
                             .bytes())
                .bytes());
    std::memset(&group, 0xFF, sizeof group);
    group.Hb_subscription_type = Hb_Empty_Subscription;
  }

  std::vector<size_t> members() const {
    const auto* set = reinterpret_cast<const uint8_t*>(&group) + 52;
    std::vector<size_t> found;
    for (size_t member = 0; member < 98352; ++member) {
      if ((set[member / 8] & (0x80U >> (member % 8))) != 0) found.push_back(member);
    }
    return found;
  }

  int32_t count() const { return group.Hb_subscription_grp_union.Hb_adapter_subscription_grp.Hb_num_adapters; }
  Bytes tail() const { return Bytes(reinterpret_cast<const char*>(&group) + 52 + 12294, 2); }

  Hb_Subscription_Group group;
};

TEST_F(AdaptersBeyondTheSet, AreSkippedWhenAllAdaptersAreAdded) {
  EXPECT_EQ(Hb_Success, hb_add_all_adapters_to_subscription_group(&group));
  EXPECT_THAT(members(), ElementsAre(0, 2, 12, 13, 17, 98351));
  EXPECT_EQ(9, count());
  EXPECT_EQ("\xff\xff", tail());
}

TEST_F(AdaptersBeyondTheSet, AreSkippedWhenTheirNetworkIsAdded) {
  EXPECT_EQ(Hb_Success, hb_add_network_to_subscription_group(&group, 1));
  EXPECT_THAT(members(), ElementsAre(13, 17, 98351));
  EXPECT_EQ(3, count());
  EXPECT_EQ("\xff\xff", tail());
}

TEST_F(AdaptersBeyondTheSet, AreSkippedWhenTheirNetworkIsRemoved) {
  group.Hb_subscription_type = Hb_All_Adapters_Subscription;
  group.Hb_subscription_grp_union.Hb_adapter_subscription_grp.Hb_num_adapters = 98352;
  EXPECT_EQ(Hb_Success, hb_remove_network_from_subscription_group(&group, 1));
  EXPECT_EQ(98352U - 3U, members().size());
  EXPECT_EQ(98352 - 3, count());
  EXPECT_EQ("\xff\xff", tail());
}

TEST_F(AdaptersBeyondTheSet, AreOutOfRangeOneByOne) {
  for (const Hb_Adapter_Number adapter : {98351U, 98352U, 0x80000000U, 0xFFFFFFFFU}) {
    EXPECT_TRUE(fails_with(4, [&] { return hb_add_adapter_to_subscription_group(&group, adapter); })) << adapter;
  }
}

TEST_F(HostileInput, NullPointersToAccessorsAreRefused) {
  Hb_Group* group = out.group.get();
  std::memset(group, 0, sizeof *group);
  Hb_Adapter_Identifier id = {};
  Hb_Group_Status status = Hb_Group_Stable;
  Hb_Node_Number node = 0;
  Hb_FFDC_Id identifier = {};
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_group_id(nullptr, &id); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_group_id(group, nullptr); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_group_leader_id(nullptr, &id); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_group_leader_id(group, nullptr); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_group_status(nullptr, &status); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_group_status(group, nullptr); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_adapter_id(nullptr, 13, &id); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_adapter_id(group, 13, nullptr); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_first_adapter(nullptr, &id); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_next_adapter(group, nullptr); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_first_node(nullptr, &node); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_next_node(group, nullptr); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_FFDC_id(nullptr, &identifier); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_FFDC_id(group, nullptr); }));
}

TEST_F(HostileInput, NullPointersToPredicatesMeanNo) {
  set_hb_errno(untouched_error);
  EXPECT_EQ(Hb_False, hb_is_adapter_in_group(nullptr, 13));
  EXPECT_EQ(4, hb_get_errno());
  set_hb_errno(untouched_error);
  EXPECT_EQ(Hb_False, hb_is_node_in_group(nullptr, 3));
  EXPECT_EQ(4, hb_get_errno());
  set_hb_errno(untouched_error);
  EXPECT_EQ(3, static_cast<int>(hb_has_adapter_died_because_removed(nullptr)));
  EXPECT_EQ(4, hb_get_errno());
  EXPECT_EQ(0xFFFFFFFFU, hb_adapter_incarnation(nullptr));
}

TEST_F(HostileInput, NullPointersToTheAccessorsThatDoNotStartTheClientAreRefused) {
  Hb_Site_Split_Info split;
  Hb_Site_Merge_Info merge;
  Hb_Split_Merge_Info info;
  Hb_Group* group = out.group.get();
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_site_split_info(nullptr, &split); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_site_split_info(group, nullptr); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_site_merge_info(nullptr, &merge); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_site_merge_info(group, nullptr); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_split_info(nullptr, &info); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_split_info(group, nullptr); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_merge_info(nullptr, &info); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_merge_info(group, nullptr); }));
  hb_free_split_info(nullptr);
  Hb_Entity_State state;
  Hb_Entity_State_Reason reason;
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_node_status_reason(3, nullptr, &reason); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_node_status_reason(3, &state, nullptr); }));
}

void ask_everything(Hb_Group* group) {
  Hb_Adapter_Identifier id = {};
  Hb_Group_Status status;
  Hb_FFDC_Id identifier;
  Hb_Diff_Instance_Info sender;
  Hb_Site_Split_Info split;
  Hb_Site_Merge_Info merge;
  Hb_Split_Merge_Info info;
  Hb_Entity_State state;
  Hb_Entity_State_Reason reason;
  hb_get_group_id(group, &id);
  hb_get_group_leader_id(group, &id);
  hb_get_group_status(group, &status);
  hb_get_adapter_id(group, 13, &id);
  hb_is_adapter_in_group(group, 13);
  hb_is_node_in_group(group, 3);
  hb_has_adapter_died_because_removed(&id);
  hb_adapter_incarnation(&id);
  hb_get_FFDC_id(group, &identifier);
  hb_get_different_instance_sender(group, &sender);
  hb_get_site_split_info(group, &split);
  hb_get_site_merge_info(group, &merge);
  hb_get_split_info(group, &info);
  hb_get_merge_info(group, &info);
  hb_get_node_status_reason(3, &state, &reason);
  hb_site_down(group);
  hb_site_merge(group);
}

void walk_two_steps(Hb_Group* group) {
  Hb_Adapter_Identifier id;
  Hb_Node_Number node;
  hb_get_first_adapter(group, &id);
  hb_get_next_adapter(group, &id);
  hb_get_first_node(group, &node);
  hb_get_next_node(group, &node);
}

TEST_F(HostileInput, AccessorsChangeNothingButTheCursorThatTheyWalkWith) {
  const Bytes adapters = adapter_event_message({{13, 1}, {2, 2}});
  const std::pair<Bytes, Hb_Cursor> events[] = {
      {ReplyPacket(4).leader(13, 1).group(13, 2).status(1).message(adapters).bytes(), 14}, {whole_packet(5), 4}};
  for (const auto& [packet, cursor] : events) {
    ASSERT_EQ(Hb_Success, deliver(packet));
    const Bytes before = image_of_state();
    GroupBytes expected(*out.group);
    ask_everything(out.group.get());
    EXPECT_TRUE(expected.is(*out.group)) << cursor;
    walk_two_steps(out.group.get());
    EXPECT_TRUE(expected.i32(4, cursor).is(*out.group)) << cursor;
    EXPECT_TRUE(before == image_of_state()) << cursor;
  }
}

}  // namespace
}  // namespace hb_test
