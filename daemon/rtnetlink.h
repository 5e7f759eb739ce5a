/* The kernel's messages about links and addresses. */
#ifndef HBD_RTNETLINK_H
#define HBD_RTNETLINK_H

#include <libmnl/libmnl.h>

#include "host_table.h"

namespace hbd {

/** A netlink socket that closes itself. */
class NetlinkSocket {
 public:
  /** @param groups the multicast groups to listen to, as bits; 0 for none. */
  explicit NetlinkSocket(unsigned groups);
  NetlinkSocket(const NetlinkSocket&) = delete;
  NetlinkSocket& operator=(const NetlinkSocket&) = delete;
  ~NetlinkSocket();

  mnl_socket* get() { return socket_; }
  [[nodiscard]] int descriptor() const { return mnl_socket_get_fd(socket_); }

 private:
  mnl_socket* socket_;
};

/** Follows this host's links and addresses. */
class HostMonitor {
 public:
  HostMonitor();

  /** Readable when there is something for take_all(). */
  [[nodiscard]] int descriptor() const { return changes_.descriptor(); }

  /** The table as the kernel has it now, asked for whole. */
  static HostTable read_all();

  /** Takes every message that has arrived into the table; reads it anew when some were lost. */
  void take_all(HostTable& table);

 private:
  NetlinkSocket changes_;
};

}  // namespace hbd

#endif
