// The answer to a new subscription.
#include <thread>

#include "VEX_EVMONEventPipeHandler.h"
#include "VEX_EVMONNewGroupEventHandler.h"
#include "handler_state.h"
#include "support/process_state.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr char node_group = 1;
constexpr char adapter_group = 2;

class NewGroup : public HandlerState {
 protected:
  NewGroup() {
    ends = new_pipe();
    new_group_event_handler_p = new EVMONNewGroupEventHandler(ends.fds, nullptr);
    evmon_cluster_name = new char[8]{"cluster"};
    set_name(nodeEventSubscriptionName, "nodes");
    set_name(networkEventSubscriptionName, "networks");
    fill_table(global_config_tbl, 4, 3, {{0}, {1, Hb_Entity_Down, Hb_Entity_State_Reason_Down}, {2}, {3}},
               {{0, Hb_Entity_Up, "en0", scripted_address(0, 0, 0)},
                {3, Hb_Entity_Down, "en3", scripted_address(0, 0, 3)},
                {4, Hb_Entity_Up, "en4", scripted_address(0, 0, 4)},
                {9, Hb_Entity_Down, "en9", scripted_address(0, 0, 9)}});
    start_tracing();
  }

  // The answer to that byte.
  Hb_Rc ask(char request) {
    EXPECT_EQ(write(ends.write(), &request, 1), 1);
    return serve();
  }

  Hb_Rc serve() {
    start_tracing();
    return out.call(*new_group_event_handler_p);
  }

  std::string begins() const { return "Info 227: " + std::to_string(ends.read()); }

  // Who is in the group, by the accessors.
  std::vector<int> nodes() {
    std::vector<int> members;
    Hb_Node_Number node = 0;
    out.group->Hb_cursor = 0;
    for (Hb_Rc rc = hb_get_first_node(out.group.get(), &node); rc == Hb_Success;
         rc = hb_get_next_node(out.group.get(), &node)) {
      members.push_back(node);
    }
    return members;
  }

  std::vector<unsigned> adapters() {
    std::vector<unsigned> members;
    Hb_Adapter_Identifier id = {};
    for (Hb_Rc rc = hb_get_first_adapter(out.group.get(), &id); rc == Hb_Success;
         rc = hb_get_next_adapter(out.group.get(), &id)) {
      members.push_back(id.Hb_adapter_number);
    }
    return members;
  }

  // The accessors ask for a client that runs.
  static void pretend_to_run() {
    IsVEX = Hb_True;
    client_initialized = Hb_True;
  }

  static Scripted_Interface interface(uint8_t adapter, zu_vex_intf_status_t status = ZU_VEX_INTF_STATUS_UP) {
    return {uint32_t{adapter} / 3, "en" + std::to_string(adapter), scripted_address(0, 0, adapter), status, 0};
  }

  Ends ends = {{-1, -1}};
  Handler_Outputs out;
};

TEST_F(NewGroup, PipeIsOwnedAndItsReadEndRegistered) {
  EXPECT_EQ(new_group_event_handler_p->getFileDescriptor(), ends.read());
  EXPECT_EQ(new_group_event_handler_p->getWriteFd(), ends.write());
  const std::unique_ptr<int[]> listed(EVMONHandler::getFileDescriptors());
  EXPECT_EQ(listed[0], ends.read());
  const int before = open_descriptors();
  delete new_group_event_handler_p;
  new_group_event_handler_p = nullptr;
  EXPECT_EQ(open_descriptors(), before - 2);
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 0);
}

TEST_F(NewGroup, PipeIsMadeSilently) {
  Ends others = new_pipe();
  const EVMONNewGroupEventHandler handler(others.fds, nullptr);
  EXPECT_THAT(trace_lines(), IsEmpty());
}

TEST_F(NewGroup, HandlerCanBeMadeOfAMonitor) {
  scripted_cluster().appear();
  char path[] = "/monitor";
  EVMONNewGroupEventHandler handler(path);
  EXPECT_TRUE(scripted_cluster().is_open_monitor(handler.getFileDescriptor()));
  EXPECT_TRUE(scripted_cluster().asked[0].init_string.empty());
  EXPECT_EQ(handler.getWriteFd(), -1);
}

