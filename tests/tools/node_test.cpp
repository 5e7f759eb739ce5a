// hbctl node and hbctl simulate-death.
#include <gmock/gmock.h>

#include "steered.h"

namespace hb_test {
namespace {

using nlohmann::json;
using testing::HasSubstr;

class HbctlNode : public Steered {};

TEST_F(HbctlNode, is_reported_by_its_number) {
  const Bytes suspicion = begin({"node", "2", "may-be-down"}, 203);
  EXPECT_EQ(suspicion, request_packet(child().pid(), 203, 2, Bytes(2, '\0')));
  const Finished suspected = end();
  EXPECT_EQ(suspected.output, "report that node 2 may be down: sent\n");
  EXPECT_EQ(suspected.errors, "");
  EXPECT_EQ(suspected.status, 0);
  const Bytes report = begin({"node", "2", "is-down", "--yes"}, 204);
  EXPECT_EQ(report, request_packet(child().pid(), 204, 2, Bytes(2, '\0')));
  EXPECT_EQ(end().output, "report that node 2 is down: sent\n");
}

TEST_F(HbctlNode, is_in_json_what_was_reported) {
  begin({"node", "0", "is-down", "--yes", "--json"}, 204);
  const json expected = {
      {"version", 1}, {"type", "request"}, {"request", "node is-down"}, {"outcome", "sent"}, {"node", 0}};
  EXPECT_EQ(parse(end()), expected);
}

TEST_F(HbctlNode, beyond_the_cluster_or_without_an_adapter_is_not_reported) {
  const Finished beyond = run_without_request({"node", "3", "may-be-down"});
  EXPECT_THAT(beyond.errors, HasSubstr(": HB_EINVAL (4), "));
  EXPECT_EQ(beyond.status, 1);
  const ConfigurationMessage first_of_two =
      ConfigurationMessage().max_nodes(2).adapters_per_node(1).adapter(0, "10.0.0.1").network("net0");
  const Finished empty = run_without_request({"node", "1", "may-be-down"}, first_of_two);
  EXPECT_THAT(empty.errors, HasSubstr(": HB_ENONODE (9), "));
  EXPECT_EQ(empty.status, 1);
}

TEST_F(HbctlNode, plays_dead_for_so_many_seconds) {
  expect_request({"simulate-death", "300", "--yes"}, 217, octets({0x2C, 1, 0, 0}));
  const Finished finished = end();
  EXPECT_EQ(finished.output, "simulate the death of this node for 300 s: sent\n");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlNode, plays_dead_for_the_configured_time) {
  expect_request({"simulate-death", "0", "--yes", "--json"}, 217, octets({0, 0, 0, 0}));
  const json expected = {
      {"version", 1}, {"type", "request"}, {"request", "simulate-death"}, {"outcome", "sent"}, {"seconds", 0}};
  EXPECT_EQ(parse(end()), expected);
}

}  // namespace
}  // namespace hb_test
