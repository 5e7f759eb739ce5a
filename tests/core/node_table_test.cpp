// Which nodes are present, and looking adapters up.
#include "hb_global_data/node_table.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <initializer_list>
#include <memory>
#include <vector>

#include "hb_client/lifecycle.h"
#include "support/running_client.h"

namespace hb_test {
namespace {

class NodeTable : public testing::Test {
 protected:
  NodeTable() {
    global_config_tbl = {};
    std::fill(std::begin(global_node_tbl), std::end(global_node_tbl), Hb_False);
    global_num_nodes = 0;
    global_config_tbl.adap_hash = adapters;
  }

  ~NodeTable() override {
    Hash_free(adapters);
    global_config_tbl = {};
  }

  void configure(int max_nodes, int adapters_per_node, std::initializer_list<Hb_Adapter_Number> numbers) {
    global_config_tbl.Hb_max_nodes = max_nodes;
    global_config_tbl.Hb_adapters_per_node = adapters_per_node;
    for (const Hb_Adapter_Number number : numbers) {
      Hash_insert(number, adapters, &adapter);
    }
  }

  std::vector<int> present_nodes() {
    std::vector<int> nodes;
    for (int node = 0; node < 2049; ++node) {
      if (global_node_tbl[node] == Hb_True) {
        nodes.push_back(node);
      }
    }
    return nodes;
  }

