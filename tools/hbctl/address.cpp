#include "address.h"

#include <arpa/inet.h>

namespace hbctl {

std::string address_text(const Hb_IP_address6& address) {
  char text[INET6_ADDRSTRLEN] = "";
  if (IN6_IS_ADDR_V4MAPPED(&address.i6_ipv6)) {
    inet_ntop(AF_INET, &address.v4_in_v6.v4_in_v6_ipv4, text, sizeof text);
  } else {
    inet_ntop(AF_INET6, &address.i6_ipv6, text, sizeof text);
  }
  return text;
}

}  // namespace hbctl
