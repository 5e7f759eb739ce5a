// Updates of the configuration.
#include <gmock/gmock.h>

#include <thread>

#include "event_reception.h"

namespace hb_test {
namespace {

using testing::ElementsAre;

std::vector<int> present_nodes() {
  std::vector<int> nodes;
  for (int node = 0; node < 2049; ++node) {
    if (global_node_tbl[node] == Hb_True) nodes.push_back(node);
  }
  return nodes;
}

// Nodes 1 and 2 of 3, two adapters a node.
ConfigurationMessage changed_cluster() {
  return ConfigurationMessage()
      .local_node(1)
      .max_nodes(3)
      .adapters_per_node(2)
      .remote_period(7, 8)
      .adapter(2, "10.2.0.2", 0, "en2", 2)
      .adapter(3, "10.2.0.3", 0, "en3", 1)
      .adapter(5, "10.2.0.5", 0, "en5", 1)
      .network("net_changed", "ether");
}

TEST_F(EventReception, AConfigurationUpdateComesUnderItsOwnNameAndFillsNoGroup) {
  GroupBytes expected(*out.group);
  expected.no_ffdc();
  EXPECT_TRUE(succeeds([&] { return deliver(telling_packet(9).message(changed_cluster().bytes())); }));
  EXPECT_TRUE(expected.is(*out.group));
  EXPECT_EQ(128, out.events);
  EXPECT_STREQ("Hb_Config_Group", out.name);
  EXPECT_EQ(0x01020304U, out.sequence);
}

TEST_F(EventReception, AConfigurationUpdateReplacesTheTable) {
  deliver(telling_packet(9).message(changed_cluster().bytes()));
  EXPECT_EQ(1, global_config_tbl.local_node_number);
  EXPECT_EQ(3, global_config_tbl.Hb_max_nodes);
  EXPECT_EQ(2, global_config_tbl.Hb_adapters_per_node);
  EXPECT_EQ(3, global_config_tbl.Hb_num_adapters);
  EXPECT_EQ(1, global_config_tbl.Hb_num_networks);
  EXPECT_EQ(7, global_config_tbl.Hb_rem_node_down_sim_period.tv_sec);
  EXPECT_EQ(2, global_config_tbl.Hb_num_nodes);
  EXPECT_EQ(3, Hash_entries(global_config_tbl.adap_hash));
  EXPECT_EQ(3, Hash_entries(global_config_tbl.ip_hash));
  EXPECT_EQ(2, Hash_entries(global_config_tbl.node_hash));
  EXPECT_EQ(nullptr, Hash_search(13, global_config_tbl.adap_hash));
  EXPECT_EQ(&global_config_tbl.Hb_global_adapter_list[2], Hash_search(5, global_config_tbl.adap_hash));
  EXPECT_EQ(2U, adapter_state(2));
}

TEST_F(EventReception, AConfigurationUpdateIsWhatTheQueriesAnswerFrom) {
  deliver(telling_packet(9).message(changed_cluster().bytes()));
  Hb_Adapter_Number adapter = 0;
  EXPECT_EQ(Hb_Success, hb_get_adapter_number_by_address(address_of("10.2.0.5"), &adapter));
  EXPECT_EQ(5U, adapter);
  EXPECT_TRUE(fails_with(7, [&] { return hb_get_adapter_number_by_address(address_of("10.0.1.3"), &adapter); }));
  Hb_Node_Number node = 0;
  Hb_Cursor cursor = 0;
  EXPECT_EQ(Hb_Success, hb_get_first_configured_node_number(&node, &cursor));
  EXPECT_EQ(1, node);
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_node_number_by_adapter_number(6, &node); }));
}

TEST_F(EventReception, AConfigurationUpdateRebuildsTheNodeTableBelowItsMaximum) {
  ASSERT_THAT(present_nodes(), ElementsAre(0, 3, 4));
  deliver(telling_packet(9).message(changed_cluster().bytes()));
  EXPECT_EQ(2, global_num_nodes);
  EXPECT_THAT(present_nodes(), ElementsAre(1, 2, 3, 4));  // 3 and 4 are beyond the maximum and keep their flags
}

