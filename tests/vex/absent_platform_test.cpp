// VEX mode on a platform that has neither cluster services nor monitors: what fails, with which number and trace.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cerrno>
#include <cstring>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "VEX_EVMONAdapterEventHandler.h"
#include "VEX_EVMONIPChangeEventHandler.h"
#include "VEX_EVMONNodeListHandler.h"
#include "VEX_EVMONNodeLivenessHandler.h"
#include "VEX_EVMONPeerGSLivenessHandler.h"
#include "VEX_EVMONReconfigEventHandler.h"
#include "VEX_EVMONRepositoryDiskHandler.h"
#include "VEX_EVMONSiteConfigEventHandler.h"
#include "VEX_EVMONSplitMergeEventHandler.h"
#include "hb_client.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/vex_event_queue.h"
#include "hb_global_data/vex_handler_set.h"
#include "support/process_state.h"
#include "support/running_client.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr int errors = 0;
constexpr int info = 1;
constexpr uint32_t minus_one = 0xFFFFFFFF;
constexpr int no_number = 49;

std::vector<std::pair<uint32_t, int>> traced() {
  std::vector<std::pair<uint32_t, int>> records;
  for (const Recorded_Trace& trace : platform_double().traces) {
    records.emplace_back(trace.id, trace.category);
  }
  return records;
}

// The 32-bit values of a record, in whichever of the two forms it has.
std::vector<uint32_t> numbers_of(const Recorded_Trace& trace) {
  std::vector<uint32_t> numbers = trace.values;
  for (size_t i = 0; i < trace.blocks.size(); ++i) {
    numbers.push_back(trace.block_value(i));
  }
  return numbers;
}

// Without a client.

class AbsentPlatform : public testing::Test {
 protected:
  AbsentPlatform() {
    reset_platform(1);
    hbc_initialize_trace_once();
    set_hb_errno(no_number);
    IsVEX = Hb_True;
  }
  ~AbsentPlatform() override {
    hb_terminate();
    IsVEX = Hb_False;
  }
};

TEST_F(AbsentPlatform, TheMonitorsAreNotOpenedAsTheClientDoesNotStart) {
  EXPECT_EQ(Hb_Failure, hb_initialize_evmon_event_handlers());
  EXPECT_EQ(no_number, hb_get_errno());
  EXPECT_THAT(traced(), ElementsAre(std::pair(272U, info), std::pair(273U, errors), std::pair(276U, errors)));
  EXPECT_EQ(0U, scripted_cluster().times_asked("zu_evm_open"));
}

TEST_F(AbsentPlatform, WhatStartsTheClientFailsAsTheStartDoes) {
  Hb_Subscription_Group group = {};
  int* descriptors = nullptr;
  int count = 0;
  Hb_Node_Number node = 0;
  const std::function<Hb_Rc()> operations[] = {
      [] { return hb_init(); },
      [] { return hb_vex_msg_received_from(1); },
      [] { return hb_vex_delayed_daemon_shutdown(); },
      [&] { return hb_add_all_nodes_to_subscription_group(&group); },
      [&] { return hb_get_file_descriptor_array(&descriptors, &count); },
      [&] { return hb_get_my_node_number(&node); },
  };
  for (const auto& operation : operations) {
    platform_double().traces.clear();
    EXPECT_EQ(Hb_Failure, operation());
    EXPECT_EQ(no_number, hb_get_errno());
    EXPECT_THAT(platform_double().trace_ids(), testing::IsSupersetOf({272U, 273U, 276U}));
  }
}

TEST_F(AbsentPlatform, NoEventCanBeTaken) {
  int descriptors[] = {0, -1};
  Hb_Events events = 77;
  Hb_Name name = "before";
  auto group = std::make_unique<Hb_Group>();
  Hb_Seq_Num sequence = 5;
  EXPECT_EQ(Hb_Failure, hb_get_event_message(descriptors, nullptr, &events, name, group.get(), &sequence));
  EXPECT_EQ(HB_ENOPIPEHANDLER, hb_get_errno());
  EXPECT_EQ(90, hb_get_errno());
  EXPECT_THAT(traced(), ElementsAre(std::pair(250U, info), std::pair(245U, info), std::pair(251U, info)));
  EXPECT_EQ(77, events);
  EXPECT_STREQ("before", name);
}

