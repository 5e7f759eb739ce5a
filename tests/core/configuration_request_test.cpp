// Asking for the configuration at start-up.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <csignal>

#include "core/scripted_socket.h"
#include "hb_communication/configuration_load.h"
#include "hb_communication/vex_table_build.h"
#include "hb_global_data/node_table.h"
#include "support/running_client.h"
#include "support/system_calls.h"

namespace hb_test {
namespace {

class ConfigurationRequest : public testing::Test {
 protected:
  ConfigurationRequest() {
    std::signal(SIGPIPE, SIG_IGN);
    reset_platform();
    set_hb_errno(0);
    EXPECT_EQ(hb_init_communication(), Hb_Success);
    peer = daemon.accept();
  }

  ~ConfigurationRequest() override {
    IsVEX = Hb_False;
    hb_deinit_global_config_and_node_tbl();
    hb_remove_client_select();
    hb_remove_socket();
  }

  FakeDaemon daemon{Publication::none()};
  DaemonConnection peer;
};

TEST_F(ConfigurationRequest, IsOfKind201WithoutData) {
  peer.send_frame(configuration_answer(small_cluster()));
  EXPECT_EQ(hb_recv_config_info(nullptr), Hb_Success);
  const Bytes request = peer.receive_request();
  EXPECT_EQ(request.size(), 76U);
  EXPECT_EQ(i32_at(request, 8), 201);
  EXPECT_EQ(i32_at(request, 12), 0);
  EXPECT_FALSE(peer.has_input());
}

TEST_F(ConfigurationRequest, LoadsTheTableFromTheAnswer) {
  peer.send_frame(configuration_answer(small_cluster().local_node(2)));
  EXPECT_EQ(hb_recv_config_info(nullptr), Hb_Success);
  EXPECT_EQ(global_config_tbl.local_node_number, 2);
  EXPECT_EQ(global_config_tbl.Hb_max_nodes, 3);
  EXPECT_EQ(global_config_tbl.Hb_num_adapters, 6);
  EXPECT_EQ(hb_get_adap_entry(5)->Hb_adapter_num, 5U);
}

TEST_F(ConfigurationRequest, LoadsThePeriodsFromWhereTheyLieUnaligned) {
  peer.send_frame(configuration_answer(small_cluster().remote_period(0x100000001, 5).local_period(7, 0x200000003)));
  EXPECT_EQ(hb_recv_config_info(nullptr), Hb_Success);
  EXPECT_EQ(global_config_tbl.Hb_rem_node_down_sim_period.tv_sec, 0x100000001);
  EXPECT_EQ(global_config_tbl.Hb_rem_node_down_sim_period.tv_usec, 5);
  EXPECT_EQ(global_config_tbl.Hb_local_node_down_sim_period.tv_sec, 7);
  EXPECT_EQ(global_config_tbl.Hb_local_node_down_sim_period.tv_usec, 0x200000003);
}

TEST_F(ConfigurationRequest, ReadsTheAnswerWithoutSelect) {
  daemon.run([this](FakeDaemon&) { peer.send_byte_by_byte(framed(configuration_answer(small_cluster()))); });
  SystemCalls calls;
  EXPECT_EQ(hb_recv_config_info(nullptr), Hb_Success);
  daemon.join();
  EXPECT_TRUE(calls.of("select").empty());
}

TEST_F(ConfigurationRequest, AnsweredByAnotherKindFails) {
  peer.send_frame(ReplyPacket(10).bytes());
  EXPECT_EQ(hb_recv_config_info(nullptr), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 10);
  EXPECT_EQ(global_config_tbl.adap_hash, nullptr);
}

TEST_F(ConfigurationRequest, ThatCannotBeSentFails) {
  peer.close();
  EXPECT_EQ(hb_recv_config_info(nullptr), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 16);
}

TEST_F(ConfigurationRequest, WithoutAConnectionFails) {
  hb_remove_socket();
  EXPECT_EQ(hb_recv_config_info(nullptr), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), 12);
}

class ConfigurationReceiveError : public ConfigurationRequest,
                                  public testing::WithParamInterface<std::pair<int, int>> {};

TEST_P(ConfigurationReceiveError, FollowsFromTheSocketError) {
  replace_client_socket<ScriptedReceiver>()->error = GetParam().first;
  EXPECT_EQ(hb_recv_config_info(nullptr), Hb_Failure);
  EXPECT_EQ(hb_get_errno(), GetParam().second);
}

INSTANTIATE_TEST_SUITE_P(SocketErrors, ConfigurationReceiveError,
                         testing::Values(std::pair(1, 23), std::pair(10, 24), std::pair(11, 25), std::pair(12, 26),
                                         std::pair(14, 16), std::pair(13, 27), std::pair(0, 27), std::pair(9, 27)));

TEST_F(ConfigurationRequest, InVexModeBuildsTheTableFromTheClusterServices) {
  IsVEX = Hb_True;
  EXPECT_EQ(hb_recv_config_info(nullptr), Hb_Failure);  // they are absent
  EXPECT_EQ(hb_get_errno(), 63);
  EXPECT_FALSE(peer.has_input());
}

}  // namespace
}  // namespace hb_test
