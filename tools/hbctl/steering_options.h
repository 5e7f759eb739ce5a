// The command lines of the commands that steer the daemon or read what it publishes.
#pragma once

#include "option_parts.h"

namespace hbctl {

void add_steering_commands(CLI::App& app, Options& options);

// Whether what was said fits together. Throws CLI::ValidationError when it does not.
void check_steering(const Options& options);

}  // namespace hbctl
