// A platform that says what no table holds, pipes and descriptors that others have touched, and memory that runs out:
// every call has a defined result, nothing is lost or given back twice, and the client goes on.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "VEX_EVMONAdapterEventHandler.h"
#include "VEX_EVMONEventPipeHandler.h"
#include "VEX_EVMONIPChangeEventHandler.h"
#include "VEX_EVMONNewGroupEventHandler.h"
#include "VEX_EVMONNodeListHandler.h"
#include "VEX_EVMONNodeLivenessHandler.h"
#include "VEX_EVMONPeerGSLivenessHandler.h"
#include "VEX_EVMONReconfigEventHandler.h"
#include "VEX_EVMONSiteConfigEventHandler.h"
#include "VEX_EVMONSplitMergeEventHandler.h"
#include "hb_global_data/state.h"
#include "hb_global_data/vex_event_queue.h"
#include "scripted_life.h"
#include "support/allocation_faults.h"
#include "support/process_state.h"
#include "support/running_client.h"

namespace hb_test {
namespace {

using testing::AnyOf;
using testing::Each;
using testing::ElementsAre;
using testing::Field;
using testing::IsEmpty;

// The kinds of record that a monitor hands out.
constexpr Platform_Handout monitor_records[] = {
    Platform_Handout::node_liveness, Platform_Handout::split_merge,      Platform_Handout::adapter_liveness,
    Platform_Handout::ip_change,     Platform_Handout::node_list,        Platform_Handout::process_liveness,
    Platform_Handout::site_cfg,      Platform_Handout::cluster_reconfig,
};

int node_monitor() { return node_liveness_handler_p->getFileDescriptor(); }
int adapter_monitor() { return adapter_event_handler_p->getFileDescriptor(); }
int address_monitor() { return ip_change_handler_p->getFileDescriptor(); }

class HostilePlatform : public testing::Test {
 protected:
  HostilePlatform() {
    std::signal(SIGPIPE, SIG_IGN);
    reset_platform();
    hbc_initialize_trace_once();
    life.emplace(4);
  }

  ~HostilePlatform() override {
    stop();
    EXPECT_EQ(0U, Scripted_Cluster::wrong_releases());
    EXPECT_THAT(platform_double().assertions, IsEmpty());
  }

  static void stop() {
    hb_terminate();
    IsVEX = Hb_False;
    while (Hb_VEX_Event* event = VEX_get_event_from_head()) {
      delete event;
    }
  }

  void start() {
    ASSERT_EQ(Hb_Success, caller.start());
    take();
    caller.taken.clear();
  }

  void take() {
    EXPECT_GT(64U, caller.take_all(64));
    for (const Platform_Handout kind : monitor_records) {
      EXPECT_EQ(0U, Scripted_Cluster::outstanding(kind)) << static_cast<int>(kind);
    }
    EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::cluster_info));
    EXPECT_EQ(0U, Scripted_Cluster::outstanding(Platform_Handout::node_info));
  }

  void expect_true_picture() const {
    EXPECT_EQ(life->configured_nodes(), caller.configured_nodes);
    EXPECT_EQ(life->nodes_up(), caller.nodes_up);
    EXPECT_EQ(life->configured_adapters(), life->without_aliases(caller.configured_adapters));
    EXPECT_EQ(life->adapters_up(), life->without_aliases(caller.adapters_up));
  }

  static void trace_from_now_on() { platform_double().set_levels({1, 1, 1}); }

  // A death and a return are told as ever.
  void expect_to_go_on() {
    for (const bool dies : {true, false}) {
      dies ? life->node_dies(4, ZU_VEX_NODE_DOWN_REASON_NONE) : life->node_returns(4);
      take();
      expect_true_picture();
    }
  }

  // The interface lists that a rebuild replaces stay allocated, by definition.
  LeakAllowed replaced_lists_stay;
  std::optional<Scripted_Life> life;
  Caller caller;
};

// Lists at the start.

std::set<int> numbers(int first, int last) {
  std::set<int> all;
  for (int number = first; number <= last; ++number) {
    all.insert(number);
  }
  return all;
}

TEST_F(HostilePlatform, NodesWithNumbersThatNoTableHoldsAreLeftOut) {
  for (const uint32_t number : {2049U, 65535U, 65538U, 0x7FFFFFFFU, 0x80000001U, 0xFFFFFFFFU}) {
    scripted_cluster().nodes.push_back({.number = number});
    scripted_cluster().interfaces.push_back({.node = number, .name = "en0", .address = scripted_address(9, 9, 9)});
    scripted_cluster().boot_addresses.push_back({.node = number, .name = "en0", .address = scripted_address(9, 9, 9)});
  }
  start();
  EXPECT_EQ(numbers(1, 4), caller.configured_nodes);
  EXPECT_EQ(numbers(1, 4), caller.nodes_up);
  EXPECT_EQ(8U, caller.configured_adapters.size());
  EXPECT_EQ(8U, caller.adapters_up.size());
}

