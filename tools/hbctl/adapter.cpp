#include <fmt/format.h>

#include "adapter_action.h"
#include "daemon_link.h"
#include "hb_client/control.h"
#include "request.h"
#include "words.h"

namespace hbctl {
namespace {

std::string describe(const AdapterAction& action, const AdapterOrder& order, const std::string& value) {
  return fmt::format(fmt::runtime(action.what), order.adapter, value);
}

std::string if_invalid(const AdapterAction& action) {
  if (!action.local) return "the number is beyond those of the cluster: see hbctl adapters";
  return "the adapter, and the other one of a swap, have to be of the local node: see hbctl status and hbctl adapters";
}

Json subject(const AdapterAction& action, const AdapterOrder& order, const std::string& value) {
  Json json = {{"adapter", order.adapter}};
  if (action.value == ActionValue::Address) json["address"] = value;
  if (action.value == ActionValue::Seconds) json["seconds"] = order.seconds;
  return json;
}

Request make_request(const AdapterAction& action, const AdapterOrder& order, const std::string& value) {
  return {std::string("adapter ") + action.word,
          describe(action, order, value),
          action.answered ? Outcome::Done : Outcome::Sent,
          action.danger,
          if_invalid(action),
          subject(action, order, value)};
}

Json state_json(Hb_Adapter_Number adapter, Hb_Adapter_state_t state) {
  Json json = json_object("adapter-state");
  json["adapter"] = adapter;
  json["state"] = monitoring_word(state);
  json["number"] = static_cast<int>(state);
  return json;
}

std::string state_text(const Style& style, Hb_Adapter_Number adapter, Hb_Adapter_state_t state) {
  const Paint paint = state == Hb_Adapter_Up ? Paint::Good : state == Hb_Adapter_Unknown ? Paint::Doubtful : Paint::Bad;
  return fmt::format("adapter {}: {}\n", adapter, style.apply(paint, monitoring_word(state)));
}

void show_state(const Context& context, const AdapterAction& action, const AdapterOrder& order) {
  const DaemonLink link(context.socket_path);
  Hb_Adapter_state_t state = Hb_Adapter_Unknown;
  if (hb_get_adapter_state(order.adapter, &state) != Hb_Success)
    throw request_error(describe(action, order, ""), if_invalid(action));
  context.output.write(context.options.json ? json_document(state_json(order.adapter, state))
                                            : state_text(context.style, order.adapter, state));
}

}  // namespace

void adapter_command(const Context& context) {
  const Options& options = context.options;
  const AdapterAction& action = *find_adapter_action(options.action);
  const AdapterOrder order = make_order(action, options.adapter, options.value);
  if (action.call == nullptr) return show_state(context, action, order);
  carry_out(context, make_request(action, order, options.value), [&] { return action.call(order); });
}

}  // namespace hbctl
