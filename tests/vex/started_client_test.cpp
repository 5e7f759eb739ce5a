// A client that started in VEX mode over a scripted cluster: what each family of operations does from then on.
#include <algorithm>
#include <cstdlib>

#include "VEX_EVMONNewGroupEventHandler.h"
#include "VEX_EVMONNodeLivenessHandler.h"
#include "control/control_operations.h"
#include "migrating_client.h"
#include "queries/subscription_record.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

// Nodes 0, 3 and 4, all up; this is node 0, with the addresses 10.0.0.0 to 10.0.0.17. The others have two each,
// 10.0.<node>.0 and 10.0.<node>.1.
class StartedClient : public testing::Test {
 protected:
  StartedClient() {
    std::signal(SIGPIPE, SIG_IGN);
    forget_leftovers();
    reset_platform();
    scripted_cluster().appear();
    scripted_cluster().local_node = 0;
    add_node(0, 18);
    add_node(3, 2);
    add_node(4, 2);
    scripted_cluster().boot_addresses = scripted_cluster().interfaces;
    operation_outputs.clear();
    IsVEX = Hb_True;
    started = hb_initialize_evmon_event_handlers();
  }
  ~StartedClient() override {
    platform_double().errno_after_trace = 0;
    trace_nothing();
    hb_terminate();
    forget_leftovers();
    EXPECT_EQ(0U, Scripted_Cluster::wrong_releases());
  }
  void SetUp() override { ASSERT_EQ(Hb_Success, started); }

  static void add_node(uint32_t node, uint8_t interfaces) {
    scripted_cluster().nodes.push_back({.number = node});
    for (uint8_t index = 0; index < interfaces; ++index) {
      scripted_cluster().interfaces.push_back({.node = node,
                                               .name = "en" + std::to_string(index),
                                               .address = scripted_address(0, static_cast<uint8_t>(node), index)});
    }
  }

  // Nodes 3 and 4 go, in this order.
  static void split() {
    std::vector<uint32_t> here = {0};
    std::vector<uint32_t> there = {3, 4};
    zu_evm_event_split_merge_cfg_t record = {};
    record.event_type = ZU_EVM_SUBCLUSTER_SPLIT;
    record.event_subtype = ZU_EVM_SPLITMERGE_EVENT_SUBTYPE_LOCAL;
    record.sequence_number = 0x700000009;
    record.num_local_node_up = 1;
    record.num_remote_node_up = 2;
    record.local_node_numbers = here.data();
    record.remote_node_numbers = there.data();
    scripted_cluster().notify(node_liveness_handler_p->getFileDescriptor(), record);
  }

  static Hb_Rc subscribe_to(Hb_Rc (*fill)(Hb_Subscription_Group*), const char* name, int events = HB_EVENT_NEW_GROUP) {
    Hb_Subscription_Group group = group_of_type(4);
    std::string text = name;
    const Hb_Rc rc = fill(&group);
    return rc == Hb_Success ? hb_subscribe(text.data(), &group, events) : rc;
  }
  static Hb_Rc subscribe_to_nodes(const char* name) {
    return subscribe_to(hb_add_all_nodes_to_subscription_group, name);
  }
  static Hb_Rc subscribe_to_adapters(const char* name) {
    return subscribe_to(hb_add_all_adapters_to_subscription_group, name);
  }
  static Hb_Rc subscribe_to_splits(const char* name) {
    return subscribe_to(hb_empty_subscription_group, name, HB_EVENT_SPLIT_MERGE);
  }
  static Hb_Rc withdraw(const char* name) {
    std::string text = name;
    return hb_unsubscribe(text.data());
  }

  Hb_Rc take(std::vector<int> descriptors) {
    descriptors.push_back(-1);
    timeval at_once = {0, 0};
    return hb_get_event_message(descriptors.data(), &at_once, &out.events, out.name, out.group.get(), &out.sequence);
  }
  Hb_Rc take() { return take(Migrating_Client::readable()); }

  std::string name() const { return out.name; }

