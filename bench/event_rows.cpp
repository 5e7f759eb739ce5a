// Taking events that wait in the socket.
#include <cstring>
#include <memory>

#include "bare_client.h"
#include "client.h"
#include "rows.h"

namespace bench {
namespace {

constexpr int longest_wait = 10;  // seconds; a feeding thread may still be at it

using TakeBare = std::function<void(client_packet*, Outputs&)>;

struct EventRow {
  std::string name;
  std::string floor;
  double limit;
  Cluster cluster;
  Bytes event;
  size_t batch;  // events of one batch, so few that they lie in the socket before the first is taken
  TakeBare take_bare;
};

void take_with_library(const Client& client, Outputs& outputs, Wait wait) {
  timeval longest{longest_wait, 0};
  if (wait == Wait::poll) wait_for(client.descriptors()[0], wait, longest_wait);
  timeval* limit = wait == Wait::select ? &longest : nullptr;
  require(hb_get_event_message(client.descriptors(), limit, &outputs.events, outputs.name, &outputs.group,
                               &outputs.sequence_number),
          "hb_get_event_message");
}

void take_bare(const BareClient& client, Outputs& outputs, Wait wait, const TakeBare& take) {
  wait_for(client.descriptor(), wait, longest_wait);
  take(client.receive(), outputs);
}

Contender library_side(const Client& client, Outputs& outputs, Feed& feed, const Bytes& event, size_t batch,
                       Wait wait) {
  return {.prepare = [&feed, &event, batch] { feed.feed(event, batch); },
          .run =
              [&client, &outputs, batch, wait] {
                for (size_t taken = 0; taken < batch; ++taken) take_with_library(client, outputs, wait);
              },
          .operations = batch};
}

Contender bare_side(const BareClient& client, Outputs& outputs, Feed& feed, const Bytes& event, size_t batch, Wait wait,
                    const TakeBare& take) {
  return {.prepare = [&feed, &event, batch] { feed.feed(event, batch); },
          .run =
              [&client, &outputs, &take, batch, wait] {
                for (size_t taken = 0; taken < batch; ++taken) take_bare(client, outputs, wait, take);
              },
          .operations = batch};
}

void compare_event(const EventRow& row, Wait wait, const Compare& compare) {
  const Peer peer(row.cluster);
  const Client client(peer);
  const BareClient bare(peer.socket_path());
  const Descriptor bare_end = peer.accept();
  const Bytes bytes = framed(row.event);
  auto our_outputs = std::make_unique<Outputs>();
  auto bare_outputs = std::make_unique<Outputs>();
  Feed our_feed(client.daemon_end());
  Feed bare_feed(bare_end);
  compare(library_side(client, *our_outputs, our_feed, bytes, row.batch, wait),
          bare_side(bare, *bare_outputs, bare_feed, bytes, row.batch, wait, row.take_bare));
}

void add_event_row(const EventRow& row, Wait wait, const char* wait_name) {
  add_row({.name = "take/" + row.name + ", " + wait_name, .floor = row.floor, .limit = row.limit},
          [row, wait](const Compare& compare) { compare_event(row, wait, compare); });
}

TakeBare taking_nodes(const Cluster& cluster) {
  return [nodes = cluster.nodes](client_packet* packet, Outputs& outputs) { take_node_event(packet, outputs, nodes); };
}

// The tables that the walks lead through; made when the first packet comes, like the library's own.
TakeBare taking_adapters_and_walking() {
  const auto tables = std::make_shared<std::unique_ptr<BareConfiguration>>();
  return [tables](client_packet* packet, Outputs& outputs) {
    if (!*tables) {
      const Bytes message = configuration(HB_CONFIGURATION_INFO, full_size);
      *tables = std::make_unique<BareConfiguration>(message.data() + HB_REPLY_HEADER_SIZE);
    }
    take_adapter_event(packet, outputs, tables->get());
  };
}

TakeBare taking_nodes_and_walking() {
  const auto tables = std::make_shared<std::unique_ptr<BareConfiguration>>();
  return [tables](client_packet* packet, Outputs& outputs) {
    if (!*tables) {
      const Bytes message = configuration(HB_CONFIGURATION_INFO, full_size);
      *tables = std::make_unique<BareConfiguration>(message.data() + HB_REPLY_HEADER_SIZE);
    }
    for (int node = 0; node < full_size.nodes; ++node) {
      Hb_Boolean member;
      std::memcpy(&member, packet->message + static_cast<size_t>(node) * sizeof member, sizeof member);
      if (member != Hb_True) continue;
      Hb_Node_config_state* state = (*tables)->find_node(static_cast<uint32_t>(node));
      state->state = Hb_Entity_Up;
      state->reason = Hb_Entity_State_Reason_Up;
    }
    take_node_event(packet, outputs, full_size.nodes);
  };
}

std::vector<EventRow> event_rows() {
  const Cluster one_node{1, 1};
  const auto take_adapters = [](client_packet* packet, Outputs& outputs) {
    take_adapter_event(packet, outputs, nullptr);
  };
  const auto all_adapters = static_cast<size_t>(full_size.adapters());
  return {
      {"112 bytes, failure data", "bare loop", 1.08, full_size, failure_data_event(4), 64, take_failure_data},
      {"112 bytes, node death", "bare loop", 1.08, one_node, node_event(HB_NODE_DEATH, one_node, 1), 64,
       taking_nodes(one_node)},
      {"2,049 nodes, 3 died", "bare loop", 1.08, full_size, node_event(HB_NODE_DEATH, full_size, 700), 32,
       taking_nodes(full_size)},
      {"2,049 nodes, all joined", "bare loop", 1.08, full_size, node_event(HB_NODE_JOIN, full_size, 1), 32,
       taking_nodes(full_size)},
      {"2,049 nodes, all joined", "bare loop, a chain walk a node", 0, full_size,
       node_event(HB_NODE_JOIN, full_size, 1), 32, taking_nodes_and_walking()},
      {"48 adapters", "bare loop, memset", 1.10, full_size, adapter_event(HB_ADAPTER_DEATH, 48, 2049), 16,
       take_adapters},
      {"98,352 adapters", "bare loop, memset, stores, a chain walk an entry", 1.25, full_size,
       adapter_event(HB_ADAPTER_DEATH, all_adapters, 1), 2, taking_adapters_and_walking()},
  };
}

}  // namespace

void add_event_rows() {
  for (const EventRow& row : event_rows()) {
    add_event_row(row, Wait::poll, "poll");
    add_event_row(row, Wait::select, "select");
  }
}

}  // namespace bench