TEST_F(NewGroup, OfNodesNamesThoseThatAreUp) {
  scripted_cluster().appear();
  scripted_cluster().nodes = {{2}, {1}, {3, ZU_VEX_NODE_STATUS_DOWN}, {0, ZU_VEX_NODE_STATUS_UNDEF}};
  EXPECT_EQ(ask(node_group), Hb_Success);
  EXPECT_EQ(out.events, 4);
  EXPECT_EQ(out.seqnum, 0U);
  EXPECT_STREQ(out.name, "nodes");
  const auto expected = group_of_bytes(0x5A);
  expected->Hb_group_type = Hb_Node_Group;
  expected->Hb_events = 4;
  expected->Hb_group_status = Hb_Group_Stable;
  Hb_Node_Membership_Grp& membership = expected->Hb_membership_grp_union.Hb_node_membership_grp;
  std::memset(&membership, 0, sizeof membership);
  membership.Hb_num_nodes = 2;
  membership.Hb_node_list[1] = Hb_True;
  membership.Hb_node_list[2] = Hb_True;
  EXPECT_TRUE(same_bytes(*out.group, *expected));
  EXPECT_THAT(trace_lines(), ElementsAre(begins(), "Info 228"));
  pretend_to_run();
  EXPECT_THAT(nodes(), ElementsAre(1, 2));
  EXPECT_EQ(Scripted_Cluster::outstanding(), 0U);
  EXPECT_EQ(Scripted_Cluster::wrong_releases(), 0U);
}

TEST_F(NewGroup, OfNodesChangesNothingOfTheConfiguration) {
  scripted_cluster().appear();
  scripted_cluster().nodes = {{1}};
  ask(node_group);
  EXPECT_EQ(node_of(1).state, Hb_Entity_Down);
  EXPECT_EQ(node_of(0).state, Hb_Entity_Up);
}

TEST_F(NewGroup, OfNodesLeavesOutWhomTheConfigurationDoesNotKnow) {
  scripted_cluster().appear();
  scripted_cluster().nodes = {{0}, {7}, {2049}, {0xFFFFFFFFU}, {70000}, {0}};
  EXPECT_EQ(ask(node_group), Hb_Success);
  EXPECT_EQ(out.group->Hb_membership_grp_union.Hb_node_membership_grp.Hb_num_nodes, 1);
  pretend_to_run();
  EXPECT_THAT(nodes(), ElementsAre(0));
}

TEST_F(NewGroup, OfNodesLeavesOutWhoseDaemonIsDown) {
  node_of(2).state = Hb_Entity_Down;
  node_of(2).reason = Hb_Entity_State_Reason_BRIXD_Down;
  scripted_cluster().appear();
  scripted_cluster().nodes = {{0}, {2}};
  EXPECT_EQ(ask(node_group), Hb_Success);
  pretend_to_run();
  EXPECT_THAT(nodes(), ElementsAre(0));
}

TEST_F(NewGroup, OfNodesMayBeEmpty) {
  scripted_cluster().appear();
  EXPECT_EQ(ask(node_group), Hb_Success);
  EXPECT_EQ(out.events, 4);
  EXPECT_EQ(out.group->Hb_membership_grp_union.Hb_node_membership_grp.Hb_num_nodes, 0);
}

TEST_F(NewGroup, OfNodesIsEmptyEventWithoutASubscription) {
  scripted_cluster().appear();
  nodeEventSubscriptionName[0] = '\0';
  EXPECT_EQ(ask(node_group), Hb_Success);
  EXPECT_TRUE(out.is_empty_event());
  EXPECT_TRUE(same_bytes(*out.group, *group_of_bytes(0x5A)));
  EXPECT_THAT(trace_lines(), ElementsAre(begins(), "Info 190", "Info 228"));
  EXPECT_EQ(scripted_cluster().asked.size(), 0U);
}

TEST_F(NewGroup, OfNodesFailsWhereTheServicesAreAbsent) {
  platform_double().errno_after_trace = EXDEV;
  const char request = node_group;
  ASSERT_EQ(write(ends.write(), &request, 1), 1);
  errno = ENOTTY;
  EXPECT_EQ(serve(), Hb_Failure);
  EXPECT_EQ(errno, ENOTTY);
  EXPECT_EQ(hb_get_errno(), 64);
  EXPECT_TRUE(out.is_untouched());
  EXPECT_THAT(trace_lines(), ElementsAre(begins(), "Info 32: -1 64", "Info 228"));
}

