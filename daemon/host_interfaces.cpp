#include "host_interfaces.h"

#include <spdlog/spdlog.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <utility>

#include "rtnetlink_request.h"

namespace hbd {
namespace {

/* What an answer of the kernel means to whoever has asked. Other errors may pass. */
constexpr std::pair<int, Hb_Request_Status> meanings[] = {
    {0, HB_REQUEST_SUCCESSFUL},           {EPERM, HB_NOT_SUPPORTED},
    {EACCES, HB_NOT_SUPPORTED},           {EOPNOTSUPP, HB_NOT_SUPPORTED},
    {ENODEV, HB_ADAPTER_NOT_CONFIG},      {EADDRNOTAVAIL, HB_ADAPTER_NOT_CONFIG},
    {EINVAL, HB_INVALID_SERVICE_ADDRESS}, {EEXIST, HB_INVALID_SERVICE_ADDRESS},
};

Hb_Request_Status status_of(int error, const char* what, const Adapter& adapter) {
  const auto* const found =
      std::find_if(std::begin(meanings), std::end(meanings), [&](const auto& each) { return each.first == error; });
  if (error != 0) {
    spdlog::warn("{} of {} failed: {}{}", what, adapter.type, std::strerror(error),
                 error == EPERM ? "; run the daemon with the capability to administer networks" : "");
  }
  return found == std::end(meanings) ? HB_TRY_AGAIN : found->second;
}

constexpr unsigned char whole_ipv4_address = 32; /* as a prefix */

/* Another address in the place of one. The old one goes first: both may be on one network, whose addresses the kernel
   removes together with the first of them. */
int replace(const HostAddress& old, const HostAddress& wanted) {
  if (const int error = remove_address(old); error != 0) {
    return error;
  }
  const int error = add_address(wanted);
  if (error != 0) {
    add_address(old);
  }
  return error;
}

HostAddress moved_to(int interface, HostAddress address) {
  address.interface = interface;
  return address;
}

/* Two addresses on each other's interfaces; back where they were when one cannot be there. */
int exchange(const HostAddress& first, const HostAddress& second) {
  if (const int error = remove_address(second); error != 0) {
    return error;
  }
  int error = replace(first, moved_to(first.interface, second));
  if (error == 0) {
    error = add_address(moved_to(second.interface, first));
    if (error != 0) {
      replace(moved_to(first.interface, second), first);
    }
  }
  if (error != 0) {
    add_address(second);
  }
  return error;
}

/* The prefix stays, but that of an IPv6 address means nothing to an IPv4 one: this one stands alone. */
HostAddress in_place_of(const HostAddress& old, const Hb_IP_address6& address) {
  HostAddress wanted = old;
  std::memcpy(wanted.bytes.data(), &address, wanted.bytes.size());
  if (wanted.is_ipv4() && !old.is_ipv4()) {
    wanted.prefix_length = whole_ipv4_address;
  }
  return wanted;
}

bool share_fate(const HostAddress& one, const HostAddress& other) {
  return one.interface == other.interface && one.prefix_length == other.prefix_length && one.is_ipv4() &&
         other.is_ipv4() && one.bytes != other.bytes;
}

}  // namespace

const HostAddress* HostInterfaces::find(const Adapter& adapter) const {
  const auto found = std::find_if(table_.addresses().begin(), table_.addresses().end(), [&](const auto& each) {
    const auto interface = table_.interfaces().find(each.interface);
    return std::memcmp(each.bytes.data(), &adapter.address, each.bytes.size()) == 0 &&
           interface != table_.interfaces().end() && interface->second.name == adapter.type;
  });
  return found == table_.addresses().end() ? nullptr : &*found;
}

Hb_Request_Status HostInterfaces::switch_interface(const Adapter& adapter, bool on) {
  const HostAddress* place = find(adapter);
  return status_of(place == nullptr ? ENODEV : switch_link(place->interface, on), "switching the interface", adapter);
}

/* With an address the kernel may remove others of its network. Those that are still there are not added twice. */
void HostInterfaces::bring_back_others(const HostAddress& removed) const {
  for (const HostAddress& each : table_.addresses()) {
    if (share_fate(each, removed)) {
      add_address(each);
    }
  }
}

Hb_Request_Status HostInterfaces::configure(const Adapter& adapter, const Hb_IP_address6& address) {
  const HostAddress* place = find(adapter);
  if (place == nullptr) {
    return HB_ADAPTER_NOT_CONFIG;
  }
  const int error = replace(*place, in_place_of(*place, address));
  bring_back_others(*place);
  return status_of(error, "changing the address", adapter);
}

Hb_Request_Status HostInterfaces::unconfigure(const Adapter& adapter) {
  const HostAddress* place = find(adapter);
  if (place == nullptr) {
    return HB_ADAPTER_NOT_CONFIG;
  }
  const int error = remove_address(*place);
  bring_back_others(*place);
  return status_of(error, "removing the address", adapter);
}

Hb_Request_Status HostInterfaces::swap(const Adapter& adapter, const Adapter& partner) {
  const HostAddress* one = find(adapter);
  const HostAddress* other = find(partner);
  if (one == nullptr || other == nullptr) {
    return HB_ADAPTER_NOT_CONFIG;
  }
  if (one->interface == other->interface) {
    return HB_REQUEST_SUCCESSFUL; /* an interface has its addresses in no order */
  }
  const int error = exchange(*one, *other);
  bring_back_others(*one);
  bring_back_others(*other);
  return status_of(error, "swapping the address", adapter);
}

bool HostInterfaces::is_switched_off(const Adapter& adapter) const {
  const HostAddress* place = find(adapter);
  const auto interface = place == nullptr ? table_.interfaces().end() : table_.interfaces().find(place->interface);
  return interface != table_.interfaces().end() && !interface->second.on;
}

}  // namespace hbd
