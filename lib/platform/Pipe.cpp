#include "platform/Pipe.h"

#include <fcntl.h>
#include <poll.h>
#include <pthread.h>
#include <unistd.h>

#include <cerrno>

#include "VEX_HBC_trace.h"

namespace {

bool never_waits(int descriptor) { return fcntl(descriptor, F_SETFL, O_NONBLOCK) == 0; }

// Asked again when a signal comes in between. A descriptor that cannot be polled is left to the write. A thread that is
// cancelled ends in the write, where it may have to wait, and not here.
bool nobody_can_read(int descriptor) {
  const Errno_Kept kept;
  int state = 0;
  pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, &state);
  pollfd polled = {descriptor, 0, 0};
  int result = 0;
  do {
    result = poll(&polled, 1, 0);
  } while (result < 0 && errno == EINTR);
  pthread_setcancelstate(state, nullptr);
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

ssize_t write_to_pipe(int descriptor, const char& byte) {
  if (nobody_can_read(descriptor)) {
    errno = EPIPE;
    return -1;
  }
  return write(descriptor, &byte, sizeof byte);
}
