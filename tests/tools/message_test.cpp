// hbctl send: a message that the daemon routes.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <unistd.h>

#include "steered.h"

namespace hb_test {
namespace {

using nlohmann::json;
using testing::HasSubstr;

// A request of kind 221: port in the other byte order, ttl 20, version 1, nine zeros, the flag, the nodes, the message.
Bytes routed(uint32_t swapped_port, const std::vector<int32_t>& nodes, const Bytes& text) {
  ByteBuilder data;
  data.u32(swapped_port).i32(20).i32(1).zeros(36).i32(0).i32(static_cast<int32_t>(nodes.size()));
  for (const int32_t node : nodes) data.i32(node);
  return data.i32(static_cast<int32_t>(text.size())).raw(text).bytes();
}

class HbctlSend : public Steered {
 protected:
  // With a file on standard input.
  Bytes begin_with_input(const std::vector<std::string>& arguments, const Bytes& input) {
    const std::string path = daemon().daemon().directory() + "/input";
    const int file = open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
    EXPECT_EQ(write(file, input.data(), input.size()), static_cast<ssize_t>(input.size()));
    EXPECT_EQ(lseek(file, 0, SEEK_SET), 0);
    Bytes request = begin(arguments, 221, {.input = file});
    close(file);
    unlink(path.c_str());
    return request;
  }

  Bytes whole(const Bytes& data) { return request_packet(child().pid(), 221, static_cast<int32_t>(data.size()), data); }
};

TEST_F(HbctlSend, routes_a_text_to_a_port_of_several_nodes_in_ascending_order) {
  const Bytes request = begin({"send", "hello", "--node", "2", "0", "1", "--port", "258"}, 221);
  EXPECT_EQ(request, whole(routed(0x0201, {0, 1, 2}, "hello")));
  const Finished finished = end();
  EXPECT_EQ(finished.output, "send 5 bytes to port 258 of nodes 0-2: sent\n");
  EXPECT_EQ(finished.errors, "");
  EXPECT_EQ(finished.status, 0);
}

TEST_F(HbctlSend, has_what_was_sent_in_json) {
  begin({"send", "x", "--node", "2", "--port", "7", "--json"}, 221);
  const json expected = {{"version", 1}, {"type", "request"}, {"request", "send"}, {"outcome", "sent"},
                         {"nodes", {2}}, {"port", 7},         {"bytes", 1}};
  EXPECT_EQ(parse(end()), expected);
}

TEST_F(HbctlSend, takes_every_byte_of_standard_input) {
  const Bytes input("a\0b\n", 4);
  const Bytes request = begin_with_input({"send", "--node", "1", "--port", "256", "-"}, input);
  EXPECT_EQ(request, whole(routed(1, {1}, input)));
  EXPECT_EQ(end().output, "send 4 bytes to port 256 of node 1: sent\n");
}

TEST_F(HbctlSend, sends_no_bytes_when_there_is_no_text) {
  const Bytes without = begin({"send", "--node", "1", "--port", "0"}, 221);
  EXPECT_EQ(without, whole(routed(0, {1}, "")));
  EXPECT_EQ(end().output, "send 0 bytes to port 0 of node 1: sent\n");
  const Bytes empty = begin({"send", "--node", "1", "--port", "0", "-"}, 221);
  EXPECT_EQ(empty, whole(routed(0, {1}, "")));
  EXPECT_EQ(end().output, "send 0 bytes to port 0 of node 1: sent\n");
}

// One node: 60 bytes, 4 for it, and the text.
TEST_F(HbctlSend, sends_as_much_as_the_library_takes) {
  const Bytes most(9936, 'm');
  const Bytes request = begin_with_input({"send", "--node", "1", "--port", "0", "-"}, most);
  EXPECT_EQ(request, whole(routed(0, {1}, most)));
  EXPECT_EQ(end().status, 0);
  const Finished refused = run_without_request({"send", "--node", "1", "--port", "0", most + "m"});
  EXPECT_THAT(refused.errors, HasSubstr("cannot send 9937 bytes to port 0 of node 1: HB_EMSGTOOBIG (53), "));
  EXPECT_EQ(refused.status, 1);
}

TEST_F(HbctlSend, refuses_a_node_that_is_named_twice) {
  const Finished finished = run_without_request({"send", "x", "--node", "1,1", "--port", "7"});
  EXPECT_THAT(finished.errors, HasSubstr(": HB_EINVAL (4), "));
  EXPECT_THAT(finished.errors, HasSubstr("\nname each node once\n"));
  EXPECT_EQ(finished.status, 1);
}

TEST_F(HbctlSend, fails_when_standard_input_cannot_be_read) {
  const int directory = open("/", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
  ChildProcess unreadable(hbctl({"send", "--node", "1", "--port", "7", "-"}), {.input = directory});
  close(directory);
  const Finished finished = unreadable.finish();
  EXPECT_EQ(finished.errors, "hbctl: cannot read standard input: Is a directory\n");
  EXPECT_EQ(finished.status, 1);
  EXPECT_FALSE(daemon().daemon().has_client());
}

}  // namespace
}  // namespace hb_test
