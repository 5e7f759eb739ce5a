// A command that runs beside the test, with its standard output and standard error in pipes and nothing to read.
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

// Descriptors for a command in place of those that it has otherwise; -1 for none.
struct Streams {
  int input = -1;
  int output = -1;
  int errors = -1;
};

class ChildProcess {
 public:
  explicit ChildProcess(const std::vector<std::string>& command);
  ChildProcess(const std::vector<std::string>& command, const Streams& streams);
  ~ChildProcess();
  ChildProcess(const ChildProcess&) = delete;
  ChildProcess& operator=(const ChildProcess&) = delete;

  pid_t pid() const { return pid_; }

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
  void start(const std::vector<std::string>& command, const Streams& streams);

  pid_t pid_ = -1;
  int output_ = -1;
  int errors_ = -1;
  std::string output_text_;
  std::string error_text_;
};

// The hbctl that was built, with these arguments.
std::vector<std::string> hbctl(const std::vector<std::string>& arguments);

}  // namespace hb_test
