#include "adapter_action.h"

#include <arpa/inet.h>
#include <fmt/format.h>

#include <algorithm>
#include <charconv>
#include <climits>
#include <optional>

#include "hb_client/control.h"

namespace hbctl {
namespace {

Hb_Rc enable(const AdapterOrder& order) { return hb_enable_adapter(order.adapter); }
Hb_Rc disable(const AdapterOrder& order) { return hb_disable_adapter(order.adapter); }
Hb_Rc interface_down(const AdapterOrder& order) { return hb_ifconfig_down(order.adapter); }
Hb_Rc interface_up(const AdapterOrder& order) { return hb_ifconfig_up(order.adapter); }
Hb_Rc configure(const AdapterOrder& order) { return hb_configure_adapter(order.adapter, order.address); }
Hb_Rc unconfigure(const AdapterOrder& order) { return hb_unconfigure_adapter(order.adapter); }
Hb_Rc swap(const AdapterOrder& order) { return hb_swap_adapters(order.adapter, order.address); }
Hb_Rc grace(const AdapterOrder& order) { return hb_adapter_grace(order.adapter, order.seconds); }
Hb_Rc may_be_down(const AdapterOrder& order) { return hb_adapter_may_be_down(order.adapter); }
Hb_Rc is_down(const AdapterOrder& order) { return hb_adapter_is_down(order.adapter); }

std::optional<Hb_IP_address4> parse_address(const std::string& text) {
  in_addr address{};
  if (inet_pton(AF_INET, text.c_str(), &address) != 1) return std::nullopt;
  return address.s_addr;
}

std::optional<int> parse_seconds(const std::string& text) {
  int seconds = 0;
  const char* end = text.data() + text.size();
  const auto parsed = std::from_chars(text.data(), end, seconds);
  if (parsed.ec != std::errc() || parsed.ptr != end || seconds < 0) return std::nullopt;
  return seconds;
}

}  // namespace

const std::vector<AdapterAction>& adapter_actions() {
  static const std::vector<AdapterAction> actions = {
      {"enable", ActionValue::None, false, true, "enable adapter {0}", "", enable},
      {"disable", ActionValue::None, false, true, "disable adapter {0}",
       "nobody is told of its deaths and joins any more", disable},
      {"ifdown", ActionValue::None, false, true, "switch the interface of adapter {0} off",
       "the adapter dies for the whole cluster", interface_down},
      {"ifup", ActionValue::None, false, true, "switch the interface of adapter {0} on", "", interface_up},
      {"configure", ActionValue::Address, true, true, "configure adapter {0} with the address {1}", "", configure},
      {"unconfigure", ActionValue::None, true, true, "take the address of adapter {0} away",
       "nothing reaches the adapter until it is configured again", unconfigure},
      {"swap", ActionValue::Address, true, true, "swap the addresses of adapter {0} and of the one at {1}",
       "whoever talks to one of them reaches the other", swap},
      {"grace", ActionValue::Seconds, true, true, "give adapter {0} a grace of {1} s", "", grace},
      {"state", ActionValue::None, true, true, "read the state of adapter {0}", "", nullptr},
      {"may-be-down", ActionValue::None, false, false, "report that adapter {0} may be down", "", may_be_down},
      {"is-down", ActionValue::None, false, false, "report that adapter {0} is down",
       "the daemon believes it, and the adapter dies for the whole cluster", is_down},
  };
  return actions;
}

const AdapterAction* find_adapter_action(const std::string& word) {
  const auto& actions = adapter_actions();
  const auto found =
      std::find_if(actions.begin(), actions.end(), [&](const AdapterAction& action) { return action.word == word; });
  return found == actions.end() ? nullptr : &*found;
}

std::string check_action_value(const AdapterAction& action, const std::string& value) {
  switch (action.value) {
    case ActionValue::Address:
      if (value.empty()) return fmt::format("{} needs an address, as 10.0.0.9", action.word);
      return parse_address(value) ? "" : fmt::format("'{}' is no IPv4 address", value);
    case ActionValue::Seconds:
      if (value.empty()) return fmt::format("{} needs a number of seconds", action.word);
      return parse_seconds(value) ? "" : fmt::format("'{}' is no number of seconds from 0 to {}", value, INT_MAX);
    case ActionValue::None:
      break;
  }
  return value.empty() ? "" : fmt::format("{} takes no value, and '{}' is one", action.word, value);
}

AdapterOrder make_order(const AdapterAction& action, Hb_Adapter_Number adapter, const std::string& value) {
  AdapterOrder order{adapter, 0, 0};
  if (action.value == ActionValue::Address) order.address = parse_address(value).value_or(0);
  if (action.value == ActionValue::Seconds) order.seconds = parse_seconds(value).value_or(0);
  return order;
}

}  // namespace hbctl
