// A client of the sparse cluster that takes the events which a test sends.
#pragma once

#include "event_outputs.h"
#include "hb_communication/connection.h"
#include "support/running_client.h"
#include "test_cluster.h"

namespace hb_test {

// A client of the sparse cluster: adapters 0, 2, 12, 13, 17 of nodes 0, 3, 4; adapter numbers below 32, nodes below 8.
class EventReception : public RunningClient {
 protected:
  EventReception() : RunningClient(cleared(sparse_cluster())) {
    descriptors[0] = client_socket == nullptr ? -1 : client_socket->socket();
  }

  static ConfigurationMessage cleared(ConfigurationMessage configuration) {
    forget_leftovers();
    return configuration;
  }

  Hb_Rc take(timeval* timeout) {
    return hb_get_event_message(descriptors, timeout, &out.events, out.name, out.group.get(), &out.sequence);
  }
  Hb_Rc take() {
    timeval limit = {10, 0};
    return take(&limit);
  }

  Hb_Rc deliver(const ReplyPacket& packet) {
    connection.send_frame(packet.bytes());
    return take();
  }

  int descriptors[2] = {-1, -1};
  EventOutputs out;
};

// A packet whose header fields all differ, so that a field that is taken for another one shows.
inline ReplyPacket telling_packet(int32_t kind) {
  return ReplyPacket(kind)
      .leader(0xA1A2A3A4, 0xB1B2B3B4)
      .group(0xC1C2C3C4, 0xD1D2D3D4)
      .status(1)
      .name("followers")
      .value(0x3344)
      .ffdc("packet's identifier")
      .sequence(0x01020304);
}

inline uint32_t adapter_state(uint32_t adapter) {
  return static_cast<uint32_t>(static_cast<Hb_Adapter*>(Hash_search(adapter, global_config_tbl.adap_hash))->Hb_state);
}

inline void set_adapter_states(int32_t state) {
  for (int index = 0; index < global_config_tbl.Hb_num_adapters; ++index) {
    global_config_tbl.Hb_global_adapter_list[index].Hb_state = static_cast<Hb_Entity_State>(state);
  }
}

inline Hb_Node_config_state& node_state(uint32_t node) {
  return *static_cast<Hb_Node_config_state*>(Hash_search(node, global_config_tbl.node_hash));
}

inline void set_node_states(int32_t state, int32_t reason) {
  for (const uint32_t node : {0U, 3U, 4U}) {
    node_state(node).state = static_cast<Hb_Entity_State>(state);
    node_state(node).reason = static_cast<Hb_Entity_State_Reason>(reason);
  }
}

}  // namespace hb_test
