// The connection to the daemon, for as long as a command runs.
#pragma once

#include <string>

namespace hbctl {

class DaemonLink {
 public:
  // Throws CommandError when the library cannot start.
  explicit DaemonLink(const std::string& socket_path);
  ~DaemonLink();
  DaemonLink(const DaemonLink&) = delete;
  DaemonLink& operator=(const DaemonLink&) = delete;
};

}  // namespace hbctl
