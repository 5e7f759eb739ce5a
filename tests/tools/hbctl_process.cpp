#include "hbctl_process.h"

#include <fcntl.h>
#include <poll.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdint>
#include <fstream>
#include <stdexcept>
#include <system_error>
#include <utility>

namespace hb_test {
namespace {

constexpr int kPatienceMs = 10000;

class Descriptor {
 public:
  explicit Descriptor(int descriptor = -1) : descriptor_(descriptor) {}
  ~Descriptor() {
    if (descriptor_ >= 0) close(descriptor_);
  }
  Descriptor(const Descriptor&) = delete;
  Descriptor& operator=(const Descriptor&) = delete;

  int get() const { return descriptor_; }
  void set(int descriptor) { descriptor_ = descriptor; }

 private:
  int descriptor_;
};

// The end to write to, which closes with its owner.
int make_pipe(int& reading, Descriptor& writing) {
  int ends[2];
  if (pipe2(ends, O_CLOEXEC) != 0) throw std::system_error(errno, std::generic_category(), "pipe2");
  reading = ends[0];
  writing.set(ends[1]);
  return ends[1];
}

// Appends what comes next; false at the end.
bool read_more(int descriptor, std::string& text) {
  pollfd entry{descriptor, POLLIN, 0};
  if (poll(&entry, 1, kPatienceMs) <= 0) throw std::runtime_error("nothing was written within ten seconds");
  char buffer[4096];
  const ssize_t count = read(descriptor, buffer, sizeof buffer);
  if (count > 0) text.append(buffer, static_cast<size_t>(count));
  return count > 0;
}

void read_to_end(int descriptor, std::string& text) {
  while (descriptor >= 0 && read_more(descriptor, text)) {
  }
}

std::string take_line(int descriptor, std::string& text) {
  size_t end = text.find('\n');
  for (; end == std::string::npos; end = text.find('\n'))
    if (!read_more(descriptor, text)) throw std::runtime_error("no further line, but: " + text);
  std::string line = text.substr(0, end);
  text.erase(0, end + 1);
  return line;
}

void close_if_open(int& descriptor) {
  if (descriptor >= 0) close(std::exchange(descriptor, -1));
}

}  // namespace

ChildProcess::ChildProcess(const std::vector<std::string>& command) : ChildProcess(command, Streams()) {}

ChildProcess::ChildProcess(const std::vector<std::string>& command, const Streams& streams) {
  const Descriptor nothing(open("/dev/null", O_RDONLY | O_CLOEXEC));
  Descriptor output;
  Descriptor errors;
  Streams all = streams;
  if (all.input < 0) all.input = nothing.get();
  if (all.output < 0) all.output = make_pipe(output_, output);
  if (all.errors < 0) all.errors = make_pipe(errors_, errors);
  start(command, all);
}

void ChildProcess::start(const std::vector<std::string>& command, const Streams& streams) {
  std::vector<char*> arguments;
  for (const std::string& argument : command) arguments.push_back(const_cast<char*>(argument.c_str()));
  arguments.push_back(nullptr);
  posix_spawn_file_actions_t actions;
  posix_spawn_file_actions_init(&actions);
  posix_spawn_file_actions_adddup2(&actions, streams.input, STDIN_FILENO);
  posix_spawn_file_actions_adddup2(&actions, streams.output, STDOUT_FILENO);
  posix_spawn_file_actions_adddup2(&actions, streams.errors, STDERR_FILENO);
  const int failed = posix_spawn(&pid_, arguments[0], &actions, nullptr, arguments.data(), environ);
  posix_spawn_file_actions_destroy(&actions);
  if (failed != 0) throw std::system_error(failed, std::generic_category(), command[0]);
}

ChildProcess::~ChildProcess() {
  if (pid_ > 0) {
    kill(pid_, SIGKILL);
    waitpid(pid_, nullptr, 0);
  }
  close_if_open(output_);
  close_if_open(errors_);
}

std::string ChildProcess::read_line() { return take_line(output_, output_text_); }

std::string ChildProcess::read_error_line() { return take_line(errors_, error_text_); }

void ChildProcess::send_signal(int signal) const { kill(pid_, signal); }

bool ChildProcess::catches(int signal) const {
  std::ifstream status("/proc/" + std::to_string(pid_) + "/status");
  std::string field;
  while (status >> field && field != "SigCgt:") {
  }
  uint64_t caught = 0;
  status >> std::hex >> caught;
  return (caught >> (signal - 1) & 1) != 0;
}

void ChildProcess::close_output() { close_if_open(output_); }

Finished ChildProcess::finish() {
  read_to_end(output_, output_text_);
  read_to_end(errors_, error_text_);
  int state = 0;
  waitpid(std::exchange(pid_, -1), &state, 0);
  return {WIFEXITED(state) ? WEXITSTATUS(state) : 128 + WTERMSIG(state), output_text_, error_text_};
}

std::vector<std::string> hbctl(const std::vector<std::string>& arguments) {
  std::vector<std::string> command{HBCTL_PATH};
  command.insert(command.end(), arguments.begin(), arguments.end());
  return command;
}

}  // namespace hb_test
