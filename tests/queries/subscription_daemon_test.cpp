// Registering and withdrawing subscriptions with the daemon.
#include <gmock/gmock.h>
#include <unistd.h>

#include "support/running_client.h"
#include "vex_subscription.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class DaemonSubscription : public RunningClient, protected NewGroupHandler {
 protected:
  DaemonSubscription() : RunningClient(sparse_cluster()) { forget_names(); }

  static void forget_names() {
    for (char* slot : {nodeEventSubscriptionName, networkEventSubscriptionName, siteEventSubscriptionName,
                       splitMergeEventSubscriptionName}) {
      std::memset(slot, 0, 32);
    }
  }

  Hb_Rc subscribe(Hb_Subscription_Group& group, int events = 1) {
    char name[] = "follower";
    return hb_subscribe(name, &group, events);
  }

  // The record of the next request, which must be a subscription.
  Bytes subscribed_record() {
    const Bytes request = connection.receive_request();
    EXPECT_EQ(76 + record_size, request.size());
    EXPECT_EQ(209U, u32_at(request, 8));
    EXPECT_EQ(record_size, u32_at(request, 12));
    EXPECT_EQ(static_cast<uint32_t>(getpid()), u32_at(request, 64));
    return request.substr(76);
  }

  // The type that a group of that type and count, without members, is sent as.
  uint32_t sent_type(int32_t type, int32_t count) {
    Hb_Subscription_Group group = group_of_type(type);
    set_count(group, count);
    EXPECT_TRUE(succeeds([&] { return subscribe(group); })) << type;
    return u32_at(subscribed_record(), 0);
  }
};

TEST_F(DaemonSubscription, TheWholeRecordIsSentAsItStands) {
  Hb_Subscription_Group group = group_filled_with(0x3C, 5);
  EXPECT_TRUE(succeeds([&] { return subscribe(group, 7); }));
  EXPECT_EQ(Bytes(reinterpret_cast<const char*>(&group), record_size), subscribed_record());
  EXPECT_STREQ("follower", group.Hb_name);
  EXPECT_EQ(7, group.Hb_events);
}

TEST_F(DaemonSubscription, FieldsAreSentAtTheirOffsets) {
  Hb_Subscription_Group group = group_of_type(4);
  hb_add_node_to_subscription_group(&group, 3);
  EXPECT_TRUE(succeeds([&] { return subscribe(group, 0x207); }));
  const Bytes record = subscribed_record();
  EXPECT_EQ(0U, u32_at(record, 0));
  EXPECT_EQ(0x207U, u32_at(record, 8));
  EXPECT_STREQ("follower", record.substr(12, 32).c_str());
  EXPECT_EQ(1U, u32_at(record, 48));
  EXPECT_EQ('\x10', record[52]);
}

TEST_F(DaemonSubscription, EveryTypeButTheEmptyOneIsSent) {
  for (int32_t type = 0; type <= 9; ++type) {
    if (type == 4) continue;
    Hb_Subscription_Group group = group_of_type(type);
    EXPECT_TRUE(succeeds([&] { return subscribe(group); })) << type;
    EXPECT_EQ(static_cast<uint32_t>(type), u32_at(subscribed_record(), 0));
    EXPECT_EQ(type, group.Hb_subscription_type);
  }
}

TEST_F(DaemonSubscription, AGroupOfEveryAdapterIsSentAsAllAndLeftAsItWas) {
  Hb_Subscription_Group group = group_of_type(4);
  hb_add_all_adapters_to_subscription_group(&group);
  EXPECT_TRUE(succeeds([&] { return subscribe(group); }));
  const Bytes record = subscribed_record();
  EXPECT_EQ(3U, u32_at(record, 0));
  EXPECT_EQ(5U, u32_at(record, 48));
  EXPECT_EQ(2, group.Hb_subscription_type);
}

TEST_F(DaemonSubscription, AGroupOfAllAdaptersButOneIsSentAsItIs) {
  Hb_Subscription_Group group = group_of_type(4);
  hb_add_all_adapters_to_subscription_group(&group);
  hb_remove_adapter_from_subscription_group(&group, 12);
  EXPECT_TRUE(succeeds([&] { return subscribe(group); }));
  EXPECT_EQ(2U, u32_at(subscribed_record(), 0));
}

TEST_F(DaemonSubscription, AGroupOfEveryNodeIsSentAsAllAndLeftAsItWas) {
  Hb_Subscription_Group group = group_of_type(4);
  for (const Hb_Node_Number node : std::vector<Hb_Node_Number>{0, 3, 4})
    hb_add_node_to_subscription_group(&group, node);
  EXPECT_TRUE(succeeds([&] { return subscribe(group); }));
  EXPECT_EQ(1U, u32_at(subscribed_record(), 0));
  EXPECT_EQ(0, group.Hb_subscription_type);
}

