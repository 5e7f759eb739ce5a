/* Requests about the local node's adapters: their answers, and what the clients are told of their effect. */
#include <gmock/gmock.h>

#include "scripted_daemon.h"
#include "steering.h"

namespace {

using testing::ElementsAre;
using testing::HasSubstr;

/* Local node 1: adapter 2 on network 0, which is up, and adapter 3 on network 1, which does not work. */
constexpr unsigned public_network = 0;
constexpr unsigned storage_network = 1;
constexpr unsigned no_network = 2;

constexpr std::uint32_t enable = 207;
constexpr std::uint32_t disable = 208;
constexpr std::uint32_t interface_down = 212;
constexpr std::uint32_t interface_up = 213;
constexpr std::uint32_t configure = 214;
constexpr std::uint32_t unconfigure = 215;
constexpr std::uint32_t grace = 216;
constexpr std::uint32_t simulate_death = 217;
constexpr std::uint32_t swap_addresses = 218;
constexpr std::uint32_t state = 223;

constexpr std::uint32_t configured = 10;
constexpr std::uint32_t grace_given = 11;

constexpr std::uint32_t free_address = address4(192, 0, 2, 9);

ExpectedPacket adapter_event(std::uint32_t kind, std::uint32_t leader, std::uint32_t group, std::uint32_t sequence,
                             std::uint32_t adapter, std::uint32_t incarnation) {
  ExpectedPacket packet;
  packet.kind = kind;
  packet.leader = leader;
  packet.group_incarnation = group;
  packet.group_status = 1;
  packet.name = "s";
  packet.sequence = sequence;
  packet.message = ByteWriter().u32(0).u32(adapter).u32(incarnation).bytes();
  return packet;
}

ExpectedPacket state_answer(std::uint32_t value) {
  ExpectedPacket packet;
  packet.kind = 14;
  packet.message = ByteWriter().u32(value).bytes();
  return packet;
}

class AdapterRequest : public testing::Test {
 protected:
  Bytes status(std::uint32_t code, unsigned network, std::uint32_t value) {
    return ask(client_, steer(code, network, value));
  }
  Bytes status(std::uint32_t code, unsigned network) { return ask(client_, steer(code, network)); }
  void do_silently(std::uint32_t code, unsigned network) {
    client_.send(steer(code, network));
    ASSERT_EQ(next_kind(client_.configuration()), 0U);
  }
  static std::uint32_t next_kind(const std::optional<Bytes>& packet) { return packet ? field(*packet, 0) : 1000; }

