// The set of handlers: made whole or not at all, and deleted in its order.
#include <fcntl.h>

#include <algorithm>

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
#include "handler_state.h"
#include "support/allocation_faults.h"
#include "support/process_state.h"
#include "support/system_calls.h"

namespace {

// The pipe of which the making fails, counted down; 0 for none.
int pipe_to_fail = 0;

}  // namespace

extern "C" {
int __real_pipe2(int* ends, int flags);
int __wrap_pipe2(int* ends, int flags);
int __wrap_pipe2(int* ends, int flags) {
  if (pipe_to_fail > 0 && --pipe_to_fail == 0) {
    errno = EMFILE;
    return -1;
  }
  return __real_pipe2(ends, flags);
}
}

namespace hb_test {
namespace {

using testing::Contains;
using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Not;

constexpr size_t monitors = 8;

std::vector<EVMONHandler*> handlers() {
  return {node_liveness_handler_p, adapter_event_handler_p,   new_group_event_handler_p, cluster_reconfig_handler_p,
          event_pipe_handler_p,    ip_change_handler_p,       node_list_handler_p,       site_config_handler_p,
          split_merge_handler_p,   peer_GS_liveness_handler_p};
}

class HandlerSet : public HandlerState {
 protected:
  // A cluster with monitors; and the registry has its slots already, as it keeps them for ever.
  void SetUp() override {
    scripted_cluster().appear();
    ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
    VEX_delete_global_event_handlers();
    scripted_cluster().reset();
    scripted_cluster().appear();
    descriptors = open_descriptors();
    set_hb_errno(0);
    start_tracing();
  }

  void expect_nothing() const {
    EXPECT_THAT(handlers(), Each(nullptr));
    EXPECT_EQ(evmon_cluster_name, nullptr);
    EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 0);
    EXPECT_THAT(scripted_cluster().open_monitors(), IsEmpty());
    // The scripted cluster keeps its ends of the monitors that were opened.
    const auto opened = static_cast<int>(scripted_cluster().times_asked("zu_evm_open")) - refused;
    EXPECT_EQ(open_descriptors(), descriptors + opened);
    EXPECT_EQ(Scripted_Cluster::outstanding(), 0U);
  }

  int descriptors = 0;
  int refused = 0;  // monitors that could not be opened
};

TEST_F(HandlerSet, IsMadeWholeWhereTheMonitorsAre) {
  EXPECT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  EXPECT_THAT(handlers(), Not(Contains(nullptr)));
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 10);
  EXPECT_EQ(scripted_cluster().open_monitors().size(), monitors);
  EXPECT_STREQ(evmon_cluster_name, "scripted");
  EXPECT_EQ(hb_get_errno(), 0);
  EXPECT_THAT(trace_lines(), Not(Contains("Errors 8")));
  EXPECT_EQ(Scripted_Cluster::outstanding(), 0U);
  EXPECT_EQ(Scripted_Cluster::wrong_releases(), 0U);
}

TEST_F(HandlerSet, OpensEachMonitorOnceUnderAPathOfItsOwn) {
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  const Scripted_Cluster& cluster = scripted_cluster();
  EXPECT_EQ(cluster.times_asked("zu_evm_open"), monitors);
  EXPECT_EQ(cluster.path_of(node_liveness_handler_p->getFileDescriptor()), "/var/ha/evmon/node_liveness");
  EXPECT_EQ(cluster.path_of(adapter_event_handler_p->getFileDescriptor()), "/var/ha/evmon/adapter_liveness");
  EXPECT_EQ(cluster.path_of(ip_change_handler_p->getFileDescriptor()), "/var/ha/evmon/ip_change");
  EXPECT_EQ(cluster.path_of(node_list_handler_p->getFileDescriptor()), "/var/ha/evmon/node_list");
  EXPECT_EQ(cluster.path_of(site_config_handler_p->getFileDescriptor()), "/var/ha/evmon/site_config");
  EXPECT_EQ(cluster.path_of(split_merge_handler_p->getFileDescriptor()), "/var/ha/evmon/split_merge");
  EXPECT_EQ(cluster.path_of(cluster_reconfig_handler_p->getFileDescriptor()), "/var/ha/evmon/cluster_reconfig");
  EXPECT_EQ(cluster.path_of(peer_GS_liveness_handler_p->getFileDescriptor()), "/var/ha/evmon/peer_gs_liveness");
}