TEST_F(NewGroup, OfNodesFailsWhenTheQueryFails) {
  scripted_cluster().appear();
  platform_double().errno_after_trace = EXDEV;
  platform_double().node_info.answers = {{-9, nullptr, EIO}};
  EXPECT_EQ(ask(node_group), Hb_Failure);
  EXPECT_EQ(errno, EIO);
  EXPECT_EQ(hb_get_errno(), 64);
  EXPECT_TRUE(out.is_untouched());
  EXPECT_THAT(trace_lines(), ElementsAre(begins(), "Info 32: -9 64", "Info 228"));
}

// One that is up, one that is down, one whose state is known, up and down, and one of unknown state.
TEST_F(NewGroup, OfAdaptersNamesThoseThatAreUp) {
  scripted_cluster().appear();
  scripted_cluster().interfaces = {interface(3), interface(0, ZU_VEX_INTF_STATUS_DOWN),
                                   interface(4, ZU_VEX_INTF_STATUS_STALE), interface(9, ZU_VEX_INTF_STATUS_STALE)};
  EXPECT_EQ(ask(adapter_group), Hb_Success);
  EXPECT_EQ(out.events, 4);
  EXPECT_EQ(out.seqnum, 0U);
  EXPECT_STREQ(out.name, "networks");
  const auto expected = group_of_bytes(0x5A);
  expected->Hb_group_type = Hb_Adapter_Group;
  expected->Hb_events = 4;
  expected->Hb_group_status = Hb_Group_Stable;
  Hb_Adapter_Membership_Grp& membership = expected->Hb_membership_grp_union.Hb_adapter_membership_grp;
  membership.Hb_num_adapters = 2;
  membership.Hb_group_leader = 0xFFFFFFFFU;
  membership.Hb_group_incarnation = 0xFFFFFFFFU;
  std::fill_n(membership.Hb_adapter_list, 12, 0xFFFFFFFFU);
  membership.Hb_adapter_list[3] = 0;
  membership.Hb_adapter_list[4] = 0;
  EXPECT_TRUE(same_bytes(*out.group, *expected));
  EXPECT_THAT(trace_lines(), ElementsAre(begins(), "Info 228"));
  pretend_to_run();
  EXPECT_THAT(adapters(), ElementsAre(3U, 4U));
  EXPECT_EQ(Scripted_Cluster::outstanding(), 0U);
}

TEST_F(NewGroup, OfAdaptersLeavesOutWhomTheConfigurationDoesNotKnow) {
  scripted_cluster().appear();
  Scripted_Interface alias = interface(4);
  alias.address = scripted_address(9, 9, 9);
  Scripted_Interface elsewhere = interface(4);
  elsewhere.node = 0xFFFFFFFFU;
  Scripted_Interface nameless = interface(4);
  nameless.name.reset();
  scripted_cluster().interfaces = {alias,        elsewhere,    nameless,
                                   interface(0), interface(0), interface(4, ZU_VEX_INTF_STATUS_UNDEF)};
  EXPECT_EQ(ask(adapter_group), Hb_Success);
  EXPECT_EQ(out.group->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_num_adapters, 1);
  pretend_to_run();
  EXPECT_THAT(adapters(), ElementsAre(0U));
}

TEST_F(NewGroup, OfAdaptersChangesNothingOfTheConfiguration) {
  scripted_cluster().appear();
  scripted_cluster().interfaces = {interface(3)};
  ask(adapter_group);
  EXPECT_EQ(static_cast<Hb_Adapter*>(Hash_search(3, global_config_tbl.adap_hash))->Hb_state, Hb_Entity_Down);
}

TEST_F(NewGroup, OfAdaptersIsEmptyEventWithoutASubscription) {
  scripted_cluster().appear();
  networkEventSubscriptionName[0] = '\0';
  EXPECT_EQ(ask(adapter_group), Hb_Success);
  EXPECT_TRUE(out.is_empty_event());
  EXPECT_TRUE(same_bytes(*out.group, *group_of_bytes(0x5A)));
  EXPECT_THAT(trace_lines(), ElementsAre(begins(), "Info 191", "Info 228"));
}

