#include "hb_global_data/address_text.h"

#include <arpa/inet.h>

#include <cstring>

namespace {

template <size_t N>
void copy_text(char* to, const char (&text)[N]) {
  std::memcpy(to, text, N);
}

char* address_text(const in6_addr& address, char* out_p) {
  if (is_ipv4_mapped(address)) {
    if (inet_ntop(AF_INET, &address.s6_addr32[3], out_p, INET_ADDRSTRLEN) == nullptr) {
      copy_text(out_p, "bad address 4");
    }
  } else if (inet_ntop(AF_INET6, &address, out_p, INET6_ADDRSTRLEN) == nullptr) {
    copy_text(out_p, "bad address 6");
  }
  return out_p;
}

}  // namespace

bool is_ipv4_mapped(const in6_addr& address) {
  return address.s6_addr32[0] == 0 && address.s6_addr32[1] == 0 && address.s6_addr32[2] == htonl(0xFFFF);
}

char* VEX_ntop(zu_vex_IP_address6_t* ip6, char* out_p) { return address_text(ip6->zu_vex_i6_ipv6, out_p); }

char* mowllib_ntop(Hb_IP_address6* ip6, char* out_p) { return address_text(ip6->i6_ipv6, out_p); }
