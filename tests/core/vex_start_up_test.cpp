// Starting in VEX mode, without the platform's cluster services and with parts of them.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <pthread.h>

#include <deque>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "VEX_HBC_trace.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/start_up.h"
#include "platform_doubles.h"
#include "support/running_client.h"
#include "support/system_calls.h"

namespace {

// The steps behind the boot-address query, scripted where a test fills the results.
struct Table_Steps {
  std::function<void()> at_boot_addresses;
  std::deque<Hb_Rc> mark_alias_results;
  std::deque<Hb_Rc> filter_results;
  std::deque<Hb_Rc> table_results;
  zu_vex_net_intf_info_t* marked = nullptr;    // what the first step puts into the interface table
  zu_vex_net_intf_info_t* filtered = nullptr;  // what the second step puts into its destination

  zu_vex_net_intf_info_t** mark_alias_list = nullptr;
  zu_vex_net_intf_info_t* mark_alias_boot_list = nullptr;
  zu_vex_net_intf_info_t** filter_destination = nullptr;
  zu_vex_net_intf_info_t* filter_source = nullptr;
  uint64_t filter_flags = 0;
  Hb_Boolean filter_negate = Hb_False;
  Hb_Configuration_Internal* built_table = nullptr;
  bool built_with_event = false;
  bool built_with_source = false;
  zu_vex_net_intf_info_t* built_from = nullptr;
};

Table_Steps steps;

Hb_Rc take(std::deque<Hb_Rc>& results) {
  const Hb_Rc rc = results.front();
  results.pop_front();
  return rc;
}

}  // namespace

extern "C" {
int __real_zu_vex_get_boot_addrs(zu_vex_net_intf_info_t** list);
int __wrap_zu_vex_get_boot_addrs(zu_vex_net_intf_info_t** list);
int __wrap_zu_vex_get_boot_addrs(zu_vex_net_intf_info_t** list) {
  if (steps.at_boot_addresses) {
    steps.at_boot_addresses();
  }
  return __real_zu_vex_get_boot_addrs(list);
}

#define HB_MARK_ALIAS(prefix) prefix##_Z39hb_vex_get_net_intf_info_and_mark_aliasPP20zu_vex_net_intf_infoS0_
Hb_Rc HB_MARK_ALIAS(__real_)(zu_vex_net_intf_info_t** list, zu_vex_net_intf_info_t* boot_list);
Hb_Rc HB_MARK_ALIAS(__wrap_)(zu_vex_net_intf_info_t** list, zu_vex_net_intf_info_t* boot_list);
Hb_Rc HB_MARK_ALIAS(__wrap_)(zu_vex_net_intf_info_t** list, zu_vex_net_intf_info_t* boot_list) {
  steps.mark_alias_list = list;
  steps.mark_alias_boot_list = boot_list;
  if (steps.mark_alias_results.empty()) {
    return HB_MARK_ALIAS(__real_)(list, boot_list);
  }
  *list = steps.marked;
  return take(steps.mark_alias_results);
}

#define HB_FILTER(prefix) prefix##_Z31hb_copy_net_intf_filter_by_flagPP20zu_vex_net_intf_infoS0_m10Hb_Boolean
Hb_Rc HB_FILTER(__real_)(zu_vex_net_intf_info_t** to, zu_vex_net_intf_info_t* from, uint64_t flags, Hb_Boolean negate);
Hb_Rc HB_FILTER(__wrap_)(zu_vex_net_intf_info_t** to, zu_vex_net_intf_info_t* from, uint64_t flags, Hb_Boolean negate);
Hb_Rc HB_FILTER(__wrap_)(zu_vex_net_intf_info_t** to, zu_vex_net_intf_info_t* from, uint64_t flags, Hb_Boolean negate) {
  steps.filter_destination = to;
  steps.filter_source = from;
  steps.filter_flags = flags;
  steps.filter_negate = negate;
  if (steps.filter_results.empty()) {
    return HB_FILTER(__real_)(to, from, flags, negate);
  }
  *to = steps.filtered;
  return take(steps.filter_results);
}

#define HB_BUILD(prefix) \
  prefix##_Z24hb_vex_update_global_tblP25Hb_Configuration_InternalP23zu_evm_event_metadata_tS0_P20zu_vex_net_intf_info
Hb_Rc HB_BUILD(__real_)(Hb_Configuration_Internal* table, zu_evm_event_metadata_t* event,
                        Hb_Configuration_Internal* source, zu_vex_net_intf_info_t* interfaces);
Hb_Rc HB_BUILD(__wrap_)(Hb_Configuration_Internal* table, zu_evm_event_metadata_t* event,
                        Hb_Configuration_Internal* source, zu_vex_net_intf_info_t* interfaces);
Hb_Rc HB_BUILD(__wrap_)(Hb_Configuration_Internal* table, zu_evm_event_metadata_t* event,
                        Hb_Configuration_Internal* source, zu_vex_net_intf_info_t* interfaces) {
  steps.built_table = table;
  steps.built_with_event = event != nullptr;
  steps.built_with_source = source != nullptr;
  steps.built_from = interfaces;
  return steps.table_results.empty() ? HB_BUILD(__real_)(table, event, source, interfaces) : take(steps.table_results);
}
}

