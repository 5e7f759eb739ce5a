// Identity, leader, status and single members of a group.
#include <gtest/gtest.h>

#include "membership.h"

namespace hb_test {
namespace {

TEST(GroupRecord, TypesAndStatesHaveTheirNumbers) {
  EXPECT_EQ(0, Hb_Node_Group);
  EXPECT_EQ(1, Hb_Adapter_Group);
  EXPECT_EQ(2, Hb_Diff_Instance_Type);
  EXPECT_EQ(3, Hb_Repository_Disk_Type);
  EXPECT_EQ(4, Hb_Site_Group);
  EXPECT_EQ(5, Hb_Subcluster_Group);
  EXPECT_EQ(0, Hb_Group_Stable);
  EXPECT_EQ(1, Hb_Group_Unstable);
}

TEST(GroupRecord, EventValuesHaveTheirNumbers) {
  EXPECT_EQ(0, HB_EVENT_NONE);
  EXPECT_EQ(1, HB_EVENT_DEATH);
  EXPECT_EQ(2, HB_EVENT_JOIN);
  EXPECT_EQ(4, HB_EVENT_NEW_GROUP);
  EXPECT_EQ(8, HB_EVENT_FFDC_ID);
  EXPECT_EQ(96, HB_EVENT_SITES);
  EXPECT_EQ(128, HB_EVENT_CONFIGURATION);
  EXPECT_EQ(256, HB_EVENT_DIFF_INSTANCE);
  EXPECT_EQ(512, HB_EVENT_NODE_HEARTBEAT);
  EXPECT_EQ(4096, HB_EVENT_SUBCLUSTER_SPLIT);
  EXPECT_EQ(8192, HB_EVENT_SUBCLUSTER_MERGE);
  EXPECT_EQ(12288, HB_EVENT_SPLIT_MERGE);
  EXPECT_EQ(16384, HB_EVENT_ALIAS);
  EXPECT_EQ(0x7377, HB_EVENT_SUBSCRIBABLE);
}

TEST_F(Membership, TheIdentityOfANewGroupIsItsLeaderWhoeverThatIsAndItsIncarnation) {
  for (const Hb_Adapter_Number leader : {13U, 32U, 98352U, 0xFFFFFFFFU}) {
    make_adapter_group(4);
    set_leader(leader, 0x08000033);
    EXPECT_TRUE(succeeds([&] { return hb_get_group_id(group.get(), &id); })) << leader;
    EXPECT_TRUE(tells(id, leader, 0x08000033));
  }
}

TEST_F(Membership, TheLeaderComesWithItsOwnValueUnmaskedFromTheWholeList) {
  const std::pair<Hb_Adapter_Number, Hb_Incarnation> leaders[] = {
      {13, 0x08000005}, {13, 0xFFFFFFFF}, {32, 0x08000009}, {98351, 0x08000009}};
  for (const auto& [leader, value] : leaders) {
    make_adapter_group(4);
    set_leader(leader, 51);
    member(leader) = value;
    EXPECT_TRUE(succeeds([&] { return hb_get_group_leader_id(group.get(), &id); })) << leader;
    EXPECT_TRUE(tells(id, leader, value));
  }
}

TEST_F(Membership, IdentityAndLeaderAreTellingOnlyInAnAdapterGroup) {
  for (const int type : types_but_adapter_group) {
    make_adapter_group(4);
    set_type(type);
    EXPECT_TRUE(fails_with(5, [&] { return hb_get_group_id(group.get(), &id); })) << type;
    EXPECT_TRUE(fails_with(5, [&] { return hb_get_group_leader_id(group.get(), &id); })) << type;
    EXPECT_TRUE(untouched(id));
  }
}

TEST_F(Membership, IdentityAndLeaderAreTellingOnlyInANewGroup) {
  for (const Hb_Events events : {0, 1, 2, 3, 5, 6, 8, 128, 256, 512}) {
    make_adapter_group(events);
    EXPECT_TRUE(fails_with(3, [&] { return hb_get_group_id(group.get(), &id); })) << events;
    EXPECT_TRUE(fails_with(3, [&] { return hb_get_group_leader_id(group.get(), &id); })) << events;
    EXPECT_TRUE(untouched(id));
  }
}

TEST_F(Membership, TheTypeIsCheckedBeforeTheEvent) {
  make_node_group(1);
  EXPECT_TRUE(fails_with(5, [&] { return hb_get_group_id(group.get(), &id); }));
  EXPECT_TRUE(fails_with(5, [&] { return hb_get_group_leader_id(group.get(), &id); }));
}

TEST_F(Membership, TheStatusOfANewGroupIsToldAsItStandsWhateverItsType) {
  for (const int type : {0, 1, 2, 5}) {
    for (const int stored : {0, 1, 7}) {
      make_adapter_group(4);
      set_type(type);
      group->Hb_group_status = static_cast<Hb_Group_Status>(stored);
      auto status = static_cast<Hb_Group_Status>(77);
      EXPECT_TRUE(succeeds([&] { return hb_get_group_status(group.get(), &status); })) << type;
      EXPECT_EQ(stored, status);
    }
  }
}

TEST_F(Membership, TheStatusIsToldOnlyOfANewGroup) {
  for (const Hb_Events events : {0, 1, 2, 5, 8, 128, 512}) {
    make_adapter_group(events);
    auto status = static_cast<Hb_Group_Status>(77);
    EXPECT_TRUE(fails_with(3, [&] { return hb_get_group_status(group.get(), &status); })) << events;
    EXPECT_EQ(77, status);
  }
}

TEST_F(Membership, ADeathAnswersNoIdentityAndNoStatusButItsAdaptersAreWalked) {
  make_adapter_group(1);
  member(7) = 70;
  Hb_Group_Status status;
  EXPECT_TRUE(fails_with(3, [&] { return hb_get_group_id(group.get(), &id); }));
  EXPECT_TRUE(fails_with(3, [&] { return hb_get_group_status(group.get(), &status); }));
  EXPECT_TRUE(succeeds([&] { return hb_get_first_adapter(group.get(), &id); }));
  EXPECT_EQ(7U, id.Hb_adapter_number);
}

TEST_F(Membership, AnAdapterIsToldWithItsValueUnmasked) {
  make_adapter_group(1);
  member(7) = 0x08000005;
  EXPECT_TRUE(succeeds([&] { return hb_get_adapter_id(group.get(), 7, &id); }));
  EXPECT_TRUE(tells(id, 7, 0x08000005));
}

TEST_F(Membership, MembersAreToldWhateverTheEvent) {
  for (const Hb_Events events : {0, 1, 2, 4, 8, 128, 512}) {
    make_adapter_group(events);
    member(7) = 1;
    EXPECT_TRUE(succeeds([&] { return hb_get_adapter_id(group.get(), 7, &id); })) << events;
    EXPECT_EQ(Hb_True, adapter_in_group(group.get(), 7)) << events;
    make_node_group(events);
    set_node(3, 1);
    EXPECT_EQ(1, node_in_group(group.get(), 3)) << events;
  }
}

TEST_F(Membership, AnAdapterThatIsNoMemberIsNotTold) {
  make_adapter_group(1);
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_adapter_id(group.get(), 7, &id); }));
  EXPECT_TRUE(untouched(id));
}