TEST_F(HostilePlatform, NoMoreNodesAreTakenThanATableHolds) {
  scripted_cluster().nodes.clear();
  for (uint32_t copy = 0; copy < 2; ++copy) {
    for (uint32_t number = 0; number < 2049; ++number) {
      scripted_cluster().nodes.push_back({.number = number});
    }
  }
  start();
  EXPECT_EQ(numbers(0, 2048), caller.configured_nodes);
  EXPECT_EQ(numbers(0, 2048), caller.nodes_up);
}

TEST_F(HostilePlatform, OfANodesAddressesFortyEightAreTaken) {
  for (uint8_t alias = 0; alias < 100; ++alias) {
    scripted_cluster().interfaces.push_back({.node = 2, .name = "en0", .address = scripted_address(7, 7, alias)});
    scripted_cluster().boot_addresses.push_back({.node = 2, .name = "en0", .address = scripted_address(7, 7, alias)});
  }
  start();
  EXPECT_EQ(48 + 3 * 2U, caller.configured_adapters.size());
  EXPECT_EQ(48 + 3 * 2U, caller.adapters_up.size());
}

TEST_F(HostilePlatform, NamesOfInterfacesAreCutAndMayBeMissing) {
  const std::string longest(200, 'x');
  scripted_cluster().interfaces[2].name = longest;
  scripted_cluster().interfaces[3].name = std::nullopt;
  scripted_cluster().boot_addresses[2].name = longest;
  scripted_cluster().boot_addresses[3].name = std::nullopt;
  start();
  std::vector<std::string> names;
  for (const Known_Adapter& adapter : caller.configured_adapters) {
    if (adapter.node == 2) {
      names.push_back(adapter.type);
    }
  }
  EXPECT_THAT(names, ElementsAre("", std::string(35, 'x')));
  EXPECT_EQ(8U, caller.adapters_up.size());
}

TEST_F(HostilePlatform, StatusesThatAreNoneAreNotUp) {
  scripted_cluster().nodes[1].status = static_cast<zu_vex_node_status_t>(77);
  scripted_cluster().nodes[2].status = ZU_VEX_NODE_STATUS_UNDEF;
  scripted_cluster().nodes[2].reason = static_cast<zu_vex_node_down_reason_t>(-9);
  scripted_cluster().interfaces[0].status = static_cast<zu_vex_intf_status_t>(77);
  scripted_cluster().interfaces[1].status = ZU_VEX_INTF_STATUS_UNDEF;
  start();
  EXPECT_THAT(caller.nodes_up, ElementsAre(1, 4));
  EXPECT_EQ(6U, caller.adapters_up.size());
  Hb_Entity_State state = Hb_Entity_Up;
  Hb_Entity_State_Reason reason = Hb_Entity_State_Reason_Up;
  EXPECT_EQ(Hb_Success, hb_get_node_status_reason(3, &state, &reason));
  EXPECT_EQ(Hb_Entity_Down, state);
  EXPECT_EQ(Hb_Entity_State_Reason_Down, reason);
}

TEST_F(HostilePlatform, ALocalNodeBeyondAllNumbersIsKeptInSixteenBits) {
  scripted_cluster().local_node = 0x10003;
  start();
  Hb_Node_Number node = -1;
  EXPECT_EQ(Hb_Success, hb_get_my_node_number(&node));
  EXPECT_EQ(3, node);
}

TEST_F(HostilePlatform, AClusterWithoutANameNodesOrInterfacesIsOne) {
  scripted_cluster().cluster_name = std::nullopt;
  scripted_cluster().nodes.clear();
  scripted_cluster().interfaces.clear();
  scripted_cluster().boot_addresses.clear();
  start();
  EXPECT_THAT(caller.configured_nodes, IsEmpty());
  EXPECT_THAT(caller.configured_adapters, IsEmpty());
  EXPECT_THAT(caller.nodes_up, IsEmpty());
}

