#include "application.h"

#include <unistd.h>

#include <csignal>
#include <iostream>

#include "command.h"
#include "json.h"
#include "socket_path.h"

namespace hbctl {
namespace {

struct CommandEntry {
  const char* name;
  void (*run)(const Context& context);
};

constexpr CommandEntry kCommands[] = {
    {"status", status_command},     {"nodes", nodes_command},       {"adapters", adapters_command},
    {"networks", networks_command}, {"sites", sites_command},       {"watch", watch_command},
    {"adapter", adapter_command},   {"node", node_command},         {"route", route_command},
    {"security", security_command}, {"send", send_command},         {"heartbeat", heartbeat_command},
    {"stale", stale_command},       {"monitors", monitors_command}, {"simulate-death", simulate_death_command},
};

void run_command(const Context& context) {
  for (const CommandEntry& entry : kCommands)
    if (context.options.command == entry.name) entry.run(context);
}

Context make_context(const Options& options) {
  if (!options.socket.empty()) use_socket_path(options.socket);
  return {options, socket_path_from_environment(), Output(STDOUT_FILENO),
          Style(wants_colour(options.colour, STDOUT_FILENO))};
}

int tell(const CommandError& error) {
  std::cerr << "hbctl: " << error.what() << std::endl;
  return static_cast<int>(error.status());
}

void tell_in_json(const Context& context, const CommandError& error) {
  Json json = json_object("error");
  json["error"] = error_json(error);
  context.output.write(json_text(context, json));
}

int run_reporting(const Context& context) {
  try {
    run_command(context);
    return static_cast<int>(ExitStatus::Ok);
  } catch (const ReportedError& error) {
    return tell(error);
  } catch (const CommandError& error) {
    const int status = tell(error);
    if (context.options.json) tell_in_json(context, error);
    return status;
  }
}

}  // namespace

int run(int argc, const char* const* argv) try {
  // A daemon or a reader that goes away is an error number here, not the end of the process.
  std::signal(SIGPIPE, SIG_IGN);
  Options options;
  if (const std::optional<int> status = parse_options(argc, argv, options)) return *status;
  return run_reporting(make_context(options));
} catch (const OutputClosed&) {
  return static_cast<int>(ExitStatus::Ok);
} catch (const CommandError& error) {
  return tell(error);
} catch (const std::exception& error) {
  return tell({ExitStatus::Failed, error.what()});
}

}  // namespace hbctl
