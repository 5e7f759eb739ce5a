/* Events as bytes: each field of each kind. */
#include <gmock/gmock.h>

#include "scripted_daemon.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

constexpr std::uint32_t death = 1;
constexpr std::uint32_t join = 2;
constexpr std::uint32_t new_group = 4;

Bytes adapter_list(const std::vector<std::pair<std::uint32_t, std::uint32_t>>& entries) {
  ByteWriter message;
  message.u32(static_cast<std::uint32_t>(entries.size()) - 1);
  for (const auto& [adapter, incarnation] : entries) {
    message.u32(adapter).u32(incarnation);
  }
  return message.bytes();
}

Bytes node_list(const std::vector<std::uint32_t>& nodes) {
  ByteWriter message;
  for (const auto node : nodes) {
    message.u32(node);
  }
  return message.bytes();
}

Bytes adapter_record(const Bytes& address, unsigned network, const std::string& type, std::uint32_t number,
                     std::uint32_t state) {
  return ByteWriter().raw(address).u16(network).text(type, 36).u16(0).u32(number).u32(state).bytes();
}

Bytes ipv4(unsigned last) {
  return {0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0xFF, 0xFF, 192, 0, 2, static_cast<std::uint8_t>(last)};
}

Bytes ipv6(unsigned last) {
  return {0x20, 0x01, 0x0d, 0xb8, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0, static_cast<std::uint8_t>(last)};
}

Bytes network_record(const std::string& name, const std::string& type) {
  return ByteWriter().text(name, 70).text(type, 16).bytes();
}

ByteWriter configuration_header(std::uint32_t adapters) {
  ByteWriter header;
  header.u32(1).u32(4).u32(2).u32(adapters).u32(2).u64(7).u64(0).u64(1).u64(500000);
  return header;
}

TEST(Configuration, is_answered_byte_for_byte) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  ExpectedPacket expected;
  expected.kind = 0;
  expected.message = configuration_header(5)
                         .raw(adapter_record(ipv4(1), 0, "en0", 0, 1))
                         .raw(adapter_record(ipv6(1), 1, "en1", 1, 1))
                         .raw(adapter_record(ipv4(2), 0, "en0", 2, 1))
                         .raw(adapter_record(ipv6(2), 1, "en1", 3, 2))
                         .raw(adapter_record(ipv4(3), 0, "", 4, 1))
                         .raw(network_record("public", "ether"))
                         .raw(network_record("storage", ""))
                         .bytes();
  EXPECT_EQ(client.configuration(), expected.bytes());
}

TEST(FirstEvent, of_all_adapters_is_the_whole_group_under_number_1) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllAdapters, new_group, "everything");
  ExpectedPacket expected;
  expected.kind = 4;
  expected.leader = 0;
  expected.group_incarnation = 1;
  expected.name = "everything";
  expected.sequence = 1;
  expected.message = adapter_list({{0, 1}, {1, 1}, {2, 1}, {4, 1}});
  EXPECT_EQ(client.receive(), expected.bytes());
}

TEST(FirstEvent, of_all_nodes_is_the_whole_group_with_one_truth_value_a_node_number) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllNodes, new_group, "nodes");
  ExpectedPacket expected;
  expected.kind = 7;
  expected.leader = 0;
  expected.group_incarnation = 1;
  expected.name = "nodes";
  expected.sequence = 1;
  expected.message = node_list({1, 1, 1, 0});
  EXPECT_EQ(client.receive(), expected.bytes());
}

TEST(FirstEvent, of_some_adapters_or_of_a_network_is_the_whole_group_too) {
  for (const auto type : {SubscriptionType::Adapter, SubscriptionType::Network}) {
    ScriptedDaemon daemon;
    Connection client(daemon.socket());
    client.subscribe(type, new_group, "some", {0x40});
    const auto packet = client.receive();
    ASSERT_TRUE(packet);
    EXPECT_EQ(field(*packet, 0), 4U);
    EXPECT_EQ(Bytes(packet->begin() + 108, packet->end()), adapter_list({{0, 1}, {1, 1}, {2, 1}, {4, 1}}));
  }
}

TEST(FirstEvent, of_some_nodes_is_the_whole_group_too) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::Node, new_group, "some", {0x80});
  const auto packet = client.receive();
  ASSERT_TRUE(packet);
  EXPECT_EQ(field(*packet, 0), 7U);
  EXPECT_EQ(Bytes(packet->begin() + 108, packet->end()), node_list({1, 1, 1, 0}));
}

