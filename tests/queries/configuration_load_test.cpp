// Building the configuration table from the daemon's configuration message.
#include <gmock/gmock.h>

#include <cstring>
#include <vector>

#include "hb_communication/configuration_load.h"
#include "hb_global_data/node_table.h"
#include "platform_doubles.h"
#include "support/running_client.h"
#include "test_cluster.h"

namespace hb_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class ConfigurationLoad : public Loaded_Client {
 protected:
  ~ConfigurationLoad() override { trace_nothing(); }
};

Hb_Adapter* by_number(uint32_t number) {
  return static_cast<Hb_Adapter*>(Hash_search(number, global_config_tbl.adap_hash));
}

Hb_Adapter* by_address(const std::string& text) {
  H_IPv6_key_t key;
  std::memcpy(&key, address_bytes(text).data(), sizeof key);
  return static_cast<Hb_Adapter*>(Hash_search_IPv6(&key, global_config_tbl.ip_hash));
}

Hb_Node_config_state* by_node(uint32_t node) {
  return static_cast<Hb_Node_config_state*>(Hash_search(node, global_config_tbl.node_hash));
}

std::vector<int> present_nodes() {
  std::vector<int> nodes;
  for (int node = 0; node < 2049; ++node) {
    if (global_node_tbl[node] == Hb_True) nodes.push_back(node);
  }
  return nodes;
}

// ---- Look-ups follow the tables, whatever is done to them ----

TEST_F(ConfigurationLoad, AnAdapterTakenOutOfItsTableIsNotFoundAnyMore) {
  ASSERT_NE(&HB_INVALID_ADAP, hb_get_adap_entry(12));
  Hash_delete(12, global_config_tbl.adap_hash);
  EXPECT_EQ(&HB_INVALID_ADAP, hb_get_adap_entry(12));
  EXPECT_NE(&HB_INVALID_ADAP, hb_get_adap_entry(13));
}

TEST_F(ConfigurationLoad, AnAdapterReplacedInItsTableIsFoundAsReplaced) {
  Hb_Adapter other = {};
  ASSERT_NE(&other, hb_get_adap_entry(12));
  Hash_insert(12, global_config_tbl.adap_hash, &other);
  EXPECT_EQ(&other, hb_get_adap_entry(12));
}

TEST_F(ConfigurationLoad, ATableInThePlaceOfAnotherAnswersForItself) {
  Hb_Adapter only = {};
  Hash_free(global_config_tbl.adap_hash);
  global_config_tbl.adap_hash = Hash_init("other", 1);
  Hash_insert(17, global_config_tbl.adap_hash, &only);
  EXPECT_EQ(&only, hb_get_adap_entry(17));
  EXPECT_EQ(&HB_INVALID_ADAP, hb_get_adap_entry(12));
}

TEST_F(ConfigurationLoad, AnEmptiedTableFindsNothing) {
  Hash_clean(global_config_tbl.adap_hash);
  EXPECT_EQ(&HB_INVALID_ADAP, hb_get_adap_entry(12));
}

// ---- Header ----

TEST_F(ConfigurationLoad, TheHeaderFieldsBecomeTheTablesNumbers) {
  EXPECT_EQ(3, global_config_tbl.local_node_number);
  EXPECT_EQ(8, global_config_tbl.Hb_max_nodes);
  EXPECT_EQ(4, global_config_tbl.Hb_adapters_per_node);
  EXPECT_EQ(5, global_config_tbl.Hb_num_adapters);
  EXPECT_EQ(4, global_config_tbl.Hb_num_networks);
}

TEST_F(ConfigurationLoad, OfTheLocalNodeNumberTheLowHalfIsKept) {
  reload(sparse_cluster().local_node(0x7ABC0005));
  EXPECT_EQ(5, global_config_tbl.local_node_number);
  reload(sparse_cluster().local_node(-1));
  EXPECT_EQ(-1, global_config_tbl.local_node_number);
}

TEST_F(ConfigurationLoad, ThePeriodsKeepTheir64Bits) {
  reload(sparse_cluster()
             .remote_period(0x0102030405060708, 0x1112131415161718)
             .local_period(0x2122232425262728, 0x3132333435363738));
  EXPECT_EQ(0x0102030405060708, global_config_tbl.Hb_rem_node_down_sim_period.tv_sec);
  EXPECT_EQ(0x1112131415161718, global_config_tbl.Hb_rem_node_down_sim_period.tv_usec);
  EXPECT_EQ(0x2122232425262728, global_config_tbl.Hb_local_node_down_sim_period.tv_sec);
  EXPECT_EQ(0x3132333435363738, global_config_tbl.Hb_local_node_down_sim_period.tv_usec);
}

