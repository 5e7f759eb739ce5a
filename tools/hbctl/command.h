// The commands. Each writes to the context's output and throws CommandError when it fails.
#pragma once

#include "cluster.h"
#include "errors.h"
#include "json.h"
#include "liveness.h"
#include "options.h"
#include "output.h"
#include "style.h"
#include "table.h"

namespace hbctl {

struct Context {
  const Options& options;
  std::string socket_path;
  Output output;
  Style style;
};

void status_command(const Context& context);
void nodes_command(const Context& context);
void adapters_command(const Context& context);
void networks_command(const Context& context);
void sites_command(const Context& context);
void watch_command(const Context& context);

// Those that steer the daemon or read what it publishes for programs that do.
void adapter_command(const Context& context);
void node_command(const Context& context);
void route_command(const Context& context);
void security_command(const Context& context);
void send_command(const Context& context);
void heartbeat_command(const Context& context);
void simulate_death_command(const Context& context);
void stale_command(const Context& context);
void monitors_command(const Context& context);

// An object as the command writes it: a document, or a line where it writes several.
std::string json_text(const Context& context, const Json& json);

// How tables show a state.
Cell state_cell(State state);

// What tables show for something that is not known.
std::string or_dash(const std::string& text);

// The error for a selection that names what is not configured.
CommandError not_configured(const std::vector<std::string>& unknown);

}  // namespace hbctl
