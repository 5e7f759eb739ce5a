#include "node_action.h"

#include <algorithm>

#include "hb_client/control.h"

namespace hbctl {

const std::vector<NodeAction>& node_actions() {
  static const std::vector<NodeAction> actions = {
      {"may-be-down", "report that node {0} may be down", "", hb_node_may_be_down},
      {"is-down", "report that node {0} is down", "the daemon believes it, and the node dies for the whole cluster",
       hb_node_is_down},
  };
  return actions;
}

const NodeAction* find_node_action(const std::string& word) {
  const auto& actions = node_actions();
  const auto found =
      std::find_if(actions.begin(), actions.end(), [&](const NodeAction& action) { return action.word == word; });
  return found == actions.end() ? nullptr : &*found;
}

}  // namespace hbctl