namespace hb_test {
namespace {

using testing::ElementsAre;

class VexStartUp : public testing::Test {
 protected:
  VexStartUp() {
    steps = {};
    reset_platform(1);
    set_hb_errno(49);
    IsVEX = Hb_True;
  }

  ~VexStartUp() override {
    hb_terminate();
    IsVEX = Hb_False;
    global_boot_ip_list = nullptr;
    global_vex_net_intf_tbl = nullptr;
  }

  // Trace ids with the category of each.
  static std::vector<std::pair<uint32_t, int>> traced() {
    std::vector<std::pair<uint32_t, int>> records;
    for (const Recorded_Trace& trace : platform_double().traces) {
      records.emplace_back(trace.id, trace.category);
    }
    return records;
  }

  static bool is_free(pthread_mutex_t& mutex) {
    bool taken = false;
    std::thread([&] {
      taken = pthread_mutex_trylock(&mutex) == 0;
      if (taken) {
        pthread_mutex_unlock(&mutex);
      }
    }).join();
    return taken;
  }

  void boot_addresses_are_there() { platform_double().boot_addrs.answers.push_back({0, &boot_record}); }

  zu_vex_net_intf_info_t boot_record = {};
  zu_vex_net_intf_info_t interface_record = {};
  zu_vex_net_intf_info_t local_record = {};
};

constexpr int errors = 0;
constexpr int info = 1;

TEST_F(VexStartUp, FailsWithoutClusterServicesAndKeepsTheErrorNumber) {
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 49);
  EXPECT_EQ(client_initialized, Hb_False);
  EXPECT_EQ(IsVEX, Hb_True);
  EXPECT_EQ(platform_double().boot_addrs.calls, 1);
  EXPECT_EQ(steps.built_table, nullptr);
}

TEST_F(VexStartUp, FailsTheSameWayEachTime) {
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 49);
  EXPECT_EQ(platform_double().traces_of(276).size(), 2U);
}

TEST_F(VexStartUp, TracesItsBeginTheFailedQueryAndItsEnd) {
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_THAT(traced(), ElementsAre(std::pair(272U, info), std::pair(273U, errors), std::pair(276U, errors)));
  EXPECT_THAT(platform_double().traces_of(273)[0].values, ElementsAre(0xFFFFFFFFU));
  EXPECT_EQ(platform_double().traces_of(272)[0].form, Trace_Form::id);
  EXPECT_EQ(platform_double().traces_of(276)[0].form, Trace_Form::id);
}

TEST_F(VexStartUp, TracesOnlyErrorsWhenInfoIsOff) {
  platform_double().levels = {1, 0, 0};
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(273U, 276U));
}

TEST_F(VexStartUp, TracesNothingWhenAllIsOff) {
  platform_double().levels = {0, 0, 0};
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_TRUE(platform_double().traces.empty());
}

TEST_F(VexStartUp, TakesAnyValueButFalseForVexMode) {
  IsVEX = static_cast<Hb_Boolean>(2);
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(platform_double().traces_of(272).size(), 1U);
}

TEST_F(VexStartUp, NeitherConnectsNorMakesHandlers) {
  SystemCalls calls;
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_TRUE(calls.of("socket").empty());
  EXPECT_EQ(event_pipe_handler_p, nullptr);
  EXPECT_EQ(new_group_event_handler_p, nullptr);
  EXPECT_EQ(adapter_event_handler_p, nullptr);
}