TEST_F(HandlerSet, ArmsTheMonitorsOfAdaptersAndAddresses) {
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  for (const Platform_Question& question : scripted_cluster().asked) {
    const bool is_armed =
        question.path == "/var/ha/evmon/adapter_liveness" || question.path == "/var/ha/evmon/ip_change";
    EXPECT_STREQ(question.init_string.c_str(), is_armed ? "BUF_SIZE=1048576;CHANGED=YES;CLUSTER=YES\n" : "");
  }
}

TEST_F(HandlerSet, ListsItsDescriptorsForTheCaller) {
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  IsVEX = Hb_True;
  client_initialized = Hb_True;
  int* listed = nullptr;
  int count = 0;
  ASSERT_EQ(hb_get_file_descriptor_array(&listed, &count), Hb_Success);
  EXPECT_EQ(count, 10);
  for (EVMONHandler* handler : handlers()) {
    EXPECT_EQ(std::count(listed, listed + count, handler->getFileDescriptor()), 1);
  }
  hb_free_file_descriptor_array(listed);
}

TEST_F(HandlerSet, IsEmptyWhereThereAreNoMonitors) {
  scripted_cluster().reset();
  start_tracing();
  refused = 1;
  EXPECT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  expect_nothing();
  EXPECT_THAT(trace_lines(), IsEmpty());
  EXPECT_EQ(hb_get_errno(), 0);
  EXPECT_EQ(scripted_cluster().times_asked("zu_evm_open"), 1U);
}

TEST_F(HandlerSet, IsEmptyAlsoWhereOnlyTheServicesAre) {
  scripted_cluster().has_monitors = false;
  refused = 1;
  EXPECT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  expect_nothing();
}

// What a monitor traces when it is made outside the set is traced again afterwards.
TEST_F(HandlerSet, TracesAMonitorThatIsMissingWhenItIsOpenedAlone) {
  scripted_cluster().reset();
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  char path[] = "/monitor";
  const EVMONNodeLivenessHandler handler(path);
  EXPECT_THAT(trace_lines(), ElementsAre("Errors 8"));
}

TEST_F(HandlerSet, GoesWhenTheFirstMonitorCannotBeOpened) {
  scripted_cluster().open_results = {{-2, EACCES}};
  refused = 1;
  EXPECT_EQ(VEX_create_global_event_handlers(), Hb_Failure);
  expect_nothing();
  EXPECT_THAT(trace_lines(), Contains("Errors 8"));
}

class HandlerSetWithoutAMonitor : public HandlerSet, public testing::WithParamInterface<size_t> {};

TEST_P(HandlerSetWithoutAMonitor, GoesWhole) {
  for (const int result : {-1, -2, 5}) {
    for (size_t monitor = 1; monitor < GetParam(); ++monitor) {
      scripted_cluster().open_results.push_back(platform_as_usual);
    }
    scripted_cluster().open_results.push_back({result, EACCES});
    ++refused;
    start_tracing();
    EXPECT_EQ(VEX_create_global_event_handlers(), Hb_Failure) << result;
    EXPECT_THAT(scripted_cluster().open_results, IsEmpty());
    expect_nothing();
    ASSERT_EQ(platform_double().traces_of(8).size(), 1U);
    EXPECT_EQ(platform_double().traces_of(8)[0].block_value(1), static_cast<uint32_t>(result));
    EXPECT_EQ(platform_double().traces_of(8)[0].block_value(2), static_cast<uint32_t>(EACCES));
  }
}

INSTANTIATE_TEST_SUITE_P(EachButTheFirst, HandlerSetWithoutAMonitor, testing::Range(size_t{2}, monitors + 1));

