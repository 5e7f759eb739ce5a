// What registering a subscription writes into the record.
#include <gmock/gmock.h>

#include "vex_subscription.h"

namespace hb_test {
namespace {

using testing::ElementsAre;

class RecordOfSubscribe : public VexSubscription {
 protected:
  RecordOfSubscribe() { make_pipe_handler(); }
};

TEST_F(RecordOfSubscribe, EventsOutsideTheMaskAreRefusedBeforeAnythingIsWritten) {
  for (const int events : {0, 0x8000, 0x80, 0x400, 0x800, 0x08, 0x10000, -1, 0x7377 | 0x80, 0x8001}) {
    if ((events & ~0x7377) == 0 && events != 0) continue;
    Hb_Subscription_Group group = group_filled_with(0x11, 0);
    const Hb_Subscription_Group before = group;
    char name[] = "follower";
    EXPECT_TRUE(fails_with(4, [&] { return hb_subscribe(name, &group, events); })) << events;
    EXPECT_TRUE(same_bytes(before, group)) << events;
  }
  EXPECT_THAT(names(), ElementsAre("", "", "", ""));
}

TEST_F(RecordOfSubscribe, EveryBitInsideTheMaskIsTaken) {
  for (const int events : {0x1, 0x2, 0x4, 0x10, 0x20, 0x40, 0x100, 0x200, 0x1000, 0x2000, 0x4000, 0x7377}) {
    EXPECT_TRUE(succeeds([&] { return subscribe(9, events); })) << events;
  }
}

TEST_F(RecordOfSubscribe, NameAndEventsAreWrittenAndNothingElse) {
  Hb_Subscription_Group group = group_filled_with(0x11, 9);
  char name[] = "follower";
  EXPECT_TRUE(succeeds([&] { return hb_subscribe(name, &group, 0x0007); }));
  EXPECT_STREQ("follower", group.Hb_name);
  for (size_t index = 8; index < 32; ++index) EXPECT_EQ('\0', group.Hb_name[index]) << index;
  EXPECT_EQ(7, group.Hb_events);
  EXPECT_EQ(9, group.Hb_subscription_type);
  EXPECT_EQ(0x11111111, group.Hb_cursor);
  EXPECT_EQ(0x1111, group.Hb_netnum);
  EXPECT_EQ(0x11111111, count_of(group));
  for (size_t index = 0; index < 12296; ++index) ASSERT_EQ(0x11, set_byte(group, index)) << index;
}

TEST_F(RecordOfSubscribe, TheNameMayBeTheRecordsOwn) {
  Hb_Subscription_Group group = group_filled_with(0x11, 9);
  std::memcpy(group.Hb_name, "follower", 9);
  EXPECT_TRUE(succeeds([&] { return hb_subscribe(group.Hb_name, &group, 0x0007); }));
  EXPECT_STREQ("follower", group.Hb_name);
  EXPECT_TRUE(succeeds([&] { return hb_subscribe(group.Hb_name + 6, &group, 0x0007); }));
  EXPECT_STREQ("er", group.Hb_name);
}

TEST_F(RecordOfSubscribe, TheRecordKeeps31CharactersOfTheName) {
  Hb_Subscription_Group group = group_filled_with(0x11, 9);
  char name[] = "abcdefghijklmnopqrstuvwxyz123456789";
  EXPECT_TRUE(succeeds([&] { return hb_subscribe(name, &group, 1); }));
  EXPECT_STREQ("abcdefghijklmnopqrstuvwxyz12345", group.Hb_name);
  EXPECT_EQ(0x1111, group.Hb_netnum);
}

TEST_F(RecordOfSubscribe, AnEmptyGroupIsRefusedAndKeepsNameAndEvents) {
  Hb_Subscription_Group group = group_filled_with(0x11, 4);
  const Hb_Subscription_Group before = group;
  char name[] = "follower";
  EXPECT_TRUE(fails_with(11, [&] { return hb_subscribe(name, &group, 1); }));
  EXPECT_TRUE(same_bytes(before, group));
  EXPECT_THAT(names(), ElementsAre("", "", "", ""));
}

TEST_F(RecordOfSubscribe, TheMaskRulesLeaveTheirTypes) {
  struct Rule {
    int events;
    int32_t left;
  };
  for (const Rule& rule : {Rule{0x100, 6}, Rule{0x3000, 9}, Rule{0x60, 7}}) {
    for (int32_t type = 0; type <= 9; ++type) {
      Hb_Subscription_Group group = group_of_type(type);
      char name[] = "follower";
      EXPECT_TRUE(succeeds([&] { return hb_subscribe(name, &group, rule.events); })) << type;
      EXPECT_EQ(rule.left, group.Hb_subscription_type) << "events " << rule.events << " type " << type;
    }
  }
}

TEST_F(RecordOfSubscribe, MasksThatOnlyContainARuleKeepTheType) {
  for (const int events : {0x101, 0x1000, 0x2000, 0x3001, 0x20, 0x40, 0x61, 0x160}) {
    Hb_Subscription_Group group = group_of_type(5);
    char name[] = "follower";
    EXPECT_TRUE(succeeds([&] { return hb_subscribe(name, &group, events); })) << events;
    EXPECT_EQ(5, group.Hb_subscription_type) << events;
  }
}

}  // namespace
}  // namespace hb_test
