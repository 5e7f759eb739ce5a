#include "daemon_process.h"

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <fstream>
#include <stdexcept>
#include <vector>

#include "descriptor.h"

namespace bench {
namespace {

constexpr int ready_descriptor = 3;

pid_t spawn(const std::string& program, std::vector<std::string> arguments, int ready) {
  std::vector<char*> words{const_cast<char*>(program.c_str())};
  for (std::string& argument : arguments) words.push_back(argument.data());
  words.push_back(nullptr);
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_adddup2(&actions, ready, ready_descriptor);
  pid_t process = -1;
  const int error = posix_spawn(&process, program.c_str(), &actions, nullptr, words.data(), environ);
  posix_spawn_file_actions_destroy(&actions);
  if (error != 0) throw std::runtime_error("cannot start " + program);
  return process;
}

}  // namespace

DaemonProcess::DaemonProcess(const std::string& program) {
  int ends[2];
  if (pipe2(ends, O_CLOEXEC) != 0) throw_errno("pipe");
  Descriptor reading(ends[0]);
  Descriptor writing(ends[1]);
  process_ = spawn(program,
                   {"--socket", socket_path(), "--log-level", "error", "--start-after-subscriptions", "100000",
                    "--ready-fd", std::to_string(ready_descriptor)},
                   writing.get());
  writing.close();
  char ready = 0;
  if (!read_all(reading.get(), &ready, 1)) throw std::runtime_error(program + " did not get ready");
}

DaemonProcess::~DaemonProcess() {
  kill(process_, SIGTERM);
  waitpid(process_, nullptr, 0);
}

double DaemonProcess::resident_bytes() const {
  std::ifstream status("/proc/" + std::to_string(process_) + "/status");
  for (std::string word; status >> word;) {
    if (word != "VmRSS:") continue;
    double kilobytes = 0;
    status >> kilobytes;
    return kilobytes * 1024;
  }
  throw std::runtime_error("the daemon has ended");
}

}  // namespace bench
