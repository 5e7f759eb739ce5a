// Addresses as people write them.
#pragma once

#include <string>

#include "hb_client/types.h"

namespace hbctl {

// Dotted for an IPv4-mapped address, otherwise as IPv6.
std::string address_text(const Hb_IP_address6& address);

}  // namespace hbctl
