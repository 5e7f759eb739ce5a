#include "daemon_process.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <atomic>
#include <sstream>

namespace {

constexpr int ready_descriptor = 9;

std::string contents(const std::string& file) {
  std::ostringstream text;
  text << std::ifstream(file).rdbuf();
  return text.str();
}

void redirect(const std::string& file, int descriptor) {
  const int opened = open(file.c_str(), O_WRONLY | O_CREAT | O_APPEND, 0644);
  dup2(opened, descriptor);
  close(opened);
}

}  // namespace

DaemonProcess::DaemonProcess(const TemporaryDirectory& directory, const std::vector<std::string>& arguments,
                             const std::map<std::string, std::string>& environment) {
  static std::atomic<int> count = 0;
  const std::string name = "hbd" + std::to_string(++count);
  log_file_ = directory.path(name + ".log");
  output_file_ = directory.path(name + ".out");
  std::array<int, 2> ready{};
  if (pipe2(ready.data(), O_CLOEXEC) != 0) {
    throw std::runtime_error("pipe2 failed");
  }
  std::vector<std::string> words = {HBD_PROGRAM, "--ready-fd", std::to_string(ready_descriptor)};
  words.insert(words.end(), arguments.begin(), arguments.end());
  std::vector<char*> argv;
  for (auto& word : words) {
    argv.push_back(word.data());
  }
  argv.push_back(nullptr);

  pid_ = fork();
  if (pid_ == 0) {
    prctl(PR_SET_PDEATHSIG, SIGTERM);
    for (const char* variable : {"HB_SERVER_SOCKET", "HA_DOMAIN_NAME", "HA_SYSPAR_NAME"}) {
      unsetenv(variable);
    }
    for (const auto& [variable, value] : environment) {
      setenv(variable.c_str(), value.c_str(), 1);
    }
    redirect(output_file_, STDOUT_FILENO);
    redirect(log_file_, STDERR_FILENO);
    dup2(ready[1], ready_descriptor);
    execv(argv[0], argv.data());
    _exit(127);
  }
  close(ready[1]);
  ready_ = ready[0];
}

DaemonProcess::~DaemonProcess() {
  if (!ended_) {
    stop();
  }
  close(ready_);
}

bool DaemonProcess::wait_until_ready() {
  char byte = 0;
  return read(ready_, &byte, 1) == 1;
}

void DaemonProcess::signal(int number) const { kill(pid_, number); }

int DaemonProcess::wait_for_end() {
  int status = 0;
  waitpid(pid_, &status, 0);
  ended_ = true;
  return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
}

int DaemonProcess::stop() {
  signal(SIGTERM);
  return wait_for_end();
}

std::string DaemonProcess::log() const { return contents(log_file_); }

std::string DaemonProcess::output() const { return contents(output_file_); }
