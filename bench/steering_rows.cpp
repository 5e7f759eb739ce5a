// Sending the requests that steer a daemon: those that are not answered, and those whose answer lies ready.
#include <cstddef>
#include <cstring>
#include <functional>

#include "bare_client.h"
#include "client.h"
#include "requests.h"
#include "rows.h"
#include "subscriber.h"

namespace bench {
namespace {

// As many small requests as fit into the socket with the buffers of the library.
constexpr size_t batch = 24;

constexpr double limit = 1.15;
constexpr Limits many_rounds{.least_rounds = 2000};

// An adapter of the local node, which is node 0, and the address of another one.
constexpr Hb_Adapter_Number adapter = 0;
constexpr Hb_Adapter_Number partner = 1;

char interface_name[] = "en0";

struct Steering_Request {
  const char* name;  // with the bytes that are written
  size_t data;       // bytes behind the header
  std::function<Hb_Rc()> send;
};

Hb_Rc send_routed_message() {
  static char text[100];
  static int nodes[] = {1, 2, 3};
  iovec buffer = {text, sizeof text};
  return hb_daemon_route_mcast(&buffer, 1, 4711, nodes, 3);
}

const Steering_Request requests[] = {
    {"request/node may be down, 81 bytes", 1, [] { return hb_node_may_be_down(1); }},
    {"request/node is down, 81 bytes", 1, [] { return hb_node_is_down(1); }},
    {"request/adapter may be down, 85 bytes", 5, [] { return hb_adapter_may_be_down(5); }},
    {"request/adapter is down, 85 bytes", 5, [] { return hb_adapter_is_down(5); }},
    {"request/enabling an adapter, 82 bytes", 2, [] { return hb_enable_adapter(adapter); }},
    {"request/disabling an adapter, 82 bytes", 2, [] { return hb_disable_adapter(adapter); }},
    {"request/interface down, 82 bytes", 2, [] { return hb_ifconfig_down(adapter); }},
    {"request/interface up, 82 bytes", 2, [] { return hb_ifconfig_up(adapter); }},
    {"request/simulated death, 84 bytes", 4, [] { return hb_simulate_death(5); }},
    {"request/discarding stale messages, 80 bytes", 0, [] { return hb_discard_stale_messages(Hb_True); }},
    {"request/keeping stale messages, 80 bytes", 0, [] { return hb_discard_stale_messages(Hb_False); }},
    {"request/routed message, 252 bytes", 172, send_routed_message},
    {"request/heartbeat, 84 bytes", 4, [] { return hb_client_heartbeat(1); }},
    {"request/manual control of a monitor, 83 bytes", 3,
     [] { return hb_nim_manual_start_control(HB_NIM_MANCTRL_ENABLE, interface_name); }},
    {"request/monitor's own control, 83 bytes", 3,
     [] { return hb_nim_manual_start_control(HB_NIM_MANCTRL_DISABLED, interface_name); }},
};

struct Answered_Request {
  const char* name;  // with the bytes that are written and read
  size_t data;
  Bytes answer;  // without its length
  bool is_waited_for;
  std::function<Hb_Rc()> call;
};

Bytes answer_of(Hb_Client_Reply kind, int32_t value, size_t message_size) {
  Bytes answer(HB_REPLY_HEADER_SIZE + message_size);
  std::memcpy(answer.data() + offsetof(client_packet, kind), &kind, sizeof kind);
  std::memcpy(answer.data() + offsetof(client_packet, value), &value, sizeof value);
  return answer;
}

Hb_IP_address4 partner_address() {
  static const Hb_IP_address4 address = [] {
    Hb_IP_address6 mapped = {};
    require(hb_get_adapter_address_by_number(partner, &mapped), "hb_get_adapter_address_by_number");
    return mapped.v4_in_v6.v4_in_v6_ipv4;
  }();
  return address;
}

Hb_Rc ask_state() {
  Hb_Adapter_state_t state;
  return hb_get_adapter_state(adapter, &state);
}

Hb_Rc ask_route() {
  Hb_Source_Route option;
  unsigned short length = 0;
  return hb_get_route(1, &option, &length);
}

const Answered_Request answered_requests[] = {
    {"answered/configuring, 88 and 112 bytes", 8, answer_of(HB_CONFIG_ADAPTER, 0, 0), true,
     [] { return hb_configure_adapter(adapter, 0x0100000A); }},
    {"answered/unconfiguring, 82 and 112 bytes", 2, answer_of(HB_CONFIG_ADAPTER, 0, 0), true,
     [] { return hb_unconfigure_adapter(adapter); }},
    {"answered/swapping, 88 and 112 bytes", 8, answer_of(HB_CONFIG_ADAPTER, 0, 0), true,
     [] { return hb_swap_adapters(adapter, partner_address()); }},
    {"answered/grace, 88 and 112 bytes", 8, answer_of(HB_ADAPTER_GRACE, 0, 0), false,
     [] { return hb_adapter_grace(adapter, 30); }},
    {"answered/adapter's state, 82 and 116 bytes", 2, answer_of(HB_ADAPTER_STATE, 0, 4), true, ask_state},
    {"answered/route, 81 and 288 bytes", 1, answer_of(HB_ROUTE, 176, 176), false, ask_route},
};

constexpr int answer_limit = 55;  // seconds

void compare_answered(const Compare& compare, const Answered_Request& request) {
  const Peer peer(full_size);
  const Client client(peer);
  const BareClient bare(peer.socket_path());
  const Descriptor bare_end = peer.accept();
  Bytes bytes = bare_request(request.data);
  const Bytes answer = framed(request.answer);
  Feed ours(client.daemon_end());
  Feed floor(bare_end);
  compare({.prepare =
               [&] {
                 drain(client.daemon_end().get());
                 ours.feed(answer, batch);
               },
           .run =
               [&] {
                 for (size_t sent = 0; sent < batch; ++sent) require(request.call(), request.name);
               },
           .operations = batch},
          {.prepare =
               [&] {
                 drain(bare_end.get());
                 floor.feed(answer, batch);
               },
           .run =
               [&] {
                 for (size_t sent = 0; sent < batch; ++sent) {
                   bare.send(bytes);
                   if (request.is_waited_for) wait_for(bare.descriptor(), Wait::select, answer_limit);
                   release(bare.receive());
                 }
               },
           .operations = batch});
}

}  // namespace

void add_steering_rows() {
  for (const Steering_Request& request : requests) {
    add_row({.name = request.name, .floor = "writev", .limit = limit, .limits = many_rounds},
            [&request](const Compare& compare) {
              compare_requests(compare, batch, request.data, [&] { require(request.send(), request.name); });
            });
  }
  for (const Answered_Request& request : answered_requests) {
    add_row({.name = request.name, .floor = "the same calls", .limits = many_rounds},
            [&request](const Compare& compare) { compare_answered(compare, request); });
  }
}

}  // namespace bench