TEST_F(AbsentPlatform, TheHandlerSetIsEmptyAndThatIsASuccess) {
  EXPECT_EQ(Hb_Success, VEX_create_global_event_handlers());
  EXPECT_EQ(nullptr, node_liveness_handler_p);
  EXPECT_EQ(nullptr, peer_GS_liveness_handler_p);
  EXPECT_EQ(nullptr, adapter_event_handler_p);
  EXPECT_EQ(nullptr, new_group_event_handler_p);
  EXPECT_EQ(nullptr, event_pipe_handler_p);
  EXPECT_EQ(nullptr, ip_change_handler_p);
  EXPECT_EQ(nullptr, node_list_handler_p);
  EXPECT_EQ(nullptr, site_config_handler_p);
  EXPECT_EQ(nullptr, split_merge_handler_p);
  EXPECT_EQ(nullptr, cluster_reconfig_handler_p);
  EXPECT_EQ(0, EVMONHandler::getNumbersOfFileDescriptors());
  const std::unique_ptr<int[]> descriptors(EVMONHandler::getFileDescriptors());
  ASSERT_NE(nullptr, descriptors);
  EXPECT_EQ(-1, descriptors[0]);
}

TEST_F(AbsentPlatform, CreatingTheHandlerSetLeavesNoDescriptorOpen) {
  const int descriptors = open_descriptors();
  EXPECT_EQ(Hb_Success, VEX_create_global_event_handlers());
  EXPECT_EQ(descriptors, open_descriptors());
  hb_delete_evmon_event_handlers_except_brix_monitor();
  hb_delete_evmon_event_handlers();
  hb_delete_evmon_event_handlers();
  EXPECT_EQ(descriptors, open_descriptors());
}

TEST_F(AbsentPlatform, AQueuedEventHasNobodyToWakeAndStays) {
  auto* event = VEX_new_event(Hb_Node_Group);
  ASSERT_NE(nullptr, event);
  VEX_add_event_at_end(event);
  EXPECT_EQ(Hb_Failure, VEX_write_to_event_pipe());
  EXPECT_EQ(90, hb_get_errno());
  EXPECT_THAT(traced(), ElementsAre(std::pair(245U, info)));
  EXPECT_EQ(Hb_False, VEX_event_queue_is_empty());
  EXPECT_EQ(event, VEX_get_event_from_head());
  delete event;
  EXPECT_EQ(Hb_Success, VEX_write_to_event_pipe());
}

// Building a table.

class AbsentServices : public AbsentPlatform {
 protected:
  AbsentServices() { platform_double().errno_after_trace = ENOTTY; }
};

TEST_F(AbsentServices, ATableIsNotBuiltAndNotTouched) {
  Hb_Configuration_Internal table;
  std::memset(static_cast<void*>(&table), 0x5A, sizeof table);
  Hb_Configuration_Internal before;
  std::memcpy(static_cast<void*>(&before), &table, sizeof table);
  errno = EXDEV;
  EXPECT_EQ(Hb_Failure, hb_vex_update_global_tbl(&table, nullptr, nullptr, nullptr));
  EXPECT_EQ(EXDEV, errno);
  EXPECT_EQ(63, hb_get_errno());
  EXPECT_EQ(0, std::memcmp(static_cast<const void*>(&before), &table, sizeof table));
}

TEST_F(AbsentServices, TheFailedBuildIsTracedWithTheCallItsResultAndErrno) {
  Hb_Configuration_Internal table = {};
  errno = EXDEV;
  EXPECT_EQ(Hb_Failure, hb_vex_update_global_tbl(&table, nullptr, nullptr, nullptr));
  ASSERT_THAT(traced(), ElementsAre(std::pair(36U, errors)));
  const Recorded_Trace& trace = platform_double().traces[0];
  EXPECT_EQ(Trace_Form::data, trace.form);
  ASSERT_EQ(4U, trace.blocks.size());
  EXPECT_EQ(26U, trace.blocks[0].size());
  EXPECT_EQ("zu_vex_get_cluster_info()", trace.block_text(0));
  EXPECT_EQ(10U, trace.blocks[1].size());
  EXPECT_EQ("(Default)", trace.block_text(1));
  EXPECT_EQ(minus_one, trace.block_value(2));
  EXPECT_EQ(static_cast<uint32_t>(EXDEV), trace.block_value(3));
}

TEST_F(AbsentServices, AFailedBuildSaysNothingWithErrorsOff) {
  platform_double().set_levels({0, 1, 1});
  Hb_Configuration_Internal table = {};
  EXPECT_EQ(Hb_Failure, hb_vex_update_global_tbl(&table, nullptr, nullptr, nullptr));
  EXPECT_EQ(63, hb_get_errno());
  EXPECT_THAT(traced(), IsEmpty());
}