  const LeakAllowed interface_lists_stay;
  Hb_Rc started = Hb_Failure;
  EventOutputs out;
};

// Queries.

TEST_F(StartedClient, HasTheTablesOfABuiltConfiguration) {
  EXPECT_STREQ("Hb_IP list", global_config_tbl.ip_hash->name);
  EXPECT_STREQ("VEX_node list", global_config_tbl.node_hash->name);
  EXPECT_STREQ("Hb_Adapter list", global_config_tbl.adap_hash->name);
  EXPECT_EQ(4099, global_config_tbl.node_hash->size);
}

TEST_F(StartedClient, CountsWhatItsClusterHas) {
  int count = -1;
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_nodes(&count); }));
  EXPECT_EQ(3, count);
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_adapters(&count); }));
  EXPECT_EQ(22, count);
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_networks(&count); }));
  EXPECT_EQ(48, count);
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_sites(&count); }));
  EXPECT_EQ(0, count);
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_adapters_in_node(0, &count); }));
  EXPECT_EQ(18, count);
  EXPECT_TRUE(succeeds([&] { return hb_get_number_of_configured_adapters_in_node(4, &count); }));
  EXPECT_EQ(2, count);
  EXPECT_TRUE(fails_with(9, [&] { return hb_get_number_of_configured_adapters_in_node(1, &count); }));
  EXPECT_TRUE(fails_with(9, [&] { return hb_get_number_of_configured_adapters_in_node(2048, &count); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_number_of_configured_adapters_in_node(2049, &count); }));
  Hb_Node_Number node = -1;
  EXPECT_TRUE(succeeds([&] { return hb_get_my_node_number(&node); }));
  EXPECT_EQ(0, node);
}

// What a first/next pair yields, up to its end.
template <typename Number, typename First, typename Next>
std::vector<Number> walk(First first, Next next) {
  std::vector<Number> found;
  Hb_Cursor cursor = 0;
  Number number = 0;
  for (Hb_Rc rc = first(&number, &cursor); rc == Hb_Success; rc = next(&number, &cursor)) found.push_back(number);
  EXPECT_EQ(1, hb_get_errno());
  return found;
}

TEST_F(StartedClient, WalksNodesAdaptersAndItsOneNetwork) {
  EXPECT_THAT(walk<Hb_Node_Number>(hb_get_first_configured_node_number, hb_get_next_configured_node_number),
              ElementsAre(0, 3, 4));
  EXPECT_THAT(walk<Hb_Network_Number>(hb_get_first_configured_network_number, hb_get_next_configured_network_number),
              ElementsAre(0));
  EXPECT_THAT(walk<Hb_Site_Number>(hb_get_first_configured_site_number, hb_get_next_configured_site_number), IsEmpty());
  EXPECT_THAT(walk<Hb_Adapter_Number>(
                  [](auto* number, auto* cursor) { return hb_get_first_configured_adapter_in_node(4, number, cursor); },
                  [](auto* number, auto* cursor) { return hb_get_next_configured_adapter_in_node(4, number, cursor); }),
              ElementsAre(4 * 48, 4 * 48 + 1));
  std::vector<Hb_Adapter_Number> all =
      walk<Hb_Adapter_Number>(hb_get_first_configured_adapter_number, hb_get_next_configured_adapter_number);
  const std::vector<Hb_Adapter_Number> in_network = walk<Hb_Adapter_Number>(
      [](auto* number, auto* cursor) { return hb_get_first_configured_adapter_in_network(0, number, cursor); },
      [](auto* number, auto* cursor) { return hb_get_next_configured_adapter_in_network(0, number, cursor); });
  EXPECT_EQ(all, in_network);
  std::vector<Hb_Adapter_Number> expected;
  for (Hb_Adapter_Number offset = 0; offset < 18; ++offset) expected.push_back(offset);
  for (const Hb_Adapter_Number node : {3U, 4U}) expected.insert(expected.end(), {node * 48, node * 48 + 1});
  std::sort(all.begin(), all.end());
  EXPECT_EQ(expected, all);
}

