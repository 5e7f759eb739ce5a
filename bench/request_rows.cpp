// Sending requests.
#include <memory>

#include "bare_client.h"
#include "client.h"
#include "requests.h"
#include "rows.h"
#include "subscriber.h"

namespace bench {
namespace {

// As many as fit into the socket with the buffers of the library.
constexpr size_t subscriptions = 3;
constexpr size_t withdrawals = 24;

char subscription_name[] = "benchmark";

void compare_subscribing(const Compare& compare) {
  const auto group = std::make_unique<Hb_Subscription_Group>();
  group->Hb_subscription_type = Hb_Adapter_Subscription;
  group->Hb_subscription_grp_union.Hb_adapter_subscription_grp.Hb_num_adapters = 1;
  group->Hb_subscription_grp_union.Hb_adapter_subscription_grp.Hb_adapter_list[0] = 0x80;
  compare_requests(compare, subscriptions, sizeof *group,
                   [&] { require(hb_subscribe(subscription_name, group.get(), HB_EVENT_DEATH), "hb_subscribe"); });
}

void compare_withdrawing(const Compare& compare) {
  compare_requests(compare, withdrawals, sizeof subscription_name,
                   [] { require(hb_unsubscribe(subscription_name), "hb_unsubscribe"); });
}

}  // namespace

Bytes bare_request(size_t data) { return framed(Bytes(HB_REQUEST_HEADER_SIZE + data, 'x')); }

void compare_requests(const Compare& compare, size_t batch, size_t data, const std::function<void()>& request) {
  const Peer peer(full_size);
  const Client client(peer);
  const BareClient bare(peer.socket_path());
  const Descriptor bare_end = peer.accept();
  Bytes bytes = bare_request(data);
  compare({.prepare = [&] { drain(client.daemon_end().get()); },
           .run =
               [&] {
                 for (size_t sent = 0; sent < batch; ++sent) request();
               },
           .operations = batch},
          {.prepare = [&] { drain(bare_end.get()); },
           .run =
               [&] {
                 for (size_t sent = 0; sent < batch; ++sent) bare.send(bytes);
               },
           .operations = batch});
}

void add_request_rows() {
  const Limits many_rounds{.least_rounds = 2000};
  add_row({.name = "request/subscription, 12,428 bytes", .floor = "writev", .limit = 1.15, .limits = many_rounds},
          compare_subscribing);
  add_row({.name = "request/withdrawal, 90 bytes", .floor = "writev", .limit = 1.15, .limits = many_rounds},
          compare_withdrawing);
}

}  // namespace bench