// The list was cleared before the services were asked; nothing else was written.
TEST_F(NewGroup, OfAdaptersFailsWhereTheServicesAreAbsent) {
  platform_double().errno_after_trace = EXDEV;
  const char request = adapter_group;
  ASSERT_EQ(write(ends.write(), &request, 1), 1);
  errno = ENOTTY;
  EXPECT_EQ(serve(), Hb_Failure);
  EXPECT_EQ(errno, ENOTTY);
  EXPECT_EQ(hb_get_errno(), 65);
  EXPECT_THAT(trace_lines(), ElementsAre(begins(), "Info 33: -1 25 65", "Info 228"));
  Handler_Outputs expected;
  std::fill_n(expected.group->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_adapter_list, 12, 0xFFFFFFFFU);
  EXPECT_TRUE(same_bytes(*out.group, *expected.group));
  EXPECT_EQ(out.events, expected.events);
  EXPECT_EQ(out.seqnum, expected.seqnum);
  EXPECT_EQ(std::memcmp(out.name, expected.name, sizeof out.name), 0);
}

TEST_F(NewGroup, OfAdaptersStaysInTheRecordWhateverTheConfigurationSays) {
  global_config_tbl.Hb_max_nodes = 2049;
  global_config_tbl.Hb_adapters_per_node = 100000;
  EXPECT_EQ(ask(adapter_group), Hb_Failure);
  const auto expected = group_of_bytes(0x5A);
  std::fill_n(expected->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_adapter_list, HB_MAX_ADAPTERS,
              0xFFFFFFFFU);
  EXPECT_TRUE(same_bytes(*out.group, *expected));
}

// A list that leads back into itself comes to an end.
TEST_F(NewGroup, OfNodesComesToAnEndWhenTheListDoesNot) {
  zu_vex_node_info_t node = {};
  node.number = 2;
  node.status = ZU_VEX_NODE_STATUS_UP;
  node.p_next = &node;
  platform_double().node_info.answers = {{0, &node}};
  EXPECT_EQ(ask(node_group), Hb_Success);
  EXPECT_EQ(out.group->Hb_membership_grp_union.Hb_node_membership_grp.Hb_num_nodes, 1);
}

TEST_F(NewGroup, OfAdaptersComesToAnEndWhenTheListDoesNot) {
  char name[] = "en3";
  zu_vex_net_intf_info_t record = {};
  record.node_number = 1;
  record.p_name = name;
  record.ip_addr = scripted_address(0, 0, 3);
  record.status = ZU_VEX_INTF_STATUS_UP;
  record.p_next = &record;
  platform_double().net_intf_info.answers = {{0, &record}};
  EXPECT_EQ(ask(adapter_group), Hb_Success);
  EXPECT_EQ(out.group->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_num_adapters, 1);
}

TEST_F(NewGroup, NeedsNoGroupOfTheCaller) {
  scripted_cluster().appear();
  scripted_cluster().nodes = {{0}};
  scripted_cluster().interfaces = {interface(0)};
  for (const char request : {node_group, adapter_group}) {
    ASSERT_EQ(write(ends.write(), &request, 1), 1);
    EXPECT_EQ(new_group_event_handler_p->handler(&out.events, out.name, nullptr, &out.seqnum), Hb_Success);
    EXPECT_EQ(out.events, 4);
  }
}

TEST_F(NewGroup, MissesTheNameOfTheClusterAndGoesOn) {
  delete[] evmon_cluster_name;
  evmon_cluster_name = nullptr;
  scripted_cluster().appear();
  EXPECT_EQ(ask(node_group), Hb_Success);
  EXPECT_THAT(trace_lines(), ElementsAre(begins(), "Info 29", "Info 228"));
}

TEST_F(NewGroup, OfUnknownKindIsRefused) {
  scripted_cluster().appear();
  for (const int request : {0, 3, 127, 255}) {
    EXPECT_EQ(ask(static_cast<char>(request)), Hb_Failure);
    EXPECT_EQ(hb_get_errno(), 68);
    EXPECT_THAT(trace_lines(), ElementsAre(begins(), "Info 35: " + std::to_string(request) + " 1 68", "Info 228"));
    EXPECT_TRUE(out.is_untouched());
  }
}

