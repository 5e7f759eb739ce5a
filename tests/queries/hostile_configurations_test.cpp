// Configurations that are not usable, and texts in them without a terminator.
#include <gtest/gtest.h>

#include <ostream>
#include <thread>

#include "hb_communication/configuration_load.h"
#include "hb_communication/shared_memory.h"
#include "hostile_input.h"
#include "platform_doubles.h"

namespace hb_test {
namespace {

struct Bad_Configuration {
  const char* name;
  Bytes message;
};

void PrintTo(const Bad_Configuration& configuration, std::ostream* stream) { *stream << configuration.name; }

Bytes with_field(size_t offset, int32_t value) {
  Bytes message = sparse_cluster().bytes();
  return message.replace(offset, 4, ByteBuilder().i32(value).bytes());
}

Bytes with_nodes_and_adapters(int32_t max_nodes, int32_t adapters_per_node) {
  return ConfigurationMessage().max_nodes(max_nodes).adapters_per_node(adapters_per_node).bytes();
}

Bytes with_49_networks() {
  ConfigurationMessage configuration = sparse_cluster();
  for (int network = 4; network < 49; ++network) configuration.network("net" + std::to_string(network));
  return configuration.bytes();
}

std::vector<Bad_Configuration> bad_configurations() {
  return {
      {"NegativeNodes", with_field(4, -1)},
      {"LeastNodes", with_field(4, least)},
      {"NegativeAdaptersPerNode", with_field(8, -1)},
      {"LeastAdaptersPerNode", with_field(8, least)},
      {"NoAdapterPerNode", with_field(8, 0)},
      {"NegativeAdapters", with_field(12, -1)},
      {"LeastAdapters", with_field(12, least)},
      {"OneAdapterMoreThanSent", with_field(12, 11)},
      {"MostAdapters", with_field(12, most)},
      {"AdaptersWhoseSizeOverflows", with_field(12, 0x04000000)},
      {"NegativeNetworks", with_field(16, -1)},
      {"OneNetworkMoreThanSent", with_field(16, 5)},
      {"MoreNetworksThanSlots", with_49_networks()},
      {"MostNetworks", with_field(16, most)},
      {"MoreNodesThanTheTablesHold", with_nodes_and_adapters(2050, 1)},
      {"MostNodes", with_nodes_and_adapters(most, 1)},
      {"MoreAdapterNumbersThanTheListsHold", with_nodes_and_adapters(2049, 49)},
      {"OneAdapterNumberTooMany", with_nodes_and_adapters(1, 98353)},
      {"MostAdaptersPerNode", with_nodes_and_adapters(2, most)},
      {"NumbersWhoseProductOverflows", with_nodes_and_adapters(65536, 65536)},
      {"HeaderOnlyInPart", Bytes(51, '\1')},
      {"NoMessage", Bytes()},
  };
}

class BadConfigurations : public HostileInput, public testing::WithParamInterface<Bad_Configuration> {};

TEST_P(BadConfigurations, AreRefusedAsAnUpdateAndTheOldOneStays) {
  expect_refused(ReplyPacket(9).sequence(5).message(GetParam().message).bytes());
  int adapters = 0;
  EXPECT_EQ(Hb_Success, hb_get_number_of_configured_adapters(&adapters));
  EXPECT_EQ(5, adapters);
  Hb_Node_Number node = 0;
  EXPECT_EQ(Hb_Success, hb_get_node_number_by_adapter_number(17, &node));
  EXPECT_EQ(4, node);
}

TEST_P(BadConfigurations, FailTheStart) {
  hb_terminate();
  daemon.serve_configuration(ReplyPacket(0).message(GetParam().message).bytes());
  EXPECT_TRUE(fails_with(10, [] { return hb_init(); }));
  EXPECT_EQ(Hb_False, client_initialized);
  EXPECT_EQ(nullptr, global_config_tbl.Hb_global_adapter_list);
  EXPECT_EQ(nullptr, global_config_tbl.adap_hash);
  daemon.take_connection();
  hb_remove_client_select();
  hb_remove_socket();
  hb_detach_shared_memory();
}

INSTANTIATE_TEST_SUITE_P(HostileInput, BadConfigurations, testing::ValuesIn(bad_configurations()),
                         [](const auto& test) { return std::string(test.param.name); });

TEST_F(HostileInput, ConfigurationsAtTheLimitsAreTaken) {
  const std::vector<std::pair<int32_t, int32_t>> limits = {{2049, 48}, {1, 98352}, {98352 / 64, 64}, {0, 98352}};
  for (const auto& [nodes, adapters_per_node] : limits) {
    EXPECT_EQ(Hb_Success, deliver(ReplyPacket(9).message(with_nodes_and_adapters(nodes, adapters_per_node)).bytes()))
        << nodes;
    EXPECT_EQ(nodes, global_config_tbl.Hb_max_nodes);
    EXPECT_EQ(adapters_per_node, global_config_tbl.Hb_adapters_per_node);
  }
}

TEST_F(HostileInput, MoreAdaptersThanNumbersAreRefusedEvenWhenAllOfThemAreSent) {
  const Bytes header = ConfigurationMessage().max_nodes(2049).adapters_per_node(48).claim_adapters(98353).bytes();
  const Bytes packet = ReplyPacket(9).message(header + Bytes(98353 * sizeof(Hb_Adapter), '\0')).bytes();
  const Bytes before = image_of_state();
  std::thread sender([&] { connection.send_frame(packet); });
  EXPECT_TRUE(fails_with(10, [&] { return take(); }));
  sender.join();
  EXPECT_TRUE(out.untouched());
  EXPECT_TRUE(before == image_of_state());
}

TEST_F(HostileInput, AnEventOfTheLargestClusterFillsTheWholeListAndNothingBehindIt) {
  ASSERT_EQ(Hb_Success, deliver(ReplyPacket(9).message(with_nodes_and_adapters(2049, 48)).bytes()));
  EXPECT_EQ(Hb_Success, deliver(ReplyPacket(2).message(adapter_event_message({{98351, 3}})).bytes()));
  const Hb_Adapter_Membership_Grp& members = out.group->Hb_membership_grp_union.Hb_adapter_membership_grp;
  EXPECT_EQ(3U, members.Hb_adapter_list[98351]);
  EXPECT_EQ(0xFFFFFFFFU, members.Hb_adapter_list[98350]);
  Hb_Adapter_Identifier id = {};
  EXPECT_EQ(Hb_Success, hb_get_first_adapter(out.group.get(), &id));
  EXPECT_EQ(98351U, id.Hb_adapter_number);
  EXPECT_TRUE(fails_with(1, [&] { return hb_get_next_adapter(out.group.get(), &id); }));
}

TEST_F(HostileInput, ATruncatedConfigurationIsRefusedAtEveryLengthBeforeOneIsThere) {
  hb_terminate();
  const Bytes whole = configuration_answer(sparse_cluster());
  for (size_t length = 0; length < whole.size(); ++length) {
    const Packet packet = packet_of(whole.substr(0, length));
    EXPECT_TRUE(fails_with(10, [&] { return load_first_configuration(packet); })) << length;
    EXPECT_EQ(nullptr, global_config_tbl.adap_hash) << length;
  }
}

class EndlessTexts : public HostileInput {
 protected:
  EndlessTexts() {
    deliver(ReplyPacket(9)
                .message(ConfigurationMessage()
                             .max_nodes(1)
                             .adapters_per_node(2)
                             .adapter(0, "10.0.0.1", 0, std::string(36, 't'), 0)
                             .adapter(1, "10.0.0.1", 0, std::string(36, 'u'), 0)
                             .network(std::string(70, 'n'), std::string(16, 'k'))
                             .bytes())
                .bytes());
    std::memset(text, 'x', sizeof text);
  }
  ~EndlessTexts() override { trace_nothing(); }

