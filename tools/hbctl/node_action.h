// What can be reported about a node: the words of `hbctl node`, and the library's function behind each.
#pragma once

#include <string>
#include <vector>

#include "hb_client/types.h"

namespace hbctl {

struct NodeAction {
  const char* word;
  const char* what;    // for people; {0} is the node
  const char* danger;  // what it does to the cluster; empty when nobody need be asked
  Hb_Rc (*call)(Hb_Node_Number node);
};

const std::vector<NodeAction>& node_actions();

// Null when there is none of that word.
const NodeAction* find_node_action(const std::string& word);

}  // namespace hbctl
