// The library, started against a peer and stopped again.
#pragma once

#include "cluster.h"
#include "descriptor.h"
#include "hb_client.h"
#include "peer.h"

namespace bench {

// What one taken event fills.
struct Outputs {
  Hb_Events events = 0;
  Hb_Seq_Num sequence_number = 0;
  Hb_Name name{};
  Hb_Group group{};
};

// Says where the library finds its daemon.
void point_library_at(const std::string& socket_path);

// Throws with the library's error number unless it is Hb_Success.
void require(Hb_Rc result, const char* what);

class Client {
 public:
  explicit Client(const Peer& peer);
  ~Client();
  Client(const Client&) = delete;
  Client& operator=(const Client&) = delete;

  int* descriptors() const { return descriptors_; }
  const Descriptor& daemon_end() const { return daemon_end_; }

 private:
  Descriptor daemon_end_;
  int* descriptors_ = nullptr;
};

}  // namespace bench
