#include "steering_options.h"

#include <climits>

#include "adapter_action.h"
#include "help_text.h"
#include "node_action.h"

namespace hbctl {
namespace {

template <class Actions>
std::string words_of(const Actions& actions) {
  std::string words;
  for (const auto& action : actions) words += (words.empty() ? "" : ", ") + std::string(action.word);
  return words;
}

// One of the words of a table.
template <class Actions>
CLI::Validator word_of(const Actions& actions) {
  const auto check = [&actions](const std::string& word) -> std::string {
    for (const auto& action : actions)
      if (word == action.word) return "";
    return fmt::format("unknown action '{}': the words are {}", word, words_of(actions));
  };
  return {check, ""};
}

void add_yes(CLI::App& command, Options& options) {
  command.add_flag("--yes", options.yes, "Agree to what is dangerous, and be asked nothing");
}

void add_node_number(CLI::App& command, Options& options) {
  command.add_option("NUMBER", options.node, "Number of the node")
      ->required()
      ->check(within(0, HB_MAX_NODES - 1))
      ->type_name("");
}

void add_adapter(CLI::App& app, Options& options) {
  CLI::App* adapter = add_command(app, options, "adapter", "Steer an adapter, or report about it", help::kAdapter);
  adapter->add_option("NUMBER", options.adapter, "Number of the adapter")
      ->required()
      ->check(within(0, HB_MAX_ADAPTERS - 1))
      ->type_name("");
  adapter->add_option("ACTION", options.action, "What to do: " + words_of(adapter_actions()))
      ->required()
      ->check(word_of(adapter_actions()))
      ->type_name("");
  adapter->add_option("VALUE", options.value, "ADDRESS to configure or to swap with, SECONDS of grace")->type_name("");
  add_yes(*adapter, options);
}

void add_node(CLI::App& app, Options& options) {
  CLI::App* node = add_command(app, options, "node", "Report about a node", help::kNode);
  add_node_number(*node, options);
  node->add_option("ACTION", options.action, "What to do: " + words_of(node_actions()))
      ->required()
      ->check(word_of(node_actions()))
      ->type_name("");
  add_yes(*node, options);
}

void add_route(CLI::App& app, Options& options) {
  CLI::App* route = add_command(app, options, "route", "Show the route to a node", help::kRoute);
  add_node_number(*route, options);
  CLI::Option* from_daemon =
      route->add_flag("--from-daemon", options.from_daemon, "Ask the daemon instead of reading what it publishes");
  route->add_flag("--ip", options.ip, "Only if it is an IP route")->excludes(from_daemon);
}

void add_security(CLI::App& app, Options& options) {
  CLI::App* security =
      add_command(app, options, "security", "Show the security keys, without their bytes", help::kSecurity);
  security->add_flag("--reveal", options.reveal, "Print the bytes of the keys, too");
}

void add_send(CLI::App& app, Options& options) {
  CLI::App* send = add_command(app, options, "send", "Have the daemon route a message to nodes", help::kSend);
  add_numbers(*send, "--node", options.selection.nodes, "The nodes that it is for", HB_MAX_NODES)->required();
  send->add_option("--port", options.port, "The port that it is for")
      ->required()
      ->check(within(0, UINT16_MAX))
      ->type_name("PORT");
  send->add_option("TEXT", options.text, "The message; - reads it from standard input, and nothing is one of no bytes")
      ->type_name("");
}

void add_heartbeat(CLI::App& app, Options& options) {
  CLI::App* heartbeat = add_command(app, options, "heartbeat", "Send signs of life of this client", help::kHeartbeat);
  heartbeat->add_option("--sequence", options.sequence, "Number of the first one")
      ->check(within(uint32_t{0}, UINT32_MAX))
      ->type_name("N")
      ->capture_default_str();
  CLI::Option* every = heartbeat->add_option("--every", options.every, "Send one after the other, so long apart")
                           ->check(within(0.001, kLongestSeconds))
                           ->type_name("SECONDS");
  heartbeat->add_option("--count", options.count, "End after so many")
      ->needs(every)
      ->check(within(uint32_t{1}, UINT32_MAX))
      ->type_name("N");
  CLI::Option* settings =
      heartbeat->add_flag("--settings", options.settings, "Show what the daemon expects of heartbeats");
  heartbeat->add_option("--wait", options.wait, "Longest wait for the settings")
      ->needs(settings)
      ->check(within(0.0, kLongestSeconds))
      ->type_name("SECONDS")
      ->capture_default_str();
}

void add_simulate_death(CLI::App& app, Options& options) {
  CLI::App* death =
      add_command(app, options, "simulate-death", "Have this node play dead for some time", help::kSimulateDeath);
  death->add_option("SECONDS", options.seconds, "For how long; 0 is the time of the configuration")
      ->required()
      ->check(within(0, INT_MAX))
      ->type_name("");
  add_yes(*death, options);
}

CLI::App* add_switch(CLI::App& app, Options& options, const char* name, const char* text, const char* examples) {
  CLI::App* command = add_command(app, options, name, text, examples);
  command
      ->add_option_function<std::string>(
          "SWITCH", [&options](const std::string& word) { options.on = word == "on"; }, "on or off")
      ->required()
      ->check(CLI::IsMember({"on", "off"}))
      ->type_name("");
  return command;
}

}  // namespace

void add_steering_commands(CLI::App& app, Options& options) {
  add_adapter(app, options);
  add_node(app, options);
  add_route(app, options);
  add_security(app, options);
  add_send(app, options);
  add_heartbeat(app, options);
  add_simulate_death(app, options);
  add_switch(app, options, "stale", "Have stale events of this very connection dropped, or not", help::kStale);
  add_switch(app, options, "monitors", "Put interface monitors under manual control, or not", help::kMonitors)
      ->add_option("NAME", options.interface, "Name of the interface; all of them when it is left out")
      ->type_name("");
}

void check_steering(const Options& options) {
  if (options.command != "adapter") return;
  const std::string mistake = check_action_value(*find_adapter_action(options.action), options.value);
  if (!mistake.empty()) throw CLI::ValidationError("VALUE", mistake);
}

}  // namespace hbctl
