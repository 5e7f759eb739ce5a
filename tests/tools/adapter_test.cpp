// hbctl adapter: what is asked for each action, what is told about each answer.
#include <gmock/gmock.h>

#include "steered.h"

namespace hb_test {
namespace {

using nlohmann::json;
using testing::HasSubstr;
using testing::StartsWith;

constexpr int32_t kConfigured = 10;  // kinds of the daemon's answers
constexpr int32_t kGrace = 11;
constexpr int32_t kState = 14;

class HbctlAdapter : public Steered {};

// Adapter 1 is on network 1 of the small cluster.
struct Unanswered {
  std::vector<std::string> action;
  int32_t kind;
  const char* what;
};

const Unanswered kUnanswered[] = {
    {{"enable"}, 207, "enable adapter 1"},
    {{"disable", "--yes"}, 208, "disable adapter 1"},
    {{"ifdown", "--yes"}, 212, "switch the interface of adapter 1 off"},
    {{"ifup"}, 213, "switch the interface of adapter 1 on"},
};

std::vector<std::string> command(const char* adapter, std::vector<std::string> rest) {
  rest.insert(rest.begin(), {"adapter", adapter});
  return rest;
}

TEST_F(HbctlAdapter, sends_the_network_of_the_adapter_where_nothing_is_answered) {
  for (const Unanswered& unanswered : kUnanswered) {
    expect_request(command("1", unanswered.action), unanswered.kind, octets({1, 0}));
    const Finished finished = end();
    EXPECT_EQ(finished.output, std::string(unanswered.what) + ": sent\n");
    EXPECT_EQ(finished.errors, "");
    EXPECT_EQ(finished.status, 0);
  }
}

TEST_F(HbctlAdapter, has_what_was_sent_in_json) {
  begin({"adapter", "1", "disable", "--yes", "--json"}, 208);
  const json expected = {
      {"version", 1}, {"type", "request"}, {"request", "adapter disable"}, {"outcome", "sent"}, {"adapter", 1}};
  EXPECT_EQ(parse(end()), expected);
}

TEST_F(HbctlAdapter, reports_about_adapters_of_every_node) {
  const Bytes suspicion = begin({"adapter", "5", "may-be-down"}, 205);
  EXPECT_EQ(suspicion, request_packet(child().pid(), 205, 5, Bytes(5, '\0')));
  EXPECT_EQ(end().output, "report that adapter 5 may be down: sent\n");
  const Bytes report = begin({"adapter", "5", "is-down", "--yes"}, 206);
  EXPECT_EQ(report, request_packet(child().pid(), 206, 5, Bytes(5, '\0')));
  EXPECT_EQ(end().output, "report that adapter 5 is down: sent\n");
}

TEST_F(HbctlAdapter, configures_with_an_address) {
  expect_request({"adapter", "1", "configure", "10.0.0.9"}, 214, octets({1, 0, 0, 0, 10, 0, 0, 9}));
  answer(ReplyPacket(kConfigured).value(0));
  const Finished finished = end();
  EXPECT_EQ(finished.output, "configure adapter 1 with the address 10.0.0.9: done\n");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlAdapter, takes_an_address_away) {
  expect_request({"adapter", "1", "unconfigure", "--yes"}, 215, octets({1, 0}));
  answer(ReplyPacket(kConfigured).value(0));
  const Finished finished = end();
  EXPECT_EQ(finished.output, "take the address of adapter 1 away: done\n");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlAdapter, swaps_with_another_one_of_the_node) {
  expect_request({"adapter", "1", "swap", "10.0.0.1", "--yes"}, 218, octets({1, 0, 0, 0, 10, 0, 0, 1}));
  answer(ReplyPacket(kConfigured).value(0));
  const Finished finished = end();
  EXPECT_EQ(finished.output, "swap the addresses of adapter 1 and of the one at 10.0.0.1: done\n");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlAdapter, asks_for_grace) {
  expect_request({"adapter", "1", "grace", "300"}, 216, octets({1, 0, 0, 0, 0x2C, 1, 0, 0}));
  answer(ReplyPacket(kGrace).value(0));
  const Finished finished = end();
  EXPECT_EQ(finished.output, "give adapter 1 a grace of 300 s: done\n");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlAdapter, has_what_was_done_in_json) {
  begin({"adapter", "1", "configure", "10.0.0.9", "--json"}, 214);
  answer(ReplyPacket(kConfigured).value(0));
  const json configured = {{"version", 1}, {"type", "request"},     {"request", "adapter configure"},
                           {"adapter", 1}, {"address", "10.0.0.9"}, {"outcome", "done"}};
  EXPECT_EQ(parse(end()), configured);
  begin({"adapter", "1", "grace", "300", "--json"}, 216);
  answer(ReplyPacket(kGrace).value(0));
  const json granted = {{"version", 1}, {"type", "request"}, {"request", "adapter grace"},
                        {"adapter", 1}, {"seconds", 300},    {"outcome", "done"}};
  EXPECT_EQ(parse(end()), granted);
}

// How an answer with a status ends the command.
struct Refusal {
  std::vector<std::string> action;
  int32_t request;
  int32_t reply;
  int32_t status;
  const char* error;
  int exit_status;
};

const std::vector<std::string> kConfigure = {"configure", "10.0.0.9"};
const std::vector<std::string> kUnconfigure = {"unconfigure", "--yes"};
const std::vector<std::string> kSwap = {"swap", "10.0.0.1", "--yes"};
const std::vector<std::string> kGraceOf5 = {"grace", "5"};
const std::vector<std::string> kStateOf = {"state"};

const Refusal kRefusals[] = {
    {kConfigure, 214, kConfigured, 1, "HB_ENONETWORK (8)", 6},
    {kConfigure, 214, kConfigured, 2, "HB_EBADREPLY (10)", 7},
    {kConfigure, 214, kConfigured, 3, "HB_EWRONGSTATE (3)", 6},
    {kConfigure, 214, kConfigured, 4, "HB_ENOADAPTER (7)", 1},
    {kConfigure, 214, kConfigured, 5, "HB_EBADSERVICEADDR (50)", 6},
    {kConfigure, 214, kConfigured, 6, "HB_ESAMEADDR (51)", 6},
    {kConfigure, 214, kConfigured, 7, "HB_EBADREPLY (10)", 7},
    {kUnconfigure, 215, kConfigured, 1, "HB_ENONETWORK (8)", 6},
    {kUnconfigure, 215, kConfigured, 3, "HB_EWRONGSTATE (3)", 6},
    {kUnconfigure, 215, kConfigured, 4, "HB_ENOADAPTER (7)", 1},
    {kUnconfigure, 215, kConfigured, 5, "HB_EBADREPLY (10)", 7},
    {kSwap, 218, kConfigured, 1, "HB_ENONETWORK (8)", 6},
    {kSwap, 218, kConfigured, 3, "HB_EWRONGSTATE (3)", 6},
    {kSwap, 218, kConfigured, 4, "HB_ENOADAPTER (7)", 1},
    {kSwap, 218, kConfigured, -1, "HB_EBADREPLY (10)", 7},
    {kGraceOf5, 216, kGrace, 1, "HB_ENONETWORK (8)", 6},
    {kGraceOf5, 216, kGrace, 4, "HB_EBADREPLY (10)", 7},
    {kGraceOf5, 216, kGrace, 7, "HB_ENOTSUPPORTED (52)", 6},
    {kGraceOf5, 216, kGrace, 8, "HB_EGRACEFAILED (55)", 6},
    {kGraceOf5, 216, kGrace, 9, "HB_EGRACETIMEOUT (56)", 6},
    {kStateOf, 223, kState, 1, "HB_ENONETWORK (8)", 6},
    {kStateOf, 223, kState, 4, "HB_ENOADAPTER (7)", 1},
    {kStateOf, 223, kState, 6, "HB_EBADREPLY (10)", 7},
};

TEST_F(HbctlAdapter, tells_every_refusal_by_its_error_and_ends_by_its_kind) {
  for (const Refusal& refusal : kRefusals) {
    const auto arguments = command("1", refusal.action);
    begin(arguments, refusal.request);
    answer(ReplyPacket(refusal.reply).value(refusal.status));
    const Finished finished = end();
    EXPECT_EQ(finished.output, "");
    EXPECT_THAT(finished.errors, StartsWith("hbctl: cannot "));
    EXPECT_THAT(finished.errors, HasSubstr(std::string(": ") + refusal.error + ", ")) << refusal.status;
    EXPECT_EQ(finished.status, refusal.exit_status) << testing::PrintToString(arguments) << refusal.status;
  }
}

TEST_F(HbctlAdapter, says_what_failed_why_and_what_to_do) {
  begin({"adapter", "1", "configure", "10.0.0.9"}, 214);
  answer(ReplyPacket(kConfigured).value(3));
  EXPECT_EQ(end().errors,
            "hbctl: cannot configure adapter 1 with the address 10.0.0.9: HB_EWRONGSTATE (3), the request does not fit "
            "the state, or the event does not carry the datum\n"
            "the adapter is enabled: first run hbctl adapter NUMBER disable\n");
}

TEST_F(HbctlAdapter, has_a_refusal_in_json) {
  begin({"adapter", "1", "unconfigure", "--yes", "--json"}, 215);
  answer(ReplyPacket(kConfigured).value(3));
  const Finished finished = end();
  EXPECT_THAT(finished.errors, HasSubstr("HB_EWRONGSTATE (3)"));
  const json error = parse(finished);
  EXPECT_EQ(error["type"], "error");
  EXPECT_EQ(error["error"]["exit_status"], 6);
  EXPECT_EQ(error["error"]["name"], "HB_EWRONGSTATE");
  EXPECT_EQ(error["error"]["number"], 3);
}

TEST_F(HbctlAdapter, that_is_another_nodes_is_not_steered) {
  for (const auto& action : {std::vector<std::string>{"enable"},
                             {"disable", "--yes"},
                             {"ifdown", "--yes"},
                             {"ifup"},
                             kConfigure,
                             kUnconfigure,
                             kSwap,
                             kGraceOf5,
                             kStateOf}) {
    const Finished finished = run_without_request(command("2", action));
    EXPECT_THAT(finished.errors, HasSubstr(": HB_EINVAL (4), ")) << action[0];
    EXPECT_THAT(finished.errors, HasSubstr("of the local node")) << action[0];
    EXPECT_EQ(finished.status, 1) << action[0];
  }
}

TEST_F(HbctlAdapter, beyond_the_cluster_is_not_reported) {
  const Finished finished = run_without_request({"adapter", "6", "may-be-down"});
  EXPECT_THAT(finished.errors, StartsWith("hbctl: cannot report that adapter 6 may be down: HB_EINVAL (4), "));
  EXPECT_EQ(finished.status, 1);
}

TEST_F(HbctlAdapter, that_is_not_configured_is_not_steered) {
  const ConfigurationMessage one_of_two =
      ConfigurationMessage().max_nodes(1).adapters_per_node(2).adapter(0, "10.0.0.1").network("net0");
  for (const char* action : {"enable", "state", "may-be-down"}) {
    const Finished finished = run_without_request({"adapter", "1", action}, one_of_two);
    EXPECT_THAT(finished.errors, HasSubstr(": HB_ENOADAPTER (7), ")) << action;
    EXPECT_EQ(finished.status, 1) << action;
  }
}

TEST_F(HbctlAdapter, swaps_with_no_address_that_nobody_or_another_node_has) {
  const Finished nobody = run_without_request({"adapter", "0", "swap", "192.0.2.1", "--yes"});
  EXPECT_THAT(nobody.errors, HasSubstr(": HB_ENOADAPTER (7), "));
  EXPECT_EQ(nobody.status, 1);
  const Finished another = run_without_request({"adapter", "0", "swap", "10.0.0.3", "--yes"});
  EXPECT_THAT(another.errors, HasSubstr(": HB_EINVAL (4), "));
  EXPECT_EQ(another.status, 1);
}

TEST_F(HbctlAdapter, shows_the_state_that_the_daemon_answers) {
  const Bytes request = begin({"adapter", "1", "state"}, 223);
  EXPECT_EQ(request, request_packet(child().pid(), 223, 2, octets({1, 0})));
  answer(ReplyPacket(kState).value(0).message(ByteBuilder().i32(7).bytes()));
  const Finished finished = end();
  EXPECT_EQ(finished.output, "adapter 1: not-monitored\n");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlAdapter, has_the_state_in_json_also_when_it_has_no_word) {
  begin({"adapter", "1", "state", "--json"}, 223);
  answer(ReplyPacket(kState).value(0).message(ByteBuilder().i32(4).bytes()));
  const json known = {
      {"version", 1}, {"type", "adapter-state"}, {"adapter", 1}, {"state", "interface-down"}, {"number", 4}};
  EXPECT_EQ(parse(end()), known);
  begin({"adapter", "1", "state", "--json"}, 223);
  answer(ReplyPacket(kState).value(0).message(ByteBuilder().i32(12).bytes()));
  const json unknown = {
      {"version", 1}, {"type", "adapter-state"}, {"adapter", 1}, {"state", "state 12"}, {"number", 12}};
  EXPECT_EQ(parse(end()), unknown);
}

TEST_F(HbctlAdapter, is_in_doubt_when_the_answer_has_no_state) {
  begin({"adapter", "1", "state"}, 223);
  answer(ReplyPacket(kState).value(0));
  const Finished finished = end();
  EXPECT_THAT(finished.errors, HasSubstr("HB_EBADREPLY (10)"));
  EXPECT_EQ(finished.status, 7);
}

TEST_F(HbctlAdapter, is_in_doubt_when_an_event_comes_before_the_answer) {
  begin({"adapter", "1", "configure", "10.0.0.9"}, 214);
  answer(ReplyPacket(9).message(small_cluster().bytes()));
  const Finished finished = end();
  EXPECT_THAT(finished.errors, HasSubstr("HB_EBADREPLY (10)"));
  EXPECT_THAT(finished.errors, HasSubstr("an event came instead of the answer and is lost"));
  EXPECT_EQ(finished.status, 7);
}

TEST_F(HbctlAdapter, ends_with_the_status_of_a_daemon_that_goes_before_it_answers) {
  begin({"adapter", "1", "grace", "5"}, 216);
  daemon().connection().close();
  const Finished finished = child().finish();
  EXPECT_THAT(finished.errors, HasSubstr(": HB_EDAEMONGONE (16), "));
  EXPECT_EQ(finished.status, 4);
}

}  // namespace
}  // namespace hb_test
