#include "stop_signals.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstring>

#include "errors.h"

namespace hbctl {
namespace {

constexpr int kSignals[] = {SIGINT, SIGTERM};

volatile sig_atomic_t stop_writer = -1;

extern "C" void note_stop(int) {
  const int saved = errno;
  const char byte = 1;
  // When the pipe is full, the reader has been woken already.
  [[maybe_unused]] const ssize_t written = write(stop_writer, &byte, sizeof byte);
  errno = saved;
}

}  // namespace

StopSignals::StopSignals() {
  if (pipe2(pipe_, O_CLOEXEC | O_NONBLOCK) != 0)
    throw CommandError(ExitStatus::Failed, std::string("cannot make a pipe: ") + std::strerror(errno));
  stop_writer = pipe_[1];
  struct sigaction action {};
  action.sa_handler = note_stop;
  action.sa_flags = static_cast<int>(SA_RESETHAND) | SA_RESTART;
  for (int signal : kSignals) sigaction(signal, &action, nullptr);
}

StopSignals::~StopSignals() {
  for (int signal : kSignals) std::signal(signal, SIG_DFL);
  close(pipe_[0]);
  close(pipe_[1]);
}

}  // namespace hbctl
