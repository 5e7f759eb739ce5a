#include "platform/Pipe.h"

#include <fcntl.h>
#include <pthread.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <ctime>

#include "VEX_HBC_trace.h"

namespace {

bool never_waits(int descriptor) { return fcntl(descriptor, F_SETFL, O_NONBLOCK) == 0; }

bool is_waiting(const sigset_t& signals, int signal) {
  sigset_t waiting;
  return sigismember(&signals, signal) == 1 && sigpending(&waiting) == 0 && sigismember(&waiting, signal) == 1;
}

// Keeps the signal of a write that nobody reads away from this thread, whatever the program does with such signals. One
// that waited before stays.
class Pipe_Signal_Held {
 public:
  Pipe_Signal_Held() {
    sigemptyset(&signal_);
    sigaddset(&signal_, SIGPIPE);
    pthread_sigmask(SIG_BLOCK, &signal_, &before_);
    waited_before_ = is_waiting(before_, SIGPIPE);
  }
  ~Pipe_Signal_Held() { pthread_sigmask(SIG_SETMASK, &before_, nullptr); }
  Pipe_Signal_Held(const Pipe_Signal_Held&) = delete;
  Pipe_Signal_Held& operator=(const Pipe_Signal_Held&) = delete;

  // The write has raised it. A thread that is cancelled does not end in here.
  void take_back() const {
    if (waited_before_) {
      return;
    }
    const Errno_Kept kept;
    int state = 0;
    pthread_setcancelstate(PTHREAD_CANCEL_DISABLE, &state);
    const timespec at_once = {};
    sigtimedwait(&signal_, nullptr, &at_once);
    pthread_setcancelstate(state, nullptr);
  }

 private:
  sigset_t signal_;
  sigset_t before_;
  bool waited_before_;
};

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
  const Pipe_Signal_Held held;
  const ssize_t written = write(descriptor, &byte, sizeof byte);
  if (written < 0 && errno == EPIPE) {
    held.take_back();
  }
  return written;
}
