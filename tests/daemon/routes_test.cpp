/* Routes: which they are, and how they are answered and published. */
#include "routes.h"

#include <gmock/gmock.h>

#include "address.h"
#include "published_segments.h"
#include "scripted_daemon.h"
#include "steering.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

/* Node n and network w: the address 10.w.0.n. One adapter for each network of a node, in their order. */
hbd::Configuration on_networks(const std::vector<std::vector<Hb_Network_Number>>& networks_of_nodes,
                               std::vector<hbd::Network> networks) {
  hbd::Configuration configuration;
  configuration.max_nodes = static_cast<int>(networks_of_nodes.size());
  configuration.adapters_per_node = 20;
  configuration.networks = std::move(networks);
  for (int node = 0; node < configuration.max_nodes; ++node) {
    int offset = 0;
    for (const auto network : networks_of_nodes[static_cast<std::size_t>(node)]) {
      const auto number = configuration.adapter_number(node, offset++);
      const auto text = "10." + std::to_string(network) + ".0." + std::to_string(node + 1);
      configuration.adapters[number] = {number, *hbd::parse_address(text), network, "", true};
    }
  }
  return configuration;
}

std::vector<std::string> hops(const std::optional<hbd::Route>& route) {
  std::vector<std::string> texts;
  for (const auto& hop : route ? route->hops : std::vector<Hb_IP_address6>{}) {
    texts.push_back(hbd::address_text(hop));
  }
  return texts;
}

TEST(Routes, lead_to_neighbours_directly_and_to_the_local_node_itself) {
  const auto routes = hbd::routes_of(on_networks({{0, 1}, {1}, {0}, {}}, {{"a", ""}, {"b", ""}}));
  EXPECT_THAT(hops(routes[0]), ElementsAre("10.0.0.1"));
  EXPECT_THAT(hops(routes[1]), ElementsAre("10.1.0.2"));
  EXPECT_THAT(hops(routes[2]), ElementsAre("10.0.0.3"));
  EXPECT_FALSE(routes[3]);
}

TEST(Routes, lead_over_nodes_that_are_on_both_networks) {
  const auto routes = hbd::routes_of(on_networks({{0}, {0, 1}, {1, 2}, {2}}, {{"a", ""}, {"b", ""}, {"c", ""}}));
  EXPECT_THAT(hops(routes[3]), ElementsAre("10.0.0.2", "10.1.0.3", "10.2.0.4"));
}

TEST(Routes, avoid_networks_without_ip_where_they_can) {
  /* To node 2 directly without IP, or over node 1 with it; to node 3 without IP alone. */
  const auto routes =
      hbd::routes_of(on_networks({{0, 1}, {1, 2}, {0, 2}, {0}}, {{"serial", "", false}, {"b", ""}, {"c", ""}}));
  EXPECT_THAT(hops(routes[2]), ElementsAre("10.1.0.2", "10.2.0.3"));
  EXPECT_TRUE(routes[2]->ip);
  EXPECT_THAT(hops(routes[3]), ElementsAre("10.0.0.4"));
  EXPECT_FALSE(routes[3]->ip);
}

TEST(Routes, have_at_most_11_hops) {
  std::vector<std::vector<Hb_Network_Number>> chain;
  std::vector<hbd::Network> networks;
  for (Hb_Network_Number i = 0; i < 14; ++i) {
    chain.push_back(i == 0 ? std::vector<Hb_Network_Number>{0}
                           : std::vector<Hb_Network_Number>{static_cast<Hb_Network_Number>(i - 1), i});
    networks.push_back({std::to_string(i), ""});
  }
  const auto routes = hbd::routes_of(on_networks(chain, networks));
  EXPECT_EQ(hops(routes[11]).size(), 11U);
  EXPECT_FALSE(routes[12]);
}

TEST(Routes, do_not_lead_over_adapters_without_an_address) {
  auto configuration = on_networks({{0}, {0}}, {{"a", ""}});
  configuration.adapters[20].address = {};
  EXPECT_THAT(hops(hbd::routes_of(configuration)[1]), IsEmpty());
}