TEST_F(HandlerSet, GoesWhenAPipeCannotBeMade) {
  for (const int pipe : {1, 2}) {
    pipe_to_fail = pipe;
    EXPECT_EQ(VEX_create_global_event_handlers(), Hb_Failure);
    EXPECT_EQ(pipe_to_fail, 0);
    expect_nothing();
  }
}

TEST_F(HandlerSet, GoesWheneverMemoryRunsOut) {
  set_levels(0);
  scripted_cluster().appear();
  bool has_failed = true;
  size_t nth = 0;
  for (; has_failed; ++nth) {
    const long live = live_allocations();
    {
      const AllocationFailure failure(nth + 1);
      const Hb_Rc rc = VEX_create_global_event_handlers();
      has_failed = failure.happened();
      EXPECT_EQ(rc, has_failed ? Hb_Failure : Hb_Success) << nth;
    }
    if (has_failed) {
      ASSERT_EQ(live_allocations(), live) << nth;
      expect_nothing();
    }
  }
  // Each handler and each path, at least, and the name.
  EXPECT_GE(nth, 2 * monitors + 2 + 1);
}

TEST_F(HandlerSet, KeepsWhatWasMadeUntilTheWholeIsDeleted) {
  scripted_cluster().open_results = {platform_as_usual, {-2, EACCES}};
  EXPECT_EQ(VEX_create_global_event_handlers_internal(), Hb_Failure);
  EXPECT_NE(node_liveness_handler_p, nullptr);
  EXPECT_EQ(adapter_event_handler_p, nullptr);
}

TEST_F(HandlerSet, KeepsItsHandlersWhenItIsMadeAgain) {
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  const std::vector<EVMONHandler*> made = handlers();
  const char* name = evmon_cluster_name;
  EXPECT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  EXPECT_EQ(handlers(), made);
  EXPECT_EQ(evmon_cluster_name, name);
  EXPECT_EQ(scripted_cluster().times_asked("zu_evm_open"), monitors);
  EXPECT_EQ(EVMONHandler::getNumbersOfFileDescriptors(), 10);
}

TEST_F(HandlerSet, HasNoNameWhenTheClusterTellsNone) {
  platform_double().cluster_info.answers = {{-3, nullptr, EIO}, {0, nullptr}};
  EXPECT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  EXPECT_EQ(evmon_cluster_name, nullptr);
  EXPECT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  EXPECT_EQ(evmon_cluster_name, nullptr);
  scripted_cluster().cluster_name.reset();
  EXPECT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  EXPECT_EQ(evmon_cluster_name, nullptr);
  EXPECT_THAT(handlers(), Not(Contains(nullptr)));
  EXPECT_EQ(Scripted_Cluster::outstanding(), 0U);
}

TEST_F(HandlerSet, HasPipesThatCloseInOtherProgramsAndWaitForNobodyToRead) {
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  const int event_read = event_pipe_handler_p->getFileDescriptor();
  const int event_write = event_pipe_handler_p->getWriteFd();
  const int group_read = new_group_event_handler_p->getFileDescriptor();
  const int group_write = new_group_event_handler_p->getWriteFd();
  for (const int end : {event_read, event_write, group_read, group_write}) {
    EXPECT_EQ(fcntl(end, F_GETFD), FD_CLOEXEC);
  }
  for (const int end : {event_read, event_write, group_write}) {
    EXPECT_NE(fcntl(end, F_GETFL) & O_NONBLOCK, 0);
  }
  EXPECT_EQ(fcntl(group_read, F_GETFL) & O_NONBLOCK, 0);
  ASSERT_EQ(write(event_write, "a", 1), 1);
  ASSERT_EQ(write(group_write, "bc", 2), 2);
  EXPECT_EQ(waiting_bytes(event_read), 1);
  EXPECT_EQ(waiting_bytes(group_read), 2);
}

