/* A daemon that plays a script on the small cluster, as soon as a client has said that it is ready. */
#ifndef HB_TESTS_DAEMON_SCRIPTED_DAEMON_H
#define HB_TESTS_DAEMON_SCRIPTED_DAEMON_H

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "daemon_process.h"
#include "small_cluster.h"
#include "wire.h"

/** Runs hbd on the small cluster. The script ends with a failure-data identifier "end" that tests wait for. */
class ScriptedDaemon {
 public:
  /**
   * @param subscriptions how many subscriptions start the script, the one of go() included.
   * @param cluster what the script is played on.
   */
  explicit ScriptedDaemon(const std::string& script = "", int subscriptions = 2,
                          const std::string& cluster = small_cluster, const std::vector<std::string>& more = {})
      : process_(directory_, arguments(script, subscriptions, cluster, more)) {
    EXPECT_TRUE(process_.wait_until_ready()) << process_.log();
  }

  [[nodiscard]] std::string socket() const { return directory_.path("socket"); }
  DaemonProcess& process() { return process_; }

  /** Makes the last subscription, which starts the script. */
  static void go(const Connection& client) { client.subscribe(SubscriptionType::AllNodes, 8, "end"); }

  /** The packets until the script's end. */
  static std::vector<Bytes> packets(Connection& client) {
    std::vector<Bytes> all;
    for (auto packet = client.receive(); packet; packet = client.receive()) {
      if (field(*packet, 0) == 12 && text_field(*packet, 60) == "end") {
        return all;
      }
      all.push_back(*packet);
    }
    ADD_FAILURE() << "the script's end did not arrive";
    return all;
  }

  /** Subscribes, starts the script, and yields what comes. */
  std::vector<Bytes> follow(SubscriptionType type, std::uint32_t events, const Bytes& set = {}) {
    Connection client(socket());
    client.subscribe(type, events, "s", set);
    go(client);
    return packets(client);
  }

 private:
  [[nodiscard]] std::vector<std::string> arguments(const std::string& script, int subscriptions,
                                                   const std::string& cluster,
                                                   const std::vector<std::string>& more) const {
    std::vector<std::string> words = {"--socket",
                                      socket(),
                                      "--scenario",
                                      directory_.write("scenario.toml", cluster + script + end_of_script),
                                      "--as-fast-as-read",
                                      "--start-after-subscriptions",
                                      std::to_string(subscriptions)};
    words.insert(words.end(), more.begin(), more.end());
    return words;
  }

  static constexpr const char* end_of_script = "\n[[event]]\nat = \"1h\"\nkind = \"ffdc-id\"\nid = \"end\"\n";

  TemporaryDirectory directory_;
  DaemonProcess process_;
};

/** The kinds of packets, in order. */
inline std::vector<std::uint32_t> kinds_of(const std::vector<Bytes>& packets) {
  std::vector<std::uint32_t> kinds;
  for (const auto& packet : packets) {
    kinds.push_back(field(packet, 0));
  }
  return kinds;
}

#endif