constexpr std::uint32_t get_route = 211;

/* An answer with a route, or the published entry of a node: the hops in 176 bytes. */
Bytes option(Bytes hop_bytes) {
  hop_bytes.resize(176);
  return hop_bytes;
}

Bytes route_answer(const Bytes& hop_bytes) {
  ExpectedPacket packet;
  packet.kind = 8;
  packet.value = static_cast<std::uint32_t>(hop_bytes.size());
  packet.message = option(hop_bytes);
  return packet.bytes();
}

Bytes entry(std::uint32_t sequence, unsigned nonip, const Bytes& hop_bytes) {
  return ByteWriter()
      .u32(sequence)
      .u16(static_cast<unsigned>(hop_bytes.size()))
      .u16(nonip)
      .raw(option(hop_bytes))
      .bytes();
}

const std::string given_route =
    "[[route]]\nnode = 3\nhops = [\"192.0.2.1\", \"198.51.100.9\"]\nip = false\n"
    "[[event]]\nat = \"1s\"\nkind = \"configuration-update\"\nremove = [{ node = 2 }]\n";

TEST(RouteRequest, is_answered_with_the_hops_and_their_size) {
  ScriptedDaemon daemon(given_route);
  Connection client(daemon.socket());
  EXPECT_EQ(ask(client, request_with_number(get_route, 0)), route_answer(mapped(192, 0, 2, 1)));
  EXPECT_EQ(ask(client, request_with_number(get_route, 1)), route_answer(mapped(192, 0, 2, 2)));
  EXPECT_EQ(ask(client, request_with_number(get_route, 3)),
            route_answer(ByteWriter().raw(mapped(192, 0, 2, 1)).raw(mapped(198, 51, 100, 9)).bytes()));
}

TEST(RouteRequest, to_a_node_that_is_not_there_is_answered_with_no_route) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  for (const std::uint32_t node : {3U, 4U, 2049U, 98351U}) {
    EXPECT_EQ(ask(client, request_with_number(get_route, node)), answer(8, 0)) << node;
  }
}

TEST(PublishedRoutes, carry_the_number_of_the_configuration_and_get_the_next_with_it) {
  ScriptedDaemon daemon(given_route);
  const PublishedSegment published(daemon.socket(), 104);
  const Bytes to_3 = ByteWriter().raw(mapped(192, 0, 2, 1)).raw(mapped(198, 51, 100, 9)).bytes();
  EXPECT_EQ(published.bytes(0, 4 * 184), ByteWriter()
                                             .raw(entry(1, 0, mapped(192, 0, 2, 1)))
                                             .raw(entry(1, 0, mapped(192, 0, 2, 2)))
                                             .raw(entry(1, 0, mapped(192, 0, 2, 3)))
                                             .raw(entry(1, 1, to_3))
                                             .bytes());
  daemon.follow(SubscriptionType::AllAdapters, 1);
  ReaderLock(daemon.socket()).wait_for_writer();
  EXPECT_EQ(PublishedSegment(daemon.socket(), 103).word(0), 2U);
  EXPECT_EQ(published.bytes(0, 4 * 184), ByteWriter()
                                             .raw(entry(2, 0, mapped(192, 0, 2, 1)))
                                             .raw(entry(2, 0, mapped(192, 0, 2, 2)))
                                             .zeros(184)
                                             .raw(entry(2, 1, to_3))
                                             .bytes());
}

TEST(PublishedRoutes, follow_an_address_that_a_request_changes) {
  ScriptedDaemon daemon;
  const PublishedSegment published(daemon.socket(), 104);
  Connection client(daemon.socket());
  client.send(steer(208, 0));
  EXPECT_EQ(ask(client, steer(214, 0, address4(192, 0, 2, 9))), answer(10, 0));
  ASSERT_TRUE(client.configuration());
  ReaderLock(daemon.socket()).wait_for_writer();
  EXPECT_EQ(published.bytes(184, 184), entry(2, 0, mapped(192, 0, 2, 9)));
}

}  // namespace