TEST(FirstEvent, is_not_sent_when_the_mask_asks_for_no_new_groups) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllAdapters, death | join, "s");
  const auto packet = client.configuration();
  ASSERT_TRUE(packet);
  EXPECT_EQ(field(*packet, 0), 0U);
}

TEST(FirstEvent, is_not_sent_for_sites_nor_for_splits_and_merges_nor_for_other_instances) {
  ScriptedDaemon daemon("", 100);
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::DifferentInstance, 0x100, "a");
  client.subscribe(SubscriptionType::Site, 7, "b", {0xFF});
  client.subscribe(SubscriptionType::AllSites, 0x60, "c");
  client.subscribe(SubscriptionType::SplitMerge, 0x3000, "d");
  const auto packet = client.configuration();
  ASSERT_TRUE(packet);
  EXPECT_EQ(field(*packet, 0), 0U);
}

TEST(AdapterDeath, lists_the_dead_adapter_and_then_comes_the_new_group) {
  ScriptedDaemon daemon("[[event]]\nat = \"1s\"\nkind = \"adapter-death\"\nnode = 0\noffset = 0\n");
  ExpectedPacket dead;
  dead.kind = 2;
  dead.leader = 1;
  dead.group_incarnation = 2;
  dead.group_status = 1;
  dead.name = "s";
  dead.sequence = 2;
  dead.message = adapter_list({{0, 1}});
  ExpectedPacket group;
  group.kind = 4;
  group.leader = 1;
  group.group_incarnation = 2;
  group.name = "s";
  group.sequence = 3;
  group.message = adapter_list({{1, 1}, {2, 1}, {4, 1}});
  EXPECT_THAT(daemon.follow(SubscriptionType::AllAdapters, death | join | new_group),
              ElementsAre(testing::_, dead.bytes(), group.bytes()));
}

TEST(AdapterJoin, lists_the_adapter_with_its_next_incarnation) {
  ScriptedDaemon daemon(
      "[[event]]\nat = \"1s\"\nkind = \"adapter-death\"\nnode = 0\noffset = 0\n"
      "[[event]]\nat = \"2s\"\nkind = \"adapter-join\"\nnode = 0\noffset = 0\n");
  ExpectedPacket joined;
  joined.kind = 3;
  joined.leader = 0;
  joined.group_incarnation = 3;
  joined.group_status = 1;
  joined.name = "s";
  joined.sequence = 4;
  joined.message = adapter_list({{0, 2}});
  EXPECT_THAT(daemon.follow(SubscriptionType::AllAdapters, join), ElementsAre(joined.bytes()));
}

TEST(NodeDeath, kills_the_adapters_then_the_node_and_carries_its_failure_data) {
  ScriptedDaemon daemon("[[event]]\nat = \"1s\"\nkind = \"node-death\"\nnode = 0\nffdc_id = \"crash.7\"\n", 3);
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllAdapters, death | new_group, "a");
  client.subscribe(SubscriptionType::AllNodes, death | new_group, "n");
  daemon.go(client);

  ExpectedPacket adapters;
  adapters.kind = 2;
  adapters.leader = 2;
  adapters.group_incarnation = 2;
  adapters.group_status = 1;
  adapters.name = "a";
  adapters.sequence = 2;
  adapters.message = adapter_list({{0, 1}, {1, 1}});
  ExpectedPacket node;
  node.kind = 5;
  node.leader = 1;
  node.group_incarnation = 2;
  node.group_status = 1;
  node.name = "n";
  node.ffdc_id = "crash.7";
  node.sequence = 3;
  node.message = node_list({1, 0, 0, 0});
  ExpectedPacket adapter_group;
  adapter_group.kind = 4;
  adapter_group.leader = 2;
  adapter_group.group_incarnation = 2;
  adapter_group.name = "a";
  adapter_group.sequence = 4;
  adapter_group.message = adapter_list({{2, 1}, {4, 1}});
  ExpectedPacket node_group;
  node_group.kind = 7;
  node_group.leader = 1;
  node_group.group_incarnation = 2;
  node_group.name = "n";
  node_group.sequence = 5;
  node_group.message = node_list({0, 1, 1, 0});
  EXPECT_THAT(daemon.packets(client), ElementsAre(testing::_, testing::_, adapters.bytes(), node.bytes(),
                                                  adapter_group.bytes(), node_group.bytes()));
}

