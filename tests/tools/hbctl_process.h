// A command that runs beside the test, with its standard output and standard error in pipes.
#pragma once

#include <sys/types.h>

#include <string>
#include <vector>

namespace hb_test {

struct Finished {
  int status;  // exit status; 128 and the signal when one ended it
  std::string output;
  std::string errors;
};

class ChildProcess {
 public:
  explicit ChildProcess(const std::vector<std::string>& command);
  // As above, but its standard output is that descriptor.
  ChildProcess(const std::vector<std::string>& command, int output);
  ~ChildProcess();
  ChildProcess(const ChildProcess&) = delete;
  ChildProcess& operator=(const ChildProcess&) = delete;

  // The next line of its output, without the line feed. Waits at most ten seconds, then throws.
  std::string read_line();
  // The same of its standard error.
  std::string read_error_line();

  void send_signal(int signal) const;
  // Whether it handles that signal itself.
  bool catches(int signal) const;
  // Its output has no reader any more.
  void close_output();

  // Waits for its end and for the rest of what it writes.
  Finished finish();

 private:
  void start(const std::vector<std::string>& command, int output, int errors);

  pid_t pid_ = -1;
  int output_ = -1;
  int errors_ = -1;
  std::string output_text_;
  std::string error_text_;
};

// The hbctl that was built, with these arguments.
std::vector<std::string> hbctl(const std::vector<std::string>& arguments);

}  // namespace hb_test
