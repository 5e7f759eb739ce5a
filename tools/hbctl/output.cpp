#include "output.h"

#include <unistd.h>

#include <cerrno>
#include <cstring>

#include "errors.h"

namespace hbctl {

void Output::write(std::string_view text) const {
  while (!text.empty()) {
    const ssize_t written = ::write(fd_, text.data(), text.size());
    if (written >= 0) {
      text.remove_prefix(static_cast<size_t>(written));
    } else if (errno == EPIPE) {
      throw OutputClosed();
    } else if (errno != EINTR) {
      throw CommandError(ExitStatus::Failed, std::string("cannot write standard output: ") + std::strerror(errno));
    }
  }
}

}  // namespace hbctl