TEST(NodeJoin, lists_the_node_with_its_failure_data) {
  ScriptedDaemon daemon(
      "[[event]]\nat = \"1s\"\nkind = \"node-death\"\nnode = 2\n"
      "[[event]]\nat = \"2s\"\nkind = \"node-join\"\nnode = 2\nffdc_id = \"back\"\n");
  ExpectedPacket joined;
  joined.kind = 6;
  joined.leader = 0;
  joined.group_incarnation = 3;
  joined.group_status = 1;
  joined.name = "s";
  joined.ffdc_id = "back";
  joined.sequence = 7;
  joined.message = node_list({0, 0, 1, 0});
  EXPECT_THAT(daemon.follow(SubscriptionType::AllNodes, join), ElementsAre(joined.bytes()));
}

TEST(NetworkLoss, kills_its_adapters_in_one_event_and_the_nodes_without_another) {
  ScriptedDaemon daemon("[[event]]\nat = \"1s\"\nkind = \"network-loss\"\nnetwork = \"public\"\n", 3);
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllAdapters, death, "a");
  client.subscribe(SubscriptionType::AllNodes, death, "n");
  daemon.go(client);
  const auto packets = daemon.packets(client);
  ASSERT_THAT(kinds_of(packets), ElementsAre(2, 5));
  EXPECT_EQ(Bytes(packets[0].begin() + 108, packets[0].end()), adapter_list({{0, 1}, {2, 1}, {4, 1}}));
  EXPECT_EQ(Bytes(packets[1].begin() + 108, packets[1].end()), node_list({0, 1, 1, 0}));
}

TEST(NetworkReturn, brings_its_adapters_back_those_aside_that_are_broken) {
  ScriptedDaemon daemon(
      "[[event]]\nat = \"1s\"\nkind = \"network-loss\"\nnetwork = \"storage\"\n"
      "[[event]]\nat = \"2s\"\nkind = \"network-return\"\nnetwork = \"storage\"\n");
  const auto packets = daemon.follow(SubscriptionType::AllAdapters, join);
  ASSERT_THAT(kinds_of(packets), ElementsAre(3));
  EXPECT_EQ(Bytes(packets[0].begin() + 108, packets[0].end()), adapter_list({{1, 2}}));
}

const std::string swap_nodes =
    "[[event]]\nat = \"1s\"\nkind = \"configuration-update\"\nremove = [{ node = 2 }]\n"
    "add = [{ node = 3, offset = 0, network = \"storage\", address = \"192.0.2.9\", type = \"en9\" }]\n";

TEST(ConfigurationUpdate, is_sent_between_the_deaths_and_the_joins_to_a_client_that_asked_for_the_configuration) {
  ScriptedDaemon daemon(swap_nodes, 3);
  Connection client(daemon.socket());
  ASSERT_TRUE(client.configuration());
  client.subscribe(SubscriptionType::AllAdapters, death | join, "a");
  client.subscribe(SubscriptionType::AllNodes, death | join, "n");
  daemon.go(client);
  const auto packets = daemon.packets(client);
  ASSERT_THAT(kinds_of(packets), ElementsAre(2, 5, 9, 3, 6));
  ExpectedPacket update;
  update.kind = 9;
  update.sequence = 4;
  update.message = configuration_header(5)
                       .raw(adapter_record(ipv4(1), 0, "en0", 0, 1))
                       .raw(adapter_record(ipv6(1), 1, "en1", 1, 1))
                       .raw(adapter_record(ipv4(2), 0, "en0", 2, 1))
                       .raw(adapter_record(ipv6(2), 1, "en1", 3, 2))
                       .raw(adapter_record(ipv4(9), 1, "en9", 6, 1))
                       .raw(network_record("public", "ether"))
                       .raw(network_record("storage", ""))
                       .bytes();
  EXPECT_EQ(packets[2], update.bytes());
}

TEST(ConfigurationUpdate, marks_the_adapters_that_died_because_they_were_removed) {
  ScriptedDaemon daemon(swap_nodes);
  const auto packets = daemon.follow(SubscriptionType::AllAdapters, death);
  ASSERT_THAT(kinds_of(packets), ElementsAre(2));
  EXPECT_EQ(Bytes(packets[0].begin() + 108, packets[0].end()), adapter_list({{4, 0x08000001}}));
}

