// A client that is sent what it should not trust, and everything that must not change by it.
#pragma once

#include <cstring>
#include <limits>

#include "event_outputs.h"
#include "hb_communication/connection.h"
#include "hb_communication/event_reception.h"
#include "support/allocation_faults.h"
#include "support/running_client.h"
#include "test_cluster.h"

namespace hb_test {

inline constexpr int32_t most = std::numeric_limits<int32_t>::max();
inline constexpr int32_t least = std::numeric_limits<int32_t>::min();

template <typename T>
inline Bytes image_of(const T* records, size_t count = 1) {
  return Bytes(reinterpret_cast<const char*>(records), count * sizeof(T));
}

// Everything that an event could change: the table with its pointers, the adapters and nodes that it owns, the flags
// of nodes and the heartbeat settings.
inline Bytes image_of_state() {
  return image_of(&global_config_tbl) +
         image_of(global_config_tbl.Hb_global_adapter_list, static_cast<size_t>(global_config_tbl.Hb_num_adapters)) +
         image_of(global_config_tbl.node_list, 2049) + image_of(global_node_tbl, 2049) + image_of(&global_num_nodes) +
         image_of(&client_hb_info);
}

class HostileInput : public RunningClient {
 protected:
  HostileInput() : RunningClient(sparse_cluster()) { connected(); }

  void connected() { descriptors_[0] = client_socket->socket(); }

  Hb_Rc take() {
    timeval limit = {10, 0};
    return hb_get_event_message(descriptors_, &limit, &out.events, out.name, out.group.get(), &out.sequence);
  }

  Hb_Rc deliver(const Bytes& packet) {
    connection.send_frame(packet);
    return take();
  }

  // Refused with that error, and neither output nor state nor memory is any different.
  void expect_refused(const Bytes& packet, int error = 10) {
    const Bytes before = image_of_state();
    connection.send_frame(packet);
    const long live = live_allocations();
    EXPECT_TRUE(fails_with(error, [&] { return take(); }));
    EXPECT_EQ(live, live_allocations());
    EXPECT_TRUE(out.untouched());
    EXPECT_TRUE(before == image_of_state());
  }

  EventOutputs out;

 private:
  int descriptors_[2] = {-1, -1};
};

inline Bytes whole_packet(int32_t kind) {
  ReplyPacket packet(kind);
  packet.name("followers").sequence(5);
  switch (kind) {
    case 2:
    case 3:
    case 4:
      return packet.message(adapter_event_message({{13, 1}, {2, 2}})).bytes();
    case 5:
    case 6:
    case 7:
      return packet.message(node_event_message({1, 0, 0, 1, 1, 0, 0, 0})).bytes();
    case 9:
      return packet.message(sparse_cluster().bytes()).bytes();
    case 13:
      return packet.message(Bytes(20, 'i')).bytes();
    case 15:
      return packet.message(Bytes(16, 'h')).bytes();
    default:
      return packet.bytes();
  }
}

}  // namespace hb_test
