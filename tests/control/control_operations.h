// Every operation of the control, route and security families, with arguments that are good in the sparse cluster.
#pragma once

#include <algorithm>
#include <array>
#include <functional>
#include <ostream>
#include <string>
#include <vector>

#include "steering.h"

namespace hb_test {

// What an operation sets where nothing can be sent or read: nothing, as it succeeds all the same; nothing, as it fails
// without a number; or that number.
inline constexpr int no_failure = 0;
inline constexpr int no_error_number = -1;

struct Operation {
  const char* name;
  std::function<Hb_Rc()> call;
  int32_t request;         // its code, 0 when nothing is asked
  Bytes answer;            // a good one; empty when none is awaited
  int in_vex_mode;         // without a connection
  int without_connection;  // in daemon mode
};

inline void PrintTo(const Operation& operation, std::ostream* stream) { *stream << operation.name; }

// Where operations write, filled with a pattern that none of them writes.
struct Operation_Outputs {
  void clear() {
    std::memset(&bytes, 0xB7, sizeof bytes);
    nodes = {4, 0, 3};
  }
  bool bytes_untouched() const {
    const auto* first = reinterpret_cast<const uint8_t*>(&bytes);
    return std::all_of(first, first + sizeof bytes, [](uint8_t byte) { return byte == 0xB7; });
  }
  bool untouched() const { return bytes_untouched() && nodes == std::array<int, 3>{4, 0, 3}; }

  struct {
    Hb_Adapter_state_t state;
    timeval remote;
    timeval local;
    Hb_Source_Route route;
    unsigned short length;
    Hb_Sequence_Number sequence;
    Hb_Security_Status current;
    Hb_Security_Status previous;
    Hb_Key_Cache cache;
  } bytes;
  std::array<int, 3> nodes;
};

inline Operation_Outputs operation_outputs;

inline Hb_Rc route_a_message() {
  char text[] = "to all";
  iovec buffer = {text, 6};
  return hb_daemon_route_mcast(&buffer, 1, 80, operation_outputs.nodes.data(), 3);
}

// All but hb_get_client_hb_info() and hb_free_security_info_keys(), which need no client.
inline std::vector<Operation> operations_that_start() {
  static char interface[] = "en0";
  static auto& out = operation_outputs.bytes;
  const Bytes configured = ReplyPacket(10).bytes();
  const Bytes state = ReplyPacket(14).message(octets({2, 0, 0, 0})).bytes();
  const Bytes route = ReplyPacket(8).value(36).message(Bytes(176, 'r')).bytes();
  return {
      {"hb_enable_adapter", [] { return hb_enable_adapter(13); }, 207, {}, no_failure, 12},
      {"hb_disable_adapter", [] { return hb_disable_adapter(13); }, 208, {}, no_failure, 12},
      {"hb_ifconfig_down", [] { return hb_ifconfig_down(13); }, 212, {}, no_failure, 12},
      {"hb_ifconfig_up", [] { return hb_ifconfig_up(13); }, 213, {}, no_failure, 12},
      {"hb_configure_adapter",
       [] {
         return hb_configure_adapter(13, ipv4({10, 9, 8, 7}));
       },
       214, configured, 12, 12},
      {"hb_unconfigure_adapter", [] { return hb_unconfigure_adapter(13); }, 215, configured, 12, 12},
      {"hb_swap_adapters",
       [] {
         return hb_swap_adapters(13, ipv4({10, 0, 0, 3}));
       },
       218, configured, 12, 12},
      {"hb_adapter_grace", [] { return hb_adapter_grace(13, 5); }, 216, ReplyPacket(11).bytes(), 12, 12},
      {"hb_get_adapter_state", [] { return hb_get_adapter_state(13, &out.state); }, 223, state, 12, 12},
      {"hb_adapter_may_be_down", [] { return hb_adapter_may_be_down(17); }, 205, {}, no_failure, 12},
      {"hb_adapter_is_down", [] { return hb_adapter_is_down(17); }, 206, {}, no_failure, 12},
      {"hb_node_may_be_down", [] { return hb_node_may_be_down(4); }, 203, {}, no_failure, 12},
      {"hb_node_is_down", [] { return hb_node_is_down(4); }, 204, {}, no_failure, 12},
      {"hb_simulate_death", [] { return hb_simulate_death(5); }, 217, {}, no_failure, 12},
      {"hb_discard_stale_messages", [] { return hb_discard_stale_messages(Hb_True); }, 219, {}, no_failure, 12},
      {"hb_client_heartbeat", [] { return hb_client_heartbeat(5); }, 222, {}, no_failure, 12},
      {"hb_nim_manual_start_control",
       [] { return hb_nim_manual_start_control(HB_NIM_MANCTRL_ENABLE, interface); },
       225,
       {},
       no_failure,
       12},
      {"hb_get_local_rem_sim_node_down_period",
       [] { return hb_get_local_rem_sim_node_down_period(&out.remote, &out.local); },
       0,
       {},
       no_failure,
       no_failure},
      {"hb_get_route", [] { return hb_get_route(4, &out.route, &out.length); }, 211, route, 12, 12},
      {"hb_read_route", [] { return hb_read_route(4, &out.route, &out.length); }, 0, {}, 6, 6},
      {"hb_read_ip_route", [] { return hb_read_ip_route(4, &out.route, &out.length); }, 0, {}, 6, 6},
      {"hb_daemon_route_mcast", route_a_message, 221, {}, no_failure, 12},
      {"hb_get_security_sequence",
       [] { return hb_get_security_sequence(&out.sequence); },
       0,
       {},
       no_error_number,
       no_error_number},
      {"hb_get_security_infomation",
       [] { return hb_get_security_infomation(&out.current, &out.previous, &out.cache); },
       0,
       {},
       no_error_number,
       no_error_number},
  };
}

}  // namespace hb_test