  ScriptedDaemon daemon_;
  Connection client_{daemon_.socket()};
};

TEST_F(AdapterRequest, that_disables_it_silences_its_death_until_it_is_enabled) {
  client_.subscribe(SubscriptionType::AllAdapters, 3, "s");
  do_silently(disable, public_network);
  do_silently(interface_down, public_network);
  client_.send(steer(enable, public_network));
  EXPECT_EQ(client_.receive(), adapter_event(2, 0, 2, 2, 2, 1).bytes());
}

TEST_F(AdapterRequest, that_enables_it_tells_of_it_again_although_nothing_has_changed) {
  client_.subscribe(SubscriptionType::AllAdapters, 3, "s");
  do_silently(disable, public_network);
  client_.send(steer(enable, public_network));
  EXPECT_EQ(client_.receive(), adapter_event(3, 0, 2, 2, 2, 2).bytes());
  do_silently(disable, storage_network);
  client_.send(steer(enable, storage_network));
  EXPECT_EQ(client_.receive(), adapter_event(2, 0, 3, 4, 3, 0).bytes());
}

TEST_F(AdapterRequest, that_enables_one_that_is_enabled_tells_nothing) {
  client_.subscribe(SubscriptionType::AllAdapters, 3, "s");
  do_silently(enable, public_network);
}

TEST_F(AdapterRequest, that_switches_its_interface_brings_a_death_and_a_join) {
  client_.subscribe(SubscriptionType::AllAdapters, 3, "s");
  client_.send(steer(interface_down, public_network));
  EXPECT_EQ(client_.receive(), adapter_event(2, 0, 2, 2, 2, 1).bytes());
  client_.send(steer(interface_up, public_network));
  /* In between came the death of the node, the new groups of both kinds: 3 to 5. */
  EXPECT_EQ(client_.receive(), adapter_event(3, 0, 3, 6, 2, 2).bytes());
}

TEST_F(AdapterRequest, for_its_state_follows_what_was_done_to_it) {
  EXPECT_EQ(status(state, public_network), state_answer(2).bytes());
  EXPECT_EQ(status(state, storage_network), state_answer(3).bytes());
  client_.send(steer(interface_down, public_network));
  EXPECT_EQ(status(state, public_network), state_answer(4).bytes());
  client_.send(steer(disable, public_network));
  EXPECT_EQ(status(state, public_network), state_answer(7).bytes());
}

TEST_F(AdapterRequest, about_an_unknown_network_is_answered_so) {
  for (const unsigned network : {no_network, 0x7FFFU, 0xFFFFU}) {
    EXPECT_EQ(status(configure, network, free_address), answer(configured, 1));
    EXPECT_EQ(status(unconfigure, network), answer(configured, 1));
    EXPECT_EQ(status(swap_addresses, network, free_address), answer(configured, 1));
    EXPECT_EQ(status(grace, network, 1), answer(grace_given, 1));
    EXPECT_EQ(status(state, network), answer(14, 1));
    do_silently(enable, network);
    do_silently(interface_down, network);
  }
}

TEST_F(AdapterRequest, for_another_address_is_refused_while_it_is_enabled) {
  EXPECT_EQ(status(configure, public_network, free_address), answer(configured, 3));
  EXPECT_EQ(status(unconfigure, public_network), answer(configured, 3));
  EXPECT_EQ(status(swap_addresses, public_network, free_address), answer(configured, 3));
}

TEST_F(AdapterRequest, for_an_address_that_no_adapter_can_have_is_refused) {
  do_silently(disable, public_network);
  for (const std::uint32_t address :
       {address4(0, 0, 0, 0), address4(255, 255, 255, 255), address4(224, 0, 0, 1), address4(239, 255, 255, 255),
        address4(127, 0, 0, 1), address4(127, 255, 0, 9), address4(192, 0, 2, 1)}) {
    EXPECT_EQ(status(configure, public_network, address), answer(configured, 5)) << address;
  }
  EXPECT_EQ(status(configure, public_network, address4(192, 0, 2, 2)), answer(configured, 6));
}

TEST_F(AdapterRequest, for_another_address_is_answered_before_the_clients_are_told_of_the_change) {
  do_silently(disable, public_network);
  client_.subscribe(SubscriptionType::AllAdapters, 3, "s");
  EXPECT_EQ(status(configure, public_network, free_address), answer(configured, 0));
  const auto update = client_.receive();
  ASSERT_TRUE(update);
  EXPECT_EQ(field(*update, 0), 9U);
  EXPECT_EQ(field(*update, 104), 2U);
  EXPECT_EQ(address_of_record(*update, 2), mapped(192, 0, 2, 9));
  /* It is monitored from then on, and up. */
  EXPECT_EQ(client_.receive(), adapter_event(3, 0, 2, 3, 2, 2).bytes());
  EXPECT_EQ(status(configure, public_network, free_address), answer(configured, 3));
}

TEST_F(AdapterRequest, that_takes_its_address_leaves_it_unconfigured_until_it_gets_another) {
  do_silently(disable, public_network);
  EXPECT_EQ(status(unconfigure, public_network), answer(configured, 0));
  const auto update = client_.receive();
  ASSERT_EQ(next_kind(update), 9U);
  EXPECT_EQ(address_of_record(*update, 2), Bytes(16));
  EXPECT_EQ(state_of_record(*update, 2), 2U);
  EXPECT_EQ(status(unconfigure, public_network), answer(configured, 4));
  EXPECT_EQ(status(swap_addresses, public_network, address4(192, 0, 2, 1)), answer(configured, 4));
  EXPECT_EQ(status(state, public_network), answer(14, 4));
  EXPECT_EQ(status(configure, public_network, address4(192, 0, 2, 2)), answer(configured, 0));
  const auto second = client_.receive();
  ASSERT_EQ(next_kind(second), 9U);
  EXPECT_EQ(address_of_record(*second, 2), mapped(192, 0, 2, 2));
  EXPECT_EQ(state_of_record(*second, 2), 1U);
  EXPECT_EQ(status(state, public_network), state_answer(2).bytes());
}

TEST_F(AdapterRequest, to_swap_exchanges_two_addresses_of_this_node) {
  do_silently(disable, storage_network);
  EXPECT_EQ(status(configure, storage_network, address4(192, 0, 2, 30)), answer(configured, 0));
  ASSERT_EQ(next_kind(client_.receive()), 9U);
  do_silently(disable, public_network);
  EXPECT_EQ(status(swap_addresses, public_network, address4(192, 0, 2, 30)), answer(configured, 0));
  const auto update = client_.receive();
  ASSERT_EQ(next_kind(update), 9U);
  EXPECT_EQ(address_of_record(*update, 2), mapped(192, 0, 2, 30));
  EXPECT_EQ(address_of_record(*update, 3), mapped(192, 0, 2, 2));
}

TEST_F(AdapterRequest, to_swap_needs_another_adapter_of_this_node) {
  do_silently(disable, public_network);
  EXPECT_EQ(status(swap_addresses, public_network, address4(192, 0, 2, 1)), answer(configured, 4));
  EXPECT_EQ(status(swap_addresses, public_network, free_address), answer(configured, 4));
  EXPECT_EQ(status(swap_addresses, public_network, address4(0, 0, 0, 0)), answer(configured, 4));
  EXPECT_EQ(status(swap_addresses, public_network, address4(192, 0, 2, 2)), answer(configured, 6));
}

TEST_F(AdapterRequest, for_grace_defers_its_death_to_the_end_of_that_time) {
  client_.subscribe(SubscriptionType::AllAdapters, 3, "s");
  EXPECT_EQ(status(grace, public_network, 1), answer(grace_given, 0));
  do_silently(interface_down, public_network);
  EXPECT_EQ(client_.receive(), adapter_event(2, 0, 2, 2, 2, 1).bytes());
}

TEST_F(AdapterRequest, for_grace_spares_one_that_is_back_in_time) {
  client_.subscribe(SubscriptionType::AllAdapters, 3, "s");
  EXPECT_EQ(status(grace, public_network, 3600), answer(grace_given, 0));
  do_silently(interface_down, public_network);
  do_silently(interface_up, public_network);
  /* A later request for grace takes the place of the earlier one. */
  EXPECT_EQ(status(grace, public_network, 1), answer(grace_given, 0));
  client_.send(steer(interface_down, public_network));
  EXPECT_EQ(client_.receive(), adapter_event(2, 0, 2, 2, 2, 1).bytes());
}

TEST_F(AdapterRequest, for_grace_fails_without_a_time_or_without_monitoring) {
  EXPECT_EQ(status(grace, public_network, 0), answer(grace_given, 8));
  EXPECT_EQ(status(grace, public_network, 0xFFFFFFFF), answer(grace_given, 8));
  do_silently(disable, public_network);
  EXPECT_EQ(status(grace, public_network, 1), answer(grace_given, 8));
}

TEST_F(AdapterRequest, of_a_node_that_plays_dead_is_put_off) {
  do_silently(disable, public_network);
  client_.send(request(simulate_death, ByteWriter().u32(3600).bytes()));
  EXPECT_EQ(status(configure, public_network, free_address), answer(configured, 2));
  EXPECT_EQ(status(unconfigure, public_network), answer(configured, 2));
  EXPECT_EQ(status(swap_addresses, public_network, free_address), answer(configured, 2));
  EXPECT_EQ(status(grace, storage_network, 1), answer(grace_given, 9));
}

TEST_F(AdapterRequest, is_logged_with_its_outcome) {
  do_silently(disable, public_network);
  EXPECT_EQ(status(unconfigure, no_network), answer(configured, 1));
  EXPECT_THAT(daemon_.process().log(), HasSubstr("asks to monitor the adapter no more on network 0: successful"));
  EXPECT_THAT(daemon_.process().log(), HasSubstr("asks to take the adapter's address on network 2: no-such-network"));
}

std::string replaced(std::string text, const std::string& what, const std::string& with) {
  const auto found = text.find(what);
  EXPECT_NE(found, std::string::npos) << what;
  return text.replace(found, what.size(), with);
}

TEST(AdapterRequestOnANetworkWithoutIp, for_grace_is_not_supported) {
  ScriptedDaemon daemon("", 2, replaced(small_cluster, "type = \"ether\"", "ip = false"));
  Connection client(daemon.socket());
  EXPECT_EQ(ask(client, steer(grace, public_network, 1)), answer(grace_given, 7));
}

TEST(AdapterRequestOnANetworkThatTheNodeIsNotOn, finds_no_adapter) {
  const std::string second =
      "  { offset = 1, network = \"storage\", address = \"2001:db8::2\", type = \"en1\", up = false },\n";
  ScriptedDaemon daemon("", 2, replaced(small_cluster, second, ""));
  Connection client(daemon.socket());
  EXPECT_EQ(ask(client, steer(configure, storage_network, free_address)), answer(configured, 4));
  EXPECT_EQ(ask(client, steer(unconfigure, storage_network)), answer(configured, 4));
  EXPECT_EQ(ask(client, steer(swap_addresses, storage_network, free_address)), answer(configured, 4));
  EXPECT_EQ(ask(client, steer(state, storage_network)), answer(14, 4));
  EXPECT_EQ(ask(client, steer(grace, storage_network, 1)), answer(grace_given, 8));
}

TEST(SimulatedDeath, takes_the_local_node_down_and_brings_it_back) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllNodes, 3, "s");
  client.send(request(simulate_death, ByteWriter().u32(1).bytes()));
  ExpectedPacket death;
  death.kind = 5;
  death.group_incarnation = 2;
  death.group_status = 1;
  death.name = "s";
  death.sequence = 3; /* after the adapter's */
  death.message = ByteWriter().u32(0).u32(1).u32(0).u32(0).bytes();
  EXPECT_EQ(client.receive(), death.bytes());
  ExpectedPacket join = death;
  join.kind = 6;
  join.group_incarnation = 3;
  join.sequence = 7; /* after two new groups and the adapter's join */
  EXPECT_EQ(client.receive(), join.bytes());
}