TEST_F(VexStartUp, ForgetsTheAdapterTables) {
  Hb_Adapter adapter = {};
  Hb_Node_config_state node = {};
  auto* table = reinterpret_cast<H_table_str*>(&adapter);
  global_config_tbl.Hb_global_adapter_list = &adapter;
  global_config_tbl.adap_hash = global_config_tbl.ip_hash = global_config_tbl.site_hash = table;
  global_config_tbl.node_hash = table;
  global_config_tbl.node_list = &node;
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(global_config_tbl.Hb_global_adapter_list, nullptr);
  EXPECT_EQ(global_config_tbl.adap_hash, nullptr);
  EXPECT_EQ(global_config_tbl.ip_hash, nullptr);
  EXPECT_EQ(global_config_tbl.site_hash, nullptr);
  EXPECT_EQ(global_config_tbl.node_hash, table);
  EXPECT_EQ(global_config_tbl.node_list, &node);
  global_config_tbl = {};
}

TEST_F(VexStartUp, DropsTheListsItHad) {
  global_boot_ip_list = &boot_record;
  global_vex_net_intf_tbl = &interface_record;
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(global_boot_ip_list, nullptr);
  EXPECT_EQ(global_vex_net_intf_tbl, nullptr);
}

// The mutex around the boot addresses.

TEST_F(VexStartUp, AsksForBootAddressesUnderTheirMutexAndLetsItGo) {
  bool held = false;
  steps.at_boot_addresses = [&held] { held = !is_free(global_boot_ip_list_mutex); };
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_TRUE(held);
  EXPECT_TRUE(is_free(global_boot_ip_list_mutex));
}

TEST_F(VexStartUp, FailureToLockIsAsserted) {
  {
    SystemCalls calls;
    calls.only("pthread_mutex_lock", 0, &global_boot_ip_list_mutex).script("pthread_mutex_lock", {result(35)});
    calls.only("pthread_mutex_unlock", 0, &global_boot_ip_list_mutex).script("pthread_mutex_unlock", {result(0)});
    EXPECT_EQ(hb_init(), Hb_Failure);
    EXPECT_EQ(calls.of("pthread_mutex_lock").size(), 1U);
    EXPECT_EQ(calls.of("pthread_mutex_unlock").size(), 1U);
  }
  ASSERT_EQ(platform_double().assertions.size(), 1U);
  EXPECT_EQ(platform_double().assertions[0].text, "pthread_mutex_lock(&global_boot_ip_list_mutex) == 0");
  EXPECT_EQ(platform_double().assertions[0].file, "lib/hb_global_data");
}

TEST_F(VexStartUp, FailureToUnlockIsAsserted) {
  {
    SystemCalls calls;
    calls.only("pthread_mutex_unlock", 0, &global_boot_ip_list_mutex).script("pthread_mutex_unlock", {result(1)});
    EXPECT_EQ(hb_init(), Hb_Failure);
  }
  ASSERT_EQ(platform_double().assertions.size(), 1U);
  EXPECT_EQ(platform_double().assertions[0].text, "pthread_mutex_unlock(&global_boot_ip_list_mutex) == 0");
  EXPECT_EQ(platform_double().assertions[0].file, "lib/hb_global_data");
  pthread_mutex_unlock(&global_boot_ip_list_mutex);
}

void* start_in_a_thread(void*) {
  hb_init();
  return nullptr;
}

TEST_F(VexStartUp, CancelledWhileItHoldsTheMutexLetsItGo) {
  steps.at_boot_addresses = [] {
    pthread_cancel(pthread_self());
    pthread_testcancel();
  };
  pthread_t thread;
  ASSERT_EQ(pthread_create(&thread, nullptr, start_in_a_thread, nullptr), 0);
  void* how_it_ended = nullptr;
  ASSERT_EQ(pthread_join(thread, &how_it_ended), 0);
  EXPECT_EQ(how_it_ended, PTHREAD_CANCELED);
  EXPECT_TRUE(is_free(global_boot_ip_list_mutex));
}

// A platform that knows its boot addresses.