TEST_F(Membership, AnAdapterAtTheLimitOfTheClusterIsOutOfRange) {
  make_adapter_group(1);
  member(31) = 1;
  member(32) = 1;
  EXPECT_EQ(Hb_Success, hb_get_adapter_id(group.get(), 31, &id));
  id = {777, 888, static_cast<Hb_Boolean>(999)};
  for (const Hb_Adapter_Number adapter : {32U, 98352U, 0x80000000U, 0xFFFFFFFFU}) {
    EXPECT_TRUE(fails_with(4, [&] { return hb_get_adapter_id(group.get(), adapter, &id); })) << adapter;
  }
  EXPECT_TRUE(untouched(id));
}

TEST_F(Membership, OfAnAdapterTheNumberIsCheckedThenTheTypeThenTheMembership) {
  for (const int type : types_but_adapter_group) {
    make_adapter_group(1);
    member(13) = 1;
    set_type(type);
    EXPECT_TRUE(fails_with(4, [&] { return hb_get_adapter_id(group.get(), 32, &id); })) << type;
    EXPECT_TRUE(fails_with(5, [&] { return hb_get_adapter_id(group.get(), 7, &id); })) << type;
    EXPECT_TRUE(fails_with(5, [&] { return hb_get_adapter_id(group.get(), 13, &id); })) << type;
    EXPECT_TRUE(untouched(id));
  }
}