TEST(SimulatedDeath, without_a_time_lasts_as_long_as_the_configuration_says) {
  ScriptedDaemon daemon;
  Connection client(daemon.socket());
  client.subscribe(SubscriptionType::AllNodes, 3, "s");
  client.send(request(simulate_death, ByteWriter().u32(0).bytes()));
  for (const std::uint32_t kind : {5U, 6U}) {
    const auto packet = client.receive();
    ASSERT_TRUE(packet);
    EXPECT_EQ(field(*packet, 0), kind);
  }
  EXPECT_THAT(daemon.process().log(), HasSubstr("plays dead for 1500 ms"));
}

const char* const statuses[] = {"successful",      "no-such-network",        "try-again",
                                "adapter-enabled", "adapter-not-configured", "invalid-service-address",
                                "same-address",    "not-supported",          "grace-failed",
                                "grace-timed-out"};

struct Scripted {
  std::string name;
  std::uint32_t code;
  std::size_t data;
  std::uint32_t kind;
};

void PrintTo(const Scripted& each, std::ostream* out) { *out << each.name; }

class ScriptedAnswer : public testing::TestWithParam<Scripted> {};

TEST_P(ScriptedAnswer, is_given_in_place_of_an_effect_whatever_the_status) {
  std::string script;
  for (const char* status : statuses) {
    script += "[[answer]]\nrequest = \"" + GetParam().name + "\"\nstatus = \"" + status + "\"\n";
  }
  ScriptedDaemon daemon(script);
  Connection client(daemon.socket());
  for (std::uint32_t expected = 0; expected < 10; ++expected) {
    const Bytes packet = ask(client, request(GetParam().code, Bytes(GetParam().data)));
    EXPECT_EQ(field(packet, 0), GetParam().kind);
    EXPECT_EQ(field(packet, 56), expected);
  }
  /* Nothing came of those that were called successful. */
  const Bytes packet = ask(client, steer(state, public_network));
  EXPECT_EQ(packet, state_answer(2).bytes());
}