TEST_F(VexStartUp, WithBootAddressesFailsAtTheInterfacesOfThisPlatform) {
  boot_addresses_are_there();
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(steps.mark_alias_list, &global_vex_net_intf_tbl);
  EXPECT_EQ(steps.mark_alias_boot_list, &boot_record);
  EXPECT_TRUE(platform_double().traces_of(273).empty());
  ASSERT_EQ(platform_double().traces_of(274).size(), 1U);
  EXPECT_THAT(platform_double().traces_of(274)[0].values, ElementsAre(3U));
  EXPECT_EQ(platform_double().traces_of(274)[0].category, errors);
  EXPECT_EQ(platform_double().trace_ids().back(), 276U);
  EXPECT_EQ(global_boot_ip_list, nullptr);
  EXPECT_EQ(global_vex_net_intf_tbl, nullptr);
  EXPECT_EQ(steps.filter_destination, nullptr);
}

TEST_F(VexStartUp, ThatCannotFilterTheInterfacesFails) {
  boot_addresses_are_there();
  steps.mark_alias_results = {Hb_Success};
  steps.marked = &interface_record;
  steps.filter_results = {Hb_Failure};
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_THAT(traced(), ElementsAre(std::pair(272U, info), std::pair(275U, errors), std::pair(276U, errors)));
  EXPECT_THAT(platform_double().traces_of(275)[0].values, ElementsAre(3U));
  EXPECT_EQ(global_boot_ip_list, nullptr);
  EXPECT_EQ(global_vex_net_intf_tbl, nullptr);
  EXPECT_EQ(hb_get_errno(), 49);
  EXPECT_TRUE(is_free(global_boot_ip_list_mutex));
}

TEST_F(VexStartUp, FiltersTheInterfaceTableByAliasNegated) {
  boot_addresses_are_there();
  steps.mark_alias_results = {Hb_Success};
  steps.marked = &interface_record;
  steps.filter_results = {Hb_Failure};
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_EQ(steps.filter_source, &interface_record);
  EXPECT_EQ(steps.filter_flags, 2U);
  EXPECT_EQ(steps.filter_negate, Hb_True);
  EXPECT_NE(steps.filter_destination, nullptr);
  EXPECT_NE(steps.filter_destination, &global_vex_net_intf_tbl);
}

TEST_F(VexStartUp, ThatCannotBuildItsTableFails) {
  boot_addresses_are_there();
  steps.mark_alias_results = {Hb_Success};
  steps.marked = &interface_record;
  steps.filter_results = {Hb_Success};
  steps.table_results = {Hb_Failure};
  EXPECT_EQ(hb_init(), Hb_Failure);
  EXPECT_THAT(traced(), ElementsAre(std::pair(272U, info), std::pair(276U, errors)));
  EXPECT_EQ(client_initialized, Hb_False);
  EXPECT_EQ(global_boot_ip_list, &boot_record);  // dropped only when the interfaces are not to be had
  EXPECT_EQ(global_vex_net_intf_tbl, &interface_record);
}

TEST_F(VexStartUp, BuildsItsTableFromTheFilteredInterfacesAndSucceeds) {
  boot_addresses_are_there();
  steps.mark_alias_results = {Hb_Success};
  steps.marked = &interface_record;
  steps.filter_results = {Hb_Success};
  steps.filtered = &local_record;
  steps.table_results = {Hb_Success};
  global_num_nodes = 77;
  EXPECT_EQ(hb_init(), Hb_Success);
  EXPECT_EQ(client_initialized, Hb_True);
  EXPECT_EQ(steps.built_table, &global_config_tbl);
  EXPECT_FALSE(steps.built_with_event);
  EXPECT_FALSE(steps.built_with_source);
  EXPECT_EQ(steps.built_from, &local_record);
  EXPECT_THAT(platform_double().trace_ids(), ElementsAre(272U));
  EXPECT_EQ(global_num_nodes, 77);  // the node table is the daemon mode's to build
  EXPECT_EQ(hb_init(), Hb_Success);
  EXPECT_EQ(platform_double().boot_addrs.calls, 1);
}

TEST_F(VexStartUp, ThatSucceededIsLeftByTerminate) {
  boot_addresses_are_there();
  steps.mark_alias_results = {Hb_Success};
  steps.filter_results = {Hb_Success};
  steps.table_results = {Hb_Success};
  ASSERT_EQ(hb_init(), Hb_Success);
  EXPECT_EQ(hb_terminate(), Hb_Success);
  EXPECT_EQ(IsVEX, Hb_False);
  EXPECT_EQ(client_initialized, Hb_False);
}

}  // namespace
}  // namespace hb_test
