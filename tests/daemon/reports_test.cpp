/* What clients report, what they send as a sign of life, and what they have routed. */
#include <gmock/gmock.h>

#include "scripted_daemon.h"
#include "steering.h"

namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

const std::string silence_of_4 = "[[event]]\nat = \"1s\"\nkind = \"adapter-silence\"\nnode = 2\noffset = 0\n";

std::string with_short_suspicion() {
  std::string text = small_cluster;
  return text.insert(text.find("local_node ="), "suspicion = \"20ms\"\n");
}

/* Numbers of the adapters that an event names. */
std::vector<std::uint32_t> adapters_in(const Bytes& event) {
  std::vector<std::uint32_t> numbers;
  for (std::uint32_t i = 0; i <= field(event, 108); ++i) {
    numbers.push_back(field(event, 112 + std::size_t{i} * 8));
  }
  return numbers;
}

TEST(Report, that_an_adapter_is_down_is_believed) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllAdapters, 3, "s");
  client.send(request_with_number(206, 4));
  const auto event = client.receive();
  ASSERT_TRUE(event);
  EXPECT_EQ(field(*event, 0), 2U);
  EXPECT_THAT(adapters_in(*event), ElementsAre(4));
}

TEST(Report, that_node_0_is_down_is_believed) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllNodes, 3, "s");
  client.send(request_with_number(204, 0));
  ExpectedPacket death;
  death.kind = 5;
  death.leader = 1;
  death.group_incarnation = 2;
  death.group_status = 1;
  death.name = "s";
  death.sequence = 3;
  death.message = ByteWriter().u32(1).u32(0).u32(0).u32(0).bytes();
  EXPECT_EQ(client.receive(), death.bytes());
}

TEST(Suspicion, of_an_adapter_is_cleared_by_its_heartbeat_and_confirmed_by_its_silence) {
  ScriptedDaemon daemon(silence_of_4, 2, with_short_suspicion());
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllAdapters, 3, "s");
  daemon.go(client);
  /* Nobody notices a silence by itself. */
  EXPECT_THAT(daemon.packets(client), IsEmpty());
  client.send(ByteWriter().raw(request_with_number(205, 0)).raw(request_with_number(205, 4)).bytes());
  const auto event = client.receive();
  ASSERT_TRUE(event);
  EXPECT_EQ(field(*event, 0), 2U);
  EXPECT_THAT(adapters_in(*event), ElementsAre(4));
  EXPECT_THAT(daemon.process().log(), HasSubstr("the suspicion of adapters 0 is cleared"));
}

TEST(Suspicion, of_a_node_concerns_its_adapters) {
  ScriptedDaemon daemon(silence_of_4, 2, with_short_suspicion());
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllNodes, 3, "s");
  daemon.go(client);
  EXPECT_THAT(daemon.packets(client), IsEmpty());
  client.send(ByteWriter().raw(request_with_number(203, 0)).raw(request_with_number(203, 2)).bytes());
  const auto event = client.receive();
  ASSERT_TRUE(event);
  EXPECT_EQ(field(*event, 0), 5U);
  EXPECT_EQ(Bytes(event->begin() + 108, event->end()), ByteWriter().u32(0).u32(0).u32(1).u32(0).bytes());
  EXPECT_THAT(daemon.process().log(), HasSubstr("the suspicion of adapters 0, 1 is cleared"));
}

TEST(Suspicion, of_an_adapter_that_is_down_is_not_called_cleared) {
  ScriptedDaemon daemon(silence_of_4, 2, with_short_suspicion());
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllAdapters, 1, "s");
  daemon.go(client);
  EXPECT_THAT(daemon.packets(client), IsEmpty());
  client.send(request_with_number(206, 2));
  ASSERT_TRUE(client.receive());
  client.send(ByteWriter().raw(request_with_number(205, 2)).raw(request_with_number(205, 4)).bytes());
  const auto event = client.receive();
  ASSERT_TRUE(event);
  EXPECT_THAT(adapters_in(*event), ElementsAre(4));
  EXPECT_THAT(daemon.process().log(), HasSubstr("the suspicion of adapters 2 is over: they were down before"));
}

TEST(Report, of_somebody_unknown_changes_nothing) {
  ScriptedDaemon daemon("", 2, with_short_suspicion());
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllAdapters, 3, "s");
  for (const std::uint32_t number : {5U, 7U, 8U, 98351U}) {
    client.send(request_with_number(205, number));
    client.send(request_with_number(206, number));
  }
  for (const std::uint32_t number : {3U, 4U, 2049U, 98351U}) {
    client.send(request_with_number(203, number));
    client.send(request_with_number(204, number));
  }
  const auto next = client.configuration();
  ASSERT_TRUE(next);
  EXPECT_EQ(field(*next, 0), 0U);
  EXPECT_THAT(daemon.process().log(), HasSubstr("reports that adapter 98351 is down, which is not configured"));
}