TEST_F(HostilePlatform, AClusterAtTheLimitHasItsLastAdapter) {
  reset_platform();
  life.emplace(0);
  for (uint32_t node = 0; node < 2049; ++node) {
    scripted_cluster().nodes.push_back({.number = node});
    for (uint32_t slot = 0; slot < 49; ++slot) {
      const auto address =
          scripted_address(static_cast<uint8_t>(slot), static_cast<uint8_t>(node >> 8U), static_cast<uint8_t>(node));
      scripted_cluster().interfaces.push_back({.node = node, .name = "en0", .address = address});
    }
  }
  scripted_cluster().boot_addresses = scripted_cluster().interfaces;
  IsVEX = Hb_True;
  ASSERT_EQ(Hb_Success, hb_init());
  int count = 0;
  EXPECT_EQ(Hb_Success, hb_get_number_of_configured_adapters(&count));
  EXPECT_EQ(98352, count);
  Hb_Node_Number node = -1;
  EXPECT_EQ(Hb_Success, hb_get_node_number_by_adapter_number(98351, &node));
  EXPECT_EQ(2048, node);
}

// Notifications.

constexpr uint32_t foreign_nodes[] = {0, 2048, 2049, 65538, 0x7FFFFFFF, 0x80000002, 0xFFFFFFFF};
constexpr int foreign_types[] = {-1, 16, 77, 0x7FFFFFFF};

TEST_F(HostilePlatform, ReportsOfNodesThatAreNotThereChangeNoPicture) {
  start();
  for (const uint32_t node : foreign_nodes) {
    for (const zu_evm_event_type_t type : {ZU_EVM_EVENT_DOWN, ZU_EVM_EVENT_UP}) {
      SCOPED_TRACE(testing::Message() << "node " << node << ", type " << type);
      life->report_node(node, type);
      take();
      expect_true_picture();
    }
  }
  EXPECT_THAT(caller.taken, Each(Field(&Taken_Event::result, Hb_Success)));
  expect_to_go_on();
}

TEST_F(HostilePlatform, ReportsOfInterfacesThatAreNotThereChangeNoPicture) {
  start();
  for (const uint32_t node : foreign_nodes) {
    for (int type = -1; type < 17; ++type) {
      life->report_interface(node, "en0", static_cast<zu_evm_event_type_t>(type));
      life->report_address(node, "en0", scripted_address(1, 2, 3), static_cast<zu_evm_event_type_t>(type));
      take();
      expect_true_picture();
    }
  }
  EXPECT_THAT(caller.taken, Each(Field(&Taken_Event::result, Hb_Success)));
  expect_to_go_on();
}

TEST_F(HostilePlatform, ReportsOfAnUnknownKindChangeNoPicture) {
  start();
  for (const int type : foreign_types) {
    life->report_node(2, static_cast<zu_evm_event_type_t>(type));
    life->report_interface(2, "en0", static_cast<zu_evm_event_type_t>(type));
    life->report_address(2, "en0", Scripted_Life::boot_address(2, 0), static_cast<zu_evm_event_type_t>(type));
    take();
    expect_true_picture();
  }
  expect_to_go_on();
}

TEST_F(HostilePlatform, NamesInReportsMayBeMissingOrEndless) {
  start();
  trace_from_now_on();
  std::string endless(100000, 'e');
  for (char* name : {static_cast<char*>(nullptr), endless.data()}) {
    for (int type = 0; type < 4; ++type) {
      zu_evm_event_adapter_liveness_t interface = {};
      interface.event_type = static_cast<zu_evm_event_type_t>(type);
      interface.node_number = 2;
      interface.p_interface_name = name;
      scripted_cluster().notify(adapter_monitor(), interface);
      zu_evm_event_ip_change_t address = {};
      address.event_type = static_cast<zu_evm_event_type_t>(type + 4);
      address.node_number = 2;
      address.p_interface_name = name;
      scripted_cluster().notify(address_monitor(), address);
    }
    zu_evm_event_process_liveness_t process = {};
    process.process_name = name;
    scripted_cluster().notify(peer_GS_liveness_handler_p->getFileDescriptor(), process);
    zu_evm_event_node_list_t node = {};
    node.node_name = name;
    scripted_cluster().notify(node_list_handler_p->getFileDescriptor(), node);
    zu_evm_event_site_cfg_t site = {};
    site.site_name = name;
    site.node_name = name;
    scripted_cluster().notify(site_config_handler_p->getFileDescriptor(), site);
    take();
    expect_true_picture();
  }
  expect_to_go_on();
}