TEST_F(HandlerSet, RefusesASubscriptionWhenTheNewGroupPipeIsFull) {
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  while (write(new_group_event_handler_p->getWriteFd(), "\x01", 1) == 1) {
  }
  IsVEX = Hb_True;
  client_initialized = Hb_True;
  auto subscription = std::make_unique<Hb_Subscription_Group>();
  ASSERT_EQ(hb_add_all_nodes_to_subscription_group(subscription.get()), Hb_Success);
  char name[] = "nodes";
  EXPECT_EQ(hb_subscribe(name, subscription.get(), HB_EVENT_NEW_GROUP), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 59);
}

TEST_F(HandlerSet, IsDeletedInItsOrder) {
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  std::vector<intptr_t> expected;
  for (EVMONHandler* handler : handlers()) {
    if (handler == new_group_event_handler_p) {
      expected.push_back(new_group_event_handler_p->getWriteFd());
    } else if (handler == event_pipe_handler_p) {
      expected.push_back(event_pipe_handler_p->getWriteFd());
    }
    expected.push_back(handler->getFileDescriptor());
  }
  std::vector<intptr_t> closed;
  {
    SystemCalls calls;
    VEX_delete_global_event_handlers();
    for (const SystemCall& call : calls.of("close")) {
      closed.push_back(call.arguments[0]);
    }
  }
  EXPECT_EQ(closed, expected);
  expect_nothing();
}

// What the cluster was called when the first monitor went.
const char* name_at_first_deletion = nullptr;

class Watching_Handler : public EVMONNodeLivenessHandler {
 public:
  using EVMONNodeLivenessHandler::EVMONNodeLivenessHandler;
  ~Watching_Handler() override { name_at_first_deletion = evmon_cluster_name; }
};

TEST_F(HandlerSet, ForgetsTheNameOfTheClusterBeforeItsFirstHandlerGoes) {
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  char path[] = "/monitor";
  delete node_liveness_handler_p;
  node_liveness_handler_p = new Watching_Handler(path);
  name_at_first_deletion = "not deleted";
  VEX_delete_global_event_handlers();
  EXPECT_EQ(name_at_first_deletion, nullptr);
}

// Where one handler was kept, a platform that has none any more is no platform without monitors.
TEST_F(HandlerSet, GoesWhenTheMonitorsAreAbsentButOneWasKept) {
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  hb_delete_evmon_event_handlers_except_brix_monitor();
  ASSERT_NE(peer_GS_liveness_handler_p, nullptr);
  scripted_cluster().has_monitors = false;
  refused = 1;
  start_tracing();
  EXPECT_EQ(VEX_create_global_event_handlers(), Hb_Failure);
  expect_nothing();
  ASSERT_EQ(platform_double().traces_of(8).size(), 1U);
  EXPECT_EQ(platform_double().traces_of(8)[0].block_value(1), 0xFFFFFFFFU);
}

// A pipe, or a monitor that could not be opened, is no sign that the platform has monitors.
TEST_F(HandlerSet, OfPipesAndUnopenedMonitorsStaysWhereThereAreNoMonitors) {
  scripted_cluster().reset();
  char path[] = "/monitor";
  Ends ends = new_pipe();
  event_pipe_handler_p = new EVMONEventPipeHandler(ends.fds, nullptr);
  node_liveness_handler_p = new EVMONNodeLivenessHandler(path);
  peer_GS_liveness_handler_p = new EVMONPeerGSLivenessHandler(path);
  const std::vector<EVMONHandler*> before = handlers();
  set_hb_errno(12345);  // a number that nothing sets
  start_tracing();
  EXPECT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  EXPECT_EQ(handlers(), before);
  EXPECT_THAT(trace_lines(), IsEmpty());
  EXPECT_EQ(hb_get_errno(), 12345);
}

TEST_F(HandlerSet, IsDeletedTwiceWithoutHarm) {
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  hb_delete_evmon_event_handlers();
  expect_nothing();
  hb_delete_evmon_event_handlers();
  hb_delete_evmon_event_handlers_except_brix_monitor();
  expect_nothing();
  EXPECT_EQ(hb_get_errno(), 0);
}

