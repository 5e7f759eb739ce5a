// Runs a piece of a test in a process of its own: what is read from the environment once, is read anew in each.
#pragma once

#include <functional>
#include <string>

struct Child_Result {
  int exit_status;     // 0 when the body returned and no expectation in it failed; -1 when a signal ended the child
  std::string errors;  // what the child wrote to standard error
};

Child_Result run_in_child(const std::function<void()>& body);
