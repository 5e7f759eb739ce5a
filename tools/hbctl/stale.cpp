#include "hb_client/control.h"
#include "request.h"

namespace hbctl {

void stale_command(const Context& context) {
  const bool on = context.options.on;
  const Request request = {
      "stale",
      on ? "have stale events dropped on this connection" : "have stale events delivered on this connection",
      Outcome::Sent,
      "",
      "",
      {{"on", on}}};
  carry_out(context, request, [on] { return hb_discard_stale_messages(on ? Hb_True : Hb_False); });
}

}  // namespace hbctl