TEST_F(HostilePlatform, OfListsOfNodesAndSitesAsManyAreLookedAtAsAClusterHasNodes) {
  start();
  trace_from_now_on();
  std::vector<zu_evm_event_node_list_t> nodes(5000);
  std::vector<zu_evm_event_site_cfg_t> sites(5000);
  for (size_t i = 0; i + 1 < nodes.size(); ++i) {
    nodes[i].next = &nodes[i + 1];
    sites[i].next = &sites[i + 1];
    nodes[i].node_number = sites[i].node_number = sites[i].site_number = 0xFFFFFFFF;
  }
  scripted_cluster().notify(node_list_handler_p->getFileDescriptor(), nodes[0]);
  scripted_cluster().notify(site_config_handler_p->getFileDescriptor(), sites[0]);
  take();
  expect_true_picture();
  EXPECT_EQ(2049U, platform_double().traces_of(330).size());
  EXPECT_EQ(2049U, platform_double().traces_of(334).size());
}

// Splits and merges whose lists are none.

zu_evm_event_split_merge_cfg_t split_of(std::vector<uint32_t>& local, std::vector<uint32_t>& remote) {
  zu_evm_event_split_merge_cfg_t record = {};
  record.event_type = ZU_EVM_SUBCLUSTER_SPLIT;
  record.num_local_node_up = static_cast<uint32_t>(local.size());
  record.num_remote_node_up = static_cast<uint32_t>(remote.size());
  record.local_node_numbers = local.data();
  record.remote_node_numbers = remote.data();
  return record;
}

TEST_F(HostilePlatform, ASplitWithListsThatAreMissingOrTooLongIsRefused) {
  start();
  std::vector<uint32_t> few = {1, 2};
  std::vector<uint32_t> many(2050, 3);
  std::vector<zu_evm_event_split_merge_cfg_t> records = {split_of(many, few), split_of(few, many)};
  for (const uint32_t count : {1U, 2049U, 0x7FFFFFFFU, 0xFFFFFFFFU}) {
    records.push_back(split_of(few, few));
    records.back().num_remote_node_up = count;
    records.back().remote_node_numbers = nullptr;
    records.push_back(split_of(few, few));
    records.back().num_local_node_up = count;
    records.back().local_node_numbers = nullptr;
  }
  for (zu_evm_event_split_merge_cfg_t& record : records) {
    for (const zu_evm_event_type_t type : {ZU_EVM_SUBCLUSTER_SPLIT, ZU_EVM_SUBCLUSTER_MERGE}) {
      record.event_type = type;
      scripted_cluster().notify(node_monitor(), record);
      take();
      expect_true_picture();
    }
  }
  EXPECT_THAT(caller.taken, Each(Field(&Taken_Event::result, Hb_Failure)));
  expect_to_go_on();
}

TEST_F(HostilePlatform, OfASplitOnlyNodesThatAreThereDie) {
  start();
  std::vector<uint32_t> local = {1, 2, 4};
  std::vector<uint32_t> remote = {0xFFFFFFFF, 2049, 65538, 3, 3, 0, 0x80000004};
  scripted_cluster().nodes[2].status = ZU_VEX_NODE_STATUS_DOWN;
  scripted_cluster().interfaces[4].status = scripted_cluster().interfaces[5].status = ZU_VEX_INTF_STATUS_DOWN;
  scripted_cluster().notify(node_monitor(), split_of(local, remote));
  take();
  expect_true_picture();
  ASSERT_FALSE(caller.taken.empty());
  EXPECT_EQ(HB_EVENT_SUBCLUSTER_SPLIT, caller.taken[0].events);
  EXPECT_EQ(std::set<uint32_t>(remote.begin(), remote.end()), caller.taken[0].remote_part);
  expect_to_go_on();
}

TEST_F(HostilePlatform, ASplitOfAnUnknownKindOrPartTellsNothing) {
  start();
  std::vector<uint32_t> local = {1, 2, 3};
  std::vector<uint32_t> remote = {4};
  for (const int value : foreign_types) {
    zu_evm_event_split_merge_cfg_t record = split_of(local, remote);
    record.event_type = static_cast<zu_evm_event_type_t>(value);
    scripted_cluster().notify(node_monitor(), record);
    take();
    expect_true_picture();
  }
  zu_evm_event_split_merge_cfg_t record = split_of(local, remote);
  record.event_subtype = ZU_EVM_SPLITMERGE_EVENT_SUBTYPE_REMOTE;
  scripted_cluster().notify(node_monitor(), record);
  take();
  EXPECT_EQ(Hb_Failure, caller.taken.back().result);
  expect_true_picture();
  expect_to_go_on();
}

// Results that no monitor has, and records that are not there.