TEST_F(AbsentServices, InterfacesAreNotMarked) {
  zu_vex_net_intf_info_t before = {};
  zu_vex_net_intf_info_t* list = &before;
  EXPECT_EQ(Hb_Failure, hb_vex_get_net_intf_info_and_mark_alias(&list, nullptr));
  EXPECT_EQ(&before, list);
  ASSERT_THAT(traced(), ElementsAre(std::pair(277U, errors)));
  EXPECT_THAT(platform_double().traces[0].values, ElementsAre(minus_one));
  platform_double().set_levels({0, 1, 1});
  platform_double().traces.clear();
  EXPECT_EQ(Hb_Failure, hb_vex_get_net_intf_info_and_mark_alias(&list, nullptr));
  EXPECT_THAT(traced(), IsEmpty());
}

TEST_F(AbsentServices, NewInterfacesAreNotToBeHad) {
  zu_vex_net_intf_info_t before = {};
  zu_vex_net_intf_info_t* list = &before;
  EXPECT_EQ(Hb_Failure, hb_get_new_net_intf_info(&list));
  EXPECT_EQ(&before, list);
  EXPECT_EQ(nullptr, global_vex_net_intf_tbl);
  ASSERT_THAT(platform_double().trace_ids(), ElementsAre(277U, 271U));
  const Recorded_Trace& trace = platform_double().traces[1];
  EXPECT_EQ("hb_get_new_net_intf_info", trace.block_text(0));
  EXPECT_EQ("hb_vex_get_net_intf_info_and_mark_alias", trace.block_text(1));
  EXPECT_EQ(3U, trace.block_value(2));
}

TEST_F(AbsentServices, BootAddressesAreNotRefreshed) {
  zu_vex_net_intf_info_t before = {};
  zu_vex_net_intf_info_t* list = &before;
  global_boot_ip_list = &before;
  errno = EXDEV;
  hb_refresh_boot_ip_addrs(&list);
  EXPECT_EQ(&before, list);
  EXPECT_EQ(&before, global_boot_ip_list);
  global_boot_ip_list = nullptr;
  ASSERT_THAT(platform_double().trace_ids(), ElementsAre(282U, 271U, 283U));
  EXPECT_EQ(info, platform_double().traces[0].category);
  const Recorded_Trace& trace = platform_double().traces[1];
  EXPECT_EQ("hb_refresh_boot_ip_addrs", trace.block_text(0));
  EXPECT_EQ("zu_vex_get_boot_addrs", trace.block_text(1));
  EXPECT_EQ(minus_one, trace.block_value(2));
}

TEST_F(AbsentServices, RefreshingAndTellingTellsNothing) {
  hb_refresh_boot_ip_addrs_and_update_events();
  const std::vector<uint32_t> ids = platform_double().trace_ids();
  ASSERT_FALSE(ids.empty());
  EXPECT_EQ(280U, ids.front());
  EXPECT_EQ(281U, ids.back());
  EXPECT_THAT(ids, testing::IsSupersetOf({282U, 271U, 283U}));
  EXPECT_EQ(Hb_True, VEX_event_queue_is_empty());
}

// One monitor of each kind, which cannot be opened and cannot be read.

struct Absent_Monitor {
  const char* name;
  std::unique_ptr<EVMONHandler> (*make)(char* path);
  std::vector<uint32_t> records;  // of a dispatch
  uint32_t failure;               // the record among them that tells of the read
  bool errno_is_second;           // else its values are the result, the descriptor and errno

  friend void PrintTo(const Absent_Monitor& monitor, std::ostream* out) { *out << monitor.name; }
};

template <typename Handler>
std::unique_ptr<EVMONHandler> make(char* path) {
  return std::make_unique<Handler>(path);
}

class AbsentMonitor : public testing::TestWithParam<Absent_Monitor> {
 protected:
  AbsentMonitor() {
    reset_platform(1);
    hbc_initialize_trace_once();
    set_hb_errno(no_number);
    global_config_tbl.Hb_max_nodes = 0;
    std::memset(group.get(), 0x5A, sizeof *group);
    std::memcpy(before.get(), group.get(), sizeof *group);
  }

  Hb_Rc dispatch(EVMONHandler& monitor) {
    platform_double().traces.clear();
    platform_double().errno_after_trace = ENOTTY;
    errno = EXDEV;
    const Hb_Rc rc = monitor.handler(&events, name, group.get(), &sequence);
    EXPECT_EQ(EXDEV, errno);
    platform_double().errno_after_trace = 0;
    return rc;
  }

