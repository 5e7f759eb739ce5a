/* This host's interfaces and addresses, kept up to date from kernel messages. */
#ifndef HBD_HOST_TABLE_H
#define HBD_HOST_TABLE_H

#include <libmnl/libmnl.h>

#include <array>
#include <cstdint>
#include <map>
#include <set>
#include <string>
#include <tuple>

#include "hb_client/types.h"

namespace hbd {

/** One interface. */
struct Interface {
  std::string name;
  std::uint16_t hardware = 0; /**< its kind, an ARPHRD number */
  bool on = false;            /**< switched on */
  bool running = false;       /**< switched on and with a carrier */
};

/** One address of an interface. */
struct HostAddress {
  int interface = 0;
  std::array<std::uint8_t, 16> bytes{}; /**< as in `Hb_IP_address6` */
  unsigned char prefix_length = 0;      /**< of its network, in bits; it makes no other address */

  [[nodiscard]] bool is_ipv4() const;

  bool operator<(const HostAddress& other) const {
    return std::tie(interface, bytes) < std::tie(other.interface, other.bytes);
  }
};

/** What the kernel has told about links and addresses. */
class HostTable {
 public:
  /** Takes one message; those that tell neither of links nor of addresses change nothing. */
  void take(const nlmsghdr& message);

  [[nodiscard]] const std::map<int, Interface>& interfaces() const { return interfaces_; }
  [[nodiscard]] const std::set<HostAddress>& addresses() const { return addresses_; }

 private:
  void take_link(const nlmsghdr& message);
  void take_address(const nlmsghdr& message);

  std::map<int, Interface> interfaces_;
  std::set<HostAddress> addresses_;
};

}  // namespace hbd

#endif
