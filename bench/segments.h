// The shared-memory segments and semaphores of a daemon, made for a socket path and removed again.
#pragma once

#include <string>
#include <vector>

#include "cluster.h"

namespace bench {

// From now on a signal that ends the process first removes what is there of segments, with their socket.
void clear_up_on_signals();

class Segments {
 public:
  // Requires that the socket exists. Throws when one cannot be made.
  Segments(const std::string& socket_path, const Cluster& cluster);
  ~Segments();
  Segments(const Segments&) = delete;
  Segments& operator=(const Segments&) = delete;

 private:
  friend void clear_up_on_signals();

  void publish(const std::string& socket_path, const Cluster& cluster);
  int make_segment(const std::string& socket_path, int project, size_t size);
  void make_semaphores(const std::string& socket_path);
  void remove();
  static void remove_and_exit(int signal);

  static Segments* present_;  // what a signal removes

  std::string socket_path_;
  std::string directory_;
  std::vector<int> segments_;
  int semaphores_ = -1;
};

}  // namespace bench