TEST_F(HostilePlatform, AReadThatFailsIsAFailureAndNothingWaitingIsNone) {
  start();
  int* descriptors = nullptr;
  int count = 0;
  ASSERT_EQ(Hb_Success, hb_get_file_descriptor_array(&descriptors, &count));
  for (int i = 0; i < count; ++i) {
    if (!scripted_cluster().is_open_monitor(descriptors[i])) {
      continue;
    }
    for (const int result : {0, 1, 2, 3, 77, -1, -15, -17, INT32_MIN}) {
      caller.taken.clear();
      scripted_cluster().notify_result(descriptors[i], result, EIO);
      take();
      ASSERT_EQ(1U, caller.taken.size());
      EXPECT_EQ(Hb_Failure, caller.taken[0].result) << scripted_cluster().path_of(descriptors[i]) << ' ' << result;
      expect_true_picture();
    }
  }
  hb_free_file_descriptor_array(descriptors);
  expect_to_go_on();
}

// Queries that fail, or succeed without a record, while a notification is handled.

TEST_F(HostilePlatform, AQueryThatFailsWhileANotificationIsHandledCostsThatNotificationAlone) {
  start();
  Platform_Double& platform = platform_double();
  const std::function<void(int)> failures[] = {
      [&](int result) {
        platform.cluster_info.answers = {{result, nullptr, EIO}};
      },
      [&](int result) {
        platform.cluster_info.answers = {{0, nullptr, 0, true}, {result, nullptr, EIO}};
      },
      [&](int result) {
        platform.node_info_after_event.answers = {{result, nullptr, EIO}};
      },
      [&](int result) {
        platform.net_intf_info.answers = {{result, nullptr, EIO}};
      },
      [&](int result) {
        platform.net_intf_info.answers = {{0, nullptr, 0, true}, {result, nullptr, EIO}};
      },
  };
  for (const auto& fail : failures) {
    for (const int result : {-1, 7}) {
      fail(result);
      life->report_node(3, ZU_EVM_EVENT_DOWN);
      life->report_interface(3, "en0", ZU_EVM_EVENT_ADD);
      life->report_address(3, "en0", Scripted_Life::boot_address(3, 0), ZU_EVM_ADDRESS_CHG);
      take();
      expect_true_picture();
      platform.cluster_info.answers.clear();
      platform.node_info_after_event.answers.clear();
      platform.net_intf_info.answers.clear();
      expect_to_go_on();
    }
  }
}

TEST_F(HostilePlatform, AnAnswerWithoutAClusterRecordIsAFailedQuery) {
  platform_double().cluster_info.answers = {{0, nullptr}, {0, nullptr}};
  EXPECT_EQ(Hb_Failure, caller.start());
  EXPECT_EQ(63, hb_get_errno());
  platform_double().cluster_info.answers.clear();
  IsVEX = Hb_False;
  Caller again;
  EXPECT_EQ(Hb_Success, again.start());
}

TEST_F(HostilePlatform, MonitorsOfWhichOneCannotBeOpenedAreAllClosed) {
  const int descriptors = open_descriptors();
  for (size_t failing = 1; failing < 8; ++failing) {
    for (const int result : {-1, 5}) {
      scripted_cluster().open_results.assign(failing, platform_as_usual);
      scripted_cluster().open_results.push_back({result, EACCES});
      IsVEX = Hb_True;
      EXPECT_EQ(Hb_Failure, hb_initialize_evmon_event_handlers()) << failing;
      EXPECT_EQ(0, EVMONHandler::getNumbersOfFileDescriptors());
      EXPECT_THAT(scripted_cluster().open_monitors(), IsEmpty());
      scripted_cluster().open_results.clear();
    }
  }
  stop();
  scripted_cluster().reset();
  EXPECT_EQ(descriptors, open_descriptors());
}

// Pipes that others have touched.

void fill(int descriptor, char byte) {
  const int flags = fcntl(descriptor, F_GETFL);
  fcntl(descriptor, F_SETFL, flags | O_NONBLOCK);
  while (write(descriptor, &byte, 1) == 1) {
  }
  fcntl(descriptor, F_SETFL, flags);
}

TEST_F(HostilePlatform, AFullEventPipeCannotBeWrittenAndIsStillServed) {
  start();
  trace_from_now_on();
  fill(event_pipe_handler_p->getWriteFd(), 1);
  EXPECT_EQ(Hb_Failure, hb_vex_msg_received_from(2));
  EXPECT_EQ(59, hb_get_errno());
  ASSERT_EQ(1U, platform_double().traces_of(58).size());
  EXPECT_THAT(platform_double().traces_of(58)[0].values, ElementsAre(0xFFFFFFFFU, static_cast<uint32_t>(EAGAIN)));
  EXPECT_EQ(Hb_False, VEX_event_queue_is_empty());
  life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_NONE);
  for (int call = 0; call < 40; ++call) {
    EXPECT_TRUE(caller.take_one());
  }
  expect_true_picture();
  EXPECT_EQ(Hb_True, VEX_event_queue_is_empty());
}

