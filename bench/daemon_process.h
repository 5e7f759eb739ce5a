// A running hbd.
#pragma once

#include <sys/types.h>

#include <string>

#include "directory.h"

namespace bench {

class DaemonProcess {
 public:
  // Returns when clients can connect.
  explicit DaemonProcess(const std::string& program);
  ~DaemonProcess();
  DaemonProcess(const DaemonProcess&) = delete;
  DaemonProcess& operator=(const DaemonProcess&) = delete;

  std::string socket_path() const { return directory_.path() + "/socket"; }
  double resident_bytes() const;

 private:
  Directory directory_;
  pid_t process_ = -1;
};

}  // namespace bench