TEST_F(HandlerSet, MayKeepTheMonitorOfThePeersDaemon) {
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  EVMONPeerGSLivenessHandler* peer = peer_GS_liveness_handler_p;
  hb_delete_evmon_event_handlers_except_brix_monitor();
  EXPECT_EQ(peer_GS_liveness_handler_p, peer);
  peer_GS_liveness_handler_p = nullptr;
  EXPECT_THAT(handlers(), Each(nullptr));
  peer_GS_liveness_handler_p = peer;
  EXPECT_EQ(evmon_cluster_name, nullptr);
  const std::unique_ptr<int[]> listed(EVMONHandler::getFileDescriptors());
  EXPECT_EQ(listed[0], peer->getFileDescriptor());
  EXPECT_EQ(listed[1], -1);
  hb_delete_evmon_event_handlers_except_brix_monitor();
  EXPECT_EQ(peer_GS_liveness_handler_p, peer);
}

TEST_F(HandlerSet, IsCompletedAroundTheMonitorThatWasKept) {
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  EVMONPeerGSLivenessHandler* peer = peer_GS_liveness_handler_p;
  hb_delete_evmon_event_handlers_except_brix_monitor();
  EXPECT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  EXPECT_EQ(peer_GS_liveness_handler_p, peer);
  EXPECT_THAT(handlers(), Not(Contains(nullptr)));
  EXPECT_EQ(scripted_cluster().times_asked("zu_evm_open"), 2 * monitors - 1);
}

TEST_F(HandlerSet, IsMadeForAClientThatRuns) {
  IsVEX = Hb_True;
  client_initialized = Hb_True;
  EXPECT_EQ(hb_initialize_evmon_event_handlers(), Hb_Success);
  EXPECT_THAT(handlers(), Not(Contains(nullptr)));
}

class StartedHandlerSet : public HandlerSet {
 protected:
  void SetUp() override {
    HandlerSet::SetUp();
    IsVEX = Hb_True;
    const Scripted_Interface boot = {0, "en0", scripted_address(0, 0, 1), ZU_VEX_INTF_STATUS_UP, 0};
    const Scripted_Interface alias = {0, "en0", scripted_address(0, 0, 9), ZU_VEX_INTF_STATUS_UP, 0};
    scripted_cluster().nodes = {{0}};
    scripted_cluster().boot_addresses = {boot};
    scripted_cluster().interfaces = {boot, alias};
  }
  // The lists of the last start stay; they are the platform's.
  void TearDown() override {
    hb_release_global_lists(hb_take_global_lists());
    EXPECT_EQ(Scripted_Cluster::outstanding(), 0U);
    EXPECT_EQ(Scripted_Cluster::wrong_releases(), 0U);
  }

  // A start forgets its list of interfaces without aliases, by the interface's definition.
  static Hb_Rc start_with(Hb_Rc (*function)()) {
    const LeakAllowed forgotten_list;
    return function();
  }

  static constexpr long forgotten_at_a_start = 2;      // the record of an interface, and its name
  static constexpr size_t records_of_a_start = 1 + 2;  // boot addresses and interfaces
};

TEST_F(StartedHandlerSet, StartsTheClientFirst) {
  EXPECT_EQ(start_with(hb_initialize_evmon_event_handlers), Hb_Success);
  EXPECT_EQ(client_initialized, Hb_True);
  EXPECT_THAT(handlers(), Not(Contains(nullptr)));
  EXPECT_EQ(global_config_tbl.Hb_num_nodes, 1);
  EXPECT_EQ(global_config_tbl.Hb_num_adapters, 1);
  EXPECT_EQ(Scripted_Cluster::outstanding(), records_of_a_start);
  hb_terminate();
  EXPECT_THAT(handlers(), Each(nullptr));
  EXPECT_EQ(evmon_cluster_name, nullptr);
}

