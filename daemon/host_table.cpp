#include "host_table.h"

#include <linux/if_addr.h>
#include <linux/if_link.h>
#include <linux/rtnetlink.h>
#include <net/if.h>
#include <netinet/in.h>

#include <cstring>
#include <optional>

#include "address.h"

namespace hbd {
namespace {

/* Addresses that are not (yet) usable. */
constexpr std::uint32_t unusable = IFA_F_TENTATIVE | IFA_F_DADFAILED;

/* The attributes of an address message that matter here. */
struct AddressAttributes {
  const nlattr* local = nullptr;
  const nlattr* address = nullptr;
  std::uint32_t flags = 0;
};

int take_attribute(const nlattr* attribute, void* data) {
  auto& attributes = *static_cast<AddressAttributes*>(data);
  switch (mnl_attr_get_type(attribute)) {
    case IFA_LOCAL:
      attributes.local = attribute;
      break;
    case IFA_ADDRESS:
      attributes.address = attribute;
      break;
    case IFA_FLAGS:
      if (mnl_attr_validate(attribute, MNL_TYPE_U32) == 0) {
        attributes.flags = mnl_attr_get_u32(attribute);
      }
      break;
    default:
      break;
  }
  return MNL_CB_OK;
}

int take_name(const nlattr* attribute, void* data) {
  if (mnl_attr_get_type(attribute) == IFLA_IFNAME && mnl_attr_validate(attribute, MNL_TYPE_NUL_STRING) == 0) {
    *static_cast<std::string*>(data) = mnl_attr_get_str(attribute);
  }
  return MNL_CB_OK;
}

std::optional<Hb_IP_address6> address_of(const nlattr* attribute, unsigned char family) {
  if (attribute == nullptr) {
    return std::nullopt;
  }
  const std::size_t size = mnl_attr_get_payload_len(attribute);
  const void* payload = mnl_attr_get_payload(attribute);
  if (family == AF_INET && size == sizeof(in_addr)) {
    Hb_IP_address4 four = 0;
    std::memcpy(&four, payload, sizeof(four));
    return mapped_address(four);
  }
  if (family == AF_INET6 && size == sizeof(in6_addr)) {
    Hb_IP_address6 six{};
    std::memcpy(&six, payload, sizeof(six));
    return six;
  }
  return std::nullopt;
}

}  // namespace

bool HostAddress::is_ipv4() const {
  in6_addr address{};
  std::memcpy(&address, bytes.data(), bytes.size());
  return IN6_IS_ADDR_V4MAPPED(&address);
}

void HostTable::take(const nlmsghdr& message) {
  switch (message.nlmsg_type) {
    case RTM_NEWLINK:
    case RTM_DELLINK:
      take_link(message);
      break;
    case RTM_NEWADDR:
    case RTM_DELADDR:
      take_address(message);
      break;
    default:
      break;
  }
}

void HostTable::take_link(const nlmsghdr& message) {
  if (mnl_nlmsg_get_payload_len(&message) < sizeof(ifinfomsg)) {
    return;
  }
  const auto* link = static_cast<const ifinfomsg*>(mnl_nlmsg_get_payload(&message));
  if (message.nlmsg_type == RTM_DELLINK) {
    interfaces_.erase(link->ifi_index);
    std::erase_if(addresses_, [&](const HostAddress& address) { return address.interface == link->ifi_index; });
    return;
  }
  Interface& interface = interfaces_[link->ifi_index];
  interface.hardware = link->ifi_type;
  interface.on = (link->ifi_flags & IFF_UP) != 0;
  interface.running = interface.on && (link->ifi_flags & IFF_RUNNING) != 0;
  mnl_attr_parse(&message, sizeof(ifinfomsg), take_name, &interface.name);
}

void HostTable::take_address(const nlmsghdr& message) {
  if (mnl_nlmsg_get_payload_len(&message) < sizeof(ifaddrmsg)) {
    return;
  }
  const auto* header = static_cast<const ifaddrmsg*>(mnl_nlmsg_get_payload(&message));
  AddressAttributes attributes;
  attributes.flags = header->ifa_flags;
  mnl_attr_parse(&message, sizeof(ifaddrmsg), take_attribute, &attributes);
  /* On a link between two ends the other attribute is the far end's address. */
  const auto address =
      address_of(attributes.local != nullptr ? attributes.local : attributes.address, header->ifa_family);
  if (!address) {
    return;
  }
  HostAddress entry{static_cast<int>(header->ifa_index), {}, header->ifa_prefixlen};
  std::memcpy(entry.bytes.data(), &*address, entry.bytes.size());
  /* One that is there already may have another prefix now. */
  addresses_.erase(entry);
  if (message.nlmsg_type == RTM_NEWADDR && (attributes.flags & unusable) == 0) {
    addresses_.insert(entry);
  }
}

}  // namespace hbd