TEST_F(ConfigurationLoad, TheSiteNumbersAreNotTouched) {
  global_config_tbl.Hb_max_sites = 5;
  global_config_tbl.Hb_num_sites = 4;
  reload(sparse_cluster());
  EXPECT_EQ(5, global_config_tbl.Hb_max_sites);
  EXPECT_EQ(4, global_config_tbl.Hb_num_sites);
  global_config_tbl.Hb_num_sites = 0;
}

// ---- Adapters ----

TEST_F(ConfigurationLoad, TheListHoldsTheRecordsInTheirOrder) {
  std::vector<uint32_t> numbers(5);
  for (size_t index = 0; index < 5; ++index) {
    numbers[index] = global_config_tbl.Hb_global_adapter_list[index].Hb_adapter_num;
  }
  EXPECT_THAT(numbers, ElementsAre(13, 0, 12, 17, 2));
}

TEST_F(ConfigurationLoad, ARecordIsCopiedWithAllItsFields) {
  const Hb_Adapter& adapter = global_config_tbl.Hb_global_adapter_list[2];
  EXPECT_EQ(address_bytes("10.0.0.3"), Bytes(reinterpret_cast<const char*>(&adapter.Hb_ip_address), 16));
  EXPECT_EQ(0, adapter.Hb_network);
  EXPECT_STREQ("en0", adapter.Hb_adapter_type);
  EXPECT_EQ(12U, adapter.Hb_adapter_num);
  EXPECT_EQ(2, adapter.Hb_state);
}

TEST_F(ConfigurationLoad, ARecordKeepsAll64BytesAndOddValues) {
  reload(sparse_cluster().adapter(31, "fe80::1", -7, std::string(36, 'z'), 0x12345678));
  const Hb_Adapter& adapter = global_config_tbl.Hb_global_adapter_list[5];
  const Bytes expected = ByteBuilder()
                             .raw(address_bytes("fe80::1"))
                             .i16(-7)
                             .raw(std::string(36, 'z'))
                             .zeros(2)
                             .u32(31)
                             .u32(0x12345678)
                             .bytes();
  ASSERT_EQ(64U, expected.size());
  EXPECT_EQ(expected, Bytes(reinterpret_cast<const char*>(&adapter), 64));
}

TEST_F(ConfigurationLoad, EachAdapterIsFoundByItsNumberInTheList) {
  for (int index = 0; index < 5; ++index) {
    Hb_Adapter* adapter = &global_config_tbl.Hb_global_adapter_list[index];
    EXPECT_EQ(adapter, by_number(adapter->Hb_adapter_num));
    EXPECT_EQ(adapter, hb_get_adap_entry(adapter->Hb_adapter_num));
  }
  EXPECT_EQ(nullptr, by_number(1));
  EXPECT_EQ(5, Hash_entries(global_config_tbl.adap_hash));
}

TEST_F(ConfigurationLoad, EachAdapterIsFoundByItsAddressInTheList) {
  EXPECT_EQ(&global_config_tbl.Hb_global_adapter_list[0], by_address("10.0.1.3"));
  EXPECT_EQ(&global_config_tbl.Hb_global_adapter_list[4], by_address("10.0.3.10"));
  EXPECT_EQ(nullptr, by_address("10.0.1.9"));
  EXPECT_EQ(5, Hash_entries(global_config_tbl.ip_hash));
}

TEST_F(ConfigurationLoad, OfTwoAdaptersWithOneAddressOnlyTheFirstIsFoundByIt) {
  reload(sparse_cluster().adapter(1, "10.0.1.4", 0, "en7"));
  EXPECT_EQ(6, global_config_tbl.Hb_num_adapters);
  EXPECT_EQ(&global_config_tbl.Hb_global_adapter_list[3], by_address("10.0.1.4"));
  EXPECT_EQ(&global_config_tbl.Hb_global_adapter_list[3], by_number(17));
  EXPECT_EQ(&global_config_tbl.Hb_global_adapter_list[5], by_number(1));
  EXPECT_EQ(6, Hash_entries(global_config_tbl.adap_hash));
  EXPECT_EQ(5, Hash_entries(global_config_tbl.ip_hash));
}

