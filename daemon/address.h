/* Addresses as text. */
#ifndef HBD_ADDRESS_H
#define HBD_ADDRESS_H

#include <optional>
#include <string>

#include "hb_client/types.h"

namespace hbd {

/** The address of four bytes in network order, IPv4-mapped. */
Hb_IP_address6 mapped_address(Hb_IP_address4 address);

/** Reads an IPv4 or IPv6 address; nothing when the text is neither. */
std::optional<Hb_IP_address6> parse_address(const std::string& text);

/** The address for people: dotted when it is IPv4-mapped. */
std::string address_text(const Hb_IP_address6& address);

}  // namespace hbd

#endif
