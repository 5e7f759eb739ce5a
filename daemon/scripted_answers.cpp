#include "scripted_answers.h"

#include <algorithm>

namespace hbd {

std::optional<ScriptedAnswer> ScriptedAnswers::take(Hb_Client_Request request) {
  const auto found =
      std::find_if(answers_.begin(), answers_.end(), [&](const auto& each) { return each.request == request; });
  if (found == answers_.end()) {
    return std::nullopt;
  }
  const ScriptedAnswer answer = *found;
  if (found->count != 0 && --found->count == 0) {
    answers_.erase(found);
  }
  return answer;
}

}  // namespace hbd