TEST_F(HostilePlatform, ForeignBytesInTheEventPipeAreReportedAndTheQueueIsServed) {
  start();
  fill(event_pipe_handler_p->getWriteFd(), 0x55);
  life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_NONE);
  for (int call = 0; call < 40; ++call) {
    ASSERT_TRUE(caller.take_one());
  }
  EXPECT_THAT(caller.taken, testing::Contains(Field(&Taken_Event::error, HB_EPIPEMSG)));
  EXPECT_EQ(72, HB_EPIPEMSG);
  expect_true_picture();
}

TEST_F(HostilePlatform, AnEventPipeWhoseWriteEndWasClosedWakesNobodyButTheQueueIsTakenFirst) {
  start();
  trace_from_now_on();
  close(event_pipe_handler_p->getWriteFd());
  life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_NONE);
  ASSERT_TRUE(caller.take_one());
  EXPECT_EQ(Hb_Failure, caller.taken.back().result);
  EXPECT_EQ(59, caller.taken.back().error);
  // The read end is at its end now, which poll tells as well.
  for (int call = 0; call < 8; ++call) {
    EXPECT_TRUE(caller.take_one());
  }
  EXPECT_EQ(Hb_True, VEX_event_queue_is_empty());
  EXPECT_FALSE(platform_double().traces_of(178).empty());
  EXPECT_EQ(life->configured_nodes(), caller.configured_nodes);
}

TEST_F(HostilePlatform, AnEventPipeWhoseReadEndWasClosedIsAFailedWrite) {
  start();
  trace_from_now_on();
  close(event_pipe_handler_p->getFileDescriptor());
  EXPECT_EQ(Hb_Failure, hb_vex_msg_received_from(2));
  EXPECT_EQ(59, hb_get_errno());
  ASSERT_EQ(1U, platform_double().traces_of(58).size());
  EXPECT_THAT(platform_double().traces_of(58)[0].values, ElementsAre(0xFFFFFFFFU, static_cast<uint32_t>(EPIPE)));
}

TEST_F(HostilePlatform, ForeignBytesInTheNewGroupPipeAreRefusedOneByOne) {
  start();
  const char bytes[] = {0, 3, 1, 'x', 2};
  ASSERT_EQ(5, write(new_group_event_handler_p->getWriteFd(), bytes, 5));
  take();
  std::vector<std::pair<Hb_Rc, int>> results;
  for (const Taken_Event& event : caller.taken) {
    results.emplace_back(event.result, event.result == Hb_Success ? 0 : event.error);
  }
  EXPECT_THAT(results, ElementsAre(std::pair(Hb_Failure, 68), std::pair(Hb_Failure, 68), std::pair(Hb_Success, 0),
                                   std::pair(Hb_Failure, 68), std::pair(Hb_Success, 0)));
  expect_true_picture();
}

TEST_F(HostilePlatform, AFullNewGroupPipeRefusesASubscription) {
  start();
  fill(new_group_event_handler_p->getWriteFd(), 1);
  Hb_Subscription_Group group = {};
  char name[] = "more";
  ASSERT_EQ(Hb_Success, hb_add_all_nodes_to_subscription_group(&group));
  EXPECT_EQ(Hb_Failure, hb_subscribe(name, &group, HB_EVENT_DEATH));
  EXPECT_EQ(59, hb_get_errno());
  EXPECT_TRUE(caller.take_one());
  expect_true_picture();
}

TEST_F(HostilePlatform, ANewGroupPipeWhoseWriteEndWasClosedCannotBeRead) {
  start();
  close(new_group_event_handler_p->getWriteFd());
  EXPECT_TRUE(caller.take_one());
  EXPECT_EQ(Hb_Failure, caller.taken.back().result);
  EXPECT_EQ(58, caller.taken.back().error);
}

// Descriptors that were closed behind the library's back.