TEST_F(StartedClient, FindsEveryAddressAndItsAdapter) {
  for (const Scripted_Interface& interface : scripted_cluster().interfaces) {
    Hb_IP_address6 address;
    std::memcpy(&address, &interface.address, sizeof address);
    Hb_Adapter_Number number = 0;
    ASSERT_TRUE(succeeds([&] { return hb_get_adapter_number_by_address(address, &number); }));
    Hb_Node_Number node = -1;
    EXPECT_TRUE(succeeds([&] { return hb_get_node_number_by_adapter_number(number, &node); }));
    EXPECT_EQ(static_cast<int>(interface.node), node);
    Hb_Adapter_Number again = 0;
    EXPECT_TRUE(
        succeeds([&] { return hb_get_adapter_number_by_node_number(node, static_cast<int>(number % 48), &again); }));
    EXPECT_EQ(number, again);
    Hb_IP_address6 found = {};
    EXPECT_TRUE(succeeds([&] { return hb_get_adapter_address_by_number(number, &found); }));
    EXPECT_EQ(0, std::memcmp(&address, &found, sizeof found));
    Hb_Adapter_Type type = "";
    EXPECT_TRUE(succeeds([&] { return hb_get_adapter_type_by_number(number, type); }));
    EXPECT_EQ(*interface.name, std::string(type));
  }
  Hb_Adapter_Number number = 0;
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_adapter_number_by_node_number(4, 2, &number); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_adapter_number_by_node_number(4, 48, &number); }));
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_adapter_number_by_address(address_of("10.0.3.2"), &number); }));
}

TEST_F(StartedClient, NamesItsOneNetwork) {
  char name[] = "VEX_Network";
  Hb_Network_Number network = -1;
  EXPECT_TRUE(succeeds([&] { return hb_get_network_number_by_name(name, &network); }));
  EXPECT_EQ(0, network);
  Hb_Network_Name text = "";
  EXPECT_TRUE(succeeds([&] { return hb_get_network_name_by_number(0, text); }));
  EXPECT_STREQ("VEX_Network", text);
  EXPECT_TRUE(succeeds([&] { return hb_get_network_type_by_number(0, text); }));
  EXPECT_STREQ("ether", text);
  EXPECT_TRUE(fails_with(8, [&] { return hb_get_network_name_by_number(47, text); }));
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_network_name_by_number(48, text); }));
}

// Requests, routes and keys.

class OperationOfAStartedClient : public StartedClient, public testing::WithParamInterface<Operation> {};

TEST_P(OperationOfAStartedClient, SendsNothingAndHasNoConnectionToAwaitAnAnswerOn) {
  SystemCalls calls;
  const int outcome = GetParam().in_vex_mode;
  if (outcome == no_failure) {
    EXPECT_TRUE(succeeds(GetParam().call));
  } else {
    EXPECT_TRUE(fails_with(outcome == no_error_number ? untouched_error : outcome, GetParam().call));
    EXPECT_TRUE(operation_outputs.untouched());
  }
  for (const char* function : {"socket", "writev", "read", "select"}) {
    EXPECT_THAT(calls.of(function), IsEmpty()) << function;
  }
  EXPECT_EQ(nullptr, client_socket);
  EXPECT_THAT(Migrating_Client::readable(), IsEmpty()) << "a monitor was woken";
}

INSTANTIATE_TEST_SUITE_P(Control, OperationOfAStartedClient, testing::ValuesIn(operations_that_start()),
                         [](const testing::TestParamInfo<Operation>& test) { return std::string(test.param.name); });

