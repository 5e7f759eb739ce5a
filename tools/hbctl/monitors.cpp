#include <fmt/format.h>

#include "hb_client/control.h"
#include "request.h"
#include "text.h"

namespace hbctl {
namespace {

std::string describe(bool on, const std::string& interface) {
  const std::string whose =
      interface.empty() ? "the monitors of all interfaces" : "the monitor of interface " + printable(interface);
  return fmt::format("{} {} {} manual control", on ? "put" : "take", whose, on ? "under" : "off");
}

}  // namespace

void monitors_command(const Context& context) {
  const bool on = context.options.on;
  std::string interface = context.options.interface;
  const Request request = {"monitors",
                           describe(on, interface),
                           Outcome::Sent,
                           "",
                           "the name of an interface has at most 16460 characters",
                           {{"on", on}, {"interface", interface.empty() ? Json(nullptr) : Json(interface)}}};
  carry_out(context, request, [&] {
    return hb_nim_manual_start_control(on ? HB_NIM_MANCTRL_ENABLE : HB_NIM_MANCTRL_DISABLED, interface.data());
  });
}

}  // namespace hbctl