TEST_F(HostilePlatform, AMonitorThatWasClosedCannotBeReadAndTheOthersGoOn) {
  start();
  trace_from_now_on();
  close(adapter_monitor());
  int descriptors[] = {adapter_monitor(), -1};
  Hb_Events events = 0;
  Hb_Name name = "";
  static Hb_Group group;
  Hb_Seq_Num sequence = 0;
  EXPECT_EQ(Hb_Failure, hb_get_event_message(descriptors, nullptr, &events, name, &group, &sequence));
  EXPECT_EQ(1U, platform_double().traces_of(15).size());
  life->node_dies(3, ZU_VEX_NODE_DOWN_REASON_NONE);
  for (int call = 0; call < 8; ++call) {
    EXPECT_TRUE(caller.take_one());
  }
  EXPECT_EQ(life->nodes_up(), caller.nodes_up);
}

TEST_F(HostilePlatform, WhatWasClosedIsNotClosedAgainWhenSomebodyElseHasItsNumber) {
  start();
  const int number = adapter_monitor();
  close(number);
  int* descriptors = nullptr;
  int count = 0;
  ASSERT_EQ(Hb_Success, hb_get_file_descriptor_array(&descriptors, &count));
  EXPECT_EQ(1, std::count(descriptors, descriptors + count, number));
  hb_free_file_descriptor_array(descriptors);
  hb_delete_evmon_event_handlers();
  EXPECT_EQ(0, EVMONHandler::getNumbersOfFileDescriptors());
  EXPECT_EQ(Hb_Success, hb_initialize_evmon_event_handlers());
  EXPECT_EQ(10, EVMONHandler::getNumbersOfFileDescriptors());
}

// What stays allocated, by definition: of each rebuild the copies of the interfaces that are no aliases.

TEST_F(HostilePlatform, EachRebuildLeavesOneListOfInterfaceCopiesAndNothingElse) {
  start();
  Hb_Events events = 0;
  Hb_Name name = "";
  static Hb_Group group;
  Hb_Seq_Num sequence = 0;
  const auto rebuild = [&] {
    life->report_node(3, ZU_EVM_EVENT_DOWN);
    return node_liveness_handler_p->handler(&events, name, &group, &sequence);
  };
  ASSERT_EQ(Hb_Success, rebuild());
  const size_t interfaces = Scripted_Cluster::outstanding(Platform_Handout::net_intf_info);
  const long before = live_allocations();
  for (int time = 0; time < 10; ++time) {
    ASSERT_EQ(Hb_Success, rebuild());
  }
  // Eight interfaces of a record and a name each.
  EXPECT_EQ(10 * 8 * 2, live_allocations() - before);
  EXPECT_EQ(interfaces, Scripted_Cluster::outstanding(Platform_Handout::net_intf_info));
}

// Memory that runs out, at each allocation in turn.

struct Situation {
  const char* name;
  std::function<void(Scripted_Life&)> before;  // with memory, and everything taken
  std::function<void(Scripted_Life&)> happens;

  friend void PrintTo(const Situation& situation, std::ostream* out) { *out << situation.name; }
};

class MemoryRunsOut : public HostilePlatform, public testing::WithParamInterface<Situation> {
 protected:
  // Polls and takes without an allocation of its own, `limit` times at most.
  static int take_without_memory(const int* descriptors, int count, int limit) {
    static Hb_Group group;
    pollfd polled[16];
    int taken = 0;
    for (; taken < limit; ++taken) {
      for (int i = 0; i < count; ++i) {
        polled[i] = {descriptors[i], POLLIN, 0};
      }
      if (poll(polled, static_cast<nfds_t>(count), 0) <= 0) {
        break;
      }
      const auto* ready = std::find_if(polled, polled + count, [](const pollfd& one) { return one.revents != 0; });
      int list[] = {ready->fd, -1};
      Hb_Events events = 0;
      Hb_Name name = "";
      Hb_Seq_Num sequence = 0;
      const Hb_Rc rc = hb_get_event_message(list, nullptr, &events, name, &group, &sequence);
      EXPECT_TRUE(rc == Hb_Success || rc == Hb_Failure);
      if (events == HB_EVENT_SUBCLUSTER_SPLIT || events == HB_EVENT_SUBCLUSTER_MERGE) {
        hb_free_split_info(&group.Hb_membership_grp_union.split_info);
      }
    }
    return taken;
  }

  // One life in which the n-th allocation fails, and the blocks that stay. Memory does not run out with n 0.
  bool live_once(size_t nth, long* staying) {
    reset_platform();
    hbc_initialize_trace_once();
    const long before = live_allocations();
    bool happened = false;
    {
      Scripted_Life one(4);
      Caller first;
      EXPECT_EQ(Hb_Success, first.start());
      first.take_all();
      GetParam().before(one);
      first.take_all();
      GetParam().happens(one);
      int* descriptors = nullptr;
      int count = 0;
      EXPECT_EQ(Hb_Success, hb_get_file_descriptor_array(&descriptors, &count));
      {
        const AllocationFailure failure(nth);
        EXPECT_GT(40, take_without_memory(descriptors, count, 40));
        happened = failure.happened();
      }
      hb_free_file_descriptor_array(descriptors);
      expect_recovered(one);
    }
    stop();
    scripted_cluster().reset();
    *staying = live_allocations() - before;
    return happened;
  }

