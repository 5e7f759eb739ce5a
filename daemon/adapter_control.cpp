#include "adapter_control.h"

#include <arpa/inet.h>

#include <algorithm>
#include <cstring>

#include "address.h"

namespace hbd {
namespace {

bool is_same(const Hb_IP_address6& one, const Hb_IP_address6& other) {
  return std::memcmp(&one, &other, sizeof(one)) == 0;
}

/* Addresses that no adapter of a cluster can have. */
bool is_special(Hb_IP_address4 address) {
  const in_addr_t number = ntohl(address);
  return number == INADDR_ANY || number == INADDR_BROADCAST || IN_MULTICAST(number) || (number >> 24) == IN_LOOPBACKNET;
}

}  // namespace

/* A network has one adapter in a node; of several it is the first with an IPv4 address, as requests carry such. */
const Adapter* AdapterControl::find(Hb_Network_Number network) const {
  const Configuration& configuration = cluster_.configuration();
  const auto& adapters = configuration.adapters;
  const auto end = adapters.lower_bound(configuration.adapter_number(configuration.local_node + 1, 0));
  const Adapter* first = nullptr;
  for (auto each = adapters.lower_bound(configuration.adapter_number(configuration.local_node, 0)); each != end;
       ++each) {
    const Adapter& adapter = each->second;
    if (adapter.network != network) {
      continue;
    }
    if (IN6_IS_ADDR_V4MAPPED(&adapter.address.i6_ipv6)) {
      return &adapter;
    }
    first = first == nullptr ? &adapter : first;
  }
  return first;
}

const Adapter* AdapterControl::find(const Hb_IP_address6& address) const {
  const auto& adapters = cluster_.configuration().adapters;
  const auto found = std::find_if(adapters.begin(), adapters.end(), [&](const auto& each) {
    return is_same(each.second.address, address) && cluster_.has_address(each.first);
  });
  return found == adapters.end() ? nullptr : &found->second;
}

Hb_Request_Status AdapterControl::check(const AdapterTarget& target) const {
  const auto networks = cluster_.configuration().networks.size();
  if (target.network < 0 || static_cast<std::size_t>(target.network) >= networks) {
    return HB_NO_SUCH_NETWORK;
  }
  return find(target.network) == nullptr ? HB_ADAPTER_NOT_CONFIG : HB_REQUEST_SUCCESSFUL;
}

/* Of an adapter's address: nothing may follow the adapter meanwhile. */
Hb_Request_Status AdapterControl::check_change(const AdapterTarget& target) const {
  const auto status = check(target);
  if (status != HB_REQUEST_SUCCESSFUL) {
    return status;
  }
  if (cluster_.is_monitored(find(target.network)->number)) {
    return HB_ADAPTER_ENABLED;
  }
  return local_node_is_dead() ? HB_TRY_AGAIN : HB_REQUEST_SUCCESSFUL;
}

bool AdapterControl::is_acceptable(const Hb_IP_address6& address) const {
  return !is_special(address.v4_in_v6.v4_in_v6_ipv4) && find(address) == nullptr;
}

bool AdapterControl::local_node_is_dead() const {
  return !cluster_.node_is_running(cluster_.configuration().local_node);
}

Hb_Request_Status AdapterControl::switch_monitoring(const AdapterTarget& target, bool on) {
  const auto status = check(target);
  if (status == HB_REQUEST_SUCCESSFUL) {
    sink_.apply(MonitoringSwitch{find(target.network)->number, on});
  }
  return status;
}

Hb_Request_Status AdapterControl::enable(const AdapterTarget& target) { return switch_monitoring(target, true); }

Hb_Request_Status AdapterControl::disable(const AdapterTarget& target) { return switch_monitoring(target, false); }

Hb_Request_Status AdapterControl::switch_interface(const AdapterTarget& target, bool on) {
  const auto status = check(target);
  return status == HB_REQUEST_SUCCESSFUL ? interfaces_.switch_interface(*find(target.network), on) : status;
}

Hb_Request_Status AdapterControl::interface_down(const AdapterTarget& target) {
  return switch_interface(target, false);
}

Hb_Request_Status AdapterControl::interface_up(const AdapterTarget& target) { return switch_interface(target, true); }

Hb_Request_Status AdapterControl::configure(const AdapterTarget& target) {
  const auto status = check_change(target);
  if (status != HB_REQUEST_SUCCESSFUL) {
    return status;
  }
  const Adapter& adapter = *find(target.network);
  const Hb_IP_address6 address = mapped_address(target.value);
  if (is_same(adapter.address, address)) {
    return HB_SAME_ADDRESS;
  }
  return is_acceptable(address) ? interfaces_.configure(adapter, address) : HB_INVALID_SERVICE_ADDRESS;
}

Hb_Request_Status AdapterControl::unconfigure(const AdapterTarget& target) {
  const auto status = check_change(target);
  if (status != HB_REQUEST_SUCCESSFUL) {
    return status;
  }
  const Adapter& adapter = *find(target.network);
  return cluster_.has_address(adapter.number) ? interfaces_.unconfigure(adapter) : HB_ADAPTER_NOT_CONFIG;
}

Hb_Request_Status AdapterControl::swap(const AdapterTarget& target) {
  const auto status = check_change(target);
  if (status != HB_REQUEST_SUCCESSFUL) {
    return status;
  }
  const Adapter& adapter = *find(target.network);
  const Adapter* partner = find(mapped_address(target.value));
  const Configuration& configuration = cluster_.configuration();
  if (!cluster_.has_address(adapter.number) || partner == nullptr ||
      configuration.node_of(partner->number) != configuration.local_node) {
    return HB_ADAPTER_NOT_CONFIG;
  }
  return partner == &adapter ? HB_SAME_ADDRESS : interfaces_.swap(adapter, *partner);
}

/* A node that is dead answers nobody, a network without IP has no such service, and what is not watched needs none. */
Hb_Request_Status AdapterControl::grace(const AdapterTarget& target) {
  const auto status = check(target);
  if (status != HB_REQUEST_SUCCESSFUL) {
    return status == HB_NO_SUCH_NETWORK ? status : HB_GRACE_FAILED;
  }
  if (!cluster_.configuration().networks[static_cast<std::size_t>(target.network)].ip) {
    return HB_NOT_SUPPORTED;
  }
  const Hb_Adapter_Number number = find(target.network)->number;
  const auto seconds = static_cast<std::int32_t>(target.value);
  if (seconds <= 0 || !cluster_.is_monitored(number) || !cluster_.has_address(number)) {
    return HB_GRACE_FAILED;
  }
  if (local_node_is_dead()) {
    return HB_GRACE_TIME_OUT;
  }
  sink_.apply(GraceSwitch{number, true});
  deadlines_.set({DeadlineKey::Purpose::Grace, number}, std::chrono::seconds(seconds), GraceSwitch{number, false});
  return HB_REQUEST_SUCCESSFUL;
}

Hb_Request_Status AdapterControl::state(const AdapterTarget& target, Hb_Adapter_state_t& state) const {
  const auto status = check(target);
  if (status != HB_REQUEST_SUCCESSFUL) {
    return status;
  }
  const Adapter& adapter = *find(target.network);
  if (!cluster_.has_address(adapter.number)) {
    return HB_ADAPTER_NOT_CONFIG;
  }
  const bool is_off = cluster_.is_monitored(adapter.number) && interfaces_.is_switched_off(adapter);
  state = is_off ? Hb_Adapter_ifconfig_Down : cluster_.state(adapter.number);
  return HB_REQUEST_SUCCESSFUL;
}

}  // namespace hbd