TEST_F(ConfigurationLoad, OfTwoRecordsWithOneNumberTheLaterIsFoundByIt) {
  reload(sparse_cluster().adapter(17, "10.0.9.9", 2));
  EXPECT_EQ(6, global_config_tbl.Hb_num_adapters);
  EXPECT_EQ(&global_config_tbl.Hb_global_adapter_list[5], by_number(17));
  EXPECT_EQ(5, Hash_entries(global_config_tbl.adap_hash));
  EXPECT_EQ(6, Hash_entries(global_config_tbl.ip_hash));
}

// ---- Tables ----

TEST_F(ConfigurationLoad, TheTablesHaveTheirNames) {
  EXPECT_STREQ("Hb_Adapter list", global_config_tbl.adap_hash->name);
  EXPECT_STREQ("preVEX_node list", global_config_tbl.node_hash->name);
  EXPECT_STREQ("preVEX_Hb_IP list", global_config_tbl.ip_hash->name);
}

TEST_F(ConfigurationLoad, SmallTablesHaveTheFewestBucketsAndTheNodeTable4099) {
  EXPECT_EQ(257, global_config_tbl.adap_hash->size);
  EXPECT_EQ(257, global_config_tbl.ip_hash->size);
  EXPECT_EQ(4099, global_config_tbl.node_hash->size);
}

// Adapters 0 to count - 1 of one node, each with an address of its own.
ConfigurationMessage one_node_of(uint32_t count) {
  ConfigurationMessage configuration;
  configuration.max_nodes(1).adapters_per_node(static_cast<int32_t>(count));
  for (uint32_t adapter = 0; adapter < count; ++adapter) {
    configuration.adapter(adapter, "10.1." + std::to_string(adapter / 256) + "." + std::to_string(adapter % 256));
  }
  return configuration;
}

TEST_F(ConfigurationLoad, AdapterTablesHaveTwiceAsManyBucketsAsAdaptersRaisedToAPrime) {
  reload(one_node_of(200));
  EXPECT_EQ(401, global_config_tbl.adap_hash->size);
  EXPECT_EQ(401, global_config_tbl.ip_hash->size);
  reload(one_node_of(264));  // 528, and 529 is the square of 23, which passes
  EXPECT_EQ(529, global_config_tbl.adap_hash->size);
}

// ---- Nodes ----

TEST_F(ConfigurationLoad, NodesAreListedInTheOrderInWhichTheirAdaptersCome) {
  ASSERT_EQ(3, global_config_tbl.Hb_num_nodes);
  EXPECT_EQ(3, global_config_tbl.node_list[0].node_num);
  EXPECT_EQ(0, global_config_tbl.node_list[1].node_num);
  EXPECT_EQ(4, global_config_tbl.node_list[2].node_num);
  EXPECT_EQ(3, Hash_entries(global_config_tbl.node_hash));
}

TEST_F(ConfigurationLoad, EachNodeIsFoundByItsNumberInTheList) {
  EXPECT_EQ(&global_config_tbl.node_list[0], by_node(3));
  EXPECT_EQ(&global_config_tbl.node_list[1], by_node(0));
  EXPECT_EQ(&global_config_tbl.node_list[2], by_node(4));
  EXPECT_EQ(nullptr, by_node(1));
}

TEST_F(ConfigurationLoad, TheNodeListHasRoomFor2049Nodes) {
  ConfigurationMessage configuration;
  configuration.max_nodes(2049).adapters_per_node(1);
  for (uint32_t adapter = 0; adapter < 2049; ++adapter) configuration.adapter(adapter, "10.0.0.1");
  reload(configuration);
  EXPECT_EQ(2049, global_config_tbl.Hb_num_nodes);
  EXPECT_EQ(2048, global_config_tbl.node_list[2048].node_num);
  EXPECT_EQ(&global_config_tbl.node_list[2048], by_node(2048));
  EXPECT_EQ(2049, global_num_nodes);
}

TEST_F(ConfigurationLoad, TheNodeTableFollowsTheAdapters) {
  EXPECT_THAT(present_nodes(), ElementsAre(0, 3, 4));
  EXPECT_EQ(3, global_num_nodes);
}

// ---- Networks ----

TEST_F(ConfigurationLoad, NetworksAreCopiedIntoTheirSlots) {
  EXPECT_STREQ("net_ether_01", global_config_tbl.Hb_global_network_list[0].Hb_network_name);
  EXPECT_STREQ("ether", global_config_tbl.Hb_global_network_list[0].Hb_network_type);
  EXPECT_STREQ("", global_config_tbl.Hb_global_network_list[2].Hb_network_name);
  EXPECT_STREQ("net_disk_01", global_config_tbl.Hb_global_network_list[3].Hb_network_name);
  EXPECT_STREQ("disk", global_config_tbl.Hb_global_network_list[3].Hb_network_type);
}

