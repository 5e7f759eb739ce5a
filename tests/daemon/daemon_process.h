/* The daemon as a process that a test starts and stops. */
#ifndef HB_TESTS_DAEMON_DAEMON_PROCESS_H
#define HB_TESTS_DAEMON_DAEMON_PROCESS_H

#include <sys/types.h>

#include <map>
#include <string>
#include <vector>

#include "support/temporary_directory.h"

/** A running hbd. Its log goes to a file; the test stops it, or the end of the object does. */
class DaemonProcess {
 public:
  /** Starts it with these arguments and environment variables; an empty value unsets one. */
  DaemonProcess(const TemporaryDirectory& directory, const std::vector<std::string>& arguments,
                const std::map<std::string, std::string>& environment = {});
  DaemonProcess(const DaemonProcess&) = delete;
  DaemonProcess& operator=(const DaemonProcess&) = delete;
  ~DaemonProcess();

  /** Waits until it accepts clients; false when it ends before. */
  bool wait_until_ready();
  /** Asks it to stop. */
  void signal(int number) const;
  /** Waits for its end; the exit status, or 128 and the signal that it died of. */
  int wait_for_end();
  /** SIGTERM and wait_for_end(). */
  int stop();

  [[nodiscard]] pid_t pid() const { return pid_; }
  /** What it has written to standard error. */
  [[nodiscard]] std::string log() const;
  /** What it has written to standard output. */
  [[nodiscard]] std::string output() const;

 private:
  pid_t pid_ = -1;
  bool ended_ = false;
  int ready_ = -1;
  std::string log_file_;
  std::string output_file_;
};

#endif
