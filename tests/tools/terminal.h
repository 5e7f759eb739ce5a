// A terminal for a command, and the person before it.
#pragma once

#include <string>

namespace hb_test {

class Terminal {
 public:
  Terminal();
  ~Terminal();
  Terminal(const Terminal&) = delete;
  Terminal& operator=(const Terminal&) = delete;

  // For the command's standard streams.
  int descriptor() const { return command_side_; }

  // What is on the screen up to and with that text. Waits at most ten seconds, then throws.
  std::string read_to(const std::string& text);
  // What is on the screen by now.
  std::string read_written();
  void type(const std::string& keys);

 private:
  int person_side_ = -1;
  int command_side_ = -1;
};

}  // namespace hb_test
