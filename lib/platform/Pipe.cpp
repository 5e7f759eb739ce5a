#include "platform/Pipe.h"

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

#include <cerrno>

namespace {

bool never_waits(int descriptor) { return fcntl(descriptor, F_SETFL, O_NONBLOCK) == 0; }

// Asked again when a signal comes in between. A descriptor that cannot be polled is left to the write.
bool nobody_can_read(int descriptor) {
  pollfd polled = {descriptor, 0, 0};
  int result = 0;
  do {
    result = poll(&polled, 1, 0);
  } while (result < 0 && errno == EINTR);
  return result > 0 && (polled.revents & POLLERR) != 0;
}

}  // namespace

Pipe::Pipe() { is_open_ = pipe2(ends_, O_CLOEXEC) == 0; }

Pipe::~Pipe() {
  if (is_open_) {
    close(ends_[0]);
    close(ends_[1]);
  }
}

bool Pipe::read_without_waiting() { return never_waits(ends_[0]); }
bool Pipe::write_without_waiting() { return never_waits(ends_[1]); }

ssize_t write_to_pipe(int descriptor, char byte) {
  const int error = errno;
  if (nobody_can_read(descriptor)) {
    errno = EPIPE;
    return -1;
  }
  errno = error;
  return write(descriptor, &byte, sizeof byte);
}
