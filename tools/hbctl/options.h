// The command line.
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "hb_client/types.h"
#include "subscription_plan.h"

namespace hbctl {

struct Options {
  std::string command;
  std::string socket;  // empty: the environment's
  std::string colour = "auto";
  bool json = false;
  double wait = 1.0;    // seconds for the daemon to say who is up
  Selection selection;  // adapters and watch
  Hb_Events events = 0;
  std::string name_prefix = "hbctl";
  std::optional<uint32_t> count;
  std::optional<double> duration;  // seconds
};

// Fills `options`, or returns the exit status when there is nothing left to do: help, the version, or a mistake, each
// of which has then been printed.
std::optional<int> parse_options(int argc, const char* const* argv, Options& options);

std::chrono::milliseconds as_milliseconds(double seconds);

}  // namespace hbctl
