// Colour on a terminal, and nowhere else.
#include <gmock/gmock.h>

#include <cstdlib>

#include "hbctl_process.h"
#include "played_daemon.h"
#include "terminal.h"

namespace hb_test {
namespace {

using testing::HasSubstr;
using testing::Not;

constexpr const char* kGreenUp = "\033[32mup\033[0m";

std::string nodes_on_terminal(const std::vector<std::string>& more = {}) {
  PlayedDaemon daemon;
  Terminal terminal;
  std::vector<std::string> arguments{"nodes"};
  arguments.insert(arguments.end(), more.begin(), more.end());
  ChildProcess child(hbctl(arguments), {.output = terminal.descriptor()});
  daemon.start();
  daemon.tell_who_is_up();
  child.finish();
  return terminal.read_written();
}

std::string nodes_in_pipe(const std::vector<std::string>& more) {
  PlayedDaemon daemon;
  std::vector<std::string> arguments{"nodes"};
  arguments.insert(arguments.end(), more.begin(), more.end());
  ChildProcess child(hbctl(arguments));
  daemon.start();
  daemon.tell_who_is_up();
  return child.finish().output;
}

class HbctlColour : public testing::Test {
 protected:
  HbctlColour() {
    unsetenv("NO_COLOR");
    setenv("TERM", "xterm", 1);
  }
};

TEST_F(HbctlColour, is_used_on_a_terminal) {
  const std::string text = nodes_on_terminal();
  EXPECT_THAT(text, HasSubstr(kGreenUp));
  EXPECT_THAT(text, HasSubstr("\033[31mdown\033[0m"));
}

TEST_F(HbctlColour, is_not_used_when_NO_COLOR_is_set) {
  setenv("NO_COLOR", "1", 1);
  EXPECT_THAT(nodes_on_terminal(), Not(HasSubstr("\033")));
}

TEST_F(HbctlColour, is_used_when_NO_COLOR_is_empty) {
  setenv("NO_COLOR", "", 1);
  EXPECT_THAT(nodes_on_terminal(), HasSubstr(kGreenUp));
}

TEST_F(HbctlColour, is_not_used_on_a_dumb_terminal) {
  setenv("TERM", "dumb", 1);
  EXPECT_THAT(nodes_on_terminal(), Not(HasSubstr("\033")));
}

TEST_F(HbctlColour, is_not_used_on_a_terminal_when_it_is_never_wanted) {
  EXPECT_THAT(nodes_on_terminal({"--color=never"}), Not(HasSubstr("\033")));
}

TEST_F(HbctlColour, is_not_used_in_a_pipe) { EXPECT_THAT(nodes_in_pipe({}), Not(HasSubstr("\033"))); }

TEST_F(HbctlColour, is_used_in_a_pipe_when_it_is_always_wanted) {
  setenv("NO_COLOR", "1", 1);
  EXPECT_THAT(nodes_in_pipe({"--color", "always"}), HasSubstr(kGreenUp));
}

TEST_F(HbctlColour, is_never_in_json) {
  EXPECT_THAT(nodes_in_pipe({"--color", "always", "--json"}), Not(HasSubstr("\033")));
}

}  // namespace
}  // namespace hb_test
