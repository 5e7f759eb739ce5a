#include "options.h"

#include <CLI/CLI.hpp>
#include <chrono>
#include <string>

#include "duration.h"
#include "exit_status.h"
#include "socket_path.h"

namespace hbd {
namespace {

constexpr const char* footer = R"(
Without --scenario and --host a built-in cluster of 4 nodes on 2 networks is simulated.
The daemon stays in the foreground and logs to standard error; SIGTERM and SIGINT stop it.

Examples:
  hbd --socket /tmp/hb.sock                     simulate the built-in cluster
  hbd --socket /tmp/hb.sock --scenario my.toml  simulate a cluster of your own
  hbd --check --scenario my.toml                look for mistakes in it
  hbd --socket /tmp/hb.sock --host              follow this machine's interfaces
  HB_SERVER_SOCKET=/tmp/hb.sock hbctl watch     follow it as a client

See hbd(8) for the format of scenarios.)";

void add_source_options(CLI::App& app, Options& options) {
  auto* scenario = app.add_option("-s,--scenario", options.scenario_file, "Simulate the cluster of this TOML file")
                       ->type_name("FILE")
                       ->check(CLI::ExistingFile);
  auto* host = app.add_flag("--host", options.host, "Follow this machine's interfaces and addresses");
  auto* check = app.add_flag("--check", options.check, "Look for mistakes in the scenario, and end");
  scenario->excludes(host);
  check->needs(scenario);
}

void add_pace_options(CLI::App& app, Options& options) {
  auto* speed = app.add_option("--speed", options.pace.speed, "Play the timeline so many times faster than it is")
                    ->type_name("FACTOR")
                    ->check(CLI::Range(1e-6, 1e9));
  auto* fast = app.add_flag("--as-fast-as-read", options.pace.as_fast_as_read,
                            "Play each step of the timeline as soon as all clients have read the one before");
  auto* start = app.add_option("--start-after-subscriptions", options.pace.start_after_subscriptions,
                               "Start the timeline when clients have made so many subscriptions")
                    ->type_name("N");
  speed->excludes(fast);
  for (auto* option : {speed, fast, start}) {
    option->excludes("--host");
  }
}

/* An option that takes a length of time. */
CLI::Option* add_duration(CLI::App& app, const std::string& name, std::chrono::milliseconds& duration,
                          const std::string& description) {
  const auto take = [&duration, name](const std::string& text) {
    const auto parsed = parse_duration(text);
    if (!parsed) {
      throw CLI::ValidationError(name, "\"" + text + R"(" is no length of time as "250ms", "1.5s" or "2m")");
    }
    duration = std::chrono::ceil<std::chrono::milliseconds>(*parsed);
  };
  return app.add_option_function<std::string>(name, take, description)->type_name("DURATION");
}

void add_service_options(CLI::App& app, Options& options) {
  app.add_option("--socket", options.socket_path,
                 "Listen here instead of the path that the environment gives: HB_SERVER_SOCKET, with HA_DOMAIN_NAME "
                 "or HA_SYSPAR_NAME after a dot")
      ->type_name("PATH");
  app.add_option("--client-queue-bytes", options.client_queue_bytes,
                 "Disconnect a client that leaves more than this unread; two configurations are always kept")
      ->type_name("BYTES")
      ->capture_default_str()
      ->check(CLI::PositiveNumber);
  add_duration(app, "--stale-age", options.service.stale_age,
               "Drop events of this age that wait for a client which has asked to be told nothing stale")
      ->default_str("10s");
  add_duration(app, "--reader-patience", options.service.reader_patience,
               "Report a reader that is inside the shared segments for longer")
      ->default_str("1s");
  app.add_option("--key-file", options.service.key_file,
                 "Take the security key from this file, which nobody but the daemon's user may read; without it keys "
                 "are made at random")
      ->type_name("FILE");
  add_duration(app, "--key-rotation", options.service.key_rotation,
               "Change the security key so often; SIGUSR1 does so at any time");
  app.add_option("--ready-fd", options.ready_descriptor,
                 "Write one byte to this descriptor and close it when clients can connect")
      ->type_name("N")
      ->check(CLI::NonNegativeNumber);
  app.add_option("--log-level", options.log_level, "What to log: trace, debug, info, warning, error or off")
      ->type_name("LEVEL")
      ->capture_default_str()
      ->check(CLI::IsMember({"trace", "debug", "info", "warning", "error", "off"}));
  app.add_flag_callback(
      "--foreground", [] {}, "Stay in the foreground; this is always so");
}

}  // namespace

CommandLine read_command_line(int argc, char** argv) {
  Options options;
  CLI::App app("Heartbeat daemon: tells clients of a cluster's nodes and adapters as they die and come back.", "hbd");
  app.footer(footer);
  app.set_version_flag("--version", "hbd " HBD_VERSION);
  add_source_options(app, options);
  add_pace_options(app, options);
  add_service_options(app, options);
  try {
    app.parse(argc, argv);
  } catch (const CLI::ParseError& end) {
    return {std::nullopt, app.exit(end) == 0 ? exit_success : exit_usage};
  }
  if (app.count("--socket") == 0) {
    options.socket_path = socket_path_from_environment();
  }
  return {options, exit_success};
}

}  // namespace hbd
