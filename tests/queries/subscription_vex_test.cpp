// Registering and withdrawing subscriptions in VEX mode.
#include <gmock/gmock.h>

#include <cerrno>
#include <csignal>

#include "support/system_calls.h"
#include "vex_subscription.h"

namespace hb_test {
namespace {

using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;

// A type for each slot, in their order.
constexpr int32_t type_of_slot[] = {0, 5, 7, 9};

TEST_F(VexSubscription, NodeTypesKeepTheNameAndWriteTheByteOne) {
  make_pipe_handler();
  for (const int32_t type : {0, 1}) {
    set_name(nodeEventSubscriptionName, "");
    EXPECT_TRUE(succeeds([&] { return subscribe(type); })) << type;
    EXPECT_THAT(names(), ElementsAre("follower", "", "", ""));
    EXPECT_THAT(bytes_written(), ElementsAre(1));
  }
}

TEST_F(VexSubscription, AdapterAndNetworkTypesKeepTheNameAndWriteTheByteTwo) {
  make_pipe_handler();
  for (const int32_t type : {2, 3, 5}) {
    set_name(networkEventSubscriptionName, "");
    EXPECT_TRUE(succeeds([&] { return subscribe(type); })) << type;
    EXPECT_THAT(names(), ElementsAre("", "follower", "", ""));
    EXPECT_THAT(bytes_written(), ElementsAre(2));
  }
}

TEST_F(VexSubscription, SiteTypesKeepTheNameAndWriteNothing) {
  make_pipe_handler();
  for (const int32_t type : {7, 8}) {
    set_name(siteEventSubscriptionName, "");
    EXPECT_TRUE(succeeds([&] { return subscribe(type); })) << type;
    EXPECT_THAT(names(), ElementsAre("", "", "follower", ""));
    EXPECT_THAT(bytes_written(), IsEmpty());
  }
}

TEST_F(VexSubscription, TheSplitMergeTypeKeepsTheNameAndWritesNothing) {
  make_pipe_handler();
  EXPECT_TRUE(succeeds([&] { return subscribe(9); }));
  EXPECT_THAT(names(), ElementsAre("", "", "", "follower"));
  EXPECT_THAT(bytes_written(), IsEmpty());
}

TEST_F(VexSubscription, TheDifferentInstanceTypeKeepsNoNameAndSucceeds) {
  EXPECT_TRUE(succeeds([&] { return subscribe(6); }));
  EXPECT_THAT(names(), ElementsAre("", "", "", ""));
}

TEST_F(VexSubscription, TypesThatNoGroupHasKeepNoNameWriteNothingAndSucceed) {
  make_pipe_handler();
  for (const int32_t type : odd_types) {
    EXPECT_TRUE(succeeds([&] { return subscribe(type); })) << type;
    EXPECT_THAT(names(), Each(""));
    EXPECT_THAT(bytes_written(), IsEmpty());
  }
}

TEST_F(VexSubscription, SiteAndSplitMergeTypesNeedNoNewGroupHandler) {
  EXPECT_TRUE(succeeds([&] { return subscribe(7); }));
  EXPECT_TRUE(succeeds([&] { return subscribe(8); }));
  EXPECT_TRUE(succeeds([&] { return subscribe(9); }));
}

TEST_F(VexSubscription, TheEventMasksChooseTheNameThatIsKept) {
  EXPECT_TRUE(succeeds([&] { return subscribe(4, 96); }));
  EXPECT_THAT(names(), ElementsAre("", "", "follower", ""));
  EXPECT_TRUE(succeeds([&] { return subscribe(4, 12288); }));
  EXPECT_THAT(names(), ElementsAre("", "", "follower", "follower"));
}

TEST_F(VexSubscription, WithoutANewGroupHandlerTheNodeNameIsKeptAndTheCallFails) {
  EXPECT_TRUE(fails_with(89, [&] { return subscribe(0); }));
  EXPECT_THAT(names(), ElementsAre("follower", "", "", ""));
}

TEST_F(VexSubscription, WithoutANewGroupHandlerTheNetworkNameIsKeptAndTheCallFails) {
  EXPECT_TRUE(fails_with(89, [&] { return subscribe(5); }));
  EXPECT_THAT(names(), ElementsAre("", "follower", "", ""));
}

TEST_F(VexSubscription, AMissingNewGroupHandlerIsTraced) {
  trace_only(trace_info);
  subscribe(0);
  ASSERT_EQ(1U, platform_double().traces.size());
  EXPECT_EQ(320U, platform_double().traces[0].id);
  EXPECT_EQ(1, platform_double().traces[0].category);
}

TEST_F(VexSubscription, AWrittenByteIsTracedWithTheDescriptor) {
  make_pipe_handler();
  trace_only(trace_info);
  subscribe(0);
  ASSERT_EQ(1U, platform_double().traces.size());
  EXPECT_EQ(322U, platform_double().traces[0].id);
  EXPECT_THAT(platform_double().traces[0].values, ElementsAre(static_cast<uint32_t>(handler->getWriteFd())));
}

TEST_F(VexSubscription, AFailedWriteIsTracedWithItsResultAndTheSystemError) {
  make_handler(open("/dev/null", O_RDONLY), open("/dev/null", O_RDONLY));
  trace_only(trace_info);
  subscribe(2);
  ASSERT_EQ(1U, platform_double().traces.size());
  EXPECT_EQ(321U, platform_double().traces[0].id);
  EXPECT_THAT(platform_double().traces[0].values, ElementsAre(0xFFFFFFFFU, static_cast<uint32_t>(EBADF)));
}

TEST_F(VexSubscription, WithTheInfoCategoryOffNothingIsTraced) {
  trace_nothing();
  subscribe(0);
  make_pipe_handler();
  platform_double().traces.clear();
  subscribe(0);
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

TEST_F(VexSubscription, AWriteToAClosedPipeFailsWithoutASignalAndKeepsTheSystemError) {
  signal(SIGPIPE, SIG_DFL);
  trace_only(trace_info);
  int ends[2];
  ASSERT_EQ(0, pipe(ends));
  close(ends[0]);
  make_handler(open("/dev/null", O_RDONLY), ends[1]);
  errno = 0;
  EXPECT_TRUE(fails_with(59, [&] { return subscribe(1); }));
  EXPECT_EQ(EPIPE, errno);
  EXPECT_THAT(names(), ElementsAre("follower", "", "", ""));
  EXPECT_EQ(SIG_DFL, signal(SIGPIPE, SIG_DFL));
  ASSERT_EQ(1U, platform_double().traces.size());
  EXPECT_EQ(321U, platform_double().traces[0].id);
  EXPECT_THAT(platform_double().traces[0].values, ElementsAre(0xFFFFFFFFU, static_cast<uint32_t>(EPIPE)));
}

TEST_F(VexSubscription, AFailedWriteForANetworkKeepsTheSystemErrorToo) {
  make_handler(open("/dev/null", O_RDONLY), open("/dev/null", O_RDONLY));
  errno = 0;
  EXPECT_TRUE(fails_with(59, [&] { return subscribe(5); }));
  EXPECT_EQ(EBADF, errno);
  EXPECT_THAT(names(), ElementsAre("", "follower", "", ""));
}

TEST_F(VexSubscription, ASystemErrorIsKeptAlsoWhileTracing) {
  make_handler(open("/dev/null", O_RDONLY), open("/dev/full", O_WRONLY));
  trace_and_spoil_errno();
  for (const int32_t type : {0, 3}) {
    EXPECT_TRUE(fails_with(59, [&] { return subscribe(type); })) << type;
    EXPECT_EQ(ENOSPC, errno) << type;
  }
  EXPECT_EQ(2U, platform_double().traces.size());
}

TEST_F(VexSubscription, TracingOfAnythingElseLeavesTheSystemErrorToo) {
  trace_and_spoil_errno();
  errno = EXDEV;
  EXPECT_TRUE(fails_with(89, [&] { return subscribe(0); }));
  EXPECT_EQ(EXDEV, errno);
  make_pipe_handler();
  EXPECT_TRUE(succeeds([&] { return subscribe(0); }));
  EXPECT_EQ(EXDEV, errno);
  EXPECT_EQ(2U, platform_double().traces.size());
}

TEST_F(VexSubscription, AWriteOfNoByteIsAFailedOneToo) {
  make_pipe_handler();
  for (const int32_t type : {1, 2}) {
    trace_only(trace_info);
    SystemCalls calls;
    calls.script("write", {result(0)});
    errno = EXDEV;
    EXPECT_TRUE(fails_with(59, [&] { return subscribe(type); })) << type;
    EXPECT_EQ(EXDEV, errno);
    ASSERT_EQ(1U, platform_double().traces.size());
    EXPECT_EQ(321U, platform_double().traces[0].id);
    EXPECT_THAT(platform_double().traces[0].values, ElementsAre(0U, static_cast<uint32_t>(EXDEV)));
  }
}

TEST_F(VexSubscription, ANewSubscriptionReplacesTheNameOfItsKind) {
  make_pipe_handler();
  for (size_t kind = 0; kind < 4; ++kind) {
    for (Hb_Name* slot : slots) set_name(*slot, "a much longer name than before");
    std::vector<std::string> expected = names();
    expected[kind] = "follower";
    EXPECT_TRUE(succeeds([&] { return subscribe(type_of_slot[kind]); })) << kind;
    EXPECT_EQ(expected, names());
  }
}

TEST_F(VexSubscription, ANameOf31CharactersIsKeptWhole) {
  char name[] = "abcdefghijklmnopqrstuvwxyz12345";
  ASSERT_EQ(31U, std::strlen(name));
  Hb_Subscription_Group group = group_of_type(9);
  EXPECT_TRUE(succeeds([&] { return hb_subscribe(name, &group, 1); }));
  EXPECT_STREQ("abcdefghijklmnopqrstuvwxyz12345", splitMergeEventSubscriptionName);
}

TEST_F(VexSubscription, ANameBeyond31CharactersIsCutThereInEachSlot) {
  make_pipe_handler();
  char name[] = "abcdefghijklmnopqrstuvwxyz123456789 and more of it, well beyond the slot";
  for (const int32_t type : type_of_slot) {
    Hb_Subscription_Group group = group_of_type(type);
    set_count(group, 1);
    EXPECT_TRUE(succeeds([&] { return hb_subscribe(name, &group, 1); }));
  }
  EXPECT_THAT(names(), Each("abcdefghijklmnopqrstuvwxyz12345"));
}

TEST_F(VexSubscription, ANameBeyond31CharactersIsWithdrawnAsItWasKept) {
  for (Hb_Name* slot : slots) set_name(*slot, "abcdefghijklmnopqrstuvwxyz12345");
  char name[] = "abcdefghijklmnopqrstuvwxyz123456789";
  EXPECT_TRUE(succeeds([&] { return hb_unsubscribe(name); }));
  EXPECT_THAT(names(), Each(""));
}

TEST_F(VexSubscription, NameAndEventsStandAndTheTypeIsPutBackAlsoWhenTheCallFails) {
  Hb_Subscription_Group group = group_of_type(2);
  set_count(group, 5);
  char name[] = "follower";
  EXPECT_TRUE(fails_with(89, [&] { return hb_subscribe(name, &group, 1); }));
  EXPECT_EQ(2, group.Hb_subscription_type);
  EXPECT_STREQ("follower", group.Hb_name);
  EXPECT_EQ(1, group.Hb_events);
}

TEST_F(VexSubscription, WithdrawingClearsEverySlotOfThatName) {
  set_name(nodeEventSubscriptionName, "follower");
  set_name(networkEventSubscriptionName, "another");
  set_name(siteEventSubscriptionName, "follower");
  set_name(splitMergeEventSubscriptionName, "follower");
  char name[] = "follower";
  EXPECT_TRUE(succeeds([&] { return hb_unsubscribe(name); }));
  EXPECT_THAT(names(), ElementsAre("", "another", "", ""));
}

TEST_F(VexSubscription, WithdrawingClearsTheNetworkSlotToo) {
  set_name(networkEventSubscriptionName, "follower");
  char name[] = "follower";
  EXPECT_TRUE(succeeds([&] { return hb_unsubscribe(name); }));
  EXPECT_THAT(names(), ElementsAre("", "", "", ""));
}

TEST_F(VexSubscription, WithdrawingAnUnknownNameSucceedsAndClearsNothing) {
  set_name(nodeEventSubscriptionName, "follower");
  for (const char* other : {"followe", "followers", "Follower"}) {
    std::string name = other;
    EXPECT_TRUE(succeeds([&] { return hb_unsubscribe(name.data()); }));
  }
  EXPECT_THAT(names(), ElementsAre("follower", "", "", ""));
}

TEST_F(VexSubscription, WithdrawingClears31BytesAndLeavesThe32nd) {
  std::memset(siteEventSubscriptionName, 'x', 32);
  std::memcpy(siteEventSubscriptionName, "follower", 9);
  char name[] = "follower";
  EXPECT_TRUE(succeeds([&] { return hb_unsubscribe(name); }));
  EXPECT_THAT(std::vector<char>(siteEventSubscriptionName, siteEventSubscriptionName + 31), Each('\0'));
  EXPECT_EQ('x', siteEventSubscriptionName[31]);
  siteEventSubscriptionName[31] = '\0';
}

TEST_F(VexSubscription, ASlotWithoutATerminatorHoldsA32ndCharacter) {
  const std::string kept(32, 'x');
  kept.copy(siteEventSubscriptionName, 32);
  std::string name(31, 'x');
  EXPECT_TRUE(succeeds([&] { return hb_unsubscribe(name.data()); }));
  EXPECT_EQ(kept, std::string(siteEventSubscriptionName, 32));
  set_name(siteEventSubscriptionName, "");
}

TEST_F(VexSubscription, ANullNameOrGroupIsRefused) {
  Hb_Subscription_Group group = group_filled_with(0x3C, 9);
  const Hb_Subscription_Group before = group;
  char name[] = "follower";
  EXPECT_TRUE(fails_with(4, [&] { return hb_subscribe(nullptr, &group, 1); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_subscribe(name, nullptr, 1); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_unsubscribe(nullptr); }));
  EXPECT_TRUE(same_bytes(before, group));
}

}  // namespace
}  // namespace hb_test
