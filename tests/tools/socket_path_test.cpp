#include "socket_path.h"

#include <gtest/gtest.h>

#include <cstdlib>

namespace hbctl {
namespace {

class HbctlSocketPath : public testing::Test {
 protected:
  HbctlSocketPath() {
    for (const char* variable : {"HB_SERVER_SOCKET", "HA_DOMAIN_NAME", "HA_SYSPAR_NAME"}) unsetenv(variable);
  }
};

TEST_F(HbctlSocketPath, is_the_default_without_an_environment) {
  EXPECT_EQ(socket_path_from_environment(), "/var/ha/soc/mowl/server_socket");
}

TEST_F(HbctlSocketPath, has_the_domain_appended) {
  setenv("HA_DOMAIN_NAME", "d1", 1);
  setenv("HA_SYSPAR_NAME", "p1", 1);
  EXPECT_EQ(socket_path_from_environment(), "/var/ha/soc/mowl/server_socket.d1");
}

TEST_F(HbctlSocketPath, has_the_partition_appended_without_a_domain) {
  setenv("HA_SYSPAR_NAME", "p1", 1);
  EXPECT_EQ(socket_path_from_environment(), "/var/ha/soc/mowl/server_socket.p1");
  setenv("HA_DOMAIN_NAME", "", 1);
  EXPECT_EQ(socket_path_from_environment(), "/var/ha/soc/mowl/server_socket.p1");
}

TEST_F(HbctlSocketPath, has_the_base_replaced_even_by_nothing) {
  setenv("HB_SERVER_SOCKET", "/tmp/hb", 1);
  EXPECT_EQ(socket_path_from_environment(), "/tmp/hb");
  setenv("HA_DOMAIN_NAME", "d1", 1);
  EXPECT_EQ(socket_path_from_environment(), "/tmp/hb.d1");
  setenv("HB_SERVER_SOCKET", "", 1);
  EXPECT_EQ(socket_path_from_environment(), ".d1");
}

TEST_F(HbctlSocketPath, that_was_chosen_counts_alone) {
  setenv("HA_DOMAIN_NAME", "d1", 1);
  setenv("HA_SYSPAR_NAME", "p1", 1);
  use_socket_path("/tmp/mine");
  EXPECT_EQ(socket_path_from_environment(), "/tmp/mine");
  EXPECT_STREQ(std::getenv("HB_SERVER_SOCKET"), "/tmp/mine");
}

}  // namespace
}  // namespace hbctl
