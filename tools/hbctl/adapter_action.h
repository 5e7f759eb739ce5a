// What can be done to an adapter: the words of `hbctl adapter`, and the library's function behind each.
#pragma once

#include <string>
#include <vector>

#include "hb_client/types.h"

namespace hbctl {

enum class ActionValue { None, Address, Seconds };

struct AdapterOrder {
  Hb_Adapter_Number adapter;
  Hb_IP_address4 address;  // 0 unless the action takes one
  int seconds;             // 0 unless the action takes them
};

struct AdapterAction {
  const char* word;
  ActionValue value;
  bool answered;                             // by the daemon
  bool local;                                // of adapters of this node only
  const char* what;                          // for people; {0} is the adapter, {1} the value
  const char* danger;                        // what it does to the cluster; empty when nobody need be asked
  Hb_Rc (*call)(const AdapterOrder& order);  // null: the state is read, which has a result of its own
};

const std::vector<AdapterAction>& adapter_actions();

// Null when there is none of that word.
const AdapterAction* find_adapter_action(const std::string& word);

// Why that is no value for the action; empty when it is one.
std::string check_action_value(const AdapterAction& action, const std::string& value);

// The order for an action with a value that has been checked.
AdapterOrder make_order(const AdapterAction& action, Hb_Adapter_Number adapter, const std::string& value);

}  // namespace hbctl
