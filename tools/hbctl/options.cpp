#include "options.h"

#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <cmath>
#include <iostream>

#include "errors.h"
#include "hb_client/events.h"
#include "help_text.h"
#include "option_parts.h"
#include "steering_options.h"
#include "words.h"

namespace hbctl {
namespace {

// What the library's parser hands over before it becomes `Options`.
struct Raw {
  std::vector<std::string> event_words;
  double duration = 0;
};

void add_networks(CLI::App& command, Options& options) {
  command.add_option("--network", options.selection.networks, "Only these networks, by name or number")
      ->delimiter(',')
      ->type_name("NETWORK");
}

void add_wait(CLI::App& command, Options& options) {
  command.add_option("--wait", options.wait, "Longest wait for the daemon to tell who is up; 0 does not ask")
      ->check(within(0.0, kLongestSeconds))
      ->type_name("SECONDS")
      ->capture_default_str();
}

std::string subscribable_list() {
  std::string list = "all";
  for (const std::string& word : subscribable_words()) list += ", " + word;
  return list;
}

std::string check_event_word(const std::string& word) {
  return bits_of_word(word) != 0 ? "" : "unknown event '" + word + "': the words are " + subscribable_list();
}

std::string check_name_prefix(const std::string& prefix) {
  if (!prefix.empty() && prefix.size() <= kLongestNamePrefix) return "";
  return "the prefix has to have 1 to " + std::to_string(kLongestNamePrefix) + " characters";
}

void add_watch(CLI::App& app, Options& options, Raw& raw) {
  CLI::App* watch = add_command(app, options, "watch", "Follow events as they happen", help::kWatch);
  add_numbers(*watch, "--node", options.selection.nodes, "Only these nodes", HB_MAX_NODES);
  add_numbers(*watch, "--adapter", options.selection.adapters, "Only these adapters", HB_MAX_ADAPTERS);
  add_networks(*watch, options);
  watch->add_option("--events", raw.event_words, "Only these events: " + subscribable_list())
      ->delimiter(',')
      ->check(CLI::Validator(check_event_word, ""))
      ->type_name("EVENT");
  watch->add_option("--count", options.count, "End after so many events")
      ->check(within(uint32_t{1}, UINT32_MAX))
      ->type_name("N");
  watch->add_option("--duration", raw.duration, "End after so long")
      ->check(within(0.0, kLongestSeconds))
      ->type_name("SECONDS");
  watch->add_option("--name", options.name_prefix, "First part of the subscriptions' names")
      ->check(CLI::Validator(check_name_prefix, ""))
      ->type_name("PREFIX")
      ->capture_default_str();
  watch->add_flag("--discard-stale", options.discard_stale,
                  "Have the daemon drop events that waited too long to be read");
}

void add_commands(CLI::App& app, Options& options, Raw& raw) {
  add_wait(
      *add_command(app, options, "status", "Show whether the daemon is there, and how the cluster is", help::kStatus),
      options);
  add_wait(*add_command(app, options, "nodes", "List the configured nodes and their states", help::kNodes), options);
  CLI::App* adapters = add_command(app, options, "adapters", "List the configured adapters", help::kAdapters);
  add_numbers(*adapters, "--node", options.selection.nodes, "Only the adapters of these nodes", HB_MAX_NODES);
  add_networks(*adapters, options);
  add_wait(*adapters, options);
  add_wait(*add_command(app, options, "networks", "List the configured networks", help::kNetworks), options);
  add_command(app, options, "sites", "List the configured sites", help::kSites);
  add_watch(app, options, raw);
  add_steering_commands(app, options);
}

void add_common(CLI::App& app, Options& options) {
  app.set_version_flag("--version", "hbctl " HBCTL_VERSION);
  app.add_option("--socket", options.socket, "The daemon's socket, exactly this path")->type_name("PATH");
  app.add_option("--color", options.colour, "When to colour: auto, always or never")
      ->check(CLI::IsMember({"auto", "always", "never"}))
      ->type_name("WHEN")
      ->capture_default_str();
  app.footer(help::kMain);
  app.require_subcommand(1);
  app.fallthrough();
  app.failure_message([](const CLI::App*, const CLI::Error& error) {
    return std::string("hbctl: ") + error.what() + "\nRun 'hbctl --help' or 'hbctl COMMAND --help'.\n";
  });
}

void complete(const CLI::App& app, const Raw& raw, Options& options) {
  const CLI::App* command = app.get_subcommands().front();
  options.command = command->get_name();
  check_steering(options);
  if (options.command != "watch") return;
  for (const std::string& word : raw.event_words) options.events |= bits_of_word(word);
  if (raw.event_words.empty()) {
    options.events =
        HB_EVENT_DEATH | HB_EVENT_JOIN | HB_EVENT_NEW_GROUP | HB_EVENT_DIFF_INSTANCE | HB_EVENT_NODE_HEARTBEAT;
  }
  if (command->count("--duration") != 0) options.duration = raw.duration;
}

}  // namespace

CLI::App* add_command(CLI::App& app, Options& options, const char* name, const char* text, const char* examples) {
  CLI::App* command = app.add_subcommand(name, text);
  command->add_flag("--json", options.json, "Print JSON, as hbctl-json.md describes it");
  command->footer(std::string(examples) + help::kCommon);
  return command;
}

std::optional<int> parse_options(int argc, const char* const* argv, Options& options) {
  CLI::App app("Shows the liveness of a cluster as its heartbeat daemon tells it, and steers the daemon.", "hbctl");
  Raw raw;
  add_common(app, options);
  add_commands(app, options, raw);
  try {
    app.parse(argc, argv);
    complete(app, raw, options);
  } catch (const CLI::ParseError& error) {
    const int result = app.exit(error, std::cout, std::cerr);
    return result == 0 ? 0 : static_cast<int>(ExitStatus::Usage);
  }
  return std::nullopt;
}

std::chrono::milliseconds as_milliseconds(double seconds) {
  return std::chrono::milliseconds(std::llround(seconds * 1000.0));
}

}  // namespace hbctl
