// Standard output, written at once.
#pragma once

#include <string_view>

namespace hbctl {

class Output {
 public:
  explicit Output(int fd) : fd_(fd) {}
  int descriptor() const { return fd_; }

  // Writes all of it. Throws OutputClosed when nobody reads any more, CommandError when it cannot be written.
  void write(std::string_view text) const;

 private:
  int fd_;
};

}  // namespace hbctl