  Hb_Events events = 77;
  Hb_Name name = "before";
  Hb_Seq_Num sequence = 5;
  std::unique_ptr<Hb_Group> group{new Hb_Group};
  std::unique_ptr<Hb_Group> before{new Hb_Group};
};

TEST_P(AbsentMonitor, IsNotOpenedAndNotRegistered) {
  char path[] = "/monitor";
  errno = EXDEV;
  const auto monitor = GetParam().make(path);
  EXPECT_EQ(-1, monitor->getFileDescriptor());
  EXPECT_EQ(-1, monitor->getVEXEVMOpenRCInConstructor());
  EXPECT_EQ(EXDEV, monitor->getOpenFileError());
  EXPECT_EQ(0, EVMONHandler::getNumbersOfFileDescriptors());
  ASSERT_THAT(traced(), ElementsAre(std::pair(8U, errors)));
  const Recorded_Trace& trace = platform_double().traces[0];
  EXPECT_EQ("/monitor", trace.block_text(0));
  EXPECT_EQ(minus_one, trace.block_value(1));
  EXPECT_EQ(static_cast<uint32_t>(EXDEV), trace.block_value(2));
}

TEST_P(AbsentMonitor, CannotBeReadAndLeavesTheOutputsAlone) {
  char path[] = "/monitor";
  const auto monitor = GetParam().make(path);
  EXPECT_EQ(Hb_Failure, dispatch(*monitor));
  EXPECT_EQ(no_number, hb_get_errno());
  EXPECT_EQ(77, events);
  EXPECT_STREQ("before", name);
  EXPECT_EQ(5U, sequence);
  EXPECT_EQ(0, std::memcmp(static_cast<const void*>(before.get()), group.get(), sizeof *group));
  EXPECT_EQ(Hb_True, VEX_event_queue_is_empty());
}

TEST_P(AbsentMonitor, TracesTheFailedRead) {
  char path[] = "/monitor";
  const auto monitor = GetParam().make(path);
  dispatch(*monitor);
  EXPECT_EQ(GetParam().records, platform_double().trace_ids());
  const std::vector<Recorded_Trace> failures = platform_double().traces_of(GetParam().failure);
  ASSERT_EQ(1U, failures.size());
  const auto error = static_cast<uint32_t>(EXDEV);
  if (GetParam().errno_is_second) {
    EXPECT_THAT(numbers_of(failures[0]), ElementsAre(minus_one, error, minus_one));
  } else {
    EXPECT_THAT(numbers_of(failures[0]), ElementsAre(minus_one, minus_one, error));
  }
}