TEST_F(Membership, AnAdapterIsInTheGroupWhenItHasAValue) {
  make_adapter_group(2);
  member(0) = 0;
  member(7) = 0x08000005;
  member(31) = 1;
  for (const Hb_Adapter_Number adapter : {0U, 7U, 31U}) {
    EXPECT_EQ(Hb_True, adapter_in_group(group.get(), adapter)) << adapter;
    EXPECT_EQ(untouched_error, hb_get_errno());
  }
  EXPECT_EQ(Hb_False, adapter_in_group(group.get(), 8));
  EXPECT_EQ(untouched_error, hb_get_errno());
}

TEST_F(Membership, AnAdapterOutOfRangeIsInNoGroup) {
  make_adapter_group(2);
  member(32) = 1;
  EXPECT_EQ(Hb_False, adapter_in_group(group.get(), 32));
  EXPECT_EQ(4, hb_get_errno());
  EXPECT_EQ(Hb_False, adapter_in_group(group.get(), 0xFFFFFFFFU));
  EXPECT_EQ(4, hb_get_errno());
}

TEST_F(Membership, AnAdapterIsInNoGroupOfAnotherType) {
  for (const int type : types_but_adapter_group) {
    make_adapter_group(2);
    member(7) = 1;
    set_type(type);
    EXPECT_EQ(Hb_False, adapter_in_group(group.get(), 7)) << type;
    EXPECT_EQ(5, hb_get_errno()) << type;
    EXPECT_EQ(Hb_False, adapter_in_group(group.get(), 32)) << type;
    EXPECT_EQ(4, hb_get_errno()) << type;
  }
}

TEST_F(Membership, ANodeInTheGroupIsToldWithTheStoredValue) {
  make_node_group(4);
  set_node(0, 1);
  set_node(3, 2);
  set_node(7, -5);
  EXPECT_EQ(1, node_in_group(group.get(), 0));
  EXPECT_EQ(0, node_in_group(group.get(), 1));
  EXPECT_EQ(2, node_in_group(group.get(), 3));
  EXPECT_EQ(-5, node_in_group(group.get(), 7));
  EXPECT_EQ(untouched_error, hb_get_errno());
}

TEST_F(Membership, ANodeOutOfRangeIsInNoGroup) {
  make_node_group(4);
  set_node(8, 1);
  for (const int node : {-1, 8, 2049, -32768, 32767}) {
    EXPECT_EQ(0, node_in_group(group.get(), static_cast<Hb_Node_Number>(node))) << node;
    EXPECT_EQ(4, hb_get_errno()) << node;
  }
}

TEST_F(Membership, ANodeIsInNoGroupOfAnotherType) {
  for (const int type : types_but_node_group) {
    make_node_group(4);
    set_node(3, 1);
    set_type(type);
    EXPECT_EQ(0, node_in_group(group.get(), 3)) << type;
    EXPECT_EQ(5, hb_get_errno()) << type;
    EXPECT_EQ(0, node_in_group(group.get(), 8)) << type;
    EXPECT_EQ(4, hb_get_errno()) << type;
  }
}

TEST_F(Membership, AnIdentifierTellsWhetherTheAdapterWasRemoved) {
  id.Hb_died_because_removed = Hb_True;
  EXPECT_EQ(Hb_True, hb_has_adapter_died_because_removed(&id));
  id.Hb_died_because_removed = Hb_False;
  EXPECT_EQ(Hb_False, hb_has_adapter_died_because_removed(&id));
  id.Hb_died_because_removed = static_cast<Hb_Boolean>(42);
  EXPECT_EQ(42, static_cast<int>(hb_has_adapter_died_because_removed(&id)));
}

TEST_F(Membership, AnIdentifierTellsItsIncarnation) {
  id.Hb_incarnation = 0x0800ABCD;
  EXPECT_EQ(0x0800ABCDU, hb_adapter_incarnation(&id));
}

}  // namespace
}  // namespace hb_test
