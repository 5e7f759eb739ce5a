// Daemon and client in turns: the client asks for an event by one byte, a daemon thread sends it, the client takes it.
#include <sys/socket.h>

#include <memory>
#include <thread>

#include "bare_client.h"
#include "client.h"
#include "rows.h"

namespace bench {
namespace {

constexpr int longest_wait = 10;  // seconds

// Sends the event once for each byte that comes. Ends when its last user is gone.
class TurnDaemon {
 public:
  TurnDaemon(const Descriptor& end, const Bytes& event) {
    int pair[2];
    if (socketpair(AF_UNIX, SOCK_STREAM, 0, pair) != 0) throw_errno("socketpair");
    ask_ = Descriptor(pair[0]);
    asked_ = Descriptor(pair[1]);
    thread_ = std::jthread([this, &end, &event] { serve(end, event); });
  }
  ~TurnDaemon() { ask_.close(); }
  TurnDaemon(const TurnDaemon&) = delete;
  TurnDaemon& operator=(const TurnDaemon&) = delete;

  void ask() const { write_all(ask_.get(), {1}); }

 private:
  void serve(const Descriptor& end, const Bytes& event) const {
    for (char turn = 0; read_all(asked_.get(), &turn, 1);) write_all(end.get(), event);
  }

  Descriptor ask_;
  Descriptor asked_;
  std::jthread thread_;
};

struct TurnRow {
  std::string name;
  Cluster cluster;
  Bytes event;
  void (*take_bare)(client_packet* packet, Outputs& outputs);
};

void take_one(const Client& client, Outputs& outputs) {
  timeval limit{longest_wait, 0};
  require(hb_get_event_message(client.descriptors(), &limit, &outputs.events, outputs.name, &outputs.group,
                               &outputs.sequence_number),
          "hb_get_event_message");
}

void compare_turns(const TurnRow& row, const Compare& compare) {
  const Peer peer(row.cluster);
  const Client client(peer);
  const BareClient bare(peer.socket_path());
  const Descriptor bare_end = peer.accept();
  const Bytes bytes = framed(row.event);
  const TurnDaemon our_daemon(client.daemon_end(), bytes);
  const TurnDaemon bare_daemon(bare_end, bytes);
  const auto outputs = std::make_unique<Outputs>();
  const auto our_turn = [&] {
    our_daemon.ask();
    take_one(client, *outputs);
  };
  const auto bare_turn = [&] {
    bare_daemon.ask();
    wait_for(bare.descriptor(), Wait::select, longest_wait);
    row.take_bare(bare.receive(), *outputs);
  };
  compare({.prepare = {}, .run = our_turn, .operations = 1}, {.prepare = {}, .run = bare_turn, .operations = 1});
}

}  // namespace

void add_turn_rows() {
  const std::vector<TurnRow> rows = {
      {"112 bytes, failure data", full_size, failure_data_event(4), take_failure_data},
      {"2,049 nodes, 3 died", full_size, node_event(HB_NODE_DEATH, full_size, 700),
       [](client_packet* packet, Outputs& outputs) { take_node_event(packet, outputs, full_size.nodes); }},
  };
  for (const TurnRow& row : rows) {
    add_row({.name = "in turns/" + row.name + ", select",
             .floor = "bare loop",
             .limit = 1.10,
             .limits = {.least_rounds = 4000}},
            [row](const Compare& compare) { compare_turns(row, compare); });
  }
}

}  // namespace bench
