/* The same scenario, the same bytes, at whatever pace and whoever else is connected. */
#include <gtest/gtest.h>

#include <memory>

#include "daemon_process.h"
#include "small_cluster.h"
#include "wire.h"

namespace {

const std::string lively = small_cluster + R"(
[[event]]
at = "3ms"
kind = "ffdc-id"
id = "scripted"

[random]
seed = 77
mean_interval = "1ms"
count = 200
kinds = ["adapter-death", "adapter-join", "node-death", "node-join", "network-loss", "network-return",
         "configuration-update", "ffdc-id", "different-instance", "heartbeat"]

[[event]]
at = "1s"
kind = "ffdc-id"
id = "end"
)";

/* All bytes that a client gets which subscribes to everything. */
std::vector<Bytes> stream(const std::vector<std::string>& pace, bool with_others) {
  const TemporaryDirectory directory;
  std::vector<std::string> arguments = {"--socket",
                                        directory.path("socket"),
                                        "--scenario",
                                        directory.write("s.toml", lively),
                                        "--start-after-subscriptions",
                                        with_others ? "6" : "3"};
  arguments.insert(arguments.end(), pace.begin(), pace.end());
  DaemonProcess daemon(directory, arguments);
  EXPECT_TRUE(daemon.wait_until_ready()) << daemon.log();

  std::vector<std::unique_ptr<Connection>> others;
  for (int i = 0; with_others && i < 3; ++i) {
    others.push_back(std::make_unique<Connection>(directory.path("socket")));
    others.back()->subscribe(SubscriptionType::AllNodes, 7, "other");
    EXPECT_TRUE(others.back()->receive());
  }
  Connection client(directory.path("socket"));
  std::vector<Bytes> packets = {*client.configuration()};
  client.subscribe(SubscriptionType::AllAdapters, 7, "adapters");
  client.subscribe(SubscriptionType::AllNodes, 7, "nodes");
  client.subscribe(SubscriptionType::DifferentInstance, 0x308, "rest");
  for (auto packet = client.receive(); packet; packet = client.receive()) {
    packets.push_back(*packet);
    if (field(*packet, 0) == 12 && text_field(*packet, 60) == "end") {
      return packets;
    }
  }
  ADD_FAILURE() << "the end did not arrive";
  return packets;
}

TEST(Stream, is_the_same_byte_for_byte_in_each_run) {
  const auto once = stream({"--as-fast-as-read"}, false);
  EXPECT_GT(once.size(), 300U);
  EXPECT_EQ(once, stream({"--as-fast-as-read"}, false));
}

TEST(Stream, is_the_same_in_real_time_and_sped_up) {
  const auto fast = stream({"--as-fast-as-read"}, false);
  EXPECT_EQ(stream({}, false), fast);
  EXPECT_EQ(stream({"--speed", "25"}, false), fast);
}

TEST(Stream, is_the_same_beside_other_clients) {
  EXPECT_EQ(stream({"--as-fast-as-read"}, true), stream({"--as-fast-as-read"}, false));
}

}  // namespace