  // What happens next is told, and a program that starts to look then sees what is there.
  static void expect_recovered(Scripted_Life& one) {
    Caller second;
    EXPECT_EQ(Hb_Success, second.start());
    second.take_all();
    one.node_dies(4, ZU_VEX_NODE_DOWN_REASON_NONE);
    second.take_all();
    EXPECT_EQ(one.nodes_up(), second.nodes_up);
    one.node_returns(4);
    second.take_all();
    EXPECT_EQ(one.nodes_up(), second.nodes_up);
    EXPECT_THAT(second.taken, Each(Field(&Taken_Event::result, Hb_Success)));
    Caller third;
    EXPECT_EQ(Hb_Success, third.start());
    third.take_all();
    EXPECT_EQ(one.configured_nodes(), third.configured_nodes);
    EXPECT_EQ(one.nodes_up(), third.nodes_up);
    EXPECT_EQ(one.configured_adapters(), one.without_aliases(third.configured_adapters));
    EXPECT_EQ(one.adapters_up(), one.without_aliases(third.adapters_up));
  }
};

TEST_P(MemoryRunsOut, AtEachAllocationInTurnNothingIsThrownOrLostAndTheClientGoesOn) {
  stop();
  scripted_cluster().reset();
  long usual = 0;
  EXPECT_FALSE(live_once(0, &usual));
  EXPECT_FALSE(live_once(0, &usual));
  size_t nth = 1;
  for (long staying = 0; nth < 2000 && live_once(nth, &staying); ++nth) {
    EXPECT_LE(staying, usual) << "allocation " << nth;
    ASSERT_FALSE(HasFailure()) << "allocation " << nth;
  }
  EXPECT_LT(1U, nth);
  EXPECT_GT(2000U, nth);
}

void nothing(Scripted_Life&) {}
void lose_a_node(Scripted_Life& life) { life.node_dies(3, ZU_VEX_NODE_DOWN_REASON_NONE); }
void lose_an_address(Scripted_Life& life) { life.remove_boot_address(3, 1); }

INSTANTIATE_TEST_SUITE_P(
    Situations, MemoryRunsOut,
    testing::Values(Situation{"ANodeDies", nothing, lose_a_node},
                    Situation{"ANodeReturns", lose_a_node, [](Scripted_Life& life) { life.node_returns(3); }},
                    Situation{"AnAddressGoes", nothing, lose_an_address},
                    Situation{"AnAddressComes", lose_an_address,
                              [](Scripted_Life& life) { life.add_boot_address(3, 1); }},
                    Situation{"AnAddressChanges", nothing,
                              [](Scripted_Life& life) { life.change_address(3, 1, scripted_address(5, 5, 5)); }},
                    Situation{"AnInterfaceComes", nothing,
                              [](Scripted_Life& life) { life.report_interface(3, "en0", ZU_EVM_EVENT_ADD); }},
                    Situation{"ASplit", nothing,
                              [](Scripted_Life& life) {
                                life.split_off({3, 4});
                              }}),
    [](const auto& instance) { return instance.param.name; });

TEST_F(HostilePlatform, AStartThatMemoryDoesNotDoForFailsAndTheNextOneSucceeds) {
  size_t nth = 1;
  for (; nth < 2000; ++nth) {
    IsVEX = Hb_True;
    Hb_Rc rc = Hb_Failure;
    bool happened = false;
    {
      const AllocationFailure failure(nth);
      rc = hb_initialize_evmon_event_handlers();
      happened = failure.happened();
    }
    if (!happened) {
      EXPECT_EQ(Hb_Success, rc);
      break;
    }
    EXPECT_TRUE(rc == Hb_Success || rc == Hb_Failure);
    EXPECT_EQ(rc == Hb_Success ? 10 : 0, EVMONHandler::getNumbersOfFileDescriptors()) << nth;
    stop();
  }
  EXPECT_LT(10U, nth);
  EXPECT_GT(2000U, nth);
  stop();
  reset_platform();
  life.emplace(4);
  start();
  expect_true_picture();
}

}  // namespace
}  // namespace hb_test