ExpectedPacket heartbeat_settings(std::uint32_t seconds, std::uint32_t microseconds, std::uint32_t enabled,
                                  std::uint32_t process) {
  ExpectedPacket packet;
  packet.kind = 15;
  packet.name = "s";
  packet.sequence = 1;
  packet.message = ByteWriter().u32(seconds).u32(microseconds).u32(enabled).u32(process).bytes();
  return packet;
}

const Bytes heartbeat = request(222, {1, 0, 0, 0});

TEST(ClientHeartbeat, brings_what_the_daemon_expects_to_a_client_that_has_subscribed_to_it) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllNodes, 0x200, "s");
  client.send(heartbeat);
  EXPECT_EQ(client.receive(), heartbeat_settings(5, 0, 1, static_cast<std::uint32_t>(daemon.process().pid())).bytes());
}

TEST(ClientHeartbeat, brings_what_the_scenario_says) {
  ScriptedDaemon daemon("[client_heartbeat]\nthreshold = \"2500ms\"\nenabled = false\ndaemon_pid = 77\n");
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllNodes, 0x200, "s");
  client.send(heartbeat);
  EXPECT_EQ(client.receive(), heartbeat_settings(2, 500000, 0, 77).bytes());
}

TEST(ClientHeartbeat, brings_nothing_to_others_and_none_when_the_scenario_says_so) {
  ScriptedDaemon daemon;
  Connection other(daemon.socket());
  other.subscribe(SubscriptionType::AllNodes, 0x3, "s");
  other.send(heartbeat);
  const auto next = other.configuration();
  ASSERT_TRUE(next);
  EXPECT_EQ(field(*next, 0), 0U);

  ScriptedDaemon silent("[client_heartbeat]\nanswer = false\n");
  Connection client(silent.socket());
  client.subscribe(SubscriptionType::AllNodes, 0x200, "s");
  client.send(heartbeat);
  const auto following = client.configuration();
  ASSERT_TRUE(following);
  EXPECT_EQ(field(*following, 0), 0U);
}

const std::string death_of_2 = "[[event]]\nat = \"1s\"\nkind = \"adapter-death\"\nnode = 1\noffset = 0\n";
const Bytes en0 = {'e', 'n', '0'};

TEST(ManualControl, of_an_interface_keeps_its_monitor_from_changing_the_state) {
  ScriptedDaemon daemon(death_of_2);
  Connection client(daemon.socket());
  client.send(request(225, en0));
  client.subscribe(SubscriptionType::AllAdapters, 3, "s");
  daemon.go(client);
  EXPECT_THAT(daemon.packets(client), IsEmpty());
  client.send(request(226, {}));
  const auto event = client.receive();
  ASSERT_TRUE(event);
  EXPECT_EQ(field(*event, 0), 2U);
  EXPECT_THAT(adapters_in(*event), ElementsAre(2));
  EXPECT_THAT(daemon.process().log(), HasSubstr("the monitor of en0 is under manual control"));
  EXPECT_THAT(daemon.process().log(), HasSubstr("the monitor of en1 is under its own control"));
}

TEST(ManualControl, leaves_the_state_to_requests) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  client.send(request(225, {}));
  client.subscribe(SubscriptionType::AllAdapters, 3, "s");
  client.send(steer(212, 0));
  const auto event = client.receive();
  ASSERT_TRUE(event);
  EXPECT_EQ(field(*event, 0), 2U);
  EXPECT_THAT(adapters_in(*event), ElementsAre(2));
}

TEST(ManualControl, of_another_interface_or_node_changes_nothing) {
  ScriptedDaemon daemon(death_of_2 + "[[event]]\nat = \"2s\"\nkind = \"adapter-death\"\nnode = 0\noffset = 1\n");
  Connection client(daemon.socket());
  client.send(request(225, {'e', 'n', '1'}));
  client.send(request(225, {'e', 'n'}));
  client.subscribe(SubscriptionType::AllAdapters, 3, "s");
  daemon.go(client);
  const auto events = daemon.packets(client);
  ASSERT_THAT(kinds_of(events), ElementsAre(2, 2));
  EXPECT_THAT(adapters_in(events[0]), ElementsAre(2));
  EXPECT_THAT(adapters_in(events[1]), ElementsAre(1));
  EXPECT_THAT(daemon.process().log(), HasSubstr("an interface that this node does not have"));
}

ByteWriter routing_front(std::uint32_t port, std::uint32_t ttl, std::uint32_t version, std::uint32_t flag,
                         std::uint32_t nodes) {
  return ByteWriter().u32(port).u32(ttl).u32(version).zeros(36).u32(flag).u32(nodes);
}

