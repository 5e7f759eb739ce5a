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

// What a person said on the command line. Which members a command looks at is its own matter.
struct Options {
  std::string command;
  std::string socket;  // empty: the environment's
  std::string colour = "auto";
  std::string name_prefix = "hbctl";
  std::string action;              // a word of adapter_action.h or node_action.h
  std::string value;               // of an adapter's action; fits it
  std::string text;                // to send; "-" is standard input
  std::string interface;           // empty: all
  Selection selection;             // adapters, watch and send
  double wait = 1.0;               // seconds for the daemon to say what it is asked
  std::optional<double> duration;  // seconds
  std::optional<double> every;     // seconds between heartbeats
  std::optional<uint32_t> count;
  Hb_Events events = 0;
  Hb_Adapter_Number adapter = 0;
  uint32_t sequence = 1;  // of the first heartbeat
  int port = 0;
  int seconds = 0;
  Hb_Node_Number node = 0;
  bool json = false;
  bool discard_stale = false;
  bool yes = false;  // agreed to what is dangerous
  bool from_daemon = false;
  bool ip = false;
  bool reveal = false;
  bool settings = false;
  bool on = false;
};

// Fills `options`, or returns the exit status when there is nothing left to do: help, the version, or a mistake, each
// of which has then been printed.
std::optional<int> parse_options(int argc, const char* const* argv, Options& options);

std::chrono::milliseconds as_milliseconds(double seconds);

}  // namespace hbctl
