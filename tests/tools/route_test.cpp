// hbctl route: the hops that are published, and those that the daemon answers with.
#include <gmock/gmock.h>

#include "steered.h"

namespace hb_test {
namespace {

using nlohmann::json;
using testing::HasSubstr;

// 11 addresses; those after the given ones are zeros.
Bytes hops(const std::vector<std::string>& addresses) {
  Bytes bytes;
  for (const std::string& address : addresses) bytes += address_bytes(address);
  bytes.resize(176);
  return bytes;
}

class HbctlRoute : public Steered {
 protected:
  // The entry of 184 bytes of that node.
  void publish(size_t node, uint32_t sequence, uint16_t length, uint16_t nonip, const Bytes& addresses) {
    daemon().daemon().write_segment(Segment::route, node * 184,
                                    ByteBuilder().u32(sequence).u16(length).u16(nonip).raw(addresses).bytes());
  }
};

TEST_F(HbctlRoute, is_shown_as_it_is_published_and_nothing_is_asked) {
  publish(2, 1, 32, 0, hops({"10.0.0.3", "10.0.0.5"}));
  const Finished finished = run_without_request({"route", "2"});
  EXPECT_EQ(finished.output,
            "HOP  ADDRESS\n"
            "  1  10.0.0.3\n"
            "  2  10.0.0.5\n");
  EXPECT_EQ(finished.errors, "");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlRoute, is_in_json_as_it_is_published) {
  publish(1, 1, 32, 0, hops({"10.0.0.3", "2001:db8::5"}));
  const json expected = {{"version", 1},          {"type", "route"}, {"node", 1},
                         {"source", "published"}, {"length", 32},    {"hops", {"10.0.0.3", "2001:db8::5"}}};
  EXPECT_EQ(parse(run_without_request({"route", "1", "--json"})), expected);
}

TEST_F(HbctlRoute, that_is_not_an_ip_route_is_shown_unless_one_is_asked_for) {
  publish(1, 1, 16, 1, hops({"10.0.0.3"}));
  EXPECT_EQ(run_without_request({"route", "1"}).output, "HOP  ADDRESS\n  1  10.0.0.3\n");
  const Finished refused = run_without_request({"route", "1", "--ip"});
  EXPECT_EQ(refused.output, "");
  EXPECT_THAT(refused.errors, HasSubstr("cannot read the IP route to node 1: HB_ENOIPROUTE (49), "));
  EXPECT_EQ(refused.status, 1);
}

TEST_F(HbctlRoute, that_is_an_ip_route_is_shown_when_one_is_asked_for) {
  publish(1, 1, 16, 0, hops({"10.0.0.3"}));
  const json route = parse(run_without_request({"route", "1", "--ip", "--json"}));
  EXPECT_EQ(route["source"], "published-ip");
  EXPECT_EQ(route["hops"], json({"10.0.0.3"}));
}

TEST_F(HbctlRoute, of_another_configuration_is_none) {
  publish(1, 2, 16, 0, hops({"10.0.0.3"}));
  const Finished finished = run_without_request({"route", "1"});
  EXPECT_THAT(finished.errors, HasSubstr("cannot read the route to node 1: HB_ENOROUTE (6), "));
  EXPECT_EQ(finished.status, 1);
}

TEST_F(HbctlRoute, has_no_more_hops_than_there_is_room_for) {
  publish(1, 1, 65535, 0, Bytes(176, '\1'));
  const json route = parse(run_without_request({"route", "1", "--json"}));
  EXPECT_EQ(route["length"], 65535);
  EXPECT_EQ(route["hops"].size(), 11U);
}

TEST_F(HbctlRoute, of_a_node_beyond_the_cluster_is_refused) {
  for (const char* option : {"--ip", "--from-daemon", "--json"}) {
    const Finished finished = run_without_request({"route", "3", option});
    EXPECT_THAT(finished.errors, HasSubstr(": HB_EINVAL (4), ")) << option;
    EXPECT_EQ(finished.status, 1) << option;
  }
}

TEST_F(HbctlRoute, is_asked_of_the_daemon_by_the_nodes_number) {
  const Bytes request = begin({"route", "2", "--from-daemon"}, 211);
  EXPECT_EQ(request, request_packet(child().pid(), 211, 2, Bytes(2, '\0')));
  answer(ReplyPacket(8).value(32).message(hops({"10.0.0.3", "10.0.0.5"})));
  const Finished finished = end();
  EXPECT_EQ(finished.output,
            "HOP  ADDRESS\n"
            "  1  10.0.0.3\n"
            "  2  10.0.0.5\n");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlRoute, is_in_json_as_the_daemon_answers) {
  begin({"route", "2", "--from-daemon", "--json"}, 211);
  answer(ReplyPacket(8).value(16).message(hops({"10.0.0.5"})));
  const json expected = {{"version", 1},       {"type", "route"}, {"node", 2},
                         {"source", "daemon"}, {"length", 16},    {"hops", {"10.0.0.5"}}};
  EXPECT_EQ(parse(end()), expected);
}

TEST_F(HbctlRoute, that_the_daemon_does_not_know_is_none) {
  begin({"route", "2", "--from-daemon"}, 211);
  answer(ReplyPacket(8).value(0).message(hops({})));
  const Finished finished = end();
  EXPECT_THAT(finished.errors, HasSubstr("cannot get the route to node 2 from the daemon: HB_ENOROUTE (6), "));
  EXPECT_EQ(finished.status, 1);
}

TEST_F(HbctlRoute, is_in_doubt_when_an_event_comes_before_the_answer) {
  begin({"route", "2", "--from-daemon"}, 211);
  answer(ReplyPacket(9).message(small_cluster().bytes()));
  const Finished finished = end();
  EXPECT_THAT(finished.errors, HasSubstr("HB_EBADREPLY (10)"));
  EXPECT_EQ(finished.status, 7);
}

TEST_F(HbctlRoute, ends_with_the_status_of_a_daemon_that_goes_before_it_answers) {
  begin({"route", "2", "--from-daemon"}, 211);
  daemon().connection().close();
  EXPECT_EQ(child().finish().status, 4);
}

}  // namespace
}  // namespace hb_test