TEST(RoutedMessage, is_counted_and_logged_with_its_destinations) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  /* Port 7000 is 0x1B58. Node 3 is not configured. */
  client.send(request(221, routing_front(0x581B, 20, 1, 0, 2).u32(0).u32(3).u32(3).raw({'a', 'b', 'c'}).bytes()));
  client.send(request(221, routing_front(0, 20, 1, 0, 1).u32(2).u32(0).bytes()));
  ASSERT_TRUE(client.configuration());
  EXPECT_THAT(daemon.process().log(), HasSubstr("message of 3 bytes to port 7000 of 2 nodes (0, 3), 1 of them up; 1 "
                                                "messages with 3 bytes so far"));
  EXPECT_THAT(daemon.process().log(),
              HasSubstr("message of 0 bytes to port 0 of 1 nodes (2), 1 of them up; 2 messages with 3 bytes so far"));
}

TEST(RoutedMessage, of_the_largest_size_is_taken) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  client.send(request(221, routing_front(0, 20, 1, 0, 1).u32(0).u32(9936).zeros(9936).bytes()));
  ASSERT_TRUE(client.configuration());
  EXPECT_THAT(daemon.process().log(), HasSubstr("message of 9936 bytes"));
}

struct Malformed {
  std::string name;
  Bytes data;
  std::string complaint;
};

void PrintTo(const Malformed& each, std::ostream* out) { *out << each.name; }

class MalformedMessage : public testing::TestWithParam<Malformed> {};

TEST_P(MalformedMessage, disconnects_its_sender_alone) {
  ScriptedDaemon daemon;
  Connection innocent(daemon.socket());
  Connection sender(daemon.socket());
  sender.send(request(221, GetParam().data));
  EXPECT_TRUE(sender.is_ended());
  EXPECT_TRUE(innocent.configuration());
  EXPECT_THAT(daemon.process().log(), HasSubstr("sent a routed message " + GetParam().complaint + "; disconnected"));
}

INSTANTIATE_TEST_SUITE_P(
    Of, MalformedMessage,
    testing::Values(
        Malformed{"no_data", {}, "in 0 bytes of data"}, Malformed{"short_front", Bytes(55), "in 55 bytes of data"},
        Malformed{"more_than_10000_bytes", routing_front(0, 20, 1, 0, 1).u32(0).u32(9937).zeros(9937).bytes(),
                  "in 10001 bytes of data"},
        Malformed{"version_2", routing_front(0, 20, 2, 0, 1).u32(0).u32(0).bytes(), "of version 2"},
        Malformed{"ttl_0", routing_front(0, 0, 1, 0, 1).u32(0).u32(0).bytes(), "with 0 hops to live"},
        Malformed{"ttl_21", routing_front(0, 21, 1, 0, 1).u32(0).u32(0).bytes(), "with 21 hops to live"},
        Malformed{"port_65536", routing_front(65536, 20, 1, 0, 1).u32(0).u32(0).bytes(), "to port 65536"},
        Malformed{"flag_2", routing_front(0, 20, 1, 2, 1).u32(0).u32(0).bytes(), "with a flag of 2"},
        Malformed{"expansion", ByteWriter().u32(0).u32(20).u32(1).zeros(32).u32(1).u32(0).u32(1).u32(0).u32(0).bytes(),
                  "with something in its reserved words"},
        Malformed{"no_nodes", routing_front(0, 20, 1, 0, 0).u32(0).bytes(), "to 0 nodes"},
        Malformed{"2050_nodes", routing_front(0, 20, 1, 0, 2050).zeros(8204).bytes(), "to 2050 nodes"},
        Malformed{"nodes_that_are_not_there", routing_front(0, 20, 1, 0, 5).zeros(20).bytes(),
                  "to 5 nodes in 76 bytes of data"},
        Malformed{"equal_nodes", routing_front(0, 20, 1, 0, 2).u32(1).u32(1).u32(0).bytes(),
                  "whose nodes are not ascending node numbers"},
        Malformed{"descending_nodes", routing_front(0, 20, 1, 0, 2).u32(2).u32(1).u32(0).bytes(),
                  "whose nodes are not ascending node numbers"},
        Malformed{"negative_node", routing_front(0, 20, 1, 0, 1).u32(0xFFFFFFFF).u32(0).bytes(),
                  "whose nodes are not ascending node numbers"},
        Malformed{"node_2049", routing_front(0, 20, 1, 0, 1).u32(2049).u32(0).bytes(),
                  "whose nodes are not ascending node numbers"},
        Malformed{"size_beyond_the_bytes", routing_front(0, 20, 1, 0, 1).u32(0).u32(2).u8(0).bytes(),
                  "of 2 bytes with 1 bytes"},
        Malformed{"size_before_the_bytes", routing_front(0, 20, 1, 0, 1).u32(0).u32(0).u8(0).bytes(),
                  "of 0 bytes with 1 bytes"},
        Malformed{"negative_size", routing_front(0, 20, 1, 0, 1).u32(0).u32(0xFFFFFFFF).bytes(),
                  "of -1 bytes with 0 bytes"}),
    [](const auto& each) { return each.param.name; });

}  // namespace