INSTANTIATE_TEST_SUITE_P(ToEach, ScriptedAnswer,
                         testing::Values(Scripted{"configure-adapter", 214, 8, 10},
                                         Scripted{"unconfigure-adapter", 215, 2, 10},
                                         Scripted{"swap-adapters", 218, 8, 10}, Scripted{"adapter-grace", 216, 8, 11},
                                         Scripted{"adapter-state", 223, 2, 14}),
                         [](const auto& each) { return std::to_string(each.param.code); });

TEST(ScriptedAnswers, are_counted_and_those_of_count_0_never_end) {
  ScriptedDaemon daemon(
      "[[answer]]\nrequest = \"adapter-grace\"\nstatus = \"grace-timed-out\"\ncount = 2\n"
      "[[answer]]\nrequest = \"adapter-grace\"\nstatus = \"try-again\"\ncount = 0\n");
  Connection client(daemon.socket());
  std::vector<std::uint32_t> values;
  for (int i = 0; i < 6; ++i) {
    values.push_back(field(ask(client, steer(grace, public_network, 1)), 56));
  }
  EXPECT_THAT(values, ElementsAre(9, 9, 2, 2, 2, 2));
}

TEST(ScriptedAnswers, can_name_a_state) {
  ScriptedDaemon daemon(
      "[[answer]]\nrequest = \"adapter-state\"\nstatus = \"successful\"\nstate = \"cannot-open-device\"\n");
  Connection client(daemon.socket());
  EXPECT_EQ(ask(client, steer(state, public_network)), state_answer(11).bytes());
  EXPECT_EQ(ask(client, steer(state, public_network)), state_answer(2).bytes());
}

}  // namespace
