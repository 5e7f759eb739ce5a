// A platform without cluster services and without event monitors.
#include <gtest/gtest.h>

#include <cerrno>

#include "zu_evm.h"
#include "zu_vex.h"

namespace {

// Calls with an output, and without one: each yields -1 and touches neither the output nor `errno`.
template <typename Output, typename Call>
void expect_absent(Call call) {
  Output before{};
  Output* output = &before;
  errno = EXDEV;
  EXPECT_EQ(call(&output), -1);
  EXPECT_EQ(output, &before);
  EXPECT_EQ(call(static_cast<Output**>(nullptr)), -1);
  EXPECT_EQ(errno, EXDEV);
}

// A read, on a descriptor and on none.
template <typename Output>
void expect_absent(int (*read)(int, Output**)) {
  expect_absent<Output>([&](Output** output) { return read(0, output); });
  expect_absent<Output>([&](Output** output) { return read(-1, output); });
}

TEST(AbsentClusterServices, TheClusterIsNotKnown) { expect_absent<zu_vex_cluster_info_t>(zu_vex_get_cluster_info); }

TEST(AbsentClusterServices, NodesAreNotKnown) { expect_absent<zu_vex_node_info_t>(zu_vex_get_node_info); }

TEST(AbsentClusterServices, InterfacesAreNotKnown) { expect_absent<zu_vex_net_intf_info_t>(zu_vex_get_net_intf_info); }

TEST(AbsentClusterServices, BootAddressesAreNotKnown) { expect_absent<zu_vex_net_intf_info_t>(zu_vex_get_boot_addrs); }

TEST(AbsentClusterServices, NothingIsKnownAfterAnEventEither) {
  const zu_evm_event_metadata_t event{};
  for (const zu_evm_event_metadata_t* given : {&event, static_cast<const zu_evm_event_metadata_t*>(nullptr)}) {
    expect_absent<zu_vex_node_info_t>(
        [&](zu_vex_node_info_t** list) { return zu_vex_get_node_info_after_event(given, list); });
    expect_absent<zu_vex_net_intf_info_t>(
        [&](zu_vex_net_intf_info_t** list) { return zu_vex_get_net_intf_info_after_event(given, list); });
  }
}

TEST(AbsentClusterServices, ReleasingNothingIsNothing) {
  errno = EXDEV;
  zu_vex_free_cluster_info(nullptr);
  zu_vex_free_node_info(nullptr);
  zu_vex_free_net_intf_info(nullptr);
  EXPECT_EQ(errno, EXDEV);
}

TEST(AbsentMonitors, NoneCanBeOpened) {
  int descriptor = 77;
  errno = EXDEV;
  EXPECT_EQ(zu_evm_open("/monitor", "BUF_SIZE=1048576;CHANGED=YES;CLUSTER=YES\n", &descriptor), -1);
  EXPECT_EQ(zu_evm_open("/monitor", nullptr, &descriptor), -1);
  EXPECT_EQ(zu_evm_open(nullptr, nullptr, nullptr), -1);
  EXPECT_EQ(descriptor, 77);
  EXPECT_EQ(errno, EXDEV);
}

TEST(AbsentMonitors, NodeLivenessCannotBeRead) {
  zu_evm_event_node_liveness_t before{};
  zu_evm_event_node_or_split_merge_cfg_t record;
  record.p_event_node_liveness = &before;
  errno = EXDEV;
  EXPECT_EQ(zu_evm_read_node_liveness(0, &record), -1);
  EXPECT_EQ(zu_evm_read_node_liveness(-1, nullptr), -1);
  EXPECT_EQ(record.p_event_node_liveness, &before);
  EXPECT_EQ(errno, EXDEV);
}

TEST(AbsentMonitors, SplitsAndMergesCannotBeRead) { expect_absent(zu_evm_read_split_merge); }

TEST(AbsentMonitors, AdapterLivenessCannotBeRead) { expect_absent(zu_evm_read_adapter_liveness); }

TEST(AbsentMonitors, ChangesOfAddressesCannotBeRead) { expect_absent(zu_evm_read_ip_change); }

TEST(AbsentMonitors, TheNodeListCannotBeRead) { expect_absent(zu_evm_read_node_list); }

TEST(AbsentMonitors, ProcessLivenessCannotBeRead) { expect_absent(zu_evm_read_process_liveness); }

TEST(AbsentMonitors, ReconfigurationCannotBeRead) { expect_absent(zu_evm_read_cluster_reconfig); }

TEST(AbsentMonitors, TheRepositoryDiskCannotBeRead) { expect_absent(zu_evm_read_repository_disk); }

TEST(AbsentMonitors, SitesCannotBeRead) { expect_absent(zu_evm_read_site_cfg); }

TEST(AbsentMonitors, ReleasingNothingIsNothing) {
  errno = EXDEV;
  zu_evm_free(nullptr);
  EXPECT_EQ(errno, EXDEV);
}

}  // namespace
