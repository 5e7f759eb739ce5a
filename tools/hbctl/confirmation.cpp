#include "confirmation.h"

#include <fmt/format.h>
#include <unistd.h>

#include <iostream>

#include "errors.h"

namespace hbctl {
namespace {

// The question goes to standard error: standard output is for the result alone.
bool can_ask() { return isatty(STDIN_FILENO) == 1 && isatty(STDERR_FILENO) == 1; }

bool ask(const std::string& what, const std::string& danger) {
  std::cerr << fmt::format("hbctl will {}: {}. Go on? [y/N] ", what, danger) << std::flush;
  std::string answer;
  std::getline(std::cin, answer);
  return answer == "y" || answer == "Y" || answer == "yes";
}

}  // namespace

void confirm(const std::string& what, const std::string& danger, bool agreed_beforehand) {
  if (agreed_beforehand) return;
  if (!can_ask()) {
    throw CommandError(ExitStatus::NotConfirmed,
                       fmt::format("will not {} unasked: {}, and there is no terminal to ask on\n"
                                   "agree beforehand with --yes",
                                   what, danger));
  }
  if (!ask(what, danger))
    throw CommandError(ExitStatus::NotConfirmed, fmt::format("did not {}: it was not agreed to", what));
}

}  // namespace hbctl
