// What the library is measured against: the same system calls on the same bytes, with nothing around them.
#pragma once

#include <string>

#include "bare_tables.h"
#include "client.h"
#include "cluster.h"
#include "descriptor.h"

namespace bench {

enum class Wait { poll, select };

// Waits until the descriptor is readable, not at all with 0 seconds. Throws when it is not by then.
void wait_for(int descriptor, Wait wait, int seconds);

class BareClient {
 public:
  // Connects with the socket buffers of the library.
  explicit BareClient(const std::string& socket_path);

  int descriptor() const { return socket_.get(); }

  // Reads one packet into a new array.
  client_packet* receive() const;

  // Writes a request that is ready to be sent.
  void send(Bytes& framed_request) const;

 private:
  Descriptor socket_;
};

// Each copies what the library hands out of a packet and releases the packet.
void take_failure_data(client_packet* packet, Outputs& outputs);
void take_node_event(client_packet* packet, Outputs& outputs, int nodes);

// Clears the list of adapters and stores the entries. With tables it walks a chain for each of them, too.
void take_adapter_event(client_packet* packet, Outputs& outputs, BareConfiguration* tables);

void release(client_packet* packet);

}  // namespace bench
