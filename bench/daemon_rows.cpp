// The daemon telling one event to its clients. Its parts run in this process, so that daemon and floor share it.
#include <sys/socket.h>

#include <memory>
#include <vector>

#include "bare_client.h"
#include "daemon.h"
#include "directory.h"
#include "hb_client/events.h"
#include "hb_protocol/framing.h"
#include "loop.h"
#include "membership_source.h"
#include "rows.h"
#include "subscriber.h"

namespace bench {
namespace {

constexpr Hb_Adapter_Number changing_adapter = 1;
constexpr size_t largest_queue = 16U << 20;

// Four nodes with two adapters each. Nothing changes by itself.
class QuietCluster : public hbd::MembershipSource {
 public:
  hbd::Configuration configuration() const override {
    hbd::Configuration configuration;
    configuration.name = "benchmark";
    configuration.max_nodes = 4;
    configuration.adapters_per_node = 2;
    configuration.networks = {{"net0", "ether"}, {"net1", "ether"}};
    for (uint32_t number = 0; number < 8; ++number) {
      const auto network = static_cast<Hb_Network_Number>(number % 2);
      configuration.adapters[number] = {number, address_with_number(number), network, "en", true};
    }
    return configuration;
  }
  void start(hbd::ChangeSink&, const hbd::Cluster&) override {}
};

// The daemon with its clients.
class DaemonSide {
 public:
  explicit DaemonSide(size_t clients)
      : daemon_(loop_, socket_path(), source_, largest_queue), subscribers_(connect(clients)) {}

  // One event: the adapter dies, or is back.
  void tell_one() {
    up_ = !up_;
    if (up_) {
      daemon_.apply(hbd::AdapterJoin{{changing_adapter}});
    } else {
      daemon_.apply(hbd::AdapterDeath{{changing_adapter}});
    }
  }

  void drain_all() const { subscribers_.drain_all(); }

  // The bytes of one event as a client gets them.
  Bytes told_bytes() {
    tell_one();
    Bytes bytes(1U << 16);
    const ssize_t size = recv(subscribers_.first().descriptor(), bytes.data(), bytes.size(), MSG_DONTWAIT);
    if (size < 0) throw_errno("no event came");
    bytes.resize(static_cast<size_t>(size));
    return bytes;
  }

 private:
  std::string socket_path() const { return directory_.path() + "/socket"; }

  // The requests lie in their sockets until the loop runs.
  Subscribers connect(size_t clients) {
    Subscribers subscribers(socket_path(), clients, HB_EVENT_DEATH | HB_EVENT_JOIN);
    while (daemon_.server().subscriptions() < clients) loop_.run_once();
    return subscribers;
  }

  Directory directory_;
  hbd::Loop loop_;
  QuietCluster source_;
  hbd::Daemon daemon_;
  Subscribers subscribers_;
  bool up_ = true;
};

// As many connections, and nothing but a loop that sends.
class BareSide {
 public:
  BareSide(size_t clients, Bytes event) : event_(std::move(event)) {
    for (size_t made = 0; made < clients; ++made) {
      int pair[2];
      if (socketpair(AF_UNIX, SOCK_STREAM, 0, pair) != 0) throw_errno("socketpair");
      daemon_ends_.emplace_back(pair[0]);
      client_ends_.emplace_back(pair[1]);
    }
  }

  void tell_one() const {
    for (const Descriptor& end : daemon_ends_) {
      const ssize_t sent = send(end.get(), event_.data(), event_.size(), MSG_DONTWAIT | MSG_NOSIGNAL);
      if (sent != static_cast<ssize_t>(event_.size())) throw_errno("send");
    }
  }

  void drain_all() const {
    for (const Descriptor& end : client_ends_) drain(end.get());
  }

 private:
  Bytes event_;
  std::vector<Descriptor> daemon_ends_;
  std::vector<Descriptor> client_ends_;
};

template <typename Side>
Contender telling(Side& side, size_t batch) {
  return {.prepare = [&side] { side.drain_all(); },
          .run =
              [&side, batch] {
                for (size_t told = 0; told < batch; ++told) side.tell_one();
              },
          .operations = batch};
}

void compare_telling(size_t clients, size_t batch, const Compare& compare) {
  raise_descriptor_limit(2 * clients);
  DaemonSide daemon(clients);
  BareSide bare(clients, daemon.told_bytes());
  compare(telling(daemon, batch), telling(bare, batch));
}

}  // namespace

void add_daemon_rows() {
  struct Audience {
    size_t clients;
    size_t batch;  // events of one batch, so few that each fits into the sockets
    const char* name;
  };
  for (const Audience& to : {Audience{1, 64, "1 client"}, {64, 8, "64 clients"}, {500, 2, "500 clients"}}) {
    add_row({.name = std::string("daemon/event of 120 bytes to ") + to.name, .floor = "loop of send", .limit = 1.5},
            [to](const Compare& compare) { compare_telling(to.clients, to.batch, compare); });
  }
}

}  // namespace bench
