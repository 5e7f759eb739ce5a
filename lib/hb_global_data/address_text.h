// Addresses as text: dotted for IPv4-mapped ones, IPv6 notation for all others.
#pragma once

#include "hb_client/types.h"
#include "zu_vex.h"

// Whether the 16 bytes are those of an IPv4 address.
bool is_ipv4_mapped(const in6_addr& address);

// Both write at most 46 bytes to out_p and return it.
char* VEX_ntop(zu_vex_IP_address6_t* ip6, char* out_p);
char* mowllib_ntop(Hb_IP_address6* ip6, char* out_p);