TEST_F(NewGroup, FailsWhenItsPipeCannotBeRead) {
  platform_double().errno_after_trace = EXDEV;
  SystemCalls calls;
  calls.script("read", {fail(EIO)});
  EXPECT_EQ(serve(), Hb_Failure);
  EXPECT_EQ(errno, EIO);
  EXPECT_EQ(hb_get_errno(), 58);
  EXPECT_TRUE(out.is_untouched());
  EXPECT_THAT(trace_lines(), ElementsAre(begins(), "Info 28: -1 5", "Info 228"));
}

TEST_F(NewGroup, FailsAtTheEndOfItsPipe) {
  close(ends.write());
  errno = ENOTTY;
  EXPECT_EQ(serve(), Hb_Failure);
  EXPECT_EQ(errno, ENOTTY);
  EXPECT_EQ(hb_get_errno(), 58);
  EXPECT_THAT(trace_lines(), ElementsAre(begins(), "Info 28: 0 25", "Info 228"));
}

TEST_F(NewGroup, ReadsOneByteWithoutLookingFirst) {
  ASSERT_EQ(write(ends.write(), "\x03\x03", 2), 2);
  SystemCalls calls;
  serve();
  EXPECT_TRUE(calls.of("poll").empty());
  EXPECT_EQ(calls.of("read").size(), 1U);
  EXPECT_EQ(waiting_bytes(ends.read()), 1);
}

TEST_F(NewGroup, WaitsForItsRequest) {
  scripted_cluster().appear();
  std::thread subscriber([this] {
    const char request = node_group;
    EXPECT_EQ(write(ends.write(), &request, 1), 1);
  });
  EXPECT_EQ(serve(), Hb_Success);
  subscriber.join();
  EXPECT_EQ(out.events, 4);
}

TEST_F(NewGroup, IsSilentWithoutTracing) {
  set_levels(0);
  for (const char request : {node_group, adapter_group, '\x09'}) {
    EXPECT_EQ(ask(request), Hb_Failure);
    EXPECT_THAT(trace_lines(), IsEmpty());
  }
}

// What a subscription asks for is what the handler answers.
TEST_F(NewGroup, AnswersASubscriptionToNodes) {
  scripted_cluster().appear();
  scripted_cluster().nodes = {{0}, {2}};
  pretend_to_run();
  auto subscription = std::make_unique<Hb_Subscription_Group>();
  ASSERT_EQ(hb_add_all_nodes_to_subscription_group(subscription.get()), Hb_Success);
  char name[] = "my nodes";
  ASSERT_EQ(hb_subscribe(name, subscription.get(), HB_EVENT_NEW_GROUP), Hb_Success);
  Ends events = new_pipe();
  event_pipe_handler_p = new EVMONEventPipeHandler(events.fds, nullptr);
  int descriptors[] = {ends.read(), -1};
  EXPECT_EQ(hb_get_event_message(descriptors, nullptr, &out.events, out.name, out.group.get(), &out.seqnum),
            Hb_Success);
  EXPECT_EQ(out.events, 4);
  EXPECT_STREQ(out.name, "my nodes");
  EXPECT_THAT(nodes(), ElementsAre(0, 2));
}

TEST_F(NewGroup, AnswersASubscriptionToAdapters) {
  scripted_cluster().appear();
  scripted_cluster().interfaces = {interface(3)};
  pretend_to_run();
  auto subscription = std::make_unique<Hb_Subscription_Group>();
  ASSERT_EQ(hb_add_all_adapters_to_subscription_group(subscription.get()), Hb_Success);
  char name[] = "my adapters";
  ASSERT_EQ(hb_subscribe(name, subscription.get(), HB_EVENT_NEW_GROUP), Hb_Success);
  EXPECT_EQ(serve(), Hb_Success);
  EXPECT_STREQ(out.name, "my adapters");
  EXPECT_THAT(adapters(), ElementsAre(3U));
}

}  // namespace
}  // namespace hb_test