TEST_F(EventReception, AConfigurationUpdateLeavesTheSitesAlone) {
  H_table_str site_table = {};
  Hb_Site sites[1] = {};
  global_config_tbl.site_hash = &site_table;
  global_config_tbl.site_list = sites;
  global_config_tbl.Hb_max_sites = 2;
  global_config_tbl.Hb_num_sites = 1;
  global_site_tbl[1] = Hb_True;
  global_num_sites = 1;
  EXPECT_EQ(Hb_Success, deliver(telling_packet(9).message(changed_cluster().bytes())));
  EXPECT_EQ(&site_table, global_config_tbl.site_hash);
  EXPECT_EQ(sites, global_config_tbl.site_list);
  EXPECT_EQ(2, global_config_tbl.Hb_max_sites);
  EXPECT_EQ(1, global_config_tbl.Hb_num_sites);
  EXPECT_THAT(global_site_tbl, ElementsAre(Hb_False, Hb_True));
  EXPECT_EQ(1, global_num_sites);
  global_config_tbl.site_hash = nullptr;
  global_config_tbl.site_list = nullptr;
}

TEST_F(EventReception, AConfigurationUpdateTracesItsAdapters) {
  trace_only(trace_info);
  deliver(telling_packet(9).message(changed_cluster().bytes()));
  ASSERT_THAT(platform_double().trace_ids(), ElementsAre(118, 118, 118));
  EXPECT_THAT(platform_double().traces[2].values, ElementsAre(5, 2));
  trace_nothing();
}

TEST_F(EventReception, EventsBehindAConfigurationUpdateAreReadByTheNewTable) {
  deliver(telling_packet(9).message(changed_cluster().bytes()));
  EXPECT_EQ(Hb_Success, deliver(telling_packet(5).message(node_event_message({0, 1, 1}))));
  EXPECT_EQ(2, out.group->Hb_membership_grp_union.Hb_node_membership_grp.Hb_num_nodes);
  EXPECT_EQ(2, node_state(1).state);
}

TEST_F(EventReception, ManyConfigurationUpdatesFollowOneAnother) {
  for (int round = 0; round < 3; ++round) {
    EXPECT_EQ(Hb_Success, deliver(telling_packet(9).message(changed_cluster().bytes())));
    EXPECT_EQ(3, global_config_tbl.Hb_num_adapters);
    EXPECT_EQ(Hb_Success, deliver(telling_packet(9).message(sparse_cluster().bytes())));
    EXPECT_EQ(5, global_config_tbl.Hb_num_adapters);
    EXPECT_EQ(3, global_num_nodes);
  }
}

TEST_F(EventReception, AFullSizeConfigurationUpdateIsTaken) {
  // 2049 nodes of 48 adapters, and 48 networks: the largest packet there is.
  ByteBuilder message;
  message.i32(2048).i32(2049).i32(48).i32(98352).i32(48).zeros(32);
  for (uint32_t adapter = 0; adapter < 98352; ++adapter) {
    message.zeros(12).u32(adapter + 1).i16(0).text("en0", 36).zeros(2).u32(adapter).i32(1);
  }
  for (int network = 0; network < 48; ++network) message.text("net", 70).text("ether", 16);
  const Bytes packet = ReplyPacket(9).message(message.bytes()).bytes();
  ASSERT_EQ(6298816U, packet.size());
  std::thread sender([&] { connection.send_frame(packet); });
  EXPECT_EQ(Hb_Success, take());
  sender.join();
  EXPECT_EQ(128, out.events);
  EXPECT_EQ(2049, global_num_nodes);
  EXPECT_EQ(98352, Hash_entries(global_config_tbl.adap_hash));
  EXPECT_EQ(98352, Hash_entries(global_config_tbl.ip_hash));
}

}  // namespace
}  // namespace hb_test
