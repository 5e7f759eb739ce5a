// A daemon's end, played in this process: it listens, publishes, answers the configuration request, and sends what it
// is told to.
#pragma once

#include <string>
#include <thread>

#include "cluster.h"
#include "descriptor.h"
#include "directory.h"
#include "segments.h"

namespace bench {

class Peer {
 public:
  explicit Peer(const Cluster& cluster);

  const std::string& socket_path() const { return socket_path_; }

  // The daemon's end of the next connection.
  Descriptor accept() const;

  // The same, and answers one configuration request on it.
  Descriptor accept_and_answer() const;

 private:
  Directory directory_;
  std::string socket_path_;
  Descriptor listener_;
  Segments segments_;
  Bytes configuration_;
};

// Sends bytes ahead of their reader: at once where they have room in the socket, else from a thread of its own.
class Feed {
 public:
  explicit Feed(const Descriptor& end) : end_(end) {}

  // Whatever was fed before has been read by now.
  void feed(const Bytes& bytes, size_t times);

 private:
  const Descriptor& end_;
  std::jthread sender_;
};

}  // namespace bench