TEST(ConfigurationUpdate, is_not_sent_to_a_client_that_never_asked_for_the_configuration) {
  ScriptedDaemon daemon(swap_nodes);
  EXPECT_THAT(kinds_of(daemon.follow(SubscriptionType::AllAdapters, 0x7377)), ElementsAre(4, 2, 3, 4));
}

TEST(FailureData, goes_to_a_mask_with_its_bit_and_carries_the_identifier_in_the_header) {
  ScriptedDaemon daemon(
      "[[event]]\nat = \"1s\"\nkind = \"ffdc-id\"\nid = \"an identifier of forty-two characters.....\"\n");
  ExpectedPacket expected;
  expected.kind = 12;
  expected.name = "s";
  expected.ffdc_id = "an identifier of forty-two characters.....";
  expected.sequence = 2;
  EXPECT_EQ(daemon.follow(SubscriptionType::AllAdapters, 8).at(0), expected.bytes());
}

TEST(FailureData, goes_once_and_without_a_name_to_a_client_that_asked_for_the_configuration) {
  ScriptedDaemon daemon("[[event]]\nat = \"1s\"\nkind = \"ffdc-id\"\nid = \"x\"\n", 2);
  Connection client(daemon.socket());
  ASSERT_TRUE(client.configuration());
  client.subscribe(SubscriptionType::AllAdapters, death, "a");
  client.subscribe(SubscriptionType::AllNodes, death, "n");
  ExpectedPacket expected;
  expected.kind = 12;
  expected.ffdc_id = "x";
  expected.sequence = 2;
  EXPECT_EQ(client.receive(), expected.bytes());
  expected.ffdc_id = "end";
  expected.sequence = 3;
  EXPECT_EQ(client.receive(), expected.bytes());
}

TEST(DifferentInstance, carries_the_senders_address_and_instance_in_20_bytes) {
  ScriptedDaemon daemon(
      "[[event]]\nat = \"1s\"\nkind = \"different-instance\"\naddress = \"192.0.2.99\"\ninstance = 4026531841\n");
  ExpectedPacket expected;
  expected.kind = 13;
  expected.name = "s";
  expected.sequence = 2;
  expected.message = ByteWriter().raw(ipv4(99)).u32(0xF0000001).bytes();
  EXPECT_THAT(daemon.follow(SubscriptionType::DifferentInstance, 0x100), ElementsAre(expected.bytes()));
}

TEST(Heartbeat, carries_threshold_switch_and_process_in_16_bytes) {
  ScriptedDaemon daemon(
      "[[event]]\nat = \"1s\"\nkind = \"heartbeat\"\nthreshold = \"2250ms\"\nenabled = true\ndaemon_pid = 4711\n");
  ExpectedPacket expected;
  expected.kind = 15;
  expected.name = "s";
  expected.sequence = 2;
  expected.message = ByteWriter().u32(2).u32(250000).u32(1).u32(4711).bytes();
  EXPECT_THAT(daemon.follow(SubscriptionType::AllNodes, 0x200), ElementsAre(expected.bytes()));
}

TEST(Mask, without_their_bits_holds_back_failure_data_other_instances_and_heartbeats) {
  ScriptedDaemon daemon(
      "[[event]]\nat = \"1s\"\nkind = \"ffdc-id\"\nid = \"x\"\n"
      "[[event]]\nat = \"1s\"\nkind = \"different-instance\"\naddress = \"192.0.2.99\"\ninstance = 1\n"
      "[[event]]\nat = \"1s\"\nkind = \"heartbeat\"\nthreshold = \"1s\"\n",
      3);
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllNodes, 0x7377 & ~0x308U, "a");
  client.subscribe(SubscriptionType::AllAdapters, 0x7377 & ~0x308U, "b");
  daemon.go(client);
  /* The end itself goes by its bit; the first identifier comes under that subscription's name alone. */
  const auto packets = daemon.packets(client);
  ASSERT_THAT(kinds_of(packets), ElementsAre(7, 4, 12));
  EXPECT_EQ(text_field(packets[2], 24), "end");
}