TEST_P(AbsentMonitor, TracesNothingWhenAllIsOff) {
  char path[] = "/monitor";
  const auto monitor = GetParam().make(path);
  platform_double().set_levels({0, 0, 0});
  EXPECT_EQ(Hb_Failure, dispatch(*monitor));
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(
    Kinds, AbsentMonitor,
    testing::Values(Absent_Monitor{"NodeLiveness", make<EVMONNodeLivenessHandler>, {231, 11, 284}, 11, true},
                    Absent_Monitor{"SplitMerge", make<EVMONSplitMergeEventHandler>, {254, 258, 255}, 258, false},
                    Absent_Monitor{"AdapterLiveness", make<EVMONAdapterEventHandler>, {221, 15, 222}, 15, false},
                    Absent_Monitor{"IPChange", make<EVMONIPChangeEventHandler>, {225, 95, 226}, 95, false},
                    Absent_Monitor{"NodeList", make<EVMONNodeListHandler>, {229, 116, 230}, 116, false},
                    Absent_Monitor{"PeerGroupServices", make<EVMONPeerGSLivenessHandler>, {13}, 13, false},
                    Absent_Monitor{"Reconfiguration", make<EVMONReconfigEventHandler>, {52}, 52, false},
                    Absent_Monitor{"RepositoryDisk", make<EVMONRepositoryDiskHandler>, {198}, 198, false},
                    Absent_Monitor{
                        "SiteConfiguration", make<EVMONSiteConfigEventHandler>, {219, 210, 220}, 210, false}),
    [](const auto& instance) { return instance.param.name; });

// A client of the daemon that would move to VEX mode.

class AbsentMigration : public RunningClient {
 protected:
  AbsentMigration() : RunningClient(small_cluster(), 1) {
    set_hb_errno(no_number);
    platform_double().traces.clear();
  }
  ~AbsentMigration() override { migrate_back(); }

  static int configured_nodes() {
    int count = -1;
    EXPECT_EQ(Hb_Success, hb_get_number_of_configured_nodes(&count));
    return count;
  }

  static void migrate_back() {
    hb_migrate_to_vex_abort();
    hb_terminate();
    IsVEX = Hb_False;
  }
};

TEST_F(AbsentMigration, CannotBePrepared) {
  EXPECT_EQ(Hb_Failure, hb_migrate_to_vex_prep());
  EXPECT_EQ(63, hb_get_errno());
  EXPECT_EQ(Hb_False, IsVEX);
  ASSERT_EQ(1U, platform_double().traces_of(99).size());
  EXPECT_EQ(errors, platform_double().traces_of(99)[0].category);
  EXPECT_THAT(platform_double().traces_of(99)[0].values, ElementsAre(3U));
  EXPECT_EQ(1U, platform_double().traces_of(36).size());
  Hb_Node_Number node = -1;
  EXPECT_EQ(Hb_Success, hb_get_my_node_number(&node));
  EXPECT_EQ(0, node);
  EXPECT_EQ(3, configured_nodes());
}

TEST_F(AbsentMigration, IsAbortedWithoutATrace) {
  hb_migrate_to_vex_prep();
  platform_double().traces.clear();
  EXPECT_EQ(Hb_Success, hb_migrate_to_vex_abort());
  EXPECT_THAT(platform_double().traces, IsEmpty());
  EXPECT_EQ(Hb_False, IsVEX);
}

TEST_F(AbsentMigration, CommittedAllTheSameKeepsTheDaemonsConfigurationAndNoDescriptor) {
  EXPECT_EQ(Hb_Success, hb_migrate_to_vex_commit());
  EXPECT_EQ(91, hb_get_errno());
  EXPECT_EQ(Hb_True, IsVEX);
  ASSERT_EQ(1U, platform_double().traces_of(246).size());
  EXPECT_EQ(info, platform_double().traces_of(246)[0].category);
  EXPECT_EQ(3, configured_nodes());
  int* descriptors = nullptr;
  int count = 7;
  EXPECT_EQ(Hb_Success, hb_get_file_descriptor_array(&descriptors, &count));
  EXPECT_EQ(0, count);
  ASSERT_NE(nullptr, descriptors);
  EXPECT_EQ(-1, descriptors[0]);
  hb_free_file_descriptor_array(descriptors);
}

TEST_F(AbsentMigration, ACommittedClientHasNobodyToAnswerASubscription) {
  hb_migrate_to_vex_commit();
  Hb_Subscription_Group group = {};
  char name[] = "nodes";
  ASSERT_EQ(Hb_Success, hb_add_all_nodes_to_subscription_group(&group));
  EXPECT_EQ(Hb_Failure, hb_subscribe(name, &group, HB_EVENT_DEATH));
  EXPECT_EQ(HB_ENOGROUPHANDLER, hb_get_errno());
  EXPECT_EQ(1U, platform_double().traces_of(320).size());
}

TEST_F(AbsentMigration, ACommittedClientIsNotToldOfADaemon) {
  hb_migrate_to_vex_commit();
  platform_double().traces.clear();
  EXPECT_EQ(Hb_Failure, hb_vex_msg_received_from(1));
  EXPECT_EQ(90, hb_get_errno());
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(92U, 245U));
  EXPECT_THAT(platform_double().traces[0].values, ElementsAre(1U));
}

TEST_F(AbsentMigration, TheAdapterMonitorEmptiesTheListOfTheConfigurationEvenThen) {
  char path[] = "/monitor";
  EVMONAdapterEventHandler monitor(path);
  Hb_Events events = 77;
  Hb_Name name = "before";
  Hb_Seq_Num sequence = 5;
  auto group = std::make_unique<Hb_Group>();
  std::memset(group.get(), 0x5A, sizeof *group);
  EXPECT_EQ(Hb_Failure, monitor.handler(&events, name, group.get(), &sequence));
  const auto& list = group->Hb_membership_grp_union.Hb_adapter_membership_grp.Hb_adapter_list;
  for (int slot = 0; slot < 6; ++slot) {
    EXPECT_EQ(-1, list[slot]) << slot;
  }
  EXPECT_EQ(0x5A5A5A5A, list[6]);
  EXPECT_EQ(77, events);
  EXPECT_STREQ("before", name);
  EXPECT_EQ(5U, sequence);
}

}  // namespace
}  // namespace hb_test
