#include <fmt/format.h>

#include "hb_client/control.h"
#include "node_action.h"
#include "request.h"

namespace hbctl {

void node_command(const Context& context) {
  const Options& options = context.options;
  const NodeAction& action = *find_node_action(options.action);
  const Request request = {std::string("node ") + action.word,
                           fmt::format(fmt::runtime(action.what), options.node),
                           Outcome::Sent,
                           action.danger,
                           "the number is beyond those of the cluster: see hbctl nodes",
                           {{"node", options.node}}};
  carry_out(context, request, [&] { return action.call(options.node); });
}

}  // namespace hbctl