  Hb_Adapter adapter = {};
  H_table_str* adapters = Hash_init("adapters", 257);
};

TEST_F(NodeTable, HoldsANodeWithAnyOfItsAdapters) {
  configure(5, 3, {0, 4, 11, 12, 13});  // nodes 0, 1, 3 (last slot), 4 (two of three)
  hb_init_global_node_tbl();
  EXPECT_EQ(present_nodes(), (std::vector<int>{0, 1, 3, 4}));
  EXPECT_EQ(global_num_nodes, 4);
}

TEST_F(NodeTable, OfAnEmptyConfigurationIsEmpty) {
  configure(4, 2, {});
  std::fill_n(global_node_tbl, 4, Hb_True);
  global_num_nodes = 4;
  hb_init_global_node_tbl();
  EXPECT_TRUE(present_nodes().empty());
  EXPECT_EQ(global_num_nodes, 0);
}

TEST_F(NodeTable, IgnoresAdaptersBeyondTheLastNode) {
  configure(2, 2, {1, 4});
  hb_init_global_node_tbl();
  EXPECT_EQ(present_nodes(), (std::vector<int>{0}));
}

TEST_F(NodeTable, KeepsOldFlagsBeyondTheLastNode) {
  configure(2, 2, {0});
  global_node_tbl[1] = Hb_True;
  global_node_tbl[2] = Hb_True;
  global_node_tbl[2048] = Hb_True;
  hb_init_global_node_tbl();
  EXPECT_EQ(present_nodes(), (std::vector<int>{0, 2, 2048}));
  EXPECT_EQ(global_num_nodes, 1);
}

TEST_F(NodeTable, WithoutAdaptersPerNodeHoldsNobody) {
  configure(3, 0, {0, 1});
  hb_init_global_node_tbl();
  EXPECT_TRUE(present_nodes().empty());
}

TEST_F(NodeTable, WithFewerThanNoAdaptersPerNodeHoldsNobody) {
  configure(3, -1, {0, 1});
  hb_init_global_node_tbl();
  EXPECT_TRUE(present_nodes().empty());
  EXPECT_EQ(global_num_nodes, 0);
}

TEST_F(NodeTable, ReachesTheLastNodeOfTheLargestCluster) {
  configure(2049, 48, {98351});
  hb_init_global_node_tbl();
  EXPECT_EQ(present_nodes(), (std::vector<int>{2048}));
  EXPECT_EQ(global_num_nodes, 1);
}

TEST_F(NodeTable, LookUpOfAKnownAdapterIsItsRecord) {
  configure(2, 2, {3});
  EXPECT_EQ(hb_get_adap_entry(3), &adapter);
}

TEST_F(NodeTable, LookUpOfAnUnknownAdapterIsTheInvalidRecord) {
  configure(2, 2, {3});
  EXPECT_EQ(hb_get_adap_entry(2), &HB_INVALID_ADAP);
  EXPECT_EQ(hb_get_adap_entry(0xFFFFFFFFU), &HB_INVALID_ADAP);
}

TEST_F(NodeTable, LookUpWithoutATableIsTheInvalidRecord) {
  global_config_tbl.adap_hash = nullptr;
  EXPECT_EQ(hb_get_adap_entry(3), &HB_INVALID_ADAP);
}

TEST(InvalidAdapter, HasItsContents) {
  Bytes bytes(reinterpret_cast<const char*>(&HB_INVALID_ADAP), 64);
  EXPECT_EQ(sizeof HB_INVALID_ADAP, 64U);
  EXPECT_EQ(bytes.substr(0, 16), Bytes(16, '\xff'));
  EXPECT_EQ(u16_at(bytes, 16), 0xFFFFU);
  EXPECT_EQ(bytes.substr(18, 3), Bytes("un\0", 3));
  EXPECT_EQ(u32_at(bytes, 56), 0xFFFFFFFFU);
  EXPECT_EQ(u32_at(bytes, 60), 0U);
}

TEST(NodeTableOfAClient, IsRebuiltByAnotherStart) {
  FakeDaemon daemon(Publication::for_nodes(4));
  ConfigurationMessage first;
  first.max_nodes(4).adapters_per_node(2).network("net0");
  first.adapter(0, "10.0.0.1").adapter(6, "10.0.0.7");
  const DaemonConnection one = start_client(daemon, first);
  EXPECT_EQ(global_num_nodes, 2);
  EXPECT_EQ(global_node_tbl[0], Hb_True);
  EXPECT_EQ(global_node_tbl[3], Hb_True);
  ASSERT_EQ(hb_terminate(), Hb_Success);
  EXPECT_EQ(global_num_nodes, 0);
  EXPECT_EQ(global_node_tbl[0], Hb_True);  // stale until the next start

  ConfigurationMessage second;
  second.max_nodes(3).adapters_per_node(2).network("net0").adapter(2, "10.0.0.3");
  const DaemonConnection two = start_client(daemon, second);
  EXPECT_EQ(global_num_nodes, 1);
  EXPECT_EQ(global_node_tbl[0], Hb_False);
  EXPECT_EQ(global_node_tbl[1], Hb_True);
  EXPECT_EQ(global_node_tbl[2], Hb_False);
  EXPECT_EQ(global_node_tbl[3], Hb_True);  // beyond the new maximum: as it was
  hb_terminate();
}

TEST(Deinit, ReleasesWhatTheTableOwnsAndLeavesSitesAndFlags) {
  Hb_Site site = {};
  auto* site_table = reinterpret_cast<H_table_str*>(&site);
  global_config_tbl = {};
  global_config_tbl.Hb_global_adapter_list = new Hb_Adapter[2];
  global_config_tbl.node_list = new Hb_Node_config_state[2];
  global_config_tbl.adap_hash = Hash_init("a", 257);
  global_config_tbl.ip_hash = Hash_init("i", 257);
  global_config_tbl.node_hash = Hash_init("n", 257);
  global_config_tbl.site_hash = site_table;
  global_config_tbl.site_list = &site;
  global_num_nodes = 2;
  global_node_tbl[1] = Hb_True;
  hb_deinit_global_config_and_node_tbl();
  EXPECT_EQ(global_config_tbl.Hb_global_adapter_list, nullptr);
  EXPECT_EQ(global_config_tbl.node_list, nullptr);
  EXPECT_EQ(global_config_tbl.adap_hash, nullptr);
  EXPECT_EQ(global_config_tbl.ip_hash, nullptr);
  EXPECT_EQ(global_config_tbl.node_hash, nullptr);
  EXPECT_EQ(global_config_tbl.site_hash, site_table);
  EXPECT_EQ(global_config_tbl.site_list, &site);
  EXPECT_EQ(global_num_nodes, 0);
  EXPECT_EQ(global_node_tbl[1], Hb_True);
  hb_deinit_global_config_and_node_tbl();  // nothing is left to release
  EXPECT_EQ(global_config_tbl.site_list, &site);
  global_config_tbl = {};
}

}  // namespace
}  // namespace hb_test
