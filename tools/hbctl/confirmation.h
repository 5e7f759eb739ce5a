// The question before something dangerous.
#pragma once

#include <string>

namespace hbctl {

// Returns when somebody agreed: beforehand, or now at the terminal. Throws CommandError otherwise, also when there is
// no terminal to ask on. `what` is what will be done, `danger` what it does to the cluster.
void confirm(const std::string& what, const std::string& danger, bool agreed_beforehand);

}  // namespace hbctl
