#include "output.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <csignal>
#include <string>
#include <thread>
#include <utility>

#include "errors.h"

namespace hbctl {
namespace {

class HbctlOutput : public testing::Test {
 protected:
  HbctlOutput() { EXPECT_EQ(pipe2(pipe_, O_CLOEXEC), 0); }
  ~HbctlOutput() override {
    close(pipe_[0]);
    close(pipe_[1]);
  }
  int pipe_[2];
};

TEST_F(HbctlOutput, is_written_whole_however_long) {
  const std::string text(1 << 20, 'x');
  std::thread writer([&] {
    Output(pipe_[1]).write(text);
    close(std::exchange(pipe_[1], -1));
  });
  std::string received;
  char buffer[65536];
  for (ssize_t count = 1; count > 0;) {
    count = read(pipe_[0], buffer, sizeof buffer);
    if (count > 0) received.append(buffer, static_cast<size_t>(count));
  }
  writer.join();
  EXPECT_EQ(received, text);
}

TEST_F(HbctlOutput, without_a_reader_says_so) {
  std::signal(SIGPIPE, SIG_IGN);
  close(std::exchange(pipe_[0], -1));
  EXPECT_THROW(Output(pipe_[1]).write("text"), OutputClosed);
}

TEST_F(HbctlOutput, that_fails_is_an_error) { EXPECT_THROW(Output(pipe_[0]).write("text"), CommandError); }

}  // namespace
}  // namespace hbctl
