/* The command line. */
#ifndef HBD_OPTIONS_H
#define HBD_OPTIONS_H

#include <cstddef>
#include <optional>
#include <string>

#include "service_settings.h"
#include "simulation.h"

namespace hbd {

/** What the daemon is asked to do. */
struct Options {
  std::string socket_path;
  std::string scenario_file; /**< empty: the built-in cluster */
  bool host = false;
  bool check = false;
  Pace pace;
  std::size_t client_queue_bytes = std::size_t{16} * 1024 * 1024;
  ServiceSettings service;
  int ready_descriptor = -1;
  std::string log_level = "info";
};

/** Options, or the status that the program ends with at once. */
struct CommandLine {
  std::optional<Options> options;
  int exit_status = 0;
};

/** Reads the command line; prints help, the version, or what is wrong with it. */
CommandLine read_command_line(int argc, char** argv);

}  // namespace hbd

#endif
