// Loading the configuration of the largest cluster, at the start and on an update.
#include <malloc.h>

#include <cstring>
#include <memory>
#include <semaphore>
#include <thread>

#include "bare_client.h"
#include "client.h"
#include "hb_protocol/framing.h"
#include "rows.h"

namespace bench {
namespace {

constexpr int longest_wait = 10;  // seconds
constexpr Limits few_rounds{.least_rounds = 24, .most_seconds = 60};

Bytes bare_configuration_request() {
  Bytes request(HB_REQUEST_HEADER_SIZE);
  const int32_t kind = HB_GET_CONFIG_INFO;
  std::memcpy(request.data() + offsetof(packet_str, kind), &kind, sizeof kind);
  return framed(request);
}

// Answers one connection. It stands ready when the constructor returns.
class Answer {
 public:
  explicit Answer(const Peer& peer)
      : thread_([this, &peer] {
          ready_.release();
          end_ = peer.accept_and_answer();
        }) {
    ready_.acquire();
  }

 private:
  std::binary_semaphore ready_{0};
  Descriptor end_;
  std::jthread thread_;
};

// Ends the one that was, and stands ready for the next. What was released goes back to the system, so that each load
// starts with the memory of a new process.
void answer_next(std::unique_ptr<Answer>& answer, const Peer& peer) {
  answer.reset();
  malloc_trim(0);
  answer = std::make_unique<Answer>(peer);
}

class BareLoad {
 public:
  explicit BareLoad(const Peer& peer) : request_(bare_configuration_request()) { load(peer); }

  void load(const Peer& peer) {
    client_ = std::make_unique<BareClient>(peer.socket_path());
    client_->send(request_);
    fill(client_->receive());
  }

  void unload() {
    tables_.reset();
    client_.reset();
  }

 private:
  void fill(client_packet* packet) {
    tables_ = std::make_unique<BareConfiguration>(packet->message);
    release(packet);
  }

  Bytes request_;
  std::unique_ptr<BareClient> client_;
  std::unique_ptr<BareConfiguration> tables_;
};

void compare_first_load(const Compare& compare) {
  const Peer peer(full_size);
  point_library_at(peer.socket_path());
  auto answer = std::make_unique<Answer>(peer);
  BareLoad bare(peer);
  compare({.prepare =
               [&] {
                 hb_terminate();
                 answer_next(answer, peer);
               },
           .run = [] { require(hb_init(), "hb_init"); },
           .operations = 1},
          {.prepare =
               [&] {
                 bare.unload();
                 answer_next(answer, peer);
               },
           .run = [&] { bare.load(peer); },
           .operations = 1});
  hb_terminate();
}

// The tables that were there are released and filled anew, as the library does it.
void reload_bare(const BareClient& client, std::unique_ptr<BareConfiguration>& tables) {
  wait_for(client.descriptor(), Wait::select, longest_wait);
  client_packet* packet = client.receive();
  tables.reset();
  tables = std::make_unique<BareConfiguration>(packet->message);
  release(packet);
}

void reload_with_library(const Client& client, Outputs& outputs) {
  timeval longest{longest_wait, 0};
  require(hb_get_event_message(client.descriptors(), &longest, &outputs.events, outputs.name, &outputs.group,
                               &outputs.sequence_number),
          "hb_get_event_message");
}

void compare_reload(const Compare& compare) {
  const Peer peer(full_size);
  const Client client(peer);
  const BareClient bare(peer.socket_path());
  const Descriptor bare_end = peer.accept();
  const Bytes update = framed(configuration(HB_CONFIGURATION_UPDATE, full_size));
  Feed our_feed(client.daemon_end());
  Feed bare_feed(bare_end);
  const auto outputs = std::make_unique<Outputs>();
  std::unique_ptr<BareConfiguration> tables;
  compare({.prepare = [&] { our_feed.feed(update, 1); },
           .run = [&] { reload_with_library(client, *outputs); },
           .operations = 1},
          {.prepare = [&] { bare_feed.feed(update, 1); }, .run = [&] { reload_bare(bare, tables); }, .operations = 1});
}

}  // namespace

void add_configuration_rows() {
  add_row({.name = "configuration/98,352 adapters, loaded",
           .floor = "connection, transfer, filling three chained tables",
           .limit = 1.25,
           .limits = few_rounds},
          compare_first_load);
  add_row({.name = "configuration/98,352 adapters, reloaded",
           .floor = "transfer, releasing and filling three chained tables",
           .limit = 1.25,
           .limits = few_rounds},
          compare_reload);
}

}  // namespace bench
