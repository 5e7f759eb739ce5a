#include <fmt/format.h>

#include "hb_client/control.h"
#include "request.h"

namespace hbctl {

void simulate_death_command(const Context& context) {
  const int seconds = context.options.seconds;
  const std::string what = seconds > 0 ? fmt::format("simulate the death of this node for {} s", seconds)
                                       : "simulate the death of this node for the configured time";
  const Request request = {"simulate-death",
                           what,
                           Outcome::Sent,
                           "the node dies for the whole cluster, and comes back only after that time",
                           "",
                           {{"seconds", seconds}}};
  carry_out(context, request, [&] { return hb_simulate_death(seconds); });
}

}  // namespace hbctl
