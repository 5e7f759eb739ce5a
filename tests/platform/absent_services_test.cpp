#include <gtest/gtest.h>

#include "zu_vex.h"

namespace {

TEST(AbsentClusterServices, ClusterQueryYieldsMinusOneAndLeavesTheOutputAlone) {
  zu_vex_cluster_info_t before{};
  zu_vex_cluster_info_t* output = &before;
  EXPECT_EQ(zu_vex_get_cluster_info(&output), -1);
  EXPECT_EQ(output, &before);
}

TEST(AbsentClusterServices, InterfaceQueryYieldsMinusOneAndLeavesTheOutputAlone) {
  zu_vex_net_intf_info_t before{};
  zu_vex_net_intf_info_t* output = &before;
  EXPECT_EQ(zu_vex_get_net_intf_info(&output), -1);
  EXPECT_EQ(output, &before);
}

TEST(AbsentClusterServices, BootAddressQueryYieldsMinusOneAndLeavesTheOutputAlone) {
  zu_vex_net_intf_info_t before{};
  zu_vex_net_intf_info_t* output = &before;
  EXPECT_EQ(zu_vex_get_boot_addrs(&output), -1);
  EXPECT_EQ(output, &before);
}

TEST(AbsentClusterServices, QueriesTakeNoOutputAtAll) {
  EXPECT_EQ(zu_vex_get_cluster_info(nullptr), -1);
  EXPECT_EQ(zu_vex_get_net_intf_info(nullptr), -1);
  EXPECT_EQ(zu_vex_get_boot_addrs(nullptr), -1);
}

}  // namespace