TEST_F(DaemonSubscription, AGroupOfAllNodesButOneIsSentAsItIs) {
  Hb_Subscription_Group group = group_of_type(4);
  for (const Hb_Node_Number node : std::vector<Hb_Node_Number>{0, 3}) hb_add_node_to_subscription_group(&group, node);
  EXPECT_TRUE(succeeds([&] { return subscribe(group); }));
  EXPECT_EQ(0U, u32_at(subscribed_record(), 0));
}

TEST_F(DaemonSubscription, ItsCountMakesAGroupAllWhateverItsMembers) {
  EXPECT_EQ(3U, sent_type(2, 5));
  EXPECT_EQ(1U, sent_type(0, 3));
  Hb_Subscription_Group group = group_of_type(4);
  hb_add_all_adapters_to_subscription_group(&group);
  set_count(group, 4);
  EXPECT_TRUE(succeeds([&] { return subscribe(group); }));
  EXPECT_EQ(2U, u32_at(subscribed_record(), 0));
}

TEST_F(DaemonSubscription, AllNodesAreAsManyAsTheNodeCountSays) {
  global_num_nodes = 7;
  EXPECT_EQ(1U, sent_type(0, 7));
  EXPECT_EQ(0U, sent_type(0, 3));
}

TEST_F(DaemonSubscription, ANetworkOfEveryAdapterIsSentAsANetwork) { EXPECT_EQ(5U, sent_type(5, 5)); }

TEST_F(DaemonSubscription, ATypeThatNoGroupHasIsSentAsItIsAndKept) {
  for (const int32_t type : odd_types) {
    Hb_Subscription_Group group = group_of_type(type);
    EXPECT_TRUE(succeeds([&] { return subscribe(group); })) << type;
    EXPECT_EQ(type, i32_at(subscribed_record(), 0));
    EXPECT_EQ(type, group.Hb_subscription_type);
  }
}

TEST_F(DaemonSubscription, AGroupMayBeChangedAndRegisteredAgain) {
  Hb_Subscription_Group group = group_of_type(4);
  hb_add_node_to_subscription_group(&group, 3);
  EXPECT_TRUE(succeeds([&] { return subscribe(group); }));
  subscribed_record();
  hb_add_node_to_subscription_group(&group, 4);
  EXPECT_TRUE(succeeds([&] { return subscribe(group); }));
  const Bytes record = subscribed_record();
  EXPECT_EQ(2U, u32_at(record, 48));
  EXPECT_EQ('\x18', record[52]);
}

TEST_F(DaemonSubscription, SiteEventsAreSentAsAllSitesAndLeaveTheSiteType) {
  for (int32_t type = 0; type <= 9; ++type) {
    Hb_Subscription_Group group = group_of_type(type);
    EXPECT_TRUE(succeeds([&] { return subscribe(group, 0x60); })) << type;
    const Bytes record = subscribed_record();
    EXPECT_EQ(8U, u32_at(record, 0));
    EXPECT_EQ(0x60U, u32_at(record, 8));
    EXPECT_EQ(7, group.Hb_subscription_type);
  }
}

TEST_F(DaemonSubscription, InstanceAndSplitMergeEventsAreSentUnderTheirTypes) {
  Hb_Subscription_Group group = group_of_type(2);
  set_count(group, 5);
  EXPECT_TRUE(succeeds([&] { return subscribe(group, 0x100); }));
  EXPECT_EQ(6U, u32_at(subscribed_record(), 0));
  EXPECT_EQ(6, group.Hb_subscription_type);
  group = group_of_type(0);
  EXPECT_TRUE(succeeds([&] { return subscribe(group, 0x3000); }));
  EXPECT_EQ(9U, u32_at(subscribed_record(), 0));
  EXPECT_EQ(9, group.Hb_subscription_type);
}

TEST_F(DaemonSubscription, TheNameIsSentCutAt31Characters) {
  Hb_Subscription_Group group = group_of_type(5);
  char name[] = "abcdefghijklmnopqrstuvwxyz123456789";
  EXPECT_TRUE(succeeds([&] { return hb_subscribe(name, &group, 1); }));
  EXPECT_EQ(Bytes("abcdefghijklmnopqrstuvwxyz12345\0", 32), subscribed_record().substr(12, 32));
}

TEST_F(DaemonSubscription, ARefusedSubscriptionSendsNothing) {
  Hb_Subscription_Group group = group_of_type(4);
  EXPECT_TRUE(fails_with(11, [&] { return subscribe(group); }));
  EXPECT_TRUE(fails_with(4, [&] { return subscribe(group, 0x8000); }));
  EXPECT_FALSE(connection.has_input());
}