TEST_F(StartedClient, ChecksTheArgumentsOfRequestsAgainstItsConfiguration) {
  EXPECT_TRUE(fails_with(4, [] { return hb_enable_adapter(3 * 48); })) << "of another node";
  EXPECT_TRUE(fails_with(7, [] { return hb_enable_adapter(18); })) << "a slot without an adapter";
  EXPECT_TRUE(fails_with(4, [] { return hb_enable_adapter(2049 * 48); }));
  EXPECT_TRUE(succeeds([] { return hb_adapter_is_down(3 * 48 + 1); }));
  EXPECT_TRUE(fails_with(9, [] { return hb_node_is_down(1); }));
  EXPECT_TRUE(fails_with(4, [] { return hb_node_is_down(2049); }));
  EXPECT_TRUE(fails_with(7, [] { return hb_swap_adapters(13, ipv4({10, 0, 0, 18})); }));
  EXPECT_TRUE(fails_with(4, [] { return hb_swap_adapters(13, ipv4({10, 0, 3, 0})); }));
}

TEST_F(StartedClient, HasNoHeartbeatSettingsNorKeys) {
  Hb_client_hb_info_t settings;
  std::memset(&settings, 0xB7, sizeof settings);
  EXPECT_TRUE(succeeds([&] { return hb_get_client_hb_info(&settings); }));
  EXPECT_EQ(Bytes(sizeof settings, '\0'), Bytes(reinterpret_cast<const char*>(&settings), sizeof settings));
  Hb_Security_Status status = {};
  Hb_Key_Cache cache = {};
  EXPECT_TRUE(succeeds([&] { return hb_free_security_info_keys(&status, &status, &cache); }));
  EXPECT_THAT(platform_double().releases, IsEmpty());
}

// Subscriptions.

TEST_F(StartedClient, FillsGroupsFromItsConfiguration) {
  Hb_Subscription_Group group = group_of_type(4);
  EXPECT_TRUE(succeeds([&] { return hb_add_all_nodes_to_subscription_group(&group); }));
  EXPECT_THAT(members_of(group, 257), ElementsAre(0, 3, 4));
  EXPECT_EQ(3, count_of(group));
  EXPECT_TRUE(succeeds([&] { return hb_add_all_adapters_to_subscription_group(&group); }));
  EXPECT_THAT(members_of(group, 12294), SizeIs(22));
  EXPECT_EQ(22, count_of(group));
  group.Hb_subscription_type = Hb_Empty_Subscription;
  EXPECT_TRUE(succeeds([&] { return hb_add_network_to_subscription_group(&group, 0); }));
  EXPECT_THAT(members_of(group, 12294), SizeIs(22));
  EXPECT_TRUE(succeeds([&] { return hb_add_all_sites_to_subscription_group(&group); }));
  EXPECT_EQ(0, count_of(group));
  EXPECT_TRUE(fails_with(4, [&] { return hb_add_site_to_subscription_group(&group, 0); }));
  EXPECT_TRUE(succeeds([&] { return hb_empty_subscription_group(&group); }));
  EXPECT_TRUE(fails_with(8, [&] { return hb_add_network_to_subscription_group(&group, 1); }));
  EXPECT_TRUE(succeeds([&] { return hb_add_adapter_to_subscription_group(&group, 4 * 48 + 1); }));
  Hb_Adapter_Number adapter = 0;
  EXPECT_TRUE(succeeds([&] { return hb_get_first_subscription_adapter(&group, &adapter); }));
  EXPECT_EQ(4U * 48 + 1, adapter);
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_subscription_adapter(&group, &adapter); }));
}

TEST_F(StartedClient, AnswersEachSubscriptionWithItsGroup) {
  ASSERT_TRUE(succeeds([] { return subscribe_to_nodes("my nodes"); }));
  ASSERT_TRUE(succeeds([] { return subscribe_to_adapters("my adapters"); }));
  EXPECT_TRUE(succeeds([&] { return take(); }));
  EXPECT_EQ(4, out.events);
  EXPECT_EQ("my nodes", name());
  EXPECT_THAT(nodes_of(*out.group), ElementsAre(0, 3, 4));
  EXPECT_TRUE(succeeds([&] { return take(); }));
  EXPECT_EQ(4, out.events);
  EXPECT_EQ("my adapters", name());
  EXPECT_THAT(adapters_of(*out.group), SizeIs(22));
  EXPECT_THAT(Migrating_Client::readable(), IsEmpty());
}