const std::string two_deaths_and_a_join =
    "[[event]]\nat = \"1s\"\nkind = \"adapter-death\"\nnode = 0\noffset = 1\n"
    "[[event]]\nat = \"2s\"\nkind = \"adapter-death\"\nnode = 2\noffset = 0\n"
    "[[event]]\nat = \"3s\"\nkind = \"adapter-join\"\nnode = 0\noffset = 1\n";

TEST(Mask, of_deaths_lets_only_deaths_through) {
  ScriptedDaemon daemon(two_deaths_and_a_join);
  EXPECT_THAT(kinds_of(daemon.follow(SubscriptionType::AllAdapters, death)), ElementsAre(2, 2));
}

TEST(Mask, of_new_groups_lets_only_new_groups_through) {
  ScriptedDaemon daemon(two_deaths_and_a_join);
  EXPECT_THAT(kinds_of(daemon.follow(SubscriptionType::AllAdapters, new_group)), ElementsAre(4, 4, 4, 4));
}

TEST(Members, are_the_bits_of_the_set_with_the_most_significant_bit_first) {
  for (const auto type : {SubscriptionType::Adapter, SubscriptionType::Network}) {
    ScriptedDaemon daemon(two_deaths_and_a_join);
    const auto packets = daemon.follow(type, death | join, {0x40}); /* adapter 1 */
    ASSERT_THAT(kinds_of(packets), ElementsAre(2, 3));
    EXPECT_EQ(Bytes(packets[0].begin() + 108, packets[0].end()), adapter_list({{1, 1}}));
    EXPECT_EQ(Bytes(packets[1].begin() + 108, packets[1].end()), adapter_list({{1, 2}}));
  }
}

TEST(Members, of_nodes_are_told_of_these_nodes_only) {
  ScriptedDaemon daemon(two_deaths_and_a_join); /* node 2 dies with its only adapter */
  EXPECT_THAT(kinds_of(daemon.follow(SubscriptionType::Node, death, {0x20})), ElementsAre(5));
  ScriptedDaemon again(two_deaths_and_a_join);
  EXPECT_THAT(kinds_of(again.follow(SubscriptionType::Node, death, {0xDF, 0xFF})), IsEmpty());
}

TEST(Members, that_left_the_group_are_told_of_the_new_group_without_them) {
  ScriptedDaemon daemon("[[event]]\nat = \"1s\"\nkind = \"adapter-death\"\nnode = 2\noffset = 0\n");
  EXPECT_THAT(kinds_of(daemon.follow(SubscriptionType::Adapter, new_group, {0x08})), ElementsAre(4, 4));
}

TEST(Members, that_have_no_part_in_the_group_are_not_told_of_a_new_one) {
  ScriptedDaemon daemon("[[event]]\nat = \"1s\"\nkind = \"adapter-death\"\nnode = 2\noffset = 0\n");
  /* Adapter 3 is down all the time: the first event is all there is. */
  EXPECT_THAT(kinds_of(daemon.follow(SubscriptionType::Adapter, new_group, {0x10})), ElementsAre(4));
}

TEST(Change, that_makes_no_difference_is_not_told) {
  ScriptedDaemon daemon("[[event]]\nat = \"1s\"\nkind = \"adapter-join\"\nnode = 0\noffset = 1\n");
  EXPECT_THAT(daemon.follow(SubscriptionType::AllAdapters, death | join), IsEmpty());
}

TEST(EmptyGroup, has_no_leader_and_no_entries) {
  ScriptedDaemon daemon(
      "[[event]]\nat = \"1s\"\nkind = \"network-loss\"\nnetwork = \"public\"\n"
      "[[event]]\nat = \"2s\"\nkind = \"network-loss\"\nnetwork = \"storage\"\n",
      3);
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllAdapters, new_group, "a");
  client.subscribe(SubscriptionType::AllNodes, new_group, "n");
  daemon.go(client);
  const auto packets = daemon.packets(client);
  ASSERT_THAT(kinds_of(packets), ElementsAre(4, 7, 4, 7, 4, 7));
  EXPECT_EQ(field(packets[4], 4), 0xFFFFFFFFU);
  EXPECT_EQ(Bytes(packets[4].begin() + 108, packets[4].end()), Bytes({0xFF, 0xFF, 0xFF, 0xFF}));
  EXPECT_EQ(field(packets[5], 4), 0xFFFFFFFFU);
  EXPECT_EQ(Bytes(packets[5].begin() + 108, packets[5].end()), node_list({0, 0, 0, 0}));
}

}  // namespace
