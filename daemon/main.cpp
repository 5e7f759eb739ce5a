/* hbd, the heartbeat daemon. */
#include <fmt/format.h>
#include <spdlog/sinks/stdout_sinks.h>
#include <spdlog/spdlog.h>
#include <sys/resource.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <exception>
#include <fstream>
#include <memory>
#include <sstream>
#include <utility>

#include "built_in_scenario.h"
#include "daemon.h"
#include "exit_status.h"
#include "failure.h"
#include "host_source.h"
#include "options.h"
#include "scenario_parser.h"
#include "simulation.h"
#include "socket_path.h"

namespace {

using hbd::Failure;

std::string contents_of(const std::string& file) {
  std::ifstream stream(file);
  std::ostringstream text;
  text << stream.rdbuf();
  if (!stream) {
    throw Failure(fmt::format("reading {} failed: {}; is it readable and not empty?", file, std::strerror(errno)));
  }
  return text.str();
}

hbd::Scenario load_scenario(const std::string& file) {
  auto result = hbd::parse_scenario(file.empty() ? hbd::built_in_scenario() : contents_of(file));
  if (const auto* error = std::get_if<hbd::ScenarioError>(&result)) {
    throw Failure(error->line == 0 ? fmt::format("{}: {}", file, error->text)
                                   : fmt::format("{}:{}: {}", file, error->line, error->text));
  }
  return std::get<hbd::Scenario>(std::move(result));
}

int check_scenario(const std::string& file) {
  const hbd::Scenario scenario = load_scenario(file);
  fmt::print("{}: cluster \"{}\" with {} adapters on {} networks, {} scripted events{}\n", file,
             scenario.configuration.name, scenario.configuration.adapters.size(),
             scenario.configuration.networks.size(), scenario.steps.size(), scenario.churn ? " and random churn" : "");
  return hbd::exit_success;
}

void set_up_log(const std::string& level) {
  auto log = spdlog::stderr_logger_mt("hbd");
  log->set_pattern("hbd: %Y-%m-%dT%H:%M:%S.%e %l: %v");
  log->set_level(spdlog::level::from_str(level));
  spdlog::set_default_logger(std::move(log));
}

/* One descriptor a client: as many as the system allows. */
void raise_descriptor_limit() {
  rlimit limit{};
  if (getrlimit(RLIMIT_NOFILE, &limit) == 0) {
    limit.rlim_cur = limit.rlim_max;
    setrlimit(RLIMIT_NOFILE, &limit);
  }
}

void tell_ready(int descriptor) {
  if (descriptor < 0) {
    return;
  }
  if (write(descriptor, "\n", 1) != 1) {
    spdlog::warn("telling descriptor {} that the daemon is ready failed: {}", descriptor, std::strerror(errno));
  }
  close(descriptor);
}

void serve(hbd::Loop& loop, const hbd::Options& options, hbd::MembershipSource& source, hbd::Daemon& daemon) {
  const hbd::Signal terminate(loop, SIGTERM, [&] { loop.stop(); });
  const hbd::Signal interrupt(loop, SIGINT, [&] { loop.stop(); });
  const hbd::Signal rotate(loop, SIGUSR1, [&] { daemon.rotate_keys(); });
  source.start(daemon, daemon.cluster());
  spdlog::info("listening at {}", options.socket_path);
  tell_ready(options.ready_descriptor);
  loop.run();
  spdlog::info("stopped");
}

int run(const hbd::Options& options) {
  hbd::check_socket_path(options.socket_path);
  hbd::Loop loop;
  if (options.host) {
    hbd::HostSource host(loop);
    hbd::Daemon daemon(loop, options.socket_path, host, options.client_queue_bytes, options.service);
    serve(loop, options, host, daemon);
  } else {
    hbd::Simulation simulation(loop, load_scenario(options.scenario_file), options.pace);
    hbd::Daemon daemon(loop, options.socket_path, simulation, options.client_queue_bytes, options.service);
    simulation.set_audience(daemon.server());
    serve(loop, options, simulation, daemon);
  }
  return hbd::exit_success;
}

}  // namespace

int main(int argc, char** argv) {
  const hbd::CommandLine command_line = hbd::read_command_line(argc, argv);
  if (!command_line.options) {
    return command_line.exit_status;
  }
  try {
    std::signal(SIGPIPE, SIG_IGN);
    set_up_log(command_line.options->log_level);
    raise_descriptor_limit();
    return command_line.options->check ? check_scenario(command_line.options->scenario_file)
                                       : run(*command_line.options);
  } catch (const std::exception& failure) {
    fmt::print(stderr, "hbd: {}\n", failure.what());
    return hbd::exit_failure;
  }
}