TEST_F(ConfigurationLoad, ANetworkIsCopiedWithAll86Bytes) {
  reload(sparse_cluster().network(std::string(70, 'n'), std::string(16, 't')));
  EXPECT_EQ(std::string(70, 'n') + std::string(16, 't'),
            Bytes(reinterpret_cast<const char*>(&global_config_tbl.Hb_global_network_list[4]), 86));
}

TEST_F(ConfigurationLoad, SlotsBeyondTheNetworksSentKeepWhatTheyHeld) {
  reload(sparse_cluster().network("fifth"));
  reload(sparse_cluster());
  EXPECT_EQ(4, global_config_tbl.Hb_num_networks);
  EXPECT_STREQ("fifth", global_config_tbl.Hb_global_network_list[4].Hb_network_name);
}

TEST_F(ConfigurationLoad, All48NetworksAreTaken) {
  ConfigurationMessage configuration = one_node_of(1);
  for (int network = 0; network < 48; ++network) configuration.network("net" + std::to_string(network));
  reload(configuration);
  EXPECT_EQ(48, global_config_tbl.Hb_num_networks);
  EXPECT_STREQ("net47", global_config_tbl.Hb_global_network_list[47].Hb_network_name);
}

// ---- Small ones ----

TEST_F(ConfigurationLoad, AConfigurationWithoutAdaptersAndNetworksIsTaken) {
  reload(ConfigurationMessage().max_nodes(4).adapters_per_node(2));
  EXPECT_EQ(0, global_config_tbl.Hb_num_adapters);
  EXPECT_EQ(0, global_config_tbl.Hb_num_nodes);
  EXPECT_EQ(0, global_num_nodes);
  EXPECT_EQ(257, global_config_tbl.adap_hash->size);
  Hb_Adapter_Number adapter = 0;
  Hb_Cursor cursor = 0;
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_first_configured_adapter_number(&adapter, &cursor); }));
}

TEST_F(ConfigurationLoad, AConfigurationWithoutNodeNumbersIsTaken) {
  reload(ConfigurationMessage().max_nodes(0).adapters_per_node(1));
  Hb_Node_Number node = 0;
  Hb_Cursor cursor = 0;
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_first_configured_node_number(&node, &cursor); }));
  EXPECT_EQ(-1, node);
}

TEST_F(ConfigurationLoad, AnAdapterBeyondTheNodesStaysInTheListAndBelongsToNoNode) {
  reload(sparse_cluster().adapter(32, "10.9.9.9").adapter(0xFFFFFFFFU, "10.9.9.8"));
  EXPECT_EQ(7, global_config_tbl.Hb_num_adapters);
  EXPECT_EQ(&global_config_tbl.Hb_global_adapter_list[5], by_number(32));
  EXPECT_EQ(&global_config_tbl.Hb_global_adapter_list[6], by_number(0xFFFFFFFFU));
  EXPECT_EQ(3, global_config_tbl.Hb_num_nodes);
  EXPECT_EQ(3, global_num_nodes);
  EXPECT_EQ(nullptr, by_node(8));
  Hb_Node_Number node = 99;
  EXPECT_TRUE(fails_with(4, [&] { return hb_get_node_number_by_adapter_number(32, &node); }));
}

TEST_F(ConfigurationLoad, MoreAdaptersBeyondTheNodesThanTheNodeListHoldsAreTaken) {
  ConfigurationMessage configuration;
  configuration.max_nodes(1).adapters_per_node(1);
  for (uint32_t adapter = 0; adapter < 3000; ++adapter) configuration.adapter(adapter, "10.0.0.1");
  reload(configuration);
  EXPECT_EQ(3000, global_config_tbl.Hb_num_adapters);
  EXPECT_EQ(1, global_config_tbl.Hb_num_nodes);
  EXPECT_EQ(1, global_num_nodes);
}

// ---- Trace ----

class TracedLoad : public testing::Test {
 protected:
  ~TracedLoad() override {
    trace_nothing();
    unload();
  }

  static ConfigurationMessage two_adapters_of_one_address() {
    return ConfigurationMessage()
        .max_nodes(8)
        .adapters_per_node(4)
        .adapter(13, "10.0.1.3", 1, "en1", 1)
        .adapter(2, "10.0.1.3", 0, "en0", 2);
  }
};

