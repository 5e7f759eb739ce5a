/* Scenarios, and what is said about mistakes in them. */
#include "scenario_parser.h"

#include <gtest/gtest.h>

#include <array>
#include <chrono>
#include <cstring>

#include "address.h"
#include "built_in_scenario.h"
#include "duration.h"
#include "small_cluster.h"

namespace {

using hbd::parse_scenario;
using namespace std::chrono_literals;

hbd::Scenario scenario_of(const std::string& text) {
  auto result = parse_scenario(text);
  if (const auto* error = std::get_if<hbd::ScenarioError>(&result)) {
    ADD_FAILURE() << error->line << ": " << error->text;
    return {};
  }
  return std::get<hbd::Scenario>(result);
}

TEST(Scenario, holds_the_cluster_that_the_text_describes) {
  const auto configuration = scenario_of(small_cluster).configuration;
  EXPECT_EQ(configuration.name, "small");
  EXPECT_EQ(configuration.local_node, 1);
  EXPECT_EQ(configuration.max_nodes, 4);
  EXPECT_EQ(configuration.adapters_per_node, 2);
  EXPECT_EQ(configuration.remote_node_down_period.tv_sec, 7);
  EXPECT_EQ(configuration.local_node_down_period.tv_sec, 1);
  EXPECT_EQ(configuration.local_node_down_period.tv_usec, 500000);
  ASSERT_EQ(configuration.networks.size(), 2U);
  EXPECT_EQ(configuration.networks[0].type, "ether");
  EXPECT_EQ(configuration.networks[1].name, "storage");
  ASSERT_EQ(configuration.adapters.size(), 5U);
  const auto& adapter = configuration.adapters.at(3);
  EXPECT_EQ(hbd::address_text(adapter.address), "2001:db8::2");
  EXPECT_EQ(adapter.network, 1);
  EXPECT_EQ(adapter.type, "en1");
  EXPECT_FALSE(adapter.up);
  EXPECT_TRUE(configuration.adapters.at(4).up);
}

TEST(Scenario, without_limits_has_room_for_its_nodes_adapters_and_networks) {
  const auto configuration = scenario_of(R"(
network = [{ name = "a" }, { name = "b" }, { name = "c" }]
node = [{ number = 5, adapters = [{ offset = 1, network = "a", address = "::1" }] }]
cluster = { local_node = 5 }
)")
                                 .configuration;
  EXPECT_EQ(configuration.max_nodes, 6);
  EXPECT_EQ(configuration.adapters_per_node, 3);
  EXPECT_EQ(configuration.adapters.begin()->first, 16U);
}

TEST(Scenario, has_its_events_in_order_of_time_and_those_of_one_time_in_order_of_the_file) {
  const auto steps = scenario_of(small_cluster + R"(
[[event]]
at = "2s"
kind = "ffdc-id"
id = "third"
[[event]]
at = "0.5s"
kind = "ffdc-id"
id = "first"
[[event]]
at = "500ms"
kind = "ffdc-id"
id = "second"
)")
                         .steps;
  ASSERT_EQ(steps.size(), 3U);
  EXPECT_EQ(std::get<hbd::FailureData>(steps[0].change).id, "first");
  EXPECT_EQ(std::get<hbd::FailureData>(steps[1].change).id, "second");
  EXPECT_EQ(std::get<hbd::FailureData>(steps[2].change).id, "third");
  EXPECT_EQ(steps[0].at, 500ms);
  EXPECT_EQ(steps[2].at, 2s);
}

TEST(Scenario, may_use_what_an_earlier_update_has_added) {
  const auto steps = scenario_of(small_cluster + R"(
[[event]]
at = "2s"
kind = "node-death"
node = 3
[[event]]
at = "1s"
kind = "configuration-update"
add = [{ node = 3, offset = 1, network = "public", address = "192.0.2.4" }]
)")
                         .steps;
  ASSERT_EQ(steps.size(), 2U);
  EXPECT_EQ(std::get<hbd::ConfigurationChange>(steps[0].change).add.at(0).number, 7U);
  EXPECT_EQ(std::get<hbd::NodeDeath>(steps[1].change).node, 3);
}

TEST(Scenario, takes_a_removal_without_offset_for_the_whole_node) {
  const auto steps = scenario_of(small_cluster + R"(
[[event]]
at = "1s"
kind = "configuration-update"
remove = [{ node = 0 }]
)")
                         .steps;
  EXPECT_EQ(std::get<hbd::ConfigurationChange>(steps.at(0).change).remove, (std::vector<Hb_Adapter_Number>{0, 1}));
}

TEST(Scenario, churns_by_deaths_and_joins_when_it_does_not_say_how) {
  const auto churn = scenario_of(small_cluster + "[random]\nseed = 9\nmean_interval = \"2ms\"\n").churn;
  ASSERT_TRUE(churn);
  EXPECT_EQ(churn->seed, 9U);
  EXPECT_EQ(churn->mean_interval, 2ms);
  EXPECT_EQ(churn->count, 0U);
  EXPECT_EQ(churn->kinds, (std::vector<hbd::ChurnKind>{hbd::ChurnKind::AdapterDeath, hbd::ChurnKind::AdapterJoin,
                                                       hbd::ChurnKind::NodeDeath, hbd::ChurnKind::NodeJoin}));
}

TEST(Scenario, that_is_built_in_has_4_nodes_2_networks_and_churn_without_end) {
  const auto scenario = scenario_of(std::string(hbd::built_in_scenario()));
  EXPECT_EQ(scenario.configuration.max_nodes, 4);
  EXPECT_EQ(scenario.configuration.networks.size(), 2U);
  EXPECT_EQ(scenario.configuration.adapters.size(), 8U);
  ASSERT_TRUE(scenario.churn);
  EXPECT_EQ(scenario.churn->count, 0U);
}

struct Mistake {
  std::string name;
  std::string text;
  unsigned line;
  std::string message;
};

void PrintTo(const Mistake& each, std::ostream* out) { *out << each.name; }

class ScenarioMistake : public testing::TestWithParam<Mistake> {};

TEST_P(ScenarioMistake, is_told_with_its_line_and_what_to_do) {
  const auto result = parse_scenario(GetParam().text);
  const auto* error = std::get_if<hbd::ScenarioError>(&result);
  ASSERT_NE(error, nullptr);
  EXPECT_EQ(error->line, GetParam().line);
  EXPECT_EQ(error->text, GetParam().message);
}

std::string with_answer(const std::string& keys) { return small_cluster + "[[answer]]\n" + keys; }

/* Lines of events start behind the cluster's 33 lines. */
std::string with_event(const std::string& keys) { return small_cluster + "[[event]]\nat = \"1s\"\n" + keys; }

INSTANTIATE_TEST_SUITE_P(
    Of, ScenarioMistake,
    testing::Values(
        Mistake{"no_node", "[cluster]\nname = \"x\"\n", 0,
                "no node has an adapter; add [[node]] tables with a number and adapters"},
        Mistake{"unknown_key", "[[network]]\nname = \"a\"\nspeed = 1\n", 3,
                "[[network]] has an unknown key \"speed\"; the keys are: ip, name, type"},
        Mistake{"missing_key", "[[node]]\nnumber = 0\nadapters = [{ offset = 0 }]\n", 3,
                "an adapter has no \"network\"; add it"},
        Mistake{"unknown_network",
                "[[node]]\nnumber = 0\nadapters = [\n{ offset = 0, network = \"x\", address = \"::1\" }]\n", 4,
                "an adapter \"network\" is \"x\", which no [[network]] is called; add one, or correct it"},
        Mistake{"bad_address",
                "[[network]]\nname = \"x\"\n[[node]]\nnumber = 0\nadapters = [\n"
                "{ offset = 0, network = \"x\", address = \"300.1.1.1\" }]\n",
                6,
                "an adapter \"address\" must be an IPv4 or IPv6 address in quotes, as \"192.0.2.1\" or "
                "\"2001:db8::1\""},
        Mistake{"node_twice", "[[node]]\nnumber = 1\n[[node]]\nnumber = 1\n", 4,
                "[[node]] \"number\" is 1 again; put all adapters of a node into one [[node]]"},
        Mistake{"node_number_too_high", "[[node]]\nnumber = 2049\n", 2,
                "[[node]] \"number\" must be a whole number from 0 to 2048"},
        Mistake{"max_nodes_too_low", "cluster = { max_nodes = 1 }\n[[node]]\nnumber = 1\nadapters = [{offset = 0}]\n",
                1, "[cluster] \"max_nodes\" must be a whole number from 2 to 2049"},
        Mistake{"name_twice", "[[network]]\nname = \"a\"\n[[network]]\nname = \"a\"\n", 4,
                "[[network]] \"name\" is that of an earlier network; give each its own"},
        Mistake{"name_too_long", "[[network]]\nname = \"" + std::string(70, 'n') + "\"\n", 2,
                "[[network]] \"name\" must be a text of 1 to 69 characters"},
        Mistake{"unknown_kind", with_event("kind = \"explosion\"\n"), 36,
                "\"explosion\" is no kind of event; the kinds are: adapter-death, adapter-join, node-death, node-join, "
                "network-loss, network-return, configuration-update, ffdc-id, different-instance, heartbeat, "
                "adapter-silence"},
        Mistake{"adapter_that_is_not_there", with_event("kind = \"adapter-death\"\nnode = 2\noffset = 1\n"), 38,
                "[[event]] \"offset\" is 1, where node 2 has no adapter at that time; add it before"},
        Mistake{"node_that_is_not_there", with_event("kind = \"node-death\"\nnode = 3\n"), 37,
                "[[event]] \"node\" is 3, which is not configured at that time; add it before"},
        Mistake{"adapter_that_is_there_already",
                with_event("kind = \"configuration-update\"\nadd = [{ node = 0, offset = 1, network = \"public\", "
                           "address = \"::1\" }]\n"),
                37, "an addition \"offset\" is in use on that node; give each adapter its own"},
        Mistake{"bad_time", small_cluster + "[[event]]\nat = \"soon\"\n", 35,
                "[[event]] \"at\" must be a length of time in quotes, as \"250ms\", \"1.5s\" or \"2m\""},
        Mistake{"identifier_too_long", with_event("kind = \"ffdc-id\"\nid = \"" + std::string(43, 'i') + "\"\n"), 37,
                "[[event]] \"id\" must be a text of 1 to 42 characters"},
        Mistake{"route_without_hops", small_cluster + "[[route]]\nnode = 0\nhops = []\n", 36,
                "[[route]] \"hops\" must be 1 to 11 addresses, the node's own at the end"},
        Mistake{"route_of_no_address", small_cluster + "[[route]]\nnode = 0\nhops = [\"::1\", \"x\"]\n", 36,
                "[[route]] \"hops\" has \"x\", which is no IPv4 or IPv6 address"},
        Mistake{"route_twice",
                small_cluster + "[[route]]\nnode = 0\nhops = [\"::1\"]\n[[route]]\nnode = 0\nhops = [\"::2\"]\n", 38,
                "[[route]] \"node\" is 0 again; a node has one route"},
        Mistake{"route_beyond_the_nodes", small_cluster + "[[route]]\nnode = 4\nhops = [\"::1\"]\n", 35,
                "[[route]] \"node\" must be a whole number from 0 to 3"},
        Mistake{"answer_to_no_request", with_answer("request = \"subscribe\"\nstatus = \"try-again\"\n"), 35,
                "[[answer]] \"request\" is \"subscribe\"; it must be one of: configure-adapter, unconfigure-adapter, "
                "swap-adapters, adapter-grace, adapter-state"},
        Mistake{"answer_of_no_status", with_answer("request = \"adapter-grace\"\nstatus = \"maybe\"\n"), 36,
                "[[answer]] \"status\" is \"maybe\"; it must be one of: successful, no-such-network, try-again, "
                "adapter-enabled, adapter-not-configured, invalid-service-address, same-address, not-supported, "
                "grace-failed, grace-timed-out"},
        Mistake{"answer_with_a_state_that_is_not_sent",
                with_answer("request = \"adapter-state\"\nstatus = \"try-again\"\nstate = \"up\"\n"), 37,
                "[[answer]] \"state\" goes with the request \"adapter-state\" and the status \"successful\" alone"},
        Mistake{"churn_without_time", small_cluster + "[random]\nseed = 1\nmean_interval = \"0s\"\n", 36,
                "[random] \"mean_interval\" must be longer than 0"},
        Mistake{"local_node_without_adapter",
                "[cluster]\nlocal_node = 1\n[[network]]\nname = \"a\"\n[[node]]\n"
                "number = 2\nadapters = [{ offset = 0, network = \"a\", address = \"::1\" }]\n",
                2, "[cluster] \"local_node\" is node 1, which has no adapter; add one, or choose another node"},
        Mistake{"too_many_adapter_numbers",
                "[cluster]\nmax_nodes = 2049\n[[node]]\nnumber = 0\nadapters = [{ offset = 48 }]\n", 1,
                "2049 nodes with 49 adapters each are 100401 adapter numbers; 98352 are the most, use lower node "
                "numbers or offsets"}),
    [](const auto& each) { return each.param.name; });

TEST(Scenario, says_how_requests_are_taken) {
  std::string text = small_cluster + R"(
[client_heartbeat]
threshold = "1500ms"
enabled = false
[[answer]]
request = "adapter-state"
status = "successful"
state = "no-monitor"
[[answer]]
request = "swap-adapters"
status = "try-again"
count = 0
)";
  text.insert(text.find("local_node ="), "suspicion = \"2s\"\n");
  const auto control = scenario_of(text).control;
  EXPECT_EQ(control.suspicion, 2s);
  EXPECT_TRUE(control.heartbeat.is_given);
  EXPECT_EQ(control.heartbeat.settings.seconds, 1);
  EXPECT_EQ(control.heartbeat.settings.microseconds, 500000);
  EXPECT_FALSE(control.heartbeat.settings.enabled);
  ASSERT_EQ(control.answers.size(), 2U);
  EXPECT_EQ(control.answers[0].request, HB_GET_ADAPTER_STATE);
  EXPECT_EQ(control.answers[0].state, Hb_Adapter_No_NIM);
  EXPECT_EQ(control.answers[0].count, 1U);
  EXPECT_EQ(control.answers[1].status, HB_TRY_AGAIN);
  EXPECT_EQ(control.answers[1].count, 0U);
  EXPECT_EQ(scenario_of(small_cluster).control.suspicion, 1s);
}

