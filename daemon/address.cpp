#include "address.h"

#include <arpa/inet.h>

#include <array>

namespace hbd {

Hb_IP_address6 mapped_address(Hb_IP_address4 address) {
  Hb_IP_address6 mapped{};
  mapped.v4_in_v6.filler[2] = htonl(0xFFFF);
  mapped.v4_in_v6.v4_in_v6_ipv4 = address;
  return mapped;
}

std::optional<Hb_IP_address6> parse_address(const std::string& text) {
  in_addr four{};
  if (inet_pton(AF_INET, text.c_str(), &four) == 1) {
    return mapped_address(four.s_addr);
  }
  Hb_IP_address6 six{};
  if (inet_pton(AF_INET6, text.c_str(), &six.i6_ipv6) == 1) {
    return six;
  }
  return std::nullopt;
}

std::string address_text(const Hb_IP_address6& address) {
  std::array<char, INET6_ADDRSTRLEN> text{};
  if (IN6_IS_ADDR_V4MAPPED(&address.i6_ipv6)) {
    inet_ntop(AF_INET, &address.v4_in_v6.v4_in_v6_ipv4, text.data(), text.size());
  } else {
    inet_ntop(AF_INET6, &address.i6_ipv6, text.data(), text.size());
  }
  return text.data();
}

}  // namespace hbd