TEST_F(TracedLoad, EachAdapterIsTracedWithItsNode) {
  trace_only(trace_info);
  load(sparse_cluster());
  std::vector<std::vector<uint32_t>> values;
  for (const Recorded_Trace& trace : platform_double().traces) {
    EXPECT_EQ(118U, trace.id);
    EXPECT_EQ(1, trace.category);
    EXPECT_EQ("_HBC", trace.component);
    values.push_back(trace.values);
  }
  EXPECT_THAT(values, ElementsAre(ElementsAre(13, 3), ElementsAre(0, 0), ElementsAre(12, 3), ElementsAre(17, 4),
                                  ElementsAre(2, 0)));
}

TEST_F(TracedLoad, ARepeatedAddressIsTracedBehindItsAdapter) {
  trace_only(trace_info);
  load(two_adapters_of_one_address());
  ASSERT_THAT(platform_double().trace_ids(), ElementsAre(118, 118, 119));
  const Recorded_Trace& trace = platform_double().traces[2];
  EXPECT_EQ(1, trace.category);
  ASSERT_EQ(4U, trace.blocks.size());
  EXPECT_EQ("10.0.1.3", trace.block_text(0));
  EXPECT_EQ("en0", trace.block_text(1));
  EXPECT_EQ(9U, trace.blocks[0].size());  // texts stand with their terminators
  EXPECT_EQ(4U, trace.blocks[1].size());
  EXPECT_EQ(2U, trace.block_value(2));
  EXPECT_EQ(2U, trace.block_value(3));
}

TEST_F(TracedLoad, ARepeatedAddressIsTracedWithTheStateAsTheRecordHoldsIt) {
  trace_only(trace_info);
  load(ConfigurationMessage().max_nodes(1).adapters_per_node(2).adapter(0, "::1").adapter(1, "::1", 0, "lo0", 0x7BCD));
  ASSERT_EQ(1U, platform_double().traces_of(119).size());
  const Recorded_Trace trace = platform_double().traces_of(119)[0];
  EXPECT_EQ("::1", trace.block_text(0));
  EXPECT_EQ("lo0", trace.block_text(1));
  EXPECT_EQ(0x7BCDU, trace.block_value(3));
}

TEST_F(TracedLoad, NothingIsTracedWithTheInfoCategoryOff) {
  trace_only(trace_errors);
  load(two_adapters_of_one_address());
  unload();
  trace_only(trace_debug);
  load(two_adapters_of_one_address());
  EXPECT_THAT(platform_double().traces, IsEmpty());
}

// ---- At the start of the client ----

class ConfigurationAtStart : public testing::Test {
 protected:
  ConfigurationAtStart() {
    reset_platform();
    forget_leftovers();
  }
  ~ConfigurationAtStart() override { hb_terminate(); }

  Hb_Rc start_with(const Bytes& answer) {
    daemon_.serve_configuration(answer);
    const Hb_Rc result = hb_init();
    connection_ = daemon_.take_connection();
    return result;
  }

 private:
  FakeDaemon daemon_;
  DaemonConnection connection_;
};

TEST_F(ConfigurationAtStart, IsLoadedFromTheAnswer) {
  EXPECT_EQ(Hb_Success, start_with(configuration_answer(sparse_cluster())));
  EXPECT_EQ(5, global_config_tbl.Hb_num_adapters);
  EXPECT_THAT(present_nodes(), ElementsAre(0, 3, 4));
  EXPECT_EQ(&global_config_tbl.Hb_global_adapter_list[3], by_number(17));
}

TEST_F(ConfigurationAtStart, HasNoSites) {
  EXPECT_EQ(Hb_Success, start_with(configuration_answer(sparse_cluster())));
  EXPECT_THAT(global_site_tbl, ElementsAre(Hb_False, Hb_False));
  EXPECT_EQ(0, global_num_sites);
}

TEST_F(ConfigurationAtStart, TheRestOfTheAnswersHeaderDoesNotMatter) {
  const Bytes answer = ReplyPacket(0)
                           .leader(1, 2)
                           .group(3, 4)
                           .status(1)
                           .name("whatever")
                           .value(9)
                           .ffdc("id")
                           .sequence(77)
                           .message(sparse_cluster().bytes())
                           .bytes();
  EXPECT_EQ(Hb_Success, start_with(answer));
  EXPECT_EQ(5, global_config_tbl.Hb_num_adapters);
}

}  // namespace
}  // namespace hb_test