TEST(ScenarioThatIsNoToml, is_told_with_its_line) {
  const auto result = parse_scenario("[cluster]\nname = \"x\n");
  const auto* error = std::get_if<hbd::ScenarioError>(&result);
  ASSERT_NE(error, nullptr);
  EXPECT_EQ(error->line, 2U);
  EXPECT_NE(error->text, "");
}

TEST(ScenarioWith49Networks, is_refused) {
  std::string text;
  for (int i = 0; i < 49; ++i) {
    text += "[[network]]\nname = \"n" + std::to_string(i) + "\"\n";
  }
  const auto result = parse_scenario(text);
  const auto* error = std::get_if<hbd::ScenarioError>(&result);
  ASSERT_NE(error, nullptr);
  EXPECT_EQ(error->line, 98U);
  EXPECT_EQ(error->text, "[[network]] \"name\" is one too many; 48 networks are the most");
}

TEST(Duration, is_a_number_with_a_unit) {
  EXPECT_EQ(hbd::parse_duration("250ms"), 250ms);
  EXPECT_EQ(hbd::parse_duration("1.5s"), 1500ms);
  EXPECT_EQ(hbd::parse_duration("2m"), 2min);
  EXPECT_EQ(hbd::parse_duration("1h"), 1h);
  EXPECT_EQ(hbd::parse_duration("7us"), 7us);
  EXPECT_EQ(hbd::parse_duration("0s"), 0s);
}

TEST(Duration, is_nothing_else) {
  for (const char* text : {"", "s", "1", "1 s", "-1s", "1d", "nans", "infs", "1e9s", "9999999h", "1s2", "0x1s"}) {
    EXPECT_FALSE(hbd::parse_duration(text)) << text;
  }
}

TEST(Address, of_four_parts_is_mapped) {
  const auto address = hbd::parse_address("192.0.2.7");
  ASSERT_TRUE(address);
  const std::array<std::uint8_t, 16> expected = {0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0xFF, 0xFF, 192, 0, 2, 7};
  EXPECT_EQ(std::memcmp(&*address, expected.data(), 16), 0);
  EXPECT_EQ(hbd::address_text(*address), "192.0.2.7");
  EXPECT_FALSE(hbd::parse_address("192.0.2"));
  EXPECT_FALSE(hbd::parse_address("fe80::1%eth0"));
}

}  // namespace
