// Clients of a daemon without the library: they subscribe, and leave what they are sent in their socket.
#pragma once

#include <string>
#include <vector>

#include "bare_client.h"
#include "cluster.h"

namespace bench {

// Reads and drops whatever has come.
void drain(int descriptor);

class Subscribers {
 public:
  // Connects so many clients, each with a subscription to these events of all adapters.
  Subscribers(const std::string& socket_path, size_t count, Hb_Events events);

  size_t size() const { return clients_.size(); }
  const BareClient& first() const { return clients_.front(); }
  void drain_all() const;

  // Waits until each has been sent something.
  void await_all() const;

 private:
  std::vector<BareClient> clients_;
};

// Lets the process have descriptors for so many connections with both their ends. Throws when it may not.
void raise_descriptor_limit(size_t connections);

}  // namespace bench