// The byte asks for a kind of group; under which name it comes is looked up when the byte is taken.
TEST_F(StartedClient, ReadsTheNameOfASubscriptionWhenItAnswers) {
  ASSERT_TRUE(succeeds([] { return subscribe_to_nodes("a much longer name than later"); }));
  ASSERT_TRUE(succeeds([] { return subscribe_to_nodes("later"); }));
  for (int answer = 0; answer < 2; ++answer) {
    EXPECT_TRUE(succeeds([&] { return take(); }));
    EXPECT_EQ(4, out.events);
    EXPECT_EQ("later", name());
  }
  EXPECT_THAT(Migrating_Client::readable(), IsEmpty());
}

TEST_F(StartedClient, AnswersAWithdrawnSubscriptionWithTheEmptyEvent) {
  ASSERT_TRUE(succeeds([] { return subscribe_to_nodes("nodes"); }));
  ASSERT_TRUE(succeeds([] { return subscribe_to_adapters("adapters"); }));
  ASSERT_TRUE(succeeds([] { return withdraw("nodes"); }));
  EXPECT_TRUE(succeeds([&] { return take(); }));
  EXPECT_EQ(0, out.events);
  EXPECT_EQ("<EMPTY EVENT>", name());
  EXPECT_TRUE(succeeds([&] { return take(); }));
  EXPECT_EQ("adapters", name()) << "another subscription stands";
}

TEST_F(StartedClient, WithdrawsANameBeyond31CharactersAsItWasKept) {
  const char* const name_of_36 = "abcdefghijklmnopqrstuvwxyz1234567890";
  ASSERT_TRUE(succeeds([&] { return subscribe_to_nodes(name_of_36); }));
  EXPECT_TRUE(succeeds([&] { return take(); }));
  EXPECT_EQ("abcdefghijklmnopqrstuvwxyz12345", name());
  ASSERT_TRUE(succeeds([&] { return subscribe_to_nodes(name_of_36); }));
  ASSERT_TRUE(succeeds([&] { return withdraw(name_of_36); }));
  EXPECT_TRUE(succeeds([&] { return take(); }));
  EXPECT_EQ("<EMPTY EVENT>", name());
}

TEST_F(StartedClient, IsAskedForNothingByTypesThatHaveNoGroup) {
  char text[] = "odd";
  for (const int32_t type : {6, 7, 8, 9, 10, -1, std::numeric_limits<int32_t>::max()}) {
    Hb_Subscription_Group group = group_of_type(type);
    EXPECT_TRUE(succeeds([&] { return hb_subscribe(text, &group, 1); })) << type;
    EXPECT_EQ(type, group.Hb_subscription_type);
    EXPECT_THAT(Migrating_Client::readable(), IsEmpty()) << type;
  }
  EXPECT_STREQ("", nodeEventSubscriptionName);
  EXPECT_STREQ("", networkEventSubscriptionName);
}

// Events.

TEST_F(StartedClient, TakesWhatTheHandlerOfAReadableDescriptorTells) {
  ASSERT_TRUE(succeeds([] { return subscribe_to_splits("splits"); }));
  split();
  ASSERT_THAT(Migrating_Client::readable(), ElementsAre(node_liveness_handler_p->getFileDescriptor()));
  trace_only(trace_info);
  EXPECT_TRUE(succeeds([&] { return take(); }));
  EXPECT_EQ(4096, out.events);
  EXPECT_EQ("splits", name());
  EXPECT_EQ(9U, out.sequence);
  EXPECT_EQ(Hb_Subcluster_Group, out.group->Hb_group_type);
  const std::vector<uint32_t> ids = platform_double().trace_ids();
  ASSERT_LT(4U, ids.size());
  EXPECT_THAT(std::vector<uint32_t>(ids.begin(), ids.begin() + 2), ElementsAre(250, 252));
  EXPECT_THAT(std::vector<uint32_t>(ids.end() - 2, ids.end()), ElementsAre(253, 251));
  Hb_Split_Merge_Info parts = {};
  EXPECT_TRUE(succeeds([&] { return hb_get_split_info(out.group.get(), &parts); }));
  EXPECT_THAT(std::vector<uint32_t>(parts.remote_subcluster.node_numbers, parts.remote_subcluster.node_numbers + 2),
              ElementsAre(3, 4));
  EXPECT_EQ(2U, parts.remote_subcluster.num_up_nodes);
  EXPECT_EQ(1U, parts.local_subcluster.num_up_nodes);
  // Lists of the C allocator, which a caller that keeps its own account may release itself.
  std::free(parts.local_subcluster.node_numbers);
  std::free(parts.remote_subcluster.node_numbers);
}