TEST_F(DaemonSubscription, ADaemonThatIsGoneFailsTheCallAndNameAndEventsStandAndTheTypeIsPutBack) {
  connection.close();
  Hb_Subscription_Group group = group_of_type(4);
  hb_add_all_adapters_to_subscription_group(&group);
  EXPECT_TRUE(fails_with(16, [&] { return subscribe(group); }));
  EXPECT_EQ(2, group.Hb_subscription_type);
  EXPECT_STREQ("follower", group.Hb_name);
  EXPECT_EQ(1, group.Hb_events);
  EXPECT_TRUE(fails_with(16, [&] { return subscribe(group, 0x60); }));
  EXPECT_EQ(7, group.Hb_subscription_type);
  char name[] = "follower";
  EXPECT_TRUE(fails_with(16, [&] { return hb_unsubscribe(name); }));
}

TEST_F(DaemonSubscription, ANameIsKeptByKindInDaemonModeToo) {
  const std::vector<std::string> node = {"follower", "", "", ""};
  const std::vector<std::string> network = {"", "follower", "", ""};
  const std::vector<std::string> site = {"", "", "follower", ""};
  const std::vector<std::string> split_merge = {"", "", "", "follower"};
  const std::vector<std::string> none(4);
  const std::vector<std::string> kept[] = {node, node, network, network, none, network, none, site, site, split_merge};
  for (int32_t type = 0; type <= 9; ++type) {
    forget_names();
    Hb_Subscription_Group group = group_of_type(type);
    subscribe(group);
    if (type != 4) subscribed_record();
    EXPECT_EQ(kept[type], names()) << type;
  }
}

TEST_F(DaemonSubscription, ANewGroupHandlerIsNotWritten) {
  make_pipe_handler();
  for (const int32_t type : {0, 2}) {
    Hb_Subscription_Group group = group_of_type(type);
    EXPECT_TRUE(succeeds([&] { return subscribe(group); })) << type;
    EXPECT_THAT(bytes_written(), IsEmpty()) << type;
  }
}

TEST_F(DaemonSubscription, NoNewGroupHandlerIsNeeded) {
  trace_all();
  Hb_Subscription_Group group = group_of_type(0);
  EXPECT_TRUE(succeeds([&] { return subscribe(group); }));
  EXPECT_THAT(platform_double().traces, IsEmpty());
  trace_nothing();
}

TEST_F(DaemonSubscription, WithdrawingSendsTheNameWithItsTerminator) {
  char name[] = "follower";
  EXPECT_TRUE(succeeds([&] { return hb_unsubscribe(name); }));
  const Bytes request = connection.receive_request();
  EXPECT_EQ(76U + 9U, request.size());
  EXPECT_EQ(210U, u32_at(request, 8));
  EXPECT_EQ(9U, u32_at(request, 12));
  EXPECT_EQ(Bytes("follower\0", 9), request.substr(76));
}

TEST_F(DaemonSubscription, WithdrawingSendsAtMost31Characters) {
  char name[] = "abcdefghijklmnopqrstuvwxyz123456789";
  EXPECT_TRUE(succeeds([&] { return hb_unsubscribe(name); }));
  const Bytes request = connection.receive_request();
  EXPECT_EQ(32U, u32_at(request, 12));
  EXPECT_EQ(Bytes("abcdefghijklmnopqrstuvwxyz12345\0", 32), request.substr(76));
}

TEST_F(DaemonSubscription, WithdrawingAnEmptyNameSendsItsTerminator) {
  char name[] = "";
  EXPECT_TRUE(succeeds([&] { return hb_unsubscribe(name); }));
  EXPECT_EQ(Bytes("\0", 1), connection.receive_request().substr(76));
}

TEST_F(DaemonSubscription, WithdrawingLeavesTheKeptNames) {
  set_name(nodeEventSubscriptionName, "follower");
  char name[] = "follower";
  EXPECT_TRUE(succeeds([&] { return hb_unsubscribe(name); }));
  EXPECT_THAT(names(), ElementsAre("follower", "", "", ""));
}

TEST(UnconnectedSubscription, RegisteringInDaemonModeWithoutAConnectionFails) {
  Hb_Subscription_Group group = group_of_type(6);
  char name[] = "follower";
  EXPECT_TRUE(fails_with(12, [&] { return hb_subscribe(name, &group, 1); }));
  EXPECT_TRUE(fails_with(12, [&] { return hb_unsubscribe(name); }));
}

TEST_F(Subscription, NamesAreKeptInDaemonModeToo) {
  Hb_Subscription_Group group = group_of_type(9);
  char name[] = "follower";
  EXPECT_TRUE(fails_with(12, [&] { return hb_subscribe(name, &group, 1); }));
  EXPECT_STREQ("follower", splitMergeEventSubscriptionName);
}

}  // namespace
}  // namespace hb_test
