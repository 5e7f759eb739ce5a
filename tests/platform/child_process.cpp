#include "child_process.h"

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <system_error>

namespace {

[[noreturn]] void fail(const char* call) { throw std::system_error(errno, std::generic_category(), call); }

[[noreturn]] void run_body(const std::function<void()>& body, const std::array<int, 2>& pipe_ends) {
  dup2(pipe_ends[1], STDERR_FILENO);
  close(pipe_ends[0]);
  close(pipe_ends[1]);
  body();
  std::exit(testing::Test::HasFailure() ? 1 : 0);
}

std::string read_to_end(int descriptor) {
  std::string all;
  std::array<char, 4096> part;
  ssize_t count = 0;
  while ((count = read(descriptor, part.data(), part.size())) > 0) all.append(part.data(), static_cast<size_t>(count));
  return all;
}

}  // namespace

Child_Result run_in_child(const std::function<void()>& body) {
  std::array<int, 2> pipe_ends;
  if (pipe(pipe_ends.data()) != 0) fail("pipe");
  std::fflush(nullptr);
  const pid_t child = fork();
  if (child < 0) fail("fork");
  if (child == 0) run_body(body, pipe_ends);
  close(pipe_ends[1]);
  Child_Result result{-1, read_to_end(pipe_ends[0])};
  close(pipe_ends[0]);
  int status = 0;
  if (waitpid(child, &status, 0) != child) fail("waitpid");
  if (WIFEXITED(status)) result.exit_status = WEXITSTATUS(status);
  return result;
}