TEST_F(StartedHandlerSet, GivesTheListsOfTheLastStartBackWhenTheClientStartsAgain) {
  for (int start = 0; start < 3; ++start) {
    IsVEX = Hb_True;
    EXPECT_EQ(start_with(hb_initialize_evmon_event_handlers), Hb_Success);
    EXPECT_EQ(Scripted_Cluster::outstanding(), records_of_a_start) << start;
    hb_terminate();
    EXPECT_EQ(Scripted_Cluster::outstanding(), records_of_a_start) << start;
  }
}

// Nobody takes the event behind it any more.
TEST_F(StartedHandlerSet, DropsATableThatWaitsWhenTheClientStops) {
  ASSERT_EQ(start_with(hb_initialize_evmon_event_handlers), Hb_Success);
  ASSERT_EQ(hb_vex_update_global_tbl(&global_config_tbl_new, nullptr, nullptr, nullptr), Hb_Success);
  ASSERT_NE(global_config_tbl_new.node_list, nullptr);
  hb_terminate();
  EXPECT_EQ(global_config_tbl_new.node_list, nullptr);
  EXPECT_EQ(global_config_tbl_new.Hb_max_nodes, 0);
}

TEST_F(StartedHandlerSet, LeavesTheTableThatIsBuiltNextToAStart) {
  Hb_Node_config_state node = {};
  global_config_tbl_new.node_list = &node;
  global_config_tbl_new.Hb_num_nodes = 1;
  EXPECT_EQ(start_with(hb_init), Hb_Success);
  EXPECT_EQ(global_config_tbl_new.node_list, &node);
  EXPECT_EQ(global_config_tbl_new.Hb_num_nodes, 1);
  global_config_tbl_new = {};
  hb_terminate();
}

// A refresh puts copies in the place of the platform's interfaces.
TEST_F(StartedHandlerSet, GivesTheCopiesOfARefreshBackWhenTheClientStartsAgain) {
  platform_double().set_levels({0, 0, 0});
  ASSERT_EQ(start_with(hb_init), Hb_Success);
  hb_terminate();
  const long live = live_allocations();
  IsVEX = Hb_True;
  ASSERT_EQ(start_with(hb_init), Hb_Success);
  hb_refresh_boot_ip_addrs_and_update_events();
  EXPECT_EQ(Scripted_Cluster::outstanding(), 1U);
  hb_terminate();
  IsVEX = Hb_True;
  ASSERT_EQ(start_with(hb_init), Hb_Success);
  EXPECT_EQ(Scripted_Cluster::outstanding(), records_of_a_start);
  hb_terminate();
  EXPECT_EQ(live_allocations(), live + 2 * forgotten_at_a_start);
}

// What they held is lost, by the interface's definition: the scripted cluster still counts it.
TEST_F(StartedHandlerSet, DropsTheListsOfTheLastStartWhenTheNextOneFails) {
  ASSERT_EQ(start_with(hb_init), Hb_Success);
  hb_terminate();
  zu_vex_net_intf_info_t* boot = global_boot_ip_list;
  zu_vex_net_intf_info_t* interfaces = global_vex_net_intf_tbl;
  IsVEX = Hb_True;
  scripted_cluster().has_services = false;
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(global_boot_ip_list, nullptr);
  EXPECT_EQ(global_vex_net_intf_tbl, nullptr);
  EXPECT_EQ(Scripted_Cluster::outstanding(), records_of_a_start);
  zu_vex_free_net_intf_info(boot);
  zu_vex_free_net_intf_info(interfaces);
}

TEST_F(HandlerSet, IsNotTouchedWhenTheClientDoesNotStart) {
  ASSERT_EQ(VEX_create_global_event_handlers(), Hb_Success);
  const std::vector<EVMONHandler*> made = handlers();
  scripted_cluster().has_services = false;
  IsVEX = Hb_True;
  EXPECT_EQ(hb_initialize_evmon_event_handlers(), Hb_Failure);
  EXPECT_EQ(handlers(), made);
  VEX_delete_global_event_handlers();
  EXPECT_EQ(hb_initialize_evmon_event_handlers(), Hb_Failure);
  expect_nothing();
}

}  // namespace
}  // namespace hb_test
