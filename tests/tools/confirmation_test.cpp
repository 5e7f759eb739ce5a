// What is dangerous is asked about: on a terminal by a question, elsewhere by --yes.
#include <gmock/gmock.h>

#include "steered.h"
#include "terminal.h"

namespace hb_test {
namespace {

using testing::EndsWith;
using testing::HasSubstr;
using testing::StartsWith;

const std::vector<std::vector<std::string>> kDangerous = {
    {"adapter", "1", "disable"},     {"adapter", "1", "ifdown"},
    {"adapter", "1", "unconfigure"}, {"adapter", "1", "swap", "10.0.0.1"},
    {"adapter", "5", "is-down"},     {"node", "2", "is-down"},
    {"simulate-death", "3"},
};

class HbctlConfirmation : public testing::Test {
 protected:
  // Its question and its errors are on the terminal.
  std::unique_ptr<ChildProcess> run_on_terminal(const std::vector<std::string>& arguments) {
    return std::make_unique<ChildProcess>(hbctl(arguments),
                                          Streams{.input = terminal_.descriptor(), .errors = terminal_.descriptor()});
  }

  // Asks, gets these keys, and does nothing.
  void expect_no(const std::string& keys) {
    const auto child = run_on_terminal({"adapter", "1", "disable"});
    terminal_.read_to("[y/N] ");
    terminal_.type(keys);
    EXPECT_THAT(terminal_.read_to("not agreed to"),
                HasSubstr("hbctl: did not disable adapter 1: it was not agreed to"));
    const Finished finished = child->finish();
    EXPECT_EQ(finished.output, "");
    EXPECT_EQ(finished.status, 5);
    EXPECT_FALSE(daemon_.daemon().has_client());
  }

  void expect_yes(const std::string& keys) {
    const auto child = run_on_terminal({"adapter", "1", "disable"});
    terminal_.read_to("[y/N] ");
    EXPECT_FALSE(daemon_.daemon().has_client());
    terminal_.type(keys);
    daemon_.start();
    daemon_.expect(208);
    EXPECT_EQ(child->finish().output, "disable adapter 1: sent\n");
  }

  PlayedDaemon daemon_;
  Terminal terminal_;
};

TEST_F(HbctlConfirmation, is_a_question_that_says_what_happens) {
  const auto child = run_on_terminal({"node", "2", "is-down"});
  EXPECT_EQ(terminal_.read_to("[y/N] "),
            "hbctl will report that node 2 is down: the daemon believes it, and the node dies for the whole cluster. "
            "Go on? [y/N] ");
}

TEST_F(HbctlConfirmation, is_given_before_the_command_starts_with_the_daemon) {
  expect_yes("y\n");
  expect_yes("Y\n");
  expect_yes("yes\n");
}

TEST_F(HbctlConfirmation, is_not_given_by_anything_else) {
  expect_no("\n");
  expect_no("n\n");
  expect_no("yep\n");
  expect_no("\x04");  // the end of input
}

TEST_F(HbctlConfirmation, is_asked_for_whatever_is_dangerous) {
  for (const auto& command : kDangerous) {
    const auto child = run_on_terminal(command);
    EXPECT_THAT(terminal_.read_to("[y/N] "), HasSubstr("Go on? [y/N] ")) << testing::PrintToString(command);
    terminal_.type("n\n");
    EXPECT_EQ(child->finish().status, 5) << testing::PrintToString(command);
    terminal_.read_to("not agreed to\r\n");
  }
}

TEST_F(HbctlConfirmation, is_refused_without_a_terminal) {
  for (const auto& command : kDangerous) {
    const Finished finished = ChildProcess(hbctl(command)).finish();
    EXPECT_EQ(finished.output, "");
    EXPECT_THAT(finished.errors, StartsWith("hbctl: will not ")) << testing::PrintToString(command);
    EXPECT_THAT(finished.errors, EndsWith("and there is no terminal to ask on\nagree beforehand with --yes\n"));
    EXPECT_EQ(finished.status, 5) << testing::PrintToString(command);
  }
  EXPECT_FALSE(daemon_.daemon().has_client());
}

TEST_F(HbctlConfirmation, is_refused_with_half_a_terminal) {
  const std::vector<std::string> command = {"adapter", "1", "disable"};
  EXPECT_EQ(ChildProcess(hbctl(command), {.input = terminal_.descriptor()}).finish().status, 5);
  ChildProcess unheard(hbctl(command), {.errors = terminal_.descriptor()});
  EXPECT_THAT(terminal_.read_to("--yes"), HasSubstr("there is no terminal to ask on"));
  EXPECT_EQ(unheard.finish().status, 5);
}

TEST_F(HbctlConfirmation, is_an_error_object_in_json_when_it_is_refused) {
  const Finished finished = ChildProcess(hbctl({"adapter", "1", "disable", "--json"})).finish();
  const auto error = nlohmann::json::parse(finished.output)["error"];
  EXPECT_EQ(error["exit_status"], 5);
  EXPECT_EQ(error["name"], nullptr);
  EXPECT_EQ(error["number"], nullptr);
  EXPECT_EQ(error["advice"], "agree beforehand with --yes");
}

TEST_F(HbctlConfirmation, is_not_asked_for_when_it_was_given_beforehand) {
  const auto child = run_on_terminal({"adapter", "1", "disable", "--yes"});
  daemon_.start();
  daemon_.expect(208);
  EXPECT_EQ(child->finish().status, 0);
  terminal_.type("end\n");
  EXPECT_EQ(terminal_.read_to("end"), "end");  // nothing was on the screen before this echo
}

TEST_F(HbctlConfirmation, is_not_asked_for_what_is_harmless) {
  const auto child = run_on_terminal({"adapter", "1", "enable"});
  daemon_.start();
  daemon_.expect(207);
  EXPECT_EQ(child->finish().status, 0);
}

}  // namespace
}  // namespace hb_test