  char text[128];
};

TEST_F(EndlessTexts, AnAdapterTypeIsCutToItsBufferAndTerminated) {
  EXPECT_EQ(Hb_Success, hb_get_adapter_type_by_number(0, text));
  EXPECT_EQ(std::string(35, 't'), text);
  EXPECT_EQ('x', text[36]);
}

TEST_F(EndlessTexts, ANetworkNameIsCutToItsBufferAndTerminated) {
  EXPECT_EQ(Hb_Success, hb_get_network_name_by_number(0, text));
  EXPECT_EQ(std::string(69, 'n'), text);
  EXPECT_EQ('x', text[70]);
}

TEST_F(EndlessTexts, ANetworkTypeIsCutToItsBufferAndTerminated) {
  EXPECT_EQ(Hb_Success, hb_get_network_type_by_number(0, text));
  EXPECT_EQ(std::string(15, 'k'), text);
  EXPECT_EQ('x', text[16]);
}

TEST_F(EndlessTexts, ANetworkIsFoundByTheWholeOfItsField) {
  Hb_Network_Number network = 99;
  std::string name(70, 'n');
  EXPECT_EQ(Hb_Success, hb_get_network_number_by_name(name.data(), &network));
  EXPECT_EQ(0, network);
  std::string longer = name + std::string(16, 'k');
  EXPECT_TRUE(fails_with(8, [&] { return hb_get_network_number_by_name(longer.data(), &network); }));
}

TEST_F(EndlessTexts, ATypeIsTracedToTheEndOfItsField) {
  trace_only(trace_info);
  EXPECT_EQ(Hb_Success, hb_get_adapter_type_by_number(0, text));
  ASSERT_EQ(1U, platform_double().traces.size());
  EXPECT_EQ(std::string(36, 't'), platform_double().traces[0].block_text(0));
}

TEST_F(EndlessTexts, ATypeOfARepeatedAddressIsTracedToTheEndOfItsField) {
  trace_only(trace_info);
  deliver(ReplyPacket(9)
              .message(ConfigurationMessage()
                           .max_nodes(1)
                           .adapters_per_node(2)
                           .adapter(0, "10.0.0.1")
                           .adapter(1, "10.0.0.1", 0, std::string(36, 'u'))
                           .bytes())
              .bytes());
  ASSERT_EQ(1U, platform_double().traces_of(119).size());
  EXPECT_EQ(std::string(36, 'u'), platform_double().traces_of(119)[0].block_text(1));
}

}  // namespace
}  // namespace hb_test
