#include "command.h"

#include <fmt/format.h>

#include "words.h"

namespace hbctl {

std::string json_text(const Context& context, const Json& json) {
  const bool several = context.options.command == "watch" || context.options.command == "heartbeat";
  return several ? json_line(json) : json_document(json);
}

Cell state_cell(State state) {
  switch (state) {
    case State::Up:
      return {state_word(state), Paint::Good};
    case State::Down:
      return {state_word(state), Paint::Bad};
    case State::Unknown:
      break;
  }
  return {state_word(state), Paint::Doubtful};
}

std::string or_dash(const std::string& text) { return text.empty() ? "-" : text; }

CommandError not_configured(const std::vector<std::string>& unknown) {
  std::string list;
  for (const std::string& item : unknown) list += (list.empty() ? "" : ", ") + item;
  return {ExitStatus::Failed,
          fmt::format("not configured: {}\nlist what is configured with: hbctl nodes, hbctl adapters, hbctl networks",
                      list)};
}

}  // namespace hbctl