TEST_F(StartedClient, TakesTheEventAtTheHeadOfTheQueueFirst) {
  ASSERT_TRUE(succeeds([] { return subscribe_to_nodes("nodes"); }));
  ASSERT_TRUE(succeeds([] { return subscribe_to_adapters("adapters"); }));
  while (!Migrating_Client::readable().empty()) ASSERT_EQ(Hb_Success, take());
  split();
  ASSERT_TRUE(succeeds([&] { return take(); }));
  hb_free_split_info(&out.group->Hb_membership_grp_union.split_info);

  // What waits is the death of both nodes, of the adapters of node 3, and of those of node 4.
  EXPECT_TRUE(succeeds([&] { return take(); }));
  EXPECT_EQ("nodes", name());
  EXPECT_EQ(1, out.events);
  EXPECT_THAT(nodes_of(*out.group), ElementsAre(3, 4));
  for (const uint32_t node : {3U, 4U}) {
    // Whatever else is readable, it is the queue that is served.
    scripted_cluster().wake(node_liveness_handler_p->getFileDescriptor());
    EXPECT_TRUE(succeeds([&] { return take({node_liveness_handler_p->getFileDescriptor()}); }));
    EXPECT_EQ("adapters", name());
    EXPECT_EQ(1, out.events);
    EXPECT_THAT(adapters_of(*out.group), ElementsAre(node * 48, node * 48 + 1));
  }
}

TEST_F(StartedClient, FailsForADescriptorThatNobodyServes) {
  EXPECT_TRUE(fails_with(81, [&] { return take({999}); }));
  EXPECT_TRUE(out.untouched());
}

TEST_F(StartedClient, KeepsErrnoWhateverTracingDoesToIt) {
  trace_all();
  platform_double().errno_after_trace = EPERM;
  const auto expect_kept = [](const char* what, Hb_Rc expected, const auto& step) {
    errno = EXDEV;
    EXPECT_EQ(expected, step()) << what;
    EXPECT_EQ(EXDEV, errno) << what;
  };
  expect_kept("nodes", Hb_Success, [] { return subscribe_to_nodes("nodes"); });
  expect_kept("adapters", Hb_Success, [] { return subscribe_to_adapters("adapters"); });
  expect_kept("splits", Hb_Success, [] { return subscribe_to_splits("splits"); });
  std::vector<int> ready = {new_group_event_handler_p->getFileDescriptor()};
  expect_kept("the group of nodes", Hb_Success, [&] { return take(ready); });
  expect_kept("the group of adapters", Hb_Success, [&] { return take(ready); });
  split();
  ready = {node_liveness_handler_p->getFileDescriptor()};
  expect_kept("the split", Hb_Success, [&] { return take(ready); });
  EXPECT_EQ(4096, out.events);
  hb_free_split_info(&out.group->Hb_membership_grp_union.split_info);
  ready = {event_pipe_handler_p->getFileDescriptor()};
  for (int queued = 0; queued < 3; ++queued) {
    expect_kept("what was queued", Hb_Success, [&] { return take(ready); });
    EXPECT_EQ(1, out.events);
  }
  expect_kept("nothing", Hb_Success, [&] { return take(ready); });
  EXPECT_EQ("<EMPTY EVENT>", name());
  expect_kept("a strange descriptor", Hb_Failure, [&] { return take({999}); });
  expect_kept("withdrawing", Hb_Success, [] { return withdraw("nodes"); });
}

}  // namespace
}  // namespace hb_test
