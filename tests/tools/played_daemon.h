// The daemon's side of the conversations that hbctl holds, over the small cluster of support/bytes.h.
#pragma once

#include "support/fake_daemon.h"

namespace hb_test {

// Fields of a subscription request (209).
int32_t subscription_type(const Bytes& request);
int32_t subscription_events(const Bytes& request);
std::string subscription_name(const Bytes& request);
int32_t subscription_count(const Bytes& request);
// `count` bytes of its member set.
Bytes subscription_members(const Bytes& request, size_t count);

class PlayedDaemon {
 public:
  PlayedDaemon() = default;
  explicit PlayedDaemon(const Publication& publication) : daemon_(publication) {}

  FakeDaemon& daemon() { return daemon_; }
  DaemonConnection& connection() { return connection_; }

  // Takes the client, awaits the configuration request and answers it.
  void start(const ConfigurationMessage& configuration = small_cluster());

  // The next request, which has to be of that kind; throws when it is not.
  Bytes expect(int32_t kind);
  // A subscription (209) of that name.
  Bytes expect_subscription(const std::string& name);
  // A withdrawal (210) of that name.
  void expect_withdrawal(const std::string& name);

  void send(const ReplyPacket& packet) { connection_.send_frame(packet.bytes()); }
  void send_nodes(int32_t kind, const std::string& name, uint32_t sequence, const std::vector<uint32_t>& flags);
  void send_adapters(int32_t kind, const std::string& name, uint32_t sequence,
                     const std::vector<AdapterEntry>& entries);

  // Answers a command that asks who is up: nodes 0 and 1, and the adapters 0 to 3 of them.
  void tell_who_is_up();

 private:
  FakeDaemon daemon_;
  DaemonConnection connection_;
};

}  // namespace hb_test
